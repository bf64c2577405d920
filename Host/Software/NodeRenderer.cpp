// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/NodeRenderer.h"

#include <algorithm>
#include <optional>
#include <stdexcept>
#include <string>
#include <utility>

#include "Host/Software/Effects/Dissolves.h"
#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/Effects/MulticamGrid.h"
#include "Host/Software/Transitions.h"
#include "Vantrel/HostSuites.h"

namespace Vantrel::Host::Software {

namespace {

View ViewOf(const SequenceFormat& format, std::uint32_t quality) {
    return {format.width,
            format.height,
            {format.aspectNumerator, format.aspectDenominator},
            format.width,
            format.height,
            format.frameTicks,
            quality,
            static_cast<std::uint32_t>(format.fieldType)};
}

/// An angle is rendered as large as the whole monitor, or as its half beside the programme.
View AngleView(const View& view, bool besideProgram) {
    View angle = view;
    if (besideProgram) {
        angle.sequenceWidth /= 2;
        angle.width =
            static_cast<std::int32_t>(static_cast<float>(angle.sequenceWidth) / static_cast<float>(view.ScaleX()));
    }
    return angle;
}

std::optional<std::int64_t> MediaTimecode(const Node& media, const ItemTimes& times) {
    if (!media.AsMedia() || (media.flags & kNodeFlag_Still) != 0) return std::nullopt;
    const std::string* start = media.FindProperty("MediaNode::StartTimecodeOffset");
    return times.parameters + (start ? std::stoll(*start) : 0);
}

LayerPicture AsLayer(Picture picture, const View& view) {
    LayerPicture layer;
    layer.picture = std::move(picture);
    layer.aspect = view.aspect;
    return layer;
}

}  // namespace

NodeRenderer::NodeRenderer(std::shared_ptr<PixelBufferPool> pool, std::shared_ptr<MediaReader> reader, bool strict)
    : mPictures(std::move(pool), std::move(reader),
                [this](const Sequence& sequence, std::int64_t time) { return RenderWholeFrame(sequence, time); }),
      mMedia(mPictures,
             [this](const Sequence& sequence, std::int64_t time, std::uint32_t fieldSelection) {
                 return RenderSequence(sequence, time, fieldSelection);
             }),
      mEffects(strict) {}

Picture NodeRenderer::RenderFrame(const Node& node, std::int64_t time, const View& view) {
    return PlaceLayer(RenderLayer(node, time, view), ReadLayerMotion(node, time, false), view).picture;
}

Picture NodeRenderer::RenderOperators(const Node& clip, const ItemTimes& times, std::size_t endOperator,
                                      const View& view) {
    return PlaceLayer(RenderClip(clip, times, endOperator, view),
                      ReadClipMotion(clip, times.parameters, false, endOperator), view)
        .picture;
}

Picture NodeRenderer::RenderWholeFrame(const Sequence& sequence, std::int64_t time) {
    const auto fieldType = static_cast<std::uint32_t>(sequence.format.fieldType);
    if (!Vellum::IsInterlaced(fieldType)) return RenderSequence(sequence, time, Vellum::kFieldSelection_Frame);
    Picture picture = RenderSequence(sequence, time, Vellum::kFieldSelection_First);
    const std::int64_t later = time + Vellum::HalfFrameTicks(sequence.format.frameTicks);
    WeaveField(picture, RenderSequence(sequence, later, Vellum::kFieldSelection_Second),
               fieldType == Vellum::kFieldType_UpperFirst);
    return picture;
}

Picture NodeRenderer::RenderSequence(const Sequence& sequence, std::int64_t time, std::uint32_t fieldSelection) {
    View view = ViewOf(sequence.format, 4);
    view.fieldSelection = fieldSelection;
    const Segment* segment = sequence.plain.Find(time);
    if (!segment) return {view.width, view.height};
    return RenderFrame(*segment->root, time - segment->start + segment->offset, view);
}

LayerPicture NodeRenderer::RenderLayer(const Node& node, std::int64_t time, const View& view) {
    switch (node.kind) {
        case NodeKind::kClip:
            return RenderClip(node, node.AsItem()->time.AtItemTime(time), node.operators.size(), view);
        case NodeKind::kMedia:
        case NodeKind::kPreview:
        case NodeKind::kSolidColor:
            return mMedia.Render(node, time, view);
        case NodeKind::kCompositor:
            return AsLayer(Composite(node, time, view), view);
        case NodeKind::kTransition:
            return AsLayer(RenderBetween(node, time, view), view);
        case NodeKind::kAdjustment:
            return AsLayer(Adjust(node, time, view), view);
        case NodeKind::kMulticam:
            return AsLayer(Tile(node, time, view), view);
        case NodeKind::kDisabled:
            return AsLayer(RenderInput(node.inputs.at(0), time, view), view);
        case NodeKind::kEffect:
            break;
    }
    throw std::runtime_error(std::string("a node of kind ") + GetKindText(node.kind) + " has no picture of its own");
}

LayerPicture NodeRenderer::RenderClip(const Node& clip, const ItemTimes& times, std::size_t endOperator,
                                      const View& view) {
    const NodeInput& input = clip.inputs.at(0);
    LayerPicture layer =
        RenderLayer(*input.node, input.node->AsMedia() ? times.media : times.item - input.offset, view);
    for (std::size_t i = 0; i < clip.operators.size() && i < endOperator; ++i) {
        const Node& effect = *clip.operators[i];
        if (IsIntrinsic(effect)) continue;
        const NodeInput& matte = effect.AsEffect()->matte;
        EffectContext context;
        context.time = times.parameters;
        context.itemTime = times.item;
        context.mediaTimecode = MediaTimecode(*input.node, times);
        context.view = view;
        if (matte.node) context.matte = [&] { return RenderInput(matte, times.item, view); };
        mEffects.Run(effect, std::move(context), layer);
    }
    return layer;
}

Picture NodeRenderer::RenderInput(const NodeInput& input, std::int64_t time, const View& view) {
    if (!input.node) return {view.width, view.height};
    return RenderFrame(*input.node, time - input.offset, view);
}

Picture NodeRenderer::Composite(const Node& compositor, std::int64_t time, const View& view) {
    Picture frame(view.width, view.height);
    bool over = false;
    for (const NodeInput& input : compositor.inputs) {
        if (!input.node || input.node->kind == NodeKind::kDisabled) continue;
        const std::int64_t layerTime = time - input.offset;
        LayerPicture layer = RenderLayer(*input.node, layerTime, view);
        const LayerMotion motion = ReadLayerMotion(*input.node, layerTime, over);
        if (over) {
            DrawLayer(layer, motion, view, frame);
        } else {
            frame = PlaceLayer(std::move(layer), motion, view).picture;
        }
        over = true;
    }
    if (!over) throw std::runtime_error("a segment has no enabled layer");
    return frame;
}

Picture NodeRenderer::RenderBetween(const Node& transition, std::int64_t time, const View& view) {
    if (transition.inputs.size() != 2) throw std::runtime_error("a transition needs two inputs");
    const std::int64_t duration = transition.AsTransition()->duration;
    const float elapsed = duration == 0 ? 0.0F : static_cast<float>(time) / static_cast<float>(duration);
    const TransitionSides sides{[&] { return RenderInput(transition.inputs[0], time, view); },
                                [&] { return RenderInput(transition.inputs[1], time, view); }};
    bool known = true;
    Picture picture = RenderTransition(transition, elapsed, sides, known);
    if (!known) mEffects.NotePassedThrough(transition.AsTransition()->matchName);
    return picture;
}

Picture NodeRenderer::Adjust(const Node& adjustment, std::int64_t time, const View& view) {
    Picture picture = RenderInput(adjustment.inputs.at(0), time, view);
    const NodeInput& input = adjustment.inputs.at(1);
    const std::int64_t layerTime = time - input.offset;
    const LayerMotion motion = ReadLayerMotion(*input.node, layerTime, true);
    const Picture adjusted = PlaceLayer(RenderLayer(*input.node, layerTime, view), LayerMotion{}, view).picture;
    // The layer's own shape goes where the layer goes; its pixels stay where they were.
    Picture whole(view.width, view.height);
    Fill(whole, 0, 0, view.width, view.height, {1, 1, 1, 1});
    LayerMotion place = motion;
    place.opacity = 1.0F;
    place.blendMode = Kiln::kBlend_Normal;
    place.overDestination = false;
    const Picture matte = PlaceLayer(AsLayer(std::move(whole), view), place, view).picture;
    LayAdjusted(adjusted, matte, static_cast<double>(motion.opacity), motion.blendMode, picture);
    return picture;
}

Picture NodeRenderer::Tile(const Node& multicam, std::int64_t time, const View& view) {
    const auto& options = std::get<MulticamDetail>(multicam.detail).options;
    const View angleView = AngleView(view, options.showProgram);
    std::vector<Picture> tiles;
    for (const NodeInput& input : multicam.inputs) {
        tiles.push_back(input.node ? RenderInput(input, time, angleView) : Picture());
    }
    return DrawMulticamGrid(tiles, {view.width, view.height, options.selected, options.showProgram, options.recording,
                                    options.isNonMulticam, view.Quality()});
}

}  // namespace Vantrel::Host::Software
