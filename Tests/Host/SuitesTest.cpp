// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cstring>
#include <thread>

#include "Host/Suites/DescriptionSuites.h"
#include "Host/Suites/HandleTables.h"
#include "Tests/Host/TimelineText.h"

namespace Vantrel::Host::Test {
namespace {

TEST(Suites, AreFoundByTextAndVersion) {
    const QuillBasicSuite& basic = *HostServices::Instance().GetBasicSuite();
    const void* suite = nullptr;
    EXPECT_NE(basic.AcquireSuite("Corvane Video Segment Suite", 4, &suite), 0);
    EXPECT_EQ(suite, nullptr);
    EXPECT_NE(basic.AcquireSuite("Corvane", 5, &suite), 0);
    EXPECT_EQ(basic.AcquireSuite("Corvane Video Segment Suite", 5, &suite), 0);
    EXPECT_EQ(basic.AcquireSuite("Opaque Effect Data Suite", 1, &suite), 0);
    EXPECT_EQ(basic.ReleaseSuite("Opaque Effect Data Suite", 1), 0);
    using Entry = VantrelHostStatus (*)();
    EXPECT_EQ(reinterpret_cast<Entry>(Segments().reserved14)(), kHostStatus_NotImplemented);
}

TEST(Suites, NodesOutliveTheListAndTheEditThatReplacedThem) {
    const Published first(Timeline({Track({Clip("a", 0, 10, Effects({Effect("TQ.XQVE Invert", {{"blend", 25}})}))})}));
    const RootHold hold;
    EXPECT_EQ(Segments().ReleaseVideoSegments(hold.list), 0);
    EXPECT_NE(Segments().ReleaseVideoSegments(hold.list), 0);
    const Published second(Timeline({Track({Clip("b", 0, 10)})}));
    std::int64_t offset = 1;
    std::uint32_t clip = 0;
    std::uint32_t effect = 0;
    ASSERT_EQ(Segments().AcquireInputNode(hold.root, 0, &offset, &clip), 0);
    ASSERT_EQ(Segments().AcquireOperatorNode(clip, 0, &effect), 0);
    VantrelParamRecord record;
    std::memset(record.bytes, 0xFF, sizeof record.bytes);
    EXPECT_EQ(Segments().GetParam(effect, 1, 0, &record), 0);
    float blend = 0;
    std::memcpy(&blend, record.bytes + 4, sizeof blend);
    EXPECT_EQ(blend, 25.0F);
    EXPECT_NE(Segments().GetParam(effect, 99, 0, &record), 0);
    for (const unsigned char byte : record.bytes) EXPECT_EQ(byte, 0);
    std::int64_t key = 0;
    std::int32_t number = 0;
    EXPECT_LT(Segments().GetNextKeyframeTime(effect, 1, 0, &key, &number), 0);
    char* text = nullptr;
    EXPECT_NE(Segments().GetProperty(clip, "ClipNode::TimeRemapping", &text), 0);
    EXPECT_EQ(text, nullptr);
    // Two acquisitions, one id, two releases.
    std::uint32_t again = 0;
    ASSERT_EQ(Segments().AcquireInputNode(hold.root, 0, &offset, &again), 0);
    EXPECT_EQ(again, clip);
    for (const std::uint32_t id : {clip, again, effect, hold.root}) EXPECT_EQ(Segments().ReleaseNode(id), 0);
    EXPECT_NE(Segments().ReleaseNode(clip), 0);
    EXPECT_EQ(HostServices::Instance().GetNodes().Count(), 0U);
}

TEST(Suites, UnknownIdsAndNoTimelineFail) {
    std::uint32_t list = 0;
    EXPECT_NE(Segments().AcquireVideoSegments(1, "", &list), 0);
    const Published described(Timeline({Track({Clip("a", 0, 10)})}));
    EXPECT_NE(Segments().AcquireVideoSegments(4711, "", &list), 0);
    std::int32_t count = 0;
    EXPECT_NE(Segments().GetSegmentCount(4711, &count), 0);
    EXPECT_NE(Segments().GetInputCount(0, &count), 0);
    const RootHold hold;
    std::int64_t offset = 0;
    std::uint32_t id = 0;
    for (const std::int32_t index : {-1, 1}) EXPECT_NE(Segments().AcquireInputNode(hold.root, index, &offset, &id), 0);
    EXPECT_NE(Segments().AcquireSegmentNode(hold.list, "00000000-0000-0000-0000-000000000001", &id), 0);
    EXPECT_EQ(Segments().ReleaseNode(hold.root), 0);
    EXPECT_EQ(Segments().ReleaseVideoSegments(hold.list), 0);
}

TEST(Suites, OpaqueDataStayAsLongAsTheyAreHeld) {
    const auto timeline = [](const char* data) {
        Json effect = Effect("TQ.XQVE SubspaceStabilizer");
        if (data != nullptr) effect["metadata"]["vantrel"]["opaque_data"] = data;
        return Timeline({Track({Clip("a", 0, 10, Effects({effect}))})});
    };
    const OpaqueEffectDataSuite& suite = Acquire<OpaqueEffectDataSuite>("Opaque Effect Data Suite", 1);
    const Published with(timeline("AQID"));
    const Node& effect = *with.Segments().at(0).root->inputs.at(0).node->operators.at(0);
    const auto instance = static_cast<std::int32_t>(effect.AsEffect()->instanceID);
    void* data = nullptr;
    ASSERT_EQ(suite.Acquire(instance, &data), 0);
    const Published without(timeline(nullptr));
    EXPECT_EQ(static_cast<const unsigned char*>(data)[2], 3);
    EXPECT_EQ(static_cast<const unsigned char*>(data)[3], 0) << "so that a text comes to an end";
    std::uint8_t disposed = 0;
    EXPECT_EQ(suite.Release(instance, &disposed), 0);
    EXPECT_EQ(disposed, 1);
    EXPECT_NE(suite.Acquire(instance, &data), 0);
}

TEST(Suites, AnswerManyThreadsWhileTimelinesAreReplaced) {
    const Published described(Timeline({Track({Clip("a", 0, 10), Dissolve(2, 2), Clip("b", 5, 10)})}));
    const Described other(Timeline({Track({Clip("a", 3, 10)})}));
    const auto& memory = Acquire<LarkspurMemoryManagerSuite>(kMemoryManagerSuiteName, kMemoryManagerSuiteVersion);
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t) {
        threads.emplace_back([&memory] {
            for (int i = 0; i < 300; ++i) {
                const RootHold hold;
                std::int64_t offset = 0;
                std::uint32_t input = 0;
                EXPECT_EQ(Segments().AcquireInputNode(hold.root, 0, &offset, &input), 0);
                EXPECT_EQ(Segments().TransformTime(input, 5, &offset), 0);
                char* text = nullptr;
                EXPECT_EQ(Segments().GetProperty(input, "ClipNode::ClipSpeed", &text), 0);
                memory.FreeText(text);
                EXPECT_EQ(Segments().ReleaseNode(input), 0);
                EXPECT_EQ(Segments().ReleaseNode(hold.root), 0);
                EXPECT_EQ(Segments().ReleaseVideoSegments(hold.list), 0);
            }
        });
    }
    for (int i = 0; i < 300; ++i) HostServices::Instance().Publish(i % 2 == 0 ? other.snapshot : described.snapshot);
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(HostServices::Instance().GetNodes().Count(), 0U);
    EXPECT_EQ(HostServices::Instance().GetSegmentLists().Count(), 0U);
    EXPECT_EQ(CountTexts(), 0);
}

}  // namespace
}  // namespace Vantrel::Host::Test
