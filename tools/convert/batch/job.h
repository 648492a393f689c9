#pragma once

#include "convert/guard.h"
#include "convert/options.h"

#include <set>
#include <string>
#include <vector>

namespace convert
{

/// One model to convert, and its outputs.
struct Job
{
    std::string model;                ///< path
    std::string out;                  ///< path of the scene file
    std::string report;               ///< path of a file for the JSON; empty for none
    std::string depfile;              ///< path of a dependency file for a build; empty for none
    std::string page;                 ///< folder of the scene file, which also gets a page; empty for none
    bool dryRun = false;              ///< neither scene nor textures are written, nor a depfile
    std::vector<std::string> allowed; ///< further folders that the model may have files in
    Options options;
    Limits limits;
};

struct Outcome
{
    std::string error;             ///< one line; empty if it went well
    std::string text;              ///< the report for a person
    std::string json;              ///< the report for a program
    std::set<std::string> inputs;  ///< canonical paths of the files that were read, also after an error
    std::set<std::string> missing; ///< absolute paths of files that do not exist
};

/// Converts in a child process and writes the results, all or nothing.
Outcome convertModel(Job job);

} // namespace convert
