#include "render/glotest.h"
#include "support/logcapture.h"
#include "support/picture.h"
#include "support/tempdir.h"

#include "headless/png.h"

#include "orv/animationgroup.h"
#include "orv/appearance.h"
#include "orv/camera.h"
#include "orv/filestreamsource.h"
#include "orv/light.h"
#include "orv/mesh.h"
#include "orv/solid.h"
#include "orv/texture2d.h"
#include "orv/texture2dcache.h"

#include <cmath>
#include <cstdio>
#include <filesystem>

#include <sys/wait.h>

using namespace orv;
using support::LogCapture;

namespace
{

const char* const MODELS = "/usr/share/assimp/models/";

struct Outcome
{
    int exitCode;
    std::string output; // of both streams
};

/// Runs orv-convert in a folder of its own, and loads from there.
class ConvertTest : public GloTest
{
protected:
    void SetUp() override
    {
        GloTest::SetUp();
        m_pool->registerSource(makeShared<FileStreamSource>(m_folder.path().c_str()));
    }

    Outcome convert(const std::string& arguments) const
    {
        const std::string command = "cd '" + m_folder.path() + "' && " ORV_CONVERT " " + arguments + " 2>&1";
        std::FILE* pipe = popen(command.c_str(), "r");
        std::string output;
        char buffer[1024];
        for (size_t got; (got = fread(buffer, 1, sizeof buffer, pipe)) > 0;)
            output.append(buffer, got);
        return {WEXITSTATUS(pclose(pipe)), output};
    }

    /// Converts, then loads with the engine, which must not complain.
    Glo::Ptr convertAndLoad(const std::string& arguments, const char* name)
    {
        m_outcome = convert(arguments);
        EXPECT_EQ(0, m_outcome.exitCode) << m_outcome.output;
        LogCapture log;
        const Glo::Ptr loaded = loadGloFile(*m_pool, m_root, name, true);
        EXPECT_TRUE(loaded) << log.text();
        EXPECT_EQ(0, log.count('E')) << log.text();
        return loaded;
    }

    bool reports(const char* text) const { return m_outcome.output.find(text) != std::string::npos; }

    static SharedPtr<Texture2D> getDiffuseTexture(const SharedPtr<Appearance>& appearance)
    {
        SharedPtr<Texture2D> texture;
        EXPECT_TRUE(appearance->getPropertyUniform("M_DIFFUSE_TEXTURE")->getValue(texture, 0));
        return texture;
    }

    support::TempDir m_folder;
    Outcome m_outcome;
};

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

// Fault caught: a failure that exits with 0, does not name the file, or leaves something behind.
TEST_F(ConvertTest, failuresWriteNothing)
{
    m_folder.write("broken.gltf", std::string("{\"asset\":"));
    m_folder.write("noise.xyz", std::string("noise"));
    m_folder.write("tri.obj", std::string("v 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n"));
    const std::vector<std::string> before = m_folder.list();
    const struct
    {
        const char* arguments;
        int exitCode;
        const char* message;
    } cases[] = {
        {"--help", 0, "orv-convert walk.fbx"},
        {"", 2, "MODEL"},
        {"tri.obj", 2, "OUT.glo"},
        {"tri.obj out.txt", 2, "out.txt: the output's name has to end in .glo"},
        {"tri.obj out.glo --fps 0", 2, "fps"},
        {"missing.obj out.glo", 1, "missing.obj: No such file"},
        {". out.glo", 1, ".: not a file"},
        {"broken.gltf out.glo", 1, "broken.gltf: "},
        {"noise.xyz out.glo", 1, "noise.xyz: "},
        {"tri.obj nowhere/out.glo", 1, "nowhere/out.glo: No such file"},
    };
    for (const auto& item : cases)
    {
        const Outcome outcome = convert(item.arguments);
        EXPECT_EQ(item.exitCode, outcome.exitCode) << item.arguments << "\n" << outcome.output;
        EXPECT_NE(std::string::npos, outcome.output.find(item.message)) << outcome.output;
        EXPECT_EQ(before, m_folder.list()) << item.arguments;
    }
}

// Fault caught: half an output where the second half cannot be written.
TEST_F(ConvertTest, allOrNothing)
{
    const uint8_t pixel[] = {255, 0, 0, 255};
    std::string error;
    ASSERT_TRUE(headless::writePng(m_folder.path("a.png"), 1, 1, pixel, error)) << error;
    m_folder.write("m.mtl", std::string("newmtl m\nKd 1 1 1\nmap_Kd a.png\n"));
    m_folder.write("tri.obj",
                   std::string("mtllib m.mtl\nusemtl m\nv 0 0 0\nv 1 0 0\nv 0 1 0\nvt 0 0\nf 1/1 2/1 3/1\n"));
    std::filesystem::create_directories(m_folder.path("out.glo/taken"));
    const std::vector<std::string> before = m_folder.list();
    EXPECT_EQ(1, convert("tri.obj out.glo").exitCode);
    EXPECT_EQ(before, m_folder.list());
}

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
    EXPECT_EQ(2.0f, light.getIntensity());
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

// Fault caught: materials that hide their texture, cover what is behind them, or show grey as transparent black;
// pictures of one name that overwrite each other.
TEST_F(ConvertTest, materials)
{
    std::string error;
    std::vector<uint8_t> pixels(6 * 4 * 4, 255);
    pixels[3] = 0; // one of them transparent
    ASSERT_TRUE(headless::writePng(m_folder.path("a.png"), 6, 4, pixels.data(), error)) << error;
    std::filesystem::create_directory(m_folder.path("sub"));
    std::vector<uint8_t> grey(18 + 4 * 4, 100); // TGA
    const uint8_t header[18] = {0, 0, 3, 0, 0, 0, 0, 0, 0, 0, 0, 0, 4, 0, 4, 0, 8, 0};
    std::copy(header, header + 18, grey.begin());
    m_folder.write("sub/a.png", grey);
    m_folder.write("m.mtl", std::string("newmtl grey\nKd 0 0 0\nmap_Kd sub\\a.png\n"
                                        "newmtl glass\nKd 1 0 0\nd 0.25\n"
                                        "newmtl holes\nKd 1 1 1\nKs 1 1 1\nNs 500\nmap_Kd A.PNG\n"
                                        "newmtl lost\nKd 0 1 0\nmap_Kd nowhere.png\n"));
    std::string model = "mtllib m.mtl\nv 0 0 0\nv 1 0 0\nv 0 1 0\nvt 0 0\nvt 3 0\nvt 0 3\n";
    for (const char* name : {"grey", "glass", "holes", "lost"})
        model += std::string("usemtl ") + name + "\nf 1/1 2/2 3/3\n";
    m_folder.write("model.obj", model);

    const Glo::Ptr loaded = convertAndLoad("model.obj out.glo", "out.glo");
    ASSERT_TRUE(loaded);
    EXPECT_TRUE(reports("lost: texture \"nowhere.png\" is not there")) << m_outcome.output;
    EXPECT_TRUE(m_folder.exists("out-a.png"));
    EXPECT_TRUE(m_folder.exists("out-A-2.png"));
    ASSERT_EQ(4u, loaded->getAppearances().size());

    Vector4f colour;
    const SharedPtr<Appearance> plain = loaded->getAppearance("grey");
    EXPECT_TRUE(plain->getPropertyUniform("M_DIFFUSE_COLOUR")->getValue(colour, 0));
    EXPECT_EQ(Vector4f(1, 1, 1, 1), colour);
    EXPECT_TRUE(plain->isOpaque());
    EXPECT_EQ(4u * 4u * 3u, getDiffuseTexture(plain)->getSizeInBytes());
    EXPECT_FALSE(loaded->getAppearance("glass")->isOpaque());

    const SharedPtr<Appearance> holes = loaded->getAppearance("holes");
    EXPECT_FALSE(holes->isOpaque());
    EXPECT_EQ(8u, getDiffuseTexture(holes)->getWidth()); // repeated, so the size has to be a power of two
    EXPECT_EQ(TextureParameters::WrapMode::REPEAT, getDiffuseTexture(holes)->getHorizontalWrap());
    EXPECT_EQ(m_pool->getTexture2DCache()->get("orv#white.png"),
              getDiffuseTexture(loaded->getAppearance("lost")));
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
        {"glTF/CesiumMilkTruck/CesiumMilkTruck.gltf", 4, 0, 0, 0, "texture out-CesiumMilkTruck.png"},
        {"glTF2/BoxTextured-glTF-Embedded/BoxTextured.gltf", 1, 0, 0, 0, "texture out-texture0.png"},
        {"glTF2/simple_skin/simple_skin.gltf", 1, 0, 0, 1, "lost: a skin"},
        {"3DS/RotatingCube.3DS", 1, 0, 0, 1, "12 triangles"},
        {"OBJ/spider.obj", 4, 0, 0, 0, "texture out-drkwood2.jpg"},
        {"FBX/spider.fbx", 4, 1, 1, 0, "1368 triangles"},
        {"X/anim_test.x", 1, 0, 0, 1, "lost: a skin"},
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
