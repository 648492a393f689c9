#pragma once

#include "orv/colour.h"
#include "orv/export.h"
#include "orv/quaternion.h"
#include "orv/vector.h"

namespace orv
{

class SceneNode;

namespace detail
{
class MixedPlaces;
}

/// How an AnimationController that was asked for smooth motion wants an animation applied: between keys or stepped, whole
/// or mixed with what its targets have, everywhere or on one subtree.
///
/// Controllers make it, animations hand it on, animators ask it. Only who derives from Animation or Animator meets it.
class ORV_API AnimationMix
{
public:
    /// @param interpolated  whether values between keys are wanted.
    explicit AnimationMix(bool interpolated) : m_isInterpolated(interpolated) {}

    /// @param weight   0 leaves the targets as they are, 1 replaces what they have.
    /// @param subtree  borrowed; null is everything.
    /// @param places   borrowed; null where the weight is always 1.
    AnimationMix(bool interpolated, float weight, const SceneNode* subtree, detail::MixedPlaces* places)
        : m_isInterpolated(interpolated)
        , m_weight(weight)
        , m_subtree(subtree)
        , m_places(places)
    {
    }

    bool isInterpolated() const { return m_isInterpolated; } ///< Whether values between keys are asked for.
    /// The same, interpolated.
    AnimationMix interpolated() const { return AnimationMix(true, m_weight, m_subtree, m_places); }
    float getWeight() const { return m_weight; }

    /// Whether a target is to be written to.
    /// @param node  null for what is no node, which is in no subtree.
    bool reaches(const SceneNode* node) const { return !m_subtree || isBelow(node); }

    /// For an animator that cannot tell what its target has, and so cannot mix: it writes with a weight of a half or more.
    bool isMostly() const { return m_weight >= 0.5f && !m_subtree; }

    /// What to write to a target.
    /// @param place    tells it from all other targets: the address of what is written to.
    /// @param current  what it has now; exactly what was written last, unless somebody else wrote since.
    /// @param value    what the animation would have.
    Vector4f resolve(const void* place, const Vector4f& current, const Vector4f& value) const;
    Quaternionf resolve(const void* place, const Quaternionf& current, const Quaternionf& value) const;
    float resolve(const void* place, float current, float value) const;

    /// The value that lies share of the way between two keys: straight, component by component; a rotation as slerp()
    /// has it. Where one of them is not finite, the first holds until the second, as stepped ones do.
    static Vector4f between(const Vector4f& from, const Vector4f& to, float share);
    static Quaternionf between(const Quaternionf& from, const Quaternionf& to, float share);
    static Vector3f between(const Vector3f& from, const Vector3f& to, float share);
    static Colour4f between(const Colour4f& from, const Colour4f& to, float share);
    static float between(float from, float to, float share);

    /// How far a time lies between two, 0 up to, without, 1. 0 where that is no number (equal or infinite times).
    static float getShare(float from, float to, float time);

private:
    bool isBelow(const SceneNode* node) const;
    template <class T>
    ORV_LOCAL T resolveAs(const void* place, const T& current, const T& value) const;

    bool m_isInterpolated = false;
    float m_weight = 1.0f;
    const SceneNode* m_subtree = nullptr;
    detail::MixedPlaces* m_places = nullptr;
};

} // namespace orv
