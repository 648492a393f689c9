#include "converttest.h"

#include "convert/meshes/meshes.h"
#include "convert/meshes/parts.h"
#include "convert/scene/lights.h"
#include "convert/scene/placement.h"

#include "orv/detail/glovertices.h"
#include "orv/indexbuffer.h"
#include "orv/mesh.h"
#include "orv/solid.h"
#include "orv/vertexbuffer.h"

#include <assimp/light.h>
#include <assimp/mesh.h>

#include <algorithm>
#include <cmath>
#include <deque>
#include <random>
#include <set>

using namespace orv;
using convert::Corners;
using convert::Influences;

namespace
{

using Attributes = std::set<std::string>;

/// Everything of one kind that a scene draws.
struct Drawn
{
    int solids = 0;
    int vertices = 0; // that are drawn, by the indices
    Attributes attributes;
};

std::map<IndexBuffer::Primitive, Drawn> collectDrawn(const SceneNode& node)
{
    std::map<IndexBuffer::Primitive, Drawn> all;
    std::vector<const SceneNode*> nodes = {&node};
    while (!nodes.empty())
    {
        const SceneNode* next = nodes.back();
        nodes.pop_back();
        for (const SharedPtr<SceneNode>& child : next->getChildren())
            nodes.push_back(child.get());
        if (next->getNodeType() != Solid::NODE_TYPE)
            continue;
        const Mesh& mesh = *static_cast<const Solid*>(next)->getMesh();
        Drawn& drawn = all[mesh.getIndexBuffer()->getPrimitive()];
        ++drawn.solids;
        drawn.vertices += mesh.getIndexBuffer()->getCount();
        for (const detail::AttribRecord& attribute : mesh.getVertexBuffer()->getAttribs())
            drawn.attributes.insert(attribute.name);
    }
    return all;
}

/// A grid of squares, two triangles each, in random order.
Corners makeShuffledGrid(uint32_t edge)
{
    std::vector<Corners> triangles;
    for (uint32_t y = 0; y + 1 < edge; ++y)
    {
        for (uint32_t x = 0; x + 1 < edge; ++x)
        {
            const uint32_t i = y * edge + x;
            triangles.push_back({i, i + 1, i + edge});
            triangles.push_back({i + 1, i + edge + 1, i + edge});
        }
    }
    std::shuffle(triangles.begin(), triangles.end(), std::mt19937(1));
    Corners corners;
    for (const Corners& triangle : triangles)
        corners.insert(corners.end(), triangle.begin(), triangle.end());
    return corners;
}

/// Vertices that a cache of 16 does not have, per triangle.
double countMisses(const Corners& corners)
{
    std::deque<uint32_t> cache;
    size_t misses = 0;
    for (const uint32_t vertex : corners)
    {
        if (std::find(cache.begin(), cache.end(), vertex) != cache.end())
            continue;
        ++misses;
        cache.push_back(vertex);
        if (cache.size() > 16)
            cache.pop_front();
    }
    return double(misses) * 3.0 / double(corners.size());
}

/// In an order of their own, whatever the order they are in and the corner they begin with.
std::vector<std::array<uint32_t, 3>> listFaces(const std::vector<Corners>& parts)
{
    std::vector<std::array<uint32_t, 3>> faces;
    for (const Corners& part : parts)
    {
        for (size_t i = 0; i < part.size(); i += 3)
        {
            std::array<uint32_t, 3>& face = faces.emplace_back();
            std::copy_n(&part[i], 3, face.begin());
            std::rotate(face.begin(), std::min_element(face.begin(), face.end()), face.end());
        }
    }
    std::sort(faces.begin(), faces.end());
    return faces;
}

} // namespace

// Fault caught: kinds of faces or attributes that get lost; vertices that are not joined; faces without an area that
// are kept, or not counted.
TEST_F(ConvertTest, geometryIsKept)
{
    using Primitive = IndexBuffer::Primitive;
    m_folder.write("mixed.obj",
                   std::string("v 0 0 0\nv 1 0 0\nv 1 1 0\nv 0 1 0\nv 1 0 0\nvt 0 0\nvt 1 0\nvt 1 1\nvt 0 1\n"
                               "f 1/1 2/2 3/3 4/4\nf 1/1 2/2 5/2\nl 1 2 3\np 4\np 3\n"));
    const Attributes plain = {"a_position", "a_normal"};
    const Attributes textured = {"a_position", "a_normal", "a_uv0"};
    const std::string models = MODELS;
    const struct
    {
        std::string file;
        Primitive primitive;
        int vertices;
        Attributes attributes;
        const char* report;
    } cases[] = {
        {"mixed.obj", Primitive::TRIANGLES, 6, textured, "1 degenerate face"},
        {"mixed.obj", Primitive::LINES, 4, {"a_position", "a_uv0"}, "2 lines"},
        {"mixed.obj", Primitive::POINTS, 2, {"a_position", "a_uv0"}, "2 points"},
        {models + "PLY/cube.ply", Primitive::TRIANGLES, 36, plain,
         "24 vertices"}, // normals for its 8 corners
        {models + "Collada/cube_with_2UVs.DAE",
         Primitive::TRIANGLES,
         36,
         {"a_position", "a_normal", "a_uv0", "a_uv1"},
         "24 vertices"},
        {models + "OBJ/cube_with_vertexcolors.obj",
         Primitive::TRIANGLES,
         36,
         {"a_position", "a_normal", "a_colour"},
         "24 vertices"},
        {models + "glTF2/glTF-Sample-Models/AnimatedMorphCube-glTF/AnimatedMorphCube.gltf",
         Primitive::TRIANGLES, 36 * 64, plain, "64 moving shapes"},
    };
    for (const auto& item : cases)
    {
        SCOPED_TRACE(item.file);
        const Glo::Ptr loaded = convertAndLoad("'" + item.file + "' out.glo", "out.glo");
        ASSERT_TRUE(loaded);
        const Drawn drawn = collectDrawn(*loaded->getTopNode())[item.primitive];
        EXPECT_EQ(item.vertices, drawn.vertices);
        EXPECT_EQ(item.attributes, drawn.attributes);
        EXPECT_TRUE(reports(item.report)) << m_outcome.output;
    }
}

// Fault caught: faces that are lost or turned over where a mesh is split, parts that are over the limits, and
// joints that no part needs.
TEST(ConvertParts, splitsWithinTheLimits)
{
    constexpr uint32_t EDGE = 260; // 67,600 vertices
    const Corners grid = makeShuffledGrid(EDGE);
    EXPECT_GT(countMisses(grid), 2.5);
    std::vector<Influences> chain; // three joints a vertex, 87 in all, along the rows
    for (uint32_t i = 0; i < EDGE * EDGE; ++i)
    {
        const auto joint = uint16_t(i % EDGE / 3);
        chain.push_back(
            {{joint, uint16_t((joint + 1) % 87), uint16_t((joint + 2) % 87)}, {0.5f, 0.3f, 0.2f}});
    }
    for (const std::vector<Influences>& influences : {std::vector<Influences>(), chain})
    {
        const std::vector<Corners> parts = convert::splitFaces(grid, 3, influences);
        EXPECT_EQ(listFaces({grid}), listFaces(parts));
        EXPECT_LE(parts.size(), influences.empty() ? 2u : 10u);
        double misses = 0.0;
        for (const Corners& part : parts)
        {
            EXPECT_LE(std::set<uint32_t>(part.begin(), part.end()).size(), 65536u);
            EXPECT_LE(convert::listJoints(part, influences).size(), 20u);
            misses += countMisses(part) * double(part.size()) / double(grid.size());
        }
        EXPECT_LT(misses, 0.8);
    }
}

// Fault caught: weights that do not sum to 1, a strong one dropped for a weak one, vertices that no joint moves.
TEST(ConvertSkins, keepsTheStrongestWeights)
{
    const struct
    {
        std::vector<float> weights; // by bone
        std::array<uint16_t, 4> joints;
        std::array<float, 4> kept;
        uint64_t cut;
    } cases[] = {
        {{0.25f, 0.75f, 0, 0, 0, 0}, {1, 0, 0, 0}, {0.75f, 0.25f}, 0},
        {{0.1f, 0.1f, 0.3f, 0.1f, 0.2f, 0.2f}, {2, 4, 5, 0}, {0.375f, 0.25f, 0.25f, 0.125f}, 1},
        {{0, 0, 0, 2.0f, 0, 6.0f}, {5, 3, 0, 0}, {0.75f, 0.25f}, 0}, // sums that are not 1
        {{0, 0, 0, 0, 0, 0}, {6, 0, 0, 0}, {1.0f}, 0},               // with the mesh
        {{-1.0f, NAN, 0.5f, 0, 0, 0}, {2, 0, 0, 0}, {1.0f}, 0},
    };
    for (const auto& item : cases)
    {
        aiMesh mesh;
        mesh.mNumVertices = 1;
        mesh.mNumBones = unsigned(item.weights.size());
        mesh.mBones = new aiBone*[item.weights.size()];
        for (size_t i = 0; i < item.weights.size(); ++i)
        {
            mesh.mBones[i] = new aiBone;
            mesh.mBones[i]->mNumWeights = 1;
            mesh.mBones[i]->mWeights = new aiVertexWeight[1]{{0, item.weights[i]}};
        }
        convert::Report report;
        const std::vector<Influences> made = convert::gatherInfluences(mesh, report);
        ASSERT_EQ(1u, made.size());
        EXPECT_EQ(item.joints, made[0].joints);
        for (size_t i = 0; i < 4; ++i)
            EXPECT_FLOAT_EQ(item.kept[i], made[0].weights[i]) << i;
        EXPECT_EQ(item.cut, report.getFigures().at("vertices-with-more-than-four-joints"));
    }
}

// Fault caught: tangents across a mirrored picture that cancel out, or that lean out of the surface; normals of no
// length, or of the wrong side, that are taken as they are.
TEST(ConvertSurfaces, tangentsFollowThePicture)
{
    // Two squares side by side in a plane; the picture lies on the second one mirrored.
    const aiVector3D places[] = {{0, 0, 0}, {1, 0, 0}, {1, 1, 0}, {0, 1, 0}, {2, 0, 0}, {2, 1, 0}};
    const aiVector3D uvs[] = {{0, 0, 0}, {1, 0, 0}, {1, 1, 0}, {0, 1, 0}, {0, 0, 0}, {0, 1, 0}};
    const unsigned faces[][3] = {{0, 1, 2}, {0, 2, 3}, {1, 4, 5}, {1, 5, 2}};
    aiMesh mesh;
    mesh.mNumVertices = 6;
    mesh.mVertices = new aiVector3D[6];
    std::copy(places, places + 6, mesh.mVertices);
    mesh.mTextureCoords[0] = new aiVector3D[6];
    std::copy(uvs, uvs + 6, mesh.mTextureCoords[0]);
    mesh.mNumFaces = 4;
    mesh.mFaces = new aiFace[4];
    for (size_t i = 0; i < 4; ++i)
    {
        mesh.mFaces[i].mNumIndices = 3;
        mesh.mFaces[i].mIndices = new unsigned[3]{faces[i][0], faces[i][1], faces[i][2]};
    }
    convert::ConvertedMaterial material;
    material.hasNormalMap = true;
    convert::Report report;
    for (const float z : {1.0f, 0.0f, -1.0f})
    {
        SCOPED_TRACE(z);
        delete[] mesh.mNormals;
        mesh.mNormals = new aiVector3D[6];
        std::fill_n(mesh.mNormals, 6, aiVector3D(0, 0, z));
        const std::vector<convert::MeshPart> parts = convert::convertMesh(mesh, material, report);
        ASSERT_EQ(1u, parts.size());
        const glo::Geometry& geometry = parts[0].geometry;
        EXPECT_EQ(8u, geometry.vertices.vertexCount); // the two that both squares have are there twice
        const auto read = [&](const char* name)
        {
            std::vector<float> values;
            glo::forEachComponent(*glo::findAttribute(geometry, name), geometry.vertices, false, 3,
                                  [&](uint32_t, float value) { values.push_back(value); });
            return values;
        };
        const std::vector<float> position = read("a_position");
        const std::vector<float> normal = read("a_normal");
        const std::vector<float> tangent = read("a_tangent");
        const std::vector<float> binormal = read("a_binormal");
        float sum = 0.0f;
        for (size_t i = 0; i < position.size(); i += 3)
        {
            EXPECT_FLOAT_EQ(1.0f, normal[i + 2]);
            EXPECT_FLOAT_EQ(1.0f, std::fabs(tangent[i]));
            EXPECT_FLOAT_EQ(1.0f, binormal[i + 1]); // v grows upwards in both
            EXPECT_TRUE(position[i] == 1.0f || tangent[i] * (1.0f - position[i]) > 0.0f) << position[i];
            sum += tangent[i];
        }
        EXPECT_FLOAT_EQ(0.0f, sum);
    }
}

// Fault caught: rounded edges on a glTF mesh without normals, which the format has flat; and flat ones in formats where
// such meshes are meant to be smooth.
TEST(ConvertMesh, missingNormals)
{
    aiMesh mesh; // two triangles that meet at 45 degrees
    const aiVector3D places[] = {{0, 0, 0}, {0, 1, 0}, {-1, 0, 0}, {1, 0, -1}};
    const unsigned faces[][3] = {{0, 1, 2}, {0, 3, 1}};
    mesh.mNumVertices = 4;
    mesh.mVertices = new aiVector3D[4];
    std::copy(places, places + 4, mesh.mVertices);
    mesh.mNumFaces = 2;
    mesh.mFaces = new aiFace[2];
    for (size_t i = 0; i < 2; ++i)
    {
        mesh.mFaces[i].mNumIndices = 3;
        mesh.mFaces[i].mIndices = new unsigned[3]{faces[i][0], faces[i][1], faces[i][2]};
    }
    convert::ConvertedMaterial material;
    convert::Report report;
    for (const bool isFlat : {false, true})
    {
        material.isFlat = isFlat;
        const std::vector<convert::MeshPart> parts = convert::convertMesh(mesh, material, report);
        ASSERT_EQ(1u, parts.size());
        EXPECT_EQ(isFlat ? 6u : 4u, parts[0].geometry.vertices.vertexCount);
    }
    mesh.mColors[0] = new aiColor4D[4]; // black
    EXPECT_FALSE(convert::isColoured(mesh, false));
    EXPECT_TRUE(convert::isColoured(mesh, true));
}

// Fault caught: lights by the square of the distance that light far things as if they were near.
TEST(ConvertLights, followTheSquareOfTheDistance)
{
    aiLight source;
    source.mType = aiLightSource_POINT;
    source.mAttenuationConstant = source.mAttenuationLinear = 0.0f;
    source.mAttenuationQuadratic = 1.0f;
    for (const float strength : {0.5f, 3.0f, 200.0f})
    {
        source.mColorDiffuse = aiColor3D(strength, strength, strength);
        glo::LightDefinition made;
        convert::Report report;
        ASSERT_TRUE(convert::convertLight(source, made, report));
        for (float share = 0.1f; share < 4.0f; share += 0.1f) // of the distance where it lights in full
        {
            const float distance = share * std::sqrt(strength);
            const float line = made.intensity * std::clamp(1.0f - distance / made.attenuationFar, 0.0f, 1.0f);
            const float square = strength / (distance * distance);
            EXPECT_NEAR(std::min(square, 1.0f), std::min(line, 1.0f), 0.26f)
                << strength << " at " << distance;
        }
    }
}

// Fault caught: a node that is flat in one or two of its axes and comes out turned, or with a node for shear.
TEST(ConvertPlacement, keepsFlatNodes)
{
    const aiQuaternion turn(aiVector3D(1, 2, 3).Normalize(), 1.1f);
    for (unsigned zeros = 0; zeros < 8; ++zeros)
    {
        const aiVector3D scale(zeros & 1 ? 0.0f : 2.0f, zeros & 2 ? 0.0f : -1.0f, zeros & 4 ? 0.0f : 3.0f);
        const aiMatrix4x4 wanted = convert::compose(aiVector3D(4, 5, 6), turn, scale);
        glo::NodeData node;
        EXPECT_TRUE(convert::place(node, wanted)) << zeros;
        const Vector3f axis(node.rotation.x, node.rotation.y, node.rotation.z);
        const Quaternionf rotation = quaternionFromAxisAngle(axis, Anglef::fromRadians(node.rotation.w));
        const Matrix4f made = toMatrix4(rotation) * scaleMatrix(node.scale);
        const Matrix4f expected = convert::toMatrix(wanted);
        for (int column = 0; column < 3; ++column)
            EXPECT_LT(length(made[column] - expected[column]), 1e-5f) << zeros;
    }
}

// Fault caught: transforms that components cannot hold and that helper nodes get wrong.
TEST(ConvertPlacement, splitsShear)
{
    std::mt19937 random(1);
    std::uniform_real_distribution<float> number(-2.0f, 2.0f);
    for (int round = 0; round < 50; ++round)
    {
        aiMatrix4x4 wanted;
        for (unsigned i = 0; i < 12; ++i)
            wanted[i / 4][i % 4] = round == 0 && i % 4 == 1 ? 0.0f : number(random); // the first is flat
        const convert::Nested nested = convert::splitShear(wanted);
        glo::NodeData outer;
        glo::NodeData inner;
        EXPECT_TRUE(convert::place(outer, nested.outer));
        EXPECT_TRUE(convert::place(inner, nested.inner));
        const Matrix4f made = outer.transform * inner.transform;
        const Matrix4f expected = convert::toMatrix(wanted);
        for (int column = 0; column < 4; ++column)
            EXPECT_LT(length(made[column] - expected[column]), 1e-4f) << round;
    }
}
