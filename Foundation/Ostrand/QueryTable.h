// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <utility>

#include "Ostrand/Allocated.h"
#include "Ostrand/InterfaceRef.h"
#include "Ostrand/Unknown.h"

namespace Ostrand {

/// The body of a QueryInterface, one line for each class or interface that is answered:
///
/// @code
/// Status NestedTimelineNode::QueryInterface(const Guid& iid, void** out) {
///     return Ostrand::QueryTable(this, iid, out)
///         .Answer<NestedTimelineNode>()             // by NestedTimelineNode::kInterfaceID
///         .Answer<INestedTimelineNode>()
///         .Answer<NestedTimelineNode>(kAliasID)     // by another identifier
///         .Otherwise<MediaNode>();                  // what the base class answers
/// }
/// @endcode
///
/// A class without a base that answers ends its table with Result(). The first line that matches wins; the pointer
/// written is that of the class asked for, also under multiple inheritance, and is counted.
template <class Object>
class QueryTable {
public:
    QueryTable(Object* object, const Guid& iid, void** out) : mObject(object), mInterfaceID(iid), mOut(out) {
        *mOut = nullptr;
    }

    template <class Interface>
    [[nodiscard]] QueryTable& Answer() {
        return Answer<Interface>(Interface::kInterfaceID);
    }
    template <class Interface>
    [[nodiscard]] QueryTable& Answer(const Guid& identifier) {
        if (!*mOut && mInterfaceID == identifier) {
            Interface* answered = mObject;
            answered->AddRef();
            *mOut = answered;
        }
        return *this;
    }

    [[nodiscard]] Status Result() const { return *mOut ? kStatus_OK : kStatus_NoInterface; }

    template <class Base>
    [[nodiscard]] Status Otherwise() const {
        return *mOut ? kStatus_OK : mObject->Base::QueryInterface(mInterfaceID, mOut);
    }

private:
    Object* mObject;
    const Guid& mInterfaceID;
    void** mOut;
};

/// Completes a concrete class: allocation and counter from Allocated<T>, AddRef and Release for all of its bases at
/// once. The class still writes its QueryInterface. Constructor arguments go to the first base; no base may itself be
/// Allocated.
///
/// @code
/// class HostFrame final : public Ostrand::Counted<HostFrame, IVideoFrame, IFrameData, IFrameRows> { ... };
/// InterfaceRef<HostFrame> frame = Ostrand::MakeRef<HostFrame>(...);
/// @endcode
template <class T, class Base, class... Interfaces>
class Counted : public Base, public Interfaces..., public Allocated<T> {
public:
    void AddRef() override { this->mRefCount.fetch_add(1, std::memory_order_relaxed); }
    void Release() override {
        if (this->mRefCount.fetch_sub(1, std::memory_order_acq_rel) == 1) delete this;
    }

protected:
    template <class... Arguments>
    explicit Counted(Arguments&&... arguments) : Base(std::forward<Arguments>(arguments)...) {}
};

/// Creates an object and holds it.
template <class T, class... Arguments>
[[nodiscard]] InterfaceRef<T> MakeRef(Arguments&&... arguments) {
    return InterfaceRef<T>(new T(std::forward<Arguments>(arguments)...));
}

}  // namespace Ostrand
