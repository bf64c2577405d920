// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// Films whose frames show their numbers: each picture must show the frames that the timeline's items, looked at
// directly, say.
#include <gtest/gtest.h>

#include <cmath>
#include <fstream>

#include "Host/Inspect/TestMedia.h"
#include "Host/Media/FFmpegProbe.h"
#include "Host/Media/NumberPicture.h"
#include "Host/Timeline/OtioReader.h"
#include "Tests/EndToEnd/Film.h"
#include "Tests/Host/DirectEvaluator.h"
#include "Tests/Host/TimelineMaker.h"

namespace Vantrel::Host::Test {
namespace {

/// Compression and scaling leave the middle of a square this near to black or white.
constexpr double kTolerance = 0.05;

/// The levels that the squares of a picture should have, colour weighed by its alpha.
struct Squares {
    std::array<double, kNumberBits> levels{};
    double alpha = 0;
};

Squares Over(const Squares& top, const Squares& below) {
    Squares result;
    for (int i = 0; i < kNumberBits; ++i) {
        const auto at = static_cast<std::size_t>(i);
        result.levels[at] = top.levels[at] + below.levels[at] * (1 - top.alpha);
    }
    result.alpha = top.alpha + below.alpha * (1 - top.alpha);
    return result;
}

/// `numberOf` gives the number that a media frame shows.
Squares Expect(const Sight& sight, const std::function<std::int64_t(const Shown&)>& numberOf) {
    Squares result;
    switch (sight.kind) {
        case Sight::Kind::kFrame: {
            const std::int64_t number = numberOf(sight.frame);
            for (int i = 0; i < kNumberBits; ++i) {
                result.levels[static_cast<std::size_t>(i)] = number >> (kNumberBits - 1 - i) & 1 ? 1.0 : 0.0;
            }
            result.alpha = 1;
            break;
        }
        case Sight::Kind::kLayers:
            for (const Sight& part : sight.parts) result = Over(Expect(part, numberOf), result);
            break;
        case Sight::Kind::kMix: {
            const double weights[] = {1 - sight.fraction, sight.fraction};
            for (std::size_t side = 0; side < 2; ++side) {
                const Squares part = Expect(sight.parts[side], numberOf);
                for (std::size_t i = 0; i < part.levels.size(); ++i) result.levels[i] += weights[side] * part.levels[i];
                result.alpha += weights[side] * part.alpha;
            }
            break;
        }
    }
    return result;
}

std::string ToText(const std::array<double, kNumberBits>& levels) {
    std::string text;
    for (const double level : levels) text += std::to_string(static_cast<int>(std::lround(100 * level))) + " ";
    return text;
}

/// The media that are offline show a slate, which has no squares.
bool ShowsUnknown(const Sight& sight, const std::function<std::int64_t(const Shown&)>& numberOf) {
    if (sight.kind == Sight::Kind::kFrame) return numberOf(sight.frame) < 0;
    for (const Sight& part : sight.parts) {
        if (ShowsUnknown(part, numberOf)) return true;
    }
    return false;
}

/// Compares every frame of a rendered film with the evaluator.
void Check(const std::string& what, const Document& document, const Film& film,
           const std::function<std::int64_t(const Shown&)>& numberOf) {
    EXPECT_TRUE(film.failures.empty()) << what << ": " << (film.failures.empty() ? "" : film.failures.front());
    DirectEvaluator evaluator(document, film.frameTicks, Between::kNearest);
    std::size_t wrong = 0;
    for (std::size_t frame = 0; frame < film.pictures.size(); ++frame) {
        const Sight sight = evaluator.SightAt(static_cast<std::int64_t>(frame) * film.frameTicks);
        if (ShowsUnknown(sight, numberOf)) continue;
        const Squares expected = Expect(sight, numberOf);
        const std::array<double, kNumberBits> seen = ReadSquares(*film.pictures[frame]);
        bool right = true;
        for (std::size_t i = 0; i < seen.size(); ++i) {
            right = right && std::abs(seen[i] - expected.levels[i]) <= kTolerance;
        }
        if (right) continue;
        ADD_FAILURE() << what << ", frame " << frame << "\nexpected: " << ToText(expected.levels)
                      << "\nseen:     " << ToText(seen);
        if (++wrong == 5) return;  // enough to see a pattern
    }
}

std::string NameOf(const testing::TestParamInfo<DeviceChoice>& info) {
    return info.param == DeviceChoice::kCuda ? "Cuda" : "OpenCL";
}

class FrameNumbers : public testing::TestWithParam<DeviceChoice> {
protected:
    static void SetUpTestSuite() { sDevices = std::make_unique<KeptDevices>(); }
    static void TearDownTestSuite() { sDevices.reset(); }

    static std::unique_ptr<KeptDevices> sDevices;
};
std::unique_ptr<KeptDevices> FrameNumbers::sDevices;

INSTANTIATE_TEST_SUITE_P(OnEachDevice, FrameNumbers, testing::Values(DeviceChoice::kCuda, DeviceChoice::kOpenCL),
                         NameOf);

TEST_P(FrameNumbers, OfTheSampleTimelinesAreThoseOfTheirItems) {
    std::size_t samples = 0;
    for (const auto& entry : std::filesystem::directory_iterator(VANTREL_SAMPLES)) {
        if (entry.path().extension() != ".otio") continue;
        const std::string file = entry.path().string();
        const std::string name = entry.path().stem().string();
        const Document document = ReadTimelineFile(file);
        const Folder folder("vantrel-sample-" + name);
        const std::vector<TestMediaPlan> plans = PlanTestMedia(document);
        WriteTestMedia(plans, folder.Path(""), [](const std::string&) {});
        FilmOptions options;
        options.device = GetParam();
        options.mediaRoots = {folder.Path("")};
        options.width = 128;
        options.height = 72;
        const Film film = RenderFilm(file, options);
        const auto numberOf = [&plans](const Shown& shown) {
            for (const TestMediaPlan& plan : plans) {
                if (std::filesystem::path(plan.name).stem() == std::filesystem::path(shown.media).stem()) {
                    return plan.firstFrame + std::clamp<std::int64_t>(shown.frame, 0, plan.frameCount - 1);
                }
            }
            return std::int64_t{-1};
        };
        Check(name, document, film, numberOf);
        ++samples;
    }
    EXPECT_EQ(samples, 6U);
}

TEST_P(FrameNumbers, OfRandomTimelinesAreThoseOfTheirItems) {
    constexpr unsigned kTimelines = VANTREL_RANDOM_TIMELINES;
    constexpr int kMediaFrames = 120;
    const Folder folder("vantrel-random");
    std::vector<TestMediaPlan> plans;
    for (int i = 0; i < 10; ++i) {
        plans.push_back({"m" + std::to_string(i) + ".mov", 1000 * i, kMediaFrames, kFrame});
    }
    WriteTestMedia(plans, folder.Path(""), [](const std::string&) {});
    const auto numberOf = [](const Shown& shown) {
        const std::string stem = std::filesystem::path(shown.media).stem().string();
        return 1000 * std::int64_t{stem.back() - '0'} + shown.frame;
    };
    std::size_t pictures = 0;
    for (unsigned seed = 1; seed <= kTimelines; ++seed) {
        // The host renders what no node stands for at whole frames, so that edges between frames would part from it.
        const Json timeline = TimelineMaker(seed, kMediaFrames, false).Make();
        const std::string file = folder.Path("random.otio");
        std::ofstream(file) << timeline.dump();
        FilmOptions options;
        options.device = GetParam();
        options.mediaRoots = {folder.Path("")};
        options.width = 64;
        options.height = 36;
        const Film film = RenderFilm(file, options);
        Check("seed " + std::to_string(seed), ReadTimelineFile(file), film, numberOf);
        pictures += film.pictures.size();
        if (HasFailure()) return;
    }
    EXPECT_GT(pictures, 10U * kTimelines);
}

}  // namespace
}  // namespace Vantrel::Host::Test
