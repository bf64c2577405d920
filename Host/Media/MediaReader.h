// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <condition_variable>
#include <cstdint>
#include <list>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "Host/Media/HostPicture.h"
#include "Host/Media/PictureConverter.h"
#include "Host/Media/VideoFile.h"

namespace Vantrel::Host {

/// Reads pictures of files by frame number, from any number of threads. A file has up to three decoders open, so that a
/// film's two ends and a transition's handles don't fight over one; each is used by one thread at a time, and a caller
/// waits when all of a file's are busy. Files that nobody has asked for lately are closed.
class MediaReader {
public:
    /// @param decoderThreads threads of each decoder; 0 lets FFmpeg decide.
    MediaReader(std::shared_ptr<PixelBufferPool> pool, int decoderThreads);
    ~MediaReader();

    /// The upright picture of frame `number`, or of the nearest frame. Throws MediaError.
    [[nodiscard]] std::shared_ptr<HostPicture> Read(const std::string& path, std::int64_t number);

    /// Frames decoded so far.
    [[nodiscard]] std::int64_t GetDecodedFrames() const;

private:
    struct Slot {
        std::unique_ptr<VideoFile> file;  ///< null while it is being opened
        std::int64_t position = -1;
        std::uint64_t lastUse = 0;
        bool busy = false;
    };
    using Slots = std::list<Slot>;

    /// Finds or makes a slot and marks it busy; the decoder may still have to be opened.
    Slots::iterator Acquire(const std::string& path, std::int64_t number, std::unique_lock<std::mutex>& lock);
    void Release(const std::string& path, Slots::iterator slot);
    void CloseOldest();
    [[nodiscard]] std::shared_ptr<HostPicture> Convert(const AVFrame& frame, int rotation);

    std::shared_ptr<PixelBufferPool> mPool;
    int mDecoderThreads;
    mutable std::mutex mMutex;
    std::condition_variable mReleased;
    std::map<std::string, Slots> mFiles;
    std::vector<std::unique_ptr<PictureConverter>> mConverters;  ///< those at rest
    std::uint64_t mClock = 0;
    std::size_t mOpenDecoders = 0;
    std::int64_t mDecodedFrames = 0;
};

}  // namespace Vantrel::Host
