#pragma once

#include "orv/detail/assetpath.h"
#include "orv/export.h"
#include "orv/sharedptr.h"

#include <string>

namespace orv
{

class FontCache;
class IndexBufferCache;
class MeshCache;
class ShaderProgramCache;
class Texture2DCache;
class TextureCubeCache;
class VertexBufferCache;

/// One cache per asset type over common stream sources: where a program gets its assets from.
///
/// The built-in assets ("orv#...", "luvane#...") come first on every path, so a file of the program cannot take
/// the place of one of them. Assets use each other, so the usual end is to drop the scene, call flush() twice
/// (the first lets go of what meshes hold) and drop the pool; a pool dropped without that leaks its GL objects
/// and logs each.
/// Threads: the GL thread only; construction and flush() make GL calls.
class ORV_API AssetCachePool : public Shared
{
public:
    ORV_CLASS_NAME("AssetCachePool")

    AssetCachePool();
    ~AssetCachePool() override;

    /// False, after a message, if there was no memory for a part of it: such a pool can only be dropped.
    bool isComplete() const { return m_complete; }

    /// Appends a source to the path of the pool and of every cache. An empty one is taken too; see AssetPath.
    void registerSource(const SharedPtr<StreamSource>& source);

    /// Sets where derived data, such as compiled shader programs, is kept; empty for nowhere.
    void setCacheSource(const SharedPtr<StreamSource>& source);

    /// Opens a file by its exact name. @return empty if no source has it.
    SharedPtr<Stream> getStream(const char* name) const;

    /// Call this after a message about a file that may not have been found: if no source has it, a warning
    /// says where it was looked for, once in a load.
    ORV_LOCAL void explainMissing(const char* name) const;

    /// Opens a file of derived data; for writing, the source makes the folders of its name.
    /// @return empty without a cache source or where it cannot be opened.
    SharedPtr<Stream> getCacheStream(const char* name, bool writable) const;

    /// Drops the assets that only the caches hold and deletes GL objects that are no longer used.
    void flush();

    /// After the GL context was lost: forgets every GL object without a GL call. The assets stay, under their
    /// names, but draw nothing: drop them and call flush(), then load or make what is needed again.
    void release();

    /// The same in one call for a program that loads everything again: release(), and the caches let go of every
    /// asset, also of those that somebody still holds, so that what is asked for from here on is loaded into the
    /// new context. Sources, loaders and the cache source stay.
    void forgetContext();

    /// The caches; never empty in a complete pool.
    const SharedPtr<IndexBufferCache>& getIndexBufferCache() const { return m_indexBufferCache; }
    const SharedPtr<ShaderProgramCache>& getShaderProgramCache() const { return m_shaderProgramCache; }
    const SharedPtr<Texture2DCache>& getTexture2DCache() const { return m_texture2DCache; }
    const SharedPtr<TextureCubeCache>& getTextureCubeCache() const { return m_textureCubeCache; }
    const SharedPtr<VertexBufferCache>& getVertexBufferCache() const { return m_vertexBufferCache; }
    const SharedPtr<FontCache>& getFontCache() const { return m_fontCache; }
    const SharedPtr<MeshCache>& getMeshCache() const { return m_meshCache; }

private:
    template <class Operation>
    void forEachCache(const Operation& operation);
    ORV_LOCAL bool areCachesComplete() const;

    SharedPtr<detail::AssetPath> m_assetPath;
    SharedPtr<StreamSource> m_cacheSource;
    SharedPtr<IndexBufferCache> m_indexBufferCache;
    SharedPtr<ShaderProgramCache> m_shaderProgramCache;
    SharedPtr<Texture2DCache> m_texture2DCache;
    SharedPtr<TextureCubeCache> m_textureCubeCache;
    SharedPtr<VertexBufferCache> m_vertexBufferCache;
    SharedPtr<FontCache> m_fontCache;
    SharedPtr<MeshCache> m_meshCache;
    bool m_complete = false;
};

/// Registers a directory as a source. Archives are not supported: with archive true an empty source is registered.
ORV_API void registerSource(AssetCachePool& pool, const char* path, bool archive);

/// Keeps derived data in a directory.
ORV_API void setCacheSource(AssetCachePool& pool, const char* path);

} // namespace orv
