#include "glocost.h"

#include "names.h"

#include "orv/detail/glocredit.h"

namespace inspect
{

using namespace orv::detail::glo;

namespace
{

class Payer
{
public:
    explicit Payer(const ScannedFile& file)
        : m_scene(file.scene)
        , m_geometries(firstByName(m_scene.geometries))
        , m_skins(firstByName(m_scene.skins))
        , m_credit(file.size)
    {
    }

    bool payAll()
    {
        if (m_scene.scene && !payNode(m_scene.scene->top))
            return false;
        for (const AnimationData& animation : m_scene.animations)
        {
            if (!payAnimation(animation))
                return false;
        }
        return true;
    }

private:
    bool payNode(const NodeData& node)
    {
        if (node.geometry && !m_credit.spend(GloCredit::solids(countSets(node.geometry->geometry))))
            return false;
        if (node.skin && !paySkin(*node.skin))
            return false;
        if (node.light)
            ++m_lights[node.light->light];
        for (const NodeData& child : node.children)
        {
            if (!payNode(child))
                return false;
        }
        return true;
    }

    bool paySkin(const SkinReference& reference)
    {
        const Skin* skin = find(m_skins, reference.skin);
        const size_t sets = skin ? countSets(skin->geometry) : 0;
        return !skin || (m_credit.spend(GloCredit::solids(sets)) &&
                         m_credit.spend(GloCredit::links(reference, *skin, sets)));
    }

    bool payAnimation(const AnimationData& animation)
    {
        for (const Channel& channel : animation.channels)
        {
            const auto lights = m_lights.find(std::string(getTargetName(channel.targetName)));
            if (channel.targetType == "light" && lights != m_lights.end() && channel.type <= type::FLOAT &&
                findChannelKind(channel.targetType, channel.property) &&
                !m_credit.spend(GloCredit::lightChannels(lights->second)))
                return false;
        }
        for (const AnimationData& inner : animation.animations)
        {
            if (!payAnimation(inner))
                return false;
        }
        return true;
    }

    size_t countSets(const std::string& name) const
    {
        const Geometry* geometry = find(m_geometries, name);
        return geometry ? geometry->primitiveSets.size() : 0;
    }

    const GloScene& m_scene;
    ByName<Geometry> m_geometries;
    ByName<Skin> m_skins;
    std::map<std::string, size_t> m_lights; ///< made of each definition
    GloCredit m_credit;
};

} // namespace

bool isAffordable(const ScannedFile& file)
{
    return Payer(file).payAll();
}

} // namespace inspect
