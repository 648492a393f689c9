#pragma once

#include "job.h"

#include <string>

namespace convert
{

/// Which models of a folder are converted, and how.
struct FolderJob
{
    Job common;             ///< of every model; its paths are not used
    std::string folder;     ///< with all folders below it
    std::string out;        ///< gets the same folders, with a scene and a report for each model
    unsigned shard = 1;     ///< 1 to shards
    unsigned shards = 1;    ///< number of parts; a model's path decides its part
    unsigned processes = 1; ///< at a time
    bool again = false;     ///< unchanged models too
};

/// Converts new and changed models. A report lists a scene's inputs and options; a scene whose report is still valid is
/// skipped. A model that failed and has not changed is skipped too, and counts as failed again. The report is written
/// last, so that interrupted conversions are repeated. Prints a line for each model on standard output, errors on
/// standard error.
/// @return false if a model failed or there is none.
bool convertFolder(const FolderJob& job);

} // namespace convert
