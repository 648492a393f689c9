#include "model.h"

#include "animations.h"
#include "lights.h"
#include "materials.h"
#include "meshes.h"
#include "names.h"
#include "placement.h"

#include <assimp/Importer.hpp>
#include <assimp/config.h>
#include <assimp/importerdesc.h>
#include <assimp/postprocess.h>
#include <assimp/scene.h>

#include <filesystem>
#include <limits>
#include <map>

namespace convert
{

namespace
{

constexpr int MOST_VERTICES = 65535; // of one mesh, for 16-bit indices
constexpr float CREASE_DEGREES = 66.0f;

const aiScene* import(Assimp::Importer& importer, const std::string& path)
{
    importer.SetPropertyInteger(AI_CONFIG_PP_SLM_VERTEX_LIMIT, MOST_VERTICES);
    importer.SetPropertyInteger(AI_CONFIG_PP_SLM_TRIANGLE_LIMIT, std::numeric_limits<int>::max());
    importer.SetPropertyFloat(AI_CONFIG_PP_GSN_MAX_SMOOTHING_ANGLE, CREASE_DEGREES);
    return importer.ReadFile(path, aiProcess_Triangulate | aiProcess_GenSmoothNormals |
                                       aiProcess_CalcTangentSpace | aiProcess_GenUVCoords |
                                       aiProcess_TransformUVCoords | aiProcess_SortByPType |
                                       aiProcess_JoinIdenticalVertices | aiProcess_SplitLargeMeshes |
                                       aiProcess_ImproveCacheLocality | aiProcess_ValidateDataStructure);
}

bool isGltf(const Assimp::Importer& importer)
{
    const int index = importer.GetPropertyInteger("importerIndex", -1); // as the importer leaves it
    const aiImporterDesc* format = index < 0 ? nullptr : importer.GetImporterInfo(size_t(index));
    return format && std::string(format->mName).find("glTF") != std::string::npos;
}

/// Makes the records of a scene, in the order in which they need each other.
class ModelConverter
{
public:
    ModelConverter(const aiScene& source, const std::string& path, const std::string& stem, bool fromGltf,
                   ConvertedModel& model)
        : m_source(source)
        , m_stem(stem)
        , m_fromGltf(fromGltf)
        , m_model(model)
        , m_textures(source, path, stem, model.report)
    {
    }

    void convert(const Options& options)
    {
        convertMaterials();
        convertMeshes();
        glo::NodeData top; // bare: what turns the model upright is the model's own top node, below this one
        top.name = top.scopedName = m_nodeNames.make(m_stem, "scene");
        nameNodes(*m_source.mRootNode);
        top.children.push_back(convertNode(*m_source.mRootNode));
        m_model.scene.scene = glo::SceneData{m_stem, std::move(top)};
        m_model.scene.animations = convertAnimations(m_source, m_names, options, m_model.report);
        m_model.textures = m_textures.getFiles();
    }

private:
    void convertMaterials()
    {
        NameMaker names;
        for (unsigned i = 0; i < m_source.mNumMaterials; ++i)
        {
            const aiMaterial& material = *m_source.mMaterials[i];
            bool repeats = false;
            bool used = false;
            for (unsigned m = 0; m < m_source.mNumMeshes; ++m)
            {
                const aiMesh& mesh = *m_source.mMeshes[m];
                if (mesh.mMaterialIndex != i)
                    continue;
                used = true;
                repeats = repeats || leavesPicture(mesh, findUvChannel(material));
            }
            m_materials.push_back(used ? convertMaterial(material, repeats, m_textures, names, m_model.report)
                                       : ConvertedMaterial());
            if (used)
                m_model.scene.materials.push_back(m_materials.back().material);
        }
    }

    void convertMeshes()
    {
        NameMaker names;
        for (unsigned i = 0; i < m_source.mNumMeshes; ++i)
        {
            const aiMesh& mesh = *m_source.mMeshes[i];
            m_geometryNames.emplace_back();
            if (!(mesh.mPrimitiveTypes & aiPrimitiveType_TRIANGLE) ||
                mesh.mNumVertices > unsigned(MOST_VERTICES))
            {
                m_model.report.lose("a mesh of points or lines");
                continue;
            }
            m_geometryNames.back() = names.make(mesh.mName.C_Str(), "mesh");
            m_model.scene.geometries.push_back(
                convertMesh(mesh, m_materials[mesh.mMaterialIndex], m_geometryNames.back(), m_model.report));
            m_model.vertexCount += mesh.mNumVertices;
            m_model.triangleCount +=
                m_model.scene.geometries.back().primitiveSets[0].indices->indices.size() / 3;
        }
    }

    /// Parents first, so that of several nodes of one name the first keeps it, as in the model.
    void nameNodes(const aiNode& node)
    {
        m_names[&node] = m_nodeNames.make(node.mName.C_Str(), "node");
        ++m_model.nodeCount;
        for (unsigned i = 0; i < node.mNumChildren; ++i)
            nameNodes(*node.mChildren[i]);
    }

    glo::NodeData convertNode(const aiNode& source)
    {
        glo::NodeData node;
        node.name = node.scopedName = m_names[&source];
        if (!place(node, source.mTransformation))
            m_model.report.lose("the shear of node \"" + node.name + "\"");
        for (unsigned i = 0; i < source.mNumMeshes; ++i)
            addMesh(source.mMeshes[i], node);
        // Lights and cameras belong to the first node of their name.
        if (m_source.mRootNode->FindNode(source.mName) == &source)
        {
            addLights(source, node);
            addCameras(source, node);
        }
        for (unsigned i = 0; i < source.mNumChildren; ++i)
            node.children.push_back(convertNode(*source.mChildren[i]));
        return node;
    }

    void addMesh(unsigned index, glo::NodeData& node)
    {
        const std::string& geometry = m_geometryNames[index];
        if (geometry.empty())
            return;
        const std::string& material = m_materials[m_source.mMeshes[index]->mMaterialIndex].material.name;
        glo::NodeData& holder = node.geometry ? addChild(node, geometry) : node;
        holder.geometry = glo::GeometryReference{geometry, {material}};
    }

    glo::NodeData& addChild(glo::NodeData& node, const std::string& name)
    {
        glo::NodeData& child = node.children.emplace_back();
        child.name = child.scopedName = m_nodeNames.make(name, "part");
        return child;
    }

    /// The node itself if the object sits in it as the engine has it, looking along -z; else a child that does.
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
            if (!(light.mName == source.mName) ||
                !convertLight(light, m_fromGltf, definition, m_model.report))
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
            glo::CameraDefinition definition = convertCamera(camera, m_fromGltf);
            definition.name = m_cameraNames.make(camera.mName.C_Str(), "camera");
            // The glTF importer repeats the node's position in the camera.
            const aiVector3D position = m_fromGltf ? aiVector3D() : camera.mPosition;
            const aiMatrix4x4 transform = lookingAlong(position, camera.mLookAt, camera.mUp);
            addHolder(node, !node.camera, definition.name + " view", transform).camera =
                glo::CameraReference{definition.name};
            m_model.scene.cameras.push_back(definition);
        }
    }

    const aiScene& m_source;
    std::string m_stem;
    bool m_fromGltf;
    ConvertedModel& m_model;
    TextureStore m_textures;
    std::vector<ConvertedMaterial> m_materials; ///< by the model's index
    std::vector<std::string> m_geometryNames;   ///< likewise; empty for a mesh that is left out
    NameMaker m_nodeNames;
    NameMaker m_lightNames;
    NameMaker m_cameraNames;
    std::map<const aiNode*, std::string> m_names;
};

} // namespace

bool convertModel(const std::string& path, const std::string& stem, const Options& options,
                  ConvertedModel& model, std::string& error)
{
    std::error_code reason;
    if (!std::filesystem::is_regular_file(path, reason))
    {
        error = reason ? reason.message() : "not a file";
        return false;
    }
    Assimp::Importer importer;
    const aiScene* source = import(importer, path);
    if (!source || !source->mRootNode)
    {
        error = importer.GetErrorString();
        return false;
    }
    if (source->mFlags & AI_SCENE_FLAGS_INCOMPLETE && source->mNumMeshes == 0)
    {
        error = "holds nothing that can be drawn";
        return false;
    }
    ModelConverter(*source, path, stem, isGltf(importer), model).convert(options);
    return true;
}

} // namespace convert
