// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Media/FilterSourceReader.h"

#include <utility>

extern "C" {
#include <libavfilter/buffersink.h>
#include <libavutil/opt.h>
}

namespace Vantrel::Host {

namespace {

/// Has the filter an option of this name, and does the text leave it open?
bool LeavesOpen(const AVFilter& filter, const std::string& text, const char* option) {
    const AVClass* options = filter.priv_class;
    if (!options || !av_opt_find(&options, option, nullptr, 0, AV_OPT_SEARCH_FAKE_OBJ)) return false;
    return text.find(std::string(option) + "=") == std::string::npos;
}

}  // namespace

FilterSourceReader::FilterSourceReader(std::string source, std::int32_t width, std::int32_t height, AVRational rate)
    : mSource(std::move(source)), mWidth(width), mHeight(height), mRate(rate) {
    Start();
}

void FilterSourceReader::Start() {
    const std::size_t split = mSource.find('=');
    const std::string name = mSource.substr(0, split);
    std::string options = split == std::string::npos ? std::string() : mSource.substr(split + 1);
    const AVFilter* filter = avfilter_get_by_name(name.c_str());
    if (!filter || avfilter_filter_pad_count(filter, 0) != 0 || (filter->flags & AVFILTER_FLAG_DYNAMIC_INPUTS) != 0) {
        throw MediaError("\"" + name + "\" is no source of pictures");
    }
    const auto add = [&options](const std::string& option) { options += (options.empty() ? "" : ":") + option; };
    if (LeavesOpen(*filter, options, "size")) add("size=" + std::to_string(mWidth) + "x" + std::to_string(mHeight));
    if (LeavesOpen(*filter, options, "rate"))
        add("rate=" + std::to_string(mRate.num) + "/" + std::to_string(mRate.den));

    mGraph.reset(avfilter_graph_alloc());
    if (!mGraph) throw std::bad_alloc();
    AVFilterContext* origin = nullptr;
    int code = avfilter_graph_create_filter(&origin, filter, "source", options.c_str(), nullptr, mGraph.get());
    if (code >= 0) {
        code = avfilter_graph_create_filter(&mSink, avfilter_get_by_name("buffersink"), "sink", nullptr, nullptr,
                                            mGraph.get());
    }
    if (code >= 0) code = avfilter_link(origin, 0, mSink, 0);
    if (code >= 0) code = avfilter_graph_config(mGraph.get(), nullptr);
    if (code < 0) throw MediaError("the source \"" + mSource + "\" can't be made: " + DescribeFFmpegError(code));
    if (av_buffersink_get_type(mSink) != AVMEDIA_TYPE_VIDEO)
        throw MediaError("\"" + name + "\" is no source of pictures");
    mLast.reset();
    mNext = 0;
}

std::int32_t FilterSourceReader::GetWidth() const { return av_buffersink_get_w(mSink); }

std::int32_t FilterSourceReader::GetHeight() const { return av_buffersink_get_h(mSink); }

AVRational FilterSourceReader::GetSampleAspect() const {
    const AVRational aspect = av_buffersink_get_sample_aspect_ratio(mSink);
    return aspect.num > 0 && aspect.den > 0 ? aspect : AVRational{1, 1};
}

AVRational FilterSourceReader::GetFrameRate() const { return av_buffersink_get_frame_rate(mSink); }

int FilterSourceReader::GetPixelFormat() const { return av_buffersink_get_format(mSink); }

Frame FilterSourceReader::ReadFrame(std::int64_t number) {
    if (number < 0) number = 0;
    if (number < mNext - 1) Start();
    while (mNext <= number) {
        Frame frame = MakeFrame();
        if (av_buffersink_get_frame(mSink, frame.get()) < 0) break;
        mLast = std::move(frame);
        ++mNext;
    }
    if (!mLast) throw MediaError("the source \"" + mSource + "\" gives no picture");
    return ShareFrame(*mLast);
}

}  // namespace Vantrel::Host
