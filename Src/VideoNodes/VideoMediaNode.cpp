// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/VideoNodes/VideoMediaNode.h"

#include "Brae/Conversions.h"

namespace Vantrel {

std::uint32_t VideoMediaNode::GetStreamAlphaType() const {
    return Brae::SDKToBEAlphaType(ReadInt("MediaNode::StreamAlphaType", 1));
}

std::uint32_t VideoMediaNode::GetStreamAlphaMatteColor() const {
    std::uint32_t color = 0;
    static_cast<void>(GetColorProperty("MediaNode::StreamAlphaMatteColor", color));
    return color;
}

std::uint32_t VideoMediaNode::GetStreamPullDownCadence() const {
    return Brae::SDKToVellumPulldownCadence(ReadInt("MediaNode::StreamPullDownCadence"));
}

std::int32_t VideoMediaNode::GetClipScaleToFramePolicy() const {
    std::int32_t policy = 0;
    if (!Ostrand::Failed(GetIntProperty("MediaNode::ClipScaleToFramePolicy", policy))) return policy;
    // Projects from before there were policies only say whether to fit.
    return ReadBool("MediaNode::ClipScaleToFrameSize") ? 1 : 0;
}

}  // namespace Vantrel
