#include "glcalls/glcalls.h"

#include "support/gltest.h"
#include "support/picture.h"

#include <algorithm>
#include <cstdlib>

using support::GlTest;

namespace
{

using GlCallsTest = GlTest;

} // namespace

// Fault caught: a call that goes past the table, so that a redundant call is never seen.
TEST_F(GlCallsTest, countsCallsAndStillMakesThem)
{
    glClearColor(1.0f, 0.0f, 0.0f, 1.0f);
    glClear(GL_COLOR_BUFFER_BIT);
    glClear(GL_COLOR_BUFFER_BIT);
    EXPECT_EQ(3u, glcalls::total());
    EXPECT_EQ(2u, glcalls::count(glClear));
    EXPECT_EQ(1u, glcalls::count("glClearColor"));
    EXPECT_EQ((support::Rgba{255, 0, 0, 255}), support::readFrame().average());
}

// Fault caught: arguments in the wrong order or of the wrong kind in what tests compare with.
TEST_F(GlCallsTest, recordsEachKindOfArgument)
{
    const float matrix[4] = {1.0f, 0.5f, 0.0f, -2.0f};
    GLuint name = 0;
    glcalls::dropAll();
    glcalls::startRecording();
    glBindTexture(GL_TEXTURE_2D, 3);
    glClear(GL_COLOR_BUFFER_BIT);
    glColorMask(GL_TRUE, GL_FALSE, GL_TRUE, GL_TRUE);
    glDepthRangef(0.25f, 1.0f);
    glUniform2fv(5, 2, matrix);
    glUniformMatrix2fv(1, 1, GL_FALSE, matrix);
    glUniform1iv(1, 0, nullptr);
    glGetUniformLocation(7, "u_time");
    glVertexAttribPointer(0, 3, GL_FLOAT, GL_FALSE, 32, reinterpret_cast<const void*>(12));
    glBufferData(GL_ARRAY_BUFFER, 16, matrix, GL_STATIC_DRAW);
    glGenTextures(1, &name);
    glFinish();
    const std::vector<std::string> expected = {"glBindTexture(0x0de1, 3)",
                                               "glClear(0x4000)",
                                               "glColorMask(1, 0, 1, 1)",
                                               "glDepthRangef(0.25, 1)",
                                               "glUniform2fv(5, 2, {1, 0.5, 0, -2})",
                                               "glUniformMatrix2fv(1, 1, 0, {1, 0.5, 0, -2})",
                                               "glUniform1iv(1, 0, null)",
                                               "glGetUniformLocation(7, \"u_time\")",
                                               "glVertexAttribPointer(0, 3, 0x1406, 0, 32, 12)",
                                               "glBufferData(0x8892, 16, data, 0x88e4)",
                                               "glGenTextures(1, data)",
                                               "glFinish()"};
    EXPECT_EQ(expected, glcalls::recorded());
    EXPECT_EQ(1u, glcalls::recorded("glClear").size());
    EXPECT_EQ(0u, name) << "a dropped call must not reach the driver";
}

// Fault caught: a failure that a test asked for and that outlives reset() into the next test.
TEST_F(GlCallsTest, failuresEndWithReset)
{
    GLuint texture = 1;
    GLint status = GL_TRUE;
    glcalls::refuseNames(glGenTextures);
    glcalls::setDropped(glCreateProgram);
    glcalls::setFramebufferStatus(GL_FRAMEBUFFER_UNSUPPORTED);
    glcalls::failCompiling("no luck");
    glcalls::queueError(GL_OUT_OF_MEMORY);
    const GLuint shader = glCreateShader(GL_VERTEX_SHADER);
    glGenTextures(1, &texture);
    glGetShaderiv(shader, GL_COMPILE_STATUS, &status);
    char log[5] = {};
    glGetShaderInfoLog(shader, sizeof log, nullptr, log);
    EXPECT_EQ(0u, texture);
    EXPECT_EQ(GL_FALSE, status);
    EXPECT_STREQ("no l", log);
    EXPECT_EQ(0u, glCreateProgram());
    EXPECT_EQ(GLenum(GL_FRAMEBUFFER_UNSUPPORTED), glCheckFramebufferStatus(GL_FRAMEBUFFER));
    EXPECT_EQ(GLenum(GL_OUT_OF_MEMORY), glGetError());
    EXPECT_EQ(GLenum(GL_NO_ERROR), glGetError());

    glcalls::reset();
    glGenTextures(1, &texture);
    EXPECT_TRUE(texture && glCreateProgram());
    EXPECT_EQ(GLenum(GL_FRAMEBUFFER_COMPLETE), glCheckFramebufferStatus(GL_FRAMEBUFFER));
}

// Fault caught: an error that is written down beside the wrong call, or kept from the program that made it.
TEST_F(GlCallsTest, checksEachCallWhereTheEnvironmentSaysSo)
{
    setenv("ORV_GL_CHECK", "1", 1);
    glcalls::reset();
    testing::internal::CaptureStderr();
    glEnable(GL_BLEND);
    glEnable(0x0bad);
    glDisable(GL_BLEND);
    const std::string said = testing::internal::GetCapturedStderr();
    unsetenv("ORV_GL_CHECK");
    EXPECT_EQ(0u, said.find("GL error 0x0500: glEnable(0x0bad); bound are program 0,")) << said;
    EXPECT_EQ(1, std::count(said.begin(), said.end(), '\n')) << said;
    EXPECT_EQ(GLenum(GL_INVALID_ENUM), glGetError());
    EXPECT_EQ(GLenum(GL_NO_ERROR), glGetError());
}

// Fault caught: a replacement that calls the entry point it replaces and never comes back.
TEST_F(GlCallsTest, replacementReachesTheRealFunction)
{
    glcalls::replace(glGetIntegerv,
                     [](GLenum name, GLint* value)
                     {
                         glcalls::real(glGetIntegerv)(name, value);
                         if (name == GL_MAX_TEXTURE_SIZE)
                             *value = 64;
                     });
    GLint size = 0;
    glGetIntegerv(GL_MAX_TEXTURE_SIZE, &size);
    EXPECT_EQ(64, size);
    glcalls::restore(glGetIntegerv);
    glGetIntegerv(GL_MAX_TEXTURE_SIZE, &size);
    EXPECT_LT(64, size);
}

// Fault caught: a leak hidden because the same name is alive in another context.
TEST_F(GlCallsTest, tracksLiveNamesPerContext)
{
    GLuint buffers[2];
    glGenBuffers(2, buffers);
    const GLuint program = glCreateProgram();
    EXPECT_EQ((std::vector<GLuint>{buffers[0], buffers[1]}), glcalls::liveNames(glcalls::Kind::BUFFER));
    {
        const auto other = makeContext();
        EXPECT_EQ("", glcalls::describeLiveNames());
        GLuint texture;
        glGenTextures(1, &texture);
        EXPECT_EQ("textures " + std::to_string(texture), glcalls::describeLiveNames());
    }
    ASSERT_TRUE(context().makeCurrent());
    glDeleteBuffers(2, buffers);
    EXPECT_EQ("programs " + std::to_string(program), glcalls::describeLiveNames());
    glDeleteProgram(program);
    EXPECT_EQ("", glcalls::describeLiveNames());
}
