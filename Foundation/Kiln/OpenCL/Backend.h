// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <mutex>
#include <unordered_map>

#include "Kiln/Backend.h"
#include "Kiln/OpenCL/Binding.h"

namespace Kiln::OpenCL {

/// The devices of the installed platforms, GPUs first. `platformFilter`, when not empty, is part of the names of the
/// platforms that count.
[[nodiscard]] BackendList FindBackends(const std::string& platformFilter);

/// Releases OpenCL objects at the end of their scope.
template <class Handle>
class ScopedObject {
public:
    using Release = cl_int(CL_API_CALL*)(Handle);
    ScopedObject(Handle handle, Release release) : mHandle(handle), mRelease(release) {}
    ScopedObject(ScopedObject&& other) noexcept
        : mHandle(std::exchange(other.mHandle, nullptr)), mRelease(other.mRelease) {}
    ~ScopedObject() {
        if (mHandle) mRelease(mHandle);
    }
    ScopedObject(const ScopedObject&) = delete;
    ScopedObject& operator=(const ScopedObject&) = delete;
    ScopedObject& operator=(ScopedObject&&) = delete;

    [[nodiscard]] Handle Get() const { return mHandle; }
    [[nodiscard]] Handle Detach() { return std::exchange(mHandle, nullptr); }

private:
    Handle mHandle;
    Release mRelease;
};

/// What a backend is made of: the order is that of destruction's reverse.
struct Session {
    std::shared_ptr<const Driver> driver;
    cl_device_id device;
    ScopedObject<cl_context> context;
    ScopedObject<cl_command_queue> queue;
    /// For mapping pinned memory, which must not wait behind the work of the other queue.
    ScopedObject<cl_command_queue> mapQueue;
};

/// One device's context and its in-order queue, which takes times.
class OpenCLBackend final : public Backend {
public:
    OpenCLBackend(Session session, DeviceFacts facts);
    ~OpenCLBackend() override;

    const DeviceFacts& GetFacts() const override { return mFacts; }
    std::uint64_t GetQueueHandle() const override { return reinterpret_cast<std::uint64_t>(mSession.queue.Get()); }
    void Enter() override {}
    void Leave() override {}

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
    friend class OpenCLMark;

    /// Takes the cached binary of a source, or builds the source and caches the binary.
    cl_program BuildSource(const ModuleImage& image, std::string& message);
    cl_program BuildBinary(const std::string& binary);
    [[nodiscard]] std::string GetBuildLog(cl_program program) const;
    [[nodiscard]] std::string GetBinary(cl_program program) const;
    [[nodiscard]] const Driver& GetDriver() const { return *mSession.driver; }

    Session mSession;
    DeviceFacts mFacts;
    std::string mBuildOptions;
    std::mutex mMappedMutex;
    std::unordered_map<void*, cl_mem> mMapped;  ///< pinned blocks and the buffers that they are the memory of
};

}  // namespace Kiln::OpenCL
