#pragma once

#include "orv/detail/glofields.h"
#include "orv/stream.h"

#include <string>
#include <vector>

namespace orv::detail
{

/// Receives the geometries of a scene file, nearly all of its bytes, each before the next one is read.
class GeometryReceiver
{
public:
    virtual ~GeometryReceiver() = default;

    /// @param version  of the file, as read so far; writers put it first.
    /// @return false, after logging, to end the reading.
    virtual bool receive(glo::Geometry& geometry, glo::FileVersion version) = 0;
};

/// Reads a scene file into plain records and checks every chunk against its size.
///
/// One per load. The first failure is logged and ends the reading.
class GloReader
{
public:
    /// @param stream      borrowed.
    /// @param geometries  borrowed; gets the geometries, which are not in the scene's records.
    /// @param name        for messages.
    GloReader(Stream& stream, GeometryReceiver& geometries, const char* name);

    /// The whole file. @return false, after logging, with the scene in part read.
    bool read();

    glo::GloScene& scene() { return m_scene; }

    // The interface for glo::fields().
    glo::FileVersion version() const { return m_version; }
    bool acceptVersion(const std::string& text);
    bool acceptTool(const std::string& text);
    glo::AuthoringTool tool() const { return m_tool; }
    bool u32(const char* label, uint32_t& value);
    bool i32(const char* label, int32_t& value);
    bool f32(const char* label, float& value);
    bool floats(const char* label, float* values, int count);
    bool text(const char* label, std::string& value);
    bool bytes(glo::VertexData& data);
    bool indices(glo::IndexData& data);
    bool keys(glo::Channel& channel);
    bool body(glo::GloScene& scene);
    bool fail(const char* format) const;

    template <class Fields>
    bool block(const char* label, uint32_t size, Fields&& blockFields);
    template <class Record>
    bool chunk(Record& record);
    template <class Optional>
    bool optionalChunk(Optional& record);
    template <class Record>
    bool chunks(uint32_t count, std::vector<Record>& records, bool skipUnknown);
    template <class Element, class Fields>
    bool each(uint32_t count, std::vector<Element>& elements, Fields&& elementFields);

private:
    enum class Opening
    {
        FAILED,
        SKIPPED, ///< another chunk, or the end of the stream
        OPENED
    };

    struct OpenChunk
    {
        uint32_t id;
        uint32_t start;     ///< of its data
        uint32_t outerSize; ///< m_chunkSize around it
    };

    Opening open(const uint32_t ids[], bool skipUnknown, OpenChunk& chunk);
    Opening open(uint32_t id, bool skipUnknown, OpenChunk& chunk);
    Opening enter(uint32_t id, uint32_t size, OpenChunk& chunk);
    bool close(const OpenChunk& chunk, bool isRead);
    bool bodyChunk(uint32_t id, glo::GloScene& scene);
    bool skipChunk(uint32_t id, uint32_t size);
    template <class Record>
    bool keep(Record& record, std::vector<Record>& records);
    bool keep(glo::Geometry& geometry, std::vector<glo::Geometry>& records);
    bool readExactly(void* buffer, uint32_t size);
    template <class Element>
    bool readElements(RawVector<Element>& elements, uint32_t count);
    bool readField(const char* label, void* buffer, uint32_t size);
    uint32_t position() const;
    uint32_t remaining() const;
    bool sizeMismatch(uint32_t id, uint32_t consumed, uint32_t size) const;

    Stream& m_stream;
    GeometryReceiver& m_geometries;
    std::string m_name;
    bool m_ended = false; ///< the stream had no further chunk
    uint32_t m_chunkSize = 0;
    int m_depth = 0;
    glo::FileVersion m_version;
    glo::AuthoringTool m_tool = glo::AuthoringTool::MAX;
    glo::GloScene m_scene;
};

} // namespace orv::detail
