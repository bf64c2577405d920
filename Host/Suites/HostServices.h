// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <utility>

#include "Host/Snapshot/IdentityBook.h"
#include "Host/Snapshot/Snapshot.h"
#include "Vantrel/HostSuites.h"

namespace Vantrel::Host {

class NodeTable;
class OpaqueDataTable;
class SegmentListTable;

/// What stands behind the host's suites. Their entries are plain functions without a context, so there is one of it in
/// a process. The suites of description, memory and opaque data are its own; the renderer adds the others.
///
/// All members may be called from several threads at once but for OfferSuite, which belongs before the engine's start.
/// No lock is held over more than a look-up, and none while anything outside is called.
class HostServices {
public:
    [[nodiscard]] static HostServices& Instance();

    /// The record for the engine's start.
    [[nodiscard]] const QuillBasicSuite* GetBasicSuite() const;
    /// Offers a table under a name and version, replacing an earlier one. The table stays valid until the process ends.
    void OfferSuite(const std::string& name, std::int32_t version, const void* table);
    /// Null for an unknown name or version. Names are compared as text.
    [[nodiscard]] const void* FindSuite(const char* name, std::int32_t version) const;

    /// Makes a snapshot the one that the engine reads from now on. Ids that were handed out before keep what they stand
    /// for.
    void Publish(SnapshotPtr snapshot);
    /// Null before the first one.
    [[nodiscard]] SnapshotPtr GetSnapshot() const;

    [[nodiscard]] IdentityBook& GetIdentities() { return mIdentities; }
    [[nodiscard]] NodeTable& GetNodes() { return *mNodes; }
    [[nodiscard]] SegmentListTable& GetSegmentLists() { return *mSegmentLists; }
    [[nodiscard]] OpaqueDataTable& GetOpaqueData() { return *mOpaqueData; }
    /// What a node id stands for; null for an id that isn't held.
    [[nodiscard]] NodePtr FindNode(std::uint32_t nodeID) const;
    [[nodiscard]] MediaClipPtr FindClip(std::uint32_t clipID) const { return mIdentities.FindClip(clipID); }

    HostServices(const HostServices&) = delete;
    HostServices& operator=(const HostServices&) = delete;

private:
    HostServices();
    ~HostServices();

    IdentityBook mIdentities;
    std::unique_ptr<NodeTable> mNodes;
    std::unique_ptr<SegmentListTable> mSegmentLists;
    std::unique_ptr<OpaqueDataTable> mOpaqueData;
    SnapshotPtr mSnapshot;
    std::map<std::pair<std::string, std::int32_t>, const void*> mSuites;
};

}  // namespace Vantrel::Host
