// Dumps of the adapters: what a client has made, lists and deletes, how many are kept, and what the refresh knows of
// it.
#include "tests/module/Clock.h"
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"
#include "tests/module/ModuleMemory.h"
#include "tests/module/RefreshLines.h"
#include "tests/module/ServiceHost.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <map>

using namespace module_test;
using namespace std::chrono_literals;
using broker::Value;
using testing::AllOf;
using testing::Contains;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using testing::MatchesRegex;
using testing::SizeIs;

namespace
{

using Texts = std::vector<std::string>;

const std::map<std::string, std::string> entries = {
    {"GenerateDump", "[TVR_DBG] Entering GenerateDump"},
    {"GetDumpFileNames", "[TVR_DBG] Entering GetDumpFileNames method"},
    {"DeleteDump", "[TVR_DBG] Entering DeleteDump"},
};

std::string hostOf(const std::string& port1, const std::string& port2 = "")
{
    const auto adapter = [](const char* number, const std::string& members)
    {
        return std::string(R"({"name": "A)") + number + R"(", "serialNumber": "S", "model": "M", "ports": [{"wwpn": )" +
               "\"100000000000000" + number + "\"" + members + "}]}";
    };
    return R"({"adapters": [)" + adapter("1", port1) + ", " + adapter("2", port2) + "]}";
}

/// Member of a port that has so many dump files.
std::string filesMember(const Texts& names)
{
    std::string list;
    for (const std::string& name : names)
        list += (list.empty() ? "\"" : ", \"") + name + "\"";
    return R"(, "dumps": {"files": [)" + list + "]}";
}

Texts numbered(unsigned count)
{
    Texts names;
    for (unsigned i = 0; i < count; i++)
        names.push_back(std::to_string(i) + ".dmp");
    return names;
}

std::string fault(const std::string& function, const std::string& effect)
{
    return R"({"function": ")" + function + "\", " + effect + "}";
}

class DumpHost : public ServiceHost
{
public:
    explicit DumpHost(const std::string& scenario = hostOf("")) : ServiceHost("TVRHBA_DumpService", scenario)
    {
        port = instancesOf("TVRHBA_PortController").at(0).path;
    }

    Answer on(const std::string& method) { return callOnPort(method, entries.at(method)); }
    Texts files()
    {
        const Value names = on("GetDumpFileNames").at("DumpFiles");
        Texts texts;
        if (!names.isNull())
            for (const Value& name : names.asList())
                texts.push_back(name.asString());
        return texts;
    }
    broker::Object data(std::size_t index = 0) { return instancesOf("TVRHBA_DumpData").at(index); }
    std::uint64_t retention(std::size_t index = 0) { return data(index).get("RetentionCount").asUnsigned(); }
    /// Changes what is given of the first port's data, and sends the rest along.
    CMPIrc modify(const std::vector<broker::Property>& changes, const broker::PropertyList& named = {})
    {
        broker::Object wanted = data();
        for (const broker::Property& change : changes)
            wanted = changedWith(wanted, change);
        _before = log().size();
        return broker().modifyInstance(wanted, named).status;
    }
    CMPIrc keep(std::uint32_t count) { return modify({{"RetentionCount", Value::uint32(count)}}); }
    /// Lines of the last change, up to the rebuilding of the classes.
    Texts linesOfChange() const
    {
        Texts lines = log();
        lines.erase(lines.begin(), lines.begin() + static_cast<std::ptrdiff_t>(_before));
        const auto begin = std::ranges::find(lines, "[TVR_DBG] TVRHBA_DumpData_Provider::modify_instance()");
        const auto end = std::ranges::find(lines, "[TVR_DBG] Entered FC_ClearDumpClasses");
        Texts own(begin == lines.end() ? begin : begin + 1, end);
        for (const char* word : {"BuildCimpleInfo", "PERF: ", "TimeOut", "loadedtime", "TVR_MethodWrapper::Id2",
                                 "TVR_MethodWrapper::str2", "DeviceID is::", "HBA Name is::", "wwpn:("})
            std::erase_if(own, [&](const std::string& line) { return line.find(word) != line.npos; });
        return own;
    }

private:
    static broker::Object changedWith(broker::Object object, const broker::Property& change)
    {
        std::erase_if(object.properties, [&](const broker::Property& known) { return known.name == change.name; });
        object.properties.push_back(change);
        return object;
    }

    std::size_t _before = 0;
};

// --- the methods

TEST(Dumps, AreMadeListedAndDeleted)
{
    stopClock();
    DumpHost host(hostOf("", filesMember({"other.dmp"})));
    EXPECT_THAT(host.on("GetDumpFileNames").lines,
                ElementsAre("[TVR_DBG] Calling the Get Dump filenames method",
                            "[TVR_DBG] GetDumpFileNames Succesful, NumberOfFileEntries : 0"));
    EXPECT_TRUE(host.on("GetDumpFileNames").at("DumpFiles").isNull());

    const Answer made = host.on("GenerateDump");
    EXPECT_EQ(made.value, 0u);
    EXPECT_THAT(made.lines, ElementsAre("[TVR_DBG] TVRHBA_DumpService::tvrcimDumpDiagnostic Succesful",
                                        "[TVR_DBG] returning from TVRHBA_DumpService::GenerateDump"));
    const Answer one = host.on("GetDumpFileNames");
    EXPECT_EQ(one.value, 0u);
    const Texts files = host.files();
    ASSERT_THAT(files, ElementsAre(MatchesRegex("1000000000000001_[0-9]{8}_[0-9]{6}\\.dmp")));
    EXPECT_THAT(one.lines, ElementsAre("[TVR_DBG] Calling the Get Dump filenames method",
                                       "[TVR_DBG] GetDumpFileNames Succesful, NumberOfFileEntries : 1",
                                       "[TVR_DBG] Filenames = " + files[0], "[TVR_DBG] Filename[0] = " + files[0]));
    EXPECT_EQ(host.on("GenerateDump").value, 0u);
    advanceClock(1min);
    EXPECT_EQ(host.on("GenerateDump").value, 0u);
    EXPECT_THAT(host.files(), AllOf(SizeIs(3), Contains(files[0].substr(0, 32) + "_2.dmp")));

    const Answer deleted = host.on("DeleteDump");
    EXPECT_EQ(deleted.value, 0u);
    EXPECT_THAT(deleted.lines, ElementsAre("[TVR_DBG] TVRHBA_DumpService::tvrcimDeleteDumpFiles Succesful",
                                           "[TVR_DBG] returning from TVRHBA_DumpService::DeleteDump"));
    EXPECT_THAT(host.files(), IsEmpty());
    host.port = host.instancesOf("TVRHBA_PortController").at(1).path;
    EXPECT_THAT(host.files(), ElementsAre("other.dmp")) << "of another adapter";
    host.unload();
}

TEST(Dumps, ListsOfAnyLengthComeWhole)
{
    const struct
    {
        unsigned files;
        std::uint64_t calls;
    } rows[] = {{3, 1}, {4, 1}, {5, 2}, {300, 2}, {4096, 2}};
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.files);
        DumpHost host(hostOf(filesMember(numbered(row.files))));
        EXPECT_EQ(host.files(), numbered(row.files));
        EXPECT_EQ(host.calls("LRM_GetDumpFileNames"), row.calls);
        host.unload();
    }
}

TEST(Dumps, OnlyFilesWithTheEndingOfADumpAreListed)
{
    DumpHost host(hostOf(filesMember({"a.fat", "dump.log", "core", "xcore", "b.efd", "c.txt", "d.dmp", "e.cee", "f.bin",
                                      "g.DMP", "ore", ".dmp.gz", ""})));
    EXPECT_THAT(host.files(), ElementsAre("a.fat", "core", "xcore", "b.efd", "c.txt", "d.dmp", "e.cee", "f.bin"));
    const Texts lines = host.on("GetDumpFileNames").lines;
    EXPECT_THAT(lines, AllOf(Contains("[TVR_DBG] Filenames = dump.log"), Contains("[TVR_DBG] Filename[2] = core"),
                             Contains("[TVR_DBG] Filenames = ")));
    host.unload();

    DumpHost without(hostOf(filesMember({"dump.log"})));
    EXPECT_TRUE(without.on("GetDumpFileNames").at("DumpFiles").isNull());
    without.unload();
}

TEST(Dumps, WrongArgumentsReachNoLibrary)
{
    DumpHost host;
    const broker::Path service = host.service, port = host.port;
    broker::Path wrongService = service, unknown = port;
    wrongService.setKey("Name", Value::string("another"));
    unknown.setKey("DeviceID", Value::string("1000000000000099"));
    const broker::Path fcPort = host.instancesOf("TVRHBA_FCPort").at(0).path; // of the same DeviceID
    const auto target = [](const broker::Path& path) {
        return std::vector<broker::Property>{{"Target", Value::reference(path)}};
    };
    const std::string noTarget = "[TVR_ERR] TVRHBA_DumpService invald port ...return"; // also of another class
    const std::string invalid = "[TVR_DBG] TVRHBA_DumpService::Id2HBAName failed";
    const struct
    {
        broker::Path service;
        std::vector<broker::Property> in;
        std::uint64_t value;
        std::string line;
    } rows[] = {
        {wrongService, target(port), 33068, "[TVR_ERR] Invalid instance of TVRHBA_DumpService"},
        {service, {}, 32968, noTarget},
        {service, target(unknown), 32968, invalid},
        {service, target(fcPort), 32968, noTarget},
    };
    for (const auto& row : rows)
        for (const auto& [method, entry] : entries)
        {
            SCOPED_TRACE(method + " " + row.line);
            host.service = row.service;
            const Answer answer = host.call(method, entry, row.in);
            EXPECT_EQ(answer.value, row.value);
            EXPECT_THAT(answer.lines, ElementsAre(row.line));
        }
    for (const char* function : {"LRM_GenerateDump", "LRM_GetDumpFileNames", "LRM_DeleteDumpFiles"})
        EXPECT_EQ(host.calls(function), 0u) << function;
    host.unload();
}

TEST(Dumps, AnyServiceWillDoWhereThereIsNone)
{
    DumpHost known;
    const broker::Path service = known.service, port = known.port;
    known.unload();
    Host host(R"({"adapters": []})");
    EXPECT_THAT(host.instancesOf("TVRHBA_DumpService"), IsEmpty());
    const broker::MethodReply reply =
        host.broker().invokeMethod(service, "GenerateDump", {{"Target", Value::reference(port)}});
    EXPECT_EQ(reply.returnValue.asUnsigned(), 32968u);
    EXPECT_EQ(host.logged("[TVR_DBG] TVRHBA_DumpService::Id2HBAName failed"), 1u);
    host.unload();
}

TEST(Dumps, FailuresOfTheLibraryComeAs40000AndTheirStatus)
{
    const std::string listed = "[TVR_DBG] Calling the Get Dump filenames method";
    const struct
    {
        const char* method;
        const char* function;
        unsigned status;
        Texts lines;
    } rows[] = {
        {"GenerateDump",
         "LRM_GenerateDump",
         2,
         {"[TVR_DBG] Failed to generate the dump file, exited with error code 2",
          "[TVR_DBG] Status: <2>:The operation is not supported",
          "[TVR_ERR] TVRHBA_DumpService::tvrcimDumpDiagnostic failed"}},
        {"DeleteDump",
         "LRM_DeleteDumpFiles",
         1,
         {"[TVR_DBG] Failed to delete the Dump files, exited with error code 1",
          "[TVR_DBG] Status: <1>:The operation failed", "[TVR_ERR] TVRHBA_DumpService::tvrcimDeleteDumpFiles failed"}},
        {"GetDumpFileNames",
         "LRM_GetDumpFileNames",
         97,
         {listed, "[TVR_DBG] Status: <97>:The adapter is busy",
          "[TVR_ERR] TVRHBA_DumpService::tvrcimGetDumpFileNames failed"}},
        {"GetDumpFileNames", // that never has enough room
         "LRM_GetDumpFileNames",
         191,
         {listed, "[TVR_DBG] Status: <191>:The list is too small for the entries",
          "[TVR_DBG] Status: <191>:The list is too small for the entries",
          "[TVR_ERR] TVRHBA_DumpService::tvrcimGetDumpFileNames failed"}},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(std::string(row.function) + " " + std::to_string(row.status));
        DumpHost host(hostOf(filesMember({"a.dmp"})));
        host.addFault(fault(row.function, "\"status\": " + std::to_string(row.status)));
        const Answer answer = host.on(row.method);
        EXPECT_EQ(answer.value, 40000 + row.status);
        EXPECT_THAT(answer.lines, ElementsAreArray(row.lines));
        EXPECT_TRUE(answer.at("DumpFiles").isNull());
        host.clearFaults();
        EXPECT_THAT(host.files(), ElementsAre("a.dmp"));
        host.unload();
    }
    DumpHost more(hostOf(filesMember(numbered(4097))));
    EXPECT_EQ(more.on("GetDumpFileNames").value, 40191u) << "more than are asked for";
    more.unload();
}

TEST(Dumps, NamesThatLieAreCutToTheirRoom)
{
    for (const char* kind : {"hugeCount", "unterminatedText", "allOnes"})
    {
        SCOPED_TRACE(kind);
        DumpHost host(hostOf(filesMember({"a.dmp", "b.dmp"})));
        host.addFault(fault("LRM_GetDumpFileNames", std::string(R"("hostile": ")") + kind + "\""));
        EXPECT_EQ(host.on("GetDumpFileNames").value, 0u);
        if (std::string(kind) == "hugeCount")
        {
            EXPECT_THAT(host.files(), ElementsAre("a.dmp", "b.dmp")) << "the others have no name";
        }
        if (std::string(kind) == "unterminatedText")
        {
            EXPECT_THAT(host.on("GetDumpFileNames").lines,
                        Contains("[TVR_DBG] Filenames = " + std::string(256, 'X')).Times(2));
        }
        host.unload();
    }
}

// --- what is kept

TEST(Dumps, NoMoreAreKeptThanTheRetentionCount)
{
    stopClock();
    DumpHost host;
    EXPECT_EQ(host.keep(2), CMPI_RC_OK);
    EXPECT_THAT(host.linesOfChange(),
                ElementsAre("[TVR_DBG] found the key match for instance.", "[TVR_DBG]  For Non VMWARE",
                            "[TVR_DBG] TVR_MethodWrapper::tvrcimSetRetentionCount succeded"));
    EXPECT_EQ(host.retention(), 2u) << "at once";
    EXPECT_EQ(host.retention(1), 5u) << "of another adapter";
    Texts all;
    for (unsigned i = 0; i < 3; i++)
    {
        EXPECT_EQ(host.on("GenerateDump").value, 0u);
        all.push_back(host.files().back());
        advanceClock(1s);
    }
    EXPECT_THAT(host.files(), ElementsAre(all[1], all[2]));
    host.unload();
}

TEST(Dumps, ChangesAreRefusedOneByOne)
{
    const std::string found = "[TVR_DBG] found the key match for instance.";
    const std::string sameDirectory = "[TVR_DBG]  For Non VMWARE";
    const std::string done = "[TVR_DBG] TVR_MethodWrapper::tvrcimSetRetentionCount succeded";
    const std::string otherDirectory = "[TVR_DBG] tvrcimSetDumpDirectory is not supported";
    const std::string range = "[TVR_DBG] ERROR: RetentionCount value must be in-between 1 and 20";
    const std::string notSet = "[TVR_ERR] TVR_MethodWrapper::tvrcimSetRetentionCount failed";
    const std::string noName = "[TVR_ERR] INVALID HBA Name";
    const std::string str2 = "[TVR_ERR] TVRHBA_DumpData_Provider::modify_instance::str2HBAName failed";
    const auto count = [](std::uint32_t value) { return broker::Property{"RetentionCount", Value::uint32(value)}; };
    const auto text = [](const char* name, const std::string& value) {
        return broker::Property{name, Value::string(value)};
    };
    const auto null = [](const char* name) { return broker::Property{name, Value::null(CMPI_string)}; };
    const char* const directory = "/var/log/tavrin/dump";
    const broker::Property noCount = {"RetentionCount", Value::null(CMPI_uint32)};
    const struct
    {
        std::vector<broker::Property> changes;
        broker::PropertyList named;
        CMPIrc status;
        std::uint64_t kept;
        std::uint64_t sets; ///< calls of the library
        Texts lines;
    } rows[] = {
        {{count(1)}, {}, CMPI_RC_OK, 1, 1, {found, sameDirectory, done}},
        {{count(20)}, {}, CMPI_RC_OK, 20, 1, {found, sameDirectory, done}},
        {{count(0)}, {}, CMPI_RC_ERR_FAILED, 5, 0, {found, sameDirectory, range, notSet}},
        {{count(21)}, {}, CMPI_RC_ERR_FAILED, 5, 0, {found, sameDirectory, range, notSet}},
        {{count(5)}, {}, CMPI_RC_OK, 5, 0, {found, sameDirectory}},
        {{count(7), text("DumpDirectory", directory)}, {}, CMPI_RC_OK, 7, 1, {found, sameDirectory, done}},
        {{count(7), text("DumpDirectory", "/tmp")}, {}, CMPI_RC_ERR_NOT_SUPPORTED, 5, 0, {found, otherDirectory}},
        {{count(0), text("DumpDirectory", "/tmp")}, {}, CMPI_RC_ERR_NOT_SUPPORTED, 5, 0, {found, otherDirectory}},
        {{count(7), text("DumpDirectory", "")}, {}, CMPI_RC_OK, 7, 1, {found, done}},
        {{count(7), null("DumpDirectory")}, {}, CMPI_RC_OK, 7, 1, {found, done}},
        {{count(7), text("DumpDirectory", "/tmp")}, {{"RetentionCount"}}, CMPI_RC_OK, 7, 1, {found, done}},
        {{count(7)}, {{"ElementName"}}, CMPI_RC_OK, 5, 0, {found}},
        {{noCount}, {}, CMPI_RC_OK, 5, 0, {found, sameDirectory}},
        {{count(7), null("ElementName")}, {{"RetentionCount"}}, CMPI_RC_OK, 7, 1, {found, done}},
        {{count(7), text("ElementName", "1000000000000002")}, {}, CMPI_RC_ERR_FAILED, 5, 0, {str2}},
        {{count(7), text("ElementName", "x")}, {}, CMPI_RC_ERR_FAILED, 5, 0, {noName, str2}},
        {{count(7), text("ElementName", "")}, {}, CMPI_RC_ERR_FAILED, 5, 0, {noName, str2}},
        {{count(7), text("ElementName", "10000000000000\xC3\xA9")}, {}, CMPI_RC_ERR_FAILED, 5, 0, {noName, str2}},
    };
    for (std::size_t i = 0; i < std::size(rows); i++)
    {
        SCOPED_TRACE(i);
        const auto& row = rows[i];
        DumpHost host;
        EXPECT_EQ(host.modify(row.changes, row.named), row.status);
        EXPECT_THAT(host.linesOfChange(), ElementsAreArray(row.lines));
        EXPECT_EQ(host.calls("LRM_SetDumpRetentionCount"), row.sets);
        EXPECT_EQ(host.calls("LRM_SetDumpDirectory"), 0u);
        EXPECT_EQ(host.retention(), row.kept);
        EXPECT_EQ(host.data().get("DumpDirectory").asString(), directory);
        host.unload();
    }
}

TEST(Dumps, ChangesOfWhatIsNotThereOrCannotBeStoredAreRefused)
{
    DumpHost host;
    broker::Object unknown = host.data();
    unknown.path.setKey("InstanceID", Value::string("TVRHBA_DumpData::1000000000000099"));
    std::erase_if(unknown.properties, [](const broker::Property& known) { return known.name == "InstanceID"; });
    unknown.properties.push_back({"InstanceID", Value::string("TVRHBA_DumpData::1000000000000099")});
    EXPECT_EQ(host.broker().modifyInstance(unknown).status, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(host.logged("[TVR_ERR] Invalid instance of TVRHBA_DumpData_Provider Data"), 1u);

    host.addFault(fault("LRM_SetDumpRetentionCount", R"("status": 178)"));
    EXPECT_EQ(host.keep(7), CMPI_RC_ERR_FAILED);
    EXPECT_THAT(host.linesOfChange(),
                ElementsAre("[TVR_DBG] found the key match for instance.", "[TVR_DBG]  For Non VMWARE",
                            "[TVR_DBG] Failed to set the retention count, exited with error code 178",
                            "[TVR_DBG] Status: <178>:The configuration file cannot be opened",
                            "[TVR_ERR] TVR_MethodWrapper::tvrcimSetRetentionCount failed"));
    EXPECT_EQ(host.retention(), 5u);
    host.unload();
}

TEST(Dumps, AreThereAgainAfterAChangeThatFoundNoMemory)
{
    DumpHost host;
    const broker::Object data = host.data();
    for (std::size_t number = 1;; number++)
    {
        refuseAllocation(number);
        host.broker().modifyInstance(data);
        const CMPIrc got = host.broker().getInstance(data.path).status;
        if (allocationsOfModule() < number)
            break;
        EXPECT_NE(got, CMPI_RC_ERR_NOT_FOUND) << number;
        ASSERT_TRUE(host.awaitLog(ended, host.logged(created))); // one may be under way that has not begun its work
        EXPECT_EQ(host.instancesOf("TVRHBA_ElementDumpData").size(), 2u) << number;
    }
    host.unload();
}

// --- the classes

TEST(Dumps, EachPortHasItsData)
{
    setHostNames({});
    Host host(hostOf(R"(, "dumps": {"directory": "/d1", "retentionCount": 3})"));
    Texts lines = {"[TVR_DBG] Calling FC_CreateDumpClasses", "[TVR_DBG] Entered FC_CreateDumpClasses"};
    for (unsigned port = 0; port < 2; port++)
        lines.insert(lines.end(), {"[TVR_DBG] TVR_Dump::tvrcimGetDumpDirectory Succesful",
                                   "[TVR_DBG] Calling TVR_Dump::tvrcimGetRetentionCount",
                                   "[TVR_DBG] returned tvrcimGetRetentionCount call from wrapper",
                                   "[TVR_DBG] TVR_Dump::tvrcimGetRetentionCount Succesful"});
    lines.push_back("[TVR_DBG] FC_CreateDumpClasses succesful");
    const broker::Object service = host.instancesOf("TVRHBA_DumpService").at(0);
    EXPECT_THAT(logAbout(host, {"DumpClasses", "TVR_Dump::", "tvrcimGetRetentionCount call"}), ElementsAreArray(lines));
    EXPECT_EQ(text(service, "Name"), "TVRHBA_DumpService");
    EXPECT_EQ(text(service, "CreationClassName"), "TVRHBA_DumpService");
    EXPECT_EQ(text(service, "SystemName"), text(host.instancesOf("TVRHBA_PortController").at(0), "SystemName"));
    EXPECT_EQ(describe(host.instancesOf("TVRHBA_DumpData").at(0)),
              "\nDumpDirectory = \"/d1\"\n"
              "ElementName = \"1000000000000001\"\n"
              "InstanceID = \"TVRHBA_DumpData::1000000000000001\"\n"
              "RetentionCount = 3\n");
    const auto affected = host.instancesOf("TVRHBA_DumpServiceAffectsElement");
    ASSERT_EQ(affected.size(), 2u);
    EXPECT_EQ(affected[1].get("ElementEffects").asList().at(0).asUnsigned(), 5u);
    const auto data = host.instancesOf("TVRHBA_ElementDumpData");
    ASSERT_EQ(data.size(), 2u);
    EXPECT_EQ(data[1].get("IsDefault").asUnsigned(), 1u);
    EXPECT_EQ(data[1].get("ManagedElement").asPath(), affected[1].get("AffectedElement").asPath());
    EXPECT_EQ(host.instancesOf("TVRHBA_HostedDumpService").size(), 1u);
    host.unload();
}

TEST(Dumps, DataThatCannotBeReadAreEmpty)
{
    Host host(hostOf(""));
    host.addFault(fault("LRM_GetDumpDirectoryA", R"("status": 2, "to": 1)"));
    host.addFault(fault("LRM_GetDumpDirectoryA", R"("hostile": "unterminatedText", "from": 2)"));
    host.addFault(fault("LRM_GetDumpRetentionCount", R"("status": 1, "to": 1)"));
    const auto data = host.instancesOf("TVRHBA_DumpData");
    ASSERT_EQ(data.size(), 2u);
    EXPECT_EQ(text(data[0], "DumpDirectory"), "");
    EXPECT_EQ(data[0].get("RetentionCount").asUnsigned(), 0u);
    EXPECT_EQ(text(data[1], "DumpDirectory"), std::string(256, 'X'));
    EXPECT_EQ(data[1].get("RetentionCount").asUnsigned(), 5u);
    EXPECT_THAT(logAbout(host, {"Failed to get the", "Count failed", "Directory failed", "es succesful"}),
                ElementsAre("[TVR_DBG] Failed to get the Dump directory, returned with error code 2",
                            "[TVR_INFO] TVR_Dump::tvrcimGetDumpDirectory failed",
                            "[TVR_DBG] Failed to get the retention count, returned with error code 1",
                            "[TVR_ERR] TVR_Dump::tvrcimGetRetentionCount failed",
                            "[TVR_DBG] FC_CreateDumpClasses succesful"));
    host.unload();
}

} // namespace
