// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <type_traits>

#include "Halden/Guid.h"

namespace Ostrand {

/// The state of a fingerprint: four 32-bit words, all zero at the start.
struct HashValue {
    std::uint32_t w0 = 0;
    std::uint32_t w1 = 0;
    std::uint32_t w2 = 0;
    std::uint32_t w3 = 0;
};

struct MixHash {
    /// Mixes bytes into a state: XXH3, 128 bit, of the bytes, then of the state joined with that. Deterministic on
    /// every machine of one byte order; fingerprints are only compared with each other. `bytes` may be null for length
    /// 0.
    static void MixInData(HashValue& value, const void* bytes, std::size_t length);
};

/// Builds a node's fingerprint: for each item its length is added to w3, then its bytes are mixed in.
class NodeHasher {
public:
    NodeHasher& Bytes(const void* bytes, std::size_t length);
    /// The characters of a literal, without its terminator.
    template <std::size_t N>
    NodeHasher& Text(const char (&literal)[N]) {
        return Bytes(literal, N - 1);
    }
    NodeHasher& Identifier(const Halden::utility::Guid& guid);
    /// A plain value without padding.
    template <class T>
    NodeHasher& Value(const T& value) {
        static_assert(std::is_trivially_copyable_v<T>);
        return Bytes(&value, sizeof value);
    }

    /// The fingerprint of all items so far.
    [[nodiscard]] Halden::utility::Guid Finish() const;

private:
    HashValue mValue;
};

}  // namespace Ostrand
