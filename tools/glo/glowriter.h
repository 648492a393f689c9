#pragma once

#include "orv/detail/glorecords.h"

#include <cstdint>
#include <string>
#include <vector>

/// The writing side of scene files: fill a GloScene, write it.
namespace glo
{

using namespace orv::detail::glo;

/// Writes a scene in the version that its info names.
/// @param file   replaced by the bytes of the whole file.
/// @param error  the reason: an unknown version, a feature that the version lacks, a text that is too long.
/// @return false on an error; file is not to be used then.
bool writeGlo(const GloScene& scene, std::vector<uint8_t>& file, std::string& error);

/// Values of one attribute for all vertices.
struct FloatAttribute
{
    std::string name;
    int componentCount;
    std::vector<float> values;   ///< vertex by vertex
    uint32_t type = type::FLOAT; ///< as which they are kept: this or UINT8, with values from 0 to 255
    uint32_t normalize = 0;      ///< flag: 255 stands for 1
};

/// Interleaves attributes in their order.
/// @param attributes  all for the same number of vertices.
VertexSet makeVertexSet(const std::vector<FloatAttribute>& attributes);

/// Appends a key of floats to a channel. All keys of a channel have the same number of values.
void addKey(Channel& channel, float time, const std::vector<float>& values);

} // namespace glo
