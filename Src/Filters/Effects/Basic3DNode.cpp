// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/Basic3DNode.h"

#include <algorithm>
#include <array>
#include <cmath>

#include "Kiln/Frames.h"
#include "Kiln/Scratch.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Filters/Effects/ParameterReader.h"
#include "Src/Kernels/TextureTable.h"
#include "Vantrel/Effects/Basic3D.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = R"(..\..\Src\Filters\Effects\Basic3DNode)";
EffectKernel gPrepareSource{kModuleKey, "cuda_kernel_prepsource", {}};
EffectKernel gRenderQuad{kModuleKey, "cuda_kernel_renderquad", {}};
TextureTable gTexture;

void PrepareSourceKernel(DeviceValue /*in*/, DeviceValue /*scratch*/, std::int32_t /*width*/, std::int32_t /*height*/,
                         std::int32_t /*inPitch*/, std::int32_t /*scratchPitch*/, Vellum::PixelFormat /*format*/) {}
void RenderQuadKernel(DeviceValue /*out*/, std::int32_t /*width*/, std::int32_t /*height*/, float /*sourceWidth*/,
                      float /*sourceHeight*/, std::int32_t /*sourcePitch*/, std::int32_t /*outPitch*/,
                      Vellum::PixelFormat /*format*/, Kiln::float4 /*corner*/, Kiln::float4 /*across*/,
                      Kiln::float4 /*down*/, Kiln::float4 /*eye*/, float2 /*s0*/, float2 /*s1*/, float2 /*s2*/,
                      float2 /*s3*/, float2 /*e0*/, float2 /*e1*/, float2 /*e2*/, float2 /*e3*/,
                      std::int32_t /*specular*/, DeviceValue /*texture*/) {}

using Kiln::float4;

struct Angle {
    float sine, cosine;

    explicit Angle(float degrees) {
        constexpr float kPi = 3.1415927F;
        constexpr double kHalfTurn = 180.0;
        const double radians = static_cast<double>(degrees * kPi) / kHalfTurn;
        sine = static_cast<float>(std::sin(radians));
        cosine = static_cast<float>(std::cos(radians));
    }
};

float4 Difference(const float4& a, const float4& b) { return {a.x - b.x, a.y - b.y, a.z - b.z, 0.0F}; }

/// The unit vector from `a` to `b`; nothing where they are one.
float2 Direction(const float2& a, const float2& b) {
    constexpr float kLeastLength = 1e-37F;
    const float x = b.x - a.x, y = b.y - a.y;
    const float length = std::max(std::sqrt(x * x + y * y), kLeastLength);
    return {x / length, y / length};
}

float2 Opposite(const float2& v) { return {-v.x, -v.y}; }

/// The frame that reaches as far from the middle, no larger than `largest`. A corner beside the eye is seen at no
/// place.
std::int32_t Enclose(std::int32_t size, float reach, std::int32_t largest) {
    if (!(reach < static_cast<float>(largest))) return std::isnan(reach) ? size : largest;
    return std::max(size, 2 * static_cast<std::int32_t>(reach));
}

/// The plane as the kernel takes it. Corners go round from the upper left one of the picture.
struct PlaneGeometry {
    std::int32_t width = 0, height = 0;  ///< of the new frame
    float4 eye{};
    std::array<float4, 4> corners{};
    std::array<float2, 4> seen{};   ///< the corners on the screen, clockwise there
    std::array<float2, 4> edges{};  ///< unit vectors from each to the next

    PlaneGeometry(const KernelFrame& source, std::int32_t outWidth, std::int32_t outHeight, const Angle& swivel,
                  const Angle& tilt, float distance) {
        const auto sourceWidth = static_cast<float>(source.Width()), sourceHeight = static_cast<float>(source.Height());
        const auto eyeDistance = static_cast<float>(std::max(source.Width(), source.Height()));
        const float halfX = sourceWidth / 2.0F, halfY = sourceHeight / 2.0F;
        const float2 flat[] = {{-halfX, -halfY}, {halfX, -halfY}, {halfX, halfY}, {-halfX, halfY}};
        for (std::size_t i = 0; i < corners.size(); ++i) {
            const float y = flat[i].y * tilt.cosine, z = flat[i].y * tilt.sine;
            corners[i] = {flat[i].x * swivel.cosine + z * swivel.sine, y,
                          z * swivel.cosine - flat[i].x * swivel.sine + distance * eyeDistance, 0.0F};
        }
        Project(outWidth, outHeight, eyeDistance);
        if (edges[0].x * edges[1].y - edges[0].y * edges[1].x < 0.0F) Reverse();
    }

private:
    void Project(std::int32_t outWidth, std::int32_t outHeight, float eyeDistance) {
        width = outWidth;
        height = outHeight;
        std::array<float, 4> divisors{};
        for (std::size_t i = 0; i < corners.size(); ++i) {
            divisors[i] = corners[i].z / eyeDistance + 1.0F;
            width = Enclose(width, std::abs(corners[i].x / divisors[i]), kBasic3D_LargestFrame);
            height = Enclose(height, std::abs(corners[i].y / divisors[i]), kBasic3D_LargestFrame);
        }
        width = std::min(width, kBasic3D_LargestFrame);
        height = std::min(height, kBasic3D_LargestFrame);
        const float middleX = static_cast<float>(width) / 2.0F, middleY = static_cast<float>(height) / 2.0F;
        eye = {middleX, middleY, -eyeDistance, 0.0F};
        for (std::size_t i = 0; i < corners.size(); ++i) {
            corners[i].x += middleX;
            corners[i].y += middleY;
            seen[i] = {(corners[i].x - middleX) / divisors[i] + middleX,
                       (corners[i].y - middleY) / divisors[i] + middleY};
        }
        for (std::size_t i = 0; i < edges.size(); ++i) edges[i] = Direction(seen[i], seen[(i + 1) % seen.size()]);
    }

    void Reverse() {
        std::reverse(seen.begin(), seen.end());
        edges = {Opposite(edges[2]), Opposite(edges[1]), Opposite(edges[0]), Opposite(edges[3])};
    }
};

Status DrawPlane(const Kiln::DeviceRef& device, const KernelFrame& in, const KernelFrame& out,
                 const PlaneGeometry& plane, bool specular) {
    const Kiln::DeviceScratchBuffer scratch(
        device, static_cast<std::uint64_t>(in.Height()) * static_cast<std::uint64_t>(in.RowBytes()));
    const DeviceValue buffer = scratch.GetHandle();
    if (buffer == 0) return Ostrand::kStatus_OutOfMemory;
    const std::uint64_t prepare = gPrepareSource.Find(device);
    if (prepare == 0) return Ostrand::kStatus_Failure;
    Status status = Launch2D(device, prepare, in.Grid(), {}, PrepareSourceKernel, in.Data(), buffer, in.Width(),
                             in.Height(), in.Pitch(), in.Pitch(), in.Format());
    if (Ostrand::Failed(status)) return status;

    Kiln::Texture& texture = GetTexture(gTexture, device, kModuleKey, "inTexture", Kiln::TextureAddress::kClamp,
                                        Kiln::TextureFilter::kLinear, in.Format());
    const Kiln::ScopedTextureBinding binding(device, texture);
    status = Kiln::BindTexture(device, texture, buffer, buffer, in.RowBytes(), in.Width(), in.Height(), in.Format());
    if (Ostrand::Failed(status)) return status;
    const std::uint64_t render = gRenderQuad.Find(device);
    if (render == 0) return Ostrand::kStatus_Failure;
    constexpr BlockSize kBlock{8, 8};
    const auto& [p0, p1, p2, p3] = plane.corners;
    const auto& [s0, s1, s2, s3] = plane.seen;
    const auto& [e0, e1, e2, e3] = plane.edges;
    return Launch2D(device, render, GridFor(out.Width(), out.Height(), kBlock.x, kBlock.y), kBlock, RenderQuadKernel,
                    out.Data(), out.Width(), out.Height(), static_cast<float>(in.Width()),
                    static_cast<float>(in.Height()), in.Pitch(), out.Pitch(), in.Format(), p0, Difference(p1, p0),
                    Difference(p3, p0), plane.eye, s0, s1, s2, s3, e0, e1, e2, e3, specular ? 1 : 0, texture.argument);
}

}  // namespace

Status Basic3DNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                           const RenderResultsRef& /*results*/) {
    const ParameterReader read(*mDescription, kBasic3DEffect, GetNodeTime(params.clipTime, false));
    const float swivel = read.Number(kBasic3D_Swivel), tilt = read.Number(kBasic3D_Tilt);
    const float distance = read.Number(kBasic3D_Distance);
    const bool specular = read.Flag(kBasic3D_SpecularHighlight);
    if (swivel == 0.0F && tilt == 0.0F && distance == 0.0F) return Ostrand::kStatus_OK;

    const VideoFrameRef input = mFrameSlot;
    const KernelFrame in(input);
    const std::int32_t outWidth = params.outputRect.Width(), outHeight = params.outputRect.Height();
    const PlaneGeometry plane(in, outWidth, outHeight, Angle(swivel), Angle(tilt), distance);
    const Vellum::Point origin{(plane.width - outWidth) / 2, (plane.height - outHeight) / 2};
    if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(mFrameSlot, mDevice, in.Format(), plane.width, plane.height,
                                                  input->GetPixelAspectRatio(), Vellum::kFieldType_Progressive,
                                                  origin))) {
        mFrameSlot = input;
        return Ostrand::kStatus_OutOfMemory;
    }
    const Status status = DrawPlane(mDevice, in, KernelFrame(mFrameSlot), plane, specular);
    // Another try starts from the same place.
    if (Ostrand::Failed(status)) mFrameSlot = input;
    return status;
}

}  // namespace Vantrel
