#include "parts.h"

#include <algorithm>
#include <limits>
#include <utility>

namespace convert
{

namespace
{

constexpr size_t MOST_VERTICES = 65536; // limit of 16-bit indices
constexpr size_t MOST_JOINTS = 20;      // limit of the shaders
constexpr uint32_t NONE = std::numeric_limits<uint32_t>::max();

/// Faces with a common set of joints.
struct JointGroup
{
    std::vector<uint16_t> joints; ///< ascending
    Corners corners;
};

using Joints = std::vector<uint16_t>;

Joints unite(const Joints& a, const Joints& b)
{
    Joints both;
    std::set_union(a.begin(), a.end(), b.begin(), b.end(), std::back_inserter(both));
    return both;
}

size_t countNew(const Joints& known, const Joints& wanted)
{
    return size_t(std::count_if(wanted.begin(), wanted.end(),
                                [&](uint16_t joint)
                                { return !std::binary_search(known.begin(), known.end(), joint); }));
}

/// Puts each face into the part to which it adds the fewest joints.
std::vector<Corners> splitByJoints(const Corners& corners, unsigned cornersPerFace,
                                   const std::vector<Influences>& influences)
{
    std::vector<JointGroup> groups;
    for (size_t face = 0; face < corners.size(); face += cornersPerFace)
    {
        const Corners own(corners.begin() + long(face), corners.begin() + long(face + cornersPerFace));
        const Joints joints = listJoints(own, influences);
        JointGroup* best = nullptr;
        size_t fewest = MOST_JOINTS + 1;
        for (JointGroup& group : groups)
        {
            const size_t added = countNew(group.joints, joints);
            if (added < fewest && group.joints.size() + added <= MOST_JOINTS)
            {
                best = &group;
                fewest = added;
            }
        }
        if (!best)
            best = &groups.emplace_back();
        if (fewest > 0)
            best->joints = unite(best->joints, joints);
        best->corners.insert(best->corners.end(), own.begin(), own.end());
    }
    std::vector<Corners> parts;
    parts.reserve(groups.size());
    for (JointGroup& group : groups)
        parts.push_back(std::move(group.corners));
    return parts;
}

/// Takes faces in their order until the vertices are too many.
void splitByVertices(const Corners& corners, unsigned cornersPerFace, std::vector<Corners>& parts)
{
    std::vector<uint32_t> lastPart(countVertices(corners), NONE); // that the vertex is in
    size_t used = MOST_VERTICES;
    for (size_t face = 0; face < corners.size(); face += cornersPerFace)
    {
        if (used + cornersPerFace > MOST_VERTICES)
        {
            parts.emplace_back();
            used = 0;
        }
        for (size_t i = face; i < face + cornersPerFace; ++i)
        {
            parts.back().push_back(corners[i]);
            uint32_t& last = lastPart[corners[i]];
            used += last == parts.size() ? 0 : 1;
            last = uint32_t(parts.size());
        }
    }
}

} // namespace

std::vector<Corners> splitFaces(const Corners& corners, unsigned cornersPerFace,
                                const std::vector<Influences>& influences)
{
    const bool isOrdered = cornersPerFace == 3;
    const Corners faces = isOrdered ? orderForCache(corners) : corners;
    std::vector<Corners> groups = {faces};
    if (listJoints(faces, influences).size() > MOST_JOINTS)
    {
        // Models are often ordered by limbs, which may split better.
        groups = splitByJoints(corners, cornersPerFace, influences);
        std::vector<Corners> others = splitByJoints(faces, cornersPerFace, influences);
        if (others.size() < groups.size())
            groups = std::move(others);
    }
    std::vector<Corners> parts;
    for (const Corners& group : groups)
        splitByVertices(group, cornersPerFace, parts);
    if (isOrdered && parts.size() > 1)
    {
        for (Corners& part : parts)
            part = orderForCache(part);
    }
    return parts;
}

std::vector<uint16_t> listJoints(const Corners& corners, const std::vector<Influences>& influences)
{
    std::vector<uint16_t> joints;
    if (influences.empty())
        return joints;
    std::vector<bool> isKnown;
    for (const uint32_t vertex : corners)
    {
        const Influences& own = influences[vertex];
        for (size_t i = 0; i < 4 && own.weights[i] > 0.0f; ++i)
        {
            if (own.joints[i] >= isKnown.size())
                isKnown.resize(size_t(own.joints[i]) + 1);
            if (!isKnown[own.joints[i]])
                joints.push_back(own.joints[i]);
            isKnown[own.joints[i]] = true;
        }
    }
    std::sort(joints.begin(), joints.end());
    return joints;
}

} // namespace convert
