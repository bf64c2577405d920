// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// One timeline rendered in several ways must give one film: on either framework, and with too little memory.
#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>

#include "Host/Inspect/TestMedia.h"
#include "Tests/EndToEnd/Film.h"
#include "Tests/Host/TimelineText.h"

namespace Vantrel::Host::Test {
namespace {

struct Difference {
    int levels = 0;  ///< of 255
    std::string place;
};

/// The worst channel of two films' pictures.
Difference Compare(const Film& a, const Film& b) {
    Difference worst;
    EXPECT_EQ(a.pictures.size(), b.pictures.size());
    for (std::size_t i = 0; i < std::min(a.pictures.size(), b.pictures.size()); ++i) {
        const HostPicture& one = *a.pictures[i];
        const HostPicture& other = *b.pictures[i];
        EXPECT_TRUE(one.width == other.width && one.height == other.height);
        for (std::int32_t y = 0; y < one.height; ++y) {
            const auto* rowA = reinterpret_cast<const std::uint8_t*>(one.GetRow(y));
            const auto* rowB = reinterpret_cast<const std::uint8_t*>(other.GetRow(y));
            for (std::int32_t x = 0; x < 4 * one.width; ++x) {
                const int levels = std::abs(rowA[x] - rowB[x]);
                if (levels <= worst.levels) continue;
                worst.levels = levels;
                worst.place = "picture " + std::to_string(i) + ", channel " + std::to_string(x % 4) + " at " +
                              std::to_string(x / 4) + ", " + std::to_string(y) + ": " + std::to_string(rowA[x]) +
                              " and " + std::to_string(rowB[x]);
            }
        }
    }
    return worst;
}

class FilmsAgree : public testing::Test {
protected:
    KeptDevices mDevices;
};

TEST_F(FilmsAgree, OnBothFrameworksAtEveryQuality) {
    FilmOptions options;
    options.frames = {5, 30, 45, 85, 105, 150, 185, 215};
    for (const std::uint32_t quality : {1U, 2U, 3U, 4U}) {
        options.quality = quality;
        options.device = DeviceChoice::kCuda;
        const Film cuda = RenderFilm(VANTREL_EXAMPLES "/first-cut/first-cut.otio", options);
        options.device = DeviceChoice::kOpenCL;
        const Film opencl = RenderFilm(VANTREL_EXAMPLES "/first-cut/first-cut.otio", options);
        EXPECT_TRUE(cuda.failures.empty() && opencl.failures.empty());
        const Difference worst = Compare(cuda, opencl);
        // At the lowest quality CUDA works in half floats, whose steps near white are half a level wide.
        EXPECT_LE(worst.levels, quality == 1 ? 3 : 1) << "quality " << quality << ", " << worst.place;
    }
}

TEST_F(FilmsAgree, ExamplesOnBothFrameworksAndOnTheHost) {
    const struct {
        const char* name;
        std::vector<std::int64_t> frames;
    } examples[] = {{"adjustment", {10, 40, 70}},
                    {"multicam", {5, 25, 45, 65}},
                    {"nested", {5, 30, 60}},
                    {"time", {3, 24, 51}},
                    {"interlaced", {3, 26, 49, 63, 90}},
                    {"titles", {80, 110}},
                    {"grade", {3, 20, 30, 60, 77, 90}},
                    {"transitions", {3, 37, 65, 77, 118, 157, 205, 243, 278, 316, 362, 395}}};
    for (const auto& example : examples) {
        SCOPED_TRACE(example.name);
        const std::string file = std::string(VANTREL_EXAMPLES) + "/" + example.name + "/" + example.name + ".otio";
        FilmOptions options;
        options.width = 480;
        options.height = 270;
        options.frames = example.frames;
        options.deviceMemory = ~std::uint64_t{0};  // all of it: the limit outlives a session
        const Film cuda = RenderFilm(file, options);
        EXPECT_EQ(cuda.summary.hostFrames, 0);
        EXPECT_TRUE(cuda.failures.empty());
        options.device = DeviceChoice::kOpenCL;
        const Difference frameworks = Compare(cuda, RenderFilm(file, options));
        EXPECT_LE(frameworks.levels, 1) << frameworks.place;
        // A device on which no frame has room leaves all to the host.
        options.deviceMemory = 1;
        const Film host = RenderFilm(file, options);
        EXPECT_GT(host.summary.hostFrames, 0);
        const Difference renderers = Compare(cuda, host);
        EXPECT_LE(renderers.levels, 2) << renderers.place;
    }
}

/// By how many levels neighbouring pictures differ on the average, in the half that begins with a column.
double MeasureUnrest(const Film& film, std::int32_t from) {
    double sum = 0.0;
    for (std::size_t i = 1; i < film.pictures.size(); ++i) {
        const HostPicture& one = *film.pictures[i - 1];
        const HostPicture& other = *film.pictures[i];
        for (std::int32_t y = 0; y < one.height; ++y) {
            const auto* a = reinterpret_cast<const std::uint8_t*>(one.GetRow(y)) + std::ptrdiff_t{4} * from;
            const auto* b = reinterpret_cast<const std::uint8_t*>(other.GetRow(y)) + std::ptrdiff_t{4} * from;
            for (std::int32_t x = 0; x < 2 * one.width; ++x) sum += std::abs(a[x] - b[x]);
        }
    }
    const HostPicture& first = *film.pictures.front();
    return sum / (2.0 * first.width * first.height * static_cast<double>(film.pictures.size() - 1));
}

TEST_F(FilmsAgree, AShakyClipIsMadeSteadyOnBothFrameworks) {
    FilmOptions options;
    options.width = 480;
    options.height = 270;
    options.frames = {70, 71, 72, 73, 74};
    options.deviceMemory = ~std::uint64_t{0};
    const Film cuda = RenderFilm(VANTREL_EXAMPLES "/stabilizer/stabilizer.otio", options);
    EXPECT_TRUE(cuda.failures.empty());
    EXPECT_EQ(cuda.summary.hostFrames, 0);
    EXPECT_LT(MeasureUnrest(cuda, 240), 0.4 * MeasureUnrest(cuda, 0));
    options.device = DeviceChoice::kOpenCL;
    const Difference frameworks = Compare(cuda, RenderFilm(VANTREL_EXAMPLES "/stabilizer/stabilizer.otio", options));
    EXPECT_LE(frameworks.levels, 1) << frameworks.place;
}

class WithLittleMemory : public FilmsAgree {
protected:
    static constexpr std::int32_t kHeight = VANTREL_LARGE_HEIGHT;
    static constexpr std::int32_t kWidth = kHeight * 16 / 9;

    /// Three layers, of which two are drawn with motion, in a large picture.
    WithLittleMemory() {
        WriteTestMedia({{"a.mov", 1, 8, kFrame}, {"b.mov", 700, 8, kFrame}, {"c.mov", 5000, 8, kFrame}},
                       mFolder.Path(""), [](const std::string&) {});
        const auto layer = [](const char* name, Json effects) {
            return Track(
                {Clip(name, Range(0, 4), File(std::string(name) + ".mov", 0, 8), Effects(std::move(effects)))});
        };
        const Json motion = {{"0", {0.3, 0.6}}, {"1", 60.0}, {"3", true}, {"4", 20.0}};
        const Json timeline =
            Timeline({layer("a", Json::array()),
                      layer("b", {Effect("TQ.XQVE Opacity", {{"0", 80.0}}), Effect("TQ.XQVE Motion", motion)}),
                      layer("c", {Effect("TQ.XQVE Motion", {{"0", {0.7, 0.3}}, {"1", 40.0}, {"3", true}})})},
                     Own({{"sequence", {{"width", kWidth}, {"height", kHeight}, {"rate", 24}}}}));
        std::ofstream(mFile) << timeline.dump();
        mOptions.mediaRoots = {mFolder.Path("")};
        mOptions.frames = {1};
    }

    Folder mFolder{"vantrel-memory"};
    std::string mFile = mFolder.Path("layers.otio");
    FilmOptions mOptions;
};

TEST_F(WithLittleMemory, AFilmIsTheSame) {
    const Film untroubled = RenderFilm(mFile, mOptions);
    ASSERT_EQ(untroubled.pictures.size(), 1U);
    EXPECT_EQ(untroubled.summary.hostFrames, 0);
    FilmOptions little = mOptions;
    little.deviceMemory = std::uint64_t{50} * kWidth * kHeight;  // three pictures and a little more
    const Film troubled = RenderFilm(mFile, little);
    const Difference worst = Compare(untroubled, troubled);
    EXPECT_LE(worst.levels, 1) << worst.place;
}

TEST_F(WithLittleMemory, RefusedAllocationsDoNotShow) {
    const Film untroubled = RenderFilm(mFile, mOptions);
    const Kiln::DeviceRef device = Kiln::GetPrimaryDevice(Kiln::DeviceFramework::kCuda);
    for (const unsigned n : {2U, 3U, 5U}) {
        std::atomic<unsigned> count{0};
        device->GetDeviceMemory()->SetAllocationFilter([&](std::uint64_t) { return ++count % n == 0; });
        const Film troubled = RenderFilm(mFile, mOptions);
        device->GetDeviceMemory()->SetAllocationFilter({});
        EXPECT_GE(count, n);
        const Difference worst = Compare(untroubled, troubled);
        EXPECT_LE(worst.levels, 1) << "every " << n << "th refused, " << worst.place;
    }
}

}  // namespace
}  // namespace Vantrel::Host::Test
