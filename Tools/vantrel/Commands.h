// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <CLI/CLI.hpp>

namespace Vantrel::Tool {

/// How the command ends; told in the README and in --help.
enum ExitStatus : int {
    kExit_Done = 0,
    kExit_BadInput = 1,    ///< bad arguments, or a file that can't be read
    kExit_Incomplete = 2,  ///< rendered, but with offline media or effects passed through
    kExit_Failed = 3,      ///< the render failed or was interrupted
};

/// A mistake of the user's: ends the command with kExit_BadInput.
class UsageError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// Each adds its subcommand; when that was called, `status` holds its outcome after the parse.
void AddRenderCommand(CLI::App& app, int& status);
void AddInspectCommand(CLI::App& app, int& status);
void AddSegmentsCommand(CLI::App& app, int& status);
void AddMediaCommand(CLI::App& app, int& status);
void AddDevicesCommand(CLI::App& app, int& status);
void AddEffectsCommand(CLI::App& app, int& status);

}  // namespace Vantrel::Tool
