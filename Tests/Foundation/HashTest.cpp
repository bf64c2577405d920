// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <set>
#include <vector>

#include "Ostrand/MixHash.h"

using Halden::utility::Guid;
using Ostrand::HashValue;
using Ostrand::MixHash;
using Ostrand::NodeHasher;

TEST(NodeHashes, DifferByContentOrderSplitAndLength) {
    const std::uint32_t zero = 0;
    const std::vector<Guid> hashes = {
        NodeHasher().Finish(),
        NodeHasher().Bytes(nullptr, 0).Finish(),
        NodeHasher().Text("ab").Text("c").Finish(),
        NodeHasher().Text("a").Text("bc").Finish(),
        NodeHasher().Text("abc").Finish(),
        NodeHasher().Text("c").Text("ab").Finish(),
        NodeHasher().Text("abc").Text("").Finish(),
        NodeHasher().Value(zero).Finish(),
        NodeHasher().Value(zero).Value(zero).Finish(),
        NodeHasher().Value(std::uint64_t{0}).Finish(),
        NodeHasher().Identifier({}).Finish(),
    };
    EXPECT_EQ(std::set<Guid>(hashes.begin(), hashes.end()).size(), hashes.size());
    EXPECT_EQ(NodeHasher().Text("ab").Value(zero).Finish(), NodeHasher().Bytes("ab", 2).Bytes(&zero, 4).Finish());
    EXPECT_TRUE(hashes.front().IsNil()) << "without items the state is still zero";
}

// Every bit of the state and of the data reaches every word: a hash that drops part of the state collides here.
TEST(MixedData, DependsOnEveryBitOfStateAndData) {
    const HashValue start{1, 2, 3, 4};
    const std::vector<std::uint8_t> data(300, 0x5A);
    const auto mix = [](HashValue value, const std::vector<std::uint8_t>& bytes) {
        MixHash::MixInData(value, bytes.data(), bytes.size());
        return value;
    };
    const HashValue base = mix(start, data);
    const auto expectAllWordsChanged = [&base](const HashValue& value) {
        EXPECT_NE(value.w0, base.w0);
        EXPECT_NE(value.w1, base.w1);
        EXPECT_NE(value.w2, base.w2);
        EXPECT_NE(value.w3, base.w3);
    };
    for (int bit = 0; bit < 128; ++bit) {
        HashValue changed = start;
        std::uint32_t* words[] = {&changed.w0, &changed.w1, &changed.w2, &changed.w3};
        *words[bit / 32] ^= 1U << bit % 32;
        expectAllWordsChanged(mix(changed, data));
    }
    for (std::size_t i = 0; i < data.size(); ++i) {
        std::vector<std::uint8_t> changed = data;
        changed[i] ^= 1;
        expectAllWordsChanged(mix(start, changed));
    }
}
