#include "orv/plane.h"
#include "orv/ray.h"
#include "orv/sharedptr.h"
#include "orv/sphere.h"
#include "orv/square.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace orv;

// Fault caught: distances in the shape's own units instead of the world's, hits behind the ray dropped, the far
// root of the sphere, and NaN from rays and shapes without extent.
TEST(Shape, raycast)
{
    const Matrix4f& identity = Matrix4f::IDENTITY;
    const Matrix4f doubled = scaleMatrix(Vector3f(2, 2, 2));
    const Matrix4f flat = scaleMatrix(Vector3f(1, 0, 1));
    const Matrix4f stretched = translationMatrix(Vector3f(0, 0, 1)) * scaleMatrix(Vector3f(1, 1, 4));
    const Matrix4f aside = translationMatrix(Vector3f(10, 0, 0)) *
                           toMatrix4(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(90)));
    const Ray down = {Vector3f(0, 0, 5), Vector3f(0, 0, -2)};
    const Ray up = {Vector3f(0, 0, 5), Vector3f(0, 0, 2)};
    const Ray along = {Vector3f(0, 0, 5), Vector3f(1, 0, 0)};
    const Ray edge = {Vector3f(0.5f, -0.5f, 5), Vector3f(0, 0, -1)};
    const Ray beside = {Vector3f(0.51f, 0, 5), Vector3f(0, 0, -1)};
    const Ray still = {Vector3f(0, 0, 0.1f), Vector3f()};
    const Ray broken = {Vector3f(0, 0, 5), Vector3f(0, 0, std::nanf(""))};
    const struct
    {
        const char* name;
        SharedPtr<Shape> shape;
        Ray ray;
        bool hit;
        float distance;
        Vector3f normal;
    } cases[] = {
        {"plane", makeShared<Plane>(identity), down, true, 5, Vector3f::Z_AXIS},
        {"plane behind", makeShared<Plane>(identity), up, true, -5, Vector3f::Z_AXIS},
        {"plane alongside", makeShared<Plane>(identity), along, false, 0, Vector3f()},
        {"plane turned", makeShared<Plane>(aside), along, true, 10, Vector3f::X_AXIS},
        {"plane flat in y", makeShared<Plane>(flat), down, false, 0, Vector3f()},
        {"plane, broken ray", makeShared<Plane>(identity), broken, false, 0, Vector3f()},
        {"square corner", makeShared<Square>(identity), edge, true, 5, Vector3f::Z_AXIS},
        {"square beside", makeShared<Square>(identity), beside, false, 0, Vector3f()},
        {"square doubled", makeShared<Square>(doubled), beside, true, 5, Vector3f::Z_AXIS},
        {"square alongside", makeShared<Square>(identity), along, false, 0, Vector3f()},
        {"sphere", makeShared<Sphere>(identity), down, true, 4.5f, Vector3f::Z_AXIS},
        {"sphere behind", makeShared<Sphere>(identity), up, true, -4.5f, Vector3f::Z_AXIS},
        {"sphere doubled", makeShared<Sphere>(doubled), down, true, 4, Vector3f::Z_AXIS},
        {"sphere stretched", makeShared<Sphere>(stretched), down, true, 2, Vector3f::Z_AXIS},
        {"sphere beside", makeShared<Sphere>(identity), beside, false, 0, Vector3f()},
        {"sphere from inside, nearer behind", makeShared<Sphere>(identity),
         Ray{Vector3f(0, 0, 0.25f), Vector3f(0, 0, -3)}, true, -0.25f, Vector3f::Z_AXIS},
        {"sphere, still ray", makeShared<Sphere>(identity), still, false, 0, Vector3f()},
        {"sphere, broken ray", makeShared<Sphere>(identity), broken, false, 0, Vector3f()},
    };
    for (const auto& c : cases)
    {
        SCOPED_TRACE(c.name);
        const RaycastResult result = c.shape->raycast(c.ray);
        EXPECT_EQ(c.hit, result.hit);
        EXPECT_NEAR(c.distance, result.distance, 1e-5f);
        EXPECT_NEAR(0.0f, length(c.normal - result.normal), 1e-5f) << toString(result.normal);
    }
}
