// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Allocation, copies, fills. Device addresses are addresses of this process, so one set of copies serves all
// directions.

#include <algorithm>
#include <cstring>

#include "SoftCuda/Objects.h"
#include "SoftCuda/ThreadPool.h"

using namespace SoftCuda;

namespace SoftCuda {

namespace {

constexpr std::size_t kCopyPart = std::size_t{256} << 10;
constexpr std::size_t kPitchAlignment = 512;

/// Rows of bytes within host or device memory.
struct Rows {
    std::uint8_t* base;
    std::size_t pitch;
};

void CopyRows(const Rows& target, const Rows& source, std::size_t widthBytes, std::size_t rows) {
    if (target.pitch == widthBytes && source.pitch == widthBytes)
        return CopyBytes(target.base, source.base, widthBytes * rows);
    const std::size_t group = std::max<std::size_t>(1, kCopyPart / std::max<std::size_t>(1, widthBytes));
    const std::size_t parts = (rows + group - 1) / group;
    GetPool().Run(static_cast<int>(parts), [&](int part) {
        const std::size_t first = static_cast<std::size_t>(part) * group;
        for (std::size_t row = first; row < std::min(first + group, rows); ++row)
            std::memcpy(target.base + row * target.pitch, source.base + row * source.pitch, widthBytes);
    });
}

/// Is the range device memory, or mapped host memory, or a module's global (which no block tells of)?
bool IsDevice(CUdeviceptr address, std::size_t bytes) {
    const std::optional<Block> block = GetMemory().Find(address);
    return address != 0 && (!block || GetMemory().Contains(address, bytes));
}

/// Memory that the driver can't hold on to after the call returns: the API copies from and to it before that.
bool IsPageable(const void* host) { return !GetMemory().Find(reinterpret_cast<std::uintptr_t>(host)); }

CUresult CopySmall(void* target, const void* source, std::size_t bytes, CUstream handle, bool wait,
                   std::shared_ptr<void> holder) {
    CUstream_st* stream = nullptr;
    if (const CUresult result = FindStream(handle, stream); result != CUDA_SUCCESS) return result;
    const auto number = [](const void* address) { return reinterpret_cast<std::uintptr_t>(address); };
    const std::uint64_t ticket =
        stream->stream->Submit({number(target), number(source), bytes, std::move(holder)}, GetDependencies(*stream));
    if (wait) stream->stream->Wait(ticket);
    return CUDA_SUCCESS;
}

CUresult Copy(void* target, const void* source, std::size_t bytes, CUstream stream, bool wait) {
    if (bytes <= Stream::kSmallBytes) return CopySmall(target, source, bytes, stream, wait, nullptr);
    return Enqueue(stream, wait, [=] { CopyBytes(target, source, bytes); });
}

/// From host memory; what is pageable is taken before the call returns.
CUresult CopyFromHost(void* target, const void* source, std::size_t bytes, CUstream stream) {
    if (!IsPageable(source)) return Copy(target, source, bytes, stream, false);
    if (bytes > Stream::kSmallBytes) return Copy(target, source, bytes, stream, true);
    const auto taken = std::make_shared<std::vector<std::uint8_t>>(bytes);
    if (bytes != 0) std::memcpy(taken->data(), source, bytes);
    return CopySmall(target, taken->data(), bytes, stream, false, taken);
}

void* Address(CUdeviceptr address) { return reinterpret_cast<void*>(address); }

template <class T>
CUresult Fill(CUdeviceptr target, std::size_t pitch, T value, std::size_t width, std::size_t height, CUstream stream,
              bool wait) {
    if (width == 0 || height == 0) return CUDA_SUCCESS;
    if (target % sizeof(T) != 0 || !IsDevice(target, (height - 1) * pitch + width * sizeof(T)))
        return CUDA_ERROR_INVALID_VALUE;
    return Enqueue(stream, wait, [=] {
        GetPool().Run(static_cast<int>(height), [&](int row) {
            T* const first = static_cast<T*>(Address(target + static_cast<std::size_t>(row) * pitch));
            std::fill_n(first, width, value);
        });
    });
}

/// A flat fill, cut into rows so that all threads have a part.
template <class T>
CUresult Fill(CUdeviceptr target, T value, std::size_t count, CUstream stream, bool wait) {
    const std::size_t row = kCopyPart / sizeof(T);
    const std::size_t whole = count / row * row;
    const CUresult result = Fill(target, kCopyPart, value, whole == 0 ? 0 : row, count / row, stream, wait);
    if (result != CUDA_SUCCESS) return result;
    return Fill(target + whole * sizeof(T), 0, value, count - whole, 1, stream, wait);
}

/// One side of a two-dimensional copy: where it begins, or null for a kind of memory that isn't there.
Rows GetSide(CUmemorytype type, const void* host, CUdeviceptr device, std::size_t pitch, std::size_t x, std::size_t y) {
    auto* base = type == CU_MEMORYTYPE_HOST ? static_cast<std::uint8_t*>(const_cast<void*>(host))
                                            : static_cast<std::uint8_t*>(Address(device));
    if (type == CU_MEMORYTYPE_ARRAY || base == nullptr) return {nullptr, 0};
    return {base + y * pitch + x, pitch};
}

CUresult Copy2D(const CUDA_MEMCPY2D* copy, CUstream stream, bool wait) {
    if (copy == nullptr) return CUDA_ERROR_INVALID_VALUE;
    const std::size_t width = copy->WidthInBytes;
    const std::size_t height = copy->Height;
    if (width == 0 || height == 0) return CUDA_SUCCESS;
    const Rows source = GetSide(copy->srcMemoryType, copy->srcHost, copy->srcDevice,
                                copy->srcPitch != 0 ? copy->srcPitch : width, copy->srcXInBytes, copy->srcY);
    const Rows target = GetSide(copy->dstMemoryType, copy->dstHost, copy->dstDevice,
                                copy->dstPitch != 0 ? copy->dstPitch : width, copy->dstXInBytes, copy->dstY);
    if (source.base == nullptr || target.base == nullptr ||
        (height > 1 && (source.pitch < width || target.pitch < width)))
        return CUDA_ERROR_INVALID_VALUE;
    const auto isInside = [&](const Rows& rows, CUmemorytype type) {
        return type == CU_MEMORYTYPE_HOST ||
               IsDevice(reinterpret_cast<CUdeviceptr>(rows.base), (height - 1) * rows.pitch + width);
    };
    if (!isInside(source, copy->srcMemoryType) || !isInside(target, copy->dstMemoryType))
        return CUDA_ERROR_INVALID_VALUE;
    const bool pageable = (copy->srcMemoryType == CU_MEMORYTYPE_HOST && IsPageable(source.base)) ||
                          (copy->dstMemoryType == CU_MEMORYTYPE_HOST && IsPageable(target.base));
    return Enqueue(stream, wait || pageable, [=] { CopyRows(target, source, width, height); });
}

CUresult FreeBlock(std::uintptr_t address, MemoryKind kind) {
    CUcontext context = nullptr;
    if (const CUresult result = NeedContext(context); result != CUDA_SUCCESS) return result;
    if (address == 0) return CUDA_SUCCESS;
    context->Synchronize();
    return GetMemory().Free(address, kind);
}

}  // namespace

void CopyBytes(void* target, const void* source, std::size_t bytes) {
    const std::size_t parts = (bytes + kCopyPart - 1) / kCopyPart;
    GetPool().Run(static_cast<int>(parts), [&](int part) {
        const std::size_t first = static_cast<std::size_t>(part) * kCopyPart;
        std::memcpy(static_cast<std::uint8_t*>(target) + first, static_cast<const std::uint8_t*>(source) + first,
                    std::min(kCopyPart, bytes - first));
    });
}

}  // namespace SoftCuda

extern "C" {

CUresult cuMemGetInfo(size_t* freeBytes, size_t* totalBytes) {
    CUcontext context = nullptr;
    if (const CUresult result = NeedContext(context); result != CUDA_SUCCESS) return result;
    if (freeBytes == nullptr || totalBytes == nullptr) return CUDA_ERROR_INVALID_VALUE;
    *totalBytes = GetMemory().GetLimit();
    *freeBytes = *totalBytes - GetMemory().GetUsed(context->device);
    return CUDA_SUCCESS;
}
SOFTCUDA_V2(cuMemGetInfo);

CUresult cuMemAlloc(CUdeviceptr* address, size_t bytes) {
    CUcontext context = nullptr;
    if (const CUresult result = NeedContext(context); result != CUDA_SUCCESS) return result;
    if (address == nullptr) return CUDA_ERROR_INVALID_VALUE;
    std::uintptr_t made = 0;
    const CUresult result = GetMemory().AllocateDevice(bytes, context->device, context, made);
    if (result == CUDA_SUCCESS) *address = made;
    return result;
}
SOFTCUDA_V2(cuMemAlloc);

CUresult cuMemAllocPitch(CUdeviceptr* address, size_t* pitch, size_t widthBytes, size_t height, unsigned /*element*/) {
    if (pitch == nullptr || widthBytes == 0 || height == 0) return CUDA_ERROR_INVALID_VALUE;
    *pitch = (widthBytes + kPitchAlignment - 1) / kPitchAlignment * kPitchAlignment;
    return cuMemAlloc(address, *pitch * height);
}
SOFTCUDA_V2(cuMemAllocPitch);

CUresult cuMemFree(CUdeviceptr address) { return FreeBlock(address, MemoryKind::kDevice); }
SOFTCUDA_V2(cuMemFree);

CUresult cuMemGetAddressRange(CUdeviceptr* base, size_t* bytes, CUdeviceptr address) {
    const std::optional<Block> block = GetMemory().Find(address);
    if (!block || block->kind != MemoryKind::kDevice) return CUDA_ERROR_NOT_FOUND;
    if (base != nullptr) *base = block->base;
    if (bytes != nullptr) *bytes = block->bytes;
    return CUDA_SUCCESS;
}
SOFTCUDA_V2(cuMemGetAddressRange);

CUresult cuMemHostAlloc(void** host, size_t bytes, unsigned flags) {
    CUcontext context = nullptr;
    if (const CUresult result = NeedContext(context); result != CUDA_SUCCESS) return result;
    if (host == nullptr) return CUDA_ERROR_INVALID_VALUE;
    std::uintptr_t made = 0;
    const CUresult result = GetMemory().AllocateHost(bytes, context, flags, made);
    if (result == CUDA_SUCCESS) *host = Address(made);
    return result;
}

CUresult cuMemAllocHost(void** host, size_t bytes) { return cuMemHostAlloc(host, bytes, 0); }
SOFTCUDA_V2(cuMemAllocHost);

CUresult cuMemFreeHost(void* host) { return FreeBlock(reinterpret_cast<std::uintptr_t>(host), MemoryKind::kHost); }

CUresult cuMemHostRegister(void* host, size_t bytes, unsigned flags) {
    CUcontext context = nullptr;
    if (const CUresult result = NeedContext(context); result != CUDA_SUCCESS) return result;
    return GetMemory().Register(reinterpret_cast<std::uintptr_t>(host), bytes, context, flags);
}
SOFTCUDA_V2(cuMemHostRegister);

CUresult cuMemHostUnregister(void* host) {
    return FreeBlock(reinterpret_cast<std::uintptr_t>(host), MemoryKind::kRegistered);
}

CUresult cuMemHostGetDevicePointer(CUdeviceptr* address, void* host, unsigned flags) {
    const std::optional<Block> block = GetMemory().Find(reinterpret_cast<std::uintptr_t>(host));
    if (address == nullptr || flags != 0 || !block || block->kind == MemoryKind::kDevice)
        return CUDA_ERROR_INVALID_VALUE;
    *address = reinterpret_cast<CUdeviceptr>(host);
    return CUDA_SUCCESS;
}
SOFTCUDA_V2(cuMemHostGetDevicePointer);

CUresult cuMemHostGetFlags(unsigned* flags, void* host) {
    const std::optional<Block> block = GetMemory().Find(reinterpret_cast<std::uintptr_t>(host));
    if (flags == nullptr || !block || block->kind == MemoryKind::kDevice) return CUDA_ERROR_INVALID_VALUE;
    *flags = block->flags;
    return CUDA_SUCCESS;
}

CUresult cuMemcpyHtoDAsync(CUdeviceptr target, const void* source, size_t bytes, CUstream stream) {
    if (bytes != 0 && (source == nullptr || !IsDevice(target, bytes))) return CUDA_ERROR_INVALID_VALUE;
    return CopyFromHost(Address(target), source, bytes, stream);
}
SOFTCUDA_V2(cuMemcpyHtoDAsync);

CUresult cuMemcpyDtoHAsync(void* target, CUdeviceptr source, size_t bytes, CUstream stream) {
    if (bytes != 0 && (target == nullptr || !IsDevice(source, bytes))) return CUDA_ERROR_INVALID_VALUE;
    return Copy(target, Address(source), bytes, stream, IsPageable(target));
}
SOFTCUDA_V2(cuMemcpyDtoHAsync);

CUresult cuMemcpyDtoDAsync(CUdeviceptr target, CUdeviceptr source, size_t bytes, CUstream stream) {
    if (bytes != 0 && (!IsDevice(target, bytes) || !IsDevice(source, bytes))) return CUDA_ERROR_INVALID_VALUE;
    return Copy(Address(target), Address(source), bytes, stream, false);
}
SOFTCUDA_V2(cuMemcpyDtoDAsync);

CUresult cuMemcpyHtoD(CUdeviceptr target, const void* source, size_t bytes) {
    if (bytes != 0 && (source == nullptr || !IsDevice(target, bytes))) return CUDA_ERROR_INVALID_VALUE;
    return Copy(Address(target), source, bytes, nullptr, true);
}
SOFTCUDA_V2(cuMemcpyHtoD);

CUresult cuMemcpyDtoH(void* target, CUdeviceptr source, size_t bytes) {
    if (bytes != 0 && (target == nullptr || !IsDevice(source, bytes))) return CUDA_ERROR_INVALID_VALUE;
    return Copy(target, Address(source), bytes, nullptr, true);
}
SOFTCUDA_V2(cuMemcpyDtoH);

CUresult cuMemcpyDtoD(CUdeviceptr target, CUdeviceptr source, size_t bytes) {
    return cuMemcpyDtoDAsync(target, source, bytes, nullptr);
}
SOFTCUDA_V2(cuMemcpyDtoD);

CUresult cuMemcpy(CUdeviceptr target, CUdeviceptr source, size_t bytes) {
    if (bytes != 0 && (target == 0 || source == 0)) return CUDA_ERROR_INVALID_VALUE;
    return Copy(Address(target), Address(source), bytes, nullptr, true);
}

CUresult cuMemcpyPeer(CUdeviceptr target, CUcontext targetContext, CUdeviceptr source, CUcontext sourceContext,
                      size_t bytes) {
    if (targetContext == nullptr || sourceContext == nullptr) return CUDA_ERROR_INVALID_CONTEXT;
    targetContext->Synchronize();
    sourceContext->Synchronize();
    return cuMemcpy(target, source, bytes);
}

CUresult cuMemcpy2D(const CUDA_MEMCPY2D* copy) { return Copy2D(copy, nullptr, true); }
SOFTCUDA_V2(cuMemcpy2D);
CUresult cuMemcpy2DUnaligned(const CUDA_MEMCPY2D* copy) { return Copy2D(copy, nullptr, true); }
SOFTCUDA_V2(cuMemcpy2DUnaligned);
CUresult cuMemcpy2DAsync(const CUDA_MEMCPY2D* copy, CUstream stream) { return Copy2D(copy, stream, false); }
SOFTCUDA_V2(cuMemcpy2DAsync);

CUresult cuMemsetD8(CUdeviceptr target, unsigned char value, size_t count) {
    return Fill(target, value, count, nullptr, false);
}
SOFTCUDA_V2(cuMemsetD8);
CUresult cuMemsetD16(CUdeviceptr target, unsigned short value, size_t count) {
    return Fill(target, value, count, nullptr, false);
}
SOFTCUDA_V2(cuMemsetD16);
CUresult cuMemsetD32(CUdeviceptr target, unsigned value, size_t count) {
    return Fill(target, value, count, nullptr, false);
}
SOFTCUDA_V2(cuMemsetD32);
CUresult cuMemsetD8Async(CUdeviceptr target, unsigned char value, size_t count, CUstream stream) {
    return Fill(target, value, count, stream, false);
}
CUresult cuMemsetD32Async(CUdeviceptr target, unsigned value, size_t count, CUstream stream) {
    return Fill(target, value, count, stream, false);
}
CUresult cuMemsetD2D8(CUdeviceptr target, size_t pitch, unsigned char value, size_t width, size_t height) {
    return Fill(target, pitch, value, width, height, nullptr, false);
}
SOFTCUDA_V2(cuMemsetD2D8);
CUresult cuMemsetD2D16(CUdeviceptr target, size_t pitch, unsigned short value, size_t width, size_t height) {
    return Fill(target, pitch, value, width, height, nullptr, false);
}
SOFTCUDA_V2(cuMemsetD2D16);
CUresult cuMemsetD2D32(CUdeviceptr target, size_t pitch, unsigned value, size_t width, size_t height) {
    return Fill(target, pitch, value, width, height, nullptr, false);
}
SOFTCUDA_V2(cuMemsetD2D32);

}  // extern "C"
