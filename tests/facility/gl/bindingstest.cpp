#include "orv/detail/bindings.h"

#include "facilitytest.h"

#include "orv/rendercontext.h"

using namespace orv;

namespace
{

class BindingsTest : public support::GlTest
{
protected:
    BindingsTest()
    {
        glGenTextures(1, &m_texture);
        glGenBuffers(1, &m_buffer);
    }

    ~BindingsTest() override
    {
        glDeleteTextures(1, &m_texture);
        glDeleteBuffers(1, &m_buffer);
    }

    Calls useNoProgram()
    {
        return callsOf([this] { m_bindings.useProgram(0); });
    }

    Calls bindTexture(int unit, unsigned target, unsigned name)
    {
        return callsOf([=, this] { m_bindings.bindTexture(unit, target, name); });
    }

    std::string bindingTexture() const { return "glBindTexture(0x0de1, " + std::to_string(m_texture) + ")"; }

    RenderContext m_context;
    detail::Bindings& m_bindings = m_context.getBindings();
    GLuint m_texture = 0;
    GLuint m_buffer = 0;
};

} // namespace

// Fault caught: units or targets mixed up.
TEST_F(BindingsTest, texturesAreBoundOncePerUnitAndTarget)
{
    const RenderContext::DrawScope scope(m_context);
    EXPECT_EQ((Calls{"glActiveTexture(0x84c1)", bindingTexture()}), bindTexture(1, GL_TEXTURE_2D, m_texture));
    EXPECT_EQ(Calls{"glBindTexture(0x8513, 0)"}, bindTexture(1, GL_TEXTURE_CUBE_MAP, 0));
    EXPECT_EQ(Calls{}, bindTexture(1, GL_TEXTURE_2D, m_texture));
    EXPECT_EQ((Calls{"glActiveTexture(0x84c0)", bindingTexture()}), bindTexture(0, GL_TEXTURE_2D, m_texture));
}

// Fault caught: the two buffer bindings exchanged.
TEST_F(BindingsTest, buffersAndProgramsAreBoundOnce)
{
    const RenderContext::DrawScope scope(m_context);
    const auto bindArray = [this] { m_bindings.bindArrayBuffer(m_buffer); };
    const auto bindElements = [this] { m_bindings.bindElementBuffer(m_buffer); };
    EXPECT_EQ(Calls{"glBindBuffer(0x8892, " + std::to_string(m_buffer) + ")"}, callsOf(bindArray));
    EXPECT_EQ(Calls{"glBindBuffer(0x8893, " + std::to_string(m_buffer) + ")"}, callsOf(bindElements));
    EXPECT_EQ(Calls{}, callsOf(bindArray));
    EXPECT_EQ(Calls{}, callsOf(bindElements));
    EXPECT_EQ(Calls{"glUseProgram(0)"}, useNoProgram());
    EXPECT_EQ(Calls{}, useNoProgram());
}

// Fault caught: a binding trusted although something else changed it, or where no scope is open.
TEST_F(BindingsTest, whatMayHaveChangedIsForgotten)
{
    {
        const RenderContext::DrawScope scope(m_context);
        m_bindings.setVertexInputBound(5, 6);
        EXPECT_TRUE(m_bindings.isVertexInputBound(5, 6));
        EXPECT_FALSE(m_bindings.isVertexInputBound(5, 7));
        bindTexture(1, GL_TEXTURE_2D, m_texture);
        useNoProgram();

        detail::bindingsChanged();
        EXPECT_FALSE(m_bindings.isVertexInputBound(5, 6));
        EXPECT_EQ((Calls{"glActiveTexture(0x84c1)", bindingTexture()}),
                  bindTexture(1, GL_TEXTURE_2D, m_texture));
        EXPECT_EQ(Calls{"glUseProgram(0)"}, useNoProgram());

        m_context.forgetBindings();
        EXPECT_EQ(Calls{"glUseProgram(0)"}, useNoProgram());
    }
    EXPECT_EQ(Calls{"glUseProgram(0)"}, useNoProgram());
    EXPECT_EQ(Calls{"glUseProgram(0)"}, useNoProgram());
    m_bindings.setVertexInputBound(5, 6);
    EXPECT_FALSE(m_bindings.isVertexInputBound(5, 6));
}

// Faults caught: an array of an earlier program left on; a constant trusted after an array was in its place.
TEST_F(BindingsTest, attributeArraysAreSwitchedByDifference)
{
    const RenderContext::DrawScope scope(m_context);
    glEnableVertexAttribArray(7);
    m_bindings.setAttribArrays(0b0111u);
    for (GLuint i = 0; i < 8; ++i)
    {
        GLint enabled = -1;
        glGetVertexAttribiv(i, GL_VERTEX_ATTRIB_ARRAY_ENABLED, &enabled);
        EXPECT_EQ(i < 3 ? 1 : 0, enabled) << i;
    }
    const auto switchArrays = [this] { m_bindings.setAttribArrays(0b1011u); };
    EXPECT_EQ((Calls{"glDisableVertexAttribArray(2)", "glEnableVertexAttribArray(3)"}),
              callsOf(switchArrays));
    EXPECT_EQ(Calls{}, callsOf(switchArrays));

    const auto setOnes = [this] { m_bindings.setAttribOnes(2); };
    EXPECT_EQ(Calls{"glVertexAttrib4fv(2, {1, 1, 1, 1})"}, callsOf(setOnes));
    EXPECT_EQ(Calls{}, callsOf(setOnes));
    m_bindings.setAttribArrays(0b0100u);
    m_bindings.setAttribArrays(0);
    EXPECT_EQ(1u, callsOf(setOnes).size());
}
