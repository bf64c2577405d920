// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>
#include <sys/wait.h>

#include <array>
#include <cstdio>
#include <fstream>
#include <sstream>
#include <string>

#include "Tests/EndToEnd/Film.h"
#include "Tests/Host/TimelineText.h"

namespace Vantrel::Host::Test {

struct Outcome {
    int status = -1;
    std::string out;
    std::string err;
};

/// What a shell's command writes, and its status.
inline std::string OutputOf(const std::string& line, int* status = nullptr) {
    FILE* pipe = popen(line.c_str(), "r");
    std::string text;
    std::array<char, 4096> buffer{};
    for (std::size_t n = 0; (n = std::fread(buffer.data(), 1, buffer.size(), pipe)) > 0;) text.append(buffer.data(), n);
    const int ended = pclose(pipe);
    if (status) *status = WIFEXITED(ended) ? WEXITSTATUS(ended) : -1;
    return text;
}

class Command : public testing::Test {
protected:
    /// Runs the command through the shell, so that arguments and settings are written as a person writes them.
    Outcome Run(const std::string& arguments, const std::string& settings = "") {
        const std::string errors = mFolder.Path("errors.txt");
        const std::string line = settings + " " VANTREL_COMMAND " " + arguments + " 2>" + errors;
        Outcome outcome;
        outcome.out = OutputOf(line, &outcome.status);
        std::stringstream text;
        text << std::ifstream(errors).rdbuf();
        outcome.err = text.str();
        return outcome;
    }
    std::string Write(const std::string& name, const std::string& text) {
        const std::string path = mFolder.Path(name);
        std::ofstream(path) << text;
        return path;
    }
    std::string Write(const std::string& name, const Json& timeline) { return Write(name, timeline.dump()); }
    [[nodiscard]] std::string Path(const std::string& name) const { return mFolder.Path(name); }

    /// A small cut of a generated film.
    std::string WriteFilm(int frames, Json effects = Json::array()) {
        const Json clip = Clip("bars", Range(0, frames), GeneratorOf("testsrc2"), Effects(std::move(effects)));
        return Write("cut.otio",
                     Timeline({Track({clip})}, Own({{"sequence", {{"width", 64}, {"height", 36}, {"rate", 24}}}})));
    }

private:
    Folder mFolder{"vantrel-command"};
};

}  // namespace Vantrel::Host::Test
