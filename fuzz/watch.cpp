#include "watch.h"

#include <algorithm>
#include <cstdarg>
#include <cstdio>

#include <malloc.h>

namespace hostile
{

Messages& messages()
{
    static Messages theMessages;
    return theMessages;
}

Heap& heap()
{
    static thread_local Heap theHeap;
    return theHeap;
}

void Heap::start()
{
    peak = live;
    largest = 0;
    blocks = 0;
}

void Heap::note(const void* block, size_t asked)
{
    largest = std::max(largest, asked);
    ++blocks;
    live += block ? malloc_usable_size(const_cast<void*>(block)) : 0;
    peak = std::max(peak, live);
}

void Heap::noteGone(const void* block)
{
    const size_t size = block ? malloc_usable_size(const_cast<void*>(block)) : 0;
    live -= std::min(live, size); // it may have been allocated before counting began
}

} // namespace hostile

// The linker puts these in place of the platform's log. Formatting shows that every argument can be read.
#define HOSTILE_LOG(name, count)                                                                             \
    extern "C" void __wrap_##name(const char*, const char*, int, const char* format, ...)                    \
    {                                                                                                        \
        char text[1024];                                                                                     \
        va_list arguments;                                                                                   \
        va_start(arguments, format);                                                                         \
        std::vsnprintf(text, sizeof(text), format, arguments);                                               \
        va_end(arguments);                                                                                   \
        ++hostile::messages().all;                                                                           \
        count(text);                                                                                         \
    }

namespace
{

void countError(const char* text)
{
    if (++hostile::messages().errors == 1)
        hostile::messages().firstError = text;
}

void countWarning(const char*)
{
    ++hostile::messages().warnings;
}

void ignore(const char*) {}

} // namespace

HOSTILE_LOG(pssLogError, countError)
HOSTILE_LOG(pssLogWarn, countWarning)
HOSTILE_LOG(pssLogInfo, ignore)
HOSTILE_LOG(pssLogDebug, ignore)
