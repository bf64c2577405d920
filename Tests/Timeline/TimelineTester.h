// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <set>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "Ostrand/Allocated.h"
#include "Shared/Src/Timeline.h"
#include "Src/Filters/INestedTimelineNode.h"
#include "Src/VideoNodes/VideoNode.h"
#include "Tests/Support/HostedTest.h"
#include "Tests/Timeline/VerdictCount.h"

namespace Vantrel::Testing {

/// A render node that does nothing but remember what it was given. One made for a nested sequence takes its trees.
class ProbeNode final : public IRenderNode, public INestedTimelineNode, public Ostrand::Allocated<ProbeNode> {
public:
    struct SegmentTree {
        RenderNodeRef tree;
        std::int64_t start, sourceStart, end;
    };

    ProbeNode(std::string key, VideoNodeRef description, const RenderRequirements& requirements);

    void AddRef() override { ++mRefCount; }
    void Release() override;
    Status QueryInterface(const Guid& iid, void** out) override;
    void SetInput(std::size_t index, const RenderNodeRef& node) override;
    void AddSegmentTree(const RenderNodeRef& tree, std::int64_t start, std::int64_t sourceStart,
                        std::int64_t end) override;
    void SetDefaultTree(const RenderNodeRef& tree) override { defaultTree = tree; }

    // No test here renders.
    Status RequestHostFrames(const RenderParams&, const RenderResultsRef&) override { return 0; }
    Status CancelHostFrames(const RenderParams&, const RenderResultsRef&) override { return 0; }
    Status BeginUpload(const RenderToken&, const RenderParams&, const RenderResultsRef&, bool,
                       VideoFrameRef&) override {
        return 0;
    }
    Status Configure(const VideoNodeRef&, const RenderRequirements&, bool&) override { return 0; }
    Status FetchHostFrame(const RenderToken&, const RenderParams&, const RenderResultsRef&, bool,
                          VideoFrameRef&) override {
        return 0;
    }
    Status RenderFrame(const RenderToken&, const RenderParams&, const RenderResultsRef&, VideoFrameRef&) override {
        return 0;
    }
    Status EndFrame(const RenderToken&, const RenderParams&, const RenderResultsRef&, std::uint32_t) override {
        return 0;
    }
    Status CollectHostFrames(const RenderParams&, const RenderResultsRef&, const RenderResultsRef&) override {
        return 0;
    }
    Guid GetFrameHash(const RenderParams&, const RenderResultsRef&) override { return {}; }

    std::string key;
    VideoNodeRef description;
    RenderRequirements requirements;
    std::vector<RenderNodeRef> inputs;
    std::vector<SegmentTree> segmentTrees;
    RenderNodeRef defaultTree;
};

/// A timeline over a scripted host and a scripted node creator.
class TimelineTester : public HostedTest, protected CreatorScript {
protected:
    static constexpr std::uint32_t kTop = 1;
    static constexpr std::uint32_t kInner = 2;

    TimelineTester() { host.sequences[kTop].hash = NumberedGuid(10000); }

    // The script. Media has the sequence's size and rate and plays natively.
    void AddMedia(std::uint32_t id);
    void AddEffect(std::uint32_t id, const std::string& matchName);
    void AddClip(std::uint32_t id, std::uint32_t media, const std::vector<std::uint32_t>& effects = {});
    void AddNode(std::uint32_t id, const std::string& kind, const std::vector<std::uint32_t>& inputs = {});
    /// A clip of media of its own, whose id is the clip's plus 500.
    void AddPlainClip(std::uint32_t id, const std::vector<std::uint32_t>& effects = {});
    /// A clip whose media, the clip's id plus 500, is the inner sequence.
    void AddNestedClip(std::uint32_t id);
    void AddSegment(std::uint32_t sequence, std::int64_t start, std::int64_t end, std::uint32_t node,
                    std::int64_t offset = 0, std::uint32_t content = 0);
    /// The sequence shall tell another hash from now on.
    void Change() { host.sequences[kTop].hash = NumberedGuid(++mGeneration + 10000); }

    static Guid NumberedGuid(std::uint32_t number) { return {number, 0, 0, {}}; }
    static ProbeNode& Probe(const RenderNodeRef& node) { return static_cast<ProbeNode&>(*node); }
    /// A tree as "key(input, input)", with "-" for no node.
    static std::string Describe(const RenderNodeRef& node);

    /// Makes the timeline, which reads the sequence.
    Timeline& Read(bool usePreviews = false, std::uint32_t nativeSubType = 0, Timeline* parent = nullptr);
    [[nodiscard]] std::unique_ptr<Timeline> MakeTimeline(std::uint32_t id, bool usePreviews,
                                                         std::uint32_t nativeSubType, Timeline* parent);
    [[nodiscard]] SegmentInfo InfoAt(std::int64_t ticks, bool merged = false) const;
    /// The tree of a segment that shows one node, and what is known of it.
    SegmentInfo Build(std::uint32_t node);

    std::vector<std::string> created;  ///< keys that were asked for, in order
    std::unique_ptr<Timeline> timeline;

private:
    RenderNodeRef CreateNode(const Halden::WideString& key, const VideoNodeRef& description,
                             const RenderRequirements& requirements, bool& needsHost);

    std::uint32_t mGeneration = 0;
};

}  // namespace Vantrel::Testing
