// Up-calls through a CMPI broker.
#pragma once

#include "runtime/cmpi/Cmpi.h"
#include "runtime/threads/Thread_Context.h"

namespace cimple
{

class CMPI_Adapter;
struct Static_Adapter_Data;

/// Lives for one adapter call on a broker's thread, or as long as a provider's thread.
class CMPI_Thread_Context final : public Thread_Context
{
public:
    /// `owner` may be null.
    CMPI_Thread_Context(const CMPIBroker* mb, const CMPIContext* ctx, CMPI_Adapter* owner);

    const CMPIBroker* broker;
    const CMPIContext* context;
    CMPI_Adapter* adapter; ///< may be gone before a provider's thread ends: only for comparison there

    Thread_Context* thread_create_hook(void* arg) override;
    void thread_start_hook() override;
    void thread_exit_hook() override;

    Instance_Enumeration* instance_enumerator_create(const char* name_space, const Instance* model) override;
    void instance_enumerator_destroy(Instance_Enumeration* enumeration) override;
    bool instance_enumerator_more(Instance_Enumeration* enumeration) override;
    void instance_enumerator_next(Instance_Enumeration* enumeration) override;
    Instance* instance_enumerator_get(Instance_Enumeration* enumeration) override;

    Instance* get_instance(const char* name_space, const Instance* model) override;
    int create_instance(const char* name_space, const Instance* instance) override;
    int delete_instance(const char* name_space, const Instance* instance) override;
    int modify_instance(const char* name_space, const Instance* instance) override;
    int invoke_method(const char* name_space, const Instance* reference, Instance* method) override;
    void allow_unload(bool allow) override;
    bool get_username(String& username) override;

private:
    CMPI_Thread_Context(const CMPI_Thread_Context& creator, const CMPIContext* prepared);

    CMPIObjectPath* path_of(const char* name_space, const Instance* instance);
    CMPIInstance* instance_of(const char* name_space, const Instance* instance, CMPIObjectPath* path);

    Static_Adapter_Data* _adapter_data; ///< of `adapter`; stays
    void* _mark = nullptr;              ///< of the broker's memory, between start and exit of a provider's thread
    bool _attached = false;
};

} // namespace cimple
