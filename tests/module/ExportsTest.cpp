// What the shared object shows to a broker and to tools: its symbols, its libraries and its registration records.
#include "broker/core/ModuleImage.h"
#include "tests/support/Sanitized.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <dlfcn.h>
#include <initializer_list>
#include <set>
#include <sstream>
#include <string>
#include <vector>

using namespace cimple;

namespace
{

using Names = std::set<std::string>;

/// Lines that a tool of the system prints about the module.
std::vector<std::string> linesOf(const std::string& tool)
{
    std::FILE* pipe = popen((tool + " '" TVR_MODULE_FILE "'").c_str(), "r");
    std::string output;
    for (int c; pipe && (c = std::fgetc(pipe)) != EOF;)
        output += static_cast<char>(c);
    EXPECT_TRUE(pipe && pclose(pipe) == 0) << tool;
    std::vector<std::string> lines;
    std::istringstream stream(output);
    for (std::string line; std::getline(stream, line);)
        lines.push_back(line);
    return lines;
}

class Exports : public testing::Test
{
protected:
    Exports() : image(broker::openModule(TVR_MODULE_FILE, RTLD_NOW))
    {
        for (const Registration* record = image->registrations(); record; record = record->next)
            records.insert(records.begin(), record);
    }

    static bool isAssociation(const Registration& record) { return record.meta_class->flags & META_ASSOCIATION; }

    /// The procedure's answer with these first two arguments.
    static int ask(const Registration& record, int operation, void* arg0 = nullptr)
    {
        return record.proc(&record, operation, arg0, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr);
    }

    std::unique_ptr<broker::ModuleImage> image;
    std::vector<const Registration*> records; ///< in linking order
};

TEST_F(Exports, AreTheFactoriesOfTheRegisteredClassesAndTheModulesFunctions)
{
    Names expected = {"cimple_module", "tavrin_fc_observe"};
    for (const Registration* record : records)
    {
        for (const std::string stem : {record->provider_name, record->meta_class->name})
        {
            expected.insert(stem + "_Create_InstanceMI");
            expected.insert(stem + "_Create_MethodMI");
            if (isAssociation(*record))
                expected.insert(stem + "_Create_AssociationMI");
        }
    }
    EXPECT_EQ(expected.size(), 848u);

    Names exported;
    for (const std::string& line : linesOf("nm -D --defined-only"))
        exported.insert(line.substr(line.rfind(' ') + 1));
    EXPECT_EQ(exported, expected);
}

TEST_F(Exports, NeedOnlyTheLanguagesOwnLibraries)
{
#if TVR_SANITIZED
    GTEST_SKIP() << "the sanitizers' run-time libraries are linked in this build";
#endif
    const Names allowed = {"libc.so.6",      "libm.so.6",       "libgcc_s.so.1",
                           "libstdc++.so.6", "libpthread.so.0", "libdl.so.2"};
    Names needed;
    for (const std::string& line : linesOf("readelf -dW"))
        if (line.find("(NEEDED)") != std::string::npos)
            needed.insert(line.substr(line.find('[') + 1, line.rfind(']') - line.find('[') - 1));
    EXPECT_EQ(needed.count("libc.so.6"), 1u);
    for (const std::string& library : needed)
        EXPECT_TRUE(allowed.count(library) || library.starts_with("ld-linux")) << library;
}

TEST_F(Exports, RegistrationsAreLinkedInTheCatalogsOrder)
{
    ASSERT_EQ(records.size(), 159u);
    std::vector<std::string> names;
    for (const Registration* record : records)
    {
        EXPECT_STREQ(record->module_name, "tavrin_fc_provider_Module");
        EXPECT_EQ(record->provider_name, std::string(record->meta_class->name) + "_Provider");
        names.emplace_back(record->provider_name);
    }
    EXPECT_EQ(Names(names.begin(), names.end()).size(), names.size());
    EXPECT_THAT(std::vector(names.begin(), names.begin() + 3),
                testing::ElementsAre("TVRHBA_Product_Provider", "TVRHBA_SoftwareIdentity_Provider",
                                     "TVRHBA_ProviderConfigSetting_Provider"));
    EXPECT_EQ(names.back(), "TVRHBA_JobElementSettingData_Provider");
}

TEST_F(Exports, ProceduresTellClassAndRepository)
{
    for (const Registration* record : records)
    {
        SCOPED_TRACE(record->provider_name);
        const Meta_Class* mc = nullptr;
        const Meta_Repository* repository = nullptr;
        EXPECT_EQ(ask(*record, OP_GET_META_CLASS, &mc), 0);
        EXPECT_EQ(ask(*record, OP_GET_REPOSITORY, &repository), 0);
        EXPECT_EQ(mc, record->meta_class);
        ASSERT_NE(repository, nullptr);
        EXPECT_EQ(repository, mc->meta_repository);
        EXPECT_EQ(repository->num_meta_classes, 278u);
    }
}

TEST_F(Exports, ProceduresAnswerWhatTheyDoNotImplement)
{
    const Names modified = {"TVRHBA_FCPort_Provider", "TVRHBA_ProviderConfigSetting_Provider",
                            "TVRHBA_DumpData_Provider"};
    const Names made = {"TVRHBA_DriverParams_Provider"};
    for (const Registration* record : records)
    {
        SCOPED_TRACE(record->provider_name);
        const bool association = isAssociation(*record);
        const std::initializer_list<std::pair<int, int>> answers = {
            {OP_GET_INSTANCE, 61},
            {OP_CREATE_INSTANCE, made.count(record->provider_name) ? 82 : 81},
            {OP_DELETE_INSTANCE, made.count(record->provider_name) ? 93 : 91},
            {OP_MODIFY_INSTANCE, modified.count(record->provider_name) ? 102 : 101},
            {OP_ASSOCIATORS, association ? 111 : -1},
            {OP_REFERENCES, association ? 121 : -1},
            {OP_ASSOCIATORS_WITH_PROPERTIES, association ? 171 : -1},
            {OP_ENABLE_INDICATIONS, -1},
            {OP_DISABLE_INDICATIONS, -1},
            {17, -1},
            {-1, -1},
        };
        for (const auto& [operation, answer] : answers)
            EXPECT_EQ(ask(*record, operation), answer) << "operation " << operation;
    }
}

} // namespace
