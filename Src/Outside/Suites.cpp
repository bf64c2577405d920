// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Outside/Suites.h"

#include <functional>
#include <map>
#include <utility>

#include "Ostrand/CriticalSection.h"

namespace Vantrel {
namespace {

struct LiteralOrder {
    using Key = std::pair<const char*, std::int32_t>;
    bool operator()(const Key& a, const Key& b) const {
        if (a.first != b.first) return std::less<>()(a.first, b.first);
        return a.second < b.second;
    }
};

struct SuiteHolder {
    Ostrand::CriticalSection lock{"SuiteHolder"};
    QuillBasicSuite* record = nullptr;
    std::uint32_t count = 0;
    std::map<LiteralOrder::Key, const void*, LiteralOrder> suites;
    /// The last user made; they are chained, and never end.
    std::atomic<SuiteUser*> users{nullptr};
};

SuiteHolder& Holder() {
    static SuiteHolder& holder = *new SuiteHolder;  // outlives every static object that may still use a suite
    return holder;
}

template <class Suite>
const Suite* FindAs(SuiteUser& user) {
    return static_cast<const Suite*>(user.Find());
}

}  // namespace

void SetBasicSuite(QuillBasicSuite* record) {
    SuiteHolder& holder = Holder();
    const Ostrand::ScopedLock lock(holder.lock, "SetBasicSuite");
    if (++holder.count == 1 || !holder.record) holder.record = record;
}

VantrelHostStatus AcquireSuite(const char* name, std::int32_t version, const void** suite) {
    SuiteHolder& holder = Holder();
    const Ostrand::ScopedLock lock(holder.lock, "AcquireSuite");
    if (!holder.record) return kHostStatus_NoBasicSuite;
    const LiteralOrder::Key key(name, version);
    const auto found = holder.suites.find(key);
    if (found != holder.suites.end()) {
        *suite = found->second;
        return 0;
    }
    const void* acquired = nullptr;
    const VantrelHostStatus status = holder.record->AcquireSuite(name, version, &acquired);
    holder.suites.emplace(key, acquired);
    *suite = acquired;
    return status;
}

void ReleaseSuites() {
    SuiteHolder& holder = Holder();
    if (holder.count == 0 || --holder.count != 0) return;
    for (SuiteUser* user = holder.users; user; user = user->mNext) user->mSuite = nullptr;
    for (const auto& [key, suite] : holder.suites) holder.record->ReleaseSuite(key.first, key.second);
    holder.suites.clear();
    holder.record = nullptr;
}

SuiteUser::SuiteUser(const char* name, std::int32_t version) : mName(name), mVersion(version) {
    std::atomic<SuiteUser*>& users = Holder().users;
    mNext = users;
    while (!users.compare_exchange_weak(mNext, this)) {
    }
}

const void* SuiteUser::Find() {
    const void* suite = mSuite;
    if (!suite && AcquireSuite(mName, mVersion, &suite) == 0) mSuite = suite;
    return mSuite;
}

// The users below have no destructors: views of host nodes may outlive static destruction.

const CorvaneVideoSegmentSuite* FindVideoSegmentSuite() {
    static SuiteUser user(kVideoSegmentSuiteName, kVideoSegmentSuiteVersion);
    return FindAs<CorvaneVideoSegmentSuite>(user);
}

const CorvaneVideoSegmentRenderSuite* FindVideoSegmentRenderSuite() {
    static SuiteUser user(kVideoSegmentRenderSuiteName, kVideoSegmentRenderSuiteVersion);
    return FindAs<CorvaneVideoSegmentRenderSuite>(user);
}

const LarkspurMemoryManagerSuite* FindMemoryManagerSuite() {
    static SuiteUser user(kMemoryManagerSuiteName, kMemoryManagerSuiteVersion);
    return FindAs<LarkspurMemoryManagerSuite>(user);
}

const LarkspurGlazeSuite* FindGlazeSuite() {
    static SuiteUser user(kGlazeSuiteName, kGlazeSuiteVersion);
    return FindAs<LarkspurGlazeSuite>(user);
}

const LarkspurGlazeCacheSuite* FindGlazeCacheSuite() {
    static SuiteUser user(kGlazeCacheSuiteName, kGlazeCacheSuiteVersion);
    return FindAs<LarkspurGlazeCacheSuite>(user);
}

const OpaqueEffectDataSuite* FindOpaqueEffectDataSuite() {
    static SuiteUser user(kOpaqueEffectDataSuiteName, kOpaqueEffectDataSuiteVersion);
    return FindAs<OpaqueEffectDataSuite>(user);
}

}  // namespace Vantrel
