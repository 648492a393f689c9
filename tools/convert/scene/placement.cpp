#include "placement.h"

#include "orv/matrix.h"
#include "orv/quaternion.h"

#include <algorithm>
#include <cmath>

namespace convert
{

using orv::Matrix4f;
using orv::Vector3f;
using orv::Vector4f;

namespace
{

/// Any direction perpendicular to v.
aiVector3D across(const aiVector3D& v)
{
    const aiVector3D axis = std::fabs(v.x) < 0.7f ? aiVector3D(1, 0, 0) : aiVector3D(0, 1, 0);
    return (v ^ axis).NormalizeSafe();
}

/// Makes the columns orthonormal and right-handed.
void orthonormalise(aiVector3D columns[3])
{
    const bool isNothing = std::all_of(
        columns, columns + 3, [](const aiVector3D& column) { return column.SquareLength() == 0.0f; });
    for (unsigned i = 0; isNothing && i < 3; ++i)
        columns[i][i] = 1.0f; // of scale zero: no rotation either, since it may grow
    if (columns[0].SquareLength() == 0.0f)
        columns[0] = columns[1] ^ columns[2];
    if (columns[0].Length() < 1e-6f)
        columns[0] = across(columns[columns[1].SquareLength() > 0.0f ? 1 : 2]);
    columns[0].Normalize();
    columns[1] -= columns[0] * (columns[0] * columns[1]);
    if (columns[1].Length() < 1e-6f)
        columns[1] = columns[2] ^ columns[0];
    columns[1] = columns[1].Length() < 1e-6f ? across(columns[0]) : columns[1].Normalize();
    columns[2] = columns[0] ^ columns[1];
}

float largestDifference(const Matrix4f& made, const aiMatrix4x4& wanted, float& largest)
{
    float difference = 0.0f;
    for (unsigned row = 0; row < 3; ++row)
    {
        for (unsigned column = 0; column < 3; ++column)
        {
            const float value = float(wanted[row][column]);
            difference = std::max(difference, std::fabs(made[int(column)][int(row)] - value));
            largest = std::max(largest, std::fabs(value));
        }
    }
    return difference;
}

} // namespace

Vector3f toVector(const aiVector3D& v)
{
    return Vector3f(float(v.x), float(v.y), float(v.z));
}

Matrix4f toMatrix(const aiMatrix4x4& m)
{
    Matrix4f made;
    for (unsigned row = 0; row < 4; ++row)
    {
        for (unsigned column = 0; column < 4; ++column)
            made[int(column)][int(row)] = float(m[row][column]);
    }
    return made;
}

Vector4f toAxisAngle(const aiQuaternion& rotation)
{
    // Of the two quaternions of a rotation, the one of at most half a turn.
    const float sign = rotation.w < 0.0f ? -1.0f : 1.0f;
    const aiVector3D part(rotation.x * sign, rotation.y * sign, rotation.z * sign);
    const float length = float(part.Length());
    if (length < 1e-7f)
        return Vector4f(0.0f, 1.0f, 0.0f, 0.0f);
    return Vector4f(toVector(part / length), 2.0f * std::atan2(length, float(rotation.w) * sign));
}

aiMatrix4x4 compose(const aiVector3D& translation, const aiQuaternion& rotation, const aiVector3D& scale)
{
    aiMatrix4x4 move;
    aiMatrix4x4 stretch;
    aiMatrix4x4::Translation(translation, move);
    aiMatrix4x4::Scaling(scale, stretch);
    return move * aiMatrix4x4(rotation.GetMatrix()) * stretch;
}

bool place(glo::NodeData& node, const aiMatrix4x4& transform)
{
    const aiMatrix4x4& m = transform;
    aiVector3D columns[3] = {{m.a1, m.b1, m.c1}, {m.a2, m.b2, m.c2}, {m.a3, m.b3, m.c3}};
    Vector3f scale(float(columns[0].Length()), float(columns[1].Length()), float(columns[2].Length()));
    for (int i = 0; i < 3; ++i)
        columns[i] = columns[i].NormalizeSafe();
    if ((columns[0] ^ columns[1]) * columns[2] < 0.0f)
    {
        // Of the three axes that could be mirrored, the one that leaves the smallest rotation.
        unsigned turned = 0;
        for (unsigned i = 1; i < 3; ++i)
            turned = columns[i][i] < columns[turned][turned] ? i : turned;
        scale[int(turned)] = -scale[int(turned)];
        columns[turned] = -columns[turned];
    }
    orthonormalise(columns);

    node.translation = Vector3f(float(m.a4), float(m.b4), float(m.c4));
    node.scale = scale;
    const aiMatrix3x3 rotation(columns[0].x, columns[1].x, columns[2].x, columns[0].y, columns[1].y,
                               columns[2].y, columns[0].z, columns[1].z, columns[2].z);
    node.rotation = toAxisAngle(aiQuaternion(rotation).Normalize());

    // As the engine makes a matrix of the components.
    const orv::Quaternionf turn =
        orv::quaternionFromAxisAngle(Vector3f(node.rotation.x, node.rotation.y, node.rotation.z),
                                     orv::Anglef::fromRadians(node.rotation.w));
    Matrix4f made = orv::toMatrix4(turn) * orv::scaleMatrix(scale);
    made[3] = Vector4f(node.translation, 1.0f);

    float largest = 0.0f;
    const float difference = largestDifference(made, transform, largest);
    const bool isHeld = difference <= 1e-3f * largest;
    node.transform = isHeld ? toMatrix(transform) : made;
    return isHeld;
}

Nested splitShear(const aiMatrix4x4& transform)
{
    // Jacobi's method: rotations before the transform make its axes orthogonal, two at a time. Then the rest is a
    // rotation and a scale.
    Nested nested{transform, {}};
    const auto column = [&](unsigned i)
    {
        const aiMatrix4x4& m = nested.outer;
        return aiVector3D(m[0][i], m[1][i], m[2][i]);
    };
    constexpr int MOST_ROUNDS = 30;
    for (int round = 0; round < MOST_ROUNDS; ++round)
    {
        for (unsigned i = 0; i < 3; ++i)
        {
            const unsigned a = i;
            const unsigned b = (i + 1) % 3;
            const float difference = float(column(a).SquareLength() - column(b).SquareLength());
            const float product = float(column(a) * column(b));
            const float angle = 0.5f * std::atan2(difference < 0.0f ? -2.0f * product : 2.0f * product,
                                                  std::fabs(difference)); // at most an eighth of a turn
            aiMatrix4x4 turn;
            turn[a][a] = turn[b][b] = std::cos(angle);
            turn[b][a] = std::sin(angle);
            turn[a][b] = -turn[b][a];
            nested.outer *= turn;
            nested.inner = turn.Transpose() * nested.inner;
        }
    }
    return nested;
}

aiMatrix4x4 lookingAlong(const aiVector3D& position, const aiVector3D& direction, const aiVector3D& up)
{
    const aiVector3D back =
        direction.SquareLength() > 0.0f ? -aiVector3D(direction).Normalize() : aiVector3D(0, 0, 1);
    const aiVector3D upwards = up.SquareLength() > 0.0f ? up : aiVector3D(0, 1, 0);
    aiVector3D right = upwards ^ back;
    right = right.Length() > 1e-6f ? right.Normalize() : across(back);
    const aiVector3D top = back ^ right;
    return aiMatrix4x4(right.x, top.x, back.x, position.x, right.y, top.y, back.y, position.y, right.z, top.z,
                       back.z, position.z, 0, 0, 0, 1);
}

} // namespace convert
