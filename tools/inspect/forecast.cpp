#include "forecast.h"

#include "glocost.h"
#include "images.h"
#include "names.h"

#include "orv/detail/glomaterialrules.h"
#include "orv/detail/glovertices.h"

#include <map>
#include <set>

namespace inspect
{

using namespace orv::detail::glo;

namespace
{

constexpr const char* DEFAULT_PROGRAM = "orv#max_pvl.sp$DIFF$SPEC$AMBI$EMIS";

uint64_t countTriangles(const PrimitiveSet& set, uint64_t vertexCount)
{
    const uint64_t count = set.indices ? set.indices->indices.size() : vertexCount;
    switch (set.primitive)
    {
    case primitive::POINTS:
    case primitive::LINE_STRIP:
    case primitive::LINE_LOOP:
    case primitive::LINES: return 0;
    case primitive::TRIANGLES: return count / 3;
    default: return count < 3 ? 0 : count - 2;
    }
}

float readKey(const Channel& channel, size_t key, uint32_t coefficient)
{
    const uint32_t size = type::SIZES[channel.type];
    const size_t keySize = 4 + size_t(channel.coefficientCount) * size;
    const size_t at = key * keySize + 4 + coefficient * size;
    return at + size <= channel.keys.size() ? readComponent(&channel.keys[at], getFormat(channel.type), false)
                                            : 0.0f;
}

class Forecaster
{
public:
    Forecaster(const ScannedFile& file, const std::filesystem::path& folder)
        : m_file(file)
        , m_geometries(firstByName(file.scene.geometries))
        , m_skins(firstByName(file.scene.skins))
        , m_isAffordable(isAffordable(file))
        , m_images(folder)
    {
    }

    Forecast make()
    {
        for (const Material& material : m_file.scene.materials)
        {
            if (!material.techniques.empty())
                m_materials[material.name] = material.techniques.back();
        }
        for (const AnimationData& animation : m_file.scene.animations)
            addAnimation(animation);
        for (const Geometry& geometry : m_file.scene.geometries)
            addGeometry(geometry);
        if (m_file.scene.scene)
            addNode(m_file.scene.scene->top);
        for (const auto& [name, material] : m_materials)
            addTextures(material);
        for (const auto& [name, draws] : m_programs)
            m_forecast.programs.push_back({name, draws});
        return m_forecast;
    }

private:
    void addAnimation(const AnimationData& animation)
    {
        for (const Channel& channel : animation.channels)
        {
            m_forecast.keys += channel.keyCount;
            m_forecast.interpolated += channel.interpolation == interpolation::LINEAR ? channel.keyCount : 0;
            const auto material = m_materials.find(std::string(getTargetName(channel.targetName)));
            if (channel.targetType == "material" && channel.type <= type::FLOAT &&
                material != m_materials.end())
                reachAll(material->second, channel);
        }
        for (const AnimationData& inner : animation.animations)
            addAnimation(inner);
    }

    static void reachAll(StandardMaterial& material, const Channel& channel)
    {
        for (uint32_t key = 0; key < channel.keyCount; ++key)
        {
            if (channel.coefficientCount == 1)
                reach(material, channel.property, readKey(channel, key, 0));
            else if (channel.coefficientCount >= 3)
                reach(material, channel.property,
                      orv::Vector4f(readKey(channel, key, 0), readKey(channel, key, 1),
                                    readKey(channel, key, 2), 1.0f));
        }
    }

    void addGeometry(const Geometry& geometry)
    {
        m_forecast.vertices += geometry.vertices.vertexCount;
        m_forecast.vertexBytes += geometry.vertices.data.bytes.size();
        for (const PrimitiveSet& set : geometry.primitiveSets)
            m_forecast.indexBytes += set.indices ? set.indices->indices.size() * 2 : 0;
    }

    void addNode(const NodeData& node)
    {
        ++m_forecast.nodes;
        if (node.geometry)
            addDraws(node.geometry->geometry, node.geometry->materials, false);
        if (node.skin)
        {
            const Skin* skin = find(m_skins, node.skin->skin);
            if (skin)
                addDraws(skin->geometry, node.skin->materials, true);
        }
        for (const NodeData& child : node.children)
            addNode(child);
    }

    void addDraws(const std::string& name, const std::vector<std::string>& materials, bool skinned)
    {
        const Geometry* geometry = find(m_geometries, name);
        if (!geometry || !m_isAffordable)
            return;
        for (size_t i = 0; i < geometry->primitiveSets.size(); ++i)
        {
            const PrimitiveSet& set = geometry->primitiveSets[i];
            ++m_forecast.draws;
            m_forecast.triangles += countTriangles(set, geometry->vertices.vertexCount);
            const auto material = i < materials.size() ? m_materials.find(materials[i]) : m_materials.end();
            const std::string program =
                material != m_materials.end()
                    ? getProgramName(m_file.version, m_file.tool, material->first, material->second, skinned)
                    : std::string(DEFAULT_PROGRAM) + (skinned ? "$SKIN" : "");
            ++m_programs[program];
        }
    }

    void addTextures(const StandardMaterial& material)
    {
        for (const ColourField* field :
             {&material.ambient, &material.diffuse, &material.specular, &material.emissive})
            addTexture(field->sampler, "orv#white.png");
        addTexture(material.reflection.sampler, nullptr);
        for (const SamplerField* field :
             {&material.bump, &material.refraction, &material.filterColour, &material.displacement,
              &material.gloss, &material.specularLevelMap})
            addTexture(*field, nullptr);
    }

    /// @param otherwise  the replacement for none; may be null.
    void addTexture(const SamplerField& field, const char* otherwise)
    {
        if (!hasImage(field) && !otherwise)
            return;
        const std::string name = hasImage(field) ? field->image : otherwise;
        const bool cube = hasImage(field) && field->type == sampler::TEXTURE_CUBE;
        const bool usable = !hasImage(field) || field->type <= sampler::TEXTURE_CUBE;
        const ImageSize size = usable ? m_images.measure(name, cube) : ImageSize();
        const bool readable = size.state == ImageState::READABLE;
        if (m_textures.insert(readable ? name : "orv#missing.png").second)
            m_forecast.textureBytes +=
                readable ? size.gpuBytes : m_images.measure("orv#missing.png", false).gpuBytes;
    }

    const ScannedFile& m_file;
    ByName<Geometry> m_geometries;
    ByName<Skin> m_skins;
    bool m_isAffordable; ///< if false, nothing is drawn
    Images m_images;
    Forecast m_forecast;
    std::map<std::string, StandardMaterial> m_materials; ///< including values reached by animations
    std::map<std::string, int> m_programs;
    std::set<std::string> m_textures;
};

} // namespace

Forecast forecast(const ScannedFile& file, const std::filesystem::path& folder)
{
    return Forecaster(file, folder).make();
}

} // namespace inspect
