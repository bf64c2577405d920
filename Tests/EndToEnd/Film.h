// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <functional>
#include <string>
#include <vector>

#include "Host/Session/RenderSession.h"

namespace Vantrel::Host::Test {

/// A folder of the test's own, empty at the start and gone at the end.
class Folder {
public:
    explicit Folder(const std::string& name);
    ~Folder();
    Folder(const Folder&) = delete;
    Folder& operator=(const Folder&) = delete;

    [[nodiscard]] std::string Path(const std::string& name) const { return (mPath / name).string(); }

private:
    std::filesystem::path mPath;
};

/// Keeps the devices between the sessions of a test program: finding them anew costs more than a short film.
class KeptDevices {
public:
    KeptDevices();
    ~KeptDevices() { Kiln::Terminate(); }
    KeptDevices(const KeptDevices&) = delete;
    KeptDevices& operator=(const KeptDevices&) = delete;
};

/// What differs from a session's and a job's defaults.
struct FilmOptions {
    DeviceChoice device = DeviceChoice::kCuda;
    std::vector<std::string> mediaRoots;
    std::string previews;    ///< a folder
    std::int32_t width = 0;  ///< 0: the sequence's
    std::int32_t height = 0;
    std::uint32_t quality = 4;
    std::uint64_t deviceMemory = 0;
    Vellum::PixelFormat format = Vellum::kPixelFormat_BGRA_4444_8u;
    /// Frames to render, every one if empty.
    std::vector<std::int64_t> frames;
    /// Picks the frames to render of a film of so many; wins over `frames`.
    std::function<std::vector<std::int64_t>(std::int64_t)> choose;
};

struct Film {
    std::vector<HostPictureRef> pictures;
    std::vector<std::int64_t> frames;  ///< their places, if some were picked
    std::int64_t frameTicks = 0;       ///< of the sequence
    RenderSummary summary;
    std::vector<std::string> failures;
};

/// Renders a timeline's file and keeps its pictures, laid over black.
[[nodiscard]] Film RenderFilm(const std::string& file, const FilmOptions& options);

}  // namespace Vantrel::Host::Test
