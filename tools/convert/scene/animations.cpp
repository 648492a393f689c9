#include "animations.h"

#include "keychoice.h"
#include "placement.h"

#include <assimp/anim.h>
#include <assimp/mesh.h>
#include <assimp/scene.h>

#include <algorithm>
#include <cmath>

namespace convert
{

namespace
{

constexpr double MOST_SAMPLES = 200000.0;       // of one clip: almost two hours at 30 a second
constexpr double USUAL_TICKS_PER_SECOND = 25.0; // if the model does not specify it
constexpr float TOLERANCE = 1e-6f;              // relative to the value

enum class Property
{
    TRANSLATION,
    ROTATION,
    SCALE
};

constexpr const char* PROPERTY_NAMES[] = {"translation", "rotation", "scale"};

aiVector3D interpolate(const aiVectorKey& a, const aiVectorKey& b, float factor)
{
    return a.mValue + (b.mValue - a.mValue) * factor;
}

aiQuaternion interpolate(const aiQuatKey& a, const aiQuatKey& b, float factor)
{
    aiQuaternion value;
    aiQuaternion::Interpolate(value, a.mValue, b.mValue, factor);
    return value.Normalize();
}

/// The first key holds before its time, the last one after its.
template <class Key>
auto evaluate(const Key* keys, unsigned count, double ticks) -> decltype(keys->mValue)
{
    const Key* next = std::upper_bound(keys, keys + count, ticks,
                                       [](double wanted, const Key& key) { return wanted < key.mTime; });
    if (next == keys)
        return keys->mValue;
    const Key* previous = next - 1;
    if (next == keys + count || !(next->mTime > previous->mTime))
        return previous->mValue;
    return interpolate(*previous, *next, float((ticks - previous->mTime) / (next->mTime - previous->mTime)));
}

using Values = std::vector<float>;

Values toValues(const orv::Vector3f& v)
{
    return {v.x, v.y, v.z};
}

Values toValues(const orv::Vector4f& v)
{
    return {v.x, v.y, v.z, v.w};
}

/// The node's values at rest.
Values getRest(const glo::NodeData& rest, Property property)
{
    switch (property)
    {
    case Property::TRANSLATION: return toValues(rest.translation);
    case Property::ROTATION: return toValues(rest.rotation);
    case Property::SCALE: break;
    }
    return toValues(rest.scale);
}

Values sample(const aiNodeAnim& channel, Property property, double ticks, const glo::NodeData& rest)
{
    switch (property)
    {
    case Property::TRANSLATION:
        if (channel.mNumPositionKeys > 0)
            return toValues(toVector(evaluate(channel.mPositionKeys, channel.mNumPositionKeys, ticks)));
        break;
    case Property::ROTATION:
        if (channel.mNumRotationKeys > 0)
            return toValues(toAxisAngle(evaluate(channel.mRotationKeys, channel.mNumRotationKeys, ticks)));
        break;
    case Property::SCALE:
        if (channel.mNumScalingKeys > 0)
            return toValues(toVector(evaluate(channel.mScalingKeys, channel.mNumScalingKeys, ticks)));
        break;
    }
    return getRest(rest, property);
}

/// Times of keys that have the same time as the key before.
template <class Key>
std::vector<double> findJumps(const Key* keys, unsigned count)
{
    std::vector<double> times;
    for (unsigned i = 1; i < count; ++i)
    {
        if (keys[i].mTime == keys[i - 1].mTime)
            times.push_back(keys[i].mTime);
    }
    return times;
}

/// In ticks.
std::vector<double> listJumps(const aiNodeAnim& channel, Property property)
{
    switch (property)
    {
    case Property::TRANSLATION: return findJumps(channel.mPositionKeys, channel.mNumPositionKeys);
    case Property::ROTATION: return findJumps(channel.mRotationKeys, channel.mNumRotationKeys);
    case Property::SCALE: break;
    }
    return findJumps(channel.mScalingKeys, channel.mNumScalingKeys);
}

/// Selects the relevant keys of a model: those in a clip; of several within a sample's time the first; and all keys of
/// the same time as the one before.
struct KeyRange
{
    double end; ///< in ticks, as all times of keys
    double samplesPerTick;
};

template <class Key, class Convert>
void appendKeys(const Key* keys, unsigned count, const KeyRange& range, const Convert& toValue,
                std::vector<Sample>& samples)
{
    double last = 0.0; // earlier keys, and those that go back in time, are skipped
    double lastSample = -1.0;
    for (unsigned i = 0; i < count; ++i)
    {
        const double time = keys[i].mTime;
        if (!(time >= last && time <= range.end))
            continue;
        const double sample = std::floor(time * range.samplesPerTick + 1e-6);
        const bool isJump =
            (i > 0 && keys[i - 1].mTime == time) || (i + 1 < count && keys[i + 1].mTime == time);
        if (sample <= lastSample && !isJump)
            continue;
        last = time;
        lastSample = sample;
        samples.push_back({time, toValue(keys[i].mValue)});
    }
}

void appendKeys(const aiNodeAnim& channel, Property property, const KeyRange& range,
                std::vector<Sample>& samples)
{
    const auto toPlace = [](const aiVector3D& v) { return orv::Vector4f(toVector(v), 0.0f); };
    switch (property)
    {
    case Property::TRANSLATION:
        return appendKeys(channel.mPositionKeys, channel.mNumPositionKeys, range, toPlace, samples);
    case Property::ROTATION:
        return appendKeys(channel.mRotationKeys, channel.mNumRotationKeys, range, toAxisAngle, samples);
    case Property::SCALE: break;
    }
    appendKeys(channel.mScalingKeys, channel.mNumScalingKeys, range, toPlace, samples);
}

orv::Vector4f toVector4(const Values& values)
{
    return orv::Vector4f(values[0], values[1], values[2], values.size() > 3 ? values[3] : 0.0f);
}

Values toValues(const Sample& sample, Property property)
{
    if (property == Property::ROTATION)
        return toValues(sample.value);
    return toValues(sample.value.xyz());
}

/// Sizes of a model at rest.
struct Extent
{
    aiVector3D low = aiVector3D(HUGE_VALF);
    aiVector3D high = aiVector3D(-HUGE_VALF);

    void add(const aiVector3D& place)
    {
        for (unsigned i = 0; i < 3; ++i)
        {
            low[i] = std::min(low[i], place[i]);
            high[i] = std::max(high[i], place[i]);
        }
    }
    /// The diagonal; 0 without vertices.
    float getLength() const { return low.x <= high.x ? (high - low).Length() : 0.0f; }
};

void measure(const aiScene& scene, const aiNode& node, const aiMatrix4x4& above, Extent& nodes,
             Extent& vertices)
{
    const aiMatrix4x4 world = above * node.mTransformation;
    nodes.add(world * aiVector3D());
    for (unsigned i = 0; i < node.mNumMeshes; ++i)
    {
        const aiMesh& mesh = *scene.mMeshes[node.mMeshes[i]];
        for (unsigned v = 0; v < mesh.mNumVertices; ++v)
            vertices.add(world * mesh.mVertices[v]);
    }
    for (unsigned i = 0; i < node.mNumChildren; ++i)
        measure(scene, *node.mChildren[i], world, nodes, vertices);
}

/// The largest factor by which the world scales a node's children.
float findScale(const aiNode* node)
{
    aiMatrix4x4 world;
    for (; node; node = node->mParent)
        world = node->mTransformation * world;
    float largest = 0.0f;
    for (unsigned i = 0; i < 3; ++i)
        largest = std::max(largest, aiVector3D(world[0][i], world[1][i], world[2][i]).Length());
    return largest > 0.0f && std::isfinite(largest) ? largest : 1.0f;
}

bool isSame(const Values& a, const Values& b)
{
    return std::equal(a.begin(), a.end(), b.begin(),
                      [](float x, float y)
                      { return std::fabs(x - y) <= TOLERANCE * std::max(1.0f, std::fabs(x)); });
}

glo::Channel makeChannel(const std::string& node, const char* property)
{
    glo::Channel channel;
    channel.targetType = "node";
    channel.targetName = "node-" + node; // the prefix is taken off, so a name may begin with it
    channel.property = property;
    return channel;
}

/// An animation of the model and how it is sampled.
struct Source
{
    ModelClip clip;
    unsigned sampleCount;
    double ticksPerSecond;
    double duration; ///< in ticks
    std::map<const aiNode*, const aiNodeAnim*> channels;
};

class MotionMaker
{
public:
    MotionMaker(const aiScene& scene, const NodeNames& nodeNames, const std::string& clipNode,
                const Options& options, Report& report)
        : m_scene(scene)
        , m_nodeNames(nodeNames)
        , m_clipNode(clipNode)
        , m_fps(options.fps)
        , m_isSparse(options.sparseKeys)
        , m_keyError(options.keyError)
        , m_report(report)
    {
        if (!m_isSparse)
            return;
        Extent nodes;
        Extent vertices;
        measure(scene, *scene.mRootNode, aiMatrix4x4(), nodes, vertices);
        const float length = vertices.getLength() > 0.0f ? vertices.getLength() : nodes.getLength();
        m_length = length > 0.0f && std::isfinite(length) ? double(length) : 1.0;
    }

    Motion make()
    {
        for (unsigned i = 0; i < m_scene.mNumAnimations; ++i)
            addSource(*m_scene.mAnimations[i]);
        if (m_sources.empty())
            return {};
        m_all.loopRanges.push_back({0.0f, m_sources.back().clip.end});
        addTracks(*m_scene.mRootNode);

        Motion motion;
        for (const Source& source : m_sources)
            motion.clips.push_back(source.clip);
        if (m_sources.size() > 1)
        {
            for (const ModelClip& clip : motion.clips)
                motion.animations.push_back(makeMark(clip));
        }
        motion.usesClipNode = m_sources.size() > 1 || m_all.channels.empty();
        m_all.name = m_sources.size() > 1 ? m_names.make("all clips", "") : m_sources[0].clip.name;
        if (m_all.channels.empty()) // nothing moves, but it has a length
            m_all.channels = makeMark({"", 0.0f, m_sources.back().clip.end}).channels;
        else
            extend(m_all.channels.front());
        motion.animations.push_back(std::move(m_all));
        return motion;
    }

private:
    void addSource(const aiAnimation& animation)
    {
        const std::string name = m_names.make(animation.mName.C_Str(), "animation");
        Source source;
        source.ticksPerSecond =
            animation.mTicksPerSecond > 0.0 ? animation.mTicksPerSecond : USUAL_TICKS_PER_SECOND;
        source.duration = std::max(animation.mDuration, 0.0);
        const double seconds = source.duration / source.ticksPerSecond;
        const double samples = std::ceil(seconds * m_fps - 1e-6);
        if (!(samples >= 0.0 && samples <= MOST_SAMPLES))
        {
            m_report.lose("animation", "animation \"" + name + "\", which is too long");
            return;
        }
        source.sampleCount = unsigned(samples) + 1;
        const double start = m_sources.empty() ? 0.0 : double(m_sources.back().clip.end) + 1.0 / m_fps;
        source.clip = {name, float(start), float(start + seconds)};
        if (animation.mNumMeshChannels + animation.mNumMorphMeshChannels > 0)
            m_report.lose("morph-animation", "how animation \"" + name + "\" morphs meshes");
        for (unsigned i = 0; i < animation.mNumChannels; ++i)
            addChannel(*animation.mChannels[i], source);
        m_sources.push_back(std::move(source));
    }

    void addChannel(const aiNodeAnim& channel, Source& source)
    {
        const std::string what =
            "of \"" + std::string(channel.mNodeName.C_Str()) + "\" in animation \"" + source.clip.name + "\"";
        const aiNode* node = m_scene.mRootNode->FindNode(channel.mNodeName);
        if (!node)
            m_report.lose("animation-target", "the movement " + what + ": there is no such node");
        else if (!source.channels.emplace(node, &channel).second)
            m_report.lose("animation-target", "a second movement " + what);
        const auto isEndless = [](aiAnimBehaviour behaviour)
        { return behaviour == aiAnimBehaviour_LINEAR || behaviour == aiAnimBehaviour_REPEAT; };
        if (isEndless(channel.mPreState) || isEndless(channel.mPostState))
            m_report.approximate("animation-ends", "how the movement " + what +
                                                       " goes on before its first and after its last key");
    }

    void addTracks(const aiNode& node)
    {
        const bool isMoved =
            std::any_of(m_sources.begin(), m_sources.end(),
                        [&](const Source& source) { return source.channels.count(&node) > 0; });
        if (isMoved)
        {
            glo::NodeData rest;
            place(rest, node.mTransformation);
            for (const Property property : {Property::TRANSLATION, Property::ROTATION, Property::SCALE})
                addTrack(node, property, rest);
        }
        for (unsigned i = 0; i < node.mNumChildren; ++i)
            addTracks(*node.mChildren[i]);
    }

    /// A constant track has one key, or none if its value is the node's own.
    void addTrack(const aiNode& node, Property property, const glo::NodeData& rest)
    {
        glo::Channel track = makeChannel(m_nodeNames.at(&node), PROPERTY_NAMES[size_t(property)]);
        const Values last =
            m_isSparse ? addSparseKeys(track, node, property, rest) : addSteps(track, node, property, rest);
        if (track.keyCount == 1 && isSame(last, getRest(rest, property)))
            return;
        m_lastOfFirst = m_all.channels.empty() ? last : m_lastOfFirst;
        m_all.channels.push_back(std::move(track));
    }

    /// A key where the value changes, since values hold until the next key.
    /// @return the last key's values.
    Values addSteps(glo::Channel& track, const aiNode& node, Property property,
                    const glo::NodeData& rest) const
    {
        const Values restValues = getRest(rest, property);
        Values last;
        for (const Source& source : m_sources)
        {
            const auto channel = source.channels.find(&node);
            const bool isMoved = channel != source.channels.end();
            for (const double seconds :
                 isMoved ? listTimes(source, *channel->second, property) : std::vector<double>{0.0})
            {
                const Values values =
                    isMoved ? sample(*channel->second, property, seconds * source.ticksPerSecond, rest)
                            : restValues;
                if (!last.empty() && isSame(values, last))
                    continue;
                glo::addKey(track, float(double(source.clip.start) + seconds), values);
                last = values;
            }
        }
        return last;
    }

    /// Keys where the movement bends, since the engine interpolates between them.
    /// @return the last key's values.
    Values addSparseKeys(glo::Channel& track, const aiNode& node, Property property,
                         const glo::NodeData& rest) const
    {
        std::vector<Sample> samples;
        for (const Source& source : m_sources)
            appendSamples(source, node, property, rest, samples);
        double error = m_keyError;
        if (property == Property::TRANSLATION)
            error *= m_length / double(findScale(node.mParent));
        std::vector<size_t> keys = chooseKeys(samples, property == Property::ROTATION, error);
        // A value constant to the end needs only its first key.
        while (keys.size() > 1 && isSame(toValues(samples[keys[keys.size() - 2]], property),
                                         toValues(samples[keys.back()], property)))
            keys.pop_back();
        track.interpolation = glo::interpolation::LINEAR;
        for (const size_t key : keys)
            glo::addKey(track, float(samples[key].seconds), toValues(samples[key], property));
        return toValues(samples[keys.back()], property);
    }

    /// The samples to approximate: the model's keys, and the values at both ends of a clip.
    void appendSamples(const Source& source, const aiNode& node, Property property, const glo::NodeData& rest,
                       std::vector<Sample>& samples) const
    {
        const size_t first = samples.size();
        const auto channel = source.channels.find(&node);
        const auto evaluateAt = [&](double ticks)
        {
            return toVector4(channel != source.channels.end()
                                 ? sample(*channel->second, property, ticks, rest)
                                 : getRest(rest, property));
        };
        if (channel != source.channels.end())
            appendKeys(*channel->second, property, {source.duration, m_fps / source.ticksPerSecond}, samples);
        if (samples.size() == first || samples[first].seconds > 0.0)
            samples.insert(samples.begin() + std::ptrdiff_t(first), {0.0, evaluateAt(0.0)});
        if (samples.back().seconds < source.duration)
            samples.push_back({source.duration, evaluateAt(source.duration)});
        for (size_t i = first; i < samples.size(); ++i) // seconds on the time line, rounded as in the file
            samples[i].seconds =
                double(float(double(source.clip.start) + samples[i].seconds / source.ticksPerSecond));
    }

    /// Times of samples in seconds: evenly spaced, the end, and jumps.
    std::vector<double> listTimes(const Source& source, const aiNodeAnim& channel, Property property) const
    {
        const double end = source.duration / source.ticksPerSecond;
        std::vector<double> times = listJumps(channel, property);
        for (double& time : times)
            time = std::clamp(time / source.ticksPerSecond, 0.0, end);
        for (unsigned i = 0; i < source.sampleCount; ++i)
            times.push_back(std::min(double(i) / m_fps, end));
        std::sort(times.begin(), times.end());
        return times;
    }

    /// Repeats the last key at the end of the time line, to give it its length.
    void extend(glo::Channel& track) const
    {
        if (m_sources.back().clip.end > 0.0f)
            glo::addKey(track, m_sources.back().clip.end, m_lastOfFirst);
    }

    /// An animation that lasts from a clip's start to its end and moves nothing.
    glo::AnimationData makeMark(const ModelClip& clip) const
    {
        glo::AnimationData mark;
        mark.name = clip.name;
        mark.loopRanges.push_back({clip.start, clip.end});
        glo::Channel& channel = mark.channels.emplace_back(makeChannel(m_clipNode, "translation"));
        glo::addKey(channel, clip.start, {0.0f, 0.0f, 0.0f});
        if (clip.end > clip.start)
            glo::addKey(channel, clip.end, {0.0f, 0.0f, 0.0f});
        return mark;
    }

    const aiScene& m_scene;
    const NodeNames& m_nodeNames;
    const std::string& m_clipNode;
    double m_fps;
    bool m_isSparse;
    double m_keyError;
    double m_length = 1.0; ///< the model's diagonal at rest
    Report& m_report;
    NameMaker m_names;
    std::vector<Source> m_sources;
    glo::AnimationData m_all;
    Values m_lastOfFirst; ///< the last value of the first channel
};

} // namespace

Motion convertAnimations(const aiScene& scene, const NodeNames& nodeNames, const std::string& clipNode,
                         const Options& options, Report& report)
{
    return MotionMaker(scene, nodeNames, clipNode, options, report).make();
}

} // namespace convert
