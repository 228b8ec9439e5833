#pragma once

// The reference product libraries loaded the way the module loads them: the
// folder from the registry file's binDir, then dlopen and the entry points by
// name. Loaded once per process and kept (Qt inside them must not be unloaded
// under a running test).

#include "sorvik/refcounted.h"
#include "sorvik/rovoapi.h"
#include "sorvik/vekex.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <utility>

namespace reftest {

using cv::krn::RefPtr;
using cv::krn::WString;

struct Vekex
{
    cv::vekex::PFN_Init init;
    cv::vekex::PFN_Cleanup cleanup;
    cv::vekex::PFN_vekGetEnvironment getEnvironment;
    cv::vekex::PFN_vekCreateContainer createContainer;
    cv::vekex::PFN_vekCreateInstList createInstList;
    cv::vekex::PFN_vekCreateContainerList createContainerList;
    cv::vekex::PFN_vekGetLastErrorText lastError;
};

struct Rovo
{
    cv::rovo::PFN_Init init;
    cv::rovo::PFN_Cleanup cleanup;
    cv::rovo::PFN_rovoCreateEnvironment createEnvironment;
    cv::rovo::PFN_rovoGetLastErrorText lastError;
};

// binDir of the key in the registry file the build generated.
std::filesystem::path RegistryBinDir(const std::string &key);

const Vekex &VekexLibrary();
const Rovo &RovoLibrary();

// Runs call(&status); fails the test on a non-zero status and returns the result.
template <typename Call>
auto Ok(Call &&call)
{
    std::int32_t status = 0;
    auto result = call(&status);
    EXPECT_EQ(status, 0) << "unexpected failure";
    return result;
}

template <typename Call>
void OkVoid(Call &&call)
{
    std::int32_t status = 0;
    call(&status);
    EXPECT_EQ(status, 0) << "unexpected failure";
}

// Runs call(&status) and returns the status it reported.
template <typename Call>
std::int32_t StatusOf(Call &&call)
{
    std::int32_t status = 0;
    call(&status);
    return status;
}

std::u16string U16(const std::string &text);
std::string Utf8(const WString &text);

RefPtr<cv::vekex::IEnvironment> DataStoreEnvironment();
RefPtr<cv::vekex::IContainer> Container(std::initializer_list<const char16_t *> texts);

} // namespace reftest
