// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Host/Timeline/EffectTables.h"
#include "Tests/Host/TimelineText.h"

namespace Vantrel::Host::Test {
namespace {

using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;

std::string ErrorOf(const std::string& text) {
    try {
        static_cast<void>(ReadTimelineText(text, "/films/film.otio"));
    } catch (const TimelineError& error) {
        return error.what();
    }
    return "(no error)";
}
std::string ErrorOf(const Json& timeline) { return ErrorOf(timeline.dump()); }

/// A timeline with one clip, and what is wrong with it.
Json WithClip(const std::function<void(Json&)>& spoil, Json clip = Clip("A", 0, 10)) {
    spoil(clip);
    return Timeline({Track({std::move(clip)})});
}

constexpr const char* kClipPath = "/films/film.otio: /tracks/children/0/children/0";

TEST(OtioReader, ErrorsNameFilePlaceAndThing) {
    struct Case {
        Json timeline;
        const char* place;
        const char* thing;
    };
    const auto effects = [](std::vector<Json> list) {
        return WithClip([&](Json& clip) { clip["effects"] = std::move(list); });
    };
    const auto blur = [&](Json value) {
        return effects({Effect("TQ.XQVE Gaussian Blur 2", {{"blurriness", std::move(value)}})});
    };
    const Json late = {{"t", Time(9)}, {"value", 1}};
    const std::vector<Case> cases = {
        {WithClip([](Json& c) { c["OTIO_SCHEMA"] = "Clop.1"; }), "", "unknown schema \"Clop\""},
        {WithClip([](Json& c) { c["OTIO_SCHEMA"] = "Clip.9"; }), "", "version 9 of Clip"},
        {WithClip([](Json& c) { c["OTIO_SCHEMA"] = "Clip"; }), "", "\"Clip\" isn't a schema"},
        {WithClip([](Json& c) { c = 5; }), "", "expected an object, found a number"},
        {WithClip([](Json& c) { c["enabled"] = "yes"; }), "/enabled", "expected true or false, found a text"},
        {WithClip([](Json& c) { c["source_range"] = Range(0, 10, 0); }), "/source_range/start_time/rate",
         "above 0, found 0"},
        {WithClip([](Json& c) { c["source_range"] = Range(0, -1); }), "/source_range/duration", "below 0"},
        {WithClip([](Json& c) { c["source_range"] = Range(0, 0); }), "/source_range/duration", "\"A\" has no length"},
        {WithClip([](Json& c) { c["source_range"] = Range(1e9, 1); }), "/source_range/start_time/value", "100 hours"},
        {WithClip([](Json& c) { c["source_range"]["start_time"]["value"] = nullptr; }),
         "/source_range/start_time/value", "expected a number, found null"},
        {WithClip([](Json& c) { c["active_media_reference_key"] = "proxy"; }), "/media_references", "\"proxy\""},
        {WithClip([](Json& c) { c["media_references"]["DEFAULT_MEDIA"]["OTIO_SCHEMA"] = "Tape.1"; }),
         "/media_references/DEFAULT_MEDIA", "unknown schema \"Tape\""},
        {WithClip(
             [](Json& c) { c.erase("source_range"), c["media_references"]["DEFAULT_MEDIA"].erase("available_range"); }),
         "", "neither a source_range nor an available_range"},
        {effects({Warp(1e9)}), "/effects/0/time_scalar", "a speed is 0 or lies between"},
        {effects({{{"OTIO_SCHEMA", "Sparkle.1"}}}), "/effects/0", "unknown schema \"Sparkle\""},
        {effects({Effect("TQ.XQVE Opacity"), Effect("TQ.XQVE Opacity")}), "/effects/1", "more than once"},
        {effects({Effect("TQ.XQVE Opacity", {{"blend_mode", "shiny"}})}),
         "/effects/0/metadata/vantrel/params/blend_mode", "no choice \"shiny\"; accepted are color, color_burn"},
        {effects({Effect("TQ.XQVE Gaussian Blur 2", {{"bluriness", 1}})}),
         "/effects/0/metadata/vantrel/params/bluriness", "\"TQ.XQVE Gaussian Blur 2\" has no parameter \"bluriness\""},
        {blur("much"), "/effects/0/metadata/vantrel/params/blurriness",
         "\"blurriness\" of \"TQ.XQVE Gaussian Blur 2\" is of type double, found a text"},
        {blur({1, 2}), "/effects/0/metadata/vantrel/params/blurriness", "is of type double, found an array"},
        {blur({{"keyframes", Json::array()}}), "/effects/0/metadata/vantrel/params/blurriness/keyframes",
         "has no keyframes"},
        {blur({{"keyframes", {late, late}}}), "/effects/0/metadata/vantrel/params/blurriness/keyframes/1/t",
         "must rise"},
        {WithClip([](Json& c) {
             c.update(Own({{"scale_to_frame", "zoom"}}));
         }),
         "/metadata/vantrel/scale_to_frame", "\"zoom\" isn't known; accepted are none, fit, fill, stretch"},
    };
    for (const Case& c : cases) {
        EXPECT_THAT(ErrorOf(c.timeline), AllOf(HasSubstr(std::string(kClipPath) + c.place + ": "), HasSubstr(c.thing)));
    }
}

TEST(OtioReader, TransitionsAreReadByTheirTable) {
    const auto push = [](Json properties, const char* name = "XQVE Push") {
        Json transition = Dissolve(2, 2);
        transition["metadata"] = {{"vantrel", {{"match_name", name}, {"properties", std::move(properties)}}}};
        return Timeline({Track({Clip("A", 0, 10), transition, Clip("B", 0, 10)})});
    };
    const Document read = Read(push({{"direction", "up"}, {"border_color", {1, 2, 3}}, {"border_width", 2.5}}));
    EXPECT_THAT(read.tracks.children.at(0).children.at(1).properties,
                testing::UnorderedElementsAre(testing::Pair("TransitionNode::TransitionDirection", "4"),
                                              testing::Pair("TransitionNode::TransitionBorderColor", "197121"),
                                              testing::Pair("TransitionNode::TransitionBorderWidth", "2.5")));
    const std::pair<Json, const char*> mistakes[] = {
        {{{"direction", "back"}}, "direction: \"back\" isn't known; accepted are right, down, left, up"},
        {{{"border_width", -1}}, "border_width: expected a number from 0 to 32768, found -1"},
        {{{"border_color", {1, 2, 300}}}, "border_color: a colour's components lie in 0 to 255"},
        {{{"reverse", "yes"}}, "reverse: expected true or false, found a text"}};
    for (const auto& [properties, message] : mistakes) EXPECT_THAT(ErrorOf(push(properties)), HasSubstr(message));
    EXPECT_THAT(Read(push({{"reverse", true}}, "XQVE Cross Dissolve")).warnings,
                testing::ElementsAre(HasSubstr("\"XQVE Cross Dissolve\" has no properties")));
}

TEST(OtioReader, BrokenFilesAreToldByLineAndColumn) {
    EXPECT_THAT(ErrorOf(std::string("{\n  \"a\": [1, 2\n")),
                HasSubstr("/films/film.otio: line 3, column 1: not valid JSON"));
    EXPECT_THAT(ErrorOf(std::string("")), HasSubstr("not valid JSON"));
    EXPECT_THAT(ErrorOf(std::string("[]")), HasSubstr("expected an object"));
    EXPECT_THAT(ErrorOf(std::string(R"({"OTIO_SCHEMA": "Marker.1"})")), HasSubstr("unknown schema \"Marker\""));
    Json deep = Clip("A", 0, 1);
    for (int i = 0; i < 100; ++i) deep = Stack({deep});
    EXPECT_THAT(ErrorOf(deep), HasSubstr("nested deeper than"));
    try {
        static_cast<void>(ReadTimelineFile("/nowhere/film.otio"));
        FAIL();
    } catch (const TimelineError& error) {
        EXPECT_STREQ(error.what(), "/nowhere/film.otio: the file can't be read");
    }
}

TEST(OtioReader, NumbersThatJsonDoesNotKnowAreReadOutsideOfTexts) {
    const std::string text = R"({"OTIO_SCHEMA": "Timeline.1", "name": "a \"NaN\" Inf", "metadata":
        {"x": NaN, "y": [-Infinity, Inf, -Inf, Infinity], "big": 123456789012345678901234567890},
        "tracks": {"OTIO_SCHEMA": "Stack.1", "children": []}})";
    EXPECT_EQ(ReadTimelineText(text, "x.otio").name, "a \"NaN\" Inf");
}

TEST(OtioReader, UnknownKeysOfOursAreWarnedAbout) {
    const Document document = Read(WithClip([](Json& c) { c.update(Own({{"frame_blnd", true}})); }));
    EXPECT_THAT(document.warnings, ElementsAre(HasSubstr("/metadata/vantrel: unknown key \"frame_blnd\"")));
}

TEST(OtioReader, WhatIsNoTimelineIsWrapped) {
    const Json clip = Clip("A", 0, 10);
    const Json collection = {{"OTIO_SCHEMA", "SerializableCollection.1"},
                             {"children", {Clip("other", 0, 3), Timeline({Track({clip})})}}};
    for (const Json& top : {clip, Track({clip}), Stack({Track({clip})}), Timeline({Track({clip})}), collection}) {
        const Described described(top);
        EXPECT_EQ(described.snapshot->top->length, 10 * kFrame) << top["OTIO_SCHEMA"];
        EXPECT_EQ(described.Segments().size(), 1U) << top["OTIO_SCHEMA"];
    }
    Json audio = Track({clip});
    audio["kind"] = "Audio";
    EXPECT_TRUE(Described(Timeline({audio})).Segments().empty());
}

TEST(OtioReader, ReferencesBecomePaths) {
    const auto fileOf = [](const std::string& url) {
        const Json media = {{"OTIO_SCHEMA", "ExternalReference.1"}, {"target_url", url}};
        return Read(Clip("A", Range(0, 10), media)).tracks.children[0].media.file;
    };
    EXPECT_EQ(fileOf("file:///media/a%20b%2541.mov"), "/media/a b%41.mov");
    EXPECT_EQ(fileOf("file://localhost/media/a.mov"), "/media/a.mov");
    EXPECT_EQ(fileOf("/media/a%20b.mov"), "/media/a%20b.mov");
    EXPECT_EQ(fileOf("clips/../a.mov"), "/films/a.mov");
    EXPECT_EQ(fileOf("https://example.org/a.mov"), "");
    const Json images = {{"OTIO_SCHEMA", "ImageSequenceReference.1"},
                         {"target_url_base", "file:///media/shot"},
                         {"name_prefix", "s."},
                         {"name_suffix", ".png"},
                         {"start_frame", 98},
                         {"frame_step", 2},
                         {"rate", 24},
                         {"frame_zero_padding", 4},
                         {"missing_frame_policy", "hold"},
                         {"available_range", Range(98, 20)}};
    const MediaReference read = Read(Clip("A", Range(98, 10), images)).tracks.children[0].media;
    EXPECT_EQ(read.images.PathOf(0), "/media/shot/s.0098.png");
    EXPECT_EQ(read.images.PathOf(1), "/media/shot/s.0100.png");
    EXPECT_EQ(read.ticksPerImage, 2 * kFrame);
    EXPECT_EQ(read.images.frameCount, 10);
    EXPECT_EQ(read.images.missing, MissingFramePolicy::kHold);
}

TEST(Parameters, AnUnknownEffectTakesItsTypesFromTheFile) {
    const Json effect =
        Effect("lavfi:gblur=sigma={sigma}", {{"sigma", 3}, {"on", true}, {"7", {1, 2}}, {"tint", {0.5, 0.25, 1}}});
    const Host::Effect read = Read(Clip("A", 0, 10, Effects({effect}))).tracks.children[0].effects.at(0);
    EXPECT_EQ(read.filterGraph, "gblur=sigma={sigma}");
    ASSERT_EQ(read.parameters.size(), 4U);
    EXPECT_EQ(read.parameters[0].index, 7);
    EXPECT_EQ(read.parameters[0].type, ParameterType::kPoint);
    for (std::size_t i = 1; i < 4; ++i) EXPECT_EQ(read.parameters[i].index, 7 + static_cast<std::int32_t>(i));
    EXPECT_EQ(read.parameters[3].type, ParameterType::kColor);
    EXPECT_EQ(read.parameters[3].value[3], 1.0);
}

TEST(Parameters, TablesHaveNoGapsAndNoNameTwice) {
    for (const EffectTable& table : GetEffectTables()) {
        std::set<std::string> names;
        for (std::size_t i = 0; i < table.parameters.size(); ++i) {
            const Parameter& parameter = table.parameters[i];
            EXPECT_EQ(parameter.index, static_cast<std::int32_t>(i)) << table.matchName;
            EXPECT_TRUE(parameter.name.empty() || names.insert(parameter.name).second)
                << table.matchName << " " << parameter.name;
        }
    }
    // The indices that effects read last tell whether a long table has slipped.
    EXPECT_EQ(FindEffectTable("TQ.XQVE Luma Corrector")->Find("selection_invert")->index, 69);
    EXPECT_EQ(FindEffectTable("TQ.XQVE RGB Color Corrector")->Find("highlight_blue_gain")->index, 61);
    EXPECT_EQ(FindEffectTable("TQ.XQVE Three-Way Color Corrector")->Find("output_white")->index, 104);
    EXPECT_EQ(FindEffectTable("TQ.XQVE RGB Curves")->Find("blue_y15")->index, 132);
    EXPECT_EQ(FindEffectTable("TQ.XQVE Garbage Matte 8")->Find("3")->value[1], 0.5);
}

TEST(Parameters, KeyframesInterpolateByKind) {
    Parameter parameter;
    parameter.type = ParameterType::kDouble;
    for (const Interpolation kind : {Interpolation::kLinear, Interpolation::kHold, Interpolation::kBezier}) {
        Keyframe key;
        key.time = static_cast<std::int64_t>(parameter.keys.size()) * 100;
        key.value[0] = static_cast<double>(parameter.keys.size()) * 10;
        key.interpolation = kind;
        parameter.keys.push_back(key);
    }
    Keyframe last;
    last.time = 300;
    last.value[0] = 30;
    parameter.keys.push_back(last);
    EXPECT_EQ(parameter.At(-5)[0], 0);
    EXPECT_DOUBLE_EQ(parameter.At(25)[0], 2.5);
    EXPECT_EQ(parameter.At(199)[0], 10);
    EXPECT_NEAR(parameter.At(250)[0], 25, 1e-9);
    EXPECT_LT(parameter.At(210)[0], 21);
    EXPECT_EQ(parameter.At(1000)[0], 30);
    // Handles along the straight line make a straight line, in any proportion.
    parameter.keys[2].out[0] = {0.25, 2.5};
    parameter.keys[3].in[0] = {-0.5, -5};
    for (const std::int64_t t : {210, 233, 275}) EXPECT_NEAR(parameter.At(t)[0], static_cast<double>(t) / 10, 1e-9);
    parameter.type = ParameterType::kInt;
    EXPECT_EQ(parameter.At(99)[0], 0);
}

TEST(Parameters, RecordsHoldTheValueBehindATypeWord) {
    const auto record = [](ParameterType type, ParameterValue value) {
        VantrelParamRecord r{};
        WriteRecord(type, value, r);
        return r;
    };
    const VantrelParamRecord color = record(ParameterType::kColor, {1, 0.5, 0, 1});
    EXPECT_THAT(std::vector<int>(color.bytes, color.bytes + 12),
                ElementsAre(8, 0, 0, 0, 0, 0, 0x80, 0x7F, 0, 0xFF, 0, 0xFF));
    const VantrelParamRecord point = record(ParameterType::kPoint, {0.25, -3});
    double y = 0;
    std::memcpy(&y, point.bytes + 12, sizeof y);
    EXPECT_EQ(y, -3);
    EXPECT_EQ(record(ParameterType::kByte, {300}).bytes[4], 255);
    EXPECT_EQ(record(ParameterType::kBool, {1}).bytes[4], 1);
    std::int32_t whole = 0;
    std::memcpy(&whole, record(ParameterType::kInt, {-2.5}).bytes + 4, sizeof whole);
    EXPECT_EQ(whole, -2);
}

}  // namespace
}  // namespace Vantrel::Host::Test
