#include "orv/detail/gloreader.h"

#include "orv/detail/glolog.h"
#include "orv/detail/littleendian.h"

#include <algorithm>
#include <bit>
#include <cstring>
#include <new>
#include <utility>

namespace orv::detail
{

using namespace glo;

namespace
{

/// Reads the fields of a block in memory.
class BlockReader
{
public:
    explicit BlockReader(const unsigned char* bytes) : m_bytes(bytes) {}

    void u32(uint32_t& value)
    {
        value = readLittleEndian(m_bytes);
        m_bytes += 4;
    }

    void f32(float& value)
    {
        uint32_t word;
        u32(word);
        std::memcpy(&value, &word, sizeof(value));
    }

private:
    const unsigned char* m_bytes;
};

/// Whether a block of that size can be allocated: a vector cannot report it, since the engine has no exceptions.
bool isAllocatable(size_t size)
{
    void* trial = ::operator new(size, std::nothrow);
    ::operator delete(trial);
    return trial != nullptr;
}

} // namespace

GloReader::GloReader(Stream& stream, GeometryReceiver& geometries, const char* name)
    : m_stream(stream)
    , m_geometries(geometries)
    , m_name(name)
{
}

bool GloReader::read()
{
    return chunk(m_scene);
}

/// Goes to the data of the next chunk if its ID is one of those, a list that ends with 0. At the end of the stream a
/// chunk that may be absent counts as skipped.
GloReader::Opening GloReader::open(const uint32_t ids[], bool skipUnknown, OpenChunk& chunk)
{
    ORV_ASSERT(ids);
    unsigned char word[4];
    const bool isEnd = remaining() < sizeof(word); // otherwise the read failed before the end
    if (!readExactly(word, sizeof(word)))
    {
        m_ended = true;
        if (skipUnknown && isEnd)
            return Opening::SKIPPED;
        ORV_GLO_ERROR("Failed to read chunk ID");
        return Opening::FAILED;
    }
    const uint32_t id = readLittleEndian(word);
    if (!readExactly(word, sizeof(word)))
    {
        ORV_GLO_ERROR("Failed to read %s chunk size", ChunkName(id).text);
        return Opening::FAILED;
    }
    const uint32_t size = readLittleEndian(word);

    const uint32_t* known = ids;
    while (*known != 0 && *known != id)
        ++known;
    if (*known != 0)
        return enter(id, size, chunk);
    if (skipUnknown)
        return skipChunk(id, size) ? Opening::SKIPPED : Opening::FAILED;

    std::string expected;
    for (known = ids; *known != 0; ++known)
        expected.append(expected.empty() ? "" : ", ").append(ChunkName(*known).text);
    ORV_GLO_ERROR("Chunk ID \"%s\" does not match expected ID(s): \"%s\"", ChunkName(id).text,
                  expected.c_str());
    return Opening::FAILED;
}

GloReader::Opening GloReader::open(uint32_t id, bool skipUnknown, OpenChunk& chunk)
{
    const uint32_t ids[] = {id, 0};
    return open(ids, skipUnknown, chunk);
}

GloReader::Opening GloReader::enter(uint32_t id, uint32_t size, OpenChunk& chunk)
{
    if (m_depth >= MAX_CHUNK_DEPTH)
    {
        fail("Chunks lie more than 512 deep in %s");
        return Opening::FAILED;
    }
    chunk = {id, position(), m_chunkSize};
    m_chunkSize = size;
    ++m_depth;
    return Opening::OPENED;
}

/// @param isRead  whether its data were read. @return true if they were read completely.
bool GloReader::close(const OpenChunk& chunk, bool isRead)
{
    const uint32_t size = m_chunkSize;
    m_chunkSize = chunk.outerSize;
    --m_depth;
    if (!isRead)
        return false;
    const uint32_t consumed = position() - chunk.start;
    return consumed == size || sizeMismatch(chunk.id, consumed, size);
}

/// A chunk that reaches beyond the end is damaged: seeking there would wrap or, in some streams, stop short.
bool GloReader::skipChunk(uint32_t id, uint32_t size)
{
    const uint32_t left = remaining();
    if (size > left)
        return sizeMismatch(id, left, size);
    if (m_stream.seek(position() + size) >= 0)
        return true;
    ORV_GLO_ERROR("Failed to skip %s chunk in %s", ChunkName(id).text, m_name.c_str());
    return false;
}

bool GloReader::sizeMismatch(uint32_t id, uint32_t consumed, uint32_t size) const
{
    ORV_GLO_ERROR("Size of %s chunk data (%u) does not match expected size (%u)", ChunkName(id).text,
                  consumed, size);
    return false;
}

/// The end of the stream also when the position is unknown, as after a short read from a file, or beyond it.
uint32_t GloReader::position() const
{
    const int32_t size = m_stream.size();
    const int32_t position = m_ended ? -1 : m_stream.tell();
    const int32_t known = position < 0 || position > size ? size : position;
    return known < 0 ? 0 : uint32_t(known);
}

uint32_t GloReader::remaining() const
{
    const int32_t size = m_stream.size();
    return size < 0 ? 0 : uint32_t(size) - position();
}

bool GloReader::readExactly(void* buffer, uint32_t size)
{
    return m_stream.read(buffer, size) == int32_t(size);
}

bool GloReader::readField(const char* label, void* buffer, uint32_t size)
{
    if (readExactly(buffer, size))
        return true;
    ORV_GLO_ERROR("Error reading: %s in file: %s ", label, m_name.c_str());
    return false;
}

bool GloReader::fail(const char* format) const
{
    ORV_GLO_ERROR(format, m_name.c_str());
    return false;
}

bool GloReader::u32(const char* label, uint32_t& value)
{
    unsigned char word[4];
    if (!readField(label, word, sizeof(word)))
        return false;
    value = readLittleEndian(word);
    return true;
}

bool GloReader::i32(const char* label, int32_t& value)
{
    uint32_t word;
    if (!u32(label, word))
        return false;
    value = int32_t(word);
    return true;
}

bool GloReader::f32(const char* label, float& value)
{
    return floats(label, &value, 1);
}

bool GloReader::floats(const char* label, float* values, int count)
{
    constexpr int MOST = 16;
    unsigned char words[4 * MOST];
    ORV_ASSERT(count <= MOST);
    if (!readField(label, words, uint32_t(4 * count)))
        return false;
    BlockReader block(words);
    for (int i = 0; i < count; ++i)
        block.f32(values[i]);
    return true;
}

bool GloReader::text(const char* label, std::string& value)
{
    uint32_t size;
    if (!u32(label, size))
        return false;
    value.resize(std::clamp<uint32_t>(size, 1, MAX_TEXT_SIZE));
    if (value.size() == size && readExactly(value.data(), size) && value.back() == '\0')
    {
        value.resize(std::strlen(value.c_str()));
        return true;
    }
    ORV_GLO_ERROR("Error reading: %s in file: %s ", label, m_name.c_str());
    return false;
}

template <class Fields>
bool GloReader::block(const char* label, uint32_t size, Fields&& blockFields)
{
    unsigned char words[40];
    ORV_ASSERT(size <= sizeof(words));
    if (!readField(label, words, size))
        return false;
    BlockReader block(words);
    blockFields(block);
    return true;
}

bool GloReader::acceptVersion(const std::string& text)
{
    if (!parseVersion(text.c_str(), m_version))
        return fail("Incorrect glo version file format in %s");
    return isSupported(m_version) || fail("File version not supported in %s");
}

bool GloReader::acceptTool(const std::string& text)
{
    for (const AuthoringToolName& known : AUTHORING_TOOLS)
    {
        if (text == known.text)
        {
            m_tool = known.tool;
            return true;
        }
    }
    return fail("Only 3DS-Max 2012 and Blender 2.63.0 are supported as authoring tools (%s)");
}

bool GloReader::body(GloScene& scene)
{
    while (!m_ended && !m_stream.eof())
    {
        OpenChunk opened;
        const Opening opening = open(BODY_CHUNKS, true, opened);
        if (opening == Opening::FAILED)
            return false;
        if (opening == Opening::OPENED && !close(opened, bodyChunk(opened.id, scene)))
            return false;
    }
    return true;
}

/// One of BODY_CHUNKS.
bool GloReader::bodyChunk(uint32_t id, GloScene& scene)
{
    switch (id)
    {
    case Info::ID: m_tool = AuthoringTool::MAX; return fields(*this, scene.info);
    case Geometry::LIST_ID: return listFields(*this, scene.geometries);
    case Material::LIST_ID: return listFields(*this, scene.materials);
    case Surfaces::ID: return fields(*this, scene.surfaces);
    case Skin::LIST_ID: return listFields(*this, scene.skins);
    case LightDefinition::LIST_ID: return listFields(*this, scene.lights);
    case CameraDefinition::LIST_ID: return listFields(*this, scene.cameras);
    case AnimationData::LIST_ID: return listFields(*this, scene.animations);
    case SceneData::ID:
        if (scene.scene)
            return fail("More than one scene in %s");
        return fields(*this, scene.scene.emplace());
    default: return false;
    }
}

template <class Record>
bool GloReader::chunk(Record& record)
{
    OpenChunk opened;
    return open(Record::ID, false, opened) == Opening::OPENED && close(opened, fields(*this, record));
}

template <class Optional>
bool GloReader::optionalChunk(Optional& record)
{
    return chunk(record.emplace());
}

template <class Record>
bool GloReader::chunks(uint32_t count, std::vector<Record>& records, bool skipUnknown)
{
    for (uint32_t i = 0; i < count && !m_ended; ++i)
    {
        OpenChunk opened;
        const Opening opening = open(Record::ID, skipUnknown, opened);
        if (opening == Opening::FAILED)
            return false;
        if (opening == Opening::SKIPPED)
            continue;
        Record record;
        if (!close(opened, fields(*this, record)) || !keep(record, records))
            return false;
    }
    return true;
}

template <class Record>
bool GloReader::keep(Record& record, std::vector<Record>& records)
{
    records.push_back(std::move(record));
    return true;
}

bool GloReader::keep(Geometry& geometry, std::vector<Geometry>&)
{
    return m_geometries.receive(geometry, m_version);
}

template <class Element, class Fields>
bool GloReader::each(uint32_t count, std::vector<Element>& elements, Fields&& elementFields)
{
    for (uint32_t i = 0; i < count; ++i)
    {
        if (!elementFields(elements.emplace_back()))
            return false;
    }
    return true;
}

template <class Element>
bool GloReader::readElements(RawVector<Element>& elements, uint32_t count)
{
    elements.resize(count);
    return readExactly(elements.data(), count * uint32_t(sizeof(Element)));
}

bool GloReader::bytes(VertexData& data)
{
    if (m_chunkSize > remaining() || !isAllocatable(m_chunkSize))
        return fail("vertex buffer read failed in %s");
    return readElements(data.bytes, m_chunkSize) || fail("vertex buffer read failed in %s");
}

bool GloReader::indices(IndexData& data)
{
    const uint32_t size = m_chunkSize < 4 ? 0 : m_chunkSize - 4;
    if (size > remaining() || !isAllocatable(size))
        return fail("Failed to read indices in %s");
    if (!readElements(data.indices, size / 2))
        return fail("Failed to read indices in %s");
    for (size_t i = 0; std::endian::native != std::endian::little && i < data.indices.size(); ++i)
        data.indices[i] = uint16_t(data.indices[i] << 8 | data.indices[i] >> 8);

    unsigned char spare;
    return size % 2 == 0 || readExactly(&spare, 1) || fail("Failed to read indices in %s");
}

bool GloReader::keys(Channel& channel)
{
    const uint64_t keySize = 4 + uint64_t(channel.coefficientCount) * type::SIZES[channel.type];
    const uint32_t left = remaining();
    if (keySize > left || channel.keyCount > left / keySize)
    {
        // Without keys there is nothing to read, whatever the size of a key.
        return channel.keyCount == 0 || fail("Failed to read animation data in %s");
    }
    const uint32_t size = channel.keyCount * uint32_t(keySize);
    if (!isAllocatable(size))
        return fail("Failed to read animation data in %s");
    channel.keys.resize(size);
    return readExactly(channel.keys.data(), size) || fail("Failed to read animation data in %s");
}

} // namespace orv::detail
