#include "scenetest.h"

#include "orv/framecounters.h"
#include "orv/log.h"
#include "orv/logsink.h"

#include "support/tempdir.h"

#include <GLES2/gl2.h>

#include <string>
#include <vector>

using namespace orv;

// The examples' main(), one function each.
int firstframe_main();
int showpiece_main(int argc, char** argv);
int motionblur_main(int argc, char** argv);
int textpage_main(int argc, char** argv);
int pvrsheet_main(int argc, char** argv);

namespace
{

uint64_t count(const std::vector<const char*>& names)
{
    uint64_t sum = 0;
    for (const char* name : names)
        sum += glcalls::count(name);
    return sum;
}

uint64_t countUniforms()
{
    return count({"glUniform1fv", "glUniform2fv", "glUniform3fv", "glUniform4fv", "glUniform1iv",
                  "glUniform2iv", "glUniform3iv", "glUniform4iv", "glUniformMatrix2fv", "glUniformMatrix3fv",
                  "glUniformMatrix4fv"});
}

/// All but what a program does itself, to have a context and to read its picture.
void expectSame(const FrameCounters& counters, const char* what)
{
    EXPECT_EQ(count({"glDrawElements", "glDrawArrays"}), counters.draws) << what;
    EXPECT_EQ(countUniforms(), counters.uniforms) << what;
    EXPECT_EQ(count({"glUseProgram"}), counters.programs) << what;
    EXPECT_EQ(count({"glBindBuffer"}), counters.buffers) << what;
    EXPECT_EQ(count({"glVertexAttribPointer", "glVertexAttrib4fv", "glEnableVertexAttribArray",
                     "glDisableVertexAttribArray"}),
              counters.attributes)
        << what;
    EXPECT_EQ(count({"glBufferData", "glTexImage2D", "glCompressedTexImage2D"}), counters.uploads) << what;
}

} // namespace

// Fault caught: a call that is not counted, or counted as another.
TEST(FrameCountersTest, examplesTakeWhatGlHears)
{
    const support::TempDir folder;
    const std::string out = folder.path() + "/out";
    std::vector<std::string> words = {"example", "--out", out + ".png"};
    std::vector<char*> arguments;
    for (std::string& word : words)
        arguments.push_back(word.data());
    struct Case
    {
        const char* name;
        int (*main)(int argc, char** argv);
    };
    const Case cases[] = {{"firstframe", [](int, char**) { return firstframe_main(); }},
                          {"showpiece", showpiece_main},
                          {"motionblur", motionblur_main},
                          {"textpage", textpage_main},
                          {"pvrsheet", pvrsheet_main}};
    for (const Case& c : cases)
    {
        const glcalls::Scope gl;
        const FrameCounters before = countGlCalls();
        ::testing::internal::CaptureStdout(); // of pictures
        EXPECT_EQ(0, c.main(int(arguments.size()), arguments.data())) << c.name;
        ::testing::internal::GetCapturedStdout();
        const FrameCounters counters = countGlCalls() - before;
        expectSame(counters, c.name);
        EXPECT_LT(0u, counters.draws) << c.name;
        EXPECT_LE(counters.getCalls(), glcalls::total()) << c.name;
        EXPECT_GE(counters.getCalls() + 60, glcalls::total()) << c.name; // contexts and pictures
    }
    setLogLevel(LogLevel::DEBUGGING); // as the examples did not leave it
}

using RendererCountersTest = SceneTest;

// Faults caught: calls beside the frame's; triangles, bytes and left out solids that are others.
TEST_F(RendererCountersTest, aFrameTakesWhatGlHears)
{
    const auto near = addSquare(Vector3f(0, 0, 0), 1.0f, makePaint(Colour4f::RED));
    addSquare(Vector3f(0, 0, 100), 1.0f, makePaint(Colour4f::RED));
    const auto cube = createCube(*pool, Vector2f(1, 1));
    cube->setParent(scene);
    render();
    EXPECT_EQ(0u, renderer->getCounters().getCalls());
    renderer->setCounted(true);
    const auto check = [&](uint32_t draws, uint32_t triangles, uint32_t culled)
    {
        const glcalls::Scope gl;
        render();
        const FrameCounters counters = renderer->getCounters();
        expectSame(counters, "frame");
        EXPECT_EQ(glcalls::total(), counters.getCalls());
        EXPECT_EQ(count({"glBindTexture"}), counters.textures);
        EXPECT_EQ(count({"glBindFramebuffer"}), counters.targets);
        EXPECT_EQ(draws, counters.draws);
        EXPECT_EQ(triangles, counters.triangles);
        EXPECT_EQ(culled, counters.culled);
        EXPECT_EQ(0u, counters.uploadBytes);
    };
    check(3, 16, 0);
    renderer->setCulled(true);
    for (int i = 0; i < 3; ++i)
        check(2, 14, 1);
    camera->setStereo(10.0f, 0.1f);
    check(4, 28, 2);
    camera->setStereo(10.0f, 0.0f);
    near->setPosition(Vector3f(0, 0, 50));
    cube->setPosition(Vector3f(0, 0, 50));
    for (int i = 0; i < 3; ++i) // one by one, and then the whole
        check(0, 0, 3);

    const FrameCounters before = countGlCalls();
    const unsigned char pixels[6 * 2 * 4] = {};
    pool->getTexture2DCache()->create(6, 2, Texture::Format::RGBA, Texture::Type::UNSIGNED_BYTE, pixels,
                                      nullptr);
    EXPECT_EQ(6u * 2 * 4, (countGlCalls() - before).uploadBytes);
    const FrameCounters between = countGlCalls();
    createSquare(*pool, Vector2f(1, 1));
    EXPECT_EQ(4u * 8 * 4 + 6 * 2, (countGlCalls() - between).uploadBytes);
}
