#include "glotest.h"
#include "scenetest.h"

#include "orv/animationgroup.h"
#include "orv/glo.h"
#include "orv/indexbuffercache.h"
#include "orv/meshcache.h"
#include "orv/meshutil.h"
#include "orv/vertexbuffercache.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <map>
#include <random>
#include <set>

using namespace orv;

namespace
{

constexpr int FRAMES = 6000;

using Place = std::array<double, 4>;
using Transform = std::array<std::array<double, 4>, 4>; // columns

Transform widen(const Matrix4f& m)
{
    Transform wide;
    for (int column = 0; column < 4; ++column)
    {
        for (int row = 0; row < 4; ++row)
            wide[size_t(column)][size_t(row)] = double(m[column][row]);
    }
    return wide;
}

Place operator*(const Transform& m, const Place& v)
{
    Place result = {};
    for (size_t column = 0; column < 4; ++column)
    {
        for (size_t row = 0; row < 4; ++row)
            result[row] += m[column][row] * v[column];
    }
    return result;
}

Transform operator*(const Transform& a, const Transform& b)
{
    Transform product;
    for (size_t column = 0; column < 4; ++column)
        product[column] = a * b[column];
    return product;
}

Transform findWorld(const SceneNode& node)
{
    const Transform local = widen(node.getLocalTransform());
    return node.getParent() ? findWorld(*node.getParent()) * local : local;
}

} // namespace

/// Random frames, each checked against the vertices: a solid that is not drawn must be outside of one plane of the
/// picture that lacks it. Solids are identified by the number of indices that they draw.
class CullingTest : public SceneTest
{
protected:
    struct Shape
    {
        std::vector<Vector3f> places;
        std::vector<std::array<std::pair<int, float>, 4>>
            joints; ///< numbers and weights; empty without a skin
    };

    struct Item
    {
        SharedPtr<Solid> solid;
        const Shape* shape = nullptr;
        bool isAlwaysDrawn = false;
    };

    void SetUp() override
    {
        SceneTest::SetUp();
        renderer->setCulled(true);
        source = makeShared<GloTestSource>();
        pool->registerSource(source);
        glcalls::replace(glDrawElements,
                         [this](GLenum, GLsizei count, GLenum, const void*) { noteDraw(count); });
    }

    void TearDown() override
    {
        glcalls::restore(glDrawElements);
        items.clear();
        nodes.clear();
        paint = overlay = glass = nullptr;
        animation = nullptr;
        SceneTest::TearDown();
    }

    float number(float from, float to) { return std::uniform_real_distribution<float>(from, to)(random); }
    int pick(int count) { return std::uniform_int_distribution<int>(0, count - 1)(random); }
    Vector3f vector(float reach)
    {
        return Vector3f(number(-reach, reach), number(-reach, reach), number(-reach, reach));
    }
    Quaternionf rotation()
    {
        return quaternionFromAxisAngle(normalize(vector(1.0f)), Anglef::fromRadians(number(-4.0f, 4.0f)));
    }

    /// A cloud of vertices beside the origin.
    Mesh::Ptr makeMesh(bool hasBounds)
    {
        const Vector3f centre = pick(3) ? vector(2.0f) : Vector3f();
        const Vector3f size(number(0.0f, 2.0f), number(0.0f, 2.0f), number(0.0f, 2.0f));
        Shape& shape = shapes[++lastCount];
        for (int i = 0; i < 12; ++i)
            shape.places.push_back(centre + vector(1.0f) * size);
        const auto array = makeShared<VertexArray>(12, 4, 3);
        for (size_t i = 0; i < shape.places.size(); ++i)
            std::copy_n(shape.places[i].data(), 3, array->getData<float>() + 3 * i);
        const auto vertices = pool->getVertexBufferCache()->create(nullptr);
        vertices->addAttrib(array, "a_position", VertexBuffer::AttribFormat::FLOAT,
                            VertexBuffer::AttribUsage::GL_BUFFER, false);
        vertices->commit();
        const std::vector<unsigned short> indices(size_t(lastCount), 0);
        const auto order = pool->getIndexBufferCache()->create(IndexBuffer::Primitive::TRIANGLES,
                                                               unsigned(lastCount), indices.data(), nullptr);
        order->commit();
        const Mesh::Ptr mesh = pool->getMeshCache()->create(MeshHeader(), order, vertices, nullptr);
        if (hasBounds)
            mesh->setBounds(computeBounds(array));
        return mesh;
    }

    void addSolid(const Mesh::Ptr& mesh, const SharedPtr<Appearance>& appearance,
                  const SharedPtr<SceneNode>& parent)
    {
        Item& item = items[mesh->getIndexBuffer()->getCount()];
        item.solid = makeShared<Solid>(mesh, appearance);
        item.shape = &shapes[mesh->getIndexBuffer()->getCount()];
        item.isAlwaysDrawn = !mesh->getBounds().isKnown() || appearance == overlay;
        item.solid->setParent(parent);
        nodes.push_back(item.solid);
    }

    /// A scene file with a skin, a clip for its joints, and a solid without one.
    std::vector<uint8_t> writeFigure(int skinCount, int solidCount)
    {
        glo::GloScene file;
        file.geometries = {makeSquareGeometry("figure"), makeSquareGeometry("prop")};
        Shape& shape = shapes[skinCount];
        std::vector<float> places, joints, weights;
        for (int i = 0; i < 20; ++i)
        {
            shape.places.push_back(Vector3f(1.0f, 2.0f, 0.0f) + vector(1.5f));
            places.insert(places.end(), shape.places.back().data(), shape.places.back().data() + 3);
            auto& shares = shape.joints.emplace_back();
            float total = 0.0f;
            for (auto& [joint, weight] : shares)
            {
                joint = pick(6); // there are three; higher numbers use the last one
                weight = pick(2) ? number(0.0f, 1.0f) : 0.0f;
                joints.push_back(float(joint));
                weights.push_back(weight);
                total += weight;
            }
            for (auto& [joint, weight] : shares)
            {
                weight = total > 0.0f ? weight / total : joint == shares[0].first ? 1.0f : 0.0f;
                joint = std::min(joint, 2);
            }
            if (total == 0.0f)
                shares = {{{shares[0].first, 1.0f}, {0, 0.0f}, {0, 0.0f}, {0, 0.0f}}};
        }
        file.geometries[0].vertices = glo::makeVertexSet(
            {{"a_position", 3, places}, {"a_joints", 4, joints}, {"a_weights", 4, weights}});
        const auto makeIndices = [this](int count, int vertexCount)
        {
            glo::IndexData indices;
            for (int i = 0; i < count; ++i)
                indices.indices.push_back(uint16_t(i < vertexCount ? i : pick(vertexCount)));
            return indices;
        };
        file.geometries[0].primitiveSets = {{glo::primitive::TRIANGLES, makeIndices(skinCount, 20)}};
        file.geometries[1].primitiveSets = {{glo::primitive::TRIANGLES, makeIndices(solidCount, 4)}};
        shapes[solidCount].places = {
            {-0.5f, -0.5f, 0.0f}, {0.5f, -0.5f, 0.0f}, {0.5f, 0.5f, 0.0f}, {-0.5f, 0.5f, 0.0f}};

        glo::Skin& skin = file.skins.emplace_back();
        skin.name = "skin";
        skin.geometry = "figure";
        skin.bindShape = translationMatrix(vector(1.0f)) * scaleMatrix(Vector3f(0.5f, 1.0f, 2.0f));
        file.scene =
            glo::SceneData{"scene", makeNode("top", {makeNode("figure", &glo::NodeData::skin,
                                                              glo::SkinReference{"skin", {"red"}, {"hip"}}),
                                                     makeNode("hip", {makeNode("knee", {makeNode("toe")})}),
                                                     makeSolidNode("prop", "prop", "red")})};
        file.materials = {makeMaterial("red", Vector4f(1, 0, 0, 1))};
        glo::AnimationData& clip = file.animations.emplace_back();
        clip.name = "walk";
        for (const char* joint : {"hip", "knee", "toe"})
        {
            skin.attachments.push_back(
                {joint, inverse(translationMatrix(vector(1.0f)) * toMatrix4(rotation()))});
            glo::Channel move = makeChannel("node", joint, "translation", {0, 0, 0}, 0.0f);
            glo::Channel turn = makeChannel("node", joint, "rotation", {0, 1, 0, 0}, 0.0f);
            glo::Channel grow = makeChannel("node", joint, "scale", {1, 1, 1}, 0.0f);
            for (int key = 1; key < 10; ++key)
            {
                const Vector3f place = vector(2.0f), axis = normalize(vector(1.0f));
                glo::addKey(move, float(key), {place.x, place.y, place.z});
                glo::addKey(turn, float(key), {axis.x, axis.y, axis.z, number(-3.0f, 3.0f)});
                glo::addKey(grow, float(key), {number(0.2f, 2.0f), number(0.2f, 2.0f), number(-1.0f, 2.0f)});
            }
            clip.channels.insert(clip.channels.end(), {move, turn, grow});
        }
        std::vector<uint8_t> bytes;
        std::string error;
        EXPECT_TRUE(glo::writeGlo(file, bytes, error)) << error;
        return bytes;
    }

    void addFigure(const SharedPtr<SceneNode>& parent)
    {
        const int skinCount = ++lastCount + 20;
        const int solidCount = lastCount += 21;
        const std::string name = "figure" + std::to_string(skinCount) + ".glo";
        source->set(name, writeFigure(skinCount, solidCount));
        const Glo::Ptr figure = loadGloFile(*pool, parent, name.c_str(), MeshData::BOUNDS);
        ASSERT_TRUE(figure);
        animation = figure->getAnimationGroup();
        for (const auto& [node, count] : {std::pair("figure", skinCount), std::pair("prop", solidCount)})
        {
            Item& item = items[count];
            item.solid = SharedPtr<Solid>(static_cast<Solid*>(figure->getTopNode()->find(node)));
            item.shape = &shapes[count];
            EXPECT_EQ(count, item.solid->getMesh()->getIndexBuffer()->getCount());
        }
        nodes.push_back(figure->getTopNode());
    }

    void makeScene()
    {
        paint = makePaint(Colour4f::RED);
        glass = makePaint(Colour4f::GREEN);
        glass->setBlendFactors(BlendFactor::SRC_ALPHA, BlendFactor::SRC_ALPHA, BlendFactor::ONE,
                               BlendFactor::ONE);
        overlay = makeShared<Appearance>();
        overlay->setShaderProgram(
            makeProgram("attribute vec3 a_position; void main() { gl_Position = vec4(a_position, 1.0); }",
                        "void main() { gl_FragColor = vec4(1.0); }", {}));
        for (int i = 0; i < 8; ++i)
        {
            auto node = makeShared<SceneNode>();
            node->setParent(i < 2 ? scene : nodes[size_t(pick(int(nodes.size())))]);
            nodes.push_back(node);
        }
        for (int i = 0; i < 24; ++i)
        {
            const SharedPtr<SceneNode> parent = nodes[size_t(pick(int(nodes.size())))];
            addSolid(makeMesh(i != 7), i == 9 ? overlay : i % 5 ? paint : glass, parent);
        }
        addFigure(nodes[0]);
        addFigure(nodes[3]);
        for (const SharedPtr<SceneNode>& node : nodes)
            move(*node);
    }

    void move(SceneNode& node)
    {
        node.setPosition(vector(12.0f));
        node.setRotation(rotation());
        node.setScale(pick(3) ? Vector3f(1, 1, 1)
                              : Vector3f(number(0.1f, 2.0f), number(-1.0f, 1.5f), number(0.0f, 2.0f)));
        if (pick(4) == 0)
            node.setLocalTransform(Matrix4f(Vector4f(vector(1.0f), 0), Vector4f(vector(1.0f), 0),
                                            Vector4f(vector(1.0f), 0), Vector4f(vector(12.0f), 1)));
    }

    /// Changes nothing in most frames, so that caches between frames are used.
    void changeScene()
    {
        const auto anyNode = [this]() -> SceneNode& { return *nodes[size_t(pick(int(nodes.size())))]; };
        const auto anyItem = [this]() -> Item&
        { return std::next(items.begin(), pick(int(items.size())))->second; };
        switch (pick(30))
        {
        case 0: return move(anyNode());
        case 1: return anyNode().setParent(nodes[size_t(pick(8))], pick(2) == 0);
        case 2: return scene->setPosition(pick(2) ? Vector3f() : vector(100000.0f));
        case 3: return animation->apply(number(0.0f, 10.0f));
        case 4:
        {
            Item& item = anyItem(); // of another material, or back
            if (!item.shape->joints.empty() || !item.solid->getMesh()->getBounds().isKnown() ||
                item.solid == mirror)
                return;
            item.isAlwaysDrawn = item.solid->getAppearance() != overlay;
            return item.solid->setAppearance(item.isAlwaysDrawn ? overlay : paint);
        }
        case 5:
        {
            const Item& item = anyItem(); // bounds that are wider than needed, and back
            const Mesh::Ptr& mesh = item.solid->getMesh();
            if (mesh->getBounds().isKnown())
            {
                const Bounds whole(mesh->getBounds().box);
                mesh->setBounds(Bounds(whole.box, whole.radius * (pick(2) ? 1.0f : 1.1f)));
            }
            return;
        }
        default: return;
        }
    }

    void placeCamera()
    {
        const Vector3f centre = scene->getPosition();
        camera->setPosition(centre + vector(20.0f));
        camera->setRotation(rotation());
        camera->setScale(pick(5) ? Vector3f(1, 1, 1) : Vector3f(1, pick(2) ? -1.0f : 2.0f, 1));
        camera->setProjectionType(pick(5) ? Camera::ProjectionType::PERSPECTIVE
                                          : Camera::ProjectionType::ORTHOGRAPHIC);
        const support::LogCapture log; // of what the other projection cannot use
        camera->setFieldOfView(Anglef::fromDegrees(number(10.0f, 120.0f)));
        camera->setWidth(number(1.0f, 20.0f));
        camera->setNear(pick(2) ? 0.01f : number(0.1f, 5.0f));
        camera->setFar(pick(3) ? number(6.0f, 60.0f) : 10000.0f);
        const bool isFar = centre.x + centre.y + centre.z != 0.0f; // two eyes are not told apart there
        const bool isStereo =
            pick(4) == 0 && !isFar && camera->getProjectionType() == Camera::ProjectionType::PERSPECTIVE;
        camera->setStereo(10.0f, isStereo ? 0.5f : 0.0f);
    }

    /// What is multiplied by a place in the world, for each picture of the frame.
    std::vector<Transform> findViews()
    {
        Matrix4f eyes[2], projections[2];
        const bool isStereo = camera->getStereoEyeSeparation() != 0.0f;
        camera->getStereoWorldTransform(&eyes[0], &eyes[1]);
        camera->getStereoProjection(&projections[0], &projections[1], 1.0f);
        if (!isStereo)
            camera->getProjection(&projections[0], 1.0f);
        std::vector<Transform> found;
        for (int i = 0; i < (isStereo ? 2 : 1); ++i)
        {
            found.push_back(widen(projections[i]) * widen(inverse(eyes[i])));
            if (!mirror)
                continue;
            const Vector3f n = normalize(mirror->getWorldTransform()[2].xyz());
            const float d = dot(n, mirror->getWorldTransform()[3].xyz());
            Matrix4f reflection = translationMatrix(n * (2.0f * d));
            for (int column = 0; column < 3; ++column)
            {
                for (int row = 0; row < 3; ++row)
                    reflection[column][row] -= 2.0f * n[row] * n[column];
            }
            Matrix4f projection = projections[i];
            projection[1] = -projection[1];
            found.push_back(widen(projection) * widen(inverse(reflection * eyes[i])));
        }
        return found;
    }

    void noteDraw(int count)
    {
        if (views.empty())
            return;
        const Transform view = widen(property<Matrix4f>("T_VIEW_PROJECTION"));
        const auto distance = [&view](const Transform& other)
        {
            double sum = 0.0;
            for (size_t i = 0; i < 16; ++i)
                sum += std::fabs(view[i / 4][i % 4] - other[i / 4][i % 4]);
            return sum;
        };
        size_t nearest = 0;
        for (size_t i = 1; i < views.size(); ++i)
        {
            if (distance(views[i]) < distance(views[nearest]))
                nearest = i;
        }
        EXPECT_TRUE(drawn[nearest].insert(count).second) << "drawn twice";
    }

    bool isOutside(const Item& item, const Transform& view) const
    {
        std::array<bool, 6> outside;
        outside.fill(true);
        const Solid& solid = *item.solid;
        const Transform world = findWorld(solid);
        for (size_t i = 0; i < item.shape->places.size(); ++i)
        {
            const Vector3f& at = item.shape->places[i];
            Place place = {at.x, at.y, at.z, 1.0};
            if (item.shape->joints.empty())
                place = world * place;
            else
                place = skin(solid, item.shape->joints[i], place);
            const Place clip = view * place;
            for (size_t plane = 0; plane < 6; ++plane)
                outside[plane] = outside[plane] && clip[plane / 2] * (plane % 2 ? -1.0 : 1.0) < -clip[3];
        }
        return std::count(outside.begin(), outside.end(), true) > 0;
    }

    static Place skin(const Solid& solid, const std::array<std::pair<int, float>, 4>& shares,
                      const Place& place)
    {
        Place sum = {};
        for (const auto& [joint, weight] : shares)
        {
            const Solid::JointAttachment attachment = solid.getJoint(joint);
            const Place moved =
                findWorld(*attachment.joint) *
                (widen(attachment.inverseBind) * (widen(solid.getBindShapeTransform()) * place));
            for (size_t i = 0; i < 4; ++i)
                sum[i] += double(weight) * moved[i];
        }
        return sum;
    }

    void checkFrame(int frame)
    {
        views = findViews();
        drawn.assign(views.size(), {});
        render();
        for (size_t view = 0; view < views.size(); ++view)
        {
            const bool isReflected = mirror && view % 2 == 1;
            if (isReflected && drawn[view - 1].count(mirror->getMesh()->getIndexBuffer()->getCount()) == 0)
                continue;
            for (const auto& [count, item] : items)
            {
                if (isReflected && item.solid == mirror)
                    continue; // not drawn into itself
                const bool isOut = isOutside(item, views[view]);
                const bool isDrawn = drawn[view].count(count) > 0;
                outsideCount += isOut && !item.isAlwaysDrawn;
                leftOutCount += !isDrawn;
                EXPECT_TRUE(isDrawn || (isOut && !item.isAlwaysDrawn))
                    << "frame " << frame << ", view " << view << ", solid " << count;
            }
        }
    }

    SharedPtr<GloTestSource> source;
    std::mt19937 random{1};
    std::map<int, Shape> shapes; ///< by the count of indices
    std::map<int, Item> items;   ///< likewise
    int lastCount = 0;
    std::vector<SharedPtr<SceneNode>> nodes;
    SharedPtr<Appearance> paint, glass, overlay;
    SharedPtr<Animation> animation;
    SharedPtr<Solid> mirror;
    std::vector<Transform> views;
    std::vector<std::set<int>> drawn; ///< for each view
    int outsideCount = 0;
    int leftOutCount = 0;
};

// Faults caught: a visible solid left out, because spheres do not follow a move, a scale, a shear or a joint, because a
// subtree's cached bounds are stale, or because of another eye's planes.
TEST_F(CullingTest, leavesNothingOutThatMayBeSeen)
{
    makeScene();
    for (int frame = 0; frame < FRAMES && !HasFailure(); ++frame)
    {
        changeScene();
        placeCamera();
        checkFrame(frame);
    }
    EXPECT_LT(0.8 * outsideCount, leftOutCount) << outsideCount; // spheres reach further than what is in them
}

// Faults caught: solids visible only in a mirror left out, by the eye's planes or by the walk of the first frame with a
// mirror.
TEST_F(CullingTest, leavesNothingOutThatAMirrorMayShow)
{
    makeScene();
    addSolid(makeMesh(true), makeMirror(), scene);
    const SharedPtr<Solid> added = items[lastCount].solid;
    for (int frame = 0; frame < FRAMES / 4 && !HasFailure(); ++frame)
    {
        if (frame % 10 == 0) // with one or without
            added->setParent(pick(2) ? scene : nullptr);
        changeScene(); // which may put it back
        mirror = added->getParent() ? added : nullptr;
        items.erase(lastCount);
        if (mirror)
            items[lastCount] = {mirror, &shapes[lastCount], false};
        if (mirror)
            mirror->setRotation(rotation());
        placeCamera();
        checkFrame(frame);
    }
    EXPECT_LT(0, leftOutCount);
    mirror = nullptr;
}

// Fault caught: points that vanish when their centre leaves the view, though half of each is still in it.
TEST_F(CullingTest, largePointsAreDrawn)
{
    const auto large = makeShared<Appearance>();
    large->setShaderProgram(makeProgram("attribute vec3 a_position; uniform mat4 u_transform;"
                                        "void main() { gl_Position = u_transform * vec4(a_position, 1.0);"
                                        " gl_PointSize = 40.0; }",
                                        "void main() { gl_FragColor = vec4(1.0); }",
                                        {{"u_transform", "T_MODEL_VIEW_PROJECTION"}}));
    const auto places = makeShared<VertexArray>(1, 4, 3);
    std::fill_n(places->getData<float>(), 3, 0.0f);
    const auto vertices = makeShared<VertexBuffer>(nullptr);
    vertices->addAttrib(places, "a_position", VertexBuffer::AttribFormat::FLOAT,
                        VertexBuffer::AttribUsage::CLIENT_MEMORY, false);
    const auto mesh = makeShared<Mesh>(
        MeshHeader(), makeShared<IndexBuffer>(IndexBuffer::Primitive::POINTS, 1, false, nullptr), vertices);
    Box box;
    box.add(Vector3f());
    mesh->setBounds(Bounds(box, 0.0f));
    const auto solid = makeShared<Solid>(mesh, large);
    solid->setParent(scene);
    camera->setPosition(Vector3f());
    camera->setProjectionType(Camera::ProjectionType::ORTHOGRAPHIC);
    camera->setWidth(2.0f);
    solid->setPosition(Vector3f(1.1f, 0, -5)); // the view ends at 1
    renderer->setCounted(true);
    renderFrame();
    EXPECT_EQ(0u, renderer->getCounters().culled);
}

// Fault caught: a mirror that takes the place in a list of those before it, which are hidden and have none.
TEST_F(CullingTest, drawsAMirrorBehindHiddenOnes)
{
    SharedPtr<Appearance> last;
    for (int i = 0; i < 9; ++i)
    {
        last = makeMirror();
        const auto square = createSquare(*pool, Vector2f(1, 1));
        square->setAppearance(last);
        square->setPosition(Vector3f(0, 0, i < 8 ? 50.0f : -5.0f)); // behind the eye, and before it
        square->setParent(scene);
    }
    camera->setPosition(Vector3f());
    renderer->setCounted(true);
    for (int frame = 0; frame < 2; ++frame)
    {
        renderFrame();
        const SharedPtr<ShaderUniformBase> property = last->getPropertyUniform("M_MIRROR_TEXTURE");
        SharedPtr<Texture2D> texture;
        ASSERT_TRUE(property && property->getValue(texture, 0));
        EXPECT_TRUE(texture);
        EXPECT_EQ(8u, renderer->getCounters().culled);
    }
}

// Faults caught: a look at each solid of a subtree that cannot be seen; lights that go out with it.
TEST_F(CullingTest, hiddenSubtreesAreNotWalked)
{
    struct Counted : Solid
    {
        using Solid::Solid;
        void accept(SceneNodeVisitor& visitor) override
        {
            ++visits;
            Solid::accept(visitor);
        }
        int visits = 0;
    };
    SharedPtr<SceneNode> groups[2];
    SharedPtr<Counted> solids[2];
    const auto appearance = makePaint(Colour4f::RED);
    for (int i = 0; i < 2; ++i)
    {
        groups[i] = makeShared<SceneNode>();
        groups[i]->setParent(scene);
        for (int k = 0; k < 10; ++k)
        {
            solids[i] =
                makeShared<Counted>(createCubeMesh(*pool->getMeshCache(), Vector2f(1, 1)), appearance);
            solids[i]->setPosition(Vector3f(0, 0, 20.0f + float(k)));
            solids[i]->setParent(groups[i]);
        }
    }
    const auto lamp = makeShared<Light>();
    lamp->setParent(groups[1]);
    const auto countVisits = [&](int i)
    {
        solids[i]->visits = 0;
        render();
        render();
        const int visits = solids[i]->visits;
        render();
        return solids[i]->visits - visits;
    };
    for (int i = 0; i < 3; ++i)
        render();
    EXPECT_EQ(0, countVisits(0));
    EXPECT_EQ(1, countVisits(1)); // for the light's sake
    EXPECT_EQ(1, property<int>("L_COUNT"));
    lamp->setParent(nullptr);
    EXPECT_EQ(0, countVisits(1));
    groups[0]->setPosition(Vector3f(0, 0, -30.0f));
    EXPECT_EQ(1, countVisits(0));
    groups[0]->setPosition(Vector3f());
    EXPECT_EQ(0, countVisits(0));
    solids[0]->setMesh(nullptr); // something else is there still
    solids[0]->setPosition(Vector3f());
    EXPECT_EQ(0, countVisits(0));
    solids[0]->setMesh(createCubeMesh(*pool->getMeshCache(), Vector2f(1, 1)));
    EXPECT_EQ(1, countVisits(0));

    renderer->setCulled(false);
    groups[1]->setParent(nullptr);
    solids[0]->setPosition(Vector3f(0, 0, 20.0f));
    EXPECT_EQ(1, countVisits(0));
}
