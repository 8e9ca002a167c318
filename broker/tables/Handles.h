// The objects behind the CMPI handles, and how a handle is opened.
#pragma once

#include "broker/core/Arena.h"
#include "broker/core/Reply.h"
#include "broker/values/ClassInfo.h"

#include <algorithm>
#include <array>
#include <optional>
#include <string>
#include <vector>

namespace broker
{

/// A kind's function table in the versions that servers give it.
template <class Table> using Versions = std::array<Table, 3>;

template <class Table> constexpr Versions<Table> inVersions(const Table& table)
{
    Versions<Table> versions{table, table, table};
    versions[0].ftVersion = 1;
    versions[1].ftVersion = 100;
    versions[2].ftVersion = 200;
    return versions;
}

template <class H> const auto* functionTable(int version)
{
    const auto* last = &H::functions.back();
    return std::find_if(H::functions.data(), last, [&](const auto& table) { return table.ftVersion == version; });
}

template <class H> bool isTableOf(const void* table)
{
    return std::any_of(H::functions.begin(), H::functions.end(), [&](const auto& own) { return &own == table; });
}

/// An object that a provider sees as `Cmpi`. `Derived` has the function tables and the kind's name.
template <class Derived, class Cmpi_, class Content_> struct Handle : Tracked, Cmpi_
{
    using Cmpi = Cmpi_;
    using Content = Content_;

    Handle(Core& owner, Content value) : Tracked(owner), Cmpi_{}, content(std::move(value))
    {
        this->hdl = static_cast<Tracked*>(this);
        this->ft = functionTable<Derived>(objectVersion(owner));
    }
    const char* kind() const override { return Derived::kindName; }
    void empty() override { content = Content{}; }

    Content content;
};

struct StringContent
{
    std::string text;
    bool noCharacters = false; ///< getCharPtr answers a null pointer
};
struct StringHandle : Handle<StringHandle, CMPIString, StringContent>
{
    using Handle::Handle;
    static const Versions<CMPIStringFT> functions;
    static constexpr const char* kindName = "CMPIString";
};

struct DateTimeHandle : Handle<DateTimeHandle, CMPIDateTime, DateTime>
{
    using Handle::Handle;
    static const Versions<CMPIDateTimeFT> functions;
    static constexpr const char* kindName = "CMPIDateTime";
};

struct ArrayContent
{
    CMPIType elementType = CMPI_null;
    Value::List elements;
};
struct ArrayHandle : Handle<ArrayHandle, CMPIArray, ArrayContent>
{
    using Handle::Handle;
    static const Versions<CMPIArrayFT> functions;
    static constexpr const char* kindName = "CMPIArray";
};

struct EnumerationContent
{
    CMPIType elementType = CMPI_null;
    Value::List elements;
    std::size_t next = 0;
};
struct EnumerationHandle : Handle<EnumerationHandle, CMPIEnumeration, EnumerationContent>
{
    using Handle::Handle;
    static const Versions<CMPIEnumerationFT> functions;
    static constexpr const char* kindName = "CMPIEnumeration";
};

struct PathContent
{
    Path path;
    const ClassInfo* info = {}; ///< null for a class that the repository lacks
};
struct PathHandle : Handle<PathHandle, CMPIObjectPath, PathContent>
{
    using Handle::Handle;
    static const Versions<CMPIObjectPathFT> functions;
    static constexpr const char* kindName = "CMPIObjectPath";
};

struct PropertyFilter
{
    std::vector<std::string> properties;
    std::vector<std::string> keys;
};
struct InstanceContent
{
    const ClassInfo* info = {};
    Object object;                ///< `path.keys` matter only for an unknown class
    std::vector<Property> hidden; ///< keys that the property filter keeps but does not show
    std::optional<PropertyFilter> filter;

    /// The path made from the key properties; for an unknown class the path that the instance was made with.
    Path pathFromKeys() const;
};
struct InstanceHandle : Handle<InstanceHandle, CMPIInstance, InstanceContent>
{
    using Handle::Handle;
    static const Versions<CMPIInstanceFT> functions;
    static constexpr const char* kindName = "CMPIInstance";
};

struct ArgsContent
{
    std::vector<Property> args;
    const MethodInfo* method = {}; ///< checks what is added; null for none
};
struct ArgsHandle : Handle<ArgsHandle, CMPIArgs, ArgsContent>
{
    using Handle::Handle;
    static const Versions<CMPIArgsFT> functions;
    static constexpr const char* kindName = "CMPIArgs";
};

struct ContextHandle : Handle<ContextHandle, CMPIContext, std::vector<Property>>
{
    using Handle::Handle;
    static const Versions<CMPIContextFT> functions;
    static constexpr const char* kindName = "CMPIContext";
};

struct SelectExpContent
{
    std::string query;
    std::string language;
};
struct SelectExpHandle : Handle<SelectExpHandle, CMPISelectExp, SelectExpContent>
{
    using Handle::Handle;
    static const Versions<CMPISelectExpFT> functions;
    static constexpr const char* kindName = "CMPISelectExp";
};

/// What a call may return, and what it returned.
struct ResultContent
{
    enum class Kind
    {
        nothing,
        instances,
        paths,
        data,
    };
    Kind kind = Kind::nothing;
    const ClassInfo* expectedClass = {}; ///< instances and paths are of it or of a subclass; null for any
    std::size_t limit = SIZE_MAX;        ///< results that the operation may give
    const MethodInfo* method = {};       ///< gives the type of the data
    ObjectSink objects = {};
    PathSink paths = {};
    std::size_t given = 0;
    std::optional<Value> data = {};
    bool done = false;
};
struct ResultHandle : Handle<ResultHandle, CMPIResult, ResultContent>
{
    using Handle::Handle;
    static const Versions<CMPIResultFT> functions;
    static constexpr const char* kindName = "CMPIResult";
};

void setStatus(CMPIStatus* rc, CMPIrc code);
inline CMPIStatus makeStatus(CMPIrc code)
{
    return {code, nullptr};
}
/// Null data with that state in addition.
CMPIData nullData(CMPIType type, CMPIValueState state = 0);

/// Checks an object that a provider handed in: not null, one of ours (as its table tells), alive.
Tracked* openTracked(const void* object, bool isOurs, void* hdl, const char* kind, const char* function);

/// The object behind a handle. A null, foreign or dead handle is a violation: then the answer is null and `rc`, unless
/// null, says CMPI_RC_ERR_INVALID_HANDLE.
template <class H> H* open(const typename H::Cmpi* object, const char* function, CMPIStatus* rc = nullptr)
{
    Tracked* tracked =
        openTracked(object, object && isTableOf<H>(object->ft), object ? object->hdl : nullptr, H::kindName, function);
    setStatus(rc, tracked ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE);
    return static_cast<H*>(tracked);
}

/// This thread's frame; its lack is a violation (a thread that is not attached), answered by null and
/// CMPI_RC_ERR_FAILED.
Frame* openFrame(const Core& core, const char* function, CMPIStatus* rc);

/// A new handle of this thread's frame; null without one.
template <class H>
typename H::Cmpi* newHandle(const Core& core, const char* function, CMPIStatus* rc, typename H::Content content)
{
    Frame* frame = openFrame(core, function, rc);
    return frame ? frame->make<H>(std::move(content)) : nullptr;
}

inline CMPIString* newString(const Core& core, const char* function, CMPIStatus* rc, std::string text)
{
    return newHandle<StringHandle>(core, function, rc, {std::move(text), false});
}

/// Hands a clone to its owner, or takes it back; releasing something else is a violation.
void adoptClone(Core& core, std::unique_ptr<Tracked> clone);
CMPIStatus releaseClone(Tracked* object);

template <class H> CMPIStatus releaseHandle(typename H::Cmpi* object)
{
    H* handle = open<H>(object, "release");
    return handle ? releaseClone(handle) : makeStatus(CMPI_RC_ERR_INVALID_HANDLE);
}

template <class H> typename H::Cmpi* cloneHandle(const typename H::Cmpi* object, CMPIStatus* rc)
{
    H* handle = open<H>(object, "clone", rc);
    if (!handle)
        return nullptr;
    auto copy = std::make_unique<H>(*handle->core, handle->content);
    H* raw = copy.get();
    adoptClone(*handle->core, std::move(copy));
    return raw;
}

/// The object behind any handle by its function table; null for what is not ours.
Tracked* openAny(const void* object);

} // namespace broker
