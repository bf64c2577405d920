// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>

#include "Host/Media/FFmpegProbe.h"
#include "Host/Media/NumberPicture.h"
#include "Host/Software/Effects/Convert.h"
#include "Host/Software/SoftwareRenderer.h"
#include "Tests/Host/Render/Films.h"
#include "Tests/Host/TimelineText.h"
#include "Tests/Support/Pictures.h"

/// Timelines rendered by the host alone.
namespace Vantrel::Testing {

/// `metadata` of a timeline that fixes its format.
inline Host::Test::Json Format(int width, int height) {
    return Host::Test::Own({{"sequence", {{"width", width}, {"height", height}, {"rate", 24}}}});
}

/// A clip of one colour, components from 0 to 255.
inline Host::Test::Json Solid(int red, int green, int blue, double duration,
                              Host::Test::Json more = Host::Test::Json::object()) {
    return Host::Test::Clip("solid", Host::Test::Range(0, duration),
                            Host::Test::GeneratorOf("color", {{"color", {red, green, blue}}}), std::move(more));
}

/// A clip of a file with real frames.
inline Host::Test::Json FilmClip(const std::string& path, double start, double duration, double available,
                                 Host::Test::Json more = Host::Test::Json::object()) {
    Host::Test::Json media = {{"OTIO_SCHEMA", "ExternalReference.1"},
                              {"target_url", path},
                              {"available_range", Host::Test::Range(0, available)}};
    return Host::Test::Clip("film", Host::Test::Range(start, duration), media, std::move(more));
}

class Stage {
public:
    explicit Stage(const Host::Test::Json& timeline, bool strict = false)
        : mDocument(Host::Test::Read(timeline)),
          mSnapshot(Host::BuildSnapshot(mDocument, {}, mProbe, mIdentities)),
          mPool(Host::PixelBufferPool::Create()),
          mRenderer(Host::MakeSoftwareRenderer(mPool, std::make_shared<Host::MediaReader>(mPool, 1), strict)) {
        for (const std::string& warning : mSnapshot->warnings) ADD_FAILURE() << warning;
    }

    [[nodiscard]] Host::ISoftwareRenderer& GetRenderer() { return *mRenderer; }
    [[nodiscard]] const std::vector<std::string>& GetOffline() const { return mSnapshot->offline; }
    [[nodiscard]] const Host::Sequence& GetSequence() const { return *mSnapshot->top; }
    [[nodiscard]] const Host::Segment& SegmentAt(int frame) const {
        return *mSnapshot->top->plain.Find(frame * Host::Test::kFrame);
    }

    /// A request for the sequence's picture in some size.
    [[nodiscard]] VantrelRenderDescription Describe(int width, int height, std::uint32_t quality = 4) const {
        VantrelRenderDescription description{};
        description.pixelFormats = mFormats;
        description.pixelFormatCount = 2;
        description.width = width;
        description.height = height;
        description.aspectNumerator = GetSequence().format.aspectNumerator;
        description.aspectDenominator = GetSequence().format.aspectDenominator;
        description.quality = quality;
        return description;
    }
    /// One for bytes, which the first of its two formats doesn't give.
    [[nodiscard]] VantrelRenderDescription DescribeBytes(int width, int height) const {
        VantrelRenderDescription description = Describe(width, height);
        description.pixelFormats = mByteFormats;
        return description;
    }
    [[nodiscard]] Host::SequenceSize GetSize() const {
        const Host::SequenceFormat& format = GetSequence().format;
        return {format.width, format.height, {format.aspectNumerator, format.aspectDenominator}, format.frameTicks};
    }

    [[nodiscard]] Host::HostPictureRef RenderHost(int frame, const VantrelRenderDescription& description) {
        const Host::Segment& segment = SegmentAt(frame);
        const std::int64_t time = frame * Host::Test::kFrame - segment.start + segment.offset;
        return mRenderer->RenderNode(*segment.root, time, GetSize(), description);
    }
    /// The sequence's frame as floats, in its own size.
    [[nodiscard]] Picture Render(int frame) {
        const Host::SequenceFormat& format = GetSequence().format;
        const Host::HostPictureRef picture = RenderHost(frame, Describe(format.width, format.height));
        return Host::Software::ReadPicture(picture->pixels.get(), picture->rowBytes, picture->width, picture->height,
                                           picture->format, picture->alphaType);
    }

private:
    Host::FFmpegProbe mProbe;
    Host::IdentityBook mIdentities;
    Host::Document mDocument;
    Host::SnapshotPtr mSnapshot;
    std::shared_ptr<Host::PixelBufferPool> mPool;
    std::unique_ptr<Host::ISoftwareRenderer> mRenderer;
    std::uint32_t mFormats[2] = {Vellum::FourCC("bgrf"), 0};
    std::uint32_t mByteFormats[2] = {Vellum::FourCC("VUYA"), Vellum::FourCC("bgra")};
};

/// Expects a pixel, given as red, green, blue, alpha.
inline void ExpectPixel(const Picture& picture, int x, int y, const std::array<double, 4>& rgba,
                        double tolerance = 1e-5) {
    const std::size_t order[] = {2, 1, 0, 3};
    for (std::size_t c = 0; c < 4; ++c) {
        EXPECT_NEAR(static_cast<double>(picture.At(x, y)[order[c]]), rgba[c], tolerance)
            << "at " << x << ", " << y << ", "
            << "rgba"[c];
    }
}

}  // namespace Vantrel::Testing
