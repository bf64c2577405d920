// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cmath>
#include <memory>

#include "Kiln/Operations/Common.h"
#include "Kiln/Scratch.h"

namespace Kiln {
namespace {

using Vellum::PixelFormat;

enum class Weight : std::int32_t { kGaussian = 0, kSpline = 1 };

constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, PixelFormat, DeviceBuffer,
                 std::int32_t, std::int32_t, std::int32_t, std::int32_t, std::int32_t, Weight, float, float, bool, bool>
    kColumns{R"(..\..\Kiln\Modules\Blur)", "BlurColumnsKernel"};
constexpr Kernel<DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, DeviceBuffer, std::int32_t, std::int32_t,
                 std::int32_t, std::int32_t, float, float, bool>
    kRows{R"(..\..\Kiln\Modules\Blur)", "BlurRowsKernel"};
constexpr Kernel<DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, PixelFormat, DeviceBuffer, std::int32_t,
                 std::int32_t, std::int32_t, std::int32_t, bool, bool>
    kReduceRows{R"(..\..\Kiln\Modules\Blur)", "BlurReduceRowsKernel"};
constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, DeviceBuffer, std::int32_t,
                 std::int32_t, std::int32_t, std::int32_t, std::int32_t, std::int32_t, std::int32_t>
    kFinish{R"(..\..\Kiln\Modules\Blur)", "BlurFinishKernel"};

constexpr PixelFormat kWorkFormat = kPixelFormat_GPU_BGRA_4444_32f;

/// One pass along an axis: `size` outputs, of which number n has its middle at the input pixel n * step + first.
struct Pass {
    std::int32_t size;
    std::int32_t step;
    std::int32_t first;
    std::int32_t reach;
    Weight weight;
    float inverseWidth;
    float scale = 1.0F;  ///< makes the weights sum to 1
};

Pass MakeGaussian(std::int32_t size, std::int32_t first, float sigma) {
    constexpr float kReach = 3.5F;  // in standard deviations
    if (!(sigma > 0.0F)) return {size, 1, first, 0, Weight::kGaussian, 0.0F};
    const auto reach = static_cast<std::int32_t>(std::ceil(kReach * sigma));
    double sum = 1.0;
    for (std::int32_t k = 1; k <= reach; ++k) sum += 2.0 * std::exp(-0.5 * k * k / (double{sigma} * sigma));
    return {size, 1, first, reach, Weight::kGaussian, 1.0F / sigma, static_cast<float>(1.0 / sum)};
}

/// An axis of a blur. Up to a few pixels it is the Gaussian itself, else one on a coarser grid: a cubic B-spline leads
/// onto the grid, another one back, and the Gaussian between them is as much narrower as those two blur by themselves
/// (a spline's variance is a third of its squared step).
struct Axis {
    Axis(std::int32_t sourceSize, std::int32_t targetSize, float sigma, bool active) {
        constexpr float kSmallestCoarse = 4.0F;  // below it the Gaussian has few enough taps
        constexpr float kWidthOnGrid = 2.0F;     // at least, in steps
        constexpr float kLargest = 16384.0F;     // beyond it every picture is flat
        const std::int32_t pad = (targetSize - sourceSize) / 2;
        if (!active || sigma < kSmallestCoarse) {
            passes[0] = MakeGaussian(targetSize, -pad, active ? sigma : 0.0F);
            return;
        }
        const float width = std::min(sigma, kLargest);
        step = static_cast<std::int32_t>(width / kWidthOnGrid);
        first = -step;
        const std::int32_t points = (targetSize - 1 + step) / step + 3;
        const float steps = width / static_cast<float>(step);
        passes[1] = MakeGaussian(points, 0, std::sqrt(steps * steps - 2.0F / 3.0F));
        const std::int32_t margin = passes[1].reach;
        passes[1].first = margin;
        const auto unit = static_cast<float>(step);
        passes[0] = {points + 2 * margin, step,        first - margin * step - pad, 2 * step - 1,
                     Weight::kSpline,     1.0F / unit, 1.0F / (6.0F * unit)};
        passCount = 2;
    }

    std::int32_t passCount = 1;
    Pass passes[2]{};
    /// Grid point n lies at the target's pixel n * step + first.
    std::int32_t step = 1;
    std::int32_t first = 0;
};

/// Colour times alpha in 32 bits, in scratch memory.
struct WorkPicture {
    std::unique_ptr<DeviceScratchBuffer> memory;
    DeviceBuffer data = 0;
    std::int32_t pitch = 0;
    std::int32_t width = 0;
    std::int32_t height = 0;
    PixelFormat format;
    bool straight = false;
};

Status MakeWorkPicture(const DeviceRef& device, std::int32_t width, std::int32_t height, WorkPicture& picture) {
    const std::uint64_t pixels = static_cast<std::uint64_t>(width) * static_cast<std::uint64_t>(height);
    picture.memory = std::make_unique<DeviceScratchBuffer>(device, pixels * Vellum::BytesPerPixel(kWorkFormat));
    picture.data = picture.memory->GetHandle();
    picture.pitch = picture.width = width;
    picture.height = height;
    picture.format = kWorkFormat;
    return picture.data == 0 ? Ostrand::kStatus_OutOfMemory : Ostrand::kStatus_OK;
}

Status RunDown(const DeviceRef& device, const Pass& pass, bool clamped, WorkPicture& picture) {
    constexpr std::int32_t kRowsOfAThread = 8;  // BLUR_ROWS of the kernel
    WorkPicture result;
    const Status status = MakeWorkPicture(device, picture.width, pass.size, result);
    if (Ostrand::Failed(status)) return status;
    const std::int32_t threads = (pass.size + kRowsOfAThread - 1) / kRowsOfAThread;
    const Status launched =
        kColumns.Launch(device, ShapeFor(picture.width, threads), kWorkFormat, result.data, result.pitch, picture.width,
                        pass.size, picture.format, picture.data, picture.pitch, picture.height, pass.step, pass.first,
                        pass.reach, pass.weight, pass.inverseWidth, pass.scale, clamped, picture.straight);
    picture = std::move(result);
    return launched;
}

Status RunAcross(const DeviceRef& device, const Pass& pass, bool clamped, WorkPicture& picture) {
    WorkPicture result;
    const Status status = MakeWorkPicture(device, pass.size, picture.height, result);
    if (Ostrand::Failed(status)) return status;
    Status launched;
    if (pass.weight == Weight::kSpline) {
        constexpr std::int32_t kPointsOfAThread = 16;  // BLUR_POINTS of the kernel
        const std::int32_t threads = (pass.size + kPointsOfAThread - 1) / kPointsOfAThread;
        launched = kReduceRows.Launch(device, ShapeFor(picture.height, threads), result.data, result.pitch, pass.size,
                                      picture.height, picture.format, picture.data, picture.pitch, picture.width,
                                      pass.step, pass.first, clamped, picture.straight);
    } else {
        launched = kRows.Launch(device, ShapeFor(4 * pass.size, picture.height), result.data, result.pitch, pass.size,
                                picture.height, picture.data, picture.pitch, picture.width, pass.first, pass.reach,
                                pass.inverseWidth, pass.scale, clamped);
    }
    picture = std::move(result);
    return launched;
}

}  // namespace

Status GaussianBlur(const DeviceRef& device, DeviceBuffer source, std::int32_t sourceRowBytes, std::int32_t sourceWidth,
                    std::int32_t sourceHeight, DeviceBuffer target, std::int32_t targetRowBytes,
                    std::int32_t targetWidth, std::int32_t targetHeight, PixelFormat format, float sigmaX, float sigmaY,
                    bool keepSize, std::int32_t direction) {
    if (!device || source == 0 || target == 0 || !IsRenderFormat(format)) return Ostrand::kStatus_Failure;
    if (sourceWidth <= 0 || sourceHeight <= 0 || targetWidth <= 0 || targetHeight <= 0) return Ostrand::kStatus_Failure;
    const bool blursX = (direction & kBlur_Horizontal) != 0 && sigmaX > 0.0F;
    const bool blursY = (direction & kBlur_Vertical) != 0 && sigmaY > 0.0F;
    if ((blursX && !std::isfinite(sigmaX)) || (blursY && !std::isfinite(sigmaY))) return Ostrand::kStatus_Failure;
    const Axis x(sourceWidth, targetWidth, sigmaX, blursX), y(sourceHeight, targetHeight, sigmaY, blursY);

    WorkPicture picture;
    picture.data = source;
    picture.pitch = PitchOf(sourceRowBytes, format);
    picture.width = sourceWidth;
    picture.height = sourceHeight;
    picture.format = format;
    picture.straight = true;
    Status status = Ostrand::kStatus_OK;
    // The first pass onto a coarse grid takes straight pictures as they are.
    const bool downIsPlain = !blursY && sourceHeight == targetHeight && x.passCount == 2;
    for (std::int32_t i = 0; i < y.passCount && !downIsPlain && !Ostrand::Failed(status); ++i) {
        status = RunDown(device, y.passes[i], keepSize, picture);
    }
    const bool acrossIsPlain = !blursX && sourceWidth == targetWidth;
    for (std::int32_t i = 0; i < x.passCount && !acrossIsPlain && !Ostrand::Failed(status); ++i) {
        status = RunAcross(device, x.passes[i], keepSize, picture);
    }
    if (Ostrand::Failed(status)) return status;
    return kFinish.Launch(device, ShapeFor(targetWidth, targetHeight), format, target, PitchOf(targetRowBytes, format),
                          targetWidth, targetHeight, picture.data, picture.pitch, picture.width, picture.height, x.step,
                          x.first, y.step, y.first);
}

}  // namespace Kiln
