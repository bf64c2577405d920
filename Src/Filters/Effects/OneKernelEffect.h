// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Kernels/KernelLaunch.h"
#include "Src/Kernels/KernelTable.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// A kernel of a node, kept in static storage beside the node's Render. The module key is the path of the node's files
/// without an extension.
struct EffectKernel {
    const char* moduleKey;
    const char* kernelName;
    KernelTable table;

    /// The kernel on a device, 0 when there is none.
    [[nodiscard]] std::uint64_t Find(const Kiln::DeviceRef& device) {
        return GetKernel(table, device, moduleKey, kernelName);
    }
};

/// A device frame as kernels take it. Holds the frame's memory.
class KernelFrame {
public:
    /// A null frame, or one without rows, raises NullInterfaceException.
    explicit KernelFrame(const VideoFrameRef& frame)
        : mFormat(Demand(frame)->GetPixelFormat()),
          mBounds(frame->GetBounds()),
          mData(Ostrand::Query<Marl::IFrameData>(frame)),
          mRows(Ostrand::Demand<Marl::IFrameRows>(frame)) {}

    [[nodiscard]] std::int32_t Width() const { return mBounds.Width(); }
    [[nodiscard]] std::int32_t Height() const { return mBounds.Height(); }
    [[nodiscard]] Vellum::PixelFormat Format() const { return mFormat; }
    [[nodiscard]] std::int32_t RowBytes() const { return mRows->GetRowBytes(); }
    /// In pixels.
    [[nodiscard]] std::int32_t Pitch() const { return PitchInPixels(mRows->GetRowBytes(), mFormat); }
    /// A frame without memory of its own raises NullInterfaceException.
    [[nodiscard]] DeviceValue Data() const { return mData->GetData(); }
    /// Blocks of 16 by 16 over the whole frame.
    [[nodiscard]] GridSize Grid() const { return GridFor(Width(), Height()); }

private:
    static const VideoFrameRef& Demand(const VideoFrameRef& frame) {
        if (!frame) throw Ostrand::NullInterfaceException();
        return frame;
    }

    Vellum::PixelFormat mFormat;
    Vellum::Rect mBounds;
    InterfaceRef<Marl::IFrameData> mData;
    InterfaceRef<Marl::IFrameRows> mRows;
};

/// Makes a progressive frame of the input's size and attributes. A null input raises NullInterfaceException.
[[nodiscard]] Status MakeFrameLike(const Kiln::DeviceRef& device, const VideoFrameRef& input, VideoFrameRef& frame);

/// The base of effects that run one kernel over the frame of their one input. What is left to such an effect is to read
/// its parameters, to see that it has nothing to do, and to list the kernel's arguments:
///
///     Status VignetteNode::Render(...) {
///         DemandInputFrame();
///         const std::int64_t time = GetNodeTime(params.clipTime, false);
///         const float amount = mDescription->GetFloatParam(kVignette_Amount, time) / 100.0F;
///         if (amount == 0.0F) return Ostrand::kStatus_OK;
///         return RenderNewFrame(gKernel, [&](std::uint64_t kernel, const KernelFrame& out, const KernelFrame& in) {
///             return Launch2D(mDevice, kernel, out.Grid(), {}, VignetteKernel, in.Format(), out.Data(), ...);
///         });
///     }
class OneKernelEffect : public FilterNode {
protected:
    OneKernelEffect() : FilterNode(false, false) {}

    /// An empty frame slot raises NullInterfaceException.
    void DemandInputFrame() const {
        if (!mFrameSlot) throw Ostrand::NullInterfaceException();
    }

    /// Makes a frame like the input's, runs `launch(kernel, out, in)`, which returns a status, and leaves the new frame
    /// in the frame slot. After a failure the input's frame is there again, so that another try starts from the same
    /// place.
    template <class LaunchFunction>
    Status RenderNewFrame(EffectKernel& kernel, const LaunchFunction& launch) {
        return RenderNewFrame([&](const KernelFrame& out, const KernelFrame& in) {
            const std::uint64_t handle = kernel.Find(mDevice);
            return handle == 0 ? Ostrand::kStatus_Failure : launch(handle, out, in);
        });
    }

    /// The same for more than one kernel: runs `work(out, in)`.
    template <class WorkFunction>
    Status RenderNewFrame(const WorkFunction& work) {
        const VideoFrameRef input = mFrameSlot;
        const Status status = RunOnNewFrame(work, input);
        if (!Ostrand::Failed(status)) return Ostrand::kStatus_OK;
        mFrameSlot = input;
        return status;
    }

    /// Runs `launch(kernel, frame)` on the frame in the frame slot, which the kernel changes.
    template <class LaunchFunction>
    Status RenderInPlace(EffectKernel& kernel, const LaunchFunction& launch) {
        const KernelFrame frame(mFrameSlot);
        const std::uint64_t handle = kernel.Find(mDevice);
        return handle == 0 ? Ostrand::kStatus_Failure : launch(handle, frame);
    }

private:
    template <class WorkFunction>
    Status RunOnNewFrame(const WorkFunction& work, const VideoFrameRef& input) {
        const KernelFrame in(input);
        if (Ostrand::Failed(MakeFrameLike(mDevice, input, mFrameSlot))) return Ostrand::kStatus_OutOfMemory;
        const KernelFrame out(mFrameSlot);
        static_cast<void>(out.Data());
        return work(out, in);
    }
};

}  // namespace Vantrel
