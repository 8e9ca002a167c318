#include "broker/tvrcim/CheckCommand.h"

#include "broker/host/ReadableText.h"
#include "broker/tvrcim/CheckFiles.h"
#include "broker/tvrcim/CheckLibraries.h"
#include "broker/tvrcim/CheckServers.h"
#include "broker/tvrcim/Environment.h"
#include "broker/tvrcim/Findings.h"
#include "broker/tvrcim/Replies.h"

#include <cstdlib>
#include <exception>
#include <filesystem>
#include <iterator>
#include <memory>

#include <dlfcn.h>

namespace tvrcim
{

using namespace broker;

namespace
{

void append(Findings& findings, Findings more)
{
    std::ranges::move(more, std::back_inserter(findings));
}

// --- the adapters

/// "TV1602 (TV16A02417), TV3202 (TV32B71155)"
std::string namesOf(const std::vector<Object>& cards)
{
    std::string names;
    for (const Object& card : cards)
        names += (names.empty() ? "" : ", ") + textOf(card, "Model") + " (" + textOf(card, "SerialNumber") + ")";
    return names;
}

Json factsOf(const std::vector<Object>& cards, std::size_t ports)
{
    Json list = Json::array();
    for (const Object& card : cards)
        list.push_back({{"model", textOf(card, "Model")}, {"serialNumber", textOf(card, "SerialNumber")}});
    return {{"cards", std::move(list)}, {"ports", ports}};
}

Finding adapters(Broker& broker, const std::string& nameSpace, const Libraries& libraries)
try
{
    const char* subject = "adapters";
    const std::vector<Object> cards = checked(broker.enumerateInstances(nameSpace, "TVRHBA_Card")).objects;
    const std::size_t ports = checked(broker.enumerateInstanceNames(nameSpace, "TVRHBA_FCPort")).paths.size();
    if (cards.empty())
        return {State::missing, subject, "none is seen",
                libraries.allFound() ? "load the adapters' driver; /etc/hba.conf must name the vendor's HBA API library"
                                     : "install the libraries",
                factsOf(cards, ports)};
    return {State::ok, subject,
            countText(cards.size(), "card", "cards") + " with " + countText(ports, "FC port", "FC ports") + ": " +
                shortened(namesOf(cards), 200),
            "", factsOf(cards, ports)};
}
catch (const CimError& error)
{
    return {State::wrong, "adapters", error.what(), "'tvrcim --hardware log' shows what the provider says of it"};
}

// --- the module

std::string loadedPath(const std::string& module)
{
    void* library = dlopen(module.c_str(), RTLD_LAZY | RTLD_NOLOAD);
    if (!library)
        return module;
    const std::string path = pathOfLibrary(library);
    dlclose(library);
    return path.empty() ? module : path;
}

/// As its identity has it, which is there when adapters are; empty otherwise.
std::string versionOf(Broker& broker, const std::string& nameSpace)
{
    for (const Path& path : broker.enumerateInstanceNames(nameSpace, "TVRHBA_ProviderSoftwareIdentity").paths)
        if (const Value* identity = path.key("Antecedent"); identity && !identity->isNull())
            if (const Reply reply = broker.getInstance(identity->asPath()); reply.ok() && !reply.objects.empty())
                return textOf(reply.objects.front(), "VersionString");
    return {};
}

Finding module(Broker& broker, const std::string& path, const std::string& nameSpace)
{
    std::uint64_t factories = 0;
    std::string without;
    for (const std::string& name : broker.servedClasses())
    {
        for (const Kind kind : allKinds)
            factories += broker.serves(name, kind);
        if (!broker.serves(name, Kind::instance))
            without += (without.empty() ? "" : ", ") + name;
    }
    const std::uint64_t classes = broker.servedClasses().size();
    const std::string version = versionOf(broker, nameSpace);
    Finding finding{.subject = "module"};
    finding.text = loadedPath(path) + (version.empty() ? "" : ", version " + version) + ", " +
                   countText(classes, "class", "classes") + " and " + countText(factories, "factory", "factories");
    if (!without.empty())
    {
        finding.state = State::wrong;
        finding.text += "; none for " + shortened(without, 100);
        finding.remedy = "install the package tavrin-fc-provider anew";
    }
    finding.facts = {{"path", loadedPath(path)},
                     {"version", version.empty() ? Json() : Json(version)},
                     {"classes", classes},
                     {"factories", factories}};
    return finding;
}

Finding registration(const std::string& file)
{
    if (file.empty())
        return {State::warning, "registration", "there is no registration file beside the module",
                "install the package tavrin-fc-provider: servers need the file"};
    return {State::ok, "registration", file, "", Json{{"path", file}}};
}

/// The module and what it sees, where it can be opened; the libraries are looked at while it has them initialised.
Findings provider(const Settings& settings, SignalEnd& signals, const Libraries& libraries)
{
    const std::string path = settings.module.empty() ? findModule() : settings.module;
    const std::string file = std::filesystem::path(findRegistration(path)).lexically_normal();
    std::unique_ptr<Broker> broker;
    std::string failure;
    try
    {
        broker = std::make_unique<Broker>(
            Options{.module = path, .registration = file, .personality = settings.personality});
    }
    catch (const std::exception& error)
    {
        failure = error.what();
    }
    if (!broker)
    {
        Findings findings = libraries.findings(false);
        findings.push_back({State::wrong, "module", failure,
                            "install the package tavrin-fc-provider, or name the module by --module",
                            Json{{"path", path}}});
        return findings;
    }
    const UnloadedBySignal entrusted(signals, *broker);
    const Finding seen = adapters(*broker, settings.nameSpace, libraries);
    Findings findings = libraries.findings(true);
    findings.push_back(seen);
    findings.push_back(module(*broker, path, settings.nameSpace));
    findings.push_back(registration(file));
    broker->unload();
    for (const Violation& violation : broker->violations())
        findings.push_back({State::wrong, "module", "breaks the rules of its interface: " + violation.text});
    return findings;
}

} // namespace

int checkHost(const Settings& settings, SignalEnd& signals, std::ostream& out, bool colour)
{
    if (settings.format == Format::mof)
        throw UsageError("--format: a check is none of MOF");
    Findings files = checkFiles();
    // A module writes its settings and a log: here it has a folder for that, so that a check changes nothing.
    unsetenv("TVR_FILE_ROOT");
    const FileRoot root(signals);
    Findings findings;
    if (!settings.hardware)
    {
        startSimulator(settings.scenario);
        findings.push_back({State::note, "simulation", "the libraries and adapters below are those of the simulator",
                            "'tvrcim --hardware check' looks at this machine's"});
    }
    append(findings, provider(settings, signals, Libraries()));
    append(findings, std::move(files));
    append(findings, checkServers());
    if (settings.format == Format::json)
        printJson(out, toJson(findings));
    else
        printFindings(out, findings, colour);
    return isComplete(findings) ? 0 : exitIncomplete;
}

} // namespace tvrcim
