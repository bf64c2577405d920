// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Host/Software/Picture.h"
#include "Vellum/FieldOrder.h"
#include "Vellum/Geometry.h"

namespace Vantrel::Host::Software {

/// What a request wants of a sequence's picture.
struct View {
    /// Of the picture that comes out.
    std::int32_t width = 0;
    std::int32_t height = 0;
    Vellum::PixelAspectRatio aspect;
    /// Of the sequence as it was laid out.
    std::int32_t sequenceWidth = 0;
    std::int32_t sequenceHeight = 0;
    std::int64_t frameTicks = 0;
    std::uint32_t quality = 4;
    /// Of the sequence.
    std::uint32_t fieldType = Vellum::kFieldType_Progressive;
    /// The moment that is wanted: that of one of a frame's fields, or the whole frame.
    std::uint32_t fieldSelection = Vellum::kFieldSelection_Frame;

    /// Pixels of the sequence in one of the picture.
    [[nodiscard]] double ScaleX() const { return static_cast<double>(sequenceWidth) / width; }
    [[nodiscard]] double ScaleY() const { return static_cast<double>(sequenceHeight) / height; }
    [[nodiscard]] Vellum::RenderQuality Quality() const { return Vellum::ToRenderQuality(quality); }
};

/// A picture on its way up the tree.
struct LayerPicture {
    Picture picture;
    Vellum::PixelAspectRatio aspect;
    /// Of the frame's corner within the picture: what is larger than the frame and centred on it has a positive origin.
    Vellum::Point origin;
    /// The size that the media had before any effect; 0 if there are none.
    std::int32_t mediaWidth = 0;
    std::int32_t mediaHeight = 0;
    Vellum::PixelAspectRatio mediaAspect;
};

}  // namespace Vantrel::Host::Software
