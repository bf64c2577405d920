// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/LayerMotion.h"

#include <cmath>

#include "Host/Software/Effects/Motion.h"
#include "Host/Timeline/EffectTables.h"
#include "Vantrel/Effects/Intrinsics.h"

namespace Vantrel::Host::Software {

namespace {

/// Single precision carries fractions of a percent: what lies closer to a value than this counts as it.
constexpr float kTolerance = 8e-6F;

ParameterValue Evaluate(const Node& effect, std::int32_t index, std::int64_t time, ParameterValue fallback) {
    const Parameter* parameter = effect.FindParameter(index);
    return parameter ? parameter->At(time) : fallback;
}

const Node* FindOperator(const Node& clip, const char* matchName, std::size_t endOperator) {
    for (std::size_t i = 0; i < clip.operators.size() && i < endOperator; ++i) {
        if (clip.operators[i]->AsEffect()->matchName == matchName) return clip.operators[i].get();
    }
    return nullptr;
}

void ReadOpacity(const Node& opacity, std::int64_t time, LayerMotion& motion) {
    motion.opacity = static_cast<float>(Evaluate(opacity, kOpacity_Opacity, time, {100})[0]) / 100.0F;
    motion.blendMode = static_cast<std::int32_t>(Evaluate(opacity, kOpacity_BlendMode, time, {Kiln::kBlend_Normal})[0]);
    if (!motion.overDestination && motion.blendMode != Kiln::kBlend_Normal) {
        motion.opacity = 1.0F;
        motion.blendMode = Kiln::kBlend_Normal;
    }
}

void ReadPlace(const Node& place, std::int64_t time, LayerMotion& motion) {
    const ParameterValue position = Evaluate(place, kMotion_Position, time, {0.5, 0.5});
    const ParameterValue anchor = Evaluate(place, kMotion_Anchor, time, {0.5, 0.5});
    motion.positionX = position[0];
    motion.positionY = position[1];
    motion.anchorX = anchor[0];
    motion.anchorY = anchor[1];
    motion.scaleY = static_cast<float>(Evaluate(place, kMotion_Scale, time, {100})[0]) / 100.0F;
    motion.scaleX = Evaluate(place, kMotion_UniformScale, time, {1})[0] != 0
                        ? motion.scaleY
                        : static_cast<float>(Evaluate(place, kMotion_ScaleWidth, time, {100})[0]) / 100.0F;
    motion.rotation = static_cast<float>(Evaluate(place, kMotion_Rotation, time, {0})[0]);
}

void ReadTransitionOpacity(const Node& transition, std::int64_t nodeTime, LayerMotion& motion) {
    const NodeInput* input = nullptr;
    for (const NodeInput& side : transition.inputs) {
        if (side.node) {
            input = &side;
            break;
        }
    }
    if (!input || input->node->kind != NodeKind::kClip) return;
    const Node* opacity = FindOperator(*input->node, kOpacityMatchName, SIZE_MAX);
    constexpr double kNormal = Kiln::kBlend_Normal;
    if (!opacity || Evaluate(*opacity, kOpacity_BlendMode, 0, {kNormal})[0] == kNormal) return;
    const ItemTimes times = input->node->AsItem()->time.AtItemTime(nodeTime - input->offset);
    ReadOpacity(*opacity, times.parameters, motion);
}

bool Differs(float a, float b) { return std::fabs(a - b) >= kTolerance; }

bool IsPlain(const LayerMotion& motion) {
    return motion.opacity + kTolerance >= 1.0F && motion.blendMode == Kiln::kBlend_Normal;
}

bool IsMoved(const LayerPicture& layer, const LayerMotion& motion, const View& view) {
    return Differs(static_cast<float>(motion.positionX), static_cast<float>(motion.anchorX)) ||
           Differs(static_cast<float>(motion.positionY), static_cast<float>(motion.anchorY)) ||
           layer.picture.width != view.width || layer.picture.height != view.height ||
           layer.origin != Vellum::Point{0, 0};
}

}  // namespace

bool IsIntrinsic(const Node& effect) {
    const std::string& name = effect.AsEffect()->matchName;
    return name == kMotionMatchName || name == kOpacityMatchName;
}

LayerMotion ReadClipMotion(const Node& clip, std::int64_t parameterTime, bool overDestination,
                           std::size_t endOperator) {
    LayerMotion motion;
    motion.overDestination = overDestination;
    if (const Node* opacity = FindOperator(clip, kOpacityMatchName, endOperator)) {
        ReadOpacity(*opacity, parameterTime, motion);
    }
    if (const Node* place = FindOperator(clip, kMotionMatchName, endOperator)) ReadPlace(*place, parameterTime, motion);
    return motion;
}

LayerMotion ReadLayerMotion(const Node& layer, std::int64_t nodeTime, bool overDestination) {
    if (layer.kind == NodeKind::kClip) {
        const ItemTimes times = layer.AsItem()->time.AtItemTime(nodeTime);
        return ReadClipMotion(layer, times.parameters, overDestination, layer.operators.size());
    }
    LayerMotion motion;
    motion.overDestination = overDestination;
    if (layer.kind == NodeKind::kTransition) ReadTransitionOpacity(layer, nodeTime, motion);
    return motion;
}

void DrawLayer(const LayerPicture& layer, const LayerMotion& motion, const View& view, Picture& target) {
    const double width = layer.picture.width;
    const double height = layer.picture.height;
    double anchorX = motion.anchorX;
    double anchorY = motion.anchorY;
    // The anchor is a fraction of the clip's own frame, also when an effect has made the picture larger.
    if (layer.mediaWidth > 0 && layer.mediaHeight > 0) {
        const double grownX = width - layer.mediaWidth;
        const double grownY = height - layer.mediaHeight;
        anchorX += (0.5 * grownX - grownX * anchorX) / width;
        anchorY += (0.5 * grownY - grownY * anchorY) / height;
    }
    anchorX += (0.5 * target.width + layer.origin.x) / width - 0.5;
    anchorY += (0.5 * target.height + layer.origin.y) / height - 0.5;
    LayerDrawing drawing;
    drawing.positionX = static_cast<float>(motion.positionX);
    drawing.positionY = static_cast<float>(motion.positionY);
    drawing.anchorX = static_cast<float>(anchorX);
    drawing.anchorY = static_cast<float>(anchorY);
    drawing.scaleX = motion.scaleX;
    drawing.scaleY = motion.scaleY;
    drawing.rotation = motion.rotation;
    drawing.opacity = motion.opacity;
    drawing.blendMode = motion.blendMode;
    drawing.overDestination = motion.overDestination;
    drawing.quality = view.Quality();
    drawing.layerAspect = layer.aspect;
    drawing.targetAspect = view.aspect;
    DrawLayer(layer.picture, drawing, target);
}

LayerPicture PlaceLayer(LayerPicture layer, const LayerMotion& motion, const View& view) {
    const bool scaled = Differs(motion.scaleX, 1.0F) || Differs(motion.scaleY, 1.0F) || layer.aspect != view.aspect;
    if (!scaled && !Differs(motion.rotation, 0.0F) && IsPlain(motion) && !IsMoved(layer, motion, view)) return layer;
    LayerPicture placed;
    placed.picture = Picture(view.width, view.height);
    placed.aspect = view.aspect;
    DrawLayer(layer, motion, view, placed.picture);
    return placed;
}

}  // namespace Vantrel::Host::Software
