// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <ostream>

#include "Halden/Strings.h"
#include "Src/Nodes/RenderNodeBase.h"

namespace Vantrel {

using Halden::WideString;

/// The base of everything that makes device frames: it turns the walk of the inputs into a cached render.
///
/// RenderFrame looks for a frame under the node's fingerprint, in the request's store and in the device's cache; only
/// without one do the inputs render and then Render, which a concrete node implements. A refused allocation is answered
/// by a purge and one more try. Everything here but GetFrameHash runs on the render thread, which holds the device.
class FilterNode : public RenderNodeBase {
public:
    static constexpr Guid kInterfaceID = kFilterNodeID;

    /// @param selfRendering the node renders its inputs itself, through RenderInput, and takes care of refused memory
    /// and
    ///                      of its timing where it allocates.
    /// @param wrapInputs    SetInput puts a node for motion and opacity before an input that has none.
    FilterNode(bool selfRendering, bool wrapInputs) : mSelfRendering(selfRendering), mWrapInputs(wrapInputs) {}

    Status QueryInterface(const Guid& iid, void** out) override;
    void SetInput(std::size_t index, const RenderNodeRef& node) override;
    Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       VideoFrameRef& frame) override;
    Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                    std::uint32_t level) override;

    /// The node's name: the match name of its description where a subclass has no fixed one.
    [[nodiscard]] virtual WideString GetName();
    /// Writes a line for this node, when it is named and took more than 0.01 ms, and then those of its inputs. The
    /// stream carries the number format.
    virtual void WriteTimings(std::ostream& stream);
    /// Does the node's work: takes the input's frame in the frame slot and leaves its own there, in place where it can.
    virtual Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) = 0;

    /// Keeps this frame out of the store; ends with EndFrame. A parent calls it before it renders the input.
    void SuppressCaching() { mCaching = false; }
    /// Takes that back within a frame, for a second picture of the same input in which nobody does its work.
    void ResumeCaching() { mCaching = true; }
    [[nodiscard]] bool IsCaching() const { return mCaching; }
    /// Milliseconds of device time of the last render; 0.0 when not measured.
    [[nodiscard]] float GetRenderTime() const { return mRenderTime; }

    /// Gives back all that can be given without touching a render in progress, after a refused allocation: finished
    /// inputs anywhere in the tree, what lies below this node's inputs, and pooled memory.
    void Purge(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results);

protected:
    /// Renders an input from within Render: an input that is refused memory is tried again after a purge, is safe from
    /// purges while it runs, and can be released by them once it has finished.
    Status RenderInput(const RenderNodeRef& input, const RenderToken& token, const RenderParams& params,
                       const RenderResultsRef& results, VideoFrameRef& frame);
    /// Runs `attempt()`, which returns a status; when memory was refused, purges and runs it once more.
    template <class Attempt>
    Status TryWithPurge(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                        const Attempt& attempt) {
        const Status status = attempt();
        if (status != Ostrand::kStatus_OutOfMemory) return status;
        Purge(token, params, results);
        return attempt();
    }
    /// The node with a node for motion and opacity before it, where it has none and isn't black; else the node itself.
    [[nodiscard]] RenderNodeRef WrapInput(const RenderNodeRef& node);
    /// A mark on the device's queue when timing is on, else empty.
    [[nodiscard]] Kiln::TimingMarkRef MarkWhenTiming() const;

    VideoFrameRef mFrameSlot;
    float mRenderTime = 0.0F;
    WideString mName;

private:
    [[nodiscard]] bool IsCacheable() const;
    [[nodiscard]] VideoFrameRef FindCachedFrame(const Guid& hash, const RenderResultsRef& results) const;
    Status RenderMissing(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                         bool cacheable, VideoFrameRef& frame);
    Status RenderTimed(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results);
    void KeepFrame(const Guid& hash, const RenderResultsRef& results, const VideoFrameRef& frame);
    [[nodiscard]] bool IsStill() const;
    void MakeRoom(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results);

    bool mSelfRendering;
    bool mWrapInputs;
    bool mCaching = true;
};

using FilterNodeRef = InterfaceRef<FilterNode>;

}  // namespace Vantrel
