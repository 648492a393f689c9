#include "surfaces.h"

#include "convert/meshes/rowtable.h"

#include <assimp/mesh.h>

#include <cmath>
#include <numeric>

namespace convert
{

namespace
{

constexpr float CREASE_COSINE = 0.4067366f; // of 66 degrees

/// -1 if the picture is mirrored on the face, else 1.
float getSide(const aiVector3D* uvs, const Corners& corners, size_t first)
{
    const aiVector3D ab = uvs[corners[first + 1]] - uvs[corners[first]];
    const aiVector3D ac = uvs[corners[first + 2]] - uvs[corners[first]];
    return ab.x * ac.y - ab.y * ac.x < 0.0f ? -1.0f : 1.0f;
}

/// The part of v that is at right angles to a normal, of length 1; any such direction if there is none.
aiVector3D across(const aiVector3D& normal, const aiVector3D& v)
{
    const aiVector3D part = v - normal * (normal * v);
    if (part.SquareLength() > 1e-12f * v.SquareLength())
        return aiVector3D(part).Normalize();
    const aiVector3D axis = std::fabs(normal.x) < 0.7f ? aiVector3D(1, 0, 0) : aiVector3D(0, 1, 0);
    return (normal ^ axis).NormalizeSafe();
}

} // namespace

aiVector3D getFaceNormal(const aiMesh& mesh, const Corners& corners, size_t first)
{
    const aiVector3D& a = mesh.mVertices[corners[first]];
    return (mesh.mVertices[corners[first + 1]] - a) ^ (mesh.mVertices[corners[first + 2]] - a);
}

std::vector<aiVector3D> makeNormals(const aiMesh& mesh, const Corners& corners)
{
    constexpr size_t MANY = 64; // corners at one position: not a surface, and too many to compare all pairs
    std::vector<aiVector3D> faces;
    for (size_t i = 0; i < corners.size(); i += 3)
        faces.push_back(getFaceNormal(mesh, corners, i));
    RowTable places(3, mesh.mNumVertices);
    std::vector<uint32_t> placeOf; // by vertex
    for (unsigned i = 0; i < mesh.mNumVertices; ++i)
    {
        const aiVector3D& p = mesh.mVertices[i];
        const float row[] = {p.x + 0.0f, p.y + 0.0f, p.z + 0.0f}; // -0 is 0
        placeOf.push_back(places.add(row));
    }
    std::vector<size_t> starts(places.size() +
                               1); // of the corners in each place, and where the last ones end
    for (const uint32_t vertex : corners)
        ++starts[placeOf[vertex] + 1];
    std::partial_sum(starts.begin(), starts.end(), starts.begin());
    std::vector<size_t> next = starts;
    std::vector<size_t> facesAt(corners.size());
    for (size_t i = 0; i < corners.size(); ++i)
        facesAt[next[placeOf[corners[i]]]++] = i / 3;

    std::vector<aiVector3D> normals;
    for (size_t i = 0; i < corners.size(); ++i)
    {
        const uint32_t place = placeOf[corners[i]];
        const size_t count = starts[place + 1] - starts[place];
        const aiVector3D& own = faces[i / 3];
        const float ownLength = own.Length();
        aiVector3D sum;
        for (size_t other = starts[place]; other < starts[place + 1]; ++other)
        {
            const aiVector3D& face = faces[facesAt[other]];
            if (count > MANY || face * own >= CREASE_COSINE * face.Length() * ownLength)
                sum += face;
        }
        normals.push_back(sum.NormalizeSafe());
    }
    return normals;
}

std::vector<aiVector3D> makeFlatNormals(const aiMesh& mesh, const Corners& corners)
{
    std::vector<aiVector3D> normals;
    for (size_t i = 0; i < corners.size(); i += 3)
        normals.insert(normals.end(), 3, getFaceNormal(mesh, corners, i).NormalizeSafe());
    return normals;
}

Tangents makeTangents(const aiMesh& mesh, const Corners& corners, const std::vector<aiVector3D>& normals,
                      const aiVector3D* uvs)
{
    RowTable table(9, mesh.mNumVertices);
    std::vector<uint32_t> numbers;
    std::vector<aiVector3D> sums;
    for (size_t i = 0; i < corners.size(); ++i)
    {
        const size_t first = i - i % 3;
        const size_t a = corners[first];
        const size_t b = corners[first + 1];
        const size_t c = corners[first + 2];
        const aiVector3D ab = mesh.mVertices[b] - mesh.mVertices[a];
        const aiVector3D ac = mesh.mVertices[c] - mesh.mVertices[a];
        const float side = getSide(uvs, corners, first);
        const aiVector3D alongU =
            ((ab * (uvs[c].y - uvs[a].y) - ac * (uvs[b].y - uvs[a].y)) * side).NormalizeSafe();

        const aiVector3D& p = mesh.mVertices[corners[i]];
        const aiVector3D& n = normals[i];
        const aiVector3D& uv = uvs[corners[i]];
        const float row[] = {p.x, p.y, p.z, n.x, n.y, n.z, uv.x, uv.y, side};
        numbers.push_back(table.add(row));
        if (numbers.back() == sums.size())
            sums.emplace_back(0.0f, 0.0f, 0.0f);
        sums[numbers.back()] += alongU;
    }
    Tangents made;
    for (size_t i = 0; i < corners.size(); ++i)
    {
        made.alongU.push_back(across(normals[i], sums[numbers[i]]));
        made.alongV.push_back((normals[i] ^ made.alongU.back()) * getSide(uvs, corners, i - i % 3));
    }
    return made;
}

} // namespace convert
