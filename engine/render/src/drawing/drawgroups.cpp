#include "drawgroups.h"

#include "orv/shaderprogram.h"

#include <algorithm>
#include <utility>

namespace orv::detail
{

namespace
{

/// Whether the picture depends on the order of drawing. Opaque materials do not blend; a depth offset depends on the
/// one before it (see RenderContext::setDepthOffset).
bool keepsPlace(const RenderState& state)
{
    const bool findsNearest =
        state.depthTestEnabled && state.depthWriteEnabled &&
        (state.depthFunction == DepthFunction::LESS || state.depthFunction == DepthFunction::LEQUAL);
    const bool writesAll =
        state.colourMaskRed && state.colourMaskGreen && state.colourMaskBlue && state.colourMaskAlpha;
    const bool isOffset = state.depthOffsetFactor != 0.0f || state.depthOffsetUnits != 0.0f;
    return !findsNearest || !writesAll || isOffset || state.stencilTestEnabled;
}

/// Turns counts into the position of each number's first element.
void addUp(std::vector<uint32_t>& counts)
{
    uint32_t place = 0;
    for (uint32_t& count : counts)
        place += std::exchange(count, place);
}

} // namespace

void DrawGroups::begin()
{
    m_round = nextRevision();
    m_programCount = 0;
    m_meshCount = 1; // number 0 stands for no mesh
    m_entries.clear();
    m_programs.clear();
    m_materialCounts.clear();
}

[[gnu::noinline]] void DrawGroups::add(Solid& solid, const Appearance& appearance)
{
    const DrawMark& material = appearance.getDrawMark();
    if (material.round == m_round || numberMaterial(appearance))
        return addNumbered(solid, material, numberMesh(solid.getMesh().get()));
    finish();
    m_solids.add(&solid);
    begin();
}

/// @return false for a material that keeps the places of its solids.
bool DrawGroups::numberMaterial(const Appearance& appearance)
{
    if (keepsPlace(appearance.getRenderState()))
        return false;
    appearance.getDrawMark() = {m_round, uint32_t(m_programs.size())};
    DrawMark& programMark = appearance.getShaderProgram()->getDrawMark();
    if (programMark.round != m_round)
        programMark = {m_round, m_programCount++};
    m_programs.push_back(programMark.number);
    m_materialCounts.push_back(0);
    return true;
}

DrawMark DrawGroups::numberMesh(const Mesh* mesh)
{
    if (!mesh)
        return {m_round, 0};
    DrawMark& mark = mesh->getDrawMark();
    if (mark.round != m_round)
        mark = {m_round, m_meshCount++};
    return mark;
}

/// Sorts by mesh first; the stable sort by material keeps that order within each material.
[[gnu::noinline]] void DrawGroups::finish()
{
    if (m_meshCount > 2)
        sortByMesh();
    rankMaterials();
    Solid** const solids = m_solids.extend(m_entries.size());
    uint32_t* const places = m_materialCounts.data();
    for (const Entry& entry : m_entries)
        solids[places[entry.material]++] = entry.solid;
}

void DrawGroups::sortByMesh()
{
    m_counts.assign(m_meshCount, 0);
    for (const Entry& entry : m_entries)
        ++m_counts[entry.mesh];
    addUp(m_counts);
    m_byMesh.resize(m_entries.size());
    for (const Entry& entry : m_entries)
        m_byMesh[m_counts[entry.mesh]++] = entry;
    std::copy(m_byMesh.begin(), m_byMesh.end(), m_entries.begin());
}

/// Turns the counts into the position of each material's first solid; materials of one program are adjacent.
void DrawGroups::rankMaterials()
{
    m_counts.assign(m_programCount, 0);
    for (size_t i = 0; i < m_programs.size(); ++i)
        m_counts[m_programs[i]] += m_materialCounts[i];
    addUp(m_counts);
    for (size_t i = 0; i < m_programs.size(); ++i)
    {
        const uint32_t count = m_materialCounts[i];
        m_materialCounts[i] = std::exchange(m_counts[m_programs[i]], m_counts[m_programs[i]] + count);
    }
}

} // namespace orv::detail
