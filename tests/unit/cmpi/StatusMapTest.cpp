#include "runtime/adapter/StatusMap.h"

#include <gtest/gtest.h>

namespace cimple
{
namespace
{

/// The operations' numbers with the same last meaning give the same status, but "unsupported" is none for a get.
TEST(StatusMap, gives_each_meaning_its_status)
{
    for (int failed : {64, 70, 84, 93, 104, 110, 120, 130, 140, 150, 170})
        EXPECT_EQ(cmpi_status_of(failed), CMPI_RC_ERR_FAILED) << failed;
    for (int denied : {63, 71, 83, 92, 103, 112, 122, 132, 172})
        EXPECT_EQ(cmpi_status_of(denied), CMPI_RC_ERR_ACCESS_DENIED) << denied;
    for (int unsupported : {81, 91, 101, 111, 121, 131})
        EXPECT_EQ(cmpi_status_of(unsupported), CMPI_RC_ERR_NOT_SUPPORTED) << unsupported;
    for (int not_found : {60, 90, 100})
        EXPECT_EQ(cmpi_status_of(not_found), CMPI_RC_ERR_NOT_FOUND) << not_found;
    for (int parameter : {62, 82, 102})
        EXPECT_EQ(cmpi_status_of(parameter), CMPI_RC_ERR_INVALID_PARAMETER) << parameter;
    EXPECT_EQ(cmpi_status_of(80), CMPI_RC_ERR_ALREADY_EXISTS);
    EXPECT_EQ(cmpi_status_of(61), CMPI_RC_ERR_FAILED);
}

TEST(StatusMap, takes_unknown_numbers_for_success)
{
    for (int unknown : {-1, 0, 1, 65, 171, 1000})
        EXPECT_EQ(cmpi_status_of(unknown), CMPI_RC_OK) << unknown;
}

TEST(StatusMap, names_codes_and_calls_the_rest_failed)
{
    EXPECT_STREQ(cmpi_status_name(0), "CMPI_RC_OK");
    EXPECT_STREQ(cmpi_status_name(17), "CMPI_RC_ERR_METHOD_NOT_FOUND");
    EXPECT_STREQ(cmpi_status_name(50), "CMPI_RC_DO_NOT_UNLOAD");
    EXPECT_STREQ(cmpi_status_name(200), "CMPI_RC_ERROR");
    for (int unnamed : {18, 49, 62, 199, 201, -1})
        EXPECT_STREQ(cmpi_status_name(unnamed), "CMPI_RC_ERR_FAILED") << unnamed;
}

} // namespace
} // namespace cimple
