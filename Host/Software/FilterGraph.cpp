// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/FilterGraph.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <stdexcept>
#include <utility>
#include <vector>

#include "Host/Software/PlanePixels.h"

extern "C" {
#include <libavfilter/buffersink.h>
#include <libavfilter/buffersrc.h>
#include <libavutil/opt.h>
#include <libavutil/pixdesc.h>
}

namespace Vantrel::Host::Software {

namespace {

constexpr std::size_t kKeptGraphs = 16;
/// The time base in which every usual frame rate is whole and fits FFmpeg's fractions.
constexpr std::int64_t kTicksPerUnit = 360;
constexpr AVRational kTimeBase{1, 705600000};

/// Those with alpha first: what a filter does to shapes it does to alpha as well.
constexpr AVPixelFormat kFormats[] = {AV_PIX_FMT_GBRAPF32, AV_PIX_FMT_GBRAP16, AV_PIX_FMT_GBRAP, AV_PIX_FMT_RGBA,
                                      AV_PIX_FMT_GBRPF32,  AV_PIX_FMT_GBRP16,  AV_PIX_FMT_GBRP,  AV_PIX_FMT_RGB24};
/// What filters of luma and chroma are fed from.
constexpr AVPixelFormat kConvertedFormat = AV_PIX_FMT_GBRAP16;

constexpr const char* kNeedNeighbours[] = {"atadenoise",
                                           "bwdif",
                                           "chromanr",
                                           "cue",
                                           "decimate",
                                           "deflicker",
                                           "dejudder",
                                           "deshake",
                                           "detelecine",
                                           "doubleweave",
                                           "estdif",
                                           "field",
                                           "fieldmatch",
                                           "fps",
                                           "framepack",
                                           "framerate",
                                           "framestep",
                                           "freezeframes",
                                           "hqdn3d",
                                           "interlace",
                                           "kerndeint",
                                           "lagfun",
                                           "loop",
                                           "mcdeint",
                                           "mestimate",
                                           "minterpolate",
                                           "mpdecimate",
                                           "nnedi",
                                           "photosensitivity",
                                           "pullup",
                                           "random",
                                           "realtime",
                                           "repeatfields",
                                           "reverse",
                                           "select",
                                           "separatefields",
                                           "setpts",
                                           "settb",
                                           "shuffleframes",
                                           "tblend",
                                           "telecine",
                                           "thumbnail",
                                           "tile",
                                           "tinterlace",
                                           "tmedian",
                                           "tmidequalizer",
                                           "tmix",
                                           "tpad",
                                           "trim",
                                           "w3fdif",
                                           "yadif"};
constexpr const char* kReadFiles[] = {"movie", "subtitles", "ass"};

bool IsOneOf(const char* name, const char* const* begin, const char* const* end) {
    return std::any_of(begin, end, [name](const char* known) { return std::strcmp(known, name) == 0; });
}

struct InOutDeleter {
    void operator()(AVFilterInOut* list) const { avfilter_inout_free(&list); }
};
using OpenPads = std::unique_ptr<AVFilterInOut, InOutDeleter>;

bool IsSinglePicture(const OpenPads& pads, bool output) {
    if (!pads || pads->next) return false;
    const AVFilterPad* list = output ? pads->filter_ctx->output_pads : pads->filter_ctx->input_pads;
    return avfilter_pad_get_type(list, pads->pad_idx) == AVMEDIA_TYPE_VIDEO;
}

/// The names of a graph's filters: each stands at the beginning or after an unquoted comma or semicolon, perhaps behind
/// labels in brackets, and ends before "=" or "@", the next label or the next filter.
std::vector<std::string> ListFilterNames(const std::string& graph) {
    std::vector<std::string> names;
    std::string name;
    enum class Place { kLabel, kName, kOptions } place = Place::kName;
    bool quoted = false;
    const auto finish = [&] {
        if (!name.empty()) names.push_back(std::exchange(name, {}));
    };
    for (std::size_t i = 0; i < graph.size(); ++i) {
        const char c = graph[i];
        if (c == '\\' && !quoted) {
            ++i;
        } else if (c == '\'') {
            quoted = !quoted;
        } else if (!quoted && (c == ',' || c == ';')) {
            finish();
            place = Place::kName;
        } else if (!quoted && c == '[' && place != Place::kLabel) {
            finish();
            place = Place::kLabel;
        } else if (place == Place::kLabel) {
            if (c == ']') place = Place::kName;
        } else if (c == '=' || c == '@') {
            finish();
            place = Place::kOptions;
        } else if (place == Place::kName && std::isspace(static_cast<unsigned char>(c)) == 0) {
            name += c;
        }
    }
    finish();
    return names;
}

/// While it lives, what FFmpeg says on this thread is kept instead of printed: trying a format is no error, and the
/// last message is the best reason for one.
class MessageScope {
public:
    MessageScope() {
        static std::once_flag once;
        std::call_once(once, [] { av_log_set_callback(Receive); });
        Current() = this;
    }
    ~MessageScope() { Current() = nullptr; }
    MessageScope(const MessageScope&) = delete;
    MessageScope& operator=(const MessageScope&) = delete;

    [[nodiscard]] const std::string& GetError() const { return mError; }

private:
    static MessageScope*& Current() {
        thread_local MessageScope* current = nullptr;
        return current;
    }

    static void Receive(void* object, int level, const char* format, va_list arguments) {
        MessageScope* scope = Current();
        if (!scope) {
            av_log_default_callback(object, level, format, arguments);
            return;
        }
        if (level > AV_LOG_ERROR) return;
        std::array<char, 512> text{};
        (void)std::vsnprintf(text.data(), text.size(), format, arguments);
        scope->mError = text.data();
        while (!scope->mError.empty() && scope->mError.back() == '\n') scope->mError.pop_back();
    }

    std::string mError;
};

}  // namespace

FilterGraph::FilterGraph(std::string text, int width, int height, Vellum::PixelAspectRatio aspect)
    : mText(std::move(text)) {
    CheckFilters();
    const bool direct = std::any_of(std::begin(kFormats), std::end(kFormats),
                                    [&](AVPixelFormat format) { return Build(format, false, width, height, aspect); });
    if (!direct && !Build(kConvertedFormat, true, width, height, aspect)) Fail("its filters don't go together");
    mLosesAlpha = LosesAlpha();
}

void FilterGraph::Fail(const std::string& reason) const {
    throw std::runtime_error("the filter graph \"" + mText + "\" can't be used: " + reason);
}

void FilterGraph::CheckFilters() const {
    // Before anything is parsed: a filter's beginning may open files.
    for (const std::string& name : ListFilterNames(mText)) {
        if (IsOneOf(name.c_str(), std::begin(kNeedNeighbours), std::end(kNeedNeighbours))) {
            Fail("\"" + name + "\" needs other frames than the one it gets, or changes their rate");
        }
        if (IsOneOf(name.c_str(), std::begin(kReadFiles), std::end(kReadFiles))) Fail("\"" + name + "\" reads files");
        const AVFilter* filter = avfilter_get_by_name(name.c_str());
        if (!filter) Fail("there is no filter \"" + name + "\"");
        if (avfilter_filter_pad_count(filter, 0) == 0 && (filter->flags & AVFILTER_FLAG_DYNAMIC_INPUTS) == 0) {
            Fail("\"" + name + "\" brings pictures of its own");
        }
    }
}

void FilterGraph::Parse() {
    AVFilterInOut* firstInput = nullptr;
    AVFilterInOut* firstOutput = nullptr;
    int code = 0;
    std::string reason;
    {
        const MessageScope messages;
        code = avfilter_graph_parse2(mGraph.get(), mText.c_str(), &firstInput, &firstOutput);
        reason = messages.GetError();
    }
    const OpenPads inputs(firstInput);
    const OpenPads outputs(firstOutput);
    if (code < 0) Fail(reason.empty() ? DescribeFFmpegError(code) : reason);
    if (!IsSinglePicture(inputs, false) || !IsSinglePicture(outputs, true)) {
        Fail("it must take one picture and give one picture");
    }
    mSource = nullptr;
    mSink = nullptr;
    mSource = avfilter_graph_alloc_filter(mGraph.get(), avfilter_get_by_name("buffer"), "in");
    mSink = avfilter_graph_alloc_filter(mGraph.get(), avfilter_get_by_name("buffersink"), "out");
    if (!mSource || !mSink) throw std::bad_alloc();
    if (avfilter_link(mSource, 0, inputs->filter_ctx, static_cast<unsigned>(inputs->pad_idx)) < 0 ||
        avfilter_link(outputs->filter_ctx, static_cast<unsigned>(outputs->pad_idx), mSink, 0) < 0) {
        Fail("its ends can't be joined");
    }
}

bool FilterGraph::Build(AVPixelFormat format, bool convert, int width, int height, Vellum::PixelAspectRatio aspect) {
    mGraph.reset(avfilter_graph_alloc());
    if (!mGraph) throw std::bad_alloc();
    mGraph->nb_threads = 1;
    mGraph->scale_sws_opts = av_strdup("flags=bicubic+accurate_rnd+full_chroma_int+full_chroma_inp");
    avfilter_graph_set_auto_convert(mGraph.get(), convert ? AVFILTER_AUTO_CONVERT_ALL : AVFILTER_AUTO_CONVERT_NONE);
    Parse();
    mFormat = format;
    const std::string arguments = "video_size=" + std::to_string(width) + "x" + std::to_string(height) +
                                  ":pix_fmt=" + std::to_string(format) + ":time_base=1/" +
                                  std::to_string(kTimeBase.den) + ":pixel_aspect=" + std::to_string(aspect.numerator) +
                                  "/" + std::to_string(aspect.denominator);
    const MessageScope messages;
    int code = avfilter_init_str(mSource, arguments.c_str());
    if (code >= 0) {
        code = av_opt_set_bin(mSink, "pix_fmts", reinterpret_cast<const std::uint8_t*>(&format), sizeof format,
                              AV_OPT_SEARCH_CHILDREN);
    }
    if (code >= 0) code = avfilter_init_str(mSink, nullptr);
    if (code >= 0) code = avfilter_graph_config(mGraph.get(), nullptr);
    if (code < 0 && convert) {
        Fail(messages.GetError().empty() ? DescribeFFmpegError(code) : messages.GetError());
    }
    return code >= 0;
}

bool FilterGraph::LosesAlpha() const {
    for (unsigned i = 0; i < mGraph->nb_filters; ++i) {
        const AVFilterContext& filter = *mGraph->filters[i];
        for (unsigned pad = 0; pad < filter.nb_inputs; ++pad) {
            if (avfilter_pad_get_type(filter.input_pads, static_cast<int>(pad)) != AVMEDIA_TYPE_VIDEO) continue;
            const AVPixFmtDescriptor* format =
                av_pix_fmt_desc_get(static_cast<AVPixelFormat>(filter.inputs[pad]->format));
            if (format && (format->flags & AV_PIX_FMT_FLAG_ALPHA) == 0) return true;
        }
    }
    return false;
}

Picture FilterGraph::Run(const Picture& picture, std::int64_t time) {
    Frame frame = MakeFrame();
    frame->format = mFormat;
    frame->width = picture.width;
    frame->height = picture.height;
    frame->color_range = AVCOL_RANGE_JPEG;
    if (av_frame_get_buffer(frame.get(), 64) < 0) throw std::bad_alloc();
    WritePlanes(picture, *frame);
    frame->pts = time / kTicksPerUnit;
    const MessageScope messages;
    int code = av_buffersrc_add_frame_flags(mSource, frame.get(), AV_BUFFERSRC_FLAG_PUSH);
    const Frame result = MakeFrame();
    if (code >= 0) code = av_buffersink_get_frame(mSink, result.get());
    if (code == AVERROR(EAGAIN)) Fail("it gave no picture for the one that it got");
    if (code < 0) Fail(messages.GetError().empty() ? DescribeFFmpegError(code) : messages.GetError());
    const Frame another = MakeFrame();
    if (av_buffersink_get_frame(mSink, another.get()) >= 0) Fail("it gave more than one picture for one");
    Picture filtered = ReadPlanes(*result);
    if (filtered.width == picture.width && filtered.height == picture.height) PutAlphaBack(picture, filtered);
    return filtered;
}

void FilterGraph::PutAlphaBack(const Picture& picture, Picture& filtered) const {
    // What differs by less than an 8-bit step has only been rounded on its way.
    const float limit = mFormat == AV_PIX_FMT_GBRAPF32 ? 0.0F : 1.0F / 255.0F;
    for (std::size_t i = 3; i < filtered.pixels.size(); i += 4) {
        if (mLosesAlpha || std::fabs(filtered.pixels[i] - picture.pixels[i]) < limit) {
            filtered.pixels[i] = picture.pixels[i];
        }
    }
}

void FilterGraphs::Run(const std::string& text, std::int64_t time, LayerPicture& layer) {
    const std::string key = text + "|" + std::to_string(layer.picture.width) + "x" +
                            std::to_string(layer.picture.height) + "|" + std::to_string(layer.aspect.numerator) + "/" +
                            std::to_string(layer.aspect.denominator);
    Resting taken{key, nullptr};
    {
        const std::lock_guard<std::mutex> hold(mMutex);
        const auto known = std::find_if(mResting.begin(), mResting.end(),
                                        [&key](const Resting& resting) { return resting.key == key; });
        if (known != mResting.end()) {
            taken = std::move(*known);
            mResting.erase(known);
        }
    }
    if (!taken.graph) {
        taken.graph = std::make_unique<FilterGraph>(text, layer.picture.width, layer.picture.height, layer.aspect);
    }
    Picture filtered = taken.graph->Run(layer.picture, time);
    layer.origin.x += (filtered.width - layer.picture.width) / 2;
    layer.origin.y += (filtered.height - layer.picture.height) / 2;
    layer.picture = std::move(filtered);
    std::list<Resting> dropped;  // goes after the lock
    const std::lock_guard<std::mutex> hold(mMutex);
    mResting.push_front(std::move(taken));
    if (mResting.size() > kKeptGraphs) dropped.splice(dropped.end(), mResting, std::prev(mResting.end()));
}

}  // namespace Vantrel::Host::Software
