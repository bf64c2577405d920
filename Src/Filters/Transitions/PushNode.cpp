// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Transitions/PushNode.h"

#include <algorithm>
#include <cmath>
#include <utility>

#include "Src/Filters/ScopedRenderTime.h"
#include "Src/Nodes/FrameBuffer.h"
#include "Src/VideoNodes/VideoTransitionNode.h"
#include "Vantrel/TransitionTable.h"

namespace Vantrel {
namespace {

/// Towards 0. What lies far outside any frame is as good as any such place.
std::int32_t Truncate(float pixels) {
    constexpr float kFarAway = 1.0e6F;
    return static_cast<std::int32_t>(std::fmax(std::fmin(pixels, kFarAway), -kFarAway));
}

/// A part of a picture and where it goes.
struct Piece {
    Vellum::Rect target;
    Vellum::Rect source;
};
struct Pieces {
    Piece first;
    Piece second;
};

Pieces CutPieces(const PushSettings& settings, const Vellum::Rect& bounds) {
    const bool vertical = settings.direction == kPush_Down || settings.direction == kPush_Up;
    const auto length = static_cast<float>(vertical ? bounds.Height() : bounds.Width());
    const std::int32_t half = Truncate(settings.borderWidth * 0.5F);
    const std::int32_t shift = Truncate(settings.fraction * length + 0.5F);
    Pieces pieces{{bounds, bounds}, {bounds, bounds}};
    auto& [first, second] = pieces;
    switch (settings.direction) {
        case kPush_Down:
            first.target.top += shift + half;
            first.source.top += half;
            second.target.bottom = bounds.top + shift - half;
            second.source.top = bounds.bottom - shift;
            break;
        case kPush_Left:
            first.target.right -= shift + half;
            first.source.left += shift;
            second.target.left = bounds.right - shift + half;
            second.source.left += half;
            break;
        case kPush_Up:
            first.target.bottom -= shift + half;
            first.source.top += shift;
            second.target.top = bounds.bottom - shift + half;
            second.source.top += half;
            break;
        default:
            first.target.left += shift + half;
            first.source.left += half;
            second.target.right = bounds.left + shift - half;
            second.source.left = bounds.right - shift;
            break;
    }
    return pieces;
}

/// Times outside the transition would move pictures beyond the frame: the rectangle that both frames really have.
void ClipPiece(Piece& piece, const Vellum::Rect& bounds) {
    const std::int32_t left = std::max({0, bounds.left - piece.target.left, bounds.left - piece.source.left});
    const std::int32_t top = std::max({0, bounds.top - piece.target.top, bounds.top - piece.source.top});
    piece.target.left += left;
    piece.source.left += left;
    piece.target.top += top;
    piece.source.top += top;
    const std::int32_t width = std::min(bounds.right - piece.target.left, bounds.right - piece.source.left);
    const std::int32_t height = std::min(bounds.bottom - piece.target.top, bounds.bottom - piece.source.top);
    piece.target.right = std::min(piece.target.right, piece.target.left + width);
    piece.target.bottom = std::min(piece.target.bottom, piece.target.top + height);
}

Status CopyPiece(const Kiln::DeviceRef& device, Piece piece, const FrameBuffer& from, const FrameBuffer& to) {
    ClipPiece(piece, to.bounds);
    return Kiln::DeviceCopyRect(device, from.data, from.rowBytes, to.data, to.rowBytes, to.format, piece.source.left,
                                piece.source.top, piece.target.left, piece.target.top, piece.target.Width(),
                                piece.target.Height());
}

}  // namespace

PushSettings PushNode::ReadSettings(const RenderParams& params) const {
    PushSettings settings;
    settings.fraction = ElapsedFraction(*this, params);
    const auto* transition = dynamic_cast<const VideoTransitionNode*>(mDescription.get());
    if (!transition) return settings;

    double width = 0.0;
    std::int32_t color = 0;
    transition->GetTransitionBorderWidth(width);
    transition->GetTransitionBorderColor(color);
    transition->GetTransitionDirection(settings.direction);
    const auto level = [color](int shift) { return static_cast<float>((color >> shift) & 255) / 255.0F; };
    settings.borderWidth = static_cast<float>(width);
    settings.color = {level(16), level(8), level(0), 1.0F};
    settings.reverse = transition->GetTransitionReverse();
    if (settings.reverse) settings.fraction = 1.0F - settings.fraction;
    return settings;
}

Status PushNode::Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) {
    if (!HasBothInputs()) return Ostrand::kStatus_Failure;
    const PushSettings settings = ReadSettings(params);
    VideoFrameRef outgoing;
    VideoFrameRef incoming;
    const Status status = RenderSides(token, params, results, outgoing, incoming);
    if (Ostrand::Failed(status)) return status;
    const ScopedRenderTime timer(mDevice, mRenderTime);
    if (!outgoing) throw Ostrand::NullInterfaceException();
    const Status made = MakeFrameLike(outgoing, token, params, results);
    return Ostrand::Failed(made) ? made : Compose(settings, outgoing, incoming);
}

Status PushNode::Compose(const PushSettings& settings, const VideoFrameRef& outgoing, const VideoFrameRef& incoming) {
    FrameBuffer first = FrameBuffer::Demand(outgoing);
    FrameBuffer second;
    if (!FrameBuffer::Find(incoming, second) || !Covers(incoming, outgoing)) return Ostrand::kStatus_Failure;
    const FrameBuffer target = FrameBuffer::Demand(mFrameSlot);
    const bool bordered = settings.borderWidth > 0.0F;
    const bool within = settings.fraction >= 0.0F && settings.fraction <= 1.0F;
    if (bordered || !within) {
        // Outside its time neither picture may be there.
        const Status filled =
            Kiln::FillWithColor(mDevice, target.data, target.rowBytes, target.format, 0, 0, target.Width(),
                                target.Height(), bordered ? settings.color : Kiln::float4());
        if (Ostrand::Failed(filled)) return filled;
    }
    // Played backwards the pictures change places, so that the incoming one stays in the end.
    if (settings.reverse) std::swap(first, second);
    const Pieces pieces = CutPieces(settings, target.bounds);
    const Status status = CopyPiece(mDevice, pieces.first, first, target);
    if (Ostrand::Failed(status)) return status;
    return CopyPiece(mDevice, pieces.second, second, target);
}

}  // namespace Vantrel
