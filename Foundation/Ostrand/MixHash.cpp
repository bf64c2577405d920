// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Ostrand/MixHash.h"

#include <xxhash.h>

namespace Ostrand {

void MixHash::MixInData(HashValue& value, const void* bytes, std::size_t length) {
    // Data and state are hashed one after the other: a seed alone would take only half of the state, and joining the
    // two in one buffer would copy the data.
    const XXH128_hash_t digest = XXH3_128bits(bytes, length);
    const std::uint64_t folded[] = {value.w0 | static_cast<std::uint64_t>(value.w1) << 32,
                                    value.w2 | static_cast<std::uint64_t>(value.w3) << 32, digest.low64, digest.high64};
    const XXH128_hash_t mixed = XXH3_128bits(folded, sizeof folded);
    value.w0 = static_cast<std::uint32_t>(mixed.low64);
    value.w1 = static_cast<std::uint32_t>(mixed.low64 >> 32);
    value.w2 = static_cast<std::uint32_t>(mixed.high64);
    value.w3 = static_cast<std::uint32_t>(mixed.high64 >> 32);
}

NodeHasher& NodeHasher::Bytes(const void* bytes, std::size_t length) {
    mValue.w3 += static_cast<std::uint32_t>(length);
    MixHash::MixInData(mValue, bytes, length);
    return *this;
}

NodeHasher& NodeHasher::Identifier(const Halden::utility::Guid& guid) {
    std::uint8_t bytes[16];
    Halden::utility::Guid::GuidToBytes(guid, bytes);
    return Bytes(bytes, sizeof bytes);
}

Halden::utility::Guid NodeHasher::Finish() const {
    Halden::utility::Guid guid;
    guid.Data1 = mValue.w0;
    guid.Data2 = static_cast<std::uint16_t>(mValue.w1 >> 16);
    guid.Data3 = static_cast<std::uint16_t>(mValue.w1);
    for (std::size_t i = 0; i < 4; ++i) {
        guid.Data4[i] = static_cast<std::uint8_t>(mValue.w2 >> (24 - 8 * i));
        guid.Data4[4 + i] = static_cast<std::uint8_t>(mValue.w3 >> (24 - 8 * i));
    }
    return guid;
}

}  // namespace Ostrand
