#pragma once

#include "glo/glowriter.h"
#include "support/gltest.h"

#include "orv/assetcachepool.h"
#include "orv/glo.h"
#include "orv/memorystream.h"
#include "orv/scenenode.h"

#include <map>

/// Files held in memory, which tests may replace.
class GloTestSource : public orv::StreamSource
{
public:
    bool exists(const char* name) const override { return m_files.find(name) != m_files.end(); }

    orv::SharedPtr<orv::Stream> open(const char* name, bool) override
    {
        const std::vector<uint8_t>& file = m_files[name];
        return orv::makeShared<orv::MemoryStream>(file.data(), int(file.size()));
    }

    const char* getName() const override { return "GloTestSource"; }

    void set(const std::string& name, const std::vector<uint8_t>& file) { m_files[name] = file; }

private:
    std::map<std::string, std::vector<uint8_t>> m_files;
};

/// Writes scenes with tools/glo and loads them with the engine.
class GloTest : public support::GlTest
{
protected:
    GloTest() = default;
    explicit GloTest(const headless::Options& options) : GlTest(options) {}

    void SetUp() override
    {
        GlTest::SetUp();
        m_pool = orv::makeShared<orv::AssetCachePool>();
        m_source = orv::makeShared<GloTestSource>();
        m_pool->registerSource(m_source);
        m_root = orv::makeShared<orv::SceneNode>();
    }

    void TearDown() override
    {
        m_root.reset();
        m_pool->flush();
        m_pool->flush();
        m_pool.reset();
        GlTest::TearDown();
    }

    static std::vector<uint8_t> write(const glo::GloScene& scene)
    {
        std::vector<uint8_t> file;
        std::string error;
        EXPECT_TRUE(glo::writeGlo(scene, file, error)) << error;
        return file;
    }

    orv::Glo::Ptr load(const std::vector<uint8_t>& file)
    {
        m_source->set("test.glo", file);
        return orv::loadGloFile(*m_pool, m_root, "test.glo");
    }

    orv::Glo::Ptr load(const glo::GloScene& scene) { return load(write(scene)); }

    orv::SharedPtr<orv::AssetCachePool> m_pool;
    orv::SharedPtr<GloTestSource> m_source;
    orv::SharedPtr<orv::SceneNode> m_root;
};

/// A square from -0.5 to 0.5 that faces +z, as one set of indexed triangles.
inline glo::Geometry makeSquareGeometry(const std::string& name)
{
    glo::Geometry geometry;
    geometry.name = name;
    geometry.vertices = glo::makeVertexSet(
        {{"a_position", 3, {-0.5f, -0.5f, 0.0f, 0.5f, -0.5f, 0.0f, 0.5f, 0.5f, 0.0f, -0.5f, 0.5f, 0.0f}},
         {"a_normal", 3, {0, 0, 1, 0, 0, 1, 0, 0, 1, 0, 0, 1}},
         {"a_uv0", 2, {0, 0, 1, 0, 1, 1, 0, 1}}});
    geometry.primitiveSets.push_back({glo::primitive::TRIANGLES, glo::IndexData{3, {0, 1, 2, 0, 2, 3}}});
    return geometry;
}

inline glo::Material makeMaterial(const std::string& name, const orv::Vector4f& diffuse)
{
    glo::StandardMaterial technique;
    technique.diffuse.colour = diffuse;
    return {name, {technique}};
}

inline glo::NodeData makeNode(const std::string& name)
{
    glo::NodeData node;
    node.name = name;
    node.scopedName = name;
    return node;
}

/// Places a node, in matrix and components alike.
inline void moveTo(glo::NodeData& node, const orv::Vector3f& position)
{
    node.translation = position;
    node.transform = orv::translationMatrix(position);
}

/// One of everything that a file can hold.
inline glo::GloScene makeFullScene()
{
    glo::GloScene scene;
    scene.geometries = {makeSquareGeometry("square"), makeSquareGeometry("skinned")};
    glo::VertexSet& vertices = scene.geometries[1].vertices;
    vertices = glo::makeVertexSet({{"a_position", 3, {0, 0, 0, 1, 0, 0, 1, 1, 0, 0, 1, 0}},
                                   {"a_joints", 4, {0, 1, 0, 0, 0, 1, 0, 0, 0, 1, 0, 0, 0, 1, 0, 0}},
                                   {"a_weights", 4, {1, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 1, 0, 0}}});
    scene.geometries[1].primitiveSets.push_back({glo::primitive::LINE_LOOP, {}});

    glo::Skin skin;
    skin.name = "skin";
    skin.geometry = "skinned";
    skin.attachments = {{"hip", orv::Matrix4f::IDENTITY}, {"knee", orv::Matrix4f::IDENTITY}};
    scene.skins.push_back(skin);

    glo::LightDefinition light;
    light.name = "lamp";
    scene.lights.push_back(light);
    glo::CameraDefinition camera;
    camera.name = "lens";
    scene.cameras.push_back(camera);

    scene.materials = {makeMaterial("red", orv::Vector4f(1, 0, 0, 1)),
                       makeMaterial("blue", orv::Vector4f(0, 0, 1, 1))};
    glo::Sampler sampler;
    sampler.image = "orv#white.png";
    scene.materials[0].techniques[0].diffuse.sampler = sampler;

    glo::Channel move;
    move.targetType = "node";
    move.targetName = "node-hip";
    move.property = "translation";
    glo::addKey(move, 0.0f, {0, 0, 0});
    glo::addKey(move, 1.0f, {0, 1, 0});
    glo::Channel fade;
    fade.targetType = "material";
    fade.targetName = "red";
    fade.property = "opacity";
    glo::addKey(fade, 0.0f, {1.0f});
    glo::AnimationData animation;
    animation.name = "walk";
    animation.loopRanges.push_back({0.25f, 0.75f});
    animation.channels.push_back(move);
    animation.animations.push_back({"inner", {}, {fade}, {}});
    scene.animations.push_back(animation);

    glo::NodeData top = makeNode("top");
    glo::NodeData square = makeNode("square node");
    square.geometry = glo::GeometryReference{"square", {"red"}};
    glo::NodeData figure = makeNode("figure");
    figure.skin = glo::SkinReference{"skin", {"blue", "blue"}, {"hip"}};
    glo::NodeData hip = makeNode("hip");
    hip.children.push_back(makeNode("knee"));
    glo::NodeData lamp = makeNode("lamp node");
    lamp.light = glo::LightReference{"lamp"};
    glo::NodeData eye = makeNode("eye");
    eye.camera = glo::CameraReference{"lens"};
    top.children = {square, figure, hip, lamp, eye};
    scene.scene = glo::SceneData{"scene", top};
    return scene;
}
