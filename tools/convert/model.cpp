#include "model.h"

#include "convert/files/modelfiles.h"
#include "convert/materials/materials.h"
#include "convert/meshes/meshes.h"
#include "convert/scene/lights.h"
#include "convert/scene/placement.h"
#include "importer.h"
#include "names.h"
#include "progress.h"

#include <cerrno>
#include <cstring>
#include <set>

namespace convert
{

namespace
{

/// Makes the records of a scene, in the order of their dependencies.
class ModelConverter
{
public:
    ModelConverter(const ImportedModel& source, ModelFiles& files, const std::string& stem,
                   const Options& options, ConvertedModel& model)
        : m_source(*source.scene)
        , m_hidesColours(source.hidesColours)
        , m_isGltf(source.own != nullptr)
        , m_toScene(source.toScene)
        , m_stem(stem)
        , m_options(options)
        , m_model(model)
        , m_textures(m_source, files, stem, options, model.report)
    {
    }

    void convert()
    {
        convertMaterials();
        convertMeshes();
        glo::NodeData top; // without a transform; the node below turns the model upright
        top.name = top.scopedName = m_nodeNames.make(m_stem, "scene");
        glo::NodeData upright = makeNode(m_nodeNames.make(m_stem + " upright", ""));
        nameNodes(*m_source.mRootNode);
        findAnimatedNodes();
        glo::NodeData root = convertNode(*m_source.mRootNode);
        if (m_toScene.IsIdentity())
            top.children.push_back(std::move(root));
        else
        {
            place(upright, m_toScene);
            upright.children.push_back(std::move(root));
            top.children.push_back(std::move(upright));
        }
        if (m_options.animation)
            convertMotion(top);
        m_model.scene.scene = glo::SceneData{m_stem, std::move(top)};
        m_model.textures = m_textures.getFiles();
    }

private:
    void convertMaterials()
    {
        NameMaker names;
        for (unsigned i = 0; i < m_source.mNumMaterials; ++i)
        {
            const aiMaterial& material = *m_source.mMaterials[i];
            MaterialUse use;
            use.linear = m_options.linear;
            use.sky = m_options.sky;
            bool used = false;
            for (unsigned m = 0; m < m_source.mNumMeshes; ++m)
            {
                const aiMesh& mesh = *m_source.mMeshes[m];
                if (mesh.mMaterialIndex != i)
                    continue;
                used = true;
                use.repeats = use.repeats || leavesPicture(mesh, findUvChannel(material));
                const bool hasColours = isColoured(mesh, m_isGltf);
                if (hasColours && m_hidesColours)
                    m_model.report.approximate("vertex-colours",
                                               "vertex colours (kept as a_colour and not shown, as "
                                               "Blender shows them on request alone)");
                use.hasColours = use.hasColours || (hasColours && !m_hidesColours);
                use.isSurface =
                    use.isSurface || mesh.mNormals || mesh.mPrimitiveTypes & aiPrimitiveType_TRIANGLE;
            }
            m_materials.push_back(used ? convertMaterial(material, use, m_textures, names, m_model.report)
                                       : ConvertedMaterial());
            m_materials.back().isFlat = m_isGltf;
            if (used)
                addMaterial(m_materials.back().material);
        }
    }

    void addMaterial(const glo::Material& material)
    {
        glo::GloScene& scene = m_model.scene;
        const glo::StandardMaterial& made = material.techniques.back();
        if (made.features != 0)
            scene.surfaces.list.push_back({uint32_t(scene.materials.size()), made.features, made.cutoff});
        scene.materials.push_back(material);
    }

    /// A part of a mesh of the model.
    struct Part
    {
        std::string geometry;
        std::vector<uint16_t> bones; ///< see MeshPart
    };

    void convertMeshes()
    {
        NameMaker names;
        for (unsigned i = 0; i < m_source.mNumMeshes; ++i)
        {
            const aiMesh& mesh = *m_source.mMeshes[i];
            showProgress("meshes", float(i) / float(m_source.mNumMeshes));
            m_parts.emplace_back();
            for (MeshPart& part : convertMesh(mesh, m_materials[mesh.mMaterialIndex], m_model.report))
            {
                part.geometry.name = names.make(mesh.mName.C_Str(), "mesh");
                m_parts.back().push_back({part.geometry.name, std::move(part.bones)});
                m_model.scene.geometries.push_back(std::move(part.geometry));
            }
        }
    }

    /// Parents first, so that the first node of a name keeps it.
    void nameNodes(const aiNode& node)
    {
        m_names[&node] = m_nodeNames.make(node.mName.C_Str(), "node");
        m_nodes.emplace(node.mName.C_Str(), &node);
        for (unsigned i = 0; i < node.mNumChildren; ++i)
            nameNodes(*node.mChildren[i]);
    }

    const aiNode* findNode(const aiString& name) const
    {
        const auto found = m_nodes.find(name.C_Str());
        return found != m_nodes.end() ? found->second : nullptr;
    }

    void findAnimatedNodes()
    {
        for (unsigned i = 0; i < (m_options.animation ? m_source.mNumAnimations : 0); ++i)
        {
            const aiAnimation& animation = *m_source.mAnimations[i];
            for (unsigned c = 0; c < animation.mNumChannels; ++c)
                m_animated.insert(findNode(animation.mChannels[c]->mNodeName));
        }
    }

    static glo::NodeData makeNode(const std::string& name)
    {
        glo::NodeData node;
        node.name = node.scopedName = name;
        return node;
    }

    glo::NodeData convertNode(const aiNode& source)
    {
        glo::NodeData node = makeNode(m_names[&source]);
        const bool isHeld = place(node, source.mTransformation);
        for (unsigned i = 0; i < source.mNumMeshes; ++i)
            addMesh(source.mMeshes[i], source, node);
        // Lights and cameras belong to the first node of their name.
        if (findNode(source.mName) == &source)
        {
            addLights(source, node);
            addCameras(source, node);
        }
        for (unsigned i = 0; i < source.mNumChildren; ++i)
            node.children.push_back(convertNode(*source.mChildren[i]));
        return isHeld ? node : addShear(std::move(node), source);
    }

    /// A node with shear becomes two. An animated node stays one: its keys have no shear.
    glo::NodeData addShear(glo::NodeData node, const aiNode& source)
    {
        if (m_animated.count(&source) > 0)
        {
            m_model.report.approximate("animated-shear",
                                       "the shear of node \"" + node.name + "\" while no animation moves it");
            return node;
        }
        const Nested nested = splitShear(source.mTransformation);
        glo::NodeData outer = makeNode(m_nodeNames.make(node.name + " shear", ""));
        place(outer, nested.outer);
        place(node, nested.inner);
        outer.children.push_back(std::move(node));
        m_model.report.count("shear-nodes", 1);
        return outer;
    }

    void addMesh(unsigned index, const aiNode& source, glo::NodeData& node)
    {
        const aiMesh& mesh = *m_source.mMeshes[index];
        const std::vector<std::string> materials = {m_materials[mesh.mMaterialIndex].material.name};
        for (const Part& part : m_parts[index])
        {
            const bool isTurned = !part.bones.empty() && isTurnedBySkin(mesh, part, source);
            const bool isFree = !node.geometry && !node.skin && !isTurned;
            glo::NodeData& holder = isFree ? node : addChild(node, part.geometry);
            if (isTurned)
            {
                aiMatrix4x4 mirror;
                place(holder, aiMatrix4x4::Scaling(aiVector3D(-1, 1, 1), mirror));
            }
            if (part.bones.empty())
                holder.geometry = glo::GeometryReference{part.geometry, materials};
            else
                holder.skin = glo::SkinReference{addSkin(mesh, part, m_names[&source]), materials, {}};
        }
    }

    static aiMatrix4x4 getWorld(const aiNode& node)
    {
        return node.mParent ? getWorld(*node.mParent) * node.mTransformation : node.mTransformation;
    }

    /// A mesh's node determines the winding, its joints the vertices. So if only one of them mirrors, the mesh gets a
    /// mirrored node.
    bool isTurnedBySkin(const aiMesh& mesh, const Part& part, const aiNode& source) const
    {
        const aiBone* bone = part.bones[0] < mesh.mNumBones ? mesh.mBones[part.bones[0]] : nullptr;
        const aiNode* joint = bone ? findNode(bone->mName) : nullptr;
        const float skinned = joint ? (getWorld(*joint) * bone->mOffsetMatrix).Determinant() : 0.0f;
        return skinned * getWorld(source).Determinant() < 0.0f;
    }

    /// Joints transform vertices from the file's mesh to the scene. An assimp bone's matrix leads from the mesh to the
    /// joint in the bind pose.
    const std::string& addSkin(const aiMesh& mesh, const Part& part, const std::string& ownName)
    {
        glo::Skin& skin = m_model.scene.skins.emplace_back();
        skin.name = m_skinNames.make(part.geometry, "skin");
        skin.geometry = part.geometry;
        for (const uint16_t number : part.bones)
        {
            const aiBone* bone = number < mesh.mNumBones ? mesh.mBones[number] : nullptr;
            const aiNode* joint = bone ? findNode(bone->mName) : nullptr;
            if (joint)
                skin.attachments.push_back({m_names[joint], toMatrix(bone->mOffsetMatrix)});
            else
                skin.attachments.push_back({ownName, orv::Matrix4f::IDENTITY});
        }
        return skin.name;
    }

    glo::NodeData& addChild(glo::NodeData& node, const std::string& name)
    {
        return node.children.emplace_back(makeNode(m_nodeNames.make(name, "part")));
    }

    /// The node itself if the object looks along its -z; else a child that does.
    glo::NodeData& addHolder(glo::NodeData& node, bool isFree, const std::string& name,
                             const aiMatrix4x4& transform)
    {
        if (isFree && transform.IsIdentity())
            return node;
        glo::NodeData& child = addChild(node, name);
        place(child, transform);
        return child;
    }

    void addLights(const aiNode& source, glo::NodeData& node)
    {
        for (unsigned i = 0; i < m_source.mNumLights; ++i)
        {
            const aiLight& light = *m_source.mLights[i];
            glo::LightDefinition definition;
            if (!(light.mName == source.mName) || !convertLight(light, definition, m_model.report))
                continue;
            definition.name = m_lightNames.make(light.mName.C_Str(), "light");
            const bool isDirected = light.mType != aiLightSource_POINT;
            const aiVector3D ahead(0, 0, -1);
            const aiMatrix4x4 transform = lookingAlong(light.mPosition, isDirected ? light.mDirection : ahead,
                                                       isDirected ? light.mUp : aiVector3D(0, 1, 0));
            addHolder(node, !node.light, definition.name + " light", transform).light =
                glo::LightReference{definition.name};
            m_model.scene.lights.push_back(definition);
        }
    }

    void addCameras(const aiNode& source, glo::NodeData& node)
    {
        for (unsigned i = 0; i < m_source.mNumCameras; ++i)
        {
            const aiCamera& camera = *m_source.mCameras[i];
            if (!(camera.mName == source.mName))
                continue;
            glo::CameraDefinition definition = convertCamera(camera);
            definition.name = m_cameraNames.make(camera.mName.C_Str(), "camera");
            const aiMatrix4x4 transform = placeCamera(camera, source.mTransformation);
            addHolder(node, !node.camera, definition.name + " view", transform).camera =
                glo::CameraReference{definition.name};
            m_model.scene.cameras.push_back(definition);
        }
    }

    void convertMotion(glo::NodeData& top)
    {
        const std::string clipNode = m_nodeNames.make("clips", "");
        Motion motion = convertAnimations(m_source, m_names, clipNode, m_options, m_model.report);
        if (motion.usesClipNode)
            top.children.push_back(makeNode(clipNode));
        m_model.clips = std::move(motion.clips);
        m_model.scene.animations = std::move(motion.animations);
    }

    const aiScene& m_source;
    bool m_hidesColours;
    bool m_isGltf; ///< 2.0, whose values are used without guessing
    aiMatrix4x4 m_toScene;
    std::string m_stem;
    const Options& m_options;
    ConvertedModel& m_model;
    TextureStore m_textures;
    std::vector<ConvertedMaterial> m_materials; ///< by the model's index
    std::vector<std::vector<Part>> m_parts;     ///< by the model's index of meshes
    NameMaker m_nodeNames;
    NameMaker m_lightNames;
    NameMaker m_cameraNames;
    NameMaker m_skinNames;
    NodeNames m_names;
    std::map<std::string, const aiNode*> m_nodes; ///< the first of each name
    std::set<const aiNode*> m_animated;
};

/// A number as people write it: "4,212".
std::string group(uint64_t number)
{
    std::string text = std::to_string(number);
    for (size_t at = text.size(); at > 3; at -= 3)
        text.insert(at - 3, ",");
    return text;
}

/// @param error  why there is nothing.
bool hasSomethingToDraw(const ConvertedModel& model, std::string& error)
{
    for (const glo::Geometry& geometry : model.scene.geometries)
    {
        for (const glo::PrimitiveSet& set : geometry.primitiveSets)
        {
            if (set.indices && !set.indices->indices.empty())
                return true;
        }
    }
    const auto dropped = model.report.getFigures().find("degenerate-faces");
    const uint64_t count = dropped != model.report.getFigures().end() ? dropped->second : 0;
    error = "nothing that can be drawn is left";
    if (count > 0)
        error += ": " + group(count) + (count > 1 ? " faces" : " face") + " without area";
    return false;
}

} // namespace

bool convertModel(const std::string& path, ModelFiles& files, const std::string& stem, const Options& options,
                  ConvertedModel& model, std::string& error)
{
    int reason = 0;
    if (!files.open(path, &reason))
    {
        error = reason == EISDIR ? "not a file" : std::strerror(reason);
        return false;
    }
    ImportedModel source;
    bool isConverted = importModel(path, files, options, source, model.report, error);
    if (isConverted)
    {
        ModelConverter(source, files, stem, options, model).convert();
        isConverted = hasSomethingToDraw(model, error);
    }
    for (const std::string& refused : files.getRefused())
    {
        model.report.lose("file-refused",
                          "file \"" + refused + "\", which is not in the model's folder (see --allow)");
        if (!isConverted)
            error += "; not in the model's folder, and so not read (see --allow): " + refused;
    }
    return isConverted;
}

} // namespace convert
