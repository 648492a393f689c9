#pragma once

#include <cstddef>
#include <string>

/// What is watched while a loader is given a hostile file: the engine's messages and the heap.
namespace hostile
{

/// Messages of the engine since clear(). Programs that link orv_hostile have them come here and not to the
/// platform's log.
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
    size_t largest = 0; ///< block asked for since start(), had or not
    size_t blocks = 0;  ///< asked for since start()

    void start();
    void note(const void* block, size_t asked);
    void noteGone(const void* block);
};

Heap& heap();

} // namespace hostile
