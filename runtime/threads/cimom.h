// Up-calls of provider code to the broker, through the context of the calling thread.
#pragma once

#include "runtime/meta/Instance.h"
#include "runtime/values/Array.h"
#include "runtime/values/String.h"

namespace cimple
{

struct Instance_Enumeration;

/// Result of cimom::enum_instances(). To be used and destroyed on a thread that has a context.
class Instance_Enumerator
{
public:
    Instance_Enumerator() = default;
    ~Instance_Enumerator() { destroy(); }
    Instance_Enumerator(const Instance_Enumerator&) = delete;
    Instance_Enumerator& operator=(const Instance_Enumerator&) = delete;

    /// False at the end and without a context.
    bool more() const;
    void next();
    /// The current instance, with a count for the caller; null at the end.
    Instance* get() const;
    void destroy();

private:
    friend class cimom;
    Instance_Enumeration* _handle = nullptr;
};

/// Every function fails without effect on a thread that has no context: check for that value first in code that
/// may run on one. Instances are read only; method records get the results.
class cimom
{
public:
    /// 0, or -1. A former enumeration of `enumerator` is destroyed. The class is that of `model`.
    static int enum_instances(const char* name_space, const Instance* model, Instance_Enumerator& enumerator);
    /// Not implemented: aborts.
    static int enum_instances(const char* name_space, const Instance* model, Array<Instance>& instances);

    /// The instance with the keys of `model`, with a count for the caller; null on failure.
    static Instance* get_instance(const char* name_space, const Instance* model);
    /// These four return 0, or -1.
    static int create_instance(const char* name_space, const Instance* instance);
    static int delete_instance(const char* name_space, const Instance* instance);
    static int modify_instance(const char* name_space, const Instance* instance);
    static int invoke_method(const char* name_space, const Instance* reference, Instance* method);

    /// Whether the broker may unload the provider while it is not terminating.
    static void allow_unload(bool allow);
    /// Name of the client's user; false if the broker does not tell.
    static bool get_username(String& username);
};

} // namespace cimple
