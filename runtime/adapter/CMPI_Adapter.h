// The broker's face of a class provider: one adapter per class behind four kinds of CMPI functions.
#pragma once

#include "runtime/adapter/Provider.h"
#include "runtime/cmpi/Cmpi.h"
#include "runtime/threads/Thread.h"
#include "runtime/values/Array.h"
#include "runtime/values/String.h"

#include <atomic>
#include <cstdint>
#include <mutex>
#include <pthread.h>
#include <span>
#include <type_traits>

namespace cimple
{

class CMPI_Adapter;

/// A recursive mutex that is all zero bytes while nobody holds it, so that static data stay zero-initialised.
class Adapter_Gate
{
public:
    void lock();
    void unlock();

private:
    std::mutex _mutex;
    std::atomic<pthread_t> _owner{};
    unsigned _depth = 0;
};

/// The stable object of a class that the broker sees; static and zero at start.
///
/// Factory and cleanup calls of one class take turns at the gate, which is held while a provider loads or unloads
/// and may be passed again by an up-call on the same thread. `guard` is a leaf lock for the pointer to the adapter
/// and the count of its users, so that an operation never meets a deleted adapter.
struct Static_Adapter_Data
{
    static constexpr std::uint32_t alive = 0x5DE2B131;
    static constexpr std::uint32_t dead = 0xDDDDDDDD;
    static constexpr std::size_t name_size = 256;

    std::uint32_t magic{};
    CMPI_Adapter* adapter{}; ///< null when none exists
    CMPIInstanceMIFT instance_ft{};
    CMPIMethodMIFT method_ft{};
    CMPIIndicationMIFT indication_ft{};
    CMPIAssociationMIFT association_ft{};
    CMPIInstanceMI instance_mi{};
    CMPIMethodMI method_mi{};
    CMPIAssociationMI association_mi{};
    CMPIIndicationMI indication_mi{};
    char instance_name[name_size]{};
    char method_name[name_size]{};
    char indication_name[name_size]{};
    char association_name[name_size]{};

    Adapter_Gate gate;
    std::mutex guard;
};

/// An active indication filter: its query and how many subscriptions use it.
struct Indication_Filter
{
    String query;
    std::size_t count;
};

/// Ends of associations that their own provider may have no more while the association still holds them.
struct Lasting_End
{
    const char* association; ///< the class or one of its superclasses; null: any
    const char* referent;    ///< likewise
};

/// What the adapters of a module know of it as a whole.
struct Module_Info
{
    const Registration* registrations; ///< the one linked last
    std::span<const Lasting_End> lasting_ends;
};

class CMPI_Adapter
{
public:
    /// Creates and loads the provider, and fills the static block on the way.
    CMPI_Adapter(const Registration* registration, const CMPIBroker* broker, const CMPIContext* context,
                 Static_Adapter_Data* static_data, const char* provider_name, const Module_Info* module = nullptr);
    /// Unloads and destroys the provider.
    ~CMPI_Adapter();
    CMPI_Adapter(const CMPI_Adapter&) = delete;
    CMPI_Adapter& operator=(const CMPI_Adapter&) = delete;

    const Registration* registration;
    Provider_Proc proc;
    void* provider = nullptr;
    std::atomic<const CMPIBroker*> broker; ///< the latest: one that closed the library and opened it again has another
    Static_Adapter_Data* static_data;
    int load_count = 1; ///< behind the gate
    bool load_tried = false;
    std::atomic<bool> allow_unload{true}; ///< provider threads may write it
    Array<Indication_Filter> filters;     ///< behind the block's guard
    const Meta_Class* meta_class = nullptr;
    bool indications_enabled = false; ///< behind `lock`
    Mutex lock{true};
    unsigned users = 1;        ///< the static block and each running operation; behind the block's guard
    const Module_Info* module; ///< may be null: then the module serves every class

    /// Asks the provider procedure; up to eight pointers as the operation wants them.
    template <class... Args> int call(Operation operation, Args... args) const
    {
        static_assert(sizeof...(Args) <= 8);
        void* list[8] = {argument(args)...};
        return proc(registration, operation, list[0], list[1], list[2], list[3], list[4], list[5], list[6], list[7]);
    }

    /// Whether an association of this class answers with the end that it holds when the broker says `failure` in place
    /// of the instance: where the module does not serve the end's class, and where the end outlives its own provider's.
    bool answers_for(const Instance* end, CMPIrc failure) const;

    /// Class that an object path names, from the provider's repository; null if it is none of it.
    const Meta_Class* find_class(const CMPIObjectPath* path) const;

private:
    /// Creates the provider.
    CMPI_Adapter(const Registration* registration, const CMPIBroker* broker, Static_Adapter_Data* static_data,
                 const Module_Info* module);
    void fill_static_data(const char* provider_name);

    template <class T> static void* argument(T* pointer)
    {
        if constexpr (std::is_function_v<T>)
            return reinterpret_cast<void*>(pointer);
        else
            return const_cast<void*>(static_cast<const void*>(pointer));
    }
};

/// Behind every factory symbol: makes the class's adapter or counts it up, and stores the address of the record
/// for the kind `type` ('I' instance, 'M' method, 'A' association, 'N' indication) in `out_mi`. Returns 0, or -1
/// with `out_mi` null for any other kind and when the adapter cannot be made. Without `module` every class counts as
/// served by the module.
int cimple_cmpi_adapter(Static_Adapter_Data* static_data, const Registration* registration, const CMPIBroker* broker,
                        const CMPIContext* context, const char* provider_name, char type, void** out_mi,
                        const Module_Info* module = nullptr);

} // namespace cimple
