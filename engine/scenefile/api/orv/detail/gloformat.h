#pragma once

#include <compare>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <string_view>

/// The container rules of scene files, shared by reader, writer and inspector: chunk IDs, type codes and the
/// differences between versions. The chunks' contents are in glorecords.h and glofields.h.
///
/// Everything in a file is little-endian and unaligned. A chunk is its ID (four characters, kept as one 32-bit
/// word with the first character lowest), the number of its data bytes as an unsigned 32-bit number, the data.
namespace orv::detail::glo
{

constexpr uint32_t chunkId(const char (&text)[5])
{
    uint32_t id = 0;
    for (int i = 3; i >= 0; --i)
        id = id << 8 | uint32_t(static_cast<unsigned char>(text[i]));
    return id;
}

struct ChunkKind
{
    uint32_t id;
    const char* content;
};

/// Every chunk that a file may hold.
constexpr ChunkKind CHUNKS[] = {
    {chunkId("GLO3"), "file body"},
    {chunkId("INFO"), "file information and versions"},
    {chunkId("LGEO"), "list of geometries"},
    {chunkId("GEOM"), "geometry"},
    {chunkId("VSET"), "vertex set"},
    {chunkId("VATT"), "vertex attribute"},
    {chunkId("VBUF"), "interleaved vertex data"},
    {chunkId("PSET"), "primitive set"},
    {chunkId("IBUF"), "index data"},
    {chunkId("LMAT"), "list of materials"},
    {chunkId("MATL"), "material"},
    {chunkId("SMAT"), "standard material"},
    {chunkId("SMPL"), "texture sampler"},
    {chunkId("SURF"), "further features of materials"},
    {chunkId("LCTL"), "list of controllers"},
    {chunkId("SKIN"), "skin"},
    {chunkId("ATCH"), "joint attachment"},
    {chunkId("LLGT"), "list of lights"},
    {chunkId("LGHT"), "light definition"},
    {chunkId("LCAM"), "list of cameras"},
    {chunkId("CAMA"), "camera definition"},
    {chunkId("LANM"), "list of animations"},
    {chunkId("ANIM"), "animation"},
    {chunkId("CHAN"), "animation channel"},
    {chunkId("SCNE"), "scene"},
    {chunkId("NODE"), "scene node"},
    {chunkId("GREF"), "geometry reference"},
    {chunkId("SREF"), "skin reference"},
    {chunkId("LREF"), "light reference"},
    {chunkId("CREF"), "camera reference"},
};

/// A chunk ID as its four characters.
struct ChunkName
{
    char text[5] = {};

    constexpr explicit ChunkName(uint32_t id)
    {
        for (int i = 0; i < 4; ++i)
            text[i] = char(static_cast<unsigned char>(id >> (8 * i)));
    }
};

/// Chunks inside chunks, the file body included, so at most 509 nodes one below the other. A file that goes
/// deeper is refused: reading and drawing recurse.
constexpr int MAX_CHUNK_DEPTH = 512;

/// Bytes of a text with its final NUL: 1 to this many.
constexpr uint32_t MAX_TEXT_SIZE = 1024;

/// "major.minor.patch" as three numbers.
struct FileVersion
{
    int first = 0;
    int second = 0;
    int third = 0;

    constexpr auto operator<=>(const FileVersion&) const = default;
};

/// The newest version; newer files are refused, all older ones are read.
constexpr FileVersion NEWEST_VERSION = {0, 14, 0};

constexpr bool isSupported(FileVersion v)
{
    return v <= NEWEST_VERSION;
}
constexpr bool hasAuthoringTool(FileVersion v)
{
    return v >= FileVersion{0, 13, 0};
}
constexpr bool hasScopedNames(FileVersion v)
{
    return v >= FileVersion{0, 14, 0};
}
/// Attributes of older files are all normalised.
constexpr bool hasNormalizeFlag(FileVersion v)
{
    return v >= FileVersion{0, 14, 0};
}
constexpr bool hasSkinReferences(FileVersion v)
{
    return v >= FileVersion{0, 14, 0};
}
constexpr bool hasNodeTransform(FileVersion v)
{
    return v >= FileVersion{0, 12, 0};
}
constexpr bool hasCameraReferences(FileVersion v)
{
    return v >= FileVersion{0, 11, 0};
}
/// Materials of older files are drawn by the fallback program.
constexpr bool hasMaterialFeatures(FileVersion v)
{
    return v >= FileVersion{0, 7, 0};
}

constexpr uint32_t lightBlockSize(FileVersion v)
{
    return v >= FileVersion{0, 10, 0} ? 40 : 32;
}
constexpr uint32_t CAMERA_BLOCK_SIZE = 20;
constexpr uint32_t SAMPLER_BLOCK_SIZE = 24;

/// Reads three numbers with dots between them; blanks before a number and anything after the third are ignored.
/// @return false, version unchanged, if there are fewer.
inline bool parseVersion(const char* text, FileVersion& version)
{
    int numbers[3];
    for (int i = 0; i < 3; ++i)
    {
        if (i > 0 && *text++ != '.')
            return false;
        char* end = nullptr;
        const long number = std::strtol(text, &end, 10);
        if (end == text)
            return false;
        constexpr long LIMIT = std::numeric_limits<int>::max();
        numbers[i] = int(number > LIMIT ? LIMIT : number < -LIMIT ? -LIMIT : number);
        text = end;
    }
    version = {numbers[0], numbers[1], numbers[2]};
    return true;
}

/// The tool that a file says it comes from. Files without the field count as MAX.
enum class AuthoringTool : uint32_t
{
    MAX = 1,
    BLENDER = 2
};

struct AuthoringToolName
{
    const char* text;
    AuthoringTool tool;
};

constexpr AuthoringToolName AUTHORING_TOOLS[] = {
    {"3ds_max2012", AuthoringTool::MAX},
    {"blender2.63.0", AuthoringTool::BLENDER},
};

/// What is done to the rotation of the top node.
enum class UpAxis : uint32_t
{
    X = 0, ///< replaced by +90 degrees about z
    Y = 1, ///< kept
    Z = 2  ///< replaced by -90 degrees about x
};

/// The interpolation of a channel's keys. Every other value means steps: tools write various numbers there, so LINEAR
/// is a number that none of them writes.
namespace interpolation
{
constexpr uint32_t STEPPED = 0;
constexpr uint32_t LINEAR = chunkId("LINE");
} // namespace interpolation

/// Number types of vertex attributes, indices and animation keys.
namespace type
{
constexpr uint32_t INT8 = 0;
constexpr uint32_t UINT8 = 1;
constexpr uint32_t INT16 = 2;
constexpr uint32_t UINT16 = 3;
constexpr uint32_t FLOAT = 6; ///< 4 and 5 are read as floats too

constexpr uint32_t SIZES[] = {1, 1, 2, 2, 4, 4, 4, 2, 2};
constexpr uint32_t COUNT = sizeof(SIZES) / sizeof(SIZES[0]);

/// VertexBuffer::AttribFormat values, by code. 7 and 8 take two bytes in keys, but GL reads four for a fixed
/// point number.
constexpr int ATTRIB_FORMATS[COUNT] = {0, 1, 2, 3, 4, 4, 4, 5, 5};
constexpr int UNKNOWN_ATTRIB_FORMAT = 4;
} // namespace type

/// Primitive codes.
namespace primitive
{
constexpr uint32_t POINTS = 0;
constexpr uint32_t LINE_STRIP = 1;
constexpr uint32_t LINE_LOOP = 2;
constexpr uint32_t LINES = 3;
constexpr uint32_t TRIANGLE_FAN = 4; ///< codes above 6 are drawn as this too
constexpr uint32_t TRIANGLES = 5;
constexpr uint32_t TRIANGLE_STRIP = 6;
} // namespace primitive

/// Sampler types.
namespace sampler
{
constexpr uint32_t TEXTURE_2D = 0;
constexpr uint32_t TEXTURE_CUBE = 1;
} // namespace sampler

/// Further material features, one bit each; each is a feature of the lit programs. Unknown bits are ignored.
namespace surface
{
constexpr uint32_t VERTEX_COLOUR = 1;
constexpr uint32_t CUTOFF = 2;
constexpr uint32_t BACK = 4;
constexpr uint32_t UNLIT = 8;
constexpr uint32_t LINEAR = 16;

struct Feature
{
    uint32_t bit;
    const char* define; ///< in a program's name
};

/// In the order in which names have them.
constexpr Feature FEATURES[] = {
    {VERTEX_COLOUR, "$VCOL"}, {CUTOFF, "$CUTOFF"}, {BACK, "$BACK"}, {UNLIT, "$UNLIT"}, {LINEAR, "$LINEAR"},
};
} // namespace surface

/// Light types. From 4 on a definition is refused when a node refers to it.
namespace light
{
constexpr uint32_t AMBIENT = 0; ///< becomes a point light, after a warning
constexpr uint32_t POINT = 1;
constexpr uint32_t DIRECTIONAL = 2;
constexpr uint32_t SPOT = 3;
} // namespace light

/// Camera projections, the values of Camera::ProjectionType.
namespace projection
{
constexpr uint32_t ORTHOGRAPHIC = 0;
constexpr uint32_t PERSPECTIVE = 1;
} // namespace projection

/// The targets of channels and the number of coefficients of their keys. Channels of other targets are skipped.
struct ChannelKind
{
    const char* targetType;
    const char* property;
    uint32_t fewestCoefficients;
    uint32_t mostCoefficients;
};

constexpr ChannelKind CHANNEL_KINDS[] = {
    {"node", "translation", 3, 3},
    {"node", "rotation", 4, 4}, // axis and angle
    {"node", "scale", 3, 3},
    {"light", "colour", 3, 4}, // the opacity may be left out
    {"light", "multiplier", 1, 1},
    {"material", "ambient", 3, 4},
    {"material", "diffuse", 3, 4},
    {"material", "specular", 3, 4},
    {"material", "emission", 3, 4},
    {"material", "self_illumination", 1, 1},
    {"material", "specular_level", 1, 1},
    {"material", "shininess", 1, 1},
    {"material", "opacity", 1, 1},
};

/// @return null if there is none.
constexpr const ChannelKind* findChannelKind(std::string_view targetType, std::string_view property)
{
    for (const ChannelKind& kind : CHANNEL_KINDS)
    {
        if (targetType == kind.targetType && property == kind.property)
            return &kind;
    }
    return nullptr;
}

/// The name of a channel's target, without a leading "node-".
constexpr std::string_view getTargetName(std::string_view name)
{
    return name.substr(0, 5) == "node-" ? name.substr(5) : name;
}

} // namespace orv::detail::glo
