// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <optional>

#include "Host/Snapshot/IdentityBook.h"
#include "Host/Snapshot/MediaResolver.h"
#include "Host/Snapshot/Node.h"
#include "Host/Snapshot/TrackLayout.h"

namespace Vantrel::Host {

/// A layer of a segment at its start in sequence time, by the number of its video track.
struct LayerAt {
    std::int64_t anchor = 0;
    NodePtr node;
};
using MatteLookup = std::function<std::optional<LayerAt>(std::int32_t trackID)>;

/// An item that is about to become a clip node.
struct ClipRequest {
    const PlacedItem* placed = nullptr;
    TimeMap time;
    /// The item's own time at which its media start: parameter times count from there.
    std::int64_t mediaStart = 0;
    /// Number of the video track, from 1.
    std::int32_t trackID = 0;
};

[[nodiscard]] TimeMap MakeTimeMap(const Item& item, std::int64_t mediaStart, std::int64_t duration,
                                  std::int64_t frameTicks);

/// Whether an effect of the item takes its matte from another track.
[[nodiscard]] bool UsesTrackMatte(const Item& item);

/// Makes the nodes of one sequence: properties, flags and hashes.
class NodeFactory {
public:
    NodeFactory(const SequenceFormat& format, IdentityBook& identities) : mFormat(format), mIdentities(identities) {}

    /// @param input the media, or the compositor below an adjustment layer
    [[nodiscard]] NodePtr Clip(const ClipRequest& request, const NodePtr& input, const MatteLookup& mattes) const;
    [[nodiscard]] NodePtr Media(const ClipRequest& request, const ResolvedMedia& media) const;
    /// Of a sequence that the engine renders itself.
    [[nodiscard]] NodePtr NestedMedia(const ClipRequest& request, const SequencePtr& sequence) const;
    /// Of a sequence whose frames the host renders.
    [[nodiscard]] NodePtr VirtualMedia(const ClipRequest& request, const MediaClipPtr& clip) const;
    /// @param sequence the selected angle's; null if there is no such angle
    [[nodiscard]] NodePtr MulticamMedia(const ClipRequest& request, const SequencePtr& sequence,
                                        std::vector<NodeInput> angles) const;
    [[nodiscard]] NodePtr Compositor(std::vector<NodeInput> layers) const;
    [[nodiscard]] NodePtr Transition(const Item& transition, NodeInput outgoing, NodeInput incoming) const;
    [[nodiscard]] NodePtr Disabled(const NodePtr& clip) const;
    [[nodiscard]] NodePtr Adjustment(const NodePtr& below, const NodePtr& clip) const;
    [[nodiscard]] NodePtr Multicam(const Multicam& options, std::vector<NodeInput> angles) const;
    /// A colour that the engine leaves to the host, and with it the whole segment.
    [[nodiscard]] NodePtr HostSolid(const MediaClipPtr& clip) const;
    [[nodiscard]] NodePtr Preview(const MediaClipPtr& clip) const;

private:
    [[nodiscard]] NodePtr Effect(const Host::Effect& effect, const ClipRequest& request, bool still,
                                 const MatteLookup& mattes) const;
    void AddOperators(Node& clip, const ClipRequest& request, const NodePtr& input, const MatteLookup& mattes) const;
    [[nodiscard]] Node StartMedia(const ClipRequest& request, const MediaClipPtr& clip) const;
    [[nodiscard]] NodePtr Finish(Node node) const;

    SequenceFormat mFormat;
    IdentityBook& mIdentities;
};

}  // namespace Vantrel::Host
