#pragma once

#include "orv/animator.h"
#include "orv/colour.h"
#include "orv/export.h"
#include "orv/propertyref.h"
#include "orv/sharedptr.h"
#include "orv/vector.h"

namespace orv
{

class Appearance;
class Light;
class SceneNode;

/// The animators of scene objects. Each shares its target; one without a target logs an error each time it is
/// applied and does nothing. All of them mix: see AnimationMix.

class ORV_API SceneNodePositionAnimator : public Animator<Vector3f>
{
public:
    ORV_CLASS_NAME("SceneNodePositionAnimator")
    using Ptr = SharedPtr<SceneNodePositionAnimator>;

    explicit SceneNodePositionAnimator(const SharedPtr<SceneNode>& node); ///< Shares the node.
    ~SceneNodePositionAnimator() override;
    void apply(const Vector3f& position) override;
    void applyMixed(const Vector3f& from, const Vector3f& to, float share, const AnimationMix& mix) override;

private:
    SharedPtr<SceneNode> m_node;
};

/// Turns a node: x, y and z are the axis, w the angle in radians.
class ORV_API SceneNodeRotationAnimator : public Animator<Vector4f>
{
public:
    ORV_CLASS_NAME("SceneNodeRotationAnimator")
    using Ptr = SharedPtr<SceneNodeRotationAnimator>;

    explicit SceneNodeRotationAnimator(const SharedPtr<SceneNode>& node); ///< Shares the node.
    ~SceneNodeRotationAnimator() override;
    /// @param axisAngle  axis x, y, z, taken as it is (not normalised), and angle in radians.
    void apply(const Vector4f& axisAngle) override;
    void applyMixed(const Vector4f& from, const Vector4f& to, float share, const AnimationMix& mix) override;

private:
    SharedPtr<SceneNode> m_node;
};

/// Leaves the node alone, and so its transform clean, while the value stays the one it applied last.
class ORV_API SceneNodeScaleAnimator : public Animator<Vector3f>
{
public:
    ORV_CLASS_NAME("SceneNodeScaleAnimator")
    using Ptr = SharedPtr<SceneNodeScaleAnimator>;

    explicit SceneNodeScaleAnimator(const SharedPtr<SceneNode>& node); ///< Shares the node.
    ~SceneNodeScaleAnimator() override;
    void apply(const Vector3f& scale) override;
    void applyMixed(const Vector3f& from, const Vector3f& to, float share, const AnimationMix& mix) override;

private:
    SharedPtr<SceneNode> m_node;
    Vector3f m_lastScale; // not a number before the first apply(), so that any first scale differs
};

/// Sets the colour of a light.
class ORV_API LightColourAnimator : public Animator<Colour4f>
{
public:
    ORV_CLASS_NAME("LightColourAnimator")
    using Ptr = SharedPtr<LightColourAnimator>;

    explicit LightColourAnimator(const SharedPtr<Light>& light); ///< Shares the light.
    ~LightColourAnimator() override;
    void apply(const Colour4f& colour) override;
    void applyMixed(const Colour4f& from, const Colour4f& to, float share, const AnimationMix& mix) override;

private:
    SharedPtr<Light> m_light;
};

/// Sets the intensity of a light.
class ORV_API LightIntensityAnimator : public Animator<float>
{
public:
    ORV_CLASS_NAME("LightIntensityAnimator")
    using Ptr = SharedPtr<LightIntensityAnimator>;

    explicit LightIntensityAnimator(const SharedPtr<Light>& light); ///< Shares the light.
    ~LightIntensityAnimator() override;
    void apply(const float& intensity) override;
    void applyMixed(const float& from, const float& to, float share, const AnimationMix& mix) override;

private:
    SharedPtr<Light> m_light;
};

/// Writes element 0 of a named property, which is created when absent. T is float or Vector4f.
template <class T>
class AppearancePropertyAnimator // NOLINT(cppcoreguidelines-virtual-class-destructor): its base's is virtual
    : public Animator<T>
{
public:
    ORV_CLASS_NAME("AppearancePropertyAnimator")
    using Ptr = SharedPtr<AppearancePropertyAnimator<T>>;

    /// @param name  copied.
    AppearancePropertyAnimator(const SharedPtr<Appearance>& appearance, const char* name)
        : m_appearance(appearance)
        , m_property(name)
    {
    }
    ~AppearancePropertyAnimator() override = default;

    void apply(const T& value) override
    {
        if (Appearance* appearance = m_appearance.getLogged())
            m_property.set(*appearance, value);
    }

    /// An appearance is in no subtree.
    void applyMixed(const T& from, const T& to, float share, const AnimationMix& mix) override
    {
        Appearance* appearance = m_appearance.getLogged();
        if (!appearance || !mix.reaches(nullptr))
            return;
        T value = AnimationMix::between(from, to, share);
        T current;
        if (const void* place = m_property.get(*appearance, current))
            value = mix.resolve(place, current, value);
        m_property.set(*appearance, value);
    }

private:
    SharedPtr<Appearance> m_appearance;
    PropertyRef m_property;
};

} // namespace orv
