// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <initializer_list>
#include <nlohmann/json.hpp>
#include <optional>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

namespace Vantrel::Host {

/// A timeline file can't be used. The text names file, place and thing.
class TimelineError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// What a whole reading shares.
struct ReadContext {
    std::string file;
    std::vector<std::string> warnings;
};

/// Parses a timeline file's text. Bare NaN, Inf, Infinity and their negatives, which such files may hold, become null.
/// @throws TimelineError naming line and column
[[nodiscard]] nlohmann::json ParseTimelineText(const std::string& text, const std::string& file);

/// A value with the place where it stands, so that every complaint can say so.
class JsonCursor {
public:
    JsonCursor(const nlohmann::json& value, std::string path, ReadContext& context)
        : mValue(&value), mPath(std::move(path)), mContext(&context) {}

    [[nodiscard]] const std::string& Path() const { return mPath; }
    [[nodiscard]] const nlohmann::json& Value() const { return *mValue; }

    [[noreturn]] void Fail(const std::string& message) const;
    void Warn(const std::string& message) const;

    /// A member; empty if it is missing or null.
    [[nodiscard]] std::optional<JsonCursor> Find(const std::string& key) const;
    /// A member that must be there.
    [[nodiscard]] JsonCursor Get(const std::string& key) const;
    [[nodiscard]] std::size_t Size() const;
    [[nodiscard]] JsonCursor Element(std::size_t index) const;
    /// Demands an array of that many numbers, or of one of two counts.
    [[nodiscard]] std::vector<double> Numbers(std::size_t count, std::size_t otherCount = 0) const;

    [[nodiscard]] double Number() const;
    /// A whole number between two limits.
    [[nodiscard]] std::int64_t Integer(std::int64_t lowest, std::int64_t highest) const;
    [[nodiscard]] bool Bool() const;
    [[nodiscard]] const std::string& Text() const;
    /// The number of the name among `names`.
    [[nodiscard]] std::size_t Choice(std::initializer_list<const char*> names) const;
    void ExpectObject() const;
    void ExpectArray() const;
    /// Warns of every member that isn't among `keys`.
    void WarnOfOthers(const std::vector<const char*>& keys) const;
    /// "text", "number" and so on, for messages.
    [[nodiscard]] const char* KindName() const;

    /// Name and version of "OTIO_SCHEMA".
    struct Schema {
        std::string name;
        int version = 0;
    };
    [[nodiscard]] Schema GetSchema() const;

private:
    const nlohmann::json* mValue;
    std::string mPath;
    ReadContext* mContext;
};

}  // namespace Vantrel::Host
