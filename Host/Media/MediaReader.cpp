// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Media/MediaReader.h"

#include <algorithm>

namespace Vantrel::Host {

namespace {

constexpr std::size_t kDecodersPerFile = 3;
constexpr std::size_t kDecodersInAll = 16;
/// A decoder this far behind runs on to a frame sooner than another one opens and seeks.
constexpr std::int64_t kNearFrames = 48;

}  // namespace

MediaReader::MediaReader(std::shared_ptr<PixelBufferPool> pool, int decoderThreads)
    : mPool(std::move(pool)), mDecoderThreads(decoderThreads) {}

MediaReader::~MediaReader() = default;

MediaReader::Slots::iterator MediaReader::Acquire(const std::string& path, std::int64_t number,
                                                  std::unique_lock<std::mutex>& lock) {
    for (;;) {
        Slots& slots = mFiles[path];
        const auto distance = [number](const Slot& slot) {
            const bool ahead = slot.position >= 0 && number > slot.position - VideoFile::kRecentFrames;
            return ahead ? std::max<std::int64_t>(0, number - slot.position) : INT64_MAX;
        };
        auto best = slots.end();
        bool nearIsBusy = false;
        for (auto it = slots.begin(); it != slots.end(); ++it) {
            if (it->busy) {
                nearIsBusy = nearIsBusy || distance(*it) <= kNearFrames;
                continue;
            }
            if (best == slots.end() || distance(*it) < distance(*best)) best = it;
        }
        const bool bestIsNear = best != slots.end() && distance(*best) <= kNearFrames;
        // A busy decoder that is about to reach the frame is worth waiting for: read-ahead asks in order.
        if (bestIsNear || (!nearIsBusy && best != slots.end() && slots.size() >= kDecodersPerFile)) {
            best->busy = true;
            return best;
        }
        if (!nearIsBusy && slots.size() < kDecodersPerFile) {
            if (mOpenDecoders >= kDecodersInAll) CloseOldest();
            ++mOpenDecoders;
            Slots& current = mFiles[path];
            current.emplace_back();
            current.back().busy = true;
            return std::prev(current.end());
        }
        mReleased.wait(lock);
    }
}

void MediaReader::CloseOldest() {
    auto oldestFile = mFiles.end();
    Slots::iterator oldest;
    for (auto file = mFiles.begin(); file != mFiles.end(); ++file) {
        for (auto slot = file->second.begin(); slot != file->second.end(); ++slot) {
            if (slot->busy || (oldestFile != mFiles.end() && slot->lastUse >= oldest->lastUse)) continue;
            oldestFile = file;
            oldest = slot;
        }
    }
    if (oldestFile == mFiles.end()) return;
    oldestFile->second.erase(oldest);
    --mOpenDecoders;
}

void MediaReader::Release(const std::string& path, Slots::iterator slot) {
    const std::lock_guard<std::mutex> hold(mMutex);
    if (!slot->file) {
        mFiles[path].erase(slot);
        --mOpenDecoders;
    } else {
        slot->busy = false;
        slot->position = slot->file->GetPosition();
        slot->lastUse = ++mClock;
        ++mDecodedFrames;
    }
    mReleased.notify_all();
}

std::shared_ptr<HostPicture> MediaReader::Read(const std::string& path, std::int64_t number) {
    std::unique_lock<std::mutex> lock(mMutex);
    const auto slot = Acquire(path, number, lock);
    lock.unlock();

    struct Lease {
        MediaReader& reader;
        const std::string& path;
        Slots::iterator slot;
        ~Lease() { reader.Release(path, slot); }
    };
    Frame frame;
    VideoStreamInfo info;
    {
        const Lease lease{*this, path, slot};
        if (!slot->file) slot->file = std::make_unique<VideoFile>(path, mDecoderThreads);
        frame = slot->file->ReadFrame(number);
        info = slot->file->GetInfo();
    }
    std::shared_ptr<HostPicture> picture = Convert(*frame, info.rotation);
    AVRational aspect = info.sampleAspect;
    if (info.rotation % 180 != 0) aspect = av_inv_q(aspect);
    picture->aspect = {aspect.num, aspect.den};
    if (info.interlaced) {
        picture->fieldType = info.upperFieldFirst ? Vellum::kFieldType_UpperFirst : Vellum::kFieldType_LowerFirst;
    }
    return picture;
}

std::shared_ptr<HostPicture> MediaReader::Convert(const AVFrame& frame, int rotation) {
    std::unique_ptr<PictureConverter> converter;
    {
        const std::lock_guard<std::mutex> hold(mMutex);
        if (!mConverters.empty()) {
            converter = std::move(mConverters.back());
            mConverters.pop_back();
        }
    }
    if (!converter) converter = std::make_unique<PictureConverter>(mPool);
    std::shared_ptr<HostPicture> picture = converter->Convert(frame, rotation);
    const std::lock_guard<std::mutex> hold(mMutex);
    mConverters.push_back(std::move(converter));
    return picture;
}

std::int64_t MediaReader::GetDecodedFrames() const {
    const std::lock_guard<std::mutex> hold(mMutex);
    return mDecodedFrames;
}

}  // namespace Vantrel::Host
