// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>
#include <vector>

#include "Host/Snapshot/MediaResolver.h"
#include "Host/Snapshot/Snapshot.h"
#include "Host/Timeline/Model.h"

namespace Vantrel::Host {

/// Describes the sequences of a document: the top stack, compositions inside tracks, and angles of multicam sources.
class SequenceBuilder {
public:
    SequenceBuilder(const Document& document, const SnapshotOptions& options, IMediaProbe& probe,
                    IdentityBook& identities, Snapshot& snapshot);

    /// The sequence of the top stack; 1 is its id.
    [[nodiscard]] SequencePtr BuildTop();
    /// A composition that stands as an item in a track: its range and effects are the item's business.
    [[nodiscard]] SequencePtr BuildNested(const Item& composition, const SequenceFormat& parent);
    /// An angle of a multicam source: a sequence with that one layer.
    [[nodiscard]] SequencePtr BuildAngle(const Item& angle, const SequenceFormat& parent);

    [[nodiscard]] MediaResolver& GetMedia() { return mMedia; }
    [[nodiscard]] IdentityBook& GetIdentities() { return mIdentities; }
    void Warn(const Item& item, const std::string& message);

private:
    struct Layer;

    [[nodiscard]] SequenceFormat TopFormat();
    [[nodiscard]] SequencePtr Build(const std::string& key, const Item& named, const std::vector<const Item*>& layers,
                                    bool applyRanges, const SequenceFormat& format);
    [[nodiscard]] SegmentList AddPreviews(const SegmentList& plain, const SequenceFormat& format);

    const Document& mDocument;
    const SnapshotOptions& mOptions;
    IdentityBook& mIdentities;
    Snapshot& mSnapshot;
    MediaResolver mMedia;
    /// By key: a composition's path, with a mark for angles.
    std::map<std::string, SequencePtr> mBuilt;
};

}  // namespace Vantrel::Host
