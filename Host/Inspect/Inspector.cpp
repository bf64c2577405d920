// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Inspect/Inspector.h"

#include <algorithm>
#include <array>

#include "Host/Inspect/StretchExplainer.h"
#include "Host/Time/Timecode.h"

namespace Vantrel::Host {

namespace {

/// A compositor with one layer only hands its picture on.
bool HasDeviceWork(const TreeNode& tree) {
    const bool works = tree.side == TreeNode::Side::kDevice && tree.kind != "black" && tree.kind != "disabled" &&
                       !(tree.kind == "layers" && tree.inputs.size() < 2);
    return works || std::any_of(tree.inputs.begin(), tree.inputs.end(), HasDeviceWork);
}

bool HasHostWork(const TreeNode& tree) {
    return tree.side == TreeNode::Side::kHost || std::any_of(tree.inputs.begin(), tree.inputs.end(), HasHostWork);
}

/// The engine's word on whether the host takes part; the tree's on how much is left to the device.
Rendering RenderingOf(const Stretch& stretch) {
    const bool host = stretch.info.hostWhole || stretch.info.hostPart || HasHostWork(stretch.tree);
    if (!host) return Rendering::kDevice;
    return stretch.info.hostWhole || !HasDeviceWork(stretch.tree) ? Rendering::kHost : Rendering::kPartlyHost;
}

/// The statistics of a moment from the merged map; what only the render map says is taken from there.
SegmentInfo AskEngine(RenderSystem& system, std::int64_t time, bool& known) {
    SegmentInfo rendered;
    SegmentInfo merged;
    known = system.GetSegmentInfo(time, rendered, false) == 0;
    if (!known) return {};
    if (system.GetSegmentInfo(time, merged, true) != 0) merged = rendered;
    merged.in = std::max(merged.in, rendered.in);
    merged.out = std::min(merged.out, rendered.out);
    merged.guid = rendered.guid;
    merged.nested = rendered.nested;
    merged.isPreview = rendered.isPreview;
    merged.hostPart = merged.hostPart || rendered.hostPart;
    merged.hostWhole = rendered.hostWhole;
    merged.tree.Reset();
    return merged;
}

/// The engine's flags decide what has to be explained.
void KeepReasons(Stretch& stretch, std::vector<Reason> reasons) {
    const bool onDevice = stretch.rendering == Rendering::kDevice && stretch.info.accelerated;
    for (Reason& reason : reasons) {
        if (!reason.realTimeOnly || !stretch.info.realTime) stretch.reasons.push_back(std::move(reason));
    }
    const bool told = std::any_of(stretch.reasons.begin(), stretch.reasons.end(),
                                  [](const Reason& reason) { return !reason.realTimeOnly; });
    if (onDevice || told) return;
    stretch.reasons.push_back(
        {Reason::Topic::kEngine, false, "", "a node that the engine couldn't set up on the device"});
}

class Walk {
public:
    Walk(RenderSession& session, Inspection& inspection)
        : mSession(session), mInspection(inspection), mAbilities(*session.GetDevice()) {}

    void Run() {
        for (std::int64_t time = 0; time < mInspection.length;) {
            bool known = false;
            SegmentInfo info = AskEngine(mSession.GetSystem(), time, known);
            if (!known) info.out = EndOfUnknown(time);
            Stretch stretch = MakeStretch(time, std::move(info));
            if (!known) {
                stretch.rendering = Rendering::kHost;
                stretch.reasons = {{Reason::Topic::kEngine, false, "", "the engine has no tree for it"}};
            }
            time = stretch.end;
            mInspection.stretches.push_back(std::move(stretch));
        }
    }

private:
    [[nodiscard]] std::int64_t EndOfUnknown(std::int64_t time) const {
        const Segment* segment = mSession.GetSequence().plain.Find(time);
        return segment ? segment->end : time + mInspection.format.frameTicks;
    }

    [[nodiscard]] std::int64_t FirstFrameFrom(std::int64_t time) const {
        const std::int64_t frame = mInspection.format.frameTicks;
        return (time + frame - 1) / frame;
    }

    [[nodiscard]] Stretch MakeStretch(std::int64_t time, SegmentInfo info) const {
        Stretch stretch;
        stretch.start = time;
        stretch.end = std::min(info.out, mInspection.length);
        stretch.firstFrame = FirstFrameFrom(stretch.start);
        stretch.endFrame = FirstFrameFrom(stretch.end);
        stretch.info = std::move(info);
        stretch.tree.kind = "black";
        stretch.tree.name = "Black";
        const Segment* segment = mSession.GetSequence().plain.Find(time);
        if (!segment) return stretch;
        StretchExplainer explainer(mSession.GetSnapshot(), mAbilities);
        stretch.tree = explainer.Explain(*segment, {stretch.start, stretch.end}, mInspection.format);
        stretch.rendering = RenderingOf(stretch);
        KeepReasons(stretch, explainer.GetReasons());
        return stretch;
    }

    RenderSession& mSession;
    Inspection& mInspection;
    const DeviceAbilities mAbilities;
};

}  // namespace

Inspection Inspect(RenderSession& session, const std::string& file) {
    Inspection inspection;
    const Kiln::Device& device = *session.GetDevice();
    inspection.file = file;
    inspection.name = session.GetSequence().name;
    inspection.framework = device.GetFramework() == Kiln::DeviceFramework::kCuda ? "CUDA" : "OpenCL";
    inspection.deviceName = device.GetName();
    inspection.deviceMemory = device.GetMemoryLimit();
    inspection.format = session.GetSequence().format;
    inspection.globalStart = session.GetSnapshot().globalStart;
    inspection.length = session.GetSequence().length;
    inspection.warnings = session.GetSnapshot().warnings;
    inspection.offline = session.GetOffline();
    Walk(session, inspection).Run();
    return inspection;
}

std::string Inspection::GetTimecode(std::int64_t frame) const {
    return TimecodeOf(frame + globalStart / format.frameTicks, format.frameTicks);
}

std::int64_t Inspection::GetFrameCount() const { return (length + format.frameTicks - 1) / format.frameTicks; }

std::int64_t Inspection::CountFrames(Rendering rendering) const {
    std::int64_t frames = 0;
    for (const Stretch& stretch : stretches) {
        if (stretch.rendering == rendering) frames += stretch.CountFrames();
    }
    return frames;
}

bool Inspection::IsComplete() const {
    const auto passes = [](const Reason& reason) { return reason.passedThrough; };
    return offline.empty() && std::none_of(stretches.begin(), stretches.end(), [&passes](const Stretch& stretch) {
               return std::any_of(stretch.reasons.begin(), stretch.reasons.end(), passes);
           });
}

const char* GetName(Rendering rendering) {
    constexpr std::array kNames = {"gap", "device", "partly host", "host"};
    return kNames[static_cast<std::size_t>(rendering)];
}

}  // namespace Vantrel::Host
