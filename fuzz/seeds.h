#pragma once

#include "loaders.h"

#include <map>

namespace hostile
{

struct Seed
{
    std::string loader;
    std::string name;
    Bytes file;
    std::string error; ///< in the first message; empty for a file that loads without one
    bool loads;
};

/// Small files of every kind, at most 4 KB each, made by the project's own writers.
std::vector<Seed> makeSeeds();

/// Larger files that demand as much as possible: pictures, programs, time, records.
std::vector<Seed> makeCostlyFiles();
void addCostlyScenes(std::vector<Seed>& files); ///< for makeCostlyFiles()
void addCostlyFonts(std::vector<Seed>& files);  ///< likewise
void addFonts(std::vector<Seed>& seeds);        ///< for makeSeeds()

/// Files by name that seeds may refer to.
std::map<std::string, Bytes> makeSoundFiles();

} // namespace hostile
