// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Kernels/CudaDriver.h"

#include <dlfcn.h>
#include <gtest/gtest.h>

#include <map>
#include <set>
#include <string>
#include <vector>

#include "Kiln/Device.h"

namespace Vantrel {
namespace {

constexpr std::int32_t kRequested = 4000;

std::int32_t gDriverVersion = 0;
CUresult gInitStatus = CUDA_SUCCESS;
CUresult gVersionStatus = CUDA_SUCCESS;
unsigned gInitFlags = 0;

CUresult ScriptedInit(unsigned flags) {
    gInitFlags = flags;
    return gInitStatus;
}
CUresult ScriptedVersion(int* version) {
    *version = gDriverVersion;
    return gVersionStatus;
}

/// A driver library of whatever version and with whatever names are missing. Every name has an address of its own.
class ScriptedDriver final : public DriverPlatform {
public:
    explicit ScriptedDriver(std::int32_t version) {
        GetCudaDriver() = CudaDriverTable();
        gDriverVersion = version;
        gInitStatus = gVersionStatus = CUDA_SUCCESS;
    }
    ~ScriptedDriver() override { GetCudaDriver() = CudaDriverTable(); }

    void* LoadLibrary(const Halden::WideString& name) override {
        libraries.push_back(Halden::ToUTF8(name));
        return isPresent ? this : nullptr;
    }
    void* GetProcAddress(void* library, const char* name) override {
        EXPECT_EQ(library, this);
        asked.emplace_back(name);
        if (missing.count(name) != 0) return nullptr;
        if (asked.back() == "cuInit") return reinterpret_cast<void*>(&ScriptedInit);
        if (asked.back() == "cuDriverGetVersion") return reinterpret_cast<void*>(&ScriptedVersion);
        return AddressOf(name);
    }
    /// What the table holds after `name` was bound.
    void* AddressOf(const std::string& name) { return &mAddresses[name]; }
    /// Loads, and returns what went to standard output.
    std::string Load(std::int32_t requested = kRequested) {
        ::testing::internal::CaptureStdout();
        result = LoadCudaDriver(7, requested, *this);
        return ::testing::internal::GetCapturedStdout();
    }

    bool isPresent = true;
    std::set<std::string> missing;
    std::vector<std::string> asked;
    std::vector<std::string> libraries;
    std::int32_t result = -1;

private:
    std::map<std::string, char> mAddresses;
};

template <class Entry>
void* Bound(Entry entry) {
    return reinterpret_cast<void*>(entry);
}

TEST(CudaDriver, AFullDriverBindsEverythingInOrderAndPrefersVersionedNames) {
    ScriptedDriver driver(12000);
    EXPECT_EQ(driver.Load(), "");
    EXPECT_EQ(driver.result, 0);
    EXPECT_EQ(gInitFlags, 7U);
    EXPECT_EQ(driver.libraries, std::vector<std::string>{"nvcuda.dll"});
    const CudaDriverTable& table = GetCudaDriver();
    EXPECT_EQ(Bound(table.cuMemAlloc), driver.AddressOf("cuMemAlloc_v2"));
    EXPECT_EQ(Bound(table.cuCtxDestroy), driver.AddressOf("cuCtxDestroy_v2"));
    EXPECT_EQ(Bound(table.cuGLCtxCreate), driver.AddressOf("cuGLCtxCreate_v2"));
    EXPECT_EQ(Bound(table.cuGraphicsResourceGetMappedPointer),
              driver.AddressOf("cuGraphicsResourceGetMappedPointer_v2"));
    EXPECT_EQ(Bound(table.cuParamSetv), driver.AddressOf("cuParamSetv"));
    EXPECT_EQ(Bound(table.cuLaunchKernel), driver.AddressOf("cuLaunchKernel"));

    // 2 probes, 54 base entries, 5 rebound, 40 versioned, then 6, 3, 9, 5 and 7.
    ASSERT_EQ(driver.asked.size(), 131U);
    const std::pair<std::size_t, const char*> landmarks[] = {{0, "cuInit"},
                                                             {2, "cuDeviceGet"},
                                                             {55, "cuStreamDestroy"},
                                                             {56, "cuCtxDestroy_v2"},
                                                             {61, "cuDeviceTotalMem_v2"}};
    for (const auto& [place, name] : landmarks) EXPECT_EQ(driver.asked[place], name) << place;
}

TEST(CudaDriver, VersionAndMissingNamesDecideHowFarTheLoadGets) {
    const struct {
        std::int32_t version;
        const char* missing;
        std::int32_t result;
        const char* last;  ///< name that was asked for
        std::size_t count;
    } kRows[] = {{2000, "", 0, "cuTexRefGetAddress_v2", 101},
                 {2010, "", 0, "cuGraphicsGLRegisterImage", 107},
                 {2030, "", 0, "cuGraphicsGLRegisterImage", 110},
                 {3000, "", 0, "cuGetExportTable", 119},
                 {3010, "", 0, "cuCtxGetLimit", 124},
                 {3020, "", 0, "cuCtxGetLimit", 124},
                 {4000, "", 0, "cuLaunchKernel", 131},
                 {4000, "cuDriverGetVersion", 0, "cuTexRefGetAddress_v2", 101},  // it counts as the oldest
                 {4000, "cuInit", 999, "cuInit", 1},
                 {4000, "cuStreamDestroy_v2", 999, "cuStreamDestroy_v2", 60},
                 {4000, "cuMemcpyPeer", 999, "cuMemcpyPeer", 130}};
    for (const auto& row : kRows) {
        ScriptedDriver driver(row.version);
        driver.missing = {row.missing};
        const std::string message =
            std::string("Failed to find required function \"") + row.missing + "\" in nvcuda.dll\n";
        EXPECT_EQ(driver.Load(), row.result == 0 ? "" : message);
        EXPECT_EQ(driver.result, row.result) << row.version << row.missing;
        EXPECT_EQ(driver.asked.back(), row.last) << row.version << row.missing;
        EXPECT_EQ(driver.asked.size(), row.count) << row.version << row.missing;
        EXPECT_EQ(GetCudaDriver().cuLaunchKernel != nullptr, row.count == 131U);
    }
}

TEST(CudaDriver, TheRequestedVersionDecidesBetweenNames) {
    ScriptedDriver old(4000);
    old.Load(3010);
    EXPECT_EQ(old.result, 0);
    EXPECT_EQ(Bound(GetCudaDriver().cuMemAlloc), old.AddressOf("cuMemAlloc"));
    EXPECT_EQ(Bound(GetCudaDriver().cuGLCtxCreate), old.AddressOf("cuGLCtxCreate"));
    for (const std::string& name : old.asked) EXPECT_EQ(name.find("_v2"), std::string::npos) << name;

    ScriptedDriver between(4000);
    between.Load(3020);
    EXPECT_EQ(Bound(GetCudaDriver().cuMemAlloc), between.AddressOf("cuMemAlloc_v2"));
    EXPECT_EQ(Bound(GetCudaDriver().cuCtxDestroy), between.AddressOf("cuCtxDestroy"))
        << "those five change with version 4.0 only";
}

TEST(CudaDriver, FailuresToStartComeBackUnchanged) {
    ScriptedDriver refusing(4000);
    gInitStatus = CUDA_ERROR_NO_DEVICE;
    EXPECT_EQ(refusing.Load(), "");
    EXPECT_EQ(refusing.result, 100);
    EXPECT_EQ(refusing.asked, std::vector<std::string>{"cuInit"});

    ScriptedDriver mute(4000);
    gVersionStatus = CUDA_ERROR_INVALID_VALUE;
    EXPECT_EQ(mute.Load(), "");
    EXPECT_EQ(mute.result, 1);
    EXPECT_EQ(mute.asked.back(), "cuDriverGetVersion");

    ScriptedDriver absent(4000);
    absent.isPresent = false;
    EXPECT_EQ(absent.Load(), "LoadLibrary \"nvcuda.dll\" failed!\n");
    EXPECT_EQ(absent.result, 999);
    ::testing::internal::CaptureStdout();
    void* library = &absent;
    EXPECT_EQ(LoadCudaLibrary(library, absent), 999);
    EXPECT_EQ(::testing::internal::GetCapturedStdout(), "LoadLibrary \"nvcuda.dll\" failed!\n");
    EXPECT_EQ(library, nullptr);
}

TEST(CudaDriver, ThisMachinesDriverBindsWhole) {
    const std::string path = Kiln::GetCudaDriverPath();
    ASSERT_FALSE(path.empty()) << "the CPU driver is always there";
    // The older request binds every name without its version, the newer one those with it.
    ASSERT_EQ(LoadCudaDriver(0, 3010), 0);
    ASSERT_EQ(LoadCudaDriver(0, kRequested), 0);
    int version = 0;
    EXPECT_EQ(GetCudaDriver().cuDriverGetVersion(&version), CUDA_SUCCESS);
    EXPECT_GE(version, 4000);
    GetCudaDriver() = CudaDriverTable();
}

}  // namespace
}  // namespace Vantrel
