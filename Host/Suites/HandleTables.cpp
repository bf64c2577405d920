// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Suites/HandleTables.h"

#include <functional>
#include <set>

namespace Vantrel::Host {
namespace {

/// Collects the effects with opaque data below a node, each node once.
void CollectOpaque(const NodePtr& node, std::set<const Node*>& seen, std::map<std::uint32_t, NodePtr>& effects) {
    if (!node || !seen.insert(node.get()).second) return;
    for (const NodeInput& input : node->inputs) CollectOpaque(input.node, seen, effects);
    for (const NodePtr& effect : node->operators) {
        const EffectDetail& detail = *effect->AsEffect();
        if (!detail.opaqueData.empty()) effects.emplace(detail.instanceID, effect);
    }
}

}  // namespace

std::uint32_t NodeTable::Acquire(const NodePtr& node) {
    if (!node) return 0;
    const auto number = static_cast<std::uint32_t>(std::hash<const Node*>()(node.get()) >> 6) % mShards.size();
    Shard& shard = mShards[number];
    const std::unique_lock<std::shared_mutex> lock(shard.mutex);
    std::uint32_t& id = shard.ids[node.get()];
    if (id == 0) {
        id = ++shard.last << kShardBits | static_cast<std::uint32_t>(number);
        shard.entries[id].node = node;
    }
    ++shard.entries[id].count;
    return id;
}

bool NodeTable::Release(std::uint32_t id) {
    Shard& shard = mShards[id % mShards.size()];
    NodePtr last;  // a whole tree may die with it, which needn't happen under the lock
    const std::unique_lock<std::shared_mutex> lock(shard.mutex);
    const auto entry = shard.entries.find(id);
    if (entry == shard.entries.end()) return false;
    if (--entry->second.count > 0) return true;
    last = std::move(entry->second.node);
    shard.ids.erase(last.get());
    shard.entries.erase(entry);
    return true;
}

NodePtr NodeTable::Find(std::uint32_t id) const {
    const Shard& shard = mShards[id % mShards.size()];
    const std::shared_lock<std::shared_mutex> lock(shard.mutex);
    const auto entry = shard.entries.find(id);
    return entry != shard.entries.end() ? entry->second.node : nullptr;
}

std::size_t NodeTable::Count() const {
    std::size_t count = 0;
    for (const Shard& shard : mShards) {
        const std::shared_lock<std::shared_mutex> lock(shard.mutex);
        count += shard.entries.size();
    }
    return count;
}

std::uint32_t SegmentListTable::Acquire(const SequencePtr& sequence, bool previews) {
    auto held = std::make_shared<HeldSegments>();
    held->sequence = sequence;
    held->list = previews ? &sequence->withPreviews : &sequence->plain;
    const std::unique_lock<std::shared_mutex> lock(mMutex);
    mHeld.emplace(++mLast, std::move(held));
    return mLast;
}

bool SegmentListTable::Release(std::uint32_t id) {
    const std::unique_lock<std::shared_mutex> lock(mMutex);
    return mHeld.erase(id) > 0;
}

std::shared_ptr<const HeldSegments> SegmentListTable::Find(std::uint32_t id) const {
    const std::shared_lock<std::shared_mutex> lock(mMutex);
    const auto held = mHeld.find(id);
    return held != mHeld.end() ? held->second : nullptr;
}

std::size_t SegmentListTable::Count() const {
    const std::shared_lock<std::shared_mutex> lock(mMutex);
    return mHeld.size();
}

void OpaqueDataTable::SetSnapshot(const Snapshot& snapshot) {
    std::set<const Node*> seen;
    std::map<std::uint32_t, NodePtr> effects;
    for (const auto& [id, sequence] : snapshot.sequences) {
        for (const Segment& segment : sequence->plain.segments) CollectOpaque(segment.root, seen, effects);
    }
    const std::lock_guard<std::mutex> lock(mMutex);
    mEffects = std::move(effects);
}

const std::uint8_t* OpaqueDataTable::Acquire(std::uint32_t instanceID) {
    const std::lock_guard<std::mutex> lock(mMutex);
    Hold& hold = mHolds[instanceID];
    if (hold.bytes.empty()) {
        const auto effect = mEffects.find(instanceID);
        if (effect == mEffects.end()) {
            mHolds.erase(instanceID);
            return nullptr;
        }
        hold.bytes = effect->second->AsEffect()->opaqueData;
        hold.bytes.push_back(0);
    }
    ++hold.count;
    return hold.bytes.data();
}

bool OpaqueDataTable::Release(std::uint32_t instanceID) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto hold = mHolds.find(instanceID);
    if (hold == mHolds.end() || --hold->second.count > 0) return false;
    mHolds.erase(hold);
    return true;
}

}  // namespace Vantrel::Host
