#include "glcalls/weakdevice.h"

#include "support/gltest.h"
#include "support/picture.h"

#include "orv/renderdevice.h"

#include <GLES2/gl2ext.h>

namespace
{

class WeakDeviceTest : public support::GlTest
{
protected:
    static GLuint link(const char* vertex, const char* fragment)
    {
        const GLuint program = glCreateProgram();
        for (const auto& [kind, source] :
             {std::pair(GL_VERTEX_SHADER, vertex), {GL_FRAGMENT_SHADER, fragment}})
        {
            const GLuint shader = glCreateShader(GLenum(kind));
            glShaderSource(shader, 1, &source, nullptr);
            glCompileShader(shader);
            glAttachShader(program, shader);
        }
        glLinkProgram(program);
        return program;
    }

    static bool isLinked(GLuint program)
    {
        GLint linked = GL_FALSE;
        glGetProgramiv(program, GL_LINK_STATUS, &linked);
        return linked;
    }

    /// The colour of a square with the bound texture of 3 x 2 white texels.
    static support::Rgba sampleNpot(GLint filter, GLint wrap)
    {
        const std::vector<uint8_t> white(3 * 2 * 4, 255);
        const float corners[] = {-1, -1, 3, -1, -1, 3};
        GLuint texture = 0;
        glGenTextures(1, &texture);
        glBindTexture(GL_TEXTURE_2D, texture);
        glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA, 3, 2, 0, GL_RGBA, GL_UNSIGNED_BYTE, white.data());
        glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, filter);
        glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, wrap);
        glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, wrap);
        glUseProgram(
            link("attribute vec2 a_position; void main() { gl_Position = vec4(a_position, 0.0, 1.0); }",
                 "uniform sampler2D u_picture;"
                 "void main() { gl_FragColor = texture2D(u_picture, vec2(0.5)); }"));
        glVertexAttribPointer(0, 2, GL_FLOAT, GL_FALSE, 0, corners);
        glEnableVertexAttribArray(0);
        glDrawArrays(GL_TRIANGLES, 0, 3);
        return support::readFrame().pixel(32, 32);
    }
};

const glcalls::Device& NONE = glcalls::WEAK_DEVICES[8]; // has none of these

} // namespace

// Fault caught: a limit that is reported but not enforced.
TEST_F(WeakDeviceTest, keepsToItsLimits)
{
    // Full matrices, and three columns of 8 beside each other: indices that only a draw knows keep arrays whole.
    const auto makeVertex = [](const char* matrices)
    {
        return "uniform mat4 u_m[" + std::string(matrices) +
               "]; uniform float u_f[8], u_g[8], u_h[8]; uniform int u_i; void main()"
               "{ gl_Position = u_m[u_i][0] + vec4(u_f[u_i], u_g[u_i], u_h[u_i], 1.0); }";
    };
    const std::string packed = makeVertex("30"); // 120 + 8, with u_i in the fourth column
    const std::string tooMany = makeVertex("31");
    const char* plain = "void main() { gl_FragColor = vec4(1.0); }";
    const char* high = "precision highp float; void main() { gl_FragColor = vec4(1.0); }";
    const char* guarded =
        "#ifdef GL_FRAGMENT_PRECISION_HIGH\nprecision highp float;\n#else\nprecision mediump float;\n"
        "#endif\nvarying float v; void main() { gl_FragColor = vec4(1.0); }";
    const char* still = "void main() { gl_Position = vec4(1.0); }";
    const struct
    {
        const char* name;
        const char* vertex;
        const char* fragment;
        bool isTaken;
    } programs[] = {
        {"packed", packed.c_str(), plain, true},
        {"a matrix too many", tooMany.c_str(), plain, false},
        {"highp", still, high, false},
        {"highp only where there is any", still, guarded, true},
        {"8 samplers", still,
         "uniform sampler2D u[8]; void main() { gl_FragColor = texture2D(u[7], vec2(0)); }", true},
        {"9 samplers", still,
         "uniform sampler2D u[9]; void main() { gl_FragColor = texture2D(u[8], vec2(0)); }", false}};
    for (const bool isWeak : {false, true})
    {
        if (isWeak)
            glcalls::emulate(NONE);
        for (const auto& c : programs)
            EXPECT_EQ(c.isTaken || !isWeak, isLinked(link(c.vertex, c.fragment))) << c.name << isWeak;
        GLint range[2] = {1, 1};
        GLint precision = 1;
        glGetShaderPrecisionFormat(GL_FRAGMENT_SHADER, GL_HIGH_FLOAT, range, &precision);
        EXPECT_EQ(isWeak, precision == 0);
        EXPECT_EQ(isWeak, orv::RenderDevice::getMaxVertexUniformVectors() == 128);
        for (const char* extension :
             {"GL_OES_texture_npot", "GL_OES_depth_texture", "GL_OES_packed_depth_stencil"})
            EXPECT_EQ(!isWeak, orv::RenderDevice::isExtensionSupported(extension)) << extension;
    }
}

// Fault caught: a format that is accepted although the device lacks it.
TEST_F(WeakDeviceTest, refusesWhatItLacks)
{
    constexpr GLenum depth = GL_DEPTH_COMPONENT;
    const std::pair<GLenum, void (*)()> cases[] = {
        {GL_INVALID_ENUM, [] { glActiveTexture(GL_TEXTURE8); }},
        {GL_INVALID_ENUM, [] { glRenderbufferStorage(GL_RENDERBUFFER, GL_DEPTH24_STENCIL8_OES, 4, 4); }},
        {GL_INVALID_ENUM,
         [] { glTexImage2D(GL_TEXTURE_2D, 0, depth, 4, 4, 0, depth, GL_UNSIGNED_SHORT, nullptr); }},
        {GL_INVALID_ENUM,
         [] { glCompressedTexImage2D(GL_TEXTURE_2D, 0, GL_ETC1_RGB8_OES, 4, 4, 0, 8, "12345678"); }},
        {GL_INVALID_VALUE,
         [] { glTexImage2D(GL_TEXTURE_2D, 1, GL_RGBA, 3, 2, 0, GL_RGBA, GL_UNSIGNED_BYTE, nullptr); }},
    };
    GLuint texture = 0;
    GLuint buffer = 0;
    glGenTextures(1, &texture);
    glBindTexture(GL_TEXTURE_2D, texture);
    glGenRenderbuffers(1, &buffer);
    glBindRenderbuffer(GL_RENDERBUFFER, buffer);
    for (const bool isWeak : {false, true})
    {
        if (isWeak)
            glcalls::emulate(NONE);
        for (const auto& [error, call] : cases)
        {
            call();
            EXPECT_EQ(isWeak ? error : GLenum(GL_NO_ERROR), glGetError()) << &call - &cases[0].second;
        }
    }
}

// Fault caught: sizes that are no power of two drawn as a stronger device would draw them.
TEST_F(WeakDeviceTest, incompleteTexturesAreBlack)
{
    const support::Rgba white = {255, 255, 255, 255};
    const support::Rgba black = {0, 0, 0, 255};
    EXPECT_EQ(white, sampleNpot(GL_LINEAR, GL_REPEAT));
    glcalls::emulate(glcalls::WEAK_DEVICES[2]);
    EXPECT_EQ(white, sampleNpot(GL_LINEAR, GL_CLAMP_TO_EDGE));
    EXPECT_EQ(black, sampleNpot(GL_LINEAR, GL_REPEAT));
    EXPECT_EQ(black, sampleNpot(GL_NEAREST_MIPMAP_NEAREST, GL_CLAMP_TO_EDGE));
    glGenerateMipmap(GL_TEXTURE_2D);
    EXPECT_EQ(GLenum(GL_INVALID_OPERATION), glGetError());
}
