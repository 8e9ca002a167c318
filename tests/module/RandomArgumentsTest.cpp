// Whatever a client sends: every method, creation, change and deletion of every class with random arguments. Each is
// answered with a status or a value, nothing of the host changes but by what reports success, and no password gets
// into the log. The environment variable TVR_SEED repeats a run.
#include "broker/values/PathText.h"
#include "broker/values/ValueText.h"
#include "simulator/FirmwareFile.h"
#include "tests/module/Host.h"
#include "tests/module/Walk.h"
#include "tests/support/Sanitized.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <random>

using namespace module_test;
using broker::ClassInfo;
using broker::FeatureInfo;
using broker::Object;
using broker::Path;
using broker::Property;
using broker::Value;

namespace
{

constexpr const char* password = "c0rrect-h0rse";
const std::string firmware = tvrsim::firmwareText("TV1602", "11.8.1.0", "program");
/// For what has no body, and for what answers more than that this is not supported.
constexpr unsigned briefRounds = 1;
constexpr unsigned rounds = TVR_SANITIZED ? 10 : 80;

std::uint64_t seed()
{
    const char* given = std::getenv("TVR_SEED");
    return given ? std::strtoull(given, nullptr, 0) : std::random_device()();
}

/// Texts and paths as a client with errors, or with intentions, sends them.
class Arguments
{
public:
    Arguments(std::uint64_t seed, Host& host) : _random(seed), _host(host)
    {
        const broker::NamesReply all = host.broker().enumerateInstanceNames("root/tavrin", "CIM_ManagedElement");
        for (const Path& path : all.paths)
            _instances[path.className].push_back(path);
    }

    std::size_t below(std::size_t end) { return std::uniform_int_distribution<std::size_t>(0, end - 1)(_random); }
    bool oneIn(std::size_t chances) { return below(chances) == 0; }
    template <class Range> const auto& anyOf(const Range& range)
    {
        return *std::next(range.begin(), below(range.size()));
    }

    /// From now on all types, paths and presences are right, or else not.
    void carefully(bool careful) { _careful = careful; }

    /// Most of them are what the class has.
    std::vector<Property> of(const std::vector<FeatureInfo>& features)
    {
        std::vector<Property> arguments;
        for (const FeatureInfo& feature : features)
            if (!errs(8))
                arguments.push_back({feature.name, value(feature)});
        return arguments;
    }

    /// An instance of the class or another, with keys that are right or wrong.
    Path path(const std::string& className)
    {
        const ClassInfo* info = _host.broker().classes().find(className);
        Path path = known(info ? _host.broker().classes().withSubclasses(*info) : std::vector<const ClassInfo*>{});
        if (path.className.empty() || errs(6))
            path = known({});
        if (errs(3))
            spoil(path);
        return path;
    }

    /// Values of a class's properties, with those of the path's keys among them.
    Object object(const ClassInfo& info)
    {
        Object object{path(info.name), {}};
        object.path.className = info.name;
        for (const Property& argument : of(info.properties))
            if (oneIn(2) && !endsServer(*info.property(argument.name), argument.value))
                object.set(argument.name, argument.value);
        for (const Property& key : object.path.keys)
            if (info.property(key.name) && !oneIn(8) && !endsServer(*info.property(key.name), key.value))
                object.set(key.name, key.value);
        return object;
    }

private:
    bool errs(std::size_t chances) { return !_careful && oneIn(chances); }

    /// Some servers do not survive texts in properties that have none, whoever reads them.
    bool endsServer(const FeatureInfo& property, const Value& value) const
    {
        return _host.options.personality.wrongProperties == broker::WrongProperties::accepted &&
               value.type() != property.type && (value.type() & ~CMPI_ARRAY) == CMPI_string;
    }

    Value value(const FeatureInfo& feature)
    {
        const bool isArray = feature.type & CMPI_ARRAY;
        const auto scalar = static_cast<CMPIType>(feature.type & ~CMPI_ARRAY);
        if (errs(10))
            return Value::null(feature.type);
        if (errs(20)) // of another type
            return oneIn(2)   ? Value::array(CMPI_string, {text(feature)})
                   : oneIn(2) ? text(feature)
                              : number(CMPI_uint64);
        if (!isArray)
            return value(feature, scalar);
        if ((feature.flags & cimple::META_OCTET_STRING) && oneIn(2))
            return bytes(firmware);
        if (oneIn(30)) // far more than anyone needs, of short ones
            return Value::array(scalar, Value::List(20'000, shortValue(scalar)));
        Value::List elements;
        for (std::size_t size = below(4); elements.size() < size;)
            elements.push_back(errs(10) ? Value::null(scalar) : value(feature, scalar));
        return Value::array(scalar, std::move(elements));
    }

    Value value(const FeatureInfo& feature, CMPIType type)
    {
        switch (type)
        {
        case CMPI_boolean:
            return Value::boolean(oneIn(2));
        case CMPI_real32:
            return Value::real32(-1e30F);
        case CMPI_real64:
            return Value::real64(1e300);
        case CMPI_string:
            return text(feature);
        case CMPI_dateTime:
            return Value::dateTime(oneIn(2) ? broker::DateTime::now() : broker::DateTime());
        case CMPI_ref:
            return Value::reference(path(feature.referenceClass));
        case CMPI_instance:
            return Value::instance({path(feature.referenceClass), {{"InstanceID", text(feature)}}});
        default:
            return number(type);
        }
    }

    static Value bytes(const std::string& text)
    {
        Value::List list;
        for (const char byte : text)
            list.push_back(Value::uint8(static_cast<std::uint8_t>(byte)));
        return Value::array(CMPI_uint8, std::move(list));
    }

    Value shortValue(CMPIType type)
    {
        switch (type)
        {
        case CMPI_string:
            return Value::string("x");
        case CMPI_ref:
            return Value::reference(known({}));
        case CMPI_instance:
            return Value::instance({known({}), {}});
        default:
            return value({}, type);
        }
    }

    Value number(CMPIType type)
    {
        static constexpr std::array<std::uint64_t, 14> numbers{0,  1,  2,    3,    4,      5,          7,
                                                               11, 22, 0xff, 8000, 0x8000, 0xffffffff, ~0ULL};
        return Value::integer(type, numbers[below(_careful ? 3 : numbers.size())]);
    }

    Value text(const FeatureInfo& feature)
    {
        const bool isUri = feature.name.find("URI") != std::string::npos;
        const std::string inRoot = (_host.root() / "file").string();
        const std::vector<std::string> uris{"file://" + inRoot,
                                            inRoot,
                                            "file:///dev/zero",
                                            "/dev/zero",
                                            "file://" + _host.root().string(),
                                            std::string("ftp://user:") + password + "@host.invalid/file",
                                            "http://user:" + std::string(password) + "@",
                                            std::string("FTP://a:") + password + "@b@c:99999/x?y#z",
                                            "sftp://:" + std::string(password) + "@host/",
                                            "user:" + std::string(password) + "@host:/file",
                                            "file://user:" + std::string(password) + "@/file"};
        if (isUri && !oneIn(4))
            return Value::string(anyOf(uris));
        static const std::vector<std::string> texts{"",
                                                    " ",
                                                    "0",
                                                    "1",
                                                    "4294967296",
                                                    "-1",
                                                    "x",
                                                    "file",
                                                    "..",
                                                    "../file",
                                                    "/etc/hostname",
                                                    "a/b",
                                                    "%s%n%s%n",
                                                    "1000027A51160210",
                                                    "10:00:02:7a:51:16:02:10",
                                                    "1000027A5116021",
                                                    "1000027A51160210G",
                                                    "50063D200110000A",
                                                    "2000027A51160299",
                                                    "cr_delay",
                                                    "cr_delay=1",
                                                    "lun-queue-depth",
                                                    "\xc3\xa9\xe2\x82\xac",
                                                    "\xff\xfe\x80",
                                                    "a\nb\tc\x01",
                                                    std::string(255, 'y'),
                                                    std::string(256, 'z'),
                                                    std::string(100'000, 'L')};
        return Value::string(anyOf(texts));
    }

    /// A key of an instance, whole or with an error.
    std::string knownText()
    {
        const Path path = known({});
        std::string text = path.keys.empty() ? "" : broker::valueText(anyOf(path.keys).value);
        return oneIn(2) ? text : spoiled(std::move(text));
    }

    std::string spoiled(std::string text)
    {
        static const std::string characters = "0129aF:=/.\\\xff";
        if (!text.empty() && oneIn(2))
            text[below(text.size())] = anyOf(characters);
        else if (oneIn(2))
            text.erase(below(text.size() + 1));
        else
            text += anyOf(characters);
        return text;
    }

    /// One of an instance of these classes, or of any.
    Path known(const std::vector<const ClassInfo*>& classes)
    {
        std::vector<const std::vector<Path>*> candidates;
        for (const ClassInfo* info : classes)
            if (const auto found = _instances.find(info->name); found != _instances.end())
                candidates.push_back(&found->second);
        if (!candidates.empty())
            return anyOf(*anyOf(candidates));
        return classes.empty() ? anyOf(anyOf(_instances).second) : Path();
    }

    void spoil(Path& path)
    {
        if (path.keys.empty())
            return path.setKey("Key", number(CMPI_uint16));
        Property& key = path.keys[below(path.keys.size())];
        switch (below(6))
        {
        case 0:
            return path.keys.clear();
        case 1:
        case 2:
            key.value = Value::string(spoiled(broker::valueText(key.value)));
            return;
        case 3:
            key.value = number(CMPI_uint16);
            return;
        case 4:
            path.className = oneIn(2) ? "CIM_ManagedElement" : "TVRHBA_NoSuchClass";
            return;
        default:
            path.nameSpace = oneIn(2) ? "" : "root/none";
        }
    }

    std::mt19937_64 _random;
    Host& _host;
    bool _careful = false;
    std::map<std::string, std::vector<Path>> _instances; ///< by class
};

/// What a failure shows.
struct Operation
{
    std::string name;
    const Path& path;
    const std::vector<Property>& values;

    friend std::ostream& operator<<(std::ostream& out, const Operation& operation)
    {
        constexpr std::size_t longest = 200;
        out << operation.name << " on " << broker::fullPathText(operation.path) << '\n';
        for (const Property& value : operation.values)
            out << "    " << value.name << " = " << broker::valueText(value.value).substr(0, longest) << '\n';
        return out;
    }
};

class RandomArguments : public testing::TestWithParam<const char*>
{
protected:
    RandomArguments() : host(GetParam()), seed(::seed()), trace(__FILE__, __LINE__, "TVR_SEED=" + std::to_string(seed))
    {
        addPlatform(host.broker());
        host.write("/work/file", "in the way\n");
        std::filesystem::current_path(host.root() / "work");
        arguments.emplace(seed, host);
        host.instancesOf("TVRHBA_StorageVolume"); // what changes while the host is read has changed
        host.rememberState();
    }
    ~RandomArguments() override { std::filesystem::current_path(folder); }

    /// The operation must have answered with a status of CIM, and have changed the host with success alone.
    void judge(const broker::Outcome& outcome, bool success, const Operation& operation)
    {
        EXPECT_LE(outcome.status, CMPI_RC_ERR_METHOD_NOT_FOUND) << operation << outcome.message;
        EXPECT_EQ(outcome.message.find(password), std::string::npos) << operation;
        const std::string difference = host.stateDifference();
        if (difference.empty())
            return;
        EXPECT_TRUE(success) << operation << "failed and changed the " << difference;
        host.rememberState();
    }

    void expectNoPasswords()
    {
        for (const std::string& line : host.log())
            EXPECT_EQ(line.find(password), std::string::npos) << line;
    }

    const std::filesystem::path folder = std::filesystem::current_path();
    Host host;
    const std::uint64_t seed;
    const testing::ScopedTrace trace;
    std::optional<Arguments> arguments;
};

TEST_P(RandomArguments, OfMethods)
{
    unsigned answered = 0;
    for (const std::string& className : host.broker().servedClasses())
    {
        const ClassInfo& info = *host.broker().classes().find(className);
        for (const broker::MethodInfo& method : info.methods)
        {
            unsigned planned = briefRounds;
            for (unsigned round = 0; round < planned; ++round)
            {
                arguments->carefully(round % 2 == 1);
                Path path = arguments->path(className);
                if (!arguments->oneIn(8))
                    path.className = className;
                const std::vector<Property> in = arguments->of(method.parameters);
                if (!std::filesystem::exists(host.root() / "file")) // those who install it take it away
                    host.write("/file", firmware);
                const Operation operation{method.name, path, in};
                const broker::MethodReply reply = host.broker().invokeMethod(path, method.name, in);
                const bool hasValue = !reply.returnValue.isNull();
                EXPECT_EQ(reply.ok(), hasValue) << operation;
                judge(reply, hasValue && reply.returnValue.asUnsigned() == 0, operation);
                answered += reply.ok();
                if (reply.status != CMPI_RC_ERR_NOT_SUPPORTED)
                    planned = rounds;
            }
        }
    }
    EXPECT_GT(answered, 0u);
    expectNoPasswords();
    host.unload();
}

TEST_P(RandomArguments, OfInstances)
{
    for (const std::string& className : host.broker().servedClasses())
    {
        const ClassInfo& info = *host.broker().classes().find(className);
        const auto repeat = [&](const char* name, auto operation)
        {
            unsigned planned = briefRounds;
            for (unsigned round = 0; round < planned; ++round)
            {
                arguments->carefully(round % 2 == 1);
                const Object object = arguments->object(info);
                const broker::Outcome outcome = operation(object);
                judge(outcome, outcome.ok(), {name, object.path, object.properties});
                if (outcome.status != CMPI_RC_ERR_NOT_SUPPORTED)
                    planned = rounds;
            }
        };
        repeat("create", [&](const Object& object) { return host.broker().createInstance(object); });
        repeat("modify", [&](const Object& object) { return host.broker().modifyInstance(object); });
        repeat("delete", [&](const Object& object) { return host.broker().deleteInstance(object.path); });
    }
    expectNoPasswords();
    host.unload();
}

INSTANTIATE_TEST_SUITE_P(Hosts, RandomArguments, testing::Values("default", "lanes"),
                         [](const auto& info) { return std::string(info.param); });

} // namespace
