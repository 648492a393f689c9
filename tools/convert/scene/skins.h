#pragma once

#include "convert/report.h"

#include <array>
#include <vector>

struct aiMesh;

namespace convert
{

/// What moves a vertex: joints, by the numbers of the mesh's bones, with weights that sum to 1, the strongest first.
/// Places that are not used are 0.
struct Influences
{
    std::array<uint16_t, 4> joints = {};
    std::array<float, 4> weights = {};
};

/// The strongest four of each vertex, with their weights scaled up to what all of them had.
/// A vertex that no bone moves goes with the mesh's own node, which has the number after the last bone's.
/// @return for each vertex; empty for a mesh without bones.
std::vector<Influences> gatherInfluences(const aiMesh& mesh, Report& report);

} // namespace convert
