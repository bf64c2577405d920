// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Media/FFmpegProbe.h"

#include <sys/stat.h>

#include <cerrno>
#include <cstring>
#include <limits>
#include <map>
#include <mutex>

#include "Host/Media/FilterSourceReader.h"
#include "Host/Media/PictureConverter.h"
#include "Host/Media/VideoFile.h"
#include "Host/Time/ExactTime.h"

extern "C" {
#include <libavutil/pixdesc.h>
#include <libavutil/timecode.h>
}

namespace Vantrel::Host {

namespace {

std::int64_t SnappedTicks(AVRational rate) {
    if (rate.num <= 0 || rate.den <= 0) return 0;
    const std::optional<Rate> snapped = SnapRate(av_q2d(rate));
    return snapped ? TicksPerFrame(*snapped) : 0;
}

std::optional<std::int64_t> ReadTimecode(const VideoStreamInfo& stream, std::int64_t ticksPerFrame) {
    if (stream.timecode.empty() || ticksPerFrame <= 0) return std::nullopt;
    AVTimecode timecode{};
    if (av_timecode_init_from_string(&timecode, stream.frameRate, stream.timecode.c_str(), nullptr) < 0) {
        return std::nullopt;
    }
    return timecode.start * ticksPerFrame;
}

void SetPicture(MediaInfo& info, std::int32_t width, std::int32_t height, AVRational aspect, int rotation) {
    const bool quarter = rotation % 180 != 0;
    info.rotation = rotation;
    info.width = quarter ? height : width;
    info.height = quarter ? width : height;
    info.pixelAspectNumerator = quarter ? aspect.den : aspect.num;
    info.pixelAspectDenominator = quarter ? aspect.num : aspect.den;
}

MediaInfo Describe(const VideoFile& file) {
    const VideoStreamInfo& stream = file.GetInfo();
    MediaInfo info;
    SetPicture(info, stream.width, stream.height, stream.sampleAspect, stream.rotation);
    info.still = stream.still;
    info.ticksPerFrame = stream.still ? 0 : SnappedTicks(stream.frameRate);
    info.still = info.still || info.ticksPerFrame == 0;
    info.frameCount = info.still ? 1 : stream.frameCount;
    if (stream.interlaced) info.fieldType = stream.upperFieldFirst ? FieldType::kTopFirst : FieldType::kBottomFirst;
    // OpenEXR has colour multiplied by alpha; every other form that keeps alpha has it straight.
    const AlphaType form = stream.codecName == "exr" ? AlphaType::kPremultiplied : AlphaType::kStraight;
    info.alphaType = stream.hasAlpha ? form : AlphaType::kNone;
    info.codecTag = stream.codecTag;
    info.startTimecode = ReadTimecode(stream, info.ticksPerFrame);
    info.bitDepth = stream.bitDepth;
    info.identity.streamIndex = stream.streamIndex;
    return info;
}

}  // namespace

struct FFmpegProbe::Memory {
    std::mutex mutex;
    std::map<std::string, MediaInfo> infos;
};

FFmpegProbe::FFmpegProbe() : mMemory(std::make_unique<Memory>()) {}

FFmpegProbe::~FFmpegProbe() = default;

MediaProbeResult FFmpegProbe::ProbeFile(const std::string& path) {
    struct stat status {};
    if (stat(path.c_str(), &status) != 0) return {std::nullopt, path + " can't be opened: " + std::strerror(errno)};
    const std::int64_t modified = status.st_mtim.tv_sec * std::int64_t{1000000000} + status.st_mtim.tv_nsec;
    {
        const std::lock_guard<std::mutex> hold(mMemory->mutex);
        const auto known = mMemory->infos.find(path);
        if (known != mMemory->infos.end() && known->second.identity.sizeBytes == status.st_size &&
            known->second.identity.modified == modified) {
            return {known->second, {}};
        }
    }
    try {
        const VideoFile file(path, 1);
        MediaInfo info = Describe(file);
        info.identity.path = path;
        info.identity.sizeBytes = status.st_size;
        info.identity.modified = modified;
        const std::lock_guard<std::mutex> hold(mMemory->mutex);
        mMemory->infos[path] = info;
        return {info, {}};
    } catch (const MediaError& error) {
        return {std::nullopt, error.what()};
    }
}

MediaProbeResult FFmpegProbe::ProbeFilterSource(const std::string& source, std::int32_t width, std::int32_t height,
                                                std::int64_t ticksPerFrame) {
    try {
        AVRational rate{};
        av_reduce(&rate.num, &rate.den, Vellum::kTicksPerSecond, ticksPerFrame, INT32_MAX);
        const FilterSourceReader filter(source, width, height, rate);
        MediaInfo info;
        SetPicture(info, filter.GetWidth(), filter.GetHeight(), filter.GetSampleAspect(), 0);
        info.ticksPerFrame = SnappedTicks(filter.GetFrameRate());
        if (info.ticksPerFrame == 0) info.ticksPerFrame = ticksPerFrame;
        info.frameCount = std::numeric_limits<std::int64_t>::max();
        const AVPixFmtDescriptor* format = av_pix_fmt_desc_get(static_cast<AVPixelFormat>(filter.GetPixelFormat()));
        if (format && (format->flags & AV_PIX_FMT_FLAG_ALPHA) != 0) info.alphaType = AlphaType::kStraight;
        info.bitDepth = format ? format->comp[0].depth : 8;
        info.identity.path = source;
        return {info, {}};
    } catch (const MediaError& error) {
        return {std::nullopt, error.what()};
    }
}

}  // namespace Vantrel::Host
