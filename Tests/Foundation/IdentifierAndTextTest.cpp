// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>

#include "Brae/Conversions.h"
#include "Halden/DebugDatabase.h"
#include "Halden/Guid.h"
#include "Halden/Strings.h"
#include "Marl/BinaryData.h"
#include "Vellum/Field.h"

using Halden::ToUTF8;
using Halden::ToWide;
using Halden::WideString;
using Halden::utility::Guid;

namespace {

constexpr Guid kSample{0x0A1B2C3D, 0x4E5F, 0x6071, {0x82, 0x93, 0xA4, 0xB5, 0xC6, 0xD7, 0xE8, 0xF9}};
constexpr char kSampleText[] = "0A1B2C3D-4E5F-6071-8293-A4B5C6D7E8F9";

}  // namespace

TEST(GuidText, IsWrittenAndReadBack) {
    EXPECT_EQ(kSample.ToString(), kSampleText);
    EXPECT_EQ(kSample.ToWideString(), ToWide(kSampleText));
    EXPECT_EQ(Guid(std::string(kSampleText)), kSample);
    EXPECT_EQ(Guid(u"{0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9}"), kSample);
    EXPECT_EQ(Brae::GuidToPluginID(kSample).text, std::string(kSampleText));
    EXPECT_EQ(Guid().ToString(), "00000000-0000-0000-0000-000000000000");
}

TEST(GuidText, ThatIsMalformedGivesTheNilIdentifier) {
    const std::string text = kSampleText;
    for (const std::string& malformed :
         {std::string(), text + "0", text.substr(1), "{" + text, text + "}", "(" + text + ")", "{" + text + ")",
          std::string("0A1B2C3D04E5F-6071-8293-A4B5C6D7E8F9"), std::string("0A1B2C3-D4E5F-6071-8293-A4B5C6D7E8F9"),
          std::string("0A1B2C3G-4E5F-6071-8293-A4B5C6D7E8F9"), std::string("0A1B2C3D-4E5F-6071-8293-A4B5C6D7E8-9")}) {
        EXPECT_TRUE(Guid(malformed).IsNil()) << malformed;
    }
    WideString wide = ToWide(text);
    wide[0] = u'0' + 0x100;  // a digit only when cut to eight bits
    EXPECT_TRUE(Guid(wide).IsNil());
}

TEST(WideText, ConvertsEveryLengthOfCharacterBothWays) {
    const std::string utf8 =
        "a\xC2\x80\xC3\xA9\xDF\xBF\xE0\xA0\x80\xED\x9F\xBF\xEE\x80\x80\xEF\xBF\xBF\xF0\x90\x80\x80"
        "\xF4\x8F\xBF\xBF" +
        std::string(1, '\0') + "z";
    const WideString wide =
        WideString(u"a\u0080\u00E9\u07FF\u0800\uD7FF\uE000\uFFFF\U00010000\U0010FFFF") + u'\0' + u'z';
    EXPECT_EQ(ToWide(utf8), wide);
    EXPECT_EQ(ToUTF8(wide), utf8);
}

TEST(WideText, ReplacesEachIllFormedSequence) {
    const struct {
        std::string utf8;
        WideString wide;
    } cases[] = {
        {"\x80", u"\uFFFD"},                                // a trailing byte alone
        {"\xC0\xAF", u"\uFFFD\uFFFD"},                      // overlong
        {"\xE0\x80\xAF", u"\uFFFD\uFFFD\uFFFD"},            // overlong
        {"\xED\xA0\x80", u"\uFFFD\uFFFD\uFFFD"},            // a surrogate
        {"\xF4\x90\x80\x80", u"\uFFFD\uFFFD\uFFFD\uFFFD"},  // beyond the last character
        {"\xE2\x82", u"\uFFFD"},                            // cut short by the end
        {"\xF0\x9F\x98z", u"\uFFFDz"},                      // cut short by another character
        {"\xF0\x9F\xC3\xA9", u"\uFFFD\u00E9"},              // the interrupting character survives
        {"\xFF\xFEok", u"\uFFFD\uFFFDok"},
    };
    for (const auto& malformed : cases) EXPECT_EQ(ToWide(malformed.utf8), malformed.wide) << malformed.utf8;

    const char16_t high = 0xD83D;
    const char16_t low = 0xDE00;
    EXPECT_EQ(ToUTF8(WideString{high}), "\xEF\xBF\xBD");
    EXPECT_EQ(ToUTF8(WideString{low, high}), "\xEF\xBF\xBD\xEF\xBF\xBD");
    EXPECT_EQ(ToUTF8(WideString{high, high, low}), "\xEF\xBF\xBD\xF0\x9F\x98\x80");
    EXPECT_EQ(ToUTF8(WideString{high, u'z'}), "\xEF\xBF\xBDz");
}

TEST(Base64, EncodesAndDecodesTheKnownVectors) {
    const struct {
        std::string data;
        std::string text;
    } vectors[] = {{"", ""},
                   {"f", "Zg=="},
                   {"fo", "Zm8="},
                   {"foo", "Zm9v"},
                   {"foob", "Zm9vYg=="},
                   {"fooba", "Zm9vYmE="},
                   {"\xFB\xFF\xBF", "+/+/"}};
    for (const auto& vector : vectors) {
        const Marl::BinaryData data(vector.data.begin(), vector.data.end());
        EXPECT_EQ(Marl::EncodeBinaryDataToUTF8String(data), vector.text);
        Marl::BinaryData decoded{1, 2, 3};
        EXPECT_EQ(Marl::DecodeBinaryDataFromUTF8String(vector.text, decoded), Ostrand::kStatus_OK);
        EXPECT_EQ(decoded, data);
    }
}

TEST(Base64, RefusesWhatIsMalformedAndEmptiesTheOutput) {
    for (const char* text : {"Zg", "Zg=", "Zg===", "====", "=", "Z===", "Zg==Zm9v", "Zm9v\n", "Zm 9", "Zm9-",
                             "Zh==", "Zm9=", "Z=g=", "Zm9v=m9v"}) {
        Marl::BinaryData decoded{1, 2, 3};
        EXPECT_EQ(Marl::DecodeBinaryDataFromUTF8String(text, decoded), Ostrand::kStatus_Failure) << text;
        EXPECT_TRUE(decoded.empty()) << text;
    }
}
