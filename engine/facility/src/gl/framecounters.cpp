#include "orv/framecounters.h"

#include "countedgl.h"

#include <initializer_list>
#include <numeric>

namespace orv
{

namespace detail
{

GlCounts g_glCounts = {};

uint32_t getPictureBytes(GLsizei width, GLsizei height, GLenum format, GLenum type)
{
    const bool isPacked = type == GL_UNSIGNED_SHORT_5_6_5 || type == GL_UNSIGNED_SHORT_4_4_4_4 ||
                          type == GL_UNSIGNED_SHORT_5_5_5_1;
    const uint32_t channels = isPacked                       ? 1
                              : format == GL_RGBA            ? 4
                              : format == GL_RGB             ? 3
                              : format == GL_LUMINANCE_ALPHA ? 2
                                                             : 1;
    const uint32_t size = type == GL_UNSIGNED_BYTE ? 1 : type == GL_UNSIGNED_INT || type == GL_FLOAT ? 4 : 2;
    return uint32_t(width) * uint32_t(height) * channels * size;
}

} // namespace detail

FrameCounters countGlCalls()
{
    using detail::GlKind;
    const detail::GlCounts& counts = detail::g_glCounts;
    const auto get = [](GlKind kind) { return detail::g_glCounts.calls[int(kind)]; };
    FrameCounters counters;
    counters.draws = std::accumulate(counts.draws, counts.draws + 8, 0u);
    counters.triangles = counts.elements[GL_TRIANGLES] / 3 + counts.elements[GL_TRIANGLE_STRIP] +
                         counts.elements[GL_TRIANGLE_FAN] -
                         2 * (counts.draws[GL_TRIANGLE_STRIP] + counts.draws[GL_TRIANGLE_FAN]);
    counters.uniforms = get(GlKind::UNIFORM);
    counters.programs = get(GlKind::PROGRAM);
    counters.textures = get(GlKind::TEXTURE);
    counters.buffers = get(GlKind::BUFFER);
    counters.attributes = get(GlKind::ATTRIBUTE);
    counters.targets = get(GlKind::TARGET);
    counters.uploads = get(GlKind::UPLOAD);
    counters.others = get(GlKind::OTHER);
    counters.uploadBytes = counts.uploadBytes;
    return counters;
}

FrameCounters operator-(const FrameCounters& later, const FrameCounters& earlier)
{
    FrameCounters result;
    for (const auto member : {&FrameCounters::draws, &FrameCounters::triangles, &FrameCounters::uniforms,
                              &FrameCounters::programs, &FrameCounters::textures, &FrameCounters::buffers,
                              &FrameCounters::attributes, &FrameCounters::targets, &FrameCounters::uploads,
                              &FrameCounters::others})
        result.*member = later.*member - earlier.*member;
    result.uploadBytes = later.uploadBytes - earlier.uploadBytes;
    return result;
}

} // namespace orv
