#pragma once

#include "orv/export.h"
#include "orv/sharedptr.h"
#include "orv/vertexarray.h"

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace orv
{

class RenderContext;
class Stream;

namespace detail
{

class BufferResource;
struct ProgramAttrib;

/// One attribute of a vertex buffer. Its values are in array as long as that is set; after that they are in the
/// GL buffer, and an attribute with neither counts as missing.
struct AttribRecord
{
    std::string name;
    unsigned int glType = 0; ///< GL component type; 0 for an unknown format, which is never drawn.
    SharedPtr<VertexArray> array;
    bool normalised = false;
    int offset = 0; ///< Bytes into the interleaved vertex; for values in the GL buffer.
    int componentCount = 0;
    int stride = 0;     ///< Bytes from vertex to vertex; 0 = tightly packed.
    uint32_t usage = 0; ///< VertexBuffer::AttribUsage.
};

} // namespace detail

/// Named vertex attributes, and the GL buffer that most of them end up in.
///
/// Attributes are added as arrays; commit() interleaves them into one GL buffer and drops the arrays. The order
/// of interleaving and of saving is the reverse of that of adding. Until commit(), and always for attributes
/// meant for client memory, GL reads the arrays directly. After the context was lost (AssetCachePool::release())
/// committed attributes are missing; the buffer has to be made again.
/// Threads: the GL thread only.
class ORV_API VertexBuffer : public Shared
{
public:
    ORV_CLASS_NAME("VertexBuffer")
    using Ptr = SharedPtr<VertexBuffer>;

    /// The type of an attribute's components.
    enum class AttribFormat : uint32_t
    {
        BYTE = 0,
        UNSIGNED_BYTE = 1,
        SHORT = 2,
        UNSIGNED_SHORT = 3,
        FLOAT = 4,
        FIXED = 5 ///< 16.16 fixed point, four bytes.
    };

    /// Where an attribute's values are.
    enum class AttribUsage : uint32_t
    {
        GL_BUFFER = 0,    ///< Moves into the GL buffer at commit().
        CLIENT_MEMORY = 1 ///< Stays in its array; as does any other value.
    };

    /// One attribute of data that is interleaved already.
    struct AttribDescription
    {
        std::string name;                          ///< As the shader program calls it.
        AttribFormat format = AttribFormat::FLOAT; ///< Of its components.
        bool normalised = false;                   ///< Whether integers stand for shares of the largest one.
        int offset = 0;                            ///< Bytes.
        int componentCount = 0;
        int stride = 0; ///< Bytes; 0 = tightly packed.
    };

    /// Buffers normally come from VertexBufferCache::create(), whose resource cache must know the resource.
    explicit VertexBuffer(const SharedPtr<detail::BufferResource>& resource);
    ~VertexBuffer() override;

    /// Puts an attribute before those there are.
    /// @param array  shared, not copied; its values are read when the buffer is committed, saved or drawn.
    /// @param normalise  integers are scaled to 0..1 or -1..1.
    /// @return false, after an error, for a null array or name or where a component is wider than those of array.
    bool addAttrib(const SharedPtr<VertexArray>& array, const char* name, AttribFormat format,
                   AttribUsage usage, bool normalise);

    /// Of the attributes that commit() would interleave: bytes altogether and bytes of one vertex.
    void getSizeAndStride(unsigned int& size, int& stride) const;

    /// Interleaves into out and drops the arrays that went there, so this is done once.
    /// @param size, stride  from getSizeAndStride(); out has size bytes.
    /// @return false, after an error and with nothing changed, if the arrays differ in vertex count.
    bool createTempData(unsigned int size, int stride, unsigned char* out);

    /// Interleaves into the GL buffer, which stays bound. Where that fails (logged) the arrays stay and are drawn.
    void commit();

    /// Fills the GL buffer, which stays bound, with data that is interleaved already; replaces all attributes.
    /// @param data  copied. An attribute that reaches beyond size or has another component count than 1 to 4 is
    /// logged and counts as missing.
    /// @return false, object unchanged, if the resource was used before or GL has no buffer.
    bool setAllAttributes(const AttribDescription* descriptions, unsigned int count,
                          const unsigned char* data, unsigned int size);

    /// Puts other vertices of the same attributes into the GL buffer, which stays bound: for what changes often.
    /// @param data  copied; what the buffer held before is dropped.
    /// @return false, buffer unchanged, without data or a GL buffer; false, after an error and with the buffer lost, where
    /// GL has no memory for it.
    bool replaceData(const unsigned char* data, unsigned int size);

    /// Lets a vertex shader input read the attribute of this name.
    /// @return false, with the array disabled, if it is missing.
    bool enableAttrib(unsigned int location, const char* name);

    /// Draw path: sets all inputs of a program up, through what the context remembers. One that is missing here
    /// gets the constant (1, 1, 1, 1). Names are compared only the first time that the two meet.
    /// @param programRevision  stands for the program and its attributes, which are the same whenever it is.
    void bindAttribs(RenderContext& context, uint64_t programRevision, const detail::ProgramAttrib* attribs,
                     int count);

    /// Whether committed values went with their context: whatever is drawn from this buffer would be garbage.
    bool isLost() const;

    /// Writes the raw form: three 32-bit numbers (bytes of data, bytes of a vertex, records), 56 bytes a record,
    /// the interleaved data; all little-endian. Drops the arrays as createTempData() does.
    /// @return false, after an error, for a buffer that was committed or saved before, a name of more than 15
    /// characters, or a stream that does not take it all.
    bool save(const SharedPtr<Stream>& stream);

    /// Replaces the attributes by those of a raw form; the GL buffer stays bound. Attributes that were in client
    /// memory are missing.
    /// @return false, after an error and with the attributes unchanged, if anything in it is out of range or GL
    /// has no buffer.
    bool load(const SharedPtr<Stream>& stream);

    unsigned int getId() const; ///< GL buffer name, 0 if there is none.

    /// Changes whenever the attributes do; no two buffers have the same.
    uint64_t getRevision() const { return m_revision; }

    /// In the order of interleaving; valid until the attributes change.
    const std::vector<detail::AttribRecord>& getAttribs() const { return m_attribs; }

    /// Whether "a_weights" has fewer than four components, so that GL makes the last weight 1.
    bool lacksLastWeight() const { return m_lacksLastWeight; }

    /// @return null if there is none of this name.
    const detail::AttribRecord* findAttrib(const char* name) const;

private:
    /// Which attribute feeds which input of one program.
    struct Plan
    {
        uint64_t programRevision = 0;
        std::vector<const detail::AttribRecord*> sources;
    };

    ORV_LOCAL const Plan& getPlan(uint64_t programRevision, const detail::ProgramAttrib* attribs, int count);
    ORV_LOCAL bool upload(const unsigned char* data, unsigned int size);
    ORV_LOCAL void attribsChanged();

    std::vector<detail::AttribRecord> m_attribs;
    SharedPtr<detail::BufferResource> m_resource;
    uint64_t m_revision;
    bool m_lacksLastWeight = false;
    std::array<Plan, 8> m_plans;
    unsigned int m_nextPlan = 0; ///< The plan that the next unknown program takes over.
};

} // namespace orv
