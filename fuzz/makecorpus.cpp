// Writes the seeds of the fuzzing targets: makecorpus FOLDER makes FOLDER/TARGET/NAME of each. What else lies
// there, the inputs that once found a fault, stays.

#include "seeds.h"

#include <cstdio>
#include <filesystem>
#include <fstream>

int main(int argc, char** argv)
{
    if (argc != 2)
    {
        std::fprintf(stderr, "usage: makecorpus FOLDER\n");
        return 2;
    }
    for (const hostile::Seed& seed : hostile::makeSeeds())
    {
        const std::filesystem::path folder = std::filesystem::path(argv[1]) / seed.loader;
        std::filesystem::create_directories(folder);
        std::ofstream file(folder / seed.name, std::ios::binary);
        file.write(reinterpret_cast<const char*>(seed.file.data()), std::streamsize(seed.file.size()));
        if (!file)
        {
            std::fprintf(stderr, "cannot write %s\n", (folder / seed.name).c_str());
            return 1;
        }
    }
    return 0;
}
