// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Snapshot/ContentHasher.h"

#include <array>
#include <cstring>
#include <memory>
#include <new>

extern "C" {
#include <libavutil/mem.h>
#include <libavutil/sha.h>
}

namespace Vantrel::Host {
namespace {

struct FreeSha {
    void operator()(AVSHA* sha) const { av_free(sha); }
};

}  // namespace

ContentHasher& ContentHasher::Number(std::int64_t value) { return Bytes(&value, sizeof value); }

ContentHasher& ContentHasher::Real(double value) {
    // Both zeros are one number.
    const double canonical = value == 0 ? 0.0 : value;
    return Bytes(&canonical, sizeof canonical);
}

ContentHasher& ContentHasher::Text(const std::string& text) {
    Number(static_cast<std::int64_t>(text.size()));
    return Bytes(text.data(), text.size());
}

ContentHasher& ContentHasher::Identifier(const Halden::utility::Guid& guid) {
    std::uint8_t bytes[16];
    Halden::utility::Guid::GuidToBytes(guid, bytes);
    return Bytes(bytes, sizeof bytes);
}

ContentHasher& ContentHasher::Bytes(const void* bytes, std::size_t length) {
    mBytes.append(static_cast<const char*>(bytes), length);
    return *this;
}

Halden::utility::Guid ContentHasher::Finish() const {
    constexpr int kBits = 256;
    const std::unique_ptr<AVSHA, FreeSha> sha(av_sha_alloc());
    if (!sha) throw std::bad_alloc();
    std::array<std::uint8_t, kBits / 8> digest{};
    av_sha_init(sha.get(), kBits);
    av_sha_update(sha.get(), reinterpret_cast<const std::uint8_t*>(mBytes.data()), mBytes.size());
    av_sha_final(sha.get(), digest.data());
    const auto word = [&](std::size_t at) {
        return static_cast<std::uint32_t>(digest[at] << 24 | digest[at + 1] << 16 | digest[at + 2] << 8 |
                                          digest[at + 3]);
    };
    std::array<std::uint8_t, 8> tail{};
    std::memcpy(tail.data(), digest.data() + 8, tail.size());
    const Halden::utility::Guid guid(word(0), static_cast<std::uint16_t>(word(4) >> 16),
                                     static_cast<std::uint16_t>(word(4) & 0xFFFF), tail);
    return guid.IsNil() ? Halden::utility::Guid(1, 0, 0, {}) : guid;
}

}  // namespace Vantrel::Host
