#include "orv/renderdevice.h"

#include "facilitytest.h"

using namespace orv;
using support::LogCapture;

namespace
{

using ErrorCode = RenderDevice::ErrorCode;

using RenderDeviceTest = support::GlTest;

} // namespace

// Fault caught: a longer extension's name taken for the one asked for.
TEST_F(RenderDeviceTest, extensionsAreWholeWords)
{
    const struct
    {
        const char* extensions;
        const char* name;
        bool isSupported;
    } cases[] = {
        {"GL_OES_texture_float", "GL_OES_texture", false},
        {"GL_OES_texture_float GL_OES_texture", "GL_OES_texture", true},
        {"XGL_OES_texture GL_OES_texture ", "GL_OES_texture", true},
        {"aaaa aaa", "aaa", true},
        {"", "GL_OES_texture", false},
        {"GL_a  GL_b", "", false},
        {"GL_a", nullptr, false},
    };
    for (const auto& test : cases)
    {
        glcalls::setExtensions(test.extensions);
        EXPECT_EQ(test.isSupported, RenderDevice::isExtensionSupported(test.name)) << test.extensions;
    }
}

// Fault caught: a crash in a program that asks before it has a context.
TEST_F(RenderDeviceTest, textsAreEmptyWhereGlHasNone)
{
    glcalls::replace(glGetString, [](GLenum) -> const GLubyte* { return nullptr; });
    EXPECT_STREQ("", RenderDevice::getVendor());
    EXPECT_STREQ("", RenderDevice::getShaderVersion());
    EXPECT_FALSE(RenderDevice::isExtensionSupported("GL_OES_texture"));
}

// Faults caught: codes in GL's order instead of the engine's, and a remembered error lost or given out twice.
TEST_F(RenderDeviceTest, errorsAreRememberedUntilCleared)
{
    RenderDevice::getError(true);
    const struct
    {
        GLenum glError; ///< what GL reports next
        bool clear;
        ErrorCode expected;
    } steps[] = {
        {GL_OUT_OF_MEMORY, false, ErrorCode::OUT_OF_MEMORY},
        {GL_NO_ERROR, false, ErrorCode::NO_ERROR},
        {GL_NO_ERROR, true, ErrorCode::OUT_OF_MEMORY},
        {GL_NO_ERROR, true, ErrorCode::NO_ERROR},
        {GL_INVALID_ENUM, false, ErrorCode::INVALID_ENUM},
        {GL_INVALID_VALUE, true, ErrorCode::INVALID_VALUE},
        {GL_NO_ERROR, true, ErrorCode::NO_ERROR},
        {GL_INVALID_OPERATION, true, ErrorCode::INVALID_OPERATION},
        {GL_INVALID_FRAMEBUFFER_OPERATION, true, ErrorCode::INVALID_FRAMEBUFFER_OPERATION},
        {0x0507, true, ErrorCode::UNDEFINED},
    };
    for (size_t i = 0; i < std::size(steps); ++i)
    {
        if (steps[i].glError != GL_NO_ERROR)
            glcalls::queueError(steps[i].glError);
        EXPECT_EQ(steps[i].expected, RenderDevice::getError(steps[i].clear)) << "step " << i;
    }

    LogCapture log;
    checkGLError("folder/file.cpp", "draw", 7);
    glcalls::queueError(GL_INVALID_FRAMEBUFFER_OPERATION);
    checkGLError("folder/file.cpp", "draw", 7);
    EXPECT_EQ(1, log.countMessage("OpenGL error 4: Invalid framebuffer operation"));
    RenderDevice::getError(true);
}
