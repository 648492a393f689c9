#include "markings.h"

#include "stage/solidvisitor.h"
#include "stage/stage.h"

#include "orv/indexbuffercache.h"
#include "orv/meshgeometry.h"
#include "orv/scenebounds.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <utility>

namespace view
{

using orv::Colour4f;
using orv::Matrix4f;
using orv::SceneNode;
using orv::Solid;
using orv::Vector3f;

namespace
{

const Colour4f BOUNDS_COLOUR(0.95f, 0.55f, 0.1f, 1.0f);
const Colour4f SKELETON_COLOUR(0.1f, 0.75f, 0.95f, 1.0f);
const Colour4f GRID_COLOUR(0.5f, 0.5f, 0.5f, 0.6f);
constexpr float AXES_SHARE = 0.04f; // of the scene's size
constexpr float CELL_SHARE = 0.1f;  // likewise, before it is rounded to a power of ten
constexpr int MOST_GRID_CELLS = 200;

constexpr const char* NAMES[] = {"bounds", "skeletons", "axes", "grid", "wireframe", "shadows"};
static_assert(std::size(NAMES) == size_t(Marking::COUNT));

/// The same position and directions, with unit length.
Matrix4f withoutScale(const Matrix4f& transform)
{
    Matrix4f made = transform;
    for (int i = 0; i < 3; ++i)
    {
        const float length = orv::length(transform.columns[i].xyz());
        made.columns[i] = length > 0.0f ? transform.columns[i] / length : transform.columns[i];
    }
    return made;
}

template <class Operation>
void forEachNode(SceneNode& node, const Operation& operation)
{
    operation(node);
    for (const orv::SharedPtr<SceneNode>& child : node.getChildren())
        forEachNode(*child, operation);
}

/// Each edge once, as two indices of a vertex.
std::vector<uint16_t> listEdges(const std::vector<uint32_t>& triangles)
{
    std::vector<std::pair<uint32_t, uint32_t>> edges;
    edges.reserve(triangles.size());
    for (size_t i = 0; i + 2 < triangles.size(); i += 3)
    {
        for (size_t side = 0; side < 3; ++side)
            edges.emplace_back(std::minmax(triangles[i + side], triangles[i + (side + 1) % 3]));
    }
    std::sort(edges.begin(), edges.end());
    edges.erase(std::unique(edges.begin(), edges.end()), edges.end());
    std::vector<uint16_t> indices;
    for (const auto& [from, to] : edges)
    {
        indices.push_back(uint16_t(from));
        indices.push_back(uint16_t(to));
    }
    return indices;
}

/// Of the grid: a tenth of the scene, rounded to a power of ten.
float findCell(const Vector3f& low, const Vector3f& high)
{
    const float size = orv::length(high - low);
    return size > 0.0f && std::isfinite(size) ? std::pow(10.0f, std::round(std::log10(size * CELL_SHARE)))
                                              : 1.0f;
}

} // namespace

Marking findMarking(const std::string& name)
{
    size_t i = 0;
    while (i < std::size(NAMES) && name != NAMES[i])
        ++i;
    return Marking(i);
}

std::string listMarkings()
{
    std::string list;
    for (const char* name : NAMES)
        list += (list.empty() ? "" : ", ") + std::string(name);
    return list;
}

Markings::Markings(const orv::RenderContext::Ptr& context)
    : m_context(context)
    , m_pool(orv::makeShared<orv::AssetCachePool>())
    , m_inside(orv::makeShared<orv::DebugLines>(*m_pool))
    , m_above(orv::makeShared<orv::DebugLines>(*m_pool))
{
    m_above->setDepthTested(false);
}

Markings::~Markings()
{
    m_edges.clear();
    m_shadows.reset();
    m_inside.reset();
    m_above.reset();
    m_pool->flush();
    m_pool->flush();
}

std::string Markings::describe() const
{
    std::string text;
    for (size_t i = 0; i < m_shown.size(); ++i)
    {
        if (!m_shown[i])
            continue;
        text += (text.empty() ? "" : ", ") + std::string(NAMES[i]);
        if (Marking(i) == Marking::GRID && m_isMeasured)
        {
            char cell[40];
            std::snprintf(cell, sizeof cell, " of %g", double(findCell(m_low, m_high)));
            text += cell;
        }
    }
    return text;
}

void Markings::forget()
{
    m_edges.clear();
    m_shadows.reset();
    m_isMeasured = false;
    m_pool->flush();
}

void Markings::draw(Stage& stage, int width, int height)
{
    drawShadows(stage);
    if (shows(Marking::WIREFRAME))
        drawWireframe(stage, width, height);
    else
        stage.draw(width, height);

    m_inside->clear();
    m_above->clear();
    if (shows(Marking::AXES) || shows(Marking::GRID))
        measure(stage);
    if (shows(Marking::GRID))
        addGrid();
    if (shows(Marking::BOUNDS))
        addBounds(stage);
    if (shows(Marking::SKELETONS))
        addSkeletons(stage);
    if (shows(Marking::AXES))
        addAxes(stage);
    m_inside->draw(*m_context, stage.getCamera());
    m_above->draw(*m_context, stage.getCamera());
}

/// Materials receive shadows while they are shown.
void Markings::drawShadows(Stage& stage)
{
    if (!shows(Marking::SHADOWS))
        return m_shadows.reset();
    if (!m_shadows)
    {
        m_shadows = orv::makeShared<orv::ShadowMap>(m_context, stage.getStudio().getPool());
        m_shadows->attach(stage.getScene());
    }
    m_shadows->render(stage.getScene(), &stage.getCamera(), SceneNode::VISIBLE, SceneNode::VISIBLE);
}

/// Replaces the meshes of solids by their edges during drawing; materials, joints and all else are unchanged.
void Markings::drawWireframe(Stage& stage, int width, int height)
{
    std::vector<std::pair<Solid*, orv::SharedPtr<orv::Mesh>>> changed;
    forEachSolid(stage.getScene(),
                 [&](Solid& solid)
                 {
                     const orv::SharedPtr<orv::Mesh> mesh = solid.getMesh();
                     const orv::SharedPtr<orv::Mesh> edges = findEdges(mesh);
                     if (!edges)
                         return;
                     changed.emplace_back(&solid, mesh);
                     solid.setMesh(edges);
                 });
    stage.draw(width, height);
    for (const auto& [solid, mesh] : changed)
        solid->setMesh(mesh);
}

/// @return empty for what has no triangles.
orv::SharedPtr<orv::Mesh> Markings::findEdges(const orv::SharedPtr<orv::Mesh>& mesh)
{
    if (!mesh || !mesh->getGeometry() || mesh->getGeometry()->getTriangles().empty())
        return {};
    Edges& edges = m_edges[mesh.get()];
    if (edges.triangles)
        return edges.lines;
    edges.triangles = mesh;
    const std::vector<uint16_t> indices = listEdges(mesh->getGeometry()->getTriangles());
    const orv::IndexBuffer::Ptr buffer = m_pool->getIndexBufferCache()->create(
        orv::IndexBuffer::Primitive::LINES, unsigned(indices.size()), nullptr, nullptr);
    if (!buffer || !buffer->getIndices())
        return {};
    std::copy(indices.begin(), indices.end(), buffer->getIndices());
    buffer->commit();
    edges.lines = orv::makeShared<orv::Mesh>(orv::MeshHeader(), buffer, mesh->getVertexBuffer());
    return edges.lines;
}

void Markings::addBounds(Stage& stage)
{
    forEachSolid(stage.getScene(),
                 [&](const Solid& solid)
                 {
                     const orv::Box bounds = orv::getOwnBounds(solid).box;
                     if (!bounds.isEmpty() && getDerivedFlags(solid, SceneNode::VISIBLE))
                         m_inside->addBox(bounds.lowest, bounds.highest, solid.getWorldTransform(),
                                          BOUNDS_COLOUR);
                 });
}

void Markings::addSkeletons(Stage& stage)
{
    bool hasJoints = false;
    forEachSolid(stage.getScene(),
                 [&](Solid& solid)
                 {
                     hasJoints = hasJoints || solid.getJointCount() > 0;
                     m_above->addJoints(solid, SKELETON_COLOUR);
                 });
    if (!hasJoints)
        m_above->addSkeleton(stage.getTopNode(), SKELETON_COLOUR);
}

void Markings::addAxes(Stage& stage)
{
    const float length = orv::length(m_high - m_low) * AXES_SHARE;
    forEachNode(stage.getTopNode(), [&](const SceneNode& node)
                { m_above->addAxes(withoutScale(node.getWorldTransform()), length); });
}

/// At height 0, or directly below a scene above that.
void Markings::addGrid()
{
    const float cell = findCell(m_low, m_high);
    const Vector3f middle = (m_low + m_high) * 0.5f;
    const bool isAtGround = m_low.y <= cell && m_high.y >= 0.0f;
    const Matrix4f place = orv::translationMatrix(
        Vector3f(std::round(middle.x / cell) * cell, isAtGround ? 0.0f : std::floor(m_low.y / cell) * cell,
                 std::round(middle.z / cell) * cell));
    const float reach = std::max(m_high.x - m_low.x, m_high.z - m_low.z);
    const int half = std::min(int(std::ceil(reach / cell)) + 1, MOST_GRID_CELLS / 2);
    m_inside->addGrid(place, 2 * half, cell, GRID_COLOUR);
}

void Markings::measure(Stage& stage)
{
    if (m_isMeasured)
        return;
    m_isMeasured = true;
    const orv::Box bounds = orv::getWorldBounds(stage.getScene()).box;
    m_low = bounds.isEmpty() ? Vector3f() : bounds.lowest;
    m_high = bounds.isEmpty() ? Vector3f() : bounds.highest;
}

} // namespace view
