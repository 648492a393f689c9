#include "support/gltest.h"

namespace support
{

void GlTest::SetUp()
{
    std::string error;
    m_context = headless::Context::create(m_options, error);
    ASSERT_TRUE(m_context) << error;
    glcalls::reset();
}

void GlTest::TearDown()
{
    if (m_context && m_context->isCurrent())
    {
        EXPECT_EQ(GLenum(GL_NO_ERROR), glcalls::real(glGetError)()) << "the test left a GL error behind";
    }
    glcalls::reset();
    m_context.reset();
}

std::unique_ptr<headless::Context> GlTest::makeContext(int width, int height)
{
    headless::Options options = m_options;
    options.width = width;
    options.height = height;
    std::string error;
    std::unique_ptr<headless::Context> made = headless::Context::create(options, error);
    EXPECT_TRUE(made) << error;
    return made;
}

void GlTest::replaceContext()
{
    m_context.reset();
    m_context = makeContext(m_options.width, m_options.height);
}

} // namespace support
