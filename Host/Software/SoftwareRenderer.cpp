// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/SoftwareRenderer.h"

#include <algorithm>
#include <stdexcept>
#include <utility>

#include "Host/Render/FinishedFrame.h"
#include "Host/Snapshot/Fingerprint.h"
#include "Host/Software/NodeRenderer.h"

namespace Vantrel::Host {

namespace {

/// The first of a description's formats that a picture can be had in.
Vellum::PixelFormat ChooseFormat(const VantrelRenderDescription& description) {
    for (std::int32_t i = 0; i < description.pixelFormatCount; ++i) {
        const Vellum::PixelFormat format = Vellum::PixelFormatFromCode(description.pixelFormats[i]);
        if (format == Vellum::kPixelFormat_BGRA_4444_8u || format == Vellum::kPixelFormat_BGRA_4444_32f) return format;
    }
    return Vellum::kPixelFormat_BGRA_4444_8u;
}

Software::View ViewOf(const SequenceSize& sequence, const VantrelRenderDescription& description) {
    if (description.width < 1 || description.height < 1 || sequence.width < 1 || sequence.height < 1) {
        throw std::invalid_argument("a picture of " + std::to_string(description.width) + " by " +
                                    std::to_string(description.height) + " pixels was asked for");
    }
    Vellum::PixelAspectRatio aspect{description.aspectNumerator, description.aspectDenominator};
    if (aspect.numerator <= 0 || aspect.denominator <= 0) aspect = Vellum::kPixelAspectRatio_Square;
    return {description.width,   description.height, aspect, sequence.width, sequence.height,
            sequence.frameTicks, description.quality};
}

class SoftwareRenderer : public ISoftwareRenderer {
public:
    SoftwareRenderer(std::shared_ptr<PixelBufferPool> pool, std::shared_ptr<MediaReader> reader, bool strict)
        : mPool(pool), mNodes(std::move(pool), std::move(reader), strict) {}

    HostPictureRef RenderClip(const MediaClip& clip, std::int64_t frame, Vellum::PixelFormat format) override {
        return ConvertPicture(*mPool, mNodes.GetMedia().GetFrame(clip, {}, frame), format);
    }

    HostPictureRef RenderNode(const Node& node, std::int64_t nodeTime, const SequenceSize& sequence,
                              const VantrelRenderDescription& description) override {
        const Software::View view = ViewOf(sequence, description);
        if (node.kind != NodeKind::kClip) return Finish(mNodes.RenderFrame(node, nodeTime, view), description);
        const ItemTimes times = node.AsItem()->time.FromTransformed(nodeTime);
        return Finish(mNodes.RenderOperators(node, times, node.operators.size(), view), description);
    }

    HostPictureRef RenderOperators(const Node& clip, std::int32_t endOperator, std::int64_t rawTime,
                                   const SequenceSize& sequence, const VantrelRenderDescription& description) override {
        if (!clip.AsItem()) throw std::invalid_argument("operators of a node that isn't a clip were asked for");
        const auto end = static_cast<std::size_t>(std::max(endOperator, 0));
        return Finish(
            mNodes.RenderOperators(clip, TimesOfRawTime(*clip.AsItem(), rawTime), end, ViewOf(sequence, description)),
            description);
    }

    std::vector<std::string> GetPassedThrough() const override { return mNodes.GetPassedThrough(); }

private:
    HostPictureRef Finish(const Software::Picture& picture, const VantrelRenderDescription& description) const {
        auto finished = Software::ToHostPicture(*mPool, picture, ChooseFormat(description));
        finished->aspect = {description.aspectNumerator, description.aspectDenominator};
        if (description.compositeOnBlack != 0) LayOverBlack(*finished);
        return finished;
    }

    std::shared_ptr<PixelBufferPool> mPool;
    Software::NodeRenderer mNodes;
};

}  // namespace

std::unique_ptr<ISoftwareRenderer> MakeSoftwareRenderer(std::shared_ptr<PixelBufferPool> pool,
                                                        std::shared_ptr<MediaReader> reader, bool strict) {
    return std::make_unique<SoftwareRenderer>(std::move(pool), std::move(reader), strict);
}

}  // namespace Vantrel::Host
