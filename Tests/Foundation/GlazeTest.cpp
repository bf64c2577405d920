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
    glaze.rowBytes = sizeof storage.pixels[0];
    glaze.pixels = storage.pixels;
    glaze.storage = &storage;
    glaze.retainStorage = &Storage::Retain;
    glaze.releaseStorage = &Storage::Release;
    return glaze;
}

}  // namespace

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
