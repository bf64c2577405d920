// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Output/PictureWriter.h"

#include <cctype>
#include <cstdio>
#include <fstream>

namespace Vantrel::Host {

NumberedName::NumberedName(const std::string& pattern) {
    const std::size_t percent = pattern.find('%');
    mBefore = pattern.substr(0, percent);
    if (percent == std::string::npos) return;
    std::size_t at = percent + 1;
    int width = 0;
    if (at < pattern.size() && pattern[at] == '0') {
        for (++at; at < pattern.size() && std::isdigit(static_cast<unsigned char>(pattern[at])) != 0 && width < 100;
             ++at) {
            width = 10 * width + (pattern[at] - '0');
        }
    }
    if (at >= pattern.size() || pattern[at] != 'd' || width > 20 || pattern.find('%', at) != std::string::npos) {
        throw OutputError(pattern + ": a picture's name takes one %d or %0Nd");
    }
    mWidth = width;
    mAfter = pattern.substr(at + 1);
}

std::string NumberedName::Format(std::int64_t number) const {
    if (!HasNumber()) return mBefore;
    std::string digits = std::to_string(number);
    if (digits.size() < static_cast<std::size_t>(mWidth))
        digits.insert(0, static_cast<std::size_t>(mWidth) - digits.size(), '0');
    return mBefore + digits + mAfter;
}

PictureWriter::PictureWriter(const OutputFormat& format, bool exr, std::int64_t frameCount)
    : mFormat(format), mName(format.path), mExr(exr) {
    if (frameCount > 1 && !mName.HasNumber()) {
        throw OutputError(format.path + ": " + std::to_string(frameCount) +
                          " pictures need a %d or %0Nd in their name");
    }
    const PendingFile probe(mName.Format(0));
}

Vellum::PixelFormat PictureWriter::GetPixelFormat() const {
    return mExr ? Vellum::kPixelFormat_BGRA_4444_32f : Vellum::kPixelFormat_BGRA_4444_8u;
}

void EncodePicture(const HostPicture& picture, const OutputFormat& format, bool exr, std::ostream& out) {
    const AVPixelFormat pixelFormat = exr ? (format.alpha ? AV_PIX_FMT_GBRAPF32 : AV_PIX_FMT_GBRPF32)
                                          : (format.alpha ? AV_PIX_FMT_RGBA : AV_PIX_FMT_RGB24);
    Encoder encoder(exr ? "exr" : "png", format, pixelFormat, [exr](AVCodecContext& context, AVDictionary** options) {
        context.time_base = {1, 25};
        context.color_range = AVCOL_RANGE_JPEG;
        if (exr) av_dict_set(options, "compression", "zip16", 0);
    });
    const auto deliver = [&](AVPacket& packet) { out.write(reinterpret_cast<const char*>(packet.data), packet.size); };
    encoder.Encode(&picture, 0, deliver);
    encoder.Encode(nullptr, 0, deliver);
}

void PictureWriter::Write(const HostPicture& picture, std::int64_t number) {
    OutputFormat format = mFormat;
    format.path = mName.Format(number);
    PendingFile file(format.path);
    std::ofstream out(file.GetWorkingPath(), std::ios::binary);
    EncodePicture(picture, format, mExr, out);
    out.close();
    if (!out) throw OutputError(format.path + " can't be written: the disk is full or the folder refuses it");
    file.Commit();
}

}  // namespace Vantrel::Host
