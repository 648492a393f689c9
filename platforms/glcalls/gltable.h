#pragma once

/// Every entry point of OpenGL ES 2.0, in the order of <GLES2/gl2.h>:
/// X(result, name, (parameters), (arguments)).
// clang-format off
#define GLCALLS_TABLE(X) \
    X(void, glActiveTexture, (GLenum texture), (texture)) \
    X(void, glAttachShader, (GLuint program, GLuint shader), (program, shader)) \
    X(void, glBindAttribLocation, (GLuint program, GLuint index, const GLchar* name), (program, index, name)) \
    X(void, glBindBuffer, (GLenum target, GLuint buffer), (target, buffer)) \
    X(void, glBindFramebuffer, (GLenum target, GLuint framebuffer), (target, framebuffer)) \
    X(void, glBindRenderbuffer, (GLenum target, GLuint renderbuffer), (target, renderbuffer)) \
    X(void, glBindTexture, (GLenum target, GLuint texture), (target, texture)) \
    X(void, glBlendColor, (GLfloat red, GLfloat green, GLfloat blue, GLfloat alpha), (red, green, blue, alpha)) \
    X(void, glBlendEquation, (GLenum mode), (mode)) \
    X(void, glBlendEquationSeparate, (GLenum modeRGB, GLenum modeAlpha), (modeRGB, modeAlpha)) \
    X(void, glBlendFunc, (GLenum sfactor, GLenum dfactor), (sfactor, dfactor)) \
    X(void, glBlendFuncSeparate, (GLenum sfactorRGB, GLenum dfactorRGB, GLenum sfactorAlpha, GLenum dfactorAlpha), (sfactorRGB, dfactorRGB, sfactorAlpha, dfactorAlpha)) \
    X(void, glBufferData, (GLenum target, GLsizeiptr size, const void* data, GLenum usage), (target, size, data, usage)) \
    X(void, glBufferSubData, (GLenum target, GLintptr offset, GLsizeiptr size, const void* data), (target, offset, size, data)) \
    X(GLenum, glCheckFramebufferStatus, (GLenum target), (target)) \
    X(void, glClear, (GLbitfield mask), (mask)) \
    X(void, glClearColor, (GLfloat red, GLfloat green, GLfloat blue, GLfloat alpha), (red, green, blue, alpha)) \
    X(void, glClearDepthf, (GLfloat d), (d)) \
    X(void, glClearStencil, (GLint s), (s)) \
    X(void, glColorMask, (GLboolean red, GLboolean green, GLboolean blue, GLboolean alpha), (red, green, blue, alpha)) \
    X(void, glCompileShader, (GLuint shader), (shader)) \
    X(void, glCompressedTexImage2D, (GLenum target, GLint level, GLenum internalformat, GLsizei width, GLsizei height, GLint border, GLsizei imageSize, const void* data), (target, level, internalformat, width, height, border, imageSize, data)) \
    X(void, glCompressedTexSubImage2D, (GLenum target, GLint level, GLint xoffset, GLint yoffset, GLsizei width, GLsizei height, GLenum format, GLsizei imageSize, const void* data), (target, level, xoffset, yoffset, width, height, format, imageSize, data)) \
    X(void, glCopyTexImage2D, (GLenum target, GLint level, GLenum internalformat, GLint x, GLint y, GLsizei width, GLsizei height, GLint border), (target, level, internalformat, x, y, width, height, border)) \
    X(void, glCopyTexSubImage2D, (GLenum target, GLint level, GLint xoffset, GLint yoffset, GLint x, GLint y, GLsizei width, GLsizei height), (target, level, xoffset, yoffset, x, y, width, height)) \
    X(GLuint, glCreateProgram, (), ()) \
    X(GLuint, glCreateShader, (GLenum type), (type)) \
    X(void, glCullFace, (GLenum mode), (mode)) \
    X(void, glDeleteBuffers, (GLsizei n, const GLuint* buffers), (n, buffers)) \
    X(void, glDeleteFramebuffers, (GLsizei n, const GLuint* framebuffers), (n, framebuffers)) \
    X(void, glDeleteProgram, (GLuint program), (program)) \
    X(void, glDeleteRenderbuffers, (GLsizei n, const GLuint* renderbuffers), (n, renderbuffers)) \
    X(void, glDeleteShader, (GLuint shader), (shader)) \
    X(void, glDeleteTextures, (GLsizei n, const GLuint* textures), (n, textures)) \
    X(void, glDepthFunc, (GLenum func), (func)) \
    X(void, glDepthMask, (GLboolean flag), (flag)) \
    X(void, glDepthRangef, (GLfloat n, GLfloat f), (n, f)) \
    X(void, glDetachShader, (GLuint program, GLuint shader), (program, shader)) \
    X(void, glDisable, (GLenum cap), (cap)) \
    X(void, glDisableVertexAttribArray, (GLuint index), (index)) \
    X(void, glDrawArrays, (GLenum mode, GLint first, GLsizei count), (mode, first, count)) \
    X(void, glDrawElements, (GLenum mode, GLsizei count, GLenum type, const void* indices), (mode, count, type, indices)) \
    X(void, glEnable, (GLenum cap), (cap)) \
    X(void, glEnableVertexAttribArray, (GLuint index), (index)) \
    X(void, glFinish, (), ()) \
    X(void, glFlush, (), ()) \
    X(void, glFramebufferRenderbuffer, (GLenum target, GLenum attachment, GLenum renderbuffertarget, GLuint renderbuffer), (target, attachment, renderbuffertarget, renderbuffer)) \
    X(void, glFramebufferTexture2D, (GLenum target, GLenum attachment, GLenum textarget, GLuint texture, GLint level), (target, attachment, textarget, texture, level)) \
    X(void, glFrontFace, (GLenum mode), (mode)) \
    X(void, glGenBuffers, (GLsizei n, GLuint* buffers), (n, buffers)) \
    X(void, glGenerateMipmap, (GLenum target), (target)) \
    X(void, glGenFramebuffers, (GLsizei n, GLuint* framebuffers), (n, framebuffers)) \
    X(void, glGenRenderbuffers, (GLsizei n, GLuint* renderbuffers), (n, renderbuffers)) \
    X(void, glGenTextures, (GLsizei n, GLuint* textures), (n, textures)) \
    X(void, glGetActiveAttrib, (GLuint program, GLuint index, GLsizei bufSize, GLsizei* length, GLint* size, GLenum* type, GLchar* name), (program, index, bufSize, length, size, type, name)) \
    X(void, glGetActiveUniform, (GLuint program, GLuint index, GLsizei bufSize, GLsizei* length, GLint* size, GLenum* type, GLchar* name), (program, index, bufSize, length, size, type, name)) \
    X(void, glGetAttachedShaders, (GLuint program, GLsizei maxCount, GLsizei* count, GLuint* shaders), (program, maxCount, count, shaders)) \
    X(GLint, glGetAttribLocation, (GLuint program, const GLchar* name), (program, name)) \
    X(void, glGetBooleanv, (GLenum pname, GLboolean* data), (pname, data)) \
    X(void, glGetBufferParameteriv, (GLenum target, GLenum pname, GLint* params), (target, pname, params)) \
    X(GLenum, glGetError, (), ()) \
    X(void, glGetFloatv, (GLenum pname, GLfloat* data), (pname, data)) \
    X(void, glGetFramebufferAttachmentParameteriv, (GLenum target, GLenum attachment, GLenum pname, GLint* params), (target, attachment, pname, params)) \
    X(void, glGetIntegerv, (GLenum pname, GLint* data), (pname, data)) \
    X(void, glGetProgramiv, (GLuint program, GLenum pname, GLint* params), (program, pname, params)) \
    X(void, glGetProgramInfoLog, (GLuint program, GLsizei bufSize, GLsizei* length, GLchar* infoLog), (program, bufSize, length, infoLog)) \
    X(void, glGetRenderbufferParameteriv, (GLenum target, GLenum pname, GLint* params), (target, pname, params)) \
    X(void, glGetShaderiv, (GLuint shader, GLenum pname, GLint* params), (shader, pname, params)) \
    X(void, glGetShaderInfoLog, (GLuint shader, GLsizei bufSize, GLsizei* length, GLchar* infoLog), (shader, bufSize, length, infoLog)) \
    X(void, glGetShaderPrecisionFormat, (GLenum shadertype, GLenum precisiontype, GLint* range, GLint* precision), (shadertype, precisiontype, range, precision)) \
    X(void, glGetShaderSource, (GLuint shader, GLsizei bufSize, GLsizei* length, GLchar* source), (shader, bufSize, length, source)) \
    X(const GLubyte*, glGetString, (GLenum name), (name)) \
    X(void, glGetTexParameterfv, (GLenum target, GLenum pname, GLfloat* params), (target, pname, params)) \
    X(void, glGetTexParameteriv, (GLenum target, GLenum pname, GLint* params), (target, pname, params)) \
    X(void, glGetUniformfv, (GLuint program, GLint location, GLfloat* params), (program, location, params)) \
    X(void, glGetUniformiv, (GLuint program, GLint location, GLint* params), (program, location, params)) \
    X(GLint, glGetUniformLocation, (GLuint program, const GLchar* name), (program, name)) \
    X(void, glGetVertexAttribfv, (GLuint index, GLenum pname, GLfloat* params), (index, pname, params)) \
    X(void, glGetVertexAttribiv, (GLuint index, GLenum pname, GLint* params), (index, pname, params)) \
    X(void, glGetVertexAttribPointerv, (GLuint index, GLenum pname, void** pointer), (index, pname, pointer)) \
    X(void, glHint, (GLenum target, GLenum mode), (target, mode)) \
    X(GLboolean, glIsBuffer, (GLuint buffer), (buffer)) \
    X(GLboolean, glIsEnabled, (GLenum cap), (cap)) \
    X(GLboolean, glIsFramebuffer, (GLuint framebuffer), (framebuffer)) \
    X(GLboolean, glIsProgram, (GLuint program), (program)) \
    X(GLboolean, glIsRenderbuffer, (GLuint renderbuffer), (renderbuffer)) \
    X(GLboolean, glIsShader, (GLuint shader), (shader)) \
    X(GLboolean, glIsTexture, (GLuint texture), (texture)) \
    X(void, glLineWidth, (GLfloat width), (width)) \
    X(void, glLinkProgram, (GLuint program), (program)) \
    X(void, glPixelStorei, (GLenum pname, GLint param), (pname, param)) \
    X(void, glPolygonOffset, (GLfloat factor, GLfloat units), (factor, units)) \
    X(void, glReadPixels, (GLint x, GLint y, GLsizei width, GLsizei height, GLenum format, GLenum type, void* pixels), (x, y, width, height, format, type, pixels)) \
    X(void, glReleaseShaderCompiler, (), ()) \
    X(void, glRenderbufferStorage, (GLenum target, GLenum internalformat, GLsizei width, GLsizei height), (target, internalformat, width, height)) \
    X(void, glSampleCoverage, (GLfloat value, GLboolean invert), (value, invert)) \
    X(void, glScissor, (GLint x, GLint y, GLsizei width, GLsizei height), (x, y, width, height)) \
    X(void, glShaderBinary, (GLsizei count, const GLuint* shaders, GLenum binaryFormat, const void* binary, GLsizei length), (count, shaders, binaryFormat, binary, length)) \
    X(void, glShaderSource, (GLuint shader, GLsizei count, const GLchar* const* string, const GLint* length), (shader, count, string, length)) \
    X(void, glStencilFunc, (GLenum func, GLint ref, GLuint mask), (func, ref, mask)) \
    X(void, glStencilFuncSeparate, (GLenum face, GLenum func, GLint ref, GLuint mask), (face, func, ref, mask)) \
    X(void, glStencilMask, (GLuint mask), (mask)) \
    X(void, glStencilMaskSeparate, (GLenum face, GLuint mask), (face, mask)) \
    X(void, glStencilOp, (GLenum fail, GLenum zfail, GLenum zpass), (fail, zfail, zpass)) \
    X(void, glStencilOpSeparate, (GLenum face, GLenum sfail, GLenum dpfail, GLenum dppass), (face, sfail, dpfail, dppass)) \
    X(void, glTexImage2D, (GLenum target, GLint level, GLint internalformat, GLsizei width, GLsizei height, GLint border, GLenum format, GLenum type, const void* pixels), (target, level, internalformat, width, height, border, format, type, pixels)) \
    X(void, glTexParameterf, (GLenum target, GLenum pname, GLfloat param), (target, pname, param)) \
    X(void, glTexParameterfv, (GLenum target, GLenum pname, const GLfloat* params), (target, pname, params)) \
    X(void, glTexParameteri, (GLenum target, GLenum pname, GLint param), (target, pname, param)) \
    X(void, glTexParameteriv, (GLenum target, GLenum pname, const GLint* params), (target, pname, params)) \
    X(void, glTexSubImage2D, (GLenum target, GLint level, GLint xoffset, GLint yoffset, GLsizei width, GLsizei height, GLenum format, GLenum type, const void* pixels), (target, level, xoffset, yoffset, width, height, format, type, pixels)) \
    X(void, glUniform1f, (GLint location, GLfloat v0), (location, v0)) \
    X(void, glUniform1fv, (GLint location, GLsizei count, const GLfloat* value), (location, count, value)) \
    X(void, glUniform1i, (GLint location, GLint v0), (location, v0)) \
    X(void, glUniform1iv, (GLint location, GLsizei count, const GLint* value), (location, count, value)) \
    X(void, glUniform2f, (GLint location, GLfloat v0, GLfloat v1), (location, v0, v1)) \
    X(void, glUniform2fv, (GLint location, GLsizei count, const GLfloat* value), (location, count, value)) \
    X(void, glUniform2i, (GLint location, GLint v0, GLint v1), (location, v0, v1)) \
    X(void, glUniform2iv, (GLint location, GLsizei count, const GLint* value), (location, count, value)) \
    X(void, glUniform3f, (GLint location, GLfloat v0, GLfloat v1, GLfloat v2), (location, v0, v1, v2)) \
    X(void, glUniform3fv, (GLint location, GLsizei count, const GLfloat* value), (location, count, value)) \
    X(void, glUniform3i, (GLint location, GLint v0, GLint v1, GLint v2), (location, v0, v1, v2)) \
    X(void, glUniform3iv, (GLint location, GLsizei count, const GLint* value), (location, count, value)) \
    X(void, glUniform4f, (GLint location, GLfloat v0, GLfloat v1, GLfloat v2, GLfloat v3), (location, v0, v1, v2, v3)) \
    X(void, glUniform4fv, (GLint location, GLsizei count, const GLfloat* value), (location, count, value)) \
    X(void, glUniform4i, (GLint location, GLint v0, GLint v1, GLint v2, GLint v3), (location, v0, v1, v2, v3)) \
    X(void, glUniform4iv, (GLint location, GLsizei count, const GLint* value), (location, count, value)) \
    X(void, glUniformMatrix2fv, (GLint location, GLsizei count, GLboolean transpose, const GLfloat* value), (location, count, transpose, value)) \
    X(void, glUniformMatrix3fv, (GLint location, GLsizei count, GLboolean transpose, const GLfloat* value), (location, count, transpose, value)) \
    X(void, glUniformMatrix4fv, (GLint location, GLsizei count, GLboolean transpose, const GLfloat* value), (location, count, transpose, value)) \
    X(void, glUseProgram, (GLuint program), (program)) \
    X(void, glValidateProgram, (GLuint program), (program)) \
    X(void, glVertexAttrib1f, (GLuint index, GLfloat x), (index, x)) \
    X(void, glVertexAttrib1fv, (GLuint index, const GLfloat* v), (index, v)) \
    X(void, glVertexAttrib2f, (GLuint index, GLfloat x, GLfloat y), (index, x, y)) \
    X(void, glVertexAttrib2fv, (GLuint index, const GLfloat* v), (index, v)) \
    X(void, glVertexAttrib3f, (GLuint index, GLfloat x, GLfloat y, GLfloat z), (index, x, y, z)) \
    X(void, glVertexAttrib3fv, (GLuint index, const GLfloat* v), (index, v)) \
    X(void, glVertexAttrib4f, (GLuint index, GLfloat x, GLfloat y, GLfloat z, GLfloat w), (index, x, y, z, w)) \
    X(void, glVertexAttrib4fv, (GLuint index, const GLfloat* v), (index, v)) \
    X(void, glVertexAttribPointer, (GLuint index, GLint size, GLenum type, GLboolean normalized, GLsizei stride, const void* pointer), (index, size, type, normalized, stride, pointer)) \
    X(void, glViewport, (GLint x, GLint y, GLsizei width, GLsizei height), (x, y, width, height))
// clang-format on
