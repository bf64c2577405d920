// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Timeline/TimelineTester.h"

#include <utility>

namespace Vantrel::Testing {

ProbeNode::ProbeNode(std::string probeKey, VideoNodeRef probeDescription, const RenderRequirements& probeRequirements)
    : key(std::move(probeKey)), description(std::move(probeDescription)), requirements(probeRequirements) {}

void ProbeNode::Release() {
    if (--mRefCount == 0) delete this;
}

Status ProbeNode::QueryInterface(const Guid& iid, void** out) {
    const bool takesTrees = key == "NestedTimelineNode";
    *out = nullptr;
    if (iid == IRenderNode::kInterfaceID) *out = static_cast<IRenderNode*>(this);
    if (iid == INestedTimelineNode::kInterfaceID && takesTrees) *out = static_cast<INestedTimelineNode*>(this);
    if (!*out) return Ostrand::kStatus_NoInterface;
    AddRef();
    return Ostrand::kStatus_OK;
}

void ProbeNode::SetInput(std::size_t index, const RenderNodeRef& node) {
    if (inputs.size() <= index) inputs.resize(index + 1);
    inputs[index] = node;
}

void ProbeNode::AddSegmentTree(const RenderNodeRef& tree, std::int64_t start, std::int64_t sourceStart,
                               std::int64_t end) {
    segmentTrees.push_back({tree, start, sourceStart, end});
}

void TimelineTester::AddMedia(std::uint32_t id) {
    FakeNode media;
    media.kind = "Media";
    media.properties = {{"MediaNode::StreamFrameWidth", "64"},
                        {"MediaNode::StreamFrameHeight", "36"},
                        {"MediaNode::StreamFrameRate", "10160640000"}};
    host.nodes[id] = media;
}

void TimelineTester::AddEffect(std::uint32_t id, const std::string& matchName) {
    FakeNode effect;
    effect.kind = "Effect";
    effect.properties = {{"EffectNode::FilterMatchName", matchName}};
    host.nodes[id] = effect;
}

void TimelineTester::AddClip(std::uint32_t id, std::uint32_t media, const std::vector<std::uint32_t>& effects) {
    AddNode(id, "Clip", {media});
    host.nodes[id].operators = effects;
}

void TimelineTester::AddNode(std::uint32_t id, const std::string& kind, const std::vector<std::uint32_t>& inputs) {
    FakeNode node;
    node.kind = kind;
    for (const std::uint32_t input : inputs) node.inputs.push_back({input});
    host.nodes[id] = node;
}

void TimelineTester::AddPlainClip(std::uint32_t id, const std::vector<std::uint32_t>& effects) {
    AddMedia(id + 500);
    AddClip(id, id + 500, effects);
}

void TimelineTester::AddNestedClip(std::uint32_t id) {
    AddPlainClip(id);
    host.nodes[id + 500].properties["MediaNode::NestedSequenceTimelineID"] = std::to_string(kInner);
}

void TimelineTester::AddSegment(std::uint32_t sequence, std::int64_t start, std::int64_t end, std::uint32_t node,
                                std::int64_t offset, std::uint32_t content) {
    const FakeSegment segment{start, end, offset, NumberedGuid(content != 0 ? content : node), node};
    host.sequences[sequence].segments.push_back(segment);
    host.sequences[sequence].previewSegments.push_back(segment);
}

std::string TimelineTester::Describe(const RenderNodeRef& node) {
    if (!node) return "-";
    std::string text = Probe(node).key;
    const char* before = "(";
    for (const RenderNodeRef& input : Probe(node).inputs) {
        text += before + Describe(input);
        before = ", ";
    }
    return Probe(node).inputs.empty() ? text : text + ")";
}

std::unique_ptr<Timeline> TimelineTester::MakeTimeline(std::uint32_t id, bool usePreviews, std::uint32_t nativeSubType,
                                                       Timeline* parent) {
    const auto create = [this](const Halden::WideString& key, const VideoNodeRef& description,
                               const RenderRequirements& requirements,
                               bool& needsHost) { return CreateNode(key, description, requirements, needsHost); };
    const auto isRegistered = [this](const Halden::WideString& key) {
        return unregistered.count(Halden::ToUTF8(key)) == 0;
    };
    return std::make_unique<Timeline>(id, usePreviews, "", nativeSubType, nullptr, parent, create, isRegistered);
}

Timeline& TimelineTester::Read(bool usePreviews, std::uint32_t nativeSubType, Timeline* parent) {
    timeline = MakeTimeline(kTop, usePreviews, nativeSubType, parent);
    return *timeline;
}

SegmentInfo TimelineTester::InfoAt(std::int64_t ticks, bool merged) const {
    SegmentInfo info;
    EXPECT_EQ(timeline->GetSegmentInfo(ticks, info, merged), Ostrand::kStatus_OK) << "at " << ticks;
    return info;
}

SegmentInfo TimelineTester::Build(std::uint32_t node) {
    host.sequences[kTop].segments.clear();
    AddSegment(kTop, 0, 1000, node);
    Read();
    return InfoAt(0);
}

RenderNodeRef TimelineTester::CreateNode(const Halden::WideString& key, const VideoNodeRef& description,
                                         const RenderRequirements& requirements, bool& needsHost) {
    std::string name = Halden::ToUTF8(key);
    created.push_back(name);
    if (refused.count(name) != 0) return {};
    if (unregistered.count(name) != 0 || failing.count(name) != 0) name = "HostRenderSubtree";
    if (name == "HostRenderSubtree" && description) {
        // Media in their own right and whole structures don't count as work that the device couldn't do.
        const NodeType type = description->GetNodeType();
        needsHost |= type == NodeType::kClip || type == NodeType::kTransition || type == NodeType::kEffect;
    }
    if (needHost.count(name) != 0) needsHost = true;
    return RenderNodeRef(new ProbeNode(name, description, requirements));
}

}  // namespace Vantrel::Testing
