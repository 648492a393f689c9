#pragma once

#include "orv/export.h"

#include <cstdint>

namespace orv
{

/// Calls of GL by what they do, and what went along with them.
struct ORV_API FrameCounters
{
    uint32_t draws = 0;      ///< glDrawElements, glDrawArrays
    uint32_t triangles = 0;  ///< of these
    uint32_t uniforms = 0;   ///< glUniform...
    uint32_t programs = 0;   ///< glUseProgram
    uint32_t textures = 0;   ///< glBindTexture
    uint32_t buffers = 0;    ///< glBindBuffer
    uint32_t attributes = 0; ///< glVertexAttrib..., glEnableVertexAttribArray, glDisableVertexAttribArray
    uint32_t targets = 0;    ///< glBindFramebuffer
    uint32_t uploads = 0;    ///< glBufferData, glTexImage2D, glCompressedTexImage2D
    uint32_t others = 0;     ///< all other calls: render state, questions, objects made and deleted
    uint64_t uploadBytes = 0;
    uint32_t culled = 0; ///< SimpleRenderer's: draws that setCulled() has saved, of each picture of a frame

    /// All calls.
    uint32_t getCalls() const
    {
        return draws + uniforms + programs + textures + buffers + attributes + targets + uploads + others;
    }
};

/// What the engine has sent to GL in this process so far; counters wrap around. GL thread only. For one
/// frame, see SimpleRenderer::setCounted(); for a part of a frame or a load, subtract an earlier answer.
/// Calls that an application makes itself do not count.
ORV_API FrameCounters countGlCalls();

/// The calls between two answers; culled stays 0.
ORV_API FrameCounters operator-(const FrameCounters& later, const FrameCounters& earlier);

} // namespace orv
