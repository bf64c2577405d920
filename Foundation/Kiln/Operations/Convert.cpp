// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/FrameCopies.h"
#include "Kiln/Operations/Common.h"
#include "Vellum/Field.h"

namespace Kiln {
namespace {

using Vellum::PixelFormat;
namespace Bits = Vellum::PixelFormatBits;

constexpr const char* kModule = R"(..\..\Kiln\Modules\Convert)";

/// As Modules/Convert.kernel has them.
enum class Alpha : std::int32_t { kStraight = 0, kPremultiplied = 1, kOpaque = 2 };

constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, DeviceBuffer, std::int32_t, bool,
                 Alpha>
    kConvertBytes{kModule, "ConvertBytesKernel"};
constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, DeviceBuffer, std::int32_t, float,
                 float, float, float, Alpha>
    kConvertVideoLevels{kModule, "ConvertVideoLevelsKernel"};
constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, PixelFormat, DeviceBuffer,
                 std::int32_t, Alpha>
    kConvertFloats{kModule, "ConvertFloatsKernel"};

/// What a step of 8-bit chroma adds to red, green and blue.
struct ChromaSteps {
    float redV;
    float greenU;
    float greenV;
    float blueU;
};

/// From the shares of red and blue in luma (ITU-R BT.601 and BT.709); chroma spans 224 steps.
constexpr ChromaSteps StepsOf(double kr, double kb) {
    const double red = 2.0 * (1.0 - kr) / 224.0;
    const double blue = 2.0 * (1.0 - kb) / 224.0;
    const double kg = 1.0 - kr - kb;
    return {static_cast<float>(red), static_cast<float>(-blue * kb / kg), static_cast<float>(-red * kr / kg),
            static_cast<float>(blue)};
}
constexpr ChromaSteps kSteps601 = StepsOf(0.299, 0.114);
constexpr ChromaSteps kSteps709 = StepsOf(0.2126, 0.0722);

Alpha AlphaOf(std::uint32_t upper, std::uint32_t alphaType) {
    if ((upper & Bits::kAlpha) == 0 || alphaType == Vellum::kAlphaType_None) return Alpha::kOpaque;
    const bool premultiplied = (upper & Bits::kPremultiplied) != 0 || alphaType == Vellum::kAlphaType_Premultiplied;
    return premultiplied ? Alpha::kPremultiplied : Alpha::kStraight;
}

}  // namespace

Status ConvertFrame(const VideoFrameRef& source, const VideoFrameRef& target) {
    const DeviceFrameView from = ViewDeviceFrame(source);
    const DeviceFrameView to = ViewDeviceFrame(target);
    if (!from.device || from.device != to.device || !IsRenderFormat(to.format)) return Ostrand::kStatus_Failure;
    if (from.width != to.width || from.height != to.height) return Ostrand::kStatus_Failure;
    const std::uint32_t upper = from.format.GetUpper();
    const std::uint32_t layout = upper & Bits::kLayoutMask;
    const std::uint32_t colors = upper & Bits::kClassMask;
    const Alpha alpha = AlphaOf(upper, source->GetAlphaType());
    const LaunchShape shape = ShapeFor(to.width, to.height);
    const std::int32_t pitch = PitchOf(to.rowBytes, to.format);
    if (layout == Bits::kLayoutFloat && colors == Bits::kClassRGB) {
        return kConvertFloats.Launch(to.device, shape, to.format, to.data, pitch, to.width, to.height, from.format,
                                     from.data, PitchOf(from.rowBytes, from.format), alpha);
    }
    if (layout != Bits::kLayout8 || from.rowBytes % 4 != 0) return Ostrand::kStatus_Failure;
    if (colors == Bits::kClassRGB) {
        const bool alphaFirst = (upper & Bits::kOrderMask) == Bits::kOrderARGB;
        return kConvertBytes.Launch(to.device, shape, to.format, to.data, pitch, to.width, to.height, from.data,
                                    from.rowBytes / 4, alphaFirst, alpha);
    }
    if (colors != Bits::kClassYUV) return Ostrand::kStatus_Failure;
    const ChromaSteps& steps = (upper & Bits::kBT709) != 0 ? kSteps709 : kSteps601;
    return kConvertVideoLevels.Launch(to.device, shape, to.format, to.data, pitch, to.width, to.height, from.data,
                                      from.rowBytes / 4, steps.redV, steps.greenU, steps.greenV, steps.blueU, alpha);
}

}  // namespace Kiln
