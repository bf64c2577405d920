// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/HostRenderSubtreeNode.h"

#include "Src/Filters/StreamGeometry.h"
#include "Src/Nodes/FrameSizeLimit.h"

namespace Vantrel {

Status HostRenderSubtreeNode::Configure(const VideoNodeRef& description, const RenderRequirements& requirements,
                                        bool& host) {
    if (description) {
        const NodeType type = description->GetNodeType();
        if (type == NodeType::kClip || type == NodeType::kTransition || type == NodeType::kEffect) host = true;
        if (type == NodeType::kMedia) {
            const auto media = boost::dynamic_pointer_cast<VideoMediaNode>(description);
            const StreamGeometry stream = StreamGeometry::Read(*media);
            if (stream.scalePolicy == 0 && ExceedsDeviceMemory(stream.rect, *requirements.device)) {
                return Ostrand::kStatus_Failure;
            }
        }
    }
    return RenderNodeBase::Configure(description, requirements, host);
}

}  // namespace Vantrel
