#pragma once

#include "orv/log.h"
#include "orv/shared.h"

#include <cstddef>
#include <new>
#include <type_traits>
#include <utility>

namespace orv
{

namespace detail
{

// What SharedPtr does when something is wrong, once instead of wherever a pointer is followed.
ORV_API void logNullArrow(const char* className);
ORV_API void logNullDereference(const char* className);
ORV_API void logNoMemory(const char* className);

} // namespace detail

/// Smart pointer to a Shared object: one raw pointer, which may be null. Empty stands for "not found" or
/// "failed" throughout the engine.
///
/// Dereferencing an empty pointer logs two errors and yields null; it does not stop the process.
template <class T>
class ORV_API SharedPtr
{
public:
    SharedPtr() = default;
    SharedPtr(std::nullptr_t) {} ///< An empty pointer.

    /// Takes a share of the object; a new object's count becomes 1.
    SharedPtr(T* pointer) : m_ptr(pointer)
    {
        if (m_ptr)
            m_ptr->sharedAcquire();
    }

    /// Shares what the other one has, or takes it over.
    SharedPtr(const SharedPtr& other) : m_ptr(other.m_ptr) { acquireCopied(); }
    SharedPtr(SharedPtr&& other) noexcept : m_ptr(std::exchange(other.m_ptr, nullptr)) {}

    /// From a pointer to a derived class.
    template <class U>
    requires std::is_convertible_v<U*, T*> SharedPtr(const SharedPtr<U>& other) : m_ptr(other.get())
    {
        acquireCopied();
    }

    ~SharedPtr() { release(); }

    SharedPtr& operator=(const SharedPtr& other)
    {
        SharedPtr copy(other);
        swap(copy);
        return *this;
    }

    SharedPtr& operator=(SharedPtr&& other) noexcept
    {
        SharedPtr taken(std::move(other));
        swap(taken);
        return *this;
    }

    /// Lets go of what it has and shares another object, or none.
    void reset(T* pointer = nullptr)
    {
        SharedPtr replacement(pointer);
        swap(replacement);
    }

    /// Exchanges what the two have.
    void swap(SharedPtr& other) noexcept { std::swap(m_ptr, other.m_ptr); }

    T* get() const { return m_ptr; } ///< The object, or null.
    /// The same; null is logged, as by the operators.
    T* getLogged() const { return operator->(); }
    explicit operator bool() const { return m_ptr != nullptr; }

    T* operator->() const
    {
        if (!m_ptr) [[unlikely]]
            detail::logNullArrow(T::className());
        return m_ptr;
    }

    T& operator*() const
    {
        if (!m_ptr) [[unlikely]]
            detail::logNullDereference(T::className());
        return *m_ptr;
    }

private:
    void acquireCopied()
    {
        if (m_ptr)
            m_ptr->sharedAcquireCopied();
    }

    void release()
    {
        if (m_ptr)
            m_ptr->sharedRelease();
    }

    T* m_ptr = nullptr;
};

template <class T, class U>
bool operator==(const SharedPtr<T>& a, const SharedPtr<U>& b)
{
    return a.get() == b.get();
}

template <class T>
bool operator==(const SharedPtr<T>& a, const T* b)
{
    return a.get() == b;
}

template <class T>
bool operator==(const SharedPtr<T>& a, std::nullptr_t)
{
    return !a.get();
}

/// Makes an object and the first pointer to it; empty when there is no memory for it (logged).
template <class T, class... Arguments>
SharedPtr<T> makeShared(Arguments&&... arguments)
{
    T* made = new (std::nothrow) T(std::forward<Arguments>(arguments)...);
    if (!made) [[unlikely]]
        detail::logNoMemory(T::className());
    return SharedPtr<T>(made);
}

} // namespace orv
