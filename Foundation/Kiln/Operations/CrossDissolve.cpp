// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Operations/Common.h"

namespace Kiln {
namespace {

using Vellum::PixelFormat;

constexpr const char* kModule = R"(..\..\Kiln\Modules\CrossDissolve)";

using DissolveKernel = Kernel<PixelFormat, DeviceBuffer, std::int32_t, DeviceBuffer, std::int32_t, DeviceBuffer,
                              std::int32_t, std::int32_t, std::int32_t, float>;
constexpr DissolveKernel kCrossDissolve{kModule, "CrossDissolveKernel"};
constexpr DissolveKernel kFilmDissolve{kModule, "FilmDissolveKernel"};

}  // namespace

Status CrossDissolve(const DeviceRef& device, DeviceBuffer first, std::int32_t firstRowBytes, DeviceBuffer second,
                     std::int32_t secondRowBytes, DeviceBuffer target, std::int32_t targetRowBytes,
                     PixelFormat targetFormat, std::int32_t targetWidth, std::int32_t targetHeight, float fraction,
                     bool film) {
    if (!device || first == 0 || second == 0 || target == 0 || !IsRenderFormat(targetFormat) || targetWidth < 1 ||
        targetHeight < 1) {
        return Ostrand::kStatus_Failure;
    }
    // The ends are one of the pictures, to the bit, and often lie where they should already.
    if (fraction == 0.0F || fraction == 1.0F) {
        const DeviceBuffer shown = fraction == 0.0F ? second : first;
        if (shown == target) return Ostrand::kStatus_OK;
        return DeviceCopyRect(device, shown, fraction == 0.0F ? secondRowBytes : firstRowBytes, target, targetRowBytes,
                              targetFormat, 0, 0, 0, 0, targetWidth, targetHeight);
    }
    const DissolveKernel& kernel = film ? kFilmDissolve : kCrossDissolve;
    return kernel.Launch(device, ShapeFor(targetWidth, targetHeight), targetFormat, target,
                         PitchOf(targetRowBytes, targetFormat), first, PitchOf(firstRowBytes, targetFormat), second,
                         PitchOf(secondRowBytes, targetFormat), targetWidth, targetHeight, fraction);
}

}  // namespace Kiln
