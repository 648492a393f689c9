#pragma once

#include "orv/colour.h"
#include "orv/matrix.h"
#include "orv/shaderuniform.h"
#include "orv/sharedptr.h"

#include <cstdint>
#include <unordered_map>
#include <vector>

namespace orv
{

class Appearance;
class ShaderProgram;
class Texture2D;
class Texture2DCache;

namespace detail
{

struct GlyphPicture;

/// Blended, visible from both sides, without writing depth; the texture's alpha is the ink.
/// @return empty without memory (logged).
SharedPtr<Appearance> makeInkAppearance(const SharedPtr<ShaderProgram>& program,
                                        const SharedPtr<Texture2D>& ink, const Colour4f& colour);

/// Pictures of glyphs in square textures, the pages.
///
/// A page is filled by rows of square cells, each row as high as its cells, which come in few sizes. When all pages are
/// full, the least recently used is dropped: a glyph in a cell of the needed size, or a whole page if all of its glyphs
/// are older. Glyphs used since the last beginUse() are kept. If others hold a page's texture, its glyphs stay: instead
/// of clearing the page, the atlas gives the texture up to them.
class GlyphAtlas
{
public:
    static constexpr uint32_t NONE = UINT32_MAX;

    struct Entry
    {
        uint64_t key = 0;
        uint64_t lastUse = 0;
        uint64_t id = 0; ///< of this glyph in this cell, never reused; 0: empty
        uint16_t page = 0;
        uint16_t cell = 0;     ///< side of its cell
        uint16_t x = 0, y = 0; ///< upper left corner, of cell and glyph
        int16_t width = 0, height = 0;
        int16_t offsetX = 0, offsetY = 0; ///< as GlyphPicture has them
    };

    /// For drawing a page over a frame; colour and projection of the next draw.
    struct Look
    {
        SharedPtr<Appearance> appearance; ///< empty without a texture
        SharedPtr<ShaderUniform<Matrix4f>> projection;
        Colour4f colour;
    };

    GlyphAtlas(const SharedPtr<Texture2DCache>& textures, const SharedPtr<ShaderProgram>& program,
               unsigned pageSize, unsigned mostPages);
    ~GlyphAtlas();

    int getPageSize() const { return m_pageSize; }
    unsigned getPageCount() const { return unsigned(m_pages.size()); }
    unsigned getGlyphCount() const { return unsigned(m_byKey.size()); }
    uint64_t getDrawnCount() const { return m_lastId; } ///< pictures added so far

    /// Begins a new use: glyphs not used after this call may be dropped.
    void beginUse() { ++m_use; }

    /// Marks a glyph as used. @return its number, or NONE.
    uint32_t find(uint64_t key);

    /// Adds a new glyph and marks it as used.
    /// @param picture  not blank, and each side below that of a page.
    /// @return NONE if everything is in use.
    uint32_t add(uint64_t key, const GlyphPicture& picture);

    const Entry& getEntry(uint32_t number) const { return m_entries[number]; }

    /// Marks a glyph as used again. @return false if it has been dropped since it had that id.
    bool use(uint32_t number, uint64_t id)
    {
        Entry& entry = m_entries[number];
        if (entry.id != id)
            return false;
        entry.lastUse = m_use;
        m_pages[entry.page].lastUse = m_use;
        return true;
    }

    /// Uploads new glyphs. Call it before drawing.
    /// @param isTryingAgain  also pages that GL refused before.
    void upload(bool isTryingAgain);

    /// A page that GL refused, or that was lost with the context, has no appearance or draws nothing.
    Look& getLook(unsigned page) { return m_pages[page].look; }

    /// A page's texture, from now on with mipmaps; empty if GL refuses it. Its glyphs stay as long as others hold it.
    SharedPtr<Texture2D> takeTexture(unsigned number);

private:
    struct Cell
    {
        uint16_t page, x, y;
    };

    struct Page
    {
        std::vector<unsigned char> ink; ///< the texture's current or next contents
        SharedPtr<Texture2D> texture;
        int ownShares = 0; ///< reference count of the texture without others
        bool hasMipmaps = false;
        bool isRefused = false;
        int rowsEnd = 0;                    ///< below the last row of cells
        int changedTop = 0, changedEnd = 0; ///< rows of pixels that GL does not have yet
        uint64_t lastUse = 0;
        Look look;
    };

    static bool isHeld(const Page& page);
    bool findCell(int side, Cell& cell);
    bool addRow(int side);
    bool forget(int side);
    uint32_t findOldest(int side) const;
    unsigned findOldestPage() const;
    void forgetEntry(uint32_t number);
    void clearPage(unsigned number);
    bool updateTexture(Page& page);
    bool makeTexture(Page& page);
    void draw(const Entry& entry, const GlyphPicture& picture);

    SharedPtr<Texture2DCache> m_textures;
    SharedPtr<ShaderProgram> m_program;
    int m_pageSize;
    unsigned m_mostPages;
    uint64_t m_use = 1;
    uint64_t m_lastId = 0;
    std::vector<Page> m_pages;
    std::vector<Entry> m_entries;
    std::vector<uint32_t> m_freeEntries;
    std::unordered_map<uint64_t, uint32_t> m_byKey;
    std::unordered_map<int, std::vector<Cell>> m_freeCells; ///< by their side
};

} // namespace detail
} // namespace orv
