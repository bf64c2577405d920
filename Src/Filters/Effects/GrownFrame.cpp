// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/GrownFrame.h"

#include "Src/Nodes/FrameSizeLimit.h"
#include "Src/VideoNodes/VideoMediaNode.h"
#include "Src/VideoNodes/VideoNodeFactory.h"

namespace Vantrel {

bool FitsAtEveryKeyframe(const VideoNode& effect, const RenderRequirements& requirements, std::int32_t parameter,
                         const std::function<Vellum::Point(std::int64_t)>& pad) {
    Vellum::Rect rect = requirements.frameRect;
    if (const VideoMediaNodeRef media = GetClipMedia(effect.GetParent())) rect = media->GetStreamFrameRect();
    for (std::int64_t time = 0;;) {
        const Vellum::Point grown = pad(time);
        if (ExceedsDeviceMemory({0, 0, rect.Width() + 2 * grown.x, rect.Height() + 2 * grown.y}, *requirements.device))
            return false;
        std::int64_t next = 0;
        std::int32_t keyframe = 0;
        const Status status = effect.GetNextKeyframeTime(parameter, time, next, keyframe);
        // A host that gives the same key again has no later one.
        if (Ostrand::Failed(status) || next <= time) return true;
        time = next;
    }
}

}  // namespace Vantrel
