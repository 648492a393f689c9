// Faults caught: classes of a program's own that link only when they are compiled without type information; parts of the
// static library that do not.
#include <orv/orv.h>

namespace
{

class NoSource : public orv::StreamSource
{
public:
    bool exists(const char*) const override { return false; }
    orv::SharedPtr<orv::Stream> open(const char*, bool) override { return {}; }
    const char* getName() const override { return "none"; }
};

class Counter : public orv::SceneNodeVisitor
{
public:
    void visit(orv::SceneNode*) override { ++count; }

    using SceneNodeVisitor::visit;
    int count = 0;
};

} // namespace

int countNodes(orv::AssetCachePool& pool, orv::SceneNode& scene, orv::Appearance& appearance)
{
    pool.registerSource(orv::makeShared<NoSource>());
    appearance.setProperty("M_OPACITY", 0.5f);
    Counter counter;
    orv::visitScene(counter, scene);
    return counter.count;
}

bool isInSight(orv::AssetCachePool& pool, orv::RenderContext& context, orv::Camera& camera,
               orv::SceneNode& scene)
{
    orv::DebugLines lines(pool);
    lines.addSkeleton(scene, orv::Colour4f::RED);
    lines.draw(context, camera);
    return !orv::getWorldBounds(scene).box.isEmpty() && !orv::pick(scene, orv::Ray()).empty();
}

orv::SharedPtr<orv::MeshGeometry> makeGeometry(const orv::Vector4f& joints, const orv::Vector4f& weights)
{
    const auto vertices = orv::makeShared<orv::MeshVertices>();
    vertices->places.push_back(orv::Vector3f());
    vertices->influences.push_back(orv::makeInfluence(joints, weights));
    return orv::makeShared<orv::MeshGeometry>(vertices, orv::IndexBuffer::Primitive::POINTS, nullptr, 0);
}
