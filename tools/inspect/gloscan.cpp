#include "gloscan.h"

#include "orv/detail/glofields.h"
#include "orv/detail/glomaterialrules.h"
#include "orv/detail/littleendian.h"

#include <algorithm>
#include <cstring>
#include <iterator>
#include <utility>

namespace inspect
{

using namespace orv::detail::glo;
using nlohmann::ordered_json;

std::string Chunk::getName() const
{
    return !fields.empty() && fields.front().value.is_string() ? fields.front().value.get<std::string>() : "";
}

const Chunk& Chunk::find(uint32_t childId, size_t childRecord) const
{
    const auto place = m_places.find({childId, childRecord});
    return place != m_places.end() ? children[place->second] : *this;
}

void Chunk::add(Chunk&& child)
{
    ++m_counts[child.id];
    m_places.emplace(std::pair(child.id, child.record), children.size());
    children.push_back(std::move(child));
}

size_t Chunk::count(uint32_t childId) const
{
    const auto found = m_counts.find(childId);
    return found != m_counts.end() ? found->second : 0;
}

namespace
{

std::string name(uint32_t id)
{
    std::string text = ChunkName(id).text;
    for (char& c : text)
        c = c >= ' ' && c <= '~' ? c : '?';
    return text.empty() ? "????" : text;
}

std::string number(uint64_t value)
{
    return std::to_string(value);
}

/// "vertex count " without its blank.
std::string trim(const char* label)
{
    std::string text = label;
    while (!text.empty() && text.back() == ' ')
        text.pop_back();
    return text;
}

class BlockScanner
{
public:
    BlockScanner(const uint8_t* bytes, ordered_json& values) : m_bytes(bytes), m_values(values) {}

    void u32(uint32_t& value)
    {
        value = next();
        m_values.push_back(value);
    }

    void f32(float& value)
    {
        const uint32_t word = next();
        std::memcpy(&value, &word, sizeof(value));
        m_values.push_back(value);
    }

private:
    uint32_t next()
    {
        const uint32_t word = orv::detail::readLittleEndian(m_bytes);
        m_bytes += 4;
        return word;
    }

    const uint8_t* m_bytes;
    ordered_json& m_values;
};

/// The Io for fields(). An operation that fails has reported why and ends its chunk; chunk() continues after it.
class GloScanner
{
public:
    GloScanner(const std::vector<uint8_t>& bytes, Findings& findings) : m_bytes(bytes), m_findings(findings)
    {
    }

    ScannedFile scan()
    {
        m_file.size = m_end = m_bytes.size();
        m_chunk = &m_outside;
        if (m_bytes.size() < 8 || peekWord() != GloScene::ID)
        {
            report(Kind::NOT_GLO, 0, "the file does not begin with a GLO3 chunk; it is no scene file");
            return std::move(m_file);
        }
        chunk(m_file.scene);
        m_file.top = std::move(m_outside.children.front());
        if (m_position < m_bytes.size())
            m_findings.add(Kind::CHUNK_SIZE, m_position, m_file.top.path,
                           "the GLO3 chunk ends " + counted(m_bytes.size() - m_position, "byte", "bytes") +
                               " before the file");
        if (!m_hasInfo)
            report(Kind::NO_INFO, 0, "there is no INFO chunk, so the file is read as one of version 0.0.0");
        return std::move(m_file);
    }

    FileVersion version() const { return m_file.version; }

    bool acceptVersion(const std::string& text)
    {
        m_hasInfo = true;
        if (m_sawList)
            report(Kind::LATE_INFO, m_chunk->offset, "INFO stands behind chunks whose layout depends on it");
        if (!parseVersion(text.c_str(), m_file.version))
            return refuse(Kind::BAD_VERSION,
                          "the file version \"" + text + "\" is not three numbers with dots");
        return isSupported(m_file.version) ||
               refuse(Kind::NEW_VERSION, "the file version " + text + " is newer than the engine reads");
    }

    bool acceptTool(const std::string& text)
    {
        for (const AuthoringToolName& known : AUTHORING_TOOLS)
        {
            if (text != known.text)
                continue;
            m_file.tool = known.tool;
            return true;
        }
        return refuse(Kind::UNKNOWN_TOOL,
                      "the authoring tool \"" + text + "\" is not one that the engine knows");
    }

    bool u32(const char* label, uint32_t& value)
    {
        if (!need(label, 4))
            return false;
        addField(label, 4, value = peekWord());
        return true;
    }

    bool i32(const char* label, int32_t& value)
    {
        if (!need(label, 4))
            return false;
        addField(label, 4, value = int32_t(peekWord()));
        return true;
    }

    bool f32(const char* label, float& value) { return floats(label, &value, 1); }

    bool floats(const char* label, float* values, int count)
    {
        const uint32_t size = uint32_t(count) * 4;
        if (!need(label, size))
            return false;
        ordered_json list = ordered_json::array();
        BlockScanner block(&m_bytes[m_position], list);
        for (int i = 0; i < count; ++i)
            block.f32(values[i]);
        addField(label, size, count == 1 ? list[0] : list);
        return true;
    }

    bool text(const char* label, std::string& value)
    {
        if (!need(label, 4))
            return false;
        const uint32_t size = peekWord();
        if (size < 1 || size > MAX_TEXT_SIZE)
            return refuse(Kind::BAD_TEXT, "the " + trim(label) + " has a length of " + number(size) +
                                              "; 1 to " + number(MAX_TEXT_SIZE) + " is allowed");
        if (!need(label, 4 + size))
            return false;
        const char* characters = reinterpret_cast<const char*>(&m_bytes[m_position + 4]);
        if (characters[size - 1] != '\0')
            return refuse(Kind::BAD_TEXT, "the " + trim(label) + " does not end with a NUL");
        value = characters;
        addField(label, 4 + size, value);
        return true;
    }

    template <class Fields>
    bool block(const char* label, uint32_t size, Fields&& blockFields)
    {
        if (!need(label, size))
            return false;
        ordered_json values = ordered_json::array();
        BlockScanner scanner(&m_bytes[m_position], values);
        blockFields(scanner);
        addField(label, size, values);
        return true;
    }

    template <class Record>
    bool chunk(Record& record)
    {
        Chunk child;
        if (!openChunk(child, Record::ID))
            return false;
        if (child.id == Record::ID)
        {
            readChunk(child, [&] { return fields(*this, record); });
            return true;
        }
        report(Kind::UNEXPECTED_CHUNK, child.offset,
               "a " + name(child.id) + " chunk stands where " + name(Record::ID) + " is required");
        skipChunk(child);
        return true;
    }

    template <class Optional>
    bool optionalChunk(Optional& record)
    {
        return chunk(record.emplace());
    }

    template <class Record>
    bool chunks(uint32_t count, std::vector<Record>& records, bool skipUnknown)
    {
        for (uint32_t i = 0; i < count; ++i)
        {
            Chunk child;
            const uint64_t left = m_end - m_position;
            if (skipUnknown && left < 4 && m_position + left == m_bytes.size())
            {
                report(Kind::LIST_SHORT, m_position,
                       number(count) + " " + name(Record::ID) +
                           " chunks are counted, but the file ends after " + number(i));
                m_position = m_end;
                return false;
            }
            if (!openChunk(child, Record::ID))
                return false;
            if (child.id != Record::ID)
            {
                report(skipUnknown ? Kind::SKIPPED_CHUNK : Kind::UNEXPECTED_CHUNK, child.offset,
                       "a " + name(child.id) + " chunk stands in a list of " + name(Record::ID));
                skipChunk(child);
                continue;
            }
            child.record = records.size();
            Record record;
            readChunk(child, [&] { return fields(*this, record); });
            records.push_back(std::move(record));
        }
        return true;
    }

    template <class Element, class Fields>
    bool each(uint32_t count, std::vector<Element>& elements, Fields&& elementFields)
    {
        for (uint32_t i = 0; i < count; ++i)
        {
            if (!elementFields(elements.emplace_back()))
                return false;
        }
        return true;
    }

    bool body(GloScene& scene)
    {
        while (m_end - m_position >= 4)
        {
            Chunk child;
            if (!openChunk(child, 0))
                return false;
            if (std::find(std::begin(BODY_CHUNKS), std::end(BODY_CHUNKS), child.id) == std::end(BODY_CHUNKS))
            {
                report(Kind::SKIPPED_CHUNK, child.offset, "an unknown chunk " + name(child.id));
                skipChunk(child);
                continue;
            }
            readChunk(child, [&] { return readBody(child.id, scene); });
            m_sawList = true;
        }
        if (m_position < m_end)
            report(Kind::TRAILING_BYTES, m_position, "bytes follow the last chunk");
        m_position = m_end;
        applySurfaces(scene);
        return true;
    }

    bool bytes(VertexData& data)
    {
        data.bytes.assign(m_bytes.begin() + ptrdiff_t(m_position), m_bytes.begin() + ptrdiff_t(m_end));
        m_position = m_end;
        return true;
    }

    bool indices(IndexData& data)
    {
        for (; m_end - m_position >= 2; m_position += 2)
            data.indices.push_back(uint16_t(m_bytes[m_position] | m_bytes[m_position + 1] << 8));
        if (m_position < m_end)
            report(Kind::ODD_INDICES, m_position, "an odd byte follows the last index");
        m_position = m_end;
        return true;
    }

    bool keys(Channel& channel)
    {
        const uint64_t keySize = 4 + uint64_t(channel.coefficientCount) * type::SIZES[channel.type];
        const uint64_t left = m_end - m_position;
        if (channel.keyCount > 0 && (keySize > left || channel.keyCount > left / keySize))
        {
            report(Kind::KEYS_CUT, m_position,
                   counted(channel.keyCount, "key", "keys") + " of " + number(keySize) +
                       " bytes each, where " + counted(left, "byte is", "bytes are") + " left");
            return false;
        }
        const auto start = m_bytes.begin() + ptrdiff_t(m_position);
        const ptrdiff_t size = ptrdiff_t(channel.keyCount * keySize);
        channel.keys.assign(start, start + size);
        m_position += uint64_t(size);
        return true;
    }

    /// The three faults that fields() itself detects.
    bool fail(const char* format)
    {
        if (std::strcmp(format, UNEXPECTED_INDEX_BUFFERS) == 0)
            return refuse(Kind::INDEX_BUFFERS, "more than one index buffer is counted");
        if (std::strcmp(format, UNEXPECTED_TYPE) == 0)
            return refuse(Kind::KEY_TYPE, "the keys are of an unknown type");
        return refuse(Kind::INDEX_TYPE, "only unsigned 16-bit indices, type 3, are supported");
    }

private:
    uint32_t peekWord() const { return orv::detail::readLittleEndian(&m_bytes[m_position]); }

    void report(Kind kind, uint64_t offset, const std::string& sentence)
    {
        m_findings.add(kind, offset, m_chunk->path, sentence);
    }

    /// Reports at the last field.
    bool refuse(Kind kind, const std::string& sentence)
    {
        report(kind, m_chunk->fields.empty() ? m_position : m_chunk->fields.back().offset, sentence);
        return false;
    }

    bool need(const char* label, uint64_t size)
    {
        if (m_end - m_position >= size)
            return true;
        report(Kind::FIELD_CUT, m_position, "the chunk ends before or inside the " + trim(label));
        return false;
    }

    void addField(const char* label, uint32_t size, ordered_json value)
    {
        m_chunk->fields.push_back({trim(label), m_position, std::move(value)});
        m_position += size;
    }

    /// Reads the header of the next chunk in the present one.
    bool openChunk(Chunk& child, uint32_t wanted)
    {
        if (m_end - m_position < 8)
        {
            if (m_end - m_position >= 4 && m_end == m_bytes.size())
                report(Kind::HEADER_CUT, m_position, "the file ends inside the header of a chunk");
            else
                report(Kind::MISSING_CHUNK, m_position, "a " + name(wanted) + " chunk is missing");
            m_position = m_end;
            return false;
        }
        child.offset = m_position;
        child.id = peekWord();
        m_position += 4;
        child.size = peekWord();
        m_position += 4;
        const size_t same = m_chunk->count(child.id);
        child.path = (m_chunk->path.empty() ? "" : m_chunk->path + "/") + name(child.id);
        if (same > 0 || isListed(child.id))
            child.path += "[" + number(same) + "]";
        return true;
    }

    static bool isListed(uint32_t id)
    {
        constexpr uint32_t LISTED[] = {Geometry::ID,         Material::ID,     Skin::ID,
                                       LightDefinition::ID,  Attachment::ID,   AnimationData::ID,
                                       CameraDefinition::ID, Channel::ID,      NodeData::ID,
                                       VertexAttribute::ID,  PrimitiveSet::ID, StandardMaterial::ID};
        return std::find(std::begin(LISTED), std::end(LISTED), id) != std::end(LISTED);
    }

    /// The end of a chunk's data, cut to that of the chunk around it.
    uint64_t findEnd(const Chunk& child)
    {
        if (child.size <= m_end - m_position)
            return m_position + child.size;
        if (!std::exchange(m_cut, true)) // once, for the outermost chunk
            report(Kind::CHUNK_CUT, child.offset,
                   "the " + name(child.id) + " chunk of " + counted(child.size, "byte", "bytes") +
                       " reaches " + counted(child.size - (m_end - m_position), "byte", "bytes") +
                       " too far");
        return m_end;
    }

    template <class Content>
    void readChunk(Chunk& child, Content&& content)
    {
        const uint64_t outerEnd = m_end;
        const bool outerCut = m_cut;
        const uint64_t end = findEnd(child);
        Chunk* const outer = std::exchange(m_chunk, &child);
        m_end = end;
        if (m_depth >= MAX_CHUNK_DEPTH)
        {
            report(Kind::TOO_DEEP, child.offset, "chunks lie more than " + number(MAX_CHUNK_DEPTH) + " deep");
        }
        else
        {
            ++m_depth;
            if (content() && m_position < end)
                report(Kind::CHUNK_SIZE, m_position,
                       "the " + name(child.id) + " chunk says " + counted(child.size, "byte", "bytes") +
                           " but holds " + number(child.size - (end - m_position)));
            --m_depth;
        }
        m_position = end;
        m_cut = outerCut;
        m_end = outerEnd;
        m_chunk = outer;
        outer->add(std::move(child));
    }

    void skipChunk(Chunk& child)
    {
        child.known = false;
        const bool outerCut = m_cut;
        m_position = findEnd(child);
        m_cut = outerCut;
        m_chunk->add(std::move(child));
    }

    bool readBody(uint32_t id, GloScene& scene)
    {
        switch (id)
        {
        case Info::ID: m_file.tool = AuthoringTool::MAX; return fields(*this, scene.info);
        case Geometry::LIST_ID: return listFields(*this, scene.geometries);
        case Skin::LIST_ID: return listFields(*this, scene.skins);
        case LightDefinition::LIST_ID: return listFields(*this, scene.lights);
        case CameraDefinition::LIST_ID: return listFields(*this, scene.cameras);
        case Material::LIST_ID: return listFields(*this, scene.materials);
        case Surfaces::ID: return fields(*this, scene.surfaces);
        case AnimationData::LIST_ID: return listFields(*this, scene.animations);
        default: break;
        }
        if (scene.scene)
        {
            report(Kind::SECOND_SCENE, m_position, "there is more than one scene");
            return false;
        }
        return fields(*this, scene.scene.emplace());
    }

    const std::vector<uint8_t>& m_bytes;
    Findings& m_findings;
    ScannedFile m_file;
    Chunk m_outside;
    Chunk* m_chunk = nullptr; ///< the present one
    uint64_t m_position = 0;
    uint64_t m_end = 0; ///< of the present chunk
    bool m_cut = false; ///< that end differs from the header's
    int m_depth = 0;
    bool m_hasInfo = false;
    bool m_sawList = false;
};

} // namespace

ScannedFile scanGlo(const std::vector<uint8_t>& bytes, Findings& findings)
{
    return GloScanner(bytes, findings).scan();
}

} // namespace inspect
