// Reports allocations to hostile::heap(): those by new and by malloc() in this program, not in libraries. The linker
// installs the __wrap_ functions.

#include "watch.h"

#include <cstdlib>
#include <new>

extern "C"
{
    void* __real_malloc(size_t size);
    void* __real_calloc(size_t count, size_t size);
    void* __real_realloc(void* block, size_t size);
    void __real_free(void* block);

    void* __wrap_malloc(size_t size)
    {
        void* block = __real_malloc(size);
        hostile::heap().note(block, size);
        return block;
    }

    void* __wrap_calloc(size_t count, size_t size)
    {
        void* block = __real_calloc(count, size);
        hostile::heap().note(block, count * size);
        return block;
    }

    void* __wrap_realloc(void* block, size_t size)
    {
        hostile::heap().noteGone(block);
        void* resized = __real_realloc(block, size);
        hostile::heap().note(resized ? resized : block, size);
        return resized;
    }

    void __wrap_free(void* block)
    {
        hostile::heap().noteGone(block);
        __real_free(block);
    }
}

// Not inlined: the compiler would warn of free() on memory from new.

[[gnu::noinline]] void* operator new(size_t size, const std::nothrow_t&) noexcept
{
    return std::malloc(size > 0 ? size : 1);
}

[[gnu::noinline]] void* operator new(size_t size)
{
    void* block = std::malloc(size > 0 ? size : 1);
    return block ? block : (std::abort(), nullptr);
}

[[gnu::noinline]] void* operator new[](size_t size, const std::nothrow_t&) noexcept
{
    return std::malloc(size > 0 ? size : 1);
}

[[gnu::noinline]] void* operator new[](size_t size)
{
    return operator new(size);
}

[[gnu::noinline]] void operator delete(void* block) noexcept
{
    std::free(block);
}

[[gnu::noinline]] void operator delete(void* block, size_t) noexcept
{
    std::free(block);
}

[[gnu::noinline]] void operator delete[](void* block) noexcept
{
    std::free(block);
}

[[gnu::noinline]] void operator delete[](void* block, size_t) noexcept
{
    std::free(block);
}
