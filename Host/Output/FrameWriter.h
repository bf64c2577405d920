// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <memory>
#include <stdexcept>
#include <string>

#include "Host/Media/HostPicture.h"
#include "Vellum/Time.h"

namespace Vantrel::Host {

/// Output that can't be written: the file and the reason, as one sentence.
class OutputError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// What is to be written.
struct OutputFormat {
    /// The file's name; its extension selects the form: mp4, mov and mkv for film, png and exr for pictures. Pictures
    /// take one printf-like "%d" or "%0Nd" for the frame's number.
    std::string path;
    std::int32_t width = 0;
    std::int32_t height = 0;
    Vellum::FrameRate rate;
    Vellum::PixelAspectRatio aspect;
    std::uint32_t fieldType = Vellum::kFieldType_Progressive;
    /// Keep the alpha channel. Only pictures can.
    bool alpha = false;
    /// Of the first frame, "HH:MM:SS:FF"; empty for none. Only MP4 and MOV films keep it.
    std::string timecode;
};

/// Writes finished pictures in order. Nothing stands under the final name before the file is whole: what was begun and
/// not finished is removed by the destructor. Used by one thread.
class FrameWriter {
public:
    virtual ~FrameWriter() = default;

    /// The pixel format in which Write wants its pictures: BGRA of 8 bits or 32-bit float, straight alpha.
    [[nodiscard]] virtual Vellum::PixelFormat GetPixelFormat() const = 0;

    /// @param number the frame's number, used in picture names.
    /// Throws OutputError.
    virtual void Write(const HostPicture& picture, std::int64_t number) = 0;

    /// Ends the output and gives it its name. Throws OutputError.
    virtual void Finish() = 0;
};

/// Throws OutputError for an unknown form, a folder that isn't there, a missing encoder, or several frames for one
/// picture name.
[[nodiscard]] std::unique_ptr<FrameWriter> CreateFrameWriter(const OutputFormat& format, std::int64_t frameCount);

}  // namespace Vantrel::Host
