// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Halden/Strings.h"
#include "Vantrel/IRenderNode.h"

/// What this library can render, by name: match names of effects and transitions, fixed keys of structural nodes, and
/// the decimal four-character codes of synthetic media. A name without an entry isn't an error; it goes to the host.
///
/// Filled once at the start, for each framework, and only read afterwards, without a lock.
namespace Vantrel {

using Halden::WideString;

/// Each also tells Kiln the names, if it is the one that should: OpenCL when only that framework has a device, else
/// CUDA.
void FillCudaRegistry();
void FillOpenCLRegistry();

/// Does the framework of the device have the key?
[[nodiscard]] bool isRegistered(const WideString& key, const Kiln::DeviceRef& device);

/// Makes and configures the node of a key, falling back on the media's instance string and then on a host subtree.
/// Empty, with `host` set, when the frame is larger than the device allows; empty, too, when nothing could be
/// configured.
[[nodiscard]] RenderNodeRef createNode(const WideString& key, const Kiln::DeviceRef& device,
                                       const VideoNodeRef& description, const RenderRequirements& requirements,
                                       bool& host);

/// A new node for motion and opacity, not configured.
[[nodiscard]] RenderNodeRef MakeIntrinsicNode();

}  // namespace Vantrel
