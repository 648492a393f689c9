#pragma once

#include "orv/export.h"
#include "orv/filetostring.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

namespace orv
{

class AssetCachePool;
class Stream;

namespace detail
{
class FontOutlines;
}

/// All glyphs of one typeface of a font file: its characters, their advances and kerning.
///
/// Supported are fonts with TrueType outlines (.ttf), with PostScript outlines (.otf: CFF, version 1), and each font of a
/// collection of either (.ttc). Variable fonts with PostScript outlines (CFF2) are refused; of other variable fonts the
/// default shapes are used. Untrusted files are safe: nothing outside of the file is read, and
/// damaged glyphs are not drawn. The file stays in memory as long as the face. A face has no GL objects and survives a
/// lost context. Threads: no locks; immutable.
class ORV_API FontFace : public Shared
{
public:
    ORV_CLASS_NAME("FontFace")
    using Ptr = SharedPtr<FontFace>;

    /// Reads a file from the sources of a pool.
    /// @param name   of the file, without a size; borrowed.
    /// @param index  which font of a collection; 0 for a file of one font.
    /// @return empty, after logging why.
    static Ptr load(const AssetCachePool& pool, const char* name, unsigned index = 0);

    /// The same from the rest of a stream. @param name  for messages.
    static Ptr load(Stream& stream, const char* name, unsigned index = 0);

    ~FontFace() override;

    const char* getName() const { return m_name.c_str(); } ///< for messages

    /// @param codePoint  of Unicode.
    /// @return the number of its glyph; 0, the glyph for missing characters (a box), if the font does not have it.
    unsigned findGlyph(uint32_t codePoint) const;
    unsigned getGlyphCount() const; ///< Glyphs are numbered from 0 up to this.

    // In the font's own units; getUnitsPerEm() of them are one em.

    int getUnitsPerEm() const { return m_unitsPerEm; } ///< 16 to 16384
    int getAscent() const { return m_ascent; }         ///< of a line above the baseline
    int getDescent() const { return m_descent; }       ///< below it, positive
    int getLineGap() const { return m_lineGap; }       ///< from the bottom of a line to the top of the next

    /// How far the pen moves to the right. 0 for a number that is no glyph's.
    int getAdvance(unsigned glyph) const;

    /// Added to the advance of left if right follows; usually negative or 0.
    ///
    /// From the pair adjustments of the font's "kern" feature (table GPOS), or else from its "kern" table.
    int getKerning(unsigned left, unsigned right) const;

    /// The file, for libraries that shape text. Valid as long as the face.
    const unsigned char* getData() const { return reinterpret_cast<const unsigned char*>(m_file.getStart()); }
    std::size_t getSizeInBytes() const { return std::size_t(m_file.getEnd() - m_file.getStart()); }
    unsigned getIndex() const { return m_index; }

    const detail::FontOutlines& getOutlines() const { return *m_outlines; } ///< for GlyphCache

private:
    template <class T>
    friend class SharedPtr;

    ORV_LOCAL FontFace(FileToString&& file, const char* name, unsigned index);
    ORV_LOCAL const char* read();

    FileToString m_file;
    std::string m_name;
    unsigned m_index;
    int m_unitsPerEm = 0;
    int m_ascent = 0;
    int m_descent = 0;
    int m_lineGap = 0;
    std::unique_ptr<detail::FontOutlines> m_outlines;
    struct Tables;
    std::unique_ptr<Tables> m_tables;
};

} // namespace orv
