#include "orv/rendertarget.h"

#include "orv/texture2dcache.h"
#include "support/picture.h"
#include "texturefixture.h"

#include <GLES2/gl2ext.h>

using namespace orv;
using support::LogCapture;

namespace
{

class RenderTargetTest : public TextureFixture<Texture2DCache>
{
protected:
    SharedPtr<Texture2D> colour(unsigned width, unsigned height)
    {
        return cache->create(width, height, Texture::Format::RGBA, Texture::Type::UNSIGNED_BYTE, nullptr,
                             nullptr);
    }

    SharedPtr<Texture2D> depth(unsigned width, unsigned height)
    {
        return cache->create(width, height, Texture::Format::DEPTH, Texture::Type::UNSIGNED_SHORT, nullptr,
                             nullptr);
    }

    static GLint attachmentType(GLenum attachment)
    {
        GLint type = -1;
        glGetFramebufferAttachmentParameteriv(GL_FRAMEBUFFER, attachment,
                                              GL_FRAMEBUFFER_ATTACHMENT_OBJECT_TYPE, &type);
        return type;
    }
};

} // namespace

// Faults caught: a target made inside a pass that redirects its rest; buffers of another size than the texture.
TEST_F(RenderTargetTest, constructionGivesBackWhatWasBound)
{
    RenderTarget outer(colour(16, 16), nullptr, false, false);
    ASSERT_TRUE(outer.isComplete());
    GLuint renderbuffer = 0;
    glGenRenderbuffers(1, &renderbuffer);
    glBindRenderbuffer(GL_RENDERBUFFER, renderbuffer);
    EXPECT_EQ(0u, RenderTarget::getBoundFramebuffer());
    outer.enable();

    glcalls::startRecording();
    const RenderTarget inner(colour(256, 128), nullptr, true, false);
    EXPECT_TRUE(inner.isComplete());
    EXPECT_EQ(std::vector<std::string>{"glRenderbufferStorage(0x8d41, 0x81a5, 256, 128)"},
              glcalls::recorded("glRenderbufferStorage"));
    EXPECT_EQ(outer.getId(), RenderTarget::getBoundFramebuffer());
    GLint bound = 0;
    glGetIntegerv(GL_RENDERBUFFER_BINDING, &bound);
    EXPECT_EQ(renderbuffer, GLuint(bound));
    inner.disable();
    EXPECT_EQ(0u, RenderTarget::getBoundFramebuffer());
    glDeleteRenderbuffers(1, &renderbuffer);
}

// Fault caught: drivers that refuse separate depth and stencil buffers leave a target without either.
TEST_F(RenderTargetTest, depthAndStencilWorkTogether)
{
    glcalls::replace(glCheckFramebufferStatus,
                     [](GLenum target) -> GLenum
                     {
                         const bool separate = glcalls::count(glRenderbufferStorage) < 3;
                         return separate ? GL_FRAMEBUFFER_UNSUPPORTED
                                         : glcalls::real(glCheckFramebufferStatus)(target);
                     });
    LogCapture log;
    RenderTarget target(colour(16, 16), nullptr, true, true);
    ASSERT_TRUE(target.isComplete());
    EXPECT_EQ(0, log.count('E'));
    target.enable();
    target.setDepthTexture(nullptr);
    EXPECT_EQ(GL_RENDERBUFFER, attachmentType(GL_STENCIL_ATTACHMENT))
        << "the packed buffer went with the depth";
    target.disable();
}

// Faults caught: the wrong message for a status, a needless retry, names leaked by targets that failed.
TEST_F(RenderTargetTest, incompleteTargetsSayWhy)
{
    const struct
    {
        GLenum status;
        const char* extensions;
        uint64_t storages; ///< renderbuffers made: the retry makes a third
        const char* message;
    } cases[] = {
        {GL_FRAMEBUFFER_INCOMPLETE_ATTACHMENT, "GL_OES_packed_depth_stencil", 2,
         "Framebuffer attachment points not complete."},
        {GL_FRAMEBUFFER_INCOMPLETE_MISSING_ATTACHMENT, "", 2, "No valid attachments in framebuffer."},
        {GL_FRAMEBUFFER_UNSUPPORTED, "", 2,
         "Combination of internal formats used by framebuffer attachments is not renderable."},
        {GL_FRAMEBUFFER_UNSUPPORTED, "GL_OES_packed_depth_stencil", 3,
         "Combination of internal formats used by framebuffer attachments is not renderable."},
        {0x1234, "", 2, "Error: Unknown status code: 4660"},
    };
    const auto texture = colour(16, 16);
    for (const auto& test : cases)
    {
        glcalls::setFramebufferStatus(test.status);
        glcalls::setExtensions(test.extensions);
        glcalls::resetCounts();
        LogCapture log;
        const RenderTarget target(texture, nullptr, true, true);
        EXPECT_FALSE(target.isComplete());
        EXPECT_EQ(1, log.countMessage(test.message)) << test.message;
        EXPECT_EQ(1, log.count('E')) << test.message;
        EXPECT_EQ(test.storages, glcalls::count(glRenderbufferStorage)) << test.message;
    }

    LogCapture log;
    glcalls::restore(glCheckFramebufferStatus);
    glcalls::refuseNames(glGenRenderbuffers);
    makeShared<RenderTarget>(texture, nullptr, true, true);
    glcalls::refuseNames(glGenFramebuffers);
    makeShared<RenderTarget>(texture, nullptr, true, true);
    for (const char* object : {"depth renderbuffer", "stencil renderbuffer", "framebuffer"})
        EXPECT_EQ(1, log.countMessage(std::string("Failed to create ") + object));
}

// Faults caught: a depth buffer made beside a depth texture, or kept when a depth texture takes its place.
TEST_F(RenderTargetTest, depthTexturesReplaceTheBuffer)
{
    {
        LogCapture log;
        const RenderTarget target(colour(256, 256), depth(128, 128), true, false);
        EXPECT_EQ(1, log.countMessage("Colour and depth textures different sizes"));
        EXPECT_EQ(1, log.countMessage("Framebuffer attachments do not have same width and height."));
        EXPECT_FALSE(target.isComplete());
        EXPECT_EQ(0u, glcalls::count(glGenRenderbuffers));
    }

    RenderTarget target(colour(32, 32), nullptr, true, false);
    const auto texture = depth(32, 32);
    target.setDepthTexture(texture);
    EXPECT_EQ(target.getId(), RenderTarget::getBoundFramebuffer());
    EXPECT_EQ(GL_TEXTURE, attachmentType(GL_DEPTH_ATTACHMENT));
    EXPECT_TRUE(glcalls::liveNames(glcalls::Kind::RENDERBUFFER).empty());
    EXPECT_EQ(GLenum(GL_FRAMEBUFFER_COMPLETE), glCheckFramebufferStatus(GL_FRAMEBUFFER));

    target.setColourTexture(nullptr);
    EXPECT_EQ(GL_TEXTURE, attachmentType(GL_COLOR_ATTACHMENT0)) << "an empty pointer detaches nothing";
    const auto other = colour(32, 32);
    target.setColourTexture(other);
    glClearColor(0.0f, 1.0f, 0.0f, 1.0f);
    glClear(GL_COLOR_BUFFER_BIT);
    const RenderTarget check(other, nullptr, false, false);
    RenderTarget::bindFramebuffer(check.getId());
    EXPECT_EQ((support::Rgba{0, 255, 0, 255}), support::readFramebuffer(0, 0, 32, 32).average());
    check.disable();
}

// Fault caught: after a lost context, names deleted that belong to something else in the new one.
TEST_F(RenderTargetTest, deletesNothingAfterItsContextWasLost)
{
    auto target = makeShared<RenderTarget>(colour(16, 16), nullptr, true, false);
    cache->getResourceCache()->release();
    replaceContext();
    glcalls::reset();
    target.reset();
    EXPECT_EQ(0u, glcalls::total());
}
