#pragma once

#include "glogeometry.h"
#include "glomaterial.h"

#include "orv/detail/glorecords.h"
#include "orv/glo.h"
#include "orv/solid.h"

#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace orv::detail
{

/// Makes engine objects of the records of a scene file. One per load; every failure is logged once.
class GloBuilder
{
public:
    /// @param scene     borrowed; its bulk data is given up on the way.
    /// @param fileSize  in bytes; what it takes to build the scene is bounded by it.
    /// @param name      the file, for messages; borrowed.
    GloBuilder(AssetCachePool& pool, glo::GloScene& scene, glo::FileVersion version, glo::AuthoringTool tool,
               uint32_t fileSize, const char* name);
    ~GloBuilder();

    /// @return empty, with parent unchanged, on failure.
    SharedPtr<Glo> build(const SharedPtr<SceneNode>& parent, bool measuresMeshes);

private:
    using Objects = std::vector<SharedPtr<SceneNode>>;
    template <class Record>
    using RecordsByName = std::map<std::string_view, const Record*>; ///< the first of each name
    using NodesByName =
        std::multimap<std::string, SharedPtr<SceneNode>, std::less<>>; ///< in the tree's order

    /// The solids of one skin reference, which find their joints when all nodes are there.
    struct SkinnedSolids
    {
        const glo::Skin* skin;
        const glo::SkinReference* reference;
        std::vector<SharedPtr<Solid>> solids;
    };

    /// Work is counted in steps of a search. For each byte of a file one thing may be made, and so many more.
    static constexpr uint64_t THING = 64;
    static constexpr uint64_t SPARE_THINGS = 256;
    bool spend(uint64_t work);

    bool makeGeometries(bool measuresMeshes);
    bool makeMaterials();
    SharedPtr<SceneNode> makeNode(const glo::NodeData& data, const SharedPtr<SceneNode>& parent);
    void setTransform(SceneNode& node, const glo::NodeData& data, bool top) const;
    bool makeObjects(const glo::NodeData& data, Objects& objects);
    bool makeSolids(const std::string& geometry, const std::vector<std::string>& materials, bool skinned,
                    std::vector<SharedPtr<Solid>>& solids);
    SharedPtr<Appearance> findAppearance(const std::vector<std::string>& materials, size_t index,
                                         bool skinned, bool& missing);
    SharedPtr<Appearance> getDefaultAppearance(bool skinned);
    bool makeSkinnedSolids(const glo::SkinReference& reference, std::vector<SharedPtr<Solid>>& solids);
    bool makeLight(const glo::LightReference& reference, Objects& objects);
    bool makeCamera(const glo::CameraReference& reference, Objects& objects);
    bool linkSkin(const SkinnedSolids& skinned);
    bool findJoint(const std::string& name, const std::set<const SceneNode*>& skeletons,
                   SharedPtr<SceneNode>& joint);
    bool fail(const char* format) const;
    bool failUnknown(const char* kind, const std::string& name) const;

    bool makeAnimation(const glo::AnimationData& data, AnimationGroup& group);
    bool makeChannel(const glo::Channel& channel, AnimationGroup& group);
    bool makeNodeChannel(const glo::Channel& channel, const std::string& target, AnimationGroup& group);
    bool makeLightChannel(const glo::Channel& channel, const std::string& target, AnimationGroup& group);
    bool makeMaterialChannel(const glo::Channel& channel, const std::string& target, AnimationGroup& group);

    AssetCachePool& m_pool;
    glo::GloScene& m_scene;
    glo::FileVersion m_version;
    glo::AuthoringTool m_tool;
    const char* m_name;
    uint64_t m_credit; ///< work that may still be done
    RecordsByName<glo::Skin> m_skins;
    RecordsByName<glo::LightDefinition> m_lightDefinitions;
    RecordsByName<glo::CameraDefinition> m_cameraDefinitions;
    SharedPtr<Glo> m_glo;
    std::map<std::string, GloGeometry, std::less<>> m_geometries;
    std::map<std::string, GloMaterial, std::less<>> m_materials;
    SharedPtr<Appearance> m_defaultAppearances[2]; ///< plain, skinned
    NodesByName m_nodes;
    NodesByName m_scopedNodes;
    std::multimap<std::string_view, SharedPtr<Light>> m_lights; ///< by their definition's name
    std::vector<SkinnedSolids> m_skinnedSolids;
};

} // namespace orv::detail
