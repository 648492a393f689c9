#pragma once

#include "orv/export.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"

#include <vector>

namespace orv
{

class Texture2D;

/// The characters of one typeface at one size, drawn into one texture.
///
/// All measures are in pixels of the atlas, which are pixels of the screen when text is drawn at its own size.
class ORV_API Font : public Shared
{
public:
    ORV_CLASS_NAME("Font")
    using Ptr = SharedPtr<Font>;

    /// Where a character lies in the atlas and how it is placed, in pixels.
    struct CharacterData
    {
        /// The glyph's rectangle in the atlas, from its upper left corner; x1 and y1 lie just outside.
        float x0 = 0.0f;
        float y0 = 0.0f;
        float x1 = 0.0f;
        float y1 = 0.0f;
        /// Where the rectangle's upper left corner goes, seen from the pen on the baseline; y counts downwards.
        float xoff = 0.0f;
        float yoff = 0.0f;
        float xadvance = 0.0f; ///< how far the pen moves to the right
    };

    /// @param texture    the atlas, its alpha the ink; shared.
    /// @param size       of the typeface.
    /// @param ascent     from the baseline up to the top of a line.
    /// @param descent    from the baseline down to the bottom of a line.
    /// @param lineGap    from there to the top of the next line.
    /// @param data       charCount entries, copied; null, or a count below 1, for none.
    Font(const SharedPtr<Texture2D>& texture, int size, float ascent, float descent, float lineGap,
         int firstChar, int charCount, const CharacterData* data);
    ~Font() override;

    /// The atlas, its measures in pixels, and which characters it holds.
    const SharedPtr<Texture2D>& getTexture() const { return m_texture; }
    int getSize() const { return m_size; }
    float getAscent() const { return m_ascent; }
    float getDescent() const { return m_descent; }
    float getLineGap() const { return m_lineGap; }
    int getFirstChar() const { return m_firstChar; }
    int getCharCount() const { return m_charCount; }

    /// @param c  a Unicode code point.
    /// @return all zero for a character that the font does not have: it draws nothing and takes no room.
    const CharacterData& getCharacterData(int c) const
    {
        // Unsigned: the difference may be beyond an int, and what is below the first wraps to far above.
        const unsigned index = unsigned(c) - unsigned(m_firstChar);
        return index < unsigned(m_charCount) ? m_data[index] : NO_CHARACTER;
    }

private:
    static const CharacterData NO_CHARACTER;

    SharedPtr<Texture2D> m_texture;
    int m_size;
    float m_ascent;
    float m_descent;
    float m_lineGap;
    int m_firstChar;
    int m_charCount;
    std::vector<CharacterData> m_data;
};

} // namespace orv
