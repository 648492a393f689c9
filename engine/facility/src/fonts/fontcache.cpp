#include "orv/fontcache.h"

#include "orv/fontloader.h"
#include "orv/texture2dcache.h"

#include <string>

namespace orv
{

namespace
{

std::string makeFontName(const char* file, unsigned int size)
{
    return std::string(file) + ';' + std::to_string(size);
}

} // namespace

FontCache::FontCache(const SharedPtr<Texture2DCache>& texture2DCache) : m_texture2DCache(texture2DCache)
{
    registerLoader(makeShared<FontLoader>());
}

FontCache::~FontCache() = default;

Font::Ptr FontCache::create(const SharedPtr<Texture2D>& texture, int size, float ascent, float descent,
                            float lineGap, int firstChar, int charCount, const Font::CharacterData* data,
                            const char* name)
{
    const auto font = makeShared<Font>(texture, size, ascent, descent, lineGap, firstChar, charCount, data);
    if (font)
        add(font, name);
    return font;
}

bool exists(FontCache& cache, const char* name, unsigned int size)
{
    return name && cache.exists(makeFontName(name, size).c_str());
}

Font::Ptr get(FontCache& cache, const char* name, unsigned int size)
{
    return name ? cache.get(makeFontName(name, size).c_str()) : Font::Ptr();
}

} // namespace orv
