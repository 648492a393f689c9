#pragma once

#include "glo/glowriter.h"
#include "support/gltest.h"
#include "support/logcapture.h"

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

    /// Expects the one error with which the file is refused, or that it loads without any where error is empty.
    template <class File>
    orv::Glo::Ptr expectLoad(const File& file, const std::string& error, const std::string& what)
    {
        support::LogCapture log;
        const orv::Glo::Ptr loaded = load(file);
        EXPECT_EQ(error.empty(), bool(loaded)) << what << log.text();
        EXPECT_EQ(error.empty() ? 0 : 1, log.count('E')) << what << log.text();
        EXPECT_TRUE(error.empty() || log.countMessage(error) == 1) << what << log.text();
        return loaded;
    }

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

inline glo::NodeData makeNode(const std::string& name, const std::vector<glo::NodeData>& children = {})
{
    glo::NodeData node;
    node.name = node.scopedName = name;
    node.children = children;
    return node;
}

/// A node that shows one part of the file: node.*slot = reference.
template <class Slot, class Reference>
glo::NodeData makeNode(const std::string& name, Slot glo::NodeData::*slot, const Reference& reference)
{
    glo::NodeData node = makeNode(name);
    node.*slot = reference;
    return node;
}

inline glo::NodeData makeSolidNode(const std::string& name, const std::string& geometry,
                                   const std::string& material)
{
    return makeNode(name, &glo::NodeData::geometry, glo::GeometryReference{geometry, {material}});
}

inline glo::NodeData makeLightNode(const std::string& name)
{
    return makeNode(name, &glo::NodeData::light, glo::LightReference{"lamp"});
}

/// Places a node, in matrix and components alike.
inline void moveTo(glo::NodeData& node, const orv::Vector3f& position)
{
    node.translation = position;
    node.transform = orv::translationMatrix(position);
}

inline glo::Channel makeChannel(const char* type, const char* name, const char* property,
                                const std::vector<float>& values, float time = 1.0f)
{
    glo::Channel channel;
    channel.targetType = type;
    channel.targetName = name;
    channel.property = property;
    glo::addKey(channel, time, values);
    return channel;
}

/// One of everything that a file can hold.
inline glo::GloScene makeFullScene()
{
    glo::GloScene scene;
    scene.geometries = {makeSquareGeometry("square"), makeSquareGeometry("skinned")};
    scene.geometries[1].vertices =
        glo::makeVertexSet({{"a_position", 3, {0, 0, 0, 1, 0, 0, 1, 1, 0, 0, 1, 0}},
                            {"a_joints", 4, {0, 1, 0, 0, 0, 1, 0, 0, 0, 1, 0, 0, 0, 1, 0, 0}},
                            {"a_weights", 4, {1, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 1, 0, 0}}});
    scene.geometries[1].primitiveSets.push_back({glo::primitive::LINE_LOOP, {}});

    glo::Skin& skin = scene.skins.emplace_back();
    skin.name = "skin";
    skin.geometry = "skinned";
    skin.attachments = {{"hip", orv::Matrix4f::IDENTITY}, {"knee", orv::Matrix4f::IDENTITY}};
    scene.lights.emplace_back().name = "lamp";
    scene.cameras.emplace_back().name = "lens";
    scene.materials = {makeMaterial("red", orv::Vector4f(1, 0, 0, 1)),
                       makeMaterial("blue", orv::Vector4f(0, 0, 1, 1))};
    scene.materials[0].techniques[0].diffuse.sampler.emplace().image = "orv#white.png";

    glo::Channel move = makeChannel("node", "node-hip", "translation", {0, 0, 0}, 0.0f);
    glo::addKey(move, 1.0f, {0, 1, 0});
    const glo::Channel fade = makeChannel("material", "red", "opacity", {1.0f}, 0.0f);
    scene.animations.push_back({"walk", {{0.25f, 0.75f}}, {move}, {{"inner", {}, {fade}, {}}}});

    const glo::SkinReference figure = {"skin", {"blue", "blue"}, {"hip"}};
    scene.scene = glo::SceneData{
        "scene", makeNode("top", {makeSolidNode("square node", "square", "red"),
                                  makeNode("figure", &glo::NodeData::skin, figure),
                                  makeNode("hip", {makeNode("knee")}), makeLightNode("lamp node"),
                                  makeNode("eye", &glo::NodeData::camera, glo::CameraReference{"lens"})})};
    return scene;
}
