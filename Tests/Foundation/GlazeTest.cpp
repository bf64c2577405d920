// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tarn/Glaze.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <functional>

namespace {

/// A host's picture storage that counts.
struct Storage {
    int count = 1;
    std::uint8_t pixels[6][40] = {};

    static void Retain(void* storage) { ++static_cast<Storage*>(storage)->count; }
    static void Release(void* storage) { --static_cast<Storage*>(storage)->count; }
};

Glaze MakeGlaze(Storage& storage) {
    Glaze glaze{};
    glaze.size = sizeof(Glaze);
    glaze.pixelFormat = Vellum::FourCC("bgrp");
    glaze.width = 8;
    glaze.height = 6;
    glaze.aspectNumerator = 4;
    glaze.aspectDenominator = 3;
    glaze.fieldType = Vellum::kFieldType_LowerFirst;
    glaze.alphaType = Vellum::kAlphaType_Premultiplied;
    glaze.originX = -3;
    glaze.originY = 5;
    glaze.rowBytes = sizeof storage.pixels[0];
    glaze.pixels = storage.pixels;
    glaze.storage = &storage;
    glaze.retainStorage = &Storage::Retain;
    glaze.releaseStorage = &Storage::Release;
    return glaze;
}

}  // namespace

TEST(GlazeFrames, CarryTheRecordsAttributesAndReachItsPixels) {
    Storage storage;
    const Marl::VideoFrameRef frame = [&storage] {
        const Glaze glaze = MakeGlaze(storage);  // gone when the frame is used
        return Tarn::GetVideoFrameFromGlaze(&glaze);
    }();
    ASSERT_TRUE(frame);
    EXPECT_EQ(frame->GetBounds(), (Vellum::Rect{0, 0, 8, 6}));
    EXPECT_EQ(frame->GetOrigin(), (Vellum::Point{-3, 5}));
    EXPECT_EQ(frame->GetPixelFormat(), Vellum::kPixelFormat_BGRP_4444_8u);
    EXPECT_EQ(frame->GetPixelAspectRatio(), (Vellum::PixelAspectRatio{4, 3}));
    EXPECT_EQ(frame->GetFieldType(), Vellum::kFieldType_LowerFirst);
    EXPECT_EQ(frame->GetAlphaType(), Vellum::kAlphaType_Premultiplied);
    EXPECT_EQ(Ostrand::Demand<Marl::IFrameData>(frame)->GetData(), reinterpret_cast<std::uintptr_t>(storage.pixels));
    EXPECT_EQ(Ostrand::Demand<Marl::IFrameRows>(frame)->GetRowBytes(), 40);
    EXPECT_EQ(Ostrand::Query<Marl::IVideoFrame>(Ostrand::Query<Marl::IFrameRows>(frame)), frame);
    EXPECT_FALSE(Ostrand::Query<Marl::IFrameIdentity>(frame)) << "only device frames carry a fingerprint";

    frame->SetOrigin({1, 2});
    frame->SetFieldType(Vellum::kFieldType_Progressive);
    EXPECT_EQ(frame->GetOrigin(), (Vellum::Point{1, 2}));
    EXPECT_EQ(frame->GetFieldType(), Vellum::kFieldType_Progressive);
}

TEST(GlazeFrames, HoldTheStorageUntilTheLastInterfaceGoes) {
    Storage storage;
    const Glaze glaze = MakeGlaze(storage);
    Marl::VideoFrameRef frame = Tarn::GetVideoFrameFromGlaze(&glaze);
    EXPECT_EQ(storage.count, 2);
    auto data = Ostrand::Query<Marl::IFrameData>(frame);
    frame.Reset();
    EXPECT_EQ(storage.count, 2);
    data.Reset();
    EXPECT_EQ(storage.count, 1);
}

TEST(GlazeFrames, AreRefusedForUnsoundRecordsWithoutTouchingTheStorage) {
    EXPECT_FALSE(Tarn::GetVideoFrameFromGlaze(nullptr));
    const std::pair<const char*, std::function<void(Glaze&)>> faults[] = {
        {"size", [](Glaze& glaze) { glaze.size -= 4; }},
        {"pixel format", [](Glaze& glaze) { glaze.pixelFormat = Vellum::FourCC("BGRA"); }},
        {"no pixel format", [](Glaze& glaze) { glaze.pixelFormat = 0; }},
        {"width", [](Glaze& glaze) { glaze.width = 0; }},
        {"height", [](Glaze& glaze) { glaze.height = -6; }},
        {"overlapping rows", [](Glaze& glaze) { glaze.rowBytes = 31; }},
        {"rows upwards", [](Glaze& glaze) { glaze.rowBytes = -40; }},
        {"rows shorter than a wide picture", [](Glaze& glaze) { glaze.width = 0x40000001; }},
        {"pixels", [](Glaze& glaze) { glaze.pixels = nullptr; }},
        {"storage", [](Glaze& glaze) { glaze.storage = nullptr; }},
        {"retain", [](Glaze& glaze) { glaze.retainStorage = nullptr; }},
        {"release", [](Glaze& glaze) { glaze.releaseStorage = nullptr; }},
    };
    for (const auto& [name, spoil] : faults) {
        Storage storage;
        Glaze glaze = MakeGlaze(storage);
        spoil(glaze);
        EXPECT_FALSE(Tarn::GetVideoFrameFromGlaze(&glaze)) << name;
        EXPECT_EQ(storage.count, 1) << name;
    }
    Storage storage;
    Glaze tight = MakeGlaze(storage);
    tight.rowBytes = 32;
    EXPECT_TRUE(Tarn::GetVideoFrameFromGlaze(&tight));
}
