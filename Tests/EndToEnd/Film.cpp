// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/EndToEnd/Film.h"

#include <unistd.h>

extern "C" {
#include <libavutil/log.h>
}

namespace Vantrel::Host::Test {

Folder::Folder(const std::string& name)
    : mPath(std::filesystem::temp_directory_path() / (name + "-" + std::to_string(getpid()))) {
    std::filesystem::remove_all(mPath);
    std::filesystem::create_directories(mPath);
}

Folder::~Folder() {
    std::error_code ignored;
    std::filesystem::remove_all(mPath, ignored);
}

KeptDevices::KeptDevices() {
    av_log_set_level(AV_LOG_QUIET);
    Kiln::Initialize(true);
}

Film RenderFilm(const std::string& file, const FilmOptions& options) {
    SessionOptions session;
    session.file = file;
    session.snapshot.mediaRoots = options.mediaRoots;
    session.snapshot.previews = options.previews;
    session.device = options.device;
    session.deviceMemory = options.deviceMemory;
    RenderSession render(session);
    RenderJob job;
    job.timelineID = render.GetSequence().timelineID;
    job.width = options.width > 0 ? options.width : render.GetSequence().format.width;
    job.height = options.height > 0 ? options.height : render.GetSequence().format.height;
    job.quality = options.quality;
    job.format = options.format;

    std::vector<std::pair<std::int64_t, std::int64_t>> stretches{{0, render.GetFrameCount()}};
    Film film;
    film.frames = options.frames;
    if (options.choose && render.GetFrameCount() > 0) film.frames = options.choose(render.GetFrameCount());
    if (!film.frames.empty()) {
        stretches.clear();
        for (const std::int64_t frame : film.frames) stretches.emplace_back(frame, frame + 1);
    }
    film.frameTicks = render.GetSequence().format.frameTicks;
    const std::atomic<bool> stop{false};
    for (const auto& [first, end] : stretches) {
        job.firstFrame = first;
        job.endFrame = end;
        film.summary = render.Render(
            job, [&film](RenderedFrame frame) { film.pictures.push_back(frame.picture); }, stop);
    }
    // The device outlives the session.
    if (options.deviceMemory != 0) render.GetDevice()->SetMemoryLimit(UINT64_MAX);
    film.failures = render.GetService().GetFailures();
    return film;
}

}  // namespace Vantrel::Host::Test
