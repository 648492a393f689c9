#include "meshes.h"

#include "convert/materials/materialvalues.h"
#include "convert/materials/surfaces.h"
#include "parts.h"
#include "rowtable.h"

#include <assimp/mesh.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <optional>

namespace convert
{

namespace
{

constexpr uint32_t NONE = std::numeric_limits<uint32_t>::max();

/// One attribute of the vertices.
struct Column
{
    const char* name;
    unsigned componentCount;
    const aiVector3D* values; ///< by vertex of the mesh, or else by corner
    bool isByCorner;
};

class MeshConverter
{
public:
    MeshConverter(const aiMesh& mesh, const ConvertedMaterial& material, Report& report)
        : m_mesh(mesh)
        , m_material(material)
        , m_report(report)
        , m_name("mesh \"" + std::string(mesh.mName.C_Str()) + "\"")
    {
    }

    std::vector<MeshPart> convert()
    {
        listCorners();
        reportLosses();
        m_influences = gatherInfluences(m_mesh, m_report);
        chooseColumns();
        const Corners faces = dropDegenerate(joinVertices());
        std::vector<MeshPart> parts;
        for (const Corners& part : splitFaces(faces, m_cornersPerFace, m_joinedInfluences))
            parts.push_back(makePart(part));
        return parts;
    }

private:
    void listCorners()
    {
        for (unsigned i = 0; i < m_mesh.mNumFaces; ++i)
        {
            const aiFace& face = m_mesh.mFaces[i];
            m_cornersPerFace = i == 0 ? face.mNumIndices : m_cornersPerFace;
            const bool isUsual = face.mNumIndices == m_cornersPerFace && m_cornersPerFace <= 3 &&
                                 std::all_of(face.mIndices, face.mIndices + face.mNumIndices,
                                             [this](unsigned v) { return v < m_mesh.mNumVertices; });
            if (isUsual)
                m_corners.insert(m_corners.end(), face.mIndices, face.mIndices + face.mNumIndices);
            else
                m_report.lose("face", "faces of " + m_name + " that are not like its others");
        }
        m_cornersPerFace = std::max(m_cornersPerFace, 1u);
    }

    void reportLosses()
    {
        if (m_mesh.mNumAnimMeshes > 0)
            m_report.lose("morph-targets", "the morph targets of " + m_name + " (" +
                                               std::to_string(m_mesh.mNumAnimMeshes) + ")");
        if (m_mesh.mColors[1])
            m_report.lose("second-vertex-colours", "further vertex colours of " + m_name);
    }

    void chooseColumns()
    {
        if (getStrongestColour() > 2.0f) // some files have 0 to 255
            m_colourScale = 1.0f / 255.0f;
        m_columns.push_back({"a_position", 3, m_mesh.mVertices, false});
        const bool isSurface = m_cornersPerFace == 3;
        if (hasNormals())
            m_columns.push_back({"a_normal", 3, m_mesh.mNormals, false});
        else if (isSurface)
        {
            m_normals = m_material.isFlat && !m_mesh.mNormals ? makeFlatNormals(m_mesh, m_corners)
                                                              : makeNormals(m_mesh, m_corners);
            m_columns.push_back({"a_normal", 3, m_normals.data(), true});
        }
        const aiVector3D* uvs = chooseTextureCoordinates();
        if (!m_material.hasNormalMap || !isSurface)
            return;
        if (uvs)
            addTangents(uvs);
        else
            m_report.lose("normal-map", "the normal map on " + m_name + ", which has no texture coordinates");
    }

    float getStrongestColour() const
    {
        float strongest = 0.0f;
        for (unsigned i = 0; m_mesh.mColors[0] && i < m_mesh.mNumVertices; ++i)
        {
            const aiColor4D& colour = m_mesh.mColors[0][i];
            strongest = std::max({strongest, colour.r, colour.g, colour.b}); // skips NaN
        }
        return strongest;
    }

    /// Some exporters write normals that are all zero or all point to the backs of their faces.
    bool hasNormals() const
    {
        if (!m_mesh.mNormals || m_cornersPerFace != 3)
            return m_mesh.mNormals;
        for (size_t i = 0; i < m_corners.size(); i += 3)
        {
            if (getFaceNormal(m_mesh, m_corners, i) * m_mesh.mNormals[m_corners[i]] > 0.0f)
                return true;
        }
        return false;
    }

    /// The material's set, then another one.
    /// @return the first.
    const aiVector3D* chooseTextureCoordinates()
    {
        const aiVector3D* chosen = nullptr;
        if (m_material.uvChannel < AI_MAX_NUMBER_OF_TEXTURECOORDS)
            chosen = m_mesh.mTextureCoords[m_material.uvChannel];
        if (chosen)
            m_columns.push_back({"a_uv0", 2, chosen, false});
        unsigned others = 0;
        for (const aiVector3D* other : m_mesh.mTextureCoords)
        {
            if (!other || other == chosen)
                continue;
            if (others == 0)
                m_columns.push_back({chosen ? "a_uv1" : "a_uv0", 2, other, false});
            if (others == 1)
                m_report.lose("texture-coordinates", "further texture coordinates of " + m_name);
            ++others;
        }
        return chosen;
    }

    void addTangents(const aiVector3D* uvs)
    {
        if (m_mesh.mTangents && m_mesh.mBitangents)
        {
            m_columns.push_back({"a_tangent", 3, m_mesh.mTangents, false});
            m_columns.push_back({"a_binormal", 3, m_mesh.mBitangents, false});
            return;
        }
        if (m_normals.empty())
        {
            for (const uint32_t vertex : m_corners)
                m_normals.push_back(m_mesh.mNormals[vertex]);
        }
        m_tangents = makeTangents(m_mesh, m_corners, m_normals, uvs);
        m_columns.push_back({"a_tangent", 3, m_tangents.alongU.data(), true});
        m_columns.push_back({"a_binormal", 3, m_tangents.alongV.data(), true});
    }

    /// @return the faces, by number of row.
    Corners joinVertices()
    {
        const bool isByCorner = std::any_of(m_columns.begin(), m_columns.end(),
                                            [](const Column& column) { return column.isByCorner; });
        m_table.emplace(getWidth(), m_mesh.mNumVertices);
        std::vector<uint32_t> known(m_mesh.mNumVertices, NONE);
        Corners faces;
        for (size_t corner = 0; corner < m_corners.size(); ++corner)
        {
            const uint32_t vertex = m_corners[corner];
            if (isByCorner || known[vertex] == NONE)
            {
                fillRow(vertex, corner);
                known[vertex] = m_table->add(m_row.data());
                if (!m_influences.empty() && m_table->size() > m_joinedInfluences.size())
                    m_joinedInfluences.push_back(m_influences[vertex]);
            }
            faces.push_back(known[vertex]);
        }
        if (m_hasBadValues)
            m_report.lose("vertex-value", "values of " + m_name + " that are not numbers (0 instead)");
        return faces;
    }

    size_t getWidth() const
    {
        size_t width = (m_mesh.mColors[0] ? 4 : 0) + (m_influences.empty() ? 0 : 8);
        for (const Column& column : m_columns)
            width += column.componentCount;
        return width;
    }

    void fillRow(uint32_t vertex, size_t corner)
    {
        std::vector<float>& row = m_row;
        row.clear();
        for (const Column& column : m_columns)
        {
            const aiVector3D& value = column.values[column.isByCorner ? corner : vertex];
            for (unsigned c = 0; c < column.componentCount; ++c)
                row.push_back(makeFinite(float(value[c])));
        }
        if (const aiColor4D* colours = m_mesh.mColors[0])
        {
            const aiColor4D& own = colours[vertex];
            orv::Vector4f colour(makeFinite(own.r) * m_colourScale, makeFinite(own.g) * m_colourScale,
                                 makeFinite(own.b) * m_colourScale,
                                 m_material.usesVertexAlpha ? makeFinite(own.a) : 1.0f);
            if (m_material.hasLightColours)
                colour = toScreen(colour);
            for (const float value : {colour.x, colour.y, colour.z, colour.w})
                row.push_back(std::round(255.0f * std::clamp(value, 0.0f, 1.0f)));
        }
        if (!m_influences.empty())
        {
            row.insert(row.end(), m_influences[vertex].joints.begin(), m_influences[vertex].joints.end());
            row.insert(row.end(), m_influences[vertex].weights.begin(), m_influences[vertex].weights.end());
        }
    }

    float makeFinite(float value)
    {
        if (std::isfinite(value))
            return value + 0.0f; // -0 becomes 0: joining compares bits
        m_hasBadValues = true;
        return 0.0f;
    }

    Corners dropDegenerate(const Corners& faces)
    {
        Corners kept;
        for (size_t face = 0; face < faces.size(); face += m_cornersPerFace)
        {
            if (!isDegenerate(&faces[face]))
                kept.insert(kept.end(), &faces[face], &faces[face] + m_cornersPerFace);
        }
        m_report.count("degenerate-faces", (faces.size() - kept.size()) / m_cornersPerFace);
        return kept;
    }

    bool isDegenerate(const uint32_t* face) const
    {
        aiVector3D places[3];
        for (unsigned i = 0; i < m_cornersPerFace; ++i)
        {
            const float* row = (*m_table)[face[i]];
            places[i] = aiVector3D(row[0], row[1], row[2]);
        }
        if (m_cornersPerFace == 1)
            return false;
        const aiVector3D ab = places[1] - places[0];
        const aiVector3D ac = places[2] - places[0];
        if (m_cornersPerFace == 2)
            return ab.SquareLength() == 0.0f;
        if (!m_influences.empty()) // the pose may give area to a face without any at rest
            return face[0] == face[1] || face[1] == face[2] || face[2] == face[0];
        return (ab ^ ac).SquareLength() == 0.0f;
    }

    MeshPart makePart(const Corners& part) const
    {
        constexpr uint32_t PRIMITIVES[] = {glo::primitive::POINTS, glo::primitive::LINES,
                                           glo::primitive::TRIANGLES};
        MeshPart made;
        made.bones = listJoints(part, m_joinedInfluences);
        // Vertices in the order of their first use, in which a GPU reads them.
        std::vector<uint32_t> numbers(m_table->size(), NONE);
        std::vector<uint32_t> rows;
        glo::IndexData indices;
        for (const uint32_t row : part)
        {
            if (numbers[row] == NONE)
            {
                numbers[row] = uint32_t(rows.size());
                rows.push_back(row);
            }
            indices.indices.push_back(uint16_t(numbers[row]));
        }
        made.geometry.vertices = makeVertices(rows, made.bones);
        made.geometry.primitiveSets.push_back({PRIMITIVES[m_cornersPerFace - 1], std::move(indices)});
        return made;
    }

    glo::VertexSet makeVertices(const std::vector<uint32_t>& rows, const std::vector<uint16_t>& bones) const
    {
        std::vector<glo::FloatAttribute> attributes;
        size_t first = 0;
        const auto add = [&](const char* name, int componentCount, uint32_t type, uint32_t normalize)
        {
            glo::FloatAttribute& attribute = attributes.emplace_back();
            attribute = {name, componentCount, {}, type, normalize};
            attribute.values.reserve(rows.size() * size_t(componentCount));
            for (const uint32_t row : rows)
            {
                const float* values = (*m_table)[row] + first;
                attribute.values.insert(attribute.values.end(), values, values + componentCount);
            }
            first += size_t(componentCount);
        };
        for (const Column& column : m_columns)
            add(column.name, int(column.componentCount), glo::type::FLOAT, 0);
        if (m_mesh.mColors[0])
            add("a_colour", 4, glo::type::UINT8, 1);
        if (!bones.empty())
        {
            add("a_joints", 4, glo::type::UINT8, 0);
            for (float& joint : attributes.back().values)
                joint = float(std::lower_bound(bones.begin(), bones.end(), uint16_t(joint)) - bones.begin());
            add("a_weights", 4, glo::type::FLOAT, 0);
            clearUnused(attributes[attributes.size() - 2].values, attributes.back().values);
        }
        return glo::makeVertexSet(attributes);
    }

    /// Joints without a weight need not be among the part's.
    static void clearUnused(std::vector<float>& joints, const std::vector<float>& weights)
    {
        for (size_t i = 0; i < joints.size(); ++i)
            joints[i] = weights[i] > 0.0f ? joints[i] : 0.0f;
    }

    const aiMesh& m_mesh;
    const ConvertedMaterial& m_material;
    Report& m_report;
    std::string m_name; ///< for reports
    bool m_hasBadValues = false;
    float m_colourScale = 1.0f;
    unsigned m_cornersPerFace = 0;
    Corners m_corners; ///< vertices of the mesh, face by face
    std::vector<Influences> m_influences;
    std::vector<aiVector3D> m_normals; ///< by corner
    Tangents m_tangents;
    std::vector<Column> m_columns;
    std::vector<float> m_row;
    std::optional<RowTable> m_table;            ///< the vertices, joined
    std::vector<Influences> m_joinedInfluences; ///< by number of row
};

} // namespace

std::vector<MeshPart> convertMesh(const aiMesh& mesh, const ConvertedMaterial& material, Report& report)
{
    return MeshConverter(mesh, material, report).convert();
}

namespace
{

bool hasTransparentColour(const aiMesh& mesh)
{
    return std::any_of(mesh.mColors[0], mesh.mColors[0] + mesh.mNumVertices,
                       [](const aiColor4D& colour) { return colour.a < 1.0f; });
}

} // namespace

bool isColoured(const aiMesh& mesh, bool mayBeBlack)
{
    const aiColor4D* colours = mesh.mColors[0];
    const auto hasOther = [&](const aiColor4D& colour)
    {
        return std::any_of(colours, colours + mesh.mNumVertices,
                           [&](const aiColor4D& own)
                           { return own.r != colour.r || own.g != colour.g || own.b != colour.b; });
    };
    return colours && (mayBeBlack || hasOther(aiColor4D(0, 0, 0, 1))) &&
           (hasOther(aiColor4D(1, 1, 1, 1)) || hasTransparentColour(mesh));
}

bool leavesPicture(const aiMesh& mesh, unsigned uvChannel)
{
    constexpr float SLACK = 0.01f;
    if (uvChannel >= AI_MAX_NUMBER_OF_TEXTURECOORDS || !mesh.mTextureCoords[uvChannel])
        return false;
    for (unsigned i = 0; i < mesh.mNumVertices; ++i)
    {
        const aiVector3D& uv = mesh.mTextureCoords[uvChannel][i];
        if (!(uv.x >= -SLACK && uv.x <= 1.0f + SLACK && uv.y >= -SLACK && uv.y <= 1.0f + SLACK))
            return true;
    }
    return false;
}

} // namespace convert
