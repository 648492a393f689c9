#pragma once

#include "orv/detail/gloformat.h"
#include "orv/detail/rawvector.h"
#include "orv/matrix.h"
#include "orv/vector.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

/// The content of a scene file as plain data, one record per kind of chunk. A record with an ID is a chunk of
/// its own; the order of the fields in the file is that of glofields.h.
///
/// Texts are at most 1023 characters. Angles are in radians, times in seconds. Records refer to each other by name:
/// nodes to geometries, skins, lights, cameras and materials, channels to their targets.
namespace orv::detail::glo
{

struct Info
{
    static constexpr uint32_t ID = chunkId("INFO");

    std::string gloVersion = "0.14.0"; ///< decides the layout of all that follows
    std::string zunPythonVersion = "0.0.0";
    std::string zunColladaVersion = "0.0.0";
    std::string openColladaVersion = "0.0.0";
    std::string authoringTool = "blender2.63.0"; ///< one of AUTHORING_TOOLS; from 0.13.0
};

// ---------------------------------------------------------------------------------------------- geometries

/// The attribute names are those of the shaders: a_position, a_normal, a_uv0, a_uv1, a_tangent, a_binormal,
/// a_colour, a_joints, a_weights. Joints and weights have four components; joints are never normalised.
struct VertexAttribute
{
    static constexpr uint32_t ID = chunkId("VATT");

    std::string name;
    int32_t componentCount = 0;
    uint32_t type = type::FLOAT;
    int32_t offset = 0;     ///< bytes inside a vertex
    int32_t stride = 0;     ///< bytes from one vertex to the next; 0 if they are adjacent
    uint32_t normalize = 0; ///< flag; from 0.14.0
};

struct VertexData
{
    static constexpr uint32_t ID = chunkId("VBUF");

    RawVector<uint8_t> bytes;
};

struct VertexSet
{
    static constexpr uint32_t ID = chunkId("VSET");

    uint32_t vertexCount = 0;
    std::vector<VertexAttribute> attributes;
    VertexData data;
};

struct IndexData
{
    static constexpr uint32_t ID = chunkId("IBUF");

    uint32_t type = type::UINT16; ///< nothing else is accepted
    RawVector<uint16_t> indices;
};

struct PrimitiveSet
{
    static constexpr uint32_t ID = chunkId("PSET");

    uint32_t primitive = primitive::TRIANGLES;
    std::optional<IndexData> indices; ///< without them the vertices are drawn in order
};

struct Geometry
{
    static constexpr uint32_t ID = chunkId("GEOM");
    static constexpr uint32_t LIST_ID = chunkId("LGEO");
    static constexpr const char* COUNT_LABEL = "geometry count ";
    static constexpr bool SKIP_UNKNOWN = true;

    std::string name;
    VertexSet vertices;
    std::vector<PrimitiveSet> primitiveSets; ///< each takes a material of the reference, in order
};

// ----------------------------------------------------------------------------------------------- materials

/// The settings are engine enum values, applied to 2D textures from files, where their size allows.
struct Sampler
{
    static constexpr uint32_t ID = chunkId("SMPL");

    uint32_t type = sampler::TEXTURE_2D;
    uint32_t minFilter = 4;      ///< TextureParameters::FilterMode
    uint32_t magFilter = 1;      ///< the same, NEAREST or LINEAR
    uint32_t wrapHorizontal = 0; ///< TextureParameters::WrapMode
    uint32_t wrapVertical = 0;
    uint32_t reserved = 0;
    std::string image; ///< empty for none
};

using SamplerField = std::optional<Sampler>;

struct ColourField
{
    Vector4f colour = Vector4f(0.0f, 0.0f, 0.0f, 1.0f);
    SamplerField sampler;
};

struct StandardMaterial
{
    static constexpr uint32_t ID = chunkId("SMAT");

    ColourField ambient;
    ColourField diffuse;
    ColourField specular;
    float shininess = 5.0f;
    ColourField emissive;
    float opacity = 1.0f; ///< below 1 the material is blended
    uint32_t doubleSided = 0;
    SamplerField bump;
    ColourField reflection;
    SamplerField refraction;
    SamplerField filterColour;
    SamplerField displacement;
    SamplerField gloss;
    SamplerField specularLevelMap;
    float specularLevel = 0.0f;
    float selfIllumination = 0.0f;
    uint32_t features = 0; ///< bits of namespace surface; this and the next from the SURF chunk
    float cutoff = 0.5f;
};

struct Material
{
    static constexpr uint32_t ID = chunkId("MATL");
    static constexpr uint32_t LIST_ID = chunkId("LMAT");
    static constexpr const char* COUNT_LABEL = "material count ";
    static constexpr bool SKIP_UNKNOWN = false;

    std::string name;
    std::vector<StandardMaterial> techniques; ///< the last one counts
};

/// Further features of a material of the list; readers that do not know the chunk skip it.
struct Surface
{
    uint32_t material = 0; ///< its index in the list of materials
    uint32_t features = 0; ///< bits of namespace surface
    float cutoff = 0.5f;   ///< CUTOFF discards pixels of a lower opacity
};

struct Surfaces
{
    static constexpr uint32_t ID = chunkId("SURF");

    std::vector<Surface> list;
};

// --------------------------------------------------------------------------------- skins, lights, cameras

struct Attachment
{
    static constexpr uint32_t ID = chunkId("ATCH");

    std::string joint; ///< scoped name of a node, or else its name
    Matrix4f inverseBindPose = Matrix4f::IDENTITY;
};

struct Skin
{
    static constexpr uint32_t ID = chunkId("SKIN");
    static constexpr uint32_t LIST_ID = chunkId("LCTL");
    static constexpr const char* COUNT_LABEL = "controller count ";
    static constexpr bool SKIP_UNKNOWN = true;

    std::string name;
    std::string geometry;
    int32_t jointsPerVertex = 4;
    Matrix4f bindShape = Matrix4f::IDENTITY;
    std::vector<Attachment> attachments; ///< in the order of the joint indices; at most 20 reach a shader
};

/// Shines along -z of the nodes that refer to it.
struct LightDefinition
{
    static constexpr uint32_t ID = chunkId("LGHT");
    static constexpr uint32_t LIST_ID = chunkId("LLGT");
    static constexpr const char* COUNT_LABEL = "light count ";
    static constexpr bool SKIP_UNKNOWN = true;

    std::string name;
    uint32_t type = light::POINT;
    Vector3f colour = Vector3f(1.0f, 1.0f, 1.0f);
    float attenuationNear = 1.0f;
    float attenuationFar = 1000.0f;
    float spotInner = 0.5235988f; ///< whole angle of the cone
    float spotOuter = 0.7853982f;
    uint32_t attenuated = 1; ///< flag; from 0.10.0
    float intensity = 1.0f;  ///< from 0.10.0
};

/// Looks along -z of the nodes that refer to it.
struct CameraDefinition
{
    static constexpr uint32_t ID = chunkId("CAMA");
    static constexpr uint32_t LIST_ID = chunkId("LCAM");
    static constexpr const char* COUNT_LABEL = "camera count ";
    static constexpr bool SKIP_UNKNOWN = true;

    std::string name;
    uint32_t projection = projection::PERSPECTIVE;
    float fieldOfView = 1.0471976f; ///< whole angle over the shorter side of the view; perspective
    float width = 2.0f;             ///< of the view, in world units; orthographic
    float nearDistance = 0.1f;
    float farDistance = 100.0f;
};

// ---------------------------------------------------------------------------------------------- animations

struct LoopRange
{
    float begin = 0.0f;
    float end = 0.0f;
};

/// What moves, by target type: "node" has "translation", "rotation" (axis and angle), "scale"; "light", meaning
/// the definition, has "colour", "multiplier"; "material" has "ambient", "diffuse", "specular", "emission",
/// "self_illumination", "specular_level", "shininess", "opacity".
struct Channel
{
    static constexpr uint32_t ID = chunkId("CHAN");

    std::string targetType;
    std::string targetName; ///< a leading "node-" is ignored
    std::string property;
    uint32_t interpolation = interpolation::STEPPED; ///< any value but LINEAR is stepped
    uint32_t coefficientCount = 0;
    uint32_t type = type::FLOAT;
    uint32_t keyCount = 0;
    std::vector<uint8_t> keys; ///< per key: its time as a float, its coefficients
};

struct AnimationData
{
    static constexpr uint32_t ID = chunkId("ANIM");
    static constexpr uint32_t LIST_ID = chunkId("LANM");
    static constexpr const char* COUNT_LABEL = "animation count ";
    static constexpr bool SKIP_UNKNOWN = false;

    std::string name;
    std::vector<LoopRange> loopRanges; ///< the last one in the file is its loop range
    std::vector<Channel> channels;
    std::vector<AnimationData> animations;
};

// --------------------------------------------------------------------------------------------------- scene

struct GeometryReference
{
    static constexpr uint32_t ID = chunkId("GREF");

    std::string geometry;
    std::vector<std::string> materials; ///< one per primitive set
};

struct SkinReference
{
    static constexpr uint32_t ID = chunkId("SREF");

    std::string skin;
    std::vector<std::string> materials;
    std::vector<std::string> skeletons; ///< nodes below which joints are searched first
};

struct LightReference
{
    static constexpr uint32_t ID = chunkId("LREF");

    std::string light;
};

struct CameraReference
{
    static constexpr uint32_t ID = chunkId("CREF");

    std::string camera;
};

struct NodeData
{
    static constexpr uint32_t ID = chunkId("NODE");

    std::string name;
    std::string scopedName;                  ///< from 0.14.0
    Matrix4f transform = Matrix4f::IDENTITY; ///< from 0.12.0; used until a component is set
    Vector3f translation;
    Vector4f rotation = Vector4f(0.0f, 1.0f, 0.0f, 0.0f); ///< axis, then angle
    Vector3f scale = Vector3f(1.0f, 1.0f, 1.0f);
    std::optional<GeometryReference> geometry;
    std::optional<SkinReference> skin; ///< from 0.14.0
    std::optional<LightReference> light;
    std::optional<CameraReference> camera; ///< from 0.11.0
    std::vector<NodeData> children;
};

struct SceneData
{
    static constexpr uint32_t ID = chunkId("SCNE");

    std::string name;
    NodeData top;
};

/// A whole file.
struct GloScene
{
    static constexpr uint32_t ID = chunkId("GLO3");

    uint32_t upAxis = uint32_t(UpAxis::Y);
    Info info;
    std::vector<Geometry> geometries;
    std::vector<Skin> skins;
    std::vector<LightDefinition> lights;
    std::vector<CameraDefinition> cameras;
    std::vector<Material> materials;
    Surfaces surfaces;
    std::vector<AnimationData> animations;
    std::optional<SceneData> scene;
};

} // namespace orv::detail::glo
