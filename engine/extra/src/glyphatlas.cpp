#include "glyphatlas.h"

#include "fontoutlines.h"

#include "orv/appearance.h"
#include "orv/log.h"
#include "orv/renderdevice.h"
#include "orv/texture2dcache.h"

#include <GLES2/gl2.h>

#include <algorithm>
#include <cstring>
#include <iterator>

namespace orv::detail
{

namespace
{

constexpr int CELL_SIDES[] = {8,  12,  16,  20,  24,  32,  40,   48,   64,  80,
                              96, 128, 192, 256, 384, 512, 1024, 2048, 4096};

/// Side of the smallest cell for a picture with an empty pixel to its right and below.
int findCellSide(const GlyphPicture& picture, int pageSize)
{
    const int wanted = std::max(picture.width, picture.height) + 1;
    return std::min(*std::lower_bound(std::begin(CELL_SIDES), std::end(CELL_SIDES), wanted), pageSize);
}

} // namespace

SharedPtr<Appearance> makeInkAppearance(const SharedPtr<ShaderProgram>& program,
                                        const SharedPtr<Texture2D>& ink, const Colour4f& colour)
{
    const auto appearance = makeShared<Appearance>();
    if (!appearance)
        return {};
    appearance->setShaderProgram(program);
    // Blending raises the target's alpha towards 1, so that its picture can be composited over another one.
    appearance->setBlendFactors(BlendFactor::SRC_ALPHA, BlendFactor::ONE, BlendFactor::ONE_MINUS_SRC_ALPHA,
                                BlendFactor::ONE_MINUS_SRC_ALPHA);
    appearance->setCullingMode(CullingMode::CULL_NONE);
    appearance->setDepthWriteEnabled(false);
    appearance->setProperty("M_DIFFUSE_TEXTURE", ink);
    appearance->setProperty("M_UV_OFFSET_SCALE", Vector4f(0.0f, 0.0f, 1.0f, 1.0f));
    appearance->setProperty("M_FADE", Vector2f(0.0f, 0.0f));
    appearance->setProperty("M_DIFFUSE_COLOUR", Vector4f(colour.r, colour.g, colour.b, 1.0f));
    appearance->setProperty("M_OPACITY", colour.a);
    return appearance;
}

GlyphAtlas::GlyphAtlas(const SharedPtr<Texture2DCache>& textures, const SharedPtr<ShaderProgram>& program,
                       unsigned pageSize, unsigned mostPages)
    : m_textures(textures)
    , m_program(program)
    , m_pageSize(64)
    , m_mostPages(std::clamp(mostPages, 1u, 1024u))
{
    while (m_pageSize * 2 <= int(std::min(pageSize, 4096u)))
        m_pageSize *= 2;
}

GlyphAtlas::~GlyphAtlas() = default;

uint32_t GlyphAtlas::find(uint64_t key)
{
    const auto found = m_byKey.find(key);
    if (found == m_byKey.end())
        return NONE;
    use(found->second, m_entries[found->second].id);
    return found->second;
}

uint32_t GlyphAtlas::add(uint64_t key, const GlyphPicture& picture)
{
    const int side = findCellSide(picture, m_pageSize);
    Cell cell = {};
    while (!findCell(side, cell))
    {
        if (!addRow(side) && !forget(side))
            return NONE;
    }
    uint32_t number = uint32_t(m_entries.size());
    if (m_freeEntries.empty())
        m_entries.emplace_back();
    else
    {
        number = m_freeEntries.back();
        m_freeEntries.pop_back();
    }
    Entry& entry = m_entries[number];
    entry = {key,
             m_use,
             ++m_lastId,
             cell.page,
             uint16_t(side),
             cell.x,
             cell.y,
             int16_t(picture.width),
             int16_t(picture.height),
             int16_t(picture.x),
             int16_t(picture.y)};
    m_byKey[key] = number;
    m_pages[cell.page].lastUse = m_use;
    draw(entry, picture);
    return number;
}

bool GlyphAtlas::findCell(int side, Cell& cell)
{
    std::vector<Cell>& cells = m_freeCells[side];
    if (cells.empty())
        return false;
    cell = cells.back();
    cells.pop_back();
    return true;
}

/// Makes free cells, on a new page if the others are full. @return false if there is no room for any.
bool GlyphAtlas::addRow(int side)
{
    auto page = std::find_if(m_pages.begin(), m_pages.end(),
                             [&](const Page& p) { return p.rowsEnd + side <= m_pageSize; });
    if (page == m_pages.end())
    {
        if (m_pages.size() == m_mostPages)
            return false;
        page = m_pages.emplace(m_pages.end());
        page->ink.resize(std::size_t(m_pageSize) * std::size_t(m_pageSize));
    }
    std::vector<Cell>& cells = m_freeCells[side];
    for (int x = (m_pageSize / side - 1) * side; x >= 0; x -= side) // the leftmost is taken first
        cells.push_back({uint16_t(page - m_pages.begin()), uint16_t(x), uint16_t(page->rowsEnd)});
    page->rowsEnd += side;
    return true;
}

/// Whether others than this page, its appearance and the texture cache hold the texture.
bool GlyphAtlas::isHeld(const Page& page)
{
    return page.texture && page.texture->sharedGetCount() > page.ownShares;
}

/// Drops old glyphs. @return false if everything is in use.
bool GlyphAtlas::forget(int side)
{
    const uint32_t entry = findOldest(side);
    const unsigned page = findOldestPage();
    if (page < m_pages.size() && (entry == NONE || m_pages[page].lastUse < m_entries[entry].lastUse))
        clearPage(page);
    else if (entry != NONE)
        forgetEntry(entry);
    else
        return false;
    return true;
}

/// @return the least recently used glyph in cells of this size, of equals the oldest; NONE if all are in use.
uint32_t GlyphAtlas::findOldest(int side) const
{
    uint32_t oldest = NONE;
    for (uint32_t i = 0; i < m_entries.size(); ++i)
    {
        const Entry& entry = m_entries[i];
        if (entry.id == 0 || int(entry.cell) != side || entry.lastUse == m_use || isHeld(m_pages[entry.page]))
            continue;
        if (oldest == NONE || entry.lastUse < m_entries[oldest].lastUse ||
            (entry.lastUse == m_entries[oldest].lastUse && entry.id < m_entries[oldest].id))
            oldest = i;
    }
    return oldest;
}

/// @return the count of pages if all are in use.
unsigned GlyphAtlas::findOldestPage() const
{
    auto oldest = unsigned(m_pages.size());
    for (unsigned i = 0; i < m_pages.size(); ++i)
    {
        const bool isFree = m_pages[i].lastUse != m_use;
        if (isFree && (oldest == m_pages.size() || m_pages[i].lastUse < m_pages[oldest].lastUse))
            oldest = i;
    }
    return oldest;
}

void GlyphAtlas::forgetEntry(uint32_t number)
{
    Entry& entry = m_entries[number];
    m_byKey.erase(entry.key);
    m_freeCells[entry.cell].push_back({entry.page, entry.x, entry.y});
    m_freeEntries.push_back(number);
    entry = {};
}

/// Drops all glyphs of a page, and its texture too if others hold it.
void GlyphAtlas::clearPage(unsigned number)
{
    for (uint32_t i = 0; i < m_entries.size(); ++i)
    {
        if (m_entries[i].id != 0 && m_entries[i].page == number)
            forgetEntry(i);
    }
    for (auto& [side, cells] : m_freeCells)
        cells.erase(
            std::remove_if(cells.begin(), cells.end(), [&](const Cell& c) { return c.page == number; }),
            cells.end());
    Page& page = m_pages[number];
    page.rowsEnd = 0;
    if (!isHeld(page))
        return;
    page.changedTop = page.changedEnd = 0;
    page.texture = nullptr;
    page.look = {};
    page.hasMipmaps = false;
    std::fill(page.ink.begin(), page.ink.end(), static_cast<unsigned char>(0));
}

/// Writes the whole cell, over older contents.
void GlyphAtlas::draw(const Entry& entry, const GlyphPicture& picture)
{
    Page& page = m_pages[entry.page];
    for (int row = 0; row < entry.cell; ++row)
    {
        unsigned char* to = page.ink.data() + std::size_t(entry.y + row) * std::size_t(m_pageSize) + entry.x;
        std::memset(to, 0, entry.cell);
        if (row < picture.height)
            std::memcpy(to, picture.ink.data() + std::ptrdiff_t(row) * picture.width,
                        std::size_t(picture.width));
    }
    const bool isFirst = page.changedTop == page.changedEnd;
    page.changedTop = isFirst ? entry.y : std::min(page.changedTop, int(entry.y));
    page.changedEnd = isFirst ? entry.y + entry.cell : std::max(page.changedEnd, entry.y + entry.cell);
}

void GlyphAtlas::upload(bool isTryingAgain)
{
    for (Page& page : m_pages)
    {
        if (page.changedTop == page.changedEnd || (page.isRefused && !isTryingAgain))
            continue;
        page.isRefused = page.texture ? !updateTexture(page) : !makeTexture(page);
        if (!page.isRefused)
            page.changedTop = page.changedEnd = 0;
    }
}

/// @return false if GL refused it (logged).
bool GlyphAtlas::updateTexture(Page& page)
{
    if (page.texture->getId() == 0)
        return false;              // lost with its context
    RenderDevice::getError(false); // an older error must not be taken for one of these calls
    page.texture->enable();
    glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
    glTexSubImage2D(GL_TEXTURE_2D, 0, 0, page.changedTop, m_pageSize, page.changedEnd - page.changedTop,
                    GL_ALPHA, GL_UNSIGNED_BYTE,
                    page.ink.data() + std::ptrdiff_t(page.changedTop) * std::ptrdiff_t(m_pageSize));
    if (page.hasMipmaps)
        glGenerateMipmap(GL_TEXTURE_2D);
    const bool isTaken = RenderDevice::getError(false) == RenderDevice::ErrorCode::NO_ERROR;
    if (!isTaken)
        ORV_LOG_ERROR("GL refuses a texture for glyphs");
    return isTaken;
}

/// @return false if GL or memory refused it (logged).
bool GlyphAtlas::makeTexture(Page& page)
{
    const auto side = unsigned(m_pageSize);
    const SharedPtr<Texture2D> texture = m_textures->create(
        side, side, Texture::Format::ALPHA, Texture::Type::UNSIGNED_BYTE, page.ink.data(), nullptr);
    const SharedPtr<Appearance> appearance =
        texture ? makeInkAppearance(m_program, texture, page.look.colour) : SharedPtr<Appearance>();
    if (!appearance)
        return false;
    using Filter = TextureParameters::FilterMode;
    using Wrap = TextureParameters::WrapMode;
    texture->setParameters(TextureParameters(Filter::LINEAR, Filter::LINEAR, Wrap::CLAMP, Wrap::CLAMP));
    appearance->setDepthTestEnabled(false);
    appearance->addProperty<Matrix4f>("T_MODEL_VIEW_PROJECTION", 1);
    page.look.projection = SharedPtr<ShaderUniform<Matrix4f>>(static_cast<ShaderUniform<Matrix4f>*>(
        appearance->getPropertyUniform("T_MODEL_VIEW_PROJECTION").get()));
    if (!page.look.projection)
        return false;
    page.look.appearance = appearance;
    page.texture = texture;
    page.ownShares = texture->sharedGetCount() - 1; // without the local one
    return true;
}

SharedPtr<Texture2D> GlyphAtlas::takeTexture(unsigned number)
{
    Page& page = m_pages[number];
    if (page.texture && page.texture->getId() != 0 && !page.hasMipmaps)
    {
        // Makes the mipmaps again: they were made from older contents.
        page.texture->setMinFilter(TextureParameters::FilterMode::LINEAR_MIPMAP_LINEAR);
        glGenerateMipmap(GL_TEXTURE_2D);
        page.hasMipmaps = true;
    }
    return page.texture;
}

} // namespace orv::detail
