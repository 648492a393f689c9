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
/// Skinned and plain geometry need different programs. A material that is used by both gets a second appearance,
/// a copy of the first, which goes by the material's name; what is animated is animated in both.
class GloMaterial
{
public:
    GloMaterial(AssetCachePool& pool, glo::FileVersion version, glo::AuthoringTool tool,
                const std::string& name, const glo::StandardMaterial& data);

    /// The appearance for geometry of that kind.
    SharedPtr<Appearance> use(bool skinned);

    /// The one that goes by the material's name; empty when there was no memory for it.
    const SharedPtr<Appearance>& getAppearance() const { return m_uses.front().appearance; }

    /// Calls use with each appearance that there is, and whether it is for skinned geometry.
    void forEachAppearance(const std::function<void(const SharedPtr<Appearance>&, bool skinned)>& use) const;

    /// A key of an animation: the programs and the blending are chosen for all that the material comes to.
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
    glo::StandardMaterial m_data; ///< colours and levels as far as animations take them
    std::vector<Use> m_uses;
    bool m_used = false;
};

} // namespace detail

} // namespace orv
