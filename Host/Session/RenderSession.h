// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "Host/Media/MediaReader.h"
#include "Host/Render/FrameLoop.h"
#include "Host/Render/ISoftwareRenderer.h"
#include "Host/Render/RenderService.h"
#include "Host/Snapshot/Snapshot.h"

namespace Vantrel::Host {

/// A device that was asked for and isn't there.
class DeviceError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

enum class DeviceChoice { kAuto, kCuda, kOpenCL };

struct SessionOptions {
    std::string file;
    SnapshotOptions snapshot;
    DeviceChoice device = DeviceChoice::kAuto;
    /// Effects that nothing can render are a failure.
    bool strict = false;
    /// Bytes of device memory; 0 for what the device has.
    std::uint64_t deviceMemory = 0;
};

/// Everything that it takes to render a timeline's file: its snapshot, the host's services, the engine and a device.
/// There is one at a time in a process; used by one thread.
class RenderSession {
public:
    /// Throws TimelineError for the file, DeviceError for the device.
    explicit RenderSession(const SessionOptions& options);
    ~RenderSession();
    RenderSession(const RenderSession&) = delete;
    RenderSession& operator=(const RenderSession&) = delete;

    [[nodiscard]] const Snapshot& GetSnapshot() const { return *mSnapshot; }
    [[nodiscard]] const Sequence& GetSequence() const { return *mSnapshot->top; }
    /// Frames of the top sequence, the last one perhaps in part.
    [[nodiscard]] std::int64_t GetFrameCount() const;
    [[nodiscard]] const Kiln::DeviceRef& GetDevice() const { return mDevice; }
    [[nodiscard]] RenderSystem& GetSystem() { return *mSystem; }
    [[nodiscard]] const RenderService& GetService() const { return *mService; }

    /// Renders frames of the top sequence.
    RenderSummary Render(const RenderJob& job, const FrameLoop::Sink& sink, const std::atomic<bool>& stop);

    /// Offline media, each with its clip and reason.
    [[nodiscard]] const std::vector<std::string>& GetOffline() const { return mSnapshot->offline; }
    /// Effects that nothing could render.
    [[nodiscard]] std::vector<std::string> GetPassedThrough() const { return mRenderer->GetPassedThrough(); }

private:
    /// The engine's start and end, which nest in a process.
    class EngineScope {
    public:
        explicit EngineScope(HostServices& services);
        ~EngineScope();
        EngineScope(const EngineScope&) = delete;
        EngineScope& operator=(const EngineScope&) = delete;
    };

    [[nodiscard]] HostPictureRef RenderOnHost(const RenderParams& params);

    SnapshotPtr mSnapshot;
    std::shared_ptr<PixelBufferPool> mPool;
    std::unique_ptr<ISoftwareRenderer> mRenderer;
    std::unique_ptr<RenderService> mService;
    std::unique_ptr<EngineScope> mEngine;
    Kiln::DeviceRef mDevice;
    boost::shared_ptr<RenderSystem> mSystem;
};

/// Finds a device of the kind asked for. Throws DeviceError with the framework's own message.
[[nodiscard]] Kiln::DeviceRef ChooseDevice(DeviceChoice choice);

}  // namespace Vantrel::Host
