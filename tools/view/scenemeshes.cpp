#include "scenemeshes.h"

#include "orv/detail/gloreader.h"

#include "orv/detail/glovertices.h"
#include "orv/filestreamsource.h"
#include "orv/mesh.h"
#include "orv/meshcache.h"

#include <algorithm>
#include <cmath>
#include <filesystem>
#include <utility>

namespace view
{

namespace glo = orv::detail::glo;
using orv::Matrix4f;
using orv::Vector3f;
using orv::Vector4f;

namespace
{

std::vector<Vector4f> readAttribute(const glo::Geometry& geometry, glo::FileVersion version, const char* name)
{
    const glo::VertexAttribute* attribute = glo::findAttribute(geometry, name);
    if (!attribute || !glo::isInside(*attribute, geometry.vertices))
        return {};
    std::vector<Vector4f> values(geometry.vertices.vertexCount);
    int component = 0;
    glo::forEachComponent(*attribute, geometry.vertices, glo::isNormalised(*attribute, version), 4,
                          [&](uint32_t vertex, float value)
                          {
                              values[vertex][component] = value;
                              component = (component + 1) % std::min(attribute->componentCount, 4);
                          });
    return values;
}

/// In world space, each vertex as the joints hold it that have a weight there.
void skin(const orv::Solid& solid, const MeshVertices& vertices, std::vector<Vector3f>& places)
{
    std::vector<Matrix4f> joints;
    for (int i = 0; i < std::min(solid.getJointCount(), orv::Solid::MAX_JOINTS); ++i)
        joints.push_back(solid.getJointTransform(i));
    for (size_t i = 0; i < vertices.positions.size(); ++i)
    {
        const Vector4f position(vertices.positions[i], 1.0f);
        Vector3f sum;
        for (int j = 0; j < 4; ++j)
        {
            const float number = vertices.joints[i][j];
            const size_t joint = number > 0.0f ? size_t(std::min(number, float(joints.size() - 1))) : 0;
            sum += (joints[joint] * position).xyz() * vertices.weights[i][j];
        }
        places.push_back(sum);
    }
}

/// Evenly spread, along a spiral from pole to pole.
void spreadOverSphere(float radius, std::vector<Vector3f>& positions)
{
    constexpr int COUNT = 400;
    constexpr float GOLDEN_ANGLE = 2.3999632f;
    for (int i = 0; i < COUNT; ++i)
    {
        const float height = 1.0f - 2.0f * (float(i) + 0.5f) / float(COUNT);
        const float side = std::sqrt(1.0f - height * height);
        const float angle = GOLDEN_ANGLE * float(i);
        positions.push_back(Vector3f(side * std::cos(angle), height, side * std::sin(angle)) * radius);
    }
}

} // namespace

MeshVertices readVertices(const glo::Geometry& geometry, glo::FileVersion version)
{
    MeshVertices vertices;
    for (const Vector4f& position : readAttribute(geometry, version, "a_position"))
        vertices.positions.push_back(position.xyz());
    vertices.joints = readAttribute(geometry, version, "a_joints");
    vertices.weights = readAttribute(geometry, version, "a_weights");
    if (vertices.weights.size() != vertices.joints.size())
        vertices.joints.clear();
    return vertices;
}

std::vector<uint16_t> readTriangles(const glo::PrimitiveSet& set, uint32_t vertexCount)
{
    std::vector<uint16_t> order;
    if (set.indices)
        order = set.indices->indices;
    else
        for (uint32_t i = 0; i < vertexCount && i <= 0xFFFF; ++i)
            order.push_back(uint16_t(i));
    const bool isFan = set.primitive == glo::primitive::TRIANGLE_FAN;
    const bool isStrip = set.primitive == glo::primitive::TRIANGLE_STRIP;
    if (std::any_of(order.begin(), order.end(), [=](uint16_t index) { return index >= vertexCount; }))
        return {};
    if (set.primitive == glo::primitive::TRIANGLES)
    {
        order.resize(order.size() / 3 * 3);
        return order;
    }

    std::vector<uint16_t> triangles;
    for (size_t i = 2; (isFan || isStrip) && i < order.size(); ++i)
    {
        const bool turns = isStrip && i % 2 != 0; // every other triangle of a strip is wound the other way
        const uint16_t first = order[isFan ? 0 : i - 2];
        triangles.insert(triangles.end(),
                         {turns ? order[i - 1] : first, turns ? first : order[i - 1], order[i]});
    }
    return triangles;
}

void SceneMeshes::load(const std::string& path, const orv::AssetCachePool& pool)
{
    m_meshes.clear();
    const std::filesystem::path file(path);
    orv::FileStreamSource folder(file.has_parent_path() ? file.parent_path().c_str() : ".");
    const orv::SharedPtr<orv::Stream> stream = folder.open(file.filename().c_str(), false);
    if (!stream)
        return;
    orv::detail::GloReader reader(stream, path.c_str());
    if (!reader.read())
        return;

    // The loader makes one mesh of each primitive set, in the order of the file.
    std::vector<const orv::Mesh*> meshes;
    pool.getMeshCache()->forEachAsset([&](const orv::Mesh::Ptr& mesh) { meshes.push_back(mesh.get()); });
    size_t next = 0;
    for (const glo::Geometry& geometry : reader.scene().geometries)
    {
        const auto vertices = std::make_shared<MeshVertices>(readVertices(geometry, reader.version()));
        for (const glo::PrimitiveSet& set : geometry.primitiveSets)
        {
            if (next == meshes.size())
                return m_meshes.clear(); // the file is another one by now
            add(*meshes[next++], {vertices, readTriangles(set, uint32_t(vertices->positions.size()))});
        }
    }
}

void SceneMeshes::add(const orv::Mesh& mesh, MeshTriangles triangles)
{
    m_meshes[&mesh] = std::move(triangles);
}

const MeshTriangles* SceneMeshes::find(const orv::Mesh* mesh) const
{
    const auto found = m_meshes.find(mesh);
    return found != m_meshes.end() ? &found->second : nullptr;
}

void SceneMeshes::placeVertices(const orv::Solid& solid, std::vector<Vector3f>& places) const
{
    places.clear();
    const orv::Mesh* mesh = solid.getMesh().get();
    const MeshTriangles* known = find(mesh);
    if (known && solid.getJointCount() > 0 && !known->vertices->joints.empty())
        return skin(solid, *known->vertices, places);
    if (known)
        places = known->vertices->positions;
    else if (mesh)
        spreadOverSphere(std::max(mesh->getHeader().boundingRadius, 0.0f), places);
    for (Vector3f& place : places)
        place = (solid.getWorldTransform() * Vector4f(place, 1.0f)).xyz();
}

} // namespace view
