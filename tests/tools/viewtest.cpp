#include "viewtest.h"

#include <algorithm>
#include <cstdio>

#include <sys/wait.h>

using support::Picture;

namespace
{

struct Outcome
{
    int exitCode;
    std::string output; // of both streams
};

/// Runs orv-view without a window.
class ViewPictureTest : public ViewTest
{
protected:
    Outcome view(const std::string& arguments) const
    {
        const std::string command = "cd '" + m_folder.path() +
                                    "' && env -u DISPLAY -u WAYLAND_DISPLAY TMPDIR='" + m_temporary.path() +
                                    "' " ORV_VIEW " " + arguments + " 2>&1";
        std::FILE* pipe = popen(command.c_str(), "r");
        std::string output;
        char buffer[1024];
        for (size_t got; (got = fread(buffer, 1, sizeof buffer, pipe)) > 0;)
            output.append(buffer, got);
        return {WEXITSTATUS(pclose(pipe)), output};
    }

    support::TempDir m_temporary;
};

} // namespace

// Fault caught: a failure that exits with 0, says nothing of use, or leaves a file behind.
TEST_F(ViewPictureTest, failuresSayWhyAndWriteNothing)
{
    struct Case
    {
        const char* arguments;
        int exitCode;
        const char* message;
    };
    const Case cases[] = {
        {"--help", 0, "orv-view duck.glo --out duck.png"},
        {"", 2, "scene"},
        {"scene.glo", 1, "no window: there is no screen; with --out"},
        {"scene.glo --stats", 2, "--out"},
        {"scene.glo --out a.jpg", 2, "only PNG"},
        {"scene.glo --out a.png --size 0x9", 2, "0x9"},
        {"scene.glo --out a.png --size 10", 2, "WIDTHxHEIGHT"},
        {"scene.glo --out a.png --size 10x10x10", 2, "10x10x10"},
        {"scene.glo --out a.png --size 99999x10", 2, "99999x10"},
        {"scene.glo --out a.png --frames 0", 2, "--frames"},
        {"scene.glo --out a.png --frames 2 --time 1", 2, "--time"},
        {"scene.glo --out a.png --time nan", 2, "--time"},
        {"scene.glo --out a.png --turntable 5 --sheet 2x2", 2, "no room for 5"},
        {"scene.glo --out a.png --sheet 100x1 --size 800x600", 2, "16384"},
        {"scene.glo --out a.png --tolerance 3", 2, "--compare"},
        {"scene.glo --out a.png --compare b.png --tolerance many", 2, "many"},
        {"scene.glo --out a.png --background pink", 2, "pink"},
        {"scene.glo --out a.png --show axes,shoes", 2, "\"shoes\" is none of bounds, skeletons"},
        {"scene.glo --out a.png --material paint", 2, "paint"},
        {"scene.glo --out a.png --material paint=none.ap", 1, "none.ap: No such file"},
        {"scene.glo --out a.png --material tar=scene.glo", 1, "no material \"tar\"; there are \"paint\""},
        {"missing.glo --out a.png", 1, "missing.glo: No such file"},
        {". --out a.png", 1, ".: not a file"},
        {"damaged.glo --out a.png", 1, "orv-view: damaged.glo: "},
        {"scene.glo --out missing/a.png", 1, "missing/a.png: "},
        {"scene.glo --out a.png --camera nobody", 1, "no camera \"nobody\"; there are \"eye\""},
        {"scene.glo --out a.png --clip fly", 1, "no clip \"fly\"; there are \"jump\", \"rest\""},
        {"scene.glo --out a.png -- --up z", 1, "is not converted, so \"--up\""},
        {"garbage.dae --out a.png", 1, "garbage.dae: cannot be converted"},
    };
    m_folder.write("garbage.dae", "garbage");
    for (const Case& c : cases)
    {
        const Outcome outcome = view(c.arguments);
        EXPECT_EQ(c.exitCode, outcome.exitCode) << c.arguments << "\n" << outcome.output;
        EXPECT_NE(std::string::npos, outcome.output.find(c.message)) << c.arguments << "\n" << outcome.output;
    }
    EXPECT_EQ((std::vector<std::string>{"damaged.glo", "garbage.dae", "scene.glo"}), m_folder.list());
    EXPECT_TRUE(m_temporary.list().empty());
}

// Fault caught: a scene without a camera and a light that comes out black, cut off or out of sight.
TEST_F(ViewPictureTest, showsTheWholeScene)
{
    const Outcome outcome = view("scene.glo --out a.png --size 160x120 --stats");
    ASSERT_EQ(0, outcome.exitCode) << outcome.output;
    const Picture frame = picture("a.png");
    ASSERT_EQ(160, frame.width);
    ASSERT_EQ(120, frame.height);
    EXPECT_TRUE(isRed(frame.pixel(80, 60))) << frame.pixel(80, 60);
    for (int i = 0; i < 120; ++i)
        EXPECT_TRUE(isBackground(frame.pixel(0, i)) && isBackground(frame.pixel(159, i))) << "row " << i;
    for (const char* line : {"solids     1\n", "draws      1\n", "triangles  2\n"})
        EXPECT_NE(std::string::npos, outcome.output.find(line)) << outcome.output;
}

// Fault caught: a view that fits the bounding sphere about a mesh's origin, with the mesh small in a corner.
TEST_F(ViewPictureTest, fillsTheViewWithWhatIsFarFromItsOrigin)
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

TEST_F(ViewPictureTest, looksThroughACameraOfTheFileAtAMoment)
{
    ASSERT_EQ(0, view("scene.glo --out early.png --size 64x64 --camera eye --time 0.5").exitCode);
    ASSERT_EQ(0, view("scene.glo --out late.png --size 64x64 --camera lens --time 1").exitCode);
    ASSERT_EQ(0, view("scene.glo --out clip.png --size 64x64 --camera eye --clip rest").exitCode);
    ASSERT_EQ(0, view("scene.glo --out dark.png --size 64x64 --camera eye --background '#204'").exitCode);
    EXPECT_TRUE(isBackground(picture("early.png").pixel(32, 32)));
    EXPECT_TRUE(isRed(picture("late.png").pixel(32, 32)));
    EXPECT_TRUE(isRed(picture("clip.png").pixel(32, 32)));
    EXPECT_TRUE(isNear(picture("dark.png").pixel(32, 32), {0x22, 0, 0x44, 255}, 1));
}

// Fault caught: pictures that all show the same moment, or a view that jumps along with what moves.
TEST_F(ViewPictureTest, numbersThePicturesOfAnAnimation)
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
    EXPECT_LT(10, countRed(first, 0, 40));
    EXPECT_EQ(0, countRed(first, 40, 80));
    EXPECT_EQ(0, countRed(last, 0, 40));
    EXPECT_LT(10, countRed(last, 40, 80));
}

// Fault caught: pictures in the wrong places of a sheet, and a turntable that shows the same side twice.
TEST_F(ViewPictureTest, laysPicturesOutOnASheet)
{
    ASSERT_EQ(0, view("scene.glo --out a.png --size 80x60 --sheet 1x2").exitCode);
    const Picture moments = picture("a.png");
    ASSERT_EQ(80, moments.width);
    ASSERT_EQ(120, moments.height);
    EXPECT_TRUE(isBackground(moments.pixel(79, 30)));
    EXPECT_LT(5, countRed(moments, 0, 40));
    EXPECT_LT(5, countRed(moments, 40, 80));

    ASSERT_EQ(
        0, view("scene.glo --out b.png --size 60x60 --sheet 3x1 --turntable 2 --background white").exitCode);
    const Picture turns = picture("b.png");
    EXPECT_LT(100, countRed(turns, 0, 60));
    EXPECT_EQ(0, countRed(turns, 60, 120)) << "its back";
    EXPECT_EQ((support::Rgba{255, 255, 255, 255}), turns.pixel(150, 30)) << "the place that is left";
    ASSERT_EQ(0, view("scene.glo --out c.png --size 60x60 --turntable 2").exitCode);
    EXPECT_LT(100, countRed(picture("c-000.png"), 0, 60));
    EXPECT_EQ(0, countRed(picture("c-001.png"), 0, 60));
}

// Fault caught: a regression that passes, or one that fails without a picture to look at.
TEST_F(ViewPictureTest, comparesWithAReference)
{
    const std::string common = " --size 80x60 --camera eye --time 1 --compare good.png";
    ASSERT_EQ(0, view("scene.glo --out good.png --size 80x60 --camera eye --time 1").exitCode);
    Outcome outcome = view("scene.glo --out a.png" + common);
    EXPECT_EQ(0, outcome.exitCode) << outcome.output;
    EXPECT_NE(std::string::npos, outcome.output.find("same: 0 of 4800 pixels")) << outcome.output;

    m_folder.write("green.glo", write(makeScene(orv::Vector4f(0, 1, 0, 1))));
    outcome = view("green.glo --out b.png" + common + " --tolerance 8,1");
    EXPECT_EQ(1, outcome.exitCode) << outcome.output;
    EXPECT_NE(std::string::npos, outcome.output.find("different: ")) << outcome.output;
    const support::Rgba off = picture("b-difference.png").pixel(40, 30);
    EXPECT_TRUE(off.r == 255 && off.g == 255 && off.b == 0) << off;
    EXPECT_EQ(0, view("green.glo --out b.png" + common + " --tolerance 255").exitCode);
    outcome = view("scene.glo --out c.png --size 60x60 --compare good.png");
    EXPECT_EQ(1, outcome.exitCode);
    EXPECT_NE(std::string::npos, outcome.output.find("has 80 x 60 pixels")) << outcome.output;
}

// Fault caught: materials on their own, over a scene's, and models that are no scenes, out of sight or uncoloured.
TEST_F(ViewPictureTest, showsWhatIsNoScene)
{
    m_folder.write("red.ap",
                   "1.0\nshader_program orv#max_pvl.sp$DIFF\nproperty M_DIFFUSE_COLOUR Colour4f 1 0 0 1\n");
    m_folder.write("green.glo", write(makeScene(orv::Vector4f(0, 1, 0, 1))));
    m_folder.write("model.mtl", "newmtl red\nKd 1 0 0\n");
    m_folder.write("model.obj", "mtllib model.mtl\nv 0 0 0\nv 1 0 0\nv 0 1 0\nusemtl red\nf 1 2 3\n");
    for (const char* scene :
         {"red.ap", "green.glo --material paint=red.ap", "model.obj", "model.obj -- --fps 10"})
    {
        const std::string text = scene;
        const size_t end = std::min(text.find(" -- "), text.size());
        const Outcome outcome = view(text.substr(0, end) + " --out a.png --size 90x60" + text.substr(end));
        ASSERT_EQ(0, outcome.exitCode) << scene << "\n" << outcome.output;
        EXPECT_LT(100, countRed(picture("a.png"), 0, 90)) << scene;
    }
    EXPECT_TRUE(m_temporary.list().empty()) << "what a model was converted to";
}

// Faults caught: debug views that are not drawn, in the wrong place, or in pictures without them.
TEST_F(ViewPictureTest, marksWhatIsAskedFor)
{
    const auto draw = [&](const std::string& name, const std::string& options)
    {
        EXPECT_EQ(0,
                  view("scene.glo --camera eye --time 1.5 --size 200x200 --out " + name + ".png " + options)
                      .exitCode);
        return picture(name + ".png");
    };
    const auto countNear = [](const Picture& picture, const support::Rgba& colour)
    {
        int count = 0;
        for (int y = 0; y < picture.height; ++y)
            for (int x = 0; x < picture.width; ++x)
                count += isNear(picture.pixel(x, y), colour, 60);
        return count;
    };
    const support::Rgba orange = {242, 140, 26, 255};
    const Picture plain = draw("plain", "");
    const int square = countRed(plain, 0, 200);
    ASSERT_LT(2000, square);
    EXPECT_EQ(0, countNear(plain, orange));
    EXPECT_LT(100, countNear(draw("bounds", "--show bounds"), orange)) << "around the square, which is flat";
    EXPECT_NE(plain.rgba, draw("axes", "--show axes").rgba);
    const Picture edges = draw("edges", "--show wireframe");
    EXPECT_LT(50, countRed(edges, 0, 200));
    EXPECT_GT(square / 4, countRed(edges, 0, 200)) << "its edges and one across";
    EXPECT_TRUE(support::comparePictures("one-square", plain, draw("shadows", "--show shadows")))
        << "it throws none on itself";
    m_folder.write(
        "yard.obj",
        "v -3 0 -3\nv -3 0 3\nv 3 0 3\nv 3 0 -3\nf 1 2 3 4\nv -1 1 0\nv 1 1 0\nv 0 2 0\nf 5 6 7\n");
    for (const char* options : {"--out light.png", "--out dark.png --show shadows"})
        EXPECT_EQ(0, view(std::string("yard.obj --size 200x200 ") + options).exitCode);
    EXPECT_NE(picture("light.png").rgba, picture("dark.png").rgba);
    EXPECT_NE(edges.rgba, draw("all", "--show wireframe,axes,axes").rgba) << "a name said twice is shown";
}
