// What the calls for dumps do where no client leads them, and classes that cannot be made.
#include "tests/unit/device/FakeHost.h"

#include "agent/Build.h"
#include "schema/TVRHBA_DumpData.h"
#include "schema/TVRHBA_DumpService.h"
#include "schema/TVRHBA_DumpServiceAffectsElement.h"
#include "schema/TVRHBA_ElementDumpData.h"
#include "schema/TVRHBA_HostedDumpService.h"
#include "schema/TVRHBA_PortController.h"
#include "services/DumpCalls.h"
#include "services/DumpClasses.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <memory>
#include <utility>

using namespace cimple;
using testing::Contains;
using testing::ElementsAre;

namespace
{

using Lines = std::vector<std::string>;

struct DumpCalls : testing::Test
{
    /// The lines that came since the last look.
    Lines lines() { return std::exchange(log.lines, {}); }

    LoadedHost host;
    LogCapture log;
    const HBA_WWN port = wwn(1);
};

TEST_F(DumpCalls, FailuresAreLoggedAndComeAsTheyAre)
{
    const std::uint8_t bytes[4] = {1, 2, 3, 4};
    const std::string status = "5 Status: <2>:not supported";
    const std::string setDirectory = "5 ERROR: tvrcimSetDumpDirectory: RM_SetDumpDirectory call failed";
    const struct
    {
        const char* function;
        int status;
        std::function<RM_STATUS()> call;
        Lines lines;
    } rows[] = {
        {"LRM_GenerateEfdDump",
         2,
         [&] { return tvrcimDumpDiagnostic(port, 3); },
         {"5 Failed to generate the dump file, exited with error code 2", status}},
        {"LRM_SetDumpDirectory",
         2,
         [&] { return tvrcimSetDumpDirectory(port, "/d"); },
         {setDirectory + " with error code : 2 \n", status}},
        {"LRM_SetDumpDirectory",
         27,
         [&] { return tvrcimSetDumpDirectory(port, "/d"); },
         {setDirectory + ". The specified directory [' / vmfs / volumes / /d'] cannot be opened", "5 Status: <27>"}},
        {"LRM_SetDumpDirectory",
         160,
         [&] { return tvrcimSetDumpDirectory(port, "/d"); },
         {setDirectory + ". The configuration file could not be opened", "5 Status: <160>"}},
        {"LRM_SetDumpDirectory",
         178,
         [&] { return tvrcimSetDumpDirectory(port, "/d"); },
         {setDirectory + ". The configuration file could not be opened", "5 Status: <178>"}},
        {"LRM_SetDumpDirectory",
         0,
         [&] { return tvrcimSetDumpDirectory(port, "/d"); },
         {"5 tvrcimSetDumpDirectory: Success"}},
        {"LRM_RetrieveFATDump2",
         2,
         [&] { return tvrcimRetrieveFATDump(true, port); },
         {"5 Inside tvrcimRetrieveFATDump ", status, "5 Exiting tvrcimRetrieveFATDump \n"}},
        {"LRM_RetrieveFATDump",
         0,
         [&] { return tvrcimRetrieveFATDump(false, port); },
         {"5 Inside tvrcimRetrieveFATDump ", "5 Exiting tvrcimRetrieveFATDump \n"}},
        {"LRM_Set_BE_EventLogTraceLevel",
         2,
         [&] { return tvrcimSetAdvancedDumpTraceLevel(port, 3, bytes); },
         {"5 Failed to set the Advanced Dump TraceLevel, returned with error code 2", status}},
        {"LRM_Set_BE_EventLogConfigDataModule",
         2,
         [&] { return SetExtFATAdvancedData(port, "m", "l", 0, 255, 1); },
         {"5 Failed to set the advanced settings, returned with error code 2", status}},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.function);
        const int before = host.calls[row.function];
        host.statuses[row.function] = {row.status};
        EXPECT_EQ(row.call(), row.status);
        EXPECT_EQ(host.calls[row.function], before + 1);
        EXPECT_EQ(lines(), row.lines);
    }
    EXPECT_EQ(host.dumpArguments, "3, 1 2 3 4; m l 0 255 1; ");
}

TEST_F(DumpCalls, WrongArgumentsReachNoLibrary)
{
    EXPECT_EQ(GetDumpFileNames(port, nullptr), 4);
    EXPECT_THAT(lines(), ElementsAre("5 FileEntriesPointer NULL"));
    for (const std::uint32_t count : {0U, 21U, 0xFFFFFFFFU})
        EXPECT_EQ(tvrcimSetRetentionCount(port, count), 1);
    EXPECT_THAT(lines(), Contains("5 ERROR: RetentionCount value must be in-between 1 and 20").Times(3));
    const std::string full(48, 'x');
    EXPECT_EQ(SetExtFATAdvancedData(port, nullptr, "l", 1, 1, 1), 1);
    EXPECT_EQ(SetExtFATAdvancedData(port, "m", nullptr, 1, 1, 1), 1);
    EXPECT_EQ(SetExtFATAdvancedData(port, full.c_str(), "l", 1, 1, 1), 1);
    EXPECT_EQ(SetExtFATAdvancedData(port, "m", full.c_str(), 1, 1, 1), 1);
    EXPECT_EQ(SetExtFATAdvancedData(port, "m", "l", 16, 1, 1), 1);
    EXPECT_EQ(SetExtFATAdvancedData(port, "m", "l", 1, 256, 1), 1);
    EXPECT_EQ(SetExtFATAdvancedData(port, "m", "l", 1, 1, 0), 1);
    EXPECT_THAT(lines(), Contains("5 Invalid Module Parameter arguments, Valid values are portMask [1-15], "
                                  "FunctionMask[0-255]")
                             .Times(7));
    for (const char* function :
         {"LRM_GetDumpFileNames", "LRM_SetDumpRetentionCount", "LRM_Set_BE_EventLogConfigDataModule"})
        EXPECT_EQ(host.calls[function], 0) << function;
    EXPECT_EQ(SetExtFATAdvancedData(port, full.c_str() + 1, full.c_str() + 1, 15, 0, 1), 0);
}

TEST_F(DumpCalls, ListsThatLieAreBounded)
{
    const struct
    {
        std::uint32_t needed; ///< that the first call tells, with status 191
        std::uint32_t room;   ///< that the second call gets
        std::uint32_t told;   ///< by the second call
        std::size_t names;
    } rows[] = {
        {5, 5, 5, 5}, {5, 5, 2, 2}, {5, 5, 0xFFFFFFFF, 5}, {0xFFFFFFFF, 4096, 0xFFFFFFFF, 4096}, {0, 0, 3, 0},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.needed);
        unsigned calls = 0;
        host.dumpList = [&](RM_DumpFileNames* list) -> RM_STATUS
        {
            if (++calls == 1)
            {
                EXPECT_EQ(list->count, 4u);
                list->count = row.needed;
                return 191;
            }
            EXPECT_EQ(list->count, row.room);
            std::memset(list->entry, 'n', list->count * sizeof(RM_DumpFileName)); // without a terminator
            list->count = row.told;
            return 0;
        };
        const auto list = readDumpFileNames(port);
        ASSERT_TRUE(list.has_value());
        EXPECT_EQ(list->status, 0);
        EXPECT_EQ(list->names, std::vector<std::string>(row.names, std::string(256, 'n')));
        EXPECT_EQ(calls, 2u);
    }
}

TEST_F(DumpCalls, CoreDumpsAreForFirmwareThatCanMakeThem)
{
    const std::string failed = "5 Failed to generate core dump, exited with error code 2";
    const struct
    {
        const char* options;
        std::uint32_t isLocal;
        int featureStatus;
        std::uint32_t feature;
        int dumpStatus;
        RM_STATUS status;
        int dumps;
        Lines lines; ///< behind those of the check of the port
    } rows[] = {
        {"o", 1, 0, 1, 0, 0, 1, {"5 Options o"}},
        {"o", 1, 0, 0, 0, 251, 0, {"5 Options o"}},
        {"o", 1, 0, 2, 0, 251, 0, {"5 Options o"}},
        {"o", 1, 1, 0, 0, 0, 1, {"5 Options o"}},
        {"o", 1, 0, 1, 2, 2, 1, {"5 Options o", failed, "5 Status: <2>:not supported"}},
        {"o", 1, 0, 1, 247, 247, 1, {"5 Options o", "5 Status: <247>"}},
        {nullptr, 1, 0, 1, 0, 4, 0, {}},
        {"o", 0, 0, 1, 0, 1, 0, {"3 HBA IS NOT LOCAL", "5 INVALID wwpn"}},
        {nullptr, 0, 0, 1, 0, 1, 0, {"3 HBA IS NOT LOCAL", "5 INVALID wwpn"}},
    };
    for (std::size_t i = 0; i < std::size(rows); i++)
    {
        SCOPED_TRACE(i);
        const auto& row = rows[i];
        host.isLocal = row.isLocal;
        host.features[430] = row.feature;
        host.statuses["LRM_GetHBAFeature"] = {row.featureStatus};
        host.statuses["LRM_GenerateCoreDump"] = {row.dumpStatus};
        host.calls.clear();
        EXPECT_EQ(tvrcimGetCoreDump(port, row.options), row.status);
        EXPECT_EQ(host.calls["LRM_GenerateCoreDump"], row.dumps);
        Lines expected = row.lines;
        expected.push_back("5 Exiting TVR_MethodWrapper::tvrcimGetCoreDump");
        Lines logged = lines();
        logged.erase(logged.begin(), logged.begin() + 2);
        EXPECT_EQ(logged, expected);
        host.statuses.clear();
    }
}

TEST_F(DumpCalls, TracedModulesAreHandedOutWithinTheirRoom)
{
    const struct
    {
        int status;
        std::uint32_t count;
        std::uint32_t room;
        std::uint32_t handed; ///< 0 for none
    } rows[] = {{0, 2, 64, 2}, {0, 64, 64, 64}, {0, 0xFFFFFFF0, 0xFFFFFFFF, 64}, {0, 65, 64, 0}, {2, 1, 64, 0}};
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.count);
        host.eventLog.room = row.room;
        host.eventLog.count = row.count;
        host.statuses["LRM_Get_BE_EventLogConfigDataAll"] = {row.status};
        std::unique_ptr<RM_EventLogConfig> config;
        EXPECT_EQ(GetExtFATAdvancedData(port, &config), row.status);
        EXPECT_EQ(config ? config->count : 0, row.handed);
        const auto number = [](std::uint32_t value) { return std::to_string(static_cast<int>(value)); };
        const std::string status = std::to_string(row.status);
        const Lines logged = lines();
        EXPECT_EQ(logged.at(0),
                  "5 Returned from RM call: " + status + ", " + number(row.count) + ", " + number(row.room));
        EXPECT_EQ(logged.size() > 1, row.handed == 0);
        if (row.handed == 0)
        {
            EXPECT_EQ(logged[1], "5 RM_Get_BE_EventLogConfigDataAll call failed, with error code : " + status +
                                     ", Invalid number of entries in FAT data : " + number(row.count));
        }
        host.statuses.clear();
    }
}

// --- classes that cannot be made

struct DumpClasses : DumpCalls
{
    DumpClasses()
    {
        auto system = fresh<CIM_ComputerSystem>();
        system->CreationClassName.set("CIM_ComputerSystem");
        system->Name.set("host");
        mapOf<CIM_ComputerSystem>(*cache).insert(std::move(system), {});
        for (const char* id : {"1000000000000001", "1000000000000002"})
            addController(id);
    }

    void addController(const char* id)
    {
        auto controller = fresh<TVRHBA_PortController>();
        controller->DeviceID.set(id);
        mapOf<TVRHBA_PortController>(*cache).insert(std::move(controller), {});
    }

    std::vector<std::size_t> sizes() const
    {
        return {mapOf<TVRHBA_DumpService>(*cache).size(), mapOf<TVRHBA_HostedDumpService>(*cache).size(),
                mapOf<TVRHBA_DumpServiceAffectsElement>(*cache).size(), mapOf<TVRHBA_DumpData>(*cache).size(),
                mapOf<TVRHBA_ElementDumpData>(*cache).size()};
    }

    /// Keeps of the classes one instance of `Record` alone, the last one, so that its like is refused.
    template <class Record> std::uint32_t createBeside()
    {
        EXPECT_EQ(FC_CreateDumpClasses(*cache), 0u);
        const auto map = mapOf<Record>(*cache);
        Ref<Record> kept(static_cast<Record*>(clone(map.at(map.size() - 1))));
        EXPECT_EQ(FC_ClearDumpClasses(*cache), 0u);
        EXPECT_THAT(sizes(), testing::Each(0u));
        map.insert(std::move(kept), {});
        lines();
        return FC_CreateDumpClasses(*cache);
    }

    std::unique_ptr<InstanceCache> cache = std::make_unique<InstanceCache>();
};

TEST_F(DumpClasses, TheFirstRefusalEndsThemAndWhatWasMadeStays)
{
    using Sizes = std::vector<std::size_t>;
    const struct
    {
        std::uint32_t (DumpClasses::*create)();
        const char* line;
        Sizes sizes; ///< with the one that was there
    } rows[] = {
        {&DumpClasses::createBeside<TVRHBA_DumpService>, "1 Insert Failed : m_TVRHBA_DumpService_map", {1, 0, 0, 0, 0}},
        {&DumpClasses::createBeside<TVRHBA_HostedDumpService>,
         "1 Insert Failed : m_TVRHBA_HostedDumpService_map",
         {1, 1, 0, 0, 0}},
        {&DumpClasses::createBeside<TVRHBA_DumpServiceAffectsElement>,
         "1 Insert Failed : m_TVRHBA_DumpServiceAffectsElement_map",
         {1, 1, 2, 1, 1}},
        {&DumpClasses::createBeside<TVRHBA_DumpData>, "1 Insert Failed : m_TVRHBA_DumpData_map", {1, 1, 2, 2, 1}},
        {&DumpClasses::createBeside<TVRHBA_ElementDumpData>,
         "1 Insert Failed : m_TVRHBA_ElementDumpData_map",
         {1, 1, 2, 2, 2}},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.line);
        EXPECT_EQ((this->*row.create)(), 32769u);
        EXPECT_EQ(log.notable(), Lines{row.line});
        EXPECT_EQ(sizes(), row.sizes);
        FC_ClearDumpClasses(*cache);
    }
}

TEST_F(DumpClasses, APortWithoutANameEndsThem)
{
    addController("no name");
    addController("1000000000000003");
    EXPECT_EQ(FC_CreateDumpClasses(*cache), 32769u);
    EXPECT_THAT(log.notable(), ElementsAre("3 INVALID HBA Name", "3 TVR_Dump::str2HBAName failed"));
    EXPECT_THAT(sizes(), ElementsAre(1u, 1u, 3u, 2u, 2u));
}

} // namespace
