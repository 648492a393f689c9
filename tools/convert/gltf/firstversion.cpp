#include "firstversion.h"

#include "convert/scene/placement.h"

#include <assimp/camera.h>
#include <assimp/light.h>
#include <assimp/scene.h>

#include <array>
#include <cmath>

namespace convert::gltf
{

namespace
{

/// @param node  with translation, rotation and scale, which the importer applies in the wrong order.
void composeNode(aiNode& target, const Object& node)
{
    std::array<float, 3> t = {0.0f, 0.0f, 0.0f};
    std::array<float, 4> r = {0.0f, 0.0f, 0.0f, 1.0f};
    std::array<float, 3> s = {1.0f, 1.0f, 1.0f};
    const bool hasTranslation = node.numbers("translation", t);
    node.numbers("rotation", r);
    node.numbers("scale", s);
    if (hasTranslation)
        target.mTransformation = compose(aiVector3D(t[0], t[1], t[2]), aiQuaternion(r[3], r[0], r[1], r[2]),
                                         aiVector3D(s[0], s[1], s[2]));
}

void correctViews(aiScene& scene)
{
    for (unsigned i = 0; i < scene.mNumCameras; ++i)
    {
        aiCamera& camera = *scene.mCameras[i];
        const float aspect = camera.mAspect > 0.0f ? camera.mAspect : 1.0f;
        const float upright = camera.mHorizontalFOV / aspect; // the importer multiplies by the aspect ratio
        camera.mHorizontalFOV = 2.0f * std::atan(std::tan(upright * 0.5f) * aspect);
    }
    for (unsigned i = 0; i < scene.mNumLights; ++i)
    {
        scene.mLights[i]->mAngleInnerCone *= 2.0f;
        scene.mLights[i]->mAngleOuterCone *= 2.0f;
    }
}

} // namespace

void correctFirstVersion(aiScene& scene, const Document* file, Report& report)
{
    correctViews(scene);
    if (!file)
        return;
    const Object root = file->root();
    const Object nodes = root.object("nodes");
    for (const std::string& id : nodes.keys())
    {
        const Object node = nodes.object(id.c_str());
        aiNode* target = scene.mRootNode->FindNode(id.c_str());
        if (target && !node.has("matrix"))
            composeNode(*target, node);
    }
    const size_t animations = root.object("animations").keys().size();
    if (animations > 0)
        report.lose("gltf1-animations",
                    "the animations of a glTF 1.0 file (" + std::to_string(animations) + ")");
    const size_t skins = root.object("skins").keys().size();
    if (skins > 0)
        report.lose("gltf1-skins", "the skins of a glTF 1.0 file (" + std::to_string(skins) + ")");
}

} // namespace convert::gltf
