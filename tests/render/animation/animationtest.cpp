#include "orv/animationchannel.h"
#include "orv/animationcontroller.h"
#include "orv/animationgroup.h"
#include "orv/animationkeysequence.h"
#include "orv/appearance.h"
#include "orv/light.h"
#include "orv/sceneanimators.h"
#include "orv/scenenode.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <limits>

using namespace orv;

namespace
{

constexpr float INF = std::numeric_limits<float>::infinity();
constexpr float NOT_A_NUMBER = std::numeric_limits<float>::quiet_NaN();

/// Ten seconds long unless told otherwise; writes down what it is applied at.
class Recorder : public Animation
{
public:
    explicit Recorder(float start = 0.0f, float end = 10.0f) : m_start(start), m_end(end) {}
    void apply(float progress) override { applied.push_back(progress); }
    float getStart() const override { return m_start; }
    float getEnd() const override { return m_end; }

    std::vector<float> applied;

private:
    float m_start;
    float m_end;
};

} // namespace

// Fault caught: interpolating, a key that is late by one step, or unsorted keys looked up as if sorted.
TEST(Animation, keysAreStepped)
{
    support::LogCapture log;
    const AnimationKeySequence<float> sequence({{2.0f, 20.0f}, {NOT_A_NUMBER, 0.0f}, {1.0f, 10.0f}});
    EXPECT_EQ(1, log.count('W'));
    const struct
    {
        float time, value;
    } cases[] = {{-INF, 10}, {0.5f, 10}, {1.0f, 10}, {1.99f, 10}, {2.0f, 20}, {5.0f, 20}, {INF, 20}};
    for (const auto& c : cases)
        EXPECT_EQ(c.value, sequence.getValue(c.time)) << c.time;
    EXPECT_EQ(1.0f, sequence.getStart());
    EXPECT_EQ(2.0f, sequence.getEnd());

    const AnimationKeySequence<Vector4f> none;
    EXPECT_EQ(Vector4f(), none.getValue(1.0f));
    EXPECT_EQ(0.0f, none.getStart() + none.getEnd());
}

TEST(Animation, groupSpansItsMembers)
{
    AnimationGroup group;
    EXPECT_EQ(0.0f, group.getStart() + group.getEnd());
    const auto late = makeShared<Recorder>(5.0f, 7.0f);
    group.addAnimation(late);
    group.addAnimation(makeShared<Recorder>(2.0f, 6.0f));
    EXPECT_EQ(2.0f, group.getStart());
    EXPECT_EQ(5.0f, getLength(group));
    EXPECT_EQ(0.0f, getLength(Recorder(3.0f, 1.0f)));
    group.apply(4.5f);
    EXPECT_EQ(std::vector<float>{4.5f}, late->applied);

    support::LogCapture log;
    group.addAnimation(nullptr);
    EXPECT_FALSE(group.getAnimation(2));
    EXPECT_EQ(1, log.countMessage("Index 2 exceeds animation count 2."));
}

// Fault caught: a group within itself, which is applied until the stack ends and never dies.
TEST(Animation, groupDoesNotTakeItself)
{
    const auto outer = makeShared<AnimationGroup>();
    const auto middle = makeShared<AnimationGroup>();
    const auto inner = makeShared<AnimationGroup>();
    outer->addAnimation(middle);
    outer->addAnimation(inner);
    middle->addAnimation(inner);
    support::LogCapture log;
    for (const auto& [group, added] :
         {std::pair(outer, outer), std::pair(inner, outer), std::pair(inner, middle)})
        group->addAnimation(added);
    EXPECT_EQ(3, log.count('E')) << log.text();
    EXPECT_EQ(2, outer->getAnimationCount());
    EXPECT_EQ(0, inner->getAnimationCount());
}

// Fault caught: the loop's ends, its entry, or its direction off by one case; an endless loop over huge steps.
TEST(Animation, controllerAdvances)
{
    const struct
    {
        const char* name;
        float loopStart, loopEnd, speed, progress, delta, expected;
    } cases[] = {
        {"speed", 0, 0, -2, 3, 1, 1},
        {"end of range", 0, 0, 1, 9, 5, 10},
        {"start of range", 0, 0, -1, 1, 5, 0},
        {"progress outside is clamped first", 0, 0, 1, 50, -1, 9},
        {"already past the loop", 2, 4, 1, 5, 1, 6},
        {"enters the loop", 2, 4, 1, 1, 1, 2},
        {"enters the loop and wraps", 2, 4, 1, 1, 4, 3},
        {"reaching the end is the start", 2, 4, 1, 3, 1, 2},
        {"from the very end", 2, 4, 1, 4, 1, 3},
        {"backwards reaching the start is the end", 2, 4, -1, 3, 1, 4},
        {"backwards before the loop", 2, 4, -1, 1.5f, 1, 0.5f},
        {"backwards into the loop", 2, 4, -1, 5, 4, 3},
        {"reversed loop is none", 4, 2, 1, 3, 2, 5},
        {"a thousand loops", 2, 4, 1, 3, 2000.5f, 3.5f},
        {"a thousand loops backwards", 2, 4, -1, 3, 2000.5f, 2.5f},
        {"step not a number", 2, 4, 1, 3, NOT_A_NUMBER, 3},
        {"infinite step in a loop", 2, 4, 1, 3, INF, 3},
        {"infinite step", 0, 0, 1, 3, INF, 10},
        {"infinite step backwards", 0, 0, -1, 3, INF, 0},
        {"progress not a number", 0, 0, 1, NOT_A_NUMBER, 1, 1},
    };
    for (const auto& c : cases)
    {
        SCOPED_TRACE(c.name);
        const auto recorder = makeShared<Recorder>();
        AnimationController controller(recorder);
        setLoopRange(controller, c.loopStart, c.loopEnd);
        controller.setSpeed(c.speed);
        controller.setProgress(c.progress);
        controller.update(c.delta);
        EXPECT_EQ(c.expected, controller.getProgress());
        EXPECT_EQ(std::vector<float>{c.expected}, recorder->applied);
    }
}

// Fault caught: an endless loop if the loop range is tiny compared with the step, or below the precision of the
// progress.
TEST(Animation, loopsOfAnySizeEnd)
{
    for (const float size : {1e-30f, 1e-6f, 1e30f})
    {
        for (const float delta : {1e-30f, 1.0f, 3e38f, -3e38f})
        {
            AnimationController controller(makeShared<Recorder>(-1e38f, 1e38f));
            setLoopRange(controller, 0.0f, size);
            controller.update(delta);
            EXPECT_TRUE(controller.getProgress() >= 0.0f && controller.getProgress() <= size)
                << size << ' ' << delta;
        }
    }
}

TEST(Animation, controllerStates)
{
    const auto recorder = makeShared<Recorder>(1.0f, 3.0f);
    AnimationController controller(recorder);
    controller.update(0.5f);
    EXPECT_EQ(1.5f, controller.getProgress()) << "clamped to the start, then advanced";
    pause(controller, true);
    controller.update(1.0f);
    EXPECT_EQ((std::vector<float>{1.5f, 1.5f, 1.5f}), recorder->applied) << "applies while paused";

    play(controller, false);
    controller.update(5.0f);
    EXPECT_TRUE(isFinished(controller));
    play(controller, true);
    EXPECT_EQ(1.0f, controller.getProgress()) << "a finished one starts over";
    seek(controller, 2.0f);
    EXPECT_FALSE(isFinished(controller));

    recorder->applied.clear();
    controller.setSpeed(-1.0f);
    stop(controller, true);
    EXPECT_EQ(std::vector<float>{3.0f}, recorder->applied) << "the rewound frame, once";
    controller.update(1.0f);
    EXPECT_EQ(1u, recorder->applied.size());

    controller.setProgress(1.0f);
    EXPECT_TRUE(isFinished(controller));
    setLoopRange(controller, 1.0f, 2.0f);
    EXPECT_FALSE(isFinished(controller)) << "inside its loop";
    controller.setLooping(false);
    EXPECT_TRUE(isFinished(controller));
    controller.setSpeed(0.0f);
    EXPECT_FALSE(isFinished(controller));
    EXPECT_EQ(1.0f, getLoopLength(controller));
    setRange(controller, 5.0f, 2.0f);
    EXPECT_EQ(0.0f, getLength(controller));
}

TEST(Animation, animatorsWriteTheirTargets)
{
    const auto node = makeShared<SceneNode>();
    SceneNodePositionAnimator(node).apply(Vector3f(1, 2, 3));
    EXPECT_EQ(Vector3f(1, 2, 3), node->getPosition());
    SceneNodeRotationAnimator(node).apply(Vector4f(0, 2, 0, 1.0f));
    EXPECT_EQ(Quaternionf(std::cos(0.5f), 0, 2 * std::sin(0.5f), 0), node->getRotation()) << "axis as stored";

    SceneNodeScaleAnimator scale(node);
    scale.apply(Vector3f(1, 1, 1));
    scale.apply(Vector3f(2, 2, 2));
    node->setScale(Vector3f(1, 1, 1));
    scale.apply(Vector3f(2, 2, 2));
    EXPECT_EQ(Vector3f(1, 1, 1), node->getScale()) << "an unchanged value is not written again";

    const auto appearance = makeShared<Appearance>();
    AppearancePropertyAnimator<float> opacity(appearance, "M_OPACITY");
    float value = 0.0f;
    for (const float written : {0.25f, 0.75f})
    {
        opacity.apply(written);
        ASSERT_TRUE(appearance->getPropertyUniform("M_OPACITY")->getValue(value, 0));
        EXPECT_EQ(written, value);
        appearance->addProperty<float>("M_OPACITY", 2); // replaced: the remembered property is stale
    }
}

// Fault caught: a channel or animator that lacks an end crashing instead of being skipped.
TEST(Animation, whatIsMissingIsLoggedAndSkipped)
{
    const auto value = makeShared<AnimationKeySequence<Colour4f>>();
    const auto animator = makeShared<LightColourAnimator>(makeShared<Light>());
    const std::pair<const char*, Animation::Ptr> cases[] = {
        {"AnimatedValue", createAnimationChannel<Colour4f>(nullptr, animator)},
        {"Animator", createAnimationChannel<Colour4f>(value, nullptr)},
        {"Light", createAnimationChannel<Colour4f>(value, makeShared<LightColourAnimator>(nullptr))},
    };
    for (const auto& [missing, animation] : cases)
    {
        support::LogCapture log;
        animation->apply(1.0f);
        EXPECT_EQ(1, log.countMessage(std::string("Error: pointer operator on null. class: ") + missing));
        EXPECT_EQ(0.0f, animation->getEnd());
    }
    AnimationController(nullptr).update(1.0f);
}
