// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <map>
#include <sstream>

#include "Host/Inspect/Inspector.h"
#include "Host/Output/PictureWriter.h"

namespace Vantrel::Host {

namespace {

constexpr std::int32_t kPictureWidth = 288;

class TimingScope {
public:
    explicit TimingScope(Kiln::DeviceRef device) : mDevice(std::move(device)), mBefore(mDevice->IsTimingEnabled()) {
        mDevice->SetTimingEnabled(true);
    }
    ~TimingScope() { mDevice->SetTimingEnabled(mBefore); }
    TimingScope(const TimingScope&) = delete;
    TimingScope& operator=(const TimingScope&) = delete;

private:
    Kiln::DeviceRef mDevice;
    bool mBefore;
};

/// The mean of the pixels that fall on each pixel of a smaller picture. 8 bits, opaque.
std::shared_ptr<HostPicture> Reduce(PixelBufferPool& pool, const HostPicture& source, std::int32_t width,
                                    std::int32_t height) {
    auto target = MakeHostPicture(pool, source.format, width, height);
    const auto edge = [](std::int32_t at, std::int32_t from, std::int32_t to) {
        return static_cast<std::int32_t>(std::int64_t{at} * from / to);
    };
    for (std::int32_t y = 0; y < height; ++y) {
        const std::int32_t top = edge(y, source.height, height);
        const std::int32_t bottom = std::max(top + 1, edge(y + 1, source.height, height));
        auto* out = reinterpret_cast<std::uint8_t*>(target->GetRow(y));
        for (std::int32_t x = 0; x < width; ++x) {
            const std::int32_t left = edge(x, source.width, width);
            const std::int32_t right = std::max(left + 1, edge(x + 1, source.width, width));
            unsigned sums[4] = {};
            for (std::int32_t row = top; row < bottom; ++row) {
                const auto* in = reinterpret_cast<const std::uint8_t*>(source.GetRow(row));
                for (std::int32_t i = 4 * left; i < 4 * right; ++i) sums[i & 3] += in[i];
            }
            const auto count = static_cast<unsigned>((right - left) * (bottom - top));
            for (int c = 0; c < 4; ++c) out[4 * x + c] = static_cast<std::uint8_t>((sums[c] + count / 2) / count);
        }
    }
    return target;
}

/// The picture in square pixels, no wider than a page needs.
void TakePicture(PixelBufferPool& pool, const HostPicture& picture, const SequenceFormat& format, StretchFrame& frame) {
    const double aspect = static_cast<double>(format.width) * format.aspectNumerator /
                          (static_cast<double>(format.height) * format.aspectDenominator);
    frame.width = std::min(kPictureWidth, picture.width);
    frame.height = std::max(1, static_cast<std::int32_t>(std::lround(frame.width / aspect)));
    OutputFormat output;
    output.path = "picture of frame " + std::to_string(frame.frame);
    output.width = frame.width;
    output.height = frame.height;
    std::ostringstream png;
    EncodePicture(*Reduce(pool, picture, frame.width, frame.height), output, false, png);
    frame.picture = png.str();
}

void CountKeys(const TreeNode& tree, std::map<std::string, std::size_t>& counts) {
    ++counts[tree.key];
    for (const TreeNode& input : tree.inputs) CountKeys(input, counts);
}

void GiveTimes(TreeNode& tree, std::map<std::string, std::vector<double>>& times) {
    const auto found = times.find(tree.key);
    if (found != times.end()) {
        tree.milliseconds = found->second.front();
        found->second.erase(found->second.begin());
        if (found->second.empty()) times.erase(found);
    }
    for (TreeNode& input : tree.inputs) GiveTimes(input, times);
}

}  // namespace

void ReadTimings(const std::string& report, StretchFrame& frame, TreeNode& tree) {
    std::istringstream lines(report);
    for (std::string line; std::getline(lines, line);) {
        const std::size_t colon = line.rfind(": ");
        if (colon == std::string::npos) continue;
        char* unitStart = nullptr;
        const double value = std::strtod(line.c_str() + colon + 2, &unitStart);
        const std::string unit(unitStart);
        // Further lines of a node's, which tell what its time is made of.
        if (line[0] == ' ') continue;
        const std::string name = line.substr(0, colon);
        if (unit.rfind("mb", 0) == 0) {
            // The line goes on with the host's.
            frame.deviceMegabytes = std::strtod(line.c_str() + line.find(": ") + 2, nullptr);
        } else if (name == "Total render time") {
            frame.totalMilliseconds = value;
        } else if (unit.rfind("ms", 0) == 0) {
            frame.timings.push_back({name, value});
        }
    }
    // Of several nodes of one name those that took no time are missing, and which they are can't be told.
    std::map<std::string, std::size_t> nodes;
    std::map<std::string, std::vector<double>> times;
    CountKeys(tree, nodes);
    for (const NodeTiming& timing : frame.timings) times[timing.name].push_back(timing.milliseconds);
    for (auto it = times.begin(); it != times.end();) {
        it = nodes[it->first] == it->second.size() ? std::next(it) : times.erase(it);
    }
    GiveTimes(tree, times);
}

bool RenderStretches(RenderSession& session, Inspection& inspection, std::int32_t width, std::int32_t height,
                     const std::function<void(std::int64_t)>& progress, const std::atomic<bool>& stop) {
    const TimingScope timing(session.GetDevice());
    const std::shared_ptr<PixelBufferPool> pool = PixelBufferPool::Create();
    RenderJob job;
    job.timelineID = session.GetSequence().timelineID;
    job.width = width;
    job.height = height;
    job.report = true;
    std::int64_t done = 0;
    for (Stretch& stretch : inspection.stretches) {
        if (stretch.CountFrames() > 0 && stretch.rendering != Rendering::kGap) {
            StretchFrame frame;
            frame.frame = job.firstFrame = stretch.firstFrame + stretch.CountFrames() / 2;
            job.endFrame = job.firstFrame + 1;
            // The first time builds device code and takes memory, which would count as the frame's.
            session.Render(
                job, [](const RenderedFrame&) {}, stop);
            session.Render(
                job,
                [&](const RenderedFrame& rendered) {
                    TakePicture(*pool, *rendered.picture, inspection.format, frame);
                    ReadTimings(rendered.report, frame, stretch.tree);
                },
                stop);
            if (stop) return false;
            stretch.rendered = std::move(frame);
        }
        progress(++done);
    }
    return true;
}

}  // namespace Vantrel::Host
