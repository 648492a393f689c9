#pragma once

#include "orv/detail/drawmark.h"
#include "orv/detail/framelist.h"

#include <cstddef>
#include <cstdint>
#include <vector>

namespace orv
{

class Appearance;
class Mesh;
class Solid;

namespace detail
{

/// Puts solids that are drawn with the same things side by side, by counting: no solid is compared with another. By
/// program, then material, then mesh, each in the order in which a solid has it first; solids of equal ones stay as they
/// came. A solid whose material's state makes the order matter stays where it is, and what came before and after it too.
/// Keeps its memory from frame to frame.
class DrawGroups
{
public:
    /// @param solids  borrowed: where the solids go.
    explicit DrawGroups(FrameList<Solid*>& solids) : m_solids(solids) {}

    void begin();
    /// @param appearance  the solid's; it has a program.
    void add(Solid& solid, const Appearance& appearance);
    void finish();

private:
    struct Entry
    {
        Solid* solid;
        uint32_t material;
        uint32_t mesh;
    };

    void addNumbered(Solid& solid, const DrawMark& material, const DrawMark& mesh);
    void addNew(Solid& solid, const Appearance& appearance);
    bool numberMaterial(const Appearance& appearance);
    DrawMark numberMesh(const Mesh* mesh);
    void sortByMesh();
    void rankMaterials();

    FrameList<Solid*>& m_solids;
    uint64_t m_round = 0; ///< of numbering
    uint32_t m_programCount = 0;
    uint32_t m_meshCount = 0;
    FrameList<Entry> m_entries;
    std::vector<Entry> m_byMesh;
    std::vector<uint32_t> m_programs;       ///< of each material
    std::vector<uint32_t> m_materialCounts; ///< solids of each material; then where the next one of them goes
    std::vector<uint32_t> m_counts;         ///< the same of meshes, and of programs
};

} // namespace detail
} // namespace orv
