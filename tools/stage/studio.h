#pragma once

#include "recordingsource.h"
#include "switchedsource.h"

#include "orv/assetcachepool.h"
#include "orv/rendercontext.h"

#include <memory>
#include <set>
#include <string>
#include <vector>

namespace view
{

/// The objects shared by all scenes of a GL context.
class Studio
{
public:
    Studio();

    /// Deletes all GL objects; all stages must be deleted before.
    ~Studio();

    Studio(const Studio&) = delete;
    Studio& operator=(const Studio&) = delete;

    const orv::RenderContext::Ptr& getContext() const { return m_context; }
    const orv::SharedPtr<orv::AssetCachePool>& getPool() const { return m_pool; }

    /// Adds a folder to the search path of assets, as the last one.
    void addFolder(const std::string& folder);

    /// The search path of assets.
    std::set<std::string> getFolders() const;
    /// Restricts the search path to these of the added folders.
    void limitFolders(const std::set<std::string>& folders);

    /// A further place of assets, searched while useSources(true) holds.
    void addSource(const orv::SharedPtr<orv::StreamSource>& source);
    void useSources(bool used); ///< those of addSource(); off at first

    /// From now on, assets are read from their files again. A stage keeps the assets that it holds.
    void forgetAssets();

    /// Deletes the GL objects of unused assets.
    void flush();

    /// The files requested since forgetAssets(), missing ones too.
    std::set<std::string> getAskedFiles() const;

private:
    orv::RenderContext::Ptr m_context;
    orv::SharedPtr<orv::AssetCachePool> m_pool;
    std::vector<std::string> m_folders;
    std::vector<orv::SharedPtr<RecordingSource>> m_sources; ///< one for each folder
    std::vector<orv::SharedPtr<SwitchedSource>> m_otherSources;
};

} // namespace view
