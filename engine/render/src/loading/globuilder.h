#pragma once

#include "glogeometry.h"
#include "glomaterial.h"

#include "orv/detail/glocredit.h"
#include "orv/detail/glorecords.h"
#include "orv/glo.h"
#include "orv/solid.h"

#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace orv::detail
{

/// Makes a scene from its geometries and the other records of its file. One per load; every failure is logged once.
class GloBuilder
{
public:
    /// @param scene       borrowed.
    /// @param geometries  borrowed.
    /// @param fileSize    in bytes; limits the cost of the scene.
    /// @param name        the file, for messages; borrowed.
    GloBuilder(AssetCachePool& pool, glo::GloScene& scene, const GloGeometries& geometries,
               glo::FileVersion version, glo::AuthoringTool tool, uint32_t fileSize, const char* name);
    ~GloBuilder();

    /// @return empty, with parent unchanged, on failure.
    SharedPtr<Glo> build(const SharedPtr<SceneNode>& parent);

private:
    using Objects = std::vector<SharedPtr<SceneNode>>;
    template <class Record>
    using RecordsByName = std::map<std::string_view, const Record*>; ///< the first of each name

    /// A node made for a node of the file; kept alive by its tree.
    struct Place
    {
        SceneNode* node;
        uint32_t end; ///< the index after its last descendant; places are in the tree's order
    };

    struct NamedPlace
    {
        std::string_view name;
        uint32_t place;
    };

    using Names = std::vector<NamedPlace>; ///< by name, and of one name by place
    struct NameRange
    {
        const NamedPlace* begin;
        const NamedPlace* end;
    };

    /// The nodes that a joint's name may mean.
    struct JointNodes
    {
        NameRange byScopedName;
        NameRange byName;
    };

    /// The solids of one skin reference, which find their joints when all nodes are there.
    struct SkinnedSolids
    {
        const glo::Skin* skin;
        const glo::SkinReference* reference;
        std::vector<SharedPtr<Solid>> solids;
    };

    bool spend(uint64_t bytes);

    bool makeMaterials();
    void finishMaterials();
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
    static int compare(const void* a, const void* b);
    static NameRange findName(const Names& names, std::string_view name);
    bool linkSkins();
    void linkSkin(const SkinnedSolids& skinned, const std::vector<JointNodes>& joints);
    SceneNode* findJoint(const JointNodes& nodes, const std::vector<uint32_t>& skeletons) const;
    bool fail(const char* format) const;
    bool failUnknown(const char* kind, const std::string& name) const;

    bool makeAnimations();
    bool makeAnimation(const glo::AnimationData& data, AnimationGroup& group);
    bool makeChannel(const glo::Channel& channel, AnimationGroup& group);
    bool makeNodeChannel(const glo::Channel& channel, const std::string& target, AnimationGroup& group);
    bool makeLightChannel(const glo::Channel& channel, const std::string& target, AnimationGroup& group);
    bool makeMaterialChannel(const glo::Channel& channel, const std::string& target, AnimationGroup& group);

    AssetCachePool& m_pool;
    glo::GloScene& m_scene;
    const GloGeometries& m_geometries;
    glo::FileVersion m_version;
    glo::AuthoringTool m_tool;
    const char* m_name;
    glo::GloCredit m_credit;
    RecordsByName<glo::Skin> m_skins;
    RecordsByName<glo::LightDefinition> m_lightDefinitions;
    RecordsByName<glo::CameraDefinition> m_cameraDefinitions;
    SharedPtr<Glo> m_glo;
    std::map<std::string, GloMaterial, std::less<>> m_materials;
    SharedPtr<Appearance> m_defaultAppearances[2]; ///< plain, skinned
    std::vector<Place> m_places;
    Names m_names;
    Names m_scopedNames;
    std::multimap<std::string_view, SharedPtr<Light>> m_lights; ///< by their definition's name
    std::vector<SkinnedSolids> m_skinnedSolids;
};

} // namespace orv::detail
