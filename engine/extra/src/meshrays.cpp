#include "orv/meshrays.h"

#include "orv/meshgeometry.h"
#include "orv/ray.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <numeric>

namespace orv
{

namespace
{

constexpr uint32_t FEW = 4; ///< triangles that are not divided further

/// @param hit  replaced if the ray hits this triangle nearer, or as near and the triangle has a lower number.
void meetTriangle(const Ray& ray, const Vector3f& a, const Vector3f& b, const Vector3f& c,
                  TriangleSides sides, uint32_t triangle, MeshHit& hit, bool& isMet)
{
    const Vector3f ab = b - a;
    const Vector3f ac = c - a;
    const Vector3f perpendicular = cross(ray.direction, ac);
    const float determinant = dot(ab, perpendicular); // above 0: the ray comes from the front
    if ((sides == TriangleSides::FRONT && determinant < 0.0f) ||
        (sides == TriangleSides::BACK && determinant > 0.0f))
        return;
    const float reciprocal =
        1.0f / determinant; // infinite for a ray in the plane: then all comparisons below fail
    const Vector3f start = ray.position - a;
    const float u = dot(start, perpendicular) * reciprocal;
    if (!(u >= 0.0f && u <= 1.0f))
        return;
    const Vector3f other = cross(start, ab);
    const float v = dot(ray.direction, other) * reciprocal;
    const float distance = dot(ac, other) * reciprocal;
    if (!(v >= 0.0f && u + v <= 1.0f && distance >= 0.0f))
        return;
    const bool isFirst =
        distance < hit.distance || (isMet && distance == hit.distance && triangle < hit.triangle);
    if (isFirst)
        hit = {distance, triangle};
    isMet = isMet || isFirst;
}

/// A ray prepared for many boxes. Boxes are slightly enlarged, so that points on their sides are inside.
class BoxRay
{
public:
    explicit BoxRay(const Ray& ray)
    {
        for (int axis = 0; axis < 3; ++axis)
        {
            m_start[axis] = ray.position.data()[axis];
            m_reciprocal[axis] = 1.0f / ray.direction.data()[axis];
        }
    }

    /// @return where the ray enters the box; infinity if that is beyond limit, or it does not.
    float enter(const Box& box, float limit) const
    {
        constexpr float ROUNDING = 1e-5f;
        float from = 0.0f;
        float to = limit;
        for (int axis = 0; axis < 3; ++axis)
        {
            const float low = box.lowest.data()[axis];
            const float high = box.highest.data()[axis];
            const float slack = ROUNDING * (std::fabs(low) + std::fabs(high) + std::fabs(m_start[axis]));
            const float first = (low - slack - m_start[axis]) * m_reciprocal[axis];
            const float second = (high + slack - m_start[axis]) * m_reciprocal[axis];
            from = std::max(from, std::min(first, second)); // NaN, for a ray in a box's side, changes nothing
            to = std::min(to, std::max(first, second));
        }
        return from <= to * (1.0f + ROUNDING) ? from : std::numeric_limits<float>::infinity();
    }

private:
    float m_start[3];
    float m_reciprocal[3];
};

/// Puts the triangles of a geometry into its tree.
class TreeMaker
{
public:
    explicit TreeMaker(const MeshGeometry& geometry)
        : m_places(geometry.getVertices().places)
        , m_triangles(geometry.getTriangles())
        , m_tree(geometry.getTree())
        , m_centres(m_triangles.size() / 3)
    {
        const uint32_t count = uint32_t(m_centres.size());
        m_tree.order.resize(count);
        std::iota(m_tree.order.begin(), m_tree.order.end(), 0u);
        for (uint32_t i = 0; i < count; ++i)
        {
            const Vector3f centre = findBox(i).getCentre();
            if (std::isfinite(centre.x + centre.y + centre.z)) // NaN cannot be sorted
                m_centres[i] = centre;
        }
        m_tree.nodes.reserve(count);
        split(0, count);
    }

private:
    Box findBox(uint32_t triangle) const
    {
        Box box;
        for (std::size_t i = 0; i < 3; ++i)
            box.add(m_places[m_triangles[std::size_t(triangle) * 3 + i]]);
        return box;
    }

    /// At the median triangle, along the longest side of the box around their centres.
    void split(uint32_t first, uint32_t count)
    {
        const std::size_t index = m_tree.nodes.size();
        m_tree.nodes.push_back({Box(), first, count});
        Box places;
        for (uint32_t i = first; i < first + count; ++i)
        {
            m_tree.nodes[index].box.add(findBox(m_tree.order[i]));
            places.add(m_centres[m_tree.order[i]]);
        }
        if (count <= FEW)
            return;
        const Vector3f size = places.highest - places.lowest;
        const int axis = size.x >= size.y && size.x >= size.z ? 0 : size.y >= size.z ? 1 : 2;
        const auto begin = m_tree.order.begin() + first;
        const uint32_t half = count / 2;
        std::nth_element(begin, begin + half, begin + count,
                         [&](uint32_t a, uint32_t b)
                         { return m_centres[a].data()[axis] < m_centres[b].data()[axis]; });
        split(first, half);
        m_tree.nodes[index].first = uint32_t(m_tree.nodes.size());
        m_tree.nodes[index].count = 0;
        split(first + half, count - half);
    }

    const std::vector<Vector3f>& m_places;
    const std::vector<uint32_t>& m_triangles;
    detail::TriangleTree& m_tree;
    std::vector<Vector3f> m_centres;
};

} // namespace

bool meet(const MeshGeometry& geometry, const Ray& ray, TriangleSides sides,
          const std::vector<Vector3f>& places, MeshHit& hit)
{
    const std::vector<uint32_t>& triangles = geometry.getTriangles();
    bool isMet = false;
    for (std::size_t i = 0; sides != TriangleSides::NONE && i < triangles.size(); i += 3)
        meetTriangle(ray, places[triangles[i]], places[triangles[i + 1]], places[triangles[i + 2]], sides,
                     uint32_t(i / 3), hit, isMet);
    return isMet;
}

bool meet(const MeshGeometry& geometry, const Ray& ray, TriangleSides sides, MeshHit& hit)
{
    const std::vector<uint32_t>& triangles = geometry.getTriangles();
    if (sides == TriangleSides::NONE || triangles.empty())
        return false;
    const detail::TriangleTree& tree = geometry.getTree();
    if (tree.nodes.empty())
        TreeMaker maker(geometry);
    const std::vector<Vector3f>& places = geometry.getVertices().places;
    const BoxRay boxRay(ray);
    bool isMet = false;
    uint32_t waiting[64]; // at most one for each level; halving gives at most 32 levels
    int count = 0;
    waiting[count++] = 0;
    while (count > 0)
    {
        const uint32_t index = waiting[--count];
        const detail::TriangleTree::Node& node = tree.nodes[index];
        if (!(boxRay.enter(node.box, hit.distance) < std::numeric_limits<float>::infinity()))
            continue;
        for (uint32_t i = node.first; i < node.first + node.count; ++i)
        {
            const uint32_t* const corners = &triangles[std::size_t(tree.order[i]) * 3];
            meetTriangle(ray, places[corners[0]], places[corners[1]], places[corners[2]], sides,
                         tree.order[i], hit, isMet);
        }
        if (node.count > 0)
            continue;
        // The nearer half first: a hit there may make the other unnecessary.
        const bool isFirstNearer = boxRay.enter(tree.nodes[index + 1].box, hit.distance) <=
                                   boxRay.enter(tree.nodes[node.first].box, hit.distance);
        waiting[count++] = isFirstNearer ? node.first : index + 1;
        waiting[count++] = isFirstNearer ? index + 1 : node.first;
    }
    return isMet;
}

} // namespace orv
