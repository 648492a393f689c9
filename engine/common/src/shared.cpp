#include "orv/shared.h"

#include "orv/log.h"
#include "orv/sharedptr.h"

namespace orv
{

namespace
{

/// @param operation  of SharedPtr, for the log record.
void assertIsShared(int32_t count, const char* operation)
{
    if (count <= 0) [[unlikely]]
        pssLogError("sharedptr", operation, __LINE__, "%s", "ORV_ASSERT: m_ptr->sharedGetCount() > 0");
}

} // namespace

Shared::~Shared() = default;

void Shared::sharedAcquireCopied() const
{
    assertIsShared(sharedGetCount(), "acquireCopied");
    sharedAcquire();
}

void Shared::sharedRelease() const
{
    assertIsShared(sharedGetCount(), "release");

    // Uses the decrement's own result: if two threads drop the last two shares at once, exactly one sees 0.
    if (m_count.fetch_sub(1, std::memory_order_acq_rel) - 1 <= 0)
        delete this;
}

namespace detail
{

void logNullArrow(const char* className)
{
    logError("sharedptr", "operator->", __LINE__, "Error: pointer operator on null. class: %s", className);
    logError("sharedptr", "operator->", __LINE__, "%s", "ORV_ASSERT: m_ptr");
}

void logNullDereference(const char* className)
{
    logError("sharedptr", "operator*", __LINE__, "Error: null shared pointer dereference. class: %s",
             className);
    logError("sharedptr", "operator*", __LINE__, "%s", "ORV_ASSERT: m_ptr");
}

void logNoMemory(const char* className)
{
    logError("sharedptr", "makeShared", __LINE__, "No memory for an object. class: %s", className);
}

} // namespace detail

} // namespace orv
