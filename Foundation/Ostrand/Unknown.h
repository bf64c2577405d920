// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Halden/Guid.h"
#include "Ostrand/Status.h"

namespace Ostrand {

using Halden::utility::Guid;

/// The root of every counted interface. An interface class names its identifier `kInterfaceID`.
///
/// AddRef and Release are atomic and may come from any thread; the object dies with the last Release.
class OstrandUnknown {
public:
    virtual void AddRef() = 0;
    virtual void Release() = 0;
    virtual ~OstrandUnknown() = default;

    /// Writes a counted pointer to `*out`, or a null pointer together with kStatus_NoInterface.
    virtual Status QueryInterface(const Guid& iid, void** out) = 0;
};

}  // namespace Ostrand
