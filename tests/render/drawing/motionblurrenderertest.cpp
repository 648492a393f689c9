#include "scenetest.h"

#include "orv/mesh.h"
#include "orv/motionblurrenderer.h"

#include <GLES2/gl2.h>

using namespace orv;
using support::Picture;
using support::Rgba;

namespace
{

constexpr Rgba REST = {127, 127, 255, 255};
constexpr float FRAME = 1.0f / 60.0f;

template <class Function>
Picture makePicture(int size, Function colourAt)
{
    Picture picture = Picture::filled(size, size, BLACK);
    for (int i = 0; i < size * size; ++i)
        picture.setPixel(i % size, i / size, colourAt(i % size, i / size));
    return picture;
}

class MotionBlurRendererTest : public SceneTest
{
protected:
    void SetUp() override
    {
        SceneTest::SetUp();
        velocityRenderer = makeShared<MotionBlurRenderer>(renderContext, pool);
        renderContext->getProperty("MOTION_BLUR_FACTOR")->setValue(1.0f, 0);
        paint = makePaint(Colour4f::WHITE);
    }

    void TearDown() override
    {
        velocityRenderer = nullptr;
        paint = nullptr;
        SceneTest::TearDown();
    }

    /// The next frame, a sixtieth of a second later unless another step is given.
    Picture drawVelocities(float step = FRAME)
    {
        m_time += step;
        velocityRenderer->update(m_time);
        Background(Colour4f::BLACK).enable(*renderContext);
        velocityRenderer->render(camera.get(), *scene, flags, flags);
        return support::readFrame();
    }

    /// Textures repeat: what lies beyond an edge must not matter.
    Picture compose(const char* program, const Picture& sharp, const Picture& velocity)
    {
        const auto appearance = makeShared<Appearance>();
        appearance->setShaderProgram(pool->getShaderProgramCache()->get(program));
        for (const auto& [name, picture] :
             {std::pair("M_SHARP_TEXTURE", &sharp), std::pair("M_VELOCITY_TEXTURE", &velocity)})
        {
            const unsigned size = unsigned(picture->width);
            const auto texture = pool->getTexture2DCache()->create(size, size, Texture::Format::RGBA,
                                                                   Texture::Type::UNSIGNED_BYTE,
                                                                   picture->rgba.data(), nullptr);
            texture->setMinFilter(TextureParameters::FilterMode::LINEAR);
            appearance->setProperty(name, texture);
        }
        const auto square = addSquare(Vector3f(), 1.0f, appearance);
        square->setParent(nullptr);
        Background(Colour4f::BLUE).enable(*renderContext);
        renderer->render(nullptr, *square, FlagMask(), FlagMask());
        return support::readFrame();
    }

    FlagMask flags;
    SharedPtr<MotionBlurRenderer> velocityRenderer;
    SharedPtr<Appearance> paint;

private:
    float m_time = 0.0f;
};

} // namespace

// Faults caught: a step turned upside down, a division by no time at all, a time that is not remembered.
TEST_F(MotionBlurRendererTest, deltaTimeIsOneAtSixtyFrames)
{
    const struct
    {
        float time, deltaTime, wrapped;
    } frames[] = {{0.0f, 1.0f, 0.0f},
                  {0.25f, 1.0f / 15.0f, 0.25f},
                  {0.25f, 1.0f, 0.25f},
                  {0.25f + 1.0f / 30.0f, 0.5f, 0.25f + 1.0f / 30.0f},
                  {61.5f, 0.00027225701f, 1.5f}};
    for (const auto& frame : frames)
    {
        velocityRenderer->update(frame.time);
        velocityRenderer->render(nullptr, *scene, FlagMask(), FlagMask());
        EXPECT_NEAR(frame.deltaTime, property<float>("DELTA_TIME"), frame.deltaTime * 1e-4f) << frame.time;
        EXPECT_FLOAT_EQ(frame.wrapped, property<float>("TIME"));
    }
    EXPECT_EQ(1.0f, property<float>("MOTION_BLUR_FACTOR")) << "the application's";
}

// Faults caught: old matrices of the wrong frame, factors in the wrong order, motion data of solids that took no part.
TEST_F(MotionBlurRendererTest, comparesWithTheFrameBefore)
{
    flags = FlagMask(1, 1);
    const auto hidden = addSquare(Vector3f(0, 1, 0), 1.0f, paint);
    const auto solid = addSquare(Vector3f(1, 0, 0), 2.0f, paint);
    Matrix4f projection;
    camera->getProjection(&projection, 1.0f);
    const auto viewProjection = [&] { return projection * inverse(camera->getWorldTransform()); };

    drawVelocities();
    EXPECT_EQ(Matrix4f::IDENTITY, property<Matrix4f>("T_OLD_MODEL_VIEW_PROJECTION"))
        << "none before the first";
    const Matrix4f before = viewProjection() * solid->getWorldTransform();
    EXPECT_EQ(before, property<Matrix4f>("T_MODEL_VIEW_PROJECTION"));

    setFlags(*hidden, flags, false);
    hidden->setPosition(Vector3f(0, 2, 0));
    solid->setPosition(Vector3f(1, 2, 0));
    camera->setPosition(Vector3f(0, 1, 4));
    drawVelocities();
    EXPECT_EQ(before, property<Matrix4f>("T_OLD_MODEL_VIEW_PROJECTION"));
    EXPECT_EQ(viewProjection(), property<Matrix4f>("T_VIEW_PROJECTION"));
    EXPECT_EQ(viewProjection() * solid->getWorldTransform(), property<Matrix4f>("T_MODEL_VIEW_PROJECTION"));
    EXPECT_EQ(translationMatrix(Vector3f(0, 1, 0)), hidden->getLastWorldTransform());
    EXPECT_EQ(solid->getWorldTransform(), solid->getLastWorldTransform());
}

// Faults caught: signs and axes, values that depend on the frame rate, an eye compared with the other one's past.
TEST_F(MotionBlurRendererTest, picturesShowTheWayOverTheScreen)
{
    const auto solid = addSquare(Vector3f(), 2.0f, paint);
    solid->setRotation(quaternionFromAxisAngle(Vector3f(0.6f, 0.8f, 0), Anglef::fromDegrees(25.0f)));
    const Vector3f stand(0, 0, 3); // the view is 6 units wide where the solid is
    const struct
    {
        const char* name;
        Vector3f move, cameraMove;
        float factor, step;
        Rgba expected;
    } cases[] = {
        {"right", {0.3f, 0, 0}, {}, 1, FRAME, {178, 127, 255, 255}},
        {"down", {0, -0.3f, 0}, {}, 1, FRAME, {127, 76, 255, 255}},
        {"camera to the left and down", {}, {-0.3f, -0.6f, 0}, 1, FRAME, {178, 229, 255, 255}},
        {"both alike", {0.3f, 0.3f, 0}, {0.3f, 0.3f, 0}, 1, FRAME, REST},
        {"half the shutter", {0.6f, 0, 0}, {}, 0.5f, FRAME, {178, 127, 255, 255}},
        {"half the frame rate", {0.6f, 0, 0}, {}, 1, 2 * FRAME, {178, 127, 255, 255}},
        {"no blur wanted", {0.6f, 0, 0}, {}, 0, FRAME, REST},
        {"too far, at a slant", {-2, 1, 0}, {}, 1, FRAME, {0, 191, 255, 255}},
        {"still", {}, {}, 1, FRAME, REST},
    };
    for (const float eyeSeparation : {0.0f, 0.2f})
    {
        camera->setStereo(3.0f, eyeSeparation);
        for (const auto& c : cases)
        {
            renderContext->getProperty("MOTION_BLUR_FACTOR")->setValue(c.factor, 0);
            solid->setPosition(-c.move);
            camera->setPosition(stand - c.cameraMove);
            drawVelocities();
            solid->setPosition(Vector3f());
            camera->setPosition(stand);
            const Picture picture = drawVelocities(c.step);
            for (const int x : {eyeSeparation != 0.0f ? 16 : 32, eyeSeparation != 0.0f ? 48 : 32})
                EXPECT_TRUE(support::isNear(c.expected, picture.pixel(x, 32), c.expected == REST ? 0 : 2))
                    << c.name << " at " << x << ": " << picture.pixel(x, 32);
        }
        const Picture still = drawVelocities();
        const Picture drawn =
            makePicture(64, [&](int x, int y) { return still.pixel(x, y).b ? REST : BLACK; });
        EXPECT_EQ(drawn.rgba, still.rgba) << "rest everywhere";
    }
}

// Faults caught: a program given to skinned solids, their mesh not bound, a draw that no program asked for.
TEST_F(MotionBlurRendererTest, skinnedSolidsTakeTheCurrentProgram)
{
    const auto skinned = addSquare(Vector3f(0, 0, 0), 1.0f, paint);
    skinned->setJointsPerVertex(1);
    skinned->attachJoint(scene, Matrix4f::IDENTITY);
    drawVelocities();
    EXPECT_EQ(0u, glcalls::count(glDrawElements)) << "none is current";

    skinned->setParent(nullptr);
    const auto rigid = addSquare(Vector3f(), 1.0f, paint);
    skinned->setParent(scene);
    skinned->setMesh(createCube(*pool, Vector2f(1, 1))->getMesh());
    drawVelocities(); // everything is made and linked
    skinned->setPosition(Vector3f(2, 0, 0));
    rigid->setPosition(Vector3f(0.3f, 0, 0));
    glcalls::startRecording();
    const Picture picture = drawVelocities();
    glcalls::stopRecording();
    EXPECT_EQ(1u, glcalls::recorded("glUseProgram").size()) << "that of the square";
    EXPECT_EQ((std::vector<std::string>{"glDrawElements(0x0004, 6, 0x1403, 0)",
                                        "glDrawElements(0x0004, 36, 0x1403, 0)"}),
              glcalls::recorded("glDrawElements"));
    // The cube's front is at z = 1, where the view is 4 units wide; it stands where the square before it does.
    EXPECT_TRUE(support::isNear({203, 127, 255, 255}, picture.pixel(32, 40), 2)) << picture.pixel(32, 40);
}

// Faults caught: solids pulled to where another renderer's last skin was; joints that do not reach the program.
TEST_F(MotionBlurRendererTest, jointsAreThoseOfTheSolid)
{
    const auto joint = makeShared<SceneNode>();
    joint->setPosition(Vector3f(2, 0, 0));
    const auto posed = addSquare(Vector3f(), 1.0f, paint);
    posed->attachJoint(joint, Matrix4f::IDENTITY);
    render();
    posed->setParent(nullptr);
    addSquare(Vector3f(-2, 0, 0), 1.0f, paint);
    drawVelocities();
    const Picture alone = drawVelocities();
    EXPECT_EQ(REST, alone.pixel(11, 32));
    EXPECT_EQ(BLACK, alone.pixel(53, 32));

    posed->setParent(scene);
    drawVelocities();
    const Picture both = drawVelocities();
    EXPECT_EQ(REST, both.pixel(11, 32));
    EXPECT_EQ(REST, both.pixel(53, 32)) << "in its pose";
    EXPECT_EQ(BLACK, both.pixel(32, 32));
}

// Faults caught: what rests changed by rounding, a smear to one side, one eye's picture in the other's, the opposite
// edge or the black surroundings of smaller velocities mixed in.
TEST_F(MotionBlurRendererTest, blursAlongTheVelocityAlone)
{
    const Picture noise =
        makePicture(64,
                    [](int x, int y) {
                        return Rgba{uint8_t(x * 97 + y * 31), uint8_t(x * y), uint8_t(x * x + y * 57), 255};
                    });
    const Picture crack = makePicture(16, [](int x, int) { return x == 5 ? BLACK : REST; });
    for (const char* program : {"orv#motionblur.sp", "orv#motionblur.sp$STEREO"})
    {
        for (const Picture& rest : {Picture::filled(64, 64, REST), Picture::filled(1, 1, BLACK), crack})
        {
            const Picture composed = compose(program, noise, rest);
            // Textures have their lower row first, frames are read with the upper one first.
            EXPECT_EQ(noise.rgba,
                      makePicture(64, [&](int x, int y) { return composed.pixel(x, 63 - y); }).rgba)
                << program;
        }
    }

    const Picture column = makePicture(64, [](int x, int) { return x == 31 || x == 32 ? WHITE : BLACK; });
    const Picture halves = makePicture(64, [](int x, int) { return x < 32 ? RED : GREEN; });
    const Picture right = Picture::filled(64, 64, {254, 127, 255, 255}); // an eighth of the view: 8 pixels
    const Picture up = Picture::filled(64, 64, {127, 254, 255, 255});
    const Picture across = compose("orv#motionblur.sp", column, right);
    for (int x = 0; x < 32; ++x)
        EXPECT_TRUE(support::isNear(across.pixel(x, 32), across.pixel(63 - x, 32), 2)) << x;
    EXPECT_GT(across.pixel(28, 32).r, 30);
    EXPECT_LT(across.pixel(31, 32).r, 90);
    EXPECT_EQ(BLACK, across.pixel(25, 32));
    EXPECT_EQ(WHITE, compose("orv#motionblur.sp", column, up).pixel(31, 5)) << "along the column";
    EXPECT_TRUE(support::isNear(RED, compose("orv#motionblur.sp", halves, right).pixel(0, 32), 1));

    for (const Rgba& code : {Rgba{254, 254, 255, 255}, Rgba{0, 200, 255, 255}, Rgba{140, 127, 255, 255}})
    {
        const Picture stereo = compose("orv#motionblur.sp$STEREO", halves, Picture::filled(64, 64, code));
        for (int x = 0; x < 64; ++x)
            EXPECT_TRUE(support::isNear(x < 32 ? RED : GREEN, stereo.pixel(x, 32), 1))
                << x << stereo.pixel(x, 32);
    }
}
