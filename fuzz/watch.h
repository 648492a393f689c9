#pragma once

#include <cstddef>
#include <string>

/// Observes the engine's messages and the heap while a loader reads a hostile file.
namespace hostile
{

/// Messages of the engine since clear(). In programs that link orv_hostile they come here instead of the platform's
/// log.
struct Messages
{
    int errors = 0;
    int warnings = 0;
    int all = 0;            ///< of any level
    std::string firstError; ///< its text alone

    void clear() { *this = Messages(); }
};

Messages& messages();

/// The heap of this thread, as far as the program reports it.
struct Heap
{
    bool isReported = false;
    size_t live = 0;
    size_t peak = 0;    ///< of live, since start()
    size_t largest = 0; ///< block requested since start(), even if refused
    size_t blocks = 0;  ///< requested since start()

    void start();
    void note(const void* block, size_t asked);
    void noteGone(const void* block);
};

Heap& heap();

} // namespace hostile
