// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Media/FFmpegHandles.h"

#include <array>
#include <new>

namespace Vantrel::Host {

Frame MakeFrame() {
    Frame frame(av_frame_alloc());
    if (!frame) throw std::bad_alloc();
    return frame;
}

Packet MakePacket() {
    Packet packet(av_packet_alloc());
    if (!packet) throw std::bad_alloc();
    return packet;
}

Frame ShareFrame(const AVFrame& frame) {
    Frame shared(av_frame_clone(&frame));
    if (!shared) throw std::bad_alloc();
    return shared;
}

std::string DescribeFFmpegError(int code) {
    std::array<char, AV_ERROR_MAX_STRING_SIZE> text{};
    av_strerror(code, text.data(), text.size());
    return text.data();
}

}  // namespace Vantrel::Host
