#include "broker/core/Broker.h"

#include "broker/core/Core.h"
#include "broker/core/Dispatch.h"
#include "broker/tables/Handles.h"

#include <array>
#include <utility>

namespace broker
{

// --- what the parts share ------------------------------------------------------------------------------

namespace
{

std::shared_ptr<ModuleImage> imageOf(const Options& options)
{
    return options.image ? options.image
                         : std::shared_ptr<ModuleImage>(openModule(options.module, options.personality.openMode));
}

const cimple::Meta_Repository* repositoryOf(const ModuleImage& image)
{
    const cimple::Registration* head = image.registrations();
    return head && head->meta_class ? head->meta_class->meta_repository : nullptr;
}

} // namespace

Core::Core(Options brokerOptions)
    : options(std::move(brokerOptions)), tables(options.personality), image(imageOf(options)),
      classes(repositoryOf(*image)), graveyard(options.quarantine), store(classes), providers(*this)
{}

CimError::CimError(const Outcome& outcome)
    : std::runtime_error(statusName(outcome.status) + (outcome.message.empty() ? "" : ": " + outcome.message)),
      _status(outcome.status)
{}

std::string failureText(const std::string& className, const CimError& error)
{
    return className + ": " + error.what();
}

std::string statusName(CMPIrc status)
{
    static constexpr std::array names{"CIM_ERR_OK",
                                      "CIM_ERR_FAILED",
                                      "CIM_ERR_ACCESS_DENIED",
                                      "CIM_ERR_INVALID_NAMESPACE",
                                      "CIM_ERR_INVALID_PARAMETER",
                                      "CIM_ERR_INVALID_CLASS",
                                      "CIM_ERR_NOT_FOUND",
                                      "CIM_ERR_NOT_SUPPORTED",
                                      "CIM_ERR_CLASS_HAS_CHILDREN",
                                      "CIM_ERR_CLASS_HAS_INSTANCES",
                                      "CIM_ERR_INVALID_SUPERCLASS",
                                      "CIM_ERR_ALREADY_EXISTS",
                                      "CIM_ERR_NO_SUCH_PROPERTY",
                                      "CIM_ERR_TYPE_MISMATCH",
                                      "CIM_ERR_QUERY_LANGUAGE_NOT_SUPPORTED",
                                      "CIM_ERR_INVALID_QUERY",
                                      "CIM_ERR_METHOD_NOT_AVAILABLE",
                                      "CIM_ERR_METHOD_NOT_FOUND"};
    const auto index = static_cast<std::size_t>(status);
    return index < names.size() ? names[index] : "CMPI status " + std::to_string(status);
}

// --- clients -------------------------------------------------------------------------------------------

Broker::Broker(Options options) : _core(std::make_unique<Core>(std::move(options))) {}

Broker::~Broker()
{
    if (loaded())
        unload();
}

/// Runs an operation unless the module was unloaded, and keeps it loaded meanwhile.
template <class Answer, class Operation> Answer Broker::guarded(Operation operation)
{
    const std::shared_lock lock(_gate);
    if (!_core->image)
    {
        Answer answer;
        answer.status = CMPI_RC_ERR_FAILED;
        answer.message = "the module is unloaded";
        return answer;
    }
    return operation(Dispatcher(*_core));
}

Outcome Broker::enumerateInstances(std::string_view nameSpace, std::string_view className,
                                   const PropertyList& properties, const ObjectSink& sink)
{
    return guarded<Outcome>([&](Dispatcher dispatcher)
                            { return dispatcher.enumerateInstances(nameSpace, className, properties, sink); });
}

Reply Broker::enumerateInstances(std::string_view nameSpace, std::string_view className, const PropertyList& properties)
{
    return collectObjects([&](const ObjectSink& sink)
                          { return enumerateInstances(nameSpace, className, properties, sink); });
}

Outcome Broker::enumerateInstanceNames(std::string_view nameSpace, std::string_view className, const PathSink& sink)
{
    return guarded<Outcome>([&](Dispatcher dispatcher)
                            { return dispatcher.enumerateInstanceNames(nameSpace, className, sink); });
}

NamesReply Broker::enumerateInstanceNames(std::string_view nameSpace, std::string_view className)
{
    return collectPaths([&](const PathSink& sink) { return enumerateInstanceNames(nameSpace, className, sink); });
}

Reply Broker::getInstance(const Path& path, const PropertyList& properties)
{
    return guarded<Reply>([&](Dispatcher dispatcher) { return dispatcher.getInstance(path, properties); });
}

Outcome Broker::associators(const Path& path, const AssociationFilter& filter, const PropertyList& properties,
                            const ObjectSink& sink)
{
    return guarded<Outcome>([&](Dispatcher dispatcher)
                            { return dispatcher.associators(path, filter, properties, sink); });
}

Reply Broker::associators(const Path& path, const AssociationFilter& filter, const PropertyList& properties)
{
    return collectObjects([&](const ObjectSink& sink) { return associators(path, filter, properties, sink); });
}

Outcome Broker::associatorNames(const Path& path, const AssociationFilter& filter, const PathSink& sink)
{
    return guarded<Outcome>([&](Dispatcher dispatcher) { return dispatcher.associatorNames(path, filter, sink); });
}

NamesReply Broker::associatorNames(const Path& path, const AssociationFilter& filter)
{
    return collectPaths([&](const PathSink& sink) { return associatorNames(path, filter, sink); });
}

Outcome Broker::references(const Path& path, const AssociationFilter& filter, const PropertyList& properties,
                           const ObjectSink& sink)
{
    return guarded<Outcome>([&](Dispatcher dispatcher)
                            { return dispatcher.references(path, filter, properties, sink); });
}

Reply Broker::references(const Path& path, const AssociationFilter& filter, const PropertyList& properties)
{
    return collectObjects([&](const ObjectSink& sink) { return references(path, filter, properties, sink); });
}

Outcome Broker::referenceNames(const Path& path, const AssociationFilter& filter, const PathSink& sink)
{
    return guarded<Outcome>([&](Dispatcher dispatcher) { return dispatcher.referenceNames(path, filter, sink); });
}

NamesReply Broker::referenceNames(const Path& path, const AssociationFilter& filter)
{
    return collectPaths([&](const PathSink& sink) { return referenceNames(path, filter, sink); });
}

NamesReply Broker::createInstance(const Object& object)
{
    return guarded<NamesReply>([&](Dispatcher dispatcher) { return dispatcher.createInstance(object); });
}

Outcome Broker::modifyInstance(const Object& object, const PropertyList& properties)
{
    return guarded<Outcome>([&](Dispatcher dispatcher) { return dispatcher.modifyInstance(object, properties); });
}

Outcome Broker::deleteInstance(const Path& path)
{
    return guarded<Outcome>([&](Dispatcher dispatcher) { return dispatcher.deleteInstance(path); });
}

MethodReply Broker::invokeMethod(const Path& path, const std::string& method, const std::vector<Property>& in)
{
    return guarded<MethodReply>([&](Dispatcher dispatcher) { return dispatcher.invokeMethod(path, method, in); });
}

Outcome Broker::findNameSpace(std::string_view nameSpace)
{
    const Outcome outcome = findClass(nameSpace, {}); // of no class, unless the namespace is wrong already
    return outcome.status == CMPI_RC_ERR_INVALID_CLASS ? Outcome() : outcome;
}

Outcome Broker::findClass(std::string_view nameSpace, std::string_view className)
{
    return guarded<Outcome>(
        [&](Dispatcher dispatcher)
        {
            Outcome outcome;
            dispatcher.findClass(nameSpace, className, outcome);
            return outcome;
        });
}

const ClassTable& Broker::classes() const
{
    return _core->classes;
}

void Broker::declare(const ClassDeclaration& declaration)
{
    const std::unique_lock lock(_gate);
    _core->classes.add(declaration);
}

std::vector<std::string> Broker::nameSpaces()
{
    return Dispatcher(*_core).nameSpaces();
}

Store& Broker::store()
{
    return _core->store;
}

const std::vector<std::string>& Broker::servedClasses() const
{
    return _core->providers.classNames();
}

std::vector<std::string> Broker::nameSpacesOf(std::string_view className) const
{
    const Provider* provider = _core->providers.find(className);
    return provider ? provider->nameSpaces : std::vector<std::string>();
}

void Broker::withFunction(const std::string& name, const std::function<void(void*)>& use)
{
    const std::shared_lock lock(_gate);
    if (void* function = _core->image ? _core->image->symbol(name) : nullptr)
        use(function);
}

bool Broker::serves(std::string_view className, Kind kind) const
{
    const std::shared_lock lock(_gate);
    return _core->image && _core->providers.serves(className, kind);
}

// --- loading -------------------------------------------------------------------------------------------

Outcome Broker::loadProvider(std::string_view className, const std::vector<Kind>& kinds)
{
    const std::shared_lock lock(_gate);
    Provider* provider = _core->image ? _core->providers.find(className) : nullptr;
    if (!provider)
        return {CMPI_RC_ERR_INVALID_CLASS, "the module serves no class '" + std::string(className) + "'"};
    Outcome outcome;
    for (const Kind kind : kinds)
        if (!_core->providers.load(*provider, kind, outcome))
            break;
    return outcome;
}

std::vector<CleanupAnswer> Broker::cleanup(std::string_view className, bool terminating)
{
    const std::unique_lock lock(_gate);
    return _core->image ? _core->providers.cleanup(className, terminating) : std::vector<CleanupAnswer>();
}

std::vector<CleanupAnswer> Broker::unload()
{
    const std::unique_lock lock(_gate);
    if (!_core->image)
        return {};
    std::vector<CleanupAnswer> answers = _core->providers.shutdown();
    _core->options.image.reset();
    _core->image.reset();
    for (const auto& clone : _core->clones.takeAll())
        _core->violation("a clone of a " + std::string(clone->kind()) + " was never released");
    if (const std::size_t left = _core->attachments.count())
        _core->violation(std::to_string(left) + " prepared thread contexts were never detached");
    if (const std::size_t left = _core->openMarks)
        _core->violation(std::to_string(left) + " marks were never released");
    return answers;
}

bool Broker::loaded() const
{
    const std::shared_lock lock(_gate);
    return _core->image != nullptr;
}

std::vector<Violation> Broker::violations() const
{
    return _core->violations.all();
}

void Broker::clearViolations()
{
    _core->violations.clear();
}

std::size_t Broker::liveClones() const
{
    return _core->clones.count();
}

std::vector<Object> Broker::indications() const
{
    const std::lock_guard lock(_core->indicationMutex);
    return _core->indications;
}

} // namespace broker
