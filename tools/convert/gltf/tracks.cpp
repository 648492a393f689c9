#include "tracks.h"

#include <algorithm>
#include <cmath>

namespace convert::gltf
{

namespace
{

Track::Way toWay(const std::string& interpolation)
{
    return interpolation == "STEP"          ? Track::Way::STEP
           : interpolation == "CUBICSPLINE" ? Track::Way::SPLINE
                                            : Track::Way::LINE;
}

} // namespace

Track readTrack(Source& source, const Object& animation, const Object& channel, unsigned components)
{
    if (!channel.has("sampler"))
        channel.fail("has no sampler");
    const Object sampler = animation.at("samplers", channel.size("sampler", 0));
    if (!sampler.has("input") || !sampler.has("output"))
        sampler.fail("has no input or no output");
    const bool isWeights = channel.object("target").text("path") == "weights"; // single numbers
    Track track;
    track.way = toWay(sampler.text("interpolation"));
    track.times = source.accessors.read(sampler.size("input", 0), sampler, 1).values;
    track.values = source.accessors.read(sampler.size("output", 0), sampler, isWeights ? 1 : components);
    track.values.components = components;
    const size_t perTime = track.way == Track::Way::SPLINE ? 3 : 1;
    if (track.values.count() / perTime < track.times.size())
        sampler.fail("output", "has fewer elements than its times need");
    for (size_t i = 0; i < track.times.size(); ++i)
    {
        if (!std::isfinite(track.times[i]) || (i > 0 && track.times[i] < track.times[i - 1]))
            sampler.fail("input", "has times that do not ascend");
    }
    return track;
}

void evaluateSpline(const Track& track, size_t key, double time, float* value)
{
    const float span = track.times[key + 1] - track.times[key];
    const float t = span > 0.0f ? float((time - double(track.times[key])) / double(span)) : 0.0f;
    const float* from = track.values[key * 3 + 1];
    const float* leaving = track.values[key * 3 + 2];
    const float* arriving = track.values[key * 3 + 3];
    const float* to = track.values[key * 3 + 4];
    const float squared = t * t;
    const float cubed = squared * t;
    for (unsigned c = 0; c < track.values.components; ++c)
        value[c] = (2.0f * cubed - 3.0f * squared + 1.0f) * from[c] +
                   span * (cubed - 2.0f * squared + t) * leaving[c] +
                   (-2.0f * cubed + 3.0f * squared) * to[c] + span * (cubed - squared) * arriving[c];
}

void evaluate(const Track& track, double time, float* value)
{
    if (track.times.empty())
        return;
    const auto after = std::upper_bound(track.times.begin(), track.times.end(), float(time));
    const size_t next = size_t(after - track.times.begin());
    const size_t key = next > 0 ? next - 1 : 0;
    const float* from = track.values[track.getElement(key)];
    if (next == 0 || next == track.times.size() || track.way == Track::Way::STEP)
    {
        std::copy_n(from, track.values.components, value);
        return;
    }
    if (track.way == Track::Way::SPLINE)
        return evaluateSpline(track, key, time, value);
    const float* to = track.values[next];
    const double span = double(track.times[next]) - double(track.times[key]);
    const float share = float((time - double(track.times[key])) / span);
    for (unsigned c = 0; c < track.values.components; ++c)
        value[c] = std::lerp(from[c], to[c], share);
}

} // namespace convert::gltf
