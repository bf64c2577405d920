// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tarn/Text.h"

#include <ft2build.h>
#include FT_FREETYPE_H
#include FT_OUTLINE_H

#include <algorithm>
#include <cmath>
#include <cstring>
#include <filesystem>
#include <mutex>

#include "Vellum/Field.h"
#include "Vellum/FieldOrder.h"

namespace Tarn {
namespace {

constexpr const char* kFontFolders[] = {"/usr/share/fonts/truetype/liberation", "/usr/share/fonts/truetype/liberation2",
                                        "/usr/share/fonts/liberation", "/usr/local/share/fonts/liberation"};

constexpr float kEm = 20.0F * 96.0F / 72.0F;
constexpr float kSymbolWidth = 14.0F;
/// Beyond it nothing of a letter fits into any frame, and the rasteriser's numbers end.
constexpr float kLargestScale = 4000.0F;
/// FreeType counts in 64ths of a pixel, its matrices in 65536ths.
constexpr double kUnit = 64.0;
constexpr double kMatrixUnit = 65536.0;

/// The font, opened once and used by one thread at a time.
class Font {
public:
    Font() {
        const std::string file = FindFontFile("LiberationSans-Regular.ttf");
        if (file.empty() || FT_Init_FreeType(&mLibrary) != 0) return;
        if (FT_New_Face(mLibrary, file.c_str(), 0, &mFace) != 0) mFace = nullptr;
    }
    ~Font() {
        if (mFace) FT_Done_Face(mFace);
        if (mLibrary) FT_Done_FreeType(mLibrary);
    }
    Font(const Font&) = delete;
    Font& operator=(const Font&) = delete;

    [[nodiscard]] bool IsThere() const { return mFace != nullptr; }
    [[nodiscard]] FT_Library GetLibrary() const { return mLibrary; }
    [[nodiscard]] FT_Face GetFace() const { return mFace; }
    [[nodiscard]] float PixelsOfUnit() const { return kEm / static_cast<float>(mFace->units_per_EM); }
    [[nodiscard]] float LineHeight() const { return static_cast<float>(mFace->height) * PixelsOfUnit(); }
    [[nodiscard]] float Ascent() const { return static_cast<float>(mFace->ascender) * PixelsOfUnit(); }

    /// Makes a character's glyph the face's; in units of the font. False if there is none.
    [[nodiscard]] bool Load(char character) const {
        const FT_UInt index = FT_Get_Char_Index(mFace, static_cast<unsigned char>(character));
        return FT_Load_Glyph(mFace, index, FT_LOAD_NO_SCALE) == 0 && mFace->glyph->format == FT_GLYPH_FORMAT_OUTLINE;
    }
    [[nodiscard]] float Advance() const { return static_cast<float>(mFace->glyph->advance.x) * PixelsOfUnit(); }

private:
    FT_Library mLibrary = nullptr;
    FT_Face mFace = nullptr;
};

struct Canvas {
    unsigned char* pixels;
    std::int32_t width, height, stride;
};

void DrawSpans(int y, int count, const FT_Span* spans, void* user) {
    const auto& canvas = *static_cast<const Canvas*>(user);
    unsigned char* const row = canvas.pixels + static_cast<std::ptrdiff_t>(y) * canvas.stride;
    for (int i = 0; i < count; ++i) {
        for (int x = spans[i].x; x < spans[i].x + spans[i].len; ++x) {
            unsigned char* const pixel = row + static_cast<std::ptrdiff_t>(x) * 4;
            // Where two outlines meet in a pixel each covers a part of it.
            std::memset(pixel, std::min(255, pixel[0] + spans[i].coverage), 4);
        }
    }
}

void FillOutline(const Font& font, FT_Outline& outline, Canvas& canvas) {
    FT_Raster_Params params{};
    params.flags = FT_RASTER_FLAG_AA | FT_RASTER_FLAG_DIRECT | FT_RASTER_FLAG_CLIP;
    params.gray_spans = DrawSpans;
    params.user = &canvas;
    params.clip_box = {0, 0, canvas.width, canvas.height};
    static_cast<void>(FT_Outline_Render(font.GetLibrary(), &outline, &params));
}

void DrawLetters(const Font& font, const std::string& text, float scaleX, float scaleY, Canvas& canvas) {
    constexpr float kLeft = 6.0F, kTop = 2.0F;
    const double unitX = static_cast<double>(font.PixelsOfUnit() * scaleX) * kUnit;
    const double unitY = static_cast<double>(font.PixelsOfUnit() * scaleY) * kUnit;
    // Rows count downward.
    FT_Matrix matrix{std::lround(unitX * kMatrixUnit), 0, 0, -std::lround(unitY * kMatrixUnit)};
    const FT_Pos baseline = std::lround(static_cast<double>((kTop + font.Ascent()) * scaleY) * kUnit);
    float pen = kLeft;
    for (const char character : text) {
        if (pen * scaleX >= static_cast<float>(canvas.width)) return;
        if (!font.Load(character)) continue;
        FT_Outline& outline = font.GetFace()->glyph->outline;
        FT_Outline_Transform(&outline, &matrix);
        FT_Outline_Translate(&outline, std::lround(static_cast<double>(pen * scaleX) * kUnit), baseline);
        FillOutline(font, outline, canvas);
        pen += font.Advance();
    }
}

/// Half an ellipse of 8 by 18, its middle at (4, 0): the half below for a `side` of 1, above for -1.
void DrawHalfDisc(const Font& font, float left, float middle, float side, float scaleX, float scaleY, Canvas& canvas) {
    constexpr float kAcross = 4.0F, kDown = 9.0F, kHandle = 0.5522847F;  // of a quarter of a circle as a cubic
    constexpr float kX[] = {-1, -1, -kHandle, 0, kHandle, 1, 1}, kY[] = {0, kHandle, 1, 1, 1, kHandle, 0};
    constexpr char kOn = FT_CURVE_TAG_ON, kCubic = FT_CURVE_TAG_CUBIC;
    char tags[] = {kOn, kCubic, kCubic, kOn, kCubic, kCubic, kOn};
    FT_Vector points[7];
    for (int i = 0; i < 7; ++i) {
        points[i].x = std::lround(static_cast<double>((left + kAcross + kAcross * kX[i]) * scaleX) * kUnit);
        points[i].y = std::lround(static_cast<double>((middle + side * kDown * kY[i]) * scaleY) * kUnit);
    }
    short ends[] = {6};
    FT_Outline outline{};
    outline.n_contours = 1;
    outline.n_points = 7;
    outline.points = points;
    outline.tags = tags;
    outline.contours = ends;
    FillOutline(font, outline, canvas);
}

void DrawSymbol(const Font& font, const TextLine& line, float left, float middle, float scaleX, float scaleY,
                Canvas& canvas) {
    const bool notLower = line.fieldType != Vellum::kFieldType_LowerFirst;
    const bool notUpper = line.fieldType != Vellum::kFieldType_UpperFirst;
    const bool notFirst = line.fieldSelection != Vellum::kFieldSelection_First;
    const bool notSecond = line.fieldSelection != Vellum::kFieldSelection_Second;
    if ((notLower && notFirst) || (notUpper && notSecond)) {
        DrawHalfDisc(font, left, middle, 1.0F, scaleX, scaleY, canvas);
    }
    if ((notUpper && notFirst) || (notLower && notSecond)) {
        DrawHalfDisc(font, left, middle, -1.0F, scaleX, scaleY, canvas);
    }
}

std::int32_t BoxLength(float length, std::int32_t largest) {
    const float whole = std::ceil(length);
    if (!(whole > 0.0F) || largest <= 0) return 0;
    return whole < static_cast<float>(largest) ? static_cast<std::int32_t>(whole) : largest;
}

}  // namespace

std::string FindFontFile(const std::string& fileName) {
    for (const char* folder : kFontFolders) {
        const std::filesystem::path path = std::filesystem::path(folder) / fileName;
        std::error_code ignored;
        if (std::filesystem::exists(path, ignored)) return path.string();
    }
    return {};
}

void DrawText(const TextLine& line, std::int32_t& width, std::int32_t& height, std::int32_t stride, void* buffer) {
    static std::mutex mutex;
    static const Font font;
    const std::lock_guard<std::mutex> hold(mutex);
    const float factor = line.size / 20.0F + 0.001F;
    const float scaleX = std::min(factor * line.scaleX, kLargestScale);
    const float scaleY = std::min(factor * line.scaleY, kLargestScale);
    if (!font.IsThere() || !(scaleX > 0.0F && scaleY > 0.0F)) {
        width = height = 0;
        return;
    }
    float textWidth = kEm / 3.0F;
    for (const char character : line.text) {
        if (font.Load(character)) textWidth += font.Advance();
    }
    if (line.hasFieldSymbol) textWidth += kSymbolWidth;
    const float textHeight = font.LineHeight();
    width = BoxLength(textWidth * scaleX, width);
    height = BoxLength(textHeight * scaleY, height);
    if (!buffer) return;
    Canvas canvas{static_cast<unsigned char*>(buffer), width, height, stride};
    DrawLetters(font, line.text, scaleX, scaleY, canvas);
    if (line.hasFieldSymbol) {
        DrawSymbol(font, line, textWidth - kSymbolWidth - 1.0F, textHeight * 0.5F, scaleX, scaleY, canvas);
    }
}

}  // namespace Tarn
