#include "orv/text.h"

#include "scenetest.h"

#include "orv/fontcache.h"
#include "orv/mesh.h"
#include "orv/renderblock.h"
#include "support/allocation.h"

#include <array>
#include <cmath>

using namespace orv;
using support::Picture;
using support::Rgba;

namespace
{

/// A font of few glyphs on an atlas of noise, so that a texel out of place shows.
class TextTest : public SceneTest
{
protected:
    static constexpr int SIDE = 32; ///< of the atlas

    void SetUp() override
    {
        SceneTest::SetUp();
        glyphs[0] = {1, 1, 6, 8, 0, -7, 6.4f};   // A
        glyphs[1] = {8, 1, 12, 11, 1, -8, 5.3f}; // B hangs below the baseline
        glyphs[2] = {0, 0, 0, 0, 0, 0, 4.0f};    // C is blank
        glyphs[0x7F - 'A'] = glyphs[0];
        for (const Font::CharacterData& glyph : glyphs)
        {
            for (int y = int(glyph.y0); y < int(glyph.y1); ++y)
            {
                for (int x = int(glyph.x0); x < int(glyph.x1); ++x)
                    atlas[size_t(y * SIDE + x)] = uint8_t(64 + (x * 37 + y * 91) % 192);
            }
        }
        const auto texture = pool->getTexture2DCache()->create(
            SIDE, SIDE, Texture::Format::ALPHA, Texture::Type::UNSIGNED_BYTE, atlas.data(), nullptr);
        font = pool->getFontCache()->create(texture, 10, 7.4f, 2.2f, 0.5f, 'A', int(glyphs.size()),
                                            glyphs.data(), nullptr);
    }

    void TearDown() override
    {
        font = nullptr;
        SceneTest::TearDown();
    }

    Text::Ptr makeText(const Colour4f& colour = Colour4f::WHITE)
    {
        return makeShared<Text>(*pool, font, colour);
    }

    void clear() { Background(Colour4f::BLACK).enable(*renderContext); }

    /// What blends a glyph of the atlas over a picture, the upper left corner of its rectangle at (x, y).
    void put(Picture& picture, char c, int x, int y, const Colour4f& colour = Colour4f::WHITE) const
    {
        const Font::CharacterData& glyph = font->getCharacterData(c);
        for (int row = 0; row < int(glyph.y1 - glyph.y0); ++row)
        {
            for (int column = 0; column < int(glyph.x1 - glyph.x0); ++column)
            {
                const size_t texel = size_t((int(glyph.y0) + row) * SIDE + int(glyph.x0) + column);
                const float ink = float(atlas[texel]) * colour.a;
                const auto shade = [ink](float component) { return uint8_t(std::lround(ink * component)); };
                picture.setPixel(x + column, y + row,
                                 {shade(colour.r), shade(colour.g), shade(colour.b), 255});
            }
        }
    }

    std::array<Font::CharacterData, 63> glyphs;
    std::vector<uint8_t> atlas = std::vector<uint8_t>(SIDE * SIDE);
    Font::Ptr font;
};

} // namespace

// Faults caught: glyphs between pixels, upside down, at the wrong end of the pen; what is no character drawn.
TEST_F(TextTest, glyphsFallOnPixels)
{
    using Alignment = Text::Alignment;
    struct Place
    {
        char c;
        int x, y;
    };
    // The baseline is 8 below the top, the next line's top 10 below that of the one before.
    const struct
    {
        const char* string;
        float x, y;
        Alignment alignment;
        std::vector<Place> places;
        float width, height;
    } cases[] = {
        {"A", 3, 4, Alignment::LEFT, {{'A', 3, 5}}, 6.4f, 11},
        {"AB", 3.4f, 3.6f, Alignment::LEFT, {{'A', 3, 5}, {'B', 11, 4}}, 11.7f, 11},
        {"ACA\nB\n", 0, 0, Alignment::LEFT, {{'A', 0, 1}, {'A', 10, 1}, {'B', 1, 10}}, 16.8f, 31},
        {"AB\nA", 32, 0, Alignment::CENTRE, {{'A', 26, 1}, {'B', 34, 0}, {'A', 29, 11}}, 11.7f, 21},
        {"AB\nA", 64, 0, Alignment::RIGHT, {{'A', 52, 1}, {'B', 60, 0}, {'A', 58, 11}}, 11.7f, 21},
        {"A", -3, 60, Alignment::LEFT, {{'A', -3, 61}}, 6.4f, 11},
        {"", 0, 0, Alignment::LEFT, {}, 0, 0},
        {nullptr, 0, 0, Alignment::LEFT, {}, 0, 0},
        {"x\r\t\x7F\xC2\x85", 0, 0, Alignment::LEFT, {}, 0, 11},
        // Other scripts, then bytes that are no UTF-8: each time the A behind them is still read.
        {"\xC3\xA4\xE4\xB8\xAD\xF0\x9F\x98\x80"
         "A",
         0,
         0,
         Alignment::LEFT,
         {{'A', 0, 1}},
         6.4f,
         11},
        {"\x80\xC1\x81\xF5\xFF"
         "A",
         0,
         0,
         Alignment::LEFT,
         {{'A', 0, 1}},
         6.4f,
         11},
        {"\xC3"
         "A\xE4\xB8"
         "A\xF0\x9F\x98"
         "A",
         0,
         0,
         Alignment::LEFT,
         {{'A', 0, 1}, {'A', 6, 1}, {'A', 13, 1}},
         19.2f,
         11},
        {"\xE0\x81\x81\xED\xA0\x80\xF0\x80\x81\x81\xF4\x90\x80\x80"
         "A\xC3",
         0,
         0,
         Alignment::LEFT,
         {{'A', 0, 1}},
         6.4f,
         11},
    };
    for (const auto& test : cases)
    {
        clear();
        Picture expected = support::readFrame();
        for (const Place& place : test.places)
        {
            put(expected, place.c, place.x, place.y);
        }
        const Text::Ptr text = makeText();
        text->add(test.string, test.x, test.y, test.alignment);
        text->draw(*renderContext);
        EXPECT_TRUE(comparePictures("text", expected, support::readFrame(), {1, 0})) << test.string;
        const Vector2f size = Text::measure(*font, test.string);
        EXPECT_TRUE(std::abs(size.x - test.width) < 0.01f && size.y == test.height)
            << test.string << ": " << size.x << " " << size.y;
    }
}

// Faults caught: a draw for each string, buffers made again each frame, a frame spoilt by the text before it.
TEST_F(TextTest, drawsAllAtOnceAndLeavesTheSceneAlone)
{
    addSquare(Vector3f(), 3.0f, makePaint(Colour4f::GREEN));
    renderFrame();
    const Picture plain = support::readFrame();

    const Colour4f colour(0.2f, 0.6f, 1.0f, 0.5f);
    const Text::Ptr text = makeText(Colour4f::RED);
    text->add("A", 50, 2);
    text->draw(*renderContext);
    text->clear();
    text->add("A", 0, 0);
    text->add("A\nA", 50, 40);
    text->setColour(colour);
    Picture expected = plain;
    for (const auto& [x, y] : {std::pair(0, 1), std::pair(50, 41), std::pair(50, 51)})
        put(expected, 'A', x, y, colour);

    renderFrame();
    text->draw(*renderContext);
    EXPECT_TRUE(comparePictures("texts", expected, support::readFrame(), {2, 0}));
    renderFrame();
    EXPECT_TRUE(comparePictures("after", plain, support::readFrame()));

    text->draw(*renderContext); // the driver may compile something for it
    glcalls::reset();
    const uint64_t allocations = support::countAllocations();
    text->draw(*renderContext);
    text->draw(*renderContext);
    EXPECT_EQ(allocations, support::countAllocations());
    EXPECT_EQ(2u, glcalls::count(glDrawArrays));
    EXPECT_EQ(0u, glcalls::count(glBufferData) + glcalls::count(glTexImage2D));

    text->clear();
    text->draw(*renderContext);
    EXPECT_EQ(2u, glcalls::count(glDrawArrays));
}

// Fault caught: a buffer more for each change, which stay until a flush that a program may not do for hours.
TEST_F(TextTest, changesKeepTheBuffer)
{
    const Text::Ptr text = makeText();
    const char* const strings[] = {"A", "AAAA", "A\nA", "", "AA"};
    glcalls::reset();
    for (const char* string : strings)
    {
        text->clear();
        text->add(string, 3, 4);
        clear();
        text->draw(*renderContext);
    }
    EXPECT_EQ(1u, glcalls::count(glGenBuffers));
    EXPECT_EQ(4u, glcalls::count(glBufferData)); // but for the empty one
    EXPECT_EQ(4u, glcalls::count(glDrawArrays));
    clear();
    Picture expected = support::readFrame();
    put(expected, 'A', 3, 5);
    put(expected, 'A', 9, 5);
    text->draw(*renderContext);
    EXPECT_TRUE(comparePictures("changed", expected, support::readFrame(), {1, 0}));
}

// Fault caught: a place counted from another corner than the viewport's.
TEST_F(TextTest, viewportIsThePage)
{
    clear();
    Picture expected = support::readFrame();
    put(expected, 'A', 20, 64 - 12 - 40 + 1);
    renderContext->setViewport(20, 12, 30, 40);
    const Text::Ptr text = makeText();
    text->add("A", 0, 0);
    text->draw(*renderContext);
    EXPECT_TRUE(comparePictures("viewport", expected, support::readFrame(), {1, 0}));
}

// Faults caught: text in the scene mirrored, hidden from one side, or drawn before what is behind it.
TEST_F(TextTest, standsInTheScene)
{
    const Text::Ptr text = makeText();
    text->add("AB\nA", 32, 20, Text::Alignment::CENTRE);
    const SharedPtr<Solid> solid = text->createSolid(*pool);
    ASSERT_TRUE(solid);
    text->setColour(Colour4f::RED); // too late for the solid
    // The camera sees 6 units over 64 pixels: a unit of the text on each pixel, its origin in the corner.
    const float scale = 6.0f / 64.0f;
    solid->setScale(Vector3f(scale, scale, scale));
    solid->setPosition(Vector3f(-3, 3, 0));
    solid->setParent(scene);
    addSquare(Vector3f(0, 0, -1), 9.0f, makePaint(Colour4f(0, 0, 0, 1)));

    clear();
    Picture expected = support::readFrame();
    for (const auto& [c, x, y] : {std::tuple('A', 26, 21), std::tuple('B', 34, 20), std::tuple('A', 29, 31)})
        put(expected, c, x, y);
    renderFrame();
    EXPECT_TRUE(comparePictures("solid", expected, support::readFrame(), {2, 0}));

    Picture mirrored = expected;
    for (int y = 0; y < 64; ++y)
    {
        for (int x = 0; x < 64; ++x)
            mirrored.setPixel(x, y, expected.pixel(63 - x, y));
    }
    solid->setRotation(quaternionFromAxisAngle(Vector3f(0, 1, 0), Anglef::fromDegrees(180)));
    solid->setPosition(Vector3f(3, 3, 0));
    renderFrame();
    EXPECT_TRUE(comparePictures("behind", mirrored, support::readFrame(), {6, 0}));

    support::LogCapture log;
    text->clear();
    EXPECT_FALSE(text->createSolid(*pool));
    EXPECT_FALSE(makeShared<Text>(*pool, Font::Ptr(), Colour4f::RED)->createSolid(*pool));
    EXPECT_EQ(3, log.count('E')) << log.text();
}

// Fault caught: glyphs that are counted in 16 bits, so that the first are drawn in place of the last.
TEST_F(TextTest, longStringsAreDrawnToTheirEnd)
{
    constexpr int MANY = 20000;
    const Text::Ptr text = makeText();
    text->add(std::string(MANY, 'A').c_str(), 100, 0); // out of sight
    text->add("A", 8, 8);
    clear();
    Picture expected = support::readFrame();
    put(expected, 'A', 8, 9);
    glcalls::resetCounts();
    text->draw(*renderContext);
    EXPECT_EQ(1u, glcalls::count(glDrawArrays));
    EXPECT_TRUE(comparePictures("long", expected, support::readFrame(), {1, 0}));

    const SharedPtr<Solid> solid = text->createSolid(*pool);
    ASSERT_TRUE(solid);
    EXPECT_GT(solid->getMesh()->getHeader().boundingRadius, 100.0f + 6.0f * MANY);
}
