// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>

#include "Host/Software/LayerPicture.h"
#include "Host/Software/MediaPictures.h"

namespace Vantrel::Host::Software {

/// Makes layers of media: picks the frames that show a moment, brings them to the size that the sequence wants of them,
/// settles alpha and centres them. May be used from several threads at once.
class MediaLayers {
public:
    using SequenceRenderer = MediaPictures::SequenceRenderer;

    /// The pictures outlive it.
    MediaLayers(MediaPictures& pictures, SequenceRenderer renderSequence)
        : mPictures(pictures), mRenderSequence(std::move(renderSequence)) {}

    /// @param media  a media or preview node
    [[nodiscard]] LayerPicture Render(const Node& media, std::int64_t mediaTime, const View& view);

private:
    [[nodiscard]] Picture RenderExact(const MediaDetail& detail, std::int64_t mediaTime);
    [[nodiscard]] Picture ReadFrame(const MediaDetail& detail, std::int64_t frame);

    MediaPictures& mPictures;
    SequenceRenderer mRenderSequence;
};

}  // namespace Vantrel::Host::Software
