// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/NestedTimelineNode.h"

#include "Ostrand/QueryTable.h"
#include "Src/Nodes/NodeIdentifiers.h"

namespace Vantrel {

Status NestedTimelineNode::QueryInterface(const Guid& iid, void** out) {
    return Ostrand::QueryTable(this, iid, out)
        .Answer<INestedTimelineNode>()
        .Answer<IRenderNode>(kMulticamNodeID)
        .Otherwise<MediaNode>();
}

Status NestedTimelineNode::Configure(const VideoNodeRef& description, const RenderRequirements& requirements,
                                     bool& host) {
    mSource = InterfaceRef<NestedTimelineSource>(new NestedTimelineSource);
    if (!Ostrand::Failed(mSource->Configure(description, requirements, host))) {
        SetInput(0, Ostrand::Query<IRenderNode>(mSource));
    }
    return MediaNode::Configure(description, requirements, host);
}

}  // namespace Vantrel
