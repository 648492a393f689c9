#include "orv/textlayout.h"

#include "scenetest.h"

#include <ft2build.h>
#include FT_FREETYPE_H
#include FT_OUTLINE_H

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <string>
#include <vector>

using namespace orv;
using support::Picture;

namespace
{

constexpr int SIDE = 64; ///< of the frame, in pixels
const Vector2f PEN = Vector2f(16.0f, 48.0f);

/// Draws a glyph with FreeType, without hints, at the same place.
class Judge
{
public:
    explicit Judge(const std::string& path)
    {
        FT_Init_FreeType(&m_library);
        EXPECT_EQ(0, FT_New_Face(m_library, path.c_str(), 0, &m_face)) << path;
    }
    ~Judge() { FT_Done_FreeType(m_library); }
    Judge(const Judge&) = delete;
    Judge& operator=(const Judge&) = delete;

    int getAdvance(unsigned glyph)
    {
        FT_Load_Glyph(m_face, glyph, FT_LOAD_NO_SCALE);
        return int(m_face->glyph->metrics.horiAdvance);
    }

    /// @param scale  pixels for a unit of the font.
    /// @return the frame's ink, top row first.
    std::vector<unsigned char> draw(unsigned glyph, float scale)
    {
        std::vector<unsigned char> ink(size_t(SIDE) * SIDE);
        EXPECT_EQ(0, FT_Load_Glyph(m_face, glyph, FT_LOAD_NO_SCALE)) << glyph;
        FT_Outline& outline = m_face->glyph->outline;
        const auto fixed = FT_Fixed(std::lround(scale * 64.0f * 65536.0f));
        const FT_Matrix larger = {fixed, 0, 0, fixed};
        FT_Outline_Transform(&outline, &larger);
        FT_Outline_Translate(&outline, FT_Pos(PEN.x) * 64, FT_Pos(float(SIDE) - PEN.y) * 64);
        FT_Bitmap bitmap = {};
        bitmap.rows = bitmap.width = SIDE;
        bitmap.pitch = SIDE;
        bitmap.buffer = ink.data();
        bitmap.num_grays = 256;
        bitmap.pixel_mode = FT_PIXEL_MODE_GRAY;
        EXPECT_EQ(0, FT_Outline_Get_Bitmap(m_library, &outline, &bitmap)) << glyph;
        return ink;
    }

private:
    FT_Library m_library = nullptr;
    FT_Face m_face = nullptr;
};

class GlyphPictureTest : public SceneTest
{
protected:
    /// Compares each step-th glyph of a font with FreeType's.
    void compareWithFreeType(const std::string& path, unsigned step)
    {
        const int ALLOWED = 96; // of 255, at curves, which become straight lines, and at overlapping contours
        const float MEAN_ALLOWED = 0.5f;
        const float SIZE = 40.0f;
        registerSource(*pool, "/", false);
        const FontFace::Ptr face = FontFace::load(*pool, path.c_str() + 1);
        ASSERT_TRUE(face) << path;
        const auto cache = makeShared<GlyphCache>(*pool);
        cache->addFont(face);
        Judge judge(path);
        const float scale = SIZE / float(face->getAscent() + face->getDescent());
        int drawn = 0;
        long sum = 0;
        for (unsigned glyph = 0; glyph < face->getGlyphCount(); glyph += step)
        {
            EXPECT_EQ(judge.getAdvance(glyph), face->getAdvance(glyph)) << path << " " << glyph;
            const std::vector<unsigned char> expected = judge.draw(glyph, scale);
            const auto text = makeShared<TextLayout>(*pool, cache, Colour4f::WHITE);
            const TextLayout::Glyph placed = {0, glyph, 0.0f, 0.0f};
            text->addGlyphs(&placed, 1, SIZE, PEN.x, PEN.y);
            Background(Colour4f::BLACK).enable(*renderContext);
            text->draw(*renderContext);
            const Picture picture = support::readFrame();
            int worst = 0;
            for (int y = 0; y < SIDE; ++y)
            {
                for (int x = 0; x < SIDE; ++x)
                {
                    const int wanted = expected[size_t(y) * SIDE + size_t(x)];
                    const int difference = std::abs(wanted - int(picture.pixel(x, y).r));
                    worst = std::max(worst, difference);
                    sum += difference;
                }
            }
            drawn += std::any_of(expected.begin(), expected.end(), [](int ink) { return ink > 0; }) ? 1 : 0;
            ASSERT_GE(ALLOWED, worst) << path << " " << glyph;
        }
        EXPECT_LT(2, drawn) << path;
        EXPECT_GT(MEAN_ALLOWED * float(drawn) * SIDE * SIDE, float(sum)) << path;
    }
};

} // namespace

// Faults caught: a drawing command that is misread, a subroutine of another part of the font, a glyph at another place.
TEST_F(GlyphPictureTest, looksAsFreeTypeDrawsIt)
{
    compareWithFreeType("/usr/share/fonts/truetype/dejavu/DejaVuSans.ttf", 29);
    compareWithFreeType("/usr/share/fonts/opentype/cantarell/Cantarell-Regular.otf", 3);
    for (const char* name : {"postscript", "postscriptparts", "postscriptranges"})
        compareWithFreeType(std::string(ORV_SOURCE_FOLDER "/fuzz/corpus/font/") + name, 1);
}
