// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <list>
#include <memory>
#include <mutex>
#include <string>
#include <utility>

#include "Host/Media/FilterSourceReader.h"
#include "Host/Media/MediaReader.h"
#include "Host/Render/PictureCache.h"
#include "Host/Snapshot/Node.h"
#include "Host/Software/Picture.h"

namespace Vantrel::Host::Software {

/// Frames of media of every kind, undecorated, in the media's own size. May be used from several threads at once.
class MediaPictures {
public:
    /// Renders a frame of a sequence at its own size, with both fields if it is interlaced; called from the thread that
    /// asked for it.
    using SequenceRenderer = std::function<Picture(const Sequence& sequence, std::int64_t time)>;

    MediaPictures(std::shared_ptr<PixelBufferPool> pool, std::shared_ptr<MediaReader> reader,
                  SequenceRenderer renderSequence);

    /// A frame by number, or the nearest one that the media have. Throws MediaError.
    /// @param name  of the clip, for a slate
    [[nodiscard]] HostPictureRef GetFrame(const MediaClip& clip, const std::string& name, std::int64_t frame);

private:
    struct OpenFilter {
        std::string key;
        std::int64_t position = -1;
        std::unique_ptr<FilterSourceReader> reader;
        std::unique_ptr<PictureConverter> converter;
    };
    using StillKey = std::pair<Guid, std::string>;

    [[nodiscard]] HostPictureRef MakeFrame(const MediaClip& clip, const std::string& name, std::int64_t frame);
    [[nodiscard]] HostPictureRef ReadImage(const ImageSequence& images, const MediaInfo& info, std::int64_t frame);
    [[nodiscard]] HostPictureRef ReadFilter(const std::string& filter, const MediaInfo& info, std::int64_t frame);
    [[nodiscard]] OpenFilter TakeFilter(const std::string& filter, const MediaInfo& info, std::int64_t frame);

    std::shared_ptr<PixelBufferPool> mPool;
    std::shared_ptr<MediaReader> mReader;
    SequenceRenderer mRenderSequence;
    PictureCache<StillKey> mStills;
    // Held for taking and giving back only.
    std::mutex mMutex;
    std::list<OpenFilter> mFilters;  ///< those at rest, the one used last in front
};

/// A picture as BGRA of 8 bits, rounded, or of 32-bit float.
[[nodiscard]] std::shared_ptr<HostPicture> ToHostPicture(PixelBufferPool& pool, const Picture& picture,
                                                         Vellum::PixelFormat format);

}  // namespace Vantrel::Host::Software
