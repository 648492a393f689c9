#include "scenetest.h"

#include "orv/renderblock.h"

#include <EGL/egl.h>

using namespace orv;
using support::Picture;
using support::Rgba;

/// Pictures of the built-in materials.
class PictureTest : public SceneTest
{
protected:
    void SetUp() override
    {
        SceneTest::SetUp();
        // As a picture file has it, top row first: red green / blue white.
        const unsigned char pixels[] = {255, 0, 0, 0, 255, 0, 0, 0, 255, 255, 255, 255};
        quarters = pool->getTexture2DCache()->create(2, 2, Texture::Format::RGB, Texture::Type::UNSIGNED_BYTE,
                                                     pixels, nullptr);
        quarters->setMinFilter(TextureParameters::FilterMode::NEAREST);
        quarters->setMagFilter(TextureParameters::FilterMode::NEAREST);
    }

    void TearDown() override
    {
        quarters = nullptr;
        SceneTest::TearDown();
    }

    /// A material that needs no light: its texture shines by itself.
    SharedPtr<Appearance> makeShining(const SharedPtr<Texture2D>& texture)
    {
        auto appearance = makeShared<Appearance>();
        appearance->setShaderProgram(pool->getShaderProgramCache()->get("orv#max_pvl.sp$DIFF"));
        appearance->setProperty("M_DIFFUSE_TEXTURE", texture);
        appearance->setProperty("M_SELF_ILLUMINATION", 1.0f);
        return appearance;
    }

    /// The middles of the four quarters around the centre.
    static void expectQuarters(const Picture& frame, const Rgba& upperLeft, const Rgba& upperRight,
                               const Rgba& lowerLeft, const Rgba& lowerRight)
    {
        EXPECT_EQ(upperLeft, frame.pixel(27, 27));
        EXPECT_EQ(upperRight, frame.pixel(36, 27));
        EXPECT_EQ(lowerLeft, frame.pixel(27, 36));
        EXPECT_EQ(lowerRight, frame.pixel(36, 36));
    }

    SharedPtr<Texture2D> quarters;
};

TEST_F(PictureTest, textureStandsUprightOnEveryFaceOfACube)
{
    const auto cube = createCube(*pool, Vector2f(1, 1));
    cube->setAppearance(makeShining(quarters));
    cube->setParent(scene);
    const Vector3f up(0, 1, 0), north(0, 0, -1), south(0, 0, 1);
    const std::pair<Vector3f, Vector3f> views[] = {{Vector3f(0, 0, 4), up},    {Vector3f(0, 0, -4), up},
                                                   {Vector3f(4, 0, 0), up},    {Vector3f(-4, 0, 0), up},
                                                   {Vector3f(0, 4, 0), north}, {Vector3f(0, -4, 0), south}};
    for (const auto& [from, viewUp] : views)
    {
        SCOPED_TRACE(toString(from));
        camera->setPosition(from);
        point(*camera, Vector3f(), viewUp);
        renderFrame();
        expectQuarters(support::readFrame(), RED, GREEN, BLUE, WHITE);
    }
}

// Fault caught: a texture upside down; a mirrored node shown from the inside, or not at all.
TEST_F(PictureTest, squaresShowTheirFrontFaces)
{
    const auto square = addSquare(Vector3f(), 2.0f, makeShining(quarters));
    renderFrame();
    expectQuarters(support::readFrame(), RED, GREEN, BLUE, WHITE);
    square->setScale(Vector3f(-2, 2, 2));
    renderFrame();
    expectQuarters(support::readFrame(), GREEN, RED, WHITE, BLUE);

    square->setScale(Vector3f(2, 2, 2));
    square->setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(180.0f)));
    renderFrame();
    expectQuarters(support::readFrame(), BLACK, BLACK, BLACK, BLACK);
}

// Faults caught: normals transformed by the model matrix itself, 114 instead of 228; materials without some values
// drawn black.
TEST_F(PictureTest, litMaterials)
{
    const auto sun = makeShared<Light>(); // from the camera, white
    sun->setLightType(Light::LightType::DIRECTIONAL);
    sun->setParent(scene);
    const auto squeezed = makeShared<SceneNode>();
    squeezed->setParent(scene);
    for (const char* program :
         {"orv#max_pvl.sp$DIFF$AMBI$EMIS", "orv#max_ppl.sp$DIFF$AMBI$EMIS", "orv#fallback.sp"})
    {
        SCOPED_TRACE(program);
        const auto appearance = makeShared<Appearance>();
        appearance->setShaderProgram(pool->getShaderProgramCache()->get(program));
        const auto square = addSquare(Vector3f(), 2.0f, appearance);
        square->setParent(squeezed);
        squeezed->setScale(Vector3f(1, 1, 1));
        renderFrame();
        EXPECT_EQ(WHITE, support::readFrame().pixel(32, 32)) << "nothing set";

        appearance->setProperty("M_SPECULAR_LEVEL", 0.0f);
        squeezed->setScale(Vector3f(1, 1, 0.5f));
        square->setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(45.0f)));
        renderFrame();
        const Rgba lit = support::readFrame().pixel(32, 32);
        EXPECT_TRUE(support::isNear({228, 228, 228, 255}, lit, 3)) << lit;
        square->setParent(nullptr);
    }
}

// Fault caught: a picture of a picture upside down.
TEST_F(PictureTest, renderTargetStandsUprightOnASquare)
{
    const auto target = makeTarget(64, 64);
    addSquare(Vector3f(), 2.0f, makeShining(quarters));
    RenderBlock intoTexture(renderer, scene, camera);
    intoTexture.setRenderTarget(target);
    intoTexture.render();

    target->getColourTexture()->setMinFilter(TextureParameters::FilterMode::NEAREST);
    const auto screen = makeShining(target->getColourTexture());
    screen->setProperty("M_UV_OFFSET_SCALE", Vector4f(0, 1, 1, -1));
    scene = makeShared<SceneNode>();
    addSquare(Vector3f(), 6.0f, screen); // fills the view
    renderFrame();
    expectQuarters(support::readFrame(), RED, GREEN, BLUE, WHITE);
}

/// A mirror in the plane z = 0 that fills the view, and a red square that looks at it from behind the camera.
class MirrorPictureTest : public PictureTest
{
protected:
    void SetUp() override
    {
        PictureTest::SetUp();
        auto appearance = makeShared<Appearance>();
        appearance->setShaderProgram(makeProgram(
            "attribute vec3 a_position; uniform mat4 u_transform; varying highp vec4 v_place;"
            "void main() { v_place = u_transform * vec4(a_position, 1.0); gl_Position = v_place; }",
            "varying highp vec4 v_place; uniform sampler2D u_mirror; void main() {"
            "    highp vec2 p = v_place.xy / v_place.w;"
            "    gl_FragColor = texture2D(u_mirror, vec2(0.5 + 0.5 * p.x, 0.5 - 0.5 * p.y)); }",
            {{"u_transform", "T_MODEL_VIEW_PROJECTION"}, {"u_mirror", "M_MIRROR_TEXTURE"}}));
        mirror = addSquare(Vector3f(), 6.0f, appearance);
        red = addSquare(Vector3f(3.5f, 3.5f, 4), 3.0f, makePaint(Colour4f::RED));
        red->setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(180.0f)));
    }

    void TearDown() override
    {
        mirror = nullptr;
        red = nullptr;
        PictureTest::TearDown();
    }

    static void expectReflection(const Picture& frame)
    {
        EXPECT_EQ(RED, frame.pixel(48, 16));
        for (const auto& [x, y] : {std::pair(16, 16), std::pair(16, 48), std::pair(48, 48)})
            EXPECT_EQ(BLACK, frame.pixel(x, y)) << x << ' ' << y;
    }

    SharedPtr<Solid> mirror;
    SharedPtr<Solid> red;
};

// Faults caught: a reflection upside down, inside out or missing; masks and scissor box of a draw that keep
// the mirror's last picture from being cleared; the reflected eye left behind as the eye.
TEST_F(MirrorPictureTest, showsWhatStandsBeforeIt)
{
    const auto spoiler = makePaint(Colour4f::WHITE);
    spoiler->setScissorTestEnabled(true);
    spoiler->setScissorBox(0, 0, 1, 1);
    spoiler->setColourMask(false, false, false, false);
    spoiler->setDepthWriteEnabled(false);
    addSquare(Vector3f(0, 0, -50), 1.0f, spoiler);

    red->setPosition(Vector3f(-3.5f, -3.5f, 4));
    renderFrame();
    EXPECT_EQ(RED, support::readFrame().pixel(16, 48));
    red->setPosition(Vector3f(3.5f, 3.5f, 4));
    renderFrame();
    expectReflection(support::readFrame());
    EXPECT_EQ(Vector4f(0, 0, 3, 1), property<Vector4f>("T_CAMERA_POSITION"));
    EXPECT_EQ(inverse(camera->getWorldTransform()), property<Matrix4f>("T_VIEW"));
}

TEST_F(MirrorPictureTest, reflectedEyeStandsBehindTheMirror)
{
    // Paints the eye's z as red; in the mirror it is -3, shown as black, and green says that it was drawn.
    const auto appearance = makeShared<Appearance>();
    appearance->setShaderProgram(makeProgram(
        "attribute vec3 a_position; uniform mat4 u_transform; uniform vec4 u_eye; varying mediump vec4 v_c;"
        "void main() { v_c = vec4(u_eye.z, 1, 0, 1); gl_Position = u_transform * vec4(a_position, 1); }",
        "varying mediump vec4 v_c; void main() { gl_FragColor = v_c; }",
        {{"u_transform", "T_MODEL_VIEW_PROJECTION"}, {"u_eye", "T_CAMERA_POSITION"}}));
    red->setAppearance(appearance);
    renderFrame();
    EXPECT_EQ(GREEN, support::readFrame().pixel(48, 16));
}

// Fault caught: everything inside out with a mirroring camera, directly or in a mirror.
TEST_F(MirrorPictureTest, mirroringCamerasSeeTheRightSide)
{
    addSquare(Vector3f(-1.5f, -1.0f, 1.0f), 0.5f, makePaint(Colour4f::GREEN));
    renderFrame();
    const Picture expected = support::readFrame();
    expectReflection(expected);
    EXPECT_EQ(GREEN, expected.pixel(8, 48));
    for (const bool isStereo : {false, true})
    {
        const auto parent = makeShared<SceneNode>(); // what mirrors may be above the camera
        parent->setScale(Vector3f(-1, 1, 1));
        camera->setParent(parent);
        camera->setStereo(7.0f, isStereo ? 0.001f : 0.0f);
        renderFrame();
        const Picture mirrored = support::readFrame();
        const int halving = isStereo ? 2 : 1;
        for (int i = 0; i < 32 * 32; ++i)
        {
            const int x = 2 * (i % 32) + 1, y = 2 * (i / 32) + 1;
            const bool isEdge = !(expected.pixel(x, y) == expected.pixel(std::max(0, x - 3), y)) ||
                                !(expected.pixel(x, y) == expected.pixel(std::min(63, x + 3), y));
            if (!isEdge)
            {
                ASSERT_EQ(expected.pixel(x, y), mirrored.pixel((63 - x) / halving, y)) << x << ' ' << y;
            }
        }
    }
    EXPECT_FALSE(renderContext->isViewMirrored());
}

// Fault caught: a mirror's picture as coarse as the small view that was drawn first, for ever.
TEST_F(MirrorPictureTest, textureIsAsLargeAsTheSurface)
{
    const auto sizeOfTexture = [this]
    {
        SharedPtr<Texture2D> texture;
        mirror->getAppearance()->getPropertyUniform("M_MIRROR_TEXTURE")->getValue(texture, 0);
        return std::pair(texture->getWidth(), texture->getHeight());
    };
    const auto renderTo = [&](int width, int height)
    {
        renderContext->setViewport(0, 0, width, height);
        render();
        return sizeOfTexture();
    };
    const size_t before = glcalls::liveNames(glcalls::Kind::TEXTURE).size();
    using Size = std::pair<unsigned, unsigned>;
    EXPECT_EQ(Size(64, 64), renderTo(16, 8));
    EXPECT_EQ(Size(64, 64), renderTo(64, 64));
    EXPECT_EQ(Size(64, 128), renderTo(32, 128)) << "a target's viewport may be larger";
    EXPECT_EQ(Size(64, 128), renderTo(64, 64));

    const EGLDisplay display = eglGetCurrentDisplay();
    const EGLContext context = eglGetCurrentContext();
    const EGLSurface first = eglGetCurrentSurface(EGL_DRAW);
    EGLint id = 0;
    EGLint count = 0;
    eglQueryContext(display, context, EGL_CONFIG_ID, &id);
    const EGLint wanted[] = {EGL_CONFIG_ID, id, EGL_NONE};
    const EGLint size[] = {EGL_WIDTH, 96, EGL_HEIGHT, 32, EGL_NONE};
    EGLConfig config = nullptr;
    ASSERT_TRUE(eglChooseConfig(display, wanted, &config, 1, &count) && count == 1);
    const EGLSurface second = eglCreatePbufferSurface(display, config, size);
    ASSERT_TRUE(eglMakeCurrent(display, second, second, context));
    EXPECT_EQ(Size(96, 32), renderTo(32, 16)) << "another surface";
    ASSERT_TRUE(eglMakeCurrent(display, first, first, context));
    eglDestroySurface(display, second);
    EXPECT_EQ(Size(64, 64), renderTo(64, 64));
    EXPECT_EQ(before + 1, glcalls::liveNames(glcalls::Kind::TEXTURE).size()) << "old ones are deleted";
    EXPECT_EQ(1u, glcalls::liveNames(glcalls::Kind::FRAMEBUFFER).size());

    glcalls::setDropped(glCopyTexImage2D);
    glcalls::queueError(GL_NO_ERROR);
    glcalls::queueError(GL_OUT_OF_MEMORY);
    support::LogCapture log;
    EXPECT_EQ(Size(64, 64), renderTo(100, 100)) << "the one there is goes on";
    EXPECT_EQ(Size(64, 64), renderTo(100, 100));
    EXPECT_EQ(1, log.count('E')) << "tried once";
}

// Fault caught: the rest of a frame that goes to the surface after a mirror was drawn inside a target.
TEST_F(MirrorPictureTest, worksInsideARenderTarget)
{
    const auto target = makeTarget(64, 64);
    RenderBlock block(renderer, scene, camera);
    block.setBackgroundColour(Colour4f::BLACK);
    block.setRenderTarget(target);
    Background(Colour4f(0, 0, 1, 1)).enable(*renderContext);
    block.render();
    EXPECT_EQ(BLUE, support::readFrame().average()) << "the surface is untouched";
    target->enable();
    expectReflection(support::readFramebuffer(0, 0, 64, 64));
    target->disable();
}

// Fault caught: each eye's picture drawn over the whole view after its mirror pass.
TEST_F(MirrorPictureTest, worksInStereo)
{
    camera->setStereo(7.0f, 0.01f);
    renderFrame();
    const Picture frame = support::readFrame();
    for (const int left : {0, 32})
    {
        EXPECT_EQ(RED, frame.pixel(left + 24, 16));
        EXPECT_EQ(BLACK, frame.pixel(left + 8, 16));
        EXPECT_EQ(BLACK, frame.pixel(left + 24, 48));
    }
    EXPECT_EQ(64, renderContext->getViewportWidth());
}

// Fault caught: one mirror showing the other's picture.
TEST_F(MirrorPictureTest, eachMirrorShowsItsOwnReflection)
{
    mirror->setScale(Vector3f(3, 6, 1));
    mirror->setPosition(Vector3f(-1.5f, 0, 0));
    const auto second = makeShared<Solid>(mirror->getMesh(), mirror->getAppearance());
    second->setScale(Vector3f(3, 6, 1));
    second->setPosition(Vector3f(1.5f, 0, 1));
    second->setParent(scene);
    red->setPosition(Vector3f(-3.5f, 3.5f, 4));
    const auto white = addSquare(Vector3f(3.5f, 3.5f, 4), 3.0f, makePaint(Colour4f::WHITE));
    white->setRotation(red->getRotation());
    renderFrame();
    const Picture frame = support::readFrame();
    EXPECT_EQ(RED, frame.pixel(21, 20)) << "in the first mirror; the second would show it farther out";
    EXPECT_EQ(BLACK, frame.pixel(3, 3));
    EXPECT_EQ(BLACK, frame.pixel(42, 20));
    EXPECT_EQ(WHITE, frame.pixel(60, 3)) << "in the second mirror; the first would show it farther in";
    EXPECT_EQ(1u, glcalls::liveNames(glcalls::Kind::FRAMEBUFFER).size()) << "one target for both";
}
