// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "Ostrand/Allocated.h"
#include "Src/Nodes/FilterNode.h"
#include "Tests/Support/FakeDevice.h"
#include "Tests/Support/FakeFrame.h"

namespace Vantrel::Testing {

/// What happened to the probes of a test, in order: "name Phase".
using CallLog = std::vector<std::string>;

/// A leaf that isn't a filter node: every phase answers with `status` and writes `frame`, when it has one.
class ProbeLeaf : public RenderNodeBase, public Ostrand::Allocated<ProbeLeaf> {
public:
    ProbeLeaf(std::string leafName, CallLog& callLog) : name(std::move(leafName)), log(callLog) {}

    Status RequestHostFrames(const RenderParams& params, const RenderResultsRef&) override {
        return Note("RequestHostFrames", params);
    }
    Status CancelHostFrames(const RenderParams& params, const RenderResultsRef&) override {
        return Note("CancelHostFrames", params);
    }
    Status BeginUpload(const RenderToken&, const RenderParams& params, const RenderResultsRef&, bool,
                       VideoFrameRef& out) override {
        return Answer("BeginUpload", params, out);
    }
    Status FetchHostFrame(const RenderToken&, const RenderParams& params, const RenderResultsRef&, bool blocking,
                          VideoFrameRef& out) override {
        return Answer(blocking ? "FetchHostFrame blocking" : "FetchHostFrame", params, out);
    }
    Status RenderFrame(const RenderToken&, const RenderParams& params, const RenderResultsRef&,
                       VideoFrameRef& out) override {
        return Answer("RenderFrame", params, out);
    }
    Status EndFrame(const RenderToken&, const RenderParams& params, const RenderResultsRef&,
                    std::uint32_t level) override {
        if (onEnd) onEnd(level);
        return Note("EndFrame " + std::to_string(level), params);
    }
    Status CollectHostFrames(const RenderParams& params, const RenderResultsRef&, const RenderResultsRef&) override {
        return Note("CollectHostFrames", params);
    }

    std::string name;
    CallLog& log;
    Status status = Ostrand::kStatus_OK;
    VideoFrameRef frame;
    RenderParams lastParams;
    std::function<void(std::uint32_t level)> onEnd;

protected:
    std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    Status Note(const std::string& phase, const RenderParams& params) {
        log.push_back(name + " " + phase);
        lastParams = params;
        return status;
    }
    Status Answer(const std::string& phase, const RenderParams& params, VideoFrameRef& out) {
        if (frame) out = frame;
        return Note(phase, params);
    }
};

/// A filter node, or a node of a derived base, whose work is a function. It notes its renders, hashes and ends.
template <class Base>
class ProbeOf : public Base {
public:
    ProbeOf(std::string probeName, CallLog& callLog, bool selfRendering = false, bool wrapInputs = false)
        : Base(selfRendering, wrapInputs), name(std::move(probeName)), log(callLog) {}

    Guid GetFrameHash(const RenderParams& params, const RenderResultsRef& results) override {
        ++hashCalls;
        return hash ? *hash : Base::GetFrameHash(params, results);
    }
    WideString GetName() override { return Halden::ToWide(name); }
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override {
        log.push_back(name + " Render");
        lastParams = params;
        lastToken = token;
        return work ? work(this->mFrameSlot) : Base::Render(token, params, results);
    }
    Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                    std::uint32_t level) override {
        log.push_back(name + " EndFrame " + std::to_string(level));
        return Base::EndFrame(token, params, results, level);
    }
    using Base::mFrameSlot;
    using Base::mRenderTime;
    using Base::RenderInput;

    std::string name;
    CallLog& log;
    std::optional<Guid> hash;
    std::function<Status(VideoFrameRef& slot)> work;
    RenderParams lastParams;
    RenderToken lastToken;
    int hashCalls = 0;
};

/// The abstract Render of FilterNode, as an effect with nothing to do.
class IdleFilter : public FilterNode {
public:
    using FilterNode::FilterNode;
    Status Render(const RenderToken&, const RenderParams&, const RenderResultsRef&) override {
        return Ostrand::kStatus_OK;
    }
};

class ProbeFilter final : public ProbeOf<IdleFilter>, public Ostrand::Allocated<ProbeFilter> {
public:
    using ProbeOf::ProbeOf;

protected:
    std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

using ProbeLeafRef = InterfaceRef<ProbeLeaf>;
using ProbeFilterRef = InterfaceRef<ProbeFilter>;

/// What a probe makes where it renders a new frame.
inline std::function<Status(VideoFrameRef&)> MakesFrame(const VideoFrameRef& frame) {
    return [frame](VideoFrameRef& slot) {
        slot = frame;
        return Ostrand::kStatus_OK;
    };
}

/// A fingerprint that tests tell apart by a number.
inline Guid HashOf(std::uint32_t number) { return {number, 1, 2, {3}}; }

/// A device, results and params for a tree of probes.
struct ProbeStage {
    boost::shared_ptr<FakeDevice> device = boost::make_shared<FakeDevice>();
    RenderResultsRef results = boost::make_shared<RenderResults>();
    RenderParams params;
    CallLog log;

    ProbeStage() {
        params.outputRect = {0, 0, 64, 36};
        params.sequenceRect = {0, 0, 1920, 1080};
        params.frameTicks = params.sequenceFrameTicks = 1000;
        params.quality = 2;
    }
    [[nodiscard]] RenderRequirements Requirements() const { return {{0, 0, 1920, 1080}, 1000, {1, 1}, 0, device}; }
    template <class Node>
    InterfaceRef<Node> Configured(InterfaceRef<Node> node, const VideoNodeRef& description = {}) {
        bool host = false;
        node->Configure(description, Requirements(), host);
        return node;
    }
    [[nodiscard]] ProbeLeafRef Leaf(const std::string& name) { return ProbeLeafRef(new ProbeLeaf(name, log)); }
    [[nodiscard]] ProbeFilterRef Filter(const std::string& name, bool selfRendering = false, bool wrapInputs = false,
                                        const VideoNodeRef& description = {}) {
        return Configured(ProbeFilterRef(new ProbeFilter(name, log, selfRendering, wrapInputs)), description);
    }
    Status Render(IRenderNode& node, VideoFrameRef& frame) { return node.RenderFrame({}, params, results, frame); }
    /// The log so far, which begins anew.
    CallLog TakeLog() { return std::exchange(log, {}); }
};

}  // namespace Vantrel::Testing
