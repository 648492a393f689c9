#include "scenetest.h"

#include "orv/filetostring.h"
#include "orv/stream.h"

#include <GLES2/gl2.h>

#include <cmath>
#include <limits>
#include <random>
#include <set>
#include <sstream>

using namespace orv;
using support::LogCapture;
using support::Rgba;

class SimpleRendererTest : public SceneTest
{
protected:
    SharedPtr<Light> addLight(Light::LightType type)
    {
        auto light = makeShared<Light>();
        light->setLightType(type);
        light->setParent(scene);
        return light;
    }
};

// Fault caught: a material that leaves a value out and is drawn with what the last one sent.
TEST_F(SimpleRendererTest, everyMaterialValueOfTheBuiltInProgramsHasADefault)
{
    const std::set<std::string> ofThePass = {"M_SHARP_TEXTURE",
                                             "M_VELOCITY_TEXTURE"}; // set by the blur renderer itself
    int count = 0;
    for (const char* program : {"orv#max_pvl.sp", "orv#max_ppl.sp", "orv#fallback.sp", "orv#error.sp",
                                "luvane#blur.sp", "luvane#depthoffield.sp", "luvane#fog.sp", "luvane#quad.sp",
                                "luvane#quad_premultiply.sp", "luvane#ripple.sp", "luvane#textfadequad.sp",
                                "luvane#vidquad.sp", "luvane#weather.sp", "orv#motionblur.sp"})
    {
        const SharedPtr<Stream> stream = pool->getStream(program);
        ASSERT_TRUE(stream) << program;
        const FileToString text(*stream);
        std::istringstream words(text.getStart());
        for (std::string word, uniform, name; words >> word;)
        {
            if (word != "uniform" || !(words >> uniform >> name) || name.rfind("M_", 0) != 0)
                continue;
            ++count;
            EXPECT_TRUE(renderContext->getProperty(name.c_str()) || ofThePass.count(name))
                << program << ": " << name;
        }
    }
    EXPECT_LT(50, count);
    EXPECT_EQ(1.0f, property<float>("M_WEATHER_STRETCH"));
    const SharedPtr<Texture2D> flat = property<SharedPtr<Texture2D>>("M_BUMP_TEXTURE");
    EXPECT_TRUE(flat && flat->getWidth() == 1);
}

// Faults caught: the products in another order, by which what is far from the origin jumps before a camera beside it;
// a short cut for projections that are not of its kind.
TEST_F(SimpleRendererTest, modelViewProjectionIsProjectionTimesModelView)
{
    const auto multiply = [](const Matrix4f& a, const Matrix4f& b)
    {
        Matrix4f product;
        for (int column = 0; column < 4; ++column)
        {
            for (int row = 0; row < 4; ++row)
            {
                float sum = 0.0f;
                for (int i = 0; i < 4; ++i)
                    sum += a[i][row] * b[column][i];
                product[column][row] = sum;
            }
        }
        return product;
    };
    std::mt19937 random(1);
    std::uniform_real_distribution<float> number(-2.0f, 2.0f);
    const auto vector = [&] { return Vector3f(number(random), number(random), number(random)); };
    const auto solid = addSquare(Vector3f(), 1.0f, makePaint(Colour4f::RED));
    for (int i = 0; i < 100; ++i)
    {
        const float offset = i % 2 ? 100000.0f : 0.0f;
        camera->setPosition(vector() + Vector3f(offset, 0, 0));
        point(*camera, Vector3f(offset, 0, 0));
        solid->setPosition(vector() + Vector3f(offset, 0, 0));
        solid->setRotation(quaternionFromAxisAngle(vector(), Anglef::fromRadians(number(random))));
        solid->setScale(i % 3 ? vector() : Vector3f(1, 1, 1));
        if (i % 7 == 0)
            solid->setLocalTransform(Matrix4f(Vector4f(vector(), number(random)), Vector4f(vector(), 0.5f),
                                              Vector4f(vector(), 0.25f), Vector4f(vector(), 2.0f)));
        camera->setProjectionType(i % 5 ? Camera::ProjectionType::PERSPECTIVE
                                        : Camera::ProjectionType::ORTHOGRAPHIC);
        render();
        Matrix4f projection;
        camera->getProjection(&projection, 1.0f);
        const Matrix4f modelView = multiply(inverse(camera->getWorldTransform()), solid->getWorldTransform());
        const Matrix4f expected = multiply(projection, modelView);
        EXPECT_EQ(expected, property<Matrix4f>("T_MODEL_VIEW_PROJECTION")) << i;
        EXPECT_EQ(modelView, property<Matrix4f>("T_MODEL_VIEW")) << i;
    }

    // The right eye is the last one drawn.
    camera->setProjectionType(Camera::ProjectionType::PERSPECTIVE);
    camera->setStereo(4.0f, 0.5f);
    render();
    Matrix4f projections[2], eyes[2];
    camera->getStereoProjection(&projections[0], &projections[1], 1.0f);
    camera->getStereoWorldTransform(&eyes[0], &eyes[1]);
    EXPECT_EQ(multiply(projections[1], multiply(inverse(eyes[1]), solid->getWorldTransform())),
              property<Matrix4f>("T_MODEL_VIEW_PROJECTION"));

    // At rest before the camera, wherever the two are.
    camera->setStereo(4.0f, 0.0f);
    camera->setRotation(Quaternionf());
    solid->setRotation(Quaternionf());
    solid->setScale(Vector3f(2, 2, 2));
    const auto placeAt = [&](float x)
    {
        camera->setPosition(Vector3f(x, x, 3));
        solid->setPosition(Vector3f(x + 0.5f, x + 0.5f, 0));
        render();
        return property<Matrix4f>("T_MODEL_VIEW_PROJECTION");
    };
    const Matrix4f expected = placeAt(0.0f);
    for (int i = 0; i < 20; ++i)
        EXPECT_EQ(expected, placeAt(100000.0f + 0.0625f * float(i)));
}

// Faults caught: directions of the wrong axis or unnormalised, half cones taken for full ones, distances that
// ignore the light's scale, a fall-off that divides by zero.
TEST_F(SimpleRendererTest, publishesLights)
{
    const auto point = addLight(Light::LightType::POINT);
    point->setPosition(Vector3f(1, 2, 3));
    point->setScale(Vector3f(2, 1, 1));
    point->setColour(Colour4f(1.0f, 0.5f, 0.25f, 1.0f));
    point->setIntensity(2.0f);
    point->setAmbientLevel(0.25f);
    point->setAttenuated(true);
    point->setAttenuationNear(-5.0f);
    point->setAttenuationFar(15.0f);
    point->setActive(false); // still shines

    const auto sun = addLight(Light::LightType::DIRECTIONAL);
    sun->setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(90.0f)));
    sun->setScale(Vector3f(3, 3, 3));

    const auto spot = addLight(Light::LightType::SPOT);
    spot->setSpotInnerAngle(Anglef::fromDegrees(30.0f));
    spot->setSpotOuterAngle(Anglef::fromDegrees(-60.0f));
    spot->setAttenuated(true);
    spot->setAttenuationNear(10.0f);
    spot->setAttenuationFar(5.0f);
    render();

    EXPECT_EQ(3, property<int>("L_COUNT"));
    EXPECT_EQ(Vector4f(1, 2, 3, 1), property<Vector4f>("L_POSITION", 0));
    EXPECT_EQ(Vector4f(2, 1, 0.5f, 2), property<Vector4f>("L_DIFFUSE_COLOUR", 0));
    EXPECT_EQ(Vector4f(2, 1, 0.5f, 2), property<Vector4f>("L_SPECULAR_COLOUR", 0));
    EXPECT_EQ(Vector4f(0.5f, 0.25f, 0.125f, 0.5f), property<Vector4f>("L_AMBIENT_COLOUR", 0));
    EXPECT_EQ(10.0f, property<float>("L_ATTENUATION_NEAR", 0));
    EXPECT_FLOAT_EQ(1.0f / 20.0f, property<float>("L_ATTENUATION_RECIPROCAL", 0));
    EXPECT_EQ(-1.0f, property<float>("L_SPOT_INNER_COS", 0));
    EXPECT_EQ(-1.0f, property<float>("L_SPOT_OUTER_COS", 0));

    const Vector4f towardsSun = property<Vector4f>("L_POSITION", 1);
    EXPECT_NEAR(1.0f, towardsSun.x, 1e-5f);
    EXPECT_EQ(0.0f, towardsSun.w);
    EXPECT_EQ(0.0f, property<float>("L_ATTENUATION_RECIPROCAL", 1));

    EXPECT_NEAR(std::cos(3.14159265f / 12.0f), property<float>("L_SPOT_INNER_COS", 2), 1e-6f);
    EXPECT_NEAR(std::cos(3.14159265f / 6.0f), property<float>("L_SPOT_OUTER_COS", 2), 1e-6f);
    EXPECT_EQ(Vector3f(0, 0, 1), property<Vector3f>("L_SPOT_DIRECTION", 2));
    EXPECT_EQ(10.0f, property<float>("L_ATTENUATION_NEAR", 2));
    EXPECT_NEAR(1000.0f, property<float>("L_ATTENUATION_RECIPROCAL", 2), 5.0f);
    spot->setAttenuationNear(1e6f); // where floats are coarser than the least difference
    for (int i = 3; i < 7; ++i)
        addLight(Light::LightType::POINT)->setIntensity(float(i));
    render();
    EXPECT_NEAR(1000.0f, property<float>("L_ATTENUATION_RECIPROCAL", 2), 5.0f);
    EXPECT_EQ(5, property<int>("L_COUNT")) << "the first five";
    EXPECT_EQ(4.0f, property<Vector4f>("L_DIFFUSE_COLOUR", 4).x);
}

TEST_F(SimpleRendererTest, publishesTransforms)
{
    const auto square = addSquare(Vector3f(1, 2, 0), 1.0f, makePaint(Colour4f::WHITE));
    square->setScale(Vector3f(2, 4, -0.5f));
    renderer->update(61.5f);
    render();
    const Matrix4f view = translationMatrix(Vector3f(0, 0, -3));
    const Matrix4f model = square->getWorldTransform();
    Matrix4f projection;
    camera->getProjection(&projection, 1.0f);
    EXPECT_EQ(1.5f, property<float>("TIME"));
    EXPECT_EQ(model, property<Matrix4f>("T_MODEL"));
    EXPECT_EQ(view, property<Matrix4f>("T_VIEW"));
    EXPECT_EQ(view * model, property<Matrix4f>("T_MODEL_VIEW"));
    EXPECT_EQ(projection * view, property<Matrix4f>("T_VIEW_PROJECTION"));
    EXPECT_EQ(projection * (view * model), property<Matrix4f>("T_MODEL_VIEW_PROJECTION"));
    EXPECT_EQ(Vector4f(0, 0, 3, 1), property<Vector4f>("T_CAMERA_POSITION"));
    EXPECT_EQ(Matrix3f(Vector3f(0.5f, 0, 0), Vector3f(0, 0.25f, 0), Vector3f(0, 0, -2)),
              property<Matrix3f>("T_NORMAL_MODEL"));

    square->setScale(Vector3f(1, 1, 0));
    renderer->render(nullptr, *scene, FlagMask(), FlagMask());
    EXPECT_EQ(Vector3f(0, 0, 1), property<Matrix3f>("T_NORMAL_MODEL").columns[2]) << "flat, not gone";
    EXPECT_EQ(square->getWorldTransform(), property<Matrix4f>("T_MODEL_VIEW_PROJECTION")) << "no camera";
}

// Faults caught: a second renderer that logs an error for every name and writes what is never read; one whose
// end takes the textures from the other.
TEST_F(SimpleRendererTest, renderersShareTheContextsProperties)
{
    LogCapture log;
    auto second = makeShared<SimpleRenderer>(renderContext, pool);
    EXPECT_EQ("", log.text());
    renderContext->setViewport(0, 0, 64, 64);
    second->update(2.0f);
    second->render(camera.get(), *scene, FlagMask(), FlagMask());
    EXPECT_EQ(2.0f, property<float>("TIME"));
    second = nullptr;
    EXPECT_TRUE(property<SharedPtr<Texture2D>>("M_WHITE_TEXTURE"));

    const auto otherContext = makeShared<RenderContext>();
    otherContext->addProperty(makeShared<ShaderUniform<float>>(1), "L_POSITION");
    auto own = makeShared<ShaderUniform<float>>(1);
    own->set(0.5f);
    otherContext->addProperty(own, "M_OPACITY");
    const auto third = makeShared<SimpleRenderer>(otherContext, pool);
    EXPECT_EQ(1, log.count('E')) << "a property that cannot hold what it must";
    EXPECT_EQ(0.5f, own->get()) << "the application's default stays";
    addLight(Light::LightType::POINT);
    third->render(nullptr, *scene, FlagMask(), FlagMask());
}

TEST_F(SimpleRendererTest, reportsSolidsThatCannotBeDrawn)
{
    const auto solid = makeShared<Solid>();
    solid->setParent(scene);
    LogCapture log;
    render();
    EXPECT_EQ(1, log.countMessage("ORV_ASSERT: appearance"));
    solid->setAppearance(makeShared<Appearance>());
    render();
    EXPECT_EQ(1, log.countMessage("ORV_ASSERT: program"));
}

// Fault caught: halves on the wrong side or not given back.
TEST_F(SimpleRendererTest, stereoDrawsTwoHalves)
{
    addSquare(Vector3f(0, 0, 0), 1.0f, makePaint(Colour4f::RED)); // near: towards the nose in both pictures
    camera->setStereo(20.0f, 1.0f);
    glcalls::startRecording();
    renderFrame();
    EXPECT_EQ((std::vector<std::string>{"glViewport(0, 0, 32, 64)", "glViewport(32, 0, 32, 64)",
                                        "glViewport(0, 0, 64, 64)"}),
              glcalls::recorded("glViewport"));
    glcalls::stopRecording();
    const support::Picture frame = support::readFrame();
    for (const auto& [x, red] : {std::pair(19, 255), std::pair(12, 0), std::pair(44, 255), std::pair(51, 0)})
        EXPECT_EQ(red, frame.pixel(x, 32).r) << x;

    camera->setStereo(20.0f, 0.0f);
    glcalls::resetCounts();
    renderFrame();
    EXPECT_EQ(0u, glcalls::count(glViewport)) << "mono, whatever the focal distance";
}

// Faults caught: near before far, keys that are not numbers upsetting the sort, blending left off.
TEST_F(SimpleRendererTest, transparentSolidsAreDrawnBackToFront)
{
    const auto makeGlass = [this](const Colour4f& colour)
    {
        const auto appearance = makePaint(colour);
        appearance->setBlendFactors(BlendFactor::SRC_ALPHA, BlendFactor::ONE,
                                    BlendFactor::ONE_MINUS_SRC_ALPHA, BlendFactor::ONE_MINUS_SRC_ALPHA);
        appearance->setDepthWriteEnabled(false);
        return appearance;
    };
    const auto red = makeGlass(Colour4f(1, 0, 0, 0.5f));
    const auto green = makeGlass(Colour4f(0, 1, 0, 0.5f));
    for (int i = 0; i < 40; ++i)
        addSquare(Vector3f(std::numeric_limits<float>::quiet_NaN(), 0, 0), 1.0f, red);
    const auto greenSquare = addSquare(Vector3f(0, 0, 1), 4.0f, green);
    const auto redSquare = addSquare(Vector3f(0, 0, -1), 8.0f, red);
    addSquare(Vector3f(0, 0, -2), 20.0f, makePaint(Colour4f::BLUE));
    renderFrame();
    const Rgba greenInFront = support::readFrame().pixel(32, 32);
    EXPECT_TRUE(support::isNear({64, 128, 64, 255}, greenInFront, 2)) << greenInFront;

    greenSquare->setPosition(Vector3f(0, 0, -1));
    greenSquare->setScale(Vector3f(8, 8, 8));
    redSquare->setPosition(Vector3f(0, 0, 1));
    renderFrame();
    const Rgba redInFront = support::readFrame().pixel(32, 32);
    EXPECT_TRUE(support::isNear({128, 64, 64, 255}, redInFront, 2)) << redInFront;
}
