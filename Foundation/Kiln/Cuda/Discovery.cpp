// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <array>

#include "Kiln/Cuda/Backend.h"

namespace Kiln::Cuda {
namespace {

int GetAttribute(const Driver& driver, CUdevice device, CUdevice_attribute attribute) {
    int value = 0;
    return driver.cuDeviceGetAttribute(&value, attribute, device) == CUDA_SUCCESS ? value : 0;
}

DeviceFacts DescribeDevice(const Driver& driver, CUdevice device) {
    DeviceFacts facts;
    std::array<char, 256> name = {};
    driver.cuDeviceGetName(name.data(), static_cast<int>(name.size()) - 1, device);
    facts.name = name.data();
    std::size_t bytes = 0;
    driver.cuDeviceTotalMem(&bytes, device);
    facts.memoryBytes = bytes;
    facts.isCPU = driver.isCPUDriver;

    int version = 0;
    driver.cuDriverGetVersion(&version);
    const int major = GetAttribute(driver, device, CU_DEVICE_ATTRIBUTE_COMPUTE_CAPABILITY_MAJOR);
    const int minor = GetAttribute(driver, device, CU_DEVICE_ATTRIBUTE_COMPUTE_CAPABILITY_MINOR);
    const int processors = GetAttribute(driver, device, CU_DEVICE_ATTRIBUTE_MULTIPROCESSOR_COUNT);
    facts.description = "CUDA " + std::to_string(version / 1000) + "." + std::to_string(version % 1000 / 10) + ", " +
                        facts.name + ", capability " + std::to_string(major) + "." + std::to_string(minor) + ", " +
                        std::to_string(processors) + " processors, " + std::to_string(facts.memoryBytes >> 20) +
                        " MB, driver " + driver.path + (facts.isCPU ? ", on the CPU" : "");
    return facts;
}

std::shared_ptr<Backend> OpenDevice(const std::shared_ptr<const Driver>& driver, int ordinal, std::string& message) {
    CUdevice device = 0;
    CUresult result = driver->cuDeviceGet(&device, ordinal);
    CUcontext context = nullptr;
    if (result == CUDA_SUCCESS) result = driver->cuCtxCreate(&context, CU_CTX_SCHED_AUTO, device);
    if (result != CUDA_SUCCESS) {
        message = "CUDA device " + std::to_string(ordinal) + " can't be opened: " + driver->Describe(result);
        return nullptr;
    }
    CUstream stream = nullptr;
    result = driver->cuStreamCreate(&stream, CU_STREAM_NON_BLOCKING);
    CUcontext popped = nullptr;
    driver->cuCtxPopCurrent(&popped);
    if (result != CUDA_SUCCESS) {
        driver->cuCtxDestroy(context);
        message = "CUDA device " + std::to_string(ordinal) + " gives no stream: " + driver->Describe(result);
        return nullptr;
    }
    return std::make_shared<CudaBackend>(driver, DescribeDevice(*driver, device), context, stream);
}

}  // namespace

BackendList FindBackends(const std::string& driverPath) {
    BackendList list;
    if (driverPath.empty()) {
        list.message = "no CUDA driver: none is installed, or KILN_CUDA_DRIVER says \"none\"";
        return list;
    }
    const std::shared_ptr<const Driver> driver = LoadDriver(driverPath, list.message);
    if (!driver) return list;
    int count = 0;
    const CUresult result = driver->cuDeviceGetCount(&count);
    if (result != CUDA_SUCCESS || count == 0) {
        list.message = "the CUDA driver \"" + driverPath + "\" has no device: " + driver->Describe(result);
        return list;
    }
    for (int ordinal = 0; ordinal < std::min(count, static_cast<int>(kMaxDevices)); ++ordinal) {
        if (auto backend = OpenDevice(driver, ordinal, list.message)) list.backends.push_back(std::move(backend));
    }
    if (!list.backends.empty()) list.message.clear();
    return list;
}

}  // namespace Kiln::Cuda
