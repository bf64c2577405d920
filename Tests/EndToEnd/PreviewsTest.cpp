// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// Segments that have a rendered preview play it, from the moment on that they show.
#include <fstream>

#include "Host/Inspect/TestMedia.h"
#include "Host/Media/NumberPicture.h"
#include "Host/Output/FrameWriter.h"
#include "Tests/EndToEnd/BarFilm.h"

namespace Vantrel::Host::Test {
namespace {

constexpr int kFirst = 700;

class Previews : public BarFilms {
protected:
    /// Two clips, a title over the middle of the first, which cuts it in three.
    Previews() {
        WriteTestMedia({{"a.mov", 0, 20, kFrame}, {"b.mov", 100, 20, kFrame}}, mFolder.Path(""),
                       [](const std::string&) {});
        const Json cut = Timeline(
            {Track({Clip("a", Range(2, 12), File("a.mov", 0, 20)), Clip("b", Range(0, 4), File("b.mov", 0, 20))}),
             Track({Gap(5), Clip("t", Range(0, 2), GeneratorOf("transparent"))})},
            Own({{"sequence", {{"width", 320}, {"height", 180}, {"rate", kRate}}}}));
        std::ofstream(mFile) << cut.dump();
        mOptions.previews = mFolder.Path("previews");
        std::filesystem::create_directory(mOptions.previews);
        mOptions.device = GetParam();
        mOptions.mediaRoots = {mFolder.Path("")};
        mOptions.quality = 3;
    }
    /// A preview of the first clip, with a number of its own on each frame.
    void WritePreview(int width, int height) {
        SessionOptions session;
        session.file = mFile;
        session.snapshot.mediaRoots = mOptions.mediaRoots;
        session.device = GetParam();
        OutputFormat format;
        format.path = mOptions.previews + "/" +
                      RenderSession(session).GetSequence().plain.segments.front().root->hash.ToString() + ".mov";
        format.width = width;
        format.height = height;
        format.rate = Vellum::FrameRate::Create(kFrame);
        const auto writer = CreateFrameWriter(format, 12);
        const auto pool = PixelBufferPool::Create();
        const auto picture = MakeHostPicture(*pool, Vellum::kPixelFormat_BGRA_4444_8u, width, height);
        for (int i = 0; i < 12; ++i) {
            DrawNumber(*picture, static_cast<std::uint32_t>(kFirst + i));
            writer->Write(*picture, i);
        }
        writer->Finish();
    }
    std::vector<std::int64_t> Numbers(bool beside) {
        std::vector<std::int64_t> numbers;
        for (const HostPictureRef& picture : RenderFilm(mFile, mOptions).pictures) {
            EXPECT_TRUE(picture->width == 320 && picture->height == 180);
            // A square preview stands in the middle.
            HostPicture middle = *picture;
            if (beside && numbers.size() < 12 && (numbers.size() < 5 || numbers.size() > 6)) {
                middle.pixels = std::shared_ptr<std::byte>(picture->pixels, picture->pixels.get() + 4 * 70);
                middle.width = 180;
                EXPECT_EQ(static_cast<int>(picture->GetRow(90)[4 * 60]), 0) << "beside the preview";
            }
            numbers.push_back(ReadNumber(middle));
        }
        return numbers;
    }

    std::string mFile = mFolder.Path("cut.otio");
    FilmOptions mOptions;
};

INSTANTIATE_TEST_SUITE_P(OnEachDevice, Previews, testing::Values(DeviceChoice::kCuda, DeviceChoice::kOpenCL),
                         NameOfDevice);

TEST_P(Previews, PlayInPlaceOfTheirSegments) {
    EXPECT_EQ(Numbers(false), (std::vector<std::int64_t>{2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 100, 101, 102, 103}));
    const std::vector<std::int64_t> played{700, 701, 702, 703, 704, 7, 8, 707, 708, 709, 710, 711, 100, 101, 102, 103};
    for (const int width : {320, 640, 180}) {
        WritePreview(width, width == 180 ? 180 : width * 9 / 16);
        EXPECT_EQ(Numbers(width == 180), played) << width;
    }
}

}  // namespace
}  // namespace Vantrel::Host::Test
