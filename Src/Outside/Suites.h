// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstdint>

#include "Ostrand/Exceptions.h"
#include "Vantrel/HostSuites.h"

/// The host's suites as the engine reaches them. One holder per process keeps what the host gave, keyed by the address
/// of the name's literal and the version; each user keeps its own pointer in an atomic word.
namespace Vantrel {

/// Answered by AcquireSuite when no basic suite has been set.
constexpr VantrelHostStatus kHostStatus_NoBasicSuite = 0x21416371;

/// Counts up; the record is stored by the first call, or when none is stored.
void SetBasicSuite(QuillBasicSuite* record);

/// The suite under (address of `name`, version): the holder's, or the host's answer, which the holder keeps whatever
/// the host's status was. `*suite` may come back null. Any thread.
VantrelHostStatus AcquireSuite(const char* name, std::int32_t version, const void** suite);

/// Counts down; the last call gives all suites back to the host, forgets the record and empties every user's pointer.
/// Takes no lock: nothing may use a suite any more.
void ReleaseSuites();

/// A user's cached pointer to one suite: a static object. An empty word means to acquire now, and a failed acquisition
/// leaves it empty.
class SuiteUser {
public:
    SuiteUser(const char* name, std::int32_t version);
    SuiteUser(const SuiteUser&) = delete;
    SuiteUser& operator=(const SuiteUser&) = delete;

    /// The suite, or null. Any thread.
    [[nodiscard]] const void* Find();

private:
    friend void ReleaseSuites();

    const char* mName;
    std::int32_t mVersion;
    std::atomic<const void*> mSuite{nullptr};
    SuiteUser* mNext = nullptr;
};

/// Each suite as its table, or null when there is none.
[[nodiscard]] const CorvaneVideoSegmentSuite* FindVideoSegmentSuite();
[[nodiscard]] const CorvaneVideoSegmentRenderSuite* FindVideoSegmentRenderSuite();
[[nodiscard]] const LarkspurMemoryManagerSuite* FindMemoryManagerSuite();
[[nodiscard]] const LarkspurGlazeSuite* FindGlazeSuite();
[[nodiscard]] const LarkspurGlazeCacheSuite* FindGlazeCacheSuite();
[[nodiscard]] const OpaqueEffectDataSuite* FindOpaqueEffectDataSuite();

/// A suite that must be there; a missing one raises NullInterfaceException.
template <class Suite>
[[nodiscard]] const Suite& DemandSuite(const Suite* suite) {
    if (!suite) throw Ostrand::NullInterfaceException();
    return *suite;
}
[[nodiscard]] inline const CorvaneVideoSegmentSuite& VideoSegmentSuite() {
    return DemandSuite(FindVideoSegmentSuite());
}
[[nodiscard]] inline const CorvaneVideoSegmentRenderSuite& VideoSegmentRenderSuite() {
    return DemandSuite(FindVideoSegmentRenderSuite());
}
[[nodiscard]] inline const LarkspurMemoryManagerSuite& MemoryManagerSuite() {
    return DemandSuite(FindMemoryManagerSuite());
}
[[nodiscard]] inline const LarkspurGlazeSuite& GlazeSuite() { return DemandSuite(FindGlazeSuite()); }
[[nodiscard]] inline const LarkspurGlazeCacheSuite& GlazeCacheSuite() { return DemandSuite(FindGlazeCacheSuite()); }
[[nodiscard]] inline const OpaqueEffectDataSuite& OpaqueDataSuite() { return DemandSuite(FindOpaqueEffectDataSuite()); }

}  // namespace Vantrel
