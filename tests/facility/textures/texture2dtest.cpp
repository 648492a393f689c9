#include "orv/texture2d.h"

#include "orv/extensions.h"
#include "orv/rendercontext.h"
#include "orv/rendertarget.h"
#include "orv/texture2dcache.h"
#include "orv/texture2dloader.h"
#include "support/picture.h"
#include "texturefixture.h"

using namespace orv;
using imagefiles::Bytes;
using support::LogCapture;

namespace
{

using Format = Texture::Format;
using Type = Texture::Type;
using Filter = TextureParameters::FilterMode;
using Wrap = TextureParameters::WrapMode;

class Texture2DTest : public TextureFixture<Texture2DCache>
{
protected:
    SharedPtr<Texture2D> create(unsigned width, unsigned height, Format format = Format::RGBA,
                                Type type = Type::UNSIGNED_BYTE)
    {
        return cache->create(width, height, format, type, nullptr, nullptr);
    }
};

} // namespace

// Faults caught: a texture that GL takes for incomplete and shows black, and sizes miscounted.
TEST_F(Texture2DTest, createChoosesWhatTheSizeAndFormatAllow)
{
    const struct
    {
        unsigned width, height;
        Format format;
        Type type;
        bool isFull; ///< mipmaps and repeat
        unsigned bytes;
    } cases[] = {
        {64, 64, Format::RGB, Type::UNSIGNED_BYTE, true, 12288},
        {100, 60, Format::RGB, Type::UNSIGNED_BYTE, false, 18000},
        {64, 60, Format::LUMINANCE_ALPHA, Type::UNSIGNED_BYTE, false, 7680},
        {8, 8, Format::RGB, Type::UNSIGNED_SHORT_5_6_5, true, 128},
        {8, 8, Format::RGBA, Type::UNSIGNED_SHORT_4_4_4_4, true, 128},
        {16, 16, Format::DEPTH, Type::UNSIGNED_SHORT, false, 512},
    };
    for (const auto& test : cases)
    {
        const auto texture = create(test.width, test.height, test.format, test.type);
        ASSERT_TRUE(texture);
        const Wrap wrap = test.isFull ? Wrap::REPEAT : Wrap::CLAMP;
        EXPECT_EQ(test.isFull, texture->hasMipmaps()) << test.width << " x " << test.height;
        EXPECT_EQ(test.isFull ? Filter::LINEAR_MIPMAP_NEAREST : Filter::LINEAR, texture->getMinFilter());
        EXPECT_EQ(wrap, texture->getHorizontalWrap());
        EXPECT_EQ(wrap, texture->getVerticalWrap());
        EXPECT_EQ(test.bytes, texture->getSizeInBytes());
    }
    EXPECT_EQ(6u, Texture::getBytesPerPixel(Format::RGB, Type::UNSIGNED_SHORT));

    EXPECT_FALSE(create(0, 8) || create(8, 0) || create(8, 8, Format(6)) ||
                 create(8, 8, Format::RGB, Type(-1)));
    EXPECT_EQ(std::size(cases), glcalls::count(glTexImage2D));

    LogCapture log;
    glcalls::refuseNames(glGenTextures);
    EXPECT_FALSE(create(8, 8));
    EXPECT_EQ(1, log.countMessage("Failed to create OpenGL texture"));
}

// Fault caught: rows of three bytes per pixel skewed by GL's default row alignment, or turned upside down.
TEST_F(Texture2DTest, rowsArriveAsGiven)
{
    Bytes pixels(5 * 3 * 3, 0);
    for (int y = 0; y < 3; ++y)
        pixels[size_t((y * 5 + 1 + y) * 3)] = 255; // a red diagonal from (1, 0)
    const auto texture = cache->create(5, 3, Format::RGB, Type::UNSIGNED_BYTE, pixels.data(), nullptr);
    RenderTarget target(texture, nullptr, false, false);
    target.enable();
    auto expected = support::Picture::filled(5, 3, {0, 0, 0, 255});
    for (int y = 0; y < 3; ++y)
        expected.setPixel(1 + y, 2 - y, {255, 0, 0, 255}); // GL's first row is the picture's last
    EXPECT_TRUE(comparePictures("textureRows", expected, support::readFramebuffer(0, 0, 5, 3)));
    target.disable();
}

// Faults caught: settings under which GL shows the texture black, and mipmaps asked for but never made.
TEST_F(Texture2DTest, settingsThatWouldTurnATextureBlackAreRefused)
{
    GLuint names[2] = {};
    glGenTextures(2, names);
    const struct
    {
        const char* name;
        SharedPtr<Texture2D> texture;
        bool canMipmap;
        bool canRepeat;
    } cases[] = {
        {"power of two", create(8, 8), true, true},
        {"other size", create(6, 8), false, false},
        {"depth", create(8, 8, Format::DEPTH, Type::UNSIGNED_SHORT), false, true},
        {"compressed", cache->create(8, 8, 0.5f, false, names[0], nullptr), false, true},
        {"compressed with mipmaps", cache->create(8, 8, 0.5f, true, names[1], nullptr), true, true},
    };
    for (const auto& test : cases)
    {
        SCOPED_TRACE(test.name);
        LogCapture log;
        Texture2D& texture = *test.texture;
        texture.setParameters(TextureParameters(Filter::NEAREST, Filter::LINEAR, Wrap::CLAMP, Wrap::CLAMP));
        EXPECT_EQ(0, log.count('E'));
        texture.setMinFilter(Filter::LINEAR_MIPMAP_LINEAR);
        EXPECT_EQ(test.canMipmap ? Filter::LINEAR_MIPMAP_LINEAR : Filter::NEAREST, texture.getMinFilter());
        EXPECT_EQ(test.canMipmap, texture.hasMipmaps());
        EXPECT_EQ(test.canMipmap ? 0 : 1, log.count('E'));

        log.clear();
        texture.setHorizontalWrap(Wrap::REPEAT);
        texture.setVerticalWrap(Wrap::MIRRORED_REPEAT);
        EXPECT_EQ(test.canRepeat ? Wrap::REPEAT : Wrap::CLAMP, texture.getHorizontalWrap());
        EXPECT_EQ(test.canRepeat ? Wrap::MIRRORED_REPEAT : Wrap::CLAMP, texture.getVerticalWrap());
        EXPECT_EQ(test.canRepeat ? 0 : 2, log.count('E'));

        texture.setMagFilter(Filter::LINEAR_MIPMAP_LINEAR);
        EXPECT_EQ(1, log.countMessage("Only LINEAR and NEAREST supported for Mag Filter."));
        EXPECT_EQ(Filter::LINEAR, texture.getMagFilter());
    }
    EXPECT_EQ(1u, glcalls::count(glGenerateMipmap)) << "made once, when the texture was created";

    cases[0].texture->setMinFilter(Filter(6));
    EXPECT_EQ(GLenum(GL_INVALID_ENUM), glGetError());
    cases[0].texture->setHorizontalWrap(Wrap(3));
    EXPECT_EQ(GLenum(GL_INVALID_ENUM), glGetError());
}

// Faults caught: mipmaps that a wrapped texture lacks are never made, or taken for made when there was no memory; setters
// that reach name 0.
TEST_F(Texture2DTest, mipmapsOnDemandAndNothingAfterRelease)
{
    GLuint name = 0;
    glGenTextures(1, &name);
    glBindTexture(GL_TEXTURE_2D, name);
    glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA, 4, 4, 0, GL_RGBA, GL_UNSIGNED_BYTE, nullptr);
    const auto texture = cache->create(4, 4, 4.0f, false, name, "wrapped");
    LogCapture log;
    glcalls::refuseCall(2); // behind the binding
    texture->setMinFilter(Filter::LINEAR_MIPMAP_NEAREST);
    EXPECT_EQ(1, log.countMessage("OpenGL error 5: Out of memory")) << log.text();
    texture->setMinFilter(Filter::LINEAR_MIPMAP_NEAREST);
    texture->setMinFilter(Filter::NEAREST_MIPMAP_NEAREST);
    EXPECT_EQ(2u, glcalls::count(glGenerateMipmap)) << "the refused one is made up for";
    EXPECT_EQ(Filter::NEAREST_MIPMAP_NEAREST, texture->getMinFilter());
    EXPECT_EQ(64u, getTotalAssetSizeInBytes(*cache));

    cache->getResourceCache()->release();
    const TextureParameters nearest(Filter::NEAREST, Filter::NEAREST, Wrap::CLAMP, Wrap::CLAMP);
    EXPECT_EQ(Calls{}, callsOf([&] { texture->setParameters(nearest), texture->getMinFilter(); }));
    EXPECT_EQ(Calls{"glBindTexture(0x0de1, 0)"}, callsOf([&] { texture->enable(); }));
    glDeleteTextures(1, &name);
}

// Fault caught: a render context that draws with what it bound before, although the unit was taken.
TEST_F(Texture2DTest, everyBindOutsideDrawingMovesTheEpoch)
{
    const auto texture = create(8, 8);
    RenderContext render;
    const std::function<void()> operations[] = {
        [&] { texture->enable(); },
        [&] { texture->setMinFilter(Filter::LINEAR); },
        [&] { texture->setMagFilter(Filter::NEAREST); },
        [&] { texture->setVerticalWrap(Wrap::CLAMP); },
        [&] { texture->getHorizontalWrap(); },
        [&] { create(4, 4); },
        [&] { cache->createFromBackbuffer(render, Format::RGB, nullptr); },
        [&] { cache->flush(); },
    };
    for (size_t i = 0; i < std::size(operations); ++i)
    {
        const uint64_t epoch = detail::g_bindingEpoch;
        operations[i]();
        EXPECT_NE(epoch, detail::g_bindingEpoch) << "operation " << i;
    }
}

// Faults caught: rows missing, RGB refused for a surface with alpha, wrong sampling, names leaked by failed copies.
TEST_F(Texture2DTest, backbufferCopies)
{
    RenderContext render;
    render.setViewport(0, 0, 20, 10);
    render.setClearColour(Colour4f(1.0f, 0.0f, 0.0f, 0.5f));
    render.clear();
    for (const Format format : {Format::RGB, Format::RGBA})
    {
        glcalls::queueError(GL_INVALID_ENUM); // an older one, which is not the copy's
        const auto texture = cache->createFromBackbuffer(render, format, "mirror");
        ASSERT_TRUE(texture);
        EXPECT_TRUE(cache->get("mirror") == texture) << "a held name is replaced";
        EXPECT_EQ(format == Format::RGB ? 600u : 800u, texture->getSizeInBytes());
        EXPECT_EQ(Filter::NEAREST, texture->getMinFilter());
        EXPECT_EQ(Wrap::CLAMP, texture->getHorizontalWrap());
        RenderTarget target(texture, nullptr, false, false);
        target.enable();
        const uint8_t alpha = format == Format::RGB ? 255 : 128;
        EXPECT_TRUE(isNear({255, 0, 0, alpha}, support::readFramebuffer(0, 0, 20, 10).average(), 1));
        target.disable();
    }

    LogCapture log;
    EXPECT_FALSE(cache->createFromBackbuffer(render, Format::DEPTH, "depth"));
    EXPECT_EQ(1, log.countMessage("Creating depth texture from backbuffer is not permitted."));
    const size_t before = glcalls::liveNames(glcalls::Kind::TEXTURE).size();
    glcalls::replace(glCopyTexImage2D, [](GLenum, GLint, GLenum, GLint, GLint, GLsizei, GLsizei, GLint)
                     { glcalls::queueError(GL_INVALID_OPERATION); });
    EXPECT_FALSE(cache->createFromBackbuffer(render, Format::RGBA, "refused"));
    EXPECT_TRUE(log.contains("OpenGL error 3: Invalid operation"));
    EXPECT_EQ(before, glcalls::liveNames(glcalls::Kind::TEXTURE).size());
    render.setViewport(0, 0, 0, 10);
    EXPECT_FALSE(cache->createFromBackbuffer(render, Format::RGB, "empty"));
    EXPECT_FALSE(cache->exists("empty"));
    EXPECT_EQ(3, log.count('E'));
}

TEST_F(Texture2DTest, externalTexturesNeedTheirExtension)
{
    LogCapture log;
    const auto texture = cache->createForExternalSource();
    if (!GL_OES_EGL_image_external_supported())
    {
        EXPECT_FALSE(texture);
        EXPECT_EQ(1, log.countMessage("Extension \"GL_OES_EGL_image_external\" not supported."));
        return;
    }
    ASSERT_TRUE(texture);
    EXPECT_EQ(0u, texture->getSizeInBytes());
    texture->setMinFilter(Filter::LINEAR_MIPMAP_LINEAR);
    texture->setVerticalWrap(Wrap::REPEAT);
    EXPECT_EQ(2, log.count('E'));
    EXPECT_EQ(Wrap::CLAMP, texture->getVerticalWrap());
}

// Faults caught: a channel count uploaded as another format, files that no loader claims.
TEST_F(Texture2DTest, loaderReadsImagesByName)
{
    const struct
    {
        const char* name;
        Bytes file;
        const char* format;  ///< for GL; null for no texture
        const char* message; ///< null for none
    } cases[] = {
        {"grey.png", imagefiles::encodeFlat("png", 4, 2, 1), "0x1906", nullptr},
        {"greyalpha.TGA", imagefiles::encodeFlat("tga", 4, 2, 2), "0x190a", nullptr},
        {"colour.Jpeg", imagefiles::encodeFlat("jpg", 4, 2, 3), "0x1907", nullptr},
        {"alpha.png", imagefiles::encodeFlat("png", 4, 2, 4), "0x1908", nullptr},
        {"oddly.named", imagefiles::encodeFlat("bmp", 4, 2, 3), "0x1907", nullptr},
        {"broken.png", Bytes(100, 1), nullptr, "Image failed to load texture \"broken.png\""},
        {"broken.pvr", Bytes(100, 1), nullptr, nullptr},
    };
    cache->registerLoader(makeShared<Texture2DLoader>());
    for (const auto& test : cases)
    {
        addFile(test.name, test.file);
        LogCapture log;
        callsOf([&] { EXPECT_EQ(test.format != nullptr, bool(cache->get(test.name))) << test.name; });
        const auto uploads = glcalls::recorded("glTexImage2D");
        ASSERT_EQ(test.format ? 1u : 0u, uploads.size()) << test.name;
        if (test.format)
        {
            EXPECT_NE(std::string::npos, uploads[0].find(std::string("4, 2, 0, ") + test.format + ", 0x1401"))
                << uploads[0];
        }
        EXPECT_EQ(test.message ? 1 : 0, log.count('E')) << test.name;
        EXPECT_EQ(test.message ? 1 : 0, log.countMessage(test.message ? test.message : "")) << test.name;
    }
    Texture2DLoader loader;
    EXPECT_TRUE(loader.isKnown("a.JPG"));
    EXPECT_FALSE(loader.isKnown("a.pvr"));
}
