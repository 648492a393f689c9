#pragma once

#include "orv/colour.h"
#include "orv/export.h"

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace orv
{

/// One value of a render-state enum: how it is written in appearance files and what the GL calls it. Tables
/// of these are indexed by the enum's value.
struct RenderStateWord
{
    const char* keyword;
    const char* alternative; ///< second accepted spelling; null where there is none
    unsigned glValue;
};

/// The position of a keyword (either spelling, case-sensitive) in one of the tables below, which is the
/// enum's value; -1 when the table does not have it.
constexpr int findKeyword(const RenderStateWord* table, std::size_t size, std::string_view keyword)
{
    for (std::size_t i = 0; i < size; ++i)
    {
        if (keyword == table[i].keyword || (table[i].alternative && keyword == table[i].alternative))
            return int(i);
    }
    return -1;
}

template <std::size_t N>
constexpr int findKeyword(const RenderStateWord (&table)[N], std::string_view keyword)
{
    return findKeyword(table, N, keyword);
}

enum class BlendFactor : int32_t
{
    CONSTANT_ALPHA = 0,
    CONSTANT_COLOUR = 1,
    DST_ALPHA = 2,
    DST_COLOUR = 3,
    ONE = 4,
    ONE_MINUS_CONSTANT_ALPHA = 5,
    ONE_MINUS_CONSTANT_COLOUR = 6,
    ONE_MINUS_DST_ALPHA = 7,
    ONE_MINUS_DST_COLOUR = 8,
    ONE_MINUS_SRC_ALPHA = 9,
    ONE_MINUS_SRC_COLOUR = 10,
    SRC_ALPHA = 11,
    SRC_ALPHA_SATURATE = 12,
    SRC_COLOUR = 13,
    ZERO = 14
};

inline constexpr RenderStateWord BLEND_FACTORS[] = {
    {"CONSTANT_ALPHA", nullptr, 0x8003},
    {"CONSTANT_COLOUR", nullptr, 0x8001},
    {"DST_ALPHA", nullptr, 0x0304},
    {"DST_COLOUR", nullptr, 0x0306},
    {"ONE", nullptr, 1},
    {"ONE_MINUS_CONSTANT_ALPHA", nullptr, 0x8004},
    {"ONE_MINUS_CONSTANT_COLOUR", nullptr, 0x8002},
    {"ONE_MINUS_DST_ALPHA", nullptr, 0x0305},
    {"ONE_MINUS_DST_COLOUR", nullptr, 0x0307},
    {"ONE_MINUS_SRC_ALPHA", nullptr, 0x0303},
    {"ONE_MINUS_SRC_COLOUR", nullptr, 0x0301},
    {"SRC_ALPHA", nullptr, 0x0302},
    {"SRC_ALPHA_SATURATE", nullptr, 0x0308},
    {"SRC_COLOUR", nullptr, 0x0300},
    {"ZERO", nullptr, 0},
};

enum class BlendFunction : int32_t
{
    ADD = 0,
    REVERSE_SUBTRACT = 1,
    SUBTRACT = 2
};

inline constexpr RenderStateWord BLEND_FUNCTIONS[] = {
    {"ADD", nullptr, 0x8006},
    {"REVERSE_SUBTRACT", nullptr, 0x800B},
    {"SUBTRACT", nullptr, 0x800A},
};

enum class CullingMode : int32_t
{
    CULL_BACK = 0,
    CULL_FRONT = 1,
    CULL_FRONT_AND_BACK = 2,
    CULL_NONE = 3
};

/// CULL_NONE has no face: culling is switched off instead.
inline constexpr RenderStateWord CULLING_MODES[] = {
    {"BACK", "CULL_BACK", 0x0405},
    {"FRONT", "CULL_FRONT", 0x0404},
    {"FRONT_AND_BACK", "CULL_FRONT_AND_BACK", 0x0408},
    {"NONE", "CULL_NONE", 0},
};

enum class WindingOrder : int32_t
{
    WINDING_CCW = 0,
    WINDING_CW = 1
};

inline constexpr RenderStateWord WINDING_ORDERS[] = {
    {"CCW", "WINDING_CCW", 0x0901},
    {"CW", "WINDING_CW", 0x0900},
};

enum class DepthFunction : int32_t
{
    NEVER = 0,
    LESS = 1,
    EQUAL = 2,
    LEQUAL = 3,
    GREATER = 4,
    NOTEQUAL = 5,
    GEQUAL = 6,
    ALWAYS = 7
};

/// The same words and values as DepthFunction.
enum class StencilFunction : int32_t
{
    NEVER = 0,
    LESS = 1,
    EQUAL = 2,
    LEQUAL = 3,
    GREATER = 4,
    NOTEQUAL = 5,
    GEQUAL = 6,
    ALWAYS = 7
};

/// Of DepthFunction and StencilFunction alike.
inline constexpr RenderStateWord COMPARISONS[] = {
    {"NEVER", nullptr, 0x0200},  {"LESS", nullptr, 0x0201},    {"EQUAL", nullptr, 0x0202},
    {"LEQUAL", nullptr, 0x0203}, {"GREATER", nullptr, 0x0204}, {"NOTEQUAL", nullptr, 0x0205},
    {"GEQUAL", nullptr, 0x0206}, {"ALWAYS", nullptr, 0x0207},
};

enum class StencilOperation : int32_t
{
    ZERO = 0,
    KEEP = 1,
    REPLACE = 2,
    INCR = 3,
    DECR = 4,
    INVERT = 5,
    INCR_WRAP = 6,
    DECR_WRAP = 7
};

inline constexpr RenderStateWord STENCIL_OPERATIONS[] = {
    {"ZERO", nullptr, 0},           {"KEEP", nullptr, 0x1E00},      {"REPLACE", nullptr, 0x1E01},
    {"INCR", nullptr, 0x1E02},      {"DECR", nullptr, 0x1E03},      {"INVERT", nullptr, 0x150A},
    {"INCR_WRAP", nullptr, 0x8507}, {"DECR_WRAP", nullptr, 0x8508},
};

/// Each face has two names for one value. The back comes first.
enum class StencilFace : int32_t
{
    BACK = 0,
    FRONT = 1,
    STENCIL_BACK = BACK,
    STENCIL_FRONT = FRONT
};

inline constexpr int STENCIL_FACE_COUNT = 2;

inline constexpr RenderStateWord STENCIL_FACES[STENCIL_FACE_COUNT] = {
    {"BACK", nullptr, 0x0405},
    {"FRONT", nullptr, 0x0404},
};

/// The fixed-function state that goes with one material; the defaults are those of a new Appearance.
/// Two-element arrays are indexed by StencilFace.
struct RenderState
{
    Colour4f blendColour;
    BlendFactor blendSrcColour = BlendFactor::ONE;
    BlendFactor blendSrcAlpha = BlendFactor::ONE;
    BlendFactor blendDstColour = BlendFactor::ZERO;
    BlendFactor blendDstAlpha = BlendFactor::ZERO;
    BlendFunction blendFunctionColour = BlendFunction::ADD;
    BlendFunction blendFunctionAlpha = BlendFunction::ADD;

    CullingMode cullingMode = CullingMode::CULL_BACK;
    WindingOrder windingOrder = WindingOrder::WINDING_CCW; ///< which winding is front-facing
    float lineWidth = 1.0f;                                ///< pixels

    bool colourMaskRed = true;
    bool colourMaskGreen = true;
    bool colourMaskBlue = true;
    bool colourMaskAlpha = true;

    bool depthWriteEnabled = true;
    float depthOffsetFactor = 0.0f;
    float depthOffsetUnits = 0.0f;
    bool depthTestEnabled = true;
    DepthFunction depthFunction = DepthFunction::LESS;

    bool scissorTestEnabled = false;
    int scissorX = 0; ///< pixels from the lower left corner
    int scissorY = 0;
    int scissorWidth = 0;
    int scissorHeight = 0;

    bool stencilTestEnabled = false;
    StencilFunction stencilFunction[STENCIL_FACE_COUNT] = {StencilFunction::ALWAYS, StencilFunction::ALWAYS};
    int stencilReference[STENCIL_FACE_COUNT] = {0, 0};
    /// Kept, but a material never sends it: its comparisons go through stencilWriteMask (RenderContext::apply).
    uint32_t stencilFunctionMask[STENCIL_FACE_COUNT] = {0xFFFFFFFFu, 0xFFFFFFFFu};
    StencilOperation stencilFailOperation[STENCIL_FACE_COUNT] = {StencilOperation::KEEP,
                                                                 StencilOperation::KEEP};
    StencilOperation stencilDepthFailOperation[STENCIL_FACE_COUNT] = {StencilOperation::KEEP,
                                                                      StencilOperation::KEEP};
    StencilOperation stencilPassOperation[STENCIL_FACE_COUNT] = {StencilOperation::KEEP,
                                                                 StencilOperation::KEEP};
    uint32_t stencilWriteMask[STENCIL_FACE_COUNT] = {0xFFFFFFFFu, 0xFFFFFFFFu};

    bool operator==(const RenderState&) const = default;
};

namespace detail
{

// What setters ask before they take a value that GL would refuse. The caller keeps the old one after false, which
// is logged.

/// Above 0.
ORV_API bool allowLineWidth(float pixels);
/// @param of  what has the size, for the message; neither side may be negative.
ORV_API bool allowSize(const char* of, int width, int height);
/// Neither value may be NaN.
ORV_API bool allowNumbers(const char* of, float first, float second = 0.0f);

} // namespace detail

} // namespace orv
