// The catalog against the schema: what the rows say of a class is what its declaration says.
#include "agent/ClassCatalog.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <set>
#include <string>

using namespace cimple;

namespace
{

TEST(ClassCatalog, RowsAgreeWithTheSchema)
{
    std::set<std::string> names;
    std::set<const void*> classes;
    for (const ClassRow& row : classCatalog())
    {
        EXPECT_STREQ(row.name, row.meta_class->name);
        EXPECT_EQ(row.association, (row.meta_class->flags & META_ASSOCIATION) != 0) << row.name;
        EXPECT_TRUE(names.insert(row.name).second) << row.name;
        EXPECT_TRUE(classes.insert(row.meta_class).second) << row.name;
    }
    const Meta_Repository* repository = classCatalog()[0].meta_class->meta_repository;
    for (std::size_t i = 0; i < repository->num_meta_classes; i++)
    {
        const std::string name = repository->meta_classes[i]->name;
        EXPECT_EQ(names.count(name), name.starts_with("TVRHBA_") ? 1u : 0u) << name;
    }
}

TEST(ClassCatalog, FormsAndGroupsHaveTheirSizes)
{
    auto count = [](auto predicate) { return std::count_if(classCatalog().begin(), classCatalog().end(), predicate); };
    EXPECT_EQ(count([](const ClassRow& row) { return row.association; }), 105);
    EXPECT_EQ(count([](const ClassRow& row) { return row.form == EnumerationForm::Plain; }), 131);
    EXPECT_EQ(count([](const ClassRow& row) { return row.form == EnumerationForm::San; }), 17);
    EXPECT_EQ(count([](const ClassRow& row) { return row.form == EnumerationForm::Active; }), 4);

    const std::map<MapGroup, std::size_t> sizes = {
        {MapGroup::Adapter, 81 + 2}, // the host's two maps with those of its classes
        {MapGroup::Dump, 5},
        {MapGroup::RecordLog, 5},
        {MapGroup::SoftwareUpdate, 2},
        {MapGroup::SoftwareUpdateAssociations, 5},
        {MapGroup::DriverLog, 4 + 2}, // with the second maps
        {MapGroup::PortVirtualization, 13},
        {MapGroup::Diagnostics, 18},
        {MapGroup::DiagnosticRecords, 6},
        {MapGroup::DiagnosticJobs, 3},
        {MapGroup::San, 17},
    };
    std::map<MapGroup, std::size_t> found;
    for (const MapRow& row : allMaps())
        found[row.group]++;
    EXPECT_EQ(found, sizes);
}

} // namespace
