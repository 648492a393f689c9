#pragma once

#include <cstddef>

/// A GL that accepts everything and draws nothing, for loading without a context, many thousand times a second.
namespace nulldriver
{

/// Replaces the real GL until glcalls::reset(). No context may be current, so that the real library ignores calls that
/// are not replaced.
///
/// Names are handed out, and glcalls counts them. Shaders compile unless their source holds "#error"; programs
/// link and have three uniforms, u_float, u_texture and u_cube, and one attribute, a_position. A program binary
/// is taken if its format is 1 and it starts with "binary".
void install();

/// The data given to it, in bytes.
struct Given
{
    size_t pixels = 0;   ///< of textures
    size_t vertices = 0; ///< and indices
    size_t sources = 0;  ///< of shaders
};

/// Since install(), or since it was last set to {}.
Given& given();

} // namespace nulldriver
