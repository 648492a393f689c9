#pragma once

#include <GLES2/gl2.h>

#include <cstdint>
#include <map>
#include <string>
#include <vector>

/// A GL that keeps names, bindings and the sizes of buffers as the real one does and draws nothing: what a draw call
/// would have used is noted instead, and what would crash it or read beyond a buffer is a fault.
///
/// Programs take their inputs from what their vertex shaders name: a_position, a_normal, a_uv0. All have two uniforms:
/// u_float and u_texture.
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
    GLuint texture; ///< where u_texture looks

    auto operator<=>(const Draw&) const = default;
};

/// Puts it in place of the real one, over nulldriver; until glcalls::reset(). Nothing is alive or bound then.
void install();

/// The context and all in it is gone, and another one in its place: names begin with 1 again.
void loseContext();

/// The draw calls since the last call.
std::vector<Draw> takeDraws();

/// The first wrong use since the last call; empty for none.
std::string takeFault();

/// How many buffers, textures, shaders and programs there are.
size_t countLiveNames();

} // namespace glmodel
