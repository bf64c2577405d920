// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/MulticamGrid.h"

#include <algorithm>

#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/Effects/Motion.h"
#include "Tarn/Multicam.h"

namespace Vantrel::Host::Software {

namespace {

constexpr int kBorder = 2;
constexpr Pixel kOpaqueBlack{0, 0, 0, 1};
constexpr Pixel kRecordingColor{0, 0, 1, 1};
constexpr Pixel kSelectedColor{0, 1, 1, 1};

void DrawTile(const Picture& source, const Vellum::Rect& place, Vellum::RenderQuality quality, Picture& target) {
    if (place.Width() <= 0 || place.Height() <= 0) return;
    if (source.pixels.empty()) {
        Fill(target, place.left, place.top, place.Width(), place.Height(), kOpaqueBlack);
        return;
    }
    LayerDrawing drawing;
    drawing.scaleX = static_cast<float>(place.Width()) / static_cast<float>(source.width);
    drawing.scaleY = static_cast<float>(place.Height()) / static_cast<float>(source.height);
    drawing.quality = quality;
    Picture tile(place.Width(), place.Height());
    DrawLayer(source, drawing, tile);
    for (int y = 0; y < tile.height; ++y) {
        std::copy_n(tile.At(0, y), 4 * tile.width, target.At(place.left, place.top + y));
    }
}

void DrawBorder(const Vellum::Rect& place, const Pixel& color, Picture& target) {
    if (place.Width() < 3 || place.Height() < 3) return;
    const int inner = place.Width() - 2 * kBorder;
    Fill(target, place.left, place.top, kBorder, place.Height(), color);
    Fill(target, place.left + kBorder, place.top, inner, kBorder, color);
    Fill(target, place.right - kBorder, place.top, kBorder, place.Height(), color);
    Fill(target, place.left + kBorder, place.bottom - kBorder, inner, kBorder, color);
}

}  // namespace

Picture DrawMulticamGrid(const std::vector<Picture>& angles, const MulticamGrid& grid) {
    Picture target(grid.width, grid.height);
    const int width = grid.showProgram ? grid.width / 2 : grid.width;
    const std::int32_t side = Tarn::GetMulticamDownsampleFactor(static_cast<std::int32_t>(angles.size()));
    const auto tile = [&angles](int index) -> const Picture& {
        static const Picture kNone;
        return static_cast<std::size_t>(index) < angles.size() ? angles[static_cast<std::size_t>(index)] : kNone;
    };
    const auto placeOf = [&](int index) {
        return Tarn::GetMulticamBoundsBoundsForTrackIndex(index, width, grid.height, side);
    };
    const bool selected = grid.selected >= 0 && grid.selected < side * side;
    if (grid.isNonMulticam) {
        DrawTile(tile(0), {0, 0, width, grid.height}, grid.quality, target);
    } else {
        for (int i = 0; i < side * side; ++i) DrawTile(tile(i), placeOf(i), grid.quality, target);
        if (selected) DrawBorder(placeOf(grid.selected), grid.recording ? kRecordingColor : kSelectedColor, target);
    }
    if (grid.showProgram && selected) {
        DrawTile(tile(grid.selected), {width, 0, 2 * width, grid.height}, grid.quality, target);
    }
    return target;
}

}  // namespace Vantrel::Host::Software
