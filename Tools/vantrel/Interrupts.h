// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>

namespace Vantrel::Tool {

/// While it lives, an interrupt sets a flag instead of ending the program, so that work stops between two frames.
class InterruptScope {
public:
    InterruptScope();
    ~InterruptScope();
    InterruptScope(const InterruptScope&) = delete;
    InterruptScope& operator=(const InterruptScope&) = delete;

    [[nodiscard]] const std::atomic<bool>& GetStop() const;

private:
    void (*mOldInterrupt)(int);
    void (*mOldTerminate)(int);
};

}  // namespace Vantrel::Tool
