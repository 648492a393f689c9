#include "orv/matrix.h"

#include "orv/detail/lanes.h"

#include <algorithm>
#include <cmath>
#include <initializer_list>
#include <limits>

namespace orv
{

namespace
{

// Determinants and inverses are worked out in double precision: the products of a few small scale factors
// leave the range of a float long before the matrix itself becomes useless.
using Vector3d = Vector3<double>;

Vector3d widen(const Vector3f& v)
{
    return Vector3d(v.x, v.y, v.z);
}

/// The 2x2 determinants of the left (s) and right (c) pair of columns, from which follow the determinant and
/// every cofactor of a 4x4 matrix. s[i] and c[5 - i] come from complementary rows.
struct PairDeterminants
{
    double s[6];
    double c[6];

    explicit PairDeterminants(const Matrix4f& m)
    {
        static constexpr int ROWS[6][2] = {{0, 1}, {0, 2}, {0, 3}, {1, 2}, {1, 3}, {2, 3}};
        const float* e = m.data();
        for (int i = 0; i < 6; ++i)
        {
            const int p = ROWS[i][0];
            const int q = ROWS[i][1];
            s[i] = double(e[p]) * e[4 + q] - double(e[q]) * e[4 + p];
            c[i] = double(e[8 + p]) * e[12 + q] - double(e[8 + q]) * e[12 + p];
        }
    }

    double determinant() const
    {
        return s[0] * c[5] - s[1] * c[4] + s[2] * c[3] + s[3] * c[2] - s[4] * c[1] + s[5] * c[0];
    }
};

/// Writes values / divisor.
/// @return false if one of the results is not a finite float.
bool divideInto(float* results, const double* values, int count, double divisor)
{
    for (int i = 0; i < count; ++i)
    {
        results[i] = float(values[i] / divisor);
        if (!std::isfinite(results[i]))
            return false;
    }
    return true;
}

std::string columnLines(const char* name, std::initializer_list<std::string> columns)
{
    std::string text = std::string(name) + "(";
    const char* separator = "\n  ";
    for (const std::string& column : columns)
    {
        text.append(separator).append(column);
        separator = ", \n  ";
    }
    return text + "\n)";
}

} // namespace

Matrix4f detail::multiply(const Matrix4f& m, const Matrix4f& n)
{
    // A copy, so that it stays in registers: as far as the compiler knows, the result may lie in m.
    const Matrix4f left = m;
    const auto weigh = [&left](const Vector4f& v) __attribute__((always_inline))
    {
        return left.columns[0] * v.x + left.columns[1] * v.y + left.columns[2] * v.z + left.columns[3] * v.w;
    };
    return Matrix4f(weigh(n.columns[0]), weigh(n.columns[1]), weigh(n.columns[2]), weigh(n.columns[3]));
}

Matrix2f transpose(const Matrix2f& m)
{
    return Matrix2f(Vector2f(m.columns[0].x, m.columns[1].x), Vector2f(m.columns[0].y, m.columns[1].y));
}

Matrix3f transpose(const Matrix3f& m)
{
    return Matrix3f(Vector3f(m.columns[0].x, m.columns[1].x, m.columns[2].x),
                    Vector3f(m.columns[0].y, m.columns[1].y, m.columns[2].y),
                    Vector3f(m.columns[0].z, m.columns[1].z, m.columns[2].z));
}

Matrix4f transpose(const Matrix4f& m)
{
    return Matrix4f(Vector4f(m.columns[0].x, m.columns[1].x, m.columns[2].x, m.columns[3].x),
                    Vector4f(m.columns[0].y, m.columns[1].y, m.columns[2].y, m.columns[3].y),
                    Vector4f(m.columns[0].z, m.columns[1].z, m.columns[2].z, m.columns[3].z),
                    Vector4f(m.columns[0].w, m.columns[1].w, m.columns[2].w, m.columns[3].w));
}

float determinant(const Matrix3f& m)
{
    return float(dot(widen(m.columns[0]), cross(widen(m.columns[1]), widen(m.columns[2]))));
}

float determinant(const Matrix4f& m)
{
    return float(PairDeterminants(m).determinant());
}

Matrix3f inverse(const Matrix3f& m)
{
    const Vector3d a = widen(m.columns[0]);
    const Vector3d b = widen(m.columns[1]);
    const Vector3d c = widen(m.columns[2]);
    const Vector3d rows[3] = {cross(b, c), cross(c, a), cross(a, b)};

    double values[9];
    for (int column = 0; column < 3; ++column)
        for (int row = 0; row < 3; ++row)
            values[column * 3 + row] = rows[row][column];

    float results[9];
    if (!divideInto(results, values, 9, dot(a, rows[0])))
        return Matrix3f();
    return Matrix3f(Vector3f(results[0], results[1], results[2]),
                    Vector3f(results[3], results[4], results[5]),
                    Vector3f(results[6], results[7], results[8]));
}

Matrix4f inverse(const Matrix4f& m)
{
    const PairDeterminants pairs(m);
    const double* s = pairs.s;
    const double* c = pairs.c;
    const Vector4f& m0 = m.columns[0];
    const Vector4f& m1 = m.columns[1];
    const Vector4f& m2 = m.columns[2];
    const Vector4f& m3 = m.columns[3];
    const double values[16] = {
        m1.y * c[5] - m1.z * c[4] + m1.w * c[3],  -m0.y * c[5] + m0.z * c[4] - m0.w * c[3],
        m3.y * s[5] - m3.z * s[4] + m3.w * s[3],  -m2.y * s[5] + m2.z * s[4] - m2.w * s[3],

        -m1.x * c[5] + m1.z * c[2] - m1.w * c[1], m0.x * c[5] - m0.z * c[2] + m0.w * c[1],
        -m3.x * s[5] + m3.z * s[2] - m3.w * s[1], m2.x * s[5] - m2.z * s[2] + m2.w * s[1],

        m1.x * c[4] - m1.y * c[2] + m1.w * c[0],  -m0.x * c[4] + m0.y * c[2] - m0.w * c[0],
        m3.x * s[4] - m3.y * s[2] + m3.w * s[0],  -m2.x * s[4] + m2.y * s[2] - m2.w * s[0],

        -m1.x * c[3] + m1.y * c[1] - m1.z * c[0], m0.x * c[3] - m0.y * c[1] + m0.z * c[0],
        -m3.x * s[3] + m3.y * s[1] - m3.z * s[0], m2.x * s[3] - m2.y * s[1] + m2.z * s[0],
    };

    float results[16];
    if (!divideInto(results, values, 16, pairs.determinant()))
        return Matrix4f();
    return Matrix4f(Vector4f(results[0], results[1], results[2], results[3]),
                    Vector4f(results[4], results[5], results[6], results[7]),
                    Vector4f(results[8], results[9], results[10], results[11]),
                    Vector4f(results[12], results[13], results[14], results[15]));
}

Matrix4f translationMatrix(const Vector3f& offset)
{
    Matrix4f m = Matrix4f::IDENTITY;
    m.columns[3] = Vector4f(offset, 1.0f);
    return m;
}

Matrix4f scaleMatrix(const Vector3f& factors)
{
    Matrix4f m;
    m.columns[0].x = factors.x;
    m.columns[1].y = factors.y;
    m.columns[2].z = factors.z;
    m.columns[3].w = 1.0f;
    return m;
}

Matrix3f toMatrix3(const Quaternionf& q)
{
    return upper3x3(toMatrix4(q));
}

Matrix4f toMatrix4(const Quaternionf& q)
{
    Matrix4f result;
    detail::store(result, detail::makeRigid(q, Vector3f()));
    return result;
}

Matrix4f lookAt(const Vector3f& eye, const Vector3f& target, const Vector3f& up)
{
    static constexpr float SMALLEST_SINE = 1e-6f;
    const Vector3f back = normalize(eye - target);
    if (back == Vector3f())
        return translationMatrix(eye);

    Vector3f side = cross(normalize(up), back);
    if (!(length(side) > SMALLEST_SINE))
        side = cross(std::fabs(back.y) < 0.9f ? Vector3f::Y_AXIS : Vector3f::Z_AXIS, back);
    side = normalize(side);
    return Matrix4f(Vector4f(side, 0.0f), Vector4f(cross(back, side), 0.0f), Vector4f(back, 0.0f),
                    Vector4f(eye, 1.0f));
}

/// The square root of the largest row sum of transpose(m) * m, an upper bound of its eigenvalues.
float detail::getStretch(const Matrix4f& m)
{
    if (!isAffine(m))
        return std::numeric_limits<float>::infinity();
    const Vector3f x = m.columns[0].xyz();
    const Vector3f y = m.columns[1].xyz();
    const Vector3f z = m.columns[2].xyz();
    const float xy = std::fabs(dot(x, y));
    const float yz = std::fabs(dot(y, z));
    const float zx = std::fabs(dot(z, x));
    return std::sqrt(std::max({dot(x, x) + xy + zx, dot(y, y) + xy + yz, dot(z, z) + yz + zx}));
}

std::string toString(const Matrix2f& m)
{
    return columnLines("Matrix2f", {toString(m[0]), toString(m[1])});
}

std::string toString(const Matrix3f& m)
{
    return columnLines("Matrix3f", {toString(m[0]), toString(m[1]), toString(m[2])});
}

std::string toString(const Matrix4f& m)
{
    return columnLines("Matrix4f", {toString(m[0]), toString(m[1]), toString(m[2]), toString(m[3])});
}

} // namespace orv
