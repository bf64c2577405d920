// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// The inspection of a sequence, as people and programs get it: text, JSON, a page in a browser.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <tuple>

#include "Tests/Command/CommandFixture.h"

namespace Vantrel::Host::Test {
namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

const Json kSmall = Own({{"sequence", {{"width", 320}, {"height", 180}, {"rate", 24}}}});

Json Pattern(const std::string& name, double frames, std::vector<Json> effects = {}) {
    return Clip(name, Range(0, frames), GeneratorOf("testsrc2"), Effects(std::move(effects)));
}
Json Offline(double frames) { return Clip("holiday", Range(0, frames), File("missing.mov", 0, 100)); }

class Inspect : public Command {
protected:
    /// Device, partly host, host, a gap, and the device again: 24 frames each, the last two 12.
    std::string WriteMixed() {
        return Write("mixed.otio", Timeline({Track({Pattern("clean", 24, {Effect("TQ.XQVE Invert")}),
                                                    Pattern("magic", 24, {Effect("Sparkle"), Effect("TQ.XQVE Invert")}),
                                                    Offline(24), Gap(12), Pattern("end", 12)})},
                                            kSmall));
    }
    std::vector<Json> Stretches(const std::vector<Json>& items, const std::string& arguments = "") {
        const std::string file = Write("case.otio", Timeline({Track(items)}, kSmall));
        return Json::parse(Run("inspect --json " + file + " " + arguments).out)["stretches"];
    }
};

TEST_F(Inspect, JsonTellsEveryStretchAndItsReasonAsTheSchemaSays) {
    const Outcome outcome = Run("inspect --json " + WriteMixed());
    EXPECT_EQ(outcome.status, 2);
    EXPECT_THAT(outcome.err, HasSubstr("missing.mov"));
    const Json json = Json::parse(outcome.out);
    const char* const renderings[] = {"device", "partly host", "host", "gap", "device"};
    const char* const reasons[] = {"", "no device version of the effect 'Sparkle'", "media offline: holiday", "", ""};
    ASSERT_EQ(json["stretches"].size(), 5U);
    for (std::size_t i = 0; i < 5; ++i) {
        const Json& stretch = json["stretches"][i];
        EXPECT_EQ(stretch["rendering"], renderings[i]);
        EXPECT_EQ(stretch["reasons"].empty(), reasons[i][0] == '\0') << stretch;
        EXPECT_THAT(stretch["reasons"].dump(), HasSubstr(reasons[i]));
    }
    EXPECT_EQ(json["stretches"][2]["end"]["timecode"], "00:00:03:00");
    EXPECT_EQ(json["stretches"][0]["counters"]["effects"], 1);
    EXPECT_EQ(json["frames"], Json({{"all", 96}, {"device", 36}, {"partlyHost", 24}, {"host", 24}, {"gap", 12}}));

    const std::string check = "/usr/bin/python3 -m jsonschema " VANTREL_SCHEMA " -i ";
    EXPECT_EQ(std::system((check + Write("good.json", outcome.out)).c_str()), 0);
    Json wrong = json;
    wrong["stretches"][1]["rendering"] = "magic";
    EXPECT_NE(std::system((check + Write("wrong.json", wrong.dump()) + " >/dev/null 2>&1").c_str()), 0);
}

TEST_F(Inspect, FindsTheReasonWhereverItLies) {
    const Json dissolve = {{"OTIO_SCHEMA", "Transition.1"},
                           {"transition_type", "Custom_Transition"},
                           {"metadata", {{"vantrel", {{"match_name", "Curtain"}}}}},
                           {"in_offset", Time(4)},
                           {"out_offset", Time(4)}};
    const Json inner = Stack({Track({Pattern("plain", 12), Pattern("magic", 12, {Effect("Sparkle")})})});
    const auto nested = [&](const Json& more) {
        Json item = inner;
        item["name"] = "Scene";
        item.update(more);
        return item;
    };
    struct Case {
        std::vector<Json> items;
        std::size_t stretch;
        std::string topic;
        std::string text;
        std::string arguments;
    };
    const Case cases[] = {
        {{Pattern("a", 12), dissolve, Pattern("b", 12)}, 1, "transition", "'Curtain'", ""},
        {{nested(Json::object())}, 1, "effect", "'Sparkle'", ""},
        {{nested(Effects({Warp(2)}))}, 0, "speed", "speed isn't 1.0", ""},
        {{nested(Effects({Warp(-1)}))}, 0, "speed", "backwards", ""},
        {{Pattern("a", 12)}, 0, "limit", "frame larger than the device's memory allows", "--device-memory 1"},
        {{Pattern("a", 12, {Effect("lavfi:hue=s=0")})}, 0, "effect", "lavfi:hue=s=0", ""},
    };
    for (const Case& one : cases) {
        const std::vector<Json> stretches = Stretches(one.items, one.arguments);
        ASSERT_GT(stretches.size(), one.stretch) << one.text;
        const Json& stretch = stretches[one.stretch];
        EXPECT_NE(stretch["rendering"], "gap");
        ASSERT_FALSE(stretch["reasons"].empty()) << one.text;
        EXPECT_EQ(stretch["reasons"][0]["topic"], one.topic) << stretch["reasons"];
        EXPECT_THAT(stretch["reasons"][0]["text"], HasSubstr(one.text));
    }
}

TEST_F(Inspect, TextShowsABarAndColoursOnlyATerminal) {
    const std::string line = "inspect " + WriteMixed();
    const Outcome piped = Run(line);
    const std::string bar = std::string(20, 'D') + std::string(20, 'p') + std::string(20, 'h') + std::string(10, '.') +
                            std::string(10, 'D') + "\n";
    EXPECT_THAT(piped.out, AllOf(HasSubstr(bar), HasSubstr("|00:00:00:00"), HasSubstr("effect 'Sparkle'"),
                                 HasSubstr("  1     24      24  00:00:01:00  00:00:02:00  partly host  no"),
                                 HasSubstr("media offline: holiday"), Not(HasSubstr("\033["))));
    const auto onTerminal = [&](const std::string& settings) {
        return OutputOf("script -qec \"" + settings + " " VANTREL_COMMAND " " + line +
                        " 2>/dev/null\" /dev/null </dev/null");
    };
    EXPECT_THAT(onTerminal(""), HasSubstr("\033["));
    EXPECT_THAT(onTerminal("NO_COLOR=1"), AllOf(HasSubstr("DDDD"), Not(HasSubstr("\033["))));
}

/// Clicks and presses in the page, and leaves of it what it showed each time.
constexpr const char* kVisit = R"(<script>addEventListener('load', async () => {
    const detail = () => document.getElementById('detail').textContent;
    const told = [detail()];
    const box = document.getElementById('stretch-1').getBoundingClientRect();
    document.elementFromPoint(box.x + box.width / 2, box.y + box.height / 2)
        .dispatchEvent(new MouseEvent('click', {bubbles: true}));
    const image = document.querySelector('#detail img');
    await image.decode();
    told.push(detail(), [...document.querySelectorAll('.tree g')].map((g) => [g.dataset.name, g.classList[0]]),
              document.querySelector('.tree g').getBoundingClientRect().width, image.naturalWidth);
    document.getElementById('stretch-1').focus();
    document.activeElement.dispatchEvent(new KeyboardEvent('keydown', {key: 'ArrowRight', bubbles: true}));
    told.push(detail(), document.activeElement.id,
              performance.getEntriesByType('resource').filter((e) => !e.name.startsWith('data:')));
    document.body.textContent = '@@' + JSON.stringify(told).replace(/[<>&]/g, ' ') + '@@';
})</script>)";

TEST_F(Inspect, PageShowsTheTreeAndReasonOfTheStretchThatIsClicked) {
    const std::string page = Path("page.html");
    ASSERT_EQ(Run("inspect " + WriteMixed() + " --html " + page).status, 2);
    std::ofstream(page, std::ios::app) << kVisit;
    const std::string dom = OutputOf(VANTREL_BROWSER
                                     " --headless --no-sandbox --disable-gpu --virtual-time-budget=10000 --dump-dom"
                                     " --window-size=1440,1000 --user-data-dir=" +
                                     Path("profile") + " 'file://" + page + "#0' 2>/dev/null");
    const std::size_t from = dom.find("@@"), to = dom.rfind("@@");
    ASSERT_LT(from, to) << dom;
    const Json told = Json::parse(dom.substr(from + 2, to - from - 2));
    EXPECT_THAT(told[0].get<std::string>(), AllOf(HasSubstr("Whole frame"), Not(HasSubstr("Sparkle"))));
    EXPECT_THAT(told[1].get<std::string>(), HasSubstr("no device version of the effect 'Sparkle'"));
    EXPECT_EQ(told[2], Json::parse(R"([["magic", "host"], ["Sparkle", "host"], ["Invert", "device"],
                                       ["Layers", "device"]])"));
    EXPECT_GT(told[3], 50);
    EXPECT_EQ(told[4], 288);
    EXPECT_THAT(told[5].get<std::string>(), HasSubstr("media offline: holiday"));
    EXPECT_EQ(told[6], "stretch-2");
    EXPECT_EQ(told[7], Json::array()) << "it loads nothing from elsewhere";
}

}  // namespace
}  // namespace Vantrel::Host::Test
