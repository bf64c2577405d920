// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <shared_mutex>
#include <unordered_map>

#include "Host/Snapshot/Snapshot.h"

/// The numbers by which the engine holds what it was given. A number isn't used twice. All members may be called from
/// several threads at once; each of the locks here is held for a look-up only and never together with another one.
namespace Vantrel::Host {

/// Node ids, counted: a node keeps its id until every acquisition has been released.
class NodeTable {
public:
    /// 0 for a null node.
    [[nodiscard]] std::uint32_t Acquire(const NodePtr& node);
    /// False for an id that isn't held.
    bool Release(std::uint32_t id);
    [[nodiscard]] NodePtr Find(std::uint32_t id) const;
    /// Ids that are held now.
    [[nodiscard]] std::size_t Count() const;

private:
    // Many threads ask for nodes while frames render: a few independent tables keep them apart.
    static constexpr std::uint32_t kShardBits = 4;
    struct Entry {
        NodePtr node;
        std::uint32_t count = 0;
    };
    struct Shard {
        mutable std::shared_mutex mutex;
        std::unordered_map<std::uint32_t, Entry> entries;
        std::unordered_map<const Node*, std::uint32_t> ids;
        std::uint32_t last = 0;
    };

    std::array<Shard, 1U << kShardBits> mShards;
};

/// A segment list in the engine's hands.
struct HeldSegments {
    SequencePtr sequence;
    const SegmentList* list = nullptr;
};

class SegmentListTable {
public:
    [[nodiscard]] std::uint32_t Acquire(const SequencePtr& sequence, bool previews);
    bool Release(std::uint32_t id);
    /// Null for an id that isn't held.
    [[nodiscard]] std::shared_ptr<const HeldSegments> Find(std::uint32_t id) const;
    [[nodiscard]] std::size_t Count() const;

private:
    mutable std::shared_mutex mMutex;
    std::unordered_map<std::uint32_t, std::shared_ptr<const HeldSegments>> mHeld;
    std::uint32_t mLast = 0;
};

/// Opaque data of effect instances, of the snapshot in force and as long as somebody holds it.
class OpaqueDataTable {
public:
    void SetSnapshot(const Snapshot& snapshot);
    /// The data and a zero byte behind them, since nobody is told how many there are. Null for an instance without
    /// data. Valid until the matching release.
    [[nodiscard]] const std::uint8_t* Acquire(std::uint32_t instanceID);
    /// @return whether that was the last hold; false also for an instance that isn't held
    bool Release(std::uint32_t instanceID);

private:
    struct Hold {
        std::vector<std::uint8_t> bytes;
        std::uint32_t count = 0;
    };

    std::mutex mMutex;
    std::map<std::uint32_t, NodePtr> mEffects;
    std::map<std::uint32_t, Hold> mHolds;
};

}  // namespace Vantrel::Host
