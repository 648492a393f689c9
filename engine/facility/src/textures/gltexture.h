#pragma once

#include "gl/countedgl.h"

#include "orv/texturecube.h"

namespace orv::detail
{

// GL's values in the order of the enums of textures.

inline constexpr unsigned GL_TEXTURE_FORMATS[] = {GL_RGBA,      GL_RGB,   GL_LUMINANCE_ALPHA,
                                                  GL_LUMINANCE, GL_ALPHA, GL_DEPTH_COMPONENT};
inline constexpr unsigned GL_TEXTURE_TYPES[] = {GL_UNSIGNED_BYTE, GL_UNSIGNED_SHORT,
                                                GL_UNSIGNED_SHORT_4_4_4_4, GL_UNSIGNED_SHORT_5_5_5_1,
                                                GL_UNSIGNED_SHORT_5_6_5};
inline constexpr int GL_FILTER_MODES[] = {GL_NEAREST,
                                          GL_LINEAR,
                                          GL_NEAREST_MIPMAP_NEAREST,
                                          GL_NEAREST_MIPMAP_LINEAR,
                                          GL_LINEAR_MIPMAP_NEAREST,
                                          GL_LINEAR_MIPMAP_LINEAR};
inline constexpr int GL_WRAP_MODES[] = {GL_REPEAT, GL_CLAMP_TO_EDGE, GL_MIRRORED_REPEAT};
inline constexpr unsigned GL_CUBE_FACES[TextureCube::FACE_COUNT] = {
    GL_TEXTURE_CUBE_MAP_POSITIVE_X, GL_TEXTURE_CUBE_MAP_NEGATIVE_X, GL_TEXTURE_CUBE_MAP_POSITIVE_Y,
    GL_TEXTURE_CUBE_MAP_NEGATIVE_Y, GL_TEXTURE_CUBE_MAP_POSITIVE_Z, GL_TEXTURE_CUBE_MAP_NEGATIVE_Z};

} // namespace orv::detail
