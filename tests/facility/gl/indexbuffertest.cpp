#include "orv/indexbuffercache.h"

#include "orv/rendercontext.h"

#include "facilitytest.h"

using namespace orv;
using Primitive = IndexBuffer::Primitive;
using support::LogCapture;

namespace
{

const unsigned short INDICES[] = {0, 1, 2, 2, 1, 3};

class IndexBufferTest : public FacilityTest
{
protected:
    /// The calls of a draw that a released context would crash on are only recorded.
    void SetUp() override
    {
        GlTest::SetUp();
        glcalls::setDropped(glDrawElements);
        glcalls::setDropped(glDrawArrays);
    }

    void flush() override { cache->flush(); }

    static Calls callsOfDraw(IndexBuffer& buffer, RenderContext* context = nullptr)
    {
        return callsOf([&] { context ? buffer.draw(*context) : buffer.draw(); });
    }

    SharedPtr<IndexBufferCache> cache = makeShared<IndexBufferCache>();
};

} // namespace

// Fault caught: the engine's primitive numbers sent to GL.
TEST_F(IndexBufferTest, primitives)
{
    const struct
    {
        int primitive;
        const char* glMode;
        int count;
        int triangles;
    } cases[] = {{0, "0x0000", 4, 0}, {1, "0x0003", 4, 0},  {2, "0x0002", 4, 0}, {3, "0x0001", 4, 0},
                 {4, "0x0005", 5, 3}, {4, "0x0005", 1, -1}, {5, "0x0006", 5, 3}, {6, "0x0004", 11, 3},
                 {7, "0x0000", 9, 0}, {-1, "0x0000", 9, 0}};
    for (const auto& test : cases)
    {
        LogCapture log;
        const IndexBuffer::Ptr buffer =
            create(*cache, Primitive(test.primitive), unsigned(test.count), nullptr);
        const Calls expected = {std::string("glDrawArrays(") + test.glMode + ", 0, " +
                                std::to_string(test.count) + ")"};
        EXPECT_EQ(expected, callsOfDraw(*buffer));
        EXPECT_EQ(test.triangles, getTriangleCount(*buffer));
        const bool isUnknown = test.primitive < 0 || test.primitive > 6;
        EXPECT_EQ(isUnknown ? 1 : 0, log.countMessage("ORV_ASSERT: ORV_FALSE"));
    }
}

TEST_F(IndexBufferTest, drawsFromMemoryThenFromGl)
{
    const IndexBuffer::Ptr buffer = cache->create(Primitive::TRIANGLES, 6, INDICES, "quad");
    const std::string address = std::to_string(reinterpret_cast<uintptr_t>(buffer->getIndices()));
    EXPECT_EQ((Calls{"glBindBuffer(0x8893, 0)", "glDrawElements(0x0004, 6, 0x1403, " + address + ")"}),
              callsOfDraw(*buffer));

    buffer->commit();
    EXPECT_EQ(nullptr, buffer->getIndices());
    const std::string id = std::to_string(buffer->getId());
    EXPECT_EQ((Calls{"glBindBuffer(0x8893, " + id + ")", "glDrawElements(0x0004, 6, 0x1403, 0)",
                     "glBindBuffer(0x8893, 0)"}),
              callsOfDraw(*buffer));
    EXPECT_EQ(Calls{}, callsOf([&] { buffer->commit(); }));
    GLint size = 0;
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, buffer->getId());
    glGetBufferParameteriv(GL_ELEMENT_ARRAY_BUFFER, GL_BUFFER_SIZE, &size);
    EXPECT_EQ(12, size);
    buffer->setEnabled(false);
    EXPECT_EQ(Calls{}, callsOfDraw(*buffer));
}

// Fault caught: an element buffer bound again for every draw, or left bound under indices in memory.
TEST_F(IndexBufferTest, drawPathBindsOnChangeOnly)
{
    const auto context = makeShared<RenderContext>();
    const RenderContext::DrawScope scope(*context);
    const IndexBuffer::Ptr committed = cache->create(Primitive::TRIANGLES, 6, INDICES, nullptr);
    committed->commit();
    const IndexBuffer::Ptr inMemory = cache->create(Primitive::LINES, 6, INDICES, nullptr);
    const IndexBuffer::Ptr plain = create(*cache, Primitive::POINTS, 3, nullptr);
    const std::string bind = "glBindBuffer(0x8893, " + std::to_string(committed->getId()) + ")";
    const std::string address = std::to_string(reinterpret_cast<uintptr_t>(inMemory->getIndices()));
    const std::string drawCommitted = "glDrawElements(0x0004, 6, 0x1403, 0)";

    EXPECT_EQ((Calls{bind, drawCommitted}), callsOfDraw(*committed, context.get()));
    EXPECT_EQ(Calls{drawCommitted}, callsOfDraw(*committed, context.get()));
    EXPECT_EQ(Calls{"glDrawArrays(0x0000, 0, 3)"}, callsOfDraw(*plain, context.get()));
    EXPECT_EQ((Calls{"glBindBuffer(0x8893, 0)", "glDrawElements(0x0001, 6, 0x1403, " + address + ")"}),
              callsOfDraw(*inMemory, context.get()));
    EXPECT_EQ((Calls{bind, drawCommitted}), callsOfDraw(*committed, context.get()));
    committed->draw(); // unbinds without the context
    EXPECT_EQ((Calls{bind, drawCommitted}), callsOfDraw(*committed, context.get()));
    committed->setEnabled(false);
    EXPECT_EQ(Calls{}, callsOfDraw(*committed, context.get()));
}

// Fault caught: lost indices drawn as vertices in order, which reads beyond the vertex buffer.
TEST_F(IndexBufferTest, lostBufferDrawsNothing)
{
    const auto context = makeShared<RenderContext>();
    const IndexBuffer::Ptr buffer = cache->create(Primitive::TRIANGLES, 6, INDICES, nullptr);
    buffer->commit();
    const GLuint name = buffer->getId();
    callsOfDraw(*buffer, context.get());
    cache->getResourceCache()->release();
    EXPECT_EQ(Calls{}, callsOfDraw(*buffer));
    EXPECT_EQ(Calls{}, callsOfDraw(*buffer, context.get()));
    glDeleteBuffers(1, &name);
}

TEST_F(IndexBufferTest, creationFailures)
{
    LogCapture log;
    EXPECT_FALSE(cache->create(Primitive::TRIANGLES, 0x80000000u, nullptr, "huge"));
    EXPECT_EQ(1, log.countMessage("Failed to allocate index buffer array"));
    EXPECT_FALSE(cache->exists("huge"));

    glcalls::refuseNames(glGenBuffers);
    const IndexBuffer::Ptr buffer = cache->create(Primitive::TRIANGLES, 6, INDICES, nullptr);
    buffer->commit();
    EXPECT_EQ(2u, callsOfDraw(*buffer).size()) << "still drawn from memory";
}
