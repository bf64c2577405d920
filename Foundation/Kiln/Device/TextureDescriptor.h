// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// What a texture argument points to: written by the host, read by kernels. On CUDA the descriptor holds the texels'
/// address; on OpenCL, where a buffer can't hold another's address, the texels follow it in the same buffer.

#if defined(__OPENCL_VERSION__)
typedef ulong TextureAddress;
#else
typedef unsigned long long TextureAddress;
#endif

#define TEXTURE_TEXELS_OFFSET 256

#define TEXTURE_ADDRESS_WRAP 0
#define TEXTURE_ADDRESS_CLAMP 1
#define TEXTURE_ADDRESS_MIRROR 2
#define TEXTURE_ADDRESS_BORDER 3
#define TEXTURE_FILTER_POINT 0
#define TEXTURE_FILTER_LINEAR 1

typedef struct TextureDescriptor {
    TextureAddress texels;  // 0: they begin TEXTURE_TEXELS_OFFSET bytes after the descriptor's start
    int width, height;
    int pitch;        // from row to row, in pixels
    int format;       // 0: BGRA of 16-bit floats, else of 32-bit floats
    int addressMode;  // beyond the edges: TEXTURE_ADDRESS_...
    int filterMode;   // between texels: TEXTURE_FILTER_...
} TextureDescriptor;

#if defined(__cplusplus)
static_assert(sizeof(TextureDescriptor) == 32, "both sides agree on the layout");
#endif
