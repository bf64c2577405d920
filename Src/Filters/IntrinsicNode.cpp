// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/IntrinsicNode.h"

#include "Ostrand/MixHash.h"
#include "Src/Filters/LayerMotion.h"
#include "Src/Filters/ScopedRenderTime.h"

namespace Vantrel {

IntrinsicNode::IntrinsicNode() : FilterNode(true, false) {}

WideString IntrinsicNode::GetName() {
    const WideString name = FilterNode::GetName();
    return name.empty() ? u"Intrinsic Node" : name;
}

Guid IntrinsicNode::GetFrameHash(const RenderParams& params, const RenderResultsRef& results) {
    Guid hash;
    if (results && results->FindHash(this, params.time, hash)) return hash;
    const Guid base = FilterNode::GetFrameHash(params, results);
    if (base.IsNil()) return base;

    LayerMotion motion;
    ReadLayerMotion(motion, *this, params, results, false, false);
    const WideString name = GetName();
    hash = Ostrand::NodeHasher()
               .Text("IntrinsicNode")
               .Identifier(base)
               .Bytes(name.data(), name.size() * sizeof(char16_t))
               .Value(motion.opacity)
               .Value(motion.blendMode)
               .Value(motion.positionX)
               .Value(motion.positionY)
               .Value(motion.scaleX)
               .Value(motion.scaleY)
               .Value(motion.rotation)
               .Value(motion.anchorX)
               .Value(motion.anchorY)
               .Finish();
    if (results) results->StoreHash(this, params.time, hash);
    return hash;
}

Status IntrinsicNode::Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) {
    if (GetInputCount() != 1) return Ostrand::kStatus_Failure;

    const bool isMotion = GetName() == u"TQ.XQVE Motion";
    LayerMotion motion;
    ReadLayerMotion(motion, *this, params, results, !isMotion, isMotion);

    if (const RenderNodeRef input = GetInput(0)) {
        const Status status = TryWithPurge(token, params, results,
                                           [&] { return input->RenderFrame(token, params, results, mFrameSlot); });
        if (Ostrand::Failed(status)) {
            mFrameSlot.Reset();
            return status;
        }
    }
    if (!mFrameSlot) return Ostrand::kStatus_Failure;

    const ScopedRenderTime timer(mDevice, mRenderTime);
    const VideoFrameRef source = mFrameSlot;
    mFrameSlot = TransformFrame(mDevice, params, motion, source);
    if (!mFrameSlot) {
        Purge(token, params, results);
        mFrameSlot = TransformFrame(mDevice, params, motion, source);
    }
    return mFrameSlot ? Ostrand::kStatus_OK : Ostrand::kStatus_Failure;
}

}  // namespace Vantrel
