// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/Backend.h"
#include "Kiln/Cuda/Binding.h"

namespace Kiln::Cuda {

/// The CUDA driver's devices, behind the path that GetCudaDriverPath gives.
[[nodiscard]] BackendList FindBackends(const std::string& driverPath);

/// A CUDA context and one stream of it. Each call makes the context current for its own duration.
class CudaBackend final : public Backend {
public:
    /// Takes over a context and a stream.
    CudaBackend(std::shared_ptr<const Driver> driver, DeviceFacts facts, CUcontext context, CUstream stream);
    ~CudaBackend() override;

    const DeviceFacts& GetFacts() const override { return mFacts; }
    std::uint64_t GetQueueHandle() const override { return reinterpret_cast<std::uint64_t>(mStream); }
    void Enter() override;
    void Leave() override;

    std::uint64_t AllocateDevice(std::uint64_t bytes) override;
    void FreeDevice(std::uint64_t block) override;
    void* AllocateHost(std::uint64_t bytes) override;
    void FreeHost(void* block) override;

    Ostrand::Status CopyToDevice(std::uint64_t target, std::uint64_t targetOffset, const void* source,
                                 std::uint64_t bytes) override;
    Ostrand::Status CopyRowsToHost(void* target, std::uint64_t targetRowBytes, std::uint64_t source,
                                   const RowLayout& sourceLayout, std::uint64_t widthBytes,
                                   std::uint64_t rows) override;
    Ostrand::Status CopyRows(std::uint64_t target, const RowLayout& targetLayout, std::uint64_t source,
                             const RowLayout& sourceLayout, std::uint64_t widthBytes, std::uint64_t rows) override;
    Ostrand::Status Fill(std::uint64_t target, std::uint64_t offset, std::uint32_t pattern,
                         std::uint64_t bytes) override;

    std::uint64_t LoadModule(const ModuleImage& image, std::string& message) override;
    void UnloadModule(std::uint64_t module) override;
    std::uint64_t GetKernel(std::uint64_t module, const char* name) override;
    void ReleaseKernel(std::uint64_t kernel) override;
    Ostrand::Status SetArguments(std::uint64_t kernel, const KernelArguments& arguments) override;
    Ostrand::Status Launch(std::uint64_t kernel, const LaunchShape& shape) override;

    TimingMarkRef RecordMark() override;
    Ostrand::Status Synchronize() override;

private:
    friend class CudaMark;

    std::shared_ptr<const Driver> mDriver;
    DeviceFacts mFacts;
    CUcontext mContext;
    CUstream mStream;
};

/// Makes a backend's context current for a scope.
class ScopedContext {
public:
    explicit ScopedContext(Backend& backend) : mBackend(backend) { mBackend.Enter(); }
    ~ScopedContext() { mBackend.Leave(); }
    ScopedContext(const ScopedContext&) = delete;
    ScopedContext& operator=(const ScopedContext&) = delete;

private:
    Backend& mBackend;
};

}  // namespace Kiln::Cuda
