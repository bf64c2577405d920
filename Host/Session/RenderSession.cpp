// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Session/RenderSession.h"

#include "Host/Media/FFmpegProbe.h"
#include "Host/Software/SoftwareRenderer.h"
#include "Host/Timeline/OtioReader.h"

namespace Vantrel::Host {

RenderSession::EngineScope::EngineScope(HostServices& services) {
    // The engine keeps the record's address and writes nothing through it.
    Initialize(const_cast<QuillBasicSuite*>(services.GetBasicSuite()));
}

RenderSession::EngineScope::~EngineScope() { Terminate(); }

Kiln::DeviceRef ChooseDevice(DeviceChoice choice) {
    using Kiln::DeviceFramework;
    std::string reason;
    for (const DeviceFramework framework : {DeviceFramework::kCuda, DeviceFramework::kOpenCL}) {
        const bool wanted =
            choice == DeviceChoice::kAuto || (choice == DeviceChoice::kCuda) == (framework == DeviceFramework::kCuda);
        if (!wanted) continue;
        if (Kiln::DeviceRef device = Kiln::GetPrimaryDevice(framework)) return device;
        const char* name = framework == DeviceFramework::kCuda ? "CUDA" : "OpenCL";
        reason += (reason.empty() ? "" : "; ") + std::string("no ") + name +
                  " device: " + Kiln::GetFrameworkMessage(framework);
    }
    throw DeviceError(reason);
}

RenderSession::RenderSession(const SessionOptions& options) : mPool(PixelBufferPool::Create()) {
    HostServices& services = HostServices::Instance();
    const Document document = ReadTimelineFile(options.file);
    FFmpegProbe probe;
    mSnapshot = BuildSnapshot(document, options.snapshot, probe, services.GetIdentities());
    services.Publish(mSnapshot);
    mRenderer = MakeSoftwareRenderer(mPool, std::make_shared<MediaReader>(mPool, 0), options.strict);
    mService = std::make_unique<RenderService>(services, *mRenderer, WorkerPool::GetDefaultThreads());
    mEngine = std::make_unique<EngineScope>(services);
    mDevice = ChooseDevice(options.device);
    if (options.deviceMemory != 0) mDevice->SetMemoryLimit(options.deviceMemory);
    const bool previews = !options.snapshot.previews.empty();
    mSystem = CreateRenderSystem(mDevice, static_cast<std::int32_t>(mSnapshot->top->timelineID), previews, "",
                                 mSnapshot->nativeSubType, boost::shared_ptr<RenderSystem>());
}

RenderSession::~RenderSession() {
    // Callbacks first, then the trees that wait for them, then the engine below both.
    mService->Drain();
    mSystem.reset();
    mDevice.reset();
    mEngine.reset();
    mService.reset();
}

std::int64_t RenderSession::GetFrameCount() const {
    const std::int64_t frame = mSnapshot->top->format.frameTicks;
    return (mSnapshot->top->length + frame - 1) / frame;
}

HostPictureRef RenderSession::RenderOnHost(const RenderParams& params) {
    const Segment* segment = mSnapshot->top->plain.Find(params.time);
    if (!segment) return nullptr;
    const std::uint32_t formats[] = {params.pixelFormat, 0};
    VantrelRenderDescription description{};
    description.pixelFormats = formats;
    description.pixelFormatCount = 2;
    description.width = params.outputRect.Width();
    description.height = params.outputRect.Height();
    description.aspectNumerator = params.pixelAspectRatio.numerator;
    description.aspectDenominator = params.pixelAspectRatio.denominator;
    description.quality = params.quality;
    description.fieldType = params.fieldType;
    const SequenceSize sequence{params.sequenceRect.Width(), params.sequenceRect.Height(), params.pixelAspectRatio,
                                params.sequenceFrameTicks};
    return mRenderer->RenderNode(*segment->root, params.time - segment->start + segment->offset, sequence, description);
}

RenderSummary RenderSession::Render(const RenderJob& job, const FrameLoop::Sink& sink, const std::atomic<bool>& stop) {
    FrameLoop loop(mSystem, mPool, [this](const RenderParams& params) { return RenderOnHost(params); });
    return loop.Run(job, sink, stop);
}

}  // namespace Vantrel::Host
