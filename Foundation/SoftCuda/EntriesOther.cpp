// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Error names, and the entries that programs bind but this driver has nothing for: arrays, texture and surface
// references, graphics interoperation. These answer with the API's code for it.

#include "SoftCuda/Controls.h"
#include "SoftCuda/Objects.h"

namespace {

struct ErrorName {
    CUresult code;
    const char* name;
    const char* text;
};
constexpr ErrorName kErrors[] = {
    {CUDA_SUCCESS, "CUDA_SUCCESS", "no error"},
    {CUDA_ERROR_INVALID_VALUE, "CUDA_ERROR_INVALID_VALUE", "an argument is out of range"},
    {CUDA_ERROR_OUT_OF_MEMORY, "CUDA_ERROR_OUT_OF_MEMORY", "out of memory"},
    {CUDA_ERROR_NOT_INITIALIZED, "CUDA_ERROR_NOT_INITIALIZED", "cuInit hasn't been called"},
    {CUDA_ERROR_DEINITIALIZED, "CUDA_ERROR_DEINITIALIZED", "the driver is shutting down"},
    {CUDA_ERROR_NO_DEVICE, "CUDA_ERROR_NO_DEVICE", "there is no device"},
    {CUDA_ERROR_INVALID_DEVICE, "CUDA_ERROR_INVALID_DEVICE", "there is no device of this number"},
    {CUDA_ERROR_INVALID_IMAGE, "CUDA_ERROR_INVALID_IMAGE", "the module image isn't one"},
    {CUDA_ERROR_INVALID_CONTEXT, "CUDA_ERROR_INVALID_CONTEXT", "there is no such context, or none is current"},
    {CUDA_ERROR_NO_BINARY_FOR_GPU, "CUDA_ERROR_NO_BINARY_FOR_GPU", "the module image has no code for this device"},
    {CUDA_ERROR_INVALID_PTX, "CUDA_ERROR_INVALID_PTX", "the module image can't be compiled"},
    {CUDA_ERROR_FILE_NOT_FOUND, "CUDA_ERROR_FILE_NOT_FOUND", "the file isn't there"},
    {CUDA_ERROR_INVALID_HANDLE, "CUDA_ERROR_INVALID_HANDLE", "a handle is of nothing"},
    {CUDA_ERROR_NOT_FOUND, "CUDA_ERROR_NOT_FOUND", "nothing has this name"},
    {CUDA_ERROR_NOT_READY, "CUDA_ERROR_NOT_READY", "the work isn't done yet"},
    {CUDA_ERROR_ILLEGAL_ADDRESS, "CUDA_ERROR_ILLEGAL_ADDRESS", "a kernel would leave live memory"},
    {CUDA_ERROR_HOST_MEMORY_ALREADY_REGISTERED, "CUDA_ERROR_HOST_MEMORY_ALREADY_REGISTERED",
     "the host memory is registered already"},
    {CUDA_ERROR_HOST_MEMORY_NOT_REGISTERED, "CUDA_ERROR_HOST_MEMORY_NOT_REGISTERED",
     "the host memory isn't registered"},
    {CUDA_ERROR_LAUNCH_FAILED, "CUDA_ERROR_LAUNCH_FAILED", "a kernel failed"},
    {CUDA_ERROR_NOT_SUPPORTED, "CUDA_ERROR_NOT_SUPPORTED", "this driver doesn't have the operation"},
    {CUDA_ERROR_UNKNOWN, "CUDA_ERROR_UNKNOWN", "an unknown error"},
};

const ErrorName* FindError(CUresult code) {
    for (const ErrorName& error : kErrors)
        if (error.code == code) return &error;
    return nullptr;
}

}  // namespace

// The parameter lists are those of DriverApi.h; only their types count here.
#define SOFTCUDA_NONE(name, ...) \
    CUresult name(__VA_ARGS__) { return CUDA_ERROR_NOT_SUPPORTED; }
#define SOFTCUDA_NONE_V2(name, ...)  \
    SOFTCUDA_NONE(name, __VA_ARGS__) \
    SOFTCUDA_V2(name);

extern "C" {

CUresult cuGetErrorString(CUresult error, const char** text) {
    const ErrorName* found = FindError(error);
    if (text == nullptr) return CUDA_ERROR_INVALID_VALUE;
    *text = found != nullptr ? found->text : nullptr;
    return found != nullptr ? CUDA_SUCCESS : CUDA_ERROR_INVALID_VALUE;
}

CUresult cuGetErrorName(CUresult error, const char** name) {
    const ErrorName* found = FindError(error);
    if (name == nullptr) return CUDA_ERROR_INVALID_VALUE;
    *name = found != nullptr ? found->name : nullptr;
    return found != nullptr ? CUDA_SUCCESS : CUDA_ERROR_INVALID_VALUE;
}

SOFTCUDA_NONE(cuCtxSetLimit, CUlimit, size_t)
SOFTCUDA_NONE(cuCtxGetLimit, size_t*, CUlimit)
SOFTCUDA_NONE(cuModuleGetTexRef, CUtexref*, CUmodule, const char*)
SOFTCUDA_NONE(cuModuleGetSurfRef, CUsurfref*, CUmodule, const char*)
SOFTCUDA_NONE(cuParamSetTexRef, CUfunction, int, CUtexref)

SOFTCUDA_NONE_V2(cuMemcpy3D, const CUDA_MEMCPY3D*)
SOFTCUDA_NONE_V2(cuMemcpy3DAsync, const CUDA_MEMCPY3D*, CUstream)
SOFTCUDA_NONE_V2(cuMemcpyDtoA, CUarray, size_t, CUdeviceptr, size_t)
SOFTCUDA_NONE_V2(cuMemcpyAtoD, CUdeviceptr, CUarray, size_t, size_t)
SOFTCUDA_NONE_V2(cuMemcpyHtoA, CUarray, size_t, const void*, size_t)
SOFTCUDA_NONE_V2(cuMemcpyAtoH, void*, CUarray, size_t, size_t)
SOFTCUDA_NONE_V2(cuMemcpyAtoA, CUarray, size_t, CUarray, size_t, size_t)
SOFTCUDA_NONE_V2(cuMemcpyHtoAAsync, CUarray, size_t, const void*, size_t, CUstream)
SOFTCUDA_NONE_V2(cuMemcpyAtoHAsync, void*, CUarray, size_t, size_t, CUstream)

SOFTCUDA_NONE_V2(cuArrayCreate, CUarray*, const CUDA_ARRAY_DESCRIPTOR*)
SOFTCUDA_NONE_V2(cuArrayGetDescriptor, CUDA_ARRAY_DESCRIPTOR*, CUarray)
SOFTCUDA_NONE_V2(cuArray3DCreate, CUarray*, const CUDA_ARRAY3D_DESCRIPTOR*)
SOFTCUDA_NONE_V2(cuArray3DGetDescriptor, CUDA_ARRAY3D_DESCRIPTOR*, CUarray)
SOFTCUDA_NONE(cuArrayDestroy, CUarray)
SOFTCUDA_NONE(cuTexRefCreate, CUtexref*)
SOFTCUDA_NONE(cuTexRefDestroy, CUtexref)
SOFTCUDA_NONE(cuTexRefSetArray, CUtexref, CUarray, unsigned)
SOFTCUDA_NONE_V2(cuTexRefSetAddress, size_t*, CUtexref, CUdeviceptr, size_t)
SOFTCUDA_NONE_V2(cuTexRefSetAddress2D, CUtexref, const CUDA_ARRAY_DESCRIPTOR*, CUdeviceptr, size_t)
SOFTCUDA_NONE(cuTexRefSetFormat, CUtexref, CUarray_format, int)
SOFTCUDA_NONE(cuTexRefSetAddressMode, CUtexref, int, CUaddress_mode)
SOFTCUDA_NONE(cuTexRefSetFilterMode, CUtexref, CUfilter_mode)
SOFTCUDA_NONE(cuTexRefSetFlags, CUtexref, unsigned)
SOFTCUDA_NONE_V2(cuTexRefGetAddress, CUdeviceptr*, CUtexref)
SOFTCUDA_NONE(cuTexRefGetArray, CUarray*, CUtexref)
SOFTCUDA_NONE(cuTexRefGetAddressMode, CUaddress_mode*, CUtexref, int)
SOFTCUDA_NONE(cuTexRefGetFilterMode, CUfilter_mode*, CUtexref)
SOFTCUDA_NONE(cuTexRefGetFormat, CUarray_format*, int*, CUtexref)
SOFTCUDA_NONE(cuTexRefGetFlags, unsigned*, CUtexref)
SOFTCUDA_NONE(cuSurfRefSetArray, CUsurfref, CUarray, unsigned)
SOFTCUDA_NONE(cuSurfRefGetArray, CUarray*, CUsurfref)

SOFTCUDA_NONE_V2(cuGLCtxCreate, CUcontext*, unsigned, CUdevice)
SOFTCUDA_NONE(cuGraphicsGLRegisterBuffer, CUgraphicsResource*, unsigned, unsigned)
SOFTCUDA_NONE(cuGraphicsGLRegisterImage, CUgraphicsResource*, unsigned, unsigned, unsigned)
SOFTCUDA_NONE(cuGraphicsUnregisterResource, CUgraphicsResource)
SOFTCUDA_NONE(cuGraphicsSubResourceGetMappedArray, CUarray*, CUgraphicsResource, unsigned, unsigned)
SOFTCUDA_NONE_V2(cuGraphicsResourceGetMappedPointer, CUdeviceptr*, size_t*, CUgraphicsResource)
SOFTCUDA_NONE(cuGraphicsResourceSetMapFlags, CUgraphicsResource, unsigned)
SOFTCUDA_NONE(cuGraphicsMapResources, unsigned, CUgraphicsResource*, CUstream)
SOFTCUDA_NONE(cuGraphicsUnmapResources, unsigned, CUgraphicsResource*, CUstream)
SOFTCUDA_NONE(cuGetExportTable, const void**, const CUuuid*)

}  // extern "C"
