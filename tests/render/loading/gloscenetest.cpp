#include "glotest.h"

#include "orv/animationgroup.h"
#include "orv/appearance.h"
#include "orv/camera.h"
#include "orv/light.h"
#include "orv/mesh.h"
#include "orv/shaderprogramcache.h"
#include "orv/solid.h"
#include "orv/texture2d.h"
#include "orv/texture2dcache.h"

#include <cmath>
#include <functional>
#include <limits>
#include <tuple>

using namespace orv;
using support::LogCapture;

namespace
{

glo::SamplerField image(const char* name, uint32_t type = glo::sampler::TEXTURE_2D)
{
    glo::Sampler sampler;
    sampler.type = type;
    sampler.image = name;
    return sampler;
}

/// A square with one material, as the top node.
glo::GloScene makeSquareScene(const glo::Material& material = makeMaterial("m", Vector4f(1, 1, 1, 1)))
{
    glo::GloScene scene;
    scene.geometries.push_back(makeSquareGeometry("square"));
    scene.materials.push_back(material);
    scene.scene = glo::SceneData{"scene", makeSolidNode("top", "square", material.name)};
    return scene;
}

const Solid& asSolid(const SceneNode& node)
{
    EXPECT_EQ(Solid::NODE_TYPE, node.getNodeType());
    return static_cast<const Solid&>(node);
}

float getFloat(const Appearance& appearance, const char* name)
{
    float value = -1.0f;
    EXPECT_TRUE(appearance.getPropertyUniform(name) &&
                appearance.getPropertyUniform(name)->getValue(value, 0))
        << name;
    return value;
}

class GloSceneTest : public GloTest
{
protected:
    bool hasProgram(const SharedPtr<Appearance>& appearance, const char* name)
    {
        return m_pool->getShaderProgramCache()->exists(name) &&
               m_pool->getShaderProgramCache()->get(name) == appearance->getShaderProgram();
    }
};

} // namespace

// Fault caught: a shader program without a feature that a material needs, or with one that costs for nothing.
TEST_F(GloSceneTest, programs)
{
    using Material = glo::StandardMaterial;
    const auto none = [](Material&) {};
    const auto bump = [](Material& m) { m.bump = image("orv#white.png"); };
    const auto all = [](Material& m)
    {
        m.bump = image("orv#white.png");
        m.diffuse.colour.x = m.ambient.colour.y = m.specular.colour.z = m.emissive.colour.x = 0.1f;
        m.specularLevel = 0.1f;
        m.reflection.sampler = image("orv#white.png", glo::sampler::TEXTURE_CUBE);
    };
    const char BLENDER[] = "blender2.63.0", MAX[] = "3ds_max2012";
    using Case = std::tuple<const char*, const char*, std::function<void(Material&)>, const char*>;
    const Case cases[] = {
        {"m", BLENDER, none, "orv#max_pvl.sp"},
        {"m", MAX, none, "orv#max_pvl.sp$INVSQROOT"},
        {"m", MAX, bump, "orv#max_ppl.sp$BUMP$INVY$INVSQROOT"},
        {"m", BLENDER, bump, "orv#max_ppl.sp$BUMP"},
        {"a zun_ppl b", BLENDER, none, "orv#max_ppl.sp"},
        {"m", BLENDER, [](Material& m) { m.bump = image(""); }, "orv#max_pvl.sp"},
        {"m", BLENDER, [](Material& m) { m.specularLevel = 1.0f; }, "orv#max_pvl.sp"},
        {"m", BLENDER, [](Material& m) { m.specular.colour.x = 1.0f; }, "orv#max_pvl.sp"},
        {"m", BLENDER, [](Material& m) { m.reflection.sampler = image("orv#white.png"); },
         "orv#max_pvl.sp$REFL"},
        {"m", MAX, all, "orv#max_ppl.sp$BUMP$INVY$INVSQROOT$DIFF$SPEC$AMBI$REFL$CUBE$EMIS"},
    };
    for (const auto& [name, tool, change, program] : cases)
    {
        glo::Material material = makeMaterial(name, Vector4f(0, 0, 0, 1));
        change(material.techniques[0]);
        glo::GloScene scene = makeSquareScene(material);
        scene.info.authoringTool = tool;
        const Glo::Ptr loaded = load(scene);
        ASSERT_TRUE(loaded);
        EXPECT_TRUE(hasProgram(loaded->getAppearance(name), program)) << program;
    }
}

// Fault caught: a feature that reaches another material, that needs its chunk in one place, or that makes a cut-out
// blend; an entry for a material that is not there which is more than nothing.
TEST_F(GloSceneTest, surfaces)
{
    glo::GloScene scene = makeSquareScene(makeMaterial("m", Vector4f(1, 1, 1, 1)));
    scene.materials.push_back(makeMaterial("n", Vector4f(1, 1, 1, 1)));
    scene.materials[0].techniques[0].opacity = 0.5f;
    scene.materials[1].techniques[0].bump = image("orv#white.png");
    scene.surfaces.list = {{0, 0x80000003, 0.25f}, {1, 0x1d, 0.5f}, {2, 31, 0.5f}, {~0u, 31, 0.5f}};
    const Glo::Ptr loaded = load(scene);
    ASSERT_TRUE(loaded);
    const SharedPtr<Appearance> cut = loaded->getAppearance("m");
    EXPECT_TRUE(hasProgram(cut, "orv#max_pvl.sp$DIFF$VCOL$CUTOFF"));
    EXPECT_EQ(0.25f, getFloat(*cut, "M_CUTOFF"));
    EXPECT_TRUE(cut->isOpaque());
    EXPECT_TRUE(hasProgram(loaded->getAppearance("n"), "orv#max_ppl.sp$BUMP$DIFF$VCOL$BACK$UNLIT$LINEAR"));
    EXPECT_FALSE(loaded->getAppearance("n")->getPropertyUniform("M_CUTOFF"));
}

// Fault caught: an opaque glass, a one-sided leaf, a missing picture that leaves a hole, sampler settings that turn
// a texture black or reach the built-in ones.
TEST_F(GloSceneTest, materials)
{
    glo::Material material = makeMaterial("m", Vector4f(1, 1, 1, 1));
    glo::StandardMaterial last = material.techniques[0];
    last.opacity = 0.5f;
    last.doubleSided = 1;
    last.shininess = 7.0f;
    last.emissive.sampler = image("missing.png");
    last.gloss = image("orv#white.png", 5);
    last.specularLevelMap = image("orv#error.png");
    last.specularLevelMap->minFilter = 0;
    last.specularLevelMap->magFilter = 99;
    material.techniques.push_back(last);

    LogCapture log;
    const Glo::Ptr loaded = load(makeSquareScene(material));
    ASSERT_TRUE(loaded);
    EXPECT_EQ(2, log.count('E')) << log.text();
    EXPECT_TRUE(log.contains("Failed to find 2d texture \"missing.png\"; using \"missing\" texture."));
    EXPECT_TRUE(log.contains("Unsupported sampler type; using \"missing\" texture."));

    const SharedPtr<Appearance> appearance = loaded->getAppearance("m");
    EXPECT_FALSE(appearance->isOpaque());
    EXPECT_EQ(CullingMode::CULL_NONE, appearance->getRenderState().cullingMode);
    EXPECT_EQ(7.0f, getFloat(*appearance, "M_SHININESS"));
    const auto getTexture = [&](const char* name)
    {
        SharedPtr<Texture2D> texture;
        EXPECT_TRUE(appearance->getPropertyUniform(name)->getValue(texture, 0)) << name;
        return texture;
    };
    const SharedPtr<Texture2DCache>& textures = m_pool->getTexture2DCache();
    EXPECT_EQ(textures->get("orv#white.png"), getTexture("M_DIFFUSE_TEXTURE"));
    EXPECT_EQ(textures->get("orv#missing.png"), getTexture("M_EMISSIVE_TEXTURE"));
    EXPECT_EQ(textures->get("orv#missing.png"), getTexture("M_GLOSS_TEXTURE"));
    EXPECT_NE(TextureParameters::FilterMode::NEAREST, getTexture("M_SPECULAR_LEVEL_TEXTURE")->getMinFilter());
}

// Fault caught: sampler settings lost, or forced on a texture that cannot have them.
TEST_F(GloSceneTest, samplers)
{
    using FilterMode = TextureParameters::FilterMode;
    using WrapMode = TextureParameters::WrapMode;
    const struct
    {
        int width;
        uint32_t minFilter, wrap;
        FilterMode min;
        WrapMode made;
    } cases[] = {
        {8, 5, 2, FilterMode::LINEAR_MIPMAP_LINEAR, WrapMode::MIRRORED_REPEAT},
        {8, 0, 1, FilterMode::NEAREST, WrapMode::CLAMP},
        {8, 77, 77, FilterMode::LINEAR_MIPMAP_NEAREST, WrapMode::REPEAT},
        {6, 5, 2, FilterMode::LINEAR, WrapMode::CLAMP},
        {6, 3, 0, FilterMode::NEAREST, WrapMode::CLAMP},
    };
    for (const auto& item : cases)
    {
        // An uncompressed true-colour TGA.
        std::vector<uint8_t> tga(size_t(18 + item.width * 8 * 3));
        tga[2] = 2;
        tga[12] = uint8_t(item.width);
        tga[14] = 8;
        tga[16] = 24;
        const std::string name = std::to_string(&item - cases) + ".tga";
        m_source->set(name, tga);

        glo::GloScene scene = makeSquareScene();
        glo::SamplerField& sampler = scene.materials[0].techniques[0].diffuse.sampler;
        sampler = image(name.c_str());
        sampler->minFilter = item.minFilter;
        sampler->magFilter = 0;
        sampler->wrapHorizontal = sampler->wrapVertical = item.wrap;
        expectLoad(scene, "", name);
        const SharedPtr<Texture2D> texture = m_pool->getTexture2DCache()->get(name.c_str());
        EXPECT_EQ(item.min, texture->getMinFilter()) << item.minFilter;
        EXPECT_EQ(FilterMode::NEAREST, texture->getMagFilter());
        EXPECT_EQ(item.made, texture->getHorizontalWrap()) << item.minFilter;
        EXPECT_EQ(item.made, texture->getVerticalWrap()) << item.minFilter;
    }
}

// Fault caught: parts of a node that get lost, or hang somewhere else.
TEST_F(GloSceneTest, tree)
{
    glo::GloScene scene = makeFullScene();
    glo::NodeData& top = scene.scene->top;
    glo::NodeData& both = top.children[0];
    both.light = glo::LightReference{"lamp"};
    both.camera = glo::CameraReference{"lens"};
    moveTo(both, Vector3f(1, 2, 3));
    both.rotation = Vector4f(0, 0, 1, 2); // the matrix counts until a component is set
    scene.geometries[0].primitiveSets.push_back({glo::primitive::TRIANGLE_FAN, {}});
    scene.geometries[0].primitiveSets.push_back({99, glo::IndexData{3, {0, 1, 2}}});
    both.geometry->materials = {"red", "no such"};

    LogCapture log;
    const Glo::Ptr loaded = load(scene);
    ASSERT_TRUE(loaded) << log.text();
    EXPECT_EQ(1, log.countMessage("Geometry has no material; using default appearance.")) << log.text();
    EXPECT_EQ(m_root->getChild(0), loaded->getTopNode());
    ASSERT_EQ(5u, loaded->getTopNode()->getChildCount());

    SceneNode& node = *loaded->getTopNode()->getChild(0);
    EXPECT_EQ(translationMatrix(Vector3f(1, 2, 3)), node.getWorldTransform());
    node.setPosition(Vector3f(0, 0, 0));
    EXPECT_NEAR(std::cos(2.0f), node.getWorldTransform()[0].x, 1e-6f);

    ASSERT_EQ(4u, node.getChildCount());
    const Solid* const solids[] = {&asSolid(node), &asSolid(*node.getChild(0)), &asSolid(*node.getChild(1))};
    const auto getIndices = [&](int i) { return solids[i]->getMesh()->getIndexBuffer(); };
    EXPECT_EQ(loaded->getAppearance("red"), solids[0]->getAppearance());
    EXPECT_TRUE(hasProgram(solids[1]->getAppearance(), "orv#max_pvl.sp$DIFF$SPEC$AMBI$EMIS"));
    EXPECT_EQ(solids[1]->getAppearance(), solids[2]->getAppearance());
    EXPECT_EQ(solids[0]->getMesh()->getVertexBuffer(), solids[2]->getMesh()->getVertexBuffer());
    EXPECT_EQ(4, getIndices(1)->getCount());
    EXPECT_EQ(IndexBuffer::Primitive::TRIANGLE_FAN, getIndices(2)->getPrimitive()) << "for an unknown one";
    EXPECT_EQ(3, getIndices(2)->getCount());
    EXPECT_EQ(Light::NODE_TYPE, node.getChild(2)->getNodeType());
    EXPECT_EQ(Camera::NODE_TYPE, node.getChild(3)->getNodeType());

    // By node first, by definition otherwise.
    EXPECT_EQ(loaded->getLight(1), loaded->getLight("lamp node"));
    EXPECT_EQ(loaded->getLight(0), loaded->getLight("lamp"));
    EXPECT_EQ(loaded->getCamera(1), loaded->getCamera("eye"));
    EXPECT_FALSE(loaded->getCamera("nobody"));
    EXPECT_FALSE(loaded->getLight(2));
}

// Fault caught: light and camera fields in the wrong order or unit, unknown codes that are let through.
TEST_F(GloSceneTest, lightsAndCameras)
{
    glo::GloScene scene;
    glo::LightDefinition& light = scene.lights.emplace_back();
    light = {"lamp", glo::light::SPOT, Vector3f(0.1f, 0.2f, 0.3f), 4, 5, 0.6f, 0.7f, 0, 8};
    glo::CameraDefinition& camera = scene.cameras.emplace_back();
    camera = {"lens", glo::projection::ORTHOGRAPHIC, 0.5f, 6, 7, 8};
    scene.scene = glo::SceneData{"scene", makeLightNode("top")};
    scene.scene->top.camera = glo::CameraReference{"lens"};
    {
        LogCapture log;
        const Glo::Ptr loaded = load(scene);
        ASSERT_TRUE(loaded);
        EXPECT_EQ(1, log.count('W')) << log.text(); // a field of view without a use
        const Light& made = *loaded->getLight(0);
        EXPECT_EQ(Colour4f(0.1f, 0.2f, 0.3f, 1.0f), made.getColour());
        EXPECT_EQ((std::vector<float>{4, 5, 0.6f, 0.7f, 8, 0}),
                  (std::vector<float>{made.getAttenuationNear(), made.getAttenuationFar(),
                                      made.getSpotInnerAngle().radians(), made.getSpotOuterAngle().radians(),
                                      made.getIntensity(), made.getAmbientLevel()}));
        EXPECT_FALSE(made.isAttenuated());
        EXPECT_STREQ("lamp", made.getLightName());
        const Camera& eye = *loaded->getCamera(0);
        EXPECT_EQ(Camera::ProjectionType::ORTHOGRAPHIC, eye.getProjectionType());
        EXPECT_EQ((std::vector<float>{0.5f, 6, 7, 8}),
                  (std::vector<float>{eye.getFieldOfView().radians(), eye.getWidth(), eye.getNear(),
                                      eye.getFar()}));
    }

    using Type = Light::LightType;
    const struct
    {
        uint32_t lightType, projection;
        Type made;
        const char* error;
    } cases[] = {
        {0, 1, Type::POINT, ""},
        {1, 1, Type::POINT, ""},
        {2, 0, Type::DIRECTIONAL, ""},
        {3, 0, Type::SPOT, ""},
        {4, 0, Type::POINT, "Light \"lamp\" has the unknown type 4 in test.glo"},
        {0xffffffffu, 0, Type::POINT, "Light \"lamp\" has the unknown type 4294967295 in test.glo"},
        {1, 2, Type::POINT, "Camera \"lens\" has the unknown projection 2 in test.glo"},
    };
    for (const auto& item : cases)
    {
        light.type = item.lightType;
        camera = {"lens", item.projection};
        const Glo::Ptr loaded = expectLoad(scene, item.error, "");
        EXPECT_TRUE(!loaded || item.made == loaded->getLight(0)->getLightType()) << item.lightType;
    }
    light.type = glo::light::AMBIENT;
    camera.projection = glo::projection::PERSPECTIVE;
    LogCapture log;
    EXPECT_TRUE(load(scene));
    EXPECT_EQ(1, log.countMessage("Ambient light type not supported; defaulting to point light."));
    EXPECT_EQ(1, int(log.records().size())) << log.text();
}

// Fault caught: vertices or indices through which the GL reads outside its buffers.
TEST_F(GloSceneTest, geometryIsChecked)
{
    using Geometry = glo::Geometry;
    const auto inSquare = [](const std::string& fault)
    { return "Geometry \"square\" " + fault + " in test.glo"; };
    const auto misfit = [](const std::string& name)
    {
        return "Vertex attribute \"" + name +
               "\" of geometry \"square\" does not fit its vertex data in test.glo";
    };
    const std::pair<std::string, std::function<void(Geometry&)>> cases[] = {
        {"", [](Geometry&) {}},
        {"",
         [](Geometry& g) {
             g = Geometry{"square", {}, {glo::PrimitiveSet()}};
         }},
        {inSquare("has an index beyond its 4 vertices"),
         [](Geometry& g) { g.primitiveSets[0].indices->indices[3] = 4; }},
        {inSquare("has an index beyond its 0 vertices"), [](Geometry& g) { g.vertices = {}; }},
        {inSquare("has no data for its 4294967295 vertices"),
         [](Geometry& g) {
             g.vertices = glo::VertexSet{0xffffffffu, {}, {}};
         }},
        {misfit("a_uv0"), [](Geometry& g) { g.vertices.data.bytes.pop_back(); }},
        {misfit("a_position"), [](Geometry& g) { g.vertices.vertexCount = 0xffffffffu; }},
    };
    for (const auto& item : cases)
    {
        glo::GloScene scene = makeSquareScene();
        item.second(scene.geometries[0]);
        expectLoad(scene, item.first, std::to_string(&item - cases));
    }

    // Of 128 bytes.
    const struct
    {
        int32_t componentCount, type, offset, stride;
    } misfits[] = {{5, 4, 0, 32},  {0, 4, 0, 32},         {-3, 4, 0, 32}, {3, 4, -4, 32}, {3, 4, 24, 32},
                   {3, 4, 0, -32}, {3, 4, 0, 0x7fffffff}, {3, 7, 26, 32}}; // 7: read as four bytes
    for (const auto& item : misfits)
    {
        glo::GloScene scene = makeSquareScene();
        scene.geometries[0].vertices.attributes = {
            {"x", item.componentCount, uint32_t(item.type), item.offset, item.stride, 0}};
        expectLoad(scene, misfit("x"), std::to_string(&item - misfits));
    }
}

// Fault caught: a radius that culls what is in sight; formats that change on the way to the GL.
TEST_F(GloSceneTest, formatsAndRadii)
{
    constexpr unsigned BYTE = 0x1400, SHORT = 0x1402, UNSIGNED_SHORT = 0x1403, FLOAT = 0x1406, FIXED = 0x140c;
    const struct
    {
        uint32_t type, normalize;
        std::vector<uint8_t> vertex;
        unsigned glType;
        float radius;
    } cases[] = {
        {0, 0, {0x80, 0, 0}, BYTE, 128.0f},
        {0, 1, {127, 0, 0}, BYTE, 1.0f},
        {3, 0, {0, 1, 0, 0, 0, 0}, UNSIGNED_SHORT, 256.0f},
        {3, 1, {255, 255, 255, 255, 0, 0}, UNSIGNED_SHORT, std::sqrt(2.0f)},
        {4, 0, {0, 0, 64, 64, 0, 0, 0, 0, 0, 0, 128, 64}, FLOAT, 5.0f},
        {99, 0, {0, 0, 64, 64, 0, 0, 0, 0, 0, 0, 128, 64}, FLOAT, 5.0f},
        {2, 0, {3, 0, 4, 0, 0, 0, 1, 0}, SHORT, 5.0f}, // the fourth is no distance
        {8, 0, {0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 0}, FIXED, 2.0f},
    };
    for (const auto& item : cases)
    {
        glo::GloScene scene = makeSquareScene();
        glo::VertexSet& vertices = scene.geometries[0].vertices;
        const int components = item.type == 2 ? 4 : 3;
        vertices.attributes = {{"a_position", components, item.type, 0, 0, item.normalize}};
        vertices.data.bytes.assign(item.vertex.begin(), item.vertex.end());
        vertices.vertexCount = 1;
        scene.geometries[0].primitiveSets = {{glo::primitive::POINTS, {}}};
        const Glo::Ptr loaded = expectLoad(scene, "", std::to_string(item.type));
        ASSERT_TRUE(loaded);
        const Mesh& mesh = *asSolid(*loaded->getTopNode()).getMesh();
        EXPECT_FLOAT_EQ(item.radius, mesh.getHeader().boundingRadius) << item.type;
        const detail::AttribRecord* record = mesh.getVertexBuffer()->findAttrib("a_position");
        ASSERT_TRUE(record);
        EXPECT_EQ(item.glType, record->glType) << item.type;
        EXPECT_EQ(item.normalize != 0, record->normalised) << item.type;
    }
}

// Fault caught: animations that move the wrong thing, nothing, or stop a file that could be shown.
TEST_F(GloSceneTest, channels)
{
    glo::Channel unknownType = makeChannel("node", "hip", "scale", {});
    unknownType.coefficientCount = 3;
    unknownType.type = 7;
    unknownType.keys.resize(4 + 3 * 2);
    const float noTime = std::numeric_limits<float>::quiet_NaN();
    const struct
    {
        bool loads; ///< with a warning
        glo::Channel channel;
        const char* message;
    } cases[] = {
        {true, makeChannel("node", "nobody", "visibility", {1}), "Ignoring unknown property in test.glo"},
        {true, makeChannel("cloud", "nobody", "scale", {1}), "Ignoring unknown property in test.glo"},
        {true, unknownType, "Ignoring \"scale\" of \"hip\" in test.glo: keys of the type 7 have no meaning"},
        {false, makeChannel("node", "nobody", "scale", {1, 2, 3}), "Animation node not present in test.glo"},
        {false, makeChannel("light", "lamp node", "colour", {1, 1, 1}), "No light for animation in test.glo"},
        {false, makeChannel("material", "green", "opacity", {1}),
         "No appearance material for animation in test.glo"},
        {false, makeChannel("node", "hip", "scale", {1, 2}),
         "\"scale\" of \"hip\" has 2 coefficients per key in test.glo; wanted are 3"},
        {false, makeChannel("material", "red", "diffuse", {1, 2, 3, 4, 5}),
         "\"diffuse\" of \"red\" has 5 coefficients per key in test.glo; wanted are 4"},
        {false, makeChannel("node", "hip", "scale", {1, 2, 3}, noTime),
         "\"scale\" of \"hip\" has a key whose time is not a number in test.glo"},
    };
    for (const auto& item : cases)
    {
        glo::GloScene scene = makeFullScene();
        scene.animations[0].channels = {item.channel};
        LogCapture log;
        EXPECT_EQ(item.loads, bool(load(scene))) << item.message;
        EXPECT_EQ(item.loads ? 0 : 1, log.count('E')) << item.message << log.text();
        EXPECT_EQ(1, log.countMessage(item.message)) << log.text();
    }
    EXPECT_EQ(3u, m_root->getChildCount()); // only those that loaded
}

// Fault caught: key values in the wrong place or order, a light left behind, groups flattened or misnamed.
TEST_F(GloSceneTest, animationsApply)
{
    glo::GloScene scene = makeFullScene();
    glo::AnimationData& walk = scene.animations[0];
    glo::Channel move = makeChannel("node", "node-hip", "translation", {1, 0, 0}); // at 1
    glo::addKey(move, 0.5f, {2, 0, 0});
    glo::Channel turn = makeChannel("node", "knee", "rotation", {0, 0, 2, 1});
    glo::Channel bytes = makeChannel("node", "eye", "scale", {});
    bytes.coefficientCount = 3;
    bytes.type = glo::type::INT8;
    bytes.keys.insert(bytes.keys.end(), {1, 2, 0xff});
    walk.channels = {move, turn, bytes, makeChannel("light", "lamp", "colour", {0.1f, 0.2f, 0.3f}),
                     makeChannel("light", "lamp", "multiplier", {6})};
    walk.animations[0].channels = {makeChannel("material", "red", "opacity", {0.25f}),
                                   makeChannel("material", "red", "emission", {0.5f, 0.6f, 0.7f})};
    scene.animations.push_back({"second", {{3.0f, 4.0f}, {5.0f, 6.0f}}, {}, {}});
    scene.scene->top.children.push_back(makeLightNode("second lamp"));

    const Glo::Ptr loaded = load(scene);
    ASSERT_TRUE(loaded);
    EXPECT_EQ(5.0f, loaded->getLoopBegin());
    EXPECT_EQ(6.0f, loaded->getLoopEnd());
    ASSERT_EQ(2, loaded->getAnimationCount());
    EXPECT_STREQ("second", loaded->getAnimationName(1));
    EXPECT_EQ(loaded->getAnimationGroup()->getAnimation(0).get(), loaded->getAnimation("walk").get());
    EXPECT_FALSE(loaded->getAnimation("inner"));
    EXPECT_FALSE(loaded->getAnimation("WALK"));

    // Blended and with the feature that the animation needs, though the file starts opaque and black.
    EXPECT_FALSE(loaded->getAppearance("red")->isOpaque());
    EXPECT_TRUE(hasProgram(loaded->getAppearance("red"), "orv#max_pvl.sp$DIFF$EMIS"));
    EXPECT_EQ(1.0f, getFloat(*loaded->getAppearance("red"), "M_OPACITY"));

    SceneNode& top = *loaded->getTopNode();
    loaded->getAnimationGroup()->apply(0.75f);
    EXPECT_EQ(Vector3f(2, 0, 0), top.find("hip")->getPosition());
    loaded->getAnimationGroup()->apply(2.0f);
    EXPECT_EQ(Vector3f(1, 0, 0), top.find("hip")->getPosition());
    EXPECT_EQ(2.0f * std::sin(0.5f), top.find("knee")->getRotation().z);
    EXPECT_EQ(Vector3f(1, 2, -1), top.find("eye")->getScale());
    for (int i = 0; i < 2; ++i)
    {
        EXPECT_EQ(Colour4f(0.1f, 0.2f, 0.3f, 1.0f), loaded->getLight(i)->getColour()) << i;
        EXPECT_EQ(6.0f, loaded->getLight(i)->getIntensity()) << i;
    }
    EXPECT_EQ(0.25f, getFloat(*loaded->getAppearance("red"), "M_OPACITY"));
    Vector4f colour;
    EXPECT_TRUE(loaded->getAppearance("red")->getPropertyUniform("M_EMISSIVE_COLOUR")->getValue(colour, 0));
    EXPECT_EQ(Vector4f(0.5f, 0.6f, 0.7f, 1.0f), colour);
}

// Faults caught: files of today, whatever number they have there, played otherwise than they were; a kind of channel that
// steps although its file asks for what lies between; keys of a light's that only the first one gets.
TEST_F(GloSceneTest, channelsInterpolateIfTheFileAsks)
{
    for (const uint32_t method : {0u, 1u, 2u, 0xffffffffu, glo::interpolation::LINEAR})
    {
        glo::GloScene scene = makeFullScene();
        scene.scene->top.children.push_back(makeLightNode("second lamp"));
        glo::AnimationData& walk = scene.animations[0];
        walk.animations.clear();
        walk.channels = {makeChannel("node", "hip", "translation", {0, 0, 0}, 0.0f),
                         makeChannel("node", "knee", "rotation", {0, 0, 1, 0}, 0.0f),
                         makeChannel("light", "lamp", "multiplier", {0}, 0.0f),
                         makeChannel("light", "lamp", "colour", {0, 0, 0, 0}, 0.0f),
                         makeChannel("material", "red", "opacity", {0}, 0.0f),
                         makeChannel("material", "red", "emission", {0, 0, 0, 0}, 0.0f)};
        for (glo::Channel& channel : walk.channels)
        {
            channel.interpolation = method;
            glo::addKey(channel, 4.0f, std::vector<float>(channel.coefficientCount, 1.0f));
        }
        const Glo::Ptr loaded = load(scene);
        ASSERT_TRUE(loaded);
        loaded->getAnimationGroup()->apply(1.0f);
        const float wanted = method == glo::interpolation::LINEAR ? 0.25f : 0.0f;
        const SceneNode& top = *loaded->getTopNode();
        EXPECT_EQ(wanted, top.find("hip")->getPosition().y) << method;
        EXPECT_EQ(wanted > 0.0f, top.find("knee")->getRotation().z > 0.01f) << method;
        EXPECT_EQ(wanted, getFloat(*loaded->getAppearance("red"), "M_OPACITY")) << method;
        Vector4f colour;
        loaded->getAppearance("red")->getPropertyUniform("M_EMISSIVE_COLOUR")->getValue(colour, 0);
        EXPECT_EQ(wanted, colour.z) << method;
        for (int i = 0; i < 2; ++i)
        {
            EXPECT_EQ(wanted, loaded->getLight(i)->getIntensity()) << method;
            EXPECT_EQ(wanted, loaded->getLight(i)->getColour().g) << method;
        }
    }
}

// Fault caught: joints bound to a node of the same name elsewhere; a material that skins what has no joints, or
// the other way round.
TEST_F(GloSceneTest, skins)
{
    glo::GloScene scene = makeFullScene();
    scene.skins[0].attachments = {
        {"bone", Matrix4f::IDENTITY}, {"knee", Matrix4f::IDENTITY}, {"nobody", Matrix4f::IDENTITY}};
    scene.skins[0].jointsPerVertex = 3;
    scene.geometries[1].vertices.attributes[1].normalize = 1; // joint numbers are none the less numbers
    scene.skins[0].bindShape = translationMatrix(Vector3f(0, 0, 9));
    glo::NodeData& top = scene.scene->top;
    for (const char* name : {"first", "second"})
    {
        glo::NodeData& rig =
            top.children.emplace_back(makeNode(name, {makeNode(name + std::string(" bone"))}));
        rig.children[0].scopedName = "bone";
    }
    glo::NodeData named = makeNode("bone"); // by its plain name only
    named.scopedName = "";
    top.children.insert(top.children.begin(), named);
    glo::NodeData& figure = top.children[2];
    figure.skin->skeletons = {"second"};
    figure.skin->materials = {"red", "no such"};

    LogCapture log;
    const Glo::Ptr loaded = load(scene);
    ASSERT_TRUE(loaded) << log.text();
    EXPECT_EQ(1, log.countMessage("Joint node \"nobody\" not found.")) << log.text();
    EXPECT_EQ(1, log.count('E')) << log.text();
    const SceneNode* node = loaded->getTopNode()->find("figure");
    for (const Solid* solid : {&asSolid(*node), &asSolid(*node->getChild(0))})
    {
        ASSERT_EQ(3, solid->getJointCount());
        EXPECT_STREQ("second bone", solid->getJoint(0).joint->getName());
        EXPECT_STREQ("knee", solid->getJoint(1).joint->getName());
        EXPECT_FALSE(solid->getJoint(2).joint);
        EXPECT_EQ(3, solid->getJointsPerVertex());
        EXPECT_EQ(9.0f, solid->getBindShapeTransform()[3].z);
    }
    const detail::AttribRecord* joints = asSolid(*node).getMesh()->getVertexBuffer()->findAttrib("a_joints");
    EXPECT_FALSE(joints->normalised);

    const SharedPtr<Appearance> plain = asSolid(*loaded->getTopNode()->find("square node")).getAppearance();
    const SharedPtr<Appearance> skinned = asSolid(*node).getAppearance();
    EXPECT_EQ(loaded->getAppearance("red"), plain);
    EXPECT_TRUE(hasProgram(plain, "orv#max_pvl.sp$DIFF"));
    EXPECT_TRUE(hasProgram(skinned, "orv#max_pvl.sp$DIFF$SKIN"));
    EXPECT_TRUE(
        hasProgram(asSolid(*node->getChild(0)).getAppearance(), "orv#max_pvl.sp$DIFF$SPEC$AMBI$EMIS$SKIN"));
    EXPECT_EQ(plain, loaded->getAppearance("red", false));
    EXPECT_EQ(skinned, loaded->getAppearance("red", true));
    EXPECT_FALSE(loaded->getAppearance("blue", true));
    EXPECT_TRUE(loaded->getAppearance("blue", false));
    EXPECT_EQ(getFloat(*plain, "M_SHININESS"), getFloat(*skinned, "M_SHININESS"));
    loaded->getAnimationGroup()->apply(0.0f);
    plain->setProperty<float>("M_OPACITY", 0.0f);
    skinned->setProperty<float>("M_OPACITY", 0.0f);
    loaded->getAnimationGroup()->apply(0.0f);
    EXPECT_EQ(1.0f, getFloat(*plain, "M_OPACITY"));
    EXPECT_EQ(1.0f, getFloat(*skinned, "M_OPACITY"));
}

// Fault caught: a name that leads nowhere and is dereferenced, or a half-built tree left under the parent.
TEST_F(GloSceneTest, unknownNames)
{
    const std::pair<std::string, std::function<void(glo::GloScene&, glo::NodeData&)>> cases[] = {
        {"There is no geometry \"x\" in test.glo",
         [](auto&, auto& top) { top.children[0].geometry->geometry = "x"; }},
        {"There is no skin \"x\" in test.glo", [](auto&, auto& top) { top.children[1].skin->skin = "x"; }},
        {"There is no geometry \"x\" in test.glo", [](auto& s, auto&) { s.skins[0].geometry = "x"; }},
        {"There is no light \"x\" in test.glo", [](auto&, auto& top) { top.children[3].light->light = "x"; }},
        {"There is no camera \"x\" in test.glo",
         [](auto&, auto& top) { top.children[4].camera->camera = "x"; }},
        {"Unrecognized up-axis option in test.glo", [](auto& s, auto&) { s.upAxis = 3; }},
    };
    for (const auto& item : cases)
    {
        glo::GloScene scene = makeFullScene();
        item.second(scene, scene.scene->top);
        expectLoad(scene, item.first, "");
        EXPECT_EQ(0u, m_root->getChildCount());
    }

    glo::GloScene empty;
    empty.upAxis = 3; // of no matter without a scene
    const Glo::Ptr loaded = load(empty);
    ASSERT_TRUE(loaded);
    EXPECT_FALSE(loaded->getTopNode());

    m_root.reset();
    const Glo::Ptr rootless = load(makeFullScene());
    ASSERT_TRUE(rootless);
    EXPECT_FALSE(rootless->getTopNode()->getParent());
}

// Fault caught: the nodes, buffers, textures and programs of such a file stay for ever.
TEST_F(GloSceneTest, diesThoughItsSkinsAreBoundAcrossBranches)
{
    glo::GloScene scene = makeFullScene();
    scene.skins.push_back(scene.skins[0]);
    scene.skins[1].name = "other skin";
    glo::NodeData& top = scene.scene->top;
    top.children.clear();
    for (const int i : {0, 1})
    {
        scene.skins[size_t(i)].attachments = {{i == 0 ? "bone 1" : "bone 0", Matrix4f::IDENTITY}};
        const glo::SkinReference figure = {scene.skins[size_t(i)].name, {}, {}};
        top.children.push_back(
            makeNode("bone " + std::to_string(i), {makeNode("figure", &glo::NodeData::skin, figure)}));
    }
    scene.animations.clear();
    Glo::Ptr loaded = load(scene);
    ASSERT_TRUE(loaded);
    for (const char* bone : {"bone 0", "bone 1"})
    {
        const SceneNode* branch = loaded->getTopNode()->find(bone);
        const SceneNode* joint = asSolid(*branch->getChild(0)).getJoint(0).joint.get();
        EXPECT_TRUE(joint && joint != branch && joint->getParent() == branch->getParent());
    }
    loaded = nullptr;
    m_root = nullptr;
    m_pool->flush();
    m_pool->flush();
    m_pool = makeShared<AssetCachePool>(); // for TearDown()
    EXPECT_EQ("", glcalls::describeLiveNames());
}
