// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>

#include "Host/Media/MediaInfo.h"

namespace Vantrel::Host {

/// Looks into media with FFmpeg. Answers are remembered for as long as a file's size and time stay the same.
class FFmpegProbe : public IMediaProbe {
public:
    FFmpegProbe();
    ~FFmpegProbe() override;

    [[nodiscard]] MediaProbeResult ProbeFile(const std::string& path) override;
    [[nodiscard]] MediaProbeResult ProbeFilterSource(const std::string& source, std::int32_t width, std::int32_t height,
                                                     std::int64_t ticksPerFrame) override;

private:
    struct Memory;
    std::unique_ptr<Memory> mMemory;
};

}  // namespace Vantrel::Host
