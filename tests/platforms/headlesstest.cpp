#include "headless/headless.h"

#include "headless/png.h"
#include "support/gltest.h"
#include "support/picture.h"
#include "support/tempdir.h"

using support::GlTest;
using support::Picture;
using support::Rgba;

namespace
{

using HeadlessTest = GlTest;

void clearRegion(int x, int y, int width, int height, float r, float g, float b)
{
    glEnable(GL_SCISSOR_TEST);
    glScissor(x, y, width, height);
    glClearColor(r, g, b, 1.0f);
    glClear(GL_COLOR_BUFFER_BIT);
    glDisable(GL_SCISSOR_TEST);
}

} // namespace

// Fault caught: a picture upside down or one row off, which would make every later picture test lie.
TEST_F(HeadlessTest, readsTheTopRowFirst)
{
    clearRegion(0, 0, 64, 64, 0.0f, 0.0f, 1.0f);
    clearRegion(0, 63, 32, 1, 1.0f, 0.0f, 0.0f); // the upper left, as GL counts
    const Picture frame = support::readFrame();
    EXPECT_EQ((Rgba{255, 0, 0, 255}), frame.pixel(31, 0));
    EXPECT_EQ((Rgba{0, 0, 255, 255}), frame.pixel(32, 0));
    EXPECT_EQ((Rgba{0, 0, 255, 255}), frame.pixel(0, 1));
}

// Fault caught: reading whatever framebuffer a test left bound, or leaving another one bound.
TEST_F(HeadlessTest, readsTheSurfaceWhateverIsBound)
{
    clearRegion(0, 0, 64, 64, 0.0f, 1.0f, 0.0f);
    GLuint framebuffer;
    glGenFramebuffers(1, &framebuffer);
    glBindFramebuffer(GL_FRAMEBUFFER, framebuffer);
    EXPECT_EQ((Rgba{0, 255, 0, 255}), support::readFrame().average());
    GLint bound = 0;
    glGetIntegerv(GL_FRAMEBUFFER_BINDING, &bound);
    EXPECT_EQ(GLint(framebuffer), bound);
    glDeleteFramebuffers(1, &framebuffer);
}

TEST_F(HeadlessTest, contextsAreSeparate)
{
    clearRegion(0, 0, 64, 64, 1.0f, 0.0f, 0.0f);
    const auto other = makeContext(16, 8);
    EXPECT_FALSE(context().isCurrent());
    EXPECT_TRUE(context().readPixels().empty());
    clearRegion(0, 0, 16, 8, 0.0f, 1.0f, 0.0f);
    EXPECT_EQ(size_t(16 * 8 * 4), other->readPixels().size());
    ASSERT_TRUE(context().makeCurrent());
    EXPECT_EQ((Rgba{255, 0, 0, 255}), support::readFrame().average());
}

TEST_F(HeadlessTest, givesTheBitsAskedFor)
{
    headless::Options options;
    options.depthBits = 0;
    options.stencilBits = 0;
    options.samples = 1000; // more than any driver has: does without
    std::string error;
    const auto plain = headless::Context::create(options, error);
    ASSERT_TRUE(plain) << error;
    const auto bits = [](GLenum name)
    {
        GLint value = -1;
        glGetIntegerv(name, &value);
        return value;
    };
    for (const GLenum name : {GL_RED_BITS, GL_GREEN_BITS, GL_BLUE_BITS, GL_ALPHA_BITS})
        EXPECT_EQ(8, bits(name));
    EXPECT_EQ(0, bits(GL_DEPTH_BITS) + bits(GL_STENCIL_BITS));
    ASSERT_TRUE(context().makeCurrent());
    EXPECT_LE(24, bits(GL_DEPTH_BITS));
    EXPECT_LE(8, bits(GL_STENCIL_BITS));
}

// Fault caught: a picture of one sample per pixel, jagged although the driver has several.
TEST_F(HeadlessTest, mixesTheSamplesOfAPixel)
{
    headless::Options options;
    options.samples = 4;
    std::string error;
    const auto smooth = headless::Context::create(options, error);
    ASSERT_TRUE(smooth) << error;
    GLint samples = 0;
    glGetIntegerv(GL_SAMPLES, &samples);
    if (samples == 0)
        GTEST_SKIP() << "the driver has one sample per pixel only";

    const char* vertex =
        "attribute vec2 a_position; void main() { gl_Position = vec4(a_position, 0.0, 1.0); }";
    const char* fragment = "void main() { gl_FragColor = vec4(1.0); }";
    const GLuint program = glCreateProgram();
    for (const auto& [kind, source] : {std::pair(GL_VERTEX_SHADER, vertex), {GL_FRAGMENT_SHADER, fragment}})
    {
        const GLuint shader = glCreateShader(GLenum(kind));
        glShaderSource(shader, 1, &source, nullptr);
        glCompileShader(shader);
        glAttachShader(program, shader);
    }
    glLinkProgram(program);
    glUseProgram(program);
    const float corners[] = {-1.0f, -1.0f, 1.0f, -0.7f, -0.8f, 1.0f};
    glVertexAttribPointer(0, 2, GL_FLOAT, GL_FALSE, 0, corners);
    glEnableVertexAttribArray(0);
    glClear(GL_COLOR_BUFFER_BIT);
    glDrawArrays(GL_TRIANGLES, 0, 3);

    const Picture frame = {64, 64, smooth->readPixels()};
    int mixed = 0;
    for (int i = 0; i < 64 * 64; ++i)
    {
        const int level = frame.pixel(i % 64, i / 64).r;
        mixed += level > 20 && level < 235;
    }
    EXPECT_LT(64, mixed) << "the slanted edge crosses all columns";
    EXPECT_EQ(255, frame.pixel(5, 40).r);
    EXPECT_EQ(0, frame.pixel(60, 5).r);
}

// Fault caught: a failure without a reason, or one that takes the current context away.
TEST_F(HeadlessTest, failureNamesTheReasonAndChangesNothing)
{
    const std::pair<headless::Options, const char*> cases[] = {
        {{0, 64, 24, 8, 0}, "0 x 64"}, {{64, -1, 24, 8, 0}, "64 x -1"}, {{64, 64, 999, 8, 0}, "depth 999"}};
    for (const auto& [options, reason] : cases)
    {
        std::string error;
        EXPECT_FALSE(headless::Context::create(options, error));
        EXPECT_NE(std::string::npos, error.find(reason)) << error;
    }
    EXPECT_TRUE(context().isCurrent());
}

// Fault caught: a PNG with its rows or channels turned round, or half a file left where a write failed.
TEST(Png, isWrittenWholeOrNotAtAll)
{
    support::TempDir directory;
    Picture picture = Picture::filled(3, 2, {10, 20, 30, 255});
    picture.setPixel(2, 0, {200, 100, 50, 128});
    std::string error;
    ASSERT_TRUE(headless::writePng(directory.path("a.png"), 3, 2, picture.rgba.data(), error)) << error;

    const Picture read = support::readPng(directory.path("a.png"));
    EXPECT_TRUE(support::comparePictures("png", picture, read, {.perChannel = 0}));

    directory.write("taken/file", "a directory in the way");
    for (const std::string& path : {directory.path("missing/a.png"), directory.path("taken")})
    {
        EXPECT_FALSE(headless::writePng(path, 3, 2, picture.rgba.data(), error));
        EXPECT_EQ(0u, error.find(path + ": ")) << error;
    }
    EXPECT_EQ((std::vector<std::string>{"a.png", "taken"}), directory.list());
}
