#include "callgrind.h"
#include "timing.h"

#include <unistd.h>
#if __has_include(<valgrind/callgrind.h>)
#include <valgrind/callgrind.h>
#else // built without valgrind: nothing is counted
#define CALLGRIND_START_INSTRUMENTATION
#define CALLGRIND_STOP_INSTRUMENTATION
#endif

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <utility>

namespace callgrind
{

// Without C++ name mangling, for callgrind's options.
extern "C" [[gnu::noinline]] void callgrindMeasure(Work work, void* object, int number)
{
    work(object, number);
    asm volatile(""); // no tail call: the work must run inside this function
}

void measure(Work work, void* object, int number)
{
    CALLGRIND_START_INSTRUMENTATION; // code before this would take ten times as long
    callgrindMeasure(work, object, number);
    CALLGRIND_STOP_INSTRUMENTATION;
}

bool isAvailable()
{
    return std::system("valgrind --version >/dev/null 2>&1") == 0;
}

/// Adds up one dump: lines "position instructions" after the "fn=" line of the function that they belong to. The
/// line after a "calls=" line repeats what the called function has under its own name.
static uint64_t readDump(const std::string& path, const std::vector<std::string>& excluded)
{
    uint64_t total = 0;
    bool isExcluded = false;
    bool isRepeated = false;
    std::ifstream file(path);
    for (std::string line; std::getline(file, line);)
    {
        unsigned long long instructions = 0;
        if (line.rfind("fn=", 0) == 0)
            isExcluded =
                std::any_of(excluded.begin(), excluded.end(),
                            [&](const std::string& start) { return line.rfind("fn=" + start, 0) == 0; });
        else if (line.rfind("calls=", 0) == 0)
            isRepeated = true;
        else if (std::sscanf(line.c_str(), "%*u %llu", &instructions) == 1 &&
                 !std::exchange(isRepeated, false))
            total += isExcluded ? 0 : instructions;
    }
    return total;
}

std::vector<uint64_t> count(const std::string& arguments, const std::vector<std::string>& excluded)
{
    namespace fs = std::filesystem;
    const fs::path folder = fs::temp_directory_path() / ("callgrind." + std::to_string(getpid()));
    fs::create_directories(folder);
    const std::string output = (folder / "out").string();
    const std::string command =
        "valgrind --tool=callgrind --instr-atstart=no --collect-atstart=no --toggle-collect=callgrindMeasure"
        " --dump-after=callgrindMeasure --compress-strings=no --compress-pos=no --callgrind-out-file='" +
        output + "' '" + getProgram() + "' " + arguments + " >'" + output + ".log' 2>&1";
    std::vector<uint64_t> counts;
    if (std::system(command.c_str()) == 0)
    {
        for (int part = 1; fs::exists(output + "." + std::to_string(part)); ++part)
            counts.push_back(readDump(output + "." + std::to_string(part), excluded));
    }
    else
        std::fprintf(stderr, "failed: %s\n", command.c_str());
    fs::remove_all(folder);
    return counts;
}

} // namespace callgrind
