// The fuzzing target for sequences of the public interface. A difference between engine and model ends the program like
// a crash.

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
