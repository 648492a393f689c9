#pragma once

#include "orv/appearance.h"
#include "orv/detail/drawmark.h"
#include "orv/detail/framelist.h"
#include "orv/mesh.h"
#include "orv/solid.h"

#include <cstddef>
#include <cstdint>
#include <vector>

namespace orv
{

namespace detail
{

/// Groups solids by program, then material, then mesh, with a counting sort. Groups are in the order of their first
/// solid, and solids of a group keep their order. A solid whose material depends on the order of drawing stays in
/// place, and no solid moves across it. Keeps its memory from frame to frame.
class DrawGroups
{
public:
    /// @param solids  borrowed: where the solids go.
    explicit DrawGroups(FrameList<Solid*>& solids) : m_solids(solids) {}

    void begin();
    /// Adds a solid whose material and mesh another had since begin().
    /// @param appearance  the solid's, or null.
    /// @return false for any other solid.
    bool addKnown(Solid& solid, const Appearance* appearance);
    /// Adds a solid that addKnown() has not taken.
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
    std::vector<uint32_t> m_materialCounts; ///< solids of each material; later the position of its next solid
    std::vector<uint32_t> m_counts;         ///< the same for meshes and for programs
};

[[gnu::always_inline]] inline void DrawGroups::addNumbered(Solid& solid, const DrawMark& material,
                                                           const DrawMark& mesh)
{
    const Entry entry{&solid, material.number, mesh.number};
    ++m_materialCounts.data()[entry.material];
    m_entries.add(entry);
}

[[gnu::always_inline]] inline bool DrawGroups::addKnown(Solid& solid, const Appearance* appearance)
{
    const Mesh* const mesh = solid.getMesh().get();
    if (!appearance || appearance->getDrawMark().round != m_round || !mesh ||
        mesh->getDrawMark().round != m_round || !m_entries.hasRoom()) [[unlikely]]
        return false;
    addNumbered(solid, appearance->getDrawMark(), mesh->getDrawMark());
    return true;
}

} // namespace detail
} // namespace orv
