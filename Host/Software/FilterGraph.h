// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <list>
#include <memory>
#include <mutex>
#include <string>

#include "Host/Media/FFmpegHandles.h"
#include "Host/Software/LayerPicture.h"

extern "C" {
#include <libavfilter/avfilter.h>
}

namespace Vantrel::Host::Software {

/// A graph of libavfilter with one picture in and one out, for pictures of one size. Used by one thread at a time.
///
/// Pictures go through in the best format that all of its filters take: 32-bit float, else 16 or 8 bits, in which
/// values are kept to 0..1. Where a filter knows no alpha, the picture's own is put back afterwards.
class FilterGraph {
public:
    /// Throws std::runtime_error for a text that is no such graph, and for filters that need other frames than the one
    /// they get, change the rate, or bring pictures of their own.
    FilterGraph(std::string text, int width, int height, Vellum::PixelAspectRatio aspect);

    /// The picture that comes out, perhaps of another size. Throws std::runtime_error.
    /// @param time  in ticks, what filters know as `t`
    [[nodiscard]] Picture Run(const Picture& picture, std::int64_t time);

private:
    struct GraphDeleter {
        void operator()(AVFilterGraph* graph) const { avfilter_graph_free(&graph); }
    };

    /// False when the filters don't take the format; a text that is wrong in itself throws.
    bool Build(AVPixelFormat format, bool convert, int width, int height, Vellum::PixelAspectRatio aspect);
    void Parse();
    void CheckFilters() const;
    [[nodiscard]] bool LosesAlpha() const;
    void PutAlphaBack(const Picture& picture, Picture& filtered) const;
    [[noreturn]] void Fail(const std::string& reason) const;

    std::string mText;
    std::unique_ptr<AVFilterGraph, GraphDeleter> mGraph;
    AVFilterContext* mSource = nullptr;  ///< owned by mGraph, as is the sink
    AVFilterContext* mSink = nullptr;
    AVPixelFormat mFormat = AV_PIX_FMT_NONE;
    bool mLosesAlpha = false;
};

/// Graphs that are kept for the next picture. May be used from several threads at once.
class FilterGraphs {
public:
    /// Runs a layer through a graph; a result of another size stays centred where the layer was.
    void Run(const std::string& text, std::int64_t time, LayerPicture& layer);

private:
    struct Resting {
        std::string key;
        std::unique_ptr<FilterGraph> graph;
    };

    // Held for taking and giving back only.
    std::mutex mMutex;
    std::list<Resting> mResting;  ///< the one used last in front
};

}  // namespace Vantrel::Host::Software
