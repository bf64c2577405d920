// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Marl/BinaryData.h"

#include <algorithm>
#include <cstddef>

namespace Marl {

namespace {

constexpr char kAlphabet[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

int ValueOf(char digit) {
    if (digit >= 'A' && digit <= 'Z') return digit - 'A';
    if (digit >= 'a' && digit <= 'z') return digit - 'a' + 26;
    if (digit >= '0' && digit <= '9') return digit - '0' + 52;
    if (digit == '+') return 62;
    if (digit == '/') return 63;
    return -1;
}

bool Decode(const std::string& text, BinaryData& out) {
    if (text.size() % 4 != 0) return false;
    std::size_t padding = 0;
    while (padding < 2 && padding < text.size() && text[text.size() - 1 - padding] == '=') ++padding;

    out.reserve(text.size() / 4 * 3);
    std::uint32_t pending = 0;
    int pendingBits = 0;
    for (std::size_t i = 0; i < text.size() - padding; ++i) {
        const int value = ValueOf(text[i]);
        if (value < 0) return false;
        pending = pending << 6 | static_cast<std::uint32_t>(value);
        pendingBits += 6;
        if (pendingBits < 8) continue;
        pendingBits -= 8;
        out.push_back(static_cast<std::uint8_t>(pending >> pendingBits));
        pending &= (1U << pendingBits) - 1;
    }
    return pending == 0;
}

}  // namespace

Ostrand::Status DecodeBinaryDataFromUTF8String(const std::string& text, BinaryData& out) {
    out.clear();
    if (Decode(text, out)) return Ostrand::kStatus_OK;
    out.clear();
    return Ostrand::kStatus_Failure;
}

std::string EncodeBinaryDataToUTF8String(const BinaryData& data) {
    std::string text;
    text.reserve((data.size() + 2) / 3 * 4);
    for (std::size_t i = 0; i < data.size(); i += 3) {
        const std::size_t taken = std::min<std::size_t>(3, data.size() - i);
        std::uint32_t group = 0;
        for (std::size_t k = 0; k < 3; ++k) group = group << 8 | (k < taken ? data[i + k] : 0U);
        for (std::size_t k = 0; k < 4; ++k) text.push_back(k <= taken ? kAlphabet[group >> (18 - 6 * k) & 63] : '=');
    }
    return text;
}

}  // namespace Marl
