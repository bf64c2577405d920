// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/LayerMotion.h"

#include <cmath>

#include "Kiln/FrameOperations.h"
#include "Src/Filters/StreamGeometry.h"
#include "Src/Nodes/FindEffectNode.h"
#include "Src/Nodes/FrameBuffer.h"

namespace Vantrel {

namespace {

constexpr float kTolerance = 8e-6F;

bool Differ(float a, float b) { return !(std::fabs(a - b) < kTolerance); }
bool Differ(double a, double b) { return Differ(static_cast<float>(a), static_cast<float>(b)); }

std::int32_t RoundHalfUp(float value) { return static_cast<std::int32_t>(std::floor(value + 0.5F)); }

float Percent(float value) { return value / 100.0F; }

void ReadOpacity(LayerMotion& motion, const VideoNode& effect, std::int64_t time) {
    motion.opacity = Percent(effect.GetFloatParam(0, time));
    motion.blendMode = effect.GetIntParam(1, time);
    if (!motion.overDestination && motion.blendMode != Kiln::kBlend_Normal) {
        motion.opacity = 1.0F;
        motion.blendMode = Kiln::kBlend_Normal;
    }
}

void ReadMotion(LayerMotion& motion, const VideoNode& effect, std::int64_t time) {
    effect.GetPointParam(0, time, motion.positionX, motion.positionY);
    motion.scaleX = Percent(effect.GetFloatParam(2, time));
    motion.scaleY = Percent(effect.GetFloatParam(1, time));
    motion.rotation = effect.GetFloatParam(4, time);
    effect.GetPointParam(5, time, motion.anchorX, motion.anchorY);
    if (effect.GetBoolParam(3, time)) motion.scaleX = motion.scaleY;
}

/// The anchor as Kiln takes it, in fractions of the frame at hand: it was given in fractions of the clip's whole frame,
/// and the frame's origin says where the frame at hand lies.
struct Anchor {
    Anchor(const LayerMotion& motion, const IVideoFrame& source, const Vellum::Rect& target)
        : x(motion.anchorX), y(motion.anchorY) {
        const Vellum::Rect bounds = source.GetBounds();
        const Vellum::Point origin = source.GetOrigin();
        if (motion.sourceRect != Vellum::Rect() && motion.sourceRect != bounds) {
            Recenter(x, bounds.Width(), motion.sourceRect.Width());
            Recenter(y, bounds.Height(), motion.sourceRect.Height());
        }
        x += (0.5 * target.Width() + origin.x) / bounds.Width() - 0.5;
        y += (0.5 * target.Height() + origin.y) / bounds.Height() - 0.5;
    }

    static void Recenter(double& anchor, std::int32_t frameLength, std::int32_t clipLength) {
        const double excess = static_cast<double>(frameLength) - clipLength;
        anchor += (0.5 * excess - excess * anchor) / frameLength;
    }

    double x;
    double y;
};

}  // namespace

LayerPlacement::LayerPlacement(const LayerMotion& motion, const VideoFrameRef& frame, const RenderParams& params) {
    const Vellum::Rect bounds = frame->GetBounds();
    const std::int32_t width = params.outputRect.Width();
    const std::int32_t height = params.outputRect.Height();
    const Vellum::PixelAspectRatio aspect = frame->GetPixelAspectRatio();

    plain = motion.opacity + kTolerance >= 1.0F && motion.blendMode == Kiln::kBlend_Normal;
    rotated = Differ(motion.rotation, 0.0F);
    moved = Differ(motion.positionX, motion.anchorX) || Differ(motion.positionY, motion.anchorY) ||
            bounds.Width() != width || bounds.Height() != height || frame->GetOrigin() != Vellum::Point();
    scaled = Differ(motion.scaleX, 1.0F) || Differ(motion.scaleY, 1.0F) || aspect != params.pixelAspectRatio;

    const float ratio = static_cast<float>(aspect.Value()) / static_cast<float>(params.pixelAspectRatio.Value());
    covers = !moved && !rotated && RoundHalfUp(static_cast<float>(bounds.Width()) * motion.scaleX * ratio) >= width &&
             RoundHalfUp(static_cast<float>(bounds.Height()) * motion.scaleY) >= height;
}

void ReadLayerMotion(LayerMotion& motion, FilterNode& node, const RenderParams& params, const RenderResultsRef&,
                     bool uncacheMotion, bool uncacheOpacity) {
    const std::int64_t time = node.GetNodeTime(params.clipTime, false);
    const FilterNodeRef self(&node);
    if (const FilterNodeRef opacity = FindEffectNode(self, u"TQ.XQVE Opacity")) {
        if (const VideoNodeRef& effect = opacity->GetDescription()) ReadOpacity(motion, *effect, time);
        if (uncacheOpacity) opacity->SuppressCaching();
    }
    if (const FilterNodeRef intrinsic = FindEffectNode(self, u"TQ.XQVE Motion")) {
        if (const VideoNodeRef& effect = intrinsic->GetDescription()) ReadMotion(motion, *effect, time);
        if (uncacheMotion) intrinsic->SuppressCaching();
    }
    if (const VideoMediaNodeRef media = node.GetMediaDescription()) {
        const Vellum::Point size = StreamGeometry::Read(*media).GetRenderSize(params);
        motion.sourceRect = {0, 0, size.x, size.y};
    }
}

Status DrawLayer(const Kiln::DeviceRef& device, const LayerMotion& motion, const VideoFrameRef& source,
                 const VideoFrameRef& target, Vellum::RenderQuality quality) {
    FrameBuffer from;
    FrameBuffer to;
    if (!FrameBuffer::Find(source, from) || !FrameBuffer::Find(target, to)) return Ostrand::kStatus_Failure;

    const Vellum::PixelAspectRatio fromAspect = source->GetPixelAspectRatio();
    const Vellum::PixelAspectRatio toAspect = target->GetPixelAspectRatio();
    const Anchor anchor(motion, *source, to.bounds);
    return Kiln::Motion(device, from.data, from.rowBytes, 0, 0, from.Width(), from.Height(), fromAspect.numerator,
                        fromAspect.denominator, to.data, to.rowBytes, 0, 0, to.Width(), to.Height(), toAspect.numerator,
                        toAspect.denominator, from.format, static_cast<float>(motion.positionX),
                        static_cast<float>(motion.positionY), static_cast<float>(anchor.x),
                        static_cast<float>(anchor.y), motion.scaleX, motion.scaleY, motion.rotation, motion.opacity,
                        motion.blendMode, motion.overDestination, quality);
}

Status CreateLayerTarget(const Kiln::DeviceRef& device, Vellum::PixelFormat format, const RenderParams& params,
                         VideoFrameRef& target) {
    return Kiln::CreateGPUVideoFrame(target, device, format, params.outputRect.Width(), params.outputRect.Height(),
                                     params.pixelAspectRatio, Vellum::kFieldType_Progressive, {0, 0});
}

Status ClearUnlessCovered(const Kiln::DeviceRef& device, const LayerPlacement& placement, const VideoFrameRef& target) {
    if (placement.covers) return Ostrand::kStatus_OK;
    const FrameBuffer buffer = FrameBuffer::Demand(target);
    return Kiln::FillWithTransparentBlack(device, buffer.data, buffer.rowBytes, buffer.format, 0, 0, buffer.Width(),
                                          buffer.Height());
}

VideoFrameRef TransformFrame(const Kiln::DeviceRef& device, const RenderParams& params, const LayerMotion& motion,
                             const VideoFrameRef& source) {
    const LayerPlacement placement(motion, source, params);
    if (placement.IsIdentity()) return source;

    VideoFrameRef target;
    if (Ostrand::Failed(CreateLayerTarget(device, source->GetPixelFormat(), params, target))) return {};
    if (Ostrand::Failed(ClearUnlessCovered(device, placement, target))) return {};
    if (Ostrand::Failed(DrawLayer(device, motion, source, target, Vellum::ToRenderQuality(params.quality)))) return {};
    return target;
}

}  // namespace Vantrel
