// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Command/Browser.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <stdexcept>
#include <thread>

namespace Vantrel::Host::Test {

using Json = nlohmann::json;

namespace {

constexpr int kPatienceMs = 60000;

/// Runs in the new process. The browser reads descriptor 3 and writes descriptor 4.
[[noreturn]] void RunBrowser(int readEnd, int writeEnd, const std::string& profile) {
    // Away from 3 and 4 first, in case the pipes stand there the other way round.
    const int from = fcntl(readEnd, F_DUPFD, 10);
    const int to = fcntl(writeEnd, F_DUPFD, 10);
    dup2(from, 3);
    dup2(to, 4);
    const int quiet = open("/dev/null", O_WRONLY);
    dup2(quiet, STDOUT_FILENO);
    dup2(quiet, STDERR_FILENO);
    execlp(VANTREL_BROWSER, VANTREL_BROWSER, "--headless", "--no-sandbox", "--disable-gpu", "--remote-debugging-pipe",
           "--window-size=1440,1000", profile.c_str(), "about:blank", nullptr);
    _exit(127);
}

}  // namespace

Browser::Browser(const std::string& folder) {
    std::array<int, 2> down{};
    std::array<int, 2> up{};
    if (pipe2(down.data(), O_CLOEXEC) != 0 || pipe2(up.data(), O_CLOEXEC) != 0) throw std::runtime_error("no pipe");
    mProcess = fork();
    if (mProcess == 0) RunBrowser(down[0], up[1], "--user-data-dir=" + folder);
    close(down[0]);
    close(up[1]);
    mToBrowser = down[1];
    mFromBrowser = up[0];
    const Json target = Call("Target.createTarget", {{"url", "about:blank"}});
    const Json session = Call("Target.attachToTarget", {{"targetId", target["targetId"]}, {"flatten", true}});
    mSession = session["sessionId"];
}

Browser::~Browser() {
    // Without its pipes the browser ends; a stuck one is made to.
    close(mToBrowser);
    close(mFromBrowser);
    for (int i = 0; i < 100; ++i) {
        if (waitpid(mProcess, nullptr, WNOHANG) != 0) return;
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
    }
    kill(mProcess, SIGKILL);
    waitpid(mProcess, nullptr, 0);
}

Json Browser::ReadMessage() {
    for (;;) {
        const std::size_t end = mReceived.find('\0');
        if (end != std::string::npos) {
            Json message = Json::parse(mReceived.substr(0, end));
            mReceived.erase(0, end + 1);
            return message;
        }
        pollfd waiting{mFromBrowser, POLLIN, 0};
        std::array<char, 65536> buffer{};
        const ssize_t count =
            poll(&waiting, 1, kPatienceMs) > 0 ? read(mFromBrowser, buffer.data(), buffer.size()) : -1;
        if (count <= 0) throw std::runtime_error("the browser " VANTREL_BROWSER " doesn't answer");
        mReceived.append(buffer.data(), static_cast<std::size_t>(count));
    }
}

Json Browser::Call(const std::string& method, Json parameters) {
    Json call = {{"id", ++mLastCall}, {"method", method}, {"params", std::move(parameters)}};
    if (!mSession.empty()) call["sessionId"] = mSession;
    const std::string text = call.dump();
    if (write(mToBrowser, text.c_str(), text.size() + 1) != static_cast<ssize_t>(text.size() + 1)) {
        throw std::runtime_error("the browser " VANTREL_BROWSER " doesn't listen");
    }
    for (;;) {
        Json message = ReadMessage();
        if (message.value("id", 0) != mLastCall) continue;
        if (message.contains("error")) throw std::runtime_error(method + ": " + message["error"].dump());
        return message["result"];
    }
}

void Browser::Open(const std::string& address) {
    Call("Page.navigate", {{"url", address}});
    const std::string loaded = "document.readyState === 'complete' && location.href !== 'about:blank'";
    while (Evaluate(loaded) != true) std::this_thread::sleep_for(std::chrono::milliseconds(20));
}

Json Browser::Evaluate(const std::string& expression) {
    const Json result = Call("Runtime.evaluate", {{"expression", expression}, {"returnByValue", true}});
    if (result.contains("exceptionDetails")) throw std::runtime_error(result["exceptionDetails"].dump());
    return result["result"].value("value", Json());
}

void Browser::Click(const std::string& selector) {
    const Json at = Evaluate("(() => { const r = document.querySelector(" + Json(selector).dump() +
                             ").getBoundingClientRect(); return [r.x + r.width / 2, r.y + r.height / 2]; })()");
    for (const char* type : {"mousePressed", "mouseReleased"}) {
        Call("Input.dispatchMouseEvent",
             {{"type", type}, {"x", at[0]}, {"y", at[1]}, {"button", "left"}, {"clickCount", 1}});
    }
}

void Browser::Press(const std::string& key) {
    for (const char* type : {"keyDown", "keyUp"}) Call("Input.dispatchKeyEvent", {{"type", type}, {"key", key}});
}

}  // namespace Vantrel::Host::Test
