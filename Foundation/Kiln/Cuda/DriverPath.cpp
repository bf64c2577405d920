// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <dlfcn.h>

#include <cstdlib>
#include <filesystem>

#include "Kiln/Cuda/Binding.h"
#include "Kiln/Device.h"
#include "Kiln/Log.h"

namespace Kiln {
namespace {

constexpr const char* kRealDriver = "libcuda.so.1";
constexpr const char* kCPUDriver = "libvantrel-softcuda.so";

bool HasDevice(const std::string& path) {
    std::string message;
    const auto driver = Cuda::LoadDriver(path, message);
    int count = 0;
    const bool found = driver && driver->cuDeviceGetCount(&count) == CUDA_SUCCESS && count > 0;
    if (!found) Log("Kiln.Device", message.empty() ? path + " has no device" : message);
    return found;
}

// The CPU driver stands next to the library that this code is in, as it is built and as it is installed; where that
// library is linked into another one, the system's search decides.
std::string FindCPUDriver() {
    Dl_info info = {};
    static const int anchor = 0;
    if (dladdr(&anchor, &info) != 0 && info.dli_fname) {
        std::error_code error;
        const auto folder = std::filesystem::weakly_canonical(info.dli_fname, error).parent_path();
        for (const auto& candidate : {folder / kCPUDriver, folder.parent_path() / "lib" / kCPUDriver}) {
            if (std::filesystem::exists(candidate, error)) return candidate.string();
        }
    }
    return HasDevice(kCPUDriver) ? kCPUDriver : "";
}

std::string DecideDriverPath() {
    const char* wanted = std::getenv("KILN_CUDA_DRIVER");
    std::string choice = wanted ? wanted : "";
    if (choice == "none") return {};
    if (choice == "soft") return FindCPUDriver();
    if (!choice.empty()) return choice;
    return HasDevice(kRealDriver) ? kRealDriver : FindCPUDriver();
}

}  // namespace

std::string GetCudaDriverPath() {
    static const std::string path = DecideDriverPath();
    return path;
}

}  // namespace Kiln
