// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/MulticamGrid.h"

#include <cstring>

#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/Effects/Motion.h"

namespace Vantrel::Host::Software {

namespace {

constexpr int kBorder = 2;
constexpr Pixel kOpaqueBlack{0, 0, 0, 1};
constexpr Pixel kRecordingColor{0, 0, 1, 1};
constexpr Pixel kSelectedColor{0, 1, 1, 1};

/// The least side whose square has room for all tiles.
int GridSide(std::size_t count) {
    int side = 1;
    while (static_cast<std::size_t>(side) * static_cast<std::size_t>(side) < count) ++side;
    return side;
}

Vellum::Rect TileAt(int index, int width, int height, int side) {
    const int column = index % side;
    const int row = index / side;
    return {width * column / side, height * row / side, width * (column + 1) / side, height * (row + 1) / side};
}

void DrawTile(const Picture& source, const Vellum::Rect& place, const View& view, Picture& target) {
    if (source.pixels.empty() || place.Width() <= 0 || place.Height() <= 0) {
        Fill(target, place.left, place.top, place.Width(), place.Height(), kOpaqueBlack);
        return;
    }
    LayerDrawing drawing;
    drawing.scaleX = static_cast<float>(place.Width()) / static_cast<float>(source.width);
    drawing.scaleY = static_cast<float>(place.Height()) / static_cast<float>(source.height);
    drawing.quality = view.Quality();
    Picture tile(place.Width(), place.Height());
    DrawLayer(source, drawing, tile);
    for (int y = 0; y < tile.height; ++y) {
        std::memcpy(target.At(place.left, place.top + y), tile.At(0, y),
                    static_cast<std::size_t>(tile.width) * 4 * sizeof(float));
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

Picture DrawMulticamGrid(const std::vector<Picture>& angles, const Multicam& options, const View& view) {
    Picture target(view.width, view.height);
    const int width = options.showProgram ? view.width / 2 : view.width;
    const int side = GridSide(angles.size());
    const auto tile = [&angles](int index) -> const Picture& {
        static const Picture kNone;
        return index >= 0 && static_cast<std::size_t>(index) < angles.size() ? angles[static_cast<std::size_t>(index)]
                                                                             : kNone;
    };
    const bool selected = options.selected >= 0 && options.selected < side * side;
    if (options.isNonMulticam) {
        DrawTile(tile(0), {0, 0, width, view.height}, view, target);
    } else {
        for (int i = 0; i < side * side; ++i) DrawTile(tile(i), TileAt(i, width, view.height, side), view, target);
        if (selected) {
            DrawBorder(TileAt(options.selected, width, view.height, side),
                       options.recording ? kRecordingColor : kSelectedColor, target);
        }
    }
    if (options.showProgram && selected) {
        DrawTile(tile(options.selected), {width, 0, 2 * width, view.height}, view, target);
    }
    return target;
}

}  // namespace Vantrel::Host::Software
