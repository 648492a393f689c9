#pragma once

#include "findings.h"
#include "forecast.h"
#include "gloscan.h"
#include "textfiles.h"

#include <nlohmann/json.hpp>

#include <string>

namespace inspect
{

/// All results for one file, for people and for scripts.
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
