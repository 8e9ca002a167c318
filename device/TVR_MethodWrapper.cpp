#include "device/TVR_MethodWrapper.h"

#include "device/Bindings.h"
#include "foundation/CommonHelpers.h"
#include "foundation/Log.h"

#include <cctype>
#include <charconv>
#include <cstdio>
#include <cstring>
#include <exception>
#include <mutex>
#include <unistd.h>

namespace cimple
{

std::atomic<int> TVR_MethodWrapper::initOwner{0};

namespace
{

/// The init semaphore is made with two units: one says that no object has started, the other is the gate that
/// opens when the first is done.
constexpr unsigned untouched = 2;

/// The init semaphore of this process while an object has it. Neither is destroyed at the end of the process, when the
/// last object may still come to close.
constinit std::mutex sharedInitMutex;
constinit ProcessSemaphore* sharedInit = nullptr;

std::shared_ptr<ProcessSemaphore> joinInitSemaphore(const std::string& name)
{
    const std::lock_guard lock(sharedInitMutex);
    // After a fork the one that is known is the parent's.
    if (sharedInit && sharedInit->isOwn())
        return sharedInit->shared_from_this();
    auto semaphore = std::make_shared<ProcessSemaphore>(name, untouched);
    sharedInit = semaphore.get();
    return semaphore;
}

/// The first object that leaves takes the name away: the next to come makes a new one.
void leaveInitSemaphore(std::shared_ptr<ProcessSemaphore>& semaphore) noexcept
{
    if (!semaphore)
        return;
    {
        const std::lock_guard lock(sharedInitMutex);
        if (sharedInit == semaphore.get())
            sharedInit = nullptr;
        semaphore->removeName();
    }
    semaphore.reset();
}

/// Positions of an HBA name that hold a separator.
bool isSeparatorAt(std::size_t position)
{
    return position % 3 == 2;
}

bool isHBAName(const char* text)
{
    if (!text || std::strlen(text) != TVR_MethodWrapper::hbaNameLength)
        return false;
    for (std::size_t i = 0; i < TVR_MethodWrapper::hbaNameLength; ++i)
    {
        const char c = text[i];
        if (isSeparatorAt(i) ? c != ' ' && c != ':' : !std::isxdigit(static_cast<unsigned char>(c)))
            return false;
    }
    return true;
}

} // namespace

TVR_MethodWrapper::TVR_MethodWrapper()
    : pid(getpid()), initSemName("/TVR_RM_INIT_LIB_" + std::to_string(pid)),
      doneSemName("/TVR_RM_INIT_LIB_DONE_" + std::to_string(pid))
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::Constructor");
    TVR_LOG(TVR_DBG, "Setting Up for FIFO.. ");
    initSem = joinInitSemaphore(initSemName);
    const int value = initSem->value();
    initSem->wait();
    if (value == static_cast<int>(untouched))
        initialiseLibrary();
    else
    {
        TVR_LOG(TVR_DBG, "Waiting on Completed Semaphore.. To issue RM Calls..%s.. sem = %p", initSemName.c_str(),
                static_cast<void*>(initSem.get()));
        initSem->wait();
        TVR_LOG(TVR_DBG, "Recieved signal on Completed Semaphore.. To issue RM Calls");
    }
    TVR_LOG(TVR_DBG, "RM Library initialized");
}

void TVR_MethodWrapper::initialiseLibrary()
try
{
    TVR_LOG(TVR_DBG, "Aquired Semaphore.. Running RM_InitLib %s ", initSemName.c_str());
    initOwner = 1;
    doneSem = std::make_unique<ProcessSemaphore>(doneSemName, 0);
    TVR_LOG(TVR_DBG, "Aquired Completed Semaphore.. Running RM_InitLib %s", doneSemName.c_str());
    if (const RM_STATUS status = LRM_InitLib(); status > 0)
    {
        TVR_LOG(TVR_CRIT, "Error : Initialization of RMLib:: RM_InitLib failed with[%d]", status);
        throw std::exception();
    }
    resolveAbsentEntries();
    TVR_LOG(TVR_DBG, "Signalling Completed Semaphore.. Running RM_InitLib");
    initSem->post();
    TVR_LOG(TVR_DBG, "Signaled Completed Semaphore.. Running RM_InitLib");
}
catch (...)
{
    initSem->post(); // who waits for this object goes on
    closeSemaphores();
    throw;
}

TVR_MethodWrapper::~TVR_MethodWrapper()
{
    if (getpid() != pid)
    {
        closeSemaphores();
        return;
    }
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::Destructor");
    initSem->post();
    TVR_LOG(TVR_DBG, "Value of Sem in destructor=%d", initSem->value());
    closeSemaphores();
    TVR_LOG(TVR_DBG, "RM Library uninitialzed");
}

void TVR_MethodWrapper::closeSemaphores() noexcept
{
    leaveInitSemaphore(initSem);
    doneSem.reset();
}

int TVR_MethodWrapper::Id2HBAName(char* out, const char* deviceId)
{
    TVR_LOG(TVR_DBG, "Entering TVR_MethodWrapper::Id2HBAName");
    if (!out || !deviceId)
    {
        TVR_LOG(TVR_ERR, "Null pointer argument in one of the arguments");
        return 1;
    }
    TVR_LOG(TVR_DBG, "DeviceID is:: %s", deviceId);
    if (*deviceId == '"')
        ++deviceId;
    std::memset(out, 0, hbaNameLength + 1);
    for (std::size_t i = 0; i < hbaNameLength && *deviceId; ++i)
        out[i] = isSeparatorAt(i) ? ':' : *deviceId++;
    TVR_LOG(TVR_DBG, "HBA Name is:: %s", out);
    return 0;
}

int TVR_MethodWrapper::str2HBAName(HBA_WWN* out, const char* text)
{
    TVR_LOG(TVR_DBG, "Entering TVR_MethodWrapper::str2HBAName");
    if (!out || !text || std::strlen(text) != hbaNameLength)
    {
        TVR_LOG(TVR_ERR, "INVALID HBA Name");
        return 1;
    }
    TVR_LOG(TVR_DBG, "wwpn:( %s ) ", text);
    if (!isHBAName(text))
    {
        TVR_LOG(TVR_ERR, "INVALID HBA Name");
        return 1;
    }
    HBA_UINT8* b = out->wwn;
    for (std::size_t i = 0; i < sizeof out->wwn; ++i)
        std::from_chars(text + 3 * i, text + 3 * i + 2, b[i], 16);
    TVR_LOG(TVR_DBG, "After tokenizing wwpn:( %2x %2x %2x %2x %2x %2x %2x %2x )", b[0], b[1], b[2], b[3], b[4], b[5],
            b[6], b[7]);
    return 0;
}

bool TVR_MethodWrapper::string2HBAName(HBA_WWN* out, const std::string& text)
{
    return stringToWwn(out->wwn, String(text)) == 0;
}

int TVR_MethodWrapper::idToWwn(HBA_WWN* out, const char* deviceId)
{
    char name[hbaNameLength + 1];
    if (Id2HBAName(name, deviceId) != 0)
    {
        TVR_LOG(TVR_ERR, "Id2HBAName failed");
        return 1;
    }
    if (str2HBAName(out, name) != 0)
    {
        TVR_LOG(TVR_ERR, "str2HBAName failed");
        return 1;
    }
    return 0;
}

std::string TVR_MethodWrapper::hbaNameToString(const HBA_WWN& wwn)
{
    const HBA_UINT8* b = wwn.wwn;
    char text[hbaNameLength + 1];
    std::snprintf(text, sizeof text, "%02X:%02X:%02X:%02X:%02X:%02X:%02X:%02X", b[0], b[1], b[2], b[3], b[4], b[5],
                  b[6], b[7]);
    return text;
}

void TVR_MethodWrapper::logStatus(const RM_STATUS& status)
{
    char text[256] = {};
    RM_StatusString(status, text, sizeof text);
    text[sizeof text - 1] = 0;
    if (*text)
        TVR_LOG(TVR_DBG, "Status: <%d>:%s", status, text);
    else
        TVR_LOG(TVR_DBG, "Status: <%d>", status);
}

int TVR_MethodWrapper::Validatewwpn(const HBA_WWN& wwpn)
{
    TVR_LOG(TVR_DBG, "Entering TVR_MethodWrapper::Validatewwpn()");
    std::uint32_t isLocal = 0;
    const RM_STATUS status = RM_IsLocalHBA(wwpn, &isLocal);
    TVR_LOG(TVR_DBG, "RM_IsLocalHBA: status=%d", status);
    if (status == RM_OK && isLocal)
        return 0;
    TVR_LOG(TVR_ERR, "HBA IS NOT LOCAL");
    return 1;
}

bool TVR_MethodWrapper::IsKestorCNA(const HBA_WWN& wwpn)
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::IsKestorCNA");
    std::uint32_t value = 0;
    if (LRM_GetHBAFeature(wwpn, RM_FEATURE_KESTOR_CNA, &value) != RM_OK || value != 1)
        return false;
    TVR_LOG(TVR_DBG, "Kestor CNA Port ");
    return true;
}

} // namespace cimple
