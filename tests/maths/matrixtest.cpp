#include "orv/matrix.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

using namespace orv;

namespace
{

void expectNear(const Vector4f& expected, const Vector4f& actual, float tolerance)
{
    const Vector4f off = expected - actual;
    EXPECT_NEAR(0.0f, std::sqrt(dot(off, off)), tolerance) << toString(actual);
}

void expectNear(const Matrix4f& expected, const Matrix4f& actual, float tolerance)
{
    for (int i = 0; i < 4; ++i)
        expectNear(expected[i], actual[i], tolerance);
}

Matrix4f someTransform()
{
    const Vector3f axis = normalize(Vector3f(1, 2, 3));
    return translationMatrix(Vector3f(4, -5, 6)) *
           toMatrix4(quaternionFromAxisAngle(axis, Anglef::fromDegrees(50))) *
           scaleMatrix(Vector3f(2, 3, -0.5f));
}

} // namespace

// Fault caught: rows for columns, which turns every transform into its transpose.
TEST(Matrix, columnsAreWeightedByTheVector)
{
    const Matrix2f two(Vector2f(1, 2), Vector2f(3, 4));
    EXPECT_EQ(Vector2f(1 * 5 + 3 * 6, 2 * 5 + 4 * 6), two * Vector2f(5, 6));
    EXPECT_EQ(Matrix2f(Vector2f(1, 3), Vector2f(2, 4)), transpose(two));

    const Matrix3f three(Vector3f(1, 2, 3), Vector3f(4, 5, 6), Vector3f(7, 8, 9));
    EXPECT_EQ(Vector3f(4, 5, 6), three * Vector3f::Y_AXIS);
    EXPECT_EQ(Matrix3f(Vector3f(1, 4, 7), Vector3f(2, 5, 8), Vector3f(3, 6, 9)), transpose(three));

    const Matrix4f moveThenScale = scaleMatrix(Vector3f(2, 2, 2)) * translationMatrix(Vector3f(1, 2, 3));
    EXPECT_EQ(Vector4f(4, 6, 8, 1), moveThenScale * Vector4f(1, 1, 1, 1)) << "the right one acts first";
    EXPECT_EQ(2.0f, moveThenScale.data()[12]) << "translation in the last column of GL's order";
    EXPECT_EQ(2.0f, transpose(moveThenScale)[0].w);
}

TEST(Matrix, indexOutOfRangeIsLoggedAndGivesTheFirstColumn)
{
    support::LogCapture log;
    const Matrix4f m = someTransform();
    EXPECT_EQ(m[0], m[4]);
    EXPECT_EQ(m[0], m[-1]);
    EXPECT_EQ(1, log.countMessage("Index (4) out of range [0, 3]"));
    EXPECT_EQ(1, log.countMessage("Index (-1) out of range [0, 3]"));
}

// Fault caught: a cofactor with the wrong sign or place.
TEST(Matrix, inverseUndoes)
{
    // Arbitrary, so that every one of the sixteen cofactors differs.
    const Matrix4f m(Vector4f(2, -1, 3, 5), Vector4f(7, 1, -4, 2), Vector4f(-3, 6, 1, 8),
                     Vector4f(1, 9, -2, -6));
    expectNear(Matrix4f::IDENTITY, m * inverse(m), 1e-5f);
    expectNear(Matrix4f::IDENTITY, inverse(m) * m, 1e-5f);
    expectNear(Matrix4f::IDENTITY, someTransform() * inverse(someTransform()), 1e-5f);
    EXPECT_NEAR(-3.0f, determinant(someTransform()), 1e-4f);
    EXPECT_NEAR(-3.0f, determinant(upper3x3(someTransform())), 1e-4f);

    const Matrix3f upper = upper3x3(m);
    const Matrix3f product = upper * inverse(upper);
    for (int i = 0; i < 3; ++i)
        expectNear(Matrix4f::IDENTITY[i], Vector4f(product[i], 0), 1e-5f);
}

// Fault caught: single precision, in which the determinant of a very small (or large) scale leaves the range.
TEST(Matrix, inverseOfExtremeScales)
{
    for (float scale : {1e-18f, 1e18f})
    {
        const Matrix4f m = scaleMatrix(Vector3f(scale, scale, scale));
        EXPECT_NEAR(1.0f, inverse(m)[1].y * scale, 1e-5f);
        EXPECT_NEAR(1.0f, inverse(upper3x3(m))[2].z * scale, 1e-5f);
    }
}

TEST(Matrix, withoutInverseComesZeroAndNeverNaN)
{
    const float infinity = std::numeric_limits<float>::infinity();
    const Matrix4f cases[] = {
        Matrix4f(),
        scaleMatrix(Vector3f(1, 0, 1)),
        Matrix4f(Vector4f(1, 2, 3, 0), Vector4f(1, 2, 3, 0), Vector4f(0, 0, 1, 0), Vector4f(0, 0, 0, 1)),
        scaleMatrix(Vector3f(1, infinity, 1)),
        scaleMatrix(Vector3f(1, 1, std::nanf(""))),
        scaleMatrix(Vector3f(1, 1, 1e-42f))}; // the inverse is beyond floats
    for (const Matrix4f& m : cases)
    {
        EXPECT_EQ(Matrix4f(), inverse(m)) << toString(m);
        EXPECT_EQ(Matrix3f(), inverse(upper3x3(m))) << toString(m);
    }
}

TEST(Matrix, rotationsTurnCounterClockwise)
{
    const Vector3f& x = Vector3f::X_AXIS;
    const Vector3f& y = Vector3f::Y_AXIS;
    const Vector3f& z = Vector3f::Z_AXIS;
    const Vector3f turns[3][3] = {{z, x, y}, {x, y, z}, {y, z, x}};
    for (const auto& [axis, from, to] : turns)
    {
        const Quaternionf q = quaternionFromAxisAngle(axis, Anglef::fromDegrees(90));
        expectNear(Vector4f(to, 0), Vector4f(toMatrix3(q) * from, 0), 1e-6f);
        // Fault caught: a file's axis of length 2 that skews instead of turning.
        expectNear(toMatrix4(q), toMatrix4(Quaternionf(q.a * 3, q.x * 3, q.y * 3, q.z * 3)), 1e-6f);
    }
    for (float size : {0.0f, 1e-20f, 1e25f, std::nanf("")}) // the squares leave the range of a float
        EXPECT_EQ(Matrix4f::IDENTITY, toMatrix4(Quaternionf(size, size, 0, 0))) << size;

    const Quaternionf p = quaternionFromAxisAngle(x, Anglef::fromDegrees(40));
    const Quaternionf q = quaternionFromAxisAngle(y, Anglef::fromDegrees(70));
    expectNear(toMatrix4(p) * toMatrix4(q), toMatrix4(p * q), 1e-6f);
}

// Fault caught: a camera that looks away from its target, lies on its side, or is NaN straight above it.
TEST(Matrix, lookAtFacesTheTarget)
{
    const struct
    {
        const char* name;
        Vector3f eye, target, up;
    } cases[] = {
        {"level", Vector3f(1, 2, 3), Vector3f(-4, 2, 1), Vector3f::Y_AXIS},
        {"from below", Vector3f(0, -9, 2), Vector3f(1, 1, 1), Vector3f(0, 5, 0)},
        {"straight down", Vector3f(0, 5, 0), Vector3f(0, 0, 0), Vector3f::Y_AXIS},
        {"straight along z", Vector3f(0, 0, 1), Vector3f(0, 0, 5), Vector3f::Z_AXIS},
        {"no up", Vector3f(1, 1, 1), Vector3f(0, 0, 0), Vector3f()},
    };
    for (const auto& c : cases)
    {
        SCOPED_TRACE(c.name);
        const Matrix4f m = lookAt(c.eye, c.target, c.up);
        const Vector3f sight = c.target - c.eye;
        expectNear(Vector4f(c.target, 1), m * Vector4f(0, 0, -length(sight), 1), 1e-5f);
        EXPECT_NEAR(1.0f, determinant(m), 1e-5f);
        EXPECT_GE(dot(m[1].xyz(), c.up), -1e-5f);
        EXPECT_NEAR(0.0f, dot(m[0].xyz(), c.up), 1e-5f) << "the horizon is level";
    }
    EXPECT_EQ(translationMatrix(Vector3f(1, 2, 3)),
              lookAt(Vector3f(1, 2, 3), Vector3f(1, 2, 3), Vector3f::Y_AXIS));
}

TEST(Matrix, textForms)
{
    EXPECT_EQ("Matrix2f(\n  Vector2f(1, 0), \n  Vector2f(0, 1)\n)",
              toString(Matrix2f(Vector2f(1, 0), Vector2f(0, 1))));
    EXPECT_EQ("Matrix4f(\n  Vector4f(1, 0, 0, 0), \n  Vector4f(0, 1, 0, 0), \n  Vector4f(0, 0, 1, 0), \n"
              "  Vector4f(7, 8, 9, 1)\n)",
              toString(translationMatrix(Vector3f(7, 8, 9))));
}
