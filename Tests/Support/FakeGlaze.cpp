// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Support/FakeGlaze.h"

#include <algorithm>
#include <atomic>
#include <memory>
#include <mutex>

namespace Vantrel::Testing {
namespace {

std::atomic<int> gLiveStorages{0};

struct Storage {
    explicit Storage(std::vector<std::uint8_t> content) : bytes(std::move(content)) { ++gLiveStorages; }
    ~Storage() { --gLiveStorages; }
    std::vector<std::uint8_t> bytes;
    std::atomic<int> count{1};
};

void Retain(void* storage) { ++static_cast<Storage*>(storage)->count; }

void Release(void* storage) {
    auto* counted = static_cast<Storage*>(storage);
    if (--counted->count == 0) std::unique_ptr<Storage>(counted).reset();
}

struct LiveGlazes {
    std::mutex mutex;
    std::vector<std::unique_ptr<Glaze>> glazes;
};

LiveGlazes& Live() {
    static LiveGlazes live;
    return live;
}

}  // namespace

Glaze* NewFakeGlaze(const FakePicture& picture) {
    const Vellum::PixelFormat format = Vellum::PixelFormatFromCode(picture.pixelFormat);
    const auto rowBytes = static_cast<std::int32_t>(Vellum::PixelFormatSize(format, picture.width, 1));
    std::vector<std::uint8_t> bytes = picture.bytes;
    if (bytes.empty()) {
        bytes.assign(static_cast<std::size_t>(rowBytes) * static_cast<std::size_t>(picture.height), 128);
        for (std::size_t alpha = 3; alpha < bytes.size(); alpha += 4) bytes[alpha] = 255;
    }
    auto storage = std::make_unique<Storage>(std::move(bytes));
    auto glaze = std::make_unique<Glaze>();
    *glaze = {sizeof(Glaze),
              picture.pixelFormat,
              picture.width,
              picture.height,
              picture.aspectNumerator,
              picture.aspectDenominator,
              picture.fieldType,
              picture.alphaType,
              0,
              0,
              rowBytes,
              0,
              storage->bytes.data(),
              storage.get(),
              Retain,
              Release};
    static_cast<void>(storage.release());  // counted from here on
    LiveGlazes& live = Live();
    const std::lock_guard<std::mutex> lock(live.mutex);
    live.glazes.push_back(std::move(glaze));
    return live.glazes.back().get();
}

bool DisposeFakeGlaze(Glaze* glaze) {
    LiveGlazes& live = Live();
    const std::lock_guard<std::mutex> lock(live.mutex);
    const auto found =
        std::find_if(live.glazes.begin(), live.glazes.end(),
                     [glaze](const std::unique_ptr<Glaze>& candidate) { return candidate.get() == glaze; });
    if (found == live.glazes.end()) return false;
    Release(glaze->storage);
    live.glazes.erase(found);
    return true;
}

int CountLiveGlazes() {
    LiveGlazes& live = Live();
    const std::lock_guard<std::mutex> lock(live.mutex);
    return static_cast<int>(live.glazes.size());
}

int CountLiveGlazeStorages() { return gLiveStorages; }

}  // namespace Vantrel::Testing
