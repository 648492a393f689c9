#include "orv/text.h"

#include "orv/detail/utf8.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/indexbuffer.h"
#include "orv/log.h"
#include "orv/mesh.h"
#include "orv/rendercontext.h"
#include "orv/shaderprogramcache.h"
#include "orv/solid.h"
#include "orv/texture2d.h"
#include "orv/vertexbuffercache.h"

#include <algorithm>
#include <cmath>
#include <iterator>
#include <string_view>

namespace orv
{

namespace
{

float getLineWidth(const Font& font, std::string_view line)
{
    float width = 0.0f;
    while (!line.empty())
    {
        const int c = detail::readCodePoint(line);
        width += detail::isControl(c) ? 0.0f : font.getCharacterData(c).xadvance;
    }
    return width;
}

void applyColour(Appearance& appearance, const Colour4f& colour)
{
    appearance.setProperty("M_DIFFUSE_COLOUR", Vector4f(colour.r, colour.g, colour.b, 1.0f));
    appearance.setProperty("M_OPACITY", colour.a);
}

} // namespace

Text::Text(AssetCachePool& pool, const Font::Ptr& font, const Colour4f& colour)
    : m_font(font)
    , m_colour(colour)
    , m_program(pool.getShaderProgramCache()->get("luvane#textfadequad.sp"))
    , m_cache(pool.getVertexBufferCache())
{
    if (!font || !font->getTexture())
    {
        ORV_LOG_ERROR("A text has no font and will not be seen");
        m_font = nullptr;
        return;
    }
    m_overlay = makeAppearance();
    if (m_overlay)
    {
        m_overlay->setDepthTestEnabled(false);
        m_overlay->addProperty<Matrix4f>("T_MODEL_VIEW_PROJECTION", 1);
        m_projection = SharedPtr<ShaderUniform<Matrix4f>>(static_cast<ShaderUniform<Matrix4f>*>(
            m_overlay->getPropertyUniform("T_MODEL_VIEW_PROJECTION").get()));
    }
    if (!m_projection)
        m_font = nullptr; // no memory (logged)
}

Text::~Text() = default;

float Text::getLineHeight(const Font& font)
{
    return std::round(font.getAscent() + font.getDescent() + font.getLineGap());
}

Vector2f Text::measure(const Font& font, const char* utf8)
{
    if (!utf8 || !*utf8)
        return {};
    Vector2f size(0.0f, std::ceil(font.getAscent()) + std::ceil(font.getDescent()) - getLineHeight(font));
    detail::forEachLine(utf8,
                        [&](std::string_view line)
                        {
                            size.x = std::max(size.x, getLineWidth(font, line));
                            size.y += getLineHeight(font);
                        });
    return size;
}

void Text::add(const char* utf8, float x, float y, Alignment alignment)
{
    if (!m_font || !utf8)
        return;
    float top = std::round(y);
    detail::forEachLine(utf8,
                        [&](std::string_view line)
                        {
                            addLine(line, x, top, alignment);
                            top += getLineHeight(*m_font);
                        });
}

void Text::addLine(std::string_view line, float x, float top, Alignment alignment)
{
    if (alignment == Alignment::CENTRE)
        x -= getLineWidth(*m_font, line) * 0.5f;
    else if (alignment == Alignment::RIGHT)
        x -= getLineWidth(*m_font, line);
    const float baseline = top + std::ceil(m_font->getAscent());
    while (!line.empty())
    {
        const int c = detail::readCodePoint(line);
        if (detail::isControl(c))
            continue;
        const Font::CharacterData& data = m_font->getCharacterData(c);
        if (data.x1 > data.x0 && data.y1 > data.y0)
            m_glyphs.push_back({std::floor(x + data.xoff + 0.5f), baseline + data.yoff, &data});
        x += data.xadvance;
    }
    m_changed = true;
}

void Text::clear()
{
    m_changed = m_changed || !m_glyphs.empty();
    m_glyphs.clear();
}

void Text::setColour(const Colour4f& colour)
{
    m_colour = colour;
    if (m_overlay)
        applyColour(*m_overlay, colour);
}

void Text::draw(RenderContext& context)
{
    const auto width = float(context.getViewportWidth());
    const auto height = float(context.getViewportHeight());
    if (!m_font || width <= 0.0f || height <= 0.0f)
        return;
    if (m_changed)
        m_solid = makeSolid(m_overlay, 1.0f, *m_cache, m_buffer);
    m_changed = false;
    if (!m_solid)
        return;
    Matrix4f projection = Matrix4f::IDENTITY;
    projection[0].x = 2.0f / width;
    projection[1].y = -2.0f / height;
    projection[3] = Vector4f(-1.0f, 1.0f, 0.0f, 1.0f);
    m_projection->set(projection);
    const RenderContext::DrawScope scope(context);
    m_solid->draw(context);
}

SharedPtr<Solid> Text::createSolid(AssetCachePool& pool) const
{
    if (m_glyphs.empty())
    {
        ORV_LOG_ERROR("A text without glyphs makes no solid");
        return {};
    }
    // Trilinear filtering looks smoothest from afar.
    if (m_font->getTexture()->hasMipmaps())
        m_font->getTexture()->setMinFilter(TextureParameters::FilterMode::LINEAR_MIPMAP_LINEAR);
    const SharedPtr<Appearance> appearance = makeAppearance();
    if (!appearance)
        return {};
    SharedPtr<VertexBuffer> buffer;
    return makeSolid(appearance, -1.0f, *pool.getVertexBufferCache(), buffer);
}

/// Blending raises the target's alpha towards 1, so that its picture can be composited over another one.
SharedPtr<Appearance> Text::makeAppearance() const
{
    const auto appearance = makeShared<Appearance>();
    if (!appearance)
        return {};
    appearance->setShaderProgram(m_program);
    appearance->setBlendFactors(BlendFactor::SRC_ALPHA, BlendFactor::ONE, BlendFactor::ONE_MINUS_SRC_ALPHA,
                                BlendFactor::ONE_MINUS_SRC_ALPHA);
    appearance->setCullingMode(CullingMode::CULL_NONE);
    appearance->setDepthWriteEnabled(false);
    appearance->setProperty("M_DIFFUSE_TEXTURE", m_font->getTexture());
    appearance->setProperty("M_UV_OFFSET_SCALE", Vector4f(0.0f, 0.0f, 1.0f, 1.0f));
    appearance->setProperty("M_FADE", Vector2f(0.0f, 0.0f));
    applyColour(*appearance, m_colour);
    return appearance;
}

/// Two triangles for each glyph: six vertices of position and texture coordinates.
/// @param ySign   1 for y downwards, -1 for y upwards.
/// @param buffer  filled again; made if it is empty or lost.
/// @return empty without glyphs or, after an error, without memory.
SharedPtr<Solid> Text::makeSolid(const SharedPtr<Appearance>& appearance, float ySign,
                                 VertexBufferCache& cache, SharedPtr<VertexBuffer>& buffer) const
{
    if (m_glyphs.empty())
        return {};
    const int count = 6 * int(m_glyphs.size());
    const auto vertices = makeShared<VertexArray>(count, int(sizeof(float)), 4);
    if (!vertices || vertices->getSizeInBytes() == 0)
    {
        ORV_LOG_ERROR("No memory for a text of %u glyphs", unsigned(m_glyphs.size()));
        return {};
    }
    const auto atlasWidth = float(m_font->getTexture()->getWidth());
    const auto atlasHeight = float(m_font->getTexture()->getHeight());
    MeshHeader header;
    auto* out = vertices->getData<float>();
    for (const auto& [x, y, data] : m_glyphs)
    {
        const float left = x, right = x + data->x1 - data->x0;
        const float upper = ySign * y, lower = ySign * (y + data->y1 - data->y0);
        const float u0 = data->x0 / atlasWidth, u1 = data->x1 / atlasWidth;
        const float v0 = 1.0f - data->y0 / atlasHeight, v1 = 1.0f - data->y1 / atlasHeight;
        const float corners[] = {left,  upper, u0, v0, left, lower, u0, v1, right, upper, u1, v0,
                                 right, upper, u1, v0, left, lower, u0, v1, right, lower, u1, v1};
        out = std::copy(std::begin(corners), std::end(corners), out);
        if (ySign < 0.0f) // what draw() draws is never culled
            header.boundingRadius =
                std::max(header.boundingRadius, std::hypot(std::max(std::abs(left), std::abs(right)),
                                                           std::max(std::abs(upper), std::abs(lower))));
    }

    using Format = VertexBuffer::AttribFormat;
    if (!buffer || !buffer->replaceData(vertices->getBytes(), vertices->getSizeInBytes()))
    {
        const VertexBuffer::AttribDescription attributes[] = {{"a_position", Format::FLOAT, false, 0, 2, 16},
                                                              {"a_uv0", Format::FLOAT, false, 8, 2, 16}};
        buffer = cache.create(nullptr);
        if (!buffer ||
            !buffer->setAllAttributes(attributes, 2, vertices->getBytes(), vertices->getSizeInBytes()))
            return {};
    }
    const auto order = makeShared<IndexBuffer>(IndexBuffer::Primitive::TRIANGLES, count, false, nullptr);
    const auto mesh = makeShared<Mesh>(header, order, buffer);
    return mesh ? makeShared<Solid>(mesh, appearance) : SharedPtr<Solid>();
}

} // namespace orv
