// A provider of T_Disk or T_Link instances behind a real adapter: answers as told and counts what it is asked.
#pragma once

#include "runtime/adapter/CMPI_Adapter.h"
#include "tests/unit/cmpi/FakeBroker.h"
#include "tests/unit/runtime/Records.h"

#include <array>
#include <functional>
#include <memory>

namespace cimple::fake
{

class Provider
{
public:
    explicit Provider(const Meta_Class& meta_class);
    ~Provider();

    std::vector<Ref<>> instances;           // what an enumeration gives, as clones
    bool cut_short = false;                 // the enumeration could not give the rest
    std::array<std::atomic<int>, 17> asked; // by operation
    std::array<int, 17> answers;            // preset to "unsupported" where there is such a number
    std::function<void(Instance* record)> method = [](Instance*) {};
    std::function<void()> on_load = [] {};
    std::function<bool(Instance_Handler, void*)> on_associators; // op 16; unset: unsupported
    Ref<> received, model;                                       // of the last change or enumeration
    std::string seen_role;

    Registration registration;
    Static_Adapter_Data data;
    const Module_Info* module = nullptr; // of the factory

    /// Through the factory, as the broker would.
    template <class MI> MI* make(const Broker& broker, char type)
    {
        void* mi = nullptr;
        cimple_cmpi_adapter(&data, &registration, broker.handle(), broker.context(), "T_Provider", type, &mi, module);
        return static_cast<MI*>(mi);
    }

    int count(Operation operation) const { return asked[operation]; }

private:
    static int proc(const Registration* registration, int operation, void* arg0, void* arg1, void* arg2, void* arg3,
                    void* arg4, void* arg5, void* arg6, void* arg7);
    int enumerate(const Instance* with_model, Instance_Handler handler, void* client);
};

} // namespace cimple::fake
