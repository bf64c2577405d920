// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <filesystem>
#include <iostream>
#include <memory>

#include "Commands.h"
#include "Host/Inspect/TestMedia.h"
#include "Host/Timeline/OtioReader.h"

namespace Vantrel::Tool {

void AddMediaCommand(CLI::App& app, int& status) {
    struct Arguments {
        std::string file;
        std::string folder;
    };
    CLI::App* command =
        app.add_subcommand("media", "Write test films for a timeline's media, which show their frames' numbers");
    const auto arguments = std::make_shared<Arguments>();
    command->add_option("file", arguments->file, "OpenTimelineIO file")->required();
    command->add_option("folder", arguments->folder, "Folder for the films; made if it isn't there")->required();
    command->callback([arguments, &status] {
        const Host::Document document = Host::ReadTimelineFile(arguments->file);
        std::error_code error;
        std::filesystem::create_directories(arguments->folder, error);
        if (error) throw UsageError(arguments->folder + " can't be made: " + error.message());
        Host::WriteTestMedia(Host::PlanTestMedia(document), arguments->folder,
                             [](const std::string& path) { std::cerr << path << "\n"; });
        status = kExit_Done;
    });
}

}  // namespace Vantrel::Tool
