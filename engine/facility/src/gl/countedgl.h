#pragma once

// Replaces <GLES2/gl2.h> in the engine: each GL call also increments a counter.

#include <GLES2/gl2.h>

#include <cstdint>

namespace orv::detail
{

/// The kinds by which GL calls are counted; draws are counted by primitive.
enum class GlKind
{
    UNIFORM,
    PROGRAM,
    TEXTURE,
    BUFFER,
    ATTRIBUTE,
    TARGET,
    UPLOAD,
    OTHER,
    COUNT
};

struct GlCounts
{
    uint32_t calls[int(GlKind::COUNT)];
    uint32_t draws[8];    ///< by GL's primitive
    uint32_t elements[8]; ///< likewise: vertices or indices drawn
    uint64_t uploadBytes;
};

extern GlCounts g_glCounts;

inline void countDraw(GLenum mode, GLsizei count)
{
    ++g_glCounts.draws[mode & 7];
    g_glCounts.elements[mode & 7] += uint32_t(count);
}

/// Of a picture that GL is given.
uint32_t getPictureBytes(GLsizei width, GLsizei height, GLenum format, GLenum type);

} // namespace orv::detail

#define ORV_GL(kind, call) (++::orv::detail::g_glCounts.calls[int(::orv::detail::GlKind::kind)], call)

#define glDrawArrays(mode, first, count)                                                                     \
    (::orv::detail::countDraw(mode, count), glDrawArrays(mode, first, count))
#define glDrawElements(mode, count, type, indices)                                                           \
    (::orv::detail::countDraw(mode, count), glDrawElements(mode, count, type, indices))
#define glBufferData(target, size, data, usage)                                                              \
    (::orv::detail::g_glCounts.uploadBytes += uint64_t(size),                                                \
     ORV_GL(UPLOAD, glBufferData(target, size, data, usage)))
#define glCompressedTexImage2D(target, level, format, width, height, border, size, data)                     \
    (::orv::detail::g_glCounts.uploadBytes += uint64_t(size),                                                \
     ORV_GL(UPLOAD, glCompressedTexImage2D(target, level, format, width, height, border, size, data)))
#define glTexImage2D(target, level, own, width, height, border, format, type, pixels)                        \
    (::orv::detail::g_glCounts.uploadBytes +=                                                                \
     (pixels) ? ::orv::detail::getPictureBytes(width, height, format, type) : 0u,                            \
     ORV_GL(UPLOAD, glTexImage2D(target, level, own, width, height, border, format, type, pixels)))

#define glUseProgram(...) ORV_GL(PROGRAM, glUseProgram(__VA_ARGS__))
#define glBindTexture(...) ORV_GL(TEXTURE, glBindTexture(__VA_ARGS__))
#define glBindBuffer(...) ORV_GL(BUFFER, glBindBuffer(__VA_ARGS__))
#define glBindFramebuffer(...) ORV_GL(TARGET, glBindFramebuffer(__VA_ARGS__))

#define glUniform1fv(...) ORV_GL(UNIFORM, glUniform1fv(__VA_ARGS__))
#define glUniform1iv(...) ORV_GL(UNIFORM, glUniform1iv(__VA_ARGS__))
#define glUniform2fv(...) ORV_GL(UNIFORM, glUniform2fv(__VA_ARGS__))
#define glUniform2iv(...) ORV_GL(UNIFORM, glUniform2iv(__VA_ARGS__))
#define glUniform3fv(...) ORV_GL(UNIFORM, glUniform3fv(__VA_ARGS__))
#define glUniform3iv(...) ORV_GL(UNIFORM, glUniform3iv(__VA_ARGS__))
#define glUniform4fv(...) ORV_GL(UNIFORM, glUniform4fv(__VA_ARGS__))
#define glUniform4iv(...) ORV_GL(UNIFORM, glUniform4iv(__VA_ARGS__))
#define glUniformMatrix2fv(...) ORV_GL(UNIFORM, glUniformMatrix2fv(__VA_ARGS__))
#define glUniformMatrix3fv(...) ORV_GL(UNIFORM, glUniformMatrix3fv(__VA_ARGS__))
#define glUniformMatrix4fv(...) ORV_GL(UNIFORM, glUniformMatrix4fv(__VA_ARGS__))

#define glDisableVertexAttribArray(...) ORV_GL(ATTRIBUTE, glDisableVertexAttribArray(__VA_ARGS__))
#define glEnableVertexAttribArray(...) ORV_GL(ATTRIBUTE, glEnableVertexAttribArray(__VA_ARGS__))
#define glVertexAttrib4fv(...) ORV_GL(ATTRIBUTE, glVertexAttrib4fv(__VA_ARGS__))
#define glVertexAttribPointer(...) ORV_GL(ATTRIBUTE, glVertexAttribPointer(__VA_ARGS__))

#define glActiveTexture(...) ORV_GL(OTHER, glActiveTexture(__VA_ARGS__))
#define glAttachShader(...) ORV_GL(OTHER, glAttachShader(__VA_ARGS__))
#define glBindRenderbuffer(...) ORV_GL(OTHER, glBindRenderbuffer(__VA_ARGS__))
#define glBlendColor(...) ORV_GL(OTHER, glBlendColor(__VA_ARGS__))
#define glBlendEquationSeparate(...) ORV_GL(OTHER, glBlendEquationSeparate(__VA_ARGS__))
#define glBlendFuncSeparate(...) ORV_GL(OTHER, glBlendFuncSeparate(__VA_ARGS__))
#define glCheckFramebufferStatus(...) ORV_GL(OTHER, glCheckFramebufferStatus(__VA_ARGS__))
#define glClear(...) ORV_GL(OTHER, glClear(__VA_ARGS__))
#define glClearColor(...) ORV_GL(OTHER, glClearColor(__VA_ARGS__))
#define glClearDepthf(...) ORV_GL(OTHER, glClearDepthf(__VA_ARGS__))
#define glClearStencil(...) ORV_GL(OTHER, glClearStencil(__VA_ARGS__))
#define glColorMask(...) ORV_GL(OTHER, glColorMask(__VA_ARGS__))
#define glCompileShader(...) ORV_GL(OTHER, glCompileShader(__VA_ARGS__))
#define glCopyTexImage2D(...) ORV_GL(OTHER, glCopyTexImage2D(__VA_ARGS__))
#define glCreateProgram(...) ORV_GL(OTHER, glCreateProgram(__VA_ARGS__))
#define glCreateShader(...) ORV_GL(OTHER, glCreateShader(__VA_ARGS__))
#define glCullFace(...) ORV_GL(OTHER, glCullFace(__VA_ARGS__))
#define glDeleteBuffers(...) ORV_GL(OTHER, glDeleteBuffers(__VA_ARGS__))
#define glDeleteFramebuffers(...) ORV_GL(OTHER, glDeleteFramebuffers(__VA_ARGS__))
#define glDeleteProgram(...) ORV_GL(OTHER, glDeleteProgram(__VA_ARGS__))
#define glDeleteRenderbuffers(...) ORV_GL(OTHER, glDeleteRenderbuffers(__VA_ARGS__))
#define glDeleteShader(...) ORV_GL(OTHER, glDeleteShader(__VA_ARGS__))
#define glDeleteTextures(...) ORV_GL(OTHER, glDeleteTextures(__VA_ARGS__))
#define glDepthFunc(...) ORV_GL(OTHER, glDepthFunc(__VA_ARGS__))
#define glDepthMask(...) ORV_GL(OTHER, glDepthMask(__VA_ARGS__))
#define glDepthRangef(...) ORV_GL(OTHER, glDepthRangef(__VA_ARGS__))
#define glDisable(...) ORV_GL(OTHER, glDisable(__VA_ARGS__))
#define glEnable(...) ORV_GL(OTHER, glEnable(__VA_ARGS__))
#define glFramebufferRenderbuffer(...) ORV_GL(OTHER, glFramebufferRenderbuffer(__VA_ARGS__))
#define glFramebufferTexture2D(...) ORV_GL(OTHER, glFramebufferTexture2D(__VA_ARGS__))
#define glFrontFace(...) ORV_GL(OTHER, glFrontFace(__VA_ARGS__))
#define glGenBuffers(...) ORV_GL(OTHER, glGenBuffers(__VA_ARGS__))
#define glGenFramebuffers(...) ORV_GL(OTHER, glGenFramebuffers(__VA_ARGS__))
#define glGenRenderbuffers(...) ORV_GL(OTHER, glGenRenderbuffers(__VA_ARGS__))
#define glGenTextures(...) ORV_GL(OTHER, glGenTextures(__VA_ARGS__))
#define glGenerateMipmap(...) ORV_GL(OTHER, glGenerateMipmap(__VA_ARGS__))
#define glGetActiveAttrib(...) ORV_GL(OTHER, glGetActiveAttrib(__VA_ARGS__))
#define glGetActiveUniform(...) ORV_GL(OTHER, glGetActiveUniform(__VA_ARGS__))
#define glGetAttribLocation(...) ORV_GL(OTHER, glGetAttribLocation(__VA_ARGS__))
#define glGetError(...) ORV_GL(OTHER, glGetError(__VA_ARGS__))
#define glGetIntegerv(...) ORV_GL(OTHER, glGetIntegerv(__VA_ARGS__))
#define glGetProgramInfoLog(...) ORV_GL(OTHER, glGetProgramInfoLog(__VA_ARGS__))
#define glGetProgramiv(...) ORV_GL(OTHER, glGetProgramiv(__VA_ARGS__))
#define glGetShaderInfoLog(...) ORV_GL(OTHER, glGetShaderInfoLog(__VA_ARGS__))
#define glGetShaderiv(...) ORV_GL(OTHER, glGetShaderiv(__VA_ARGS__))
#define glGetString(...) ORV_GL(OTHER, glGetString(__VA_ARGS__))
#define glGetTexParameteriv(...) ORV_GL(OTHER, glGetTexParameteriv(__VA_ARGS__))
#define glGetUniformLocation(...) ORV_GL(OTHER, glGetUniformLocation(__VA_ARGS__))
#define glIsProgram(...) ORV_GL(OTHER, glIsProgram(__VA_ARGS__))
#define glLineWidth(...) ORV_GL(OTHER, glLineWidth(__VA_ARGS__))
#define glLinkProgram(...) ORV_GL(OTHER, glLinkProgram(__VA_ARGS__))
#define glPixelStorei(...) ORV_GL(OTHER, glPixelStorei(__VA_ARGS__))
#define glPolygonOffset(...) ORV_GL(OTHER, glPolygonOffset(__VA_ARGS__))
#define glReadPixels(...) ORV_GL(OTHER, glReadPixels(__VA_ARGS__))
#define glRenderbufferStorage(...) ORV_GL(OTHER, glRenderbufferStorage(__VA_ARGS__))
#define glScissor(...) ORV_GL(OTHER, glScissor(__VA_ARGS__))
#define glShaderSource(...) ORV_GL(OTHER, glShaderSource(__VA_ARGS__))
#define glStencilFuncSeparate(...) ORV_GL(OTHER, glStencilFuncSeparate(__VA_ARGS__))
#define glStencilMaskSeparate(...) ORV_GL(OTHER, glStencilMaskSeparate(__VA_ARGS__))
#define glStencilOpSeparate(...) ORV_GL(OTHER, glStencilOpSeparate(__VA_ARGS__))
#define glTexParameteri(...) ORV_GL(OTHER, glTexParameteri(__VA_ARGS__))
#define glValidateProgram(...) ORV_GL(OTHER, glValidateProgram(__VA_ARGS__))
#define glViewport(...) ORV_GL(OTHER, glViewport(__VA_ARGS__))
