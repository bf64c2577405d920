// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Textures.h"

#include "Kiln/Device/TextureDescriptor.h"
#include "Kiln/Operations/Common.h"

namespace Kiln {
namespace {

static_assert(static_cast<int>(TextureAddress::kClamp) == TEXTURE_ADDRESS_CLAMP &&
              static_cast<int>(TextureAddress::kBorder) == TEXTURE_ADDRESS_BORDER &&
              static_cast<int>(TextureFilter::kLinear) == TEXTURE_FILTER_LINEAR);

}  // namespace

Texture LoadTexture(const DeviceRef& /*device*/, const char* /*moduleKey*/, const char* /*name*/,
                    TextureAddress address, TextureFilter filter, Vellum::PixelFormat /*format*/) {
    return {address, filter, 0};
}

Status BindTexture(const DeviceRef& device, Texture& texture, DeviceBuffer buffer, DeviceBuffer picture,
                   std::int32_t rowBytes, std::int32_t width, std::int32_t height, Vellum::PixelFormat format) {
    UnbindTexture(device, texture);
    if (!IsRenderFormat(format) || buffer != picture || width < 1 || height < 1) return Ostrand::kStatus_Failure;
    // A CUDA kernel follows an address; an OpenCL one can't, so there the texels lie behind the descriptor.
    const bool copies = device->GetFramework() == DeviceFramework::kOpenCL;
    const auto row = static_cast<std::uint64_t>(rowBytes);
    const auto rows = static_cast<std::uint64_t>(height);
    const DeviceBuffer block =
        device->GetDeviceMemory()->Allocate(TEXTURE_TEXELS_OFFSET + (copies ? row * rows : std::uint64_t{0}));
    if (block == 0) return Ostrand::kStatus_OutOfMemory;
    texture.argument = block;

    TextureDescriptor descriptor{};
    descriptor.texels = copies ? 0 : buffer;
    descriptor.width = width;
    descriptor.height = height;
    descriptor.pitch = PitchOf(rowBytes, format);
    descriptor.format = format == kPixelFormat_GPU_BGRA_4444_32f ? 1 : 0;
    descriptor.addressMode = static_cast<int>(texture.address);
    descriptor.filterMode = static_cast<int>(texture.filter);
    Status status = device->GetCommands()->CopyHostToDevice(&descriptor, block, sizeof descriptor, nullptr);
    if (!Ostrand::Failed(status) && copies) {
        const std::uint64_t widthBytes = Vellum::BytesPerPixel(format) * static_cast<std::uint64_t>(width);
        status = device->GetBackend().CopyRows(block, {TEXTURE_TEXELS_OFFSET, row}, buffer, {0, row}, widthBytes, rows);
    }
    if (Ostrand::Failed(status)) UnbindTexture(device, texture);
    return status;
}

void UnbindTexture(const DeviceRef& device, Texture& texture) {
    if (texture.argument != 0) device->GetDeviceMemory()->Free(texture.argument);
    texture.argument = 0;
}

}  // namespace Kiln
