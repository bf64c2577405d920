// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Timeline/FieldReaders.h"

#include <cmath>
#include <cstdio>
#include <vector>

#include "Vantrel/TransitionTable.h"

namespace Vantrel::Host {
namespace {

void ExpectSchema(const JsonCursor& at, const char* name) {
    const JsonCursor::Schema schema = at.GetSchema();
    if (schema.name != name || schema.version != 1) at.Fail(std::string("expected a ") + name + ".1");
}

void ReadRemap(const JsonCursor& at, Item& item) {
    at.ExpectArray();
    if (at.Size() == 0) at.Fail("a time remap needs at least one key");
    for (std::size_t i = 0; i < at.Size(); ++i) {
        const JsonCursor key = at.Element(i);
        key.ExpectObject();
        key.WarnOfOthers({"t", "media", "interp"});
        RemapKey read;
        read.time = ReadTime(key.Get("t")).ticks;
        read.mediaTime = ReadTime(key.Get("media")).ticks;
        if (const auto interp = key.Find("interp")) {
            read.interpolation = static_cast<Interpolation>(interp->Choice({"hold", "linear", "bezier"}));
        }
        if (i > 0 && read.time <= item.options.remap.back().time) {
            key.Get("t").Fail("the keys of a time remap must rise in time");
        }
        item.options.remap.push_back(read);
    }
}

Multicam ReadMulticam(const JsonCursor& at) {
    at.ExpectObject();
    at.WarnOfOthers({"selected", "view", "show_program", "recording", "is_non_multicam"});
    constexpr std::int64_t kMostAngles = 1000;
    Multicam multicam;
    multicam.selected = static_cast<std::int32_t>(at.Get("selected").Integer(0, kMostAngles));
    if (const auto view = at.Find("view")) multicam.grid = view->Choice({"program", "grid"}) == 1;
    if (const auto program = at.Find("show_program")) multicam.showProgram = program->Bool();
    if (const auto recording = at.Find("recording")) multicam.recording = recording->Bool();
    if (const auto non = at.Find("is_non_multicam")) multicam.isNonMulticam = non->Bool();
    return multicam;
}

std::string FormatDouble(double number) {
    char text[40];
    (void)std::snprintf(text, sizeof text, "%.17g", number);
    return text;
}

std::string PackColor(const JsonCursor& color) {
    // Red lies in the lowest byte.
    std::uint32_t packed = 0;
    int shift = 0;
    for (const double component : color.Numbers(3)) {
        if (component < 0 || component > 255) color.Fail("a colour's components lie in 0 to 255");
        packed |= static_cast<std::uint32_t>(component + 0.5) << shift;
        shift += 8;
    }
    return std::to_string(packed);
}

std::int32_t FindChoice(const JsonCursor& at, const TransitionProperty& row) {
    std::string accepted;
    for (auto choice = static_cast<std::int32_t>(row.minimum); choice <= static_cast<std::int32_t>(row.maximum);
         ++choice) {
        const char* name = row.choiceName(choice);
        if (name == nullptr) continue;
        if (at.Text() == name) return choice;
        accepted += (accepted.empty() ? "" : ", ") + std::string(name);
    }
    at.Fail("\"" + at.Text() + "\" isn't known; accepted are " + accepted);
}

/// The value as the engine reads it.
std::string ReadTransitionProperty(const JsonCursor& at, const TransitionProperty& row) {
    if (row.type == ParameterType::kColor) return PackColor(at);
    if (row.type == ParameterType::kBool) return at.Bool() ? "1" : "0";
    if (row.type == ParameterType::kDouble) {
        const double number = at.Number();
        if (number >= row.minimum && number <= row.maximum) return FormatDouble(number);
        at.Fail("expected a number from " + FormatDouble(row.minimum) + " to " + FormatDouble(row.maximum) +
                ", found " + at.Value().dump());
    }
    const bool named = row.choiceName != nullptr && at.Value().is_string();
    return std::to_string(named ? FindChoice(at, row) : at.Integer(0, INT32_MAX));
}

/// Those of the push are all that there are; another transition that has them may be one that only a host knows.
void ReadTransitionProperties(const JsonCursor& at, Item& item) {
    at.ExpectObject();
    std::vector<const char*> names;
    for (const TransitionProperty& row : kPushProperties) names.push_back(row.name);
    at.WarnOfOthers(names);
    const TransitionRow* known = FindTransition(item.matchName.c_str());
    if (known != nullptr && known->propertyCount == 0 && !at.Value().empty())
        at.Warn("\"" + item.matchName + "\" has no properties");
    for (const TransitionProperty& row : kPushProperties) {
        if (const auto value = at.Find(row.name)) {
            item.properties.emplace_back(row.key, ReadTransitionProperty(*value, row));
        }
    }
}

std::int64_t ReadOffset(const JsonCursor& object, const char* key) {
    const auto offset = object.Find(key);
    if (!offset) return 0;
    const std::int64_t ticks = ReadTime(*offset).ticks;
    if (ticks < 0) offset->Fail("a transition's offset can't be below 0");
    return ticks;
}

}  // namespace

RationalTime ReadTime(const JsonCursor& at) {
    ExpectSchema(at, "RationalTime");
    const JsonCursor rate = at.Get("rate");
    const auto snapped = SnapRate(rate.Number());
    if (!snapped) rate.Fail("a rate must be above 0, found " + rate.Value().dump());
    const JsonCursor value = at.Get("value");
    const std::int64_t ticks = ToTicks(value.Number(), *snapped);
    if (ticks == Vellum::kTime_Max || ticks == -Vellum::kTime_Max) value.Fail("times lie within 100 hours");
    return {ticks, *snapped};
}

ReadRange ReadTimeRange(const JsonCursor& at) {
    ExpectSchema(at, "TimeRange");
    const RationalTime start = ReadTime(at.Get("start_time"));
    const JsonCursor duration = at.Get("duration");
    const RationalTime length = ReadTime(duration);
    if (length.ticks < 0) duration.Fail("a duration can't be below 0");
    return {{start.ticks, length.ticks}, TicksPerFrame(start.rate)};
}

std::optional<JsonCursor> FindOwnMetadata(const JsonCursor& object) {
    const auto metadata = object.Find("metadata");
    if (!metadata) return std::nullopt;
    metadata->ExpectObject();
    auto own = metadata->Find("vantrel");
    if (own) own->ExpectObject();
    return own;
}

SequenceSettings ReadSequenceSettings(const JsonCursor& at) {
    constexpr std::int64_t kLargestSide = 32768;
    at.ExpectObject();
    at.WarnOfOthers({"width", "height", "rate", "aspect", "fields"});
    SequenceSettings settings;
    if (const auto width = at.Find("width"))
        settings.width = static_cast<std::int32_t>(width->Integer(1, kLargestSide));
    if (const auto height = at.Find("height")) {
        settings.height = static_cast<std::int32_t>(height->Integer(1, kLargestSide));
    }
    if (const auto rate = at.Find("rate")) {
        const auto snapped = SnapRate(rate->Number());
        if (!snapped) rate->Fail("a rate must be above 0, found " + rate->Value().dump());
        settings.frameTicks = TicksPerFrame(*snapped);
    }
    if (const auto aspect = at.Find("aspect")) {
        aspect->ExpectArray();
        if (aspect->Size() != 2) aspect->Fail("a pixel aspect is [numerator, denominator]");
        settings.aspect = {static_cast<std::int32_t>(aspect->Element(0).Integer(1, INT32_MAX)),
                           static_cast<std::int32_t>(aspect->Element(1).Integer(1, INT32_MAX))};
    }
    if (const auto fields = at.Find("fields")) settings.fieldType = static_cast<FieldType>(fields->Integer(0, 2));
    return settings;
}

void ReadItemOptions(const JsonCursor& object, Item& item) {
    const auto own = FindOwnMetadata(object);
    if (!own) return;
    own->WarnOfOthers({"hold_filters", "hold", "time_remap", "frame_blend", "deinterlace", "reverse_field_dominance",
                       "alpha", "scale_to_frame", "disabled", "force_host", "sequence", "multicam"});
    ItemOptions& options = item.options;
    if (const auto flag = own->Find("hold_filters")) options.holdFilters = flag->Bool();
    if (const auto flag = own->Find("frame_blend")) options.frameBlend = flag->Bool();
    if (const auto flag = own->Find("deinterlace")) options.deinterlace = flag->Bool();
    if (const auto flag = own->Find("reverse_field_dominance")) options.reverseFieldDominance = flag->Bool();
    if (const auto hold = own->Find("hold")) {
        hold->ExpectObject();
        options.hold = ReadTime(hold->Get("t")).ticks;
    }
    if (const auto remap = own->Find("time_remap")) ReadRemap(*remap, item);
    if (const auto alpha = own->Find("alpha")) {
        options.alpha =
            static_cast<AlphaChoice>(alpha->Choice({"media", "ignore", "straight", "premultiplied", "invert"}));
    }
    if (const auto scale = own->Find("scale_to_frame")) {
        options.scale = static_cast<ScalePolicy>(scale->Choice({"none", "fit", "fill", "stretch"}));
    }
    if (const auto disabled = own->Find("disabled")) options.keepDisabled = disabled->Choice({"omit", "node"}) == 1;
    if (const auto force = own->Find("force_host")) options.forceHost = force->Bool();
    const bool composition = item.kind == ItemKind::kStack || item.kind == ItemKind::kTrack;
    if (const auto sequence = own->Find("sequence")) {
        if (composition) {
            item.settings = ReadSequenceSettings(*sequence);
        } else {
            sequence->Warn("only compositions have a sequence format");
        }
    }
    if (const auto multicam = own->Find("multicam")) {
        if (item.kind != ItemKind::kStack) multicam->Fail("only a Stack can be a multicam source");
        item.multicam = ReadMulticam(*multicam);
    }
}

void ReadTransition(const JsonCursor& object, Item& item) {
    item.inOffset = ReadOffset(object, "in_offset");
    item.outOffset = ReadOffset(object, "out_offset");
    const auto type = object.Find("transition_type");
    item.matchName = type ? type->Text() : "SMPTE_Dissolve";
    const auto own = FindOwnMetadata(object);
    if (own) {
        own->WarnOfOthers({"match_name", "params", "properties"});
        if (const auto name = own->Find("match_name")) item.matchName = name->Text();
    }
    if (item.matchName == "SMPTE_Dissolve") item.matchName = "XQVE Cross Dissolve";
    if (item.matchName == "Custom_Transition") object.Fail("a Custom_Transition needs metadata.vantrel.match_name");
    const auto properties = own ? own->Find("properties") : std::nullopt;
    if (properties) ReadTransitionProperties(*properties, item);
    item.parameters = ReadParameters(item.matchName, own ? own->Find("params") : std::nullopt);
}

}  // namespace Vantrel::Host
