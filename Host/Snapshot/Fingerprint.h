// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Host/Snapshot/Node.h"
#include "Vantrel/HostSuites.h"

/// Fingerprints of frames: equal exactly when the description says that the pictures are. Nothing is rendered or
/// opened; the calls come for every node and frame.
namespace Vantrel::Host {

/// Of the picture of a node. Where a description asks for an interlaced picture, the moment of its second field counts
/// too.
/// @param nodeTime media time for media; for a clip or nested sequence what TransformTime gave for its own time; for
/// all
///                 other kinds the node's own time
/// @param fieldTicks half a frame of the sequence; 0 to leave the second field out
[[nodiscard]] Guid NodeFingerprint(const Node& node, std::int64_t nodeTime, const VantrelRenderDescription& description,
                                   std::int64_t fieldTicks = 0);

/// Of the picture of a clip after its operators before `endOperator`.
/// @param rawTime the clip's own time, or its hold time where effects stand still with the picture
[[nodiscard]] Guid OperatorsFingerprint(const Node& clip, std::int32_t endOperator, std::int64_t rawTime,
                                        const VantrelRenderDescription& description, std::int64_t fieldTicks = 0);

/// Of one undecorated media frame.
[[nodiscard]] Guid ClipFingerprint(const MediaClip& clip, std::int64_t mediaTime, const VantrelClipRecord& record);

/// The number of the frame that media show at a media time: the nearest one outside the media.
[[nodiscard]] std::int64_t MediaFrameAt(const MediaInfo& info, std::int64_t mediaTime);

/// The item's times behind what the engine hands over with a request for a clip's operators.
[[nodiscard]] ItemTimes TimesOfRawTime(const ItemDetail& item, std::int64_t rawTime);

}  // namespace Vantrel::Host
