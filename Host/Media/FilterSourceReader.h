// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "Host/Media/FFmpegHandles.h"

extern "C" {
#include <libavfilter/avfilter.h>
}

namespace Vantrel::Host {

/// Pictures from one of libavfilter's sources ("testsrc2", "smptebars=duration=1"), read by number. Used by one thread
/// at a time.
class FilterSourceReader {
public:
    /// Options that the text leaves open are set to the size and rate given, where the filter has them. Throws
    /// MediaError for a name that isn't a source of pictures, and for options that it refuses.
    FilterSourceReader(std::string source, std::int32_t width, std::int32_t height, AVRational rate);

    [[nodiscard]] std::int32_t GetWidth() const;
    [[nodiscard]] std::int32_t GetHeight() const;
    [[nodiscard]] AVRational GetSampleAspect() const;
    [[nodiscard]] AVRational GetFrameRate() const;
    [[nodiscard]] int GetPixelFormat() const;

    /// The picture of frame `number`, or the last one that the source has. Going back starts the source anew.
    [[nodiscard]] Frame ReadFrame(std::int64_t number);

private:
    struct GraphDeleter {
        void operator()(AVFilterGraph* graph) const { avfilter_graph_free(&graph); }
    };

    void Start();

    std::string mSource;
    std::int32_t mWidth;
    std::int32_t mHeight;
    AVRational mRate;
    std::unique_ptr<AVFilterGraph, GraphDeleter> mGraph;
    AVFilterContext* mSink = nullptr;  ///< owned by mGraph
    Frame mLast;
    std::int64_t mNext = 0;
};

}  // namespace Vantrel::Host
