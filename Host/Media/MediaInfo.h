// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace Vantrel::Host {

/// What a file's alpha means, in the numbers that the engine reads.
enum class AlphaType : std::int32_t { kNone = 0, kStraight = 1, kPremultiplied = 2 };

/// Order of the fields in a frame, in the numbers that the engine reads.
enum class FieldType : std::uint32_t { kProgressive = 0, kTopFirst = 1, kBottomFirst = 2 };

/// Two probes of a file that hasn't changed give equal identities; everything derived from a frame hangs on them.
struct MediaIdentity {
    /// Absolute. For an image sequence that of its first image, for a generator its record as text.
    std::string path;
    std::int64_t sizeBytes = 0;
    /// Time of the last modification in nanoseconds since 1970.
    std::int64_t modified = 0;
    std::int32_t streamIndex = 0;
};

/// What is to be known of one file, image sequence or generator before any frame of it is decoded.
struct MediaInfo {
    MediaIdentity identity;
    /// In pixels, after rotation.
    std::int32_t width = 0;
    std::int32_t height = 0;
    /// Clockwise turn that a decoded frame needs: 0, 90, 180 or 270. `width` and `height` have it applied.
    std::int32_t rotation = 0;
    /// Of the picture after rotation; 1/1 where the file says nothing.
    std::int32_t pixelAspectNumerator = 1;
    std::int32_t pixelAspectDenominator = 1;
    /// Snapped to the exact rate (30000/1001 and its kin). 0 for a still: it takes the rate of its sequence.
    std::int64_t ticksPerFrame = 0;
    /// At least 1; 1 for a still. Before the first and after the last frame the nearest one is shown.
    std::int64_t frameCount = 1;
    FieldType fieldType = FieldType::kProgressive;
    AlphaType alphaType = AlphaType::kNone;
    /// 0xRRGGBB that premultiplied colour was laid over.
    std::uint32_t alphaMatteColor = 0;
    /// Four-character code of the codec, first character in the high byte; 0 if there is none.
    std::uint32_t codecTag = 0;
    /// The file's own start timecode, in ticks.
    std::optional<std::int64_t> startTimecode;
    bool still = false;
    /// Of one colour component as decoded.
    std::int32_t bitDepth = 8;
};

enum class MissingFramePolicy { kError, kHold, kBlack };

/// Numbered images that play as one film: image i is `PathOf(i)` and shows for one frame.
struct ImageSequence {
    /// Ends with the separator, or is empty.
    std::string directory;
    std::string prefix;
    std::string suffix;
    std::int64_t startNumber = 0;
    std::int64_t numberStep = 1;
    std::int32_t zeroPadding = 0;
    std::int64_t frameCount = 1;
    MissingFramePolicy missing = MissingFramePolicy::kError;

    [[nodiscard]] std::string PathOf(std::int64_t frame) const;
};

/// Either `info`, or `error` says why not, for a person: thing, place, reason.
struct MediaProbeResult {
    std::optional<MediaInfo> info;
    std::string error;
};

/// Looks into media without decoding more than it must. Probes may be called from several threads at once.
class IMediaProbe {
public:
    virtual ~IMediaProbe() = default;

    /// @param path absolute path of a film or a still image
    [[nodiscard]] virtual MediaProbeResult ProbeFile(const std::string& path) = 0;

    /// Asks whether a source of pictures exists that isn't a file ("testsrc2=size=64x64"). Size and rate that the text
    /// leaves open are those given; the answer never ends (`frameCount` is the largest number).
    /// @param source a source filter of libavfilter with its options
    [[nodiscard]] virtual MediaProbeResult ProbeFilterSource(const std::string& source, std::int32_t width,
                                                             std::int32_t height, std::int64_t ticksPerFrame) = 0;
};

}  // namespace Vantrel::Host
