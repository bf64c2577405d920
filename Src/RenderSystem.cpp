// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Vantrel/RenderSystem.h"

#include "Ostrand/CriticalSection.h"
#include "Shared/Src/Timeline.h"
#include "Src/Kernels/CudaDriver.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Src/Outside/Suites.h"
#include "Src/RenderPipeline.h"

namespace Vantrel {
namespace {

constexpr std::int32_t kRequiredCudaVersion = 4000;

/// Starts and ends of the library, process-wide. Taken before any other lock.
struct Startup {
    Ostrand::CriticalSection lock{"Vantrel::Initialize"};
    std::uint32_t count = 0;
};

Startup& SharedStartup() {
    static Startup startup;
    return startup;
}

/// Binds a device, a timeline and the device's executor together. Its fields don't change, so it has no lock.
class Vantrel final : public RenderSystem {
public:
    Vantrel(const Kiln::DeviceRef& device, std::int32_t timelineID, bool usePreviews, const char* previewSpec,
            std::uint32_t nativeSubType, const boost::shared_ptr<RenderSystem>& parent)
        : mDevice(device) {
        const auto isKeyRegistered = [device](const WideString& key) { return isRegistered(key, device); };
        const auto makeNode = [device](const WideString& key, const VideoNodeRef& description,
                                       const RenderRequirements& requirements,
                                       bool& host) { return createNode(key, device, description, requirements, host); };
        const auto* parentSystem = dynamic_cast<const Vantrel*>(parent.get());
        mTimeline = boost::shared_ptr<Timeline>(
            new Timeline(static_cast<std::uint32_t>(timelineID), usePreviews, previewSpec, nativeSubType, device,
                         parentSystem ? parentSystem->mTimeline.get() : nullptr, makeNode, isKeyRegistered));
        mExecutor = device->GetExecutor();
    }

    boost::shared_ptr<Kiln::Device> GetDevice() override { return mDevice; }
    Status UpdateTimeline() override { return mTimeline->UpdateTimeline(); }
    Guid GetTimelineHash() override { return mTimeline->GetTimelineHash(); }
    Status GetSegmentInfo(std::int64_t ticks, SegmentInfo& info, bool merged) override {
        return mTimeline->GetSegmentInfo(ticks, info, merged);
    }
    Status GetSequenceFormat(Vellum::Rect& rect, Vellum::PixelAspectRatio& aspect, Vellum::FrameRate& rate,
                             std::uint32_t& fieldType) override {
        return mTimeline->GetSequenceFormat(rect, aspect, rate, fieldType);
    }
    void PrepareRender(const RenderNodeRef& root, const boost::shared_ptr<RenderParams>& params,
                       const RenderResultsRef& results) override {
        PostPrepareRender(*mExecutor, mDevice, root, params, results);
    }
    Status RenderFrames(const RenderNodeRef& root, const boost::shared_ptr<RenderParams>& params,
                        const RenderResultsRef& results, VideoFrameRef& first, VideoFrameRef& second, std::string* text,
                        const Vellum::Rect& rect) override {
        return RenderTree(mDevice, root, *params, results, first, second, text, rect);
    }

private:
    boost::shared_ptr<Kiln::Device> mDevice;
    boost::shared_ptr<Timeline> mTimeline;
    boost::shared_ptr<Halden::threads::AsyncExecutor> mExecutor;
};

}  // namespace

void Initialize(QuillBasicSuite* suite) {
    Startup& startup = SharedStartup();
    const Ostrand::ScopedLock lock(startup.lock, "Vantrel::Initialize");
    if (++startup.count != 1) return;
    SetBasicSuite(suite);
    Kiln::Initialize(true);
    FillCudaRegistry();
    FillOpenCLRegistry();
    // Without a driver the library runs on OpenCL alone.
    static_cast<void>(LoadCudaDriver(0, kRequiredCudaVersion));
}

void Terminate() {
    Startup& startup = SharedStartup();
    const Ostrand::ScopedLock lock(startup.lock, "Vantrel::Terminate");
    if (startup.count == 0 || --startup.count != 0) return;
    Kiln::Terminate();
    ReleaseSuites();
}

boost::shared_ptr<RenderSystem> CreateRenderSystem(const boost::shared_ptr<Kiln::Device>& device,
                                                   std::int32_t timelineID, bool usePreviews, const char* previewSpec,
                                                   std::uint32_t nativeSubType,
                                                   const boost::shared_ptr<RenderSystem>& parent) {
    return boost::shared_ptr<RenderSystem>(
        new Vantrel(device, timelineID, usePreviews, previewSpec, nativeSubType, parent));
}

}  // namespace Vantrel
