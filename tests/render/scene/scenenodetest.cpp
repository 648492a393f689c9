#include "orv/scenenode.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>

using namespace orv;

namespace
{

SharedPtr<SceneNode> makeNode(const char* name, const SharedPtr<SceneNode>& parent,
                              const Vector3f& position = Vector3f())
{
    auto node = makeShared<SceneNode>(name);
    node->setPosition(position);
    if (parent)
        node->setParent(parent);
    return node;
}

Vector3f worldPosition(const SceneNode& node)
{
    return node.getWorldTransform().columns[3].xyz();
}

bool isNear(const Matrix4f& a, const Matrix4f& b)
{
    return std::equal(a.data(), a.data() + 16, b.data(),
                      [](float x, float y) { return std::fabs(x - y) < 1e-5f; });
}

/// Tells when it goes.
class WatchedNode : public SceneNode
{
public:
    explicit WatchedNode(int& deaths) : m_deaths(deaths) {}
    ~WatchedNode() override { ++m_deaths; }

private:
    int& m_deaths;
};

} // namespace

// Fault caught: rotation and scale multiplied in the wrong order, or the translation turned along.
TEST(SceneNode, scalesThenTurnsThenMoves)
{
    SceneNode node;
    node.setScale(Vector3f(2.0f, 3.0f, 4.0f));
    node.setRotation(quaternionFromAxisAngle(Vector3f::Z_AXIS, Anglef::fromDegrees(90.0f)));
    node.setPosition(Vector3f(10.0f, 20.0f, 30.0f));
    const Matrix4f expected(Vector4f(0, 2, 0, 0), Vector4f(-3, 0, 0, 0), Vector4f(0, 0, 4, 0),
                            Vector4f(10, 20, 30, 1));
    EXPECT_TRUE(isNear(expected, node.getLocalTransform()));
}

// Fault caught: a second move between two reads, or a read in the middle, leaving descendants stale.
TEST(SceneNode, descendantsFollowEveryMove)
{
    const auto root = makeNode("root", nullptr, Vector3f(1, 0, 0));
    const auto middle = makeNode("middle", root, Vector3f(0, 1, 0));
    const auto leaf = makeNode("leaf", middle, Vector3f(0, 0, 1));
    EXPECT_EQ(Vector3f(1, 1, 1), worldPosition(*leaf));

    root->setPosition(Vector3f(2, 0, 0));
    root->setPosition(Vector3f(3, 0, 0));
    EXPECT_EQ(Vector3f(3, 1, 0), worldPosition(*middle));
    EXPECT_EQ(Vector3f(3, 1, 1), worldPosition(*leaf));
    middle->setPosition(Vector3f());
    root->setPosition(Vector3f());
    EXPECT_EQ(Vector3f(0, 0, 1), worldPosition(*leaf));
}

// Fault caught: deriving components from a matrix, or an equal component discarding the matrix.
TEST(SceneNode, keepsGivenMatrixUntilAComponentChanges)
{
    SceneNode node;
    const Matrix4f given = translationMatrix(Vector3f(5, 6, 7));
    node.setLocalTransform(given);
    node.setPosition(Vector3f());
    node.setRotation(Quaternionf());
    node.setScale(Vector3f(1, 1, 1));
    EXPECT_EQ(given, node.getLocalTransform());
    EXPECT_EQ(given, node.getWorldTransform());
    EXPECT_EQ(Vector3f(), node.getPosition());

    node.setScale(Vector3f(2, 2, 2));
    EXPECT_EQ(scaleMatrix(Vector3f(2, 2, 2)), node.getLocalTransform());
}

TEST(SceneNode, knowsWhatIsMirrored)
{
    const struct
    {
        Vector3f parentScale, scale;
        bool local, world;
    } cases[] = {
        {Vector3f(1, 1, 1), Vector3f(1, 2, 3), false, false},
        {Vector3f(1, 1, 1), Vector3f(-1, 1, 1), true, true},
        {Vector3f(1, 1, 1), Vector3f(-1, 1, -2), false, false},
        {Vector3f(1, 1, 1), Vector3f(-1, -1, -2), true, true},
        {Vector3f(1, 1, -1), Vector3f(1, 1, 1), false, true},
        {Vector3f(-1, 1, 1), Vector3f(1, -1, 1), true, false},
    };
    for (const auto& c : cases)
    {
        SCOPED_TRACE(toString(c.scale));
        const auto parent = makeNode("", nullptr);
        parent->setScale(c.parentScale);
        const auto node = makeNode("", parent);
        node->setScale(c.scale);
        const auto byMatrix = makeNode("", parent);
        byMatrix->setLocalTransform(scaleMatrix(c.scale));
        for (const SceneNode* made : {node.get(), byMatrix.get()})
        {
            EXPECT_EQ(c.local, made->getLocalMirrored());
            EXPECT_EQ(c.world, made->getWorldMirrored());
        }
    }
}

// Fault caught: preserving the world matrix as it was last read instead of as it is.
TEST(SceneNode, staysInPlaceUnderANewParent)
{
    const auto oldParent = makeNode("old", nullptr);
    const auto newParent = makeNode("new", nullptr);
    const auto node = makeNode("node", oldParent, Vector3f(1, 2, 3));
    node->getWorldTransform();
    oldParent->setScale(Vector3f(2, 2, 2));
    newParent->setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(40.0f)));
    newParent->setScale(Vector3f(1, -3, 1));

    const Matrix4f expected = scaleMatrix(Vector3f(2, 2, 2)) * translationMatrix(Vector3f(1, 2, 3));
    node->setParent(newParent, true);
    EXPECT_TRUE(isNear(expected, node->getWorldTransform()));
    EXPECT_FALSE(node->getWorldMirrored());
    EXPECT_EQ(Vector3f(1, 2, 3), node->getPosition());

    node->setParent(nullptr, true);
    EXPECT_TRUE(isNear(expected, node->getWorldTransform()));
    node->setParent(newParent, false);
    EXPECT_TRUE(
        isNear(newParent->getWorldTransform() * node->getLocalTransform(), node->getWorldTransform()));

    // Fault caught: an inverse that does not exist turning the node into nothing for good.
    newParent->setScale(Vector3f(1, 1, 0));
    const auto other = makeNode("other", nullptr, Vector3f(1, 2, 3));
    other->setParent(newParent, true);
    EXPECT_EQ(translationMatrix(Vector3f(1, 2, 3)), other->getLocalTransform());
}

TEST(SceneNode, refusesCycles)
{
    const auto root = makeNode("root", nullptr);
    const auto child = makeNode("child", root);
    const auto grandchild = makeNode("grandchild", child);
    root->setParent(grandchild);
    child->setParent(child);
    EXPECT_EQ(nullptr, root->getParent());
    EXPECT_EQ(root.get(), child->getParent());
}

// Faults caught: use after free when the old parent's share is the last one, and reading the caller's pointer
// after the list that it lies in was changed.
TEST(SceneNode, survivesItsOwnReparenting)
{
    int deaths = 0;
    const auto root = makeNode("root", nullptr);
    SharedPtr<SceneNode>(new WatchedNode(deaths))->setParent(root);
    makeNode("second", root);
    makeNode("third", root);

    SceneNode* watched = root->getChild(0).get();
    watched->setParent(root->getChild(1));
    ASSERT_EQ(2u, root->getChildCount());
    EXPECT_STREQ("second", watched->getParent()->getName());
    EXPECT_EQ(0, deaths);

    watched->setParent(nullptr);
    EXPECT_EQ(1, deaths);
    root->removeChild(root->getChild(0));
    EXPECT_STREQ("third", root->getChild(0)->getName());
    root->removeChild(makeNode("stranger", makeNode("elsewhere", nullptr)));
}

// Fault caught: a world matrix kept from a parent that is gone.
TEST(SceneNode, becomesARootWithItsOwnTransform)
{
    for (const bool destroyParent : {false, true})
    {
        auto parent = makeNode("parent", nullptr, Vector3f(5, 0, 0));
        const auto child = makeNode("child", parent, Vector3f(1, 0, 0));
        const auto grandchild = makeNode("grandchild", child);
        EXPECT_EQ(Vector3f(6, 0, 0), worldPosition(*grandchild));
        if (destroyParent)
            parent = nullptr;
        else
            parent->removeChild(child);
        EXPECT_EQ(nullptr, child->getParent());
        EXPECT_EQ(Vector3f(1, 0, 0), worldPosition(*grandchild));
    }
}

// Fault caught: destruction, or marking what is about to go, that recurses once per level and runs out of stack.
TEST(SceneNode, deepTreesAreDestroyed)
{
    int deaths = 0;
    SharedPtr<SceneNode> top(new WatchedNode(deaths));
    for (int i = 1; i < 200000; ++i)
    {
        SharedPtr<SceneNode> above(new WatchedNode(deaths));
        top->setParent(above);
        top = above;
    }
    SharedPtr<SceneNode> held = top->getChild(0)->getChild(0);
    top = nullptr;
    EXPECT_EQ(2, deaths);
    for (SceneNode* node = held.get(); node; node = node->getChildCount() ? node->getChild(0).get() : nullptr)
        node->getWorldTransform(); // so that nothing is marked
    held = nullptr;
    EXPECT_EQ(200000, deaths);
}

TEST(SceneNode, findsTheFirstInPreOrder)
{
    const auto root = makeNode("root", nullptr);
    const auto left = makeNode("left", root);
    const auto deep = makeNode("twin", left);
    makeNode("twin", root);
    EXPECT_EQ(deep.get(), root->find("twin"));
    EXPECT_EQ(nullptr, root->find("Twin"));
    EXPECT_EQ(nullptr, root->find(nullptr));

    support::LogCapture log;
    EXPECT_FALSE(root->getChild(2));
    EXPECT_EQ(1, log.countMessage("ORV_ASSERT: i < m_children.size()"));
}
