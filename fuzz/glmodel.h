#pragma once

#include <GLES2/gl2.h>

#include <cstdint>
#include <map>
#include <string>
#include <vector>

/// A GL that tracks names, bindings and buffer sizes and draws nothing: it notes the objects that a draw call would
/// use, and reports calls that would crash or read beyond a buffer.
///
/// Programs have the inputs that their vertex shaders name: a_position, a_normal, a_uv0. All have two uniforms: u_float
/// and u_texture.
namespace glmodel
{

/// What one draw call used.
struct Draw
{
    GLuint program;
    GLuint indexBuffer;
    GLuint positionBuffer;
    GLsizei count;
    float value;    ///< of u_float
    GLuint texture; ///< bound for u_texture

    auto operator<=>(const Draw&) const = default;
};

/// Replaces the real GL until glcalls::reset(), on top of nulldriver. At first nothing is alive or bound.
void install();

/// Replaces the context by a new one: names begin with 1 again.
void loseContext();

/// The draw calls since the last call.
std::vector<Draw> takeDraws();

/// The first wrong use since the last call; empty for none.
std::string takeFault();

/// The number of buffers, textures, shaders and programs.
size_t countLiveNames();

} // namespace glmodel
