// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// The part of the CUDA driver API that this project uses, declared on its own so that nothing needs the vendor's
/// toolkit: handles, codes, records and the prototype of each entry. Layouts and values are those of the API's current
/// (`_v2`) form, so that a table of `decltype(&cuMemAlloc)` pointers can be bound to a real driver as well as to this
/// one.
///
/// With a real driver bind the `_v2` name wherever there is one: there, the plain name is the 32-bit form of old. The
/// CPU driver exports both and they are the same function.

#include <cstddef>

extern "C" {

using CUdevice = int;
using CUdeviceptr = unsigned long long;
using CUcontext = struct CUctx_st*;
using CUmodule = struct CUmod_st*;
using CUfunction = struct CUfunc_st*;
using CUarray = struct CUarray_st*;
using CUtexref = struct CUtexref_st*;
using CUsurfref = struct CUsurfref_st*;
using CUevent = struct CUevent_st*;
using CUstream = struct CUstream_st*;
using CUgraphicsResource = struct CUgraphicsResource_st*;

enum CUresult : int {
    CUDA_SUCCESS = 0,
    CUDA_ERROR_INVALID_VALUE = 1,
    CUDA_ERROR_OUT_OF_MEMORY = 2,
    CUDA_ERROR_NOT_INITIALIZED = 3,
    CUDA_ERROR_DEINITIALIZED = 4,
    CUDA_ERROR_NO_DEVICE = 100,
    CUDA_ERROR_INVALID_DEVICE = 101,
    CUDA_ERROR_INVALID_IMAGE = 200,
    CUDA_ERROR_INVALID_CONTEXT = 201,
    CUDA_ERROR_NO_BINARY_FOR_GPU = 209,
    CUDA_ERROR_INVALID_PTX = 218,
    CUDA_ERROR_FILE_NOT_FOUND = 301,
    CUDA_ERROR_INVALID_HANDLE = 400,
    CUDA_ERROR_NOT_FOUND = 500,
    CUDA_ERROR_NOT_READY = 600,
    CUDA_ERROR_ILLEGAL_ADDRESS = 700,
    CUDA_ERROR_HOST_MEMORY_ALREADY_REGISTERED = 712,
    CUDA_ERROR_HOST_MEMORY_NOT_REGISTERED = 713,
    CUDA_ERROR_LAUNCH_FAILED = 719,
    CUDA_ERROR_NOT_SUPPORTED = 801,
    CUDA_ERROR_UNKNOWN = 999
};

enum CUdevice_attribute : int {
    CU_DEVICE_ATTRIBUTE_MAX_THREADS_PER_BLOCK = 1,
    CU_DEVICE_ATTRIBUTE_MAX_BLOCK_DIM_X = 2,
    CU_DEVICE_ATTRIBUTE_MAX_BLOCK_DIM_Y = 3,
    CU_DEVICE_ATTRIBUTE_MAX_BLOCK_DIM_Z = 4,
    CU_DEVICE_ATTRIBUTE_MAX_GRID_DIM_X = 5,
    CU_DEVICE_ATTRIBUTE_MAX_GRID_DIM_Y = 6,
    CU_DEVICE_ATTRIBUTE_MAX_GRID_DIM_Z = 7,
    CU_DEVICE_ATTRIBUTE_MAX_SHARED_MEMORY_PER_BLOCK = 8,
    CU_DEVICE_ATTRIBUTE_TOTAL_CONSTANT_MEMORY = 9,
    CU_DEVICE_ATTRIBUTE_WARP_SIZE = 10,
    CU_DEVICE_ATTRIBUTE_MAX_PITCH = 11,
    CU_DEVICE_ATTRIBUTE_MAX_REGISTERS_PER_BLOCK = 12,
    CU_DEVICE_ATTRIBUTE_CLOCK_RATE = 13,
    CU_DEVICE_ATTRIBUTE_TEXTURE_ALIGNMENT = 14,
    CU_DEVICE_ATTRIBUTE_GPU_OVERLAP = 15,
    CU_DEVICE_ATTRIBUTE_MULTIPROCESSOR_COUNT = 16,
    CU_DEVICE_ATTRIBUTE_KERNEL_EXEC_TIMEOUT = 17,
    CU_DEVICE_ATTRIBUTE_INTEGRATED = 18,
    CU_DEVICE_ATTRIBUTE_CAN_MAP_HOST_MEMORY = 19,
    CU_DEVICE_ATTRIBUTE_COMPUTE_MODE = 20,
    CU_DEVICE_ATTRIBUTE_CONCURRENT_KERNELS = 31,
    CU_DEVICE_ATTRIBUTE_ECC_ENABLED = 32,
    CU_DEVICE_ATTRIBUTE_PCI_BUS_ID = 33,
    CU_DEVICE_ATTRIBUTE_PCI_DEVICE_ID = 34,
    CU_DEVICE_ATTRIBUTE_MEMORY_CLOCK_RATE = 36,
    CU_DEVICE_ATTRIBUTE_GLOBAL_MEMORY_BUS_WIDTH = 37,
    CU_DEVICE_ATTRIBUTE_L2_CACHE_SIZE = 38,
    CU_DEVICE_ATTRIBUTE_ASYNC_ENGINE_COUNT = 40,
    CU_DEVICE_ATTRIBUTE_UNIFIED_ADDRESSING = 41,
    CU_DEVICE_ATTRIBUTE_PCI_DOMAIN_ID = 50,
    CU_DEVICE_ATTRIBUTE_COMPUTE_CAPABILITY_MAJOR = 75,
    CU_DEVICE_ATTRIBUTE_COMPUTE_CAPABILITY_MINOR = 76
};

enum CUctx_flags : unsigned { CU_CTX_SCHED_AUTO = 0, CU_CTX_SCHED_BLOCKING_SYNC = 4, CU_CTX_MAP_HOST = 8 };
enum CUstream_flags : unsigned { CU_STREAM_DEFAULT = 0, CU_STREAM_NON_BLOCKING = 1 };
enum CUevent_flags : unsigned { CU_EVENT_DEFAULT = 0, CU_EVENT_BLOCKING_SYNC = 1, CU_EVENT_DISABLE_TIMING = 2 };
enum : unsigned {
    CU_MEMHOSTALLOC_PORTABLE = 1,
    CU_MEMHOSTALLOC_DEVICEMAP = 2,
    CU_MEMHOSTALLOC_WRITECOMBINED = 4,
    CU_MEMHOSTREGISTER_PORTABLE = 1,
    CU_MEMHOSTREGISTER_DEVICEMAP = 2
};

enum CUmemorytype : int {
    CU_MEMORYTYPE_HOST = 1,
    CU_MEMORYTYPE_DEVICE = 2,
    CU_MEMORYTYPE_ARRAY = 3,
    CU_MEMORYTYPE_UNIFIED = 4
};
enum CUarray_format : int { CU_AD_FORMAT_UNSIGNED_INT8 = 1, CU_AD_FORMAT_HALF = 0x10, CU_AD_FORMAT_FLOAT = 0x20 };
enum CUaddress_mode : int { CU_TR_ADDRESS_MODE_WRAP = 0, CU_TR_ADDRESS_MODE_CLAMP = 1 };
enum CUfilter_mode : int { CU_TR_FILTER_MODE_POINT = 0, CU_TR_FILTER_MODE_LINEAR = 1 };
enum CUfunction_attribute : int {
    CU_FUNC_ATTRIBUTE_MAX_THREADS_PER_BLOCK = 0,
    CU_FUNC_ATTRIBUTE_SHARED_SIZE_BYTES = 1,
    CU_FUNC_ATTRIBUTE_CONST_SIZE_BYTES = 2,
    CU_FUNC_ATTRIBUTE_LOCAL_SIZE_BYTES = 3,
    CU_FUNC_ATTRIBUTE_NUM_REGS = 4
};
enum CUfunc_cache : int { CU_FUNC_CACHE_PREFER_NONE = 0 };
enum CUlimit : int { CU_LIMIT_STACK_SIZE = 0, CU_LIMIT_PRINTF_FIFO_SIZE = 1, CU_LIMIT_MALLOC_HEAP_SIZE = 2 };
enum CUjit_option : int { CU_JIT_INFO_LOG_BUFFER = 3, CU_JIT_ERROR_LOG_BUFFER = 5 };

struct CUuuid {
    char bytes[16];
};

struct CUdevprop {
    int maxThreadsPerBlock;
    int maxThreadsDim[3];
    int maxGridSize[3];
    int sharedMemPerBlock;
    int totalConstantMemory;
    int SIMDWidth;
    int memPitch;
    int regsPerBlock;
    int clockRate;
    int textureAlign;
};

struct CUDA_MEMCPY2D {
    size_t srcXInBytes;
    size_t srcY;
    CUmemorytype srcMemoryType;
    const void* srcHost;
    CUdeviceptr srcDevice;
    CUarray srcArray;
    size_t srcPitch;
    size_t dstXInBytes;
    size_t dstY;
    CUmemorytype dstMemoryType;
    void* dstHost;
    CUdeviceptr dstDevice;
    CUarray dstArray;
    size_t dstPitch;
    size_t WidthInBytes;
    size_t Height;
};
static_assert(sizeof(CUDA_MEMCPY2D) == 128, "the driver's own layout");

struct CUDA_MEMCPY3D;
struct CUDA_ARRAY3D_DESCRIPTOR;

struct CUDA_ARRAY_DESCRIPTOR {
    size_t Width;
    size_t Height;
    CUarray_format Format;
    unsigned NumChannels;
};

// Declares an entry under its plain and its versioned name.
#define CUDA_BOTH_NAMES(name, ...) \
    CUresult name(__VA_ARGS__);    \
    CUresult name##_v2(__VA_ARGS__)

CUresult cuInit(unsigned flags);
CUresult cuDriverGetVersion(int* version);
CUresult cuGetErrorString(CUresult error, const char** text);
CUresult cuGetErrorName(CUresult error, const char** name);

CUresult cuDeviceGet(CUdevice* device, int ordinal);
CUresult cuDeviceGetCount(int* count);
CUresult cuDeviceGetName(char* name, int length, CUdevice device);
CUresult cuDeviceGetUuid(CUuuid* uuid, CUdevice device);
CUresult cuDeviceComputeCapability(int* major, int* minor, CUdevice device);
CUresult cuDeviceGetProperties(CUdevprop* properties, CUdevice device);
CUresult cuDeviceGetAttribute(int* value, CUdevice_attribute attribute, CUdevice device);
CUDA_BOTH_NAMES(cuDeviceTotalMem, size_t* bytes, CUdevice device);

CUDA_BOTH_NAMES(cuCtxCreate, CUcontext* context, unsigned flags, CUdevice device);
CUDA_BOTH_NAMES(cuCtxDestroy, CUcontext context);
CUDA_BOTH_NAMES(cuCtxPushCurrent, CUcontext context);
CUDA_BOTH_NAMES(cuCtxPopCurrent, CUcontext* context);
CUresult cuCtxAttach(CUcontext* context, unsigned flags);
CUresult cuCtxDetach(CUcontext context);
CUresult cuCtxSetCurrent(CUcontext context);
CUresult cuCtxGetCurrent(CUcontext* context);
CUresult cuCtxGetDevice(CUdevice* device);
CUresult cuCtxSynchronize(void);
CUresult cuCtxSetLimit(CUlimit limit, size_t value);
CUresult cuCtxGetLimit(size_t* value, CUlimit limit);

CUresult cuModuleLoad(CUmodule* module, const char* path);
CUresult cuModuleLoadData(CUmodule* module, const void* image);
CUresult cuModuleLoadDataEx(CUmodule* module, const void* image, unsigned optionCount, CUjit_option* options,
                            void** optionValues);
CUresult cuModuleLoadFatBinary(CUmodule* module, const void* image);
CUresult cuModuleUnload(CUmodule module);
CUresult cuModuleGetFunction(CUfunction* function, CUmodule module, const char* name);
CUDA_BOTH_NAMES(cuModuleGetGlobal, CUdeviceptr* address, size_t* bytes, CUmodule module, const char* name);
CUresult cuModuleGetTexRef(CUtexref* texture, CUmodule module, const char* name);
CUresult cuModuleGetSurfRef(CUsurfref* surface, CUmodule module, const char* name);

CUDA_BOTH_NAMES(cuMemGetInfo, size_t* freeBytes, size_t* totalBytes);
CUDA_BOTH_NAMES(cuMemAlloc, CUdeviceptr* address, size_t bytes);
CUDA_BOTH_NAMES(cuMemAllocPitch, CUdeviceptr* address, size_t* pitch, size_t widthBytes, size_t height,
                unsigned elementBytes);
CUDA_BOTH_NAMES(cuMemFree, CUdeviceptr address);
CUDA_BOTH_NAMES(cuMemGetAddressRange, CUdeviceptr* base, size_t* bytes, CUdeviceptr address);
CUDA_BOTH_NAMES(cuMemAllocHost, void** host, size_t bytes);
CUresult cuMemFreeHost(void* host);
CUresult cuMemHostAlloc(void** host, size_t bytes, unsigned flags);
CUDA_BOTH_NAMES(cuMemHostGetDevicePointer, CUdeviceptr* address, void* host, unsigned flags);
CUresult cuMemHostGetFlags(unsigned* flags, void* host);
CUDA_BOTH_NAMES(cuMemHostRegister, void* host, size_t bytes, unsigned flags);
CUresult cuMemHostUnregister(void* host);

CUresult cuMemcpy(CUdeviceptr target, CUdeviceptr source, size_t bytes);
CUresult cuMemcpyPeer(CUdeviceptr target, CUcontext targetContext, CUdeviceptr source, CUcontext sourceContext,
                      size_t bytes);
CUDA_BOTH_NAMES(cuMemcpyHtoD, CUdeviceptr target, const void* source, size_t bytes);
CUDA_BOTH_NAMES(cuMemcpyDtoH, void* target, CUdeviceptr source, size_t bytes);
CUDA_BOTH_NAMES(cuMemcpyDtoD, CUdeviceptr target, CUdeviceptr source, size_t bytes);
CUDA_BOTH_NAMES(cuMemcpyHtoDAsync, CUdeviceptr target, const void* source, size_t bytes, CUstream stream);
CUDA_BOTH_NAMES(cuMemcpyDtoHAsync, void* target, CUdeviceptr source, size_t bytes, CUstream stream);
CUDA_BOTH_NAMES(cuMemcpyDtoDAsync, CUdeviceptr target, CUdeviceptr source, size_t bytes, CUstream stream);
CUDA_BOTH_NAMES(cuMemcpy2D, const CUDA_MEMCPY2D* copy);
CUDA_BOTH_NAMES(cuMemcpy2DUnaligned, const CUDA_MEMCPY2D* copy);
CUDA_BOTH_NAMES(cuMemcpy2DAsync, const CUDA_MEMCPY2D* copy, CUstream stream);
CUDA_BOTH_NAMES(cuMemcpy3D, const CUDA_MEMCPY3D* copy);
CUDA_BOTH_NAMES(cuMemcpy3DAsync, const CUDA_MEMCPY3D* copy, CUstream stream);
CUDA_BOTH_NAMES(cuMemcpyDtoA, CUarray target, size_t offset, CUdeviceptr source, size_t bytes);
CUDA_BOTH_NAMES(cuMemcpyAtoD, CUdeviceptr target, CUarray source, size_t offset, size_t bytes);
CUDA_BOTH_NAMES(cuMemcpyHtoA, CUarray target, size_t offset, const void* source, size_t bytes);
CUDA_BOTH_NAMES(cuMemcpyAtoH, void* target, CUarray source, size_t offset, size_t bytes);
CUDA_BOTH_NAMES(cuMemcpyAtoA, CUarray target, size_t targetOffset, CUarray source, size_t sourceOffset, size_t bytes);
CUDA_BOTH_NAMES(cuMemcpyHtoAAsync, CUarray target, size_t offset, const void* source, size_t bytes, CUstream stream);
CUDA_BOTH_NAMES(cuMemcpyAtoHAsync, void* target, CUarray source, size_t offset, size_t bytes, CUstream stream);

CUDA_BOTH_NAMES(cuMemsetD8, CUdeviceptr target, unsigned char value, size_t count);
CUDA_BOTH_NAMES(cuMemsetD16, CUdeviceptr target, unsigned short value, size_t count);
CUDA_BOTH_NAMES(cuMemsetD32, CUdeviceptr target, unsigned value, size_t count);
CUDA_BOTH_NAMES(cuMemsetD2D8, CUdeviceptr target, size_t pitch, unsigned char value, size_t width, size_t height);
CUDA_BOTH_NAMES(cuMemsetD2D16, CUdeviceptr target, size_t pitch, unsigned short value, size_t width, size_t height);
CUDA_BOTH_NAMES(cuMemsetD2D32, CUdeviceptr target, size_t pitch, unsigned value, size_t width, size_t height);
CUresult cuMemsetD8Async(CUdeviceptr target, unsigned char value, size_t count, CUstream stream);
CUresult cuMemsetD32Async(CUdeviceptr target, unsigned value, size_t count, CUstream stream);

CUresult cuFuncSetBlockShape(CUfunction function, int x, int y, int z);
CUresult cuFuncSetSharedSize(CUfunction function, unsigned bytes);
CUresult cuFuncGetAttribute(int* value, CUfunction_attribute attribute, CUfunction function);
CUresult cuFuncSetCacheConfig(CUfunction function, CUfunc_cache config);
CUresult cuParamSetSize(CUfunction function, unsigned bytes);
CUresult cuParamSeti(CUfunction function, int offset, unsigned value);
CUresult cuParamSetf(CUfunction function, int offset, float value);
CUresult cuParamSetv(CUfunction function, int offset, void* value, unsigned bytes);
CUresult cuParamSetTexRef(CUfunction function, int unit, CUtexref texture);
CUresult cuLaunch(CUfunction function);
CUresult cuLaunchGrid(CUfunction function, int gridX, int gridY);
CUresult cuLaunchGridAsync(CUfunction function, int gridX, int gridY, CUstream stream);
CUresult cuLaunchKernel(CUfunction function, unsigned gridX, unsigned gridY, unsigned gridZ, unsigned blockX,
                        unsigned blockY, unsigned blockZ, unsigned sharedBytes, CUstream stream, void** parameters,
                        void** extra);

CUresult cuStreamCreate(CUstream* stream, unsigned flags);
CUDA_BOTH_NAMES(cuStreamDestroy, CUstream stream);
CUresult cuStreamQuery(CUstream stream);
CUresult cuStreamSynchronize(CUstream stream);
CUresult cuStreamWaitEvent(CUstream stream, CUevent event, unsigned flags);
CUresult cuEventCreate(CUevent* event, unsigned flags);
CUDA_BOTH_NAMES(cuEventDestroy, CUevent event);
CUresult cuEventRecord(CUevent event, CUstream stream);
CUresult cuEventQuery(CUevent event);
CUresult cuEventSynchronize(CUevent event);
CUresult cuEventElapsedTime(float* milliseconds, CUevent start, CUevent end);

CUDA_BOTH_NAMES(cuArrayCreate, CUarray* array, const CUDA_ARRAY_DESCRIPTOR* descriptor);
CUDA_BOTH_NAMES(cuArrayGetDescriptor, CUDA_ARRAY_DESCRIPTOR* descriptor, CUarray array);
CUDA_BOTH_NAMES(cuArray3DCreate, CUarray* array, const CUDA_ARRAY3D_DESCRIPTOR* descriptor);
CUDA_BOTH_NAMES(cuArray3DGetDescriptor, CUDA_ARRAY3D_DESCRIPTOR* descriptor, CUarray array);
CUresult cuArrayDestroy(CUarray array);
CUresult cuTexRefCreate(CUtexref* texture);
CUresult cuTexRefDestroy(CUtexref texture);
CUresult cuTexRefSetArray(CUtexref texture, CUarray array, unsigned flags);
CUDA_BOTH_NAMES(cuTexRefSetAddress, size_t* offset, CUtexref texture, CUdeviceptr address, size_t bytes);
CUDA_BOTH_NAMES(cuTexRefSetAddress2D, CUtexref texture, const CUDA_ARRAY_DESCRIPTOR* descriptor, CUdeviceptr address,
                size_t pitch);
CUresult cuTexRefSetFormat(CUtexref texture, CUarray_format format, int components);
CUresult cuTexRefSetAddressMode(CUtexref texture, int dimension, CUaddress_mode mode);
CUresult cuTexRefSetFilterMode(CUtexref texture, CUfilter_mode mode);
CUresult cuTexRefSetFlags(CUtexref texture, unsigned flags);
CUDA_BOTH_NAMES(cuTexRefGetAddress, CUdeviceptr* address, CUtexref texture);
CUresult cuTexRefGetArray(CUarray* array, CUtexref texture);
CUresult cuTexRefGetAddressMode(CUaddress_mode* mode, CUtexref texture, int dimension);
CUresult cuTexRefGetFilterMode(CUfilter_mode* mode, CUtexref texture);
CUresult cuTexRefGetFormat(CUarray_format* format, int* components, CUtexref texture);
CUresult cuTexRefGetFlags(unsigned* flags, CUtexref texture);
CUresult cuSurfRefSetArray(CUsurfref surface, CUarray array, unsigned flags);
CUresult cuSurfRefGetArray(CUarray* array, CUsurfref surface);

CUDA_BOTH_NAMES(cuGLCtxCreate, CUcontext* context, unsigned flags, CUdevice device);
CUresult cuGraphicsGLRegisterBuffer(CUgraphicsResource* resource, unsigned buffer, unsigned flags);
CUresult cuGraphicsGLRegisterImage(CUgraphicsResource* resource, unsigned image, unsigned target, unsigned flags);
CUresult cuGraphicsUnregisterResource(CUgraphicsResource resource);
CUresult cuGraphicsSubResourceGetMappedArray(CUarray* array, CUgraphicsResource resource, unsigned index,
                                             unsigned level);
CUDA_BOTH_NAMES(cuGraphicsResourceGetMappedPointer, CUdeviceptr* address, size_t* bytes, CUgraphicsResource resource);
CUresult cuGraphicsResourceSetMapFlags(CUgraphicsResource resource, unsigned flags);
CUresult cuGraphicsMapResources(unsigned count, CUgraphicsResource* resources, CUstream stream);
CUresult cuGraphicsUnmapResources(unsigned count, CUgraphicsResource* resources, CUstream stream);
CUresult cuGetExportTable(const void** table, const CUuuid* id);

#undef CUDA_BOTH_NAMES

}  // extern "C"
