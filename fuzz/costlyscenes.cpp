#include "seeds.h"

#include "render/gloscenes.h"

#include <cstdlib>

namespace hostile
{

namespace
{

Bytes write(const glo::GloScene& scene)
{
    Bytes file;
    std::string error;
    if (!glo::writeGlo(scene, file, error))
        std::abort(); // a fault in this file
    return file;
}

glo::GloScene makeScene(const std::vector<glo::NodeData>& children)
{
    glo::GloScene scene;
    scene.scene = glo::SceneData{"scene", makeNode("top", children)};
    return scene;
}

glo::NodeData makeFigure(const std::string& skin, const std::vector<std::string>& skeletons = {})
{
    return makeNode("figure", &glo::NodeData::skin, glo::SkinReference{skin, {}, skeletons});
}

/// @param sets  of the one geometry, "square", that the one skin, "skin", moves by this many joints of one name.
void addSkin(glo::GloScene& scene, size_t sets, size_t joints, const std::string& joint)
{
    scene.geometries = {makeSquareGeometry("square")};
    scene.geometries[0].primitiveSets.resize(sets);
    scene.skins.emplace_back();
    scene.skins[0].name = "skin";
    scene.skins[0].geometry = "square";
    scene.skins[0].attachments.resize(joints, {joint, {}});
}

/// A number of things, each made by a number of others.
glo::GloScene makeSolids(size_t nodes, size_t sets)
{
    glo::GloScene scene =
        makeScene(std::vector<glo::NodeData>(nodes, makeSolidNode("node", "square", "none")));
    scene.geometries = {makeSquareGeometry("square")};
    scene.geometries[0].primitiveSets.resize(sets);
    return scene;
}

glo::GloScene makeLights(size_t nodes, const std::vector<glo::Channel>& channels)
{
    glo::GloScene scene = makeScene(std::vector<glo::NodeData>(nodes, makeLightNode("lamp node")));
    scene.lights.emplace_back().name = "lamp";
    scene.animations.push_back({"all", {}, channels, {}});
    return scene;
}

/// @param image  a "%" in it is the number of the material.
glo::GloScene makeMaterials(size_t count, const std::string& image)
{
    glo::GloScene scene = makeScene({});
    for (size_t i = 0; i < count; ++i)
    {
        scene.materials.push_back(makeMaterial("material", orv::Vector4f(1, 1, 1, 1)));
        const size_t number = image.find('%');
        scene.materials.back().techniques[0].diffuse.sampler.emplace().image =
            number < image.size() ? image.substr(0, number) + std::to_string(i) : image;
    }
    return scene;
}

} // namespace

void addCostlyScenes(std::vector<Seed>& files)
{
    const auto add = [&files](const char* name, bool loads, const char* error, const glo::GloScene& scene) {
        files.push_back({"scene", name, write(scene), error, loads});
    };
    const char* const beyond = "References in file.glo ask for more than a file of its size may have";
    const char* const noJoint = "Joint node \"none\" not found.";

    add("solids", false, beyond, makeSolids(500, 5000));
    add("nodes", true, "", makeSolids(50000, 1)); // a real scene may have that many

    for (const size_t sets : {size_t(0), size_t(1)})
    {
        glo::GloScene scene = makeScene(std::vector<glo::NodeData>(2000, makeFigure("skin")));
        addSkin(scene, sets, 2000, "none");
        add(sets > 0 ? "skins times joints" : "skins times joints of no solid", false, noJoint, scene);
    }
    {
        glo::GloScene scene = makeScene(
            std::vector<glo::NodeData>(100, makeFigure("skin", std::vector<std::string>(500, "figure"))));
        addSkin(scene, 0, 500, "none");
        add("skeletons times joints", false, noJoint, scene);
    }
    {
        glo::GloScene scene = makeScene(std::vector<glo::NodeData>(2000, makeNode("bone")));
        scene.scene->top.children.push_back(makeFigure("skin", {"figure"}));
        addSkin(scene, 1, 2000, "bone");
        add("nodes and joints of one name", true, "Solid \"figure\" has more than 20 joints", scene);
    }

    add("lights times channels", false, beyond,
        makeLights(1000, std::vector<glo::Channel>(
                             1000, makeChannel("light", "lamp", "colour", {1.0f, 1.0f, 1.0f, 1.0f}))));
    add("unknown channels", true, "",
        makeLights(1, std::vector<glo::Channel>(5000, makeChannel("light", "lamp", "shape", {1.0f}))));
    {
        glo::GloScene scene = makeLights(1, {});
        for (int depth = 0; depth < 400; ++depth)
            scene.animations[0] = {
                "outer",
                {},
                std::vector<glo::Channel>(10, makeChannel("light", "lamp", "multiplier", {1.0f})),
                scene.animations};
        add("animations in one another", true, "", scene);
    }

    add("materials", true, "", makeMaterials(1000, "orv#white.png"));
    add("missing textures", true, "Failed to find 2d texture \"none0\"", makeMaterials(1000, "none%"));
    {
        glo::GloScene scene = makeLights(2000, {});
        scene.lights[0].type = glo::light::AMBIENT;
        add("ambient lights", true, "", scene);
    }
    {
        glo::GloScene scene = makeScene({});
        scene.geometries.resize(5000);
        add("empty geometries", true, "", scene);
        scene.geometries = {makeSquareGeometry("square")};
        scene.geometries[0].vertices.attributes.resize(5000, {"a", 1, glo::type::COUNT - 1, 0, 0, 0});
        add("attributes", true, "", scene);
    }
}

} // namespace hostile
