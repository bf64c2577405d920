// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <mutex>

namespace Ostrand {

/// A named recursive lock. The name of a lock, or of one section that takes it, is for diagnostics only.
class CriticalSection {
public:
    explicit CriticalSection(const char* name) : mName(name) {}
    CriticalSection(const CriticalSection&) = delete;
    CriticalSection& operator=(const CriticalSection&) = delete;

    /// `section` names the code that takes the lock; it must be a literal.
    void Enter(const char* section);
    void Leave();

    [[nodiscard]] const char* GetName() const { return mName; }
    /// The outermost section that holds the lock, or null. A snapshot, for messages of a hang.
    [[nodiscard]] const char* GetHolder() const { return mHolder.load(std::memory_order_relaxed); }

private:
    std::recursive_mutex mMutex;
    const char* mName;
    // Written by the holder only; atomic for those who ask from outside.
    std::atomic<const char*> mHolder{nullptr};
    int mDepth = 0;
};

/// Holds a critical section for a scope.
class ScopedLock {
public:
    ScopedLock(CriticalSection& section, const char* name) : mSection(section) { mSection.Enter(name); }
    explicit ScopedLock(CriticalSection& section) : ScopedLock(section, section.GetName()) {}
    ~ScopedLock() { mSection.Leave(); }
    ScopedLock(const ScopedLock&) = delete;
    ScopedLock& operator=(const ScopedLock&) = delete;

private:
    CriticalSection& mSection;
};

}  // namespace Ostrand
