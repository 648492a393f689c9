// A sheet of PVR textures: the same picture in every format that the engine loads, over a chequered ground that shows
// through where a format keeps the picture's alpha. Headers and byte orders change from one to the next. From the
// upper left:
//
//   RGBA 8888         BGRA 8888          RGB 888           RGB 565
//   RGBA 4444         ARGB 4444          RGBA 5551         ARGB 1555
//   LA 88             L 8                A 8               ETC1
//   PVRTC 2 bpp RGB   PVRTC 2 bpp RGBA   PVRTC 4 bpp RGB   PVRTC 4 bpp RGBA
//
// (A 8 has no colour, so it is black.)
//
//   build/default/examples/pvrsheet --out pvrsheet.png [FILE.pvr...]
//
// Files of your own are drawn instead of the formats, from the upper left.

#include "headless/headless.h"
#include "headless/png.h"
#include "pvr/pvrwriter.h"

#include <orv/orv.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <deque>
#include <string>

using namespace orv;

namespace
{

constexpr int COLUMNS = 4;
constexpr int CELL = 160; // pixels

/// The crate's picture with a red, a green and a blue corner, fading out towards its edges.
bool makePicture(pvr::SourcePicture& picture)
{
    const SharedPtr<StreamSource> samples = makeShared<FileStreamSource>(SAMPLES_FOLDER "/showpiece");
    const SharedPtr<Stream> stream = samples->open("crate.png", false);
    if (!stream)
        return false;
    const Image crate(*stream);
    if (!crate.data() || crate.channelCount() != 3)
        return false;

    picture.width = unsigned(crate.width());
    picture.height = unsigned(crate.height());
    const float radius = float(crate.width()) / 2.0f;
    const unsigned char* rgb = crate.data();
    for (int y = 0; y < crate.height(); ++y)
    {
        for (int x = 0; x < crate.width(); ++x, rgb += 3)
        {
            const bool isLeft = x < crate.width() / 6, isRight = x >= crate.width() * 5 / 6;
            const bool isTop = y < crate.height() / 6, isBottom = y >= crate.height() * 5 / 6;
            const float distance = std::hypot(float(x) + 0.5f - radius, float(y) + 0.5f - radius) / radius;
            const float alpha = std::clamp((1.4f - distance) * 2.0f, 0.0f, 1.0f) * 255.0f;
            uint8_t pixel[] = {rgb[0], rgb[1], rgb[2], uint8_t(alpha)};
            if ((isLeft && (isTop || isBottom)) || (isRight && isTop))
            {
                pixel[0] = isLeft && isTop ? 255 : 0;
                pixel[1] = isRight && isTop ? 255 : 0;
                pixel[2] = isLeft && isBottom ? 255 : 0;
            }
            picture.rgba.insert(picture.rgba.end(), pixel, pixel + 4);
        }
    }
    return true;
}

/// Names of textures in the pool, one for each cell.
std::vector<std::string> writeFormats(AssetCachePool& pool, std::deque<std::vector<uint8_t>>& files)
{
    pvr::SourcePicture picture;
    if (!makePicture(picture))
        return {};
    const auto source = makeShared<MemoryStreamSource>();
    std::vector<std::string> names;
    for (unsigned i = 0; i < pvr::FORMAT_COUNT; ++i)
    {
        files.push_back(
            pvr::write(picture, pvr::Format(i), {.header = pvr::Header(i % 3), .bigEndian = i % 2 == 0}));
        names.push_back(pvr::getInfo(pvr::Format(i)).name + std::string(".pvr"));
        source->add(names.back().c_str(),
                    makeShared<MemoryStream>(files.back().data(), int(files.back().size())));
    }
    pool.registerSource(source);
    return names;
}

/// A square of a unit's width that shows a texture.
SharedPtr<Solid> createCell(AssetCachePool& pool, const SharedPtr<Texture2D>& texture, float repeats)
{
    const SharedPtr<Solid> square = createSquare(pool, Vector2f(1.0f, 1.0f));
    const SharedPtr<ShaderProgram> program = pool.getShaderProgramCache()->get("luvane#quad.sp");
    if (!square || !program || !texture)
        return nullptr; // the log says why
    const auto appearance = makeShared<Appearance>();
    appearance->setShaderProgram(program);
    appearance->setProperty("M_DIFFUSE_TEXTURE", texture);
    appearance->setProperty("M_UV_OFFSET_SCALE", Vector4f(0.0f, 0.0f, repeats, repeats));
    appearance->setBlendFactors(BlendFactor::SRC_ALPHA, BlendFactor::ONE, BlendFactor::ONE_MINUS_SRC_ALPHA,
                                BlendFactor::ONE_MINUS_SRC_ALPHA);
    square->setAppearance(appearance);
    return square;
}

bool draw(const SharedPtr<AssetCachePool>& pool, const std::vector<std::string>& names, int width, int height)
{
    const auto scene = makeShared<SceneNode>("scene");
    const unsigned char greys[] = {150, 110, 110, 150};
    const SharedPtr<Texture2D> chequers = pool->getTexture2DCache()->create(
        2, 2, Texture::Format::LUMINANCE, Texture::Type::UNSIGNED_BYTE, greys, nullptr);
    chequers->setMagFilter(TextureParameters::FilterMode::NEAREST);
    const auto columns = float(COLUMNS),
               rows = float(height) / float(CELL); // of the world's units, as is the view
    const SharedPtr<Solid> ground = createCell(*pool, chequers, 4.0f * columns);
    if (!ground)
        return false;
    ground->setScale(Vector3f(columns, columns, 1.0f));
    ground->setPosition(Vector3f(0.0f, 0.0f, -2.0f));
    ground->setParent(scene, false);

    for (size_t i = 0; i < names.size(); ++i)
    {
        const SharedPtr<Solid> cell =
            createCell(*pool, pool->getTexture2DCache()->get(names[i].c_str()), 1.0f);
        if (!cell)
            return false;
        cell->setScale(Vector3f(0.92f, 0.92f, 1.0f));
        cell->setPosition(Vector3f(float(i % COLUMNS) + 0.5f - columns / 2.0f,
                                   rows / 2.0f - 0.5f - float(i / COLUMNS), -1.0f));
        cell->setParent(scene, false);
    }

    const auto camera = makeShared<Camera>("camera");
    camera->setProjectionType(Camera::ProjectionType::ORTHOGRAPHIC);
    camera->setWidth(columns);
    camera->setNear(0.5f);
    camera->setFar(10.0f);
    camera->setParent(scene, false);

    const auto renderer = makeShared<SimpleRenderer>(makeShared<RenderContext>(), pool);
    const auto block = makeShared<RenderBlock>(renderer, scene, camera);
    block->setViewport(0, 0, width, height);
    block->render();
    return true;
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    const char* out = "pvrsheet.png";
    std::vector<std::string> names;
    for (int i = 1; i < argc; ++i)
    {
        if (!std::strcmp(argv[i], "--out") && i + 1 < argc)
            out = argv[++i];
        else
            names.push_back(argv[i]);
    }

    headless::Options options;
    options.width = COLUMNS * CELL;
    const size_t cells = names.empty() ? pvr::FORMAT_COUNT : names.size();
    options.height = int((cells + COLUMNS - 1) / COLUMNS) * CELL;
    std::string error;
    const auto gl = headless::Context::create(options, error);
    if (!gl)
    {
        std::fprintf(stderr, "no GL context: %s\n", error.c_str());
        return 1;
    }

    std::deque<std::vector<uint8_t>> files; // the pool reads from them
    const auto pool = makeShared<AssetCachePool>();
    if (names.empty())
        names = writeFormats(*pool, files);
    else
        registerSource(*pool, ".", false);
    const bool drawn = !names.empty() && draw(pool, names, options.width, options.height);
    pool->flush();
    pool->flush();
    if (!drawn || !headless::writePng(out, options.width, options.height, gl->readPixels().data(), error))
    {
        std::fprintf(stderr, "no sheet %s\n", error.c_str());
        return 1;
    }
    std::printf("wrote %s\n", out);
    return 0;
}
