#pragma once

#include "orv/export.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"
#include "orv/version.h"

#include <map>
#include <string>
#include <vector>

namespace orv
{

class AnimationGroup;
class Appearance;
class AssetCachePool;
class Camera;
class Light;
class SceneNode;

namespace detail
{
class GloBuilder;
}

/// What loadGloFile() made of a scene file (".glo").
///
/// Everything handed out is shared: the tree lives on in the scene and the animations with their targets after
/// this object is gone. Questions by name compare exactly; a null name finds nothing.
class ORV_API Glo : public Shared
{
public:
    using Ptr = SharedPtr<Glo>;

    ORV_CLASS_NAME("Glo")

    ~Glo() override;

    /// The version that the file was written in, without extra text.
    const Version& getFileVersion() const { return m_fileVersion; }

    /// The top of the loaded tree; empty if the file has no scene.
    const SharedPtr<SceneNode>& getTopNode() const { return m_topNode; }

    /// All of the file's animations, a group each; an empty group if it has none. For an AnimationController.
    const SharedPtr<AnimationGroup>& getAnimationGroup() const { return m_animationGroup; }

    /// The animations of the file's list, in its order. Those inside others are only reached through them.
    int getAnimationCount() const { return int(m_animations.size()); }

    /// @return null outside 0 to the count, for getAnimation() empty.
    const char* getAnimationName(int index) const;
    SharedPtr<AnimationGroup> getAnimation(int index) const; ///< Empty outside 0 to the count.

    /// The first animation of that name.
    SharedPtr<AnimationGroup> getAnimation(const char* name) const;

    /// The file's loop range in seconds, for setLoopRange(); both 0, which is no loop, if it has none.
    float getLoopBegin() const { return m_loopBegin; }
    float getLoopEnd() const { return m_loopEnd; }

    /// Cameras and lights in the order of the tree, parents first.
    int getCameraCount() const { return int(m_cameras.size()); }
    int getLightCount() const { return int(m_lights.size()); }

    /// Empty outside 0 to the count.
    SharedPtr<Camera> getCamera(int index) const;
    SharedPtr<Light> getLight(int index) const;

    /// The first one whose node has that name, or else the first one made from the definition of that name.
    SharedPtr<Camera> getCamera(const char* name) const;
    SharedPtr<Light> getLight(const char* name) const;

    /// The appearance of the material of that name. A material that plain and skinned geometry share has two, since
    /// these need different programs; this is the one of the geometry that comes first in the tree.
    SharedPtr<Appearance> getAppearance(const char* name) const;

    /// The one of the two for skinned or for plain geometry. Empty if the material is on no such geometry; one that is
    /// on none at all counts as plain.
    SharedPtr<Appearance> getAppearance(const char* name, bool skinned) const;

    /// What getAppearance(name) finds, for all materials.
    const std::map<std::string, SharedPtr<Appearance>, std::less<>>& getAppearances() const
    {
        return m_appearances;
    }

private:
    friend class detail::GloBuilder;

    template <class T>
    struct Placed
    {
        SharedPtr<T> node;
        std::string definition;
    };

    struct NamedAnimation
    {
        std::string name;
        SharedPtr<AnimationGroup> group;
    };

    template <class T>
    static SharedPtr<T> at(const std::vector<Placed<T>>& all, int index);
    template <class T>
    static SharedPtr<T> find(const std::vector<Placed<T>>& all, const char* name);

    Glo();

    Version m_fileVersion;
    SharedPtr<SceneNode> m_topNode;
    SharedPtr<AnimationGroup> m_animationGroup;
    std::vector<NamedAnimation> m_animations;
    float m_loopBegin = 0.0f;
    float m_loopEnd = 0.0f;
    std::vector<Placed<Camera>> m_cameras;
    std::vector<Placed<Light>> m_lights;
    using Appearances = std::map<std::string, SharedPtr<Appearance>, std::less<>>;

    static SharedPtr<Appearance> find(const Appearances& all, const char* name);

    Appearances m_appearances;
    Appearances m_kinds[2]; ///< for plain, for skinned geometry
};

/// What is worked out about the meshes of a scene file, beyond what is needed to draw them.
enum class MeshData
{
    NONE,    ///< no vertex is looked at
    BOUNDS,  ///< how far each mesh reaches, and what each joint moves of it: see Mesh::getBounds()
    GEOMETRY ///< the same, and all vertices and triangles stay in memory: see Mesh::getGeometry()
};

/// Loads a scene file and hangs its tree under a node.
///
/// Textures and shader programs come from the pool by name; buffers, meshes and appearances are made again by
/// every load. Where a name in the file is borne by several nodes, the first in the order of the tree is meant; of
/// geometries, skins, lights and cameras the first in the file; of materials the last.
/// GL thread only.
///
/// @param parent  gets the top node as its last child; empty: the tree is a root that only the result holds.
/// @param name    looked for on the pool's path.
/// What is made by reference (solids, joints of skins, channels of lights) is bounded by 4 MiB and 32 bytes of memory
/// for each byte of the file; a file that asks for more is refused.
/// @param measuresMeshes  looks at every vertex to find the bounding radius of each mesh, which is unknown otherwise; the
/// same as MeshData::BOUNDS.
/// @return empty, after logging why, if the file is missing, damaged, newer than the loader, or names something
/// that it does not hold; parent is unchanged then. Missing textures, materials and joints and unknown animated
/// properties are logged and replaced or left out.
ORV_API SharedPtr<Glo> loadGloFile(AssetCachePool& pool, const SharedPtr<SceneNode>& parent, const char* name,
                                   bool measuresMeshes = false);
ORV_API SharedPtr<Glo> loadGloFile(AssetCachePool& pool, const SharedPtr<SceneNode>& parent, const char* name,
                                   MeshData meshData);

} // namespace orv
