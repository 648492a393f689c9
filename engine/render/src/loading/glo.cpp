#include "orv/glo.h"

#include "orv/animationgroup.h"
#include "orv/appearance.h"
#include "orv/camera.h"
#include "orv/light.h"

namespace orv
{

Glo::Glo() : m_fileVersion(0, 0, 0, nullptr) {}

Glo::~Glo() = default;

const char* Glo::getAnimationName(int index) const
{
    return index >= 0 && index < getAnimationCount() ? m_animations[size_t(index)].name.c_str() : nullptr;
}

SharedPtr<AnimationGroup> Glo::getAnimation(int index) const
{
    return index >= 0 && index < getAnimationCount() ? m_animations[size_t(index)].group
                                                     : SharedPtr<AnimationGroup>();
}

SharedPtr<AnimationGroup> Glo::getAnimation(const char* name) const
{
    for (const NamedAnimation& animation : m_animations)
    {
        if (name && animation.name == name)
            return animation.group;
    }
    return {};
}

template <class T>
SharedPtr<T> Glo::at(const std::vector<Placed<T>>& all, int index)
{
    return index >= 0 && size_t(index) < all.size() ? all[size_t(index)].node : SharedPtr<T>();
}

template <class T>
SharedPtr<T> Glo::find(const std::vector<Placed<T>>& all, const char* name)
{
    if (!name)
        return {};
    for (const Placed<T>& placed : all)
    {
        if (std::string(name) == placed.node->getName())
            return placed.node;
    }
    for (const Placed<T>& placed : all)
    {
        if (placed.definition == name)
            return placed.node;
    }
    return {};
}

SharedPtr<Camera> Glo::getCamera(int index) const
{
    return at(m_cameras, index);
}

SharedPtr<Light> Glo::getLight(int index) const
{
    return at(m_lights, index);
}

SharedPtr<Camera> Glo::getCamera(const char* name) const
{
    return find(m_cameras, name);
}

SharedPtr<Light> Glo::getLight(const char* name) const
{
    return find(m_lights, name);
}

SharedPtr<Appearance> Glo::find(const Appearances& all, const char* name)
{
    const auto found = name ? all.find(name) : all.end();
    return found != all.end() ? found->second : SharedPtr<Appearance>();
}

SharedPtr<Appearance> Glo::getAppearance(const char* name) const
{
    return find(m_appearances, name);
}

SharedPtr<Appearance> Glo::getAppearance(const char* name, bool skinned) const
{
    return find(m_kinds[skinned ? 1 : 0], name);
}

} // namespace orv
