// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/EndToEnd/BarFilm.h"

#include <cmath>
#include <fstream>

#include "Host/Output/FrameWriter.h"

namespace Vantrel::Host::Test {
namespace {

constexpr int kWidth = 192;
constexpr int kHeight = 80;

void DrawBar(HostPicture& picture, int line, double middle) {
    auto* row = reinterpret_cast<std::uint32_t*>(picture.GetRow(line));
    for (int x = 0; x < picture.width; ++x) row[x] = std::abs(x + 0.5 - middle) < 4.0 ? 0xFFFFFFFFU : 0xFF000000U;
}

}  // namespace

double FindBar(const HostPicture& picture, int firstLine, int step) {
    double sum = 0;
    double weight = 0;
    for (int y = firstLine; y < picture.height; y += step) {
        const auto* row = reinterpret_cast<const std::uint8_t*>(picture.GetRow(y));
        for (int x = 0; x < picture.width; ++x) {
            // What encoding leaves on black doesn't count.
            const double level = row[4 * x + 1] > 16 ? row[4 * x + 1] : 0.0;
            sum += level * (x + 0.5);
            weight += level;
        }
    }
    return weight > 0 ? sum / weight : -1;
}

void WriteBarFilm(const std::string& path, std::uint32_t drawn, std::uint32_t claimed) {
    OutputFormat format;
    format.path = path;
    format.width = kWidth;
    format.height = kHeight;
    format.rate = Vellum::FrameRate::Create(kFrame);
    format.fieldType = claimed;
    const auto writer = CreateFrameWriter(format, kBarFrames);
    const auto pool = PixelBufferPool::Create();
    const auto picture = MakeHostPicture(*pool, Vellum::kPixelFormat_BGRA_4444_8u, kWidth, kHeight);
    for (int frame = 0; frame < kBarFrames; ++frame) {
        for (int y = 0; y < kHeight; ++y) {
            const bool later = drawn != 0 && (drawn == Vellum::kFieldType_UpperFirst) == (y % 2 == 1);
            DrawBar(*picture, y, PlaceOf(2 * frame + (later ? 1 : 0)));
        }
        writer->Write(*picture, frame);
    }
    writer->Finish();
}

std::string NameOfDevice(const testing::TestParamInfo<DeviceChoice>& info) {
    return info.param == DeviceChoice::kCuda ? "Cuda" : "OpenCL";
}

std::unique_ptr<KeptDevices> BarFilms::sDevices;

Film BarFilms::Render(const Json& clip, std::uint32_t fieldType, std::uint64_t deviceMemory) {
    const Json sequence = {{"width", kWidth}, {"height", kHeight}, {"rate", kRate}, {"fields", fieldType}};
    std::ofstream(mFolder.Path("bar.otio")) << Timeline({Track({clip})}, Own({{"sequence", sequence}})).dump();
    FilmOptions options;
    options.device = GetParam();
    options.mediaRoots = {mFolder.Path("")};
    options.quality = 2;
    options.deviceMemory = deviceMemory;
    Film film = RenderFilm(mFolder.Path("bar.otio"), options);
    for (const HostPictureRef& picture : film.pictures) {
        // A picture in which nothing moves may have no fields, one for progressive frames those of its media.
        EXPECT_TRUE(fieldType == 0 || picture->fieldType == fieldType ||
                    std::abs(FindBar(*picture, 0) - FindBar(*picture, 1)) < 0.1);
    }
    return film;
}

}  // namespace Vantrel::Host::Test
