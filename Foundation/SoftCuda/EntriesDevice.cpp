// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Initialisation, devices, contexts.

#include <algorithm>
#include <cstdio>
#include <cstring>

#include "SoftCuda/Controls.h"
#include "SoftCuda/KernelAbi.h"
#include "SoftCuda/Objects.h"
#include "SoftCuda/PerThread.h"
#include "SoftCuda/ThreadPool.h"

using namespace SoftCuda;

namespace SoftCuda {

namespace {

// Every group of entries of the API's fourth version is there.
constexpr int kDriverVersion = 12000;
constexpr int kMaxThreads = 1024;
constexpr int kMaxGrid = 65535;

struct ContextStack {
    std::vector<CUcontext> contexts;
};
std::vector<CUcontext>& GetStack() { return GetPerThread<ContextStack>().contexts; }

int GetAttribute(CUdevice_attribute attribute, int& value) {
    constexpr int kUnlimited = 0x7FFFFFFF;
    switch (attribute) {
        case CU_DEVICE_ATTRIBUTE_MAX_THREADS_PER_BLOCK:
        case CU_DEVICE_ATTRIBUTE_MAX_BLOCK_DIM_X:
        case CU_DEVICE_ATTRIBUTE_MAX_BLOCK_DIM_Y:
            value = kMaxThreads;
            break;
        case CU_DEVICE_ATTRIBUTE_MAX_BLOCK_DIM_Z:
            value = 64;
            break;
        case CU_DEVICE_ATTRIBUTE_MAX_GRID_DIM_X:
            value = kUnlimited;
            break;
        case CU_DEVICE_ATTRIBUTE_MAX_GRID_DIM_Y:
        case CU_DEVICE_ATTRIBUTE_MAX_GRID_DIM_Z:
            value = kMaxGrid;
            break;
        case CU_DEVICE_ATTRIBUTE_MAX_SHARED_MEMORY_PER_BLOCK:
            value = 48 << 10;
            break;
        case CU_DEVICE_ATTRIBUTE_TOTAL_CONSTANT_MEMORY:
            value = 64 << 10;
            break;
        case CU_DEVICE_ATTRIBUTE_WARP_SIZE:
            value = 32;
            break;
        case CU_DEVICE_ATTRIBUTE_MAX_PITCH:
            value = kUnlimited;
            break;
        case CU_DEVICE_ATTRIBUTE_MAX_REGISTERS_PER_BLOCK:
            value = 64 << 10;
            break;
        case CU_DEVICE_ATTRIBUTE_CLOCK_RATE:
            value = 2'000'000;
            break;
        case CU_DEVICE_ATTRIBUTE_TEXTURE_ALIGNMENT:
            value = 512;
            break;
        case CU_DEVICE_ATTRIBUTE_GPU_OVERLAP:
        case CU_DEVICE_ATTRIBUTE_INTEGRATED:
        case CU_DEVICE_ATTRIBUTE_CAN_MAP_HOST_MEMORY:
        case CU_DEVICE_ATTRIBUTE_CONCURRENT_KERNELS:
        case CU_DEVICE_ATTRIBUTE_ASYNC_ENGINE_COUNT:
        case CU_DEVICE_ATTRIBUTE_UNIFIED_ADDRESSING:
            value = 1;
            break;
        case CU_DEVICE_ATTRIBUTE_MULTIPROCESSOR_COUNT:
            value = GetPool().GetLimit();
            break;
        case CU_DEVICE_ATTRIBUTE_COMPUTE_CAPABILITY_MAJOR:
            value = 7;
            break;
        case CU_DEVICE_ATTRIBUTE_COMPUTE_CAPABILITY_MINOR:
            value = 5;
            break;
        default:
            value = 0;
            break;
    }
    return value;
}

CUresult DestroyContext(CUcontext handle) {
    Driver& driver = GetDriver();
    std::unique_ptr<CUctx_st> context;
    {
        const std::lock_guard<std::mutex> lock(driver.mutex);
        const auto found = FindOwned(driver.contexts, handle);
        if (found == driver.contexts.end()) return CUDA_ERROR_INVALID_CONTEXT;
        context = std::move(driver.contexts.extract(found).value());
    }
    std::vector<CUcontext>& stack = GetStack();
    stack.erase(std::remove(stack.begin(), stack.end(), handle), stack.end());
    context->Synchronize();
    GetMemory().FreeAllOf(handle);
    return CUDA_SUCCESS;
}

bool IsAlive(CUcontext context) {
    Driver& driver = GetDriver();
    const std::lock_guard<std::mutex> lock(driver.mutex);
    return FindOwned(driver.contexts, context) != driver.contexts.end();
}

}  // namespace

Driver& GetDriver() {
    // Never destroyed, as its clients' static objects may call it to the end.
    static Driver& driver = *new Driver;
    return driver;
}

CUcontext GetCurrent() {
    const std::vector<CUcontext>& stack = GetStack();
    return stack.empty() ? nullptr : stack.back();
}

CUresult NeedContext(CUcontext& context) {
    context = GetCurrent();
    Driver& driver = GetDriver();
    const std::lock_guard<std::mutex> lock(driver.mutex);
    if (!driver.initialized) return CUDA_ERROR_NOT_INITIALIZED;
    // Another thread may have destroyed what is still this one's current context.
    return FindOwned(driver.contexts, context) != driver.contexts.end() ? CUDA_SUCCESS : CUDA_ERROR_INVALID_CONTEXT;
}

CUresult NeedDevice(CUdevice device) {
    Driver& driver = GetDriver();
    const std::lock_guard<std::mutex> lock(driver.mutex);
    if (!driver.initialized) return CUDA_ERROR_NOT_INITIALIZED;
    return device >= 0 && device < driver.settings.devices ? CUDA_SUCCESS : CUDA_ERROR_INVALID_DEVICE;
}

}  // namespace SoftCuda

void CUctx_st::Synchronize() {
    std::vector<StreamPoint> points;
    {
        const std::lock_guard<std::mutex> lock(mutex);
        points.push_back({defaultStream.stream, defaultStream.stream->GetLast()});
        for (const auto& stream : streams) points.push_back({stream->stream, stream->stream->GetLast()});
    }
    for (const StreamPoint& point : points) point.stream->Wait(point.ticket);
}

extern "C" {

CUresult cuInit(unsigned flags) {
    if (flags != 0) return CUDA_ERROR_INVALID_VALUE;
    Driver& driver = GetDriver();
    const std::lock_guard<std::mutex> lock(driver.mutex);
    if (driver.initialized && !driver.contexts.empty()) return CUDA_SUCCESS;
    driver.settings = ReadSettings();
    GetMemory().SetLimit(driver.settings.memoryBytes);
    GetMemory().SetFailEvery(driver.settings.failEvery);
    GetPool().SetLimit(driver.settings.threads);
    Stream::SetFusing(driver.settings.fusing);
    driver.initialized = true;
    return CUDA_SUCCESS;
}

CUresult cuDriverGetVersion(int* version) {
    if (version == nullptr) return CUDA_ERROR_INVALID_VALUE;
    *version = kDriverVersion;
    return CUDA_SUCCESS;
}

CUresult cuDeviceGetCount(int* count) {
    if (count == nullptr) return CUDA_ERROR_INVALID_VALUE;
    Driver& driver = GetDriver();
    const std::lock_guard<std::mutex> lock(driver.mutex);
    if (!driver.initialized) return CUDA_ERROR_NOT_INITIALIZED;
    *count = driver.settings.devices;
    return CUDA_SUCCESS;
}

CUresult cuDeviceGet(CUdevice* device, int ordinal) {
    if (device == nullptr) return CUDA_ERROR_INVALID_VALUE;
    *device = ordinal;
    return NeedDevice(ordinal);
}

CUresult cuDeviceGetName(char* name, int length, CUdevice device) {
    if (name == nullptr || length <= 0) return CUDA_ERROR_INVALID_VALUE;
    if (const CUresult result = NeedDevice(device); result != CUDA_SUCCESS) return result;
    (void)std::snprintf(name, static_cast<std::size_t>(length), "SoftCuda CPU device %d", device);
    return CUDA_SUCCESS;
}

CUresult cuDeviceGetUuid(CUuuid* uuid, CUdevice device) {
    if (uuid == nullptr) return CUDA_ERROR_INVALID_VALUE;
    if (const CUresult result = NeedDevice(device); result != CUDA_SUCCESS) return result;
    std::memcpy(uuid->bytes, "SoftCuda device", 16);
    uuid->bytes[15] = static_cast<char>(device);
    return CUDA_SUCCESS;
}

CUresult cuDeviceComputeCapability(int* major, int* minor, CUdevice device) {
    if (major == nullptr || minor == nullptr) return CUDA_ERROR_INVALID_VALUE;
    GetAttribute(CU_DEVICE_ATTRIBUTE_COMPUTE_CAPABILITY_MAJOR, *major);
    GetAttribute(CU_DEVICE_ATTRIBUTE_COMPUTE_CAPABILITY_MINOR, *minor);
    return NeedDevice(device);
}

CUresult cuDeviceGetProperties(CUdevprop* properties, CUdevice device) {
    if (properties == nullptr) return CUDA_ERROR_INVALID_VALUE;
    int value = 0;
    const auto get = [&](CUdevice_attribute attribute) { return GetAttribute(attribute, value); };
    *properties = {get(CU_DEVICE_ATTRIBUTE_MAX_THREADS_PER_BLOCK),
                   {get(CU_DEVICE_ATTRIBUTE_MAX_BLOCK_DIM_X), get(CU_DEVICE_ATTRIBUTE_MAX_BLOCK_DIM_Y),
                    get(CU_DEVICE_ATTRIBUTE_MAX_BLOCK_DIM_Z)},
                   {get(CU_DEVICE_ATTRIBUTE_MAX_GRID_DIM_X), get(CU_DEVICE_ATTRIBUTE_MAX_GRID_DIM_Y),
                    get(CU_DEVICE_ATTRIBUTE_MAX_GRID_DIM_Z)},
                   get(CU_DEVICE_ATTRIBUTE_MAX_SHARED_MEMORY_PER_BLOCK),
                   get(CU_DEVICE_ATTRIBUTE_TOTAL_CONSTANT_MEMORY),
                   get(CU_DEVICE_ATTRIBUTE_WARP_SIZE),
                   get(CU_DEVICE_ATTRIBUTE_MAX_PITCH),
                   get(CU_DEVICE_ATTRIBUTE_MAX_REGISTERS_PER_BLOCK),
                   get(CU_DEVICE_ATTRIBUTE_CLOCK_RATE),
                   get(CU_DEVICE_ATTRIBUTE_TEXTURE_ALIGNMENT)};
    return NeedDevice(device);
}

CUresult cuDeviceGetAttribute(int* value, CUdevice_attribute attribute, CUdevice device) {
    if (value == nullptr) return CUDA_ERROR_INVALID_VALUE;
    GetAttribute(attribute, *value);
    return NeedDevice(device);
}

CUresult cuDeviceTotalMem(size_t* bytes, CUdevice device) {
    if (bytes == nullptr) return CUDA_ERROR_INVALID_VALUE;
    *bytes = GetMemory().GetLimit();
    return NeedDevice(device);
}
SOFTCUDA_V2(cuDeviceTotalMem);

CUresult cuCtxCreate(CUcontext* context, unsigned /*flags*/, CUdevice device) {
    if (context == nullptr) return CUDA_ERROR_INVALID_VALUE;
    if (const CUresult result = NeedDevice(device); result != CUDA_SUCCESS) return result;
    auto made = std::make_unique<CUctx_st>();
    made->device = device;
    made->defaultStream.context = made.get();
    *context = made.get();
    GetStack().push_back(made.get());
    Driver& driver = GetDriver();
    const std::lock_guard<std::mutex> lock(driver.mutex);
    driver.contexts.insert(std::move(made));
    return CUDA_SUCCESS;
}
SOFTCUDA_V2(cuCtxCreate);

CUresult cuCtxDestroy(CUcontext context) { return DestroyContext(context); }
SOFTCUDA_V2(cuCtxDestroy);

CUresult cuCtxAttach(CUcontext* context, unsigned flags) {
    if (context == nullptr || flags != 0) return CUDA_ERROR_INVALID_VALUE;
    const CUresult result = NeedContext(*context);
    if (result == CUDA_SUCCESS) ++(*context)->references;
    return result;
}

CUresult cuCtxDetach(CUcontext context) {
    if (context == nullptr || context != GetCurrent()) return CUDA_ERROR_INVALID_CONTEXT;
    return --context->references == 0 ? DestroyContext(context) : CUDA_SUCCESS;
}

CUresult cuCtxPushCurrent(CUcontext context) {
    if (!IsAlive(context)) return CUDA_ERROR_INVALID_CONTEXT;
    GetStack().push_back(context);
    return CUDA_SUCCESS;
}
SOFTCUDA_V2(cuCtxPushCurrent);

CUresult cuCtxPopCurrent(CUcontext* context) {
    std::vector<CUcontext>& stack = GetStack();
    if (stack.empty()) return CUDA_ERROR_INVALID_CONTEXT;
    if (context != nullptr) *context = stack.back();
    stack.pop_back();
    return CUDA_SUCCESS;
}
SOFTCUDA_V2(cuCtxPopCurrent);

CUresult cuCtxSetCurrent(CUcontext context) {
    if (context != nullptr && !IsAlive(context)) return CUDA_ERROR_INVALID_CONTEXT;
    std::vector<CUcontext>& stack = GetStack();
    if (!stack.empty()) stack.pop_back();
    if (context != nullptr) stack.push_back(context);
    return CUDA_SUCCESS;
}

CUresult cuCtxGetCurrent(CUcontext* context) {
    if (context == nullptr) return CUDA_ERROR_INVALID_VALUE;
    *context = GetCurrent();
    return CUDA_SUCCESS;
}

CUresult cuCtxGetDevice(CUdevice* device) {
    CUcontext context = nullptr;
    if (const CUresult result = NeedContext(context); result != CUDA_SUCCESS) return result;
    if (device == nullptr) return CUDA_ERROR_INVALID_VALUE;
    *device = context->device;
    return CUDA_SUCCESS;
}

CUresult cuCtxSynchronize(void) {
    CUcontext context = nullptr;
    if (const CUresult result = NeedContext(context); result != CUDA_SUCCESS) return result;
    context->Synchronize();
    return CUDA_SUCCESS;
}

void SoftCudaSetFailEvery(unsigned n) { GetMemory().SetFailEvery(n); }

void SoftCudaSetThreads(unsigned threads) { GetPool().SetLimit(static_cast<int>(threads)); }

void SoftCudaSetFusing(int on) {
    Driver& driver = GetDriver();
    const std::lock_guard<std::mutex> lock(driver.mutex);
    for (const auto& context : driver.contexts) context->Synchronize();
    Stream::SetFusing(on != 0);
}

void SoftCudaGetCounters(SoftCudaCounters* counters) {
    const Counters& own = GetCounters();
    *counters = {own.launches, own.pointwise, own.passes, own.fused, own.timerFlushes, own.refusedAllocations};
}

const char* SoftCudaGetMessage(void) { return GetMessage(); }

const char* SoftCudaDescribe(void) {
    static const std::string text = "CPU driver, " + std::to_string(GetPool().GetLimit()) + " threads, x86-64-" +
                                    kLevelNames[ChooseLevel()] + ", " +
                                    std::to_string(ReadSettings().memoryBytes >> 20) + " MB";
    return text.c_str();
}

}  // extern "C"
