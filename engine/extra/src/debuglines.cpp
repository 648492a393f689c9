#include "orv/debuglines.h"

#include "orv/detail/eyes.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/camera.h"
#include "orv/indexbuffer.h"
#include "orv/mesh.h"
#include "orv/rendercontext.h"
#include "orv/shaderprogramcache.h"
#include "orv/solid.h"
#include "orv/vertexbuffercache.h"

#include <algorithm>
#include <cstddef>

namespace orv
{

namespace
{

constexpr int MOST_CELLS = 1000;

Vector3f transformPoint(const Matrix4f& transform, float x, float y, float z)
{
    return (transform * Vector4f(x, y, z, 1.0f)).xyz();
}

uint8_t toByte(float component)
{
    return component > 0.0f ? uint8_t(std::min(component, 1.0f) * 255.0f + 0.5f) : uint8_t(0);
}

/// Which corners the edges of a box join; bit 0 of a corner is its side along x, bit 1 along y, bit 2 along z.
constexpr uint8_t EDGES[12][2] = {{0, 1}, {2, 3}, {4, 5}, {6, 7}, {0, 2}, {1, 3},
                                  {4, 6}, {5, 7}, {0, 4}, {1, 5}, {2, 6}, {3, 7}};

void addEdges(DebugLines& lines, const Vector3f (&corners)[8], const Colour4f& colour)
{
    for (const auto& edge : EDGES)
        lines.addLine(corners[edge[0]], corners[edge[1]], colour);
}

bool isJoint(const Solid& solid, const SceneNode* node)
{
    for (int i = 0; i < solid.getJointCount(); ++i)
    {
        if (solid.getJoint(i).joint.get() == node)
            return true;
    }
    return false;
}

} // namespace

DebugLines::DebugLines(AssetCachePool& pool) : m_cache(pool.getVertexBufferCache())
{
    const auto appearance = makeShared<Appearance>();
    m_solid = makeShared<Solid>(nullptr, appearance);
    if (!appearance || !m_solid)
        return;
    appearance->setShaderProgram(pool.getShaderProgramCache()->get("orv#lines.sp$TRANSFORM$VERTEX_COLOUR"));
    appearance->setBlendFactors(BlendFactor::SRC_ALPHA, BlendFactor::ONE, BlendFactor::ONE_MINUS_SRC_ALPHA,
                                BlendFactor::ONE_MINUS_SRC_ALPHA);
    appearance->setDepthWriteEnabled(false);
    appearance->setDepthTestFunction(DepthFunction::LEQUAL); // lines on a surface are seen
    appearance->addProperty<Matrix4f>("T_MODEL_VIEW_PROJECTION", 1);
    m_transform = SharedPtr<ShaderUniform<Matrix4f>>(static_cast<ShaderUniform<Matrix4f>*>(
        appearance->getPropertyUniform("T_MODEL_VIEW_PROJECTION").get()));
}

DebugLines::~DebugLines() = default;

void DebugLines::addLine(const Vector3f& from, const Vector3f& to, const Colour4f& colour)
{
    addLine(from, colour, to, colour);
}

void DebugLines::addLine(const Vector3f& from, const Colour4f& fromColour, const Vector3f& to,
                         const Colour4f& toColour)
{
    const auto add = [this](const Vector3f& place, const Colour4f& c) {
        m_vertices.push_back({place, {toByte(c.r), toByte(c.g), toByte(c.b), toByte(c.a)}});
    };
    add(from, fromColour);
    add(to, toColour);
    m_isCopied = false;
}

void DebugLines::addBox(const Vector3f& low, const Vector3f& high, const Matrix4f& transform,
                        const Colour4f& colour)
{
    Vector3f corners[8];
    for (int i = 0; i < 8; ++i)
        corners[i] =
            transformPoint(transform, i & 1 ? high.x : low.x, i & 2 ? high.y : low.y, i & 4 ? high.z : low.z);
    addEdges(*this, corners, colour);
}

void DebugLines::addAxes(const Matrix4f& transform, float length)
{
    const Vector3f origin = transform.columns[3].xyz();
    addLine(origin, transformPoint(transform, length, 0.0f, 0.0f), Colour4f::RED);
    addLine(origin, transformPoint(transform, 0.0f, length, 0.0f), Colour4f::GREEN);
    addLine(origin, transformPoint(transform, 0.0f, 0.0f, length), Colour4f::BLUE);
}

void DebugLines::addGrid(const Matrix4f& transform, int cells, float spacing, const Colour4f& colour)
{
    cells = std::min(cells, MOST_CELLS);
    const float half = float(cells) * spacing * 0.5f;
    for (int i = 0; i <= cells; ++i)
    {
        const float at = float(i) * spacing - half;
        addLine(transformPoint(transform, at, 0.0f, -half), transformPoint(transform, at, 0.0f, half),
                colour);
        addLine(transformPoint(transform, -half, 0.0f, at), transformPoint(transform, half, 0.0f, at),
                colour);
    }
}

void DebugLines::addSkeleton(const SceneNode& top, const Colour4f& colour)
{
    for (const SharedPtr<SceneNode>& child : top.getChildren())
    {
        addLine(top.getWorldTransform().columns[3].xyz(), child->getWorldTransform().columns[3].xyz(),
                colour);
        addSkeleton(*child, colour);
    }
}

void DebugLines::addJoints(const Solid& solid, const Colour4f& colour)
{
    for (int i = 0; i < solid.getJointCount(); ++i)
    {
        const SharedPtr<SceneNode> joint = solid.getJoint(i).joint;
        const SceneNode* above = joint ? joint->getParent() : nullptr;
        while (above && !isJoint(solid, above))
            above = above->getParent();
        if (above)
            addLine(above->getWorldTransform().columns[3].xyz(), joint->getWorldTransform().columns[3].xyz(),
                    colour);
    }
}

void DebugLines::addFrustum(Camera& camera, float aspect, const Colour4f& colour)
{
    Matrix4f projection;
    camera.getProjection(&projection, aspect);
    const bool isPerspective = camera.getProjectionType() == Camera::ProjectionType::PERSPECTIVE;
    Vector3f corners[8];
    for (int i = 0; i < 8; ++i)
    {
        const float depth = i & 4 ? camera.getFar() : camera.getNear();
        const float reach = isPerspective ? depth : 1.0f;
        corners[i] =
            transformPoint(camera.getWorldTransform(), (i & 1 ? reach : -reach) / projection.columns[0].x,
                           (i & 2 ? reach : -reach) / projection.columns[1].y, -depth);
    }
    addEdges(*this, corners, colour);
}

void DebugLines::clear()
{
    m_isCopied = m_isCopied && m_vertices.empty();
    m_vertices.clear();
}

void DebugLines::setDepthTested(bool tested)
{
    if (m_solid && m_solid->getAppearance())
        m_solid->getAppearance()->setDepthTestEnabled(tested);
}

void DebugLines::draw(RenderContext& context, Camera& camera)
{
    if (m_vertices.empty() || !m_transform || !copyVertices())
        return;
    const detail::Viewport viewport = detail::getViewport(context);
    detail::Eye eyes[2];
    const int count = detail::findEyes(&camera, detail::getAspect(viewport), eyes);
    const RenderContext::DrawScope scope(context);
    for (int i = 0; i < count; ++i)
    {
        if (count > 1)
            detail::setViewport(context, detail::getHalf(viewport, i));
        m_transform->set(eyes[i].projection * inverse(eyes[i].world));
        m_solid->draw(context);
    }
    if (count > 1)
        detail::setViewport(context, viewport);
}

/// @return false if GL has no memory (logged).
bool DebugLines::copyVertices()
{
    if (m_isCopied)
        return true;
    const auto* data = reinterpret_cast<const unsigned char*>(m_vertices.data());
    const auto size = unsigned(m_vertices.size() * sizeof(Vertex));
    const bool isKept = m_buffer && m_buffer->replaceData(data, size);
    if (!isKept && !makeBuffer(data, size))
        return false;
    if (!isKept || m_solid->getMesh()->getIndexBuffer()->getCount() != int(m_vertices.size()))
        setMesh();
    m_isCopied = bool(m_buffer);
    return m_isCopied;
}

void DebugLines::setMesh()
{
    const auto order =
        makeShared<IndexBuffer>(IndexBuffer::Primitive::LINES, int(m_vertices.size()), false, nullptr);
    m_solid->setMesh(order ? makeShared<Mesh>(MeshHeader(), order, m_buffer) : nullptr);
    if (!m_solid->getMesh())
        m_buffer = nullptr; // no memory (logged)
}

bool DebugLines::makeBuffer(const unsigned char* data, unsigned size)
{
    using Format = VertexBuffer::AttribFormat;
    const VertexBuffer::AttribDescription attributes[] = {
        {"a_position", Format::FLOAT, false, int(offsetof(Vertex, place)), 3, int(sizeof(Vertex))},
        {"a_colour", Format::UNSIGNED_BYTE, true, int(offsetof(Vertex, colour)), 4, int(sizeof(Vertex))}};
    m_buffer = m_cache->create(nullptr);
    if (m_buffer && m_buffer->setAllAttributes(attributes, 2, data, size))
        return true;
    m_buffer = nullptr;
    return false;
}

} // namespace orv
