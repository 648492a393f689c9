// A page of text at several sizes, and text in the scene behind it.
//
//   build/default/examples/textpage --out textpage.png [--font FILE.ttf]

#include "headless/headless.h"
#include "headless/png.h"

#include <orv/orv.h>

#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

using namespace orv;

namespace
{

constexpr int WIDTH = 900;
constexpr int HEIGHT = 720;
constexpr float MARGIN = 24.0f;
const Colour4f PAPER(0.96f, 0.95f, 0.91f, 1.0f);
const Colour4f INK(0.1f, 0.12f, 0.2f, 1.0f);
const Colour4f RED_INK(0.7f, 0.1f, 0.1f, 1.0f);

/// A font file whose sizes are loaded when they are needed.
struct Typeface
{
    AssetCachePool& pool;
    std::string file; ///< its name in the pool's sources

    Text::Ptr createText(unsigned size, const Colour4f& colour) const
    {
        const Font::Ptr font = get(*pool.getFontCache(), file.c_str(), size);
        return font ? makeShared<Text>(pool, font, colour) : Text::Ptr(); // the log says why not
    }
};

/// One text for each size and colour: each takes one draw.
bool writePage(const Typeface& face, std::vector<Text::Ptr>& page)
{
    float y = MARGIN;
    for (const unsigned size : {64u, 48u, 32u, 24u, 18u, 14u, 12u, 10u})
    {
        const Text::Ptr text = face.createText(size, size == 64 ? RED_INK : INK);
        if (!text)
            return false;
        const std::string line = std::to_string(size) + " Sphinx of black quartz, judge my vow";
        text->add(size == 64 ? "Text, pixel for pixel" : line.c_str(), MARGIN, y);
        y += Text::getLineHeight(*text->getFont());
        page.push_back(text);
    }

    const Text::Ptr small = page[4];
    y += MARGIN;
    small->add("Every character that a font has:\n"
               " !\"#$%&'()*+,-./0123456789:;<=>?\n"
               "@ABCDEFGHIJKLMNOPQRSTUVWXYZ[\\]^_\n"
               "`abcdefghijklmnopqrstuvwxyz{|}~",
               MARGIN, y);
    y += Text::measure(*small->getFont(), "\n\n\n\n\n").y;
    small->add("Lines begin,\nor end, or have their middle\nat the place that was given.", MARGIN, y);
    small->add("Lines begin,\nor end, or have their middle\nat the place that was given.", 450.0f, y,
               Text::Alignment::CENTRE);
    small->add("Lines begin,\nor end, or have their middle\nat the place that was given.", WIDTH - MARGIN, y,
               Text::Alignment::RIGHT);
    return true;
}

/// Puts words into the scene, their middle at a place.
/// @param scale  units for a pixel of the font; @param turn  about the upright axis.
bool addLabel(const Typeface& face, const char* words, const Colour4f& colour, const SceneNode::Ptr& parent,
              const Vector3f& position, float scale, const Anglef& turn)
{
    const Text::Ptr text = face.createText(48, colour);
    if (!text)
        return false;
    const float height = Text::measure(*text->getFont(), words).y;
    text->add(words, 0.0f, height * -0.5f, Text::Alignment::CENTRE);
    const Solid::Ptr label = text->createSolid(face.pool);
    if (!label)
        return false;
    label->setScale(Vector3f(scale, scale, scale));
    label->setPosition(position);
    label->setRotation(quaternionFromAxisAngle(Vector3f(0.0f, 1.0f, 0.0f), turn));
    label->setParent(parent);
    return true;
}

/// A cube with words on two sides, and more words that recede from the viewer.
bool buildScene(const Typeface& face, const SceneNode::Ptr& scene)
{
    const Solid::Ptr cube = createCube(face.pool, Vector2f(1.0f, 1.0f));
    if (!cube)
        return false;
    cube->setPosition(Vector3f(2.6f, -2.7f, 0.0f));
    cube->setScale(Vector3f(1.05f, 1.05f, 1.05f));
    cube->setRotation(quaternionFromAxisAngle(Vector3f(0.0f, 1.0f, 0.0f), Anglef::fromDegrees(-40.0f)));
    cube->setParent(scene);

    const auto lamp = makeShared<Light>("lamp");
    lamp->setPosition(Vector3f(5.0f, 0.0f, 7.0f));
    lamp->setParent(scene);

    const Anglef straight = Anglef::fromDegrees(0.0f);
    return addLabel(face, "Front\nside", INK, cube, Vector3f(0.0f, 0.0f, 1.01f), 0.012f, straight) &&
           addLabel(face, "Right\nside", RED_INK, cube, Vector3f(1.01f, 0.0f, 0.0f), 0.012f,
                    Anglef::fromDegrees(90.0f)) &&
           addLabel(face, "A long line of words\nthat leads into the distance", INK, scene,
                    Vector3f(-2.6f, -3.6f, -3.0f), 0.015f, Anglef::fromDegrees(55.0f));
}

bool draw(const SharedPtr<AssetCachePool>& pool, const std::string& file)
{
    const auto context = makeShared<RenderContext>();
    const auto renderer = makeShared<SimpleRenderer>(context, pool);
    const Typeface face = {*pool, file};
    const auto scene = makeShared<SceneNode>("scene");
    std::vector<Text::Ptr> page;
    if (!buildScene(face, scene) || !writePage(face, page))
        return false;
    const auto camera = makeShared<Camera>("camera");
    camera->setPosition(Vector3f(0.0f, 0.0f, 9.0f));

    const auto block = makeShared<RenderBlock>(renderer, scene, camera);
    block->setViewport(0, 0, WIDTH, HEIGHT);
    block->setBackgroundColour(PAPER);
    block->render();
    for (const Text::Ptr& text : page)
        text->draw(*context);
    return true;
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    std::string out = "textpage.png";
    std::string font = "/usr/share/fonts/truetype/dejavu/DejaVuSans.ttf"; // package fonts-dejavu-core
    for (int i = 1; i + 1 < argc; i += 2)
        (std::strcmp(argv[i], "--font") ? out : font) = argv[i + 1];

    headless::Options options;
    options.width = WIDTH;
    options.height = HEIGHT;
    options.samples = 4;
    std::string error;
    const auto gl = headless::Context::create(options, error);
    if (!gl)
    {
        std::fprintf(stderr, "no GL context: %s\n", error.c_str());
        return 1;
    }

    const std::size_t slash = font.rfind('/');
    const std::string folder = slash == std::string::npos ? "." : font.substr(0, slash);
    const auto pool = makeShared<AssetCachePool>();
    registerSource(*pool, folder.c_str(), false);
    const bool drawn = draw(pool, font.substr(slash + 1)); // npos + 1 is 0
    pool->flush();
    pool->flush();
    if (!drawn || !headless::writePng(out, WIDTH, HEIGHT, gl->readPixels().data(), error))
    {
        std::fprintf(stderr, "%s\n", error.c_str());
        return 1;
    }
    std::printf("wrote %s\n", out.c_str());
    return 0;
}
