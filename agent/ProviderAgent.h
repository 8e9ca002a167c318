// The object behind all class providers: device data, settings, log sinks and the instance cache.
#pragma once

#include "agent/InstanceCache.h"
#include "agent/LaneName.h"
#include "device/Data.h"
#include "device/TVR_MethodWrapper.h"
#include "foundation/DeviceEventBuffer.h"
#include "foundation/TVR_CIMLogger.h"
#include "foundation/TVR_FileLogger.h"
#include "foundation/TVR_SysLogger.h"
#include "foundation/TvrConfigFile.h"
#include "runtime/threads/Thread.h"
#include "runtime/values/Datetime.h"

#include <atomic>
#include <cstdint>
#include <memory>
#include <set>
#include <sys/types.h>

namespace cimple
{

/// The version that the module reports.
inline constexpr int providerVersion[4] = {10, 2, 261, 13};

/// What an up-call for an instance of the platform gave.
struct PlatformAnswer
{
    bool answered = false; ///< the broker enumerated the class
    Ref<> found;           ///< the instance to take, in its own namespace; null when there is none
};

/// A stage of the refresh that readers wait for: the flags are written under the mutex.
struct RefreshStage
{
    Mutex& mutex;
    Condition& cond;
    std::atomic<bool>& ready;
    std::atomic<bool>& building;
    /// The stage ended early or left something out: what a reader does not find may be there all the same.
    std::atomic<bool>& incomplete;

    /// Waits once, with no timeout, if the stage is not ready; the mutex is held. A spurious wake-up goes on:
    /// what the caller reads next is safe whatever the flag says.
    void waitIfNotReady() const;
    /// Marks the stage complete and wakes its readers; the mutex is held.
    void complete() const;
};

/// Exists while at least one class provider is loaded. Broker threads never build anything: they ask for a refresh,
/// wait for the stage they need and copy out of the cache; one DataFetch_Handler thread at a time rebuilds it.
///
/// Locks are taken in this order: singleton mutex, m_DportThreadMutex, m_ThreadMutex, m_AdapterDataReadyMutex,
/// m_AdapterMapsReadyMutex, m_SANMapsReadyMutex, m_DataMutex.
class ProviderAgent : public InstanceCache
{
public:
    /// The agent, made on first call under the singleton mutex.
    static ProviderAgent* instance();
    static void addRef();
    /// instance() and addRef() in one, for a provider's load. False if there is no agent or it is not loaded: then no
    /// reference is taken, but the unload that will give one back all the same is reckoned with.
    static bool join();
    /// Deletes the agent when as many references came back as loads were made; that of a parent process stays.
    static void releaseRef();
    /// The process ends, or has ended, what the agent stands on: data, maps and libraries.
    bool hasEnded() const { return m_bFinished; }

    /// Of the agent as it is; nothing while there is none. Never waits.
    struct Readiness
    {
        bool loaded = false;
        bool refreshPending = false;    ///< the next request starts a refresh, however young the cache is
        std::uint32_t cacheTimeout = 0; ///< minutes
    };
    static Readiness readiness();

    /// Starts a refresh if one is due; returns 0 at once.
    int BuildCimpleInfo();
    /// Whether a reader waits for SAN maps that nobody builds yet.
    bool isFabricAwaited() const;
    /// True when the cache is older than m_cacheTimeout.
    bool isTimeOut();
    std::uint32_t updateAdapterMaps();
    std::uint32_t updateSANMaps();
    /// Clears all maps. The caller holds the mutexes of both groups and m_DataMutex.
    void ClearMaps();
    /// The caller holds the mutex of the group.
    void clearAdapterMaps();
    void clearSANMaps();

    // --- refresh requests and settings; static is what is told of the agent, also to who asks while it is deleted
    static inline std::atomic<bool> m_bAdapterRefreshPending{false};
    std::atomic<bool> m_bAdapterRefresh{false};
    static inline std::atomic<bool> m_bSANRefreshPending{false};
    std::atomic<bool> m_bSANRefresh{false};
    static inline std::atomic<std::uint32_t> m_cacheTimeout{0}; ///< minutes

    // --- parts
    static inline std::atomic<bool> m_bLoaded{false}; ///< fully built, and the libraries are usable
    std::unique_ptr<Data> m_pData;
    std::unique_ptr<TVR_MethodWrapper> m_pMethodWrapper;
    TVR_FileLogger m_fileLogger;
    TVR_CIMLogger m_cimLogger;
    TVR_SysLogger m_sysLogger;
    TvrConfigFile m_config;
    DeviceEventBuffer m_deviceEvents; ///< what the driver log shows; under m_DataMutex

    // --- stages of the refresh
    Mutex m_DataMutex; ///< device data and the contents of the maps
    std::atomic<bool> m_bIsAdapterDataReady{false};
    std::atomic<bool> m_bAdapterDataBuilding{false};
    Mutex m_AdapterDataReadyMutex;
    Condition m_AdapterDataReadyCond;
    std::atomic<bool> m_bAdapterMapsReady{false};
    std::atomic<bool> m_bAdapterMapsBuilding{false};
    std::atomic<bool> m_bAdapterMapsIncomplete{false};
    Mutex m_AdapterMapsReadyMutex;
    Condition m_AdapterMapsReadyCond;
    std::atomic<bool> m_bSANMapsReady{false};
    std::atomic<bool> m_bSANMapsBuilding{false};
    std::atomic<bool> m_bSANMapsIncomplete{false};
    Mutex m_SANMapsReadyMutex;
    Condition m_SANMapsReadyCond;
    RefreshStage adapterData();
    RefreshStage adapterMaps();
    RefreshStage sanMaps();
    std::atomic<unsigned> m_diagnosticsRunning{0}; ///< runs of tests; while there is one, no refresh starts

    // --- the host
    String m_osName;
    String m_osExtendedInfo;
    String m_hostName;
    String m_ipAddress;
    bool m_bOwnComputerSystem = false;       ///< the computer system was generated here
    PlatformAnswer m_platformComputerSystem; ///< both of the refresh's thread
    PlatformAnswer m_platformChassis;

    /// Between which ports there may be priority lanes: with the fabric, those whose adapter has them; and those of all
    /// lanes that a client has made. Under m_DataMutex.
    std::set<LanePath> m_lanePaths;

    // --- status thread of the D-Port test
    /// Runs `proc(arg)` on the thread once it has ended what it was started with before. That may take as long as a
    /// test of a link, and needs m_DataMutex, which the caller does not hold. 0, or what Thread::create_joinable
    /// answers, or ECANCELED when the agent ends; it never throws.
    int startDportThread(Thread::Proc proc, void* arg);
    std::atomic<bool> m_bDportThreadEnd{false}; ///< asks the thread to end soon

private:
    friend class AgentEnd;

    ProviderAgent();
    ~ProviderAgent();
    /// Under the singleton mutex.
    static ProviderAgent* makeLocked();
    static void addRefLocked();
    static void releaseRefLocked();
    bool isOnRefreshThread();

    void start();
    void readSettings();
    /// Stops the threads and gives back all that is not memory, once; the agent stays and answers empty. In another
    /// process than the agent's, such as a child of a fork, nothing is ended: it is all the parent's.
    void finish();
    bool joinThreads();
    bool endDportThread();
    void joinDportThread();
    void deleteData();

    void takeDownIncomplete();
    void giveUpRefresh(int error);
    static void* DataFetch_Handler(void* agent);
    void refresh();
    void askPlatform();
    void adapterStage();
    void sanStage();

    Mutex m_DportThreadMutex; ///< the two below; held while the thread is waited for
    Thread m_dportThread;
    bool m_bDportThreadRunning = false; ///< started and not joined
    Datetime m_lastLoadTime;            ///< end of the last run; the zero interval before any
    Thread m_dataFetchThread;
    Mutex m_ThreadMutex;            ///< m_bThreadRunning, m_lastLoadTime and the decision to start
    bool m_bThreadRunning = false;  ///< started and not finished
    bool m_bThreadJoinable = false; ///< started and not joined
    bool m_bPlatformAsked = false;  ///< of the refresh's thread
    bool m_bSANMapsBuilt = false;   ///< of the refresh's thread: the SAN maps were complete once
    std::atomic<bool> m_bFinished{false};
    const pid_t m_process;
};

} // namespace cimple
