#pragma once

#include "orv/detail/glorecords.h"

#include <type_traits>

/// The fields of every chunk: their order, labels and versions. The same functions read, write and print, depending on
/// the Io:
///
///     version()                     FileVersion of the file, once acceptVersion() was called
///     acceptVersion(text)           "glo version": understands it, or fails
///     acceptTool(text)              "Authoring tool": likewise
///     u32, i32, f32(label, value)   one number
///     text(label, string)
///     floats(label, float*, count)
///     block(label, size, fields)    size bytes in one piece; fields is called with something that has u32(value)
///                                   and f32(value)
///     chunk(record)                 the record's chunk, required
///     optionalChunk(optional)       a chunk that is there, required
///     chunks(count, vector, skip)   count chunks; if skip, unknown ones are skipped but count
///     each(count, vector, fields)   fields is called for each of count elements
///     body(scene)                   the chunks of BODY_CHUNKS
///     bytes(VertexData), indices(IndexData), keys(Channel)   the rest of their chunks
///     fail(format)                  reports, with the file's name for %s; false
///
/// Every operation returns false, after reporting, when it fails. For an Io that reads, the records are filled;
/// one that writes takes constant records.
namespace orv::detail::glo
{

template <class T, class Record>
concept Of = std::is_same_v<std::remove_const_t<T>, Record>;

/// The chunks of a file body in the order of writing, ended by a 0.
constexpr uint32_t BODY_CHUNKS[] = {
    Info::ID,
    Geometry::LIST_ID,
    Skin::LIST_ID,
    LightDefinition::LIST_ID,
    CameraDefinition::LIST_ID,
    Material::LIST_ID,
    Surfaces::ID,
    AnimationData::LIST_ID,
    SceneData::ID,
    0,
};

constexpr const char* UNEXPECTED_INDEX_BUFFERS = "Unexpected index buffer chunk count in %s";
constexpr const char* UNEXPECTED_TYPE = "Unexpected type in %s";

/// A list chunk: a count, then that many chunks of one kind.
template <class Io, class Records>
bool listFields(Io& io, Records& records)
{
    using Record = typename Records::value_type;
    uint32_t count = uint32_t(records.size());
    return io.u32(Record::COUNT_LABEL, count) && io.chunks(count, records, Record::SKIP_UNKNOWN);
}

template <class Io>
bool fields(Io& io, Of<GloScene> auto& r)
{
    return io.u32("up-axis option file ", r.upAxis) && io.body(r);
}

template <class Io>
bool fields(Io& io, Of<Info> auto& r)
{
    return io.text("glo version", r.gloVersion) && io.text("zunPython version", r.zunPythonVersion) &&
           io.text("zunCollada version", r.zunColladaVersion) &&
           io.text("openColladaPlugin version", r.openColladaVersion) && io.acceptVersion(r.gloVersion) &&
           (!hasAuthoringTool(io.version()) ||
            (io.text("Authoring tool", r.authoringTool) && io.acceptTool(r.authoringTool)));
}

template <class Io>
bool fields(Io& io, Of<VertexAttribute> auto& r)
{
    return io.text("vertex attribute name ", r.name) && io.i32("vertex component count ", r.componentCount) &&
           io.u32("vertex attribute data type ", r.type) && io.i32("vertex attribute offset ", r.offset) &&
           io.i32("vertex attribute stride ", r.stride) &&
           (!hasNormalizeFlag(io.version()) || io.u32("vertex attribute normalize ", r.normalize));
}

template <class Io>
bool fields(Io& io, Of<VertexData> auto& r)
{
    return io.bytes(r);
}

template <class Io>
bool fields(Io& io, Of<VertexSet> auto& r)
{
    uint32_t attributeCount = uint32_t(r.attributes.size());
    return io.u32("vertex count ", r.vertexCount) && io.u32("attribute count ", attributeCount) &&
           io.chunks(attributeCount, r.attributes, false) && io.chunk(r.data);
}

template <class Io>
bool fields(Io& io, Of<IndexData> auto& r)
{
    return io.u32("index buffer type ", r.type) &&
           (r.type == type::UINT16 || io.fail("Only 16-bit indices supported (%s)")) && io.indices(r);
}

template <class Io>
bool fields(Io& io, Of<PrimitiveSet> auto& r)
{
    uint32_t indexBufferCount = r.indices ? 1 : 0;
    return io.u32("primitive type ", r.primitive) && io.u32("Index buffer chunk count ", indexBufferCount) &&
           (indexBufferCount <= 1 || io.fail(UNEXPECTED_INDEX_BUFFERS)) &&
           (indexBufferCount == 0 || io.optionalChunk(r.indices));
}

template <class Io>
bool fields(Io& io, Of<Geometry> auto& r)
{
    uint32_t count = uint32_t(r.primitiveSets.size());
    return io.text("geometry chunk name ", r.name) && io.chunk(r.vertices) && io.u32("PSET count ", count) &&
           io.chunks(count, r.primitiveSets, false);
}

template <class Io>
bool fields(Io& io, Of<Sampler> auto& r)
{
    const auto block = [&r](auto& data)
    {
        data.u32(r.type);
        data.u32(r.minFilter);
        data.u32(r.magFilter);
        data.u32(r.wrapHorizontal);
        data.u32(r.wrapVertical);
        data.u32(r.reserved);
    };
    return io.block("sampler data ", SAMPLER_BLOCK_SIZE, block) && io.text("sampler image name ", r.image);
}

template <class Io>
bool samplerField(Io& io, Of<SamplerField> auto& field)
{
    uint32_t flag = field ? 1 : 0;
    return io.u32("material sampler flag ", flag) && (flag == 0 || io.optionalChunk(field));
}

template <class Io>
bool colourField(Io& io, Of<ColourField> auto& field)
{
    return io.floats("material colour ", &field.colour.x, 4) && samplerField(io, field.sampler);
}

template <class Io>
bool fields(Io& io, Of<StandardMaterial> auto& r)
{
    return colourField(io, r.ambient) && colourField(io, r.diffuse) && colourField(io, r.specular) &&
           io.f32("material shininess ", r.shininess) && colourField(io, r.emissive) &&
           io.f32("material opacity ", r.opacity) && io.u32("material double sided ", r.doubleSided) &&
           samplerField(io, r.bump) && colourField(io, r.reflection) && samplerField(io, r.refraction) &&
           samplerField(io, r.filterColour) && samplerField(io, r.displacement) &&
           samplerField(io, r.gloss) && samplerField(io, r.specularLevelMap) &&
           io.f32("material specular level ", r.specularLevel) &&
           io.f32("material illumination ", r.selfIllumination);
}

template <class Io>
bool fields(Io& io, Of<Material> auto& r)
{
    uint32_t count = uint32_t(r.techniques.size());
    return io.text("material name ", r.name) && io.u32("material technique count ", count) &&
           io.chunks(count, r.techniques, false);
}

template <class Io>
bool fields(Io& io, Of<Surfaces> auto& r)
{
    uint32_t count = uint32_t(r.list.size());
    const auto surface = [&io](auto& s)
    {
        return io.u32("surface material ", s.material) && io.u32("surface features ", s.features) &&
               io.f32("surface cutoff ", s.cutoff);
    };
    return io.u32("surface count ", count) && io.each(count, r.list, surface);
}

template <class Io>
bool fields(Io& io, Of<Attachment> auto& r)
{
    return io.text("joint name ", r.joint) &&
           io.floats("inverse bind pose transform ", &r.inverseBindPose.columns[0].x, 16);
}

template <class Io>
bool fields(Io& io, Of<Skin> auto& r)
{
    uint32_t count = uint32_t(r.attachments.size());
    return io.text("skin name ", r.name) && io.text("geometry name ", r.geometry) &&
           io.i32("joints per vertex ", r.jointsPerVertex) &&
           io.floats("bind shape transform ", &r.bindShape.columns[0].x, 16) &&
           io.u32("attachment count ", count) && io.chunks(count, r.attachments, true);
}

template <class Io>
bool fields(Io& io, Of<LightDefinition> auto& r)
{
    const uint32_t size = lightBlockSize(io.version());
    const auto block = [&r, size](auto& data)
    {
        data.u32(r.type);
        data.f32(r.colour.x);
        data.f32(r.colour.y);
        data.f32(r.colour.z);
        data.f32(r.attenuationNear);
        data.f32(r.attenuationFar);
        data.f32(r.spotInner);
        data.f32(r.spotOuter);
        if (size > 32) // older files leave both at their defaults
        {
            data.u32(r.attenuated);
            data.f32(r.intensity);
        }
    };
    return io.text("light name ", r.name) && io.block("light data ", size, block);
}

template <class Io>
bool fields(Io& io, Of<CameraDefinition> auto& r)
{
    const auto block = [&r](auto& data)
    {
        data.u32(r.projection);
        data.f32(r.fieldOfView);
        data.f32(r.width);
        data.f32(r.nearDistance);
        data.f32(r.farDistance);
    };
    return io.text("camera name ", r.name) && io.block("camera data ", CAMERA_BLOCK_SIZE, block);
}

template <class Io>
bool fields(Io& io, Of<Channel> auto& r)
{
    return io.text("target type ", r.targetType) && io.text("target name ", r.targetName) &&
           io.text("property  name ", r.property) && io.u32("interpolation method ", r.interpolation) &&
           io.u32("coefficient count ", r.coefficientCount) && io.u32("coefficient data type ", r.type) &&
           (r.type < type::COUNT || io.fail(UNEXPECTED_TYPE)) && io.u32("key count ", r.keyCount) &&
           io.keys(r);
}

template <class Io>
bool fields(Io& io, Of<AnimationData> auto& r)
{
    uint32_t rangeCount = uint32_t(r.loopRanges.size());
    uint32_t channelCount = uint32_t(r.channels.size());
    uint32_t animationCount = uint32_t(r.animations.size());
    // Both ends of a range are reported under one label.
    const auto range = [&io](auto& ends)
    { return io.f32("loop start ", ends.begin) && io.f32("loop start ", ends.end); };
    return io.text("anim name ", r.name) && io.u32("ANIM size ", rangeCount) &&
           io.each(rangeCount, r.loopRanges, range) && io.u32("CHAN count ", channelCount) &&
           io.chunks(channelCount, r.channels, false) && io.u32("(sub) ANIM count ", animationCount) &&
           io.chunks(animationCount, r.animations, false);
}

template <class Io>
bool materialNames(Io& io, uint32_t count, auto& names)
{
    return io.each(count, names, [&io](auto& name) { return io.text("material name ", name); });
}

template <class Io>
bool fields(Io& io, Of<GeometryReference> auto& r)
{
    uint32_t count = uint32_t(r.materials.size());
    return io.text("geometry reference name ", r.geometry) && io.u32("material count ", count) &&
           materialNames(io, count, r.materials);
}

/// Both counts come before both lists of names.
template <class Io>
bool fields(Io& io, Of<SkinReference> auto& r)
{
    uint32_t skeletonCount = uint32_t(r.skeletons.size());
    uint32_t materialCount = uint32_t(r.materials.size());
    const auto skeleton = [&io](auto& name) { return io.text("skeleton node name ", name); };
    return io.text("skin reference name ", r.skin) && io.u32("skeleton node count ", skeletonCount) &&
           io.u32("material count ", materialCount) && materialNames(io, materialCount, r.materials) &&
           io.each(skeletonCount, r.skeletons, skeleton);
}

template <class Io>
bool fields(Io& io, Of<LightReference> auto& r)
{
    return io.text("light reference name ", r.light);
}

template <class Io>
bool fields(Io& io, Of<CameraReference> auto& r)
{
    return io.text("camera reference name ", r.camera);
}

/// A place in a node for a reference. Any count but 1 means that no chunk follows.
template <class Io>
bool referenceSlot(Io& io, auto& reference)
{
    uint32_t count = reference ? 1 : 0;
    return io.u32("leaf node count ", count) && (count != 1 || io.optionalChunk(reference));
}

template <class Io>
bool fields(Io& io, Of<NodeData> auto& r)
{
    uint32_t childCount = uint32_t(r.children.size());
    return io.text("node name ", r.name) &&
           (!hasScopedNames(io.version()) || io.text("node scoped name ", r.scopedName)) &&
           (!hasNodeTransform(io.version()) || io.floats("node transform ", &r.transform.columns[0].x, 16)) &&
           io.floats("node translation ", &r.translation.x, 3) &&
           io.floats("node rotation ", &r.rotation.x, 4) && io.floats("node scale ", &r.scale.x, 3) &&
           referenceSlot(io, r.geometry) && (!hasSkinReferences(io.version()) || referenceSlot(io, r.skin)) &&
           referenceSlot(io, r.light) &&
           (!hasCameraReferences(io.version()) || referenceSlot(io, r.camera)) &&
           io.u32("node child count ", childCount) && io.chunks(childCount, r.children, true);
}

template <class Io>
bool fields(Io& io, Of<SceneData> auto& r)
{
    return io.text("scene name ", r.name) && io.chunk(r.top);
}

} // namespace orv::detail::glo
