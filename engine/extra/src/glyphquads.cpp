#include "glyphquads.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/indexbuffercache.h"
#include "orv/log.h"
#include "orv/mesh.h"
#include "orv/meshcache.h"
#include "orv/solid.h"
#include "orv/vertexbuffercache.h"

#include <algorithm>
#include <cmath>
#include <iterator>

namespace orv::detail
{

namespace
{

constexpr unsigned FLOATS_PER_QUAD = 8; ///< of positions, and of texture coordinates

void fillIndices(unsigned short* index, unsigned quads)
{
    for (unsigned i = 0; i < quads; ++i)
    {
        for (const unsigned corner : {0u, 2u, 1u, 1u, 2u, 3u})
            *index++ = static_cast<unsigned short>(4 * i + corner);
    }
}

void addAttribs(VertexBuffer& vertices, const SharedPtr<VertexArray>& positions,
                const SharedPtr<VertexArray>& uvs, VertexBuffer::AttribUsage usage)
{
    vertices.addAttrib(positions, "a_position", VertexBuffer::AttribFormat::FLOAT, usage, false);
    vertices.addAttrib(uvs, "a_uv0", VertexBuffer::AttribFormat::FLOAT, usage, false);
}

} // namespace

GlyphQuads::GlyphQuads(unsigned count)
    : m_positions(makeShared<VertexArray>(int(4 * count), int(sizeof(float)), 2))
    , m_uvs(makeShared<VertexArray>(int(4 * count), int(sizeof(float)), 2))
{
    const auto indices =
        makeShared<IndexBuffer>(IndexBuffer::Primitive::TRIANGLES, int(6 * count), true, nullptr);
    const auto vertices = makeShared<VertexBuffer>(nullptr);
    const bool isMade = m_positions && m_positions->getSizeInBytes() != 0 && m_uvs &&
                        m_uvs->getSizeInBytes() != 0 && indices && indices->getIndices() && vertices;
    const auto mesh = isMade ? makeShared<Mesh>(MeshHeader(), indices, vertices) : SharedPtr<Mesh>();
    m_solid = mesh ? makeShared<Solid>(mesh, nullptr) : SharedPtr<Solid>();
    if (!m_solid)
    {
        ORV_LOG_ERROR("No memory for a text of %u glyphs", count);
        return;
    }
    fillIndices(indices->getIndices(), count);
    addAttribs(*vertices, m_positions, m_uvs, VertexBuffer::AttribUsage::CLIENT_MEMORY);
    m_room = count;
}

GlyphQuads::~GlyphQuads() = default;

void GlyphQuads::start(unsigned page, unsigned count)
{
    m_page = page;
    m_wanted = count;
    m_shown = std::max(m_shown, m_count);
    m_count = 0;
}

void GlyphQuads::add(const GlyphAtlas::Entry& entry, float pageSize, float x, float y, float width,
                     float height)
{
    const float u0 = float(entry.x) / pageSize, u1 = float(entry.x + entry.width) / pageSize;
    const float v0 = 1.0f - float(entry.y) / pageSize, v1 = 1.0f - float(entry.y + entry.height) / pageSize;
    const float corners[] = {x, y, x + width, y, x, y + height, x + width, y + height};
    const float places[] = {u0, v0, u1, v0, u0, v1, u1, v1};
    const std::size_t at = std::size_t(FLOATS_PER_QUAD) * m_count++;
    std::copy(std::begin(corners), std::end(corners), m_positions->getData<float>() + at);
    std::copy(std::begin(places), std::end(places), m_uvs->getData<float>() + at);
}

void GlyphQuads::end()
{
    if (m_shown > m_count)
        std::fill_n(m_positions->getData<float>() + std::size_t(FLOATS_PER_QUAD) * m_count,
                    std::size_t(FLOATS_PER_QUAD) * (m_shown - m_count), 0.0f);
    m_shown = m_count;
}

SharedPtr<Mesh> GlyphQuads::makeMesh(AssetCachePool& pool)
{
    const IndexBuffer::Ptr indices =
        pool.getIndexBufferCache()->create(IndexBuffer::Primitive::TRIANGLES, 6 * m_room, nullptr, nullptr);
    const VertexBuffer::Ptr vertices = pool.getVertexBufferCache()->create(nullptr);
    if (m_room == 0 || !indices || !indices->getIndices() || !vertices)
        return {};
    MeshHeader header;
    const float* at = m_positions->getData<float>();
    for (unsigned i = 0; i < 4 * m_count; ++i, at += 2)
        header.boundingRadius = std::max(header.boundingRadius, std::hypot(at[0], at[1]));
    fillIndices(indices->getIndices(), m_room);
    addAttribs(*vertices, m_positions, m_uvs, VertexBuffer::AttribUsage::GL_BUFFER);
    vertices->commit();
    indices->commit();
    return pool.getMeshCache()->create(header, indices, vertices, nullptr);
}

} // namespace orv::detail
