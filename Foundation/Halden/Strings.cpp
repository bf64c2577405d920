// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Halden/Strings.h"

#include <cstddef>

namespace Halden {

namespace {

constexpr char32_t kReplacement = 0xFFFD;

struct Lead {
    std::size_t trailing;  // bytes that follow; 0 for a byte that can't lead
    unsigned char secondLow;
    unsigned char secondHigh;
};

// The second byte's range keeps out overlong forms, surrogates and what lies beyond U+10FFFF, so that an ill-formed
// sequence ends at its longest valid beginning and each such beginning becomes one replacement.
Lead LeadOf(unsigned char byte) {
    if (byte >= 0xC2 && byte <= 0xDF) return {1, 0x80, 0xBF};
    if (byte == 0xE0) return {2, 0xA0, 0xBF};
    if (byte == 0xED) return {2, 0x80, 0x9F};
    if (byte >= 0xE1 && byte <= 0xEF) return {2, 0x80, 0xBF};
    if (byte == 0xF0) return {3, 0x90, 0xBF};
    if (byte >= 0xF1 && byte <= 0xF3) return {3, 0x80, 0xBF};
    if (byte == 0xF4) return {3, 0x80, 0x8F};
    return {0, 0, 0};
}

char32_t DecodeUTF8(const std::string& text, std::size_t& position) {
    const auto byteAt = [&text](std::size_t i) { return static_cast<unsigned char>(text[i]); };
    const unsigned char first = byteAt(position++);
    if (first < 0x80) return first;
    const Lead lead = LeadOf(first);
    if (lead.trailing == 0) return kReplacement;

    char32_t character = first & (0x3FU >> lead.trailing);
    for (std::size_t i = 0; i < lead.trailing; ++i) {
        if (position == text.size()) return kReplacement;
        const unsigned char next = byteAt(position);
        const unsigned char low = i == 0 ? lead.secondLow : 0x80;
        const unsigned char high = i == 0 ? lead.secondHigh : 0xBF;
        if (next < low || next > high) return kReplacement;
        character = character << 6 | (next & 0x3FU);
        ++position;
    }
    return character;
}

char32_t DecodeUTF16(const WideString& text, std::size_t& position) {
    const char32_t unit = text[position++];
    if (unit < 0xD800 || unit > 0xDFFF) return unit;
    if (unit > 0xDBFF || position == text.size()) return kReplacement;
    const char32_t low = text[position];
    if (low < 0xDC00 || low > 0xDFFF) return kReplacement;
    ++position;
    return 0x10000 + ((unit - 0xD800) << 10) + (low - 0xDC00);
}

void AppendUTF8(std::string& out, char32_t character) {
    const auto put = [&out](char32_t byte) { out.push_back(static_cast<char>(static_cast<unsigned char>(byte))); };
    if (character < 0x80) {
        put(character);
    } else if (character < 0x800) {
        put(0xC0 | character >> 6);
        put(0x80 | (character & 0x3F));
    } else if (character < 0x10000) {
        put(0xE0 | character >> 12);
        put(0x80 | (character >> 6 & 0x3F));
        put(0x80 | (character & 0x3F));
    } else {
        put(0xF0 | character >> 18);
        put(0x80 | (character >> 12 & 0x3F));
        put(0x80 | (character >> 6 & 0x3F));
        put(0x80 | (character & 0x3F));
    }
}

}  // namespace

WideString ToWide(const std::string& utf8) {
    WideString wide;
    wide.reserve(utf8.size());
    for (std::size_t position = 0; position < utf8.size();) {
        const char32_t character = DecodeUTF8(utf8, position);
        if (character < 0x10000) {
            wide.push_back(static_cast<char16_t>(character));
        } else {
            wide.push_back(static_cast<char16_t>(0xD800 + ((character - 0x10000) >> 10)));
            wide.push_back(static_cast<char16_t>(0xDC00 + ((character - 0x10000) & 0x3FF)));
        }
    }
    return wide;
}

std::string ToUTF8(const WideString& wide) {
    std::string utf8;
    utf8.reserve(wide.size());
    for (std::size_t position = 0; position < wide.size();) AppendUTF8(utf8, DecodeUTF16(wide, position));
    return utf8;
}

}  // namespace Halden
