#include "keychoice.h"

#include "orv/quaternion.h"

#include <algorithm>
#include <cmath>

namespace convert
{

namespace
{

using orv::Quaternionf;
using orv::Vector4f;

Quaternionf toTurn(const Vector4f& axisAngle)
{
    return orv::quaternionFromAxisAngle(axisAngle.xyz(), orv::Anglef::fromRadians(axisAngle.w));
}

double getLength(double a, double b, double c, double d)
{
    return std::sqrt(a * a + b * b + c * c + d * d);
}

double findDistance(const Vector4f& a, const Vector4f& b)
{
    return getLength(double(a.x) - double(b.x), double(a.y) - double(b.y), double(a.z) - double(b.z),
                     double(a.w) - double(b.w));
}

/// The angle of the turn from one to the other.
double findDistance(const Quaternionf& p, const Quaternionf& q)
{
    const Vector4f a(p.x, p.y, p.z, p.a);
    const Vector4f b(q.x, q.y, q.z, q.a);
    const double across = std::min(findDistance(a, b), findDistance(a, -b));
    return 4.0 * std::asin(std::min(across / 2.0, 1.0));
}

/// As the engine has it.
Vector4f mix(const Vector4f& a, const Vector4f& b, float share)
{
    return a * (1.0f - share) + b * share;
}

Quaternionf mix(const Quaternionf& a, const Quaternionf& b, float share)
{
    return orv::slerp(a, b, share);
}

template <class Value>
class KeyChooser
{
public:
    KeyChooser(const std::vector<double>& times, const std::vector<Value>& values, double error)
        : m_times(times)
        , m_values(values)
        , m_error(error)
    {
    }

    std::vector<size_t> choose() const
    {
        std::vector<size_t> keys;
        for (size_t key = 0; key < m_times.size(); key = findNext(key))
            keys.push_back(key);
        return keys;
    }

private:
    /// Roughly the farthest sample that one line can reach; for the last key, the number of samples.
    size_t findNext(size_t key) const
    {
        const size_t last = m_times.size() - 1;
        size_t good = key + 1;
        size_t step = 1;
        while (good < last && holds(key, std::min(good + step, last)))
        {
            good = std::min(good + step, last);
            step *= 2;
        }
        size_t bad = std::min(good + step, last + 1);
        while (good + 1 < bad)
        {
            const size_t middle = good + (bad - good) / 2;
            (holds(key, middle) ? good : bad) = middle;
        }
        return good;
    }

    bool holds(size_t from, size_t to) const
    {
        const double span = m_times[to] - m_times[from];
        for (size_t i = from + 1; i < to; ++i)
        {
            const double share = span > 0.0 ? (m_times[i] - m_times[from]) / span : 0.0;
            const Value made = mix(m_values[from], m_values[to], float(share));
            if (!(findDistance(made, m_values[i]) <= m_error))
                return false;
        }
        return true;
    }

    const std::vector<double>& m_times;
    const std::vector<Value>& m_values;
    double m_error;
};

} // namespace

std::vector<size_t> chooseKeys(const std::vector<Sample>& samples, bool areRotations, double error)
{
    std::vector<double> times;
    std::vector<Vector4f> values;
    std::vector<Quaternionf> turns;
    for (const Sample& sample : samples)
    {
        times.push_back(sample.seconds);
        if (areRotations)
            turns.push_back(toTurn(sample.value));
        else
            values.push_back(sample.value);
    }
    return areRotations ? KeyChooser<Quaternionf>(times, turns, error).choose()
                        : KeyChooser<Vector4f>(times, values, error).choose();
}

} // namespace convert
