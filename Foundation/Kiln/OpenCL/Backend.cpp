// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/OpenCL/Backend.h"

#include <utility>

#include "Kiln/Log.h"
#include "Kiln/Pages.h"

namespace Kiln::OpenCL {
namespace {

cl_mem ToBuffer(std::uint64_t block) { return reinterpret_cast<cl_mem>(block); }
cl_kernel ToKernel(std::uint64_t kernel) { return reinterpret_cast<cl_kernel>(kernel); }

// Below this size the platform's own allocation is as good as one on huge pages.
constexpr std::uint64_t kOwnPagesFrom = 2U << 20;

void CL_CALLBACK ReleasePages(cl_mem /*buffer*/, void* pages) { PagesDeleter()(pages); }

// A thread of a gather kernel takes a run of pixels; on a CPU it fills the vectors.
constexpr const char* kGPUOptions = "-cl-std=CL1.2";
constexpr const char* kCPUOptions = "-cl-std=CL1.2 -D OPENCL_LANES=16";

}  // namespace

OpenCLBackend::OpenCLBackend(Session session, DeviceFacts facts)
    : mSession(std::move(session)), mFacts(std::move(facts)), mBuildOptions(mFacts.isCPU ? kCPUOptions : kGPUOptions) {}

OpenCLBackend::~OpenCLBackend() {
    GetDriver().clFinish(mSession.queue.Get());
    for (const auto& [block, buffer] : mMapped) GetDriver().clReleaseMemObject(buffer);
}

std::uint64_t OpenCLBackend::AllocateDevice(std::uint64_t bytes) {
    if (mFacts.largestBlock != 0 && bytes > mFacts.largestBlock) return 0;
    Pages pages;
    cl_mem_flags flags = CL_MEM_READ_WRITE;
    if (mFacts.isCPU && bytes >= kOwnPagesFrom) {
        pages = AllocatePages(bytes);
        if (!pages) return 0;
        flags |= CL_MEM_USE_HOST_PTR;
    }
    cl_int result = CL_SUCCESS;
    ScopedObject<cl_mem> buffer(GetDriver().clCreateBuffer(mSession.context.Get(), flags, bytes, pages.get(), &result),
                                GetDriver().clReleaseMemObject);
    if (result != CL_SUCCESS) return 0;
    // The buffer outlives its handle while queued work uses it, and its pages with it.
    if (pages) {
        if (GetDriver().clSetMemObjectDestructorCallback(buffer.Get(), ReleasePages, pages.get()) != CL_SUCCESS)
            return 0;
        static_cast<void>(pages.release());
    }
    return reinterpret_cast<std::uint64_t>(buffer.Detach());
}

void OpenCLBackend::FreeDevice(std::uint64_t block) { GetDriver().clReleaseMemObject(ToBuffer(block)); }

void* OpenCLBackend::AllocateHost(std::uint64_t bytes) {
    if (mFacts.isCPU) return AllocatePages(bytes).release();
    cl_int result = CL_SUCCESS;
    ScopedObject<cl_mem> buffer(
        GetDriver().clCreateBuffer(mSession.context.Get(), CL_MEM_READ_WRITE | CL_MEM_ALLOC_HOST_PTR, bytes, nullptr,
                                   &result),
        GetDriver().clReleaseMemObject);
    if (result != CL_SUCCESS) return nullptr;
    void* block = GetDriver().clEnqueueMapBuffer(mSession.mapQueue.Get(), buffer.Get(), CL_TRUE,
                                                 CL_MAP_READ | CL_MAP_WRITE, 0, bytes, 0, nullptr, nullptr, &result);
    if (result != CL_SUCCESS) return nullptr;
    const std::lock_guard<std::mutex> lock(mMappedMutex);
    mMapped[block] = buffer.Detach();
    return block;
}

void OpenCLBackend::FreeHost(void* block) {
    if (mFacts.isCPU) {
        PagesDeleter()(block);
        return;
    }
    cl_mem buffer = nullptr;
    {
        const std::lock_guard<std::mutex> lock(mMappedMutex);
        const auto found = mMapped.find(block);
        if (found == mMapped.end()) return;
        buffer = found->second;
        mMapped.erase(found);
    }
    GetDriver().clEnqueueUnmapMemObject(mSession.mapQueue.Get(), buffer, block, 0, nullptr, nullptr);
    GetDriver().clReleaseMemObject(buffer);
}

Ostrand::Status OpenCLBackend::CopyToDevice(std::uint64_t target, std::uint64_t targetOffset, const void* source,
                                            std::uint64_t bytes) {
    const cl_int result = GetDriver().clEnqueueWriteBuffer(mSession.queue.Get(), ToBuffer(target), CL_FALSE,
                                                           targetOffset, bytes, source, 0, nullptr, nullptr);
    if (result == CL_SUCCESS) GetDriver().clFlush(mSession.queue.Get());
    return ToStatus(result);
}

Ostrand::Status OpenCLBackend::CopyRowsToHost(void* target, std::uint64_t targetRowBytes, std::uint64_t source,
                                              const RowLayout& sourceLayout, std::uint64_t widthBytes,
                                              std::uint64_t rows) {
    if (targetRowBytes == widthBytes && sourceLayout.rowBytes == widthBytes) {
        return ToStatus(GetDriver().clEnqueueReadBuffer(mSession.queue.Get(), ToBuffer(source), CL_TRUE,
                                                        sourceLayout.offset, widthBytes * rows, target, 0, nullptr,
                                                        nullptr));
    }
    const std::size_t sourceOrigin[3] = {sourceLayout.offset, 0, 0};
    const std::size_t targetOrigin[3] = {0, 0, 0};
    const std::size_t region[3] = {widthBytes, rows, 1};
    return ToStatus(GetDriver().clEnqueueReadBufferRect(mSession.queue.Get(), ToBuffer(source), CL_TRUE, sourceOrigin,
                                                        targetOrigin, region, sourceLayout.rowBytes, 0, targetRowBytes,
                                                        0, target, 0, nullptr, nullptr));
}

Ostrand::Status OpenCLBackend::CopyRows(std::uint64_t target, const RowLayout& targetLayout, std::uint64_t source,
                                        const RowLayout& sourceLayout, std::uint64_t widthBytes, std::uint64_t rows) {
    if (targetLayout.rowBytes == widthBytes && sourceLayout.rowBytes == widthBytes) {
        return ToStatus(GetDriver().clEnqueueCopyBuffer(mSession.queue.Get(), ToBuffer(source), ToBuffer(target),
                                                        sourceLayout.offset, targetLayout.offset, widthBytes * rows, 0,
                                                        nullptr, nullptr));
    }
    const std::size_t sourceOrigin[3] = {sourceLayout.offset, 0, 0};
    const std::size_t targetOrigin[3] = {targetLayout.offset, 0, 0};
    const std::size_t region[3] = {widthBytes, rows, 1};
    return ToStatus(GetDriver().clEnqueueCopyBufferRect(mSession.queue.Get(), ToBuffer(source), ToBuffer(target),
                                                        sourceOrigin, targetOrigin, region, sourceLayout.rowBytes, 0,
                                                        targetLayout.rowBytes, 0, 0, nullptr, nullptr));
}

Ostrand::Status OpenCLBackend::Fill(std::uint64_t target, std::uint64_t offset, std::uint32_t pattern,
                                    std::uint64_t bytes) {
    return ToStatus(GetDriver().clEnqueueFillBuffer(mSession.queue.Get(), ToBuffer(target), &pattern, sizeof pattern,
                                                    offset, bytes, 0, nullptr, nullptr));
}

std::uint64_t OpenCLBackend::GetKernel(std::uint64_t module, const char* name) {
    cl_int result = CL_SUCCESS;
    cl_kernel kernel = GetDriver().clCreateKernel(reinterpret_cast<cl_program>(module), name, &result);
    return result == CL_SUCCESS ? reinterpret_cast<std::uint64_t>(kernel) : 0;
}

void OpenCLBackend::ReleaseKernel(std::uint64_t kernel) { GetDriver().clReleaseKernel(ToKernel(kernel)); }

Ostrand::Status OpenCLBackend::SetArguments(std::uint64_t kernel, const KernelArguments& arguments) {
    for (std::uint32_t index = 0; index < arguments.GetCount(); ++index) {
        const cl_int result =
            GetDriver().clSetKernelArg(ToKernel(kernel), index, arguments.GetSize(index), arguments.GetValue(index));
        if (result != CL_SUCCESS) return ToStatus(result);
    }
    return Ostrand::kStatus_OK;
}

Ostrand::Status OpenCLBackend::Launch(std::uint64_t kernel, const LaunchShape& shape) {
    const std::size_t local[2] = {static_cast<std::size_t>(shape.blockX), static_cast<std::size_t>(shape.blockY)};
    const std::size_t global[2] = {local[0] * static_cast<std::size_t>(shape.gridX),
                                   local[1] * static_cast<std::size_t>(shape.gridY)};
    const cl_int result = GetDriver().clEnqueueNDRangeKernel(mSession.queue.Get(), ToKernel(kernel), 2, nullptr, global,
                                                             local, 0, nullptr, nullptr);
    if (result != CL_SUCCESS) Log("Kiln.Device", "a launch failed with OpenCL code " + std::to_string(result));
    return ToStatus(result);
}

Ostrand::Status OpenCLBackend::Synchronize() {
    const cl_int result = GetDriver().clFinish(mSession.queue.Get());
    if (result != CL_SUCCESS) Log("Kiln.Device", "the queue failed with OpenCL code " + std::to_string(result));
    return result == CL_SUCCESS ? Ostrand::kStatus_OK : Ostrand::kStatus_Failure;
}

}  // namespace Kiln::OpenCL
