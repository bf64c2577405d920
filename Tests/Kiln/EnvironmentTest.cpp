// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <array>
#include <cstdio>
#include <memory>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace Kiln {
namespace {

using testing::HasSubstr;
using testing::Not;

/// What the probe program prints when it is started with these variables; it must end well.
std::string Probe(const std::string& variables, const std::string& arguments = "") {
    const std::string command = "env " + variables + " " VANTREL_PROBE " " + arguments + " 2>&1";
    const auto close = [](std::FILE* pipe) { EXPECT_EQ(::pclose(pipe), 0); };
    const std::unique_ptr<std::FILE, decltype(close)> pipe(::popen(command.c_str(), "r"), close);
    std::string output;
    std::array<char, 512> piece;
    while (std::fgets(piece.data(), piece.size(), pipe.get())) output += piece.data();
    return output;
}

TEST(Environment, TurnsFrameworksOff) {
    const std::string output = Probe("KILN_CUDA_DRIVER=none KILN_OPENCL=none");
    EXPECT_THAT(output, HasSubstr("driver=\n"));
    EXPECT_THAT(output, HasSubstr("cuda=0\ncuda message=no CUDA driver"));
    EXPECT_THAT(output, HasSubstr("opencl=0\nopencl message=KILN_OPENCL says \"none\""));
}

TEST(Environment, ChoosesAPlatformByPartOfItsName) {
    EXPECT_THAT(Probe("KILN_CUDA_DRIVER=none KILN_OPENCL=Portable"), Not(HasSubstr("opencl=0")));
    const std::string output = Probe("KILN_CUDA_DRIVER=none KILN_OPENCL=NoSuchVendor");
    EXPECT_THAT(output, HasSubstr("opencl=0"));
    EXPECT_THAT(output, HasSubstr("NoSuchVendor"));
    EXPECT_THAT(output, HasSubstr("Portable Computing Language"));
}

TEST(Environment, ChoosesADriverOfCuda) {
    const std::string missing = Probe("KILN_OPENCL=none KILN_CUDA_DRIVER=/nowhere/libdriver.so");
    EXPECT_THAT(missing, HasSubstr("driver=/nowhere/libdriver.so"));
    EXPECT_THAT(missing, HasSubstr("cuda=0"));
    EXPECT_THAT(missing, HasSubstr("can't be opened"));
    const std::string wrong = Probe("KILN_OPENCL=none KILN_CUDA_DRIVER=libm.so.6");
    EXPECT_THAT(wrong, HasSubstr("lacks the function \"cuInit\""));
    const std::string soft = Probe("KILN_OPENCL=none KILN_CUDA_DRIVER=soft SOFTCUDA_DEVICES=3");
    EXPECT_THAT(soft, HasSubstr("libvantrel-softcuda.so"));
    EXPECT_THAT(soft, HasSubstr("cuda=3"));
    EXPECT_THAT(soft, HasSubstr("on the CPU"));
    EXPECT_THAT(Probe("KILN_OPENCL=none SOFTCUDA_MEMORY_MB=512 KILN_CUDA_DRIVER=soft"), HasSubstr("512 MB"));
}

TEST(Environment, MayBeLeftWithDevicesAndFramesOpen) {
    EXPECT_THAT(Probe("KILN_CUDA_DRIVER=soft", "leave"), HasSubstr("cuda=1"));
}

}  // namespace
}  // namespace Kiln
