// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Synthetics/SolidColorNode.h"

#include "Kiln/Frames.h"
#include "Ostrand/MixHash.h"
#include "Src/Nodes/FrameBuffer.h"
#include "Src/Nodes/WorkingFormat.h"

namespace Vantrel {
namespace {

constexpr std::size_t kColorMatteDataSize = 8;

constexpr Kiln::float4 kTransparent;
constexpr Kiln::float4 kOpaqueBlack{0.0F, 0.0F, 0.0F, 1.0F};

Kiln::float4 ReadMatteColor(const VideoMediaNode& media) {
    const Marl::BinaryData data = media.GetStreamOpaqueData();
    if (data.size() != kColorMatteDataSize) return kTransparent;
    const auto level = [&data](std::size_t place) { return static_cast<float>(data[place]) / 255.0F; };
    return {level(2), level(1), level(0), 1.0F};
}

}  // namespace

Status SolidColorNode::Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) {
    mMatteName = u"BlackVideoSource";
    mColor = kTransparent;
    if (const auto* media = dynamic_cast<const VideoMediaNode*>(description.get())) {
        const WideString instance = media->GetMediaInstanceString();
        if (instance == u"1129270354") {
            mMatteName = u"ColorMatte";
            mColor = ReadMatteColor(*media);
        } else if (instance == u"1112293707") {
            mMatteName = u"BlackMatte";
            mColor = kOpaqueBlack;
        } else if (instance == u"1414680150") {
            mMatteName = u"TransparentMatte";
        }
    }
    return FilterNode::Configure(description, requirements, host);
}

Guid SolidColorNode::GetFrameHash(const RenderParams& params, const RenderResultsRef& /*results*/) {
    return Ostrand::NodeHasher()
        .Text("SolidColorNode")
        .Value(mColor)
        .Value(params.quality)
        .Value(params.outputRect)
        .Value(params.pixelAspectRatio)
        .Finish();
}

Status SolidColorNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                              const RenderResultsRef& /*results*/) {
    const Vellum::PixelFormat format = GetWorkingPixelFormat(params, *mDevice);
    const Status status =
        Kiln::CreateGPUVideoFrame(mFrameSlot, mDevice, format, params.outputRect.Width(), params.outputRect.Height(),
                                  params.pixelAspectRatio, Vellum::kFieldType_Progressive, {0, 0});
    if (Ostrand::Failed(status)) return status;
    const FrameBuffer buffer = FrameBuffer::Demand(mFrameSlot);
    return Kiln::FillWithColor(mDevice, buffer.data, buffer.rowBytes, format, 0, 0, buffer.Width(), buffer.Height(),
                               mColor);
}

}  // namespace Vantrel
