#include "FakeHost.h"

#include "device/Bindings.h"

#include <dlfcn.h>
#include <gmock/gmock.h>
#include <set>
#include <thread>

using namespace cimple;
using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

/// Call of any row through a binding of its own: the value, or nothing for a function that returns none.
template <std::size_t Row> long callRow()
{
    if constexpr (entryPoints[Row].absent == absentNothing)
    {
        Binding<Row, void()>{}();
        return absentNothing;
    }
    else
        return Binding<Row, long()>{}();
}

template <std::size_t... Rows> std::vector<long> callRows(std::index_sequence<Rows...>)
{
    return {callRow<Rows>()...};
}

std::vector<long> callAllRows()
{
    return callRows(std::make_index_sequence<entryPoints.size()>());
}

TEST(EntryPoints, NamesAreUniqueAndFitTheirFamily)
{
    std::map<Family, int> sizes;
    std::set<std::string> names;
    for (const EntryPoint& row : entryPoints)
    {
        const std::string name = row.name;
        EXPECT_TRUE(names.insert(name).second) << name;
        ++sizes[row.family];
        if (row.family == Family::rmDual || row.family == Family::lrmOnly)
        {
            EXPECT_TRUE(name.starts_with("LRM_")) << name;
        }
        if (row.family == Family::hbaApi)
        {
            EXPECT_TRUE(name.starts_with("HBA_")) << name;
        }
        if (row.family == Family::vendorQos || row.family == Family::vendorClose)
        {
            EXPECT_TRUE(name.starts_with("CPQFC_")) << name;
        }
    }
    // 141 names, and the two network properties functions that have both forms; HBA_FreeLibrary is the 14th.
    EXPECT_EQ(sizes, (std::map<Family, int>{{Family::rmDual, 143},
                                            {Family::lrmOnly, 6},
                                            {Family::rmOnly, 17},
                                            {Family::hbaApi, 14},
                                            {Family::vendorQos, 8},
                                            {Family::vendorClose, 1}}));
}

TEST(EntryPoints, EveryRowAnswersItsFailureValueWithoutLibraries)
{
    const std::map<std::string, long> others = {
        {"HBA_GetNumberOfAdapters", 0},
        {"RM_GetNumberOfLocalAdapters", 0},
        {"RM_GetNextVpdEntry", 0},
        {"RM_GetAttributeValue", 0},
        {"LRM_CNA_FCOE_SetFIPParams", 0},
        {"LRM_CNA_FCOE_SetFCFConnectList", 0},
        {"LRM_CNA_FCOE_GetFIPParams", 0},
        {"LRM_CNA_FCOE_GetFCFConnectList", 0},
        {"TvrGetBoardNumber", -1},
        {"HBA_CloseAdapter", absentNothing},
        {"HBA_RefreshInformation", absentNothing},
        {"CPQFC_CloseAdapter", absentNothing},
    };
    FakeHost host;
    host.files.clear();
    EXPECT_EQ(loadAllLibraries(), 0);
    EXPECT_TRUE(hbaLibMissing && lrmLibMissing && rmLibMissing);
    host.loaderCalls.clear();

    const auto values = callAllRows();
    for (std::size_t row = 0; row < entryPoints.size(); ++row)
    {
        const auto other = others.find(entryPoints[row].name);
        EXPECT_EQ(values[row], other == others.end() ? 1 : other->second) << entryPoints[row].name;
    }
    // Only the QoS interface is looked for: it needs no library.
    EXPECT_EQ(host.loaderCalls.size(), 8u);
    for (const std::string& call : host.loaderCalls)
        EXPECT_TRUE(call.starts_with("symbol global CPQFC_")) << call;
}

TEST(EntryPoints, SameFailureValuesWhenTheLibrariesLackTheFunctions)
{
    FakeHost host;
    for (const EntryPoint& row : entryPoints)
        host.absentSymbols.insert({row.name, *row.name == 'L' ? row.name + 1 : row.name});
    for (const char* rm : {"liblrmapi.so", "librmapi.so"})
    {
        host.files = {"libHBAAPI.so", rm};
        loadAllLibraries();
        for (std::size_t row = 0; const long value : callAllRows())
            EXPECT_EQ(value, entryPoints[row++].absent);
        unloadAllLibraries();
    }
}

std::vector<void*> calledEntries()
{
    std::vector<void*> entries;
    for (std::size_t row = 0; row < entryPoints.size(); ++row)
        if (entryPoints[row].use == called)
            entries.push_back(resolveEntry(row));
    return entries;
}

TEST(EntryPoints, AreNotLookedUpAgainOnceAllAreResolved)
{
    FakeHost host;
    for (const std::set<std::string>& files :
         {std::set<std::string>{"libHBAAPI.so.2", "liblrmapi.so"}, {"libHBAAPI.so.2", "librmapi.so"}, {}})
    {
        host.files = files;
        host.absentSymbols = {"HBA_SendReadCapacity", "LRM_GetVPD", "RM_GetVPD"};
        loadAllLibraries();
        const auto entries = calledEntries();
        resolveAllEntries();
        host.loaderCalls.clear();
        EXPECT_EQ(calledEntries(), entries);
        EXPECT_THAT(host.loaderCalls, testing::IsEmpty());
        unloadAllLibraries();
    }
}

TEST(EntryPoints, AbsentOnesAreAskedForAgain)
{
    for (const std::string rm : {"liblrmapi.so", "librmapi.so"})
    {
        FakeHost host;
        host.files = {"libHBAAPI.so.2", rm};
        host.absentSymbols = {"RM_GetVersion", "HBA_SendReadCapacity", "LRM_InitLib", "RM_InitLib"};
        loadAllLibraries();
        host.loaderCalls.clear();
        resolveAbsentEntries();
        EXPECT_THAT(host.loaderCalls, IsEmpty()); // while bindings look up for themselves
        resolveAllEntries();
        EXPECT_EQ(LRM_InitLib(), 1);

        host.absentSymbols.clear();
        host.loaderCalls.clear();
        resolveAbsentEntries();
        EXPECT_EQ(LRM_InitLib(), 0);
        for (const std::size_t row : {entryRow("RM_GetVersion"), entryRow("HBA_SendReadCapacity")})
            EXPECT_NE(resolveEntry(row), nullptr) << entryPoints[row].name;
        EXPECT_THAT(host.loaderCalls, Contains("symbol " + rm + " RM_GetVersion"));
        EXPECT_THAT(host.loaderCalls, testing::Not(Contains("symbol " + rm + " RM_StatusString"))); // was there

        // What was found stays, whatever becomes of its name.
        host.absentSymbols = {"RM_GetVersion"};
        resolveAbsentEntries();
        EXPECT_NE(resolveEntry(entryRow("RM_GetVersion")), nullptr);
    }
}

TEST(EntryPoints, NothingStaysFoundWhenTheLibrariesHaveGone)
{
    FakeHost host;
    loadAllLibraries();
    resolveAllEntries();
    EXPECT_EQ(LRM_InitLib(), 0);
    unloadAllLibraries();
    host.files.clear();
    loadAllLibraries();
    resolveAllEntries();
    EXPECT_EQ(LRM_InitLib(), 1);
}

struct LoadCase
{
    std::set<std::string> files;
    int result;
    bool hba, lrm, rm; // missing
    std::vector<std::string> opened;
    long failures;
};

TEST(Loader, OpensWhatIsThereAndFlagsWhatIsNot)
{
    const LoadCase cases[] = {
        {{"libHBAAPI.so.2", "liblrmapi.so", "librmapi.so"},
         0,
         false,
         false,
         false,
         {"open libHBAAPI.so.2", "open liblrmapi.so"},
         0},
        {{"libHBAAPI.so", "liblrmapi.so"},
         0,
         false,
         false,
         false,
         {"open libHBAAPI.so.2", "open libHBAAPI.so", "open liblrmapi.so"},
         1},
        {{"librmapi.so"},
         1,
         true,
         true,
         false,
         {"open libHBAAPI.so.2", "open libHBAAPI.so", "open liblrmapi.so", "open librmapi.so"},
         3},
        {{},
         0,
         true,
         true,
         true,
         {"open libHBAAPI.so.2", "open libHBAAPI.so", "open liblrmapi.so", "open librmapi.so"},
         4},
    };
    for (const LoadCase& c : cases)
    {
        FakeHost host;
        LogCapture log;
        host.files = c.files;
        EXPECT_EQ(loadAllLibraries(), c.result);
        EXPECT_EQ(host.loaderCalls, c.opened);
        EXPECT_EQ(hbaLibMissing, c.hba);
        EXPECT_EQ(lrmLibMissing, c.lrm);
        EXPECT_EQ(rmLibMissing, c.rm);
        EXPECT_FALSE(cpqLibMissing);
        EXPECT_EQ(log.count("3 dlopen failed :fake error"), c.failures);
    }
}

TEST(Loader, AFilledSlotIsNotOpenedAgain)
{
    FakeHost host;
    loadAllLibraries();
    host.loaderCalls.clear();
    EXPECT_EQ(loadAllLibraries(), 0);
    EXPECT_THAT(host.loaderCalls, IsEmpty());
}

TEST(Loader, LocalLibraryIsAskedOnceAndTheFallbackNever)
{
    FakeHost host;
    host.files.insert("librmapi.so");
    loadAllLibraries();
    host.loaderCalls.clear();
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(LRM_InitLib(), 0);
    EXPECT_THAT(host.loaderCalls, ElementsAre("symbol liblrmapi.so LRM_InitLib"));
    EXPECT_EQ(host.calls["LRM_InitLib"], 3);

    host.absentSymbols = {"LRM_SetDebugTraces"};
    EXPECT_EQ(LRM_SetDebugTraces(1), 1);
    EXPECT_EQ(LRM_SetDebugTraces(1), 1); // what was not found is looked up again
    EXPECT_THAT(host.loaderCalls,
                ElementsAre("symbol liblrmapi.so LRM_InitLib", "symbol liblrmapi.so LRM_SetDebugTraces",
                            "symbol liblrmapi.so LRM_SetDebugTraces"));
}

TEST(Loader, FallbackIsAskedOnEveryCallUnderBothNames)
{
    FakeHost host;
    host.files = {"librmapi.so"};
    EXPECT_EQ(loadAllLibraries(), 1);
    host.loaderCalls.clear();
    EXPECT_EQ(LRM_InitLib(), 0);
    EXPECT_EQ(LRM_InitLib(), 0);
    EXPECT_THAT(host.loaderCalls, ElementsAre("symbol librmapi.so LRM_InitLib", "symbol librmapi.so RM_InitLib",
                                              "symbol librmapi.so LRM_InitLib", "symbol librmapi.so RM_InitLib"));

    // A function of one name is found under it at once, or missed twice.
    host.loaderCalls.clear();
    host.absentSymbols = {"RM_MiliVersion"};
    char text[8];
    EXPECT_EQ(RM_GetVersion(text, sizeof text), 0);
    EXPECT_EQ(RM_MiliVersion(text, sizeof text), 1);
    EXPECT_THAT(host.loaderCalls, ElementsAre("symbol librmapi.so RM_GetVersion", "symbol librmapi.so RM_MiliVersion",
                                              "symbol librmapi.so RM_MiliVersion"));
}

TEST(Loader, FallbackServesTheHbaApi)
{
    FakeHost host;
    host.addAdapter(1);
    host.files = {"librmapi.so"};
    loadAllLibraries();
    EXPECT_EQ(cimple::HBA_GetNumberOfAdapters(), 1u);
    EXPECT_THAT(host.loaderCalls, Contains("symbol librmapi.so HBA_GetNumberOfAdapters"));

    host.loaderCalls.clear();
    Binding<entryRow("CPQFC_CloseAdapter"), void()>{}();
    EXPECT_THAT(host.loaderCalls,
                ElementsAre("symbol librmapi.so CPQFC_CloseAdapter", "symbol librmapi.so CPQFC_CloseAdapter"));
}

TEST(Loader, BesideTheLocalLibraryTheGlobalScopeIsSearchedInTheFallbacksPlace)
{
    constexpr Binding<entryRow("CPQFC_CloseAdapter"), void()> closeVendorAdapter;
    FakeHost host;
    host.addAdapter(1);
    host.files = {"liblrmapi.so"};
    host.globalSymbols = {"HBA_GetNumberOfAdapters"};
    loadAllLibraries();
    host.loaderCalls.clear();
    EXPECT_EQ(cimple::HBA_GetNumberOfAdapters(), 1u);
    closeVendorAdapter();
    EXPECT_THAT(host.loaderCalls, ElementsAre("symbol global HBA_GetNumberOfAdapters",
                                              "symbol global CPQFC_CloseAdapter", "symbol global CPQFC_CloseAdapter"));

    unloadAllLibraries();
    host.loaderCalls.clear();
    EXPECT_EQ(cimple::HBA_GetNumberOfAdapters(), 0u);
    closeVendorAdapter();
    EXPECT_THAT(host.loaderCalls, IsEmpty());
}

TEST(Loader, UnloadingMakesEveryCallAbsentUntilTheNextLoad)
{
    FakeHost host;
    host.addAdapter(1);
    loadAllLibraries();
    EXPECT_EQ(cimple::HBA_GetNumberOfAdapters(), 1u);
    EXPECT_EQ(LRM_InitLib(), 0);
    host.loaderCalls.clear();
    EXPECT_EQ(unloadAllLibraries(), 0);
    EXPECT_THAT(host.loaderCalls, ElementsAre("close libHBAAPI.so.2", "close liblrmapi.so"));
    EXPECT_EQ(cimple::HBA_GetNumberOfAdapters(), 0u);
    EXPECT_EQ(LRM_InitLib(), 1);

    loadAllLibraries();
    host.loaderCalls.clear();
    EXPECT_EQ(LRM_InitLib(), 0);
    EXPECT_THAT(host.loaderCalls, ElementsAre("symbol liblrmapi.so LRM_InitLib"));
}

TEST(Loader, AFailedCloseIsLoggedAndKeepsTheLibrary)
{
    FakeHost host;
    LogCapture log;
    loadAllLibraries();
    host.closeFails = true;
    EXPECT_EQ(unloadAllLibraries(), 0);
    ASSERT_EQ(log.notable().size(), 2u);
    EXPECT_THAT(log.notable(),
                testing::Each(testing::MatchesRegex("3 dlclose for lib 0x[0-9a-f]+ failed with fake error\n")));
    EXPECT_EQ(LRM_InitLib(), 0);
}

TEST(Loader, ThreadsMayMeetInTheFirstCall)
{
    const DynamicLoader loader = {
        [](const char*, int) -> void* { return const_cast<char*>("library"); },
        [](void*, const char*) -> void* { return reinterpret_cast<void*>(+[]() -> RM_STATUS { return 42; }); },
        [](void*) { return 0; },
        []() -> const char* { return nullptr; },
    };
    const DynamicLoader previous = setDynamicLoader(loader);
    loadAllLibraries();
    std::vector<std::thread> threads;
    std::atomic<int> right{0};
    for (int i = 0; i < 8; ++i)
        threads.emplace_back([&] { right += LRM_InitLib() == 42; });
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(right, 8);
    unloadAllLibraries();
    setDynamicLoader(previous);
}

TEST(Loader, TheSystemsLoaderIsInPlaceByDefault)
{
    const DynamicLoader system = setDynamicLoader({});
    setDynamicLoader(system);
    void* library = system.open("libc.so.6", RTLD_NOW);
    ASSERT_NE(library, nullptr);
    EXPECT_NE(system.symbol(library, "getpid"), nullptr);
    EXPECT_EQ(system.symbol(library, "LRM_InitLib"), nullptr);
    EXPECT_NE(system.error(), nullptr);
    EXPECT_EQ(system.close(library), 0);
    EXPECT_EQ(system.open("libno_such_library.so", RTLD_NOW), nullptr);
    EXPECT_THAT(system.error(), testing::HasSubstr("libno_such_library.so"));
}

} // namespace
