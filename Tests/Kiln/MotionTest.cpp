// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/Effects/Motion.h"
#include "Kiln/FrameOperations.h"
#include "Tests/Support/DevicePictures.h"

namespace Vantrel::Testing {
namespace {

using Host::Software::DrawLayer;
using Host::Software::LayerDrawing;
using Vellum::Rect;
using Vellum::RenderQuality;

Rect WholeOf(const Picture& picture) { return {0, 0, picture.width, picture.height}; }

Picture Cut(const Picture& picture, const Rect& rect) {
    Picture part(rect.Width(), rect.Height());
    for (int y = 0; y < part.height; ++y) {
        for (int x = 0; x < part.width; ++x) part.Set(x, y, picture.Get(rect.left + x, rect.top + y));
    }
    return part;
}

void Paste(Picture& picture, const Picture& part, const Rect& rect) {
    for (int y = 0; y < part.height; ++y) {
        for (int x = 0; x < part.width; ++x) picture.Set(rect.left + x, rect.top + y, part.Get(x, y));
    }
}

class MotionOnEachDevice : public DeviceTest {
protected:
    Picture Draw(const Picture& layer, const Rect& layerRect, const Picture& target, const Rect& targetRect,
                 const LayerDrawing& drawing) {
        const DevicePicture source(GetDevice(), GetFormat(), layer, 3);
        const DevicePicture out(GetDevice(), GetFormat(), target, 5);
        EXPECT_EQ(Kiln::Motion(GetDevice(), source.GetData(), source.GetRowBytes(), layerRect.left, layerRect.top,
                               layerRect.Width(), layerRect.Height(), drawing.layerAspect.numerator,
                               drawing.layerAspect.denominator, out.GetData(), out.GetRowBytes(), targetRect.left,
                               targetRect.top, targetRect.Width(), targetRect.Height(), drawing.targetAspect.numerator,
                               drawing.targetAspect.denominator, GetFormat(), drawing.positionX, drawing.positionY,
                               drawing.anchorX, drawing.anchorY, drawing.scaleX, drawing.scaleY, drawing.rotation,
                               drawing.opacity, drawing.blendMode, drawing.overDestination, drawing.quality),
                  Ostrand::kStatus_OK);
        return out.Download();
    }
    Picture Draw(const Picture& layer, const Picture& target, const LayerDrawing& drawing) {
        return Draw(layer, WholeOf(layer), target, WholeOf(target), drawing);
    }

    static Picture Reference(const Picture& layer, const Rect& layerRect, const Picture& target, const Rect& targetRect,
                             const LayerDrawing& drawing) {
        Picture part = Cut(target, targetRect);
        DrawLayer(Cut(layer, layerRect), drawing, part);
        Picture out = target;
        Paste(out, part, targetRect);
        return out;
    }

    [[nodiscard]] Picture Rounded(Picture picture) const { return RoundTo(std::move(picture), GetFormat()); }
};

Rect RandomPart(Random& random, const Picture& picture) {
    const int left = random.Int(0, picture.width / 3), top = random.Int(0, picture.height / 3);
    return {left, top, random.Int(left + 1, picture.width), random.Int(top + 1, picture.height)};
}

LayerDrawing RandomDrawing(Random& random) {
    LayerDrawing drawing;
    drawing.positionX = random.Uniform(-0.1F, 1.1F);
    drawing.positionY = random.Uniform(-0.1F, 1.1F);
    drawing.anchorX = random.Uniform(-0.2F, 1.2F);
    drawing.anchorY = random.Uniform(-0.2F, 1.2F);
    const float reduction = random.Chance(0.5F) ? 0.15F : 0.6F;
    drawing.scaleX = random.Uniform(reduction, 2.5F) * (random.Chance(0.2F) ? -1.0F : 1.0F);
    drawing.scaleY = random.Uniform(reduction, 2.5F) * (random.Chance(0.2F) ? -1.0F : 1.0F);
    drawing.rotation =
        random.Chance(0.4F) ? 90.0F * static_cast<float>(random.Int(-4, 5)) : random.Uniform(-500.0F, 500.0F);
    drawing.opacity = random.Chance(0.5F) ? 1.0F : random.Uniform(0.0F, 1.0F);
    drawing.overDestination = random.Chance(0.5F);
    drawing.layerAspect = {random.Int(1, 3), random.Int(1, 3)};
    drawing.targetAspect = {random.Int(1, 3), random.Int(1, 3)};
    return drawing;
}

TEST_P(MotionOnEachDevice, MatchesTheReference) {
    Random random;
    for (int round = 0; round < 40; ++round) {
        SCOPED_TRACE(round);
        const Picture layer = Rounded(RandomPicture(random, random.Int(1, 90), random.Int(1, 60)));
        const Picture target = Rounded(RandomPicture(random, random.Int(1, 140), random.Int(1, 70)));
        const Rect layerRect = RandomPart(random, layer), targetRect = RandomPart(random, target);
        LayerDrawing drawing = RandomDrawing(random);
        drawing.quality = static_cast<RenderQuality>(1 + round % 5);
        // Where a place between pixels is in doubt by its last digits: a cubic's slope over noise makes 1e-4 of 1e-5,
        // and the nearest pixel can be another one.
        Tolerance tolerance{IsHalf() ? 3e-3 : 3e-4, 0.0, true};
        tolerance.exceptionShare = drawing.quality < RenderQuality::kMedium ? 0.005 : 0.0005;
        EXPECT_TRUE(PicturesAgree(Draw(layer, layerRect, target, targetRect, drawing),
                                  Reference(layer, layerRect, target, targetRect, drawing), tolerance));
    }
}

TEST_P(MotionOnEachDevice, WholePixelMovesKeepEveryBit) {
    Random random;
    const Picture layer = Rounded(RandomPicture(random, 37, 21));
    const Picture target = Rounded(RandomPicture(random, 61, 33));
    LayerDrawing drawing;
    for (const auto& place : {Vellum::Point{0, 0}, {7, 5}, {-11, -3}, {50, 30}}) {
        // Fractions in single precision miss the whole pixel by a little, as they do in real projects.
        drawing.positionX = (static_cast<float>(place.x) + 18.5F) / 61.0F;
        drawing.positionY = (static_cast<float>(place.y) + 10.5F) / 33.0F;
        Picture expected = target;
        for (int y = 0; y < 21; ++y) {
            for (int x = 0; x < 37; ++x) {
                const int tx = x + place.x, ty = y + place.y;
                if (tx >= 0 && ty >= 0 && tx < 61 && ty < 33) expected.Set(tx, ty, layer.Get(x, y));
            }
        }
        EXPECT_TRUE(PicturesAgree(Draw(layer, target, drawing), expected, kExactly)) << place.x << ", " << place.y;
    }
}

TEST_P(MotionOnEachDevice, RightAnglesAndFlipsKeepEveryBit) {
    Random random;
    const Picture layer = Rounded(RandomPicture(random, 40, 24));
    const struct {
        float rotation, scaleX;
        int column, columnByX, columnByY, row, rowByX, rowByY;  ///< of the layer's pixel that is shown
    } kTurns[] = {{90, 1, 0, 0, 1, 23, -1, 0},
                  {-90, 1, 39, 0, -1, 0, 1, 0},
                  {450, -1, 39, 0, -1, 23, -1, 0},
                  {180, 1, 39, -1, 0, 23, 0, -1},
                  {0, -1, 39, -1, 0, 0, 0, 1}};
    for (const auto& turn : kTurns) {
        const bool upright = turn.rotation == 180.0F || turn.rotation == 0.0F;
        Picture expected(upright ? 40 : 24, upright ? 24 : 40);
        for (int y = 0; y < expected.height; ++y) {
            for (int x = 0; x < expected.width; ++x) {
                expected.Set(x, y,
                             layer.Get(turn.column + turn.columnByX * x + turn.columnByY * y,
                                       turn.row + turn.rowByX * x + turn.rowByY * y));
            }
        }
        LayerDrawing drawing;
        drawing.rotation = turn.rotation;
        drawing.scaleX = turn.scaleX;
        EXPECT_TRUE(PicturesAgree(Draw(layer, Picture(expected.width, expected.height), drawing), expected, kExactly))
            << turn.rotation;
    }
}

TEST_P(MotionOnEachDevice, BlendModesMatchTheReference) {
    Random random;
    for (std::int32_t mode = -1; mode <= Kiln::kBlend_Count; ++mode) {
        for (const bool shifted : {false, true}) {
            const char* name = Kiln::GetBlendModeName(mode);
            SCOPED_TRACE(testing::Message() << "mode " << (name ? name : "unknown"));
            const Picture layer = Rounded(RandomPicture(random, 67, 31));
            const Picture target = Rounded(RandomPicture(random, 67, 31));
            LayerDrawing drawing;
            drawing.blendMode = mode;
            drawing.overDestination = true;
            drawing.opacity = shifted ? 1.0F : random.Uniform(0.1F, 1.0F);
            if (shifted) drawing.positionX = 0.5F + 3.0F / 67.0F;
            // Modes that choose by a threshold may choose otherwise within rounding of it. Colour and alpha are each
            // rounded to half a step, which for a 16-bit float is 2^-11 of the value.
            const Tolerance tolerance{IsHalf() ? 2e-4 : 2e-6, IsHalf() ? 1.2e-3 : 2e-6, true, 0.002};
            EXPECT_TRUE(PicturesAgree(Draw(layer, target, drawing),
                                      Reference(layer, WholeOf(layer), target, WholeOf(target), drawing), tolerance));
        }
    }
}

TEST_P(MotionOnEachDevice, WhatIsNotDrawnStaysToTheBit) {
    Random random;
    const Picture target = Rounded(RandomPicture(random, 50, 40));
    Picture clear = Rounded(RandomPicture(random, 50, 40));
    for (std::size_t i = 3; i < clear.pixels.size(); i += 4) clear.pixels[i] = 0.0F;
    LayerDrawing over;
    over.overDestination = true;
    EXPECT_TRUE(PicturesAgree(Draw(clear, target, over), target, kExactly));
    over.rotation = 10.0F;
    EXPECT_TRUE(PicturesAgree(Draw(clear, target, over), target, kExactly));
    over.blendMode = Kiln::kBlend_Multiply;
    over.opacity = 0.0F;
    EXPECT_TRUE(PicturesAgree(Draw(target, target, over), target, kExactly));

    LayerDrawing nowhere;
    nowhere.scaleX = 0.0F;
    EXPECT_TRUE(PicturesAgree(Draw(clear, target, nowhere), target, kExactly));
    nowhere.scaleX = 1.0F;
    nowhere.positionX = 3.0F;
    EXPECT_TRUE(PicturesAgree(Draw(clear, target, nowhere), target, kExactly));
}

TEST_P(MotionOnEachDevice, NotANumberStaysInItsPixelWithoutAFilter) {
    Random random;
    const Picture clean = Rounded(RandomOpaquePicture(random, 40, 20));
    Picture layer = clean;
    layer.At(17, 9)[1] = NAN;
    layer.At(18, 9)[0] = INFINITY;
    for (const std::int32_t mode : {Kiln::kBlend_Normal, Kiln::kBlend_Screen}) {
        LayerDrawing drawing;
        drawing.overDestination = true;
        drawing.blendMode = mode;
        drawing.opacity = 0.5F;
        Picture out = Draw(layer, clean, drawing);
        const Picture expected = Draw(clean, clean, drawing);
        EXPECT_TRUE(std::isnan(out.At(17, 9)[1]));
        for (const int x : {17, 18}) out.Set(x, 9, expected.Get(x, 9));
        EXPECT_TRUE(PicturesAgree(out, expected, kExactly));
    }
}

TEST_P(MotionOnEachDevice, RefusesWhatCantBeDrawn) {
    const DevicePicture picture(GetDevice(), GetFormat(), Picture(8, 8), 0);
    const auto draw = [&](std::uint64_t source, int width, Vellum::PixelFormat format, float scale) {
        return Kiln::Motion(GetDevice(), source, picture.GetRowBytes(), 0, 0, width, 8, 1, 1, picture.GetData(),
                            picture.GetRowBytes(), 0, 0, 8, 8, 1, 1, format, 0.5F, 0.5F, 0.5F, 0.5F, scale, 1.0F, 0.0F,
                            1.0F, Kiln::kBlend_Normal, false, RenderQuality::kHigh);
    };
    EXPECT_EQ(draw(0, 8, GetFormat(), 1.0F), Ostrand::kStatus_Failure);
    EXPECT_EQ(draw(picture.GetData(), 0, GetFormat(), 1.0F), Ostrand::kStatus_Failure);
    EXPECT_EQ(draw(picture.GetData(), 8, Vellum::kPixelFormat_BGRA_4444_8u, 1.0F), Ostrand::kStatus_Failure);
    EXPECT_EQ(draw(picture.GetData(), 8, GetFormat(), NAN), Ostrand::kStatus_Failure);
}

INSTANTIATE_TEST_SUITE_P(Devices, MotionOnEachDevice, testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
