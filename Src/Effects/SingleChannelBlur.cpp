// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Effects/SingleChannelBlur.h"

#include <array>
#include <cmath>

#include "Kiln/Scratch.h"
#include "Src/Kernels/KernelTable.h"

namespace Vantrel {
namespace {

using Kiln::DeviceScratchBuffer;

constexpr std::int32_t kFloatBytes = 4;

/// A kernel and where it is looked up.
struct BlurKernel {
    const char* moduleKey;
    const char* name;
    KernelTable table;
};

constexpr const char* kRecursionKey = R"(..\..\Src\Effects\SingleChannelBlur)";
constexpr const char* kColumnsKey = "SingleChannelBlur";
BlurKernel gVertical{kRecursionKey, "VerticalRecursiveGaussianGRAYF32_kernel", {}};
BlurKernel gHorizontal{kRecursionKey, "HorizontalRecursiveGaussianGrayF32_kernel", {}};
BlurKernel gFirstHalf[] = {{kColumnsKey, "amdzuk_gb1c_half1_0bc1", {}}, {kColumnsKey, "amdzuk_gb1c_half1_0bc2", {}}};
BlurKernel gSecondHalf[] = {{kColumnsKey, "amdzuk_gb1c_half2_0bc1", {}}, {kColumnsKey, "amdzuk_gb1c_half2_0bc2", {}}};
BlurKernel gTranspose{kColumnsKey, "amdzuk_gb1c_transpose", {}};
BlurKernel gTranspose4{kColumnsKey, "amdzuk_gb1c_transpose4x4", {}};

void Recursion(DeviceValue /*out*/, DeviceValue /*in*/, std::int32_t /*width*/, std::int32_t /*height*/,
               std::int32_t /*pitch*/, float /*a0*/, float /*a1*/, float /*b1*/, float /*b2*/, float /*a2*/,
               float /*a3*/, float /*c1*/, float /*c2*/) {}
void FirstHalf(DeviceValue /*in*/, DeviceValue /*work*/, std::int32_t /*p0*/, std::int32_t /*p1*/,
               std::int32_t /*cols*/, std::int32_t /*rows*/, std::int32_t /*half*/, std::int32_t /*half*/,
               std::int32_t /*off0*/, std::int32_t /*off2*/, float /*a0*/, float /*a1*/, float /*b1*/, float /*b2*/,
               float /*a2*/, float /*a3*/, float /*c1*/, float /*c2*/) {}
void SecondHalf(DeviceValue /*in*/, DeviceValue /*work*/, DeviceValue /*out*/, std::int32_t /*p0*/, std::int32_t /*p1*/,
                std::int32_t /*p2*/, std::int32_t /*cols*/, std::int32_t /*rows*/, std::int32_t /*half*/,
                std::int32_t /*half*/, std::int32_t /*off0*/, std::int32_t /*off2*/, float /*a0*/, float /*a1*/,
                float /*b1*/, float /*b2*/, float /*a2*/, float /*a3*/, float /*c1*/, float /*c2*/) {}
void Turn(DeviceValue /*in*/, DeviceValue /*out*/, std::int32_t /*inPitch*/, std::int32_t /*outPitch*/,
          std::int32_t /*width*/, std::int32_t /*height*/) {}

/// a0, a1 and a2, a3 weigh the inputs, b1, b2 the outputs, which both directions weigh alike.
struct Coefficients {
    float a0, a1, b1, b2, a2, a3;
};

/// The recursion's weights, worked out in `Number` from single-precision constants.
template <class Number>
Coefficients MakeCoefficients(float sigma) {
    using std::cos;
    using std::exp;
    using std::sin;
    const Number w = Number{0.8448F} / sigma;
    const Number c = cos(w), n = sin(w);
    const Number e1 = exp(Number{-1.26F} / sigma), e2 = exp(Number{-2.52F} / sigma);
    const Number d = 1 - 2 * c * e1 + e2;
    const Number k = 2 * (Number{0.9629F} * (1 - c * e1) / d + Number{1.942F} * n * e1 / d) - Number{0.9629F};
    const Number a0 = Number{0.9629F} / k, g = Number{1.942F} / k;
    const Number a1 = (g * n - a0 * c) * e1;
    const Number a2 = a1 + 2 * c * e1 * a0;
    return {static_cast<float>(a0),  static_cast<float>(a1), static_cast<float>(2 * c * e1),
            static_cast<float>(-e2), static_cast<float>(a2), static_cast<float>(-e2 * a0)};
}

template <class... Parameters>
Status Launch(const Kiln::DeviceRef& device, BlurKernel& kernel, GridSize grid, BlockSize block,
              void (&signature)(Parameters...), typename KernelParameter<Parameters>::Type... values) {
    const std::uint64_t handle = GetKernel(kernel.table, device, kernel.moduleKey, kernel.name);
    if (handle == 0) return Ostrand::kStatus_Failure;
    return Launch2D(device, handle, grid, block, signature, values...);
}

Status BlurOnCuda(const Kiln::DeviceRef& device, DeviceValue buffer, std::int32_t rowBytes, std::int32_t width,
                  std::int32_t height, float sigmaX, float sigmaY) {
    constexpr std::int32_t kThreads = 32;
    const DeviceScratchBuffer scratch(device,
                                      static_cast<std::uint64_t>(rowBytes) * static_cast<std::uint64_t>(height));
    if (scratch.GetHandle() == 0) return Ostrand::kStatus_OutOfMemory;
    const std::int32_t pitch = rowBytes / kFloatBytes;
    const Coefficients x = MakeCoefficients<float>(sigmaX), y = MakeCoefficients<float>(sigmaY);
    const Status status =
        Launch(device, gVertical, GridFor(width, 1, kThreads, 1), {kThreads, 1}, Recursion, scratch.GetHandle(), buffer,
               width, height, pitch, y.a0, y.a1, y.b1, y.b2, y.a2, y.a3, y.b1, y.b2);
    if (Ostrand::Failed(status)) return status;
    return Launch(device, gHorizontal, GridFor(1, height, 1, kThreads), {kThreads, 8}, Recursion, buffer,
                  scratch.GetHandle(), width, height, pitch, x.a0, x.a1, x.b1, x.b2, x.a2, x.a3, x.b1, x.b2);
}

/// Device memory as rows.
struct Plane {
    DeviceValue data;
    std::int32_t rowBytes;
};

/// Blurs each column of `in` into `out`. On an even number of columns a thread takes two at a time.
Status ColumnPass(const Kiln::DeviceRef& device, Plane in, Plane work, Plane out, std::int32_t cols, std::int32_t rows,
                  const Coefficients& k) {
    const GridSize grid{((cols + 63) >> 6) * 2, 1};
    const BlockSize block{64, 1};
    const std::int32_t together = cols % 2 == 0 ? 2 : 1;
    const auto which = static_cast<std::size_t>(together - 1);
    const std::int32_t half = (rows + 1) >> 1;
    const std::int32_t pitch0 = in.rowBytes / kFloatBytes, pitch2 = out.rowBytes / kFloatBytes;
    const std::int32_t p0 = pitch0 / together, p1 = work.rowBytes / kFloatBytes / together, p2 = pitch2 / together;
    const std::int32_t off0 = (rows - 1) * pitch0 / together, off2 = (rows - 1) * pitch2 / together;
    const std::int32_t threads = cols / together;
    const Status status = Launch(device, gFirstHalf[which], grid, block, FirstHalf, in.data, work.data, p0, p1, threads,
                                 rows, half, half, off0, off2, k.a0, k.a1, -k.b1, -k.b2, k.a2, k.a3, -k.b1, -k.b2);
    if (Ostrand::Failed(status)) return status;
    return Launch(device, gSecondHalf[which], grid, block, SecondHalf, in.data, work.data, out.data, p0, p1, p2,
                  threads, rows, half, half, off0, off2, k.a0, k.a1, -k.b1, -k.b2, k.a2, k.a3, -k.b1, -k.b2);
}

Status Transpose(const Kiln::DeviceRef& device, Plane in, Plane out, std::int32_t width, std::int32_t height) {
    const bool inSquares = width % 4 == 0 && height % 4 == 0;
    const std::int32_t side = inSquares ? 4 : 1;
    const std::int32_t threads = inSquares ? 8 : 16;
    const std::int32_t columns = width / side, rows = height / side;
    return Launch(device, inSquares ? gTranspose4 : gTranspose, GridFor(columns, rows, threads, threads),
                  {threads, threads}, Turn, in.data, out.data, in.rowBytes / kFloatBytes / side,
                  out.rowBytes / kFloatBytes / side, columns, rows);
}

/// Both directions as column passes, with the picture turned between them.
Status BlurOnOpenCL(const Kiln::DeviceRef& device, DeviceValue buffer, std::int32_t rowBytes, std::int32_t width,
                    std::int32_t height, float sigmaX, float sigmaY) {
    const std::int32_t lineBytes = kFloatBytes * width, columnBytes = kFloatBytes * height;
    const auto pictureBytes = static_cast<std::uint64_t>(lineBytes) * static_cast<std::uint64_t>(height);
    const DeviceScratchBuffer a(device, pictureBytes * 2), b(device, pictureBytes);
    if (a.GetHandle() == 0 || b.GetHandle() == 0) return Ostrand::kStatus_OutOfMemory;
    const DeviceValue work = a.GetHandle(), other = b.GetHandle();
    const Coefficients x = MakeCoefficients<double>(sigmaX), y = MakeCoefficients<double>(sigmaY);
    Status status = ColumnPass(device, {buffer, rowBytes}, {work, lineBytes}, {other, lineBytes}, width, height, y);
    if (Ostrand::Failed(status)) return status;
    status = Transpose(device, {other, lineBytes}, {buffer, columnBytes}, width, height);
    if (Ostrand::Failed(status)) return status;
    status = ColumnPass(device, {buffer, columnBytes}, {work, columnBytes}, {other, columnBytes}, height, width, x);
    if (Ostrand::Failed(status)) return status;
    return Transpose(device, {other, columnBytes}, {buffer, rowBytes}, height, width);
}

}  // namespace

Status SingleChannelBlur(const Kiln::DeviceRef& device, DeviceValue buffer, std::int32_t rowBytes, std::int32_t width,
                         std::int32_t height, float sigmaX, float sigmaY) {
    const bool isOpenCL = device->GetFramework() == Kiln::DeviceFramework::kOpenCL;
    return (isOpenCL ? BlurOnOpenCL : BlurOnCuda)(device, buffer, rowBytes, width, height, sigmaX, sigmaY);
}

}  // namespace Vantrel
