// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <functional>
#include <vector>

#include "Host/Software/LayerPicture.h"
#include "Host/Software/MediaPictures.h"
#include "Marl/TimeSampling.h"

namespace Vantrel::Host::Software {

/// Makes layers of media: picks the frames that show a moment, brings them to the size that the sequence wants of them,
/// settles alpha and centres them. May be used from several threads at once.
class MediaLayers {
public:
    /// Renders one moment of a sequence at its own size.
    using NestedRenderer =
        std::function<Picture(const Sequence& sequence, std::int64_t time, std::uint32_t fieldSelection)>;
    struct Size {
        std::int32_t width = 0;
        std::int32_t height = 0;
    };

    /// The pictures outlive it.
    MediaLayers(MediaPictures& pictures, NestedRenderer renderNested)
        : mPictures(pictures), mRenderNested(std::move(renderNested)) {}

    /// @param media  a media or preview node
    [[nodiscard]] LayerPicture Render(const Node& media, std::int64_t mediaTime, const View& view);

private:
    /// What the view shows at a media time: one field or frame, or several of them mixed.
    [[nodiscard]] Picture Show(const Node& media, std::int64_t mediaTime, const Size& size, const View& view);
    [[nodiscard]] Picture Sum(const MediaDetail& detail, const std::vector<Marl::TimeSample>& samples, const Size& size,
                              const View& view);
    [[nodiscard]] Picture RenderExact(const MediaDetail& detail, const Marl::TimeSample& sample,
                                      std::uint32_t selection, const View& view);
    /// A frame as it is, or the picture that one of its fields gives.
    [[nodiscard]] Picture ReadFrame(const MediaDetail& detail, std::int64_t frame, std::uint32_t selection);

    MediaPictures& mPictures;
    NestedRenderer mRenderNested;
};

}  // namespace Vantrel::Host::Software
