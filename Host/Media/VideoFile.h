// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <deque>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "Host/Media/FFmpegHandles.h"

namespace Vantrel::Host {

/// What a file's video stream says of itself.
struct VideoStreamInfo {
    int streamIndex = 0;
    std::int32_t width = 0;  ///< pixels, as stored, before rotation
    std::int32_t height = 0;
    int rotation = 0;  ///< clockwise degrees that show the picture upright: 0, 90, 180 or 270
    AVRational sampleAspect{1, 1};
    AVRational frameRate{0, 1};
    std::int64_t frameCount = 0;  ///< an estimate until the end has been decoded, at least 1
    bool still = false;
    bool interlaced = false;
    bool upperFieldFirst = true;
    bool hasAlpha = false;
    int bitDepth = 8;
    std::uint32_t codecTag = 0;  ///< first character in the highest byte
    std::string codecName;
    std::string timecode;  ///< of the first frame, as the file writes it; empty without one
};

/// One open video stream, read by frame number. Frames are numbered from 0 by their time stamps at the stream's rate,
/// or, where the rate varies, in the order of their time stamps. Used by one thread at a time.
class VideoFile {
public:
    /// Throws MediaError when the file can't be opened, has no video, or its codec isn't there.
    VideoFile(const std::string& path, int threads);

    [[nodiscard]] const std::string& GetPath() const { return mPath; }
    [[nodiscard]] const VideoStreamInfo& GetInfo() const { return mInfo; }

    /// The picture of frame `number`, or the nearest one that the file has. Throws MediaError when it has none there.
    [[nodiscard]] Frame ReadFrame(std::int64_t number);

    /// The number of the frame that was decoded last, -1 before the first: reading on from here needs no seek.
    [[nodiscard]] std::int64_t GetPosition() const { return mLast ? mLastNumber : -1; }

    /// How many frames before its position a file still has at hand: threads that share one ask a little out of order.
    static constexpr std::int64_t kRecentFrames = 8;

private:
    void OpenStream(int threads);
    void ReadInfo();
    /// Reads all packets; true if each of them tells its time.
    bool ScanPackets(std::int64_t& count);
    void CountFrames();
    void SeekBefore(std::int64_t number);
    /// Decodes the next frame in order; false at the end.
    bool DecodeNext();
    void FeedDecoder();
    [[nodiscard]] std::int64_t NumberOf(std::int64_t pts) const;
    [[nodiscard]] std::int64_t NumberOfDecoded();
    [[nodiscard]] std::int64_t TimestampOf(std::int64_t number) const;
    [[noreturn]] void Fail(const std::string& what, int code) const;

    std::string mPath;
    InputContext mInput;
    CodecContext mDecoder;
    AVStream* mStream = nullptr;  ///< owned by mInput
    VideoStreamInfo mInfo;
    std::int64_t mFirstTimestamp = 0;
    bool mCountIsExact = false;
    bool mHasDecodingTimes = false;
    std::vector<std::int64_t> mTimestamps;  ///< sorted; only for a varying rate
    Packet mPacket = MakePacket();
    bool mDraining = false;
    bool mAtEnd = false;
    Frame mDecoded = MakeFrame();
    Frame mLast;
    std::int64_t mLastNumber = -1;
    std::deque<std::pair<std::int64_t, Frame>> mRecent;
};

}  // namespace Vantrel::Host
