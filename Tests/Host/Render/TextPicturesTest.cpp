// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "Host/Software/TextPainter.h"
#include "Host/Software/TextPictures.h"
#include "Tests/Support/Pictures.h"

namespace Vantrel::Testing {
namespace {

using Host::Title;

struct Box {
    int left = 1 << 20, top = 1 << 20, right = 0, bottom = 0;
    double coverage = 0;
};

/// Where alpha isn't 0.
Box Find(const Picture& picture) {
    Box box;
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x) {
            if (picture.At(x, y)[3] <= 0.0F) continue;
            box.left = std::min(box.left, x);
            box.top = std::min(box.top, y);
            box.right = std::max(box.right, x + 1);
            box.bottom = std::max(box.bottom, y + 1);
            box.coverage += static_cast<double>(picture.At(x, y)[3]);
        }
    }
    return box;
}

Picture Draw(const Title& title, int width = 640, int height = 360, double aspect = 1.0) {
    Picture picture(width, height);
    DrawTitle(title, aspect, picture);
    return picture;
}

TEST(Titles, StandAtTheirPlaceInTheirColour) {
    Title title;
    title.text = "HHH";
    title.size = 60;
    title.color = {1, 0.5, 0.25, 1};
    const Picture centred = Draw(title);
    const Box box = Find(centred);
    EXPECT_NEAR((box.left + box.right) / 2.0, 320, 2);
    EXPECT_NEAR((box.top + box.bottom) / 2.0, 180, 8);
    // A capital is about 0.7 of the em high.
    EXPECT_NEAR(box.bottom - box.top, 60 * 0.69, 3);
    const float* inside = centred.At(box.left + 5, (box.top + box.bottom) / 2);
    EXPECT_FLOAT_EQ(inside[3], 1.0F);
    EXPECT_FLOAT_EQ(inside[0], 0.25F);
    EXPECT_FLOAT_EQ(inside[2], 1.0F);

    title.position = {0.25, 0.75};
    title.align = -1;
    const Box left = Find(Draw(title));
    EXPECT_NEAR(left.left, 160, 8);
    title.align = 1;
    const Box right = Find(Draw(title));
    EXPECT_NEAR(right.right, 160, 8);
    EXPECT_NEAR(right.top - box.top, 90, 1);
}

TEST(Titles, FindTheirFonts) {
    const std::pair<const char*, const char*> fonts[] = {{"", "Sans-Regular"},
                                                         {"Arial Bold", "Sans-Bold"},
                                                         {"Times New Roman", "Serif-Regular"},
                                                         {"Liberation Mono Bold Italic", "Mono-BoldItalic"},
                                                         {"sans-serif", "Sans-Regular"},
                                                         {"No Such Family", "Sans-Regular"}};
    for (const auto& [name, file] : fonts) {
        EXPECT_THAT(Host::Software::FindFontFile(name), testing::EndsWith(std::string("/Liberation") + file + ".ttf"));
    }
}

TEST(Titles, WhatLiesOutsideIsCutOff) {
    Title title;
    title.text = "Far too long for this small picture";
    title.size = 80;
    title.position = {0.0, 0.0};
    EXPECT_GT(Find(Draw(title, 50, 30)).coverage, 0.0);
    title.text = "";
    EXPECT_EQ(Find(Draw(title, 50, 30)).coverage, 0.0);
}

TEST(Slate, ShowsNameAndReasonOnDark) {
    for (const auto& [width, height] : {std::pair{640, 360}, {7, 5}}) {
        Picture slate(width, height);
        Host::Software::DrawSlate("A001_C007_shot", "/media/" + std::string(90, 'x') + " can't be opened", 1.0, slate);
        int bright = 0;
        for (std::size_t i = 0; i < slate.pixels.size(); i += 4) bright += slate.pixels[i + 1] > 0.9F ? 1 : 0;
        EXPECT_TRUE(width == 7 || (bright > 500 && bright < 640 * 360 / 10)) << bright;
        EXPECT_LT(slate.At(3, 3)[1], 0.15F);
        EXPECT_EQ(slate.At(3, 3)[3], 1.0F);
    }
}

}  // namespace
}  // namespace Vantrel::Testing
