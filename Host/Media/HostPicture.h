// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <vector>

#include "Tarn/Glaze.h"
#include "Vellum/Geometry.h"
#include "Vellum/PixelFormat.h"

namespace Vantrel::Host {

/// Memory for pictures. Blocks come back when their last holder goes and are used again: fresh memory of a picture's
/// size costs more in page faults than the picture's conversion. Thread safe; holders may outlive the pool's owner.
class PixelBufferPool : public std::enable_shared_from_this<PixelBufferPool> {
public:
    [[nodiscard]] static std::shared_ptr<PixelBufferPool> Create();
    ~PixelBufferPool();
    PixelBufferPool(const PixelBufferPool&) = delete;
    PixelBufferPool& operator=(const PixelBufferPool&) = delete;

    /// Undefined bytes, aligned to 64. Throws std::bad_alloc.
    [[nodiscard]] std::shared_ptr<std::byte> Allocate(std::size_t bytes);

private:
    PixelBufferPool() = default;
    struct Block {
        void* memory;
        std::size_t bytes;
    };
    void GiveBack(Block block);

    std::mutex mMutex;
    std::vector<Block> mFree;
};

/// A picture in host memory, rows from top to bottom. Immutable once it is shared.
struct HostPicture {
    Vellum::PixelFormat format = Vellum::kPixelFormat_BGRA_4444_8u;
    std::int32_t width = 0;
    std::int32_t height = 0;
    std::int32_t rowBytes = 0;
    Vellum::PixelAspectRatio aspect;
    std::uint32_t fieldType = Vellum::kFieldType_Progressive;
    std::uint32_t alphaType = Vellum::kAlphaType_Straight;
    Vellum::Point origin;
    std::shared_ptr<std::byte> pixels;

    [[nodiscard]] std::size_t GetBytes() const {
        return static_cast<std::size_t>(rowBytes) * static_cast<std::size_t>(height);
    }
    [[nodiscard]] std::byte* GetRow(std::int32_t y) const {
        return pixels.get() + static_cast<std::ptrdiff_t>(rowBytes) * y;
    }
};
using HostPictureRef = std::shared_ptr<const HostPicture>;

/// The lines of one field as a picture of half the height that shares the pixels: 0 has the even lines, 1 the odd ones.
[[nodiscard]] std::shared_ptr<HostPicture> ShareField(const HostPicture& picture, int field);

/// A picture with undefined pixels. Throws std::bad_alloc.
[[nodiscard]] std::shared_ptr<HostPicture> MakeHostPicture(PixelBufferPool& pool, Vellum::PixelFormat format,
                                                           std::int32_t width, std::int32_t height);

/// The picture as the record that goes to the engine, sharing its pixels. The engine disposes of it with DisposeGlaze.
[[nodiscard]] Glaze* MakeGlaze(const HostPictureRef& picture);
void DisposeGlaze(Glaze* glaze);

}  // namespace Vantrel::Host
