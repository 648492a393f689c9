#include "orv/camera.h"
#include "orv/light.h"
#include "orv/scenenodevisitor.h"
#include "orv/sceneutil.h"
#include "orv/solid.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <string>

using namespace orv;

namespace
{

/// Writes down the initials of what it meets: n, s, c or l for the class, then the name.
class Recorder : public SceneNodeVisitor
{
public:
    void visit(SceneNode* node) override { add(" n", *node); }
    void visit(Solid* solid) override { add(" s", *solid); }
    void visit(Camera* camera) override { add(" c", *camera); }
    void visit(Light* light) override { add(" l", *light); }

    std::string text;

private:
    void add(const char* kind, const SceneNode& node) { text += std::string(kind) + node.getName(); }
};

struct Tree
{
    /// @param flags  of A, B, C, D, as stored.
    explicit Tree(const uint32_t (&flags)[4])
    {
        b->setParent(a);
        c->setParent(b);
        d->setParent(a);
        c->setName("C");
        SceneNode* const nodes[] = {a.get(), b.get(), c.get(), d.get()};
        for (int i = 0; i < 4; ++i)
            nodes[i]->setFlags(flags[i]);
    }

    SharedPtr<SceneNode> a = makeShared<SceneNode>("A");
    SharedPtr<Light> b = makeShared<Light>("B");
    SharedPtr<Solid> c = makeShared<Solid>();
    SharedPtr<Camera> d = makeShared<Camera>("D");
};

} // namespace

// Fault caught: a node class visited as another one, children before parents, or flags read in the wrong polarity. The
// tree is A with the children B (with the child C) and D.
TEST(SceneWalk, visitsWhatTheFlagsAdmit)
{
    const FlagMask none;
    const FlagMask shown(1);
    const FlagMask shownByDefault(1, 1);
    const FlagMask inherited(2);
    const FlagMask inheritedByDefault(4, 4);
    const struct
    {
        const char* name;
        uint32_t flags[4];
        FlagMask render, recursive;
        const char* visited;
    } cases[] = {
        {"no render flags: everything", {0, 0, 0, 0}, none, inherited, " nA lB sC cD"},
        {"render flag only where set", {0, 1, 0, 1}, shown, inherited, " lB cD"},
        {"render flag on by default", {0, 1, 0, 0}, shownByDefault, inherited, " nA sC cD"},
        {"ordinary inherited flag admits all below", {0, 2, 0, 0}, shown, inherited, " lB sC"},
        {"no inherited flag meant: admits all", {0, 0, 0, 0}, shown, none, " nA lB sC cD"},
        {"inherited flag on by default", {1, 1, 1, 0}, shown, inheritedByDefault, " nA lB sC"},
        {"switched off: itself, nothing below", {1, 5, 1, 1}, shown, inheritedByDefault, " nA lB cD"},
        {"switched off at the root", {4, 1, 1, 1}, shown, inheritedByDefault, " lB sC cD"},
        {"both kinds, one lacking", {1, 1, 1, 1}, shown, FlagMask(6, 4), " nA lB sC cD"},
        {"both kinds, lost on the way", {3, 5, 1, 1}, shown, FlagMask(6, 4), " nA lB cD"},
        {"a render flag counts as inherited", {0, 2, 0, 0}, FlagMask(2), FlagMask(6, 4), " lB sC"},
    };
    for (const auto& c : cases)
    {
        SCOPED_TRACE(c.name);
        const Tree tree(c.flags);
        Recorder recorder;
        visitScene(recorder, *tree.a, c.render, c.recursive);
        EXPECT_EQ(c.visited, recorder.text);
    }
}

TEST(SceneWalk, derivesFlagsFromThePath)
{
    const struct
    {
        const char* name;
        uint32_t parentFlags, flags;
        FlagMask mask;
        bool expected;
    } cases[] = {
        {"ordinary, set above", 1, 0, FlagMask(1), true},
        {"one of two", 1, 0, FlagMask(3), false},
        {"one each", 1, 2, FlagMask(3), true},
        {"on by default", 0, 0, FlagMask(1, 1), true},
        {"on by default, switched off above", 1, 0, FlagMask(1, 1), false},
        {"no flag meant", 0, 0, FlagMask(), true},
    };
    for (const auto& c : cases)
        EXPECT_EQ(c.expected, getDerivedFlags(*Tree({c.parentFlags, c.flags, 0, 0}).b, c.mask)) << c.name;
}

// Fault caught: touching flags that are not meant, or forgetting the inverted polarity.
TEST(SceneWalk, setsFlagsInStoredPolarity)
{
    SceneNode node;
    node.setFlags(0xF0);
    setFlags(node, FlagMask(0x3, 0x2), true);
    EXPECT_EQ(0xF1u, node.getFlags());
    setFlags(node, FlagMask(0x3, 0x2), false);
    EXPECT_EQ(0xF2u, node.getFlags());
}

// Fault caught: a node that looks beside its target under a parent that is turned and stretched.
TEST(SceneWalk, pointsAtAPlaceInTheWorld)
{
    const auto parent = makeShared<SceneNode>();
    parent->setPosition(Vector3f(1, -2, 3));
    parent->setScale(Vector3f(1, 4, 0.5f));
    parent->setRotation(quaternionFromAxisAngle(Vector3f::X_AXIS, Anglef::fromDegrees(75.0f)));
    const auto node = makeShared<SceneNode>();
    node->setParent(parent);
    node->setPosition(Vector3f(2, 2, 2));

    const Vector3f from = node->getWorldTransform().columns[3].xyz();
    const Vector3f targets[] = {Vector3f(0, 0, 0), Vector3f(0, 9, 0), Vector3f(from.x, from.y + 3, from.z),
                                Vector3f(from.x, from.y - 3, from.z), Vector3f(-50, 1, 8)};
    for (const Vector3f& target : targets)
    {
        point(*node, target);
        const Vector3f looks = normalize(-node->getWorldTransform().columns[2].xyz());
        EXPECT_GT(dot(looks, normalize(target - from)), 0.99999f);
    }

    const Quaternionf before = node->getRotation();
    point(*node, from);
    EXPECT_EQ(before, node->getRotation());

    SceneNode root;
    point(root, Vector3f(5, 0, 0), Vector3f(0, 0, 1));
    EXPECT_GT(root.getWorldTransform().columns[1].z, 0.99999f);
}

namespace
{

/// Does something at each node, and writes down the names and the end of each node that dies.
class Changer : public SceneNodeVisitor
{
public:
    using Change = std::function<void(SceneNode& node)>;
    explicit Changer(Change change) : m_change(std::move(change)) {}

    using SceneNodeVisitor::visit;
    void visit(SceneNode* node) override
    {
        text += node->getName();
        m_change(*node);
    }

    std::string text;

private:
    Change m_change;
};

class Mourned : public SceneNode
{
public:
    Mourned(const char* name, std::string& text) : SceneNode(name), m_text(text) {}
    ~Mourned() override { m_text += getName(); }

private:
    std::string& m_text;
};

} // namespace

// Fault caught: a visitor that removes or moves what it visits, or what is beside or above it, reads nodes that are
// gone, misses others, or never ends. The tree is r with a, b (with x, y), c.
class ChangedWalk : public testing::TestWithParam<FlagMask>
{
protected:
    /// Walks a tree r of a, b (with x and y) and c, whose nodes are changed as they are met.
    /// @return the names that were met, "|", and those that had died by its end, sorted.
    std::string walk(const Changer::Change& change)
    {
        m_root = nullptr;
        m_dead.clear();
        m_root = makeShared<Mourned>("r", m_dead);
        for (const char* name : {"a", "b", "c"})
            makeShared<Mourned>(name, m_dead)->setParent(m_root);
        for (const char* name : {"x", "y"})
            makeShared<Mourned>(name, m_dead)->setParent(m_root->getChild(1));
        Changer changer(
            [&](SceneNode& node)
            {
                change(node);
                EXPECT_EQ("", m_dead) << "while it is walked";
            });
        visitScene(changer, *m_root, GetParam(), GetParam());
        std::string dead = m_dead;
        std::sort(dead.begin(), dead.end());
        return changer.text + "|" + dead;
    }

    void removeChild(unsigned index) { m_root->removeChild(m_root->getChild(index)); }

    void removeAllChildren()
    {
        while (m_root->getChildCount() > 0)
            removeChild(0);
    }

    static bool is(const SceneNode& node, const char* name) { return std::string(name) == node.getName(); }

    std::string m_dead; ///< names, by the destructors
    SharedPtr<SceneNode> m_root;
};

INSTANTIATE_TEST_SUITE_P(, ChangedWalk, testing::Values(FlagMask(), FlagMask(1, 1)),
                         [](const auto& given) { return given.index == 0 ? "all" : "byFlags"; });

TEST_P(ChangedWalk, meetsAllThatStaysAndWhatWasToCome)
{
    EXPECT_EQ("rabxyc|", walk([](SceneNode&) {}));
    EXPECT_EQ("rabxyc|abcxy", walk([](SceneNode& node) { node.setParent(nullptr); }))
        << "each removes itself";
    EXPECT_EQ("rabxyc|",
              walk([](SceneNode& node) { node.setParent(SharedPtr<SceneNode>(node.getParent())); }))
        << "each child moves behind the others";
}

TEST_P(ChangedWalk, leavesOutWhatWasRemoved)
{
    const auto removeBesideB = [this](SceneNode& node)
    {
        if (!is(node, "b"))
            return;
        removeChild(2);
        removeChild(0);
    };
    EXPECT_EQ("rabxy|ac", walk(removeBesideB));
    const auto removeAllAtC = [this](SceneNode& node)
    {
        if (is(node, "c"))
            removeAllChildren();
    };
    EXPECT_EQ("rabxyc|abcxy", walk(removeAllAtC));
    const auto removeAllAtX = [this](SceneNode& node)
    {
        if (is(node, "x"))
            removeAllChildren();
    };
    EXPECT_EQ("rabxy|abcxy", walk(removeAllAtX)) << "its own parent too";
}

TEST_P(ChangedWalk, survivesTheLossOfTheWholeTree)
{
    EXPECT_EQ("rabxyc|abcrxy", walk([this](SceneNode&) { m_root = nullptr; }));
}

TEST_P(ChangedWalk, mayHaveAnotherWalkInIt)
{
    const auto removeEach = [](SceneNode& node)
    {
        Changer inner([](SceneNode& each) { each.setParent(nullptr); });
        visitScene(inner, node);
    };
    EXPECT_EQ("r|abcxy", walk(removeEach));
}
