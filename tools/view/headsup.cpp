#include "headsup.h"

#include "orv/fontcache.h"

#include <algorithm>
#include <filesystem>

namespace view
{

using orv::makeShared;

namespace
{

const orv::Colour4f INK(1.0f, 1.0f, 1.0f, 1.0f);
const orv::Colour4f SHADOW(0.0f, 0.0f, 0.0f, 0.8f);
const orv::Colour4f PANEL(0.13f, 0.15f, 0.18f, 1.0f);
constexpr float GAP = 0.6f; // of a line's height

} // namespace

std::unique_ptr<HeadsUp> HeadsUp::create(const orv::RenderContext::Ptr& context, const std::string& font,
                                         unsigned size)
{
    const std::filesystem::path path(font);
    std::unique_ptr<HeadsUp> made(new HeadsUp);
    made->m_context = context;
    made->m_panel.setColour(PANEL);
    made->m_pool = makeShared<orv::AssetCachePool>();
    orv::registerSource(*made->m_pool, path.has_parent_path() ? path.parent_path().c_str() : ".", false);
    made->m_font = orv::get(*made->m_pool->getFontCache(), path.filename().c_str(), size);
    if (!made->m_font)
        return nullptr;
    made->m_ink = makeShared<orv::Text>(*made->m_pool, made->m_font, INK);
    made->m_shadow = makeShared<orv::Text>(*made->m_pool, made->m_font, SHADOW);
    return made;
}

HeadsUp::~HeadsUp()
{
    m_ink.reset();
    m_shadow.reset();
    m_font.reset();
    m_pool->flush();
    m_pool->flush();
}

bool HeadsUp::setLines(const std::string& lines)
{
    const bool isOther = lines != m_lines;
    m_lines = lines;
    m_changed = m_changed || isOther;
    return isOther;
}

bool HeadsUp::setMessage(const std::string& message)
{
    const bool isOther = message != m_message;
    m_message = message;
    m_changed = m_changed || isOther;
    return isOther;
}

void HeadsUp::setTable(const std::vector<Row>& rows)
{
    m_changed = true;
    m_rows = rows;
}

int HeadsUp::countRows(int height) const
{
    const float line = orv::Text::getLineHeight(*m_font);
    return std::max(int((float(height) - 2.0f * line * GAP) / line), 1);
}

void HeadsUp::write(const char* text, float x, float y)
{
    for (const float side : {-1.0f, 1.0f})
    {
        m_shadow->add(text, x + side, y - 1.0f);
        m_shadow->add(text, x + side, y + 1.0f);
    }
    m_ink->add(text, x, y);
}

void HeadsUp::layOut()
{
    const float line = orv::Text::getLineHeight(*m_font);
    const float gap = line * GAP;
    m_ink->clear();
    m_shadow->clear();
    if (m_rows.empty())
    {
        write(m_lines.c_str(), gap, gap);
        const float height = orv::Text::measure(*m_font, m_message.c_str()).y;
        write(m_message.c_str(), gap, float(m_height) - height - gap);
    }

    float column = 0.0f;
    for (const Row& row : m_rows)
        column = std::max(column, orv::Text::measure(*m_font, row.left.c_str()).x);
    float y = gap;
    for (const Row& row : m_rows)
    {
        write(row.left.c_str(), gap, y);
        write(row.right.c_str(), 3.0f * gap + column, y);
        y += line;
    }
    m_changed = false;
}

void HeadsUp::draw(int width, int height)
{
    m_changed = m_changed || width != m_width || height != m_height;
    m_width = width;
    m_height = height;
    m_context->setViewport(0, 0, width, height);
    if (m_changed)
        layOut();
    const orv::RenderContext::DrawScope scope(*m_context);
    if (!m_rows.empty())
        m_panel.enable(*m_context); // a background, so that the table is readable
    m_shadow->draw(*m_context);
    m_ink->draw(*m_context);
}

} // namespace view
