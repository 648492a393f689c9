#include "orv/scenenode.h"
#include "orv/scenenodevisitor.h"
#include "orv/sceneutil.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <map>
#include <random>

using namespace orv;

namespace
{

/// Calls a function at each node.
class Caller : public SceneNodeVisitor
{
public:
    explicit Caller(std::function<void(SceneNode&)> call) : m_call(std::move(call)) {}

    using SceneNodeVisitor::visit;
    void visit(SceneNode* node) override { m_call(*node); }

private:
    std::function<void(SceneNode&)> m_call;
};

/// Two parents and what they have, as plain lists say.
struct Family
{
    SharedPtr<SceneNode> parents[2] = {makeShared<SceneNode>(), makeShared<SceneNode>()};
    std::vector<SceneNode*> expected[2];
    std::vector<SharedPtr<SceneNode>> nodes;

    /// @param to  2 for none.
    void move(size_t node, int to)
    {
        for (std::vector<SceneNode*>& list : expected)
            list.erase(std::remove(list.begin(), list.end(), nodes[node].get()), list.end());
        nodes[node]->setParent(to < 2 ? parents[to] : nullptr);
        if (to < 2)
            expected[to].push_back(nodes[node].get());
    }
};

} // namespace

// Faults caught: children lost, doubled or in another order after others were taken; a walk that misses one or goes
// twice where others are taken or added meanwhile; a search that finds what is gone.
TEST(ChildList, isWhatAPlainListSays)
{
    std::mt19937 random(3);
    const auto pick = [&random](size_t count) { return size_t(random() % count); };
    Family family;
    for (int i = 0; i < 40; ++i)
        family.nodes.push_back(makeShared<SceneNode>(std::to_string(i).c_str()));
    for (int round = 0; round < 4000; ++round)
    {
        const size_t leaning = size_t(round / 500 % 2); // long lists, then short ones
        for (size_t changes = pick(8); changes > 0; --changes)
            family.move(pick(family.nodes.size()), int(pick(3 + 2 * leaning)));
        const size_t which = pick(2);
        const std::vector<SceneNode*>& expected = family.expected[which];
        SceneNode& parent = *family.parents[which];
        ASSERT_EQ(expected.size(), parent.getChildCount());
        if (pick(3) == 0 && !expected.empty())
        {
            const size_t place = pick(expected.size());
            ASSERT_EQ(expected[place], parent.getChild(unsigned(place)).get());
        }
        if (pick(3) == 0)
        {
            ASSERT_TRUE(std::equal(expected.begin(), expected.end(), parent.getChildren().begin(),
                                   parent.getChildren().end(),
                                   [](SceneNode* a, const SharedPtr<SceneNode>& b) { return a == b.get(); }));
        }
        const size_t sought = pick(family.nodes.size());
        const bool isThere = std::count(expected.begin(), expected.end(), family.nodes[sought].get()) > 0;
        ASSERT_EQ(isThere ? family.nodes[sought].get() : nullptr,
                  parent.find(std::to_string(sought).c_str()));

        // A walk, in the course of which nodes go to the other parent or away: those go on to be met that are left.
        std::map<SceneNode*, int> met;
        const std::vector<SceneNode*> atFirst = expected;
        Caller caller(
            [&](SceneNode& node)
            {
                if (&node == &parent)
                    return;
                ++met[&node];
                const size_t moved = pick(family.nodes.size());
                if (family.nodes[moved]->getParent() == &parent)
                    family.move(moved, pick(2) ? 2 : int(1 - which));
                if (pick(4) == 0 && family.parents[which]->getChildCount() > 0)
                    family.parents[which]->getChildren();
            });
        visitScene(caller, parent);
        for (SceneNode* child : atFirst)
        {
            const bool stayed = std::count(expected.begin(), expected.end(), child) > 0;
            ASSERT_LE(met[child], 1) << round;
            ASSERT_TRUE(!stayed || met[child] == 1) << round;
        }
    }
}
