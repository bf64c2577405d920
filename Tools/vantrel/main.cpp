// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <exception>
#include <iostream>
#include <string>

#include "Commands.h"
#include "Host/Media/FFmpegHandles.h"
#include "Host/Output/FrameWriter.h"
#include "Host/Session/RenderSession.h"
#include "Host/Timeline/JsonCursor.h"

extern "C" {
#include <libavutil/log.h>
}

namespace {

using namespace Vantrel;

int Fail(const std::exception& error, Tool::ExitStatus status) {
    std::cerr << "vantrel: " << error.what() << "\n";
    return status;
}

int Run(int argc, char** argv) {
    CLI::App app("Renders OpenTimelineIO timelines on a CUDA or OpenCL device.", "vantrel");
    app.footer(
        "Exit status: 0 done; 1 bad arguments or file; 2 rendered with offline media or effects passed through;\n"
        "3 render failed or interrupted.");
    app.require_subcommand(1);
    int status = Tool::kExit_Done;
    Tool::AddRenderCommand(app, status);
    Tool::AddInspectCommand(app, status);
    Tool::AddSegmentsCommand(app, status);
    Tool::AddMediaCommand(app, status);
    Tool::AddDevicesCommand(app, status);
    Tool::AddEffectsCommand(app, status);
    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError& error) {
        return app.exit(error) == 0 ? Tool::kExit_Done : Tool::kExit_BadInput;
    }
    return status;
}

}  // namespace

int main(int argc, char** argv) {
    // FFmpeg's own messages name neither the timeline nor the place; ours do.
    av_log_set_level(AV_LOG_QUIET);
    try {
        return Run(argc, argv);
    } catch (const Tool::UsageError& error) {
        return Fail(error, Tool::kExit_BadInput);
    } catch (const Host::TimelineError& error) {
        return Fail(error, Tool::kExit_BadInput);
    } catch (const Host::OutputError& error) {
        return Fail(error, Tool::kExit_Failed);
    } catch (const std::bad_alloc&) {
        return Fail(std::runtime_error("out of memory"), Tool::kExit_Failed);
    } catch (const std::exception& error) {
        return Fail(error, Tool::kExit_Failed);
    }
}
