#pragma once

#include "orv/assetcachepool.h"
#include "orv/rendercontext.h"
#include "orv/simplerenderer.h"

#include <cstdint>
#include <string>
#include <vector>

/// Everything in the engine that reads what others wrote, and the rules that hold whatever they wrote.
namespace hostile
{

using Bytes = std::vector<uint8_t>;

class Files;

/// A pool and what else a loader needs, used for one file after another.
class Session
{
public:
    Session();
    ~Session();

    /// Gives a loader a file, uses what it makes of it and drops that again.
    /// @return what rule was broken, empty for none: a refusal says why (at least one error) and leaves nothing
    /// behind, an asset is sound, every message can be read, no GL name is left when the caches are flushed,
    /// the heap, the reads, the log and what GL is given are bounded by the size of the files read.
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

    /// Loads the session's file and uses what came.
    /// @param fault  set when what came is not sound.
    /// @return whether an asset came.
    bool (*load)(Session& session, const Bytes& file, std::string& fault);

    size_t (*heapPerByte)(const Bytes& file); ///< what one byte of the file may lead to
    size_t spareHeap;                         ///< and what any file may
    bool mayBeSilent;                         ///< gives an answer in place of a message
};

extern const std::vector<Loader> LOADERS;

/// @return null for a name that is none.
const Loader* findLoader(const std::string& name);

} // namespace hostile
