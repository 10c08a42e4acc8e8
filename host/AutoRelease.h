#pragma once

#include "Interface.h"

#include <utility>

namespace Prjrep {

// Holds one reference to a host object and releases it at the end of the
// scope. Takes over the reference that the object was handed out with.
template<typename T>
class AutoRelease
{
public:
    AutoRelease() = default;
    explicit AutoRelease(T *p) : m_p(p) {}
    AutoRelease(const AutoRelease &) = delete;
    AutoRelease &operator=(const AutoRelease &) = delete;
    AutoRelease(AutoRelease &&o) noexcept : m_p(std::exchange(o.m_p, nullptr)) {}
    AutoRelease &operator=(AutoRelease &&o) noexcept
    {
        reset(std::exchange(o.m_p, nullptr));
        return *this;
    }
    ~AutoRelease() { reset(); }

    // Resetting to the pointer already held keeps it: releasing first would
    // leave the wrapper holding an object that may already be gone.
    void reset(T *p = nullptr)
    {
        if (p == m_p)
            return;
        if (m_p)
            CitI::release(m_p);
        m_p = p;
    }
    // For out-parameters: releases what is held and answers the slot to fill.
    T **out()
    {
        reset();
        return &m_p;
    }
    T *get() const { return m_p; }
    T *operator->() const { return m_p; }
    explicit operator bool() const { return m_p != nullptr; }

private:
    T *m_p = nullptr;
};

// Asks `from` for the interface T (by T::iid()) and keeps the object alive
// for the wrapper's lifetime; null when `from` is null or lacks T.
template<typename T>
class AutoCast
{
public:
    explicit AutoCast(CitI::IInterface *from)
        : m_p(from ? static_cast<T *>(from->GetInterface(T::iid())) : nullptr)
    {
        if (m_p)
            CitI::addRef(m_p);
    }
    AutoCast(const AutoCast &) = delete;
    AutoCast &operator=(const AutoCast &) = delete;
    ~AutoCast()
    {
        if (m_p)
            CitI::release(m_p);
    }

    T *get() const { return m_p; }
    T *operator->() const { return m_p; }
    explicit operator bool() const { return m_p != nullptr; }

private:
    T *m_p;
};

} // namespace Prjrep
