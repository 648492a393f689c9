#include "shadowprograms.h"

#include "orv/detail/embeddedassets.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/memorystreamsource.h"
#include "orv/renderdevice.h"
#include "orv/shaderprogramcache.h"

#include <algorithm>
#include <initializer_list>

namespace orv::detail
{

namespace
{

constexpr int ROOMY_VERTICES = 129; // enough uniform vectors for all features
constexpr int ROOMY_FRAGMENTS = 32;

bool hasFeature(const std::string& name, const char* feature)
{
    const std::string looked = std::string("$") + feature;
    for (size_t at = name.find(looked); at != std::string::npos; at = name.find(looked, at + 1))
    {
        const size_t end = at + looked.size();
        if (end == name.size() || name[end] == '$')
            return true;
    }
    return false;
}

bool hasFeatures(const std::string& name, std::initializer_list<const char*> features)
{
    return std::all_of(features.begin(), features.end(),
                       [&](const char* feature) { return hasFeature(name, feature); });
}

/// Whether a lit program has room for shadows on this device; see ShaderAssets.fitTheSmallestDevice.
bool hasRoom(const std::string& name, bool isByPixel)
{
    if (!isByPixel)
        return RenderDevice::getMaxVertexUniformVectors() >= ROOMY_VERTICES || hasFeature(name, "CUBE") ||
               !hasFeatures(name, {"DIFF", "AMBI", "REFL", "LINEAR", "SKIN"});
    if (hasFeatures(name, {"BUMP", "DIFF", "SPEC", "AMBI", "REFL", "EMIS"}))
        return false; // has eight textures already
    return RenderDevice::getMaxFragmentUniformVectors() >= ROOMY_FRAGMENTS ||
           !hasFeatures(name, {"DIFF", "SPEC", "EMIS"});
}

} // namespace

SharedPtr<MemoryStreamSource> createShadowAssets()
{
    const SharedPtr<MemoryStreamSource> source = makeShared<MemoryStreamSource>();
    for (size_t i = 0; source && i < SHADOW_ARCHIVE.count; ++i)
    {
        const EmbeddedAsset& asset = SHADOW_ARCHIVE.assets[i];
        const SharedPtr<MemoryStream> stream = makeShared<MemoryStream>(asset.bytes, asset.size);
        if (!stream)
            return {};
        source->add(asset.name, stream);
    }
    return source;
}

ShadowPrograms::ShadowPrograms(const SharedPtr<AssetCachePool>& pool) : m_pool(pool)
{
    if (!m_pool->getStream("shadow#depth.sp"))
        m_pool->registerSource(createShadowAssets());
}

std::string ShadowPrograms::getName(const ShaderProgram& program) const
{
    const char* const name = m_pool->getShaderProgramCache()->findName(program);
    return name ? name : "";
}

ShadowAnswer ShadowPrograms::findLit(const Appearance& appearance, SharedPtr<ShaderProgram>& program) const
{
    const SharedPtr<ShaderProgram>& own = appearance.getShaderProgram();
    if (!own)
        return ShadowAnswer::STAYS;
    if (own->uniformExists("S_DEPTHS"))
    {
        program = own;
        return ShadowAnswer::TAKES;
    }
    const std::string name = getName(*own);
    const bool isByPixel = name.rfind("orv#max_ppl.sp$", 0) == 0;
    if (!isByPixel && name.rfind("orv#max_pvl.sp$", 0) != 0)
        return ShadowAnswer::STAYS;
    const bool isLit = hasFeature(name, "DIFF") || hasFeature(name, "SPEC");
    if (!isLit || (!isByPixel && hasFeature(name, "UNLIT")))
        return ShadowAnswer::STAYS;
    if (!hasRoom(name, isByPixel))
        return ShadowAnswer::NO_ROOM;

    const bool isSheet = appearance.getRenderState().cullingMode == CullingMode::CULL_NONE;
    const std::string wanted = "shadow#" + name.substr(4) + "$SHADOW" + (isSheet ? "$SHEET" : "");
    program = m_pool->getShaderProgramCache()->get(wanted.c_str());
    return program && program->uniformExists("S_DEPTHS") ? ShadowAnswer::TAKES : ShadowAnswer::NO_PROGRAM;
}

SharedPtr<ShaderProgram> ShadowPrograms::findDepth(const ShaderProgram& program) const
{
    std::string wanted = "shadow#depth.sp";
    if (program.usesJoints())
        wanted += "$SKIN";
    if (program.uniformExists("M_CUTOFF"))
    {
        wanted += "$CUTOFF";
        if (program.uniformExists("M_DIFFUSE_TEXTURE"))
            wanted += "$DIFF";
        if (hasFeature(getName(program), "VCOL"))
            wanted += "$VCOL";
    }
    return m_pool->getShaderProgramCache()->get(wanted.c_str());
}

} // namespace orv::detail
