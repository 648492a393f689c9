#include "shapes.h"

#include "tracks.h"

#include <assimp/anim.h>

#include <algorithm>

namespace convert::gltf
{

namespace
{

constexpr size_t MOST_SHAPES = 64;       // each is drawn, visible or not
constexpr size_t MOST_VERTICES = 65536;  // of all shapes of a file
constexpr double MOST_SAMPLES = 20000.0; // of one clip
constexpr double FEWEST_A_SECOND = 8.0;

constexpr size_t TRIANGLES = 4; // first primitive mode that is invisible at scale zero

/// A node whose mesh changes, and the animations of its weights.
struct Mover
{
    std::vector<float> rest; ///< empty if meshes cannot replace the weights
    size_t vertexCount = 0;
    std::map<size_t, Track> tracks; ///< by number of the animation
};

class ShapeFinder
{
public:
    ShapeFinder(Source& source, const std::vector<std::string>& nodeNames)
        : m_source(source)
        , m_root(source.document.root())
        , m_nodeNames(nodeNames)
    {
    }

    std::map<size_t, MovingShapes> find()
    {
        const size_t count = m_source.options.animation ? m_root.length("animations") : 0;
        for (size_t i = 0; i < count; ++i)
        {
            const Object animation = m_root.at("animations", i);
            for (size_t c = 0; c < animation.length("channels"); ++c)
                addOrPass(i, animation, animation.at("channels", c));
        }
        std::map<size_t, MovingShapes> found;
        for (const auto& [node, mover] : m_movers)
        {
            MovingShapes shapes;
            if (!mover.rest.empty() && sample(mover, shapes))
                found[node] = std::move(shapes);
        }
        return found;
    }

private:
    /// Damage is reported where the animation is read.
    void addOrPass(size_t number, const Object& animation, const Object& channel)
    {
        try
        {
            add(number, animation, channel);
        }
        catch (const Fault&)
        {
            m_movers[channel.object("target").size("node", 0)] = Mover();
        }
    }

    void add(size_t number, const Object& animation, const Object& channel)
    {
        const Object target = channel.object("target");
        const std::optional<size_t> node = target.index("node");
        if (target.text("path") != "weights" || !node || *node >= m_nodeNames.size() ||
            m_nodeNames[*node].empty())
            return;
        if (m_movers.count(*node) == 0)
            m_movers[*node] = makeMover(m_root.at("nodes", *node));
        Mover& mover = m_movers[*node];
        if (!mover.rest.empty())
            mover.tracks.emplace(number,
                                 readTrack(m_source, animation, channel, unsigned(mover.rest.size())));
    }

    Mover makeMover(const Object& node)
    {
        if (!node.has("mesh") || node.has("skin") || node.extension("EXT_mesh_gpu_instancing"))
            return {};
        const Object mesh = m_source.document.find("meshes", node, "mesh");
        Mover mover;
        mover.rest = node.has("weights") ? node.numbers("weights") : mesh.numbers("weights");
        size_t targets = 0;
        for (size_t i = 0; i < mesh.length("primitives"); ++i)
        {
            const Object primitive = mesh.at("primitives", i);
            if (primitive.size("mode", TRIANGLES) < TRIANGLES)
                return {};
            targets = std::max(targets, primitive.length("targets"));
            const Object attributes = primitive.object("attributes");
            if (attributes.has("POSITION"))
                mover.vertexCount += m_source.accessors.count(attributes.size("POSITION", 0), attributes);
        }
        mover.rest.resize(targets);
        return mover;
    }

    /// With fewer samples a second if there would be too many shapes.
    bool sample(const Mover& mover, MovingShapes& shapes)
    {
        const double fps = m_source.options.fps;
        const size_t room =
            std::min(MOST_SHAPES, (MOST_VERTICES - m_vertexCount) / std::max<size_t>(mover.vertexCount, 1));
        for (size_t step = 1; step == 1 || fps / double(step) >= FEWEST_A_SECOND; ++step)
        {
            shapes = MovingShapes();
            shapes.weights.push_back(mover.rest);
            m_known = {{mover.rest, 0}};
            const bool fits = std::all_of(
                mover.tracks.begin(), mover.tracks.end(),
                [&](const auto& track)
                { return sampleClip(track.second, step, room, shapes, shapes.changes[track.first]); });
            if (!fits)
                continue;
            m_vertexCount += shapes.weights.size() * mover.vertexCount;
            m_source.report.count("moving-shapes", shapes.weights.size());
            if (step > 1)
                m_source.report.approximate("shape-steps", "moving shapes (a new one " +
                                                               std::to_string(int(fps / double(step))) +
                                                               " times a second)");
            return true;
        }
        return false;
    }

    bool sampleClip(const Track& track, size_t step, size_t room, MovingShapes& shapes,
                    MovingShapes::Changes& changes)
    {
        std::vector<float> weights = shapes.weights[0];
        for (const double time : listTimes(track, step))
        {
            evaluate(track, time, weights.data());
            const auto [known, isNew] = m_known.emplace(weights, shapes.weights.size());
            if (isNew)
                shapes.weights.push_back(weights);
            if (shapes.weights.size() > room)
                return false;
            if (changes.empty() || changes.back().second != known->second)
                changes.emplace_back(changes.empty() ? 0.0 : time, known->second);
        }
        return !changes.empty();
    }

    /// At the conversion's samples, or at every step-th of them; stepped tracks at their own times.
    /// @return none if there would be too many.
    std::vector<double> listTimes(const Track& track, size_t step) const
    {
        if (track.way == Track::Way::STEP)
            return {track.times.begin(), track.times.end()};
        const double fps = m_source.options.fps;
        const double end = track.times.empty() ? 0.0 : std::max(0.0, double(track.times.back()));
        std::vector<double> times;
        if (end * fps > MOST_SAMPLES)
            return times;
        for (double i = 0.0; i < end * fps - 1e-6; i += double(step))
            times.push_back(i / fps);
        times.push_back(end);
        return times;
    }

    Source& m_source;
    Object m_root;
    const std::vector<std::string>& m_nodeNames;
    std::map<size_t, Mover> m_movers;
    std::map<std::vector<float>, size_t> m_known; ///< shapes of the current mover
    size_t m_vertexCount = 0;                     ///< of all shapes so far
};

} // namespace

std::map<size_t, MovingShapes> findMovingShapes(Source& source, const std::vector<std::string>& nodeNames)
{
    return ShapeFinder(source, nodeNames).find();
}

std::vector<aiNodeAnim*> showShapes(const MovingShapes& shapes, size_t animation)
{
    const auto found = shapes.changes.find(animation);
    if (found == shapes.changes.end())
        return {};
    std::vector<aiNodeAnim*> channels;
    for (size_t shape = 0; shape < shapes.nodes.size(); ++shape)
    {
        std::vector<aiVectorKey> keys;
        for (const auto& [time, seen] : found->second)
        {
            const float size = seen == shape ? 1.0f : 0.0f;
            if (!keys.empty() && keys.back().mValue.x == size)
                continue;
            if (!keys.empty())
                keys.emplace_back(time, keys.back().mValue);
            keys.emplace_back(time, aiVector3D(size, size, size));
        }
        aiNodeAnim* channel = channels.emplace_back(new aiNodeAnim);
        channel->mNodeName = aiString(shapes.nodes[shape]);
        channel->mNumScalingKeys = unsigned(keys.size());
        channel->mScalingKeys = new aiVectorKey[keys.size()];
        std::copy(keys.begin(), keys.end(), channel->mScalingKeys);
    }
    return channels;
}

} // namespace convert::gltf
