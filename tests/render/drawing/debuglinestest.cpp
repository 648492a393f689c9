#include "scenetest.h"

#include "orv/debuglines.h"

#include "support/allocation.h"

using namespace orv;
using support::Picture;

namespace
{

class DebugLinesTest : public SceneTest
{
protected:
    void SetUp() override
    {
        SceneTest::SetUp();
        lines = makeShared<DebugLines>(*pool);
    }

    void TearDown() override
    {
        lines = nullptr;
        SceneTest::TearDown();
    }

    Picture drawLines()
    {
        renderFrame();
        lines->draw(*renderContext, *camera);
        return support::readFrame();
    }

    static int countPixels(const Picture& picture, const support::Rgba& colour)
    {
        int count = 0;
        for (int y = 0; y < picture.height; ++y)
            for (int x = 0; x < picture.width; ++x)
                count += support::isNear(picture.pixel(x, y), colour, 2) ? 1 : 0;
        return count;
    }

    /// The first and the last column of one half that has some red.
    static std::pair<int, int> findRed(const Picture& picture, int half)
    {
        std::pair<int, int> found(64, -1);
        for (int x = half * 32; x < half * 32 + 32; ++x)
            for (int y = 0; y < picture.height; ++y)
                if (picture.pixel(x, y).r > 128)
                    found = {std::min(found.first, x), x};
        return found;
    }

    DebugLines::Ptr lines;
};

} // namespace

// Faults caught: axes in the wrong colours or directions, a transform or the camera's place that does not count.
TEST_F(DebugLinesTest, linesAreWhereTheyWereAdded)
{
    camera->setProjectionType(Camera::ProjectionType::ORTHOGRAPHIC);
    camera->setWidth(64.0f); // a unit is a pixel
    camera->setPosition(Vector3f(-0.5f, -0.5f, 50.0f));
    const Matrix4f turned =
        toMatrix4(quaternionFromAxisAngle(Vector3f(0, 1, 0), Anglef::fromDegrees(-90.0f)));
    Matrix4f transform = turned; // z points to the left
    transform.columns[3] = Vector4f(10, -5, 0, 1);
    lines->addAxes(transform, 20.0f);
    lines->addLine(Vector3f(-30, 20, 0), Colour4f::RED, Vector3f(30, 20, 0), Colour4f(0, 0, 1, 1));
    lines->addLine(Vector3f(-30, 10, 0), Vector3f(30, 10, 0), Colour4f(1, 1, 1, 0.5f));
    const Picture picture = drawLines();
    const auto at = [&](int x, int y) { return picture.pixel(32 + x, 31 - y); };
    EXPECT_EQ(GREEN, at(10, 5)) << support::savePicture("axes", picture);
    EXPECT_EQ(BLUE, at(0, -5));
    EXPECT_EQ(BLACK, at(20, -5)) << "x points away";
    EXPECT_TRUE(support::isNear({223, 0, 32, 255}, at(-22, 20), 12));
    EXPECT_TRUE(support::isNear({128, 0, 128, 255}, at(0, 20), 6));
    EXPECT_TRUE(support::isNear({128, 128, 128, 255}, at(5, 10), 2)) << "half transparent";
    EXPECT_EQ(5, lines->getLineCount());
}

// Faults caught: edges between the wrong corners; frustums of the wrong shape; joints tied to what is no joint.
TEST_F(DebugLinesTest, shapesAreTheirEdges)
{
    const auto other = makeShared<Camera>();
    other->setPosition(Vector3f(0.5f, 0, 1));
    other->setRotation(quaternionFromAxisAngle(Vector3f(0, 1, 0), Anglef::fromDegrees(70.0f)));
    other->setNear(0.3f);
    other->setFar(2.0f);
    camera->setPosition(Vector3f(0.3f, 0.4f, 3.0f));
    const auto compare = [&](const char* name, const Matrix4f& toWorld, int count)
    {
        const Picture made = drawLines();
        EXPECT_EQ(count, lines->getLineCount()) << name;
        lines->clear();
        // All pairs of corners that differ along one axis.
        const auto corner = [&](int i)
        {
            const Vector4f p =
                toWorld * Vector4f(i & 1 ? 1.0f : -1.0f, i & 2 ? 1.0f : -1.0f, i & 4 ? 1.0f : -1.0f, 1.0f);
            return p.xyz() / p.w;
        };
        for (int a = 0; a < 8; ++a)
            for (int b = a + 1; b < 8; ++b)
                if (((a ^ b) & ((a ^ b) - 1)) == 0)
                    lines->addLine(corner(a), corner(b), Colour4f::WHITE);
        const Picture wanted = drawLines();
        lines->clear();
        EXPECT_LT(100, countPixels(wanted, WHITE)) << name;
        EXPECT_TRUE(support::comparePictures(name, wanted, made, {2, 0.01})) << name;
    };
    Matrix4f projection;
    other->getProjection(&projection, 1.5f);
    lines->addFrustum(*other, 1.5f, Colour4f::WHITE);
    compare("frustum", other->getWorldTransform() * inverse(projection), 12);

    other->setProjectionType(Camera::ProjectionType::ORTHOGRAPHIC);
    other->getProjection(&projection, 0.7f);
    lines->addFrustum(*other, 0.7f, Colour4f::WHITE);
    compare("orthographic", other->getWorldTransform() * inverse(projection), 12);

    const Matrix4f placed = other->getWorldTransform() * scaleMatrix(Vector3f(1, 2, 0.5f));
    lines->addBox(Vector3f(-0.5f, 0, -1), Vector3f(0.5f, 0.5f, 0), placed, Colour4f::WHITE);
    compare("box",
            placed * translationMatrix(Vector3f(0, 0.25f, -0.5f)) * scaleMatrix(Vector3f(0.5f, 0.25f, 0.5f)),
            12);

    lines->addGrid(Matrix4f::IDENTITY, 4, 0.5f, Colour4f::WHITE);
    EXPECT_EQ(10, lines->getLineCount());
    lines->clear();
    lines->addGrid(Matrix4f::IDENTITY, -1, 0.5f, Colour4f::WHITE);
    lines->addGrid(Matrix4f::IDENTITY, INT32_MAX, 0.5f, Colour4f::WHITE);
    EXPECT_EQ(2002, lines->getLineCount());
    lines->clear();
}

TEST_F(DebugLinesTest, skeletonsFollowTheirNodes)
{
    const auto hip = makeShared<SceneNode>(), hook = makeShared<SceneNode>(), knee = makeShared<SceneNode>(),
               toe = makeShared<SceneNode>(), stray = makeShared<SceneNode>();
    hip->setPosition(Vector3f(-2, 0, 0));
    hook->setParent(hip); // no joint
    hook->setPosition(Vector3f(1, 2, 0));
    knee->setParent(hook);
    knee->setPosition(Vector3f(1, -2, 0));
    toe->setParent(knee);
    toe->setPosition(Vector3f(0, -2, 0));
    const auto solid = makeShared<Solid>();
    for (const auto& joint : {toe, hip, knee, stray})
        solid->attachJoint(joint, Matrix4f::IDENTITY);
    solid->attachJoint(nullptr, Matrix4f::IDENTITY);

    lines->addJoints(*solid, Colour4f::WHITE);
    EXPECT_EQ(2, lines->getLineCount());
    const Picture joints = drawLines();
    lines->clear();
    lines->addLine(Vector3f(-2, 0, 0), Vector3f(0, 0, 0), Colour4f::WHITE);
    lines->addLine(Vector3f(0, 0, 0), Vector3f(0, -2, 0), Colour4f::WHITE);
    EXPECT_TRUE(support::comparePictures("joints", drawLines(), joints));

    lines->clear();
    lines->addSkeleton(*hip, Colour4f::WHITE);
    EXPECT_EQ(3, lines->getLineCount());
    const Picture skeleton = drawLines();
    lines->clear();
    lines->addLine(Vector3f(-2, 0, 0), Vector3f(-1, 2, 0), Colour4f::WHITE);
    lines->addLine(Vector3f(-1, 2, 0), Vector3f(0, 0, 0), Colour4f::WHITE);
    lines->addLine(Vector3f(0, 0, 0), Vector3f(0, -2, 0), Colour4f::WHITE);
    EXPECT_TRUE(support::comparePictures("skeleton", drawLines(), skeleton));
}

// Faults caught: lines through what is before them, or hidden where they should not be; depth that lines leave behind.
TEST_F(DebugLinesTest, depthCountsIfAsked)
{
    addSquare(Vector3f(), 2.0f, makePaint(Colour4f::GREEN));
    const auto addLines = [&]
    {
        lines->addLine(Vector3f(-3, 0.1f, -0.5f), Vector3f(3, 0.1f, -0.5f), Colour4f::RED);      // behind
        lines->addLine(Vector3f(-3, 0.5f, 0.5f), Vector3f(3, 0.5f, 0.5f), Colour4f(0, 0, 1, 1)); // before
    };
    addLines();
    Picture picture = drawLines();
    EXPECT_LT(20, countPixels(picture, RED)) << support::savePicture("tested", picture);
    EXPECT_GT(45, countPixels(picture, RED));
    EXPECT_LT(60, countPixels(picture, BLUE));
    lines->setDepthTested(false);
    picture = drawLines();
    EXPECT_LT(50, countPixels(picture, RED));
    render(); // once more, over the lines
    EXPECT_EQ(GREEN, support::readFrame().pixel(32, 26)) << "the line before the square left no depth";
}

// Fault caught: lines at one eye's place for both.
TEST_F(DebugLinesTest, bothEyesSeeThem)
{
    camera->setStereo(3.0f, 1.0f);
    lines->addLine(Vector3f(-0.5f, 0.05f, 1.0f), Vector3f(0.5f, 0.05f, 1.0f), Colour4f::RED);
    const Picture made = drawLines();
    lines->clear();
    addSquare(Vector3f(0, 0.05f, 1.0f), 1.0f, makePaint(Colour4f::RED))->setScale(Vector3f(1.0f, 0.1f, 1.0f));
    const Picture wanted = drawLines();
    for (int half = 0; half < 2; ++half)
    {
        const auto [wantedFirst, wantedLast] = findRed(wanted, half);
        const auto [first, last] = findRed(made, half);
        EXPECT_LT(wantedFirst + 4, wantedLast);
        EXPECT_NEAR(wantedFirst, first, 1) << half << support::savePicture("eyes", made);
        EXPECT_NEAR(wantedLast, last, 1) << half;
    }
    EXPECT_EQ(64, renderContext->getViewportWidth());
}

// Faults caught: a draw for each shape; uploads, copies or memory for lines that stand still, memory for those that move.
TEST_F(DebugLinesTest, isOneDraw)
{
    const auto add = [&](float x)
    {
        for (int i = 0; i < 7000; ++i) // more vertices than 16 bits count
        {
            lines->addBox(Vector3f(), Vector3f(1, 1, 1), Matrix4f::IDENTITY, Colour4f::RED);
            lines->addAxes(Matrix4f::IDENTITY, x);
        }
    };
    add(1.0f);
    drawLines();
    glcalls::resetCounts();
    uint64_t before = support::countAllocations();
    lines->draw(*renderContext, *camera);
    EXPECT_EQ(before, support::countAllocations());
    EXPECT_EQ(1u, glcalls::count(glDrawArrays) + glcalls::count(glDrawElements));
    EXPECT_EQ(0u, glcalls::count(glBufferData) + glcalls::count(glBufferSubData));

    before = support::countAllocations();
    lines->clear();
    add(0.5f);
    lines->draw(*renderContext, *camera);
    EXPECT_EQ(before, support::countAllocations());

    lines->clear();
    glcalls::resetCounts();
    lines->draw(*renderContext, *camera);
    EXPECT_EQ(0u, glcalls::count(glDrawArrays));
}
