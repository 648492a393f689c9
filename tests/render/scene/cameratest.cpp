#include "orv/camera.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

using namespace orv;

namespace
{

Matrix4f getProjection(Camera& camera, float aspect)
{
    Matrix4f projection;
    camera.getProjection(&projection, aspect);
    return projection;
}

/// To normalised device coordinates.
Vector3f project(const Matrix4f& projection, const Vector3f& p)
{
    const Vector4f clip = projection * Vector4f(p, 1.0f);
    return clip.xyz() / clip.w;
}

void expectNear(const Vector3f& expected, const Vector3f& actual)
{
    EXPECT_NEAR(0.0f, length(expected - actual), 1e-4f) << toString(actual);
}

} // namespace

// Fault caught: the field of view spanning the wrong side of the view.
TEST(Camera, fieldOfViewSpansTheShorterSide)
{
    Camera camera;
    camera.setFieldOfView(Anglef::fromDegrees(90.0f));
    camera.setNear(1.0f);
    camera.setFar(10.0f);
    const struct
    {
        float aspect;
        Vector3f corner; // upper right at the near plane
    } cases[] = {{1.0f, Vector3f(1, 1, -1)},
                 {2.0f, Vector3f(2, 1, -1)},
                 {0.5f, Vector3f(1, 2, -1)},
                 {0.0f, Vector3f(1, 1, -1)},
                 {std::numeric_limits<float>::infinity(), Vector3f(1, 1, -1)}};
    for (const auto& c : cases)
    {
        const Matrix4f projection = getProjection(camera, c.aspect);
        expectNear(Vector3f(1, 1, -1), project(projection, c.corner));
        expectNear(Vector3f(1, 1, 1), project(projection, c.corner * 10.0f));
    }
}

TEST(Camera, orthographicWidthSpansLeftToRight)
{
    Camera camera;
    camera.setProjectionType(Camera::ProjectionType::ORTHOGRAPHIC);
    camera.setWidth(8.0f);
    camera.setNear(2.0f);
    camera.setFar(6.0f);
    expectNear(Vector3f(1, 1, -1), project(getProjection(camera, 2.0f), Vector3f(4, 2, -2)));
    expectNear(Vector3f(-1, -1, 1), project(getProjection(camera, 2.0f), Vector3f(-4, -2, -6)));

    camera.setWidth(0.0f);
    camera.setFar(2.0f);
    for (int i = 0; i < 16; ++i)
        EXPECT_TRUE(std::isfinite(getProjection(camera, 2.0f).data()[i])) << i;
}

// Fault caught: a warning in every frame, since the distance put right was not stored.
TEST(Camera, putsClippingDistancesRightOnce)
{
    const struct
    {
        float nearGiven, farGiven, nearStored, farStored;
        int nearWarnings, rangeWarnings;
    } cases[] = {{0, 500, 0.5f, 500, 1, 0}, {3, 3, 1, 1000, 0, 1}, {0, 0, 1, 1000, 1, 1}};
    for (const auto& c : cases)
    {
        Camera camera;
        camera.setNear(c.nearGiven);
        camera.setFar(c.farGiven);
        support::LogCapture log;
        Matrix4f left, right;
        camera.getStereoProjection(&left, &right, 1.0f);
        EXPECT_EQ("", log.text());
        const Matrix4f first = getProjection(camera, 1.0f);
        EXPECT_EQ(c.nearStored, camera.getNear());
        EXPECT_EQ(c.farStored, camera.getFar());
        EXPECT_EQ(first, getProjection(camera, 1.0f));
        EXPECT_EQ(first, left) << "without separation";
        EXPECT_EQ(c.nearWarnings, log.countMessage("Near clipping distance modified to be non-zero."));
        EXPECT_EQ(c.rangeWarnings, log.countMessage("Clipping plane separation was zero."));
    }
}

// Fault caught: eyes swapped, or frustums and eye offsets that do not match, so that nothing fuses.
TEST(Camera, stereoPicturesMeetAtTheFocalDistance)
{
    for (const float aspect : {0.5f, 1.6f})
    {
        Camera camera;
        camera.setPosition(Vector3f(3, 4, 5));
        camera.setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(90.0f)));
        camera.setStereo(20.0f, 2.0f);
        Matrix4f projection[2], world[2];
        camera.getStereoProjection(&projection[0], &projection[1], aspect);
        camera.getStereoWorldTransform(&world[0], &world[1]);

        expectNear(Vector3f(3, 4, 6), world[0].columns[3].xyz()); // the camera's x axis is -z in the world
        expectNear(Vector3f(3, 4, 4), world[1].columns[3].xyz());

        const auto onPicture = [&](int eye, float distance)
        {
            const Vector4f place = camera.getWorldTransform() * Vector4f(0.5f, 1.0f, -distance, 1.0f);
            return project(projection[eye], (inverse(world[eye]) * place).xyz());
        };
        expectNear(onPicture(0, 20.0f), onPicture(1, 20.0f));
        EXPECT_GT(onPicture(0, 5.0f).x, onPicture(1, 5.0f).x) << "near things cross over";
        EXPECT_LT(onPicture(0, 80.0f).x, onPicture(1, 80.0f).x);
    }
}

TEST(Camera, warnsAboutSettingsWithoutEffect)
{
    const char END[] = " projection will have no visible effect until a ";
    const std::string inPerspective = std::string("PERSPECTIVE") + END + "ORTHOGRAPHIC projection is used.";
    const std::string inOrthographic = std::string("ORTHOGRAPHIC") + END + "PERSPECTIVE projection is used.";
    support::LogCapture log;
    Camera camera;
    camera.setFieldOfView(Anglef::fromDegrees(50.0f));
    camera.setStereo(10.0f, 1.0f);
    EXPECT_EQ("", log.text());
    camera.setWidth(4.0f);
    EXPECT_EQ(1, log.countMessage("Setting width while using an " + inPerspective));

    camera.setProjectionType(Camera::ProjectionType::ORTHOGRAPHIC);
    log.clear();
    camera.setWidth(5.0f);
    camera.setStereo(20.0f, 0.0f);
    EXPECT_EQ("", log.text());
    camera.setFieldOfView(Anglef::fromDegrees(70.0f));
    camera.setStereo(30.0f, 2.0f);
    EXPECT_EQ(1, log.countMessage("Setting FOV while using an " + inOrthographic));
    EXPECT_EQ(1, log.countMessage("Setting stereo parameters while using an " + inOrthographic));

    Matrix4f left, right;
    camera.getStereoProjection(&left, &right, 1.5f);
    EXPECT_EQ(getProjection(camera, 1.5f), left);
    EXPECT_EQ(left, right);
    camera.getStereoWorldTransform(&left, &right);
    EXPECT_EQ(left, right) << "no visible effect";
}
