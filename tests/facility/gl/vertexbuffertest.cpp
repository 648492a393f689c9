#include "orv/vertexbuffercache.h"

#include "orv/detail/bindingepoch.h"
#include "orv/detail/programattrib.h"
#include "orv/filestreamsource.h"
#include "orv/memorystream.h"
#include "orv/rendercontext.h"

#include "facilitytest.h"
#include "support/damage.h"
#include "support/tempdir.h"

#include <algorithm>
#include <cstring>

using namespace orv;
using support::Bytes;
using support::LogCapture;
using Format = VertexBuffer::AttribFormat;
using Usage = VertexBuffer::AttribUsage;

namespace
{

VertexArray::Ptr makeFloats(int componentCount, const std::vector<float>& values)
{
    const auto array = makeShared<VertexArray>(int(values.size()) / componentCount, 4, componentCount);
    std::copy(values.begin(), values.end(), array->getData<float>());
    return array;
}

/// Numbers its bytes from first.
VertexArray::Ptr makeBytes(int vertexCount, int typeSize, int componentCount, int first)
{
    const auto array = makeShared<VertexArray>(vertexCount, typeSize, componentCount);
    for (unsigned int i = 0; i < array->getSizeInBytes(); ++i)
        array->getBytes()[i] = static_cast<unsigned char>(unsigned(first) + i);
    return array;
}

class VertexBufferTest : public FacilityTest
{
protected:
    void flush() override
    {
        buffer = nullptr;
        cache->flush();
    }

    /// Positions (3 floats), then colours (4 bytes), of two vertices.
    void addTwoAttribs()
    {
        buffer->addAttrib(makeBytes(2, 4, 3, 0), "a_position", Format::FLOAT, Usage::GL_BUFFER, false);
        buffer->addAttrib(makeBytes(2, 1, 4, 100), "a_colour", Format::UNSIGNED_BYTE, Usage::GL_BUFFER, true);
    }

    SharedPtr<Stream> openFile() { return FileStreamSource(directory.path().c_str()).open("raw", true); }

    static bool load(const VertexBuffer::Ptr& target, const Bytes& bytes)
    {
        return target->load(makeShared<MemoryStream>(bytes.data(), int(bytes.size())));
    }

    support::TempDir directory;
    SharedPtr<VertexBufferCache> cache = makeShared<VertexBufferCache>();
    VertexBuffer::Ptr buffer = cache->create(nullptr);
};

std::string pointerCall(int location, int count, const char* type, int normalised, int stride,
                        uintptr_t offset)
{
    return "glVertexAttribPointer(" + std::to_string(location) + ", " + std::to_string(count) + ", " + type +
           ", " + std::to_string(normalised) + ", " + std::to_string(stride) + ", " + std::to_string(offset) +
           ")";
}

} // namespace

// Faults caught: a second buffer for each change, vertex input that is taken to be the old one's, a lost buffer filled.
TEST_F(VertexBufferTest, replacesItsData)
{
    const unsigned char other[32] = {};
    EXPECT_FALSE(buffer->replaceData(other, sizeof(other))) << "nothing to be replaced";
    addTwoAttribs();
    buffer->commit();
    const GLuint name = buffer->getId();
    const uint64_t revision = buffer->getRevision();
    EXPECT_FALSE(buffer->replaceData(nullptr, 32));
    EXPECT_EQ(revision, buffer->getRevision());

    EXPECT_TRUE(buffer->replaceData(other, sizeof(other)));
    EXPECT_EQ(name, buffer->getId());
    EXPECT_NE(revision, buffer->getRevision());
    EXPECT_TRUE(buffer->enableAttrib(0, "a_colour"));
    GLint size = 0;
    glGetBufferParameteriv(GL_ARRAY_BUFFER, GL_BUFFER_SIZE, &size);
    EXPECT_EQ(32, size);

    cache->getResourceCache()->release();
    EXPECT_FALSE(buffer->replaceData(other, sizeof(other)));
    glDeleteBuffers(1, &name);
}

// Fault caught: vertices interleaved in the order of adding, or offsets that do not match the bytes.
TEST_F(VertexBufferTest, interleavesTheLastAddedFirst)
{
    addTwoAttribs();
    unsigned int size = 0;
    int stride = 0;
    buffer->getSizeAndStride(size, stride);
    ASSERT_EQ(32u, size);
    std::vector<unsigned char> data(size);
    EXPECT_TRUE(buffer->createTempData(size, stride, data.data()));
    const std::vector<unsigned char> expected = {100, 101, 102, 103, 0,  1,   2,   3,   4,   5,  6,
                                                 7,   8,   9,   10,  11, 104, 105, 106, 107, 12, 13,
                                                 14,  15,  16,  17,  18, 19,  20,  21,  22,  23};
    EXPECT_EQ(expected, data);
    EXPECT_EQ(nullptr, buffer->findAttrib("a_posi"));
}

// Fault caught: arrays in memory drawn as offsets, or dropped by a commit that leaves them where they are.
TEST_F(VertexBufferTest, clientMemoryIsDrawnByPointer)
{
    const VertexArray::Ptr array = makeFloats(2, {1, 2, 3, 4});
    buffer->addAttrib(array, "a_uv0", Format::FLOAT, Usage::CLIENT_MEMORY, false);
    EXPECT_EQ(Calls{}, callsOf([&] { buffer->commit(); }));
    const uint64_t epoch = detail::g_bindingEpoch;
    EXPECT_EQ((Calls{"glBindBuffer(0x8892, 0)", "glEnableVertexAttribArray(0)",
                     pointerCall(0, 2, "0x1406", 0, 0, reinterpret_cast<uintptr_t>(array->getBytes()))}),
              callsOf([&] { EXPECT_TRUE(buffer->enableAttrib(0, "a_uv0")); }));
    EXPECT_NE(epoch, detail::g_bindingEpoch);
    EXPECT_FALSE(buffer->isLost());
}

// Fault caught: byte offsets read as addresses once the buffer is gone, which crashes.
TEST_F(VertexBufferTest, lostBufferHasNoAttributes)
{
    const VertexBuffer::Ptr interleaved = cache->create(nullptr);
    const VertexBuffer::AttribDescription description = {"a_position", Format::FLOAT, false, 0, 3, 12};
    const float triangle[9] = {};
    EXPECT_TRUE(
        interleaved->setAllAttributes(&description, 1, reinterpret_cast<const unsigned char*>(triangle), 36));
    addTwoAttribs();
    buffer->addAttrib(makeFloats(2, {1, 2, 3, 4}), "a_uv0", Format::FLOAT, Usage::CLIENT_MEMORY, false);
    buffer->commit();
    const auto context = makeShared<RenderContext>();
    const detail::ProgramAttrib attribs[] = {{"a_position", 0}, {"a_uv0", 1}};
    buffer->bindAttribs(*context, 77, attribs, 2);

    const GLuint names[] = {buffer->getId(), interleaved->getId()};
    cache->getResourceCache()->release();
    EXPECT_TRUE(buffer->isLost() && interleaved->isLost());
    EXPECT_FALSE(buffer->enableAttrib(0, "a_position"));
    EXPECT_FALSE(interleaved->enableAttrib(0, "a_position"));
    EXPECT_TRUE(buffer->enableAttrib(1, "a_uv0")) << "what is in memory is still there";

    callsOf([&] { buffer->bindAttribs(*context, 77, attribs, 2); });
    EXPECT_EQ(1u, glcalls::recorded("glVertexAttribPointer").size());
    EXPECT_EQ("glVertexAttrib4fv(0, {1, 1, 1, 1})", glcalls::recorded("glVertexAttrib4fv").at(0));
    glDeleteBuffers(2, names);
}

// Fault caught: redundant calls for each draw, and a set-up kept although something changed it.
TEST_F(VertexBufferTest, drawPathSetsUpOnlyWhatChanged)
{
    addTwoAttribs();
    buffer->commit();
    const VertexBuffer::Ptr other = cache->create(nullptr);
    other->addAttrib(makeFloats(3, {0, 0, 0}), "a_position", Format::FLOAT, Usage::GL_BUFFER, false);
    other->commit();
    const auto context = makeShared<RenderContext>();
    const RenderContext::DrawScope scope(*context);
    const detail::ProgramAttrib attribs[] = {{"a_position", 0}, {"a_uv0", 1}, {"a_colour", 2}};
    const auto callsOfBind = [&](VertexBuffer& bound, uint64_t program)
    { return callsOf([&] { bound.bindAttribs(*context, program, attribs, 3); }).size(); };
    const auto read = [](GLuint location, GLenum name)
    {
        GLint value = 0;
        glGetVertexAttribiv(location, name, &value);
        return value;
    };

    EXPECT_LT(0u, callsOfBind(*buffer, 1));
    EXPECT_EQ(0u, callsOfBind(*buffer, 1));
    EXPECT_EQ(2u, callsOfBind(*buffer, 2)) << "same buffer and arrays: two pointers";
    EXPECT_EQ(4u, callsOfBind(*other, 2)) << "bind, pointer, one array off, its constant";
    EXPECT_EQ(4u, callsOfBind(*buffer, 2)) << "bind, two pointers, one array on";
    glDisableVertexAttribArray(0);
    detail::bindingsChanged();
    EXPECT_LT(0u, callsOfBind(*buffer, 2));
    EXPECT_TRUE(read(0, GL_VERTEX_ATTRIB_ARRAY_ENABLED));

    // More programs than are remembered at once still get their own attributes.
    for (const uint64_t program : {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 1})
    {
        const detail::ProgramAttrib turned[] = {{"a_colour", 0}, {"a_position", 1}};
        buffer->bindAttribs(*context, 100 + program, program % 2 ? turned : attribs, 2);
        EXPECT_EQ(program % 2 ? 4 : 3, read(0, GL_VERTEX_ATTRIB_ARRAY_SIZE)) << program;
    }

    // An attribute added later is found although the program has used the buffer before.
    buffer->addAttrib(makeFloats(2, {1, 2, 3, 4}), "a_uv0", Format::FLOAT, Usage::CLIENT_MEMORY, false);
    EXPECT_LT(0u, callsOfBind(*buffer, 2));
    EXPECT_TRUE(read(1, GL_VERTEX_ATTRIB_ARRAY_ENABLED));
}

// Fault caught: descriptions that GL refuses, after which it reads through the pointer of an earlier draw.
TEST_F(VertexBufferTest, undrawableDescriptionsCountAsMissing)
{
    const unsigned char data[24] = {};
    const struct
    {
        VertexBuffer::AttribDescription description;
        bool isDrawn;
        int errors;
    } cases[] = {{{"a", Format::FLOAT, false, 12, 3, 24}, true, 0},
                 {{"a", Format::FLOAT, false, 16, 3, 24}, false, 1},
                 {{"a", Format::FLOAT, false, -4, 3, 24}, false, 1},
                 {{"a", Format::BYTE, true, 23, 1, 24}, true, 0},
                 {{"a", Format::FLOAT, false, 0, 5, 24}, false, 1},
                 {{"a", Format(6), false, 0, 3, 24}, false, 0},
                 {{"a", Format::FLOAT, false, 0, 0, 24}, false, 1},
                 {{"a", Format::SHORT, false, 0, INT32_MAX, 4}, false, 1}};
    for (const auto& test : cases)
    {
        LogCapture log;
        const VertexBuffer::Ptr filled = cache->create(nullptr);
        EXPECT_TRUE(filled->setAllAttributes(&test.description, 1, data, sizeof(data)));
        EXPECT_EQ(test.isDrawn, filled->enableAttrib(0, "a")) << &test - cases;
        EXPECT_EQ(test.errors, log.count('E')) << &test - cases;
        EXPECT_FALSE(filled->setAllAttributes(&test.description, 1, data, sizeof(data))) << "used before";
    }
}

TEST_F(VertexBufferTest, refusals)
{
    LogCapture log;
    EXPECT_FALSE(buffer->addAttrib(nullptr, "a", Format::FLOAT, Usage::GL_BUFFER, false));
    EXPECT_FALSE(buffer->addAttrib(makeBytes(1, 1, 4, 0), nullptr, Format::BYTE, Usage::GL_BUFFER, false));
    EXPECT_FALSE(buffer->addAttrib(makeBytes(1, 1, 4, 0), "a", Format::FLOAT, Usage::GL_BUFFER, false));
    EXPECT_FALSE(buffer->setAllAttributes(nullptr, 1, nullptr, 0));
    EXPECT_EQ(4, log.count('E'));
    EXPECT_EQ(0, makeShared<VertexArray>(0x10000000, 4, 4)->getVertexCount());
    EXPECT_EQ(nullptr, makeBytes(1, 2, 4, 0)->getData<float>());
    EXPECT_EQ(1, log.countMessage("ORV_ASSERT: sizeof( T ) == m_typeSize"));

    // Fault caught: interleaving arrays of different length writes beyond the block.
    buffer->addAttrib(makeBytes(10, 4, 3, 0), "a_position", Format::FLOAT, Usage::GL_BUFFER, false);
    buffer->addAttrib(makeBytes(2, 4, 1, 0), "a_weights", Format::FLOAT, Usage::GL_BUFFER, false);
    log.clear();
    buffer->commit();
    EXPECT_EQ(1, log.count('E'));
    EXPECT_EQ(0u, buffer->getId());
}

// Fault caught: a driver without buffers, which must still be able to draw.
TEST_F(VertexBufferTest, withoutAGlBufferTheArraysAreDrawn)
{
    LogCapture log;
    glcalls::refuseNames(glGenBuffers);
    addTwoAttribs();
    buffer->commit();
    EXPECT_TRUE(buffer->enableAttrib(0, "a_position"));
}

// Fault caught: a file laid out otherwise than documented.
TEST_F(VertexBufferTest, rawFormRoundTrip)
{
    LogCapture log;
    addTwoAttribs();
    buffer->addAttrib(makeFloats(2, {1, 2, 3, 4}), "a_client", Format::FLOAT, Usage::CLIENT_MEMORY, false);
    ASSERT_TRUE(buffer->save(openFile()));
    const Bytes bytes = support::readFile(directory.path("raw"));
    ASSERT_EQ(12u + 3 * 56 + 32, bytes.size());
    EXPECT_EQ((Bytes{32, 0, 0, 0, 16, 0, 0, 0, 3, 0, 0, 0}), Bytes(bytes.begin(), bytes.begin() + 12));
    Bytes colour(56); // the second record
    std::memcpy(colour.data(), "a_colour", 8);
    const std::pair<size_t, uint8_t> rest[] = {{16, 8}, {24, 0x01}, {25, 0x14}, {32, 1}, {40, 4}, {44, 16}};
    for (const auto& [offset, value] :
         rest) // end of the name, GL_UNSIGNED_BYTE, normalised, components, stride
        colour[offset] = value;
    EXPECT_EQ(colour, Bytes(bytes.begin() + 12 + 56, bytes.begin() + 12 + 112));
    EXPECT_EQ(100, bytes[12 + 3 * 56]);

    const VertexBuffer::Ptr loaded = cache->create(nullptr);
    ASSERT_TRUE(load(loaded, bytes));
    EXPECT_EQ("a_client", loaded->getAttribs().at(0).name);
    EXPECT_FALSE(loaded->enableAttrib(0, "a_client")) << "its values are in another process";
    callsOf([&] { EXPECT_TRUE(loaded->enableAttrib(1, "a_position")); });
    EXPECT_EQ(pointerCall(1, 3, "0x1406", 0, 16, 4), glcalls::recorded("glVertexAttribPointer").at(0));
    GLint size = 0;
    glGetBufferParameteriv(GL_ARRAY_BUFFER, GL_BUFFER_SIZE, &size);
    EXPECT_EQ(32, size);
    EXPECT_FALSE(load(loaded, bytes)) << "used before";
}

TEST_F(VertexBufferTest, saveRefuses)
{
    LogCapture log;
    const SharedPtr<Stream> stream = openFile();
    const VertexBuffer::Ptr longName = cache->create(nullptr);
    longName->addAttrib(makeBytes(1, 4, 1, 0), "sixteen_letters_", Format::FLOAT, Usage::GL_BUFFER, false);
    EXPECT_FALSE(longName->save(stream));
    EXPECT_EQ(0, stream->size());

    addTwoAttribs();
    EXPECT_FALSE(buffer->save(FileStreamSource("/no such directory").open("raw", true)));
    EXPECT_FALSE(buffer->save(stream)) << "the arrays are gone";
    EXPECT_EQ(3, log.count('E'));
}

// Fault caught: counts and sizes of a damaged file trusted; reads beyond a buffer, pointers from a file.
TEST_F(VertexBufferTest, loadRefusesDamage)
{
    addTwoAttribs();
    ASSERT_TRUE(buffer->save(openFile()));
    const Bytes good = support::readFile(directory.path("raw"));
    const size_t colour = 12;
    const struct
    {
        const char* what;
        size_t offset;
        uint32_t value;
    } cases[] = {{"data size", 0, 0xffffffff},
                 {"data size", 0, 33},
                 {"record count", 8, 3},
                 {"record count", 8, 0xffffffff},
                 {"type", colour + 24, 0x1400 + 99},
                 {"offset", colour + 36, 29},
                 {"offset", colour + 36, 0xfffffffc},
                 {"components", colour + 40, 0},
                 {"components", colour + 40, 5},
                 {"stride", colour + 44, 0x80000000}};
    for (const auto& test : cases)
    {
        LogCapture log;
        Bytes bad = good;
        for (unsigned int i = 0; i < 4; ++i)
            bad[test.offset + i] = uint8_t(test.value >> (8 * i));
        const VertexBuffer::Ptr target = cache->create(nullptr);
        EXPECT_FALSE(load(target, bad)) << test.what << " " << test.value;
        EXPECT_EQ(1, log.count('E')) << test.what << " " << test.value;
        EXPECT_TRUE(target->getAttribs().empty() && target->getId() == 0);
    }
    LogCapture log;
    Bytes unterminated = good;
    std::fill_n(unterminated.begin() + 12, 24, uint8_t('x'));
    EXPECT_FALSE(load(cache->create(nullptr), unterminated));
    EXPECT_FALSE(cache->create(nullptr)->load(nullptr));
}
