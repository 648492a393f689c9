#include "glo/glowriter.h"

#include "orv/detail/glofields.h"
#include "orv/detail/littleendian.h"

#include <cstring>

namespace glo
{

namespace
{

/// @param Bytes  a vector of them.
template <class Bytes>
void appendWord(Bytes& bytes, uint32_t word)
{
    uint8_t parts[4];
    orv::detail::writeLittleEndian(parts, word);
    bytes.insert(bytes.end(), parts, parts + 4);
}

template <class Bytes>
void appendFloat(Bytes& bytes, float value)
{
    uint32_t word;
    std::memcpy(&word, &value, sizeof(word));
    appendWord(bytes, word);
}

class BlockWriter
{
public:
    explicit BlockWriter(std::vector<uint8_t>& bytes) : m_bytes(bytes) {}

    void u32(uint32_t value) { appendWord(m_bytes, value); }
    void f32(float value) { appendFloat(m_bytes, value); }

private:
    std::vector<uint8_t>& m_bytes;
};

/// The writing Io for fields(); see glofields.h. Records are constant here.
class GloWriter
{
public:
    GloWriter(std::vector<uint8_t>& bytes, std::string& error) : m_bytes(bytes), m_error(error) {}

    FileVersion version() const { return m_version; }

    bool acceptVersion(const std::string& text)
    {
        return (parseVersion(text.c_str(), m_version) && isSupported(m_version)) ||
               refuse("version \"" + text + "\" is not known");
    }

    bool acceptTool(const std::string& text)
    {
        for (const AuthoringToolName& known : AUTHORING_TOOLS)
        {
            if (text == known.text)
                return true;
        }
        return refuse("authoring tool \"" + text + "\" is not known");
    }

    bool u32(const char*, uint32_t value)
    {
        appendWord(m_bytes, value);
        return true;
    }

    bool i32(const char*, int32_t value) { return u32(nullptr, uint32_t(value)); }

    bool f32(const char*, float value)
    {
        appendFloat(m_bytes, value);
        return true;
    }

    bool floats(const char*, const float* values, int count)
    {
        for (int i = 0; i < count; ++i)
            appendFloat(m_bytes, values[i]);
        return true;
    }

    bool text(const char* label, const std::string& value)
    {
        if (value.size() + 1 > MAX_TEXT_SIZE || value.find('\0') != std::string::npos)
            return refuse(std::string(label) + "is too long or holds a NUL: \"" + value.substr(0, 40) +
                          "...\"");
        appendWord(m_bytes, uint32_t(value.size() + 1));
        m_bytes.insert(m_bytes.end(), value.c_str(), value.c_str() + value.size() + 1);
        return true;
    }

    template <class Fields>
    bool block(const char*, uint32_t, Fields&& blockFields)
    {
        BlockWriter writer(m_bytes);
        blockFields(writer);
        return true;
    }

    template <class Record>
    bool chunk(const Record& record)
    {
        return sized(Record::ID, [&] { return fields(*this, record); });
    }

    template <class Optional>
    bool optionalChunk(const Optional& record)
    {
        return chunk(*record);
    }

    template <class Record>
    bool chunks(uint32_t, const std::vector<Record>& records, bool)
    {
        for (const Record& record : records)
        {
            if (!chunk(record))
                return false;
        }
        return true;
    }

    template <class Element, class Fields>
    bool each(uint32_t, const std::vector<Element>& elements, Fields&& elementFields)
    {
        for (const Element& element : elements)
        {
            if (!elementFields(element))
                return false;
        }
        return true;
    }

    bool body(const GloScene& scene)
    {
        return chunk(scene.info) && list(scene.geometries) && list(scene.skins) && list(scene.lights) &&
               list(scene.cameras) && list(scene.materials) &&
               (scene.surfaces.list.empty() || chunk(scene.surfaces)) && list(scene.animations) &&
               (!scene.scene || (fitsVersion(scene.scene->top) && chunk(*scene.scene)));
    }

    bool bytes(const VertexData& data)
    {
        m_bytes.insert(m_bytes.end(), data.bytes.begin(), data.bytes.end());
        return true;
    }

    bool indices(const IndexData& data)
    {
        for (const uint16_t index : data.indices)
        {
            m_bytes.push_back(uint8_t(index));
            m_bytes.push_back(uint8_t(index >> 8));
        }
        return true;
    }

    bool keys(const Channel& channel)
    {
        const size_t keySize = 4 + size_t(channel.coefficientCount) * type::SIZES[channel.type];
        if (channel.keys.size() != keySize * channel.keyCount)
            return refuse("the keys of \"" + channel.targetName + "\" differ in size");
        m_bytes.insert(m_bytes.end(), channel.keys.begin(), channel.keys.end());
        return true;
    }

    bool fail(const char* format) { return refuse(format); }

private:
    bool refuse(const std::string& reason)
    {
        m_error = reason;
        return false;
    }

    /// Writes a chunk around content.
    template <class Content>
    bool sized(uint32_t id, Content&& content)
    {
        appendWord(m_bytes, id);
        const size_t sizeAt = m_bytes.size();
        appendWord(m_bytes, 0);
        if (++m_depth > MAX_CHUNK_DEPTH)
            return refuse("nodes or animations lie too deep");
        const bool written = content();
        --m_depth;
        const size_t size = m_bytes.size() - sizeAt - 4;
        if (size > 0x7fffffff)
            return refuse("more than two gigabytes");
        for (size_t i = 0; i < 4; ++i)
            m_bytes[sizeAt + i] = uint8_t(size >> (8 * i));
        return written;
    }

    template <class Record>
    bool list(const std::vector<Record>& records)
    {
        return sized(Record::LIST_ID, [&] { return listFields(*this, records); });
    }

    /// Refuses records that an older version cannot hold.
    bool fitsVersion(const NodeData& node)
    {
        if (node.skin && !hasSkinReferences(m_version))
            return refuse("a file of this version has no skins: node \"" + node.name + "\"");
        if (node.camera && !hasCameraReferences(m_version))
            return refuse("a file of this version has no cameras: node \"" + node.name + "\"");
        for (const NodeData& child : node.children)
        {
            if (!fitsVersion(child))
                return false;
        }
        return true;
    }

    std::vector<uint8_t>& m_bytes;
    std::string& m_error;
    FileVersion m_version;
    int m_depth = 0;
};

} // namespace

bool writeGlo(const GloScene& scene, std::vector<uint8_t>& file, std::string& error)
{
    file.clear();
    return GloWriter(file, error).chunk(scene);
}

VertexSet makeVertexSet(const std::vector<FloatAttribute>& attributes)
{
    VertexSet set;
    int stride = 0;
    for (const FloatAttribute& attribute : attributes)
    {
        set.attributes.push_back(
            {attribute.name, attribute.componentCount, attribute.type, stride, 0, attribute.normalize});
        stride += int(type::SIZES[attribute.type]) * attribute.componentCount;
        set.vertexCount = uint32_t(attribute.values.size()) / uint32_t(attribute.componentCount);
    }
    for (VertexAttribute& attribute : set.attributes)
        attribute.stride = stride;
    auto& bytes = set.data.bytes;
    bytes.reserve(size_t(set.vertexCount) * size_t(stride));
    for (size_t vertex = 0; vertex < set.vertexCount; ++vertex)
    {
        for (const FloatAttribute& attribute : attributes)
        {
            const size_t first = vertex * size_t(attribute.componentCount);
            for (size_t i = first; i < first + size_t(attribute.componentCount); ++i)
            {
                if (attribute.type == type::UINT8)
                    bytes.push_back(uint8_t(attribute.values[i] + 0.5f));
                else
                    appendFloat(bytes, attribute.values[i]);
            }
        }
    }
    return set;
}

void addKey(Channel& channel, float time, const std::vector<float>& values)
{
    channel.coefficientCount = uint32_t(values.size());
    ++channel.keyCount;
    appendFloat(channel.keys, time);
    for (const float value : values)
        appendFloat(channel.keys, value);
}

} // namespace glo
