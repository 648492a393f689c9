#pragma once

#include "findings.h"
#include "forecast.h"
#include "gloscan.h"
#include "textfiles.h"

#include <nlohmann/json.hpp>

#include <string>

namespace inspect
{

/// Everything that is known of one file, in the two forms that people and scripts read.
struct Report
{
    std::string path;
    std::string kind; ///< "scene", "appearance" or "program"
    uint64_t size = 0;
    Findings findings;
    ScannedFile scene; ///< of a scene
    Forecast forecast;
    TextFile text; ///< of the other two
};

void printTree(const Report& report);
void printTotals(const Report& report);
void printFindings(const Report& report);
nlohmann::ordered_json toJson(const Report& report);

} // namespace inspect
