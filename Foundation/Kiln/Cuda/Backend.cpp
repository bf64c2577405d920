// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Cuda/Backend.h"

#include <utility>

#include "Kiln/Log.h"

namespace Kiln::Cuda {
namespace {

CUDA_MEMCPY2D DescribeRows(std::uint64_t widthBytes, std::uint64_t rows) {
    CUDA_MEMCPY2D copy = {};
    copy.WidthInBytes = widthBytes;
    copy.Height = rows;
    return copy;
}

void SetSource(CUDA_MEMCPY2D& copy, CUdeviceptr source, const RowLayout& layout) {
    copy.srcMemoryType = CU_MEMORYTYPE_DEVICE;
    copy.srcDevice = source + layout.offset;
    copy.srcPitch = layout.rowBytes;
}

CUfunction ToFunction(std::uint64_t kernel) { return reinterpret_cast<CUfunction>(kernel); }

}  // namespace

CudaBackend::CudaBackend(std::shared_ptr<const Driver> driver, DeviceFacts facts, CUcontext context, CUstream stream)
    : mDriver(std::move(driver)), mFacts(std::move(facts)), mContext(context), mStream(stream) {}

CudaBackend::~CudaBackend() {
    {
        const ScopedContext current(*this);
        mDriver->cuStreamSynchronize(mStream);
        mDriver->cuStreamDestroy(mStream);
    }
    mDriver->cuCtxDestroy(mContext);
}

void CudaBackend::Enter() { mDriver->cuCtxPushCurrent(mContext); }

void CudaBackend::Leave() {
    CUcontext popped = nullptr;
    mDriver->cuCtxPopCurrent(&popped);
}

std::uint64_t CudaBackend::AllocateDevice(std::uint64_t bytes) {
    const ScopedContext current(*this);
    CUdeviceptr block = 0;
    return mDriver->cuMemAlloc(&block, bytes) == CUDA_SUCCESS ? block : 0;
}

void CudaBackend::FreeDevice(std::uint64_t block) {
    const ScopedContext current(*this);
    mDriver->cuMemFree(block);
}

void* CudaBackend::AllocateHost(std::uint64_t bytes) {
    const ScopedContext current(*this);
    void* block = nullptr;
    return mDriver->cuMemHostAlloc(&block, bytes, CU_MEMHOSTALLOC_PORTABLE) == CUDA_SUCCESS ? block : nullptr;
}

void CudaBackend::FreeHost(void* block) {
    const ScopedContext current(*this);
    mDriver->cuMemFreeHost(block);
}

Ostrand::Status CudaBackend::CopyToDevice(std::uint64_t target, std::uint64_t targetOffset, const void* source,
                                          std::uint64_t bytes) {
    const ScopedContext current(*this);
    return ToStatus(mDriver->cuMemcpyHtoDAsync(target + targetOffset, source, bytes, mStream));
}

Ostrand::Status CudaBackend::CopyRowsToHost(void* target, std::uint64_t targetRowBytes, std::uint64_t source,
                                            const RowLayout& sourceLayout, std::uint64_t widthBytes,
                                            std::uint64_t rows) {
    const ScopedContext current(*this);
    CUDA_MEMCPY2D copy = DescribeRows(widthBytes, rows);
    SetSource(copy, source, sourceLayout);
    copy.dstMemoryType = CU_MEMORYTYPE_HOST;
    copy.dstHost = target;
    copy.dstPitch = targetRowBytes;
    const CUresult result = mDriver->cuMemcpy2DAsync(&copy, mStream);
    return ToStatus(result == CUDA_SUCCESS ? mDriver->cuStreamSynchronize(mStream) : result);
}

Ostrand::Status CudaBackend::CopyRows(std::uint64_t target, const RowLayout& targetLayout, std::uint64_t source,
                                      const RowLayout& sourceLayout, std::uint64_t widthBytes, std::uint64_t rows) {
    const ScopedContext current(*this);
    if (targetLayout.rowBytes == widthBytes && sourceLayout.rowBytes == widthBytes) {
        return ToStatus(mDriver->cuMemcpyDtoDAsync(target + targetLayout.offset, source + sourceLayout.offset,
                                                   widthBytes * rows, mStream));
    }
    CUDA_MEMCPY2D copy = DescribeRows(widthBytes, rows);
    SetSource(copy, source, sourceLayout);
    copy.dstMemoryType = CU_MEMORYTYPE_DEVICE;
    copy.dstDevice = target + targetLayout.offset;
    copy.dstPitch = targetLayout.rowBytes;
    return ToStatus(mDriver->cuMemcpy2DAsync(&copy, mStream));
}

Ostrand::Status CudaBackend::Fill(std::uint64_t target, std::uint64_t offset, std::uint32_t pattern,
                                  std::uint64_t bytes) {
    const ScopedContext current(*this);
    return ToStatus(mDriver->cuMemsetD32Async(target + offset, pattern, bytes / sizeof pattern, mStream));
}

std::uint64_t CudaBackend::LoadModule(const ModuleImage& image, std::string& message) {
    const void* binary = mDriver->isCPUDriver ? image.cpuImage : image.cudaImage;
    if (!binary) {
        message = mDriver->isCPUDriver ? "the build carries no CPU image of the module"
                                       : "the build carries no CUDA image of the module: it had no CUDA compiler";
        return 0;
    }
    const ScopedContext current(*this);
    CUmodule module = nullptr;
    const CUresult result = mDriver->cuModuleLoadData(&module, binary);
    if (result == CUDA_SUCCESS) return reinterpret_cast<std::uint64_t>(module);
    message = "the driver refuses the module: " + mDriver->Describe(result);
    return 0;
}

void CudaBackend::UnloadModule(std::uint64_t module) {
    const ScopedContext current(*this);
    mDriver->cuModuleUnload(reinterpret_cast<CUmodule>(module));
}

std::uint64_t CudaBackend::GetKernel(std::uint64_t module, const char* name) {
    const ScopedContext current(*this);
    CUfunction function = nullptr;
    const CUresult result = mDriver->cuModuleGetFunction(&function, reinterpret_cast<CUmodule>(module), name);
    return result == CUDA_SUCCESS ? reinterpret_cast<std::uint64_t>(function) : 0;
}

// Functions belong to their module.
void CudaBackend::ReleaseKernel(std::uint64_t /*kernel*/) {}

Ostrand::Status CudaBackend::SetArguments(std::uint64_t kernel, const KernelArguments& arguments) {
    const ScopedContext current(*this);
    // The driver takes the values by a pointer to mutable memory, but only reads them.
    CUresult result =
        mDriver->cuParamSetv(ToFunction(kernel), 0, const_cast<void*>(arguments.GetBytes()), arguments.GetByteCount());
    if (result == CUDA_SUCCESS) result = mDriver->cuParamSetSize(ToFunction(kernel), arguments.GetByteCount());
    return ToStatus(result);
}

Ostrand::Status CudaBackend::Launch(std::uint64_t kernel, const LaunchShape& shape) {
    const ScopedContext current(*this);
    CUresult result = mDriver->cuFuncSetBlockShape(ToFunction(kernel), shape.blockX, shape.blockY, 1);
    if (result == CUDA_SUCCESS) {
        result = mDriver->cuLaunchGridAsync(ToFunction(kernel), shape.gridX, shape.gridY, mStream);
    }
    if (result != CUDA_SUCCESS) Log("Kiln.Device", "a launch failed: " + mDriver->Describe(result));
    return ToStatus(result);
}

Ostrand::Status CudaBackend::Synchronize() {
    const ScopedContext current(*this);
    const CUresult result = mDriver->cuStreamSynchronize(mStream);
    if (result != CUDA_SUCCESS) Log("Kiln.Device", "the stream failed: " + mDriver->Describe(result));
    return result == CUDA_SUCCESS ? Ostrand::kStatus_OK : Ostrand::kStatus_Failure;
}

}  // namespace Kiln::Cuda
