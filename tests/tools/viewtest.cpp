#include "render/glotest.h"
#include "support/picture.h"
#include "support/tempdir.h"

#include <algorithm>
#include <cstdio>

#include <sys/wait.h>

using support::Picture;
using support::Rgba;

namespace
{

struct Outcome
{
    int exitCode;
    std::string output; // of both streams
};

/// Runs orv-view in a folder of its own that holds a few scenes.
class ViewTest : public testing::Test
{
protected:
    void SetUp() override
    {
        std::vector<uint8_t> file = write(makeScene());
        m_folder.write("scene.glo", file);
        file.resize(file.size() / 2);
        m_folder.write("damaged.glo", file);
    }

    Outcome view(const std::string& arguments) const
    {
        const std::string command = "cd '" + m_folder.path() + "' && " ORV_VIEW " " + arguments + " 2>&1";
        std::FILE* pipe = popen(command.c_str(), "r");
        std::string output;
        char buffer[1024];
        for (size_t got; (got = fread(buffer, 1, sizeof buffer, pipe)) > 0;)
            output.append(buffer, got);
        return {WEXITSTATUS(pclose(pipe)), output};
    }

    Picture picture(const std::string& name) const { return support::readPng(m_folder.path(name)); }

    static std::vector<uint8_t> write(const glo::GloScene& scene)
    {
        std::vector<uint8_t> file;
        std::string error;
        EXPECT_TRUE(glo::writeGlo(scene, file, error)) << error;
        return file;
    }

    /// A red square that jumps from the left to the right after half of its 2 seconds, and a camera that looks
    /// at where it lands. No light.
    static glo::GloScene makeScene()
    {
        glo::GloScene scene;
        scene.geometries = {makeSquareGeometry("square")};
        scene.materials = {makeMaterial("red", orv::Vector4f(1, 0, 0, 1))};
        glo::CameraDefinition lens;
        lens.name = "lens";
        scene.cameras.push_back(lens);

        glo::NodeData square = makeNode("square node");
        square.geometry = glo::GeometryReference{"square", {"red"}};
        glo::NodeData eye = makeNode("eye");
        eye.camera = glo::CameraReference{"lens"};
        moveTo(eye, orv::Vector3f(3.0f, 0.0f, 2.0f));
        glo::NodeData top = makeNode("top");
        top.children = {square, eye};
        scene.scene = glo::SceneData{"scene", top};

        glo::Channel move;
        move.targetType = "node";
        move.targetName = "node-square node";
        move.property = "translation";
        glo::addKey(move, 0.0f, {-3, 0, 0});
        glo::addKey(move, 1.0f, {3, 0, 0});
        glo::addKey(move, 2.0f, {3, 0, 0});
        glo::AnimationData animation;
        animation.name = "jump";
        animation.channels = {move};
        scene.animations.push_back(animation);
        return scene;
    }

    support::TempDir m_folder;
};

bool isRed(const Rgba& colour)
{
    return colour.r > 150 && colour.g < 60 && colour.b < 60 && colour.a == 255;
}

bool isBackground(const Rgba& colour)
{
    return isNear(colour, {214, 219, 227, 255}, 2);
}

} // namespace

// Fault caught: a failure that exits with 0, says nothing of use, or leaves a file behind.
TEST_F(ViewTest, failuresSayWhyAndWriteNothing)
{
    struct Case
    {
        const char* arguments;
        int exitCode;
        const char* message;
    };
    const Case cases[] = {
        {"--help", 0, "--frames"},
        {"", 2, "scene"},
        {"scene.glo", 2, "--out"},
        {"scene.glo --out a.jpg", 2, "only PNG"},
        {"scene.glo --out a.png --size 0x9", 2, "0x9"},
        {"scene.glo --out a.png --size 10", 2, "WIDTHxHEIGHT"},
        {"scene.glo --out a.png --size 10x10x10", 2, "10x10x10"},
        {"scene.glo --out a.png --size 99999x10", 2, "99999x10"},
        {"scene.glo --out a.png --frames 0", 2, "--frames"},
        {"scene.glo --out a.png --frames 2 --time 1", 2, "--time"},
        {"scene.glo --out a.png --time nan", 2, "--time"},
        {"missing.glo --out a.png", 1, "missing.glo: No such file"},
        {". --out a.png", 1, ".: not a file"},
        {"damaged.glo --out a.png", 1, "orv-view: damaged.glo: "},
        {"scene.glo --out missing/a.png", 1, "missing/a.png: "},
        {"scene.glo --out a.png --camera nobody", 1, "no camera \"nobody\"; there are \"eye\""},
    };
    for (const Case& c : cases)
    {
        const Outcome outcome = view(c.arguments);
        EXPECT_EQ(c.exitCode, outcome.exitCode) << c.arguments << "\n" << outcome.output;
        EXPECT_NE(std::string::npos, outcome.output.find(c.message)) << c.arguments << "\n" << outcome.output;
    }
    EXPECT_EQ((std::vector<std::string>{"damaged.glo", "scene.glo"}), m_folder.list());
}

// Fault caught: a scene without a camera and a light that comes out black, cut off or out of sight.
TEST_F(ViewTest, showsTheWholeScene)
{
    const Outcome outcome = view("scene.glo --out a.png --size 160x120 --stats");
    ASSERT_EQ(0, outcome.exitCode) << outcome.output;
    const Picture frame = picture("a.png");
    ASSERT_EQ(160, frame.width);
    ASSERT_EQ(120, frame.height);
    EXPECT_TRUE(isRed(frame.pixel(80, 60))) << frame.pixel(80, 60);
    for (int i = 0; i < 120; ++i)
        EXPECT_TRUE(isBackground(frame.pixel(0, i)) && isBackground(frame.pixel(159, i))) << "row " << i;
    EXPECT_NE(std::string::npos, outcome.output.find("solids     1\n")) << outcome.output;
    EXPECT_NE(std::string::npos, outcome.output.find("draws      1\n")) << outcome.output;
    EXPECT_NE(std::string::npos, outcome.output.find("triangles  2\n")) << outcome.output;
}

// Fault caught: a view that fits the bounding sphere about a mesh's origin, with the mesh small in a corner.
TEST_F(ViewTest, fillsTheViewWithWhatIsFarFromItsOrigin)
{
    glo::GloScene scene = makeScene();
    scene.geometries[0].vertices =
        glo::makeVertexSet({{"a_position", 3, {9, 0, 0, 10, 0, 0, 10, 1, 0, 9, 1, 0}},
                            {"a_normal", 3, {0, 0, 1, 0, 0, 1, 0, 0, 1, 0, 0, 1}}});
    m_folder.write("far.glo", write(scene));
    for (const char* size : {"120x80", "80x120"})
    {
        const Outcome outcome = view(std::string("far.glo --out a.png --size ") + size);
        ASSERT_EQ(0, outcome.exitCode) << outcome.output;
        const Picture frame = picture("a.png");
        int columns[2] = {frame.width, -1}; // first and last with something in it
        int rows[2] = {frame.height, -1};
        for (int i = 0; i < frame.width * frame.height; ++i)
        {
            if (isBackground(frame.pixel(i % frame.width, i / frame.width)))
                continue;
            columns[0] = std::min(columns[0], i % frame.width);
            columns[1] = std::max(columns[1], i % frame.width);
            rows[0] = std::min(rows[0], i / frame.width);
            rows[1] = i / frame.width;
        }
        EXPECT_NEAR(frame.width, columns[0] + columns[1] + 1, 6) << size;
        EXPECT_NEAR(frame.height, rows[0] + rows[1] + 1, 6) << size;
        const double filled = std::max(double(columns[1] - columns[0] + 1) / frame.width,
                                       double(rows[1] - rows[0] + 1) / frame.height);
        EXPECT_NEAR(0.9, filled, 0.05) << size;
    }
}

TEST_F(ViewTest, looksThroughACameraOfTheFileAtAMoment)
{
    ASSERT_EQ(0, view("scene.glo --out early.png --size 64x64 --camera eye --time 0.5").exitCode);
    ASSERT_EQ(0, view("scene.glo --out late.png --size 64x64 --camera lens --time 1").exitCode);
    EXPECT_TRUE(isBackground(picture("early.png").pixel(32, 32)));
    EXPECT_TRUE(isRed(picture("late.png").pixel(32, 32)));
}

// Fault caught: pictures that all show the same moment, or a view that jumps along with what moves.
TEST_F(ViewTest, numbersThePicturesOfAnAnimation)
{
    const Outcome outcome = view("scene.glo --out a.png --size 80x60 --frames 4");
    ASSERT_EQ(0, outcome.exitCode) << outcome.output;
    EXPECT_EQ(std::string::npos, outcome.output.find("picture")) << "progress is for terminals";
    EXPECT_EQ((std::vector<std::string>{"a-000.png", "a-001.png", "a-002.png", "a-003.png", "damaged.glo",
                                        "scene.glo"}),
              m_folder.list());
    const Picture first = picture("a-000.png");
    const Picture last = picture("a-003.png");
    EXPECT_TRUE(support::comparePictures("view-early", first, picture("a-001.png")));
    EXPECT_TRUE(support::comparePictures("view-late", last, picture("a-002.png")));
    const auto redShare = [](const Picture& frame, int x)
    {
        int count = 0;
        for (int i = 0; i < 40 * 60; ++i)
            count += isRed(frame.pixel(x + i % 40, i / 40));
        return count;
    };
    EXPECT_LT(10, redShare(first, 0));
    EXPECT_EQ(0, redShare(first, 40));
    EXPECT_EQ(0, redShare(last, 0));
    EXPECT_LT(10, redShare(last, 40));
}
