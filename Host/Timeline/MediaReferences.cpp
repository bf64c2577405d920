// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cctype>
#include <filesystem>

#include "Host/Timeline/FieldReaders.h"

namespace Vantrel::Host {
namespace {

int HexDigit(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    const char lower = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return lower >= 'a' && lower <= 'f' ? lower - 'a' + 10 : -1;
}

std::string DecodePercents(const std::string& text) {
    std::string result;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] == '%' && i + 2 < text.size() && HexDigit(text[i + 1]) >= 0 && HexDigit(text[i + 2]) >= 0) {
            result += static_cast<char>(HexDigit(text[i + 1]) * 16 + HexDigit(text[i + 2]));
            i += 2;
        } else {
            result += text[i];
        }
    }
    return result;
}

/// The absolute path that a URL or path means; empty, with a warning, for what isn't a local file.
std::string ResolveUrl(const JsonCursor& at, const std::string& directory) {
    const std::string& url = at.Text();
    constexpr const char* kFileScheme = "file://";
    if (url.rfind(kFileScheme, 0) == 0) {
        const std::string rest = url.substr(std::string(kFileScheme).size());
        const std::size_t slash = rest.find('/');
        const std::string host = rest.substr(0, slash);
        if (slash == std::string::npos || (!host.empty() && host != "localhost")) {
            at.Warn("\"" + url + "\" doesn't name a file on this machine");
            return {};
        }
        return std::filesystem::path(DecodePercents(rest.substr(slash))).lexically_normal().string();
    }
    if (url.find("://") != std::string::npos) {
        at.Warn("\"" + url + "\" isn't a file");
        return {};
    }
    return (std::filesystem::path(directory) / url).lexically_normal().string();
}

std::array<double, 4> ReadColor(const JsonCursor& at) {
    const std::vector<double> numbers = at.Numbers(3, 4);
    std::array<double, 4> color{0, 0, 0, 1};
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        if (numbers[i] < 0 || numbers[i] > 255) at.Element(i).Fail("a colour's components lie in 0 to 255");
        color[i] = numbers[i] / 255.0;
    }
    return color;
}

Title ReadTitle(const JsonCursor& parameters) {
    parameters.WarnOfOthers({"text", "font", "size", "color", "position", "align"});
    Title title;
    if (const auto text = parameters.Find("text")) title.text = text->Text();
    if (const auto font = parameters.Find("font")) title.font = font->Text();
    if (const auto size = parameters.Find("size")) {
        title.size = size->Number();
        if (!(title.size > 0)) size->Fail("a title's size must be above 0");
    }
    if (const auto color = parameters.Find("color")) title.color = ReadColor(*color);
    if (const auto position = parameters.Find("position")) {
        const std::vector<double> numbers = position->Numbers(2);
        title.position = {numbers[0], numbers[1]};
    }
    if (const auto align = parameters.Find("align")) {
        title.align = static_cast<std::int32_t>(align->Choice({"left", "center", "right"})) - 1;
    }
    return title;
}

/// The kind as a source filter with the parameters as its options.
std::string FilterSourceOf(const std::string& kind, const std::optional<JsonCursor>& parameters) {
    std::string source = kind;
    char separator = '=';
    if (!parameters) return source;
    for (const auto& member : parameters->Value().items()) {
        std::string value;
        for (const char c : member.value().is_string() ? member.value().get<std::string>() : member.value().dump()) {
            if (c == ':' || c == '\\' || c == '\'' || c == ',' || c == ';' || c == '[' || c == ']') value += '\\';
            value += c;
        }
        source += separator + member.key() + "=" + value;
        separator = ':';
    }
    return source;
}

void ReadGenerator(const JsonCursor& at, MediaReference& reference) {
    reference.kind = ReferenceKind::kGenerator;
    reference.generator = at.Get("generator_kind").Text();
    const auto parameters = at.Find("parameters");
    if (parameters) parameters->ExpectObject();
    if (reference.generator == "color") {
        if (!parameters || !parameters->Find("color"))
            at.Fail(R"(a generator of kind "color" needs "color": [r, g, b])");
        const std::array<double, 4> color = ReadColor(parameters->Get("color"));
        for (std::size_t i = 0; i < 3; ++i) reference.color[i] = static_cast<std::uint8_t>(color[i] * 255.0 + 0.5);
    } else if (reference.generator == "title") {
        if (parameters) reference.title = ReadTitle(*parameters);
    } else if (reference.generator != "black" && reference.generator != "transparent" &&
               reference.generator != "SMPTEBars" && reference.generator != "adjustment") {
        reference.filterSource = FilterSourceOf(reference.generator, parameters);
    }
}

void ReadImageSequence(const JsonCursor& at, const std::string& directory, MediaReference& reference) {
    reference.kind = ReferenceKind::kImageSequence;
    ImageSequence& images = reference.images;
    images.directory = ResolveUrl(at.Get("target_url_base"), directory);
    if (images.directory.empty()) {
        reference.kind = ReferenceKind::kMissing;
        return;
    }
    if (images.directory.back() != '/') images.directory += '/';
    if (const auto prefix = at.Find("name_prefix")) images.prefix = prefix->Text();
    if (const auto suffix = at.Find("name_suffix")) images.suffix = suffix->Text();
    constexpr std::int64_t kLargest = 1000000000;
    if (const auto start = at.Find("start_frame")) images.startNumber = start->Integer(-kLargest, kLargest);
    if (const auto step = at.Find("frame_step")) images.numberStep = step->Integer(1, kLargest);
    if (const auto padding = at.Find("frame_zero_padding")) {
        images.zeroPadding = static_cast<std::int32_t>(padding->Integer(0, 32));
    }
    if (const auto policy = at.Find("missing_frame_policy")) {
        images.missing = static_cast<MissingFramePolicy>(policy->Choice({"error", "hold", "black"}));
    }
    const JsonCursor rate = at.Get("rate");
    const auto snapped = SnapRate(rate.Number());
    if (!snapped) rate.Fail("a rate must be above 0, found " + rate.Value().dump());
    reference.ticksPerImage = TicksPerFrame(*snapped) * images.numberStep;
    // Without a range the files that follow each other are counted when the media is opened.
    images.frameCount = 0;
    if (reference.availableRange) {
        images.frameCount =
            std::max<std::int64_t>(1, MultiplyTicks(reference.availableRange->duration, 1, reference.ticksPerImage));
    }
    reference.file = images.PathOf(0);
}

}  // namespace

std::string ImageSequence::PathOf(std::int64_t frame) const {
    const std::int64_t number = startNumber + frame * numberStep;
    std::string digits = std::to_string(number < 0 ? -number : number);
    if (static_cast<std::size_t>(zeroPadding) > digits.size()) {
        digits.insert(0, static_cast<std::size_t>(zeroPadding) - digits.size(), '0');
    }
    return directory + prefix + (number < 0 ? "-" : "") + digits + suffix;
}

MediaReference ReadMediaReference(const JsonCursor& at, const std::string& directory) {
    const JsonCursor::Schema schema = at.GetSchema();
    if (schema.version != 1)
        at.Fail("version " + std::to_string(schema.version) + " of " + schema.name + " isn't known");
    MediaReference reference;
    reference.path = at.Path();
    if (const auto range = at.Find("available_range")) {
        const ReadRange read = ReadTimeRange(*range);
        reference.availableRange = read.range;
        reference.availableFrameTicks = read.frameTicks;
    }
    if (schema.name == "ExternalReference") {
        reference.file = ResolveUrl(at.Get("target_url"), directory);
        reference.kind = reference.file.empty() ? ReferenceKind::kMissing : ReferenceKind::kFile;
    } else if (schema.name == "ImageSequenceReference") {
        ReadImageSequence(at, directory, reference);
    } else if (schema.name == "GeneratorReference") {
        ReadGenerator(at, reference);
    } else if (schema.name != "MissingReference") {
        at.Fail("unknown schema \"" + schema.name + "\" of a media reference");
    }
    return reference;
}

}  // namespace Vantrel::Host
