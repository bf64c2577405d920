// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Media/VideoFile.h"

#include <algorithm>
#include <cmath>

extern "C" {
#include <libavutil/display.h>
#include <libavutil/pixdesc.h>
}

namespace Vantrel::Host {

namespace {

/// Running on is cheaper than a seek up to about the length of a group of pictures.
constexpr std::int64_t kRunForwardFrames = 48;
/// Files up to this size are read through where nothing else tells their length.
constexpr std::int64_t kScannedBytes = std::int64_t{128} << 20;

std::uint32_t SwapCodecTag(std::uint32_t tag) {
    return tag << 24 | (tag & 0xFF00U) << 8 | (tag >> 8 & 0xFF00U) | tag >> 24;
}

int ReadRotation(const AVStream& stream) {
    const auto* matrix =
        reinterpret_cast<const std::int32_t*>(av_stream_get_side_data(&stream, AV_PKT_DATA_DISPLAYMATRIX, nullptr));
    if (!matrix) return 0;
    const double degrees = -av_display_rotation_get(matrix);
    if (std::isnan(degrees)) return 0;
    const int quarters = static_cast<int>(std::lround(degrees / 90.0));
    return (quarters % 4 + 4) % 4 * 90;
}

std::string FindTimecode(const AVFormatContext& input, const AVStream& video) {
    if (const AVDictionaryEntry* entry = av_dict_get(video.metadata, "timecode", nullptr, 0)) return entry->value;
    for (unsigned i = 0; i < input.nb_streams; ++i) {
        if (const AVDictionaryEntry* entry = av_dict_get(input.streams[i]->metadata, "timecode", nullptr, 0)) {
            return entry->value;
        }
    }
    if (const AVDictionaryEntry* entry = av_dict_get(input.metadata, "timecode", nullptr, 0)) return entry->value;
    return {};
}

bool IsStillContainer(const AVFormatContext& input) {
    const std::string name = input.iformat->name;
    return name == "image2" || (name.size() > 5 && name.compare(name.size() - 5, 5, "_pipe") == 0);
}

}  // namespace

VideoFile::VideoFile(const std::string& path, int threads) : mPath(path) {
    AVFormatContext* input = nullptr;
    if (const int code = avformat_open_input(&input, path.c_str(), nullptr, nullptr); code < 0) {
        Fail("can't be opened", code);
    }
    mInput.reset(input);
    if (const int code = avformat_find_stream_info(input, nullptr); code < 0) Fail("can't be read", code);
    OpenStream(threads);
    ReadInfo();
}

void VideoFile::OpenStream(int threads) {
    const int index = av_find_best_stream(mInput.get(), AVMEDIA_TYPE_VIDEO, -1, -1, nullptr, 0);
    if (index < 0) throw MediaError(mPath + " has no video");
    mStream = mInput->streams[index];
    for (unsigned i = 0; i < mInput->nb_streams; ++i) {
        if (static_cast<int>(i) != index) mInput->streams[i]->discard = AVDISCARD_ALL;
    }
    const AVCodec* codec = avcodec_find_decoder(mStream->codecpar->codec_id);
    if (!codec) {
        throw MediaError(mPath + ": no decoder for " + avcodec_get_name(mStream->codecpar->codec_id) + " video");
    }
    mDecoder.reset(avcodec_alloc_context3(codec));
    if (!mDecoder) throw std::bad_alloc();
    int code = avcodec_parameters_to_context(mDecoder.get(), mStream->codecpar);
    if (code < 0) Fail("has a broken video stream", code);
    mDecoder->thread_count = threads;
    mDecoder->pkt_timebase = mStream->time_base;
    code = avcodec_open2(mDecoder.get(), codec, nullptr);
    if (code < 0) Fail("can't be decoded", code);
}

void VideoFile::ReadInfo() {
    const AVCodecParameters& parameters = *mStream->codecpar;
    mInfo.streamIndex = mStream->index;
    mInfo.width = parameters.width;
    mInfo.height = parameters.height;
    if (mInfo.width <= 0 || mInfo.height <= 0) throw MediaError(mPath + " doesn't tell the size of its picture");
    mInfo.rotation = ReadRotation(*mStream);
    mInfo.sampleAspect = av_guess_sample_aspect_ratio(mInput.get(), mStream, nullptr);
    if (mInfo.sampleAspect.num <= 0 || mInfo.sampleAspect.den <= 0) mInfo.sampleAspect = {1, 1};
    mInfo.frameRate = av_guess_frame_rate(mInput.get(), mStream, nullptr);
    mInfo.codecTag = SwapCodecTag(parameters.codec_tag);
    mInfo.codecName = avcodec_get_name(parameters.codec_id);
    mInfo.timecode = FindTimecode(*mInput, *mStream);
    mInfo.interlaced = parameters.field_order > AV_FIELD_PROGRESSIVE;
    mInfo.upperFieldFirst = parameters.field_order != AV_FIELD_BB && parameters.field_order != AV_FIELD_BT;
    if (const AVPixFmtDescriptor* format = av_pix_fmt_desc_get(static_cast<AVPixelFormat>(parameters.format))) {
        mInfo.hasAlpha = (format->flags & AV_PIX_FMT_FLAG_ALPHA) != 0;
        mInfo.bitDepth = format->comp[0].depth;
    }
    mFirstTimestamp = mStream->start_time == AV_NOPTS_VALUE ? 0 : mStream->start_time;

    const bool rateKnown = mInfo.frameRate.num > 0 && mInfo.frameRate.den > 0;
    mInfo.still = IsStillContainer(*mInput) || mStream->nb_frames == 1;
    if (mInfo.still || !rateKnown) {
        mInfo.frameCount = 1;
        return;
    }
    CountFrames();
}

void VideoFile::CountFrames() {
    const AVRational average = mStream->avg_frame_rate;
    // Containers round time stamps, so that the average rate of a constant stream strays a little.
    const bool varies = average.num > 0 && std::abs(av_q2d(average) / av_q2d(mInfo.frameRate) - 1.0) > 0.01;
    if (!varies && mStream->nb_frames > 0) {
        mInfo.frameCount = mStream->nb_frames;
        mCountIsExact = true;
        return;
    }
    const double seconds = mStream->duration > 0 ? static_cast<double>(mStream->duration) * av_q2d(mStream->time_base)
                                                 : static_cast<double>(mInput->duration) / AV_TIME_BASE;
    mInfo.frameCount = std::max<std::int64_t>(1, std::llround(seconds * av_q2d(mInfo.frameRate)));
    // Streams without an index tell their length by their last time stamps only, which is a few frames short.
    const bool guessed = mInput->duration_estimation_method != AVFMT_DURATION_FROM_STREAM && mInput->pb &&
                         avio_size(mInput->pb) <= kScannedBytes;
    if (!varies && !guessed) return;
    std::int64_t count = 0;
    const bool timed = ScanPackets(count);
    if (count > 0) {
        mInfo.frameCount = count;
        mCountIsExact = true;
    }
    if (!varies || !timed) mTimestamps.clear();
    SeekBefore(0);
}

bool VideoFile::ScanPackets(std::int64_t& count) {
    while (av_read_frame(mInput.get(), mPacket.get()) >= 0) {
        if (mPacket->stream_index == mStream->index) {
            ++count;
            if (mPacket->pts != AV_NOPTS_VALUE) mTimestamps.push_back(mPacket->pts);
        }
        av_packet_unref(mPacket.get());
    }
    std::sort(mTimestamps.begin(), mTimestamps.end());
    return static_cast<std::int64_t>(mTimestamps.size()) == count;
}

std::int64_t VideoFile::NumberOf(std::int64_t pts) const {
    if (mInfo.frameCount == 1 && mInfo.still) return 0;
    if (!mTimestamps.empty()) {
        return std::lower_bound(mTimestamps.begin(), mTimestamps.end(), pts) - mTimestamps.begin();
    }
    return av_rescale_q_rnd(pts - mFirstTimestamp, mStream->time_base, av_inv_q(mInfo.frameRate), AV_ROUND_NEAR_INF);
}

std::int64_t VideoFile::NumberOfDecoded() {
    // Some containers tell when packets are decoded, not when frames are shown: a frame then comes out when the packet
    // goes in that lies the decoder's delay later. Their key frames have no time of their own.
    if (!mLast && mDecoded->key_frame != 0 && mDecoded->pts == AV_NOPTS_VALUE) mHasDecodingTimes = true;
    const std::int64_t pts = mDecoded->best_effort_timestamp;
    if (pts == AV_NOPTS_VALUE) return mLastNumber + 1;
    const int delay = mHasDecodingTimes && mTimestamps.empty() ? mDecoder->has_b_frames : 0;
    return std::max<std::int64_t>(0, NumberOf(pts) - delay);
}

std::int64_t VideoFile::TimestampOf(std::int64_t number) const {
    if (!mTimestamps.empty()) {
        return mTimestamps[static_cast<std::size_t>(std::clamp<std::int64_t>(number, 0, mInfo.frameCount - 1))];
    }
    return mFirstTimestamp + av_rescale_q(number, av_inv_q(mInfo.frameRate), mStream->time_base);
}

void VideoFile::SeekBefore(std::int64_t number) {
    const std::int64_t timestamp = number <= 0 ? mFirstTimestamp : TimestampOf(number);
    int code = av_seek_frame(mInput.get(), mStream->index, timestamp, AVSEEK_FLAG_BACKWARD);
    if (code < 0) code = avformat_seek_file(mInput.get(), -1, INT64_MIN, 0, INT64_MAX, 0);
    if (code < 0) Fail("can't be searched for frame " + std::to_string(number), code);
    avcodec_flush_buffers(mDecoder.get());
    mDraining = false;
    mAtEnd = false;
    mLast.reset();
    mLastNumber = -1;
    mRecent.clear();
}

void VideoFile::FeedDecoder() {
    while (!mDraining) {
        const int code = av_read_frame(mInput.get(), mPacket.get());
        if (code < 0) {
            // A file that breaks off ends here, as one that is whole does: what was decoded until then is shown.
            avcodec_send_packet(mDecoder.get(), nullptr);
            mDraining = true;
            return;
        }
        const bool ours = mPacket->stream_index == mStream->index;
        // A damaged packet costs its own picture only.
        if (ours) avcodec_send_packet(mDecoder.get(), mPacket.get());
        av_packet_unref(mPacket.get());
        if (ours) return;
    }
}

bool VideoFile::DecodeNext() {
    while (!mAtEnd) {
        const int code = avcodec_receive_frame(mDecoder.get(), mDecoded.get());
        if (code == AVERROR(EAGAIN)) {
            FeedDecoder();
            continue;
        }
        if (code < 0) {
            mAtEnd = true;
            break;
        }
        const std::int64_t number = NumberOfDecoded();
        mLast = ShareFrame(*mDecoded);
        av_frame_unref(mDecoded.get());
        mLastNumber = number;
        mRecent.emplace_back(number, ShareFrame(*mLast));
        if (mRecent.size() > kRecentFrames) mRecent.pop_front();
        return true;
    }
    return false;
}

Frame VideoFile::ReadFrame(std::int64_t number) {
    number = std::max<std::int64_t>(number, 0);
    if (mCountIsExact || mInfo.still) number = std::min(number, mInfo.frameCount - 1);
    for (const auto& [recentNumber, frame] : mRecent) {
        if (recentNumber == number) return ShareFrame(*frame);
    }
    const bool runOn = mLast ? number > mLastNumber && number - mLastNumber <= kRunForwardFrames
                             : number <= kRunForwardFrames && !mAtEnd;
    if (!runOn) SeekBefore(number);

    Frame before;
    std::int64_t beforeNumber = -1;
    for (std::int64_t back = kRunForwardFrames; DecodeNext();) {
        if (mLastNumber == number) return ShareFrame(*mLast);
        if (mLastNumber < number) {
            before = ShareFrame(*mLast);
            beforeNumber = mLastNumber;
            continue;
        }
        if (!before && number > 0 && back <= 2 * mInfo.frameCount) {
            // The seek landed behind the frame, as it does where an index is coarse: start further back.
            SeekBefore(std::max<std::int64_t>(0, number - back));
            back *= 4;
            continue;
        }
        // The frame isn't there: the nearer neighbour stands in, the earlier one in a tie.
        if (before && number - beforeNumber <= mLastNumber - number) return before;
        return ShareFrame(*mLast);
    }
    if (before) {
        mInfo.frameCount = beforeNumber + 1;
        mCountIsExact = true;
        return before;
    }
    if (mLast) return ShareFrame(*mLast);
    throw MediaError(mPath + ": no picture could be decoded at frame " + std::to_string(number));
}

void VideoFile::Fail(const std::string& what, int code) const {
    throw MediaError(mPath + " " + what + ": " + DescribeFFmpegError(code));
}

}  // namespace Vantrel::Host
