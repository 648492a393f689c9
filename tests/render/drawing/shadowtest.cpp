#include "scenetest.h"

#include "orv/shadowmap.h"

#include "glcalls/weakdevice.h"
#include "support/allocation.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <limits>
#include <random>

using namespace orv;
using support::LogCapture;
using support::Picture;

namespace
{

using Place = std::array<double, 3>;

Place operator+(const Place& a, const Place& b)
{
    return {a[0] + b[0], a[1] + b[1], a[2] + b[2]};
}
Place operator*(const Place& a, double factor)
{
    return {a[0] * factor, a[1] * factor, a[2] * factor};
}
Place operator-(const Place& a, const Place& b)
{
    return a + b * -1.0;
}
double multiply(const Place& a, const Place& b)
{
    return a[0] * b[0] + a[1] * b[1] + a[2] * b[2];
}
Place shorten(const Place& a)
{
    return a * (1.0 / std::sqrt(multiply(a, a)));
}
Place toPlace(const Vector3f& v)
{
    return {double(v.x), double(v.y), double(v.z)};
}

/// A turned box, or a floor: one without a height.
struct Block
{
    Place centre;
    std::array<Place, 3> axes; ///< of length 1
    Place half;
};

/// What a ray meets first.
struct Meeting
{
    double distance = std::numeric_limits<double>::infinity();
    Place outside = {}; ///< the direction that the side faces
};

/// By slabs, one box after the other.
Meeting meetFirst(const std::vector<Block>& blocks, const Place& from, const Place& direction)
{
    Meeting first;
    for (const Block& block : blocks)
    {
        double enter = 1e-6, leave = first.distance;
        Place outside = {};
        for (size_t i = 0; i < 3; ++i)
        {
            const double start = multiply(from - block.centre, block.axes[i]);
            const double speed = multiply(direction, block.axes[i]);
            const double in = (-std::copysign(block.half[i], speed) - start) / speed;
            leave = std::min(leave, (std::copysign(block.half[i], speed) - start) / speed);
            if (in > enter)
            {
                enter = in;
                outside = block.axes[i] * (speed > 0.0 ? -1.0 : 1.0);
            }
        }
        if (enter <= leave && enter < first.distance && enter > 1e-6)
            first = {enter, outside};
    }
    return first;
}

} // namespace

class ShadowTest : public SceneTest
{
protected:
    void SetUp() override
    {
        SceneTest::SetUp();
        light = makeShared<Light>("light");
        light->setParent(scene);
    }

    void TearDown() override
    {
        shadows = nullptr;
        light = nullptr;
        target = nullptr;
        SceneTest::TearDown();
    }

    SharedPtr<Appearance> makeWhite(const char* program)
    {
        const auto appearance = makeShared<Appearance>();
        appearance->setShaderProgram(pool->getShaderProgramCache()->get(program));
        return appearance;
    }

    SharedPtr<Solid> addCube(const Vector3f& place, const Vector3f& half,
                             const SharedPtr<Appearance>& material)
    {
        const auto cube = createCube(*pool, Vector2f(1, 1));
        cube->setPosition(place);
        cube->setScale(half);
        cube->setAppearance(material);
        cube->setParent(scene);
        return cube;
    }

    /// A floor of 20 by 20 at y = 0 under a light from above, which the camera looks down on: x to the right, z down.
    void makeStage(const SharedPtr<Appearance>& material)
    {
        addCube(Vector3f(0, -0.5f, 0), Vector3f(10, 0.5f, 10), material);
        light->setLightType(Light::LightType::DIRECTIONAL);
        light->setPosition(Vector3f(0, 8, 0));
        point(*light, Vector3f(), Vector3f(0, 0, -1));
        camera->setProjectionType(Camera::ProjectionType::ORTHOGRAPHIC);
        camera->setWidth(16.0f); // four pixels for each unit
        camera->setPosition(Vector3f(0, 50, 0));
        point(*camera, Vector3f(), Vector3f(0, 0, -1));
    }

    /// The stage with a cube over its middle, and light from the upper right.
    void makeCubeInSlantedLight(const SharedPtr<Appearance>& material)
    {
        makeStage(material);
        addCube(Vector3f(0, 2, 0), Vector3f(1, 1, 1), material);
        light->setPosition(Vector3f(3, 3, 0));
        point(*light, Vector3f());
    }

    static support::Rgba at(const Picture& picture, float x, float z)
    {
        return picture.pixel(32 + int(std::floor(x * 4.0f)), 32 + int(std::floor(z * 4.0f)));
    }

    void makeShadows(int size = 1024)
    {
        shadows = makeShared<ShadowMap>(renderContext, pool, size);
        attached = shadows->attach(*scene);
    }

    Picture drawShadowed()
    {
        shadows->render(*scene, camera.get());
        renderFrame();
        return support::readFrame();
    }

    SharedPtr<Light> light;
    ShadowMap::Ptr shadows;
    SharedPtr<RenderTarget> target;
    int attached = 0;
};

namespace
{

/// A scene of turned boxes on a floor, as the engine and as the model have it.
class ShadowModel : public ShadowTest
{
protected:
    static constexpr int SIDE = 256;

    float number(float from, float to) { return std::uniform_real_distribution<float>(from, to)(random); }

    void add(const SharedPtr<Solid>& solid)
    {
        const Matrix4f& world = solid->getWorldTransform();
        Block& block = blocks.emplace_back();
        block.centre = toPlace(world[3].xyz());
        for (int i = 0; i < 3; ++i)
        {
            block.half[size_t(i)] = double(length(world[i].xyz()));
            block.axes[size_t(i)] = shorten(toPlace(world[i].xyz()));
        }
    }

    void makeScene(Light::LightType type, const SharedPtr<Appearance>& material)
    {
        blocks.clear();
        add(addCube(Vector3f(0, -0.5f, 0), Vector3f(8, 0.5f, 8), material));
        for (int i = 0; i < 7; ++i)
        {
            const auto cube = addCube(Vector3f(number(-3, 3), number(0.2f, 2.5f), number(-3, 3)),
                                      Vector3f(number(0.2f, 1), number(0.2f, 1), number(0.2f, 1)), material);
            cube->setRotation(
                quaternionFromAxisAngle(normalize(Vector3f(number(-1, 1), number(-1, 1), number(0.1f, 1))),
                                        Anglef::fromRadians(number(0, 3))));
            add(cube);
        }
        light->setLightType(type);
        light->setSpotInnerAngle(Anglef::fromDegrees(95.0f));
        light->setSpotOuterAngle(Anglef::fromDegrees(95.0f));
        light->setPosition(Vector3f(number(-4, 4), number(5, 8), number(-4, 4)));
        point(*light, Vector3f());
        camera->setPosition(Vector3f(number(-6, 6), number(4, 7), number(5, 8)));
        point(*camera, Vector3f(0, 0.5f, 0));
        camera->setFieldOfView(Anglef::fromDegrees(50.0f));
    }

    /// @return the direction towards the light, and how far it is.
    std::pair<Place, double> findLight(const Place& from) const
    {
        const Matrix4f& world = light->getWorldTransform();
        if (light->getLightType() == Light::LightType::DIRECTIONAL)
            return {shorten(toPlace(world[2].xyz())), std::numeric_limits<double>::infinity()};
        const Place way = toPlace(world[3].xyz()) - from;
        return {shorten(way), std::sqrt(multiply(way, way))};
    }

    bool isShadowed(const Place& at, const Place& outside) const
    {
        const Place from = at + outside * 1e-4;
        const auto [direction, distance] = findLight(from);
        return meetFirst(blocks, from, direction).distance < distance;
    }

    bool isInside(const Place& place) const
    {
        return std::any_of(blocks.begin(), blocks.end(),
                           [&](const Block& block)
                           {
                               bool isIn = true;
                               for (size_t i = 0; i < 3; ++i)
                                   isIn = isIn && std::fabs(multiply(place - block.centre, block.axes[i])) <
                                                      block.half[i];
                               return isIn;
                           });
    }

    /// What a pixel of the floor or of a box should look like.
    struct Expected
    {
        bool isKnown = false; ///< no edge of a side, of a shadow or of the cone of light is near
        bool isDark = false;
        double facing = 0.0; ///< cosine
    };

    Expected expectPixel(int x, int y, double texel)
    {
        Matrix4f projection;
        camera->getProjection(&projection, 1.0f);
        const Matrix4f& eye = camera->getWorldTransform();
        const double u = (x + 0.5) / SIDE * 2.0 - 1.0, v = 1.0 - (y + 0.5) / SIDE * 2.0;
        const Place way =
            shorten(toPlace(eye[0].xyz()) * (u / double(projection[0].x)) +
                    toPlace(eye[1].xyz()) * (v / double(projection[1].y)) - toPlace(eye[2].xyz()));
        const Place from = toPlace(eye[3].xyz());
        const Meeting met = meetFirst(blocks, from, way);
        Expected expected;
        if (!std::isfinite(met.distance))
            return expected;
        const Place place = from + way * met.distance;
        const auto [toLight, distance] = findLight(place);
        expected.facing = multiply(met.outside, toLight);
        const double cosine = multiply(toLight, shorten(toPlace(light->getWorldTransform()[2].xyz())));
        if (light->getLightType() == Light::LightType::SPOT && cosine < std::cos(0.79))
            return expected; // the cone's edge, or beyond
        if (std::fabs(expected.facing) < 0.1)
            return expected;
        expected.isDark = expected.facing < 0.0 || isShadowed(place, met.outside);

        // Steps to all sides, on the same plane and in what the soft edge is made of.
        const Place one =
            shorten(std::fabs(met.outside[1]) < 0.9 ? Place{met.outside[2], 0.0, -met.outside[0]}
                                                    : Place{met.outside[1], -met.outside[0], 0.0});
        const Place other = {met.outside[1] * one[2] - met.outside[2] * one[1],
                             met.outside[2] * one[0] - met.outside[0] * one[2],
                             met.outside[0] * one[1] - met.outside[1] * one[0]};
        const double reach = texel * 4.5 / std::max(std::fabs(expected.facing), 0.1);
        for (int i = 0; i < 48; ++i)
        {
            const double angle = i * 6.2831853 / 16.0, radius = reach * (1 + i / 16) / 3.0;
            const Place near = place + one * (radius * std::cos(angle)) + other * (radius * std::sin(angle));
            const Meeting ground = meetFirst(blocks, near + met.outside * 0.5, met.outside * -1.0);
            const bool isSame =
                std::fabs(ground.distance - 0.5) < 1e-4 && !isInside(near + met.outside * 1e-4);
            if (!isSame || (expected.facing > 0.0 && isShadowed(near, met.outside) != expected.isDark))
                return expected;
        }
        expected.isKnown = true;
        return expected;
    }

    /// @param plain  without shadows.
    /// @return how many pixels were compared, lit and dark ones.
    std::pair<int, int> compare(const Picture& plain, const Picture& picture, double texel,
                                const std::string& what)
    {
        int lit = 0, dark = 0, wrong = 0;
        for (int y = 0; y < SIDE; y += 3)
        {
            for (int x = 0; x < SIDE; x += 3)
            {
                const Expected expected = expectPixel(x, y, texel);
                if (!expected.isKnown)
                    continue;
                const int found = picture.pixel(x, y).r;
                const int wanted = expected.isDark ? 0 : plain.pixel(x, y).r;
                ++(expected.isDark ? dark : lit);
                const bool isRight = std::abs(found - wanted) < 4;
                wrong += !isRight;
                if (!isRight && wrong < 4)
                    ADD_FAILURE() << what << ": pixel " << x << ", " << y << " is " << found << ", expected "
                                  << wanted;
            }
        }
        EXPECT_EQ(0, wrong) << what << support::savePicture("shadows" + what.substr(0, 2), picture);
        return {lit, dark};
    }

    std::mt19937 random{7};
    std::vector<Block> blocks;
};

} // namespace

// Faults caught: shadows in the wrong place, on the wrong side or of the wrong light; self-shadowing; light leaks at
// contacts; shadows that end at the border of the map.
TEST_F(ShadowModel, rayToTheLightDecides)
{
    const struct
    {
        const char* program;
        Light::LightType type;
    } cases[] = {{"orv#max_ppl.sp$DIFF", Light::LightType::DIRECTIONAL},
                 {"orv#max_ppl.sp$DIFF", Light::LightType::SPOT},
                 {"orv#max_pvl.sp$DIFF$BACK", Light::LightType::DIRECTIONAL},
                 {"orv#max_pvl.sp$DIFF", Light::LightType::SPOT}};
    target = makeTarget(SIDE, SIDE);
    renderContext->setViewport(0, 0, SIDE, SIDE);
    int lit = 0, dark = 0;
    for (int round = 0; round < 12; ++round)
    {
        const auto& tried = cases[round % 4];
        const auto material = makeWhite(tried.program);
        const bool isSheet = round % 8 > 3; // drawn from both sides, which boxes do not need
        if (isSheet)
            material->setCullingMode(CullingMode::CULL_NONE);
        scene = makeShared<SceneNode>();
        light->setParent(scene);
        makeScene(tried.type, material);
        const auto draw = [&]
        {
            target->enable();
            renderFrame();
            const Picture picture = support::readFramebuffer(0, 0, SIDE, SIDE);
            target->disable();
            return picture;
        };
        const Picture plain = draw();
        makeShadows(1024);
        EXPECT_EQ(1, attached);
        shadows->render(*scene, camera.get());
        const Picture picture = draw();
        const double texel = tried.type == Light::LightType::SPOT ? 20.0 / 1024 : 26.0 / 1024;
        const auto [someLit, someDark] =
            compare(plain, picture, texel, std::to_string(round) + tried.program);
        lit += someLit;
        dark += someDark;
        shadows = nullptr;
    }
    EXPECT_LT(20000, lit);
    EXPECT_LT(5000, dark);
}

// Fault caught: 0 / 0 at the height of a lamp, which draws a ceiling there black.
TEST_F(ShadowTest, ceilingsAtTheHeightOfALampKeepTheirLight)
{
    light->setLightType(Light::LightType::SPOT);
    light->setAmbientLevel(0.5f);
    light->setPosition(Vector3f(0, 3, 0));
    point(*light, Vector3f(), Vector3f(0, 0, -1));
    camera->setPosition(Vector3f(0, 1, 3.5f));
    point(*camera, Vector3f(0, 2, 0));
    for (const char* program : {"orv#max_pvl.sp$DIFF$AMBI", "orv#max_ppl.sp$DIFF$AMBI"})
    {
        shadows = nullptr;
        const auto white = makeWhite(program);
        white->setProperty("M_AMBIENT_COLOUR", Vector4f(1, 1, 1, 1));
        const auto ceiling = addCube(Vector3f(0, 3.5f, 0), Vector3f(4, 0.5f, 4), white);
        const auto floor = addCube(Vector3f(0, -0.5f, 0), Vector3f(4, 0.5f, 4), white);
        renderFrame();
        const Picture plain = support::readFrame();
        makeShadows();
        EXPECT_TRUE(support::comparePictures("ceiling", plain, drawShadowed(), {.perChannel = 1})) << program;
        EXPECT_LT(100, plain.pixel(32, 8).r);
        ceiling->setParent(nullptr);
        floor->setParent(nullptr);
    }
}

// Faults caught: holes missing in the shadow, or upside down; values of the material that do not reach the map, or not
// when they change.
TEST_F(ShadowTest, cutOutsThrowTheirHoles)
{
    const auto white = makeWhite("orv#max_ppl.sp$DIFF");
    makeStage(white);
    const auto material = makeWhite("orv#max_pvl.sp$DIFF$CUTOFF");
    const uint8_t texels[] = {255, 255, 255, 255, 255, 255, 255, 90,   // the upper row: a hole to the right
                              255, 255, 255, 255, 255, 255, 255, 255}; // the lower row
    const auto texture = pool->getTexture2DCache()->create(2, 2, Texture::Format::RGBA,
                                                           Texture::Type::UNSIGNED_BYTE, texels, nullptr);
    texture->setMinFilter(Texture2D::FilterMode::NEAREST);
    texture->setMagFilter(Texture2D::FilterMode::NEAREST);
    material->setProperty("M_DIFFUSE_TEXTURE", texture);
    material->setProperty("M_CUTOFF", 0.5f);
    const auto sheet = addSquare(Vector3f(0, 3, 0), 4.0f, material);
    sheet->setRotation(quaternionFromAxisAngle(Vector3f::X_AXIS, Anglef::fromDegrees(-90.0f))); // up is -z
    light->setPosition(Vector3f(3, 3, 0)); // 45 degrees: shadows move three units to the left
    point(*light, Vector3f());
    makeShadows();
    EXPECT_EQ(2, attached);
    const auto isDark = [&](const Picture& picture, float x, float z) { return at(picture, x, z).r < 10; };
    Picture picture = drawShadowed();
    EXPECT_FALSE(isDark(picture, -2.0f, -1.0f)) << support::savePicture("hole", picture);
    EXPECT_TRUE(isDark(picture, -4.0f, -1.0f) && isDark(picture, -4.0f, 1.0f) &&
                isDark(picture, -2.2f, 1.0f));
    material->setProperty("M_CUTOFF", 0.3f);
    picture = drawShadowed();
    EXPECT_TRUE(isDark(picture, -2.2f, -1.0f)) << support::savePicture("nohole", picture);
    material->setProperty("M_OPACITY", 0.7f);
    picture = drawShadowed();
    EXPECT_FALSE(isDark(picture, -2.2f, -1.0f)) << support::savePicture("opacity", picture);

    // Culled sides, blended solids and excluded ones let light through.
    material->setProperty("M_CUTOFF", 0.0f);
    sheet->setRotation(quaternionFromAxisAngle(Vector3f::X_AXIS, Anglef::fromDegrees(90.0f)));
    EXPECT_FALSE(isDark(drawShadowed(), -4.0f, 1.0f));
    material->setCullingMode(CullingMode::CULL_NONE);
    EXPECT_TRUE(isDark(drawShadowed(), -4.0f, 1.0f));
    constexpr FlagMask THROWS(1u, 1u);
    shadows->setThrowers(THROWS);
    EXPECT_TRUE(isDark(drawShadowed(), -4.0f, 1.0f));
    setFlags(*sheet, THROWS, false);
    EXPECT_FALSE(isDark(drawShadowed(), -4.0f, 1.0f));
    setFlags(*sheet, THROWS, true);
    material->setBlendFactors(BlendFactor::ONE, BlendFactor::ONE, BlendFactor::ONE, BlendFactor::ONE);
    EXPECT_FALSE(isDark(drawShadowed(), -4.0f, 1.0f));

    // So does a picture behind the scene, which is not in the world.
    const auto behind = makeShared<Appearance>();
    behind->setShaderProgram(makeProgram(
        "attribute vec3 a_position; void main() { gl_Position = vec4(a_position.xy, 0.99, 1.0); }",
        "void main() { gl_FragColor = vec4(1.0); }", {}));
    behind->setCullingMode(CullingMode::CULL_NONE);
    sheet->setAppearance(behind);
    EXPECT_FALSE(isDark(drawShadowed(), -4.0f, 1.0f));
}

// Faults caught: skins that cast the shadow of their rest pose, or of the last frame.
TEST_F(ShadowTest, skinsThrowTheShadowOfTheMoment)
{
    makeStage(makeWhite("orv#max_pvl.sp$DIFF"));
    const auto material = makeWhite("orv#max_ppl.sp$DIFF$SKIN");
    const auto figure = addCube(Vector3f(-2, 5, 0), Vector3f(1, 1, 1), material);
    const auto rest = makeShared<SceneNode>();
    const auto joint = makeShared<SceneNode>();
    joint->setParent(scene);
    figure->setJointsPerVertex(1);
    figure->attachJoint(rest, Matrix4f::IDENTITY);
    figure->attachJoint(joint, Matrix4f::IDENTITY); // which a mesh without a_joints follows
    light->setPosition(Vector3f(4, 4, 0));          // shadows move to the left by their height
    point(*light, Vector3f());
    makeShadows();
    for (const float x : {1.5f, 3.5f})
    {
        joint->setPosition(Vector3f(x, 4, 2)); // its top is at 5, its bottom at 3
        const Picture picture = drawShadowed();
        EXPECT_GT(10, at(picture, x - 4.0f, 2).r) << x << support::savePicture("skin", picture);
        EXPECT_LT(100, at(picture, x - 7.0f, 2).r) << x;
        EXPECT_LT(100, at(picture, -7.0f, 0).r) << "where the solid's own transform would put it";
        EXPECT_LT(100, at(picture, x - 4.0f, -2).r) << x;
    }
}

// Fault caught: shadows refused without a message.
TEST_F(ShadowTest, saysWhyThereAreNone)
{
    renderContext->addProperty(makeShared<ShaderUniform<float>>(1),
                               "S_MAP"); // the program's own, of another type
    LogCapture log;
    makeShadows();
    EXPECT_FALSE(shadows->isComplete());
    EXPECT_EQ(1, log.count('W')) << log.text();
    drawShadowed();
}

// Faults caught: a device that draws nothing, or wrongly, where it could do without shadows; more messages than one.
TEST_F(ShadowTest, weakDevicesDoWithout)
{
    makeStage(makeWhite("orv#max_ppl.sp$DIFF$SPEC$AMBI"));
    addCube(Vector3f(0, 2, 0), Vector3f(1, 1, 1), makeWhite("orv#max_pvl.sp$DIFF"));
    light->setPosition(Vector3f(3, 3, 0));
    point(*light, Vector3f());
    renderFrame();
    const Picture plain = support::readFrame();

    light->setLightType(Light::LightType::POINT);
    renderFrame();
    const Picture byPoint = support::readFrame();
    LogCapture log;
    makeShadows();
    drawShadowed();
    EXPECT_TRUE(support::comparePictures("point", byPoint, drawShadowed(), {.perChannel = 0}));
    EXPECT_EQ(1, log.count('W')) << log.text();
    shadows = nullptr;
    light->setLightType(Light::LightType::DIRECTIONAL);

    glcalls::replace(glCheckFramebufferStatus, [](GLenum) -> GLenum { return GL_FRAMEBUFFER_UNSUPPORTED; });
    makeShadows();
    EXPECT_FALSE(shadows->isComplete());
    EXPECT_EQ(0, attached);
    EXPECT_TRUE(support::comparePictures("target", plain, drawShadowed(), {.perChannel = 0}));
    shadows = nullptr;
    glcalls::restore(glCheckFramebufferStatus);

    const auto full = makeWhite("orv#max_ppl.sp$BUMP$DIFF$SPEC$AMBI$REFL$EMIS");
    addCube(Vector3f(0, -5, 0), Vector3f(1, 1, 1), full); // under the floor
    addCube(Vector3f(0, -5, 0), Vector3f(1, 1, 1),
            makeWhite("orv#max_ppl.sp$BUMP$DIFF$SPEC$AMBI$REFL$EMIS$VCOL"));
    const LogCapture roomLog;
    makeShadows();
    drawShadowed();
    EXPECT_EQ(2, attached);
    EXPECT_EQ(1, roomLog.count('W') + roomLog.count('E')) << roomLog.text();
    EXPECT_FALSE(full->getShaderProgram()->uniformExists("S_DEPTHS"));
}

// Faults caught: memory asked for in each frame; GL calls for materials or lights that did not change; state that the next
// frame finds changed; materials that keep their other programs, or a context that keeps the texture.
TEST_F(ShadowTest, framesCostWhatTheyShow)
{
    const auto white = makeWhite("orv#max_ppl.sp$DIFF");
    const auto before = white->getShaderProgram();
    makeCubeInSlantedLight(white);
    renderFrame();
    const Picture plain = support::readFrame();
    makeShadows();
    const Picture first = drawShadowed();
    EXPECT_NE(plain.rgba, first.rgba);
    drawShadowed();

    const uint64_t allocations = support::countAllocations();
    glcalls::resetCounts();
    shadows->render(*scene, camera.get());
    const uint64_t calls = glcalls::total();
    renderFrame();
    EXPECT_EQ(allocations, support::countAllocations());
    EXPECT_EQ(4u, glcalls::count(glDrawElements));
    EXPECT_GT(40u, calls);
    EXPECT_TRUE(support::comparePictures("again", first, support::readFrame(), {.perChannel = 0}));

    shadows = nullptr;
    EXPECT_EQ(before, white->getShaderProgram());
    EXPECT_FALSE(property<SharedPtr<Texture2D>>("S_DEPTHS"));
    renderFrame();
    EXPECT_TRUE(support::comparePictures("detached", plain, support::readFrame(), {.perChannel = 0}));
}

// Fault caught: a map that takes the shadows along of the one that has taken its place.
TEST_F(ShadowTest, mapsTakeTurns)
{
    const auto white = makeWhite("orv#max_ppl.sp$DIFF");
    const auto before = white->getShaderProgram();
    makeCubeInSlantedLight(white);
    makeShadows();
    const Picture first = drawShadowed();
    const ShadowMap::Ptr next = makeShared<ShadowMap>(renderContext, pool, 1024);
    EXPECT_EQ(1, next->attach(*scene));
    next->render(*scene, camera.get());
    shadows = nullptr;
    renderFrame();
    EXPECT_TRUE(support::comparePictures("turns", first, support::readFrame(), {.perChannel = 0}));
    next->detach();
    EXPECT_EQ(before, white->getShaderProgram());
}

// Faults caught: shadows that use objects of lost contexts, or that look different in the next one.
TEST_F(ShadowTest, nextContextHasTheSameShadows)
{
    Picture pictures[2];
    for (Picture& picture : pictures)
    {
        light = makeShared<Light>();
        light->setParent(scene);
        makeStage(makeWhite("orv#max_ppl.sp$DIFF"));
        addCube(Vector3f(1, 2, 0), Vector3f(1, 1, 1), makeWhite("orv#max_pvl.sp$DIFF"));
        makeShadows();
        EXPECT_EQ(2, attached);
        picture = drawShadowed();

        replaceContext();
        pool->forgetContext();
        shadows = nullptr;
        scene = makeShared<SceneNode>();
        camera = makeShared<Camera>();
        renderer = nullptr;
        renderContext = makeShared<RenderContext>();
        renderer = makeShared<SimpleRenderer>(renderContext, pool);
    }
    EXPECT_TRUE(support::comparePictures("lost", pictures[0], pictures[1], {.perChannel = 0}));
}

// Faults caught: programs that a device without highp in fragment shaders refuses, with all that it says about them.
TEST_F(ShadowTest, deviceWithoutPrecisionDoesWithout)
{
    glcalls::emulate({.name = "mediump", .hasFragmentHighp = false});
    makeStage(makeWhite("orv#max_ppl.sp$DIFF"));
    addCube(Vector3f(1, 2, 0), Vector3f(1, 1, 1), makeWhite("orv#max_pvl.sp$DIFF"));
    renderFrame();
    const Picture plain = support::readFrame();
    const LogCapture log;
    makeShadows();
    EXPECT_EQ(0, attached);
    EXPECT_TRUE(support::comparePictures("mediump", plain, drawShadowed(), {.perChannel = 0}));
    EXPECT_EQ(1, log.count('W') + log.count('E')) << log.text();
}

// Faults caught: programs that the smallest device has no room for, or materials that it would have had room for. What it
// has is counted by glcalls, not by the engine.
TEST_F(ShadowTest, smallestDeviceTakesWhatFits)
{
    glcalls::emulate(
        {.name = "small", .vertexUniformVectors = 128, .textureUnits = 8, .hasDepthTextures = false});
    makeStage(makeWhite("orv#max_ppl.sp$BUMP$DIFF$SPEC$AMBI$REFL$VCOL$CUTOFF$LINEAR$SKIN"));
    const char* const names[] = {"orv#max_pvl.sp$DIFF$SPEC$AMBI$REFL$EMIS$VCOL$CUTOFF$BACK$SKIN",
                                 "orv#max_pvl.sp$DIFF$SPEC$AMBI$REFL$CUBE$EMIS$VCOL$CUTOFF$BACK$LINEAR$SKIN",
                                 "orv#max_pvl.sp$DIFF$AMBI$REFL$LINEAR$SKIN", // no room
                                 "orv#max_pvl.sp$AMBI$REFL$EMIS$SKIN",
                                 "orv#max_pvl.sp$DIFF$UNLIT"}; // nothing is lit
    for (const char* name : names)
        addCube(Vector3f(0, 2, 0), Vector3f(1, 1, 1), makeWhite(name));
    const LogCapture log;
    makeShadows();
    EXPECT_EQ(3, attached);
    EXPECT_EQ(1, log.count('W') + log.count('E')) << log.text();
}
