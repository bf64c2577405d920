// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Transitions/AdditiveDissolveNode.h"

#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Filters/ScopedRenderTime.h"
#include "Src/Nodes/FrameBuffer.h"

namespace Vantrel {
namespace {

EffectKernel gAdditiveDissolve{R"(..\..\Src\Filters\Transitions\AdditiveDissolveNode)", "AdditiveDissolveKernel", {}};

void AdditiveDissolveKernel(DeviceValue /*in*/, std::int32_t /*inPitch*/, DeviceValue /*in2*/,
                            std::int32_t /*in2Pitch*/, DeviceValue /*out*/, std::int32_t /*outPitch*/,
                            Vellum::PixelFormat /*format*/, std::int32_t /*width*/, std::int32_t /*height*/,
                            float /*fraction*/) {}

}  // namespace

Status AdditiveDissolveNode::Render(const RenderToken& token, const RenderParams& params,
                                    const RenderResultsRef& results) {
    if (!HasBothInputs()) return Ostrand::kStatus_Failure;
    VideoFrameRef outgoing;
    VideoFrameRef incoming;
    const Status status = RenderSides(token, params, results, outgoing, incoming);
    if (Ostrand::Failed(status)) return status;
    mFrameSlot = outgoing;
    const ScopedRenderTime timer(mDevice, mRenderTime);
    return Mix(outgoing, incoming, ElapsedFraction(*this, params));
}

Status AdditiveDissolveNode::Mix(const VideoFrameRef& outgoing, const VideoFrameRef& incoming, float elapsed) {
    FrameBuffer from;
    FrameBuffer to;
    FrameBuffer target;
    if (!FrameBuffer::Find(outgoing, from) || !FrameBuffer::Find(incoming, to) ||
        !FrameBuffer::Find(mFrameSlot, target) || !Covers(incoming, mFrameSlot)) {
        return Ostrand::kStatus_Failure;
    }
    const std::uint64_t kernel = gAdditiveDissolve.Find(mDevice);
    if (kernel == 0) return Ostrand::kStatus_Failure;
    const auto pitch = [&target](const FrameBuffer& buffer) { return PitchInPixels(buffer.rowBytes, target.format); };
    return Launch2D(mDevice, kernel, GridFor(target.Width(), target.Height()), {}, AdditiveDissolveKernel, from.data,
                    pitch(from), to.data, pitch(to), target.data, pitch(target), target.format, target.Width(),
                    target.Height(), elapsed);
}

}  // namespace Vantrel
