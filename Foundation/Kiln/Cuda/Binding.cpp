// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Cuda/Binding.h"

#include <dlfcn.h>

namespace Kiln::Cuda {

std::string Driver::Describe(CUresult result) const {
    const char* text = nullptr;
    if (cuGetErrorString(result, &text) != CUDA_SUCCESS || !text) text = "unknown error";
    return std::string(text) + " (" + std::to_string(result) + ")";
}

std::shared_ptr<const Driver> LoadDriver(const std::string& path, std::string& message) {
    void* library = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (!library) {
        const char* reason = dlerror();
        message = "the CUDA driver \"" + path + "\" can't be opened: " + (reason ? reason : "no reason given");
        return nullptr;
    }
    auto driver = std::make_shared<Driver>();
    driver->path = path;
    driver->isCPUDriver = dlsym(library, "SoftCudaDescribe") != nullptr;
#define KILN_BIND_ENTRY(entry, symbol)                                                  \
    driver->entry = reinterpret_cast<decltype(driver->entry)>(dlsym(library, symbol));  \
    if (!driver->entry) {                                                               \
        message = "the CUDA driver \"" + path + "\" lacks the function \"" symbol "\""; \
        return nullptr;                                                                 \
    }
    KILN_CUDA_ENTRIES(KILN_BIND_ENTRY)
#undef KILN_BIND_ENTRY
    const CUresult result = driver->cuInit(0);
    if (result != CUDA_SUCCESS) {
        message = "the CUDA driver \"" + path + "\" doesn't initialise: " + driver->Describe(result);
        return nullptr;
    }
    return driver;
}

}  // namespace Kiln::Cuda
