// The part of Culling that runs for each solid; the rest of the class is in culling.cpp.

#include "culling.h"

#include "orv/mesh.h"
#include "orv/solid.h"

namespace orv::detail
{

namespace
{

/// A quick test that finds most of the visible solids.
[[gnu::always_inline]] inline bool isSeen(const Frustum& frustum, const Solid& solid)
{
    const Mesh* const mesh = solid.getMesh().get();
    if (!mesh || solid.hasSkin() || !mesh->isAroundOrigin()) [[unlikely]]
        return false;
    const float distance = mesh->getSafeDistance() * solid.getKnownStretch();
    return frustum.contains(solid.peekWorldTransform().columns[3], distance);
}

/// The same for meshes whose sphere is not centred on the origin.
bool isSphereSeen(const Frustum& frustum, const Solid& solid)
{
    const Mesh* const mesh = solid.getMesh().get();
    if (!mesh || solid.hasSkin() || mesh->isAroundOrigin())
        return false;
    const Vector4f& sphere = mesh->getSphere();
    return frustum.contains(solid.peekWorldTransform(), sphere.xyz(), sphere.w * solid.getKnownStretch());
}

/// For solids that the quick test does not find.
[[gnu::noinline]] bool isHidden(const Frustum& frustum, const Solid& solid)
{
    return !isSphereSeen(frustum, solid) && hides(frustum, solid);
}

} // namespace

void Culling::visit(Solid* solid)
{
    if (isSeen(m_frustums[0], *solid)) [[likely]]
        return m_renderer.visit(solid);
    visitDoubtful(solid);
}

[[gnu::noinline]] void Culling::visitDoubtful(Solid* solid)
{
    if (isHidden(m_frustums[0], *solid) && (m_eyeCount == 1 || isHidden(m_frustums[1], *solid)))
        m_count += uint32_t(m_eyeCount);
    else
        m_renderer.visit(solid);
}

Solid* const* Culling::select(Solid* const* solids, size_t& count, const Matrix4f& view,
                              const Matrix4f& projection)
{
    if (m_eyeCount == 1 && !m_hasMirrors)
        return solids; // the walk has culled already
    const Frustum frustum(view, projection);
    m_selected.clear();
    for (Solid* const* next = solids; next != solids + count; ++next)
    {
        if (isSeen(frustum, **next) || !isHidden(frustum, **next))
            m_selected.add(*next);
    }
    m_count += uint32_t(count - m_selected.size());
    count = m_selected.size();
    return m_selected.begin();
}

} // namespace orv::detail
