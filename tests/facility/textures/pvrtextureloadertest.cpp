#include "orv/pvrtextureloader.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/texture2dcache.h"
#include "orv/texture2dloader.h"
#include "orv/texturepropertyutil.h"
#include "pvr/pvrwriter.h"
#include "support/picture.h"
#include "texturefixture.h"

#include <GLES2/gl2ext.h>

using namespace orv;
using imagefiles::Bytes;
using support::LogCapture;
using support::Picture;

namespace
{

using Filter = TextureParameters::FilterMode;
using Wrap = TextureParameters::WrapMode;

/// A picture of the view's size or smaller, in colours that run, with a fully opaque alpha unless told otherwise.
pvr::SourcePicture makePicture(uint32_t width, uint32_t height, bool isOpaque = true)
{
    pvr::SourcePicture picture{width, height, {}};
    for (uint32_t y = 0; y < height; ++y)
    {
        for (uint32_t x = 0; x < width; ++x)
        {
            const uint32_t alpha = isOpaque ? 255 : 255 - (x + y) * 127 / (width + height);
            for (const uint32_t value : {x * 255 / width, y * 255 / height, 255 - x * 255 / width, alpha})
                picture.rgba.push_back(uint8_t(value));
        }
    }
    return picture;
}

pvr::SourcePicture makeFlat(uint32_t width, uint32_t height, const support::Rgba& colour)
{
    return {width, height, Picture::filled(int(width), int(height), colour).rgba};
}

class PvrTextureLoaderTest : public TextureFixture<Texture2DCache>
{
protected:
    void SetUp() override
    {
        TextureFixture::SetUp();
        cache->registerLoader(makeShared<Texture2DLoader>());
        cache->registerLoader(makeShared<PvrTextureLoader>());
    }

    SharedPtr<Texture2D> load(const std::string& name, const Bytes& file)
    {
        addFile(name, file);
        return cache->get(name.c_str());
    }

    /// Draws the whole texture into the lower left corner of the view, its first row on top.
    static Picture draw(Texture2D& texture, int width, int height)
    {
        const char* sources[] = {
            "attribute vec2 a; varying highp vec2 uv;"
            "void main() { uv = vec2(a.x, 1.0 - a.y); gl_Position = vec4(a * 2.0 - 1.0, 0.0, 1.0); }",
            "varying highp vec2 uv; uniform sampler2D t; void main() { gl_FragColor = texture2D(t, uv); }"};
        const GLuint program = glCreateProgram();
        for (int i = 0; i < 2; ++i)
        {
            const GLuint shader = glCreateShader(i == 0 ? GL_VERTEX_SHADER : GL_FRAGMENT_SHADER);
            glShaderSource(shader, 1, &sources[i], nullptr);
            glCompileShader(shader);
            glAttachShader(program, shader);
            glDeleteShader(shader);
        }
        glBindAttribLocation(program, 0, "a");
        glLinkProgram(program);
        glUseProgram(program);
        texture.enable();
        const float corners[] = {0, 0, 1, 0, 0, 1, 1, 1};
        glVertexAttribPointer(0, 2, GL_FLOAT, GL_FALSE, 0, corners);
        glEnableVertexAttribArray(0);
        glViewport(0, 0, width, height);
        glDrawArrays(GL_TRIANGLE_STRIP, 0, 4);
        glUseProgram(0);
        glDeleteProgram(program);
        return support::readFramebuffer(0, 0, width, height);
    }
};

} // namespace

// Faults caught: channels exchanged, pixels taken for another format, rows upside down or skewed.
TEST_F(PvrTextureLoaderTest, everyFormatShowsItsPicture)
{
    for (unsigned i = 0; i < pvr::FORMAT_COUNT; ++i)
    {
        const pvr::FormatInfo& info = pvr::FORMATS[i];
        const std::string name = info.name + std::string(".pvr");
        const int width = info.isPvrtc() ? 32 : 30; // an odd row length where the format allows it
        const pvr::SourcePicture picture = makePicture(unsigned(width), 32, false);
        LogCapture log;
        for (const bool isTurned : {false, true})
        {
            const pvr::Header header = isTurned ? pvr::Header::LEGACY_52 : pvr::Header::VERSION_3;
            const auto texture =
                load((isTurned ? "turned " : "") + name,
                     pvr::write(picture, pvr::Format(i), {header, false, info.isPvrtc(), isTurned}));
            ASSERT_TRUE(texture) << name << log.text();
            EXPECT_EQ("", log.text());

            Picture expected{width, 32, picture.rgba};
            for (size_t at = 0; at < expected.rgba.size(); at += 4)
            {
                uint8_t* rgba = &expected.rgba[at];
                if (name[0] == 'L') // L or LA
                    std::fill_n(rgba, 3, uint8_t((77 * rgba[0] + 150 * rgba[1] + 29 * rgba[2] + 128) / 256));
                if (name[0] == 'A' && info.bitsPerPixel == 8)
                    std::fill_n(rgba, 3, uint8_t(0));
                if (name.find('A') == std::string::npos || name.find("555") != std::string::npos)
                    rgba[3] = 255; // one bit of alpha says opaque, as it is above a half everywhere
            }
            // Both kinds of compression are coarse, and PVRTC mixes the edges with the opposite ones.
            const support::Tolerance tolerance = info.isPvrtc()        ? support::Tolerance{40, 0.3}
                                                 : info.isCompressed() ? support::Tolerance{20, 0.05}
                                                                       : support::Tolerance{10, 0.0};
            EXPECT_TRUE(
                comparePictures("pvr" + std::to_string(i), expected, draw(*texture, width, 32), tolerance))
                << name;
        }
    }
}

// Fault caught: another picture where the extension is missing, or blocks sent to a driver that cannot take them.
TEST_F(PvrTextureLoaderTest, compressedAndDecodedLookTheSame)
{
    const Bytes file = pvr::write(makePicture(32, 16), pvr::Format::ETC1);
    const auto compressed = load("compressed.pvr", file);
    ASSERT_TRUE(compressed);
    EXPECT_EQ(6u, glcalls::count(glCompressedTexImage2D));
    EXPECT_EQ(0u, glcalls::count(glTexImage2D));
    EXPECT_EQ(32u * 16u / 2u, compressed->getSizeInBytes());
    const Picture expected = draw(*compressed, 32, 16);

    glcalls::setExtensions("GL_OES_element_index_uint"); // and none for compressed textures
    const auto decoded = load("decoded.pvr", file);
    ASSERT_TRUE(decoded);
    EXPECT_EQ(6u, glcalls::count(glCompressedTexImage2D));
    EXPECT_EQ(6u, glcalls::count(glTexImage2D));
    EXPECT_EQ(32u * 16u * 4u, decoded->getSizeInBytes());
    EXPECT_EQ(0u, glcalls::count(glGenerateMipmap));
    EXPECT_TRUE(comparePictures("pvrDecoded", expected, draw(*decoded, 32, 16), {1, 0.0}));
}

// Faults caught: PVRTC under the wrong GL format or size, and pictures that such drivers do not take.
TEST_F(PvrTextureLoaderTest, pvrtcStaysCompressedWhereTheDriverTakesIt)
{
    glcalls::setExtensions("GL_IMG_texture_compression_pvrtc");
    glcalls::setDropped(glCompressedTexImage2D);
    const struct
    {
        pvr::Format format;
        uint32_t width;
        bool isTurned;
        const char* call; ///< that loads the smallest level; "" if it is decoded
    } cases[] = {
        {pvr::Format::PVRTC_4_RGB, 16, false, "0x0de1, 4, 0x8c00, 1, 1, 0, 32, data"},
        {pvr::Format::PVRTC_2_RGB, 16, false, "0x0de1, 4, 0x8c01, 1, 1, 0, 32, data"},
        {pvr::Format::PVRTC_4_RGBA, 16, false, "0x0de1, 4, 0x8c02, 1, 1, 0, 32, data"},
        {pvr::Format::PVRTC_2_RGBA, 16, false, "0x0de1, 4, 0x8c03, 1, 1, 0, 32, data"},
        {pvr::Format::PVRTC_4_RGB, 8, false, ""},
        {pvr::Format::PVRTC_4_RGB, 16, true, ""},
        {pvr::Format::ETC1, 16, false, ""}, // another extension
    };
    for (const auto& test : cases)
    {
        const std::string name = std::to_string(&test - cases) + ".pvr";
        const Bytes file = pvr::write(makePicture(test.width, 16), test.format,
                                      {pvr::Header::LEGACY_52, false, true, test.isTurned});
        const Calls calls = callsOf([&] { EXPECT_TRUE(load(name, file)); });
        const std::string call = std::string("glCompressedTexImage2D(") + test.call + ")";
        EXPECT_EQ(*test.call ? 1 : 0, std::count(calls.begin(), calls.end(), call)) << name;
        EXPECT_EQ(*test.call ? 5u : 0u, glcalls::recorded("glCompressedTexImage2D").size()) << name;
        EXPECT_EQ(*test.call ? 0u : 5u, glcalls::recorded("glTexImage2D").size()) << name;
    }
}

// Faults caught: a texture that GL takes for incomplete and shows black, mipmaps made again, sizes miscounted.
TEST_F(PvrTextureLoaderTest, mipmapsAreUsedAsTheyAreOrNotAtAll)
{
    const support::Rgba large{255, 0, 0, 255}, small{0, 0, 255, 255};
    const struct
    {
        const char* name;
        uint32_t width, height, levelCount; ///< of the file
        bool hasMipmaps, canRepeat;
        int warnings;
    } cases[] = {
        {"complete", 16, 8, 5, true, true, 0},        {"largest alone", 16, 8, 1, false, true, 0},
        {"incomplete", 16, 8, 3, false, true, 1},     {"odd sides", 12, 7, 4, false, false, 1},
        {"odd and alone", 12, 7, 1, false, false, 0}, {"one pixel", 1, 1, 1, false, true, 0},
    };
    for (const auto& test : cases)
    {
        SCOPED_TRACE(test.name);
        Bytes file = pvr::write(makeFlat(test.width, test.height, large), pvr::Format::RGB_565);
        file[4 * pvr::version3::LEVELS] = uint8_t(test.levelCount);
        for (size_t at = 52 + 2 * test.width * test.height; at < file.size(); at += 2) // the smaller levels
        {
            file[at] = 0x1f; // blue
            file[at + 1] = 0;
        }

        LogCapture log;
        const auto texture = load(test.name + std::string(".pvr"), file);
        ASSERT_TRUE(texture);
        EXPECT_EQ(test.warnings, log.count('W'));
        EXPECT_EQ(test.warnings, log.contains(test.name) ? 1 : 0);
        EXPECT_EQ(test.hasMipmaps, texture->hasMipmaps());
        EXPECT_EQ(test.hasMipmaps ? Filter::LINEAR_MIPMAP_NEAREST : Filter::LINEAR, texture->getMinFilter());
        EXPECT_EQ(Filter::LINEAR, texture->getMagFilter());
        EXPECT_EQ(test.canRepeat ? Wrap::REPEAT : Wrap::CLAMP, texture->getHorizontalWrap());
        EXPECT_EQ(test.canRepeat ? Wrap::REPEAT : Wrap::CLAMP, texture->getVerticalWrap());
        EXPECT_EQ(2 * test.width * test.height, texture->getSizeInBytes());
        EXPECT_EQ(large, draw(*texture, int(test.width), int(test.height)).average());
        EXPECT_EQ(test.hasMipmaps ? small : large, draw(*texture, 1, 1).average());
    }
    EXPECT_EQ(0u, glcalls::count(glGenerateMipmap));
}

// Faults caught: a GL name leaked, an asset registered that is none, a failure without a reason (the fixture looks for
// names and errors that are left).
TEST_F(PvrTextureLoaderTest, failuresLeaveNothingBehind)
{
    const auto replaceUpload = [](GLenum error)
    {
        glcalls::replace(glTexImage2D, [=](GLenum, GLint, GLint, GLsizei, GLsizei, GLint, GLenum, GLenum,
                                           const void*) { glcalls::queueError(error); });
    };
    const Bytes file = pvr::write(makePicture(16, 16), pvr::Format::RGBA_8888);
    const struct
    {
        Bytes file;
        std::function<void()> prepare;
        const char* reason;
    } cases[] = {
        {Bytes(file.begin(), file.end() - 1), [] {},
         "level 4, 1 x 1 pixels of RGBA 8888, is cut off after 3 bytes"},
        {Bytes(100, 'x'), [] {}, "header is not that of a PVR file"},
        {Bytes(), [] {}, "header is not that of a PVR file"},
        {file, [] { replaceInteger(GL_MAX_TEXTURE_SIZE, 8); },
         "width and height are 16 and 16, more than OpenGL's largest texture, 8"},
        {file, [] { glcalls::refuseNames(glGenTextures); }, "Failed to create OpenGL texture"},
        {file, [&] { replaceUpload(GL_OUT_OF_MEMORY); }, "OpenGL error 5: Out of memory"},
        {file, [&] { replaceUpload(GL_INVALID_VALUE); }, "OpenGL error 2: Invalid value"},
    };
    for (const auto& test : cases)
    {
        glcalls::reset();
        test.prepare();
        const std::string name = std::to_string(&test - cases) + ".pvr";
        LogCapture log;
        EXPECT_FALSE(load(name, test.file));
        EXPECT_EQ(1, log.countMessage("PVR texture \"" + name + "\" failed to load: " + test.reason + "."))
            << log.text();
        EXPECT_EQ(1, log.count('E'));
        EXPECT_FALSE(cache->exists(name.c_str()));
        EXPECT_EQ("", glcalls::describeLiveNames());
    }

    // What is not named as a PVR file and is none was reported by the loader of such names.
    glcalls::reset();
    LogCapture log;
    EXPECT_FALSE(load("image.png", Bytes(100, 'x')));
    EXPECT_EQ(1, log.count('E')) << log.text();
    EXPECT_FALSE(cache->get("missing.pvr"));
    EXPECT_EQ(1, log.count('E')) << log.text();
}

// Faults caught: the loader missing from the pool, a compressed picture not preferred, and a broken one that hides the
// image beside it.
TEST_F(PvrTextureLoaderTest, preferredBesideAnImage)
{
    struct Pool
    {
        ~Pool() { pool->flush(); }
        SharedPtr<AssetCachePool> pool = makeShared<AssetCachePool>();
    } holder;
    AssetCachePool& pool = *holder.pool;
    const Bytes image = imagefiles::encodeFlat("png", 4, 4, 3);
    const Bytes good = pvr::write(makePicture(8, 8), pvr::Format::ETC1), broken(good.begin(), good.end() - 1);
    const auto source = makeShared<MemoryStreamSource>();
    const struct
    {
        const char* name;
        const Bytes& file;
    } files[] = {{"both.png", image}, {"both.pvr", good}, {"spoiled.png", image}, {"spoiled.pvr", broken}};
    for (const auto& file : files)
        source->add(file.name, makeShared<MemoryStream>(file.file.data(), int(file.file.size())));
    pool.registerSource(source);

    const struct
    {
        const char* asked;
        const char* found;
        int errors;
    } cases[] = {{"both.png", "both.pvr", 0}, {"both.pvr", "both.pvr", 0}, {"spoiled.png", "spoiled.png", 1}};
    for (const auto& test : cases)
    {
        Appearance appearance;
        LogCapture log;
        EXPECT_TRUE(applyTextureProperty(pool, appearance, "T", SAMPLER_KIND_2D, test.asked, false));
        EXPECT_EQ(test.errors, log.count('E')) << log.text();
        SharedPtr<Texture2D> texture;
        ASSERT_TRUE(appearance.getPropertyUniform("T")->getValue(texture, 0));
        EXPECT_EQ(texture, pool.getTexture2DCache()->get(test.found)) << test.asked;
    }
}
