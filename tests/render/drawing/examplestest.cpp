#include "counterchecks.h"

#include "support/picture.h"
#include "support/tempdir.h"

#include "orv/log.h"
#include "orv/logsink.h"

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

struct Example
{
    const char* name;
    int (*main)(int argc, char** argv);
    const char* picture; ///< after the name that --out gave; null for none
    uint32_t draws, uniforms, programs, textures;
};

void PrintTo(const Example& example, std::ostream* stream)
{
    *stream << example.name;
}

class ExamplesTest : public testing::TestWithParam<Example>
{
protected:
    ~ExamplesTest() override { setLogLevel(LogLevel::DEBUGGING); } // as the examples did not leave it

    /// @return what the engine has sent to GL for it, start and all.
    FrameCounters run()
    {
        std::vector<std::string> words = {"example", "--out", m_out};
        std::vector<char*> arguments;
        for (std::string& word : words)
            arguments.push_back(word.data());
        const FrameCounters before = countGlCalls();
        testing::internal::CaptureStdout(); // of pictures
        EXPECT_EQ(0, GetParam().main(int(arguments.size()), arguments.data()));
        testing::internal::GetCapturedStdout();
        return countGlCalls() - before;
    }

    const support::TempDir m_folder;
    const std::string m_out = m_folder.path() + "/out.png";
};

INSTANTIATE_TEST_SUITE_P(, ExamplesTest,
                         testing::Values(Example{"firstframe", [](int, char**) { return firstframe_main(); },
                                                 nullptr, 1, 21, 3, 8},
                                         Example{"showpiece", showpiece_main, "", 15, 144, 25, 43},
                                         Example{"motionblur", motionblur_main, "-blurred.png", 204, 476, 84,
                                                 179},
                                         Example{"textpage", textpage_main, "", 12, 33, 14, 28},
                                         Example{"pvrsheet", pvrsheet_main, "", 17, 26, 5, 39}),
                         [](const auto& given) { return given.param.name; });

} // namespace

// Faults caught: a call that is not counted, or counted as another; calls that a change of the engine adds.
TEST_P(ExamplesTest, takeTheseCalls)
{
    const glcalls::Scope gl;
    const FrameCounters counters = run();
    expectSame(counters, GetParam().name);
    EXPECT_LE(counters.getCalls(), glcalls::total());
    EXPECT_GE(counters.getCalls() + 60, glcalls::total()); // contexts and pictures
    EXPECT_EQ(GetParam().draws, counters.draws);
    EXPECT_EQ(GetParam().uniforms, counters.uniforms);
    EXPECT_EQ(GetParam().programs, counters.programs);
    EXPECT_EQ(GetParam().textures, counters.textures);
}

// Fault caught: an unintended visible change. Drivers round in ways of their own, and at edges a pixel more or less is
// drawn: over the blocks of six by six pixels that are kept, little of that is left.
TEST_P(ExamplesTest, lookAsKept)
{
    if (!GetParam().picture)
        return;
    run();
    const support::Picture picture = support::readPng(m_out + GetParam().picture);
    EXPECT_TRUE(support::compareWithKept(ORV_TEST_FOLDER "/pictures/" + std::string(GetParam().name) + ".png",
                                         support::shrink(picture, 6), {6, 0.005}));
}
