#pragma once

#include "orv/vector.h"

namespace orv
{
class SceneNode;
}

/// A box along the axes of the world around the bounding spheres of all solids met.
struct SceneBounds
{
    orv::Vector3f lowest;
    orv::Vector3f highest;
    int solids = 0; ///< those with a known size

    /// Makes room for every solid of the tree as it stands now. A skinned one counts wherever its joints
    /// take it; one without a bounding radius counts with radius 0.
    void add(orv::SceneNode& scene);

    orv::Vector3f centre() const { return (lowest + highest) * 0.5f; }
    float radius() const; ///< of the sphere around the box
};

struct SceneSize
{
    int solids = 0;
    long triangles = 0; ///< of each solid's mesh, whether or not it is in view
};

SceneSize measureScene(orv::SceneNode& scene);
