#pragma once

#include "orv/detail/gloformat.h"

#include <nlohmann/json.hpp>

#include <map>
#include <string>
#include <utility>
#include <vector>

namespace inspect
{

struct Field
{
    std::string label;
    uint64_t offset; ///< bytes from the start of the file
    nlohmann::ordered_json value;
};

/// One chunk of the file.
struct Chunk
{
    static constexpr size_t NO_RECORD = size_t(-1);

    uint32_t id = 0;
    uint64_t offset = 0; ///< of the header
    uint32_t size = 0;   ///< of the data, as the header says
    bool known = true;
    std::string path;
    size_t record = NO_RECORD; ///< index in the vector of records that it was read into
    std::vector<Field> fields;
    std::vector<Chunk> children; ///< see add()

    /// The first text in it, which is the name of everything that has one; "" if there is none.
    std::string getName() const;

    void add(Chunk&& child);

    /// The number of children of that kind so far.
    size_t count(uint32_t childId) const;

    /// The child of that kind with that record, or the only one of that kind; this chunk if there is none.
    const Chunk& find(uint32_t childId, size_t childRecord = NO_RECORD) const;

private:
    std::map<uint32_t, size_t> m_counts;
    std::map<std::pair<uint32_t, size_t>, size_t>
        m_places; ///< of children by ID and record, the first of each
};

} // namespace inspect
