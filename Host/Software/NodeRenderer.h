// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Host/Snapshot/Node.h"
#include "Host/Software/EffectRunner.h"
#include "Host/Software/LayerMotion.h"
#include "Host/Software/MediaLayers.h"

namespace Vantrel::Host::Software {

/// Walks a segment's tree at one instant and makes its picture. Times are the nodes' own: an item's counts from its
/// start on the track, media have media time. May be used from several threads at once.
class NodeRenderer {
public:
    NodeRenderer(std::shared_ptr<PixelBufferPool> pool, std::shared_ptr<MediaReader> reader, bool strict);

    [[nodiscard]] MediaPictures& GetMedia() { return mPictures; }
    [[nodiscard]] std::vector<std::string> GetPassedThrough() const { return mEffects.GetPassedThrough(); }

    /// A node's picture on a frame of the view's size, with its motion and opacity.
    [[nodiscard]] Picture RenderFrame(const Node& node, std::int64_t time, const View& view);
    /// The same for a clip and its operators before `endOperator`.
    [[nodiscard]] Picture RenderOperators(const Node& clip, const ItemTimes& times, std::size_t endOperator,
                                          const View& view);

private:
    /// What a compositor draws: a clip before its motion, everything else as a finished frame.
    [[nodiscard]] LayerPicture RenderLayer(const Node& node, std::int64_t time, const View& view);
    [[nodiscard]] LayerPicture RenderClip(const Node& clip, const ItemTimes& times, std::size_t endOperator,
                                          const View& view);
    /// A frame of a sequence with both its fields, and a picture of one of its moments.
    [[nodiscard]] Picture RenderWholeFrame(const Sequence& sequence, std::int64_t time);
    [[nodiscard]] Picture RenderSequence(const Sequence& sequence, std::int64_t time, std::uint32_t fieldSelection);
    [[nodiscard]] Picture RenderInput(const NodeInput& input, std::int64_t time, const View& view);
    [[nodiscard]] Picture Composite(const Node& compositor, std::int64_t time, const View& view);
    [[nodiscard]] Picture RenderBetween(const Node& transition, std::int64_t time, const View& view);
    [[nodiscard]] Picture Adjust(const Node& adjustment, std::int64_t time, const View& view);
    [[nodiscard]] Picture Tile(const Node& multicam, std::int64_t time, const View& view);

    MediaPictures mPictures;
    MediaLayers mMedia;
    EffectRunner mEffects;
};

}  // namespace Vantrel::Host::Software
