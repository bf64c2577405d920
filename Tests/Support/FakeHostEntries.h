// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Tests/Support/FakeHost.h"

namespace Vantrel::Testing {

/// The fake host's suite entries: plain functions that find the host that lives.
struct FakeHostEntries {
    /// One call of an entry: counted, under the host's lock.
    struct Call {
        explicit Call(const char* entry) : host(FakeHost::Current()), lock(host.mMutex) { host.Called(entry); }
        FakeHost& host;
        std::unique_lock<std::recursive_mutex> lock;
    };

    static void FillSegmentLists(CorvaneVideoSegmentSuite& suite);
    static void FillNodes(CorvaneVideoSegmentSuite& suite);
    static void FillRenders(CorvaneVideoSegmentRenderSuite& suite);
    static void FillClips(CorvaneVideoSegmentRenderSuite& suite);
    static void FillSmallSuites(LarkspurMemoryManagerSuite& memory, LarkspurGlazeSuite& glaze,
                                LarkspurGlazeCacheSuite& cache, OpaqueEffectDataSuite& opaque);
    static VantrelHostStatus AcquireSuite(const char* name, std::int32_t version, const void** suite);
    static VantrelHostStatus ReleaseSuite(const char* name, std::int32_t version);
};

}  // namespace Vantrel::Testing
