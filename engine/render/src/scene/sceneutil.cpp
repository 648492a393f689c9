#include "orv/sceneutil.h"

#include "scenewalk.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/meshutil.h"
#include "orv/scenenode.h"
#include "orv/scenenodevisitor.h"
#include "orv/solid.h"

#include <cmath>

namespace orv
{

namespace
{

class AppearanceSetter : public SceneNodeVisitor
{
public:
    explicit AppearanceSetter(const SharedPtr<Appearance>& appearance) : m_appearance(appearance) {}

    using SceneNodeVisitor::visit;
    void visit(Solid* solid) override { solid->setAppearance(m_appearance); }

private:
    const SharedPtr<Appearance>& m_appearance;
};

class ShaderProgramSetter : public SceneNodeVisitor
{
public:
    explicit ShaderProgramSetter(const SharedPtr<ShaderProgram>& program) : m_program(program) {}

    using SceneNodeVisitor::visit;
    void visit(Solid* solid) override
    {
        if (solid->getAppearance())
            solid->getAppearance()->setShaderProgram(m_program);
    }

private:
    const SharedPtr<ShaderProgram>& m_program;
};

SharedPtr<Solid> makeSolid(AssetCachePool& pool, const SharedPtr<Mesh>& mesh)
{
    if (!mesh)
        return nullptr;
    return makeShared<Solid>(mesh, loadAppearance(pool, "orv#default_pvl.ap"));
}

/// @param m  a pure rotation.
Quaternionf toQuaternion(const Matrix3f& m)
{
    const Vector3f& x = m.columns[0];
    const Vector3f& y = m.columns[1];
    const Vector3f& z = m.columns[2];

    // Each of the four squares is 4 times a component squared; dividing by the largest loses nothing.
    const float squares[4] = {1.0f + x.x + y.y + z.z, 1.0f + x.x - y.y - z.z, 1.0f - x.x + y.y - z.z,
                              1.0f - x.x - y.y + z.z};
    int largest = 0;
    for (int i = 1; i < 4; ++i)
    {
        if (squares[i] > squares[largest])
            largest = i;
    }
    const float root = std::sqrt(squares[largest]);
    const float half = 0.5f / root;
    switch (largest)
    {
    case 0: return Quaternionf(0.5f * root, (y.z - z.y) * half, (z.x - x.z) * half, (x.y - y.x) * half);
    case 1: return Quaternionf((y.z - z.y) * half, 0.5f * root, (x.y + y.x) * half, (z.x + x.z) * half);
    case 2: return Quaternionf((z.x - x.z) * half, (x.y + y.x) * half, 0.5f * root, (y.z + z.y) * half);
    default: return Quaternionf((x.y - y.x) * half, (z.x + x.z) * half, (y.z + z.y) * half, 0.5f * root);
    }
}

} // namespace

void setFlags(SceneNode& node, const FlagMask& flags, bool state)
{
    const uint32_t stored = (state ? 0xFFFFFFFF : 0u) ^ flags.inverted;
    node.setFlags((node.getFlags() & ~flags.mask) | (stored & flags.mask));
}

bool getDerivedFlags(const SceneNode& node, const FlagMask& flags)
{
    uint32_t combined = 0;
    for (const SceneNode* ancestor = &node; ancestor; ancestor = ancestor->getParent())
        combined |= ancestor->getFlags();
    return ((combined ^ flags.inverted) & flags.mask) == flags.mask;
}

void visitScene(SceneNodeVisitor& visitor, SceneNode& node)
{
    const detail::SceneWalk walk(node);
    detail::visitAll(visitor, node);
}

void visitScene(SceneNodeVisitor& visitor, SceneNode& node, const FlagMask& renderFlags,
                const FlagMask& recursiveFlags)
{
    if (renderFlags.mask == 0)
    {
        visitScene(visitor, node);
        return;
    }
    const detail::SceneWalk walk(node);
    detail::visitRestricted(visitor, node, renderFlags, recursiveFlags);
}

void setAppearance(SceneNode& node, const SharedPtr<Appearance>& appearance)
{
    AppearanceSetter setter(appearance);
    node.accept(setter);
}

void setShaderProgram(SceneNode& node, const SharedPtr<ShaderProgram>& program)
{
    ShaderProgramSetter setter(program);
    node.accept(setter);
}

SharedPtr<Solid> createSquare(AssetCachePool& pool, const Vector2f& uvScale)
{
    return makeSolid(pool, createSquareMesh(*pool.getMeshCache(), uvScale));
}

SharedPtr<Solid> createCube(AssetCachePool& pool, const Vector2f& uvScale)
{
    return makeSolid(pool, createCubeMesh(*pool.getMeshCache(), uvScale));
}

SharedPtr<Solid> createSphere(AssetCachePool& pool, unsigned int segments, unsigned int wedges,
                              const Vector2f& uvScale)
{
    return makeSolid(pool, createSphereMesh(*pool.getMeshCache(), segments, wedges, uvScale));
}

void point(SceneNode& node, const Vector3f& target, const Vector3f& up)
{
    // Straight lines stay straight between a parent's space and the world, so it suffices to point at the target in the
    // parent's space, whatever the parents' scales.
    const SceneNode* parent = node.getParent();
    const Matrix4f toParent = parent ? inverse(parent->getWorldTransform()) : Matrix4f::IDENTITY;
    const Vector3f localTarget = (toParent * Vector4f(target, 1.0f)).xyz();
    const Vector3f localUp = (toParent * Vector4f(up, 0.0f)).xyz();
    if (target == node.getWorldTransform().columns[3].xyz() || toParent == Matrix4f())
        return;
    node.setRotation(toQuaternion(upper3x3(lookAt(node.getPosition(), localTarget, localUp))));
}

} // namespace orv
