#pragma once

#include <map>
#include <string>
#include <vector>

namespace inspect
{

/// Records by name; of equal names the first.
template <class Record>
using ByName = std::map<std::string, const Record*>;

/// @param records  borrowed.
template <class Record>
ByName<Record> firstByName(const std::vector<Record>& records)
{
    ByName<Record> byName;
    for (const Record& record : records)
        byName.emplace(record.name, &record);
    return byName;
}

/// @return null if there is none.
template <class Record>
const Record* find(const ByName<Record>& records, const std::string& name)
{
    const auto found = records.find(name);
    return found != records.end() ? found->second : nullptr;
}

} // namespace inspect
