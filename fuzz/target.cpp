// One fuzzing target: libFuzzer's inputs for the loader FUZZ_TARGET. A broken rule ends the program like a crash.

#include "loaders.h"
#include "nulldriver.h"
#include "watch.h"

#include <cstdio>
#include <cstdlib>

// Missing in a build without address checks, which does not watch the heap.
extern "C" __attribute__((weak)) int
__sanitizer_install_malloc_and_free_hooks(void (*taken)(const volatile void* block, size_t size),
                                          void (*given)(const volatile void* block));

namespace
{

void noteBlock(const volatile void* block, size_t size)
{
    hostile::heap().note(const_cast<const void*>(block), size);
}

void noteBlockGone(const volatile void* block)
{
    hostile::heap().noteGone(const_cast<const void*>(block));
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***)
{
    if (__sanitizer_install_malloc_and_free_hooks)
        hostile::heap().isReported = __sanitizer_install_malloc_and_free_hooks(noteBlock, noteBlockGone) > 0;
    nulldriver::install();
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    static const hostile::Loader& loader = *hostile::findLoader(FUZZ_TARGET);
    static hostile::Session session;
    const std::string fault = session.attack(loader, hostile::Bytes(data, data + size));
    if (fault.empty())
        return 0;
    std::fprintf(stderr, "%s: %s\n", loader.name, fault.c_str());
    std::abort();
}
