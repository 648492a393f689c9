#pragma once

#include "orv/detail/glorecords.h"
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

    /// The one that goes by the material's name.
    const SharedPtr<Appearance>& getAppearance() const { return m_uses.front().appearance; }

    /// Calls use with each appearance that there is.
    void forEachAppearance(const std::function<void(const SharedPtr<Appearance>&)>& use) const;

    /// An animated colour or level: shader features and blending follow what it reaches, not only what the file
    /// starts with.
    void reach(const char* property, const Vector4f& value);
    void reach(const char* property, float value);

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
