// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

/// One line of burnt-in text, drawn on the processor: white on black, in Liberation Sans, which has Arial's metrics.
namespace Tarn {

/// A file of the Liberation fonts, such as "LiberationSans-Regular.ttf"; empty when it isn't installed.
[[nodiscard]] std::string FindFontFile(const std::string& fileName);

struct TextLine {
    std::string text;  ///< ASCII
    /// A disc beside the text: whole for a whole frame, its upper or lower half for a field.
    bool hasFieldSymbol = false;
    std::uint32_t fieldType = 0;       ///< of the sequence, a Vellum field type
    std::uint32_t fieldSelection = 2;  ///< a Vellum field selection
    float size = 20.0F;                ///< 20: an em of 20 points at 96 dots per inch
    float scaleX = 1.0F;               ///< target pixels for a pixel of that size
    float scaleY = 1.0F;
};

/// Measures and draws a line. Its box is as wide as the text and a third of an em, and as high as a line of the font;
/// the text begins 6 by 2 pixels (before scaling) from its corner, and what leaves the box is cut off. Outlines aren't
/// hinted, coverage is exact to 1/256, and equal lines give equal bytes. Without the font, and with a size that is no
/// positive number, the box is empty. Any thread.
/// @param width,height  the largest box on entry, the line's on return
/// @param stride        bytes from one row to the next
/// @param buffer        rows of 4 bytes a pixel, all of them coverage, cleared by the caller; null: measures only
void DrawText(const TextLine& line, std::int32_t& width, std::int32_t& height, std::int32_t stride, void* buffer);

}  // namespace Tarn
