#pragma once

#include "orv/export.h"

#include <atomic>
#include <cstdint>

namespace orv
{

template <class T>
class SharedPtr;

/// Base of every long-lived engine object: an intrusive reference count.
///
/// The count starts at 0; the first SharedPtr makes it 1, and the SharedPtr that brings it back to 0 deletes
/// the object through its virtual destructor. An object that no SharedPtr ever held is its maker's to delete.
/// Threads: the count is atomic, so pointers to one object may be copied and dropped on different threads;
/// the object itself has no locks. An object that owns GL resources is to be dropped last on the GL thread.
class ORV_API Shared
{
public:
    Shared() = default;
    Shared(const Shared&) = delete;
    Shared& operator=(const Shared&) = delete;
    virtual ~Shared();

    /// The printable class name used in log records; see ORV_CLASS_NAME.
    virtual const char* getClassName() const = 0;
    static const char* className() { return "Shared"; }

    /// How many pointers share it.
    int32_t sharedGetCount() const { return m_count.load(std::memory_order_relaxed); }

private:
    template <class T>
    friend class SharedPtr;

    void sharedAcquire() const { m_count.fetch_add(1, std::memory_order_relaxed); }

    // The steps of SharedPtr that are too long to stand wherever a pointer is copied and dropped.
    void sharedAcquireCopied() const; ///< logs an assertion if there is no share to copy
    void sharedRelease() const;       ///< gives a share back; deletes the object with the last one

    mutable std::atomic<int32_t> m_count = 0;
};

} // namespace orv

/// Gives a class (or a whole family, once, in its base) its name for log records, both for an object and,
/// through the static form, for a SharedPtr that is empty.
#define ORV_CLASS_NAME(text)                                                                                 \
    static const char* className()                                                                           \
    {                                                                                                        \
        return text;                                                                                         \
    }                                                                                                        \
    const char* getClassName() const override                                                                \
    {                                                                                                        \
        return text;                                                                                         \
    }
