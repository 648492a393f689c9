#include "animations.h"

#include "placement.h"

#include <assimp/anim.h>
#include <assimp/scene.h>

#include <algorithm>
#include <cmath>

namespace convert
{

namespace
{

constexpr double MOST_SAMPLES = 200000.0; // of one track: almost two hours at 30 a second
constexpr float TOLERANCE = 1e-6f;        // relative to the value

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
auto evaluate(const Key* keys, unsigned count, double time) -> decltype(keys->mValue)
{
    const Key* next = std::upper_bound(keys, keys + count, time,
                                       [](double wanted, const Key& key) { return wanted < key.mTime; });
    if (next == keys)
        return keys->mValue;
    const Key* previous = next - 1;
    if (next == keys + count || !(next->mTime > previous->mTime))
        return previous->mValue;
    return interpolate(*previous, *next, float((time - previous->mTime) / (next->mTime - previous->mTime)));
}

std::vector<float> toValues(const aiVector3D& v)
{
    return {float(v.x), float(v.y), float(v.z)};
}

std::vector<float> toValues(const aiQuaternion& rotation)
{
    const orv::Vector4f turn = toAxisAngle(rotation);
    return {turn.x, turn.y, turn.z, turn.w};
}

bool isSame(const std::vector<float>& a, const std::vector<float>& b)
{
    for (size_t i = 0; i < a.size(); ++i)
    {
        if (!(std::fabs(a[i] - b[i]) <= TOLERANCE * std::max(1.0f, std::fabs(a[i]))))
            return false;
    }
    return true;
}

/// When to sample: in ticks of the animation.
struct Sampling
{
    unsigned count;
    double ticksPerSample;
    double ticksPerSecond;
    double duration;

    double getTicks(unsigned sample) const { return std::min(duration, double(sample) * ticksPerSample); }
};

/// A key where the value changes, since values hold until the next key, and one at the end, which tells how long
/// the animation is. A track that stays as it is has one key.
template <class Key>
void addTrack(const Key* keys, unsigned keyCount, const char* property, const std::string& node,
              const Sampling& sampling, std::vector<glo::Channel>& channels)
{
    if (keyCount == 0)
        return;
    glo::Channel channel;
    channel.targetType = "node";
    channel.targetName = "node-" + node;
    channel.property = property;
    std::vector<float> last = toValues(evaluate(keys, keyCount, 0.0));
    glo::addKey(channel, 0.0f, last);
    for (unsigned sample = 1; sample < sampling.count; ++sample)
    {
        const double ticks = sampling.getTicks(sample);
        const std::vector<float> values = toValues(evaluate(keys, keyCount, ticks));
        const bool ends = sample + 1 == sampling.count && channel.keyCount > 1;
        if (isSame(values, last) && !ends)
            continue;
        glo::addKey(channel, float(ticks / sampling.ticksPerSecond), values);
        last = values;
    }
    channels.push_back(std::move(channel));
}

glo::AnimationData convertAnimation(const aiScene& scene, const aiAnimation& source,
                                    const std::map<const aiNode*, std::string>& nodeNames,
                                    const Sampling& sampling, Report& report)
{
    glo::AnimationData made;
    made.loopRanges.push_back({0.0f, float(sampling.duration / sampling.ticksPerSecond)});
    for (unsigned i = 0; i < source.mNumChannels; ++i)
    {
        const aiNodeAnim& channel = *source.mChannels[i];
        const auto node = nodeNames.find(scene.mRootNode->FindNode(channel.mNodeName));
        if (node == nodeNames.end())
        {
            report.lose("an animation channel of a node that is not there");
            continue;
        }
        addTrack(channel.mPositionKeys, channel.mNumPositionKeys, "translation", node->second, sampling,
                 made.channels);
        addTrack(channel.mRotationKeys, channel.mNumRotationKeys, "rotation", node->second, sampling,
                 made.channels);
        addTrack(channel.mScalingKeys, channel.mNumScalingKeys, "scale", node->second, sampling,
                 made.channels);
    }
    if (source.mNumMeshChannels + source.mNumMorphMeshChannels > 0)
        report.lose("an animation of a mesh's shape");
    return made;
}

} // namespace

std::vector<glo::AnimationData> convertAnimations(const aiScene& scene,
                                                  const std::map<const aiNode*, std::string>& nodeNames,
                                                  const Options& options, Report& report)
{
    constexpr double USUAL_TICKS_PER_SECOND = 25.0; // where the model does not say
    std::vector<glo::AnimationData> animations;
    NameMaker names;
    float end = 0.0f;
    for (unsigned i = 0; i < scene.mNumAnimations; ++i)
    {
        const aiAnimation& source = *scene.mAnimations[i];
        Sampling sampling;
        sampling.ticksPerSecond =
            source.mTicksPerSecond > 0.0 ? source.mTicksPerSecond : USUAL_TICKS_PER_SECOND;
        sampling.duration = source.mDuration;
        sampling.ticksPerSample = sampling.ticksPerSecond / options.fps;
        const double samples = std::ceil(sampling.duration / sampling.ticksPerSample - 1e-6);
        if (!(samples >= 0.0 && samples <= MOST_SAMPLES))
        {
            report.lose("animation \"" + std::string(source.mName.C_Str()) + "\", which is too long");
            continue;
        }
        sampling.count = unsigned(samples) + 1;
        animations.push_back(convertAnimation(scene, source, nodeNames, sampling, report));
        animations.back().name = names.make(source.mName.C_Str(), "animation");
        end = std::max(end, animations.back().loopRanges[0].end);
    }
    if (!animations.empty())
        animations.back().loopRanges[0].end = end; // the last range is the file's
    return animations;
}

} // namespace convert
