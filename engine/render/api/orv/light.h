#pragma once

#include "orv/angle.h"
#include "orv/colour.h"
#include "orv/scenenode.h"

#include <cstdint>
#include <string>

namespace orv
{

/// A light: shines from its position, or along its -z axis.
///
/// The active flag is stored for the application; renderers do not consult it. To switch a light off hide it
/// with scene flags.
class ORV_API Light : public SceneNode
{
public:
    ORV_CLASS_NAME("Light")
    using Ptr = SharedPtr<Light>;
    static constexpr NodeType NODE_TYPE = 3; ///< What getNodeType() says of a light.

    /// How the light shines: from a place, from far away, or in a cone.
    enum class LightType : int32_t
    {
        POINT = 0,
        DIRECTIONAL = 1,
        SPOT = 2
    };

    Light() = default;
    explicit Light(const char* name) : SceneNode(name) {} ///< The name is copied; it may be null.

    NodeType getNodeType() const override { return NODE_TYPE; }
    void accept(SceneNodeVisitor& visitor) override;

    bool isActive() const { return m_active; } ///< Whether it shines; true at first.
    void setActive(bool active) { m_active = active; }

    LightType getLightType() const { return m_lightType; } ///< A point light at first.
    void setLightType(LightType type) { m_lightType = type; }

    /// A factor on the colour, 1 at first.
    float getIntensity() const { return m_intensity; }
    void setIntensity(float intensity) { m_intensity = intensity; }

    /// Whether the light falls off with distance, from full at near to none at far; off at first.
    bool isAttenuated() const { return m_attenuated; }
    void setAttenuated(bool attenuated) { m_attenuated = attenuated; }

    /// Distances in the light's own units (its world scale along x counts). Setters take absolute values.
    float getAttenuationNear() const { return m_attenuationNear; }
    float getAttenuationFar() const { return m_attenuationFar; }
    void setAttenuationNear(float distance);
    void setAttenuationFar(float distance);

    /// Full cone angles, edge to edge: full light inside inner, none outside outer. Setters take absolute
    /// values.
    const Anglef& getSpotInnerAngle() const { return m_spotInnerAngle; }
    const Anglef& getSpotOuterAngle() const { return m_spotOuterAngle; }
    void setSpotInnerAngle(const Anglef& angle);
    void setSpotOuterAngle(const Anglef& angle);

    const Colour4f& getColour() const { return m_colour; } ///< White at first.
    void setColour(const Colour4f& colour) { m_colour = colour; }

    /// The part of the colour that reaches every surface, 0 at first.
    float getAmbientLevel() const { return m_ambientLevel; }
    void setAmbientLevel(float level) { m_ambientLevel = level; }

    /// The name of the light itself, beside that of the node.
    const char* getLightName() const { return m_lightName.c_str(); }
    /// @param name  copied; null counts as empty.
    void setLightName(const char* name);

private:
    bool m_active = true;
    LightType m_lightType = LightType::POINT;
    float m_intensity = 1.0f;
    float m_attenuationNear = 1.0f;
    float m_attenuationFar = 1000.0f;
    Anglef m_spotInnerAngle = Anglef::fromDegrees(30.0f);
    Anglef m_spotOuterAngle = Anglef::fromDegrees(45.0f);
    Colour4f m_colour = Colour4f(1.0f, 1.0f, 1.0f, 1.0f);
    float m_ambientLevel = 0.0f;
    bool m_attenuated = false;
    std::string m_lightName;
};

} // namespace orv
