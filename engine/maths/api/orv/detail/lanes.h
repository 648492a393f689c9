#pragma once

#include "orv/matrix.h"
#include "orv/quaternion.h"

#include <limits>

namespace orv::detail
{

/// Four floats that are processed together, in vector registers if the processor has them.
typedef float Lanes __attribute__((vector_size(16)));

/// Result of comparisons: all bits of a lane set, or none.
typedef int LaneAnswers __attribute__((vector_size(16)));

#ifdef __SSE__
[[gnu::always_inline]] inline int getSigns(LaneAnswers answers)
{
    return __builtin_ia32_movmskps(Lanes(answers));
}
#else
[[gnu::always_inline]] inline int getSigns(LaneAnswers answers)
{
    const LaneAnswers bits = answers & LaneAnswers{1, 2, 4, 8};
    return bits[0] | bits[1] | bits[2] | bits[3];
}
#endif

[[gnu::always_inline]] inline bool isAny(LaneAnswers answers)
{
    return getSigns(answers) != 0;
}

[[gnu::always_inline]] inline bool areAll(LaneAnswers answers)
{
    return getSigns(answers) == 15;
}

[[gnu::always_inline]] inline Lanes fill(float value)
{
    return Lanes{value, value, value, value};
}

/// The same in memory, as floats.
typedef float StoredLanes __attribute__((vector_size(16), aligned(4), may_alias));

[[gnu::always_inline]] inline Lanes load(const float* values)
{
    return *reinterpret_cast<const StoredLanes*>(values);
}

[[gnu::always_inline]] inline void store(float* values, Lanes lanes)
{
    *reinterpret_cast<StoredLanes*>(values) = lanes;
}

/// The lanes of the given numbers. Integers, since a processor may move those to another register in the same step.
template <int A, int B, int C, int D>
[[gnu::always_inline]] inline Lanes pick(Lanes lanes)
{
    return Lanes(__builtin_shufflevector(LaneAnswers(lanes), LaneAnswers(lanes), A, B, C, D));
}

/// Copies one lane to all four.
template <int LANE>
[[gnu::always_inline]] inline Lanes spread(Lanes lanes)
{
    return pick<LANE, LANE, LANE, LANE>(lanes);
}

/// Four columns, as those of a Matrix4f.
struct LaneMatrix
{
    Lanes x;
    Lanes y;
    Lanes z;
    Lanes w;
};

[[gnu::always_inline]] inline LaneMatrix load(const Matrix4f& matrix)
{
    return {load(matrix.columns[0].data()), load(matrix.columns[1].data()), load(matrix.columns[2].data()),
            load(matrix.columns[3].data())};
}

[[gnu::always_inline]] inline void store(Matrix4f& result, const LaneMatrix& matrix)
{
    store(result.columns[0].data(), matrix.x);
    store(result.columns[1].data(), matrix.y);
    store(result.columns[2].data(), matrix.z);
    store(result.columns[3].data(), matrix.w);
}

/// The matrix of a rotation, as toMatrix4() has it, and a translation.
[[gnu::always_inline]] inline LaneMatrix makeRigid(const Quaternionf& rotation, const Vector3f& translation)
{
    Lanes x = {1.0f, 0.0f, 0.0f, 0.0f};
    Lanes y = {0.0f, 1.0f, 0.0f, 0.0f};
    Lanes z = {0.0f, 0.0f, 1.0f, 0.0f};
    const Lanes q = load(&rotation.a);
    const Lanes squares = q * q;
    const float squaredLength = squares[0] + squares[1] + squares[2] + squares[3];
    if (squaredLength >= std::numeric_limits<float>::min() &&
        squaredLength <= std::numeric_limits<float>::max()) [[likely]]
    {
        const Lanes twice = q * fill(2.0f / squaredLength);

        // Each element is the identity's and two products of an element of twice and one of q.
        x += pick<2, 1, 1, 0>(twice) * pick<2, 2, 3, 0>(q) * Lanes{-1.0f, 1.0f, 1.0f, 0.0f};
        x += pick<3, 0, 0, 0>(twice) * pick<3, 3, 2, 0>(q) * Lanes{-1.0f, 1.0f, -1.0f, 0.0f};
        y += pick<1, 1, 2, 0>(twice) * pick<2, 1, 3, 0>(q) * Lanes{1.0f, -1.0f, 1.0f, 0.0f};
        y += pick<0, 3, 0, 0>(twice) * pick<3, 3, 1, 0>(q) * Lanes{-1.0f, -1.0f, 1.0f, 0.0f};
        z += pick<1, 2, 1, 0>(twice) * pick<3, 3, 1, 0>(q) * Lanes{1.0f, 1.0f, -1.0f, 0.0f};
        z += pick<0, 0, 2, 0>(twice) * pick<2, 1, 2, 0>(q) * Lanes{1.0f, -1.0f, -1.0f, 0.0f};
    }
    return {x, y, z, Lanes{translation.x, translation.y, translation.z, 1.0f}};
}

/// m * n, where the last row of n is 0 0 0 1.
[[gnu::always_inline]] inline LaneMatrix multiplyAffine(const LaneMatrix& m, const LaneMatrix& n)
{
    const auto turn = [&m](Lanes v) __attribute__((always_inline))
    {
        return m.x * spread<0>(v) + m.y * spread<1>(v) + m.z * spread<2>(v);
    };
    return {turn(n.x), turn(n.y), turn(n.z), turn(n.w) + m.w};
}

} // namespace orv::detail
