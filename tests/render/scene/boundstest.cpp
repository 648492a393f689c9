#include "glotest.h"

#include "orv/animationbounds.h"
#include "orv/animationgroup.h"
#include "orv/appearance.h"
#include "orv/mesh.h"
#include "orv/meshgeometry.h"
#include "orv/meshrays.h"
#include "orv/picking.h"
#include "orv/ray.h"
#include "orv/scenebounds.h"
#include "orv/sceneutil.h"
#include "orv/solid.h"

#include <cmath>
#include <cstdlib>
#include <limits>
#include <random>

using namespace orv;

namespace
{

float getVolume(const Box& box)
{
    const Vector3f size = box.highest - box.lowest;
    return size.x * size.y * size.z;
}

void expectNear(const Vector3f& expected, const Vector3f& actual, const char* what)
{
    EXPECT_LT(length(expected - actual), 1e-4f) << what << toString(expected) << toString(actual);
}

} // namespace

class BoundsTest : public GloTest
{
protected:
    float number(float from, float to) { return std::uniform_real_distribution<float>(from, to)(random); }
    Vector3f vector(float reach)
    {
        return Vector3f(number(-reach, reach), number(-reach, reach), number(-reach, reach));
    }
    Quaternionf rotation()
    {
        return quaternionFromAxisAngle(normalize(vector(1.0f)), Anglef::fromRadians(number(-3.0f, 3.0f)));
    }

    Glo::Ptr load(const glo::GloScene& scene, MeshData data)
    {
        m_source->set("test.glo", write(scene));
        return loadGloFile(*m_pool, m_root, "test.glo", data);
    }

    /// An arm of two joints that bends: the vertices along it follow both by shares.
    glo::GloScene makeArm()
    {
        glo::GloScene scene;
        glo::Geometry& geometry = scene.geometries.emplace_back();
        geometry.name = "arm";
        std::vector<float> joints, weights;
        for (int i = 0; i < 200; ++i)
        {
            const float along = number(0.0f, 4.0f);
            const float share = std::min(std::max(along - 1.5f, 0.0f), 1.0f);
            armPlaces.push_back(Vector3f(along, number(-0.3f, 0.3f), number(-0.2f, 0.2f)));
            armShares.push_back(share);
            joints.insert(joints.end(), {0, 1, 0, 0});
            weights.insert(weights.end(), {1.0f - share, share, 0, 0});
        }
        std::vector<float> places;
        for (const Vector3f& place : armPlaces)
            places.insert(places.end(), {place.x, place.y, place.z});
        geometry.vertices = glo::makeVertexSet(
            {{"a_position", 3, places}, {"a_joints", 4, joints}, {"a_weights", 4, weights}});
        geometry.primitiveSets.push_back({glo::primitive::TRIANGLE_STRIP, {}});
        glo::Skin& skin = scene.skins.emplace_back();
        skin.name = "skin";
        skin.geometry = "arm";
        skin.attachments = {{"shoulder", Matrix4f::IDENTITY},
                            {"elbow", translationMatrix(Vector3f(-2, 0, 0))}};
        glo::NodeData elbow = makeNode("elbow");
        moveTo(elbow, Vector3f(2, 0, 0));
        scene.scene = glo::SceneData{"scene", makeNode("top", {makeNode("figure", &glo::NodeData::skin,
                                                                        glo::SkinReference{"skin", {}, {}}),
                                                               makeNode("shoulder", {elbow})})};
        glo::AnimationData& clip = scene.animations.emplace_back();
        clip.name = "bend";
        for (const char* joint : {"shoulder", "elbow"})
        {
            glo::Channel turn = makeChannel("node", joint, "rotation", {0, 0, 1, 0}, 0.0f);
            for (int key = 1; key < 20; ++key)
                glo::addKey(turn, float(key) * (joint[0] == 's' ? 0.1f : 0.07f),
                            {0, 0, 1, number(-2.0f, 2.0f)});
            clip.channels.push_back(turn);
        }
        return scene;
    }

    /// Of the arm at the moment, from nothing but the joints' places.
    void addArm(SceneNode& top, Box& box) const
    {
        const Matrix4f shoulder = top.find("shoulder")->getWorldTransform();
        const Matrix4f elbow = top.find("elbow")->getWorldTransform() * translationMatrix(Vector3f(-2, 0, 0));
        for (size_t i = 0; i < armPlaces.size(); ++i)
        {
            const Vector4f place(armPlaces[i], 1.0f);
            box.add(((shoulder * place) * (1.0f - armShares[i]) + (elbow * place) * armShares[i]).xyz());
        }
    }

    std::mt19937 random{1};
    std::vector<Vector3f> armPlaces;
    std::vector<float> armShares; ///< of the elbow
};

// Faults caught: boxes of vertices that are not drawn, of another space, or that leave a solid out.
TEST_F(BoundsTest, subtreesReachAsFarAsWhatIsInThem)
{
    glo::GloScene file;
    file.geometries = {makeSquareGeometry("square")};
    file.geometries[0].vertices = glo::makeVertexSet(
        {{"a_position", 3, {-0.5f, -0.5f, 0, 0.5f, -0.5f, 0, 0.5f, 0.5f, 0, -0.5f, 0.5f, 0, 99, 99, 99}}});
    glo::NodeData near = makeSolidNode("near", "square", "");
    moveTo(near, Vector3f(10, 0, 0));
    file.scene = glo::SceneData{"scene", makeNode("top", {near})};
    const Glo::Ptr glo = load(file, MeshData::BOUNDS);
    ASSERT_TRUE(glo);
    SceneNode& top = *glo->getTopNode();
    int unknown = -1;
    Bounds bounds = getWorldBounds(top, &unknown);
    EXPECT_EQ(0, unknown);
    expectNear(Vector3f(9.5f, -0.5f, 0), bounds.box.lowest, "lowest");
    expectNear(Vector3f(10.5f, 0.5f, 0), bounds.box.highest, "highest");
    EXPECT_NEAR(std::sqrt(0.5f), bounds.radius, 1e-5f);

    const auto cube = createCube(*m_pool, Vector2f(1, 1));
    cube->setParent(glo->getTopNode());
    cube->setScale(Vector3f(1, 2, 1));
    EXPECT_EQ(Vector3f(1, 1, 1), getOwnBounds(*cube).box.highest);
    EXPECT_NEAR(std::sqrt(3.0f), getOwnBounds(*cube).radius, 1e-5f);
    top.setPosition(Vector3f(0, 0, 100));
    bounds = getWorldBounds(top, &unknown);
    expectNear(Vector3f(-1, -2, 99), bounds.box.lowest, "lowest");
    expectNear(Vector3f(10.5f, 2, 101), bounds.box.highest, "highest");

    const auto damaged = makeShared<MeshVertices>();
    damaged->places = {{1, 1, 1}, {NAN, 500, 0}, {INFINITY, 0, 0}, {1, 1.5f, 1}};
    const auto broken = makeShared<Solid>(makeShared<Mesh>(MeshHeader(), nullptr, nullptr), nullptr);
    broken->getMesh()->setGeometry(
        makeShared<MeshGeometry>(damaged, IndexBuffer::Primitive::POINTS, nullptr, 0));
    broken->setParent(glo->getTopNode());
    EXPECT_EQ(bounds.box.highest, getWorldBounds(top, &unknown).box.highest);
    EXPECT_NEAR(0.25f, getWorldBounds(*broken).radius, 1e-6f);

    const auto strange = makeShared<Solid>(makeShared<Mesh>(MeshHeader(), nullptr, nullptr), nullptr);
    strange->setParent(glo->getTopNode());
    EXPECT_FALSE(getOwnBounds(*strange).isKnown());
    EXPECT_EQ(bounds.radius, getWorldBounds(top, &unknown).radius);
    EXPECT_EQ(1, unknown);
    EXPECT_FALSE(getWorldBounds(*makeShared<SceneNode>()).isKnown());
}

// Faults caught: keys that are passed over, joints without their shares; boxes that are much wider than what is in them.
TEST_F(BoundsTest, clipsReachAsFarAsTheirKeys)
{
    const glo::GloScene file = makeArm();
    const Glo::Ptr glo = load(file, MeshData::GEOMETRY);
    ASSERT_TRUE(glo);
    SceneNode& top = *glo->getTopNode();
    top.setRotation(rotation());
    AnimationGroup& clip = *glo->getAnimationGroup();
    const Bounds bounds = getWorldBounds(top, clip, 1);

    Box expected;
    for (int i = 0; i <= 2000; ++i)
    {
        clip.apply(float(i) * 0.001f);
        addArm(top, expected);
        Box moment;
        addArm(top, moment);
        const Bounds now = getWorldBounds(top);
        expectNear(moment.lowest, now.box.lowest, "lowest");
        expectNear(moment.highest, now.box.highest, "highest");
    }
    expectNear(expected.lowest, bounds.box.lowest, "lowest of all");
    expectNear(expected.highest, bounds.box.highest, "highest of all");
    EXPECT_LE(bounds.radius, length(expected.highest - expected.lowest) * 0.5f + 1e-4f);

    // From the joints' boxes alone it is wider, and never narrower.
    Solid& figure = static_cast<Solid&>(*top.find("figure"));
    figure.getMesh()->setGeometry(nullptr);
    const Bounds wide = getWorldBounds(top, clip, 1);
    EXPECT_LE(getVolume(bounds.box), getVolume(wide.box));
    Box both = wide.box;
    both.add(bounds.box);
    expectNear(wide.box.lowest, both.lowest, "lowest of boxes");
    expectNear(wide.box.highest, both.highest, "highest of boxes");
    EXPECT_LT(getVolume(wide.box), 1.5f * getVolume(bounds.box));
}

// Faults caught: tree nodes that lose triangles, boxes that a ray misses, the wrong one of two hits; compared with a
// test of every triangle.
TEST_F(BoundsTest, raysFindTheNearestTriangle)
{
    const auto vertices = makeShared<MeshVertices>();
    std::vector<unsigned short> indices;
    for (int i = 0; i < 2000; ++i)
    {
        const Vector3f centre = vector(10.0f);
        for (int corner = 0; corner < 3; ++corner)
        {
            indices.push_back(uint16_t(vertices->places.size()));
            vertices->places.push_back(centre + vector(i % 7 ? 0.7f : 0.0f));
        }
        if (i % 10 == 0) // the same once more, which comes second
            indices.insert(indices.end(), indices.end() - 3, indices.end());
    }
    vertices->places[5].x = std::numeric_limits<float>::quiet_NaN();
    vertices->places[50].y = std::numeric_limits<float>::infinity();
    const MeshGeometry geometry(vertices, IndexBuffer::Primitive::TRIANGLES, indices.data(), indices.size());
    EXPECT_EQ(indices.size(), geometry.getTriangles().size());
    const int count = std::getenv("ORV_SWEEP_ALL") ? 1000000 : 4000;
    int metCount = 0;
    for (int i = 0; i < count; ++i)
    {
        Ray ray = {vector(15.0f), vector(1.0f)};
        if (i % 5 == 0)
            (i % 2 ? ray.direction.x : ray.direction.z) = 0.0f;
        if (i % 11 == 0)
            ray.position.x = vertices->places[size_t(i) % vertices->places.size()].x;
        const TriangleSides sides = TriangleSides(i % 4);
        MeshHit found, expected;
        found.distance = expected.distance = i % 3 ? std::numeric_limits<float>::max() : 10.0f;
        const bool isMet = meet(geometry, ray, sides, vertices->places, expected);
        EXPECT_EQ(isMet, meet(geometry, ray, sides, found)) << i;
        EXPECT_EQ(expected.distance, found.distance) << i;
        EXPECT_EQ(expected.triangle, found.triangle) << i;
        metCount += isMet;
    }
    EXPECT_LT(count / 20, metCount);
}

// Faults caught: sides that are not drawn, of mirrored solids too; hits in another space, order or pose; what is hidden.
TEST_F(BoundsTest, picksWhatIsDrawn)
{
    glo::GloScene file;
    file.geometries = {makeSquareGeometry("square")};
    file.scene = glo::SceneData{"scene", makeNode("top", {makeSolidNode("first", "square", ""),
                                                          makeSolidNode("second", "square", "")})};
    const Glo::Ptr glo = load(file, MeshData::GEOMETRY);
    ASSERT_TRUE(glo);
    SceneNode& top = *glo->getTopNode();
    Solid& first = static_cast<Solid&>(*top.find("first"));
    Solid& second = static_cast<Solid&>(*top.find("second"));
    second.setAppearance(makeShared<Appearance>());
    second.getAppearance()->setShaderProgram(first.getAppearance()->getShaderProgram());
    first.setPosition(Vector3f(0, 0, -4));
    first.setScale(Vector3f(3, 3, 3));
    second.setPosition(Vector3f(0, 0, -8));
    second.setScale(Vector3f(3, 3, 3));
    const Ray ray = {Vector3f(1.0f, -1.2f, 1.0f), Vector3f(0, 0, -2.0f)};
    const Ray back = {Vector3f(1.0f, -1.2f, -20.0f), Vector3f(0, 0, 1.0f)};

    std::vector<PickHit> hits = pick(top, ray);
    ASSERT_EQ(2u, hits.size());
    EXPECT_EQ(&first, hits[0].solid.get());
    EXPECT_EQ(&second, hits[1].solid.get());
    EXPECT_EQ(0u, hits[0].triangle);
    EXPECT_NEAR(5.0f, hits[0].distance, 1e-5f);
    expectNear(Vector3f(1.0f, -1.2f, -4.0f), hits[0].point, "point");
    EXPECT_TRUE(pick(top, back).empty());

    first.setScale(Vector3f(-3, 3, 3)); // mirrored, and drawn from the same side
    hits = pick(top, ray);
    ASSERT_EQ(2u, hits.size());
    EXPECT_TRUE(pick(top, back).empty());
    second.setScale(Vector3f(3, 3, 0)); // flat; both of its sides are drawn
    second.getAppearance()->setCullingMode(CullingMode::CULL_NONE);
    EXPECT_EQ(2u, pick(top, ray).size());
    EXPECT_EQ(1u, pick(top, back).size());
    second.setVisible(false);
    EXPECT_EQ(2u, pick(top, ray).size());
    EXPECT_EQ(1u, pick(top, ray, SceneNode::VISIBLE).size());
    first.getMesh()->getIndexBuffer()->setEnabled(false);
    EXPECT_TRUE(pick(top, ray, SceneNode::VISIBLE).empty());
    first.getMesh()->getIndexBuffer()->setEnabled(true);
    first.getMesh()->setGeometry(nullptr);
    EXPECT_TRUE(pick(top, ray, SceneNode::VISIBLE).empty());
    EXPECT_TRUE(pick(top, {Vector3f(), Vector3f()}).empty());
}

// Fault caught: triangles of a skinned solid where they were bound.
TEST_F(BoundsTest, picksSkinnedSolidsAsTheyStand)
{
    const Glo::Ptr glo = load(makeArm(), MeshData::GEOMETRY);
    ASSERT_TRUE(glo);
    SceneNode& top = *glo->getTopNode();
    Solid& figure = static_cast<Solid&>(*top.find("figure"));
    figure.getAppearance()->setCullingMode(CullingMode::CULL_NONE);
    const auto isMet = [&](float x, float y) {
        return !pick(top, {Vector3f(x, y, 5.0f), Vector3f(0, 0, -1)}).empty();
    };
    EXPECT_TRUE(isMet(3.0f, 0.0f));
    EXPECT_FALSE(isMet(2.0f, 1.0f));
    top.find("elbow")->setRotation(quaternionFromAxisAngle(Vector3f(0, 0, 1), Anglef::fromDegrees(90.0f)));
    EXPECT_FALSE(isMet(3.0f, 0.0f));
    EXPECT_TRUE(isMet(2.0f, 1.0f));

    const auto plain = makeShared<MeshVertices>(); // without a_joints: all of it follows joint 1
    plain->places = {{-1, -1, 0}, {1, -1, 0}, {0, 1, 0}};
    figure.getMesh()->setGeometry(
        makeShared<MeshGeometry>(plain, IndexBuffer::Primitive::TRIANGLES, nullptr, 0));
    figure.setPosition(Vector3f(50, 0, 0));
    top.find("elbow")->setRotation(Quaternionf());
    top.find("elbow")->setPosition(Vector3f(2, 8, 0));
    EXPECT_TRUE(isMet(0.0f, 8.0f));
    EXPECT_FALSE(isMet(0.0f, 0.0f));
}

// Fault caught: a side that is not drawn, or one that is drawn and cannot be pointed at.
TEST_F(BoundsTest, picksTheSidesThatAreDrawn)
{
    using Culling = CullingMode;
    struct Case
    {
        const char* name;
        Vector3f scale;
        Vector3f position;
        Culling culling;
        WindingOrder winding;
        Ray ray;
        float distance; ///< below 0: not met
    };
    const auto CCW = WindingOrder::WINDING_CCW;
    const auto CW = WindingOrder::WINDING_CW;
    const Ray ahead = {{0.25f, 0.1f, 5}, {0, 0, -1}};
    const Ray back = {{0.25f, 0.1f, -5}, {0, 0, 1}};
    const Vector3f one(1, 1, 1);
    const Case cases[] = {
        {"its front", one, {}, Culling::CULL_BACK, CCW, ahead, 5.0f},
        {"beside it", one, {}, Culling::CULL_BACK, CCW, {{0.6f, 0, 5}, {0, 0, -1}}, -1.0f},
        {"looking away", one, {}, Culling::CULL_NONE, CCW, {{0, 0, 5}, {0, 0, 1}}, -1.0f},
        {"its back", one, {}, Culling::CULL_BACK, CCW, back, -1.0f},
        {"its back, drawn", one, {}, Culling::CULL_NONE, CCW, back, 5.0f},
        {"its back alone", one, {}, Culling::CULL_FRONT, CCW, back, 5.0f},
        {"nothing of it", one, {}, Culling::CULL_FRONT_AND_BACK, CCW, ahead, -1.0f},
        {"wound the other way", one, {}, Culling::CULL_BACK, CW, ahead, -1.0f},
        {"mirrored, its front is still its front", {-1, 1, 1}, {}, Culling::CULL_BACK, CCW, ahead, 5.0f},
        {"mirrored, its back alone", {-1, 1, 1}, {}, Culling::CULL_FRONT, CCW, ahead, -1.0f},
        {"in world units", {20, 20, 20}, {3, 0, -5}, Culling::CULL_BACK, CCW, ahead, 10.0f},
        {"squeezed flat", {1, 1, 0}, {}, Culling::CULL_NONE, CCW, ahead, 5.0f},
    };
    const auto vertices = makeShared<MeshVertices>();
    vertices->places = {{-0.5f, -0.5f, 0.0f}, {0.5f, -0.5f, 0.0f}, {0.5f, 0.5f, 0.0f}, {-0.5f, 0.5f, 0.0f}};
    for (const Case& c : cases)
    {
        const auto mesh = makeShared<Mesh>(MeshHeader(), nullptr, nullptr);
        mesh->setGeometry(
            makeShared<MeshGeometry>(vertices, IndexBuffer::Primitive::TRIANGLE_FAN, nullptr, 0));
        const auto solid = makeShared<Solid>(mesh, makeShared<Appearance>());
        solid->setScale(c.scale);
        solid->setPosition(c.position);
        solid->getAppearance()->setCullingMode(c.culling);
        solid->getAppearance()->setWindingOrder(c.winding);
        const std::vector<PickHit> hits = pick(*solid, c.ray);
        ASSERT_EQ(c.distance >= 0.0f ? 1u : 0u, hits.size()) << c.name;
        EXPECT_NEAR(std::max(c.distance, 0.0f), hits.empty() ? 0.0f : hits[0].distance, 1e-4) << c.name;
    }
}

// Faults caught: the inverse of a singular transform (flattened, then rotated) used for picking; directions whose
// squares are too large or too small to be numbers.
TEST_F(BoundsTest, picksFlatSolidsByRaysOfAnyLength)
{
    const auto vertices = makeShared<MeshVertices>();
    vertices->places = {{-2, -1, 0}, {3, -1, 1}, {0, 2, -1}};
    const auto mesh = makeShared<Mesh>(MeshHeader(), nullptr, nullptr);
    mesh->setGeometry(makeShared<MeshGeometry>(vertices, IndexBuffer::Primitive::TRIANGLES, nullptr, 0));
    for (int i = 0; i < 300; ++i)
    {
        const auto turned = makeShared<SceneNode>();
        const auto squeezed = makeShared<SceneNode>();
        const auto solid = makeShared<Solid>(mesh, makeShared<Appearance>());
        turned->setRotation(rotation());
        squeezed->setScale(Vector3f(1.0f, i % 2 ? 0.0f : 1e-7f, i % 3 ? 1.0f : -1.0f));
        squeezed->setParent(turned);
        solid->setRotation(rotation());
        solid->setParent(squeezed);
        solid->getAppearance()->setCullingMode(CullingMode::CULL_NONE);
        const Matrix4f& world = solid->getWorldTransform();
        const float share = number(0.2f, 0.7f);
        const std::vector<Vector3f>& corners = vertices->places;
        const Vector3f inside = corners[0] * 0.2f + corners[1] * share + corners[2] * (0.8f - share);
        const Vector3f aim = (world * Vector4f(inside, 1.0f)).xyz();
        const Vector3f normal = normalize((turned->getWorldTransform() * Vector4f(0, 1, 0, 0)).xyz());
        const Vector3f start = aim + normal * 4.0f;
        const float lengths[] = {1.0f, 1e-30f, 1e25f};
        const std::vector<PickHit> hits = pick(*turned, {start, normal * -lengths[i % 3]});
        ASSERT_EQ(1u, hits.size()) << i;
        EXPECT_NEAR(4.0f, hits[0].distance, 0.02f) << i;
        EXPECT_LT(length(hits[0].point - aim), 0.02f) << i;
    }
    EXPECT_TRUE(pick(*makeShared<Solid>(mesh, makeShared<Appearance>()), {{}, {NAN, 0, 1}}).empty());
}

// Fault caught: triangles that GL draws but that cannot be pointed at, and indices beyond the vertices.
TEST_F(BoundsTest, knowsTrianglesAsTheyAreDrawn)
{
    using Primitive = IndexBuffer::Primitive;
    struct Case
    {
        Primitive primitive;
        std::vector<uint16_t> indices; ///< empty: the vertices in their order
        std::vector<uint32_t> triangles;
    };
    const Case cases[] = {{Primitive::TRIANGLES, {4, 3, 2, 1, 0}, {4, 3, 2}},
                          {Primitive::TRIANGLE_FAN, {4, 3, 2, 1}, {4, 3, 2, 4, 2, 1}},
                          {Primitive::TRIANGLE_STRIP, {}, {0, 1, 2, 2, 1, 3, 2, 3, 4}},
                          {Primitive::LINES, {0, 1, 2, 3}, {}},
                          {Primitive::TRIANGLES, {0, 1, 5}, {}}};
    const auto vertices = makeShared<MeshVertices>();
    vertices->places.resize(5);
    for (const Case& c : cases)
    {
        const MeshGeometry geometry(vertices, c.primitive, c.indices.empty() ? nullptr : c.indices.data(),
                                    c.indices.size());
        EXPECT_EQ(c.triangles, geometry.getTriangles());
    }
}
