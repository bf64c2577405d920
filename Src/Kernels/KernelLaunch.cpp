// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Kernels/KernelLaunch.h"

#include "Src/Kernels/CudaDriver.h"
#include "Src/Kernels/OpenCLLibrary.h"

namespace Vantrel {
namespace {

Status FromCudaStatus(std::int32_t status) {
    if (status == 0) return Ostrand::kStatus_OK;
    return status == CUDA_ERROR_OUT_OF_MEMORY ? Ostrand::kStatus_OutOfMemory : Ostrand::kStatus_Failure;
}

Status FromOpenCLStatus(std::int32_t status) {
    switch (status) {
        case CL_SUCCESS:
            return Ostrand::kStatus_OK;
        case CL_MEM_OBJECT_ALLOCATION_FAILURE:
        case CL_OUT_OF_RESOURCES:
        case CL_OUT_OF_HOST_MEMORY:
            return Ostrand::kStatus_OutOfMemory;
        default:
            return Ostrand::kStatus_Failure;
    }
}

CUfunction ToFunction(std::uint64_t kernel) {
    return reinterpret_cast<CUfunction>(static_cast<std::uintptr_t>(kernel));
}

}  // namespace

void KernelArgs::Add(const void* value, std::uint32_t bytes) {
    if (mFramework != Kiln::DeviceFramework::kCuda) {
        if (mOpenCLStatus != 0) return;
        const auto kernel = reinterpret_cast<cl_kernel>(static_cast<std::uintptr_t>(mKernel));
        const auto setArgument = GetOpenCL().clSetKernelArg;
        mOpenCLStatus = setArgument ? setArgument(kernel, mOpenCLIndex, bytes, value) : CL_INVALID_KERNEL;
        ++mOpenCLIndex;
        return;
    }
    if (mCudaStatus != 0) return;
    mCudaOffset = (mCudaOffset + bytes - 1) & ~(bytes - 1);
    const auto setParameter = GetCudaDriver().cuParamSetv;
    // The driver only reads through the pointer.
    mCudaStatus = setParameter ? setParameter(ToFunction(mKernel), static_cast<std::int32_t>(mCudaOffset),
                                              const_cast<void*>(value), bytes)
                               : CUDA_ERROR_NOT_FOUND;
    mCudaOffset += bytes;
}

Status KernelArgs::Finish() {
    if (mFramework != Kiln::DeviceFramework::kCuda) return FromOpenCLStatus(mOpenCLStatus);
    if (mCudaStatus == 0) {
        const auto setSize = GetCudaDriver().cuParamSetSize;
        mCudaStatus = setSize ? setSize(ToFunction(mKernel), mCudaOffset) : CUDA_ERROR_NOT_FOUND;
    }
    return FromCudaStatus(mCudaStatus);
}

std::int32_t BytesPerPixel(Vellum::PixelFormat format) {
    namespace Bits = Vellum::PixelFormatBits;
    const std::uint32_t upper = format.GetUpper();
    if ((upper & Bits::kClassMask) != Bits::kClassRGB) return 0;
    const bool isNarrow = (upper & Bits::kWidthMask) != 0;
    switch ((upper & Bits::kLayoutMask) >> 1) {
        case 0:
            return isNarrow ? 2 : 4;
        case 2:
        case 3:
            return 8;
        case 5:
            return isNarrow ? 8 : 16;
        default:
            return 0;
    }
}

std::int32_t PitchInPixels(std::int32_t rowBytes, Vellum::PixelFormat format) {
    const std::int32_t pixelBytes = Vantrel::BytesPerPixel(format);
    return pixelBytes == 0 ? 0 : rowBytes / pixelBytes;
}

}  // namespace Vantrel
