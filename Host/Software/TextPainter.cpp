// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/TextPainter.h"

#include <ft2build.h>
#include FT_FREETYPE_H

#include <algorithm>
#include <cctype>
#include <cmath>
#include <utility>

#include "Host/Media/FFmpegHandles.h"
#include "Tarn/Text.h"

namespace Vantrel::Host::Software {

namespace {

/// FreeType counts in 64ths of a pixel, its matrices in 65536ths.
constexpr double kUnit = 64.0;
constexpr double kMatrixUnit = 65536.0;

std::string Lowered(const std::string& text) {
    std::string lowered;
    for (const char c : text) {
        if (c != ' ' && c != '-') lowered += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    }
    return lowered;
}

bool Contains(const std::string& text, const char* word) { return text.find(word) != std::string::npos; }

std::string StemOf(const std::string& family) {
    const std::string name = Lowered(family);
    std::string stem = "LiberationSans";
    if (Contains(name, "mono") || Contains(name, "courier")) {
        stem = "LiberationMono";
    } else if (Contains(name, "narrow")) {
        stem = "LiberationSansNarrow";
    } else if ((Contains(name, "serif") && !Contains(name, "sans")) || Contains(name, "times")) {
        stem = "LiberationSerif";
    }
    const bool bold = Contains(name, "bold");
    const bool italic = Contains(name, "italic") || Contains(name, "oblique");
    return stem + (bold ? (italic ? "-BoldItalic" : "-Bold") : (italic ? "-Italic" : "-Regular"));
}

/// Takes one character off UTF-8; what isn't UTF-8 comes out byte by byte.
std::uint32_t TakeCharacter(const std::string& text, std::size_t& at) {
    const auto lead = static_cast<unsigned char>(text[at++]);
    const int extra = lead >= 0xF0 && lead < 0xF8 ? 3 : lead >= 0xE0 ? 2 : lead >= 0xC0 ? 1 : 0;
    if (extra == 0 || lead >= 0xF8 || at + static_cast<std::size_t>(extra) > text.size()) return lead;
    std::uint32_t code = lead & (0x3FU >> extra);
    for (int i = 0; i < extra; ++i) {
        const auto next = static_cast<unsigned char>(text[at + static_cast<std::size_t>(i)]);
        if ((next & 0xC0U) != 0x80U) return lead;
        code = code << 6 | (next & 0x3FU);
    }
    at += static_cast<std::size_t>(extra);
    return code;
}

/// Lays a colour over a pixel, both straight.
void LayOver(float* below, const Pixel& color, double coverage) {
    const double as = color[3] * coverage;
    const double ab = below[3];
    const double alpha = as + ab * (1.0 - as);
    if (alpha <= 0.0) return;
    for (std::size_t c = 0; c < 3; ++c) {
        below[c] = static_cast<float>((as * color[c] + ab * (1.0 - as) * below[c]) / alpha);
    }
    below[3] = static_cast<float>(alpha);
}

}  // namespace

std::string FindFontFile(const std::string& family) {
    const std::string stem = StemOf(family);
    for (const std::string& name : {stem, std::string("LiberationSans-Regular")}) {
        std::string path = Tarn::FindFontFile(name + ".ttf");
        if (!path.empty()) return path;
    }
    throw MediaError("no font for text: the Liberation fonts aren't installed (Debian package fonts-liberation)");
}

struct TextPainter::Face {
    ~Face() {
        if (face) FT_Done_Face(face);
        if (library) FT_Done_FreeType(library);
    }

    FT_Library library = nullptr;
    FT_Face face = nullptr;
    double aspect = 1.0;
};

TextPainter::TextPainter(const std::string& family, double size, double aspect) : mFace(std::make_unique<Face>()) {
    const std::string file = FindFontFile(family);
    const auto size64 = static_cast<FT_F26Dot6>(std::lround(std::clamp(size, 1.0, 4096.0) * kUnit));
    if (FT_Init_FreeType(&mFace->library) != 0 || FT_New_Face(mFace->library, file.c_str(), 0, &mFace->face) != 0 ||
        FT_Set_Char_Size(mFace->face, size64, size64, 72, 72) != 0) {
        throw MediaError("the font " + file + " can't be used");
    }
    mFace->aspect = aspect > 0 ? aspect : 1.0;
}

TextPainter::~TextPainter() = default;

double TextPainter::GetLineHeight() const { return static_cast<double>(mFace->face->size->metrics.height) / kUnit; }

double TextPainter::GetAscent() const { return static_cast<double>(mFace->face->size->metrics.ascender) / kUnit; }

double TextPainter::GetDescent() const { return -static_cast<double>(mFace->face->size->metrics.descender) / kUnit; }

std::vector<TextPainter::Glyph> TextPainter::SetLine(const std::string& line, double& advance) const {
    FT_Face face = mFace->face;
    FT_Set_Transform(face, nullptr, nullptr);
    std::vector<Glyph> glyphs;
    double pen = 0;
    std::uint32_t previous = 0;
    for (std::size_t at = 0; at < line.size();) {
        const std::uint32_t index = FT_Get_Char_Index(face, TakeCharacter(line, at));
        FT_Vector kerning{};
        if (previous != 0 && index != 0) FT_Get_Kerning(face, previous, index, FT_KERNING_UNFITTED, &kerning);
        pen += static_cast<double>(kerning.x) / kUnit / mFace->aspect;
        glyphs.push_back({index, pen});
        if (FT_Load_Glyph(face, index, FT_LOAD_NO_HINTING | FT_LOAD_NO_BITMAP) == 0) {
            pen += static_cast<double>(face->glyph->linearHoriAdvance) / kMatrixUnit / mFace->aspect;
        }
        previous = index;
    }
    advance = pen;
    return glyphs;
}

double TextPainter::Measure(const std::string& line) const {
    double advance = 0;
    (void)SetLine(line, advance);
    return advance;
}

void TextPainter::Draw(const std::string& line, double x, double baseline, const Pixel& color, Picture& picture) const {
    FT_Face face = mFace->face;
    double advance = 0;
    for (const Glyph& glyph : SetLine(line, advance)) {
        const double left = x + glyph.x;
        FT_Matrix matrix{std::lround(kMatrixUnit / mFace->aspect), 0, 0, std::lround(kMatrixUnit)};
        // The outline moves by the fraction of a pixel, the bitmap by whole ones.
        FT_Vector fraction{std::lround((left - std::floor(left)) * kUnit),
                           std::lround((std::ceil(baseline) - baseline) * kUnit)};
        FT_Set_Transform(face, &matrix, &fraction);
        if (FT_Load_Glyph(face, glyph.index, FT_LOAD_NO_HINTING | FT_LOAD_NO_BITMAP | FT_LOAD_RENDER) != 0) continue;
        const FT_Bitmap& bitmap = face->glyph->bitmap;
        const int left0 = static_cast<int>(std::floor(left)) + face->glyph->bitmap_left;
        const int top0 = static_cast<int>(std::ceil(baseline)) - face->glyph->bitmap_top;
        for (int row = 0; row < static_cast<int>(bitmap.rows); ++row) {
            const int targetY = top0 + row;
            if (targetY < 0 || targetY >= picture.height) continue;
            for (int column = 0; column < static_cast<int>(bitmap.width); ++column) {
                const int targetX = left0 + column;
                if (targetX < 0 || targetX >= picture.width) continue;
                const unsigned char coverage = bitmap.buffer[row * bitmap.pitch + column];
                if (coverage != 0) LayOver(picture.At(targetX, targetY), color, coverage / 255.0);
            }
        }
    }
}

}  // namespace Vantrel::Host::Software
