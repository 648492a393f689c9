#pragma once

#include "convert/report.h"

#include <array>
#include <vector>

struct aiMesh;

namespace convert
{

/// The joints of a vertex, by number of the mesh's bones, with weights of the sum 1, strongest first. Unused entries
/// are 0.
struct Influences
{
    std::array<uint16_t, 4> joints = {};
    std::array<float, 4> weights = {};
};

/// The strongest four of each vertex, with their weights scaled to the sum of all. A vertex without bones follows the
/// mesh's own node, which has the number after the last bone.
/// @return for each vertex; empty for a mesh without bones.
std::vector<Influences> gatherInfluences(const aiMesh& mesh, Report& report);

} // namespace convert
