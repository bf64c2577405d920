// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <vector>

#include "Src/Nodes/NodeIdentifiers.h"
#include "Src/VideoNodes/VideoMediaNode.h"
#include "Vantrel/IRenderNode.h"

namespace Vantrel {

/// What a phase does with an input, called with the params that are meant for it. It refers to a function that outlives
/// the call it is passed to: walks are frequent, and nothing is copied or allocated for them.
class InputCall {
public:
    template <class Call>
    InputCall(const Call& call)  // NOLINT(google-explicit-constructor): stands for the function in argument lists
        : mCall(&call), mInvoke([](const void* function, IRenderNode& input, const RenderParams& params) -> Status {
              return (*static_cast<const Call*>(function))(input, params);
          }) {}
    Status operator()(IRenderNode& input, const RenderParams& params) const { return mInvoke(mCall, input, params); }

private:
    const void* mCall;
    Status (*mInvoke)(const void* call, IRenderNode& input, const RenderParams& params);
};

/// What all nodes share: inputs, description, requirements, and phases that simply walk the inputs.
///
/// The phases with a status call each input in turn and stop at the first failure, so that the last input wins the out
/// frame; CancelHostFrames and EndFrame reach every input whatever happens. The inputs and what Configure stores don't
/// change while a frame renders, and no field is locked.
///
/// A concrete class also derives from Ostrand::Allocated<T>, which gives it its counter, and answers GetRef() with it.
class RenderNodeBase : public IRenderNode {
public:
    static constexpr Guid kInterfaceID = kRenderNodeBaseID;

    RenderNodeBase() = default;
    RenderNodeBase(const RenderNodeBase&) = delete;
    RenderNodeBase& operator=(const RenderNodeBase&) = delete;

    void AddRef() override;
    void Release() override;
    Status QueryInterface(const Guid& iid, void** out) override;

    void SetInput(std::size_t index, const RenderNodeRef& node) override;
    Status RequestHostFrames(const RenderParams& params, const RenderResultsRef& results) override;
    Status CancelHostFrames(const RenderParams& params, const RenderResultsRef& results) override;
    Status BeginUpload(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       bool blocking, VideoFrameRef& frame) override;
    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    Status FetchHostFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                          bool blocking, VideoFrameRef& frame) override;
    Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       VideoFrameRef& frame) override;
    Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                    std::uint32_t level) override;
    Status CollectHostFrames(const RenderParams& params, const RenderResultsRef& results,
                             const RenderResultsRef& previous) override;
    /// The host's fingerprint of the description, asked for once per node, time and results. Nil without a description,
    /// or when the host refuses.
    Guid GetFrameHash(const RenderParams& params, const RenderResultsRef& results) override;

    [[nodiscard]] std::size_t GetInputCount() const { return mInputs.size(); }
    /// Empty for an index without a node.
    [[nodiscard]] RenderNodeRef GetInput(std::size_t index) const {
        return index < mInputs.size() ? mInputs[index] : RenderNodeRef();
    }
    [[nodiscard]] const VideoNodeRef& GetDescription() const { return mDescription; }
    /// The media of the clip that the description's parent is, read at first need and kept; empty when there is none.
    [[nodiscard]] VideoMediaNodeRef GetMediaDescription() const;
    [[nodiscard]] const Kiln::DeviceRef& GetDevice() const { return mDevice; }
    [[nodiscard]] const Vellum::Rect& GetFrameRect() const { return mFrameRect; }
    [[nodiscard]] std::int64_t GetFrameTicks() const { return mFrameTicks; }
    [[nodiscard]] Vellum::PixelAspectRatio GetPixelAspectRatio() const { return mPixelAspectRatio; }
    [[nodiscard]] std::uint32_t GetFieldType() const { return mFieldType; }
    /// What Configure was given, put together again.
    [[nodiscard]] RenderRequirements GetRequirements() const;

    /// A time of the params as the time at which the description is read. Effects read their parameters at
    /// GetNodeTime(params.clipTime, false).
    [[nodiscard]] std::int64_t GetNodeTime(std::int64_t time, bool raw) const;

protected:
    /// The counter of the concrete class.
    [[nodiscard]] virtual std::atomic<std::int32_t>& GetRef() = 0;

    /// The walk of the phases that make host frames ready: requests, cancels, uploads, fetches, collections. A subclass
    /// decides here which inputs they reach and with which params; a walk ends at the first call that fails.
    virtual Status WalkPhase(const RenderParams& params, const InputCall& call);

    /// Calls `visit(input, index)` for each input that isn't null until one fails. Inputs may be added meanwhile.
    template <class Visit>
    Status WalkInputs(const Visit& visit) {
        for (std::size_t index = 0; index < mInputs.size(); ++index) {
            const RenderNodeRef input = mInputs[index];
            const Status status = input ? visit(*input, index) : Ostrand::kStatus_OK;
            if (Ostrand::Failed(status)) return status;
        }
        return Ostrand::kStatus_OK;
    }
    /// The same, to the end and without a status.
    template <class Visit>
    void VisitInputs(const Visit& visit) {
        static_cast<void>(WalkInputs([&visit](IRenderNode& input, std::size_t index) {
            visit(input, index);
            return Ostrand::kStatus_OK;
        }));
    }

    std::vector<RenderNodeRef> mInputs;
    VideoNodeRef mDescription;
    Vellum::Rect mFrameRect;
    std::int64_t mFrameTicks = 0;
    Vellum::PixelAspectRatio mPixelAspectRatio = Vellum::kPixelAspectRatio_Unknown;
    std::uint32_t mFieldType = Vellum::kFieldType_Unknown;
    Kiln::DeviceRef mDevice;

private:
    /// Reached through boost::atomic_load and atomic_store: phases on different threads may be the first to need it.
    mutable VideoMediaNodeRef mMediaDescription;
};

}  // namespace Vantrel
