#include "orv/meshutil.h"

#include "facilitytest.h"

#include <array>
#include <cmath>
#include <cstring>
#include <map>

using namespace orv;
using support::LogCapture;

namespace
{

/// What the maker of a mesh gave to GL.
struct Geometry
{
    std::vector<Vector3f> positions;
    std::vector<Vector3f> normals;
    std::vector<Vector2f> uvs;
    std::vector<unsigned short> indices;
};

class MeshTest : public FacilityTest
{
protected:
    void SetUp() override
    {
        GlTest::SetUp();
        glcalls::replace(glBufferData,
                         [this](GLenum target, GLsizeiptr size, const void* data, GLenum)
                         {
                             const auto* bytes = static_cast<const uint8_t*>(data);
                             m_uploads[target].assign(bytes, bytes + size);
                         });
    }

    void flush() override
    {
        indexBuffers->flush();
        meshes->flush();
        vertexBuffers->flush();
    }

    /// Interleaved in reverse: texture coordinate, normal, position.
    Geometry readGeometry() const
    {
        Geometry geometry;
        const std::vector<uint8_t>& vertices = m_uploads.at(GL_ARRAY_BUFFER);
        for (size_t i = 0; i < vertices.size(); i += 32)
        {
            std::array<float, 8> v;
            std::memcpy(v.data(), &vertices[i], 32);
            geometry.uvs.push_back(Vector2f(v[0], v[1]));
            geometry.normals.push_back(Vector3f(v[2], v[3], v[4]));
            geometry.positions.push_back(Vector3f(v[5], v[6], v[7]));
        }
        const std::vector<uint8_t>& indices = m_uploads.at(GL_ELEMENT_ARRAY_BUFFER);
        geometry.indices.resize(indices.size() / 2);
        std::memcpy(geometry.indices.data(), indices.data(), indices.size());
        return geometry;
    }

    SharedPtr<IndexBufferCache> indexBuffers = makeShared<IndexBufferCache>();
    SharedPtr<VertexBufferCache> vertexBuffers = makeShared<VertexBufferCache>();
    SharedPtr<MeshCache> meshes = makeShared<MeshCache>(indexBuffers, vertexBuffers);

private:
    std::map<GLenum, std::vector<uint8_t>> m_uploads;
};

} // namespace

// Fault caught: a face turned inside out, a normal of the wrong sign, an index out of range, a radius too small.
TEST_F(MeshTest, shapesAreSound)
{
    const Vector2f uvScale(2, 3);
    const struct
    {
        const char* name;
        Mesh::Ptr mesh;
        Geometry geometry;
        size_t vertexCount;
        int triangleCount;
        float radius;
    } cases[] = {{"square", createSquareMesh(*meshes, uvScale), readGeometry(), 4, 2, std::sqrt(2.0f)},
                 {"cube", createCubeMesh(*meshes, uvScale), readGeometry(), 24, 12, std::sqrt(3.0f)},
                 {"sphere", createSphereMesh(*meshes, 6, 9, uvScale), readGeometry(), 70, 108, 0.5f}};
    for (const auto& test : cases)
    {
        SCOPED_TRACE(test.name);
        ASSERT_TRUE(test.mesh);
        EXPECT_EQ(test.vertexCount, test.geometry.positions.size());
        EXPECT_EQ(test.triangleCount, getTriangleCount(*test.mesh->getIndexBuffer()));
        EXPECT_FLOAT_EQ(test.radius, test.mesh->getHeader().boundingRadius);
        Vector2f highest;
        for (size_t i = 0; i < test.vertexCount; ++i)
        {
            const Vector2f uv = test.geometry.uvs[i];
            EXPECT_LE(length(test.geometry.positions[i]), test.radius * 1.0001f);
            EXPECT_NEAR(1.0f, length(test.geometry.normals[i]), 1e-5f);
            EXPECT_TRUE(uv.x >= 0 && uv.x <= 2 && uv.y >= 0 && uv.y <= 3);
            highest = Vector2f(std::max(highest.x, uv.x), std::max(highest.y, uv.y));
        }
        EXPECT_EQ(uvScale, highest);

        float area = 0;
        ASSERT_EQ(size_t(test.triangleCount) * 3, test.geometry.indices.size());
        for (size_t i = 0; i < test.geometry.indices.size(); i += 3)
        {
            const unsigned short* corner = &test.geometry.indices[i];
            ASSERT_LT(std::max({corner[0], corner[1], corner[2]}), test.vertexCount);
            const Vector3f a = test.geometry.positions[corner[0]];
            const Vector3f face =
                cross(test.geometry.positions[corner[1]] - a, test.geometry.positions[corner[2]] - a);
            area += length(face) / 2;
            for (int k = 0; k < 3; ++k)
                EXPECT_GE(dot(face, test.geometry.normals[corner[k]]), -1e-6f) << i;
        }
        const float expectedArea = test.vertexCount == 4 ? 1.0f : test.vertexCount == 24 ? 24.0f : 2.91f;
        EXPECT_NEAR(expectedArea, area, 0.05f);
    }
}

// Fault caught: a picture on a cube's side that lies down or is mirrored.
TEST_F(MeshTest, picturesStandUprightOnCubeAndSquare)
{
    createSquareMesh(*meshes, Vector2f(2, 3));
    const Geometry square = readGeometry();
    const std::vector<Vector2f> squareUvs = {Vector2f(0, 0), Vector2f(2, 0), Vector2f(2, 3), Vector2f(0, 3)};
    EXPECT_EQ(squareUvs, square.uvs);
    EXPECT_EQ(Vector3f(-0.5f, -0.5f, 0), square.positions[0]);
    EXPECT_EQ((std::vector<unsigned short>{0, 1, 3, 1, 2, 3}), square.indices);

    createCubeMesh(*meshes, Vector2f(1, 1));
    const Geometry cube = readGeometry();
    for (size_t face = 0; face < 24; face += 4)
    {
        const Vector3f normal = cube.normals[face];
        const Vector3f up = (cube.positions[face + 3] - cube.positions[face]) / 2;
        const Vector3f right = (cube.positions[face + 1] - cube.positions[face]) / 2;
        EXPECT_EQ(Vector2f(0, 0), cube.uvs[face]);
        EXPECT_EQ(Vector2f(1, 0), cube.uvs[face + 1]);
        EXPECT_EQ(Vector2f(0, 1), cube.uvs[face + 3]);
        EXPECT_EQ(normal, cross(right, up)) << "mirrored";
        EXPECT_EQ(normal.y == 0 ? Vector3f(0, 1, 0) : Vector3f(0, 0, -normal.y), up);
        EXPECT_EQ(normal, (cube.positions[face] + cube.positions[face + 2]) / 2);
    }
}

TEST_F(MeshTest, sphereRings)
{
    LogCapture log;
    createSphereMesh(*meshes, 0, 1, Vector2f(1, 1));
    EXPECT_EQ(1, log.countMessage("Enforced minimum of 2 sphere segments. (was 0)"));
    EXPECT_EQ(1, log.countMessage("Enforced minimun of 2 sphere wedges. (was 1)"));
    const Geometry sphere = readGeometry();
    EXPECT_EQ(9u, sphere.positions.size());
    const std::vector<unsigned short> firstQuad(sphere.indices.begin(), sphere.indices.begin() + 6);
    EXPECT_EQ((std::vector<unsigned short>{4, 1, 0, 0, 3, 4}), firstQuad);
    EXPECT_NEAR(-0.5f, sphere.positions[0].y, 1e-6f) << "the first ring is the lower pole";
    EXPECT_EQ(sphere.positions[3], sphere.positions[5]) << "an open seam";
    EXPECT_EQ(Vector2f(1, 0.5f), sphere.uvs[5]);
}

// Fault caught: 16-bit indices that wrap, or vertex counts that do before anybody looks.
TEST_F(MeshTest, sphereTooFineIsRefused)
{
    const struct
    {
        unsigned int segments, wedges;
        bool isMade;
    } cases[] = {{254, 256, true},
                 {255, 255, true},
                 {255, 256, false},
                 {0xffffffff, 2, false},
                 {2, 0xffffffff, false}};
    for (const auto& test : cases)
    {
        LogCapture log;
        EXPECT_EQ(test.isMade, bool(createSphereMesh(*meshes, test.segments, test.wedges, Vector2f(1, 1))));
        EXPECT_EQ(test.isMade ? 0 : 1, log.count('E')) << test.segments;
    }
}

TEST_F(MeshTest, maximumLength)
{
    EXPECT_EQ(0.0f, computeMaximumLength(nullptr));
    const auto array = makeShared<VertexArray>(2, 4, 3);
    const float values[] = {1, 2, 2, -3, -4, 0};
    std::copy_n(values, 6, array->getData<float>());
    EXPECT_FLOAT_EQ(5.0f, computeMaximumLength(array));
    const auto flat = makeShared<VertexArray>(3, 4, 2);
    std::copy_n(values, 6, flat->getData<float>());
    EXPECT_FLOAT_EQ(4.0f, computeMaximumLength(flat)) << "positions without z";

    LogCapture log;
    EXPECT_EQ(0.0f, computeMaximumLength(makeShared<VertexArray>(2, 2, 3)));
    EXPECT_EQ(1, log.countMessage("ORV_ASSERT: sizeof( T ) == m_typeSize"));
}
