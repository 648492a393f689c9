#include "orv/animationchannel.h"
#include "orv/animationcontroller.h"
#include "orv/animationgroup.h"
#include "orv/animationkeysequence.h"
#include "orv/appearance.h"
#include "orv/light.h"
#include "orv/sceneanimators.h"
#include "orv/scenenode.h"

#include "support/allocation.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <functional>
#include <limits>
#include <map>
#include <random>
#include <string>

using namespace orv;

namespace
{

constexpr float INF = std::numeric_limits<float>::infinity();
constexpr float NOT_A_NUMBER = std::numeric_limits<float>::quiet_NaN();

template <class T, class SomeAnimator, class Target>
Animation::Ptr makeChannel(std::vector<AnimationKey<T>> keys, const SharedPtr<Target>& target)
{
    return createAnimationChannel<T>(makeShared<AnimationKeySequence<T>>(std::move(keys)),
                                     makeShared<SomeAnimator>(target));
}

Animation::Ptr makeMove(std::vector<AnimationKey<Vector3f>> keys, const SceneNode::Ptr& node)
{
    return makeChannel<Vector3f, SceneNodePositionAnimator>(std::move(keys), node);
}

Animation::Ptr makeTurn(std::vector<AnimationKey<Vector4f>> keys, const SceneNode::Ptr& node)
{
    return makeChannel<Vector4f, SceneNodeRotationAnimator>(std::move(keys), node);
}

Animation::Ptr makeStay(const Vector3f& place, const SceneNode::Ptr& node)
{
    return makeMove({{0.0f, place}, {100.0f, place}}, node);
}

float applyAt(const Animation::Ptr& animation, float time, const SceneNode& node)
{
    AnimationController controller(animation);
    controller.setInterpolated(true);
    setRange(controller, -INF, INF);
    seek(controller, time);
    return node.getPosition().x;
}

/// A rotation in double, as a matrix, independent of the engine's method.
using Rotation = std::array<std::array<double, 3>, 3>;

Rotation rotate(const std::array<double, 3>& axis, double angle)
{
    const double c = std::cos(angle), s = std::sin(angle);
    Rotation r{};
    for (size_t i = 0; i < 3; ++i)
    {
        for (size_t k = 0; k < 3; ++k)
            r[i][k] += axis[i] * axis[k] * (1.0 - c) + (i == k ? c : 0.0);
        r[i][(i + 1) % 3] -= axis[(i + 2) % 3] * s;
        r[(i + 1) % 3][i] += axis[(i + 2) % 3] * s;
    }
    return r;
}

Rotation multiply(const Rotation& a, const Rotation& b)
{
    Rotation r{};
    for (size_t i = 0; i < 3; ++i)
        for (size_t k = 0; k < 3; ++k)
            for (size_t j = 0; j < 3; ++j)
                r[i][k] += a[i][j] * b[j][k];
    return r;
}

Rotation transpose(const Rotation& a)
{
    Rotation r{};
    for (size_t i = 0; i < 3; ++i)
        for (size_t k = 0; k < 3; ++k)
            r[i][k] = a[k][i];
    return r;
}

/// The rotation from a to b, of which a share is done.
Rotation goFromTo(const Rotation& a, const Rotation& b, double share)
{
    const Rotation way = multiply(transpose(a), b);
    const std::array<double, 3> twice = {way[2][1] - way[1][2], way[0][2] - way[2][0], way[1][0] - way[0][1]};
    const double sine = std::sqrt(twice[0] * twice[0] + twice[1] * twice[1] + twice[2] * twice[2]);
    const double angle = std::atan2(sine, way[0][0] + way[1][1] + way[2][2] - 1.0);
    return multiply(a, rotate({twice[0] / sine, twice[1] / sine, twice[2] / sine}, angle * share));
}

double findDifference(const Rotation& wanted, const SceneNode& node)
{
    double most = 0.0;
    for (size_t column = 0; column < 3; ++column)
    {
        const Vector4f& v = node.getLocalTransform().columns[column];
        const double values[] = {double(v.x), double(v.y), double(v.z)};
        for (size_t row = 0; row < 3; ++row)
            most = std::max(most, std::fabs(values[row] - wanted[row][column]));
    }
    return most;
}

} // namespace

// Faults caught: steps left in, a share that is off at the ends, keys of one time, and what is no number spreading.
TEST(SmoothMotion, positionsGoStraight)
{
    const auto node = makeShared<SceneNode>();
    const Animation::Ptr animation = makeMove({{1, {10, 0, 0}},
                                               {2, {20, 0, 0}},
                                               {4, {20, 0, 0}},
                                               {4, {-6, 0, 0}},
                                               {5, {0.1f, 0, 0}},
                                               {7, {0.1f, 0, 0}},
                                               {8, {-3e38f, 0, 0}},
                                               {9, {3e38f, 0, 0}},
                                               {10, {INF, 0, 0}},
                                               {11, {1, 0, 0}},
                                               {12, {NOT_A_NUMBER, 0, 0}},
                                               {13, {2, 0, 0}},
                                               {INF, {4, 0, 0}}},
                                              node);
    const struct
    {
        float time, x;
    } cases[] = {{-INF, 10},   {0.0f, 10}, {1.0f, 10},    {1.25f, 12.5f}, {1.5f, 15},
                 {2.0f, 20},   {3.0f, 20}, {3.99f, 20},   {4.0f, -6},     {5.0f, 0.1f},
                 {6.3f, 0.1f}, {8.5f, 0},  {9.5f, 3e38f}, {10.0f, INF},   {10.5f, INF},
                 {11.0f, 1},   {11.9f, 1}, {13.0f, 2},    {1e9f, 2},      {INF, 4}};
    for (const auto& c : cases)
        EXPECT_EQ(c.x, applyAt(animation, c.time, *node)) << c.time;
    EXPECT_TRUE(std::isnan(applyAt(animation, 12.5f, *node)));

    AnimationController stepped(animation);
    seek(stepped, 1.5f);
    EXPECT_EQ(10.0f, node->getPosition().x) << "who does not ask";
    stepped.setInterpolated(true);
    seek(stepped, 1.5f);
    EXPECT_EQ(15.0f, node->getPosition().x);
    stepped.setInterpolated(false);
    seek(stepped, 1.5f);
    EXPECT_EQ(10.0f, node->getPosition().x);
    applyAt(makeMove({{-INF, {7, 0, 0}}, {1, {9, 0, 0}}}, node), 0.0f, *node);
    EXPECT_EQ(7.0f, node->getPosition().x);
}

// Fault caught: rotations that go the long way, faster in the middle, or leave unit length.
TEST(SmoothMotion, rotationsTurnTheShortWay)
{
    const auto node = makeShared<SceneNode>();
    std::mt19937 random(4);
    std::uniform_real_distribution<float> any(-1.0f, 1.0f);
    for (int i = 0; i < 2000; ++i)
    {
        Vector4f keys[2];
        Rotation turns[2];
        for (int k = 0; k < 2; ++k)
        {
            Vector3f axis(any(random), any(random), any(random));
            axis = normalize(axis);
            // Near each other, anywhere, and several times round: the sign of a key's quaternion is arbitrary.
            keys[k] = Vector4f(axis.x, axis.y, axis.z, any(random) * (i % 3 == 0 ? 0.001f : 9.0f));
            turns[k] = rotate({double(axis.x), double(axis.y), double(axis.z)}, double(keys[k].w));
        }
        const Animation::Ptr animation = makeTurn({{0, keys[0]}, {1, keys[1]}}, node);
        const Rotation way = multiply(transpose(turns[0]), turns[1]);
        if (way[0][0] + way[1][1] + way[2][2] < -0.999)
            continue; // half a turn: both ways are right
        for (const float share : {0.0f, 0.125f, 0.5f, 0.875f, 1.0f})
        {
            applyAt(animation, share, *node);
            ASSERT_LT(findDifference(goFromTo(turns[0], turns[1], double(share)), *node), 3e-6)
                << i << ' ' << share;
        }
    }
}

// Fault caught: half a turn, keys that are the same rotation in other signs, axes of no length: anything but numbers.
TEST(SmoothMotion, rotationsWithoutAWayHold)
{
    const auto node = makeShared<SceneNode>();
    const struct
    {
        Vector4f from, to;
        float mostAngle; ///< degrees from the first key, half way
    } cases[] = {
        {{0, 0, 1, 0}, {0, 0, 1, 3.14159265f}, 90.1f}, {{0, 0, 1, 1}, {0, 0, 1, 1 + 6.2831853f}, 0.1f},
        {{0, 0, 1, 1}, {0, 0, -1, -1}, 0.1f},          {{0, 0, 1, 0.5f}, {NOT_A_NUMBER, 0, 1, 0.5f}, 0.1f},
        {{0, 0, 1, 0.5f}, {0, 0, 1, INF}, 0.1f},
    };
    for (const auto& c : cases)
    {
        AnimationController controller(makeTurn({{0, c.from}, {2, c.to}}, node));
        controller.setInterpolated(true);
        seek(controller, 0.0f);
        const Quaternionf first = node->getRotation();
        seek(controller, 1.0f);
        const Quaternionf q = node->getRotation();
        const float cosine = first.a * q.a + first.x * q.x + first.y * q.y + first.z * q.z;
        EXPECT_NEAR(1.0f, q.a * q.a + q.x * q.x + q.y * q.y + q.z * q.z, 1e-5f) << toString(c.to);
        EXPECT_LT(2.0f * std::acos(std::min(std::fabs(cosine), 1.0f)) * 57.29578f, c.mostAngle)
            << toString(c.to);
    }
}

// Fault caught: a kind of target that steps, or is taken for another one of its node.
TEST(SmoothMotion, everyKindOfTargetMixes)
{
    const auto light = makeShared<Light>();
    light->setColour(Colour4f(0, 0, 0, 0));
    light->setIntensity(0.0f);
    light->setScale(Vector3f());
    const auto appearance = makeShared<Appearance>();
    appearance->setProperty<float>("M_OPACITY", 0.0f, 0);
    appearance->setProperty<Vector4f>("M_DIFFUSE_COLOUR", Vector4f(), 0);
    const auto group = makeShared<AnimationGroup>();
    group->addAnimation(makeMove({{0, {}}, {1, {8, 8, 8}}}, light));
    group->addAnimation(
        makeChannel<Vector3f, SceneNodeScaleAnimator>({{0, {}}, {1, {8, 8, 8}}}, SceneNode::Ptr(light)));
    group->addAnimation(makeChannel<Colour4f, LightColourAnimator>({{0, {}}, {1, {8, 8, 8, 8}}}, light));
    group->addAnimation(makeChannel<float, LightIntensityAnimator>({{0, 0}, {1, 8}}, light));
    const auto opacity =
        makeShared<AnimationKeySequence<float>>(std::vector<AnimationKey<float>>{{0, 0}, {1, 8}});
    group->addAnimation(createAnimationChannel<float>(
        opacity, makeShared<AppearancePropertyAnimator<float>>(appearance, "M_OPACITY")));
    const auto colour = makeShared<AnimationKeySequence<Vector4f>>(
        std::vector<AnimationKey<Vector4f>>{{0, {}}, {1, {8, 8, 8, 8}}});
    group->addAnimation(createAnimationChannel<Vector4f>(
        colour, makeShared<AppearancePropertyAnimator<Vector4f>>(appearance, "M_DIFFUSE_COLOUR")));

    AnimationController controller(group);
    controller.setInterpolated(true);
    for (const float weight : {0.5f, 1.0f, 0.25f})
    {
        controller.setWeight(weight);
        seek(controller, 0.5f);
        const float wanted = 4.0f * weight;
        EXPECT_EQ(Vector3f(wanted, wanted, wanted), light->getPosition());
        EXPECT_EQ(Vector3f(wanted, wanted, wanted), light->getScale());
        EXPECT_EQ(Colour4f(wanted, wanted, wanted, wanted), light->getColour());
        EXPECT_EQ(wanted, light->getIntensity());
        float opacityNow = -1.0f;
        Vector4f colourNow;
        EXPECT_TRUE(appearance->getPropertyUniform("M_OPACITY")->getValue(opacityNow, 0));
        EXPECT_TRUE(appearance->getPropertyUniform("M_DIFFUSE_COLOUR")->getValue(colourNow, 0));
        EXPECT_EQ(wanted, opacityNow);
        EXPECT_EQ(Vector4f(wanted, wanted, wanted, wanted), colourNow);
    }
}

// Fault caught: a plain controller below a mixing one whose scale is taken for unchanged.
TEST(SmoothMotion, aPlainControllerWritesScalesAgain)
{
    const auto node = makeShared<SceneNode>();
    const auto animation =
        makeChannel<Vector3f, SceneNodeScaleAnimator>({{0, {1, 1, 1}}, {1, {5, 5, 5}}}, node);
    AnimationController below(animation), above(animation);
    above.setProgress(1.0f);
    above.setWeight(0.5f);
    for (int i = 0; i < 3; ++i)
    {
        below.update(0.0f);
        EXPECT_EQ(1.0f, node->getScale().x);
        above.update(0.0f);
        EXPECT_EQ(3.0f, node->getScale().x) << i;
    }
}

// Fault caught: a weight that creeps towards the animation frame by frame, or forgets what was there before.
TEST(SmoothMotion, weightsMixWithWhatIsThere)
{
    const auto node = makeShared<SceneNode>();
    node->setPosition(Vector3f(2, 0, 0));
    AnimationController controller(makeStay(Vector3f(10, 0, 0), node));
    controller.setWeight(0.0f);
    controller.update(0.1f);
    EXPECT_EQ(2.0f, node->getPosition().x);
    controller.fadeWeight(1.0f, 2.0f);
    const float coming[] = {4, 6, 8, 10, 10};
    for (const float x : coming)
    {
        EXPECT_EQ(x < 10.0f || node->getPosition().x < 10.0f, controller.isFading());
        controller.update(0.5f);
        EXPECT_EQ(x, node->getPosition().x);
    }
    controller.fadeWeight(0.0f, 4.0f);
    controller.update(1.0f);
    EXPECT_EQ(8.0f, node->getPosition().x);
    pause(controller, false);
    controller.update(1.0f);
    EXPECT_EQ(8.0f, node->getPosition().x) << "paused";
    play(controller, false);
    controller.fadeWeight(0.25f, 1.0f); // from where it is
    controller.update(0.5f);
    EXPECT_EQ(6.0f, node->getPosition().x);
    controller.fadeWeight(0.0f, -1.0f);
    controller.update(0.5f);
    EXPECT_EQ(2.0f, node->getPosition().x) << "what was there before";
    node->setPosition(Vector3f(3, 0, 0));
    controller.update(0.5f);
    EXPECT_EQ(3.0f, node->getPosition().x) << "without weight it writes nothing";
    controller.setWeight(0.5f);
    controller.update(0.5f);
    EXPECT_EQ(6.5f, node->getPosition().x);
    node->setPosition(Vector3f(4, 0, 0));
    controller.update(0.5f);
    EXPECT_EQ(7.0f, node->getPosition().x) << "over what somebody wrote";
    for (const float weight : {NOT_A_NUMBER, -2.0f, 3.0f})
    {
        controller.setWeight(weight);
        EXPECT_EQ(weight > 1.0f ? 1.0f : 0.0f, controller.getWeight());
    }
}

// Fault caught: the arm's clip on the legs, or on nothing; a limb that changes its place in the tree.
TEST(SmoothMotion, aClipPlaysOnASubtree)
{
    const auto body = makeShared<SceneNode>();
    std::map<std::string, SceneNode::Ptr> nodes;
    const auto walk = makeShared<AnimationGroup>(), wave = makeShared<AnimationGroup>();
    for (const char* name : {"leg", "arm", "hand"})
    {
        nodes[name] = makeShared<SceneNode>(name);
        nodes[name]->setParent(std::string(name) == "hand" ? nodes["arm"] : body);
        walk->addAnimation(makeStay(Vector3f(1, 0, 0), nodes[name]));
        wave->addAnimation(makeStay(Vector3f(2, 0, 0), nodes[name]));
    }
    const auto appearance = makeShared<Appearance>();
    appearance->setProperty<float>("M_OPACITY", 1.0f, 0);
    wave->addAnimation(createAnimationChannel<float>(
        makeShared<AnimationKeySequence<float>>(std::vector<AnimationKey<float>>{{0, 0.5f}}),
        makeShared<AppearancePropertyAnimator<float>>(appearance, "M_OPACITY")));
    AnimationController walking(walk), waving(wave);
    waving.setSubtree(nodes["arm"]);
    const auto expect = [&](float leg, float arm, float hand)
    {
        walking.update(0.1f);
        waving.update(0.1f);
        EXPECT_EQ(leg, nodes["leg"]->getPosition().x);
        EXPECT_EQ(arm, nodes["arm"]->getPosition().x);
        EXPECT_EQ(hand, nodes["hand"]->getPosition().x);
    };
    expect(1, 2, 2);
    waving.setWeight(0.5f);
    expect(1, 1.5f, 1.5f);
    nodes["hand"]->setParent(body);
    expect(1, 1.5f, 1);
    float opacity = 0.0f;
    appearance->getPropertyUniform("M_OPACITY")->getValue(opacity, 0);
    EXPECT_EQ(1.0f, opacity);
    waving.setSubtree(nullptr);
    expect(1.5f, 1.5f, 1.5f);
}

namespace
{

/// A naive model of fades: every clip ever faded to, with its share of the whole.
class NaiveFades
{
public:
    struct Clip
    {
        float place;
        double covers;  ///< of what came before
        double seconds; ///< that its fade takes
    };

    void fadeTo(float place, double seconds)
    {
        if (!(seconds > 0.0))
            m_clips.clear();
        m_clips.push_back({place, m_clips.empty() ? 1.0 : 0.0, seconds});
    }

    void advance(double seconds)
    {
        for (Clip& clip : m_clips)
            clip.covers = clip.covers >= 1.0 ? 1.0 : std::min(clip.covers + seconds / clip.seconds, 1.0);
    }

    double getPlace() const
    {
        double place = 0.0;
        for (const Clip& clip : m_clips)
            place += (double(clip.place) - place) * clip.covers;
        return place;
    }

    /// How many can be seen.
    int count() const
    {
        int seen = 0;
        for (const Clip& clip : m_clips)
            seen = clip.covers >= 1.0 ? 1 : seen + 1;
        return seen;
    }

private:
    std::vector<Clip> m_clips;
};

} // namespace

// Faults caught: a jump where a fade meets another fade, an old clip that stops, shares that do not add up.
TEST(SmoothMotion, fadesEqualNaiveOnes)
{
    std::mt19937 random(7);
    std::uniform_real_distribution<float> any(0.0f, 1.0f);
    for (int run = 0; run < 200; ++run)
    {
        const auto node = makeShared<SceneNode>();
        std::vector<Animation::Ptr> clips;
        for (int i = 0; i < 5; ++i)
            clips.push_back(makeStay(Vector3f(float(i * i), 0, 0), node));
        AnimationController controller(clips[1]);
        controller.update(0.0f);
        NaiveFades naive;
        naive.fadeTo(1.0f, 0.0);
        for (int frame = 0; frame < 100; ++frame)
        {
            if (any(random) < 0.1f && naive.count() < 4)
            {
                const int clip = int(any(random) * 5.0f) % 5;
                const float seconds = any(random) < 0.2f ? 0.0f : any(random);
                controller.fadeTo(clips[size_t(clip)], 0.0f, 100.0f, seconds);
                naive.fadeTo(float(clip * clip), double(seconds));
            }
            const float step = any(random) * 0.1f;
            controller.update(step);
            naive.advance(double(step));
            ASSERT_NEAR(naive.getPlace(), double(node->getPosition().x), 1e-4) << run << ' ' << frame;
        }
    }
}

// Faults caught: an old clip that stands still while it fades, loses its loop, or takes the new one's time.
TEST(SmoothMotion, theOldClipPlaysOn)
{
    const auto node = makeShared<SceneNode>();
    const Animation::Ptr all =
        makeMove({{0, {0, 0, 0}}, {4, {4, 0, 0}}, {10, {100, 0, 0}}, {20, {200, 0, 0}}}, node);
    AnimationController controller(all);
    controller.setInterpolated(true);
    setRange(controller, 0.0f, 4.0f);
    setLoopRange(controller, 0.0f, 4.0f);
    seek(controller, 2.0f);
    controller.fadeTo(10.0f, 20.0f, 4.0f);
    EXPECT_EQ(10.0f, controller.getStart());
    EXPECT_EQ(20.0f, controller.getLoopEnd());
    const float expected[] = {3 * 0.75f + 110 * 0.25f, 0 * 0.5f + 120 * 0.5f, 1 * 0.25f + 130 * 0.75f, 140,
                              150};
    for (const float x : expected)
    {
        controller.update(1.0f);
        EXPECT_FLOAT_EQ(x, node->getPosition().x);
    }
    EXPECT_FALSE(controller.isFading());
    controller.fadeTo(nullptr, 0.0f, 4.0f, 1.0f);
    controller.update(0.5f);
    EXPECT_FLOAT_EQ(155.0f, node->getPosition().x) << "nothing to fade to: the old one goes on";
    controller.fadeTo(all, 0.0f, 4.0f, 1.0f);
    stop(controller, true);
    EXPECT_FALSE(controller.isFading());
    EXPECT_FLOAT_EQ(0.0f, node->getPosition().x) << "a stopped one shows its start alone";
}

// Fault caught: shares of clips and weight multiplied in the wrong order, so that the base has too much or too little
// share.
TEST(SmoothMotion, fadesHappenAtAWeight)
{
    const auto node = makeShared<SceneNode>();
    node->setPosition(Vector3f(100, 0, 0));
    AnimationController controller(makeStay(Vector3f(10, 0, 0), node));
    controller.setWeight(0.5f);
    controller.update(0.1f);
    EXPECT_FLOAT_EQ(55.0f, node->getPosition().x);
    controller.fadeTo(makeStay(Vector3f(20, 0, 0), node), 0.0f, 100.0f, 1.0f);
    for (const float share : {0.25f, 0.5f, 0.75f, 1.0f, 1.0f})
    {
        controller.update(0.25f);
        EXPECT_FLOAT_EQ(50.0f + 0.5f * (10.0f + 10.0f * share), node->getPosition().x) << share;
    }
}

// Faults caught: an unlimited number of clips, a jump when one is dropped, a dropped one used.
TEST(SmoothMotion, fadesWithoutEndAreBounded)
{
    const auto node = makeShared<SceneNode>();
    const auto first = makeStay(Vector3f(0, 0, 0), node);
    AnimationController controller(first);
    float before = 0.0f;
    int32_t mostShares = 0;
    for (int frame = 0; frame < 300; ++frame)
    {
        const auto next = makeStay(Vector3f(float(frame % 2), 0, 0), node);
        controller.fadeTo(next, 0.0f, 100.0f, 0.5f);
        controller.update(1.0f / 60.0f);
        const float now = node->getPosition().x;
        EXPECT_LT(std::fabs(now - before), 0.08f) << frame;
        before = now;
        mostShares = std::max(mostShares, first->sharedGetCount());
    }
    EXPECT_LE(mostShares, 2);
    EXPECT_EQ(controller.getAnimation()->sharedGetCount(), 1);
}

// Fault caught: memory from the heap in each frame of a fade.
TEST(SmoothMotion, framesAllocateNothing)
{
    std::vector<SceneNode::Ptr> nodes;
    const auto a = makeShared<AnimationGroup>(), b = makeShared<AnimationGroup>();
    for (int i = 0; i < 100; ++i)
    {
        nodes.push_back(makeShared<SceneNode>());
        a->addAnimation(makeTurn({{0, {0, 0, 1, 0}}, {100, {0, 0, 1, 3}}}, nodes.back()));
        b->addAnimation(makeTurn({{0, {0, 1, 0, 0}}, {100, {1, 0, 0, 3}}}, nodes.back()));
    }
    AnimationController controller(a);
    controller.setInterpolated(true);
    controller.setSubtree(nodes[0]);
    controller.setWeight(0.5f);
    controller.fadeTo(b, 0.0f, 100.0f, 1000.0f);
    controller.setSubtree(nullptr);
    controller.update(0.1f);
    const uint64_t before = support::countAllocations();
    for (int i = 0; i < 10; ++i)
        controller.update(0.1f);
    EXPECT_EQ(before, support::countAllocations());
}

// Faults caught: an animation destroyed while it is applied; clips, or members of a group, that move while they are walked.
TEST(SmoothMotion, whatIsAppliedMayChangeWhatPlays)
{
    struct Event : Animation
    {
        explicit Event(bool& gone) : isGone(gone) {}
        ~Event() override { isGone = true; }
        void apply(float) override
        {
            const bool& gone = isGone;
            happen();
            EXPECT_FALSE(gone);
        }
        float getStart() const override { return 0.0f; }
        float getEnd() const override { return 1.0f; }
        bool& isGone;
        std::function<void()> happen;
    };
    using Change = void (*)(AnimationController::Ptr&, AnimationGroup&);
    const Change changes[] = {[](AnimationController::Ptr& controller, AnimationGroup&)
                              { controller = nullptr; },
                              [](AnimationController::Ptr& controller, AnimationGroup&)
                              { controller->fadeTo(makeShared<AnimationGroup>(), 0.0f, 1.0f, 0.0f); },
                              [](AnimationController::Ptr& controller, AnimationGroup&)
                              {
                                  for (int i = 0; i < 9; ++i)
                                      controller->fadeTo(makeShared<AnimationGroup>(), 0.0f, 1.0f, 1.0f);
                              },
                              [](AnimationController::Ptr&, AnimationGroup& group)
                              {
                                  for (int i = 0; i < 99; ++i)
                                      group.addAnimation(makeShared<AnimationGroup>());
                              }};
    for (const Change change : changes)
    {
        for (const bool isFading : {false, true})
        {
            bool isGone = false;
            auto event = makeShared<Event>(isGone);
            auto group = makeShared<AnimationGroup>();
            group->addAnimation(event);
            group->addAnimation(makeShared<AnimationGroup>());
            auto controller = makeShared<AnimationController>(group);
            if (isFading)
                controller->fadeTo(makeShared<AnimationGroup>(), 0.0f, 1.0f, 1.0f);
            AnimationGroup& borrowed = *group;
            event->happen = [&] { change(controller, borrowed); };
            event = nullptr;
            group = nullptr;
            controller->update(0.1f); // the controller alone holds what it applies
        }
    }
}

// Fault caught: animations and animators of programs, which know nothing of mixing, left out or applied where they should
// not be.
TEST(SmoothMotion, foreignAnimationsAreApplied)
{
    struct Recorder : Animation
    {
        void apply(float progress) override { last = progress; }
        float getStart() const override { return 0.0f; }
        float getEnd() const override { return 10.0f; }
        float last = -1.0f;
    };
    struct Dial : Animator<float>
    {
        void apply(const float& value) override { last = value; }
        float last = -1.0f;
    };
    const auto recorder = makeShared<Recorder>();
    const auto dial = makeShared<Dial>();
    const auto group = makeShared<AnimationGroup>();
    group->addAnimation(recorder);
    group->addAnimation(createAnimationChannel<float>(
        makeShared<AnimationKeySequence<float>>(std::vector<AnimationKey<float>>{{0, 0}, {10, 100}}),
        SharedPtr<Animator<float>>(dial)));
    AnimationController controller(group);
    controller.setInterpolated(true);
    seek(controller, 5.0f);
    EXPECT_EQ(5.0f, recorder->last);
    EXPECT_EQ(50.0f, dial->last);
    controller.setWeight(0.4f);
    seek(controller, 6.0f);
    EXPECT_EQ(5.0f, recorder->last);
    controller.setWeight(0.5f);
    seek(controller, 7.0f);
    EXPECT_EQ(7.0f, recorder->last);
    EXPECT_EQ(70.0f, dial->last);
    controller.setSubtree(makeShared<SceneNode>());
    seek(controller, 8.0f);
    EXPECT_EQ(7.0f, recorder->last);
    EXPECT_EQ(70.0f, dial->last);
}
