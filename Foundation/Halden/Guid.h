// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>
#include <cstring>
#include <functional>
#include <string>
#include <tuple>

#include "Halden/Strings.h"

namespace Halden::utility {

/// A 16-byte identifier. The default value is the nil identifier.
///
/// Text form: 8-4-4-4-12 upper-case hexadecimal digits with hyphens, 36 characters and no braces. Reading takes either
/// case and optional braces around it; any other text yields the nil identifier.
struct Guid {
    std::uint32_t Data1 = 0;
    std::uint16_t Data2 = 0;
    std::uint16_t Data3 = 0;
    std::array<std::uint8_t, 8> Data4{};

    constexpr Guid() = default;
    constexpr Guid(std::uint32_t data1, std::uint16_t data2, std::uint16_t data3, std::array<std::uint8_t, 8> data4)
        : Data1(data1), Data2(data2), Data3(data3), Data4(data4) {}

    explicit Guid(const std::string& text);
    explicit Guid(const WideString& text);

    /// Writes the 16 bytes that fingerprints mix in: Data1, Data2 and Data3 most significant byte first, then Data4.
    static void GuidToBytes(const Guid& guid, std::uint8_t (&bytes)[16]);

    [[nodiscard]] std::string ToString() const;
    [[nodiscard]] WideString ToWideString() const;
    [[nodiscard]] constexpr bool IsNil() const { return *this == Guid(); }

    friend constexpr bool operator==(const Guid& a, const Guid& b) {
        if (a.Data1 != b.Data1 || a.Data2 != b.Data2 || a.Data3 != b.Data3) return false;
        for (std::size_t i = 0; i < 8; ++i) {
            if (a.Data4[i] != b.Data4[i]) return false;
        }
        return true;
    }
    friend constexpr bool operator!=(const Guid& a, const Guid& b) { return !(a == b); }
    /// A strict order without further meaning, for ordered maps.
    friend bool operator<(const Guid& a, const Guid& b) {
        return std::tie(a.Data1, a.Data2, a.Data3, a.Data4) < std::tie(b.Data1, b.Data2, b.Data3, b.Data4);
    }
};

}  // namespace Halden::utility

template <>
struct std::hash<Halden::utility::Guid> {
    std::size_t operator()(const Halden::utility::Guid& guid) const noexcept {
        std::uint64_t halves[2];
        static_assert(sizeof halves == sizeof guid, "the members leave no gaps");
        std::memcpy(halves, &guid, sizeof guid);
        // Most are made of hashes already; those that somebody counts up differ in few bits.
        constexpr std::uint64_t kOdd = 0x9E3779B97F4A7C15U;
        const std::uint64_t mixed = (halves[0] ^ (halves[1] * kOdd)) * kOdd;
        return static_cast<std::size_t>(mixed ^ (mixed >> 32));
    }
};
