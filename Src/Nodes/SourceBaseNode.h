// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/QueryTable.h"
#include "Src/Nodes/FilterNode.h"
#include "Vellum/Time.h"

namespace Vantrel {

/// A link of a media chain tells the rates at its output.
class ISourceNode : public Ostrand::OstrandUnknown {
public:
    static constexpr Guid kInterfaceID = kSourceNodeID;

    /// Of complete frames.
    [[nodiscard]] virtual Vellum::FrameRate GetFrameRate() = 0;
    /// Of fields; the frame rate where there are none.
    [[nodiscard]] virtual Vellum::FrameRate GetFieldRate() = 0;
};

using SourceNodeRef = InterfaceRef<ISourceNode>;

/// A link of a media chain, on top of FilterNode, TransformRenderParamsBaseNode or MultipleTimeInputBaseNode. It hands
/// the rates of the link below on; the last link before the producer reads them from the media's description, and is
/// therefore configured before it gets its input. A link has no fingerprint: the media node's covers the chain.
template <class Base>
class SourceBaseNode : public Base, public ISourceNode {
public:
    static constexpr Guid kInterfaceID = Base::kInterfaceID;

    explicit SourceBaseNode(bool selfRendering = false, bool wrapInputs = false) : Base(selfRendering, wrapInputs) {}

    void AddRef() override { Base::AddRef(); }
    void Release() override { Base::Release(); }
    Status QueryInterface(const Guid& iid, void** out) override {
        return Ostrand::QueryTable(this, iid, out).template Answer<ISourceNode>().template Otherwise<Base>();
    }

    void SetInput(std::size_t index, const RenderNodeRef& node) override {
        mUpstream = Ostrand::Query<ISourceNode>(node);
        if (!mUpstream) ReadRates();
        Base::SetInput(index, node);
    }
    Guid GetFrameHash(const RenderParams& /*params*/, const RenderResultsRef& /*results*/) override { return {}; }
    /// Passes the input's frame through.
    Status Render(const RenderToken& /*token*/, const RenderParams& /*params*/,
                  const RenderResultsRef& /*results*/) override {
        return Ostrand::kStatus_OK;
    }

    Vellum::FrameRate GetFrameRate() override { return mUpstream ? mUpstream->GetFrameRate() : mFrameRate; }
    Vellum::FrameRate GetFieldRate() override { return mUpstream ? mUpstream->GetFieldRate() : mFieldRate; }

private:
    void ReadRates() {
        const auto* media = dynamic_cast<const VideoMediaNode*>(this->GetDescription().get());
        if (!media) return;
        const auto fieldType = static_cast<std::uint32_t>(media->GetStreamFieldType());
        mFrameRate = Vellum::FrameRate::Create(media->GetStreamFrameRate());
        // Such a stream's rate counts fields; a frame is two of them.
        if (fieldType == Vellum::kFieldType_SeparateFields) mFrameRate *= fieldType - 2;
        const bool interlaced =
            fieldType == Vellum::kFieldType_UpperFirst || fieldType == Vellum::kFieldType_LowerFirst;
        mFieldRate = interlaced ? mFrameRate.Faster(2) : mFrameRate;
    }

    SourceNodeRef mUpstream;
    Vellum::FrameRate mFrameRate;
    Vellum::FrameRate mFieldRate;
};

}  // namespace Vantrel
