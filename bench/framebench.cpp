// Other work of a frame, beside the same written by hand: skins, animation, text, sorting, mirrors, stereo, motion
// blur, large trees. Instructions of one frame, with every GL call dropped, counted by callgrind.
//
//   framebench           the figures
//   framebench --table   "name count" of the engine, a line each, for ./run bench --check

#include "callgrind.h"
#include "contender.h"

#include "glcalls/glcalls.h"

#include "orv/animationchannel.h"
#include "orv/animationcontroller.h"
#include "orv/animationgroup.h"
#include "orv/animationkeysequence.h"
#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/fontcache.h"
#include "orv/logsink.h"
#include "orv/mesh.h"
#include "orv/meshutil.h"
#include "orv/motionblurrenderer.h"
#include "orv/renderblock.h"
#include "orv/rendercontext.h"
#include "orv/sceneanimators.h"
#include "orv/sceneutil.h"
#include "orv/shaderprogramcache.h"
#include "orv/simplerenderer.h"
#include "orv/solid.h"
#include "orv/text.h"

#include <GLES2/gl2.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <iterator>
#include <memory>
#include <string>
#include <vector>

using namespace orv;

namespace
{

constexpr int WARM_FRAMES = 3;
constexpr int COUNTED_FRAMES = 2;
constexpr int JOINTS = 60;
constexpr int CHANNELS = 200;
constexpr int KEYS = 100;
constexpr int GLYPHS = 1000;
constexpr int PANES = 10000;
constexpr int CUBES = 1000;
constexpr int NODES = 100000;
constexpr int GROUP = 100; ///< nodes of the large tree below one

const char* const FOR_COUNTING = "--for-counting";

Quaternionf turn(int step)
{
    return quaternionFromAxisAngle(Vector3f(0.6f, 0.8f, 0.0f), Anglef::fromDegrees(float(step % 64) * 5.6f));
}

Vector3f findPlace(int i)
{
    return Vector3f(float(i % 10), float(i / 10 % 10), float(i / 100 % 100)) * 3.0f;
}

/// One way of doing one frame's work; drawn again and again.
using Frame = std::function<void(int frame)>;

/// Shared by the engine's sides.
struct Engine
{
    SharedPtr<AssetCachePool> pool = makeShared<AssetCachePool>();
    SharedPtr<RenderContext> context = makeShared<RenderContext>();
    SharedPtr<SimpleRenderer> renderer = makeShared<SimpleRenderer>(context, pool);
    SharedPtr<SceneNode> scene = makeShared<SceneNode>();
    SharedPtr<Camera> camera = makeShared<Camera>();
    SharedPtr<RenderBlock> block = makeShared<RenderBlock>(renderer, scene, camera);
    SharedPtr<Mesh> mesh = createCubeMesh(*pool->getMeshCache(), Vector2f(1.0f, 1.0f));

    Engine()
    {
        camera->setPosition(Vector3f(13.0f, 13.0f, 60.0f));
        camera->setParent(scene);
    }

    SharedPtr<Appearance> makeMaterial(const char* vertexUniforms, const char* position,
                                       std::initializer_list<std::pair<const char*, const char*>> properties,
                                       const char* fragment = "void main() { gl_FragColor = vec4(1.0); }")
    {
        const std::string vertex = std::string("attribute vec3 a_position;") + vertexUniforms +
                                   "void main() { gl_Position = " + position + "; }";
        const auto program = pool->getShaderProgramCache()->create(vertex.c_str(), fragment, nullptr);
        if (!program)
            giveUp("a program cannot be made");
        for (int i = 0; i < program->getUniformCount(); ++i)
        {
            for (const auto& [uniform, property] : properties)
            {
                if (!std::strcmp(uniform, program->getUniformInstanceName(i)))
                    program->setUniformPropertyName(i, property);
            }
        }
        const auto appearance = makeShared<Appearance>();
        appearance->setShaderProgram(program);
        return appearance;
    }

    SharedPtr<Appearance> makePlain()
    {
        return makeMaterial("uniform mat4 u_all;", "u_all * vec4(a_position, 1.0)",
                            {{"u_all", "T_MODEL_VIEW_PROJECTION"}});
    }

    void addCubes(int count, const SharedPtr<Appearance>& appearance)
    {
        for (int i = 0; i < count; ++i)
        {
            const auto solid = makeShared<Solid>(mesh, appearance);
            solid->setPosition(findPlace(i));
            solid->setParent(scene);
        }
    }
};

/// A plain array of transforms, as in code for a known scene.
struct Hand
{
    std::vector<Matrix4f> worlds;
    Matrix4f projection;
    Matrix4f view = translationMatrix(Vector3f(-13.0f, -13.0f, -60.0f));

    explicit Hand(int count)
    {
        Camera().getProjection(&projection, 4.0f / 3.0f);
        for (int i = 0; i < count; ++i)
            worlds.push_back(translationMatrix(findPlace(i)));
    }

    void draw(const Matrix4f& viewProjection) const
    {
        for (const Matrix4f& world : worlds)
            drawOne(viewProjection * world);
    }

    static void drawOne(const Matrix4f& transform)
    {
        glUniformMatrix4fv(0, 1, GL_FALSE, transform.data());
        glDrawElements(GL_TRIANGLES, 36, GL_UNSIGNED_SHORT, nullptr);
    }
};

// --- A chain of joints that all turn, and three solids of 20 joints each ---

Frame makeSkinEngine()
{
    const auto engine = std::make_shared<Engine>();
    const auto material = engine->makeMaterial(
        "uniform mat4 u_all; uniform mat4 u_joints[20]; uniform int u_count; attribute vec4 a_joints;",
        "u_all * u_joints[int(a_joints.x)] * vec4(a_position, float(u_count))",
        {{"u_all", "T_VIEW_PROJECTION"}, {"u_joints", "J_WORLD"}, {"u_count", "J_COUNT"}});
    std::vector<SharedPtr<SceneNode>> joints;
    for (int i = 0; i < JOINTS; ++i)
    {
        joints.push_back(makeShared<SceneNode>());
        joints.back()->setPosition(Vector3f(0.1f, 0.0f, 0.0f));
        joints.back()->setParent(i % 6 ? joints[size_t(i) - 1] : engine->scene);
    }
    for (int i = 0; i < JOINTS / Solid::MAX_JOINTS; ++i)
    {
        const auto solid = makeShared<Solid>(engine->mesh, material);
        solid->setJointsPerVertex(1);
        for (int j = 0; j < Solid::MAX_JOINTS; ++j)
            solid->attachJoint(joints[size_t(i * Solid::MAX_JOINTS + j)],
                               translationMatrix(Vector3f(1, 2, 3)));
        solid->setParent(engine->scene);
    }
    return [engine, joints](int frame)
    {
        for (size_t i = 0; i < joints.size(); ++i)
            joints[i]->setRotation(turn(frame + int(i)));
        engine->block->render();
    };
}

Frame makeSkinHand()
{
    const auto hand = std::make_shared<Hand>(JOINTS);
    return [hand](int frame)
    {
        const Matrix4f inverseBind = translationMatrix(Vector3f(1, 2, 3));
        const Matrix4f viewProjection = hand->projection * hand->view;
        Matrix4f skin[JOINTS];
        for (int i = 0; i < JOINTS; ++i)
        {
            Matrix4f local = toMatrix4(turn(frame + i));
            local.columns[3] = Vector4f(0.1f, 0.0f, 0.0f, 1.0f);
            hand->worlds[size_t(i)] = i % 6 ? hand->worlds[size_t(i) - 1] * local : local;
            skin[i] = hand->worlds[size_t(i)] * inverseBind;
        }
        glUniformMatrix4fv(0, 1, GL_FALSE, viewProjection.data());
        for (int i = 0; i < JOINTS; i += 20)
        {
            glUniformMatrix4fv(1, 20, GL_FALSE, skin[i].data());
            glDrawElements(GL_TRIANGLES, 36, GL_UNSIGNED_SHORT, nullptr);
        }
    };
}

// --- Channels of 100 keys that turn nodes ---

std::vector<AnimationKey<Vector4f>> makeKeys(int channel)
{
    std::vector<AnimationKey<Vector4f>> keys;
    for (int i = 0; i < KEYS; ++i)
    {
        const Quaternionf q = turn(i + channel);
        keys.push_back({float(i) / 30.0f, Vector4f(q.x, q.y, q.z, q.a)});
    }
    return keys;
}

SharedPtr<AnimationController> makeAnimation()
{
    const auto group = makeShared<AnimationGroup>();
    for (int i = 0; i < CHANNELS; ++i)
        group->addAnimation(
            createAnimationChannel<Vector4f>(makeShared<AnimationKeySequence<Vector4f>>(makeKeys(i)),
                                             makeShared<SceneNodeRotationAnimator>(makeShared<SceneNode>())));
    return makeShared<AnimationController>(group);
}

Frame makeAnimationEngine()
{
    return [controller = makeAnimation()](int) { controller->update(0.0335f); };
}

Frame makeInterpolatedEngine()
{
    const auto controller = makeAnimation();
    controller->setInterpolated(true);
    return [controller](int) { controller->update(0.0335f); };
}

Frame makeFadeEngine()
{
    const auto controller = makeAnimation();
    controller->setInterpolated(true);
    controller->fadeTo(1.0f, 3.0f, 100.0f);
    return [controller](int) { controller->update(0.0335f); };
}

Frame makeAnimationHand()
{
    struct Channel
    {
        std::vector<AnimationKey<Vector4f>> keys;
        Vector4f rotation;
        bool isChanged = false;
    };
    const auto channels = std::make_shared<std::vector<Channel>>();
    for (int i = 0; i < CHANNELS; ++i)
        channels->push_back({makeKeys(i), Vector4f(), false});
    return [channels](int frame)
    {
        const float time = std::fmod(0.0335f * float(frame), float(KEYS - 1) / 30.0f);
        for (Channel& channel : *channels)
        {
            const auto later =
                std::upper_bound(channel.keys.begin(), channel.keys.end(), time,
                                 [](float t, const AnimationKey<Vector4f>& key) { return t < key.time; });
            const Vector4f& value = later == channel.keys.begin() ? later->value : (later - 1)->value;
            channel.isChanged = !(value == channel.rotation);
            channel.rotation = value;
        }
    };
}

/// Interpolates; with two times, mixes both rotations.
Frame makeMixHand(int moments)
{
    struct Channel
    {
        std::vector<AnimationKey<Vector4f>> keys;
        Quaternionf rotation;
        bool isChanged = false;
    };
    const auto turnTo = [](const Vector4f& v)
    { return quaternionFromAxisAngle(v.xyz(), Anglef::fromRadians(v.w)); };
    const auto mix = [](const Quaternionf& p, const Quaternionf& q, float share)
    {
        const float cosine = p.a * q.a + p.x * q.x + p.y * q.y + p.z * q.z;
        const float angle = std::acos(std::min(std::fabs(cosine), 1.0f));
        const float sine = std::sin(angle);
        const float a = sine > 0.001f ? std::sin((1.0f - share) * angle) / sine : 1.0f - share;
        const float b = std::copysign(sine > 0.001f ? std::sin(share * angle) / sine : share, cosine);
        return Quaternionf(p.a * a + q.a * b, p.x * a + q.x * b, p.y * a + q.y * b, p.z * a + q.z * b);
    };
    const auto channels = std::make_shared<std::vector<Channel>>();
    for (int i = 0; i < CHANNELS; ++i)
        channels->push_back({makeKeys(i), Quaternionf(), false});
    return [=](int frame)
    {
        for (Channel& channel : *channels)
        {
            Quaternionf rotation;
            for (int moment = 0; moment < moments; ++moment)
            {
                const float time = 0.0335f * float(frame) + float(moment); // well inside the keys
                const auto later =
                    std::upper_bound(channel.keys.begin(), channel.keys.end(), time,
                                     [](float t, const AnimationKey<Vector4f>& key) { return t < key.time; });
                const AnimationKey<Vector4f>& earlier = *(later - 1);
                const float share = (time - earlier.time) / (later->time - earlier.time);
                const Quaternionf now = mix(turnTo(earlier.value), turnTo(later->value), share);
                rotation = moment == 0 ? now : mix(rotation, now, 0.3f);
            }
            channel.isChanged = !(rotation == channel.rotation);
            channel.rotation = rotation;
        }
    };
}

// --- Text ---

const std::string& getPage()
{
    static const std::string page = []
    {
        std::string text;
        for (int i = 0; i < GLYPHS; ++i)
            text += i % 50 == 49 ? '\n' : char('a' + i % 26);
        return text;
    }();
    return page;
}

Frame makeTextEngine(bool changes)
{
    const auto engine = std::make_shared<Engine>();
    registerSource(*engine->pool, "/usr/share/fonts/truetype/dejavu", false); // package fonts-dejavu-core
    const Font::Ptr font = get(*engine->pool->getFontCache(), "DejaVuSans.ttf", 16);
    if (!font)
        giveUp("there is no font");
    const auto text = makeShared<Text>(*engine->pool, font, Colour4f::WHITE);
    text->add(getPage().c_str(), 0.0f, 0.0f, Text::Alignment::LEFT);
    return [engine, text, changes](int)
    {
        if (changes)
        {
            text->clear();
            text->add(getPage().c_str(), 0.0f, 0.0f, Text::Alignment::LEFT);
        }
        text->draw(*engine->context);
    };
}

/// Glyphs from a table, two triangles each, into an array that is uploaded.
Frame makeTextHand(bool changes)
{
    struct Glyph
    {
        float left = 1, top = 2, width = 8, height = 12, advance = 9, u0 = 0, v0 = 0, u1 = 0.1f, v1 = 0.1f;
    };
    struct Corner
    {
        float x, y, u, v;
    };
    const auto glyphs = std::make_shared<std::vector<Glyph>>(128);
    const auto corners = std::make_shared<std::vector<Corner>>(GLYPHS * 4);
    return [glyphs, corners, changes](int)
    {
        Corner* next = corners->data();
        float x = 0.0f;
        float y = 0.0f;
        for (const char c : changes ? getPage() : std::string())
        {
            if (c == '\n')
            {
                x = 0.0f;
                y += 16.0f;
                continue;
            }
            const Glyph& glyph = (*glyphs)[size_t(c)];
            const float left = x + glyph.left;
            const float top = y + glyph.top;
            *next++ = {left, top, glyph.u0, glyph.v0};
            *next++ = {left + glyph.width, top, glyph.u1, glyph.v0};
            *next++ = {left + glyph.width, top + glyph.height, glyph.u1, glyph.v1};
            *next++ = {left, top + glyph.height, glyph.u0, glyph.v1};
            x += glyph.advance;
        }
        if (changes)
            glBufferSubData(GL_ARRAY_BUFFER, 0, GLsizeiptr(corners->size() * sizeof(Corner)),
                            corners->data());
        glUseProgram(1);
        glBindTexture(GL_TEXTURE_2D, 1);
        glDrawElements(GL_TRIANGLES, GLYPHS * 6, GL_UNSIGNED_SHORT, nullptr);
    };
}

// --- Transparent solids ---

Frame makePanesEngine()
{
    const auto engine = std::make_shared<Engine>();
    const auto material = engine->makePlain();
    material->setBlendFactors(BlendFactor::SRC_ALPHA, BlendFactor::ONE, BlendFactor::ONE_MINUS_SRC_ALPHA,
                              BlendFactor::ONE_MINUS_SRC_ALPHA);
    engine->addCubes(PANES, material);
    return [engine](int frame)
    {
        engine->camera->setRotation(turn(frame));
        engine->block->render();
    };
}

Frame makePanesHand()
{
    const auto hand = std::make_shared<Hand>(PANES);
    const auto order = std::make_shared<std::vector<std::pair<float, uint32_t>>>(PANES);
    return [hand, order](int frame)
    {
        const Matrix4f camera = toMatrix4(turn(frame));
        const Vector3f z = camera.columns[2].xyz();
        for (uint32_t i = 0; i < PANES; ++i)
            (*order)[i] = {dot(z, hand->worlds[i].columns[3].xyz()), i};
        std::sort(order->begin(), order->end());
        const Matrix4f viewProjection = hand->projection * inverse(camera);
        for (const auto& [depth, i] : *order)
            Hand::drawOne(viewProjection * hand->worlds[i]);
    };
}

// --- A mirror, two eyes, velocities ---

Frame makeMirrorEngine()
{
    const auto engine = std::make_shared<Engine>();
    engine->addCubes(CUBES, engine->makePlain());
    const auto mirror = makeShared<Solid>(
        engine->mesh,
        engine->makeMaterial("uniform mat4 u_all;", "u_all * vec4(a_position, 1.0)",
                             {{"u_all", "T_MODEL_VIEW_PROJECTION"}, {"u_mirror", "M_MIRROR_TEXTURE"}},
                             "precision mediump float; uniform sampler2D u_mirror;"
                             "void main() { gl_FragColor = texture2D(u_mirror, vec2(0.5)); }"));
    mirror->setParent(engine->scene);
    return [engine](int frame)
    {
        engine->camera->setRotation(turn(frame));
        engine->block->render();
    };
}

Frame makeStereoEngine()
{
    const auto engine = std::make_shared<Engine>();
    engine->addCubes(CUBES, engine->makePlain());
    engine->block->setStereo(20.0f, 0.3f);
    return [engine](int frame)
    {
        engine->camera->setRotation(turn(frame));
        engine->block->render();
    };
}

/// A thousand visible cubes, tested one by one, since another cube is not visible.
Frame makeCubesEngine(bool isCulled)
{
    const auto engine = std::make_shared<Engine>();
    engine->addCubes(CUBES, engine->makePlain());
    engine->scene->getChild(engine->scene->getChildCount() - 1)->setPosition(Vector3f(0.0f, 0.0f, 1000.0f));
    engine->camera->setPosition(Vector3f(13.0f, 13.0f, 70.0f));
    engine->renderer->setCulled(isCulled);
    return [engine](int) { engine->block->render(); };
}

/// The same below nodes of a hundred each, behind the camera.
Frame makeHiddenCubesEngine()
{
    const auto engine = std::make_shared<Engine>();
    const auto appearance = engine->makePlain();
    for (int i = 0; i < CUBES; ++i)
    {
        if (i % GROUP == 0)
            makeShared<SceneNode>()->setParent(engine->scene);
        const auto solid = makeShared<Solid>(engine->mesh, appearance);
        solid->setPosition(findPlace(i));
        solid->setParent(engine->scene->getChild(engine->scene->getChildCount() - 1));
    }
    engine->camera->setPosition(Vector3f(0.0f, 0.0f, -1000.0f));
    engine->renderer->setCulled(true);
    return [engine](int frame)
    {
        engine->scene->getChild(1)->setPosition(Vector3f(0.0f, 0.0f, float(frame)));
        engine->block->render();
    };
}

Frame makeOnePassHand()
{
    const auto hand = std::make_shared<Hand>(CUBES);
    return [hand](int)
    {
        glClear(GL_COLOR_BUFFER_BIT);
        hand->draw(hand->projection * hand->view);
    };
}

Frame makeTwoPassHand()
{
    const auto hand = std::make_shared<Hand>(CUBES);
    return [hand](int frame)
    {
        for (int pass = 0; pass < 2; ++pass)
        {
            glClear(GL_COLOR_BUFFER_BIT);
            hand->draw(hand->projection * inverse(toMatrix4(turn(frame + pass))));
        }
    };
}

Frame makeBlurEngine()
{
    const auto engine = std::make_shared<Engine>();
    engine->addCubes(CUBES, engine->makePlain());
    const auto blur = makeShared<MotionBlurRenderer>(engine->context, engine->pool);
    const auto block = makeShared<RenderBlock>(blur, engine->scene, engine->camera);
    return [engine, block](int frame)
    {
        engine->camera->setRotation(turn(frame));
        block->update(float(frame) / 60.0f);
        block->render();
    };
}

Frame makeBlurHand()
{
    const auto hand = std::make_shared<Hand>(CUBES);
    const auto last = std::make_shared<std::vector<Matrix4f>>(hand->worlds);
    return [hand, last](int frame)
    {
        const Matrix4f now = hand->projection * inverse(toMatrix4(turn(frame)));
        const Matrix4f before = hand->projection * inverse(toMatrix4(turn(frame - 1)));
        for (size_t i = 0; i < hand->worlds.size(); ++i)
        {
            const Matrix4f old = before * (*last)[i];
            glUniformMatrix4fv(1, 1, GL_FALSE, old.data());
            Hand::drawOne(now * hand->worlds[i]);
        }
        *last = hand->worlds;
    };
}

// --- A large tree, of which 1 % moves and 10 % is hidden by a flag; one node in 100 is drawn ---

Frame makeTreeEngine()
{
    const auto engine = std::make_shared<Engine>();
    const auto material = engine->makePlain();
    const auto moving = std::make_shared<std::vector<SharedPtr<SceneNode>>>();
    SharedPtr<SceneNode> parent;
    for (int i = 0; i < NODES; ++i)
    {
        const SharedPtr<SceneNode> node =
            i % GROUP == 1 ? SharedPtr<SceneNode>(makeShared<Solid>(engine->mesh, material))
                           : makeShared<SceneNode>();
        node->setPosition(findPlace(i));
        node->setParent(i % GROUP == 0 ? engine->scene : parent);
        if (i % GROUP == 0)
            parent = node;
        if (i % GROUP == 1)
            moving->push_back(node);
        node->setVisible(i % GROUP == 0 || i % 10 != 5);
    }
    engine->block->setRenderFlags(SceneNode::VISIBLE);
    return [engine, moving](int frame)
    {
        for (size_t i = 0; i < moving->size(); ++i)
            (*moving)[i]->setRotation(turn(frame + int(i)));
        engine->block->render();
    };
}

Frame makeTreeHand()
{
    struct Node
    {
        Matrix4f local = Matrix4f::IDENTITY;
        Matrix4f world = Matrix4f::IDENTITY;
        int parent = -1;
        bool isVisible = true;
        bool isDrawn = false;
    };
    const auto nodes = std::make_shared<std::vector<Node>>(NODES);
    for (int i = 0; i < NODES; ++i)
    {
        Node& node = (*nodes)[size_t(i)];
        node.local.columns[3] = Vector4f(findPlace(i), 1.0f);
        node.parent = i % GROUP == 0 ? -1 : i - i % GROUP;
        node.isVisible = i % GROUP == 0 || i % 10 != 5;
        node.isDrawn = i % GROUP == 1;
    }
    const auto hand = std::make_shared<Hand>(0);
    return [nodes, hand](int frame)
    {
        for (size_t i = 1; i < nodes->size(); i += GROUP)
        {
            Node& node = (*nodes)[i];
            const Matrix4f rotation = toMatrix4(turn(frame + int(i)));
            std::copy_n(rotation.columns, 3, node.local.columns);
            node.world = (*nodes)[size_t(node.parent)].world * node.local;
        }
        const Matrix4f viewProjection = hand->projection * hand->view;
        for (const Node& node : *nodes)
        {
            const bool isHidden =
                !node.isVisible || (node.parent >= 0 && !(*nodes)[size_t(node.parent)].isVisible);
            if (!isHidden && node.isDrawn)
                Hand::drawOne(viewProjection * node.world);
        }
    };
}

struct Case
{
    const char* name;
    int units; ///< the figures are per unit
    const char* unit;
    Frame (*engine)();
    Frame (*hand)();
};

constexpr Case CASES[] = {
    {"skins", JOINTS, "joint", makeSkinEngine, makeSkinHand},
    {"animation", CHANNELS, "channel", makeAnimationEngine, makeAnimationHand},
    {"interpolated", CHANNELS, "channel", makeInterpolatedEngine, [] { return makeMixHand(1); }},
    {"cross-fade", CHANNELS, "channel", makeFadeEngine, [] { return makeMixHand(2); }},
    {"text-that-changes", GLYPHS, "glyph", [] { return makeTextEngine(true); },
     [] { return makeTextHand(true); }},
    {"text-that-stays", 1, "text", [] { return makeTextEngine(false); }, [] { return makeTextHand(false); }},
    {"transparent", PANES, "solid", makePanesEngine, makePanesHand},
    {"mirror", 2 * CUBES, "draw", makeMirrorEngine, makeTwoPassHand},
    {"stereo", 2 * CUBES, "draw", makeStereoEngine, makeTwoPassHand},
    {"motion-blur", CUBES, "solid", makeBlurEngine, makeBlurHand},
    {"solids", CUBES, "solid", [] { return makeCubesEngine(false); }, makeOnePassHand},
    {"solids-culled", CUBES, "solid", [] { return makeCubesEngine(true); }, makeOnePassHand},
    {"solids-hidden", CUBES, "solid", makeHiddenCubesEngine, makeOnePassHand},
    {"tree", NODES, "node", makeTreeEngine, makeTreeHand},
};

void count(Frame (*make)(), bool isEngine)
{
    glcalls::dropAll(!isEngine);      // the engine's first frame makes GL objects
    Frame& draw = *new Frame(make()); // GL objects end with the process
    draw(0);
    glcalls::dropAll();
    for (int i = 1; i < WARM_FRAMES; ++i)
        draw(i);
    const auto work = [](void* object, int first)
    {
        for (int i = 0; i < COUNTED_FRAMES; ++i)
            (*static_cast<const Frame*>(object))(first + i);
    };
    callgrind::measure(work, &draw, WARM_FRAMES);
}

void drawForCounting()
{
    for (const Case& each : CASES)
    {
        count(each.engine, true);
        count(each.hand, false);
    }
    std::fflush(stdout);
    std::_Exit(EXIT_SUCCESS);
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    const std::string argument = argc > 1 ? argv[1] : "";
    headless::Options options;
    options.width = 320;
    options.height = 240;
    std::string error;
    const auto surface = headless::Context::create(options, error);
    if (!surface)
        giveUp(error.c_str());
    if (argument == FOR_COUNTING)
        drawForCounting();

    const std::vector<uint64_t> counts =
        callgrind::isAvailable() ? callgrind::count(FOR_COUNTING, {"gl"}) : std::vector<uint64_t>();
    if (counts.size() != 2 * std::size(CASES))
        giveUp("instructions cannot be counted; is valgrind installed?");
    const bool isTable = argument == "--table";
    if (!isTable)
        std::printf("%-18s %24s %9s %9s %6s\n", "", "instructions of a frame", "engine", "by hand", "ratio");
    for (size_t i = 0; i < std::size(CASES); ++i)
    {
        const double units = double(CASES[i].units) * COUNTED_FRAMES;
        const double engine = double(counts[2 * i]) / units;
        const double hand = double(counts[2 * i + 1]) / units;
        if (isTable)
            std::printf("framebench/%s %.1f\n", CASES[i].name, engine);
        else
            std::printf("%-18s %18d %-5ss %9.1f %9.1f %6.2f\n", CASES[i].name, CASES[i].units, CASES[i].unit,
                        engine, hand, engine / hand);
    }
    return EXIT_SUCCESS;
}
