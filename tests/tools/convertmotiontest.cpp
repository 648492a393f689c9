#include "converttest.h"
#include "gltfwriter.h"

#include "convert/files/filegate.h"
#include "convert/files/modelfiles.h"
#include "convert/model.h"
#include "convert/scene/keychoice.h"
#include "convert/scene/placement.h"

#include "orv/animationgroup.h"
#include "orv/camera.h"
#include "orv/detail/glovertices.h"
#include "orv/mesh.h"
#include "orv/solid.h"

#include <assimp/Importer.hpp>
#include <assimp/scene.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <fstream>
#include <iterator>
#include <map>
#include <random>

using namespace orv;

namespace
{

using Place = std::array<float, 3>;

/// Where vertices are in the world, by where their meshes have them, which no conversion changes.
using Posed = std::multimap<Place, Vector3f>;

constexpr float NOT_THERE = 1e9f;

/// How far the vertex furthest from its counterpart is from it.
float getDeviation(const Posed& posed, const Posed& wanted)
{
    float largest = 0.0f;
    for (const auto& [place, position] : posed)
    {
        float nearest = NOT_THERE;
        const auto [begin, end] = wanted.equal_range(place);
        for (auto candidate = begin; candidate != end; ++candidate)
            nearest = std::min(nearest, length(candidate->second - position));
        largest = std::max(largest, nearest);
    }
    return largest;
}

/// A model from libassimp, posed and skinned here.
class Reference
{
public:
    explicit Reference(const std::string& path) : m_scene(m_importer.ReadFile(path, 0)) {}

    bool isThere() const { return m_scene != nullptr; }
    unsigned getClipCount() const { return m_scene->mNumAnimations; }
    double getSeconds(unsigned clip) const
    {
        return m_scene->mAnimations[clip]->mDuration / getTicksPerSecond(clip);
    }

    /// @param clip  -1: as the file places everything.
    Posed pose(int clip, double seconds, float scale)
    {
        Posed posed;
        m_scale = scale;
        m_clip = clip < 0 ? nullptr : m_scene->mAnimations[clip];
        m_ticks = clip < 0 ? 0.0 : seconds * getTicksPerSecond(unsigned(clip));
        addNode(*m_scene->mRootNode, posed);
        return posed;
    }

private:
    double getTicksPerSecond(unsigned clip) const
    {
        const double given = m_scene->mAnimations[clip]->mTicksPerSecond;
        return given > 0.0 ? given : 25.0;
    }

    static aiVector3D mix(const aiVectorKey& a, const aiVectorKey& b, float share)
    {
        return a.mValue * (1.0f - share) + b.mValue * share;
    }

    static aiQuaternion mix(const aiQuatKey& a, const aiQuatKey& b, float share)
    {
        aiQuaternion value;
        aiQuaternion::Interpolate(value, a.mValue, b.mValue, share);
        return value.Normalize();
    }

    template <class Key>
    auto evaluate(const Key* keys, unsigned count) const -> decltype(keys->mValue)
    {
        unsigned next = 0;
        while (next < count && keys[next].mTime <= m_ticks)
            ++next;
        if (next == 0 || next == count)
            return keys[next == 0 ? 0 : count - 1].mValue;
        const Key& before = keys[next - 1];
        return mix(before, keys[next], float((m_ticks - before.mTime) / (keys[next].mTime - before.mTime)));
    }

    aiMatrix4x4 getLocal(const aiNode& node) const
    {
        for (unsigned i = 0; m_clip && i < m_clip->mNumChannels; ++i)
        {
            const aiNodeAnim& channel = *m_clip->mChannels[i];
            if (m_scene->mRootNode->FindNode(channel.mNodeName) == &node)
                return convert::compose(evaluate(channel.mPositionKeys, channel.mNumPositionKeys),
                                        evaluate(channel.mRotationKeys, channel.mNumRotationKeys),
                                        evaluate(channel.mScalingKeys, channel.mNumScalingKeys));
        }
        return node.mTransformation;
    }

    aiMatrix4x4 getWorld(const aiNode& node) const
    {
        return node.mParent ? getWorld(*node.mParent) * getLocal(node) : getLocal(node);
    }

    void addNode(const aiNode& node, Posed& posed) const
    {
        for (unsigned i = 0; i < node.mNumMeshes; ++i)
            addMesh(*m_scene->mMeshes[node.mMeshes[i]], node, posed);
        for (unsigned i = 0; i < node.mNumChildren; ++i)
            addNode(*node.mChildren[i], posed);
    }

    void addMesh(const aiMesh& mesh, const aiNode& node, Posed& posed) const
    {
        std::vector<std::vector<std::pair<float, unsigned>>> weights(mesh.mNumVertices);
        std::vector<aiMatrix4x4> joints;
        for (unsigned b = 0; b < mesh.mNumBones; ++b)
        {
            const aiBone& bone = *mesh.mBones[b];
            const aiNode* joint = m_scene->mRootNode->FindNode(bone.mName);
            joints.push_back(joint ? getWorld(*joint) * bone.mOffsetMatrix : aiMatrix4x4());
            for (unsigned i = 0; joint && i < bone.mNumWeights; ++i)
                weights[bone.mWeights[i].mVertexId].push_back({-float(bone.mWeights[i].mWeight), b});
        }
        const aiMatrix4x4 world = getWorld(node);
        for (unsigned v = 0; v < mesh.mNumVertices; ++v)
        {
            const aiVector3D& place = mesh.mVertices[v];
            std::sort(weights[v].begin(), weights[v].end());
            weights[v].resize(
                std::min<size_t>(weights[v].size(), 4)); // as many as a vertex of the engine has
            aiVector3D sum;
            float total = 0.0f;
            for (const auto& [weight, joint] : weights[v])
            {
                sum += (joints[joint] * place) * -weight;
                total -= weight;
            }
            const aiVector3D at = (total > 0.0f ? sum / total : world * place) * m_scale;
            posed.emplace(Place{place.x + 0.0f, place.y + 0.0f, place.z + 0.0f}, Vector3f(at.x, at.y, at.z));
        }
    }

    Assimp::Importer m_importer;
    const aiScene* m_scene;
    const aiAnimation* m_clip = nullptr;
    double m_ticks = 0.0;
    float m_scale = 1.0f;
};

/// A converted model, loaded and moved by the engine.
class ConvertMotionTest : public GloTest
{
protected:
    void TearDown() override
    {
        m_loaded.reset();
        GloTest::TearDown();
    }

    bool convertAndLoad(const std::string& path, const convert::Options& options = {})
    {
        std::string error;
        m_model = {};
        m_geometries.clear();
        m_skins.clear();
        convert::FileGate gate(path);
        convert::ModelFiles files(path, gate);
        EXPECT_TRUE(convert::convertModel(path, files, "model", options, m_model, error))
            << path << ": " << error;
        for (const glo::Geometry& geometry : m_model.scene.geometries)
            m_geometries[geometry.name] = &geometry;
        for (const glo::Skin& skin : m_model.scene.skins)
            m_skins[skin.name] = &skin;
        support::LogCapture log;
        m_loaded = load(write(m_model.scene));
        EXPECT_TRUE(m_loaded) << path << log.text();
        return bool(m_loaded);
    }

    Posed pose(float time)
    {
        m_loaded->getAnimationGroup()->apply(time);
        Posed posed;
        addNode(m_model.scene.scene->top, posed);
        return posed;
    }

    void addNode(const glo::NodeData& node, Posed& posed)
    {
        if (node.geometry || node.skin)
        {
            SceneNode* found = m_loaded->getTopNode()->find(node.name.c_str());
            ASSERT_TRUE(found && found->getNodeType() == Solid::NODE_TYPE) << node.name;
            const std::string& geometry =
                node.geometry ? node.geometry->geometry : m_skins.at(node.skin->skin)->geometry;
            addSolid(*static_cast<Solid*>(found), *m_geometries.at(geometry), posed);
        }
        for (const glo::NodeData& child : node.children)
            addNode(child, posed);
    }

    static std::vector<float> getValues(const glo::Geometry& geometry, const char* name)
    {
        std::vector<float> values;
        const glo::VertexAttribute* attribute = glo::findAttribute(geometry, name);
        EXPECT_TRUE(attribute) << name;
        if (attribute)
            glo::forEachComponent(*attribute, geometry.vertices, attribute->normalize != 0, 4,
                                  [&](uint32_t, float value) { values.push_back(value); });
        return values;
    }

    static void addSolid(const Solid& solid, const glo::Geometry& geometry, Posed& posed)
    {
        const std::vector<float> places = getValues(geometry, "a_position");
        const bool isSkinned = solid.getJointCount() > 0;
        EXPECT_LE(solid.getJointCount(), Solid::MAX_JOINTS);
        const std::vector<float> joints = isSkinned ? getValues(geometry, "a_joints") : std::vector<float>();
        const std::vector<float> weights =
            isSkinned ? getValues(geometry, "a_weights") : std::vector<float>();
        std::vector<Matrix4f> transforms;
        for (int i = 0; i < solid.getJointCount(); ++i)
            transforms.push_back(solid.getJointTransform(i));
        for (size_t v = 0; v < places.size() / 3; ++v)
        {
            const Vector4f place(places[v * 3], places[v * 3 + 1], places[v * 3 + 2], 1.0f);
            Vector4f sum;
            for (size_t i = v * 4; isSkinned && i < v * 4 + 4; ++i)
                sum = sum + transforms[size_t(joints[i])] * place * weights[i];
            if (!isSkinned)
                sum = solid.getWorldTransform() * place;
            posed.emplace(Place{place.x, place.y, place.z}, sum.xyz());
        }
    }

    Vector3f find(const char* node) const
    {
        SceneNode* found = m_loaded->getTopNode()->find(node);
        EXPECT_TRUE(found) << node;
        return found ? found->getWorldTransform()[3].xyz() : Vector3f();
    }

    support::TempDir m_folder;
    convert::ConvertedModel m_model;
    std::map<std::string, const glo::Geometry*> m_geometries;
    std::map<std::string, const glo::Skin*> m_skins;
    Glo::Ptr m_loaded;
    float m_largest = 0.0f; ///< deviation, relative to the size of the model
};

float getSize(const Posed& posed)
{
    float largest = 0.0f;
    for (const auto& [place, position] : posed)
        largest = std::max(largest, length(position));
    return largest;
}

} // namespace

// Fault caught: joints, weights, bind poses, clips or times that are not those of the file; vertices that get lost
// where a mesh is split.
TEST_F(ConvertMotionTest, posesAreThoseOfTheSource)
{
    const struct
    {
        const char* file;
        float metres; // of the file's unit
        int clips;
        size_t parts; // of skinned meshes
    } cases[] = {
        {"glTF2/simple_skin/simple_skin.gltf", 1.0f, 1, 1},
        {"FBX/huesitos.fbx", 0.01f, 1, 1},
        {"FBX/animation_with_skeleton.fbx", 0.01f, 1, 1},
        {"FBX/cubes_with_mirroring_and_pivot.fbx", 1.0f, 0, 0}, // 100 centimetres
        {"X/Testwuson.X", 1.0f, 3, 3},                          // 37 joints
        {"X/BCN_Epileptic.X", 1.0f, 1, 4},
        {"X/anim_test.x", 1.0f, 1, 1},
        {"BVH/Boxing_Toes.bvh", 1.0f, 1, 2},
        {"Collada/box_nested_animation.dae", 1.0f, 1, 1},
        {"3DS/RotatingCube.3DS", 1.0f, 1, 0},
        {"ASE/MotionCaptureROM.ase", 1.0f, 1, 0},
    };
    convert::Options options;
    for (const auto& item : cases)
    {
        SCOPED_TRACE(item.file);
        Reference reference(std::string(MODELS) + item.file);
        ASSERT_TRUE(reference.isThere());
        options.animation = false;
        ASSERT_TRUE(convertAndLoad(std::string(MODELS) + item.file, options));
        EXPECT_EQ(0, m_loaded->getAnimationCount());
        EXPECT_EQ(item.parts, m_model.scene.skins.size());
        const Posed rest = reference.pose(-1, 0.0, item.metres);
        const float tolerance = 5e-5f * getSize(rest);
        EXPECT_LT(getDeviation(pose(0.0f), rest), tolerance);
        EXPECT_LT(getDeviation(rest, pose(0.0f)), tolerance);

        options.animation = true;
        ASSERT_TRUE(convertAndLoad(std::string(MODELS) + item.file, options));
        ASSERT_EQ(size_t(item.clips), m_model.clips.size());
        for (int clip = 0; clip < item.clips; ++clip)
        {
            const float start = m_model.clips[size_t(clip)].start;
            const double seconds = reference.getSeconds(unsigned(clip));
            EXPECT_NEAR(seconds, double(m_model.clips[size_t(clip)].end - start), 1e-4);
            const int samples = int(std::ceil(seconds * options.fps - 1e-6));
            for (const int sample : {0, samples / 3, std::max(samples - 1, 0), samples})
            {
                const double time = std::min(seconds, sample / options.fps);
                const float half = sample == samples ? 0.0f : float(0.3 / options.fps); // holds so long
                const Posed wanted = reference.pose(clip, time, item.metres);
                const float deviation = getDeviation(pose(start + float(time) + half), wanted);
                EXPECT_LT(deviation, tolerance) << clip << " at " << time;
                m_largest = std::max(m_largest, deviation / getSize(rest));
            }
        }
    }
    RecordProperty("largestDeviationInMillionths", int(m_largest * 1e6f));
}

// Faults caught: keys left out where the movement bends; a file whose keys are stepped all the same; clips, rest poses and
// jumps that run into each other.
TEST_F(ConvertMotionTest, sparseKeysStayNearTheSource)
{
    const struct
    {
        const char* file;
        float metres;
    } cases[] = {
        {"glTF2/simple_skin/simple_skin.gltf", 1.0f},
        {"FBX/huesitos.fbx", 0.01f},
        {"X/Testwuson.X", 1.0f},
        {"X/BCN_Epileptic.X", 1.0f},
        {"BVH/Boxing_Toes.bvh", 1.0f},
        {"Collada/box_nested_animation.dae", 1.0f},
        {"ASE/MotionCaptureROM.ase", 1.0f},
    };
    convert::Options options;
    options.sparseKeys = true;
    options.fps = 1000.0; // all keys of the models count
    for (const auto& item : cases)
    {
        SCOPED_TRACE(item.file);
        Reference reference(std::string(MODELS) + item.file);
        ASSERT_TRUE(reference.isThere());
        ASSERT_TRUE(convertAndLoad(std::string(MODELS) + item.file, options));
        const float size = getSize(reference.pose(-1, 0.0, item.metres));
        for (unsigned clip = 0; clip < m_model.clips.size(); ++clip)
        {
            const double seconds = reference.getSeconds(clip);
            for (const double share : {0.0, 0.123, 0.4567, 0.5, 0.789, 0.9999, 1.0})
            {
                const float time = m_model.clips[clip].start + float(seconds * share);
                const Posed wanted =
                    reference.pose(int(clip), double(time - m_model.clips[clip].start), item.metres);
                // An error of a thousandth in each joint of a chain adds up on its way to a fingertip.
                const float deviation = getDeviation(pose(time), wanted);
                EXPECT_LT(deviation, 0.003f * size) << clip << " at " << share;
                m_largest = std::max(m_largest, deviation / size);
            }
        }
    }
    RecordProperty("largestDeviationInMillionths", int(m_largest * 1e6f));
}

// Fault caught: keys beyond the error, more of them than a movement needs, or a jump made a slope.
TEST(ChooseKeys, keepsWhatTheErrorAsksFor)
{
    std::mt19937 random(11);
    std::uniform_real_distribution<float> any(-1.0f, 1.0f);
    for (int run = 0; run < 300; ++run)
    {
        std::vector<convert::Sample> samples;
        float slope = 0.0f, value = 0.0f;
        for (int i = 0; i < 100; ++i)
        {
            slope = any(random) > 0.8f ? any(random) : slope;
            value += slope + (any(random) > 0.95f ? 5.0f : 0.0f) + any(random) * 0.01f;
            const bool isJump = i > 0 && any(random) > 0.9f;
            samples.push_back(
                {isJump ? samples.back().seconds : double(i), Vector4f(value, -value, 0.0f, 0.0f)});
        }
        const double error = 0.05;
        const std::vector<size_t> keys = convert::chooseKeys(samples, false, error);
        ASSERT_EQ(0u, keys.front());
        ASSERT_EQ(samples.size() - 1, keys.back());
        for (size_t k = 1; k < keys.size(); ++k)
        {
            const convert::Sample& from = samples[keys[k - 1]];
            const convert::Sample& to = samples[keys[k]];
            for (size_t i = keys[k - 1] + 1; i < keys[k]; ++i)
            {
                const double share = (samples[i].seconds - from.seconds) / (to.seconds - from.seconds);
                const double made = double(from.value.x) * (1.0 - share) + double(to.value.x) * share;
                ASSERT_LE(std::fabs(made - double(samples[i].value.x)) * std::sqrt(2.0), error * 1.001)
                    << run;
            }
        }
    }

    std::vector<convert::Sample> spin, line, jump;
    for (int i = 0; i <= 1000; ++i)
    {
        spin.push_back({i * 0.01, Vector4f(0.6f, 0.0f, 0.8f, float(i) * 0.003f)});
        line.push_back({i * 0.01, Vector4f(float(i), 1.0f, -2.0f * float(i), 0.0f)});
        jump.push_back({i * 0.01, Vector4f(i < 500 ? 0.0f : 9.0f, 0.0f, 0.0f, 0.0f)});
    }
    jump.insert(jump.begin() + 500, {5.0, Vector4f()});
    EXPECT_EQ((std::vector<size_t>{0, 1000}), convert::chooseKeys(spin, true, 0.001)) << "one even turn";
    EXPECT_EQ((std::vector<size_t>{0, 1000}), convert::chooseKeys(line, false, 0.01));
    EXPECT_EQ((std::vector<size_t>{0, 500, 501, 1001}), convert::chooseKeys(jump, false, 0.01));
    EXPECT_EQ((std::vector<size_t>{0}), convert::chooseKeys({line[0]}, false, 0.01));
}

// Fault caught: of two clips the second one also moves what only the first one does; values that step and are read as
// lines; ranges that cannot be found; bytes that differ from run to run.
TEST_F(ConvertMotionTest, clipsLieEndToEnd)
{
    m_folder.write("model.gltf",
                   std::string(R"({"asset":{"version":"2.0"},"scene":0,"scenes":[{"nodes":[0,1]}],
"nodes":[{"name":"a","mesh":0,"translation":[7,0,0]},{"mesh":0}],
"meshes":[{"primitives":[{"attributes":{"POSITION":0}}]}],
"animations":[{"name":"jump","samplers":[{"input":1,"output":2,"interpolation":"STEP"}],
  "channels":[{"sampler":0,"target":{"node":0,"path":"translation"}}]},
 {"name":"still","samplers":[],"channels":[]},
 {"name":"jump","samplers":[{"input":1,"output":2,"interpolation":"CUBICSPLINE"},
   {"input":1,"output":2,"interpolation":"STEP"}],
  "channels":[{"sampler":1,"target":{"node":1,"path":"translation"}}]}],
"accessors":[{"bufferView":0,"componentType":5126,"count":3,"type":"VEC3","min":[0,0,0],"max":[1,1,0]},
  {"bufferView":1,"componentType":5126,"count":2,"type":"SCALAR","min":[0],"max":[1]},
  {"bufferView":2,"componentType":5126,"count":2,"type":"VEC3"}],
"bufferViews":[{"buffer":0,"byteLength":36},{"buffer":0,"byteOffset":36,"byteLength":8},
  {"buffer":0,"byteOffset":44,"byteLength":24}],
"buffers":[{"byteLength":68,"uri":"data.bin"}]})"));
    const std::vector<float> data = {0, 0, 0, 1, 0, 0, 0, 1, 0, 0, 1, 0, 5, 0, 10, 5, 0};
    const uint8_t* bytes = reinterpret_cast<const uint8_t*>(data.data());
    m_folder.write("data.bin", std::vector<uint8_t>(bytes, bytes + data.size() * sizeof(float)));
    convert::Options options;
    options.fps = 10.0;
    ASSERT_TRUE(convertAndLoad(m_folder.path("model.gltf"), options));

    const struct
    {
        const char* name;
        float start, end;
    } clips[] = {{"jump", 0.0f, 1.0f}, {"jump 2", 1.1f, 2.1f}, {"all clips", 0.0f, 2.1f}};
    ASSERT_EQ(3, m_loaded->getAnimationCount()); // the one that moves nothing is left out
    for (int i = 0; i < 3; ++i)
    {
        EXPECT_STREQ(clips[i].name, m_loaded->getAnimationName(i));
        EXPECT_FLOAT_EQ(clips[i].start, m_loaded->getAnimation(i)->getStart());
        EXPECT_FLOAT_EQ(clips[i].end, m_loaded->getAnimation(i)->getEnd());
    }
    EXPECT_FLOAT_EQ(2.1f, m_loaded->getLoopEnd());
    ASSERT_EQ(2u, m_model.clips.size());

    const struct
    {
        float time;
        Vector3f a, b;
    } moments[] = {{0.95f, {0, 5, 0}, {0, 0, 0}},
                   {1.0f, {10, 5, 0}, {0, 0, 0}},
                   {1.15f, {7, 0, 0}, {0, 5, 0}},
                   {2.0f, {7, 0, 0}, {0, 5, 0}},
                   {2.1f, {7, 0, 0}, {10, 5, 0}}};
    for (const auto& moment : moments)
    {
        m_loaded->getAnimationGroup()->apply(moment.time);
        EXPECT_EQ(moment.a, find("a")) << moment.time;
        EXPECT_EQ(moment.b, find("nodes[1]")) << moment.time;
    }
    for (const glo::Channel& channel : m_model.scene.animations.back().channels)
        EXPECT_EQ("translation", channel.property); // nothing else changes

    const std::vector<uint8_t> first = write(m_model.scene);
    ASSERT_TRUE(convertAndLoad(m_folder.path("model.gltf"), options));
    EXPECT_EQ(first, write(m_model.scene));
}

// Fault caught: libassimp's known faults: nodes of glTF 1.0, the bones of Half-Life models, the axes and the unit of
// FBX; and options that do not correct a file's own.
TEST_F(ConvertMotionTest, nodesAreWhereTheFileHasThem)
{
    const std::string models = MODELS;
    std::ifstream fbx(models + "FBX/cubes_with_mirroring_and_pivot.fbx");
    std::string text(std::istreambuf_iterator<char>(fbx), {});
    const auto replace = [&](const std::string& from, const std::string& to)
    {
        ASSERT_NE(std::string::npos, text.find(from)) << from;
        text.replace(text.find(from), from.size(), to);
    };
    replace("\"UpAxis\", \"int\", \"Integer\", \"\",1", "\"UpAxis\", \"int\", \"Integer\", \"\",2");
    replace("\"FrontAxis\", \"int\", \"Integer\", \"\",2", "\"FrontAxis\", \"int\", \"Integer\", \"\",1");
    replace("\"FrontAxisSign\", \"int\", \"Integer\", \"\",1",
            "\"FrontAxisSign\", \"int\", \"Integer\", \"\",-1");
    replace("\"Number\", \"\",100", "\"Number\", \"\",2.54");
    m_folder.write("inches.fbx", text);
    m_folder.write("tri.obj", std::string("g a\nv 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n"));
    const struct
    {
        std::string file;
        const char* up;
        double scale;
        const char* node;
        Vector3f place;
        float tolerance;
    } cases[] = {
        {models + "glTF/CesiumMilkTruck/CesiumMilkTruck.gltf",
         "",
         1.0,
         "Geometry-mesh001Node",
         {1.43267f, 0.427722f, 0.0f},
         1e-5f},
        {models + "MDL/MDL (HL1)/man.mdl", "", 1.0, "Neck", {0.0f, 7.71f, 0.0f}, 0.05f},
        {m_folder.path("inches.fbx"), "", 1000.0, "Cube2", {-0.264221f, -0.265115f, -0.253565f}, 1e-5f},
        {m_folder.path("inches.fbx"), "y", 1000.0, "Cube2", {-0.264221f, 0.253565f, -0.265115f}, 1e-5f},
    };
    convert::Options options;
    options.animation = false;
    for (const auto& item : cases)
    {
        options.up = item.up;
        options.scale = item.scale;
        ASSERT_TRUE(convertAndLoad(item.file, options));
        const Vector3f place = find(item.node);
        EXPECT_LT(length(place - item.place), item.tolerance)
            << item.file << ": " << place.x << " " << place.y << " " << place.z;
        EXPECT_EQ(Matrix4f::IDENTITY, m_loaded->getTopNode()->getWorldTransform());
    }
    options.up.clear();
    const struct
    {
        const char* file;
        const char* camera;
        Vector3f direction; // in which it looks, with +y up
    } cameras[] = {{"ASE/CameraRollAnim.ase", "Camera01", {0.9995f, 0.0f, 0.0f}},
                   {"BLEND/BlenderDefault_276.blend", "Camera", {-0.6549f, -0.4452f, -0.6107f}},
                   {"FBX/huesitos.fbx", "Camera", {-0.6549f, -0.4452f, -0.6107f}}};
    for (const auto& item : cameras)
    {
        ASSERT_TRUE(convertAndLoad(models + item.file, options));
        const SharedPtr<Camera> camera = m_loaded->getCamera(item.camera);
        ASSERT_TRUE(camera) << item.file;
        const Vector3f direction = -normalize(camera->getWorldTransform()[2].xyz());
        EXPECT_LT(length(direction - item.direction), 0.04f)
            << item.file << ": " << direction.x << " " << direction.y << " " << direction.z;
    }
    for (const auto& [up, wanted] : std::map<std::string, Vector3f>{
             {"x", {0.0f, 2.0f, 0.0f}}, {"y", {2.0f, 0.0f, 0.0f}}, {"z", {2.0f, 0.0f, 0.0f}}})
    {
        options.up = up;
        options.scale = 2.0;
        ASSERT_TRUE(convertAndLoad(m_folder.path("tri.obj"), options));
        const Posed posed = pose(0.0f);
        EXPECT_LT(length(posed.find({1, 0, 0})->second - wanted), 1e-5f) << up;
        const Vector3f upwards = up == "z"   ? Vector3f(0.0f, 0.0f, -2.0f)
                                 : up == "x" ? Vector3f(-2.0f, 0.0f, 0.0f)
                                             : Vector3f(0.0f, 2.0f, 0.0f);
        EXPECT_LT(length(posed.find({0, 1, 0})->second - upwards), 1e-5f) << up;
    }
}

namespace
{

/// A file of one triangle, and one second in which a channel goes from one value to another.
GltfWriter writeMove(const char* path, const std::vector<float>& values, const char* type)
{
    GltfWriter writer;
    writer.setAttribute("POSITION", writer.add(std::vector<float>{0, 0, 0, 1, 0, 0, 0, 1, 0}, "VEC3"));
    const size_t times = writer.add(std::vector<float>{0, 1}, "SCALAR");
    const size_t output = writer.add(values, type);
    writer.file["animations"] = {
        {{"name", "move"},
         {"samplers", {{{"input", times}, {"output", output}}}},
         {"channels", {{{"sampler", 0}, {"target", {{"node", 0}, {"path", path}}}}}}}};
    return writer;
}

/// The far corner of the triangle whose area can be seen; there is to be one.
Vector3f findSeen(SceneNode& node)
{
    Vector3f corner(NOT_THERE, NOT_THERE, NOT_THERE);
    int seen = 0;
    for (const SceneNode::Ptr& child : node.getChildren())
    {
        const Matrix4f world = child->getWorldTransform();
        if (child->getNodeType() != Solid::NODE_TYPE || length(world[0]) == 0.0f)
            continue;
        const SharedPtr<Mesh> mesh = static_cast<Solid&>(*child).getMesh();
        corner = Vector3f(world[3].x, world[3].y, mesh->getHeader().boundingRadius);
        ++seen;
    }
    EXPECT_EQ(1, seen);
    return corner;
}

} // namespace

// Fault caught: wrong orientation of animated nodes that mirror or have scale zero at rest: a matrix determines neither
// the mirrored axis nor, at scale zero, the rotation.
TEST_F(ConvertTest, nodesThatMatricesDoNotTell)
{
    const std::vector<float> half = {0, 1, 0, 0}; // a turn by half a circle around y
    const struct
    {
        const char* path;
        std::vector<float> values; ///< at 0 and 1 s
        const char* type;
        std::vector<float> rotation, scale; ///< of the node
        Vector3f x, y;                      ///< where the axes are at 1 s
    } cases[] = {
        {"rotation", {0, 0, 0, 1, 0, 1, 0, 0}, "VEC4", half, {-1, 1, 1}, {1, 0, 0}, {0, 1, 0}},
        {"scale", {-1, 1, 1, -2, 1, 1}, "VEC3", half, {-1, 1, 1}, {2, 0, 0}, {0, 1, 0}},
        {"scale", {0, 0, 0, 2, 2, 2}, "VEC3", half, {0, 0, 0}, {-2, 0, 0}, {0, 2, 0}},
        {"scale", {0, 0, 0, 2, 2, 2}, "VEC3", {0, 0, 0, 1}, {0, 0, 0}, {2, 0, 0}, {0, 2, 0}},
    };
    for (size_t i = 0; i < std::size(cases); ++i)
    {
        SCOPED_TRACE(i);
        GltfWriter writer = writeMove(cases[i].path, cases[i].values, cases[i].type);
        writer.file["nodes"][0]["rotation"] = cases[i].rotation;
        writer.file["nodes"][0]["scale"] = cases[i].scale;
        m_folder.write("model.glb", writer.write());
        const Glo::Ptr loaded = convertAndLoad("model.glb out.glo", "out.glo");
        ASSERT_TRUE(loaded);
        loaded->getAnimation("move")->apply(1.0f);
        const Matrix4f world = loaded->getTopNode()->find("node")->getWorldTransform();
        EXPECT_LT(length(world[0] - Vector4f(cases[i].x, 0.0f)), 1e-5f);
        EXPECT_LT(length(world[1] - Vector4f(cases[i].y, 0.0f)), 1e-5f);
    }
}

// Fault caught: shapes that do not move, two of them seen at once, none, or another than the weights of the moment make.
TEST_F(ConvertTest, weightsThatMoveBecomeMeshes)
{
    GltfWriter writer = writeMove("weights", {0.5f, 2.5f}, "SCALAR");
    const size_t target = writer.add(std::vector<float>{0, 0, 0, 0, 0, 0, 0, 4, 0}, "VEC3");
    writer.primitive()["targets"] = {{{"POSITION", target}}};
    for (const float rest : {0.0f, 0.5f}) // one of which no moment has
    {
        writer.file["nodes"][0]["weights"] = {rest};
        m_folder.write("model.glb", GltfWriter(writer).write());
        const Glo::Ptr loaded = convertAndLoad("model.glb out.glo --fps 20", "out.glo");
        ASSERT_TRUE(loaded);
        EXPECT_FALSE(reports("lost")) << m_outcome.output;
        EXPECT_TRUE(reports(rest == 0.0f ? "22 moving shapes" : "21 moving shapes")) << m_outcome.output;
        SceneNode* node = loaded->getTopNode()->find("node");
        EXPECT_NEAR(1.0f + 4.0f * rest, findSeen(*node).z, 1e-5f);
        for (const float time : {0.0f, 0.26f, 0.5f, 1.0f})
        {
            loaded->getAnimation("move")->apply(time);
            const float weight = 0.5f + 2.0f * std::floor(time * 20.0f + 0.001f) / 20.0f;
            EXPECT_NEAR(1.0f + 4.0f * weight, findSeen(*node).z, 1e-5f) << time;
        }
    }
    EXPECT_NE(std::string::npos, convert("model.glb many.glo --fps 200").output.find("50 times a second"));

    writer.file["skins"] = {{{"joints", {0}}}}; // joints take no account of the scale of a mesh's node
    writer.file["nodes"][0]["skin"] = 0;
    m_folder.write("model.glb", writer.write());
    EXPECT_NE(std::string::npos, convert("model.glb skin.glo").output.find("morphs meshes"));
}
