// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "Host/Media/FFmpegHandles.h"
#include "Host/Media/HostPicture.h"
#include "Host/Output/FrameWriter.h"

/// Small files for tests, made with FFmpeg's encoders.
namespace Vantrel::Testing {

/// A folder that is gone when this goes.
class ScratchFolder {
public:
    ScratchFolder();
    ~ScratchFolder();
    ScratchFolder(const ScratchFolder&) = delete;
    ScratchFolder& operator=(const ScratchFolder&) = delete;

    [[nodiscard]] std::string operator/(const std::string& name) const { return mPath + "/" + name; }
    /// Names of everything in it, sorted.
    [[nodiscard]] std::string List() const;

private:
    std::string mPath;
};

constexpr std::int64_t kTicks24 = 10584000000;
constexpr std::int64_t kTicks2997 = 8475667200;

/// A film through the host's own writer, in which frame n shows n + `first`.
void WriteNumberFilm(const std::string& path, int frames, std::int64_t ticksPerFrame = kTicks24,
                     std::uint32_t first = 0, int width = 64, int height = 64);

/// Fills a picture of 8 bits or of floats by a function of the place: blue, green, red, alpha.
void FillPicture(Host::HostPicture& picture, const std::function<std::array<float, 4>(int x, int y)>& at);

/// A picture through the host's own writer, filled by a function of the place: blue, green, red, alpha.
void WriteImage(const std::string& path, int width, int height,
                const std::function<std::array<float, 4>(int x, int y)>& at);

struct FilmPlan {
    const char* encoder = "ffv1";
    AVPixelFormat format = AV_PIX_FMT_YUV444P;
    int width = 64;
    int height = 64;
    int frames = 1;
    AVRational rate{24, 1};
    int bFrames = 0;
    int groupSize = 12;
    int rotation = 0;  ///< clockwise degrees that show it upright
    AVRational aspect{1, 1};
    AVFieldOrder fieldOrder = AV_FIELD_PROGRESSIVE;
};

/// A film of any codec; `draw` fills the frame of each number.
void WriteFilm(const std::string& path, const FilmPlan& plan, const std::function<void(AVFrame& frame, int n)>& draw);

/// Fills one plane of 8 or 16 bits.
void FillPlane(AVFrame& frame, int plane, int value);

}  // namespace Vantrel::Testing
