// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "Host/Snapshot/Fingerprint.h"
#include "Tests/Host/TimelineText.h"

/// What becomes of each construct that a timeline may hold.
namespace Vantrel::Host::Test {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;

const Node& LayerOf(const Described& described, std::size_t layer = 0) {
    return *described.Segments().at(0).root->inputs.at(layer).node;
}
const Node& MediaOf(const Described& described) { return *LayerOf(described).inputs.at(0).node; }

std::string Property(const Node& node, const std::string& key) {
    const std::string* value = node.FindProperty(key.c_str());
    return value != nullptr ? *value : "(fails)";
}

Described OneClip(Json media, Json more = Json::object()) {
    return Described(Timeline({Track({Clip("it", Range(0, 10), std::move(media), std::move(more))})}));
}

TEST(Constructs, GeneratorsFallThroughToTheirKeys) {
    struct Case {
        Json media;
        const char* instance;
        const char* opaque;
    };
    const Case cases[] = {{GeneratorOf("black"), "1112293707", "(fails)"},
                          {GeneratorOf("color", {{"color", {255, 128, 0}}}), "1129270354", "/4AAAAAAAAA="},
                          {GeneratorOf("transparent"), "1414680150", "(fails)"},
                          {GeneratorOf("SMPTEBars"), "1111577171", "(fails)"}};
    for (const Case& c : cases) {
        const Described described = OneClip(c.media);
        const Node& media = MediaOf(described);
        EXPECT_EQ(Property(media, "MediaNode::MediaInstanceString"), c.instance);
        EXPECT_EQ(Property(media, "MediaNode::StreamOpaqueData"), c.opaque);
        EXPECT_EQ(Property(media, "MediaNode::ClipID"), "(fails)");
        EXPECT_EQ(Property(media, "MediaNode::MediaIsOffline"), "0");
        EXPECT_EQ(media.flags, kNodeFlag_Still);
    }
    const Described forced = OneClip(GeneratorOf("black"), Own({{"force_host", true}}));
    EXPECT_EQ(LayerOf(forced).kind, NodeKind::kSolidColor);
    EXPECT_TRUE(LayerOf(forced).inputs.empty());
    const Described title = OneClip(GeneratorOf("title", {{"text", "x"}}));
    EXPECT_NE(Property(MediaOf(title), "MediaNode::ClipID"), "(fails)");
    EXPECT_EQ(MediaOf(title).flags, kNodeFlag_Still);
    const Described source = OneClip(GeneratorOf("testsrc2", {{"size", "64x64"}}));
    EXPECT_EQ(std::get<FilterSource>(MediaOf(source).AsMedia()->clip->source).filter, "testsrc2=size=64x64");
    EXPECT_EQ(Property(MediaOf(OneClip(GeneratorOf("nothing"))), "MediaNode::MediaIsOffline"), "1");
}

TEST(Constructs, MissingMediaAreOfflineUnlessFoundElsewhere) {
    const Described lost = OneClip(File("missing.mov"));
    EXPECT_EQ(Property(MediaOf(lost), "MediaNode::MediaIsOffline"), "1");
    EXPECT_EQ(Property(MediaOf(lost), "MediaNode::ClipID"), "(fails)");
    EXPECT_THAT(lost.snapshot->offline, ElementsAre(HasSubstr("/media/missing.mov: no such file")));

    const std::filesystem::path root = std::filesystem::path(testing::TempDir()) / "vantrel-roots";
    std::filesystem::create_directories(root);
    std::ofstream(root / "it.mkv").put('x');
    FakeProbe probe;
    probe.infos[(root / "it.mkv").string()] = FakeProbe::Usual();
    probe.infos[(root / "missing.mov").string()] = FakeProbe::Usual();
    IdentityBook identities;
    SnapshotOptions options;
    options.mediaRoots = {root.string()};
    const auto instanceOf = [&](Json media) {
        const Document document = Read(Clip("it", Range(0, 10), std::move(media)));
        const SnapshotPtr snapshot = BuildSnapshot(document, options, probe, identities);
        const NodePtr clip = snapshot->top->plain.segments.at(0).root->inputs.at(0).node;
        return Property(*clip->inputs.at(0).node, "MediaNode::MediaInstanceString");
    };
    EXPECT_EQ(instanceOf(File("missing.mov")), (root / "missing.mov").string());
    EXPECT_EQ(instanceOf({{"OTIO_SCHEMA", "MissingReference.1"}}), (root / "it.mkv").string());
}

TEST(Constructs, MediaTellTheirStream) {
    Described described(Timeline({}));
    MediaInfo info = FakeProbe::Usual();
    info.alphaType = AlphaType::kPremultiplied;
    info.alphaMatteColor = 0x102030;
    info.startTimecode = 86400 * kFrame;
    info.ticksPerFrame = 10160640000;
    described.probe.infos["/media/x.mov"] = info;
    Json media = File("x.mov");
    media.erase("available_range");
    const Document document = Read(Timeline({Track({Clip("x", Range(86410, 5), media)})}));
    const SnapshotPtr snapshot = BuildSnapshot(document, {}, described.probe, HostServices::Instance().GetIdentities());
    const Node& clip = *snapshot->top->plain.segments.at(0).root->inputs.at(0).node;
    const Node& node = *clip.inputs.at(0).node;
    // What the samples' media don't have.
    const std::pair<const char*, std::string> expected[] = {{"StreamAlphaType", "2"},
                                                            {"StreamAlphaMatteColor", "1056816"},
                                                            {"StreamFrameVidSubType", "1635148593"},
                                                            {"StartTimecodeOffset", std::to_string(86400 * kFrame)},
                                                            {"InPointMediaTimeAsTicks", std::to_string(10 * kFrame)},
                                                            {"SelectedMulticamTrack", "(fails)"}};
    for (const auto& [key, value] : expected) EXPECT_EQ(Property(node, std::string("MediaNode::") + key), value) << key;
    EXPECT_TRUE(node.AsMedia()->samplesTime);
    EXPECT_EQ(snapshot->nativeSubType, info.codecTag);
    EXPECT_EQ(snapshot->top->format.width, 1280);
}

TEST(Constructs, OperatorsStandInTheOrderOfTheTreeAndStillsKeepThem) {
    const Json fade = {{"keyframes", {{{"t", Time(0)}, {"value", 0}}, {{"t", Time(5)}, {"value", 100}}}}};
    const Described described = OneClip(
        GeneratorOf("black"), Effects({Effect("TQ.XQVE Motion", {{"rotation", 45}}), Effect("TQ.XQVE Invert"),
                                       Effect("TQ.XQVE Opacity", {{"opacity", fade}}), Effect("TQ.XQVE Tint")}));
    std::vector<std::string> names;
    std::vector<std::uint32_t> flags;
    for (const NodePtr& effect : LayerOf(described).operators) {
        names.push_back(Property(*effect, "EffectNode::FilterMatchName"));
        flags.push_back(effect->flags);
    }
    EXPECT_THAT(names, ElementsAre("TQ.XQVE Invert", "TQ.XQVE Tint", "TQ.XQVE Opacity", "TQ.XQVE Motion"));
    // A fade ends what stands still, for what comes after it too.
    EXPECT_THAT(flags, ElementsAre(8U, 8U, 0U, 0U));
    EXPECT_TRUE(LayerOf(OneClip(GeneratorOf("black"), Effects({Effect("TQ.XQVE Motion"), Effect("TQ.XQVE Opacity")})))
                    .operators.empty());
}

TEST(Constructs, ADisabledItemIsLeftOutOrKeptBesideAnotherLayer) {
    Json off = Clip("off", 0, 10, Own({{"disabled", "node"}}));
    off["enabled"] = false;
    EXPECT_TRUE(Described(Timeline({Track({off})})).Segments().empty());
    const Described kept(Timeline({Track({Clip("on", 0, 10)}), Track({off})}));
    ASSERT_EQ(kept.Segments().at(0).root->inputs.size(), 2U);
    EXPECT_EQ(LayerOf(kept, 1).kind, NodeKind::kDisabled);
    EXPECT_EQ(LayerOf(kept, 1).inputs.at(0).offset, 0);
    off.erase("metadata");
    EXPECT_EQ(Described(Timeline({Track({Clip("on", 0, 10)}), Track({off})})).Segments().at(0).root->inputs.size(), 1U);
    // In a transition it counts as blank.
    const Described joined(Timeline({Track({Clip("on", 0, 10), Dissolve(2, 2), off})}));
    const Node& transition = *joined.Segments().at(1).root->inputs.at(0).node;
    EXPECT_EQ(transition.kind, NodeKind::kTransition);
    EXPECT_FALSE(transition.inputs.at(1).node);
}

TEST(Constructs, AnAdjustmentLayerTakesThePlaceOfWhatLiesBelow) {
    const Json adjustment = Clip("adj", Range(0, 4), GeneratorOf("adjustment"), Effects({Effect("TQ.XQVE Invert")}));
    const Described described(
        Timeline({Track({Clip("a", 0, 10)}), Track({Gap(2), adjustment}), Track({Gap(3), Clip("top", 0, 10)})}));
    const Node& root = *described.Segments().at(2).root;
    ASSERT_EQ(root.inputs.size(), 2U);
    const Node& node = *root.inputs[0].node;
    EXPECT_EQ(root.inputs[0].offset, -kFrame);
    EXPECT_EQ(node.kind, NodeKind::kAdjustment);
    ASSERT_EQ(node.inputs.size(), 2U);
    const Node& below = *node.inputs[0].node;
    EXPECT_EQ(below.kind, NodeKind::kCompositor);
    EXPECT_EQ(below.inputs.at(0).offset, -2 * kFrame);
    EXPECT_EQ(node.inputs[1].node->kind, NodeKind::kClip);
    EXPECT_EQ(node.inputs[1].node->inputs.at(0).node.get(), &below);
    ASSERT_EQ(node.inputs[1].node->operators.size(), 3U)
        << "motion and opacity are its own, never those of a clip below";
    EXPECT_EQ(node.inputs[1].node->operators[2]->AsEffect()->matchName, "TQ.XQVE Motion");
    EXPECT_EQ(Property(node, "AdjustmentNode::AdjustmentMediaIsOpaque"), "1");
    EXPECT_TRUE(Described(Timeline({Track({adjustment})})).Segments().empty());
}

TEST(Constructs, MulticamSourcesShowAnAngleOrAllOfThem) {
    const auto source = [](Json multicam) {
        return Timeline({Track({Stack({Track({Clip("a", 0, 20)}), Track({Clip("b", 0, 20)})},
                                      Own({{"multicam", std::move(multicam)}}))})});
    };
    const Described program(source({{"selected", 1}}));
    const Node& media = MediaOf(program);
    EXPECT_EQ(Property(media, "MediaNode::SelectedMulticamTrack"), "1");
    EXPECT_EQ(media.inputs.size(), 2U);
    const auto id =
        static_cast<std::uint32_t>(std::stoul(Property(media, "MediaNode::SelectedMulticamTrackTimelineID")));
    EXPECT_EQ(program.snapshot->Find(id)->path, "/tracks/children/0/children/0/children/1#angle");

    const Described absent(source({{"selected", 2}}));
    EXPECT_EQ(Property(MediaOf(absent), "MediaNode::SelectedMulticamTrackTimelineID"), "(fails)");
    EXPECT_THAT(absent.snapshot->warnings, ElementsAre(HasSubstr("angle 2 is selected, but there are 2")));

    const Described grid(source({{"selected", 1}, {"view", "grid"}}));
    const Node& root = *grid.Segments().at(0).root;
    EXPECT_EQ(root.kind, NodeKind::kMulticam);
    EXPECT_EQ(root.inputs.size(), 2U);
    EXPECT_EQ(Property(root, "MulticamNode::SelectedTrack"), "1");
}

TEST(Constructs, ATrackMatteKnowsItsLayer) {
    const Json matted = Clip("fill", 0, 10, Effects({Effect("TQ.XQVE Legacy Key Track Matte", {{"matte_track", 1}})}));
    const auto fillOf = [&](double in) {
        return Described(Timeline({Track({Clip("matte", in, 10)}), Track({Gap(4), matted})})).Segments().at(1).root;
    };
    const NodePtr root = fillOf(0);
    const EffectDetail& effect = *root->inputs.at(1).node->operators.at(0)->AsEffect();
    EXPECT_EQ(effect.matte.node, root->inputs.at(0).node);
    EXPECT_EQ(effect.matte.offset, -4 * kFrame);
    // The picture of the clip depends on what the matte shows.
    VantrelRenderDescription description{};
    EXPECT_NE(OperatorsFingerprint(*root->inputs.at(1).node, 1, 0, description),
              OperatorsFingerprint(*fillOf(1)->inputs.at(1).node, 1, 0, description));
}

TEST(Constructs, AMatteHasItsOwnMatteButNotThatOfATrackAbove) {
    const auto matted = [](double track) {
        return Track(
            {Clip("clip", 0, 10, Effects({Effect("TQ.XQVE Legacy Key Track Matte", {{"matte_track", track}})}))});
    };
    const auto matteOf = [](const NodePtr& clip) { return clip->operators.at(0)->AsEffect()->matte.node; };
    const NodePtr chain = Described(Timeline({Track({Clip("c", 0, 10)}), matted(1), matted(2)})).Segments().at(0).root;
    EXPECT_NE(matteOf(matteOf(chain->inputs.at(2).node)), nullptr);
    const NodePtr ring = Described(Timeline({matted(2), matted(1), matted(3)})).Segments().at(0).root;
    ASSERT_NE(matteOf(ring->inputs.at(0).node), nullptr);
    EXPECT_EQ(matteOf(matteOf(ring->inputs.at(0).node)), nullptr);
    EXPECT_EQ(matteOf(ring->inputs.at(2).node), nullptr) << "its own";
}

TEST(Constructs, HashesChangeWithContentOnly) {
    const auto hashOf = [](Json clip, double lead = 0) {
        std::vector<Json> children{std::move(clip)};
        if (lead > 0) children.insert(children.begin(), Gap(lead));
        return Described(Timeline({Track(std::move(children))})).Segments().at(0).root->hash;
    };
    const Guid base = hashOf(Clip("a", 5, 10));
    EXPECT_EQ(base, hashOf(Clip("a", 5, 10, {{"markers", Json::array()}, {"metadata", {{"other", 1}}}}), 7));
    std::set<Guid> hashes{base};
    const std::vector<Json> others = {Clip("a", 6, 10),
                                      Clip("a", 5, 11),
                                      Clip("b", 5, 10),
                                      Clip("a", 5, 10, Effects({Warp(2)})),
                                      Clip("a", 5, 10, Effects({Freeze()})),
                                      Clip("a", 5, 10, Effects({Effect("TQ.XQVE Invert")})),
                                      Clip("a", 5, 10, Effects({Effect("TQ.XQVE Invert", {{"blend", 3}})})),
                                      Clip("a", 5, 10, Own({{"scale_to_frame", "fill"}}))};
    for (const Json& other : others) EXPECT_TRUE(hashes.insert(hashOf(other)).second) << other.dump();
}

TEST(Fingerprints, AreEqualExactlyWhenThePicturesAre) {
    const VantrelRenderDescription description{};
    const auto printOf = [&](const Described& described, std::int64_t frame) {
        const Segment& segment = described.Segments().at(0);
        return NodeFingerprint(*segment.root, frame * kFrame - segment.start + segment.offset, description);
    };
    const Described clip(Timeline({Track({Clip("a", 5, 10)})}));
    const Described slipped(Timeline({Track({Clip("a", 7, 10)})}));
    EXPECT_EQ(printOf(clip, 4), printOf(slipped, 2));
    EXPECT_NE(printOf(clip, 4), printOf(clip, 5));
    const Described nested(Timeline({Track({Stack({Track({Clip("a", 5, 10)})})})}));
    EXPECT_NE(printOf(nested, 4), printOf(nested, 5));
    const Described frozen(Timeline({Track({Clip("a", 9, 10, Effects({Freeze()}))})}));
    EXPECT_EQ(printOf(frozen, 0), printOf(frozen, 8));
    EXPECT_EQ(printOf(frozen, 3), printOf(clip, 4));
    // Noise moves although nothing else does.
    const Described noise(Timeline({Track({Clip("a", 9, 10, Effects({Freeze(), Effect("TQ.XQVE Noise")}))})}));
    EXPECT_NE(printOf(noise, 0), printOf(noise, 8));
    // The same numbers in different properties of a transition.
    const auto push = [](const char* property) {
        Json transition = Dissolve(4, 4);
        transition["metadata"] = {{"vantrel", {{"match_name", "XQVE Push"}, {"properties", {{property, 2}}}}}};
        return Timeline({Track({transition, Clip("a", 5, 10)})});
    };
    EXPECT_NE(printOf(Described(push("border_width")), 1), printOf(Described(push("direction")), 1));
    VantrelRenderDescription larger{};
    larger.width = 100;
    EXPECT_NE(NodeFingerprint(*clip.Segments()[0].root, 0, description),
              NodeFingerprint(*clip.Segments()[0].root, 0, larger));
    // A clip is asked for by the time that its own question was answered with.
    const Node& node = LayerOf(slipped);
    EXPECT_EQ(NodeFingerprint(node, node.TransformTime(2 * kFrame), description),
              OperatorsFingerprint(node, 0, 2 * kFrame, description));
}

}  // namespace
}  // namespace Vantrel::Host::Test
