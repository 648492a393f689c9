#include "figures.h"

#include <assimp/scene.h>

namespace convert
{

namespace
{

uint64_t countNodes(const aiNode& node)
{
    uint64_t count = 1;
    for (unsigned i = 0; i < node.mNumChildren; ++i)
        count += countNodes(*node.mChildren[i]);
    return count;
}

uint64_t countNodes(const glo::NodeData& node)
{
    uint64_t count = 1;
    for (const glo::NodeData& child : node.children)
        count += countNodes(child);
    return count;
}

struct Shapes
{
    uint64_t vertices = 0, triangles = 0, lines = 0, points = 0;

    void report(Report& target, void (Report::*add)(const std::string&, uint64_t)) const
    {
        (target.*add)("vertices", vertices);
        (target.*add)("triangles", triangles);
        (target.*add)("lines", lines);
        (target.*add)("points", points);
    }
};

void add(const aiMesh& mesh, Shapes& shapes)
{
    shapes.vertices += mesh.mNumVertices;
    for (unsigned i = 0; i < mesh.mNumFaces; ++i)
    {
        const unsigned corners = mesh.mFaces[i].mNumIndices;
        if (corners > 2)
            shapes.triangles += corners - 2; // of polygons as well
        else
            ++(corners == 1 ? shapes.points : shapes.lines);
    }
}

void add(const glo::Geometry& geometry, Shapes& shapes)
{
    shapes.vertices += geometry.vertices.vertexCount;
    for (const glo::PrimitiveSet& set : geometry.primitiveSets)
    {
        const uint64_t corners = set.indices ? set.indices->indices.size() : geometry.vertices.vertexCount;
        switch (set.primitive)
        {
        case glo::primitive::POINTS: shapes.points += corners; break;
        case glo::primitive::LINES: shapes.lines += corners / 2; break;
        default: shapes.triangles += corners / 3;
        }
    }
}

} // namespace

void countModel(const aiScene& model, Report& report)
{
    Shapes shapes;
    uint64_t bones = 0;
    uint64_t morphTargets = 0;
    for (unsigned i = 0; i < model.mNumMeshes; ++i)
    {
        add(*model.mMeshes[i], shapes);
        bones += model.mMeshes[i]->mNumBones;
        morphTargets += model.mMeshes[i]->mNumAnimMeshes;
    }
    report.cameIn("nodes", countNodes(*model.mRootNode));
    report.cameIn("meshes", model.mNumMeshes);
    shapes.report(report, &Report::cameIn);
    report.cameIn("bones", bones);
    report.cameIn("morph-targets", morphTargets);
    report.cameIn("materials", model.mNumMaterials);
    report.cameIn("lights", model.mNumLights);
    report.cameIn("cameras", model.mNumCameras);
    report.cameIn("animations", model.mNumAnimations);
}

void countScene(const glo::GloScene& scene, Report& report)
{
    Shapes shapes;
    for (const glo::Geometry& geometry : scene.geometries)
        add(geometry, shapes);
    report.wentOut("nodes", scene.scene ? countNodes(scene.scene->top) : 0);
    report.wentOut("geometries", scene.geometries.size());
    shapes.report(report, &Report::wentOut);
    report.wentOut("skins", scene.skins.size());
    report.wentOut("materials", scene.materials.size());
    report.wentOut("lights", scene.lights.size());
    report.wentOut("cameras", scene.cameras.size());
    report.wentOut("animations", scene.animations.size());
}

} // namespace convert
