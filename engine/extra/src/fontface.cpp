#include "orv/fontface.h"

#include "cfftable.h"
#include "charactermap.h"
#include "fontoutlines.h"
#include "kerning.h"

#include "orv/assetcachepool.h"
#include "orv/log.h"
#include "orv/stream.h"

#include <climits>
#include <new>
#include <utility>

namespace orv
{

namespace
{

using detail::FontBytes;

/// @return the offset of a font's list of tables: 0 unless the file is a collection; -1 if it has no such font.
int64_t findStart(FontBytes file, unsigned index)
{
    const std::size_t COUNT_AT = 8, STARTS_AT = 12;
    if (file.u32(0) != detail::makeFontTag("ttcf"))
        return index == 0 ? 0 : -1;
    if (index >= file.u32(COUNT_AT))
        return -1;
    const uint32_t start = file.u32(STARTS_AT + 4 * std::size_t(index));
    return file.isSound() && start <= INT_MAX ? int64_t(start) : -1;
}

/// @param outlines  filled in if they are in PostScript form.
/// @return null, or what is wrong.
const char* findOutlinesFault(detail::FontTables& tables, detail::CffTable& outlines)
{
    if (!tables.isPostScript())
        return tables.findTablesFault();
    detail::FontTables others = tables;
    FontBytes table;
    if (others.findTable(detail::makeFontTag("CFF2"), table))
        return "its outlines are in the form CFF2, of variable fonts";
    if (!tables.findTable(detail::makeFontTag("CFF "), table))
        return detail::FontTables::MISSING_TABLE;
    const char* const fault = tables.findHeadersFault<false>();
    return fault ? fault : outlines.read(table);
}

} // namespace

struct FontFace::Tables
{
    detail::FontTables tables;
    detail::CharacterMap characters;
    detail::Kerning kerning;
};

FontFace::FontFace(FileToString&& file, const char* name, unsigned index)
    : m_file(std::move(file))
    , m_name(name)
    , m_index(index)
{
}

FontFace::~FontFace() = default;

FontFace::Ptr FontFace::load(const AssetCachePool& pool, const char* name, unsigned index)
{
    const SharedPtr<Stream> stream = name ? pool.getStream(name) : SharedPtr<Stream>();
    if (!stream)
    {
        ORV_LOG_ERROR("Error reading font face \"%s\": there is no such file", name ? name : "");
        return {};
    }
    return load(*stream, name, index);
}

FontFace::Ptr FontFace::load(Stream& stream, const char* name, unsigned index)
{
    name = name ? name : "";
    const Ptr face = new (std::nothrow) FontFace(FileToString(stream), name, index);
    if (!face)
        return {};
    if (const char* fault = face->read())
    {
        ORV_LOG_ERROR("Error reading font face \"%s\", font %u: %s", name, index, fault);
        return {};
    }
    return face;
}

/// @return null, or the fault.
const char* FontFace::read()
{
    if (!getData() || getSizeInBytes() > INT_MAX)
        return "it cannot be read into memory";
    const int64_t start = findStart(FontBytes(getData(), getSizeInBytes()), m_index);
    if (start < 0)
        return "the file has no such font";
    detail::FontTables tables(getData(), getSizeInBytes(), std::size_t(start));
    detail::CffTable postScript;
    if (const char* fault = findOutlinesFault(tables, postScript))
        return fault;

    FontBytes head, hhea;
    tables.findTable(detail::makeFontTag("head"), head);
    tables.findTable(detail::makeFontTag("hhea"), hhea);
    m_unitsPerEm = int(head.u16(18));
    m_ascent = hhea.s16(4);
    m_descent = -hhea.s16(6);
    m_lineGap = hhea.s16(8);
    if (m_unitsPerEm < 16 || m_unitsPerEm > 16384)
        return "its unit of length is damaged";

    m_tables = std::make_unique<Tables>(Tables{tables, {}, {}});
    if (!m_tables->characters.read(tables.getCharacterMaps()))
        return "it has no character map that can be read";
    m_tables->kerning.read(tables);
    auto* const file = reinterpret_cast<unsigned char*>(m_file.getStart());
    m_outlines = tables.isPostScript() ? std::make_unique<detail::FontOutlines>(tables, postScript)
                                       : std::make_unique<detail::FontOutlines>(file, tables);
    return nullptr;
}

unsigned FontFace::findGlyph(uint32_t codePoint) const
{
    const uint32_t glyph = m_tables->characters.find(codePoint);
    return glyph < getGlyphCount() ? glyph : 0;
}

unsigned FontFace::getGlyphCount() const
{
    return m_tables->tables.getGlyphCount();
}

int FontFace::getAdvance(unsigned glyph) const
{
    return glyph < getGlyphCount() ? m_tables->tables.getAdvance(glyph) : 0;
}

int FontFace::getKerning(unsigned left, unsigned right) const
{
    return left < getGlyphCount() && right < getGlyphCount() ? m_tables->kerning.find(left, right) : 0;
}

} // namespace orv
