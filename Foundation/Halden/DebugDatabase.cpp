// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Halden/DebugDatabase.h"

namespace Halden::debug {

DebugDatabase& DebugDatabase::Instance() {
    static DebugDatabase instance;
    return instance;
}

WideString DebugDatabase::GetEntry(const WideString& key, const WideString& defaultValue) const {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto entry = mEntries.find(key);
    return entry == mEntries.end() ? defaultValue : entry->second;
}

void DebugDatabase::SetEntry(const WideString& key, const WideString& value) {
    const std::lock_guard<std::mutex> lock(mMutex);
    mEntries[key] = value;
}

void DebugDatabase::RemoveEntry(const WideString& key) {
    const std::lock_guard<std::mutex> lock(mMutex);
    mEntries.erase(key);
}

}  // namespace Halden::debug
