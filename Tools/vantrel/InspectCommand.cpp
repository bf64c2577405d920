// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <sys/ioctl.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <iostream>
#include <memory>

#include "Host/Inspect/InspectionJson.h"
#include "Host/Inspect/InspectionPage.h"
#include "Host/Inspect/InspectionText.h"
#include "Host/Inspect/Inspector.h"
#include "Host/Output/Encoder.h"
#include "Interrupts.h"
#include "Progress.h"
#include "SessionArguments.h"

namespace Vantrel::Tool {

namespace {

struct InspectArguments {
    SessionArguments session;
    std::string size;
    std::string page;
    bool json = false;
};

Host::TextStyle StyleOfTerminal() {
    Host::TextStyle style;
    winsize size{};
    const bool terminal = isatty(STDOUT_FILENO) != 0;
    if (terminal && ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0) style.width = size.ws_col;
    const char* refusal = std::getenv("NO_COLOR");
    style.colors = terminal && (refusal == nullptr || refusal[0] == '\0');
    return style;
}

void WritePage(const Host::Inspection& inspection, const std::string& path) {
    Host::PendingFile file(path);
    std::ofstream out(file.GetWorkingPath(), std::ios::binary);
    out << Host::InspectionToPage(inspection);
    out.close();
    if (!out) throw Host::OutputError(path + " can't be written: the disk is full or the folder refuses it");
    file.Commit();
}

/// Returns false when it was interrupted.
bool RenderPage(Host::RenderSession& session, Host::Inspection& inspection, const InspectArguments& arguments,
                std::pair<std::int32_t, std::int32_t> size) {
    const Host::PendingFile probe(arguments.page);
    const InterruptScope interrupts;
    Progress progress(Progress::ChooseForm(false), static_cast<std::int64_t>(inspection.stretches.size()));
    const bool whole = Host::RenderStretches(
        session, inspection, size.first, size.second, [&](std::int64_t done) { progress.Advance(done); },
        interrupts.GetStop());
    progress.End();
    if (whole) WritePage(inspection, arguments.page);
    return whole;
}

int Inspect(const InspectArguments& arguments) {
    Host::RenderSession session(MakeSessionOptions(arguments.session));
    for (const std::string& warning : session.GetSnapshot().warnings) std::cerr << "warning: " << warning << "\n";
    Host::Inspection inspection = Host::Inspect(session, arguments.session.file);
    const auto size = ParseSize(arguments.size, inspection.format);
    if (!arguments.page.empty() && !RenderPage(session, inspection, arguments, size)) {
        std::cerr << "vantrel: interrupted\n";
        return kExit_Failed;
    }
    if (arguments.json) {
        std::cout
            << Host::InspectionToJson(inspection).dump(2, ' ', false, nlohmann::ordered_json::error_handler_t::replace)
            << "\n";
    } else if (arguments.page.empty()) {
        std::cout << Host::InspectionToText(inspection, StyleOfTerminal());
    }
    for (const std::string& text : session.GetOffline()) std::cerr << "offline: " << text << "\n";
    const bool complete = inspection.IsComplete() && session.GetPassedThrough().empty();
    return complete ? kExit_Done : kExit_Incomplete;
}

}  // namespace

void AddInspectCommand(CLI::App& app, int& status) {
    CLI::App* command = app.add_subcommand(
        "inspect", "Show which stretches of a timeline the device renders, and why the others aren't its own");
    const auto arguments = std::make_shared<InspectArguments>();
    AddSessionArguments(*command, arguments->session);
    command->add_flag("--json", arguments->json, "As JSON (Docs/inspect.schema.json)");
    command->add_option("--html", arguments->page,
                        "Render a frame of each stretch, and write a page with pictures, trees and times");
    command->add_option("--size", arguments->size, "WIDTHxHEIGHT of the frames that --html renders");
    command->callback([arguments, &status] { status = Inspect(*arguments); });
}

}  // namespace Vantrel::Tool
