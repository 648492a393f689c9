#include "globuilder.h"

#include "orv/animationchannel.h"
#include "orv/animationgroup.h"
#include "orv/animationkeysequence.h"
#include "orv/detail/glolog.h"
#include "orv/detail/littleendian.h"
#include "orv/interpolatedanimation.h"
#include "orv/light.h"
#include "orv/sceneanimators.h"

#include <cmath>
#include <cstring>

namespace orv::detail
{

using namespace glo;

namespace
{

/// A value of a key's coefficients.
template <class T>
struct KeyValue;

template <>
struct KeyValue<float>
{
    static float make(const float* c) { return c[0]; }
};

template <>
struct KeyValue<Vector3f>
{
    static Vector3f make(const float* c) { return Vector3f(c[0], c[1], c[2]); }
};

/// An axis and an angle.
template <>
struct KeyValue<Vector4f>
{
    static Vector4f make(const float* c) { return Vector4f(c[0], c[1], c[2], c[3]); }
};

template <>
struct KeyValue<Colour4f>
{
    static Colour4f make(const float* c) { return Colour4f(c[0], c[1], c[2], c[3]); }
};

float readFloat(const uint8_t* bytes)
{
    const uint32_t word = readLittleEndian(bytes);
    float value;
    std::memcpy(&value, &word, sizeof(value));
    return value;
}

/// Integers are converted, not normalised.
float readCoefficient(const uint8_t* bytes, uint32_t type)
{
    switch (type)
    {
    case type::INT8: return float(int8_t(bytes[0]));
    case type::UINT8: return float(bytes[0]);
    case type::INT16: return float(int16_t(bytes[0] | bytes[1] << 8));
    case type::UINT16: return float(bytes[0] | bytes[1] << 8);
    default: return readFloat(bytes);
    }
}

template <class T>
bool readKeys(const Channel& channel, const char* fileName, std::vector<AnimationKey<T>>& keys)
{
    const uint32_t size = type::SIZES[channel.type];
    const uint8_t* bytes = channel.keys.data();
    for (uint32_t i = 0; i < channel.keyCount; ++i)
    {
        const float time = readFloat(bytes);
        bytes += 4;
        float coefficients[4] = {0.0f, 0.0f, 0.0f, 1.0f};
        for (uint32_t c = 0; c < channel.coefficientCount; ++c, bytes += size)
            coefficients[c] = readCoefficient(bytes, channel.type);
        if (std::isnan(time))
        {
            ORV_GLO_ERROR("\"%s\" of \"%s\" has a key whose time is not a number in %s",
                          channel.property.c_str(), channel.targetName.c_str(), fileName);
            return false;
        }
        keys.push_back({time, KeyValue<T>::make(coefficients)});
    }
    return true;
}

template <class T>
SharedPtr<AnimatedValue<T>> makeValue(const Channel& channel, const char* fileName)
{
    std::vector<AnimationKey<T>> keys;
    if (!readKeys(channel, fileName, keys))
        return {};
    return makeShared<AnimationKeySequence<T>>(std::move(keys)); // sorts them
}

void add(const Channel& channel, const Animation::Ptr& animation, AnimationGroup& group)
{
    const bool isInterpolated = animation && channel.interpolation == interpolation::LINEAR;
    group.addAnimation(isInterpolated ? Animation::Ptr(makeShared<InterpolatedAnimation>(animation))
                                      : animation);
}

template <class T, class SomeAnimator>
bool addChannel(const Channel& channel, const char* fileName, const SharedPtr<SomeAnimator>& animator,
                AnimationGroup& group)
{
    const SharedPtr<AnimatedValue<T>> value = makeValue<T>(channel, fileName);
    if (!value)
        return false;
    add(channel, createAnimationChannel<T>(value, animator), group);
    return true;
}

/// All lights share the keys.
template <class T, class LightAnimator>
bool addLightChannels(const Channel& channel, const char* fileName,
                      const std::vector<SharedPtr<Light>>& lights, AnimationGroup& group)
{
    const SharedPtr<AnimatedValue<T>> value = makeValue<T>(channel, fileName);
    if (!value)
        return false;
    for (const SharedPtr<Light>& light : lights)
        add(channel, createAnimationChannel<T>(value, makeShared<LightAnimator>(light)), group);
    return true;
}

struct MaterialProperty
{
    const char* name;
    const char* property;
    bool isColour;
};

constexpr MaterialProperty MATERIAL_PROPERTIES[] = {
    {"ambient", "M_AMBIENT_COLOUR", true},
    {"diffuse", "M_DIFFUSE_COLOUR", true},
    {"specular", "M_SPECULAR_COLOUR", true},
    {"emission", "M_EMISSIVE_COLOUR", true},
    {"self_illumination", "M_SELF_ILLUMINATION", false},
    {"specular_level", "M_SPECULAR_LEVEL", false},
    {"shininess", "M_SHININESS", false},
    {"opacity", "M_OPACITY", false},
};

const MaterialProperty* findMaterialProperty(const std::string& name)
{
    for (const MaterialProperty& known : MATERIAL_PROPERTIES)
    {
        if (name == known.name)
            return &known;
    }
    return nullptr;
}

template <class T>
bool addMaterialChannels(const Channel& channel, const std::vector<AnimationKey<T>>& keys,
                         const MaterialProperty& property, GloMaterial& material, AnimationGroup& group)
{
    for (const AnimationKey<T>& key : keys)
        material.reach(property.name, key.value);
    const SharedPtr<AnimatedValue<T>> value = makeShared<AnimationKeySequence<T>>(keys);
    material.forEachAppearance(
        [&](const SharedPtr<Appearance>& appearance, bool)
        {
            const auto animator = makeShared<AppearancePropertyAnimator<T>>(appearance, property.property);
            add(channel, createAnimationChannel<T>(value, animator), group);
        });
    return true;
}

} // namespace

bool GloBuilder::makeAnimation(const AnimationData& data, AnimationGroup& group)
{
    if (!data.loopRanges.empty())
    {
        m_glo->m_loopBegin = data.loopRanges.back().begin;
        m_glo->m_loopEnd = data.loopRanges.back().end;
    }
    for (const Channel& channel : data.channels)
    {
        if (!makeChannel(channel, group))
            return false;
    }
    for (const AnimationData& inner : data.animations)
    {
        const SharedPtr<AnimationGroup> innerGroup = makeShared<AnimationGroup>();
        if (!innerGroup)
            return false;
        group.addAnimation(innerGroup);
        if (!makeAnimation(inner, *innerGroup))
            return false;
    }
    return true;
}

bool GloBuilder::makeChannel(const Channel& channel, AnimationGroup& group)
{
    const std::string target(getTargetName(channel.targetName));
    const char* const property = channel.property.c_str();
    if (channel.type > type::FLOAT)
    {
        ORV_GLO_WARN("Ignoring \"%s\" of \"%s\" in %s: keys of the type %u have no meaning", property,
                     channel.targetName.c_str(), m_name, channel.type);
        return true;
    }
    const ChannelKind* kind = findChannelKind(channel.targetType, channel.property);
    if (!kind)
    {
        ORV_GLO_WARN("Ignoring unknown property in %s", m_name);
        return true;
    }
    if (channel.coefficientCount < kind->fewestCoefficients ||
        channel.coefficientCount > kind->mostCoefficients)
    {
        ORV_GLO_ERROR("\"%s\" of \"%s\" has %u coefficients per key in %s; wanted are %u", property,
                      channel.targetName.c_str(), channel.coefficientCount, m_name, kind->mostCoefficients);
        return false;
    }
    if (channel.targetType == "node")
        return makeNodeChannel(channel, target, group);
    if (channel.targetType == "light")
        return makeLightChannel(channel, target, group);
    return makeMaterialChannel(channel, target, group);
}

bool GloBuilder::makeNodeChannel(const Channel& channel, const std::string& target, AnimationGroup& group)
{
    const NameRange nodes = findName(m_names, target);
    if (nodes.begin == nodes.end)
        return fail("Animation node not present in %s");
    const SharedPtr<SceneNode> node(m_places[nodes.begin->place].node);
    if (channel.property == "translation")
        return addChannel<Vector3f>(channel, m_name, makeShared<SceneNodePositionAnimator>(node), group);
    if (channel.property == "rotation")
        return addChannel<Vector4f>(channel, m_name, makeShared<SceneNodeRotationAnimator>(node), group);
    return addChannel<Vector3f>(channel, m_name, makeShared<SceneNodeScaleAnimator>(node), group);
}

/// The target is the definition: every light made from it gets the channel.
bool GloBuilder::makeLightChannel(const Channel& channel, const std::string& target, AnimationGroup& group)
{
    if (m_lightDefinitions.find(target) == m_lightDefinitions.end())
        return fail("No light for animation in %s");
    const auto [begin, end] = m_lights.equal_range(target);
    std::vector<SharedPtr<Light>> lights;
    for (auto light = begin; light != end; ++light)
        lights.push_back(light->second);
    if (!spend(GloCredit::lightChannels(lights.size())))
        return false;
    if (channel.property == "colour")
        return addLightChannels<Colour4f, LightColourAnimator>(channel, m_name, lights, group);
    return addLightChannels<float, LightIntensityAnimator>(channel, m_name, lights, group);
}

bool GloBuilder::makeMaterialChannel(const Channel& channel, const std::string& target, AnimationGroup& group)
{
    const auto found = m_materials.find(target);
    if (found == m_materials.end())
        return fail("No appearance material for animation in %s");
    const MaterialProperty& property = *findMaterialProperty(channel.property);
    if (!property.isColour)
    {
        std::vector<AnimationKey<float>> keys;
        return readKeys(channel, m_name, keys) &&
               addMaterialChannels(channel, keys, property, found->second, group);
    }
    std::vector<AnimationKey<Colour4f>> colours;
    if (!readKeys(channel, m_name, colours))
        return false;
    std::vector<AnimationKey<Vector4f>> keys;
    keys.reserve(colours.size());
    for (const AnimationKey<Colour4f>& key : colours)
        keys.push_back({key.time, Vector4f(key.value.r, key.value.g, key.value.b, key.value.a)});
    return addMaterialChannels(channel, keys, property, found->second, group);
}

} // namespace orv::detail
