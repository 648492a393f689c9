#pragma once

#include "orv/assetcachepool.h"
#include "orv/rendercontext.h"
#include "orv/simplerenderer.h"

#include <cstdint>
#include <string>
#include <vector>

/// All loaders of the engine, and the rules that hold for any file.
namespace hostile
{

using Bytes = std::vector<uint8_t>;

class Files;

/// A pool and other objects for loaders, used for one file after another.
class Session
{
public:
    Session();
    ~Session();

    /// Gives a loader a file, uses the asset and drops it again.
    /// @return the broken rule, or empty. The rules: a refusal logs at least one error and leaves nothing behind; an
    /// asset is valid; every message can be formatted; no GL name is left after flushing; heap, reads, log and data for
    /// GL are limited by the size of the files read.
    std::string attack(const struct Loader& loader, const Bytes& file);

    bool wasLoaded() const { return m_loaded; } ///< the file of the last attack

    // For the loaders.
    orv::AssetCachePool& pool() { return *m_pool; }
    orv::SimpleRenderer& renderer() { return *m_renderer; }
    orv::SharedPtr<orv::Stream> openFile();

private:
    std::string findFault(const struct Loader& loader, const Bytes& file, size_t peak) const;
    std::string findCost() const;

    orv::SharedPtr<Files> m_files;
    orv::SharedPtr<orv::AssetCachePool> m_pool;
    orv::SharedPtr<orv::RenderContext> m_context;
    orv::SharedPtr<orv::SimpleRenderer> m_renderer;
    bool m_loaded = false;
};

struct Loader
{
    const char* name; ///< also of its fuzzing target and its folder in the corpus

    /// Loads the session's file and uses the asset.
    /// @param fault  set if the asset is not valid.
    /// @return whether an asset was loaded.
    bool (*load)(Session& session, const Bytes& file, std::string& fault);

    size_t (*heapPerByte)(const Bytes& file); ///< bytes allowed for each byte of the file
    size_t spareHeap;                         ///< bytes allowed for any file
    bool mayBeSilent;                         ///< returns a result instead of a message
};

extern const std::vector<Loader> LOADERS;

/// @return null for an unknown name.
const Loader* findLoader(const std::string& name);

} // namespace hostile
