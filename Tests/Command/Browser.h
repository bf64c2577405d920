// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>

#include <nlohmann/json.hpp>
#include <string>

namespace Vantrel::Host::Test {

/// A headless browser with one page, told what to do over a pair of pipes. Throws std::runtime_error when it refuses.
class Browser {
public:
    /// @param folder for the browser's profile
    explicit Browser(const std::string& folder);
    ~Browser();
    Browser(const Browser&) = delete;
    Browser& operator=(const Browser&) = delete;

    /// Waits until the page has loaded.
    void Open(const std::string& address);
    /// The value of an expression in the page.
    nlohmann::json Evaluate(const std::string& expression);
    /// Presses and releases the mouse on the middle of the first element that the selector finds.
    void Click(const std::string& selector);
    /// Presses and releases a key, by its name ("ArrowRight").
    void Press(const std::string& key);

private:
    nlohmann::json Call(const std::string& method, nlohmann::json parameters);
    [[nodiscard]] nlohmann::json ReadMessage();

    pid_t mProcess = -1;
    int mToBrowser = -1;
    int mFromBrowser = -1;
    int mLastCall = 0;
    std::string mSession;
    std::string mReceived;
};

}  // namespace Vantrel::Host::Test
