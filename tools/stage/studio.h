#pragma once

#include "recordingsource.h"

#include "orv/assetcachepool.h"
#include "orv/rendercontext.h"

#include <memory>
#include <set>
#include <string>
#include <vector>

namespace view
{

/// What there is one of for a GL context, whichever scenes are shown in it one after another.
class Studio
{
public:
    Studio();

    /// Deletes all GL objects; every stage is gone by then.
    ~Studio();

    Studio(const Studio&) = delete;
    Studio& operator=(const Studio&) = delete;

    const orv::RenderContext::Ptr& getContext() const { return m_context; }
    const orv::SharedPtr<orv::AssetCachePool>& getPool() const { return m_pool; }

    /// Assets are looked for in this folder too from now on, after those that were added before.
    void addFolder(const std::string& folder);

    /// The folders in which assets are looked for.
    std::set<std::string> getFolders() const;
    /// Assets are looked for in those of the added folders alone that are among these.
    void limitFolders(const std::set<std::string>& folders);

    /// What is asked for from now on is read from its file again. Assets that a stage holds stay with it.
    void forgetAssets();

    /// Deletes the GL objects of what is no longer held.
    void flush();

    /// The files that were asked for since forgetAssets(), those that do not exist as well.
    std::set<std::string> getAskedFiles() const;

private:
    orv::RenderContext::Ptr m_context;
    orv::SharedPtr<orv::AssetCachePool> m_pool;
    std::vector<std::string> m_folders;
    std::vector<orv::SharedPtr<RecordingSource>> m_sources;
};

} // namespace view
