// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Crop.h"

#include <algorithm>
#include <utility>

#include "Host/Software/Effects/Motion.h"
#include "Vantrel/Effects/Crop.h"

namespace Vantrel::Host::Software {
namespace {

/// What is kept of one direction, in pixels.
struct Span {
    int first = 0;
    int end = 0;
};

/// In single precision, as devices cut: a place that lies halfway would show the difference.
int Place(float place, int length) {
    return static_cast<int>(std::clamp(place + 0.5F, 0.0F, static_cast<float>(length)));
}

/// @param clip    the clip's length in pixels of the picture
/// @param origin  of the frame's corner within the picture
Span Keep(float firstCut, float lastCut, int length, int clip, int frame, int origin) {
    const auto whole = static_cast<float>(length);
    const auto scale = static_cast<double>(static_cast<float>(clip) / whole);
    const int margin = (clip - frame) / 2;
    const double start = static_cast<double>(origin - margin) / length;
    const double first = std::max(0.0, static_cast<double>(firstCut) * scale + start);
    const double last = std::max(0.0, 1.0 - static_cast<double>(1.0F - lastCut) * scale - start);
    return {Place(whole * static_cast<float>(first), length), Place(whole - whole * static_cast<float>(last), length)};
}

Picture Cut(const Picture& picture, const Span& across, const Span& down) {
    Picture kept(across.end - across.first, down.end - down.first);
    for (int y = 0; y < kept.height; ++y) {
        const float* row = picture.At(across.first, down.first + y);
        std::copy(row, row + static_cast<std::ptrdiff_t>(kept.width) * 4, kept.At(0, y));
    }
    return kept;
}

Picture Stretched(const Picture& kept, int width, int height, Vellum::RenderQuality quality) {
    Picture target(width, height);
    LayerDrawing drawing;
    drawing.scaleX = static_cast<float>(static_cast<double>(width) / kept.width);
    drawing.scaleY = static_cast<float>(static_cast<double>(height) / kept.height);
    drawing.quality = quality;
    DrawLayer(kept, drawing, target);
    return target;
}

}  // namespace

void RunCrop(const EffectContext& context, LayerPicture& layer) {
    const auto cut = [&context](std::int32_t index) { return static_cast<float>(context.Number(index)) / 100.0F; };
    const bool zoom = context.Flag(kCrop_Zoom);
    const View& view = context.view;
    const Picture& picture = layer.picture;
    const bool isClip = layer.mediaWidth > 0 && layer.mediaHeight > 0;
    const double aspect = isClip ? layer.mediaAspect.Value() / layer.aspect.Value() : 1.0;
    const int clipWidth = isClip ? static_cast<int>(layer.mediaWidth * aspect + 0.5) : view.width;
    const Span across = Keep(cut(kCrop_Left), cut(kCrop_Right), picture.width, clipWidth, view.width, layer.origin.x);
    const Span down = Keep(cut(kCrop_Top), cut(kCrop_Bottom), picture.height, isClip ? layer.mediaHeight : view.height,
                           view.height, layer.origin.y);
    int width = picture.width, height = picture.height;
    if (zoom && width < view.width) {
        width = view.width;
        layer.origin.x = 0;
    }
    if (zoom && height < view.height) {
        height = view.height;
        layer.origin.y = 0;
    }
    if (zoom) layer.aspect = view.aspect;
    const bool leavesNothing = across.first >= across.end || down.first >= down.end;
    if (leavesNothing) {
        layer.picture = Picture(width, height);
    } else if (zoom) {
        layer.picture = Stretched(Cut(picture, across, down), width, height, view.Quality());
    } else {
        Picture cropped(width, height);
        for (int y = down.first; y < down.end; ++y) {
            const float* row = picture.At(across.first, y);
            std::copy(row, row + static_cast<std::ptrdiff_t>(across.end - across.first) * 4,
                      cropped.At(across.first, y));
        }
        layer.picture = std::move(cropped);
    }
}

}  // namespace Vantrel::Host::Software
