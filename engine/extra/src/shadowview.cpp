#include "shadowview.h"

#include "orv/light.h"

#include <algorithm>
#include <cmath>

namespace orv::detail
{

namespace
{

/// Offset of lookups against self-shadowing, texels: the soft edge reads 1.5 texels away along both axes.
constexpr float TEXELS_OFF = 2.2f;
constexpr float NEAREST = 0.01f; ///< of the range: the near plane of a spot's map
constexpr float WIDEST = 170.0f; ///< field of view of a map, degrees

/// Three orthogonal directions; z is given.
struct Axes
{
    explicit Axes(const Vector3f& zAxis) : z(zAxis)
    {
        const Vector3f other = std::abs(z.y) < 0.9f ? Vector3f::Y_AXIS : Vector3f::X_AXIS;
        x = normalize(cross(other, z));
        y = cross(z, x);
    }

    Vector3f toOwn(const Vector3f& v) const { return Vector3f(dot(x, v), dot(y, v), dot(z, v)); }

    Vector3f x, y, z;
};

Vector4f makeRow(const Vector3f& direction, float scale, float move)
{
    return Vector4f(direction * scale, move);
}

Matrix4f fromRows(const Vector4f& x, const Vector4f& y, const Vector4f& z, const Vector4f& w)
{
    return Matrix4f(Vector4f(x.x, y.x, z.x, w.x), Vector4f(x.y, y.y, z.y, w.y), Vector4f(x.z, y.z, z.z, w.z),
                    Vector4f(x.w, y.w, z.w, w.w));
}

/// From -w to w in clip space to the map's texels inside of the border, times w.
Vector4f toTexture(const Vector4f& clip, const Vector4f& w, int size)
{
    const float share = float(size) / float(size + 2 * ShadowView::BORDER);
    return clip * (0.5f * share) + w * 0.5f;
}

/// The centre of a map moves by whole texels, so that edges do not shimmer when the eye moves.
float snap(float value, float texel)
{
    return std::floor(value / texel + 0.5f) * texel;
}

bool makeDirectionalView(const Vector3f& toLight, const ShadowReach& reach, int size, ShadowView& view)
{
    const Axes axes(toLight);
    Box box;
    for (const Vector3f& corner : *reach.casters)
        box.add(axes.toOwn(corner));
    const Vector3f seen = axes.toOwn(reach.seenCentre);
    const float radius = reach.seenRadius;
    if (!reach.isAllKnown && radius >= 0.0f)
    {
        box.add(seen - Vector3f(radius, radius, radius));
        box.add(seen + Vector3f(radius, radius, 2.0f * radius));
    }
    if (box.isEmpty())
        return false;

    Vector3f centre = box.getCentre();
    Vector3f half = (box.highest - box.lowest) * 0.5f;
    if (radius > 0.0f && (!reach.isAllKnown || radius < std::max(half.x, half.y)))
    {
        const float texel = 2.0f * radius / float(size);
        centre = Vector3f(snap(seen.x, texel), snap(seen.y, texel), centre.z);
        half = Vector3f(radius, radius, half.z);
    }
    half = half * 1.001f + Vector3f(1e-6f, 1e-6f, 1e-6f);

    const Vector4f one(0.0f, 0.0f, 0.0f, 1.0f);
    const Vector4f x = makeRow(axes.x, 1.0f / half.x, -centre.x / half.x);
    const Vector4f y = makeRow(axes.y, 1.0f / half.y, -centre.y / half.y);
    const Vector4f z = makeRow(axes.z, -1.0f / half.z, centre.z / half.z); // near to far
    view.clip = fromRows(x, y, z, one);
    view.rows[0] = toTexture(x, one, size);
    view.rows[1] = toTexture(y, one, size);
    view.rows[2] = z * 0.5f + one * 0.5f;
    view.light = Vector4f(toLight, 0.0f);
    view.offset = TEXELS_OFF * 2.0f * std::max(half.x, half.y) / float(size);
    return true;
}

/// The near and far distance of a spot's map along its axis.
Vector2f findSpotRange(const Light& light, const ShadowReach& reach, const Vector3f& place,
                       const Vector3f& axis)
{
    float nearest = INFINITY;
    float farthest = 0.0f;
    for (const Vector3f& corner : *reach.casters)
    {
        const float distance = dot(axis, corner - place);
        nearest = std::min(nearest, distance);
        farthest = std::max(farthest, distance);
    }
    if (!reach.isAllKnown && reach.seenRadius >= 0.0f)
    {
        nearest = 0.0f;
        farthest = std::max(farthest, length(reach.seenCentre - place) + reach.seenRadius);
    }
    if (light.isAttenuated())
    {
        const float scale = length(light.getWorldTransform().columns[0].xyz());
        farthest = std::min(farthest, light.getAttenuationFar() * scale);
    }
    farthest *= 1.001f;
    return Vector2f(std::min(std::max(nearest, farthest * NEAREST), farthest * 0.5f), farthest);
}

bool makeSpotView(const Light& light, const Vector3f& back, const ShadowReach& reach, int size,
                  ShadowView& view)
{
    const Vector3f place = light.getWorldTransform().columns[3].xyz();
    const Axes axes(back);
    const Vector2f range = findSpotRange(light, reach, place, -back);
    if (!(range.y > 0.0f) || !std::isfinite(range.y))
        return false;
    const float angle = std::clamp(light.getSpotOuterAngle().degrees(), 1.0f, WIDEST);
    const float spread = std::tan(Anglef::fromDegrees(angle * 0.5f).radians());

    const Vector4f x = makeRow(axes.x, 1.0f / spread, -dot(axes.x, place) / spread);
    const Vector4f y = makeRow(axes.y, 1.0f / spread, -dot(axes.y, place) / spread);
    const Vector4f w = makeRow(axes.z, -1.0f, dot(axes.z, place));
    const float depth = range.y - range.x;
    const Vector4f z =
        w * ((range.y + range.x) / depth) - Vector4f(0.0f, 0.0f, 0.0f, 2.0f * range.y * range.x / depth);
    view.clip = fromRows(x, y, z, w);
    const float share =
        1.0f / range.y; // depths from 0 to 1; the division by depth takes it out of x and y again
    view.rows[0] = toTexture(x, w, size) * share;
    view.rows[1] = toTexture(y, w, size) * share;
    view.rows[2] = w * share;
    view.light = Vector4f(place, 1.0f);
    view.offset = -TEXELS_OFF * 2.0f * spread * range.y / float(size);
    return true;
}

} // namespace

bool makeShadowView(const Light& light, const ShadowReach& reach, int size, ShadowView& view)
{
    const Vector3f zAxis = light.getWorldTransform().columns[2].xyz();
    if (!(length(zAxis) > 0.0f))
        return false;
    view.isSpot = light.getLightType() == Light::LightType::SPOT;
    return view.isSpot ? makeSpotView(light, normalize(zAxis), reach, size, view)
                       : makeDirectionalView(normalize(zAxis), reach, size, view);
}

} // namespace orv::detail
