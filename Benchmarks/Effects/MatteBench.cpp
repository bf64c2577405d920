// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// How far the keyer's mattes lie from the truth that made the screens, by the scalar version: the mean and the 95th
// percentile over all pixels, and the means where nothing, where all and where a part is covered. First as the effect
// is when just applied, then with settings for the screen.
//     vantrel_matte_bench [FOLDER]    also writes what the camera saw, the matte and the keyed picture as PNG
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <string>
#include <vector>

#include "Host/Software/Effects/UltraKey.h"
#include "Tests/Effects/ScreenShot.h"

namespace {

using namespace Vantrel;
using Host::Software::Picture;
using Host::Software::Pixel;
using Testing::ScreenShot;
using Subject = ScreenShot::Subject;
using Settings = std::map<std::int32_t, double>;

constexpr int kWidth = 480, kHeight = 270;

const struct {
    const char* name;
    Pixel color;
    double left, right;
    double highlight, shadow, pedestal;  ///< tuned
} kScreens[] = {{"even green", {0.25, 0.7, 0.1, 1}, 1, 1, 0, 50, 3},
                {"even blue", {0.75, 0.25, 0.1, 1}, 1, 1, 0, 50, 3},
                {"uneven green", {0.25, 0.7, 0.1, 1}, 4.0 / 3, 2.0 / 3, 50, 33, 10},
                {"uneven blue", {0.75, 0.25, 0.1, 1}, 4.0 / 3, 2.0 / 3, 50, 33, 10},
                {"uneven green, key of the brightest", {0.25, 0.7, 0.1, 1}, 1, 0.5, 50, 20, 10}};

const struct {
    const char* name;
    Subject subject;
    Pixel color;
    double noise;
} kSubjects[] = {{"soft edge, grey", Subject::kDisc, {0.5, 0.5, 0.5, 1}, 0},
                 {"dark", Subject::kDisc, {0.1, 0.12, 0.14, 1}, 0},
                 {"skin", Subject::kDisc, {0.5, 0.6, 0.82, 1}, 0},
                 {"red", Subject::kDisc, {0.08, 0.08, 0.8, 1}, 0},
                 {"yellow", Subject::kDisc, {0.1, 0.8, 0.85, 1}, 0},
                 {"cyan", Subject::kDisc, {0.8, 0.8, 0.1, 1}, 0},
                 {"magenta", Subject::kDisc, {0.7, 0.1, 0.8, 1}, 0},
                 {"hair, brown", Subject::kHair, {0.08, 0.12, 0.2, 1}, 0},
                 {"hair, fair", Subject::kHair, {0.4, 0.6, 0.72, 1}, 0},
                 {"motion, grey", Subject::kMotion, {0.5, 0.5, 0.5, 1}, 0},
                 {"motion, skin", Subject::kMotion, {0.5, 0.6, 0.82, 1}, 0},
                 {"glass", Subject::kGlass, {0.7, 0.7, 0.7, 1}, 0},
                 {"glass, noise 1 %", Subject::kGlass, {0.7, 0.7, 0.7, 1}, 0.01},
                 {"skin, noise 1 %", Subject::kDisc, {0.5, 0.6, 0.82, 1}, 0.01},
                 {"skin, noise 3 %", Subject::kDisc, {0.5, 0.6, 0.82, 1}, 0.03},
                 {"hair, noise 3 %", Subject::kHair, {0.08, 0.12, 0.2, 1}, 0.03}};

Picture Key(const Picture& shot, const Pixel& color, const Settings& settings) {
    const auto value = [&](std::int32_t index) {
        for (const ParameterRow& row : kUltraKeyParameters) {
            if (row.index == index) return (settings.count(index) != 0 ? settings.at(index) : row.value[0]) / 100.0;
        }
        std::abort();
    };
    Host::Software::UltraKey controls;
    controls.key = color;
    controls.transparency = value(4);
    controls.highlight = value(5);
    controls.shadow = value(6);
    controls.tolerance = value(7);
    controls.pedestal = value(8);
    controls.desaturate = value(17);
    controls.range = value(18);
    controls.spill = value(19);
    controls.luma = value(20);
    Picture keyed = shot;
    Host::Software::ApplyUltraKey(keyed, controls);
    return keyed;
}

void Print(const Picture& keyed, const ScreenShot& shot) {
    std::vector<double> errors;
    double sum = 0.0;
    for (std::size_t i = 3; i < keyed.pixels.size(); i += 4) {
        errors.push_back(std::abs(static_cast<double>(keyed.pixels[i] - shot.truth.pixels[i])));
        sum += errors.back();
    }
    const auto place = errors.begin() + static_cast<std::ptrdiff_t>(errors.size() * 95 / 100);
    std::nth_element(errors.begin(), place, errors.end());
    const auto [screen, front, edge] = shot.Judge(keyed);
    std::printf(" %.4f %.3f %.3f %.3f %.3f |", sum / static_cast<double>(errors.size()), *place, screen, front, edge);
}

}  // namespace

int main(int count, char** arguments) {
    for (const auto& screen : kScreens) {
        std::printf("%s\n", screen.name);
        for (const auto& subject : kSubjects) {
            Testing::Random random(7);
            const ScreenShot shot = ScreenShot::Make(
                random, kWidth, kHeight,
                {screen.color, subject.subject, subject.color, screen.left, screen.right, subject.noise});
            std::printf("  | %-18s |", subject.name);
            const Settings tuned = {{5, screen.highlight}, {6, screen.shadow}, {8, screen.pedestal}};
            for (const Settings& settings : {Settings{}, tuned}) {
                const Picture keyed = Key(shot.shot, screen.color, settings);
                Print(keyed, shot);
                if (count < 2) continue;
                const std::string stem = std::string(arguments[1]) + "/" + screen.name + ", " + subject.name +
                                         (settings.empty() ? "" : ", tuned");
                Picture matte = keyed;
                for (std::size_t i = 0; i < matte.pixels.size(); ++i) {
                    matte.pixels[i] = i % 4 == 3 ? 1.0F : keyed.pixels[i / 4 * 4 + 3];
                }
                const bool written = Testing::WritePng(shot.shot, stem + ", shot.png") &&
                                     Testing::WritePng(matte, stem + ", matte.png") &&
                                     Testing::WritePng(keyed, stem + ", keyed.png");
                if (!written) return 1;
            }
            std::printf("\n");
        }
    }
    return 0;
}
