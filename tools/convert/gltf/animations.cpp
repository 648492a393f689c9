#include "animations.h"

#include "tracks.h"

#include <assimp/anim.h>

#include <algorithm>
#include <cmath>
#include <cstring>

namespace convert::gltf
{

namespace
{

constexpr double MOST_SAMPLES = 200000.0; // the conversion drops longer animations

using Value = std::array<float, 4>;

Value getValue(const Column& column, size_t element)
{
    Value value{};
    std::copy(column[element], column[element] + column.components, value.begin());
    return value;
}

struct Key
{
    double time;
    Value value;
};

/// Keys for linear interpolation.
class KeyMaker
{
public:
    KeyMaker(const Track& track, double fps) : m_track(track), m_fps(fps) {}

    std::vector<Key> make()
    {
        for (size_t i = 0; i < m_track.times.size(); ++i)
        {
            const double time = double(m_track.times[i]);
            if (i > 0 && m_track.way == Track::Way::STEP)
                m_keys.push_back({time, m_keys.back().value});
            if (i > 0 && m_track.way == Track::Way::SPLINE)
                sample(i - 1);
            m_keys.push_back({time, getValue(m_track.values, m_track.getElement(i))});
        }
        return std::move(m_keys);
    }

private:
    void sample(size_t key)
    {
        const double start = double(m_track.times[key]);
        const double end = double(m_track.times[key + 1]);
        if (double(m_track.times.back()) * m_fps > MOST_SAMPLES)
            return;
        // From 0 on, where sampling begins: damaged times may be far below 0.
        for (double i = std::max(0.0, std::floor(start * m_fps) + 1.0); i / m_fps < end; i += 1.0)
        {
            if (i / m_fps <= start)
                continue;
            m_keys.push_back({i / m_fps, {}});
            evaluateSpline(m_track, key, i / m_fps, m_keys.back().value.data());
        }
    }

    const Track& m_track;
    double m_fps;
    std::vector<Key> m_keys;
};

/// A node's keys while they are collected.
struct Movement
{
    std::vector<Key> translation, rotation, scale;
    std::vector<Key>* find(const std::string& path)
    {
        return path == "translation" ? &translation
               : path == "rotation"  ? &rotation
               : path == "scale"     ? &scale
                                     : nullptr;
    }
};

aiVectorKey* toVectorKeys(const std::vector<Key>& keys)
{
    aiVectorKey* made = new aiVectorKey[keys.size()];
    for (size_t i = 0; i < keys.size(); ++i)
        made[i] = aiVectorKey(keys[i].time, aiVector3D(keys[i].value[0], keys[i].value[1], keys[i].value[2]));
    return made;
}

aiQuatKey* toQuatKeys(const std::vector<Key>& keys)
{
    aiQuatKey* made = new aiQuatKey[keys.size()];
    for (size_t i = 0; i < keys.size(); ++i)
    {
        const Value& v = keys[i].value;
        made[i] = aiQuatKey(keys[i].time, aiQuaternion(v[3], v[0], v[1], v[2]));
        if (v[0] * v[0] + v[1] * v[1] + v[2] * v[2] + v[3] * v[3] > 0.0f)
            made[i].mValue.Normalize();
        else
            made[i].mValue = aiQuaternion();
    }
    return made;
}

aiNodeAnim* toChannel(const std::string& node, const Movement& movement)
{
    aiNodeAnim* made = new aiNodeAnim;
    made->mNodeName = aiString(node);
    made->mNumPositionKeys = unsigned(movement.translation.size());
    made->mPositionKeys = toVectorKeys(movement.translation);
    made->mNumRotationKeys = unsigned(movement.rotation.size());
    made->mRotationKeys = toQuatKeys(movement.rotation);
    made->mNumScalingKeys = unsigned(movement.scale.size());
    made->mScalingKeys = toVectorKeys(movement.scale);
    return made;
}

class AnimationReader
{
public:
    AnimationReader(Source& source, size_t number, const std::vector<std::string>& nodeNames,
                    const std::map<size_t, MovingShapes>& shapes)
        : m_source(source)
        , m_number(number)
        , m_animation(source.document.root().at("animations", number))
        , m_nodeNames(nodeNames)
        , m_shapes(shapes)
        , m_made(std::make_unique<aiAnimation>())
    {
    }

    std::unique_ptr<aiAnimation> read()
    {
        m_made->mName = aiString(m_animation.has("name") ? getName(m_animation) : "");
        m_made->mTicksPerSecond = 1.0;
        for (size_t i = 0; i < m_animation.length("channels"); ++i)
            readOrLose(m_animation.at("channels", i));
        std::vector<aiNodeAnim*> channels;
        for (auto& [node, movement] : m_movements)
        {
            fillRest(m_source.document.root().at("nodes", node), movement);
            channels.push_back(toChannel(m_nodeNames[node], movement));
        }
        for (const auto& [node, shapes] : m_shapes)
        {
            const std::vector<aiNodeAnim*> shown = showShapes(shapes, m_number);
            channels.insert(channels.end(), shown.begin(), shown.end());
        }
        if (channels.empty()) // libassimp would leak an empty array
            return std::move(m_made);
        m_made->mNumChannels = unsigned(channels.size());
        m_made->mChannels = new aiNodeAnim*[channels.size()];
        std::copy(channels.begin(), channels.end(), m_made->mChannels);
        return std::move(m_made);
    }

private:
    /// A damaged animation is left out, and the model is converted.
    void readOrLose(const Object& channel)
    {
        try
        {
            readChannel(channel);
        }
        catch (const Fault& fault)
        {
            loseTarget(std::string("a movement that is damaged: ") + fault.what());
        }
    }

    void readChannel(const Object& channel)
    {
        const Object target = channel.object("target");
        const std::optional<size_t> node = target.index("node");
        const std::string path = target.text("path");
        if (path == "weights")
            return noteMorph(channel, node && m_shapes.count(*node) > 0);
        if (!node || *node >= m_nodeNames.size() || !Movement().find(path))
            return loseTarget("a movement of what is no node's");
        if (m_nodeNames[*node].empty())
            return; // of another scene
        std::vector<Key>& keys = *m_movements[*node].find(path);
        if (!keys.empty())
            return loseTarget("a second " + path + " of \"" + m_nodeNames[*node] + "\"");
        keys = KeyMaker(readTrack(m_source, m_animation, channel, path == "rotation" ? 4 : 3),
                        m_source.options.fps)
                   .make();
        if (!keys.empty())
            m_made->mDuration = std::max(m_made->mDuration, keys.back().time);
    }

    void loseTarget(const std::string& what)
    {
        m_source.report.lose("animation-target",
                             what + " in animation \"" + std::string(m_made->mName.C_Str()) + "\"");
    }

    /// A matrix does not determine the rotation of a node of scale zero, nor the mirrored axis of a mirroring one. So
    /// values that are not animated come from the file.
    static void fillRest(const Object& node, Movement& movement)
    {
        Value rotation = {0.0f, 0.0f, 0.0f, 1.0f};
        Value scale = {1.0f, 1.0f, 1.0f};
        node.numbers("rotation", rotation);
        node.numbers("scale", std::span(scale).first(3));
        if (node.has("matrix") || *std::min_element(scale.begin(), scale.begin() + 3) > 0.0f)
            return;
        if (movement.rotation.empty())
            movement.rotation.push_back({0.0, rotation});
        if (movement.scale.empty())
            movement.scale.push_back({0.0, scale});
    }

    /// A channel without keys, for the report.
    /// @param isShown  meshes replace the weights.
    void noteMorph(const Object& channel, bool isShown)
    {
        const Object sampler = m_animation.at("samplers", channel.size("sampler", 0));
        const Column times = m_source.accessors.read(sampler.size("input", 0), sampler, 1);
        if (!times.values.empty() && std::isfinite(times.values.back()))
            m_made->mDuration = std::max(m_made->mDuration, double(times.values.back()));
        if (isShown || m_made->mNumMorphMeshChannels > 0)
            return;
        m_made->mNumMorphMeshChannels = 1;
        m_made->mMorphMeshChannels = new aiMeshMorphAnim* [1] { new aiMeshMorphAnim };
    }

    Source& m_source;
    size_t m_number;
    Object m_animation;
    const std::vector<std::string>& m_nodeNames;
    const std::map<size_t, MovingShapes>& m_shapes; ///< by number of node
    std::unique_ptr<aiAnimation> m_made;
    std::map<size_t, Movement> m_movements; ///< by number of node
};

} // namespace

std::unique_ptr<aiAnimation> readAnimation(Source& source, size_t number,
                                           const std::vector<std::string>& nodeNames,
                                           const std::map<size_t, MovingShapes>& shapes)
{
    return AnimationReader(source, number, nodeNames, shapes).read();
}

} // namespace convert::gltf
