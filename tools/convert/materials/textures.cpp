#include "textures.h"

#include "convert/digest.h"
#include "convert/lowercase.h"
#include "convert/progress.h"

#include <algorithm>
#include <cctype>
#include <cstdio>

namespace convert
{

namespace
{

using Alpha = TextureWish::Alpha;

constexpr int LARGEST_POWER = 4096; // limit for raised sizes

bool isPowerOfTwo(int size)
{
    return (size & (size - 1)) == 0;
}

/// @return the least power of two that is not below size, or the greatest one up to the limit.
int toPowerOfTwo(int size, int limit)
{
    int power = 1;
    while (power < size && power * 2 <= limit)
        power *= 2;
    return power;
}

/// Changes the alpha channel as requested.
/// @param changed  set if the picture was changed.
/// @return whether some of the picture is transparent now.
bool applyAlpha(const TextureWish& wish, DecodedPicture& pixels, bool& changed)
{
    if (!pixels.hasAlphaChannel())
        return false;
    const Transparency transparency =
        wish.alpha == Alpha::CUT
            ? (hasHoles(pixels, wish.threshold) ? Transparency::SOME : Transparency::NONE)
            : getTransparency(pixels);
    if (wish.alpha == Alpha::CUT && transparency == Transparency::NONE)
    {
        dropAlpha(pixels);
        changed = true;
        return false;
    }
    const bool counts =
        wish.alpha != Alpha::DROP && !(wish.alpha == Alpha::AUTO && transparency == Transparency::ALL);
    if (counts || transparency == Transparency::NONE)
        return transparency != Transparency::NONE;
    dropAlpha(pixels);
    changed = true;
    return false;
}

/// '#', ';' and ':' have a meaning in the engine's names, other signs in other file systems.
std::string makePlain(std::string name)
{
    for (char& c : name)
    {
        const bool isPlain = std::isalnum(static_cast<unsigned char>(c)) || c == '-' || c == '_' || c == '.';
        c = isPlain ? c : '_';
    }
    return name;
}

/// For messages: a data URI may be very long, and a picture inside the model has only a number.
std::string getShown(const std::string& path, const FoundPicture& picture)
{
    return picture.isThere && path[0] == '*' ? picture.name : path.substr(0, 100);
}

} // namespace

std::string getPictureStem(const std::string& stem)
{
    std::string plain = makePlain(stem.substr(0, 100));
    if (plain != stem)
    {
        char number[16];
        std::snprintf(number, sizeof number, "_%08x", unsigned(digest(stem)));
        plain += number;
    }
    return plain + "-";
}

TextureStore::TextureStore(const aiScene& scene, ModelFiles& files, const std::string& stem,
                           const Options& options, Report& report)
    : m_finder(scene, files)
    , m_stem(getPictureStem(stem))
    , m_options(options)
    , m_report(report)
{
    for (const std::string& name : options.takenNames)
        m_names.insert(toLowerCase(name));
}

TextureUse TextureStore::add(const TextureWish& wish)
{
    const auto known = m_known.find(wish);
    return known != m_known.end() ? known->second : m_known[wish] = make(wish);
}

std::string TextureStore::addMade(const std::string& name, DecodedPicture (*paint)())
{
    std::string& made = m_made[name];
    if (made.empty())
    {
        made = makeName(name, ".png");
        m_files.push_back({made, encodePng(paint())});
    }
    return made;
}

std::optional<orv::Vector4f> TextureStore::getMean(const std::string& path)
{
    const auto known = m_means.find(path);
    if (known != m_means.end())
        return known->second;
    std::optional<orv::Vector4f>& mean = m_means[path];
    std::optional<Loaded> loaded = load(path);
    if (!loaded || !decode(*loaded, path))
        return mean;
    const DecodedPicture& pixels = loaded->pixels;
    const float alpha = pixels.hasAlphaChannel() ? convert::getMean(pixels, pixels.channels - 1) : 1.0f;
    mean = orv::Vector4f(convert::getMean(pixels, 0), convert::getMean(pixels, 1),
                         convert::getMean(pixels, 2), alpha);
    return mean;
}

std::optional<TextureStore::Loaded> TextureStore::load(const std::string& path)
{
    Loaded loaded{m_finder.find(path), {}, {}};
    const std::string shown = getShown(path, loaded.file);
    showProgress("texture " + shown);
    if (!loaded.file.isThere)
        m_report.lose("texture-missing", "texture \"" + shown + "\", which is not there");
    else if (!readHeader(loaded.file.bytes, loaded.header))
        m_report.lose("texture-unreadable", "texture \"" + shown + "\", which is in an unknown format");
    else
        return loaded;
    return {};
}

bool TextureStore::decode(Loaded& loaded, const std::string& path)
{
    if (decodePicture(loaded.file.bytes, loaded.header, loaded.pixels))
        return true;
    m_report.lose("texture-unreadable", "texture \"" + getShown(path, loaded.file) + "\", which is damaged");
    return false;
}

TextureUse TextureStore::make(const TextureWish& wish)
{
    std::optional<Loaded> loaded = load(wish.path);
    if (!loaded)
        return {};
    if (canPassOn(loaded->header, wish))
        return passOn(*loaded, wish);
    if (!decode(*loaded, wish.path))
        return {};

    DecodedPicture& pixels = loaded->pixels;
    bool changed = treat(pixels, wish);
    const bool hasAlpha = applyAlpha(wish, pixels, changed);
    const bool allOrNothing = hasAlpha && isAllOrNothing(pixels); // before resizing, which blurs alpha
    const Size size = getFittingSize(pixels.width, pixels.height, wish.repeats);
    if (size.width != pixels.width || size.height != pixels.height)
    {
        resize(pixels, size.width, size.height, wish.repeats);
        m_report.count("resized-textures", 1);
        changed = true;
    }
    const bool isKept = !changed && !loaded->header.extension.empty();
    const std::string name = makeName(loaded->file.name, isKept ? loaded->header.extension : ".png");
    m_files.push_back({name, isKept ? std::move(loaded->file.bytes) : encodePng(pixels)});
    m_report.count("rewritten-textures", isKept ? 0 : 1);
    return {name, hasAlpha, allOrNothing, isPowerOfTwo(pixels.width) && isPowerOfTwo(pixels.height)};
}

/// Whether the pixels need not be decoded.
bool TextureStore::canPassOn(const PictureHeader& header, const TextureWish& wish) const
{
    if (header.extension == ".pvr")
        return true;
    const Size size = getFittingSize(header.width, header.height, wish.repeats);
    const bool hasRightSize = size.width == header.width && size.height == header.height;
    const bool hasRightAlpha = header.channels == 3 || (header.channels == 4 && wish.alpha == Alpha::KEEP);
    return header.isWhole && !header.extension.empty() && hasRightSize && hasRightAlpha &&
           wish.opacity.empty() && !wish.isHeight && !wish.occlusion;
}

TextureUse TextureStore::passOn(const Loaded& loaded, const TextureWish& wish)
{
    const PictureHeader& header = loaded.header;
    if (header.width == 0 && (m_options.maxTextureSize > 0 || m_options.powerOfTwo))
        m_report.approximate("texture-compressed", "a compressed texture (not resized)");
    const std::string name = makeName(loaded.file.name, header.extension);
    m_files.push_back({name, loaded.file.bytes});
    return {name, header.channels == 4 && wish.alpha == Alpha::KEEP, false,
            isPowerOfTwo(header.width) && isPowerOfTwo(header.height)};
}

/// Makes all changes except those of size and of the picture's own alpha.
/// @return whether the picture was changed.
bool TextureStore::treat(DecodedPicture& pixels, const TextureWish& wish)
{
    bool changed = pixels.channels < 3;
    spreadGrey(pixels);
    std::optional<Loaded> opacity = wish.opacity.empty() ? std::nullopt : load(wish.opacity);
    if (opacity && decode(*opacity, wish.opacity))
    {
        setAlpha(pixels, std::move(opacity->pixels));
        changed = true;
    }
    if (wish.occlusion)
    {
        makeOcclusion(pixels, *wish.occlusion, wish.isShare);
        changed = true;
    }
    if (wish.isHeight && makeNormals(pixels))
    {
        m_report.approximate("height-map", "a height map (converted to a normal map)");
        changed = true;
    }
    return changed;
}

/// A size within the limits with which GL supports the wanted settings.
TextureStore::Size TextureStore::getFittingSize(int width, int height, bool repeats) const
{
    const int longer = std::max(width, height);
    const int limit = m_options.maxTextureSize;
    if (limit > 0 && longer > limit)
    {
        width = std::max(1, int(int64_t(width) * limit / longer));
        height = std::max(1, int(int64_t(height) * limit / longer));
    }
    if ((repeats || m_options.powerOfTwo) && !(isPowerOfTwo(width) && isPowerOfTwo(height)))
    {
        const int most = limit > 0 ? std::min(limit, LARGEST_POWER) : LARGEST_POWER;
        width = toPowerOfTwo(width, most);
        height = toPowerOfTwo(height, most);
    }
    return {width, height};
}

std::string TextureStore::makeName(const std::string& name, const std::string& extension)
{
    std::string picture = makePlain(name.substr(0, 100));
    std::replace(picture.begin(), picture.end(), '-', '_'); // the last one ends the scene's name
    const std::string wanted = m_stem + picture;
    std::string made = wanted;
    // Without the extension: the engine prefers a .pvr of the same name.
    for (int number = 2; !m_names.insert(toLowerCase(made)).second; ++number)
        made = wanted + "_" + std::to_string(number);
    return made + extension;
}

} // namespace convert
