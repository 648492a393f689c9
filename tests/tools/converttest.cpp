#include "converttest.h"

#include "headless/png.h"

#include "orv/animationgroup.h"
#include "orv/camera.h"
#include "orv/light.h"
#include "orv/mesh.h"
#include "orv/solid.h"

#include <algorithm>
#include <cmath>

using namespace orv;

namespace
{

/// A triangle, a spot light, two cameras, and a node that moves by 10 along x in one second while it stays turned.
const char* const GLTF = R"({"asset":{"version":"2.0"},"extensionsUsed":["KHR_lights_punctual"],
"extensions":{"KHR_lights_punctual":{"lights":[{"name":"spot","type":"spot","color":[1,0.5,0.25],"intensity":2,
  "spot":{"innerConeAngle":0.2,"outerConeAngle":0.5}}]}},
"scene":0,"scenes":[{"nodes":[0,2]}],
"cameras":[{"type":"perspective","perspective":{"yfov":0.8,"aspectRatio":2,"znear":0.5,"zfar":50}},
  {"type":"orthographic","orthographic":{"xmag":3,"ymag":2,"znear":0.1,"zfar":9}}],
"nodes":[{"name":"arm","translation":[0,1,0],"scale":[1,2,-3],"children":[1]},
  {"name":"hand","mesh":0,"camera":0,"translation":[0,0,4]},
  {"name":"lamp","extensions":{"KHR_lights_punctual":{"light":0}},"camera":1,
   "matrix":[0,1,0,0,-1,0,0,0,0,0,1,0,5,6,7,1]}],
"meshes":[{"name":"tri","primitives":[{"attributes":{"POSITION":0}}]}],
"animations":[{"name":"slide","samplers":[{"input":1,"output":2}],
  "channels":[{"sampler":0,"target":{"node":0,"path":"translation"}}]}],
"accessors":[{"bufferView":0,"componentType":5126,"count":3,"type":"VEC3","min":[0,0,0],"max":[10,1,0]},
  {"bufferView":1,"componentType":5126,"count":2,"type":"SCALAR","min":[0],"max":[1]},
  {"bufferView":2,"componentType":5126,"count":2,"type":"VEC3"}],
"bufferViews":[{"buffer":0,"byteLength":36},{"buffer":0,"byteOffset":36,"byteLength":8},
  {"buffer":0,"byteOffset":44,"byteLength":24}],
"buffers":[{"byteLength":68,"uri":"triangle.bin"}]})";

std::vector<uint8_t> toBytes(const std::vector<float>& values)
{
    const uint8_t* bytes = reinterpret_cast<const uint8_t*>(values.data());
    return std::vector<uint8_t>(bytes, bytes + values.size() * sizeof(float));
}

} // namespace

// Fault caught: transforms, angles and times that change on the way.
TEST_F(ConvertTest, numbers)
{
    m_folder.write("model.gltf", std::string(GLTF));
    m_folder.write("triangle.bin", toBytes({0, 0, 0, 1, 0, 0, 0, 1, 0, 0, 1, 0, 1, 0, 10, 1, 0}));
    const Glo::Ptr loaded = convertAndLoad("model.gltf scene.glo --fps 10", "scene.glo");
    ASSERT_TRUE(loaded);
    EXPECT_EQ("0.14.0", std::to_string(loaded->getFileVersion().getMajor()) + "." +
                            std::to_string(loaded->getFileVersion().getMinor()) + "." +
                            std::to_string(loaded->getFileVersion().getPatch()));
    EXPECT_EQ(Matrix4f::IDENTITY, loaded->getTopNode()->getWorldTransform());

    SceneNode* hand = loaded->getTopNode()->find("hand");
    ASSERT_TRUE(hand);
    EXPECT_EQ(Vector4f(0, 1, -12, 1), hand->getWorldTransform()[3]);
    EXPECT_EQ(Solid::NODE_TYPE, hand->getNodeType());
    EXPECT_EQ(1.0f, static_cast<Solid*>(hand)->getMesh()->getHeader().boundingRadius);

    ASSERT_EQ(1, loaded->getLightCount());
    const Light& light = *loaded->getLight(0);
    EXPECT_EQ(Light::LightType::SPOT, light.getLightType());
    EXPECT_NEAR(0.4f, light.getSpotInnerAngle().radians(), 1e-6f);
    EXPECT_NEAR(1.0f, light.getSpotOuterAngle().radians(), 1e-6f);
    EXPECT_EQ(Colour4f(1.0f, 0.5f, 0.25f, 1.0f), light.getColour());
    // Of 2 falling by the square: 1 at a distance of the root of 2.
    const float lit = (light.getAttenuationFar() - std::sqrt(2.0f)) / light.getAttenuationFar();
    EXPECT_NEAR(1.0f, light.getIntensity() * lit, 1e-5f);
    // x turned to y, in the matrix and in the components that take over when one of them is set.
    SceneNode* lamp = loaded->getTopNode()->find("lamp");
    for (int pass = 0; pass < 2; ++pass)
    {
        const Matrix4f world = lamp->getWorldTransform();
        EXPECT_NEAR(0.0f, length(world[0] - Vector4f(0, 1, 0, 0)), 1e-6f);
        EXPECT_NEAR(0.0f, length(world[1] - Vector4f(-1, 0, 0, 0)), 1e-6f);
        EXPECT_EQ(Vector4f(5, 6, 7, 1), world[3]);
        lamp->setTransformChanged();
    }

    const SharedPtr<Camera> perspective = loaded->getCamera("hand");
    ASSERT_TRUE(perspective);
    EXPECT_NEAR(0.8f, perspective->getFieldOfView().radians(), 1e-6f);
    EXPECT_EQ(0.5f, perspective->getNear());
    EXPECT_EQ(50.0f, perspective->getFar());
    EXPECT_EQ(hand->getWorldTransform(), perspective->getWorldTransform());
    const SharedPtr<Camera> orthographic = loaded->getCamera("lamp");
    ASSERT_TRUE(orthographic);
    EXPECT_EQ(Camera::ProjectionType::ORTHOGRAPHIC, orthographic->getProjectionType());
    EXPECT_EQ(6.0f, orthographic->getWidth());

    // The constant tracks have a key each, the moving one eleven.
    EXPECT_EQ(1.0f, loaded->getLoopEnd());
    const SharedPtr<AnimationGroup> slide = loaded->getAnimation("slide");
    ASSERT_TRUE(slide);
    for (const float time : {0.0f, 0.25f, 0.5f, 1.0f})
    {
        slide->apply(time);
        const float x = std::floor(time * 10.0f + 0.001f);
        EXPECT_NEAR(x, hand->getWorldTransform()[3].x, 1e-4f) << time;
        EXPECT_NEAR(-12.0f, hand->getWorldTransform()[3].z, 1e-4f) << time;
    }
}

// Fault caught: indices that wrap in a mesh of more vertices than 16 bits count.
TEST_F(ConvertTest, splitsLargeMeshes)
{
    constexpr int EDGE = 300; // 90,000 vertices
    std::string model;
    for (int i = 0; i < EDGE * EDGE; ++i)
        model += "v " + std::to_string(i % EDGE) + " " + std::to_string(i / EDGE) + " 0\n";
    for (int y = 0; y + 1 < EDGE; ++y)
    {
        for (int x = 1; x < EDGE; ++x)
        {
            const int i = y * EDGE + x;
            model += "f " + std::to_string(i) + " " + std::to_string(i + 1) + " " +
                     std::to_string(i + EDGE + 1) + " " + std::to_string(i + EDGE) + "\n";
        }
    }
    m_folder.write("grid.obj", model);
    const Glo::Ptr loaded = convertAndLoad("grid.obj grid.glo", "grid.glo");
    ASSERT_TRUE(loaded);

    int triangles = 0;
    int meshes = 0;
    std::vector<SceneNode*> nodes = {loaded->getTopNode().get()};
    while (!nodes.empty())
    {
        SceneNode* node = nodes.back();
        nodes.pop_back();
        for (const SharedPtr<SceneNode>& child : node->getChildren())
            nodes.push_back(child.get());
        if (node->getNodeType() != Solid::NODE_TYPE)
            continue;
        ++meshes;
        const Mesh& mesh = *static_cast<Solid*>(node)->getMesh();
        triangles += getTriangleCount(*mesh.getIndexBuffer());
        EXPECT_TRUE(mesh.getVertexBuffer()->findAttrib("a_normal"));
    }
    EXPECT_EQ(2 * (EDGE - 1) * (EDGE - 1), triangles);
    EXPECT_GE(meshes, 2);
}

// Fault caught: a format that other people's files come in and that does not arrive.
TEST_F(ConvertTest, realModels)
{
    const struct
    {
        const char* file;
        size_t appearances;
        int lights, cameras, animations;
        const char* report;
    } cases[] = {
        {"Collada/duck.dae", 1, 1, 1, 0, "4212 triangles"},
        {"glTF/CesiumMilkTruck/CesiumMilkTruck.gltf", 4, 0, 0, 0, "out-CesiumMilkTruck.png"},
        {"glTF2/BoxTextured-glTF-Embedded/BoxTextured.gltf", 1, 0, 0, 0, "out-texture0.png"},
        {"glTF2/simple_skin/simple_skin.gltf", 1, 0, 0, 1, "1 skin"},
        {"3DS/RotatingCube.3DS", 1, 0, 0, 1, "12 triangles"},
        {"OBJ/spider.obj", 4, 0, 0, 0, "out-drkwood2.jpg"},
        {"FBX/spider.fbx", 4, 1, 1, 0, "1368 triangles"},
        {"X/anim_test.x", 1, 0, 0, 1, "1 skin"},
    };
    for (const auto& item : cases)
    {
        const Glo::Ptr loaded = convertAndLoad(std::string(MODELS) + item.file + " out.glo", "out.glo");
        ASSERT_TRUE(loaded) << item.file;
        EXPECT_EQ(item.appearances, loaded->getAppearances().size()) << item.file;
        EXPECT_EQ(item.lights, loaded->getLightCount()) << item.file;
        EXPECT_EQ(item.cameras, loaded->getCameraCount()) << item.file;
        EXPECT_EQ(item.animations, loaded->getAnimationCount()) << item.file;
        EXPECT_TRUE(reports(item.report)) << m_outcome.output;
    }
}

namespace
{

void append(std::vector<uint8_t>& bytes, const std::vector<uint8_t>& more)
{
    bytes.insert(bytes.end(), more.begin(), more.end());
}

std::vector<uint8_t> words(const std::vector<int32_t>& values)
{
    const uint8_t* bytes = reinterpret_cast<const uint8_t*>(values.data());
    return std::vector<uint8_t>(bytes, bytes + values.size() * sizeof(int32_t));
}

/// A chunk of a B3D file.
std::vector<uint8_t> chunk(const char* name, const std::vector<std::vector<uint8_t>>& parts)
{
    std::vector<uint8_t> content;
    for (const std::vector<uint8_t>& part : parts)
        append(content, part);
    std::vector<uint8_t> made(name, name + 4);
    append(made, words({int32_t(content.size())}));
    append(made, content);
    return made;
}

/// A triangle and its bone, which moves from frame 1 to frame 11 of ten: frames count from 1 there.
std::vector<uint8_t> makeB3d()
{
    const std::vector<uint8_t> place = toBytes({0, 0, 0, 1, 1, 1, 1, 0, 0, 0});
    const auto mesh =
        chunk("MESH", {words({-1}), chunk("VRTS", {words({0, 0, 0}), toBytes({0, 0, 0, 1, 0, 0, 0, 1, 0})}),
                       chunk("TRIS", {words({0, 0, 1, 2})})});
    const auto bone =
        chunk("BONE", {words({0}), toBytes({1}), words({1}), toBytes({1}), words({2}), toBytes({1})});
    const auto keys = chunk("KEYS", {words({1, 1}), toBytes({1, 0, 0}), words({11}), toBytes({11, 0, 0})});
    const auto joint = chunk("NODE", {{'j', 0}, place, bone, keys});
    const auto anim = chunk("ANIM", {words({0, 10}), toBytes({10.0f})});
    return chunk("BB3D", {words({1}), chunk("TEXS", {}),
                          chunk("BRUS", {words({0}), {'m', 0}, toBytes({1, 1, 1, 1, 0}), words({0, 0})}),
                          chunk("NODE", {{'f', 0}, place, mesh, anim, joint})});
}

} // namespace

// Fault caught: sound files that are refused because a library finds something to say of them, files that come out empty
// without a word, and pictures that lie otherwise than their material library has them.
TEST_F(ConvertTest, otherFormats)
{
    m_folder.write("figure.b3d", makeB3d());
    m_folder.write("mixed.obj", std::string("v 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\nf 1 2\n"));
    m_folder.write("flat.obj", std::string("v 0 0 0\nv 1 0 0\nv 2 0 0\nf 1 2 3\nf 2 1 3\n"));
    std::string error;
    const std::vector<uint8_t> white(4 * 4 * 4, 255);
    ASSERT_TRUE(headless::writePng(m_folder.path("a.png"), 4, 4, white.data(), error)) << error;
    m_folder.write("m.mtl", std::string("newmtl m\nmap_Kd -s 2 3 1 -o 0.5 0.25 a.png\n"));
    m_folder.write("placed.obj",
                   std::string("mtllib m.mtl\nv 0 0 0\nv 1 0 0\nv 0 1 0\nvt 0 0\nvt 1 0\nvt 0 1\n"
                               "usemtl m\nf 1/1 2/2 3/3\n"));
    const struct
    {
        const char* file;
        int exitCode;
        const char* said;
    } cases[] = {
        {"figure.b3d", 0, "from 0.00 to 1.10 seconds"},
        {"mixed.obj", 0, "1 triangle, 1 line"},
        {"flat.obj", 1, "orv-convert: flat.obj: nothing that can be drawn is left: 2 faces without area"},
        {"placed.obj", 0, "out-a.png"},
    };
    for (const auto& item : cases)
    {
        const Outcome outcome = convert(item.file + std::string(" out.glo"));
        EXPECT_EQ(item.exitCode, outcome.exitCode) << outcome.output;
        EXPECT_NE(std::string::npos, outcome.output.find(item.said)) << outcome.output;
    }
    const std::vector<uint8_t> scene = support::readFile(m_folder.path("out.glo"));
    for (const std::vector<float>& uv : {std::vector<float>{0.5f, 0.25f}, {2.5f, 0.25f}, {0.5f, 3.25f}})
    {
        const std::vector<uint8_t> wanted = toBytes(uv);
        EXPECT_NE(scene.end(), std::search(scene.begin(), scene.end(), wanted.begin(), wanted.end()))
            << uv[1];
    }
}
