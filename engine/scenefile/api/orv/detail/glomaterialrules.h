#pragma once

#include "orv/detail/glorecords.h"

#include <algorithm>
#include <string>
#include <string_view>

/// Rules that derive program and state from a material's values, for the loader and the inspector.
namespace orv::detail::glo
{

inline bool hasImage(const SamplerField& field)
{
    return field && !field->image.empty();
}

/// A black colour switches its shader feature off.
inline bool isBlack(const Vector4f& colour)
{
    return colour.x == 0.0f && colour.y == 0.0f && colour.z == 0.0f;
}

inline bool isBlended(const StandardMaterial& material)
{
    return material.opacity < 1.0f && !(material.features & surface::CUTOFF);
}

/// Copies the features of the SURF chunk to their materials.
inline void applySurfaces(GloScene& scene)
{
    for (const Surface& surface : scene.surfaces.list)
    {
        if (surface.material >= scene.materials.size() ||
            scene.materials[surface.material].techniques.empty())
            continue;
        StandardMaterial& material = scene.materials[surface.material].techniques.back();
        material.features = surface.features;
        material.cutoff = surface.cutoff;
    }
}

/// Notes a value that an animated colour or level takes: shader features and blending must fit all such values, not
/// only the first.
/// @param property  of the channel, "diffuse" or "opacity".
inline void reach(StandardMaterial& material, std::string_view property, const Vector4f& value)
{
    const auto widen = [&](const char* name, Vector4f& colour)
    {
        if (property == name && isBlack(colour))
            colour = value;
    };
    widen("diffuse", material.diffuse.colour);
    widen("ambient", material.ambient.colour);
    widen("emission", material.emissive.colour);
    widen("specular", material.specular.colour);
}

inline void reach(StandardMaterial& material, std::string_view property, float value)
{
    if (property == "specular_level")
        material.specularLevel = std::max(material.specularLevel, value);
    else if (property == "opacity")
        material.opacity = std::min(material.opacity, value);
}

/// The asset name of the program that draws the material, with its defines in their fixed order.
inline std::string getProgramName(FileVersion version, AuthoringTool tool, const std::string& materialName,
                                  const StandardMaterial& material, bool skinned)
{
    if (!hasMaterialFeatures(version))
        return "orv#fallback.sp";
    const bool bump = hasImage(material.bump);
    const bool reflection = hasImage(material.reflection.sampler);
    const bool fromMax = tool == AuthoringTool::MAX;
    const bool perPixel = bump || materialName.find("zun_ppl") != std::string::npos;

    std::string name = perPixel ? "orv#max_ppl.sp" : "orv#max_pvl.sp";
    const auto feature = [&name](bool wanted, const char* define)
    {
        if (wanted)
            name += define;
    };
    feature(bump, "$BUMP");
    feature(bump && fromMax, "$INVY");
    feature(fromMax, "$INVSQROOT");
    feature(!isBlack(material.diffuse.colour), "$DIFF");
    feature(material.specularLevel > 0.0f && !isBlack(material.specular.colour), "$SPEC");
    feature(!isBlack(material.ambient.colour), "$AMBI");
    feature(reflection, "$REFL");
    feature(reflection && material.reflection.sampler->type == sampler::TEXTURE_CUBE, "$CUBE");
    feature(!isBlack(material.emissive.colour), "$EMIS");
    for (const surface::Feature& further : surface::FEATURES)
        feature(material.features & further.bit, further.define);
    feature(skinned, "$SKIN");
    return name;
}

} // namespace orv::detail::glo
