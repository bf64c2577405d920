// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Timeline/JsonCursor.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>
#include <string_view>

namespace Vantrel::Host {
namespace {

bool IsWordCharacter(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_';
}

/// The length of a bare not-a-number or infinity at the start of `text`, or 0.
std::size_t NonFiniteLength(std::string_view text) {
    constexpr std::array<std::string_view, 6> kWords = {"NaN", "Infinity", "Inf", "-Infinity", "-Inf", "-NaN"};
    for (const std::string_view word : kWords) {
        if (text.substr(0, word.size()) != word) continue;
        if (text.size() == word.size() || !IsWordCharacter(text[word.size()])) return word.size();
    }
    return 0;
}

std::string ReplaceNonFinite(const std::string& text) {
    std::string result;
    result.reserve(text.size());
    bool inString = false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const std::size_t length = inString ? 0 : NonFiniteLength(std::string_view(text).substr(i));
        if (length > 0) {
            result += "null";
            i += length - 1;
            continue;
        }
        result += text[i];
        if (inString && text[i] == '\\' && i + 1 < text.size()) {
            result += text[++i];
        } else if (text[i] == '"') {
            inString = !inString;
        }
    }
    return result;
}

std::string LineAndColumn(const std::string& text, std::size_t byte) {
    const std::string_view before = std::string_view(text).substr(0, std::min(byte, text.size()));
    const auto line = 1 + std::count(before.begin(), before.end(), '\n');
    const std::size_t lineStart = before.rfind('\n') + 1;  // npos + 1 is 0
    return "line " + std::to_string(line) + ", column " +
           std::to_string(std::max<std::size_t>(byte, lineStart + 1) - lineStart);
}

}  // namespace

nlohmann::json ParseTimelineText(const std::string& text, const std::string& file) {
    const std::string clean = ReplaceNonFinite(text);
    try {
        return nlohmann::json::parse(clean);
    } catch (const nlohmann::json::parse_error& error) {
        throw TimelineError(file + ": " + LineAndColumn(clean, error.byte) + ": not valid JSON");
    }
}

void JsonCursor::Fail(const std::string& message) const {
    throw TimelineError(mContext->file + ": " + (mPath.empty() ? "/" : mPath) + ": " + message);
}

void JsonCursor::Warn(const std::string& message) const {
    mContext->warnings.push_back(mContext->file + ": " + (mPath.empty() ? "/" : mPath) + ": " + message);
}

std::optional<JsonCursor> JsonCursor::Find(const std::string& key) const {
    const auto member = mValue->find(key);
    if (member == mValue->end() || member->is_null()) return std::nullopt;
    return JsonCursor(*member, mPath + "/" + key, *mContext);
}

JsonCursor JsonCursor::Get(const std::string& key) const {
    const auto member = mValue->find(key);
    if (member == mValue->end()) Fail("\"" + key + "\" is missing");
    return {*member, mPath + "/" + key, *mContext};
}

std::size_t JsonCursor::Size() const { return mValue->size(); }

JsonCursor JsonCursor::Element(std::size_t index) const {
    return {(*mValue)[index], mPath + "/" + std::to_string(index), *mContext};
}

std::vector<double> JsonCursor::Numbers(std::size_t count, std::size_t otherCount) const {
    ExpectArray();
    if (Size() != count && (otherCount == 0 || Size() != otherCount)) {
        Fail("expected " + std::to_string(count) + (otherCount != 0 ? " or " + std::to_string(otherCount) : "") +
             " numbers, found " + std::to_string(Size()));
    }
    std::vector<double> numbers;
    for (std::size_t i = 0; i < Size(); ++i) numbers.push_back(Element(i).Number());
    return numbers;
}

double JsonCursor::Number() const {
    if (!mValue->is_number()) Fail(std::string("expected a number, found ") + KindName());
    return mValue->get<double>();
}

std::int64_t JsonCursor::Integer(std::int64_t lowest, std::int64_t highest) const {
    const double number = Number();
    if (number != std::floor(number) || number < static_cast<double>(lowest) || number > static_cast<double>(highest)) {
        Fail("expected a whole number from " + std::to_string(lowest) + " to " + std::to_string(highest) + ", found " +
             mValue->dump());
    }
    return static_cast<std::int64_t>(number);
}

bool JsonCursor::Bool() const {
    if (!mValue->is_boolean()) Fail(std::string("expected true or false, found ") + KindName());
    return mValue->get<bool>();
}

const std::string& JsonCursor::Text() const {
    if (!mValue->is_string()) Fail(std::string("expected a text, found ") + KindName());
    return mValue->get_ref<const std::string&>();
}

std::size_t JsonCursor::Choice(std::initializer_list<const char*> names) const {
    const std::string& text = Text();
    const auto found = std::find(names.begin(), names.end(), text);
    if (found != names.end()) return static_cast<std::size_t>(found - names.begin());
    std::string accepted;
    for (const char* name : names) accepted += (accepted.empty() ? "" : ", ") + std::string(name);
    Fail("\"" + text + "\" isn't known; accepted are " + accepted);
}

void JsonCursor::ExpectObject() const {
    if (!mValue->is_object()) Fail(std::string("expected an object, found ") + KindName());
}

void JsonCursor::ExpectArray() const {
    if (!mValue->is_array()) Fail(std::string("expected an array, found ") + KindName());
}

void JsonCursor::WarnOfOthers(const std::vector<const char*>& keys) const {
    for (const auto& member : mValue->items()) {
        const std::string& key = member.key();
        if (std::none_of(keys.begin(), keys.end(), [&](const char* known) { return key == known; })) {
            Warn("unknown key \"" + key + "\"");
        }
    }
}

const char* JsonCursor::KindName() const {
    if (mValue->is_string()) return "a text";
    if (mValue->is_number()) return "a number";
    if (mValue->is_boolean()) return "true or false";
    if (mValue->is_array()) return "an array";
    return mValue->is_object() ? "an object" : "null";
}

JsonCursor::Schema JsonCursor::GetSchema() const {
    ExpectObject();
    const std::string& text = Get("OTIO_SCHEMA").Text();
    const std::size_t dot = text.rfind('.');
    const std::string digits = dot == std::string::npos ? "" : text.substr(dot + 1);
    const bool wellFormed = !digits.empty() && digits.size() < 6 &&
                            std::all_of(digits.begin(), digits.end(), [](char c) { return c >= '0' && c <= '9'; });
    if (!wellFormed) Fail("\"" + text + "\" isn't a schema with its version");
    return {text.substr(0, dot), std::stoi(digits)};
}

}  // namespace Vantrel::Host
