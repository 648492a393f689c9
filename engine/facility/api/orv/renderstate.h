#pragma once

#include "orv/colour.h"
#include "orv/export.h"

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace orv
{

/// How one value of a render-state enum is written in appearance files. Tables of these are indexed by the enum's value.
struct RenderStateWord
{
    const char* keyword;               ///< The word.
    const char* alternative = nullptr; ///< second accepted spelling; null where there is none
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

/// The place of a keyword in a table. @return -1 if it is none of them.
template <std::size_t N>
constexpr int findKeyword(const RenderStateWord (&table)[N], std::string_view keyword)
{
    return findKeyword(table, N, keyword);
}

/// What blending multiplies source and destination by.
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

/// The factors as files and GL name them.
inline constexpr RenderStateWord BLEND_FACTORS[] = {
    {"CONSTANT_ALPHA"},
    {"CONSTANT_COLOUR"},
    {"DST_ALPHA"},
    {"DST_COLOUR"},
    {"ONE"},
    {"ONE_MINUS_CONSTANT_ALPHA"},
    {"ONE_MINUS_CONSTANT_COLOUR"},
    {"ONE_MINUS_DST_ALPHA"},
    {"ONE_MINUS_DST_COLOUR"},
    {"ONE_MINUS_SRC_ALPHA"},
    {"ONE_MINUS_SRC_COLOUR"},
    {"SRC_ALPHA"},
    {"SRC_ALPHA_SATURATE"},
    {"SRC_COLOUR"},
    {"ZERO"},
};

/// What blending does with the two products.
enum class BlendFunction : int32_t
{
    ADD = 0,
    REVERSE_SUBTRACT = 1,
    SUBTRACT = 2
};

/// The functions as files and GL name them.
inline constexpr RenderStateWord BLEND_FUNCTIONS[] = {
    {"ADD"},
    {"REVERSE_SUBTRACT"},
    {"SUBTRACT"},
};

/// Which sides of triangles are not drawn.
enum class CullingMode : int32_t
{
    CULL_BACK = 0,
    CULL_FRONT = 1,
    CULL_FRONT_AND_BACK = 2,
    CULL_NONE = 3
};

/// The modes as files and GL name them.
inline constexpr RenderStateWord CULLING_MODES[] = {
    {"BACK", "CULL_BACK"},
    {"FRONT", "CULL_FRONT"},
    {"FRONT_AND_BACK", "CULL_FRONT_AND_BACK"},
    {"NONE", "CULL_NONE"},
};

/// Which turn of the corners is the front.
enum class WindingOrder : int32_t
{
    WINDING_CCW = 0,
    WINDING_CW = 1
};

/// The orders as files and GL name them.
inline constexpr RenderStateWord WINDING_ORDERS[] = {
    {"CCW", "WINDING_CCW"},
    {"CW", "WINDING_CW"},
};

/// When a fragment passes, by its value and the one that is there.
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
    {"NEVER"}, {"LESS"}, {"EQUAL"}, {"LEQUAL"}, {"GREATER"}, {"NOTEQUAL"}, {"GEQUAL"}, {"ALWAYS"},
};

/// What becomes of a stencil value.
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

/// The operations as files and GL name them.
inline constexpr RenderStateWord STENCIL_OPERATIONS[] = {
    {"ZERO"}, {"KEEP"}, {"REPLACE"}, {"INCR"}, {"DECR"}, {"INVERT"}, {"INCR_WRAP"}, {"DECR_WRAP"},
};

/// Each face has two names for one value. The back comes first.
enum class StencilFace : int32_t
{
    BACK = 0,
    FRONT = 1,
    STENCIL_BACK = BACK,
    STENCIL_FRONT = FRONT
};

inline constexpr int STENCIL_FACE_COUNT = 2; ///< Back and front.

/// The faces as files and GL name them.
inline constexpr RenderStateWord STENCIL_FACES[STENCIL_FACE_COUNT] = {
    {"BACK"},
    {"FRONT"},
};

/// The fixed-function state that goes with one material; the defaults are those of a new Appearance.
/// Two-element arrays are indexed by StencilFace.
struct RenderState
{
    Colour4f blendColour; ///< Blending: the constant colour, the factors, the functions.
    BlendFactor blendSrcColour = BlendFactor::ONE;
    BlendFactor blendSrcAlpha = BlendFactor::ONE;
    BlendFactor blendDstColour = BlendFactor::ZERO;
    BlendFactor blendDstAlpha = BlendFactor::ZERO;
    BlendFunction blendFunctionColour = BlendFunction::ADD;
    BlendFunction blendFunctionAlpha = BlendFunction::ADD;

    CullingMode cullingMode = CullingMode::CULL_BACK;      ///< Which sides are left out.
    WindingOrder windingOrder = WindingOrder::WINDING_CCW; ///< which winding is front-facing
    float lineWidth = 1.0f;                                ///< pixels

    bool colourMaskRed = true; ///< Which components are written.
    bool colourMaskGreen = true;
    bool colourMaskBlue = true;
    bool colourMaskAlpha = true;

    /// Depth: whether it is written and tested, how, and by how much it is shifted.
    bool depthWriteEnabled = true;
    float depthOffsetFactor = 0.0f;
    float depthOffsetUnits = 0.0f;
    bool depthTestEnabled = true;
    DepthFunction depthFunction = DepthFunction::LESS;

    bool scissorTestEnabled = false; ///< Whether only the scissor box is drawn to.
    int scissorX = 0;                ///< pixels from the lower left corner
    int scissorY = 0;
    int scissorWidth = 0;
    int scissorHeight = 0;

    bool stencilTestEnabled = false; ///< Whether stencil values decide; all others for each face.
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
