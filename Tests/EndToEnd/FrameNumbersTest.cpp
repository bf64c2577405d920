// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// Films whose frames show their numbers: each picture must show the frames that the timeline's items, looked at
// directly, say.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <map>
#include <random>

#include "Host/Inspect/TestMedia.h"
#include "Host/Media/FFmpegProbe.h"
#include "Host/Media/NumberPicture.h"
#include "Host/Timeline/OtioReader.h"
#include "Tests/EndToEnd/Film.h"
#include "Tests/Host/DirectEvaluator.h"
#include "Tests/Host/TimelineMaker.h"

namespace Vantrel::Host::Test {
namespace {

/// Compression and scaling leave the middle of a square this near to black or white; where a picture is moved, the
/// softened border of a square may lie in the middle of another.
constexpr double kTolerance = 0.05;
constexpr double kMovedTolerance = 0.12;
constexpr std::int32_t kWidth = 64;
constexpr std::int32_t kHeight = 36;

/// A picture in grey, the levels weighed by their alpha.
struct Canvas {
    struct Pixel {
        double level = 0;
        double alpha = 0;
    };
    std::vector<Pixel> pixels = std::vector<Pixel>(std::size_t{kWidth} * kHeight);
    bool moved = false;

    [[nodiscard]] Pixel& At(int x, int y) { return pixels[static_cast<std::size_t>(y * kWidth + x)]; }

    [[nodiscard]] static Canvas Plain(double level) {
        Canvas canvas;
        for (Pixel& pixel : canvas.pixels) pixel = {level, 1};
        return canvas;
    }
    /// What `combine` makes of each pixel and the other's.
    template <class Combine>
    Canvas& Each(const Canvas& other, const Combine& combine) {
        for (std::size_t i = 0; i < pixels.size(); ++i) pixels[i] = combine(pixels[i], other.pixels[i]);
        moved = moved || other.moved;
        return *this;
    }
    /// The same over black, as a film shows it: 16 numbers for the squares' middles.
    [[nodiscard]] std::array<double, kNumberBits> Read() const {
        const auto pool = PixelBufferPool::Create();
        const auto picture = MakeHostPicture(*pool, Vellum::kPixelFormat_BGRA_4444_8u, kWidth, kHeight);
        for (std::int32_t y = 0; y < kHeight; ++y) {
            auto* const row = reinterpret_cast<std::uint8_t*>(picture->GetRow(y));
            for (std::int32_t x = 0; x < 4 * kWidth; ++x) {
                const double level = pixels[static_cast<std::size_t>(y * kWidth + x / 4)].level;
                row[x] = static_cast<std::uint8_t>(std::lround(255 * std::clamp(level, 0.0, 1.0)));
            }
        }
        return ReadSquares(*picture);
    }
};

Canvas Mix(Canvas a, const Canvas& b, double weightA, double weightB) {
    return a.Each(b, [=](const Canvas::Pixel& one, const Canvas::Pixel& other) {
        return Canvas::Pixel{weightA * one.level + weightB * other.level, weightA * one.alpha + weightB * other.alpha};
    });
}

/// Light mixes, not levels.
Canvas MixFilm(Canvas a, const Canvas& b, double fraction) {
    return a.Each(b, [=](const Canvas::Pixel& one, const Canvas::Pixel& other) {
        const auto light = [](const Canvas::Pixel& p) { return p.alpha > 0 ? std::pow(p.level / p.alpha, 2.2) : 0; };
        const double weightA = (1 - fraction) * one.alpha, weightB = fraction * other.alpha, alpha = weightA + weightB;
        if (alpha <= 0) return Canvas::Pixel{};
        const double mixed = (weightA * light(one) + weightB * light(other)) / alpha;
        return Canvas::Pixel{alpha * std::pow(mixed, 1 / 2.2), alpha};
    });
}

/// The incoming picture shoves the outgoing one out; reversed, the outgoing one is drawn back over it.
Canvas Push(Canvas outgoing, Canvas incoming, double fraction, const Item& transition) {
    std::map<std::string, std::string> properties(transition.properties.begin(), transition.properties.end());
    const auto number = [&](const char* key) {
        const std::string& text = properties[std::string("TransitionNode::Transition") + key];
        return text.empty() ? 0 : std::stoi(text);
    };
    const bool reverse = number("Reverse") != 0;
    if (reverse) std::swap(outgoing, incoming);
    const int direction = number("Direction");
    const bool vertical = direction == 1 || direction == 4, towardsStart = direction == 2 || direction == 4;
    const int length = vertical ? kHeight : kWidth;
    const int shift = static_cast<int>((reverse ? 1 - fraction : fraction) * length + 0.5);
    Canvas result;
    for (int y = 0; y < kHeight; ++y) {
        for (int x = 0; x < kWidth; ++x) {
            // Measured from the edge at which the incoming picture enters.
            const int at = vertical ? y : x;
            const int place = towardsStart ? length - 1 - at : at;
            const auto from = [&](Canvas& canvas, int along) {
                const int source = towardsStart ? length - 1 - along : along;
                return vertical ? canvas.At(x, source) : canvas.At(source, y);
            };
            result.At(x, y) = place < shift ? from(incoming, length - shift + place) : from(outgoing, place - shift);
        }
    }
    result.moved = true;
    return result;
}

Canvas Transition(const Canvas& outgoing, const Canvas& incoming, double fraction, const Item& transition) {
    const std::string& name = transition.matchName;
    if (name == "XQVE Push") return Push(outgoing, incoming, fraction, transition);
    if (name == "XQVE Film Dissolve") return MixFilm(outgoing, incoming, fraction);
    if (name == "XQVE Additive Dissolve") {
        Canvas sum = Mix(outgoing, incoming, std::min(1.0, 2 - 2 * fraction), std::min(1.0, 2 * fraction));
        for (Canvas::Pixel& pixel : sum.pixels) {
            pixel.alpha = std::min(pixel.alpha, 1.0);
        }
        return sum;
    }
    if (name.rfind("XQVE Dip", 0) == 0) {
        const Canvas color = Canvas::Plain(name == "XQVE Dip To White" ? 1 : 0);
        return fraction <= 0.5 ? Mix(outgoing, color, 1 - 2 * fraction, 2 * fraction)
                               : Mix(color, incoming, 2 - 2 * fraction, 2 * fraction - 1);
    }
    return Mix(outgoing, incoming, 1 - fraction, fraction);
}

/// `numberOf` gives the number that a media frame shows.
Canvas Paint(const Sight& sight, const std::function<std::int64_t(const Shown&)>& numberOf) {
    Canvas canvas;
    switch (sight.kind) {
        case Sight::Kind::kFrame: {
            const std::int64_t number = numberOf(sight.frame);
            for (int y = 0; y < kHeight; ++y) {
                for (int x = 0; x < kWidth; ++x) {
                    const int square = 4 * (4 * y / kHeight) + 4 * x / kWidth;
                    canvas.At(x, y) = {number >> (kNumberBits - 1 - square) & 1 ? 1.0 : 0.0, 1};
                }
            }
            break;
        }
        case Sight::Kind::kPlain:
            return Canvas::Plain(sight.level);
        case Sight::Kind::kLayers:
            for (const Sight& part : sight.parts) {
                canvas.Each(Paint(part, numberOf), [](const Canvas::Pixel& below, const Canvas::Pixel& top) {
                    return Canvas::Pixel{top.level + below.level * (1 - top.alpha),
                                         top.alpha + below.alpha * (1 - top.alpha)};
                });
            }
            break;
        case Sight::Kind::kSum:
            for (std::size_t i = 0; i < sight.parts.size(); ++i) {
                canvas = Mix(canvas, Paint(sight.parts[i], numberOf), 1, sight.weights[i]);
            }
            break;
        case Sight::Kind::kInverted:
            canvas = Paint(sight.parts[0], numberOf);
            for (Canvas::Pixel& pixel : canvas.pixels) pixel.level = pixel.alpha - pixel.level;
            break;
        case Sight::Kind::kTransition:
            return Transition(Paint(sight.parts[0], numberOf), Paint(sight.parts[1], numberOf), sight.fraction,
                              *sight.item);
        case Sight::Kind::kAdjustment:
            break;
    }
    return canvas;
}

/// The frames of media in a picture, for whoever looks for a fault.
std::string Tell(const Sight& sight) {
    static const char* const kNames[] = {"", "plain", "layers", "transition", "sum", "inverted", "adjustment"};
    if (sight.kind == Sight::Kind::kFrame) {
        return std::filesystem::path(sight.frame.media).stem().string() + "[" + std::to_string(sight.frame.frame) + "]";
    }
    std::string text = sight.kind == Sight::Kind::kTransition
                           ? sight.item->matchName + " at " + std::to_string(sight.fraction)
                           : kNames[static_cast<int>(sight.kind)];
    text += "(";
    for (std::size_t i = 0; i < sight.parts.size(); ++i) {
        text += (i > 0 ? ", " : "") + Tell(sight.parts[i]);
        if (i < sight.weights.size()) text += " * " + std::to_string(sight.weights[i]);
    }
    return text + ")";
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

/// Compares the pictures of a rendered film with the evaluator; `frames` are their places, every one if empty.
/// @return how many are wrong; after five it looks no further
std::size_t Check(const std::string& what, const Document& document, const Film& film,
                  const std::vector<std::int64_t>& frames, const std::function<std::int64_t(const Shown&)>& numberOf) {
    EXPECT_TRUE(film.failures.empty()) << what << ": " << (film.failures.empty() ? "" : film.failures.front());
    DirectEvaluator evaluator(document, film.frameTicks);
    std::size_t wrong = 0;
    for (std::size_t i = 0; i < film.pictures.size(); ++i) {
        const std::int64_t frame = frames.empty() ? static_cast<std::int64_t>(i) : frames[i];
        const Sight sight = evaluator.SightAt(frame * film.frameTicks);
        if (evaluator.IsDoubtful() || ShowsUnknown(sight, numberOf)) continue;
        const Canvas canvas = Paint(sight, numberOf);
        const std::array<double, kNumberBits> expected = canvas.Read();
        const std::array<double, kNumberBits> seen = ReadSquares(*film.pictures[i]);
        const double tolerance = canvas.moved ? kMovedTolerance : kTolerance;
        const bool right = std::equal(seen.begin(), seen.end(), expected.begin(),
                                      [=](double a, double b) { return std::abs(a - b) <= tolerance; });
        if (right) continue;
        ADD_FAILURE() << what << ", frame " << frame << ", at " << frame * film.frameTicks << " ticks: " << Tell(sight)
                      << "\nexpected: " << ToText(expected) << "\nseen:     " << ToText(seen);
        if (++wrong == 5) break;
    }
    return wrong;
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
        options.width = kWidth;
        options.height = kHeight;
        const Film film = RenderFilm(file, options);
        const auto numberOf = [&plans](const Shown& shown) {
            for (const TestMediaPlan& plan : plans) {
                if (std::filesystem::path(plan.name).stem() == std::filesystem::path(shown.media).stem()) {
                    return plan.firstFrame + std::clamp<std::int64_t>(shown.frame, 0, plan.frameCount - 1);
                }
            }
            return std::int64_t{-1};
        };
        Check(name, document, film, {}, numberOf);
        ++samples;
    }
    EXPECT_EQ(samples, 6U);
}

/// How many random timelines are rendered, unless VANTREL_RANDOM_TIMELINES in the environment says otherwise.
unsigned CountTimelines() {
    constexpr unsigned kTimelines = VANTREL_RANDOM_TIMELINES;
    const char* const wanted = std::getenv("VANTREL_RANDOM_TIMELINES");
    return wanted ? static_cast<unsigned>(std::stoul(wanted)) : kTimelines;
}

/// One to three frames of a film, not in order.
std::vector<std::int64_t> SampleFrames(unsigned seed, std::int64_t count) {
    std::mt19937 random(seed);
    std::vector<std::int64_t> frames(1 + random() % 3);
    for (std::int64_t& frame : frames) frame = static_cast<std::int64_t>(random() % static_cast<unsigned>(count));
    return frames;
}

TEST_P(FrameNumbers, OfRandomTimelinesAreThoseOfTheirItems) {
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
    // One timeline alone, with its text: VANTREL_RANDOM_SEED.
    const char* const only = std::getenv("VANTREL_RANDOM_SEED");
    const unsigned timelines = CountTimelines();
    std::size_t pictures = 0;
    std::size_t faults = 0;
    for (unsigned seed = only ? static_cast<unsigned>(std::stoul(only)) : 1; seed <= timelines && faults < 20; ++seed) {
        const Json timeline = TimelineMaker(seed, kMediaFrames).Make();
        const std::string file = folder.Path("random.otio");
        std::ofstream(file) << timeline.dump();
        if (only) std::cout << timeline.dump(1) << std::endl;
        FilmOptions options;
        options.device = GetParam();
        options.mediaRoots = {folder.Path("")};
        options.width = kWidth;
        options.height = kHeight;
        options.choose = [&](std::int64_t count) { return SampleFrames(seed, count); };
        const Film film = RenderFilm(file, options);
        faults += Check("seed " + std::to_string(seed), ReadTimelineFile(file), film, film.frames, numberOf);
        pictures += film.pictures.size();
        if (only) break;
    }
    EXPECT_GE(pictures, only ? 1 : timelines);
}

}  // namespace
}  // namespace Vantrel::Host::Test
