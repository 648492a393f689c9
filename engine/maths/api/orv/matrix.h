#pragma once

#include "orv/export.h"
#include "orv/quaternion.h"
#include "orv/vector.h"

#include <string>

namespace orv
{

/// Two columns of two, column-major, as GL takes them. Starts as zero.
///
/// For all three sizes: indexing gives a column (outside the range: an error is logged, column 0 is given), a
/// matrix times a vector is the sum of the columns weighted by the components, and in a product the right
/// matrix acts first.
template <class T>
struct ORV_API Matrix2
{
    Vector2<T> columns[2]; ///< From the left.

    constexpr Matrix2() = default;
    /// Made of its columns, from the left.
    constexpr Matrix2(const Vector2<T>& column0, const Vector2<T>& column1) : columns{column0, column1} {}

    Vector2<T>& operator[](int index) { return columns[detail::checkedIndex(index, 2)]; }
    const Vector2<T>& operator[](int index) const { return columns[detail::checkedIndex(index, 2)]; }

    const T* data() const { return columns[0].data(); } ///< The elements, column by column.

    friend constexpr Vector2<T> operator*(const Matrix2& m, const Vector2<T>& v)
    {
        return m.columns[0] * v.x + m.columns[1] * v.y;
    }
    friend constexpr Matrix2 operator*(const Matrix2& m, const Matrix2& n)
    {
        return Matrix2(m * n.columns[0], m * n.columns[1]);
    }
    friend constexpr bool operator==(const Matrix2& m, const Matrix2& n)
    {
        return m.columns[0] == n.columns[0] && m.columns[1] == n.columns[1];
    }
};

/// Three columns of three; see Matrix2.
template <class T>
struct ORV_API Matrix3
{
    Vector3<T> columns[3]; ///< From the left.

    constexpr Matrix3() = default;
    /// Made of its columns, from the left.
    constexpr Matrix3(const Vector3<T>& column0, const Vector3<T>& column1, const Vector3<T>& column2)
        : columns{column0, column1, column2}
    {
    }

    Vector3<T>& operator[](int index) { return columns[detail::checkedIndex(index, 3)]; }
    const Vector3<T>& operator[](int index) const { return columns[detail::checkedIndex(index, 3)]; }

    const T* data() const { return columns[0].data(); } ///< The elements, column by column.

    friend constexpr Vector3<T> operator*(const Matrix3& m, const Vector3<T>& v)
    {
        return m.columns[0] * v.x + m.columns[1] * v.y + m.columns[2] * v.z;
    }
    friend constexpr Matrix3 operator*(const Matrix3& m, const Matrix3& n)
    {
        return Matrix3(m * n.columns[0], m * n.columns[1], m * n.columns[2]);
    }
    friend constexpr bool operator==(const Matrix3& m, const Matrix3& n)
    {
        return m.columns[0] == n.columns[0] && m.columns[1] == n.columns[1] && m.columns[2] == n.columns[2];
    }

    static const Matrix3 IDENTITY; ///< Changes nothing.
};

template <class T>
constexpr Matrix3<T> Matrix3<T>::IDENTITY(Vector3<T>(T(1), T(0), T(0)), Vector3<T>(T(0), T(1), T(0)),
                                          Vector3<T>(T(0), T(0), T(1)));

template <class T>
struct Matrix4;

namespace detail
{

template <class T>
constexpr Matrix4<T> multiply(const Matrix4<T>& m, const Matrix4<T>& n)
{
    return Matrix4<T>(m * n.columns[0], m * n.columns[1], m * n.columns[2], m * n.columns[3]);
}

/// The same in the fewest steps: frames are full of it.
ORV_API Matrix4<float> multiply(const Matrix4<float>& m, const Matrix4<float>& n);

} // namespace detail

/// Four columns of four; see Matrix2. A transform of space keeps its translation in column 3.
template <class T>
struct ORV_API Matrix4
{
    Vector4<T> columns[4]; ///< From the left.

    constexpr Matrix4() = default;
    /// Made of its columns, from the left.
    constexpr Matrix4(const Vector4<T>& column0, const Vector4<T>& column1, const Vector4<T>& column2,
                      const Vector4<T>& column3)
        : columns{column0, column1, column2, column3}
    {
    }

    Vector4<T>& operator[](int index) { return columns[detail::checkedIndex(index, 4)]; }
    const Vector4<T>& operator[](int index) const { return columns[detail::checkedIndex(index, 4)]; }

    const T* data() const { return columns[0].data(); } ///< The elements, column by column.

    friend constexpr Vector4<T> operator*(const Matrix4& m, const Vector4<T>& v)
    {
        return m.columns[0] * v.x + m.columns[1] * v.y + m.columns[2] * v.z + m.columns[3] * v.w;
    }
    friend constexpr Matrix4 operator*(const Matrix4& m, const Matrix4& n) { return detail::multiply(m, n); }
    friend constexpr bool operator==(const Matrix4& m, const Matrix4& n)
    {
        return m.columns[0] == n.columns[0] && m.columns[1] == n.columns[1] && m.columns[2] == n.columns[2] &&
               m.columns[3] == n.columns[3];
    }

    static const Matrix4 IDENTITY; ///< Changes nothing.
};

template <class T>
constexpr Matrix4<T>
    Matrix4<T>::IDENTITY(Vector4<T>(T(1), T(0), T(0), T(0)), Vector4<T>(T(0), T(1), T(0), T(0)),
                         Vector4<T>(T(0), T(0), T(1), T(0)), Vector4<T>(T(0), T(0), T(0), T(1)));

namespace detail
{

/// Whether the last row is 0 0 0 1.
inline bool isAffine(const Matrix4<float>& m)
{
    return m.columns[0].w == 0.0f && m.columns[1].w == 0.0f && m.columns[2].w == 0.0f &&
           m.columns[3].w == 1.0f;
}

/// An upper limit of what an affine transform does to lengths: where its axes stay at right angles, what it does to the
/// most stretched of them. Infinite if it is not affine.
float getStretch(const Matrix4<float>& m);

} // namespace detail

using Matrix2f = Matrix2<float>; ///< The matrices that the engine takes.
using Matrix3f = Matrix3<float>;
using Matrix4f = Matrix4<float>;

ORV_API Matrix2f transpose(const Matrix2f& m); ///< Rows become columns.
ORV_API Matrix3f transpose(const Matrix3f& m);
ORV_API Matrix4f transpose(const Matrix4f& m);

ORV_API float determinant(const Matrix3f& m); ///< 0 where there is no inverse.
ORV_API float determinant(const Matrix4f& m);

/// @return the zero matrix if there is no inverse or it does not fit floats; never infinities or NaN.
ORV_API Matrix3f inverse(const Matrix3f& m);
ORV_API Matrix4f inverse(const Matrix4f& m);

/// The part without translation.
[[gnu::always_inline]] inline Matrix3f upper3x3(const Matrix4f& m)
{
    return Matrix3f(m.columns[0].xyz(), m.columns[1].xyz(), m.columns[2].xyz());
}

/// Moves by an offset, or scales by factors along the axes.
ORV_API Matrix4f translationMatrix(const Vector3f& offset);
ORV_API Matrix4f scaleMatrix(const Vector3f& factors);

/// The rotation alone: a quaternion that is not of unit length turns as its normalised form would; one whose
/// squared length is zero or beyond floats does not turn.
ORV_API Matrix3f toMatrix3(const Quaternionf& q);
ORV_API Matrix4f toMatrix4(const Quaternionf& q); ///< The same.

/// The world transform of something at eye that looks along its -z at target (a camera, a light).
/// @param up  becomes the +y side as far as possible; if it lies along the line of sight, another axis serves.
/// @return without rotation if eye and target coincide.
ORV_API Matrix4f lookAt(const Vector3f& eye, const Vector3f& target, const Vector3f& up);

/// The type's name and, on a line each, the columns.
ORV_API std::string toString(const Matrix2f& m);
ORV_API std::string toString(const Matrix3f& m);
ORV_API std::string toString(const Matrix4f& m);

} // namespace orv
