#include "scenereader.h"

#include "animations.h"
#include "extensions.h"
#include "materials.h"
#include "primitives.h"
#include "shapes.h"
#include "skins.h"
#include "views.h"

#include "convert/names.h"
#include "convert/progress.h"
#include "convert/scene/placement.h"

#include <assimp/scene.h>

#include <array>

namespace convert::gltf
{

namespace
{

constexpr size_t DEEPEST = 1000; // levels of nodes; a scene file allows fewer

/// A node's variant of a mesh.
struct MeshUse
{
    size_t mesh = 0;
    std::optional<size_t> skin;
    std::vector<float> weights;
    bool isMoving = false; ///< see PrimitiveUse

    auto tie() const { return std::tie(mesh, skin, weights, isMoving); }
    bool operator<(const MeshUse& other) const { return tie() < other.tie(); }
};

/// Moves a vector's elements to an array of libassimp's.
template <class T>
void hand(std::vector<std::unique_ptr<T>>&& things, T**& array, unsigned& count)
{
    delete[] array;
    count = unsigned(things.size());
    array = things.empty() ? nullptr : new T*[things.size()];
    for (size_t i = 0; i < things.size(); ++i)
        array[i] = things[i].release();
}

aiMatrix4x4 readTransform(const Object& node)
{
    std::array<float, 16> matrix{};
    if (node.numbers("matrix", matrix))
        return toMatrix(matrix);
    std::array<float, 3> t = {0.0f, 0.0f, 0.0f};
    std::array<float, 4> r = {0.0f, 0.0f, 0.0f, 1.0f};
    std::array<float, 3> s = {1.0f, 1.0f, 1.0f};
    node.numbers("translation", t);
    node.numbers("rotation", r);
    node.numbers("scale", s);
    aiQuaternion rotation(r[3], r[0], r[1], r[2]);
    if (r[0] != 0.0f || r[1] != 0.0f || r[2] != 0.0f || r[3] != 0.0f)
        rotation.Normalize();
    return compose(aiVector3D(t[0], t[1], t[2]), rotation, aiVector3D(s[0], s[1], s[2]));
}

class SceneReader
{
public:
    explicit SceneReader(Source& source)
        : m_source(source)
        , m_root(source.document.root())
        , m_textures(source)
        , m_scene(std::make_unique<aiScene>())
    {
    }

    std::unique_ptr<aiScene> read()
    {
        checkExtensions(m_source);
        const std::vector<size_t> roots = listRoots();
        m_names.resize(m_root.length("nodes"));
        m_isOpen.resize(m_names.size());
        for (const size_t root : roots)
            nameNodes(root, 0);
        readMaterials();
        m_shapes = findMovingShapes(m_source, m_names);
        makeRoot(roots);
        readAnimations();
        hand(m_textures.take(), m_scene->mTextures, m_scene->mNumTextures);
        hand(std::move(m_meshes), m_scene->mMeshes, m_scene->mNumMeshes);
        hand(std::move(m_materials), m_scene->mMaterials, m_scene->mNumMaterials);
        hand(std::move(m_lights), m_scene->mLights, m_scene->mNumLights);
        hand(std::move(m_cameras), m_scene->mCameras, m_scene->mNumCameras);
        return std::move(m_scene);
    }

private:
    /// Nodes of the file's default scene, or all nodes if it has no scenes.
    std::vector<size_t> listRoots()
    {
        const size_t count = m_root.length("scenes");
        if (count > 1)
            m_source.report.lose("scene", "all but the default one of the file's scenes (" +
                                              std::to_string(count) + ")");
        if (count > 0)
            return m_source.document.get("scenes", m_root.size("scene", 0), m_root).indices("nodes");
        std::vector<bool> isChild(m_root.length("nodes"));
        for (size_t i = 0; i < isChild.size(); ++i)
        {
            for (const size_t child : m_root.at("nodes", i).indices("children"))
            {
                if (child < isChild.size())
                    isChild[child] = true;
            }
        }
        std::vector<size_t> roots;
        for (size_t i = 0; i < isChild.size(); ++i)
        {
            if (!isChild[i])
                roots.push_back(i);
        }
        return roots;
    }

    /// Parents first. Throws a Fault if the nodes do not form a tree.
    void nameNodes(size_t index, size_t depth)
    {
        const Object node = m_source.document.get("nodes", index, m_root);
        if (m_isOpen[index])
            node.fail("contains itself");
        if (!m_names[index].empty())
            node.fail("has two parents");
        if (depth > DEEPEST)
            node.fail("is nested too deeply");
        m_names[index] = m_nodeNames.make(getName(node), "");
        m_isOpen[index] = true;
        for (const size_t child : node.indices("children"))
            nameNodes(child, depth + 1);
        m_isOpen[index] = false;
    }

    void readMaterials()
    {
        for (size_t i = 0; i < m_root.length("materials"); ++i)
        {
            ReadMaterial read = readMaterial(m_source, m_textures, m_root.at("materials", i));
            m_materials.push_back(std::move(read.material));
            m_placings.push_back(read.placing);
        }
    }

    /// A single node on top is the root.
    void makeRoot(const std::vector<size_t>& roots)
    {
        if (roots.size() == 1)
        {
            m_scene->mRootNode = readNode(roots[0], true).release();
            return;
        }
        std::vector<std::unique_ptr<aiNode>> children;
        children.reserve(roots.size());
        for (const size_t root : roots)
            children.push_back(readNode(root, true));
        m_scene->mRootNode = new aiNode(m_nodeNames.make("ROOT", ""));
        adopt(*m_scene->mRootNode, std::move(children));
    }

    static void adopt(aiNode& parent, std::vector<std::unique_ptr<aiNode>>&& children)
    {
        for (const auto& child : children)
            child->mParent = &parent;
        hand(std::move(children), parent.mChildren, parent.mNumChildren);
    }

    std::unique_ptr<aiNode> readNode(size_t index, bool isVisible)
    {
        const Object node = m_root.at("nodes", index);
        const Object visibility = node.extension("KHR_node_visibility");
        isVisible = isVisible && (!visibility.has("visible") || visibility.flag("visible"));
        auto made = std::make_unique<aiNode>(m_names[index]);
        made->mTransformation = readTransform(node);
        addViews(node, m_names[index]);
        std::vector<std::unique_ptr<aiNode>> children;
        if (node.has("mesh") && isVisible)
            addMesh(index, *made, children);
        for (const size_t child : node.indices("children"))
            children.push_back(readNode(child, isVisible));
        adopt(*made, std::move(children));
        return made;
    }

    void addViews(const Object& node, const std::string& name)
    {
        const Object camera = m_source.document.find("cameras", node, "camera");
        if (camera)
            m_cameras.push_back(readCamera(camera, name));
        const Object user = node.extension("KHR_lights_punctual");
        if (!user)
            return;
        const Object lights = m_root.extension("KHR_lights_punctual");
        m_lights.push_back(readLight(lights.at("lights", user.size("light", 0)), name));
    }

    void addMesh(size_t index, aiNode& made, std::vector<std::unique_ptr<aiNode>>& children)
    {
        const Object node = m_root.at("nodes", index);
        MeshUse use{node.size("mesh", 0), node.index("skin"), node.numbers("weights"), false};
        const Object mesh = m_source.document.get("meshes", use.mesh, node);
        if (!node.has("weights"))
            use.weights = mesh.numbers("weights");
        const auto moving = m_shapes.find(index);
        if (moving != m_shapes.end())
            return addShapes(node, mesh, moving->second, made, children);
        const std::vector<unsigned>& meshes = getMeshes(mesh, use, node);
        const Object instancing = node.extension("EXT_mesh_gpu_instancing");
        if (!instancing)
            return setMeshes(made, meshes);
        for (const aiMatrix4x4& transform : readInstances(instancing))
        {
            children.push_back(std::make_unique<aiNode>(
                m_nodeNames.make(made.mName.C_Str() + std::string(" instance"), "")));
            children.back()->mTransformation = transform;
            setMeshes(*children.back(), meshes);
        }
    }

    void addShapes(const Object& node, const Object& mesh, MovingShapes& shapes, const aiNode& made,
                   std::vector<std::unique_ptr<aiNode>>& children)
    {
        for (const std::vector<float>& weights : shapes.weights)
        {
            shapes.nodes.push_back(m_nodeNames.make(made.mName.C_Str() + std::string(" shape"), ""));
            aiNode& child = *children.emplace_back(std::make_unique<aiNode>(shapes.nodes.back()));
            if (children.size() > 1)
                aiMatrix4x4::Scaling(aiVector3D(), child.mTransformation);
            setMeshes(child, getMeshes(mesh, {node.size("mesh", 0), std::nullopt, weights, true}, node));
        }
    }

    static void setMeshes(aiNode& node, const std::vector<unsigned>& meshes)
    {
        node.mNumMeshes = unsigned(meshes.size());
        node.mMeshes = new unsigned[meshes.size()];
        std::copy(meshes.begin(), meshes.end(), node.mMeshes);
    }

    std::vector<aiMatrix4x4> readInstances(const Object& instancing)
    {
        const Object attributes = instancing.object("attributes");
        const auto read = [&](const char* name, unsigned components)
        {
            const std::optional<size_t> accessor = attributes.index(name);
            return accessor ? m_source.accessors.read(*accessor, attributes, components) : Column();
        };
        const Column translations = read("TRANSLATION", 3);
        const Column rotations = read("ROTATION", 4);
        const Column scales = read("SCALE", 3);
        std::vector<aiMatrix4x4> made;
        for (size_t i = 0; i < std::max({translations.count(), rotations.count(), scales.count()}); ++i)
        {
            aiVector3D t, s(1.0f, 1.0f, 1.0f);
            aiQuaternion r;
            if (i < translations.count())
                t = aiVector3D(translations[i][0], translations[i][1], translations[i][2]);
            if (i < rotations.count())
                r = aiQuaternion(rotations[i][3], rotations[i][0], rotations[i][1], rotations[i][2]);
            if (i < scales.count())
                s = aiVector3D(scales[i][0], scales[i][1], scales[i][2]);
            made.push_back(compose(t, r.Normalize(), s));
        }
        for (const std::string& name : attributes.keys())
        {
            if (name != "TRANSLATION" && name != "ROTATION" && name != "SCALE")
                m_source.report.lose("attribute", name.substr(0, 100) + " of a mesh's instances");
        }
        return made;
    }

    const std::vector<unsigned>& getMeshes(const Object& mesh, const MeshUse& use, const Object& node)
    {
        const auto known = m_uses.find(use);
        if (known != m_uses.end())
            return known->second;
        std::vector<unsigned>& made = m_uses[use];
        Skin skin;
        if (use.skin)
            skin = readSkin(m_source, m_source.document.get("skins", *use.skin, node), m_names);
        const size_t count = mesh.length("primitives");
        for (size_t i = 0; i < count; ++i)
        {
            const Object primitive = mesh.at("primitives", i);
            showProgress("meshes");
            const size_t material = getMaterial(primitive);
            const std::string name = getName(mesh) + (count > 1 ? "-" + std::to_string(i) : "");
            std::unique_ptr<aiMesh> read = readPrimitive(
                m_source, primitive,
                {name, use.weights, m_placings[material], use.skin ? &skin : nullptr, use.isMoving});
            if (!read)
                continue;
            read->mMaterialIndex = unsigned(material);
            made.push_back(unsigned(m_meshes.size()));
            m_meshes.push_back(std::move(read));
        }
        return made;
    }

    /// For a primitive without a material, one more than the file's last.
    size_t getMaterial(const Object& primitive)
    {
        const size_t count = m_root.length("materials");
        const std::optional<size_t> index = primitive.index("material");
        if (index && *index >= count)
            primitive.fail("material", "is not there");
        if (!index && m_materials.size() == count)
        {
            m_materials.push_back(readMaterial(m_source, m_textures, Object()).material);
            m_placings.emplace_back();
        }
        return index.value_or(count);
    }

    void readAnimations()
    {
        std::vector<std::unique_ptr<aiAnimation>> animations;
        for (size_t i = 0; m_source.options.animation && i < m_root.length("animations"); ++i)
            animations.push_back(readAnimation(m_source, i, m_names, m_shapes));
        hand(std::move(animations), m_scene->mAnimations, m_scene->mNumAnimations);
    }

    Source& m_source;
    Object m_root;
    Textures m_textures;
    std::unique_ptr<aiScene> m_scene;
    NameMaker m_nodeNames;
    std::vector<std::string> m_names; ///< by number of node; empty for nodes that are not in the scene
    std::vector<bool> m_isOpen;       ///< ancestors of the current node
    std::vector<std::unique_ptr<aiMaterial>> m_materials;
    std::vector<UvPlacing> m_placings; ///< by material
    std::vector<std::unique_ptr<aiMesh>> m_meshes;
    std::map<MeshUse, std::vector<unsigned>> m_uses;
    std::map<size_t, MovingShapes> m_shapes; ///< by number of node
    std::vector<std::unique_ptr<aiLight>> m_lights;
    std::vector<std::unique_ptr<aiCamera>> m_cameras;
};

} // namespace

std::unique_ptr<aiScene> readScene(Source& source)
{
    return SceneReader(source).read();
}

} // namespace convert::gltf
