// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "Ostrand/QueryTable.h"

using namespace Ostrand;

namespace {

class IFirst : public OstrandUnknown {
public:
    static constexpr Guid kInterfaceID{1, 0, 0, {}};
    virtual int First() = 0;
};

class ISecond : public OstrandUnknown {
public:
    static constexpr Guid kInterfaceID{2, 0, 0, {}};
    virtual int Second() = 0;
};

constexpr Guid kAliasID{3, 0, 0, {}};
constexpr Guid kUnknownID{4, 0, 0, {}};

/// An abstract class that answers for itself, as the bases of nodes do.
class FirstBase : public IFirst {
public:
    explicit FirstBase(int first) : mFirst(first) {}
    int First() override { return mFirst; }
    Status QueryInterface(const Guid& iid, void** out) override {
        return QueryTable(this, iid, out).Answer<IFirst>().Result();
    }

private:
    int mFirst;
};

class Both final : public Counted<Both, FirstBase, ISecond> {
public:
    explicit Both(int first) : Counted(first) {}
    int Second() override { return 2; }
    Status QueryInterface(const Guid& iid, void** out) override {
        return QueryTable(this, iid, out).Answer<ISecond>().Answer<ISecond>(kAliasID).Otherwise<FirstBase>();
    }
};

}  // namespace

TEST(CountedObjects, AnswerForEachInterfaceWithItsOwnPointer) {
    const std::int64_t blocks = Allocator::GetLiveBlocks();
    {
        InterfaceRef<IFirst> first = MakeRef<Both>(17);
        EXPECT_EQ(Allocator::GetLiveBlocks(), blocks + 1);
        InterfaceRef<ISecond> second = Query<ISecond>(first);
        ASSERT_TRUE(second);
        EXPECT_NE(static_cast<void*>(second.Get()), static_cast<void*>(first.Get()));
        EXPECT_EQ(second->Second(), 2);
        EXPECT_EQ(Demand<IFirst>(second)->First(), 17);

        void* out = nullptr;
        EXPECT_EQ(first->QueryInterface(kAliasID, &out), kStatus_OK);
        EXPECT_EQ(InterfaceRef<ISecond>::Attach(static_cast<ISecond*>(out)), second);
        EXPECT_EQ(first->QueryInterface(kUnknownID, &out), kStatus_NoInterface);
        EXPECT_EQ(out, nullptr);

        first.Reset();
        EXPECT_EQ(Allocator::GetLiveBlocks(), blocks + 1) << "the second interface still holds the object";
    }
    EXPECT_EQ(Allocator::GetLiveBlocks(), blocks);
}

TEST(NullReferences, RaiseWhenUsed) {
    const InterfaceRef<IFirst> none;
    EXPECT_THROW((void)none->First(), NullInterfaceException);
    EXPECT_THROW((void)*none, NullInterfaceException);
    EXPECT_FALSE(Query<ISecond>(none));
    EXPECT_THROW((void)Demand<ISecond>(none), NullInterfaceException);
}
