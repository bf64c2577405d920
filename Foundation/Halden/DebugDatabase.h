// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <mutex>

#include "Halden/Strings.h"

namespace Halden::debug {

/// Process-wide debug settings: text by key. Thread safe.
class DebugDatabase {
public:
    static DebugDatabase& Instance();

    /// The entry's text, or `defaultValue` when there is none.
    [[nodiscard]] WideString GetEntry(const WideString& key, const WideString& defaultValue) const;
    void SetEntry(const WideString& key, const WideString& value);
    void RemoveEntry(const WideString& key);

private:
    DebugDatabase() = default;

    mutable std::mutex mMutex;
    std::map<WideString, WideString> mEntries;
};

}  // namespace Halden::debug
