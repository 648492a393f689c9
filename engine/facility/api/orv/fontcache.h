#pragma once

#include "orv/assetcache.h"
#include "orv/font.h"

namespace orv
{

class Texture2DCache;

/// Fonts by name, loaded from TrueType files. GL thread only.
///
/// A font's name is the file's, a semicolon and the size in pixels: "sans.ttf;24". The file part may have a
/// namespace and directories, but no semicolon. A FontLoader is registered from the start.
class ORV_API FontCache : public AssetCache<Font>
{
public:
    using Ptr = SharedPtr<FontCache>;

    /// @param texture2DCache  where atlases are made, unnamed.
    explicit FontCache(const SharedPtr<Texture2DCache>& texture2DCache);
    ~FontCache() override;

    /// Parameters as for Font; a null name = unnamed.
    Font::Ptr create(const SharedPtr<Texture2D>& texture, int size, float ascent, float descent,
                     float lineGap, int firstChar, int charCount, const Font::CharacterData* data,
                     const char* name);

    /// Where atlases are kept.
    const SharedPtr<Texture2DCache>& getTexture2DCache() const { return m_texture2DCache; }

private:
    SharedPtr<Texture2DCache> m_texture2DCache;
};

/// Whether the cache holds the font of this file and size; it is not loaded.
/// @param name  of the file, as in "sans.ttf"; null is never held.
ORV_API bool exists(FontCache& cache, const char* name, unsigned int size);

/// The font of this file and size, loaded if it is not held. @return empty, after logging why, if it cannot be.
ORV_API Font::Ptr get(FontCache& cache, const char* name, unsigned int size);

} // namespace orv
