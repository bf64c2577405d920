// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <ostream>

#include "Host/Output/Encoder.h"

namespace Vantrel::Host {

/// A name with one printf-like place for a number, or without.
class NumberedName {
public:
    /// Throws OutputError for more than one place, or one that isn't %d or %0Nd.
    explicit NumberedName(const std::string& pattern);

    [[nodiscard]] bool HasNumber() const { return mWidth >= 0; }
    [[nodiscard]] std::string Format(std::int64_t number) const;

private:
    std::string mBefore;
    std::string mAfter;
    int mWidth = -1;
};

/// Writes one picture as PNG or OpenEXR. `format` has the picture's size. Throws OutputError, which names the format's
/// path.
void EncodePicture(const HostPicture& picture, const OutputFormat& format, bool exr, std::ostream& out);

/// PNG pictures of 8 bits, or OpenEXR pictures of 32-bit float with premultiplied colour, as that form has it.
class PictureWriter : public FrameWriter {
public:
    PictureWriter(const OutputFormat& format, bool exr, std::int64_t frameCount);

    [[nodiscard]] Vellum::PixelFormat GetPixelFormat() const override;
    void Write(const HostPicture& picture, std::int64_t number) override;
    void Finish() override {}

private:
    OutputFormat mFormat;
    NumberedName mName;
    bool mExr;
};

}  // namespace Vantrel::Host
