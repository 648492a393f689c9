#include "orv/animationmix.h"

#include "mixedplaces.h"

#include "orv/scenenode.h"

#include <algorithm>
#include <cmath>

namespace orv
{

namespace
{

float mixStraight(float from, float to, float share)
{
    return from == to
               ? from
               : from * (1.0f - share) + to * share; // exact for equal values, and no difference can overflow
}

bool isFinite(const Vector4f& v)
{
    return std::isfinite(v.x) && std::isfinite(v.y) && std::isfinite(v.z) && std::isfinite(v.w);
}

Vector4f toVector(const Vector4f& v)
{
    return v;
}

Vector4f toVector(const Quaternionf& q)
{
    return Vector4f(q.x, q.y, q.z, q.a);
}

void fromVector(const Vector4f& v, Vector4f& result)
{
    result = v;
}

void fromVector(const Vector4f& v, Quaternionf& result)
{
    result = Quaternionf(v.w, v.x, v.y, v.z);
}

} // namespace

bool AnimationMix::isBelow(const SceneNode* node) const
{
    return node && node->hasAncestor(m_subtree);
}

float AnimationMix::getShare(float from, float to, float time)
{
    const double share = (double(time) - double(from)) / (double(to) - double(from));
    return share > 0.0 && share < 1.0 ? std::min(float(share), 0x1.fffffep-1f) : 0.0f;
}

Vector4f AnimationMix::between(const Vector4f& from, const Vector4f& to, float share)
{
    if (!(share > 0.0f) || !isFinite(from) || !isFinite(to))
        return from;
    return Vector4f(mixStraight(from.x, to.x, share), mixStraight(from.y, to.y, share),
                    mixStraight(from.z, to.z, share), mixStraight(from.w, to.w, share));
}

Quaternionf AnimationMix::between(const Quaternionf& from, const Quaternionf& to, float share)
{
    return share > 0.0f ? slerp(from, to, share) : from;
}

Vector3f AnimationMix::between(const Vector3f& from, const Vector3f& to, float share)
{
    return between(Vector4f(from.x, from.y, from.z, 0.0f), Vector4f(to.x, to.y, to.z, 0.0f), share).xyz();
}

Colour4f AnimationMix::between(const Colour4f& from, const Colour4f& to, float share)
{
    const Vector4f mixed =
        between(Vector4f(from.r, from.g, from.b, from.a), Vector4f(to.r, to.g, to.b, to.a), share);
    return Colour4f(mixed.x, mixed.y, mixed.z, mixed.w);
}

float AnimationMix::between(float from, float to, float share)
{
    return between(Vector4f(from, 0.0f, 0.0f, 0.0f), Vector4f(to, 0.0f, 0.0f, 0.0f), share).x;
}

/// The first write of an update blends with the others' value, later ones, of fading clips, with the earlier writes. If
/// the value is still the one that this controller wrote, nobody else has written, and the remembered value of the
/// others is used. Otherwise each frame would blend into the last frame's result.
template <class T>
T AnimationMix::resolveAs(const void* place, const T& current, const T& value) const
{
    if (!m_places)
        return value;
    detail::MixedPlaces::Place& known = m_places->find(place);
    Vector4f under = toVector(current);
    if (known.update != m_places->getUpdate())
    {
        known.update = m_places->getUpdate();
        if (!(under == known.written))
            known.base = under;
        under = known.base;
    }
    known.written = toVector(value);
    T result = value;
    if (m_weight < 1.0f)
    {
        fromVector(under, result);
        if (m_weight > 0.0f && isFinite(known.written))
            result = isFinite(under) ? between(result, value, m_weight) : value;
        known.written = toVector(result);
    }
    return result;
}

Vector4f AnimationMix::resolve(const void* place, const Vector4f& current, const Vector4f& value) const
{
    return resolveAs(place, current, value);
}

Quaternionf AnimationMix::resolve(const void* place, const Quaternionf& current,
                                  const Quaternionf& value) const
{
    return resolveAs(place, current, value);
}

float AnimationMix::resolve(const void* place, float current, float value) const
{
    return resolveAs(place, Vector4f(current, 0.0f, 0.0f, 0.0f), Vector4f(value, 0.0f, 0.0f, 0.0f)).x;
}

} // namespace orv
