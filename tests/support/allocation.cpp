#include "support/allocation.h"

#include <atomic>
#include <cstdlib>
#include <new>

// Bounds of the program's code, from the linker.
extern "C" const char __executable_start;
extern "C" const char etext;

namespace support
{

namespace
{

thread_local uint64_t t_allocations = 0;
std::atomic<int64_t> g_live = 0;
uint64_t g_allocationsToRefusal = 0;
bool g_isRefused = false;

void* allocate(size_t size)
{
    ++t_allocations;
    ++g_live;
    return std::malloc(size > 0 ? size : 1);
}

void give(void* memory)
{
    g_live -= memory ? 1 : 0;
    std::free(memory);
}

void* allocateOrNull(size_t size, const void* caller)
{
    const bool isOwnCode = caller >= &__executable_start && caller < &etext;
    if (isOwnCode && g_allocationsToRefusal > 0 && --g_allocationsToRefusal == 0)
    {
        g_isRefused = true;
        return nullptr;
    }
    return allocate(size);
}

} // namespace

uint64_t countAllocations()
{
    return t_allocations;
}

void refuseAllocation(uint64_t number)
{
    g_allocationsToRefusal = number;
    g_isRefused = false;
}

int64_t countLiveAllocations()
{
    return g_live;
}

bool isAllocationRefused()
{
    return g_isRefused;
}

} // namespace support

// None is to be put in place of its calls: the compiler would find free() on what came from new.

[[gnu::noinline]] void* operator new(size_t size, const std::nothrow_t&) noexcept
{
    return support::allocateOrNull(size, __builtin_return_address(0));
}

[[gnu::noinline]] void* operator new[](size_t size, const std::nothrow_t&) noexcept
{
    return support::allocateOrNull(size, __builtin_return_address(0));
}

[[gnu::noinline]] void* operator new(size_t size)
{
    void* memory = support::allocate(size);
    return memory ? memory : (std::abort(), nullptr);
}

[[gnu::noinline]] void* operator new[](size_t size)
{
    return operator new(size);
}

[[gnu::noinline]] void operator delete(void* memory) noexcept
{
    support::give(memory);
}

[[gnu::noinline]] void operator delete[](void* memory) noexcept
{
    support::give(memory);
}

[[gnu::noinline]] void operator delete(void* memory, size_t) noexcept
{
    support::give(memory);
}

[[gnu::noinline]] void operator delete[](void* memory, size_t) noexcept
{
    support::give(memory);
}
