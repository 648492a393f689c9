#include "textures.h"

#include <assimp/scene.h>

#define STB_IMAGE_IMPLEMENTATION
#include <stb/stb_image.h>
#define STB_IMAGE_WRITE_IMPLEMENTATION
#include <stb/stb_image_write.h>

#include <algorithm>
#include <cctype>
#include <cmath>
#include <fstream>
#include <iterator>
#include <memory>

namespace convert
{

namespace fs = std::filesystem;

namespace
{

/// Pixels in memory, top row first.
struct Pixels
{
    int width = 0;
    int height = 0;
    int channels = 0;
    std::vector<uint8_t> data;
};

bool decode(const std::vector<uint8_t>& bytes, Pixels& pixels)
{
    stbi_uc* data = stbi_load_from_memory(bytes.data(), int(bytes.size()), &pixels.width, &pixels.height,
                                          &pixels.channels, 0);
    if (!data)
        return false;
    pixels.data.assign(data, data + size_t(pixels.width) * size_t(pixels.height) * size_t(pixels.channels));
    stbi_image_free(data);
    return true;
}

std::vector<uint8_t> encodePng(const Pixels& pixels)
{
    std::vector<uint8_t> bytes;
    const auto append = [](void* context, void* data, int size)
    {
        auto& target = *static_cast<std::vector<uint8_t>*>(context);
        target.insert(target.end(), static_cast<uint8_t*>(data), static_cast<uint8_t*>(data) + size);
    };
    stbi_write_png_to_func(append, &bytes, pixels.width, pixels.height, pixels.channels, pixels.data.data(),
                           0);
    return bytes;
}

/// Grey to red, green and blue.
void spread(Pixels& pixels)
{
    std::vector<uint8_t> colours;
    for (const uint8_t grey : pixels.data)
        colours.insert(colours.end(), 3, grey);
    pixels.data = std::move(colours);
    pixels.channels = 3;
}

bool isPowerOfTwo(int size)
{
    return (size & (size - 1)) == 0;
}

int nextPowerOfTwo(int size)
{
    int power = 1;
    while (power < size && power < 4096)
        power *= 2;
    return power;
}

/// Between the four nearest pixels, round the edges as a repeating picture goes on.
void resize(Pixels& pixels, int width, int height)
{
    Pixels made{width, height, pixels.channels, {}};
    made.data.reserve(size_t(width) * size_t(height) * size_t(pixels.channels));
    const auto wrap = [](int i, int size) { return (i % size + size) % size; };
    const auto pixel = [&](int x, int y, int channel)
    {
        const size_t row = size_t(wrap(y, pixels.height)) * size_t(pixels.width);
        return float(
            pixels.data[(row + size_t(wrap(x, pixels.width))) * size_t(pixels.channels) + size_t(channel)]);
    };
    for (int y = 0; y < height; ++y)
    {
        const float v = (float(y) + 0.5f) * float(pixels.height) / float(height) - 0.5f;
        const int top = int(std::floor(v));
        for (int x = 0; x < width; ++x)
        {
            const float u = (float(x) + 0.5f) * float(pixels.width) / float(width) - 0.5f;
            const int left = int(std::floor(u));
            for (int c = 0; c < pixels.channels; ++c)
            {
                const float upper = std::lerp(pixel(left, top, c), pixel(left + 1, top, c), u - float(left));
                const float lower =
                    std::lerp(pixel(left, top + 1, c), pixel(left + 1, top + 1, c), u - float(left));
                made.data.push_back(uint8_t(std::lerp(upper, lower, v - float(top)) + 0.5f));
            }
        }
    }
    pixels = std::move(made);
}

/// A picture that is transparent all over is taken for one whose alpha means something else.
bool isPartlyTransparent(const Pixels& pixels)
{
    if (pixels.channels != 2 && pixels.channels != 4)
        return false;
    bool transparent = false;
    bool opaque = false;
    for (size_t i = size_t(pixels.channels) - 1; i < pixels.data.size(); i += size_t(pixels.channels))
    {
        transparent = transparent || pixels.data[i] < 250;
        opaque = opaque || pixels.data[i] > 5;
    }
    return transparent && opaque;
}

std::string lower(std::string text)
{
    std::transform(text.begin(), text.end(), text.begin(),
                   [](unsigned char c) { return char(std::tolower(c)); });
    return text;
}

/// Whether the engine's texture loader answers for names with this ending.
bool isUsual(const std::string& extension)
{
    constexpr const char* USUAL[] = {".jpg", ".jpeg", ".png", ".bmp", ".tga"};
    return std::any_of(std::begin(USUAL), std::end(USUAL),
                       [&](const char* known) { return extension == known; });
}

/// "%20" and the like.
std::string decodeUrl(const std::string& text)
{
    std::string decoded;
    for (size_t i = 0; i < text.size(); ++i)
    {
        const bool coded = text[i] == '%' && i + 2 < text.size() &&
                           std::isxdigit(static_cast<unsigned char>(text[i + 1])) &&
                           std::isxdigit(static_cast<unsigned char>(text[i + 2]));
        decoded += coded ? char(std::stoi(text.substr(i + 1, 2), nullptr, 16)) : text[i];
        i += coded ? 2 : 0;
    }
    return decoded;
}

/// Names with '#', ';' or ':' mean something else to the engine.
std::string makePlain(std::string name)
{
    for (char& c : name)
    {
        const bool isPlain = std::isalnum(static_cast<unsigned char>(c)) || c == '-' || c == '_' || c == '.';
        c = isPlain ? c : '_';
    }
    return name;
}

std::string lastPart(const std::string& path)
{
    return path.substr(path.find_last_of("/\\") + 1);
}

} // namespace

TextureStore::TextureStore(const aiScene& scene, const fs::path& model, const std::string& stem,
                           Report& report)
    : m_scene(scene)
    , m_folder(model.parent_path())
    , m_stem(stem)
    , m_report(report)
{
}

TextureUse TextureStore::add(const std::string& path, bool repeats)
{
    const std::pair<std::string, bool> key(path, repeats);
    const auto known = m_known.find(key);
    return known != m_known.end() ? known->second : m_known[key] = make(path, repeats);
}

TextureUse TextureStore::make(const std::string& path, bool repeats)
{
    std::vector<uint8_t> bytes;
    std::string extension = lower(fs::path(lastPart(path)).extension().string());
    if (const aiTexture* embedded = m_scene.GetEmbeddedTexture(path.c_str()))
    {
        if (embedded->mHeight > 0)
            return makeRaw(path, *embedded);
        const uint8_t* data = reinterpret_cast<const uint8_t*>(embedded->pcData);
        bytes.assign(data, data + embedded->mWidth);
        extension = "." + lower(embedded->achFormatHint);
    }
    else if (!readFile(path, bytes))
    {
        m_report.lose("texture \"" + path + "\" is not there");
        return {};
    }

    Pixels pixels;
    if (!decode(bytes, pixels))
    {
        m_report.lose("texture \"" + path + "\" cannot be read: " + stbi_failure_reason());
        return {};
    }
    const bool resizes = repeats && !(isPowerOfTwo(pixels.width) && isPowerOfTwo(pixels.height));
    const bool isGrey = pixels.channels == 1;
    const bool hasAlpha = isPartlyTransparent(pixels);
    if (resizes || isGrey || !isUsual(extension))
    {
        if (isGrey)
            spread(pixels);
        if (resizes)
            resize(pixels, nextPowerOfTwo(pixels.width), nextPowerOfTwo(pixels.height));
        bytes = encodePng(pixels);
        extension = ".png";
    }
    m_files.push_back({makeName(path, extension), std::move(bytes)});
    return {m_files.back().name, hasAlpha};
}

/// A picture that the model holds as bare pixels.
TextureUse TextureStore::makeRaw(const std::string& path, const aiTexture& texture)
{
    Pixels pixels{int(texture.mWidth), int(texture.mHeight), 4, {}};
    for (size_t i = 0; i < size_t(texture.mWidth) * texture.mHeight; ++i)
    {
        const aiTexel& texel = texture.pcData[i];
        pixels.data.insert(pixels.data.end(), {texel.r, texel.g, texel.b, texel.a});
    }
    m_files.push_back({makeName(path, ".png"), encodePng(pixels)});
    return {m_files.back().name, isPartlyTransparent(pixels)};
}

/// Where the path leads from the model's folder, or else where its last part does: paths of other machines and
/// other cases of letters are common.
bool TextureStore::readFile(const std::string& path, std::vector<uint8_t>& bytes) const
{
    std::string plain = decodeUrl(path);
    if (plain.compare(0, 7, "file://") == 0)
        plain.erase(0, 7);
    std::replace(plain.begin(), plain.end(), '\\', '/');
    std::vector<fs::path> candidates = {m_folder / path, m_folder / plain, m_folder / lastPart(plain)};
    std::error_code ignored;
    for (const fs::directory_entry& entry :
         fs::directory_iterator(m_folder.empty() ? "." : m_folder, ignored))
    {
        if (lower(entry.path().filename().string()) == lower(lastPart(plain)))
            candidates.push_back(entry.path());
    }
    for (const fs::path& candidate : candidates)
    {
        if (!fs::is_regular_file(candidate, ignored))
            continue;
        std::ifstream file(candidate, std::ios::binary);
        bytes.assign(std::istreambuf_iterator<char>(file), {});
        return file.good() || file.eof();
    }
    return false;
}

std::string TextureStore::makeName(const std::string& path, const std::string& extension)
{
    // Inside a model pictures may have no more than a number: "*0".
    const bool isNumber = !path.empty() && path[0] == '*';
    const std::string ownName = isNumber ? "texture" + path.substr(1) : lastPart(decodeUrl(path));
    const std::string wanted = makePlain(m_stem + "-" + fs::path(ownName).stem().string().substr(0, 100));
    std::string name = wanted + extension;
    for (int number = 2; !m_names.insert(lower(name)).second; ++number)
        name = wanted + "-" + std::to_string(number) + extension;
    return name;
}

} // namespace convert
