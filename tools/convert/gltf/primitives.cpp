#include "primitives.h"

#include "draco.h"
#include "faces.h"

#include <algorithm>
#include <numeric>

namespace convert::gltf
{

namespace
{

constexpr size_t TRIANGLES = 4;
constexpr uint32_t UNUSED = ~0u;

std::string numbered(const char* name, unsigned number)
{
    return std::string(name) + "_" + std::to_string(number);
}

class PrimitiveReader
{
public:
    PrimitiveReader(Source& source, const Object& primitive, const PrimitiveUse& use)
        : m_source(source)
        , m_primitive(primitive)
        , m_attributes(primitive.object("attributes"))
        , m_use(use)
        , m_what("mesh \"" + use.name + "\"")
        , m_mesh(std::make_unique<aiMesh>())
    {
    }

    std::unique_ptr<aiMesh> read()
    {
        unpack();
        if (!m_draco && !m_attributes.has("POSITION"))
        {
            m_source.report.lose("primitive", "a part of " + m_what + " without positions");
            return nullptr;
        }
        readFaces();
        if (m_faces.corners.empty())
        {
            m_source.report.lose("primitive", "a part of " + m_what + " without faces");
            return nullptr;
        }
        m_mesh->mName = aiString(m_use.name);
        compact();
        readSurface();
        readCoordinates();
        readColours();
        if (m_use.skin)
            readJoints();
        reportOthers();
        writeFaces();
        noteTargets();
        return std::move(m_mesh);
    }

private:
    void unpack()
    {
        const Object packed = m_primitive.extension("KHR_draco_mesh_compression");
        if (!packed)
            return;
        if (!packed.has("bufferView"))
            packed.fail("has no bufferView");
        m_draco.emplace(packed, m_source.buffers.view(packed.size("bufferView", 0), packed));
    }

    size_t countVertices()
    {
        if (m_draco)
            return m_draco->vertexCount();
        return m_source.accessors.count(m_attributes.size("POSITION", 0), m_attributes);
    }

    void readFaces()
    {
        m_vertexCount = countVertices();
        if (m_vertexCount >= UNUSED)
            m_attributes.fail("POSITION", "has more elements than indices can count");
        const std::optional<size_t> indices = m_primitive.index("indices");
        const size_t mode = m_primitive.size("mode", TRIANGLES);
        if (m_draco)
            m_faces = makeFaces(TRIANGLES, m_draco->readIndices(), m_vertexCount);
        else if (indices)
            m_faces = makeFaces(mode, m_source.accessors.readIndices(*indices, m_primitive), m_vertexCount);
        else
        {
            // Read first, to check that the file has that many.
            m_positions = m_source.accessors.read(m_attributes.size("POSITION", 0), m_attributes, 3);
            std::vector<uint32_t> all(m_vertexCount);
            std::iota(all.begin(), all.end(), 0u);
            m_faces = makeFaces(mode, all, m_vertexCount);
        }
        if (m_faces.cornersPerFace == 0)
            m_primitive.fail("mode", "is none");
        if (m_faces.dropped > 0)
            m_source.report.lose("face", "faces of " + m_what + " with missing or too few vertices");
    }

    /// Only vertices in use: files share long arrays among many primitives.
    void compact()
    {
        std::vector<uint32_t> numbers;
        const uint32_t last = *std::max_element(m_faces.corners.begin(), m_faces.corners.end());
        numbers.resize(size_t(last) + 1, UNUSED);
        for (const uint32_t corner : m_faces.corners)
            numbers[corner] = 0;
        for (uint32_t vertex = 0; vertex <= last; ++vertex)
        {
            if (numbers[vertex] == UNUSED)
                continue;
            numbers[vertex] = uint32_t(m_used.size());
            m_used.push_back(vertex);
        }
        for (uint32_t& corner : m_faces.corners)
            corner = numbers[corner];
        m_usesAll = m_used.size() == m_vertexCount;
        m_mesh->mNumVertices = unsigned(m_used.size());
    }

    Column pick(Column&& all) const
    {
        if (m_usesAll)
            return std::move(all);
        Column column{all.components, {}};
        for (const uint32_t vertex : m_used)
            column.values.insert(column.values.end(), all[vertex], all[vertex] + all.components);
        return column;
    }

    /// An attribute of the vertices in use; without elements if it is missing.
    /// @param components  wanted; 0 for as many as there are.
    Column readAttribute(const std::string& name, unsigned components)
    {
        const std::optional<size_t> accessor = m_attributes.index(name.c_str());
        if (m_draco && m_draco->has(name.c_str()))
        {
            const bool normalized =
                accessor && m_source.accessors.decoding(*accessor, m_attributes).normalized;
            Column column = m_draco->read(name.c_str(), normalized);
            if (components > 0 && column.components != components)
                m_attributes.fail(name.c_str(), "has elements of another size, packed");
            return pick(std::move(column));
        }
        return accessor ? readAccessor(*accessor, m_attributes, name, components) : Column();
    }

    Column readAccessor(size_t accessor, const Object& user, const std::string& name, unsigned components)
    {
        if (m_source.accessors.count(accessor, user) < m_vertexCount)
        {
            m_source.report.lose("attribute", name + " of " + m_what + ", which has too few elements");
            return {};
        }
        Column column = m_source.accessors.read(accessor, user, components, m_usesAll ? nullptr : &m_used);
        column.values.resize(m_used.size() * column.components); // there may be more than there are positions
        return column;
    }

    static aiVector3D* toVectors(const Column& column, size_t count)
    {
        if (column.components < 3 || column.count() < count)
            return nullptr;
        aiVector3D* made = new aiVector3D[count];
        for (size_t i = 0; i < count; ++i)
            made[i] = aiVector3D(column[i][0], column[i][1], column[i][2]);
        return made;
    }

    /// Positions, normals and tangents, in the shape of the morph targets.
    void readSurface()
    {
        const size_t count = m_mesh->mNumVertices;
        Column positions =
            m_positions.components > 0 ? pick(std::move(m_positions)) : readAttribute("POSITION", 3);
        if (positions.count() < count)
            m_attributes.fail("POSITION", "has too few elements");
        Column normals = readAttribute("NORMAL", 3);
        Column tangents = readAttribute("TANGENT", 4);
        morph("POSITION", positions);
        const bool turnsNormals = morph("NORMAL", normals);
        morph("TANGENT", tangents);
        m_mesh->mVertices = toVectors(positions, count);
        m_mesh->mNormals = toVectors(normals, count);
        for (size_t i = 0; turnsNormals && i < count; ++i)
            m_mesh->mNormals[i].NormalizeSafe();
        m_mesh->mTangents = m_mesh->mNormals ? toVectors(tangents, count) : nullptr;
        if (!m_mesh->mTangents)
            return;
        m_mesh->mBitangents = new aiVector3D[count];
        for (size_t i = 0; i < count; ++i)
            m_mesh->mBitangents[i] = (m_mesh->mNormals[i] ^ m_mesh->mTangents[i]) * tangents[i][3];
    }

    /// @param column  by vertex in use, of three components or more.
    /// @return whether anything changed.
    bool morph(const char* name, Column& column)
    {
        const size_t count = std::min(m_primitive.length("targets"), m_use.weights.size());
        bool changed = false;
        for (size_t i = 0; i < count; ++i)
        {
            const Object target = m_primitive.at("targets", i);
            const std::optional<size_t> accessor = target.index(name);
            if (m_use.weights[i] == 0.0f || !accessor || column.components == 0)
                continue;
            const Column change = readAccessor(*accessor, target, name, 3);
            for (size_t v = 0; v < change.count(); ++v)
            {
                for (unsigned c = 0; c < 3; ++c)
                    column.values[v * column.components + c] += m_use.weights[i] * change[v][c];
            }
            changed = changed || change.count() > 0;
        }
        return changed;
    }

    /// In libassimp, v points up.
    void readCoordinates()
    {
        for (unsigned channel = 0; channel < AI_MAX_NUMBER_OF_TEXTURECOORDS; ++channel)
        {
            const Column column = readAttribute(numbered("TEXCOORD", channel), 0);
            if (column.components < 2) // some programs write three
                continue;
            const bool isMoved = channel == m_use.placing.channel && !m_use.placing.movesNothing();
            m_mesh->mNumUVComponents[channel] = 2;
            m_mesh->mTextureCoords[channel] = new aiVector3D[column.count()];
            for (size_t i = 0; i < column.count(); ++i)
            {
                aiVector2D uv(column[i][0], column[i][1]);
                if (isMoved)
                    uv = m_use.placing.apply(uv);
                m_mesh->mTextureCoords[channel][i] = aiVector3D(uv.x, 1.0f - uv.y, 0.0f);
            }
        }
    }

    void readColours()
    {
        unsigned made = 0;
        for (unsigned channel = 0; channel < AI_MAX_NUMBER_OF_COLOR_SETS; ++channel)
        {
            const Column column = readAttribute(numbered("COLOR", channel), 0);
            if (column.components != 3 && column.components != 4)
                continue;
            aiColor4D* colours = m_mesh->mColors[made++] = new aiColor4D[column.count()];
            for (size_t i = 0; i < column.count(); ++i)
                colours[i] = aiColor4D(column[i][0], column[i][1], column[i][2],
                                       column.components == 4 ? column[i][3] : 1.0f);
        }
    }

    void readJoints()
    {
        std::vector<Column> joints;
        std::vector<Column> weights;
        for (unsigned set = 0; m_attributes.has(numbered("JOINTS", set).c_str()); ++set)
        {
            Column joint = readAttribute(numbered("JOINTS", set), 4);
            Column weight = readAttribute(numbered("WEIGHTS", set), 4);
            if (joint.values.size() != weight.values.size())
            {
                m_source.report.lose("attribute", "joints of " + m_what + " without weights");
                continue;
            }
            joints.push_back(std::move(joint));
            weights.push_back(std::move(weight));
        }
        addBones(*m_mesh, *m_use.skin, joints, weights, m_source.report);
    }

    void reportOthers()
    {
        for (const std::string& name : m_attributes.keys())
        {
            const std::string kind = name.substr(0, name.find('_'));
            const bool isKnown = name == "POSITION" || name == "NORMAL" || name == "TANGENT" ||
                                 kind == "TEXCOORD" || kind == "COLOR" || kind == "JOINTS" ||
                                 kind == "WEIGHTS";
            if (!isKnown)
                m_source.report.lose("attribute",
                                     name.substr(0, 100) + " of " + m_what + ", whose meaning is not known");
        }
    }

    void writeFaces()
    {
        constexpr unsigned TYPES[] = {aiPrimitiveType_POINT, aiPrimitiveType_LINE, aiPrimitiveType_TRIANGLE};
        const unsigned corners = m_faces.cornersPerFace;
        m_mesh->mPrimitiveTypes = TYPES[corners - 1];
        m_mesh->mNumFaces = unsigned(m_faces.corners.size() / corners);
        m_mesh->mFaces = new aiFace[m_mesh->mNumFaces];
        for (size_t i = 0; i < m_mesh->mNumFaces; ++i)
        {
            aiFace& face = m_mesh->mFaces[i];
            face.mNumIndices = corners;
            face.mIndices = new unsigned[corners];
            std::copy_n(&m_faces.corners[i * corners], corners, face.mIndices);
        }
    }

    /// Only their number, for the report.
    void noteTargets()
    {
        const size_t count = m_use.isMoving ? 0 : m_primitive.length("targets");
        if (count == 0)
            return;
        m_mesh->mNumAnimMeshes = unsigned(count);
        m_mesh->mAnimMeshes = new aiAnimMesh*[count];
        for (size_t i = 0; i < count; ++i)
            m_mesh->mAnimMeshes[i] = new aiAnimMesh;
    }

    Source& m_source;
    const Object& m_primitive;
    Object m_attributes;
    const PrimitiveUse& m_use;
    std::string m_what; ///< for reports
    std::unique_ptr<aiMesh> m_mesh;
    std::optional<DracoMesh> m_draco;
    size_t m_vertexCount = 0; ///< in the file
    Faces m_faces;
    Column m_positions;           ///< of all vertices, if they have been read
    std::vector<uint32_t> m_used; ///< vertices of the file, by vertex of the mesh
    bool m_usesAll = false;
};

} // namespace

std::unique_ptr<aiMesh> readPrimitive(Source& source, const Object& primitive, const PrimitiveUse& use)
{
    return PrimitiveReader(source, primitive, use).read();
}

} // namespace convert::gltf
