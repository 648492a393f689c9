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

constexpr unsigned VERTICES_PER_QUAD = 6; ///< two triangles
constexpr unsigned FLOATS_PER_VERTEX = 4; ///< position and texture coordinates
constexpr unsigned FLOATS_PER_QUAD = VERTICES_PER_QUAD * FLOATS_PER_VERTEX;

/// @return empty without memory (logged).
VertexBuffer::Ptr makeBuffer(VertexBufferCache& cache, const VertexArray& vertices)
{
    using Format = VertexBuffer::AttribFormat;
    const VertexBuffer::AttribDescription attributes[] = {{"a_position", Format::FLOAT, false, 0, 2, 16},
                                                          {"a_uv0", Format::FLOAT, false, 8, 2, 16}};
    const VertexBuffer::Ptr buffer = cache.create(nullptr);
    const bool isMade = buffer && buffer->setAllAttributes(attributes, 2, vertices.getBytes(),
                                                           unsigned(vertices.getSizeInBytes()));
    return isMade ? buffer : VertexBuffer::Ptr();
}

} // namespace

GlyphQuads::GlyphQuads(unsigned count)
    : m_vertices(
          makeShared<VertexArray>(int(VERTICES_PER_QUAD * count), int(sizeof(float)), int(FLOATS_PER_VERTEX)))
{
    if (!m_vertices || m_vertices->getSizeInBytes() == 0)
        ORV_LOG_ERROR("No memory for a text of %u glyphs", count);
    else
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
    const float right = x + width, lower = y + height;
    const float corners[] = {x,     y, u0, v0, x, lower, u0, v1, right, y,     u1, v0,
                             right, y, u1, v0, x, lower, u0, v1, right, lower, u1, v1};
    std::copy(std::begin(corners), std::end(corners),
              m_vertices->getData<float>() + std::size_t(FLOATS_PER_QUAD) * m_count++);
}

void GlyphQuads::end()
{
    if (m_shown > m_count)
        std::fill_n(m_vertices->getData<float>() + std::size_t(FLOATS_PER_QUAD) * m_count,
                    std::size_t(FLOATS_PER_QUAD) * (m_shown - m_count), 0.0f);
    m_shown = m_count;
}

bool GlyphQuads::send(VertexBufferCache& cache)
{
    if (m_solid && m_solid->getMesh()->getVertexBuffer()->replaceData(m_vertices->getBytes(),
                                                                      unsigned(m_vertices->getSizeInBytes())))
        return true;
    const auto order = makeShared<IndexBuffer>(IndexBuffer::Primitive::TRIANGLES,
                                               int(VERTICES_PER_QUAD * m_room), false, nullptr);
    const VertexBuffer::Ptr buffer = order ? makeBuffer(cache, *m_vertices) : VertexBuffer::Ptr();
    const auto mesh = buffer ? makeShared<Mesh>(MeshHeader(), order, buffer) : SharedPtr<Mesh>();
    m_solid = mesh ? makeShared<Solid>(mesh, nullptr) : SharedPtr<Solid>();
    return bool(m_solid);
}

SharedPtr<Mesh> GlyphQuads::makeMesh(AssetCachePool& pool)
{
    if (m_room == 0)
        return {};
    const IndexBuffer::Ptr order = create(*pool.getIndexBufferCache(), IndexBuffer::Primitive::TRIANGLES,
                                          VERTICES_PER_QUAD * m_room, nullptr);
    const VertexBuffer::Ptr buffer = makeBuffer(*pool.getVertexBufferCache(), *m_vertices);
    if (!order || !buffer)
        return {};
    MeshHeader header;
    const float* at = m_vertices->getData<float>();
    for (unsigned i = 0; i < VERTICES_PER_QUAD * m_count; ++i, at += FLOATS_PER_VERTEX)
        header.boundingRadius = std::max(header.boundingRadius, std::hypot(at[0], at[1]));
    return pool.getMeshCache()->create(header, order, buffer, nullptr);
}

} // namespace orv::detail
