#include "orv/animationbounds.h"

#include "orv/animation.h"
#include "orv/scenebounds.h"

#include <algorithm>
#include <vector>

namespace orv
{

Bounds getWorldBounds(SceneNode& top, Animation& animation, int steps)
{
    std::vector<float> times;
    animation.addTimes(times);
    std::sort(times.begin(), times.end());
    times.erase(std::unique(times.begin(), times.end()), times.end());

    // The total sphere is around the centre of the total box, and contains the sphere of each sample.
    std::vector<Bounds> moments;
    Box box;
    for (size_t i = 0; i < times.size(); ++i)
    {
        const float length = i + 1 < times.size() ? times[i + 1] - times[i] : 0.0f;
        for (int step = 0; step < (length > 0.0f ? std::max(steps, 1) : 1); ++step)
        {
            animation.apply(times[i] + length * float(step) / float(std::max(steps, 1)));
            moments.push_back(getWorldBounds(top));
            box.add(moments.back().box);
        }
    }
    Bounds bounds(box, box.isEmpty() ? -1.0f : 0.0f);
    for (const Bounds& moment : moments)
    {
        if (moment.isKnown())
            bounds.radius =
                std::max(bounds.radius, length(moment.box.getCentre() - box.getCentre()) + moment.radius);
    }
    bounds.radius = std::min(bounds.radius, Bounds(box).radius);
    return bounds;
}

} // namespace orv
