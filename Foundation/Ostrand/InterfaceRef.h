// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <type_traits>
#include <utility>

#include "Ostrand/Exceptions.h"
#include "Ostrand/Unknown.h"

namespace Ostrand {

/// A counted holder of an interface. Copying counts up, destruction counts down; a null holder is allowed, but using it
/// through `->` or `*` raises NullInterfaceException.
template <class T>
class InterfaceRef {
public:
    InterfaceRef() = default;
    InterfaceRef(std::nullptr_t) {}  // NOLINT(google-explicit-constructor): null converts as for any pointer
    /// Shares an object: counts up.
    explicit InterfaceRef(T* object) : mObject(object) { AddRefIfHeld(); }
    InterfaceRef(const InterfaceRef& other) : mObject(other.mObject) { AddRefIfHeld(); }
    InterfaceRef(InterfaceRef&& other) noexcept : mObject(std::exchange(other.mObject, nullptr)) {}

    /// From a derived class: an ordinary upcast, hence implicit.
    template <class U, class = std::enable_if_t<std::is_convertible_v<U*, T*>>>
    InterfaceRef(const InterfaceRef<U>& other)  // NOLINT(google-explicit-constructor)
        : mObject(other.Get()) {
        AddRefIfHeld();
    }

    ~InterfaceRef() { ReleaseIfHeld(); }

    InterfaceRef& operator=(InterfaceRef other) noexcept {
        std::swap(mObject, other.mObject);
        return *this;
    }

    /// Takes over a reference that has been counted already.
    [[nodiscard]] static InterfaceRef Attach(T* counted) {
        InterfaceRef ref;
        ref.mObject = counted;
        return ref;
    }

    [[nodiscard]] T* Get() const { return mObject; }
    [[nodiscard]] T* operator->() const { return &Demand(); }
    [[nodiscard]] T& operator*() const { return Demand(); }
    [[nodiscard]] explicit operator bool() const { return mObject != nullptr; }

    void Reset() { InterfaceRef().Swap(*this); }
    void Swap(InterfaceRef& other) noexcept { std::swap(mObject, other.mObject); }

    friend bool operator==(const InterfaceRef& a, const InterfaceRef& b) { return a.mObject == b.mObject; }
    friend bool operator!=(const InterfaceRef& a, const InterfaceRef& b) { return a.mObject != b.mObject; }
    friend bool operator<(const InterfaceRef& a, const InterfaceRef& b) { return a.mObject < b.mObject; }

private:
    [[nodiscard]] T& Demand() const {
        if (!mObject) throw NullInterfaceException();
        return *mObject;
    }
    void AddRefIfHeld() {
        if (mObject) mObject->AddRef();
    }
    void ReleaseIfHeld() {
        if (mObject) mObject->Release();
    }

    T* mObject = nullptr;
};

/// Asks an object for another of its interfaces; null when the object is null or lacks it.
template <class To>
[[nodiscard]] InterfaceRef<To> Query(OstrandUnknown* object) {
    void* out = nullptr;
    if (!object || Failed(object->QueryInterface(To::kInterfaceID, &out))) return {};
    return InterfaceRef<To>::Attach(static_cast<To*>(out));
}
template <class To, class From>
[[nodiscard]] InterfaceRef<To> Query(const InterfaceRef<From>& from) {
    return Query<To>(from.Get());
}

/// As Query, but a missing interface raises NullInterfaceException.
template <class To, class From>
[[nodiscard]] InterfaceRef<To> Demand(const InterfaceRef<From>& from) {
    InterfaceRef<To> ref = Query<To>(from.Get());
    if (!ref) throw NullInterfaceException();
    return ref;
}

}  // namespace Ostrand
