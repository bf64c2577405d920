// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/OpenCL/Binding.h"

#include <dlfcn.h>

namespace Kiln::OpenCL {
namespace {

constexpr const char* kLibrary = "libOpenCL.so.1";

// Texts come with a terminator, and some platforms pad them with blanks.
template <class Query>
std::string ReadText(const Query& query) {
    std::size_t size = 0;
    if (query(0, nullptr, &size) != CL_SUCCESS || size == 0) return {};
    std::string text(size, '\0');
    if (query(size, text.data(), nullptr) != CL_SUCCESS) return {};
    while (!text.empty() && (text.back() == '\0' || text.back() == ' ')) text.pop_back();
    return text;
}

}  // namespace

std::string Driver::GetPlatformText(cl_platform_id platform, cl_platform_info what) const {
    return ReadText([&](std::size_t size, void* out, std::size_t* needed) {
        return clGetPlatformInfo(platform, what, size, out, needed);
    });
}

std::string Driver::GetDeviceText(cl_device_id device, cl_device_info what) const {
    return ReadText([&](std::size_t size, void* out, std::size_t* needed) {
        return clGetDeviceInfo(device, what, size, out, needed);
    });
}

std::shared_ptr<const Driver> LoadDriver(std::string& message) {
    void* library = dlopen(kLibrary, RTLD_NOW | RTLD_LOCAL);
    if (!library) {
        const char* reason = dlerror();
        message = std::string("the OpenCL loader can't be opened: ") + (reason ? reason : "no reason given");
        return nullptr;
    }
    auto driver = std::make_shared<Driver>();
#define KILN_BIND_ENTRY(entry)                                                         \
    driver->entry = reinterpret_cast<decltype(driver->entry)>(dlsym(library, #entry)); \
    if (!driver->entry) {                                                              \
        message = "the OpenCL loader lacks the function \"" #entry "\"";               \
        return nullptr;                                                                \
    }
    KILN_OPENCL_ENTRIES(KILN_BIND_ENTRY)
#undef KILN_BIND_ENTRY
    return driver;
}

}  // namespace Kiln::OpenCL
