// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Halden/Guid.h"

#include <optional>

namespace Halden::utility {

namespace {

constexpr std::size_t kTextLength = 36;

constexpr bool IsHyphenPlace(std::size_t i) { return i == 8 || i == 13 || i == 18 || i == 23; }

template <class Character>
std::optional<std::uint8_t> DigitOf(Character character) {
    if (character >= '0' && character <= '9') return static_cast<std::uint8_t>(character - '0');
    if (character >= 'a' && character <= 'f') return static_cast<std::uint8_t>(character - 'a' + 10);
    if (character >= 'A' && character <= 'F') return static_cast<std::uint8_t>(character - 'A' + 10);
    return std::nullopt;
}

Guid FromBytes(const std::uint8_t (&bytes)[16]) {
    Guid guid;
    guid.Data1 = static_cast<std::uint32_t>(bytes[0]) << 24 | static_cast<std::uint32_t>(bytes[1]) << 16 |
                 static_cast<std::uint32_t>(bytes[2]) << 8 | bytes[3];
    guid.Data2 = static_cast<std::uint16_t>(bytes[4] << 8 | bytes[5]);
    guid.Data3 = static_cast<std::uint16_t>(bytes[6] << 8 | bytes[7]);
    for (std::size_t i = 0; i < 8; ++i) guid.Data4[i] = bytes[8 + i];
    return guid;
}

template <class Text>
Guid Parse(const Text& text) {
    std::size_t begin = 0;
    if (text.size() == kTextLength + 2 && text.front() == '{' && text.back() == '}') {
        begin = 1;
    } else if (text.size() != kTextLength) {
        return {};
    }

    std::uint8_t bytes[16] = {};
    std::size_t digits = 0;
    for (std::size_t i = 0; i < kTextLength; ++i) {
        const auto character = text[begin + i];
        if (IsHyphenPlace(i)) {
            if (character != '-') return {};
            continue;
        }
        const std::optional<std::uint8_t> digit = DigitOf(character);
        if (!digit) return {};
        bytes[digits / 2] = static_cast<std::uint8_t>(bytes[digits / 2] << 4 | *digit);
        ++digits;
    }
    return FromBytes(bytes);
}

template <class Text>
Text Write(const Guid& guid) {
    std::uint8_t bytes[16];
    Guid::GuidToBytes(guid, bytes);
    Text text;
    text.reserve(kTextLength);
    for (const std::uint8_t byte : bytes) {
        if (IsHyphenPlace(text.size())) text.push_back('-');
        text.push_back("0123456789ABCDEF"[byte >> 4]);
        text.push_back("0123456789ABCDEF"[byte & 15]);
    }
    return text;
}

}  // namespace

Guid::Guid(const std::string& text) : Guid(Parse(text)) {}

Guid::Guid(const WideString& text) : Guid(Parse(text)) {}

void Guid::GuidToBytes(const Guid& guid, std::uint8_t (&bytes)[16]) {
    for (std::size_t i = 0; i < 4; ++i) bytes[i] = static_cast<std::uint8_t>(guid.Data1 >> (24 - 8 * i));
    bytes[4] = static_cast<std::uint8_t>(guid.Data2 >> 8);
    bytes[5] = static_cast<std::uint8_t>(guid.Data2);
    bytes[6] = static_cast<std::uint8_t>(guid.Data3 >> 8);
    bytes[7] = static_cast<std::uint8_t>(guid.Data3);
    for (std::size_t i = 0; i < 8; ++i) bytes[8 + i] = guid.Data4[i];
}

std::string Guid::ToString() const { return Write<std::string>(*this); }

WideString Guid::ToWideString() const { return Write<WideString>(*this); }

}  // namespace Halden::utility
