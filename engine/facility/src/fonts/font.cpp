#include "orv/font.h"

#include "orv/texture2d.h"

namespace orv
{

const Font::CharacterData Font::NO_CHARACTER;

Font::Font(const SharedPtr<Texture2D>& texture, int size, float ascent, float descent, float lineGap,
           int firstChar, int charCount, const CharacterData* data)
    : m_texture(texture)
    , m_size(size)
    , m_ascent(ascent)
    , m_descent(descent)
    , m_lineGap(lineGap)
    , m_firstChar(firstChar)
    , m_charCount(data && charCount > 0 ? charCount : 0)
    , m_data(data, data + m_charCount)
{
}

Font::~Font() = default;

} // namespace orv
