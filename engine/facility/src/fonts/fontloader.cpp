#include "orv/fontloader.h"

#include "fontbaker.h"
#include "gl/countedgl.h"
#include "orv/detail/loadscope.h"
#include "orv/filetostring.h"
#include "orv/fontcache.h"
#include "orv/log.h"
#include "orv/stream.h"
#include "orv/textsuffix.h"
#include "orv/texture2dcache.h"

#include <charconv>
#include <string>

namespace orv
{

namespace
{

using detail::BakedFont;

std::string getFilePart(const std::string& name)
{
    return name.substr(0, name.find(';'));
}

/// @return false unless there are decimal digits, and nothing else, behind the first semicolon.
bool readSize(const std::string& name, int& size)
{
    const std::size_t semicolon = name.find(';');
    if (semicolon == std::string::npos)
        return false;
    const char* const end = name.data() + name.size();
    const auto [rest, error] = std::from_chars(name.data() + semicolon + 1, end, size);
    return error == std::errc() && rest == end && name[semicolon + 1] != '-';
}

/// @return 0 if not even the atlas's width is allowed.
int getMaxAtlasHeight()
{
    GLint largest = 0;
    glGetIntegerv(GL_MAX_TEXTURE_SIZE, &largest);
    return largest >= BakedFont::WIDTH ? largest : 0;
}

} // namespace

FontLoader::~FontLoader() = default;

bool FontLoader::isKnown(const char* name)
{
    return name && endsWithI(getFilePart(name).c_str(), ".ttf");
}

Font::Ptr FontLoader::load(AssetCache<Font>& cache, const char* name)
{
    const detail::LoadScope scope(name);
    const std::string normalized = detail::normalizeAssetName(name);
    int size = 0;
    if (!readSize(normalized, size))
    {
        ORV_LOG_ERROR("Font name %s is invalid", normalized.c_str());
        return {};
    }

    const std::string file = getFilePart(normalized);
    const std::string plain = file + ';' + std::to_string(size);
    if (plain != normalized) // leading zeros
        return cache.get(plain.c_str());

    BakedFont baked;
    const char* fault = "there is no such file";
    if (const SharedPtr<Stream> stream = cache.getStream(file.c_str()))
    {
        const FileToString text(*stream);
        fault =
            detail::bakeFont(reinterpret_cast<const unsigned char*>(text.getStart()),
                             std::size_t(text.getEnd() - text.getStart()), size, getMaxAtlasHeight(), baked);
    }
    if (fault)
    {
        ORV_LOG_ERROR("Error reading Font \"%s\"", file.c_str());
        ORV_LOG_INFO("Font name %s: %s", normalized.c_str(), fault);
        cache.getAssetPath()->explainMissing(file.c_str());
        return {};
    }

    auto& fontCache = static_cast<FontCache&>(cache);
    const SharedPtr<Texture2D> texture = fontCache.getTexture2DCache()->create(
        BakedFont::WIDTH, unsigned(baked.height), Texture::Format::ALPHA, Texture::Type::UNSIGNED_BYTE,
        baked.bitmap.get(), nullptr);
    if (!texture)
        return {};
    return fontCache.create(texture, size, baked.ascent, baked.descent, baked.lineGap, BakedFont::FIRST_CHAR,
                            BakedFont::CHAR_COUNT, baked.characters.data(), normalized.c_str());
}

} // namespace orv
