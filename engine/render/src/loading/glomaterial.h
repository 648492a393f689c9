#pragma once

#include "orv/detail/glomaterialrules.h"
#include "orv/sharedptr.h"

#include <functional>
#include <map>
#include <string>
#include <vector>

namespace orv
{

class Appearance;
class AssetCachePool;

namespace detail
{

/// One material of a scene file.
///
/// Skinned and plain geometry need different programs. A material that is used by both gets a second appearance, a copy
/// of the first. The material's name refers to the first; animations change both.
class GloMaterial
{
public:
    GloMaterial(AssetCachePool& pool, glo::FileVersion version, glo::AuthoringTool tool,
                const std::string& name, const glo::StandardMaterial& data);

    /// The appearance for geometry of that kind.
    SharedPtr<Appearance> use(bool skinned);

    /// The one to which the material's name refers; empty without memory.
    const SharedPtr<Appearance>& getAppearance() const { return m_uses.front().appearance; }

    /// Calls use with each appearance, and whether it is for skinned geometry.
    void forEachAppearance(const std::function<void(const SharedPtr<Appearance>&, bool skinned)>& use) const;

    /// Notes a key of an animation: program and blending must fit all values that the material takes.
    /// @param property  of the channel, "diffuse" or "opacity".
    template <class T>
    void reach(const std::string& property, const T& value)
    {
        glo::reach(m_data, property, value);
    }

    /// Once all uses are known: fetches the programs.
    void choosePrograms();

private:
    struct Use
    {
        bool skinned;
        SharedPtr<Appearance> appearance;
    };

    void setValues(Appearance& appearance) const;
    void setTexture(Appearance& appearance, const char* property, const glo::SamplerField& field,
                    bool whiteWhenEmpty) const;
    void setState(Appearance& appearance) const;

    AssetCachePool* m_pool;
    glo::FileVersion m_version;
    glo::AuthoringTool m_tool;
    std::string m_name;
    glo::StandardMaterial m_data; ///< colours and levels, including those of animations
    std::vector<Use> m_uses;
    bool m_used = false;
};

} // namespace detail

} // namespace orv
