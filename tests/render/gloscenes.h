#pragma once

#include "glo/glowriter.h"

#include <string>
#include <vector>

// Scenes that tests write with tools/glo.

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
