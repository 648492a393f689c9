#pragma once

#include "orv/export.h"

#include <cmath>
#include <string>

namespace orv
{

namespace detail
{

/// Logs that an index lies outside 0 to last.
/// @return 0, the index to use instead.
ORV_API int indexOutOfRange(int index, int last);

inline int checkedIndex(int index, int count)
{
    if (unsigned(index) < unsigned(count)) [[likely]]
        return index;
    return indexOutOfRange(index, count - 1);
}

} // namespace detail

/// Two components in the order x, y, without padding, as GL takes them. Starts as zero.
///
/// The operators work component by component. Indexing outside 0 to 1 logs an error and gives x.
template <class T>
struct ORV_API Vector2
{
    T x = T(); ///< The components.
    T y = T();

    constexpr Vector2() = default;
    constexpr Vector2(T xValue, T yValue) : x(xValue), y(yValue) {} ///< Its components.

    T& operator[](int index) { return data()[detail::checkedIndex(index, 2)]; }
    const T& operator[](int index) const { return data()[detail::checkedIndex(index, 2)]; }

    T* data() { return &x; } ///< The components, one after the other.
    const T* data() const { return &x; }

    constexpr Vector2 operator-() const { return Vector2(-x, -y); }

    constexpr Vector2& operator+=(const Vector2& v) { return *this = *this + v; }
    constexpr Vector2& operator-=(const Vector2& v) { return *this = *this - v; }
    constexpr Vector2& operator*=(T factor) { return *this = *this * factor; }
    constexpr Vector2& operator/=(T divisor) { return *this = *this / divisor; }

    friend constexpr Vector2 operator+(const Vector2& a, const Vector2& b)
    {
        return Vector2(a.x + b.x, a.y + b.y);
    }
    friend constexpr Vector2 operator-(const Vector2& a, const Vector2& b)
    {
        return Vector2(a.x - b.x, a.y - b.y);
    }
    friend constexpr Vector2 operator*(const Vector2& a, const Vector2& b)
    {
        return Vector2(a.x * b.x, a.y * b.y);
    }
    friend constexpr Vector2 operator/(const Vector2& a, const Vector2& b)
    {
        return Vector2(a.x / b.x, a.y / b.y);
    }
    friend constexpr Vector2 operator*(const Vector2& v, T factor)
    {
        return Vector2(v.x * factor, v.y * factor);
    }
    friend constexpr Vector2 operator*(T factor, const Vector2& v) { return v * factor; }
    friend constexpr Vector2 operator/(const Vector2& v, T divisor)
    {
        return Vector2(v.x / divisor, v.y / divisor);
    }
    friend constexpr bool operator==(const Vector2& a, const Vector2& b) { return a.x == b.x && a.y == b.y; }
};

/// Three components in the order x, y, z, without padding, as GL takes them. Starts as zero.
///
/// The operators work component by component. Indexing outside 0 to 2 logs an error and gives x.
template <class T>
struct ORV_API Vector3
{
    T x = T(); ///< The components.
    T y = T();
    T z = T();

    constexpr Vector3() = default;
    /// Its components.
    constexpr Vector3(T xValue, T yValue, T zValue) : x(xValue), y(yValue), z(zValue) {}

    T& operator[](int index) { return data()[detail::checkedIndex(index, 3)]; }
    const T& operator[](int index) const { return data()[detail::checkedIndex(index, 3)]; }

    T* data() { return &x; } ///< The components, one after the other.
    const T* data() const { return &x; }

    constexpr Vector3 operator-() const { return Vector3(-x, -y, -z); }

    constexpr Vector3& operator+=(const Vector3& v) { return *this = *this + v; }
    constexpr Vector3& operator-=(const Vector3& v) { return *this = *this - v; }
    constexpr Vector3& operator*=(T factor) { return *this = *this * factor; }
    constexpr Vector3& operator/=(T divisor) { return *this = *this / divisor; }

    friend constexpr Vector3 operator+(const Vector3& a, const Vector3& b)
    {
        return Vector3(a.x + b.x, a.y + b.y, a.z + b.z);
    }
    friend constexpr Vector3 operator-(const Vector3& a, const Vector3& b)
    {
        return Vector3(a.x - b.x, a.y - b.y, a.z - b.z);
    }
    friend constexpr Vector3 operator*(const Vector3& a, const Vector3& b)
    {
        return Vector3(a.x * b.x, a.y * b.y, a.z * b.z);
    }
    friend constexpr Vector3 operator/(const Vector3& a, const Vector3& b)
    {
        return Vector3(a.x / b.x, a.y / b.y, a.z / b.z);
    }
    friend constexpr Vector3 operator*(const Vector3& v, T factor)
    {
        return Vector3(v.x * factor, v.y * factor, v.z * factor);
    }
    friend constexpr Vector3 operator*(T factor, const Vector3& v) { return v * factor; }
    friend constexpr Vector3 operator/(const Vector3& v, T divisor)
    {
        return Vector3(v.x / divisor, v.y / divisor, v.z / divisor);
    }
    [[gnu::always_inline]] friend constexpr bool operator==(const Vector3& a, const Vector3& b)
    {
        return a.x == b.x && a.y == b.y && a.z == b.z;
    }

    static const Vector3 X_AXIS; ///< Of length 1.
    static const Vector3 Y_AXIS;
    static const Vector3 Z_AXIS;
};

template <class T>
constexpr Vector3<T> Vector3<T>::X_AXIS(T(1), T(0), T(0));
template <class T>
constexpr Vector3<T> Vector3<T>::Y_AXIS(T(0), T(1), T(0));
template <class T>
constexpr Vector3<T> Vector3<T>::Z_AXIS(T(0), T(0), T(1));

/// Four components in the order x, y, z, w, without padding, as GL takes them. Starts as zero.
///
/// The operators work component by component. Indexing outside 0 to 3 logs an error and gives x.
template <class T>
struct ORV_API Vector4
{
    T x = T(); ///< The components.
    T y = T();
    T z = T();
    T w = T();

    constexpr Vector4() = default;
    /// Its components.
    constexpr Vector4(T xValue, T yValue, T zValue, T wValue) : x(xValue), y(yValue), z(zValue), w(wValue) {}
    constexpr Vector4(const Vector3<T>& v, T wValue) : x(v.x), y(v.y), z(v.z), w(wValue) {}

    T& operator[](int index) { return data()[detail::checkedIndex(index, 4)]; }
    const T& operator[](int index) const { return data()[detail::checkedIndex(index, 4)]; }

    T* data() { return &x; } ///< The components, one after the other.
    const T* data() const { return &x; }

    /// Without w; there is no division.
    [[gnu::always_inline]] constexpr Vector3<T> xyz() const { return Vector3<T>(x, y, z); }

    constexpr Vector4 operator-() const { return Vector4(-x, -y, -z, -w); }

    constexpr Vector4& operator+=(const Vector4& v) { return *this = *this + v; }
    constexpr Vector4& operator-=(const Vector4& v) { return *this = *this - v; }
    constexpr Vector4& operator*=(T factor) { return *this = *this * factor; }
    constexpr Vector4& operator/=(T divisor) { return *this = *this / divisor; }

    friend constexpr Vector4 operator+(const Vector4& a, const Vector4& b)
    {
        return Vector4(a.x + b.x, a.y + b.y, a.z + b.z, a.w + b.w);
    }
    friend constexpr Vector4 operator-(const Vector4& a, const Vector4& b)
    {
        return Vector4(a.x - b.x, a.y - b.y, a.z - b.z, a.w - b.w);
    }
    friend constexpr Vector4 operator*(const Vector4& a, const Vector4& b)
    {
        return Vector4(a.x * b.x, a.y * b.y, a.z * b.z, a.w * b.w);
    }
    friend constexpr Vector4 operator/(const Vector4& a, const Vector4& b)
    {
        return Vector4(a.x / b.x, a.y / b.y, a.z / b.z, a.w / b.w);
    }
    friend constexpr Vector4 operator*(const Vector4& v, T factor)
    {
        return Vector4(v.x * factor, v.y * factor, v.z * factor, v.w * factor);
    }
    friend constexpr Vector4 operator*(T factor, const Vector4& v) { return v * factor; }
    friend constexpr Vector4 operator/(const Vector4& v, T divisor)
    {
        return Vector4(v.x / divisor, v.y / divisor, v.z / divisor, v.w / divisor);
    }
    [[gnu::always_inline]] friend constexpr bool operator==(const Vector4& a, const Vector4& b)
    {
        return a.x == b.x && a.y == b.y && a.z == b.z && a.w == b.w;
    }
};

/// The vectors that the engine takes: of floats, integers and truth values.
using Vector2f = Vector2<float>;
using Vector3f = Vector3<float>;
using Vector4f = Vector4<float>;
using Vector2i = Vector2<int>;
using Vector3i = Vector3<int>;
using Vector4i = Vector4<int>;
using Vector2b = Vector2<bool>;
using Vector3b = Vector3<bool>;
using Vector4b = Vector4<bool>;

/// The sum of the products of the components.
template <class T>
constexpr T dot(const Vector2<T>& a, const Vector2<T>& b)
{
    return a.x * b.x + a.y * b.y;
}

/// The sum of the products of the components.
template <class T>
constexpr T dot(const Vector3<T>& a, const Vector3<T>& b)
{
    return a.x * b.x + a.y * b.y + a.z * b.z;
}

/// The sum of the products of the components.
template <class T>
constexpr T dot(const Vector4<T>& a, const Vector4<T>& b)
{
    return a.x * b.x + a.y * b.y + a.z * b.z + a.w * b.w;
}

/// Right-handed: X_AXIS cross Y_AXIS is Z_AXIS.
template <class T>
constexpr Vector3<T> cross(const Vector3<T>& a, const Vector3<T>& b)
{
    return Vector3<T>(a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x);
}

/// The root of the sum of the squares.
template <template <class> class V, class T>
requires requires(V<T> v)
{
    dot(v, v);
}
T length(const V<T>& v)
{
    return std::sqrt(dot(v, v));
}

/// The vector divided by its length; one without a length (zero, or not a number) comes back as it is.
template <template <class> class V, class T>
requires requires(V<T> v)
{
    dot(v, v);
}
V<T> normalize(const V<T>& v)
{
    const T size = length(v);
    return size > T(0) ? v / size : v;
}

/// The type's name with the letter of its elements and the components: "Vector3f(1, 0, 0)".
/// Truth values print as 1 and 0.
ORV_API std::string toString(const Vector2f& v);
ORV_API std::string toString(const Vector3f& v);
ORV_API std::string toString(const Vector4f& v);
ORV_API std::string toString(const Vector2i& v);
ORV_API std::string toString(const Vector3i& v);
ORV_API std::string toString(const Vector4i& v);
ORV_API std::string toString(const Vector2b& v);
ORV_API std::string toString(const Vector3b& v);
ORV_API std::string toString(const Vector4b& v);

} // namespace orv
