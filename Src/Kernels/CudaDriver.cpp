// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Kernels/CudaDriver.h"

#include <dlfcn.h>

#include <cstddef>
#include <cstdio>
#include <cstring>

#include "Kiln/Device.h"

namespace Vantrel {
namespace {

constexpr const char16_t* kLibraryName = u"nvcuda.dll";
/// What a driver counts as that doesn't tell its version.
constexpr std::int32_t kOldestDriverVersion = 1000;
/// The requested API version from which on entries with 64-bit sizes go by their `_v2` names.
constexpr std::int32_t kVersionedNames = 3020;

struct BindingRow {
    std::size_t offset;  ///< of the entry in the table
    const char* symbol;
    const char* versioned;  ///< taken instead from kVersionedNames on; null when there is one name only
    std::int32_t minDriver;
    std::int32_t minRequested;
};

constexpr BindingRow kBindingRows[] = {
#define CUDA_PROBE(name)
#define CUDA_ENTRY(driver, name) {offsetof(CudaDriverTable, name), #name, nullptr, driver, 0},
#define CUDA_VERSIONED(driver, name) {offsetof(CudaDriverTable, name), #name, #name "_v2", driver, 0},
#define CUDA_REBIND(driver, requested, name, symbol) \
    {offsetof(CudaDriverTable, name), #symbol, nullptr, driver, requested},
#include "Src/Kernels/CudaDriverEntries.h"
};

class LinuxDriverPlatform final : public DriverPlatform {
public:
    void* LoadLibrary(const Halden::WideString& name) override {
        const std::string path = name == kLibraryName ? Kiln::GetCudaDriverPath() : Halden::ToUTF8(name);
        return path.empty() ? nullptr : dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    }
    void* GetProcAddress(void* library, const char* name) override { return dlsym(library, name); }
};

/// Puts a symbol into the table; a missing one leaves the entry as it was.
bool BindSymbol(DriverPlatform& platform, void* library, std::size_t offset, const char* symbol) {
    void* const address = platform.GetProcAddress(library, symbol);
    if (!address) return false;
    std::memcpy(reinterpret_cast<char*>(&GetCudaDriver()) + offset, &address, sizeof address);
    return true;
}

std::int32_t ReportMissing(const char* symbol) {
    std::printf("Failed to find required function \"%s\" in %s\n", symbol, Halden::ToUTF8(kLibraryName).c_str());
    return kCudaDriver_NotLoadable;
}

/// Starts the driver and asks for its version.
std::int32_t ProbeDriver(DriverPlatform& platform, void* library, std::uint32_t initFlags, std::int32_t& version) {
    CudaDriverTable& driver = GetCudaDriver();
    if (!BindSymbol(platform, library, offsetof(CudaDriverTable, cuInit), "cuInit")) return ReportMissing("cuInit");
    if (const CUresult status = driver.cuInit(initFlags); status != CUDA_SUCCESS) return status;
    version = kOldestDriverVersion;
    if (!BindSymbol(platform, library, offsetof(CudaDriverTable, cuDriverGetVersion), "cuDriverGetVersion")) return 0;
    return driver.cuDriverGetVersion(&version);
}

}  // namespace

CudaDriverTable& GetCudaDriver() {
    static CudaDriverTable table;
    return table;
}

DriverPlatform& GetDriverPlatform() {
    static LinuxDriverPlatform platform;
    return platform;
}

std::int32_t LoadCudaLibrary(void*& library, DriverPlatform& platform) {
    library = platform.LoadLibrary(kLibraryName);
    if (library) return 0;
    std::printf("LoadLibrary \"%s\" failed!\n", Halden::ToUTF8(kLibraryName).c_str());
    return kCudaDriver_NotLoadable;
}

std::int32_t LoadCudaDriver(std::uint32_t initFlags, std::int32_t requestedApiVersion, DriverPlatform& platform) {
    void* library = nullptr;
    if (const std::int32_t status = LoadCudaLibrary(library, platform); status != 0) return status;
    std::int32_t driverVersion = 0;
    if (const std::int32_t status = ProbeDriver(platform, library, initFlags, driverVersion); status != 0) {
        return status;
    }
    for (const BindingRow& row : kBindingRows) {
        if (driverVersion < row.minDriver || requestedApiVersion < row.minRequested) continue;
        const bool byVersion = row.versioned && requestedApiVersion >= kVersionedNames;
        const char* const symbol = byVersion ? row.versioned : row.symbol;
        if (!BindSymbol(platform, library, row.offset, symbol)) return ReportMissing(symbol);
    }
    return 0;
}

}  // namespace Vantrel
