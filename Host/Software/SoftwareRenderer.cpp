// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/SoftwareRenderer.h"

#include <algorithm>
#include <stdexcept>
#include <utility>

#include "Host/Render/FinishedFrame.h"
#include "Host/Snapshot/Fingerprint.h"
#include "Host/Software/Effects/FrameRepairs.h"
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
    Software::View view{description.width,   description.height, aspect, sequence.width, sequence.height,
                        sequence.frameTicks, description.quality};
    if (Vellum::IsInterlaced(description.fieldType)) view.fieldType = description.fieldType;
    return view;
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
        const auto render = [&](std::int64_t ticks, const Software::View& view) {
            const std::int64_t time = ticks == 0 ? nodeTime : node.LaterTime(nodeTime, ticks);
            if (node.kind != NodeKind::kClip) return mNodes.RenderFrame(node, time, view);
            return mNodes.RenderOperators(node, node.AsItem()->time.FromTransformed(time), node.operators.size(), view);
        };
        const auto fingerprint = [&](std::int64_t ticks, const VantrelRenderDescription& one) {
            return NodeFingerprint(node, ticks == 0 ? nodeTime : node.LaterTime(nodeTime, ticks), one);
        };
        return RenderFields(render, fingerprint, sequence, description);
    }

    HostPictureRef RenderOperators(const Node& clip, std::int32_t endOperator, std::int64_t rawTime,
                                   const SequenceSize& sequence, const VantrelRenderDescription& description) override {
        if (!clip.AsItem()) throw std::invalid_argument("operators of a node that isn't a clip were asked for");
        const auto end = static_cast<std::size_t>(std::max(endOperator, 0));
        const auto render = [&](std::int64_t ticks, const Software::View& view) {
            return mNodes.RenderOperators(clip, TimesOfRawTime(*clip.AsItem(), rawTime + ticks), end, view);
        };
        const auto fingerprint = [&](std::int64_t ticks, const VantrelRenderDescription& one) {
            return OperatorsFingerprint(clip, endOperator, rawTime + ticks, one);
        };
        return RenderFields(render, fingerprint, sequence, description);
    }

    std::vector<std::string> GetPassedThrough() const override { return mNodes.GetPassedThrough(); }

private:
    /// An interlaced picture shows two moments, unless nothing happens between them. At draft quality it is made like a
    /// progressive one.
    template <class Render, class Fingerprint>
    HostPictureRef RenderFields(const Render& render, const Fingerprint& fingerprint, const SequenceSize& sequence,
                                const VantrelRenderDescription& description) const {
        Software::View view = ViewOf(sequence, description);
        const std::int64_t fieldTicks = Vellum::HalfFrameTicks(sequence.frameTicks);
        const bool interlaced = Vellum::IsInterlaced(view.fieldType);
        if (!interlaced || fingerprint(0, description) == fingerprint(fieldTicks, description)) {
            return Finish(render(0, view), description);
        }
        if (description.quality >= 2) view.fieldSelection = Vellum::kFieldSelection_First;
        Software::Picture picture = render(0, view);
        if (description.quality >= 2) {
            view.fieldSelection = Vellum::kFieldSelection_Second;
            Software::WeaveField(picture, render(fieldTicks, view), view.fieldType == Vellum::kFieldType_UpperFirst);
        }
        const auto finished = Finish(picture, description);
        finished->fieldType = view.fieldType;
        return finished;
    }

    std::shared_ptr<HostPicture> Finish(const Software::Picture& picture,
                                        const VantrelRenderDescription& description) const {
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
