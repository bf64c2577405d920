// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Output/FrameWriter.h"

#include <algorithm>
#include <cctype>
#include <filesystem>

#include "Host/Output/FilmWriter.h"
#include "Host/Output/PictureWriter.h"

namespace Vantrel::Host {

std::unique_ptr<FrameWriter> CreateFrameWriter(const OutputFormat& format, std::int64_t frameCount) {
    std::string extension = std::filesystem::path(format.path).extension().string();
    std::transform(extension.begin(), extension.end(), extension.begin(),
                   [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    if (extension == ".png" || extension == ".exr") {
        return std::make_unique<PictureWriter>(format, extension == ".exr", frameCount);
    }
    if (extension == ".mp4" || extension == ".mov" || extension == ".mkv") {
        if (format.alpha) throw OutputError(format.path + ": film keeps no alpha; write PNG or EXR pictures");
        return std::make_unique<FilmWriter>(format);
    }
    throw OutputError(format.path + ": unknown form of output; known are mp4, mov, mkv, png and exr");
}

}  // namespace Vantrel::Host
