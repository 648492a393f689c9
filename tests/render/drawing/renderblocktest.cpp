#include "scenetest.h"

#include "glcalls/glcalls.h"
#include "orv/mesh.h"
#include "orv/motionblurrenderer.h"
#include "orv/renderblockgroup.h"
#include "orv/shadowmap.h"

#include <GLES2/gl2.h>

#include <functional>
#include <limits>
#include <string>
#include <utility>
#include <vector>

using namespace orv;

using RenderBlockTest = SceneTest;

// Fault caught: a clear that the last draw's masks or scissor box cut short.
TEST_F(RenderBlockTest, clearsWhateverTheLastDrawLeftBehind)
{
    const auto appearance = makePaint(Colour4f::RED);
    appearance->setScissorTestEnabled(true);
    appearance->setScissorBox(0, 0, 8, 8);
    appearance->setColourMask(true, false, false, false);
    appearance->setDepthWriteEnabled(false);
    addSquare(Vector3f(), 20.0f, appearance);
    RenderBlock block(renderer, scene, camera);
    block.setBackgroundColour(Colour4f(0, 1, 0, 1));
    block.render();
    block.setBackgroundColour(Colour4f(0, 0, 0, 1));
    block.render();
    const support::Picture frame = support::readFrame();
    EXPECT_EQ(RED, frame.pixel(2, 61));
    EXPECT_EQ(BLACK, frame.pixel(40, 20));
}

TEST_F(RenderBlockTest, keepsBuffersThatItIsNotToClear)
{
    addSquare(Vector3f(0, 0, 0), 20.0f, makePaint(Colour4f::RED));
    const auto group = makeShared<RenderBlockGroup>();
    const auto first = makeShared<RenderBlock>(renderer, scene, camera);
    const auto other = makeShared<SceneNode>();
    addSquare(Vector3f(0, 0, -1), 40.0f, makePaint(Colour4f::GREEN))->setParent(other);
    const auto second = makeShared<RenderBlock>(renderer, other, camera);
    second->setBackgroundColour(Colour4f(0, 0, 1, 1));
    second->setColourClear(false);
    group->addBlock(first);
    group->addBlock(second);

    second->setDepthClear(false);
    group->render();
    EXPECT_EQ(RED, support::readFrame().pixel(32, 32)) << "the second scene is behind the first";
    second->setDepthClear(true);
    group->render();
    EXPECT_EQ(GREEN, support::readFrame().pixel(32, 32));

    group->removeBlock(second);
    group->render();
    EXPECT_EQ(RED, support::readFrame().pixel(32, 32));
    group->setStereo(9.0f, 0.0f);
    EXPECT_EQ(9.0f, camera->getStereoFocalDistance());
}

// Fault caught: a group within itself, which is drawn until the stack ends and never dies.
TEST_F(RenderBlockTest, groupDoesNotTakeItself)
{
    const auto outer = makeShared<RenderBlockGroup>();
    const auto inner = makeShared<RenderBlockGroup>();
    outer->addBlock(inner);
    support::LogCapture log;
    outer->addBlock(outer);
    inner->addBlock(outer);
    EXPECT_EQ(2, log.count('E')) << log.text();
    outer->render();
}

// Faults caught: a crash, or the next block left out, where a block removes itself or blocks before it.
TEST_F(RenderBlockTest, groupOutlivesTheRemovalOfItsBlocks)
{
    struct Block : RenderBlockBase
    {
        explicit Block(std::function<void()> callback) : happen(std::move(callback)) {}
        void render() override { happen(); }
        void update(float) override { happen(); }
        void setStereo(float, float) override { happen(); }
        std::function<void()> happen;
    };
    std::string drawn;
    auto group = makeShared<RenderBlockGroup>();
    const auto write = [&](char letter) { return makeShared<Block>([&drawn, letter] { drawn += letter; }); };
    const SharedPtr<RenderBlockBase> first = write('a');
    const SharedPtr<RenderBlockBase> later = write('e');
    const SharedPtr<RenderBlockBase> once = makeShared<Block>(
        [&]
        {
            drawn += 'b';
            group->removeBlock(once);
            for (int i = 0; i < 9; ++i)
                group->addBlock(write('+'));
        });
    group->addBlock(first);
    group->addBlock(once);
    group->addBlock(write('c'));
    const SharedPtr<RenderBlockBase> sweeper = makeShared<Block>(
        [&]
        {
            for (const auto& block : {first, once, sweeper, later})
                group->removeBlock(block);
        });
    group->addBlock(sweeper);
    group->addBlock(write('d'));
    group->addBlock(later);
    group->addBlock(makeShared<Block>([&] { group = nullptr; }));
    group->addBlock(write('f'));
    group->render();
    EXPECT_EQ("abcdf", drawn);
    EXPECT_EQ(1, once->sharedGetCount());
}

// Faults caught: solids or a light looked at that died when a node of the program's own removed them from the scene; a
// material, program or mesh looked for in a solid that such a node has emptied, or what was drawn before in its place.
TEST_F(RenderBlockTest, nodesMayTakeOthersAwayWhenTheyAreVisited)
{
    struct Taker : SceneNode
    {
        NodeType getNodeType() const override { return 100; }
        void accept(SceneNodeVisitor&) override
        {
            for (int i = 0; i < 3; ++i)
                take(*solids[i]);
        }
        Solid* solids[4];
        std::function<void(Solid&)> take;
    };
    const auto simple = makeShared<SimpleRenderer>(renderContext, pool);
    const auto culled = makeShared<SimpleRenderer>(renderContext, pool);
    culled->setCulled(true);
    culled->setOpaqueGrouped(true);
    const auto blurring = makeShared<MotionBlurRenderer>(renderContext, pool);
    const auto shadows = makeShared<ShadowMap>(renderContext, pool, 64);
    const std::function<void(SceneNode&)> uses[] = {
        [&](SceneNode& top) { simple->render(camera.get(), top, {}, {}); },
        [&](SceneNode& top) { culled->render(camera.get(), top, {}, {}); },
        [&](SceneNode& top) { blurring->render(camera.get(), top, {}, {}); },
        [&](SceneNode& top) { shadows->render(top, camera.get()); }};
    const auto removeAll = [](Solid& solid)
    {
        SceneNode* const top = solid.getParent();
        while (top && top->getChildCount() > 1)
            top->removeChild(top->getChild(0));
    };
    const auto takeProgram = [](Solid& solid)
    {
        if (solid.getAppearance())
            solid.getAppearance()->setShaderProgram(nullptr);
    };
    const std::function<void(Solid&)> ways[] = {[](Solid& solid) { solid.setAppearance(nullptr); },
                                                [](Solid& solid) { solid.setMesh(nullptr); }, takeProgram,
                                                removeAll};
    std::vector<uint64_t> draws;
    for (const auto& use : uses)
    {
        for (const auto& way : ways)
        {
            const auto top = makeShared<SceneNode>();
            const auto taker = makeShared<Taker>();
            const auto transparent = makePaint(Colour4f::RED);
            transparent->setBlendFactors(BlendFactor::ONE, BlendFactor::ONE, BlendFactor::ONE,
                                         BlendFactor::ONE);
            const SharedPtr<Appearance> materials[] = {makePaint(Colour4f::RED), transparent, makeMirror(),
                                                       makePaint(Colour4f::GREEN)};
            for (int i = 0; i < 4; ++i)
            {
                const auto solid = createCube(*pool, Vector2f(1, 1));
                solid->setAppearance(materials[i]);
                solid->setParent(top);
                taker->solids[i] = solid.get();
            }
            taker->take = way;
            const auto sun = makeShared<Light>();
            sun->setLightType(Light::LightType::DIRECTIONAL);
            sun->setParent(top);
            taker->setParent(top);
            glcalls::resetCounts();
            use(*top);
            draws.push_back(glcalls::count(glDrawElements));
            EXPECT_EQ(sun->getParent() ? 2 : 1, sun->sharedGetCount());
        }
    }
    // The last cube is whole. An empty mirror still reflects it; velocities need no material; what was removed after it
    // was met is drawn this once, three cubes in the mirror too.
    EXPECT_EQ((std::vector<uint64_t>{1, 2, 2, 4 + 3, 1, 2, 2, 4 + 3, 4, 1, 4, 4, 1, 1, 1, 2}), draws);
}

// Faults caught: a view that clears the views beside it, or leaves the box that it cleared in for the next draws.
TEST_F(RenderBlockTest, clearsItsViewportAloneWhenTold)
{
    addSquare(Vector3f(), 1.0f, makePaint(Colour4f::RED));
    RenderBlock whole(renderer, nullptr, camera);
    whole.setBackgroundColour(Colour4f::BLUE);
    RenderBlock inset(renderer, scene, camera);
    inset.setBackgroundColour(Colour4f::GREEN);
    inset.setViewport(32, 0, 32, 16);
    for (const bool only : {true, false})
    {
        inset.getBackground().setViewportOnly(only);
        whole.render();
        inset.render();
        const support::Picture frame = support::readFrame();
        EXPECT_EQ(only ? BLUE : GREEN, frame.pixel(10, 10));
        EXPECT_EQ(only ? BLUE : GREEN, frame.pixel(31, 60));
        EXPECT_EQ(GREEN, frame.pixel(33, 49));
        EXPECT_EQ(RED, frame.pixel(48, 56));
    }

    support::LogCapture log;
    inset.setViewport(0, 0, -4, 4);
    whole.getBackground().setDepth(std::numeric_limits<float>::quiet_NaN());
    EXPECT_EQ(2, log.count('E'));
    inset.render();
    EXPECT_EQ(RED, support::readFrame().pixel(48, 56)) << "the old viewport";
    EXPECT_EQ(1.0f, whole.getBackground().getDepth());
}

// Faults caught: what is below a hidden node still drawn; a layer that shows what is not in it, or hidden.
TEST_F(RenderBlockTest, leavesOutWhatIsHiddenAndWhatIsInOtherLayers)
{
    const FlagMask layer(1);
    const auto group = makeShared<SceneNode>();
    group->setParent(scene);
    const auto red = addSquare(Vector3f(-1.5f, 0, 0), 1.0f, makePaint(Colour4f::RED));
    const auto green = addSquare(Vector3f(1.5f, 0, 0), 1.0f, makePaint(Colour4f::GREEN));
    green->setParent(group);
    RenderBlock block(renderer, scene, camera);
    block.setBackgroundColour(Colour4f::BLACK);
    const struct
    {
        FlagMask flags;
        SceneNode* hidden;
        SceneNode* inLayer;
        bool redSeen, greenSeen;
    } cases[] = {
        {SceneNode::VISIBLE, nullptr, nullptr, true, true},
        {SceneNode::VISIBLE, group.get(), nullptr, true, false},
        {SceneNode::VISIBLE, red.get(), nullptr, false, true},
        {SceneNode::VISIBLE, scene.get(), nullptr, false, false},
        {FlagMask(), group.get(), nullptr, true, true},
        {layer, nullptr, group.get(), false, true},
        {layer, nullptr, nullptr, false, false},
        {FlagMask(SceneNode::VISIBLE.mask | 1, SceneNode::VISIBLE.inverted), green.get(), scene.get(), true,
         false},
        {FlagMask(SceneNode::VISIBLE.mask | 1, SceneNode::VISIBLE.inverted), group.get(), green.get(), false,
         false},
    };
    for (const auto& c : cases)
    {
        for (SceneNode* node : {scene.get(), group.get(), static_cast<SceneNode*>(red.get()),
                                static_cast<SceneNode*>(green.get())})
        {
            node->setVisible(node != c.hidden);
            EXPECT_EQ(node != c.hidden, node->isVisible());
            setFlags(*node, layer, node == c.inLayer);
        }
        block.setRenderFlags(c.flags);
        block.render();
        const support::Picture frame = support::readFrame();
        EXPECT_EQ(c.redSeen ? RED : BLACK, frame.pixel(16, 32)) << &c - cases;
        EXPECT_EQ(c.greenSeen ? GREEN : BLACK, frame.pixel(48, 32)) << &c - cases;
    }
}

// Fault caught: a block that draws nothing, or into a corner, because it was given no viewport.
TEST_F(RenderBlockTest, drawsToTheWholeTargetUnlessTold)
{
    addSquare(Vector3f(), 100.0f, makePaint(Colour4f::RED));
    RenderBlock block(renderer, scene, camera);
    RenderBlock inset(renderer, nullptr, camera);
    inset.setViewport(0, 32, 32, 32);
    inset.render();
    block.render();
    EXPECT_EQ(RED, support::readFrame().average()) << "although the inset left its viewport behind";

    const SharedPtr<RenderTarget> target = makeTarget(128, 16);
    block.setRenderTarget(target);
    glcalls::startRecording();
    block.render();
    EXPECT_EQ(std::vector<std::string>{"glViewport(0, 0, 128, 16)"}, glcalls::recorded("glViewport"));
    EXPECT_EQ(0u, RenderTarget::getBoundFramebuffer());
    target->enable();
    EXPECT_EQ(RED, support::readFramebuffer(0, 0, 128, 16).average());
    target->disable();

    RenderBlock(nullptr, nullptr, nullptr).render();
}
