#include "glochecks.h"

#include "glocost.h"
#include "images.h"
#include "names.h"

#include "orv/detail/glomaterialrules.h"
#include "orv/detail/glovertices.h"
#include "orv/quaternion.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <map>
#include <set>

namespace inspect
{

using namespace orv::detail::glo;

namespace
{

constexpr size_t MOST_JOINTS = 20; ///< of one skin, in the built-in programs

std::string quote(const std::string& text)
{
    return "\"" + text + "\"";
}

std::string number(uint64_t value)
{
    return std::to_string(value);
}

float readFloat(const uint8_t* bytes)
{
    return readComponent(bytes, AttribFormat::FLOAT, false);
}

class GloChecker
{
public:
    GloChecker(const ScannedFile& file, const std::filesystem::path& folder, Findings& findings)
        : m_file(file)
        , m_scene(file.scene)
        , m_geometries(firstByName(m_scene.geometries))
        , m_skins(firstByName(m_scene.skins))
        , m_lights(firstByName(m_scene.lights))
        , m_cameras(firstByName(m_scene.cameras))
        , m_isAffordable(isAffordable(file))
        , m_valuesLeft(VALUES_PER_BYTE * file.size)
        , m_images(folder)
        , m_findings(findings)
    {
    }

    void check()
    {
        collectNames();
        if (!m_isAffordable)
            report(Kind::REFERENCES, m_file.top,
                   "nodes, skins and channels refer to more than a file of " +
                       counted(m_file.size, "byte", "bytes") + " may have made");
        for (const Chunk& list : m_file.top.children)
            checkList(list);
        if (!m_scene.scene)
            report(Kind::NO_SCENE, m_file.top, "there is no scene, so nothing of the file will be seen");
        else if (m_scene.upAxis > uint32_t(UpAxis::Z))
            report(Kind::UP_AXIS, m_file.top,
                   "the up-axis option " + number(m_scene.upAxis) + " is none of 0, 1, 2");
        if (m_scene.scene && !m_drawsSomething)
            report(Kind::NOTHING_DRAWN, m_file.top,
                   "no node of the scene draws a point, a line or a triangle");
        for (const Chunk& list : m_file.top.children)
            reportUnused(list);
    }

    static bool hasFaces(const Geometry& geometry)
    {
        return std::any_of(geometry.primitiveSets.begin(), geometry.primitiveSets.end(),
                           [&](const PrimitiveSet& set) {
                               return set.indices ? !set.indices->indices.empty()
                                                  : geometry.vertices.vertexCount > 0;
                           });
    }

private:
    void collectNames()
    {
        if (m_scene.scene)
            collectNodes(m_scene.scene->top);
        for (const Material& material : m_scene.materials)
        {
            if (!material.techniques.empty())
                m_materials.insert(material.name);
        }
    }

    void collectNodes(const NodeData& node)
    {
        m_nodes.insert(node.name);
        m_scopedNodes.insert(node.scopedName);
        for (const NodeData& child : node.children)
            collectNodes(child);
    }

    void report(Kind kind, const Chunk& chunk, const std::string& sentence)
    {
        m_findings.add(kind, chunk.offset, chunk.path, sentence);
    }

    void checkList(const Chunk& list)
    {
        std::map<std::string, int> names;
        for (const Chunk& item : list.children)
        {
            if (item.record == Chunk::NO_RECORD)
                continue;
            if (item.id != AnimationData::ID && ++names[item.getName()] == 2)
                report(Kind::DUPLICATE_NAME, item,
                       "the name " + quote(item.getName()) + " was taken before; " +
                           (item.id == Material::ID ? "the last one counts" : "the first one counts"));
            switch (item.id)
            {
            case Geometry::ID: checkGeometry(item, m_scene.geometries[item.record]); break;
            case Material::ID: checkMaterial(item, m_scene.materials[item.record]); break;
            case Skin::ID: checkSkin(item, m_scene.skins[item.record]); break;
            case AnimationData::ID: checkAnimation(item, m_scene.animations[item.record]); break;
            default: break;
            }
        }
        if (list.id == Surfaces::ID)
            checkSurfaces(list);
        if (list.id == SceneData::ID && m_scene.scene)
            checkNode(list.find(NodeData::ID), m_scene.scene->top, true);
    }

    // --- geometries ---------------------------------------------------------------------------------------

    void checkGeometry(const Chunk& chunk, const Geometry& geometry)
    {
        const Chunk& set = chunk.find(VertexSet::ID);
        const VertexSet& vertices = geometry.vertices;
        bool inside = true;
        for (size_t i = 0; i < vertices.attributes.size(); ++i)
            inside =
                checkAttribute(set.find(VertexAttribute::ID, i), vertices.attributes[i], vertices) && inside;
        if (vertices.vertexCount > vertices.data.bytes.size())
            report(Kind::NO_VERTEX_DATA, set.find(VertexData::ID),
                   counted(vertices.vertexCount, "vertex has", "vertices have") + " only " +
                       counted(vertices.data.bytes.size(), "byte", "bytes"));
        if (inside && vertices.vertexCount > 0)
        {
            for (size_t i = 0; i < vertices.attributes.size(); ++i)
                checkNumbers(set.find(VertexAttribute::ID, i), vertices.attributes[i], vertices);
            checkWeights(set, geometry);
        }
        if (!findAttribute(geometry, "a_position"))
            report(Kind::NO_POSITIONS, set, "there is no attribute a_position, so nothing will be seen");
        for (size_t i = 0; i < geometry.primitiveSets.size(); ++i)
            checkPrimitiveSet(chunk.find(PrimitiveSet::ID, i), geometry.primitiveSets[i],
                              vertices.vertexCount);
    }

    bool checkAttribute(const Chunk& chunk, const VertexAttribute& attribute, const VertexSet& vertices)
    {
        if (!isInside(attribute, vertices))
        {
            report(Kind::ATTRIBUTE_BOUNDS, chunk,
                   quote(attribute.name) + " with " + std::to_string(attribute.componentCount) +
                       " components at offset " + std::to_string(attribute.offset) + ", stride " +
                       std::to_string(attribute.stride) + ", does not fit " +
                       counted(vertices.vertexCount, "vertex", "vertices") + " in " +
                       counted(vertices.data.bytes.size(), "byte", "bytes"));
            return false;
        }
        if (attribute.type >= type::COUNT)
            report(Kind::ATTRIBUTE_TYPE, chunk,
                   "the unknown type " + number(attribute.type) + " of " + quote(attribute.name) +
                       " is read as floats");
        else if (getFormat(attribute.type) == AttribFormat::FIXED)
            report(Kind::ATTRIBUTE_TYPE, chunk,
                   quote(attribute.name) + " is read as 16.16 fixed point numbers");
        return true;
    }

    void checkNumbers(const Chunk& chunk, const VertexAttribute& attribute, const VertexSet& vertices)
    {
        // Attributes that share bytes could multiply the work.
        const uint64_t values = uint64_t(vertices.vertexCount) * uint32_t(attribute.componentCount);
        if (values > m_valuesLeft)
            return;
        m_valuesLeft -= values;
        uint64_t count = 0;
        forEachComponent(attribute, vertices, false, 4,
                         [&count](uint32_t, float value) { count += std::isfinite(value) ? 0 : 1; });
        if (count > 0)
            report(Kind::BAD_NUMBER, chunk,
                   quote(attribute.name) + " has " +
                       counted(count, "value that is no finite number", "values that are no finite numbers"));
    }

    void checkWeights(const Chunk& chunk, const Geometry& geometry)
    {
        const VertexAttribute* weights = findAttribute(geometry, "a_weights");
        if (!weights || !findAttribute(geometry, "a_joints"))
            return;
        std::vector<float> sums(geometry.vertices.vertexCount);
        forEachComponent(*weights, geometry.vertices, isNormalised(*weights, m_file.version), 4,
                         [&sums](uint32_t vertex, float value) { sums[vertex] += value; });
        uint64_t count = 0;
        for (const float sum : sums)
            count += std::fabs(sum - 1.0f) > 0.02f ? 1 : 0;
        // Without weights, one joint moves each vertex.
        if (count > 0 && weights->componentCount == 4)
            report(Kind::WEIGHT_SUM, chunk,
                   "the weights of " + counted(count, "vertex", "vertices") + " do not add up to 1");
    }

    void checkPrimitiveSet(const Chunk& chunk, const PrimitiveSet& set, uint32_t vertexCount)
    {
        if (set.primitive > primitive::TRIANGLE_STRIP)
            report(Kind::PRIMITIVE_TYPE, chunk,
                   "the unknown primitive type " + number(set.primitive) + " is drawn as a triangle fan");
        if (!set.indices)
            return;
        const auto& indices = set.indices->indices;
        uint64_t beyond = 0;
        for (const uint16_t index : indices)
            beyond += index >= vertexCount ? 1 : 0;
        if (beyond > 0)
            report(Kind::INDEX_BOUNDS, chunk.find(IndexData::ID),
                   counted(beyond, "index names a vertex", "indices name vertices") + " beyond the last of " +
                       number(vertexCount));
        uint64_t degenerate = 0;
        for (size_t i = 0; set.primitive == primitive::TRIANGLES && i + 2 < indices.size(); i += 3)
            degenerate += indices[i] == indices[i + 1] || indices[i] == indices[i + 2] ||
                                  indices[i + 1] == indices[i + 2]
                              ? 1
                              : 0;
        if (degenerate > 0)
            report(Kind::DEGENERATE, chunk.find(IndexData::ID),
                   counted(degenerate, "triangle uses a vertex twice and is never seen",
                           "triangles use a vertex twice and are never seen"));
    }

    // --- materials ----------------------------------------------------------------------------------------

    void checkMaterial(const Chunk& chunk, const Material& material)
    {
        if (material.techniques.empty())
        {
            report(Kind::NO_TECHNIQUE, chunk, "the material has no technique, so it counts as missing");
            return;
        }
        for (size_t i = 0; i < material.techniques.size(); ++i)
            checkTechnique(chunk.find(StandardMaterial::ID, i), material.techniques[i]);
    }

    void checkTechnique(const Chunk& chunk, const StandardMaterial& data)
    {
        struct Slot
        {
            const char* what;
            const SamplerField& field;
            bool isBlack;
        };
        const Slot slots[] = {
            {"ambient", data.ambient.sampler, isBlack(data.ambient.colour)},
            {"diffuse", data.diffuse.sampler, isBlack(data.diffuse.colour)},
            {"specular", data.specular.sampler, isBlack(data.specular.colour) || data.specularLevel <= 0.0f},
            {"emissive", data.emissive.sampler, isBlack(data.emissive.colour)},
            {"bump", data.bump, false},
            {"reflection", data.reflection.sampler, false},
            {"refraction", data.refraction, false},
            {"filter-colour", data.filterColour, false},
            {"displacement", data.displacement, false},
            {"gloss", data.gloss, false},
            {"specular-level", data.specularLevelMap, false},
        };
        size_t sampler = 0; // the samplers' chunks have this order except for two
        for (const Slot& slot : slots)
        {
            if (!slot.field)
                continue;
            const Chunk& place = findSampler(chunk, *slot.field, sampler++);
            if (!hasImage(slot.field))
                continue;
            if (slot.isBlack)
                report(Kind::BLACK_TEXTURED, place,
                       "the " + std::string(slot.what) + " image " + quote(slot.field->image) +
                           " will not be seen: its colour is black" +
                           (std::strcmp(slot.what, "specular") == 0 ? " or its level 0" : ""));
            checkImage(place, *slot.field);
        }
    }

    void checkSurfaces(const Chunk& chunk)
    {
        uint32_t known = 0;
        for (const surface::Feature& feature : surface::FEATURES)
            known |= feature.bit;
        for (const Surface& surface : m_scene.surfaces.list)
        {
            const std::string which = "the surface of material " + number(surface.material) + " ";
            const bool hasMaterial = surface.material < m_scene.materials.size() &&
                                     !m_scene.materials[surface.material].techniques.empty();
            if (!hasMaterial)
                report(Kind::SURFACE, chunk, which + "counts for nothing: there is no such material");
            if (surface.features & ~known)
                report(Kind::SURFACE, chunk,
                       which + "has features that are not known here (" + number(surface.features & ~known) +
                           ")");
            if (surface.features & surface::CUTOFF && !(surface.cutoff > 0.0f && surface.cutoff <= 1.0f))
                report(Kind::SURFACE, chunk,
                       which + "is cut off nowhere or everywhere: its cutoff is not above 0 and at most 1");
            if (hasMaterial && surface.features & surface::BACK &&
                m_scene.materials[surface.material].techniques.back().doubleSided == 0)
                report(Kind::SURFACE, chunk,
                       which + "lights backs that are never drawn: it is not double sided");
        }
    }

    static const Chunk& findSampler(const Chunk& chunk, const Sampler& sampler, size_t index)
    {
        size_t count = 0;
        for (const Chunk& child : chunk.children)
        {
            if (child.id == Sampler::ID && count++ == index &&
                (child.fields.size() < 2 || child.fields[1].value == sampler.image))
                return child;
        }
        return chunk;
    }

    void checkImage(const Chunk& chunk, const Sampler& sampler)
    {
        if (sampler.type > sampler::TEXTURE_CUBE)
        {
            report(Kind::SAMPLER_TYPE, chunk,
                   "the sampler type " + number(sampler.type) +
                       " is neither 2D nor cube; the \"missing\" picture "
                       "is shown");
            return;
        }
        const ImageSize size = m_images.measure(sampler.image, sampler.type == sampler::TEXTURE_CUBE);
        if (size.state == ImageState::MISSING)
            report(Kind::IMAGE_MISSING, chunk, "the picture " + quote(sampler.image) + " is not found");
        else if (size.state == ImageState::UNREADABLE)
            report(Kind::IMAGE_UNREADABLE, chunk,
                   "the picture " + quote(sampler.image) + " cannot be decoded");
        else if (sampler.type == sampler::TEXTURE_2D && !size.isBuiltIn && !size.isPowerOfTwo() &&
                 (sampler.wrapHorizontal != 1 || sampler.wrapVertical != 1))
            report(Kind::NEVER_REPEATS, chunk,
                   "the picture " + quote(sampler.image) + " of " + number(size.width) + " x " +
                       number(size.height) + " cannot repeat or be mipmapped");
    }

    // --- skins --------------------------------------------------------------------------------------------

    void checkSkin(const Chunk& chunk, const Skin& skin)
    {
        if (skin.attachments.size() > MOST_JOINTS)
            report(Kind::MANY_JOINTS, chunk,
                   number(skin.attachments.size()) + " joints; the built-in programs take " +
                       number(MOST_JOINTS));
        if (skin.jointsPerVertex < 1 || skin.jointsPerVertex > 4)
            report(Kind::JOINTS_PER_VERTEX, chunk,
                   std::to_string(skin.jointsPerVertex) + " joints for each vertex; 1 to 4 make sense");
        for (size_t i = 0; i < skin.attachments.size(); ++i)
        {
            const std::string& joint = skin.attachments[i].joint;
            if (!areFinite(skin.attachments[i].inverseBindPose))
                report(Kind::BAD_NUMBER, chunk.find(Attachment::ID, i),
                       "the bind pose of " + quote(joint) + " has values that are no finite numbers");
            if (m_scene.scene && !m_scopedNodes.count(joint) && !m_nodes.count(joint))
                report(Kind::JOINT_MISSING, chunk.find(Attachment::ID, i),
                       "the joint " + quote(joint) + " is no node of the scene; its vertices stay at rest");
        }
        const Geometry* geometry = find(m_geometries, skin.geometry);
        if (!geometry || !areReadable(*geometry))
            return;
        const auto [known, isNew] = m_jointCounts.try_emplace(geometry, 0);
        if (isNew)
            known->second = countJoints(*geometry);
        if (size_t(known->second) > skin.attachments.size())
            report(Kind::JOINT_NUMBER, chunk,
                   "geometry " + quote(geometry->name) + " names joint " + std::to_string(known->second - 1) +
                       ", the skin has " + number(skin.attachments.size()));
    }

    static bool areReadable(const Geometry& geometry)
    {
        for (const VertexAttribute& attribute : geometry.vertices.attributes)
        {
            if (!isInside(attribute, geometry.vertices))
                return false;
        }
        return geometry.vertices.vertexCount <= geometry.vertices.data.bytes.size();
    }

    // --- nodes --------------------------------------------------------------------------------------------

    void checkNode(const Chunk& chunk, const NodeData& node, bool top)
    {
        checkTransform(chunk, node, top);
        if (node.geometry)
            checkReference(chunk.find(GeometryReference::ID), node.geometry->geometry,
                           node.geometry->materials);
        if (node.skin)
            checkSkinReference(chunk.find(SkinReference::ID), *node.skin);
        if (node.light)
            checkLightReference(chunk.find(LightReference::ID), *node.light);
        if (node.camera)
            checkCameraReference(chunk.find(CameraReference::ID), *node.camera);
        for (size_t i = 0; i < node.children.size(); ++i)
            checkNode(chunk.find(NodeData::ID, i), node.children[i], false);
    }

    static bool areFinite(const orv::Matrix4f& matrix)
    {
        return std::all_of(matrix.data(), matrix.data() + 16,
                           [](float value) { return std::isfinite(value); });
    }

    /// The engine uses the matrix until a component is animated, then the components.
    void checkTransform(const Chunk& chunk, const NodeData& node, bool top)
    {
        if (!areFinite(node.transform))
            report(Kind::BAD_NUMBER, chunk,
                   "the matrix of " + quote(node.name) + " has values that are no finite numbers");
        if (!hasNodeTransform(m_file.version) || (top && m_scene.upAxis != uint32_t(UpAxis::Y)))
            return;
        const orv::Quaternionf rotation =
            orv::quaternionFromAxisAngle(orv::Vector3f(node.rotation.x, node.rotation.y, node.rotation.z),
                                         orv::Anglef::fromRadians(node.rotation.w));
        const orv::Matrix4f composed = orv::translationMatrix(node.translation) * orv::toMatrix4(rotation) *
                                       orv::scaleMatrix(node.scale);
        float largest = 0.0f;
        float difference = 0.0f;
        for (int i = 0; i < 16; ++i)
        {
            largest = std::max(largest, std::fabs(node.transform.data()[i]));
            difference = std::max(difference, std::fabs(node.transform.data()[i] - composed.data()[i]));
        }
        if (!(difference <= 1e-3f * std::max(1.0f, largest)))
            report(Kind::TRANSFORMS_DIFFER, chunk,
                   "the matrix of " + quote(node.name) +
                       " is not what its translation, rotation and scale come to");
    }

    void checkReference(const Chunk& chunk, const std::string& name,
                        const std::vector<std::string>& materials)
    {
        m_used.insert({Geometry::ID, name});
        for (const std::string& material : materials)
            m_used.insert({Material::ID, material});
        const Geometry* found = find(m_geometries, name);
        if (!found)
        {
            report(Kind::UNKNOWN_GEOMETRY, chunk, "there is no geometry " + quote(name));
            return;
        }
        m_drawsSomething = m_drawsSomething || !m_isAffordable || hasFaces(*found);
        for (size_t i = 0; m_isAffordable && i < found->primitiveSets.size(); ++i)
        {
            if (i >= materials.size() || !m_materials.count(materials[i]))
                report(Kind::NO_MATERIAL, chunk,
                       "primitive set " + number(i) + " of " + quote(name) +
                           " is drawn with the default material: " +
                           (i >= materials.size() ? "none is named" : "there is no " + quote(materials[i])));
        }
    }

    void checkSkinReference(const Chunk& chunk, const SkinReference& reference)
    {
        m_used.insert({Skin::ID, reference.skin});
        const Skin* found = find(m_skins, reference.skin);
        if (!found)
            report(Kind::UNKNOWN_SKIN, chunk, "there is no skin " + quote(reference.skin));
        else
            checkReference(chunk, found->geometry, reference.materials);
    }

    void checkLightReference(const Chunk& chunk, const LightReference& reference)
    {
        m_used.insert({LightDefinition::ID, reference.light});
        const LightDefinition* light = find(m_lights, reference.light);
        if (!light)
            report(Kind::UNKNOWN_LIGHT, chunk, "there is no light " + quote(reference.light));
        else if (light->type > light::SPOT)
            report(Kind::LIGHT_TYPE, chunk,
                   "light " + quote(light->name) + " has the unknown type " + number(light->type));
        else if (light->type == light::AMBIENT)
            report(Kind::AMBIENT_LIGHT, chunk,
                   "the ambient light " + quote(light->name) + " becomes a point light");
    }

    void checkCameraReference(const Chunk& chunk, const CameraReference& reference)
    {
        m_used.insert({CameraDefinition::ID, reference.camera});
        const CameraDefinition* camera = find(m_cameras, reference.camera);
        if (!camera)
            report(Kind::UNKNOWN_CAMERA, chunk, "there is no camera " + quote(reference.camera));
        else if (camera->projection > projection::PERSPECTIVE)
            report(Kind::CAMERA_TYPE, chunk,
                   "camera " + quote(camera->name) + " has the unknown projection " +
                       number(camera->projection));
    }

    // --- animations ---------------------------------------------------------------------------------------

    void checkAnimation(const Chunk& chunk, const AnimationData& animation)
    {
        for (const LoopRange& range : animation.loopRanges)
        {
            if (!(range.begin <= range.end))
                report(Kind::LOOP_RANGE, chunk,
                       "the loop range from " + std::to_string(range.begin) + " to " +
                           std::to_string(range.end) + " ends before it begins");
        }
        for (size_t i = 0; i < animation.channels.size(); ++i)
            checkChannel(chunk.find(Channel::ID, i), animation.channels[i]);
        for (size_t i = 0; i < animation.animations.size(); ++i)
            checkAnimation(chunk.find(AnimationData::ID, i), animation.animations[i]);
    }

    void checkChannel(const Chunk& chunk, const Channel& channel)
    {
        const ChannelKind* kind = findChannelKind(channel.targetType, channel.property);
        if (!kind || channel.type > type::FLOAT)
        {
            report(Kind::CHANNEL_PROPERTY, chunk,
                   kind ? "the channel is ignored: keys of type " + number(channel.type) + " have no meaning"
                        : "the channel is ignored: a " + quote(channel.targetType) + " has no animated " +
                              quote(channel.property));
            return;
        }
        if (channel.coefficientCount < kind->fewestCoefficients ||
            channel.coefficientCount > kind->mostCoefficients)
        {
            report(Kind::COEFFICIENTS, chunk,
                   quote(channel.property) + " has " + number(channel.coefficientCount) +
                       " coefficients in a key; wanted are " + number(kind->mostCoefficients));
            return;
        }
        const std::string target(getTargetName(channel.targetName));
        const bool known = channel.targetType == "node"    ? m_nodes.count(target) > 0
                           : channel.targetType == "light" ? m_lights.count(target) > 0
                                                           : m_materials.count(target) > 0;
        if (!known)
            report(Kind::CHANNEL_TARGET, chunk, "there is no " + channel.targetType + " " + quote(target));
        checkKeys(chunk, channel);
    }

    void checkKeys(const Chunk& chunk, const Channel& channel)
    {
        const size_t keySize = 4 + size_t(channel.coefficientCount) * type::SIZES[channel.type];
        const bool areFloats = channel.type >= 4 && channel.type <= type::FLOAT;
        bool ordered = true;
        bool areFinite = true;
        float last = -HUGE_VALF;
        for (size_t at = 0; at + keySize <= channel.keys.size(); at += keySize)
        {
            const float time = readFloat(&channel.keys[at]);
            if (std::isnan(time))
            {
                report(Kind::KEY_TIME, chunk, "the time of key " + number(at / keySize) + " is not a number");
                return;
            }
            ordered = ordered && time >= last;
            last = time;
            for (size_t value = at + 4; areFloats && value < at + keySize; value += 4)
                areFinite = areFinite && std::isfinite(readFloat(&channel.keys[value]));
        }
        if (!areFinite)
            report(Kind::BAD_NUMBER, chunk, "keys have values that are no finite numbers");
        if (!ordered)
            report(Kind::KEY_ORDER, chunk,
                   "the keys are not in the order of their times; the engine sorts them");
    }

    // ------------------------------------------------------------------------------------------------------

    void reportUnused(const Chunk& list)
    {
        for (const Chunk& item : list.children)
        {
            if (item.record != Chunk::NO_RECORD && item.id != AnimationData::ID &&
                !m_used.count({item.id, item.getName()}))
                report(Kind::UNUSED, item, "nothing in the scene refers to " + quote(item.getName()));
        }
    }

    const ScannedFile& m_file;
    static constexpr uint64_t VALUES_PER_BYTE = 4; ///< limit of values read; a valid file has at most one

    const GloScene& m_scene;
    ByName<Geometry> m_geometries;
    ByName<Skin> m_skins;
    ByName<LightDefinition> m_lights;
    ByName<CameraDefinition> m_cameras;
    std::map<const Geometry*, int> m_jointCounts;
    bool m_isAffordable;
    uint64_t m_valuesLeft;
    Images m_images;
    Findings& m_findings;
    bool m_drawsSomething = false;
    std::set<std::string> m_nodes;
    std::set<std::string> m_scopedNodes;
    std::set<std::string> m_materials; ///< those with a technique
    std::set<std::pair<uint32_t, std::string>> m_used;
};

} // namespace

void checkGlo(const ScannedFile& file, const std::filesystem::path& folder, Findings& findings)
{
    GloChecker(file, folder, findings).check();
}

} // namespace inspect
