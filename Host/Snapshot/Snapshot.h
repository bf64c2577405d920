// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "Host/Snapshot/IdentityBook.h"
#include "Host/Snapshot/Node.h"

namespace Vantrel::Host {

struct SnapshotOptions {
    /// Directories searched for media that aren't where the file says.
    std::vector<std::string> mediaRoots;
    /// Directory of rendered previews named by segment hash; empty for none.
    std::string previews;
};

/// Everything that the engine may ask of one version of a timeline. Immutable; an edit makes a new one.
struct Snapshot {
    SequencePtr top;
    std::map<std::uint32_t, SequencePtr> sequences;
    /// Shifts timecodes shown or typed.
    std::int64_t globalStart = 0;
    /// Codec tag of the first file clip, 0 without one.
    std::uint32_t nativeSubType = 0;
    /// Each names file, place and thing.
    std::vector<std::string> warnings;
    /// Media that couldn't be opened, with the reason.
    std::vector<std::string> offline;

    /// Null for an unknown id.
    [[nodiscard]] SequencePtr Find(std::uint32_t timelineID) const;
};
using SnapshotPtr = std::shared_ptr<const Snapshot>;

/// Lays a document out and describes it. Media are probed on the calling thread, each path once.
[[nodiscard]] SnapshotPtr BuildSnapshot(const Document& document, const SnapshotOptions& options, IMediaProbe& probe,
                                        IdentityBook& identities);

}  // namespace Vantrel::Host
