#pragma once

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

/// Puts solids that are drawn with the same things side by side, by counting: no solid is compared with another. Keeps
/// its memory from frame to frame.
class DrawGroups
{
public:
    /// By program, then material, then mesh, each in the order in which the first solid has it; solids of equal ones
    /// stay as they are. What is drawn with a material that keepsPlace() stays where it is, and what is before and
    /// after it too.
    /// @param solids  each with an appearance and a program.
    void order(std::vector<Solid*>& solids);

private:
    struct Entry
    {
        Solid* solid;
        uint32_t material;
        uint32_t mesh;
    };

    void begin();
    uint32_t numberMaterial(const Appearance& appearance);
    uint32_t numberMesh(const Mesh* mesh);
    void writeGroups(Solid** solids);
    void rankMaterials();

    uint64_t m_round = 0; ///< of numbering
    uint32_t m_programCount = 0;
    uint32_t m_meshCount = 0;
    std::vector<Entry> m_entries;
    std::vector<Entry> m_byMesh;
    std::vector<uint32_t> m_programs;       ///< of each material
    std::vector<uint32_t> m_materialCounts; ///< solids of each material; then where the next one of them goes
    std::vector<uint32_t> m_counts;         ///< the same of meshes, and of programs
};

} // namespace detail
} // namespace orv
