// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cstdlib>
#include <iostream>

#include <gtest/gtest.h>

#include "Kiln/Device.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Tests/Support/FakeDevice.h"

namespace Vantrel::Testing {
namespace {

using Kiln::DeviceFramework;

/// Keys that only one framework may have, or both.
constexpr const char16_t* kKeys[] = {u"BlackVideoSource", u"TQ.XQVE Invert", u"TQ.XQVE Gaussian Blur 2",
                                     u"TQ.XQVE Basic 3D"};

/// Starts Kiln with these frameworks, fills both registries, and ends the process with 0 when Kiln was told the names
/// of `named`, and of that framework alone.
void FillAndExit(bool withCuda, bool withOpenCL, DeviceFramework named) {
    setenv("KILN_CUDA_DRIVER", withCuda ? "soft" : "none", 1);
    if (!withOpenCL) setenv("KILN_OPENCL", "none", 1);
    Kiln::Initialize(true);
    const bool asWanted = (Kiln::GetPrimaryDevice(DeviceFramework::kCuda) != nullptr) == withCuda &&
                          (Kiln::GetPrimaryDevice(DeviceFramework::kOpenCL) != nullptr) == withOpenCL;
    if (!asWanted) {
        std::cerr << Kiln::GetFrameworkMessage(DeviceFramework::kCuda)
                  << Kiln::GetFrameworkMessage(DeviceFramework::kOpenCL);
        std::_Exit(3);
    }
    FillCudaRegistry();
    const std::size_t afterCuda = Kiln::GetRegisteredMatchNames().size();
    FillOpenCLRegistry();
    const auto names = Kiln::GetRegisteredMatchNames();
    const bool fromCuda = named == DeviceFramework::kCuda;
    if ((afterCuda == names.size()) != fromCuda || (afterCuda != 0) != fromCuda) std::_Exit(1);
    if (names.size() != (fromCuda ? 58U : 54U)) std::_Exit(4);
    const auto device = boost::make_shared<FakeDevice>(named);
    for (const char16_t* key : kKeys) {
        const bool listed = std::find(names.begin(), names.end(), key) != names.end();
        if (listed != isRegistered(key, device)) std::_Exit(2);
    }
    std::_Exit(0);
}

TEST(RegisteredNamesDeathTest, KilnIsToldTheNamesOfTheFrameworkThatRenders) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    const auto succeeded = ::testing::ExitedWithCode(0);
    EXPECT_EXIT(FillAndExit(true, true, DeviceFramework::kCuda), succeeded, "");
    EXPECT_EXIT(FillAndExit(true, false, DeviceFramework::kCuda), succeeded, "");
    EXPECT_EXIT(FillAndExit(false, true, DeviceFramework::kOpenCL), succeeded, "");
    EXPECT_EXIT(FillAndExit(false, false, DeviceFramework::kCuda), succeeded, "");
}

}  // namespace
}  // namespace Vantrel::Testing
