#pragma once

#include "job.h"

#include <string>

namespace convert
{

/// Which models of a folder are converted, and how.
struct FolderJob
{
    Job common;         ///< of every model; its paths are not used
    std::string folder; ///< with all folders below it
    std::string out;    ///< gets the same folders, with a scene and a report for each model
    unsigned shard = 1; ///< 1 to shards
    unsigned shards =
        1; ///< of how many parts of the models this is one; a model's path decides which it is in
    unsigned processes = 1; ///< at a time
    bool again = false;     ///< what has not changed too
};

/// Converts what is new or has changed. A report says what a scene was made of and with which options; a scene whose report
/// agrees with all of it is left alone, and so is a model that failed and is still as it was, which counts as failed again.
/// The report is written last: what was interrupted is done again, and nothing else.
/// Says a line for each model on standard output, each error on standard error.
/// @return false if a model failed or there is none.
bool convertFolder(const FolderJob& job);

} // namespace convert
