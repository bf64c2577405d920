// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Kiln/FrameOperations.h"

/// Pictures that kernels sample. A texture is a descriptor in device memory, which a kernel takes as an 8-byte
/// argument.
namespace Kiln {

enum class TextureAddress : std::int32_t { kWrap = 0, kClamp = 1, kMirror = 2, kBorder = 3 };
enum class TextureFilter : std::int32_t { kPoint = 0, kLinear = 1 };

/// How a kernel samples, and what is bound to it. A plain record: kept in static tables, copied by nobody while bound.
struct Texture {
    TextureAddress address = TextureAddress::kClamp;
    TextureFilter filter = TextureFilter::kPoint;
    DeviceBuffer argument = 0;  ///< what the kernel is given; 0 while nothing is bound
};

/// A module's texture. The module and name are what a framework with textures of its own would look up; the format is
/// that of the pictures to be bound.
[[nodiscard]] Texture LoadTexture(const DeviceRef& device, const char* moduleKey, const char* name,
                                  TextureAddress address, TextureFilter filter, Vellum::PixelFormat format);

/// Binds a picture in place of what was bound. The picture must stay until the work that samples it has been queued; on
/// OpenCL it is copied. kStatus_OutOfMemory when refused, and nothing is bound then.
/// @param picture the same buffer as `buffer`: the texture begins with its first pixel.
[[nodiscard]] Ostrand::Status BindTexture(const DeviceRef& device, Texture& texture, DeviceBuffer buffer,
                                          DeviceBuffer picture, std::int32_t rowBytes, std::int32_t width,
                                          std::int32_t height, Vellum::PixelFormat format);

/// Gives back what the binding holds. Work already queued may still use it.
void UnbindTexture(const DeviceRef& device, Texture& texture);

/// A binding for a scope, in which the work that samples is queued.
class ScopedTextureBinding {
public:
    ScopedTextureBinding(const DeviceRef& device, Texture& texture) : mDevice(device), mTexture(texture) {}
    ~ScopedTextureBinding() { UnbindTexture(mDevice, mTexture); }
    ScopedTextureBinding(const ScopedTextureBinding&) = delete;
    ScopedTextureBinding& operator=(const ScopedTextureBinding&) = delete;

private:
    const DeviceRef& mDevice;
    Texture& mTexture;
};

}  // namespace Kiln
