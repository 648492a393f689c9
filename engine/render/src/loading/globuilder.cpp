#include "globuilder.h"

#include "orv/animationgroup.h"
#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/camera.h"
#include "orv/detail/glolog.h"
#include "orv/light.h"
#include "orv/mesh.h"
#include "orv/shaderprogramcache.h"

#include <algorithm>
#include <cstdlib>

namespace orv::detail
{

using namespace glo;

namespace
{

template <class Record>
std::map<std::string_view, const Record*> makeIndex(const std::vector<Record>& records)
{
    std::map<std::string_view, const Record*> byName;
    for (const Record& record : records)
        byName.emplace(record.name, &record);
    return byName;
}

template <class Record>
const Record* findRecord(const std::map<std::string_view, const Record*>& records, const std::string& name)
{
    const auto found = records.find(name);
    return found != records.end() ? found->second : nullptr;
}

} // namespace

GloBuilder::GloBuilder(AssetCachePool& pool, GloScene& scene, const GloGeometries& geometries,
                       FileVersion version, AuthoringTool tool, uint32_t fileSize, const char* name)
    : m_pool(pool)
    , m_scene(scene)
    , m_geometries(geometries)
    , m_version(version)
    , m_tool(tool)
    , m_name(name)
    , m_credit(fileSize)
    , m_skins(makeIndex(scene.skins))
    , m_lightDefinitions(makeIndex(scene.lights))
    , m_cameraDefinitions(makeIndex(scene.cameras))
    , m_glo(new Glo)
{
}

GloBuilder::~GloBuilder() = default;

SharedPtr<Glo> GloBuilder::build(const SharedPtr<SceneNode>& parent)
{
    if (m_scene.scene && m_scene.upAxis > uint32_t(UpAxis::Z))
    {
        fail("Unrecognized up-axis option in %s");
        return {};
    }
    if (!makeMaterials())
        return {};

    SharedPtr<SceneNode> top;
    if (m_scene.scene)
    {
        top = makeNode(m_scene.scene->top, {});
        if (!top)
            return {};
        std::qsort(m_names.data(), m_names.size(), sizeof(NamedPlace), compare);
        std::qsort(m_scopedNames.data(), m_scopedNames.size(), sizeof(NamedPlace), compare);
    }
    if (!makeAnimations() || !linkSkins())
        return {};
    finishMaterials();

    if (top)
    {
        // Attaching rebuilds the local matrix from its components.
        const Matrix4f transform = top->getLocalTransform();
        top->setParent(parent, false);
        top->setLocalTransform(transform);
    }
    m_glo->m_topNode = top;
    m_glo->m_fileVersion = Version(m_version.first, m_version.second, m_version.third, nullptr);
    return m_glo;
}

bool GloBuilder::makeAnimations()
{
    m_glo->m_animationGroup = makeShared<AnimationGroup>();
    if (!m_glo->m_animationGroup)
        return false;
    for (const AnimationData& animation : m_scene.animations)
    {
        // Groups are added while empty: adding searches the whole group.
        const SharedPtr<AnimationGroup> group = makeShared<AnimationGroup>();
        if (!group)
            return false;
        m_glo->m_animations.push_back({animation.name, group});
        m_glo->m_animationGroup->addAnimation(group);
        if (!makeAnimation(animation, *group))
            return false;
    }
    return true;
}

/// When everything that decides the programs is known.
void GloBuilder::finishMaterials()
{
    for (auto& [name, material] : m_materials)
    {
        material.choosePrograms();
        m_glo->m_appearances[name] = material.getAppearance();
        const std::string& key = name;
        material.forEachAppearance([&](const SharedPtr<Appearance>& appearance, bool skinned)
                                   { m_glo->m_kinds[skinned ? 1 : 0][key] = appearance; });
    }
}

bool GloBuilder::fail(const char* format) const
{
    ORV_GLO_ERROR(format, m_name);
    return false;
}

bool GloBuilder::failUnknown(const char* kind, const std::string& name) const
{
    ORV_GLO_ERROR("There is no %s \"%s\" in %s", kind, name.c_str(), m_name);
    return false;
}

bool GloBuilder::spend(uint64_t bytes)
{
    return m_credit.spend(bytes) || fail("References in %s ask for more than a file of its size may have");
}

bool GloBuilder::makeMaterials()
{
    applySurfaces(m_scene);
    for (const Material& material : m_scene.materials)
    {
        if (material.techniques.empty())
            continue;
        GloMaterial made(m_pool, m_version, m_tool, material.name, material.techniques.back());
        if (!made.getAppearance())
            return false;
        m_materials.insert_or_assign(material.name, std::move(made));
    }
    return true;
}

/// @return empty on failure, with nothing left under parent.
SharedPtr<SceneNode> GloBuilder::makeNode(const NodeData& data, const SharedPtr<SceneNode>& parent)
{
    Objects objects;
    if (!makeObjects(data, objects))
        return {};
    if (objects.empty())
        objects.push_back(makeShared<SceneNode>());

    const SharedPtr<SceneNode> node = objects.front();
    if (!node)
        return {};
    node->setName(data.name.c_str());
    const uint32_t place = uint32_t(m_places.size());
    m_places.push_back({node.get(), 0});
    m_names.push_back({data.name, place});
    m_scopedNames.push_back({data.scopedName, place});
    if (parent)
        node->setParent(parent, false);
    setTransform(*node, data, !parent);
    for (size_t i = 1; i < objects.size(); ++i)
        objects[i]->setParent(node, false);
    for (const NodeData& child : data.children)
    {
        if (!makeNode(child, node))
            return {};
    }
    m_places[place].end = uint32_t(m_places.size());
    return node;
}

void GloBuilder::setTransform(SceneNode& node, const NodeData& data, bool top) const
{
    node.setPosition(data.translation);
    node.setRotation(quaternionFromAxisAngle(Vector3f(data.rotation.x, data.rotation.y, data.rotation.z),
                                             Anglef::fromRadians(data.rotation.w)));
    node.setScale(data.scale);
    if (hasNodeTransform(m_version))
        node.setLocalTransform(data.transform);
    if (!top)
        return;

    const Anglef quarter = Anglef::fromRadians(1.5707964f);
    if (m_scene.upAxis == uint32_t(UpAxis::X))
        node.setRotation(quaternionFromAxisAngle(Vector3f(0.0f, 0.0f, 1.0f), quarter));
    else if (m_scene.upAxis == uint32_t(UpAxis::Z))
        node.setRotation(quaternionFromAxisAngle(Vector3f(1.0f, 0.0f, 0.0f), -quarter));
}

/// The objects of the filled reference slots: the first becomes the node, the others its children.
bool GloBuilder::makeObjects(const NodeData& data, Objects& objects)
{
    std::vector<SharedPtr<Solid>> solids;
    if (data.geometry && !makeSolids(data.geometry->geometry, data.geometry->materials, false, solids))
        return false;
    if (data.skin && !makeSkinnedSolids(*data.skin, solids))
        return false;
    objects.assign(solids.begin(), solids.end());
    if (data.light && !makeLight(*data.light, objects))
        return false;
    return !data.camera || makeCamera(*data.camera, objects);
}

bool GloBuilder::makeSolids(const std::string& geometry, const std::vector<std::string>& materials,
                            bool skinned, std::vector<SharedPtr<Solid>>& solids)
{
    const GloGeometry* const found = m_geometries.find(geometry);
    if (!found)
        return failUnknown("geometry", geometry);
    bool missing = false;
    const std::vector<SharedPtr<Mesh>>& meshes = found->meshes;
    if (!spend(GloCredit::solids(meshes.size())))
        return false;
    for (size_t i = 0; i < meshes.size(); ++i)
    {
        const SharedPtr<Appearance> appearance = findAppearance(materials, i, skinned, missing);
        const SharedPtr<Solid> solid = makeShared<Solid>(meshes[i], appearance);
        if (!appearance || !solid)
            return false;
        solids.push_back(solid);
    }
    if (missing)
        ORV_GLO_WARN("Geometry has no material; using default appearance.");
    return true;
}

SharedPtr<Appearance> GloBuilder::findAppearance(const std::vector<std::string>& materials, size_t index,
                                                 bool skinned, bool& missing)
{
    const auto found = index < materials.size() ? m_materials.find(materials[index]) : m_materials.end();
    if (found != m_materials.end())
        return found->second.use(skinned);
    missing = true;
    return getDefaultAppearance(skinned);
}

SharedPtr<Appearance> GloBuilder::getDefaultAppearance(bool skinned)
{
    SharedPtr<Appearance>& appearance = m_defaultAppearances[skinned ? 1 : 0];
    if (appearance)
        return appearance;
    appearance = loadAppearance(m_pool, "orv#default_pvl.ap");
    if (!appearance || !appearance->getShaderProgram())
        ORV_GLO_ERROR("%s", "ORV_ASSERT: appearance");
    if (appearance && skinned)
        appearance->setShaderProgram(
            m_pool.getShaderProgramCache()->get("orv#max_pvl.sp$DIFF$SPEC$AMBI$EMIS$SKIN"));
    return appearance;
}

bool GloBuilder::makeSkinnedSolids(const SkinReference& reference, std::vector<SharedPtr<Solid>>& solids)
{
    const Skin* skin = findRecord(m_skins, reference.skin);
    if (!skin)
        return failUnknown("skin", reference.skin);
    SkinnedSolids skinned{skin, &reference, {}};
    if (!makeSolids(skin->geometry, reference.materials, true, skinned.solids))
        return false;
    if (size_t(m_geometries.find(skin->geometry)->jointCount) > skin->attachments.size())
        ORV_GLO_WARN("Geometry \"%s\" names joints that skin \"%s\" lacks in %s; the last one moves them",
                     skin->geometry.c_str(), skin->name.c_str(), m_name);
    for (const SharedPtr<Solid>& solid : skinned.solids)
    {
        solid->setJointsPerVertex(skin->jointsPerVertex);
        solid->setBindShapeTransform(skin->bindShape);
        solids.push_back(solid);
    }
    m_skinnedSolids.push_back(std::move(skinned));
    return true;
}

int GloBuilder::compare(const void* a, const void* b)
{
    const NamedPlace& left = *static_cast<const NamedPlace*>(a);
    const NamedPlace& right = *static_cast<const NamedPlace*>(b);
    const int order = left.name.compare(right.name);
    return order != 0 ? order : left.place < right.place ? -1 : 1;
}

/// @param names  sorted.
GloBuilder::NameRange GloBuilder::findName(const Names& names, std::string_view name)
{
    const auto begin = std::lower_bound(names.begin(), names.end(), name,
                                        [](const NamedPlace& a, std::string_view b) { return a.name < b; });
    const auto end = std::upper_bound(begin, names.end(), name,
                                      [](std::string_view a, const NamedPlace& b) { return a < b.name; });
    return {names.data() + (begin - names.begin()), names.data() + (end - names.begin())};
}

/// A skin's joint names are looked up once, however many nodes refer to the skin.
bool GloBuilder::linkSkins()
{
    std::vector<std::vector<JointNodes>> known(m_scene.skins.size());
    for (const SkinnedSolids& skinned : m_skinnedSolids)
    {
        const std::vector<Attachment>& attachments = skinned.skin->attachments;
        std::vector<JointNodes>& joints = known[size_t(skinned.skin - m_scene.skins.data())];
        for (size_t i = joints.size(); i < attachments.size(); ++i)
            joints.push_back(
                {findName(m_scopedNames, attachments[i].joint), findName(m_names, attachments[i].joint)});
        if (!spend(GloCredit::links(*skinned.reference, *skinned.skin, skinned.solids.size())))
            return false;
        linkSkin(skinned, joints);
    }
    return true;
}

void GloBuilder::linkSkin(const SkinnedSolids& skinned, const std::vector<JointNodes>& joints)
{
    std::vector<uint32_t> skeletons;
    for (const std::string& name : skinned.reference->skeletons)
    {
        const NameRange roots = findName(m_names, name);
        if (roots.begin != roots.end)
            skeletons.push_back(roots.begin->place);
    }
    for (size_t i = 0; i < joints.size(); ++i)
    {
        const Attachment& attachment = skinned.skin->attachments[i];
        const SharedPtr<SceneNode> joint(findJoint(joints[i], skeletons));
        if (!joint)
            ORV_GLO_ERROR("Joint node \"%s\" not found.", attachment.joint.c_str());
        for (const SharedPtr<Solid>& solid : skinned.solids)
            solid->attachJoint(joint, attachment.inverseBindPose);
    }
}

/// By scoped name, then by name; of several nodes, the first below one of the reference's skeletons, since two
/// figures of the same build have the same joint names.
/// @return null if there is none.
SceneNode* GloBuilder::findJoint(const JointNodes& nodes, const std::vector<uint32_t>& skeletons) const
{
    for (const NameRange& range : {nodes.byScopedName, nodes.byName})
    {
        const NamedPlace* found = range.end;
        for (const uint32_t root : skeletons)
        {
            const NamedPlace* below =
                std::lower_bound(range.begin, range.end, root,
                                 [](const NamedPlace& named, uint32_t place) { return named.place < place; });
            if (below < found && below->place < m_places[root].end)
                found = below;
        }
        if (found == range.end)
            found = range.begin;
        if (found != range.end)
            return m_places[found->place].node;
    }
    return nullptr;
}

bool GloBuilder::makeLight(const LightReference& reference, Objects& objects)
{
    const LightDefinition* definition = findRecord(m_lightDefinitions, reference.light);
    if (!definition)
        return failUnknown("light", reference.light);
    if (definition->type > light::SPOT)
    {
        ORV_GLO_ERROR("Light \"%s\" has the unknown type %u in %s", definition->name.c_str(),
                      definition->type, m_name);
        return false;
    }
    constexpr Light::LightType TYPES[] = {Light::LightType::POINT, Light::LightType::POINT,
                                          Light::LightType::DIRECTIONAL, Light::LightType::SPOT};
    if (definition->type == light::AMBIENT)
        ORV_GLO_WARN("Ambient light type not supported; defaulting to point light.");

    const SharedPtr<Light> made = makeShared<Light>();
    if (!made)
        return false;
    made->setLightName(definition->name.c_str());
    made->setLightType(TYPES[definition->type]);
    made->setColour(Colour4f(definition->colour.x, definition->colour.y, definition->colour.z, 1.0f));
    made->setIntensity(definition->intensity);
    made->setAttenuated(definition->attenuated != 0);
    made->setAttenuationNear(definition->attenuationNear);
    made->setAttenuationFar(definition->attenuationFar);
    made->setSpotInnerAngle(Anglef::fromRadians(definition->spotInner));
    made->setSpotOuterAngle(Anglef::fromRadians(definition->spotOuter));
    made->setAmbientLevel(m_tool == AuthoringTool::BLENDER ? 0.0f : 0.1f);
    m_glo->m_lights.push_back({made, definition->name});
    m_lights.emplace(definition->name, made);
    objects.push_back(made);
    return true;
}

bool GloBuilder::makeCamera(const CameraReference& reference, Objects& objects)
{
    const CameraDefinition* definition = findRecord(m_cameraDefinitions, reference.camera);
    if (!definition)
        return failUnknown("camera", reference.camera);
    if (definition->projection > projection::PERSPECTIVE)
    {
        ORV_GLO_ERROR("Camera \"%s\" has the unknown projection %u in %s", definition->name.c_str(),
                      definition->projection, m_name);
        return false;
    }
    const SharedPtr<Camera> made = makeShared<Camera>();
    if (!made)
        return false;
    made->setProjectionType(Camera::ProjectionType(definition->projection));
    // Values that the projection does not use are only set if they differ, since the camera logs a warning.
    const bool perspective = definition->projection == projection::PERSPECTIVE;
    const Anglef fieldOfView = Anglef::fromRadians(definition->fieldOfView);
    if (perspective || std::abs(fieldOfView.radians() - made->getFieldOfView().radians()) > 1e-6f)
        made->setFieldOfView(fieldOfView);
    if (!perspective || definition->width != made->getWidth())
        made->setWidth(definition->width);
    made->setNear(definition->nearDistance);
    made->setFar(definition->farDistance);
    m_glo->m_cameras.push_back({made, definition->name});
    objects.push_back(made);
    return true;
}

} // namespace orv::detail
