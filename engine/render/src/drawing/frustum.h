#pragma once

#include "orv/matrix.h"

#include <cstring>

namespace orv::detail
{

/// What one eye can see: the inside of six planes, a little widened, for rounding.
class Frustum
{
public:
    enum class Sight
    {
        OUTSIDE, ///< of one plane at least
        CROSSING,
        INSIDE
    };

    /// Sees everything.
    Frustum();
    Frustum(const Matrix4f& view, const Matrix4f& projection);

    /// Whether a sphere is outside. One that is not made of numbers is not.
    /// @param negativeRadius  minus infinity is never outside.
    bool hides(const Vector3f& centre, float negativeRadius) const
    {
        return isAny(getLeastDistances(centre.x, centre.y, centre.z) < fill(negativeRadius));
    }

    /// The same of a centre that has to be transformed first.
    bool hides(const Matrix4f& transform, const Vector3f& centre, float negativeRadius) const
    {
        const Lanes place = load(transform.columns[0]) * centre.x + load(transform.columns[1]) * centre.y +
                            load(transform.columns[2]) * centre.z + load(transform.columns[3]);
        return isAny(getLeastDistances(place[0], place[1], place[2]) < fill(negativeRadius));
    }

    Sight look(const Vector3f& centre, float negativeRadius) const;

private:
    friend class HullSight;

    typedef float Lanes __attribute__((vector_size(16)));
    typedef int Answers __attribute__((vector_size(16)));
    typedef long long Halves __attribute__((vector_size(16)));

    static Lanes fill(float value) { return Lanes{value, value, value, value}; }
    static Lanes load(const Vector4f& v)
    {
        Lanes lanes;
        std::memcpy(&lanes, v.data(), sizeof lanes);
        return lanes;
    }

    Lanes getDistances(int half, float x, float y, float z) const
    {
        return m_x[half] * x + m_y[half] * y + m_z[half] * z + m_offset[half];
    }

    static bool isAny(Answers answers)
    {
        const Halves halves = Halves(answers);
        return (halves[0] | halves[1]) != 0;
    }

    /// Of two planes each.
    Lanes getLeastDistances(float x, float y, float z) const
    {
        const Lanes first = getDistances(0, x, y, z);
        const Lanes second = getDistances(1, x, y, z);
        return first < second ? first : second;
    }

    // Eight planes, of unit length and towards the inside; those that are not needed see everything.
    Lanes m_x[2] = {};
    Lanes m_y[2] = {};
    Lanes m_z[2] = {};
    Lanes m_offset[2];
};

/// The same for what is somewhere between spheres: it is outside if all of them are outside of one plane.
class HullSight
{
public:
    explicit HullSight(const Frustum& frustum) : m_frustum(frustum) {}

    void add(const Vector3f& centre, float negativeRadius);
    bool isHidden() const { return Frustum::isAny(m_outside[0] | m_outside[1]); }

private:
    const Frustum& m_frustum;
    Frustum::Answers m_outside[2] = {{-1, -1, -1, -1}, {-1, -1, -1, -1}};
};

} // namespace orv::detail
