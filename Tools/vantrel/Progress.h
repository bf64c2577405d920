// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <cstdint>
#include <string>

namespace Vantrel::Tool {

/// Shows how far a render is, on standard error: a bar where that is a terminal, JSON lines on request, nothing else.
class Progress {
public:
    enum class Form { kNone, kBar, kJson };

    Progress(Form form, std::int64_t frames);

    /// What suits standard error.
    [[nodiscard]] static Form ChooseForm(bool json);

    void Advance(std::int64_t done);
    /// Clears the bar.
    void End();

private:
    using Clock = std::chrono::steady_clock;

    Form mForm;
    std::int64_t mFrames;
    Clock::time_point mStart = Clock::now();
    Clock::time_point mShown{};
};

}  // namespace Vantrel::Tool
