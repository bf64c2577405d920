// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Media/HostPicture.h"

#include <sys/mman.h>

#include <atomic>
#include <cstdlib>
#include <new>

namespace Vantrel::Host {

namespace {

constexpr std::size_t kHugePage = std::size_t{2} << 20;
/// Enough for a read-ahead's pictures of two sizes.
constexpr std::size_t kKeptBlocks = 24;

void* AllocateBlock(std::size_t bytes) {
    if (bytes < kHugePage) {
        void* memory = std::aligned_alloc(64, (bytes + 63) / 64 * 64);
        if (!memory) throw std::bad_alloc();
        return memory;
    }
    const std::size_t rounded = (bytes + kHugePage - 1) / kHugePage * kHugePage;
    void* memory = std::aligned_alloc(kHugePage, rounded);
    if (!memory) throw std::bad_alloc();
    // Only a hint: without huge pages the block is merely slower to touch.
    (void)madvise(memory, rounded, MADV_HUGEPAGE);
    return memory;
}

struct SharedPicture {
    explicit SharedPicture(HostPictureRef held) : picture(std::move(held)) {}

    HostPictureRef picture;
    std::atomic<std::int32_t> count{1};
};

void RetainPicture(void* storage) { ++static_cast<SharedPicture*>(storage)->count; }

void ReleasePicture(void* storage) {
    auto* shared = static_cast<SharedPicture*>(storage);
    if (--shared->count == 0) delete shared;
}

}  // namespace

std::shared_ptr<PixelBufferPool> PixelBufferPool::Create() {
    return std::shared_ptr<PixelBufferPool>(new PixelBufferPool);
}

PixelBufferPool::~PixelBufferPool() {
    for (const Block& block : mFree) std::free(block.memory);
}

std::shared_ptr<std::byte> PixelBufferPool::Allocate(std::size_t bytes) {
    Block block{nullptr, bytes};
    {
        const std::lock_guard<std::mutex> hold(mMutex);
        for (auto it = mFree.begin(); it != mFree.end(); ++it) {
            if (it->bytes != bytes) continue;
            block = *it;
            mFree.erase(it);
            break;
        }
    }
    if (!block.memory) block.memory = AllocateBlock(bytes);
    return {static_cast<std::byte*>(block.memory),
            [pool = shared_from_this(), block](std::byte*) { pool->GiveBack(block); }};
}

void PixelBufferPool::GiveBack(Block block) {
    Block dropped{nullptr, 0};
    {
        const std::lock_guard<std::mutex> hold(mMutex);
        mFree.push_back(block);
        if (mFree.size() > kKeptBlocks) {
            dropped = mFree.front();
            mFree.erase(mFree.begin());
        }
    }
    std::free(dropped.memory);
}

std::shared_ptr<HostPicture> MakeHostPicture(PixelBufferPool& pool, Vellum::PixelFormat format, std::int32_t width,
                                             std::int32_t height) {
    auto picture = std::make_shared<HostPicture>();
    picture->format = format;
    picture->width = width;
    picture->height = height;
    const std::size_t row = static_cast<std::size_t>(width) * Vellum::BytesPerPixel(format);
    picture->rowBytes = static_cast<std::int32_t>((row + 63) / 64 * 64);
    picture->pixels = pool.Allocate(picture->GetBytes());
    return picture;
}

std::shared_ptr<HostPicture> ShareField(const HostPicture& picture, int field) {
    auto shared = std::make_shared<HostPicture>(picture);
    shared->pixels = std::shared_ptr<std::byte>(picture.pixels, picture.GetRow(field));
    shared->rowBytes = 2 * picture.rowBytes;
    shared->height = (picture.height + 1 - field) / 2;
    return shared;
}

Glaze* MakeGlaze(const HostPictureRef& picture) {
    auto storage = std::make_unique<SharedPicture>(picture);
    auto glaze = std::make_unique<Glaze>();
    glaze->size = sizeof(Glaze);
    glaze->pixelFormat = picture->format.GetCode();
    glaze->width = picture->width;
    glaze->height = picture->height;
    glaze->aspectNumerator = picture->aspect.numerator;
    glaze->aspectDenominator = picture->aspect.denominator;
    glaze->fieldType = picture->fieldType;
    glaze->alphaType = picture->alphaType;
    glaze->originX = picture->origin.x;
    glaze->originY = picture->origin.y;
    glaze->rowBytes = picture->rowBytes;
    glaze->pixels = picture->pixels.get();
    glaze->storage = storage.release();
    glaze->retainStorage = RetainPicture;
    glaze->releaseStorage = ReleasePicture;
    return glaze.release();
}

void DisposeGlaze(Glaze* glaze) {
    if (!glaze) return;
    const std::unique_ptr<Glaze> owned(glaze);
    glaze->releaseStorage(glaze->storage);
}

}  // namespace Vantrel::Host
