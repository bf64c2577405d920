// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "Host/Software/Picture.h"

namespace Vantrel::Host::Software {

/// Finds the file of a font by its family, which may end with "Bold", "Italic" or both: Liberation's fonts, and the
/// families that they stand in for (Arial, Helvetica, Times, Courier, "sans", "serif", "mono"). An empty or unknown
/// family is Liberation Sans. Throws MediaError when no font is installed.
[[nodiscard]] std::string FindFontFile(const std::string& family);

/// Sets text in one font and size. Used by one thread.
class TextPainter {
public:
    /// @param size    of the em, in pixels, above 0
    /// @param aspect  width of the target's pixels over their height
    /// Throws MediaError.
    TextPainter(const std::string& family, double size, double aspect);
    ~TextPainter();
    TextPainter(const TextPainter&) = delete;
    TextPainter& operator=(const TextPainter&) = delete;

    /// Between baselines, in pixels.
    [[nodiscard]] double GetLineHeight() const;
    /// How far the tallest letters reach above the baseline, and the lowest below it, in pixels.
    [[nodiscard]] double GetAscent() const;
    [[nodiscard]] double GetDescent() const;
    /// Advance of one line of UTF-8, in pixels.
    [[nodiscard]] double Measure(const std::string& line) const;
    /// Draws a line over a picture, its origin at (x, baseline); what reaches beyond the border is cut off.
    void Draw(const std::string& line, double x, double baseline, const Pixel& color, Picture& picture) const;

private:
    struct Face;
    struct Glyph {
        std::uint32_t index = 0;
        double x = 0;
    };

    /// Glyphs with their places; the last one's end goes to `advance`.
    [[nodiscard]] std::vector<Glyph> SetLine(const std::string& line, double& advance) const;

    std::unique_ptr<Face> mFace;
};

}  // namespace Vantrel::Host::Software
