#include "stage/orbit.h"
#include "stage/player.h"
#include "support/tempdir.h"
#include "view/companions.h"
#include "view/compare.h"
#include "view/fontsearch.h"
#include "view/keys.h"
#include "view/watcher.h"
#include "window/window.h"

#include "orv/animation.h"
#include "orv/appearance.h"
#include "orv/mesh.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <fstream>
#include <iterator>

using orv::makeShared;
using orv::Vector3f;

namespace
{

void expectNear(const Vector3f& expected, const Vector3f& actual, const char* name)
{
    EXPECT_LT(length(expected - actual), 1e-4f)
        << name << ": " << actual.x << ' ' << actual.y << ' ' << actual.z;
}

/// Remembers when it was last applied.
class FakeAnimation : public orv::Animation
{
public:
    void apply(float progress) override { m_applied = progress; }
    float getStart() const override { return 0.0f; }
    float getEnd() const override { return m_end; }
    float m_applied = -1.0f;
    float m_end = 10.0f;
};

} // namespace

// Fault caught: an axis the wrong way round, an eye that tips over the pole, a drag that slides away from the hand.
class ViewOrbit : public ::testing::Test
{
protected:
    ViewOrbit() { m_orbit.distance = 10.0f; }

    void expectAt(const Vector3f& eye, const Vector3f& middle)
    {
        expectNear(eye, m_orbit.getEye(), "eye");
        expectNear(middle, m_orbit.middle, "middle");
        orv::Camera camera;
        m_orbit.apply(camera);
        expectNear(m_orbit.getEye(), camera.getWorldTransform()[3].xyz(), "the camera's eye");
        expectNear(m_orbit.getDirection(), camera.getWorldTransform()[2].xyz(), "the camera's direction");
        EXPECT_LT(0.0f, camera.getNear());
    }

    view::Orbit m_orbit;
};

TEST_F(ViewOrbit, isTurnedByDragging)
{
    expectAt({0, 0, 10}, {0, 0, 0});
    m_orbit.turn(180, 0); // to the right: the left side comes to the front
    expectAt({-10, 0, 0}, {0, 0, 0});
    m_orbit.turn(-180, 90); // down: seen from above
    expectAt({0, 7.0710678f, 7.0710678f}, {0, 0, 0});
    m_orbit.turn(0, 9999); // not over the pole
    expectAt({0, 10, 0.01f}, {0, 0, 0});
}

TEST_F(ViewOrbit, isMovedByTheHeightOfTheView)
{
    const float halfView = std::tan(orv::Anglef::fromDegrees(20.0f).radians()) * 10.0f;
    m_orbit.pan(50, 0, 100);
    expectAt({-halfView, 0, 10}, {-halfView, 0, 0});
    m_orbit.pan(-50, 50, 100);
    expectAt({0, halfView, 10}, {0, halfView, 0});
}

TEST_F(ViewOrbit, comesNearerAndNotThrough)
{
    m_orbit.zoom(2);
    expectAt({0, 0, 8.1f}, {0, 0, 0});
    m_orbit.zoom(1e6f);
    expectAt({0, 0, 1e-6f}, {0, 0, 0});
}

TEST_F(ViewOrbit, goesOnFromACamera)
{
    orv::Camera camera;
    camera.setPosition(Vector3f(7, 0, 0));
    camera.setRotation(quaternionFromAxisAngle(Vector3f(0, 1, 0), orv::Anglef::fromDegrees(90)));
    m_orbit.continueFrom(camera);
    expectAt({7, 0, 0}, {0, 0, 0});
}

// Fault caught: a ray that is upside down, or wrong in views that are not square or not in perspective.
TEST_F(ViewOrbit, castsRaysThroughPixels)
{
    orv::Camera camera;
    camera.setPosition(Vector3f(0, 0, 5));
    camera.setFieldOfView(orv::Anglef::fromDegrees(90.0f));
    expectNear({0, 0, -1}, view::castThrough(camera, 100, 50, 200, 100).direction, "middle");
    expectNear(normalize(Vector3f(-2, 1, -1)), view::castThrough(camera, 0, 0, 200, 100).direction,
               "upper left");
    camera.setProjectionType(orv::Camera::ProjectionType::ORTHOGRAPHIC);
    camera.setWidth(8.0f);
    const orv::Ray ray = view::castThrough(camera, 200, 100, 200, 100);
    expectNear({0, 0, -1}, ray.direction, "orthographic");
    expectNear({4, -2, 5 - camera.getNear()}, ray.position, "orthographic, lower right");
}

// Fault caught: a clip that plays into the next one, a step that leaves the loop, a player that cannot be restarted.
class ViewPlayer : public ::testing::Test
{
protected:
    /// After each: what is seen is what the player says.
    void expectAt(float seconds, bool isMoving)
    {
        EXPECT_NEAR(seconds, m_player.getTime(), 1e-4);
        EXPECT_EQ(m_player.getTime(), m_animation->m_applied);
        EXPECT_EQ(isMoving, m_player.isMoving());
    }

    orv::SharedPtr<FakeAnimation> m_animation = makeShared<FakeAnimation>();
    view::Player m_player{m_animation, {{"all", 0, 10}, {"run", 4, 6}, {"pose", 7, 7}}};
};

TEST_F(ViewPlayer, playsRoundAndRound)
{
    expectAt(0.0f, true);
    m_player.update(0.5f);
    expectAt(0.5f, true);
    m_player.update(10.0f);
    expectAt(0.5f, true);
    m_player.scaleSpeed(2.0f);
    m_player.update(0.5f);
    expectAt(1.5f, true);
}

TEST_F(ViewPlayer, stopsAtTheEndOfOneRound)
{
    m_player.setLooping(false);
    m_player.update(11.0f);
    expectAt(10.0f, false);
    m_player.togglePaused(); // from the start
    expectAt(0.0f, true);
}

TEST_F(ViewPlayer, pausesAndGoesOn)
{
    m_player.togglePaused();
    m_player.update(1.0f);
    expectAt(0.0f, false);
    m_player.togglePaused();
    m_player.update(1.0f);
    expectAt(1.0f, true);
}

TEST_F(ViewPlayer, stepsByFrames)
{
    m_player.step(1);
    m_player.update(1.0f);
    expectAt(1.0f / 30.0f, false);
    m_player.step(-2);
    expectAt(10.0f - 1.0f / 30.0f, false);
}

TEST_F(ViewPlayer, doesNotStepBackBeforeTheStartOfOneRound)
{
    m_player.setLooping(false);
    m_player.step(-1);
    expectAt(0.0f, false);
}

TEST_F(ViewPlayer, keepsToItsClip)
{
    EXPECT_TRUE(m_player.chooseClip("run"));
    expectAt(4.0f, true);
    m_player.update(2.5f);
    expectAt(4.5f, true);
    m_player.seekShare(0.5f);
    expectAt(5.0f, true);
    m_player.skip(-1.5f);
    expectAt(5.5f, true);
    EXPECT_FALSE(m_player.chooseClip("fly"));
    expectAt(5.5f, true);
}

TEST_F(ViewPlayer, goesFromClipToClip)
{
    m_player.stepClip(-1);
    EXPECT_EQ("pose", m_player.getClip().name);
    expectAt(7.0f, false);
}

// Fault caught: a share of the time line, or a JSON text, that is no number for a file with a key at an infinite time.
TEST(ViewClip, hasNoLengthIfItsTimesAreInfinite)
{
    FakeAnimation animation;
    EXPECT_EQ(10.0f, view::makeClip("walk", animation).end);
    for (const float end : {INFINITY, -INFINITY, NAN})
    {
        animation.m_end = end;
        const view::Clip clip = view::makeClip("walk", animation);
        EXPECT_EQ("walk", clip.name);
        EXPECT_EQ(0.0f, clip.end - clip.start) << end;
    }
}

// Fault caught: a comparison that passes what a person would see, or fails for what the text allows.
TEST(ViewCompare, countsWhatDiffers)
{
    struct Case
    {
        const char* tolerance;
        bool isTolerable;
        size_t pixels;
    };
    const view::PngPicture reference{2, 2, std::vector<uint8_t>(16, 100)};
    view::PngPicture actual = reference;
    actual.rgba[9] = 110; // the third pixel's green
    actual.rgba[15] = 98; // the fourth one's alpha
    const Case cases[] = {{"0", false, 2},   {"2", false, 1},   {"9,24.9", false, 1},
                          {"9,25", true, 1}, {"0,50", true, 2}, {"10", true, 0}};
    for (const Case& c : cases)
    {
        view::Tolerance tolerance;
        ASSERT_TRUE(view::parseTolerance(c.tolerance, tolerance));
        const view::Difference difference = view::comparePictures(reference, actual, tolerance);
        EXPECT_EQ(c.isTolerable, difference.isTolerable) << c.tolerance;
        EXPECT_EQ(c.pixels, difference.pixels) << c.tolerance;
        EXPECT_EQ(10, difference.largest);
        EXPECT_EQ(0, difference.x);
        EXPECT_EQ(1, difference.y);
        EXPECT_EQ(80, difference.picture.rgba[9]);
    }
    view::Tolerance tolerance;
    for (const char* text : {"", "x", "-1", "256", "1,", "1,x", "1,101", "1,2,3", "nan"})
        EXPECT_FALSE(view::parseTolerance(text, tolerance)) << text;
}

// Fault caught: an edit that is missed, taken half, or taken again and again.
TEST(ViewWatcher, tellsOfEachEditOnceItIsOver)
{
    support::TempDir folder;
    const std::string path = folder.write("a.txt", "one");
    view::Watcher watcher;
    watcher.watch({path, folder.path("later.txt")});
    EXPECT_FALSE(watcher.hasChanged());
    folder.write("a.txt", "two, still being written");
    EXPECT_FALSE(watcher.hasChanged());
    folder.write("a.txt", "two");
    EXPECT_FALSE(watcher.hasChanged());
    EXPECT_TRUE(watcher.hasChanged());
    EXPECT_FALSE(watcher.hasChanged());

    folder.write("later.txt", "made while the files were loaded again");
    watcher.watch({path, folder.path("later.txt")});
    EXPECT_FALSE(watcher.hasChanged());
    EXPECT_TRUE(watcher.hasChanged());
}

// Fault caught: a picture of a model that can be edited without the model being converted again.
TEST(ViewCompanions, followNamesFromFileToFile)
{
    support::TempDir folder;
    const std::string model = folder.write("house.obj", "mtllib house.mtl\n");
    folder.write("house.mtl", "map_Kd pictures\\bricks.png\n");
    folder.write("pictures/bricks.png", "garden.jpg");
    folder.write("garden.jpg", "");
    folder.write("street.mtl", "");
    const std::set<std::string> expected = {model, folder.path("house.mtl"),
                                            folder.path("pictures/bricks.png"), folder.path("garden.jpg")};
    EXPECT_EQ(expected, view::findCompanions(model));
}

TEST(ViewFonts, takeTheBestKnownOne)
{
    support::TempDir folder;
    EXPECT_EQ("", view::findFont({folder.path(), folder.path("missing")}));
    folder.write("b/FreeSans.ttf", "");
    folder.write("b/Unheard.ttf", "");
    const std::string best = folder.write("a/c/LiberationSans-Regular.ttf", "");
    EXPECT_EQ(best, view::findFont({folder.path("missing"), folder.path()}));
}

// Faults caught: a key that the page or the window tells about and that does nothing, or that neither tells about.
TEST(ViewKeys, thePageListsWhatTheWindowShows)
{
    std::ifstream file(ORV_SOURCE_FOLDER "/docs/view.md");
    std::string page((std::istreambuf_iterator<char>(file)), {});
    page.erase(std::remove(page.begin(), page.end(), '`'), page.end());
    for (const view::HeadsUp::Row& row : view::listKeys())
        EXPECT_NE(std::string::npos, page.find("| " + row.left + " | " + row.right + " |")) << row.left;

    EXPECT_EQ(view::Command::GO_TO_TENTH, view::findCommand('7'));
    EXPECT_EQ(view::Command::QUIT, view::findCommand(window::key::ESCAPE));
    EXPECT_EQ(view::Command::NONE, view::findCommand('x'));
}
