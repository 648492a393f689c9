// The fuzzing target for sequences of the public interface. What the engine and the model disagree on ends the program,
// as a crash does.

#include "sequence.h"

#include <cstdio>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    const std::string fault = sequence::play({data, data + size});
    if (fault.empty())
        return 0;
    std::fprintf(stderr, "sequence: %s\n", fault.c_str());
    std::abort();
}
