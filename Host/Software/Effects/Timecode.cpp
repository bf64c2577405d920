// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Timecode.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include "Tarn/Text.h"
#include "Vantrel/Effects/Timecode.h"

namespace Vantrel::Host::Software {
namespace {

constexpr std::int32_t kSource_Media = 1;

/// A drawn text; one byte in four counts.
struct Glyphs {
    std::int32_t width = 0;
    std::int32_t height = 0;
    std::vector<unsigned char> bytes;
};

Glyphs DrawGlyphs(const EffectContext& context, const LayerPicture& layer) {
    const TimecodeText text{
        context.Integer(kTimecode_Format),        context.Integer(kTimecode_Source),
        context.Integer(kTimecode_TimeDisplay),   static_cast<float>(context.Number(kTimecode_Offset)),
        context.Integer(kTimecode_StartingFrame), context.Integer(kTimecode_Label)};
    const bool showsMedia = text.source == kSource_Media && context.mediaTimecode;
    const std::int64_t time = showsMedia ? *context.mediaTimecode : std::max<std::int64_t>(0, context.itemTime);
    const View& view = context.view;
    Tarn::TextLine line;
    line.text = FormatTimecode(text, time, view.frameTicks);
    line.hasFieldSymbol = context.Flag(kTimecode_FieldSymbol);
    line.fieldType = view.fieldType;
    line.fieldSelection = view.fieldSelection;
    line.size = static_cast<float>(context.Number(kTimecode_Size));
    line.scaleX = 1.0F / (static_cast<float>(layer.aspect.Value()) * static_cast<float>(view.ScaleX()));
    line.scaleY = 1.0F / static_cast<float>(view.ScaleY());
    Glyphs glyphs;
    glyphs.width = std::max(view.width, layer.picture.width);
    glyphs.height = std::max(view.height, layer.picture.height);
    Tarn::DrawText(line, glyphs.width, glyphs.height, 0, nullptr);
    glyphs.bytes.resize(static_cast<std::size_t>(glyphs.width) * static_cast<std::size_t>(glyphs.height) * 4);
    Tarn::DrawText(line, glyphs.width, glyphs.height, glyphs.width * 4, glyphs.bytes.data());
    return glyphs;
}

/// The picture in the middle of a frame at least as large as the view's.
void PutOnFrame(const View& view, LayerPicture& layer, int& x, int& y) {
    const Picture& picture = layer.picture;
    Picture frame(std::max(view.width, picture.width), std::max(view.height, picture.height));
    const int left = (frame.width - picture.width + 1) / 2, top = (frame.height - picture.height + 1) / 2;
    for (int row = 0; row < picture.height; ++row) {
        std::copy(picture.At(0, row), picture.At(0, row) + static_cast<std::ptrdiff_t>(picture.width) * 4,
                  frame.At(left, top + row));
    }
    layer.picture = std::move(frame);
    layer.origin = {0, 0};
    x += left;
    y += top;
}

void Blend(const Glyphs& glyphs, int left, int top, double opacity, Picture& picture) {
    if (opacity <= 0.0) return;
    for (int y = std::max(0, -top); y < glyphs.height && top + y < picture.height; ++y) {
        for (int x = std::max(0, -left); x < glyphs.width && left + x < picture.width; ++x) {
            const double white = glyphs.bytes[(static_cast<std::size_t>(y) * static_cast<std::size_t>(glyphs.width) +
                                               static_cast<std::size_t>(x)) *
                                              4] /
                                 255.0;
            Pixel p = picture.Get(left + x, top + y);
            const double alpha = opacity + std::clamp(p[3], 0.0, 1.0) * (1.0 - opacity);
            const double share = opacity / alpha;
            for (std::size_t c = 0; c < 3; ++c) p[c] = share >= 1.0 ? white : p[c] * (1.0 - share) + white * share;
            p[3] = alpha;
            picture.Set(left + x, top + y, p);
        }
    }
}

int PlaceOf(double place) { return std::abs(place) < 1e6 ? static_cast<int>(place) : -1000000; }

}  // namespace

void RunTimecode(const EffectContext& context, LayerPicture& layer) {
    const Glyphs glyphs = DrawGlyphs(context, layer);
    if (glyphs.bytes.empty()) return;
    const auto centre = context.value(kTimecode_Position);
    int x = PlaceOf(layer.picture.width * centre[0] - glyphs.width * 0.5 + 0.5);
    int y = PlaceOf(layer.picture.height * centre[1] - glyphs.height * 0.5 + 0.5);
    const bool isSmaller = layer.picture.width < context.view.width || layer.picture.height < context.view.height;
    const bool leaves =
        x < 0 || y < 0 || x + glyphs.width > layer.picture.width || y + glyphs.height > layer.picture.height;
    if (isSmaller && leaves) PutOnFrame(context.view, layer, x, y);
    const auto opacity = static_cast<double>(static_cast<float>(context.Number(kTimecode_Opacity)) / 100.0F);
    Blend(glyphs, x, y, std::clamp(opacity, 0.0, 1.0), layer.picture);
}

}  // namespace Vantrel::Host::Software
