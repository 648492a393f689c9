#include "orv/texturecube.h"

#include "orv/texturecubecache.h"
#include "orv/texturecubeloader.h"
#include "support/picture.h"
#include "texturefixture.h"

using namespace orv;
using imagefiles::Bytes;
using support::LogCapture;
using support::Rgba;

namespace
{

using Filter = TextureParameters::FilterMode;
using Wrap = TextureParameters::WrapMode;

const Rgba CELL_COLOURS[6] = {{255, 0, 0, 255},   {0, 255, 0, 255},   {0, 0, 255, 255},
                              {255, 255, 0, 255}, {255, 0, 255, 255}, {0, 255, 255, 255}};

class TextureCubeTest : public TextureFixture<TextureCubeCache>
{
protected:
    void SetUp() override
    {
        TextureFixture<TextureCubeCache>::SetUp();
        cache->registerLoader(makeShared<TextureCubeLoader>());
    }

    void addFlat(const std::string& name, int width, int height, const Rgba& colour)
    {
        Bytes pixels;
        for (int i = 0; i < width * height; ++i)
            pixels.insert(pixels.end(), {colour.r, colour.g, colour.b});
        addFile(name, imagefiles::encode("png", width, height, 3, pixels));
    }

    /// The mean colour of each face, by Face.
    std::vector<Rgba> readFaces(TextureCube& cube)
    {
        std::vector<Rgba> colours;
        GLuint framebuffer = 0;
        glGenFramebuffers(1, &framebuffer);
        glBindFramebuffer(GL_FRAMEBUFFER, framebuffer);
        for (GLenum face = 0; face < 6; ++face)
        {
            glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0,
                                   GL_TEXTURE_CUBE_MAP_POSITIVE_X + face, cube.getId(), 0);
            colours.push_back(
                support::readFramebuffer(0, 0, int(cube.getWidth()), int(cube.getHeight())).average());
        }
        glBindFramebuffer(GL_FRAMEBUFFER, 0);
        glDeleteFramebuffers(1, &framebuffer);
        return colours;
    }

    static GLint parameter(TextureCube& cube, GLenum name)
    {
        GLint value = 0;
        cube.enable();
        glGetTexParameteriv(GL_TEXTURE_CUBE_MAP, name, &value);
        return value;
    }
};

} // namespace

// Fault caught: cells of the grid on the wrong faces: reflections that look left when they should look up.
TEST_F(TextureCubeTest, gridCellsLandOnTheirFaces)
{
    Bytes pixels; // rows of a face are no multiple of four bytes
    for (int y = 0; y < 10; ++y)
    {
        for (int x = 0; x < 15; ++x)
        {
            const Rgba& colour = CELL_COLOURS[y / 5 * 3 + x / 5];
            pixels.insert(pixels.end(), {colour.r, colour.g, colour.b});
        }
    }
    addFile("room.png", imagefiles::encode("png", 15, 10, 3, pixels));
    LogCapture log;
    const auto cube = cache->get("room.png");
    ASSERT_TRUE(cube);
    EXPECT_EQ(5u, cube->getWidth());
    const int cellOfFace[] = {2, 0, 4, 3, 5, 1}; // +x -x +y -y +z -z
    const std::vector<Rgba> colours = readFaces(*cube);
    for (size_t face = 0; face < 6; ++face)
        EXPECT_EQ(CELL_COLOURS[cellOfFace[face]], colours[face]) << "face " << face;
    EXPECT_EQ(0, log.count('W')) << "cells were cut to fit";
}

// Faults caught: the six names taken in another order, or blanks around them taken as part of them.
TEST_F(TextureCubeTest, sixNamesAreTheFacesInOrder)
{
    std::string name;
    for (size_t i = 0; i < 6; ++i)
    {
        const std::string face = "face" + std::to_string(i) + ".png";
        addFlat(face, 4, 4, CELL_COLOURS[i]);
        name += (i > 0 ? " ;\t" : "") + face;
    }
    const auto cube = cache->get(name.c_str());
    ASSERT_TRUE(cube);
    EXPECT_EQ(std::vector<Rgba>(std::begin(CELL_COLOURS), std::end(CELL_COLOURS)), readFaces(*cube));

    const char* names[] = {"face5.png", "face0.png", "face0.png", "face0.png", "face0.png", "face1.png"};
    EXPECT_FALSE(exists(*cache, names[0], names[1], names[2], names[3], names[4], names[5]));
    const auto other = get(*cache, names[0], names[1], names[2], names[3], names[4], names[5]);
    ASSERT_TRUE(other);
    EXPECT_EQ(CELL_COLOURS[5], readFaces(*other)[0]);
    EXPECT_EQ(CELL_COLOURS[1], readFaces(*other)[5]);
    EXPECT_TRUE(exists(*cache, names[0], names[1], names[2], names[3], names[4], names[5]));
}

// Faults caught: a half-made cube left in the cache; faces of mixed formats, which GL shows black.
TEST_F(TextureCubeTest, whatCannotBeACubeIsRefused)
{
    addFlat("301.png", 301, 200, {});
    addFlat("201high.png", 300, 201, {});
    addFlat("flat.png", 300, 100, {});
    addFlat("a.png", 4, 4, {});
    addFlat("b.png", 4, 8, {});
    addFile("grey.png", imagefiles::encodeFlat("png", 4, 4, 1));
    addFile("bad.png", Bytes(50, 7));
    const struct
    {
        const char* name;
        const char* message;
    } cases[] = {
        {"301.png", "Cube map \"301.png\" width must be divisible by 3."},
        {"201high.png", "Cube map \"201high.png\" height must be divisible by 2."},
        {"flat.png",
         "Error: Cube map texture is not square.  Width and height parameter of faces of the cube map "
         "texture are not equal. If used glTexImage2D after this then, it will result into GL error : "
         "'Invalid Value'"},
        {"bad.png", "TextureCube image \"bad.png\" failed to load."},
        {"a.png;a.png", "TextureCube name is invalid: a.png;a.png"},
        {"a.png;a.png;a.png;a.png;a.png;", "TextureCube name is invalid: a.png;a.png;a.png;a.png;a.png;"},
        {"a.png;a.png;a.png;a.png;a.png;c.png", "TextureCube image \"c.png\" not found."},
        {"a.png;bad.png;a.png;a.png;a.png;a.png", "TextureCube image \"bad.png\" failed to load."},
        {"a.png;a.png;a.png;a.png;b.png;a.png", "TextureCube images must have matching dimensions."},
        {"a.png;a.png;grey.png;a.png;a.png;a.png",
         "TextureCube image \"grey.png\" has 1 channels, the first one 3."},
    };
    for (const auto& test : cases)
    {
        LogCapture log;
        EXPECT_FALSE(cache->get(test.name)) << test.name;
        EXPECT_EQ(1, log.countMessage(test.message)) << test.name << "\n" << log.text();
        EXPECT_EQ(1, log.count('E')) << test.name;
        EXPECT_FALSE(cache->exists(test.name)) << test.name;
    }
    EXPECT_EQ("", glcalls::describeLiveNames()) << "before the caches are flushed";
}

// Fault caught: a black cube kept under its name because there was no memory for one of its faces.
TEST_F(TextureCubeTest, aRefusedFaceIsTriedAgain)
{
    addFlat("room.png", 24, 16, {9, 9, 9});
    LogCapture log;
    glcalls::refuseCall(13); // a name, then three for each face
    EXPECT_FALSE(cache->get("room.png"));
    EXPECT_EQ("glTexImage2D", glcalls::refusedCall());
    EXPECT_EQ(1, log.countMessage("OpenGL error 5: Out of memory")) << log.text();
    const auto cube = cache->get("room.png");
    ASSERT_TRUE(cube && cube->isComplete());
    EXPECT_EQ((Rgba{9, 9, 9, 255}), readFaces(*cube)[3]);
}

// Faults caught: mipmaps made before all faces are there, parameters that leave a cube black, uploads into name 0.
TEST_F(TextureCubeTest, theSixthFaceCompletes)
{
    for (const bool isPowerOfTwo : {true, false})
    {
        const unsigned size = isPowerOfTwo ? 8 : 50;
        glcalls::resetCounts();
        const auto cube =
            cache->create(size, size, Texture::Format::RGB, Texture::Type::UNSIGNED_BYTE, nullptr);
        const TextureParameters mirrored(Filter::LINEAR_MIPMAP_LINEAR, Filter::NEAREST, Wrap::MIRRORED_REPEAT,
                                         Wrap::REPEAT);
        cube->setParameters(mirrored);
        for (int i = 0; i < 5; ++i)
            cube->setFace(TextureCube::Face(i), nullptr);
        EXPECT_EQ(0u, glcalls::count(glGenerateMipmap) + glcalls::count(glTexParameteri));
        cube->setFace(TextureCube::Face(6), nullptr); // there is no such face
        EXPECT_EQ(0u, glcalls::count(glTexParameteri));
        cube->setFace(TextureCube::Face::NEGATIVE_Z, nullptr);
        EXPECT_EQ(isPowerOfTwo ? 1u : 0u, glcalls::count(glGenerateMipmap));
        EXPECT_EQ(isPowerOfTwo ? GL_LINEAR_MIPMAP_LINEAR : GL_LINEAR,
                  parameter(*cube, GL_TEXTURE_MIN_FILTER));
        EXPECT_EQ(GL_NEAREST, parameter(*cube, GL_TEXTURE_MAG_FILTER));
        EXPECT_EQ(isPowerOfTwo ? GL_MIRRORED_REPEAT : GL_CLAMP_TO_EDGE, parameter(*cube, GL_TEXTURE_WRAP_S));
        EXPECT_EQ(isPowerOfTwo ? GL_REPEAT : GL_CLAMP_TO_EDGE, parameter(*cube, GL_TEXTURE_WRAP_T));

        cube->setParameters(TextureParameters(Filter::NEAREST, Filter::LINEAR, Wrap::CLAMP, Wrap::CLAMP));
        EXPECT_EQ(GL_NEAREST, parameter(*cube, GL_TEXTURE_MIN_FILTER));
        LogCapture log;
        cube->setParameters(TextureParameters(Filter(9), Filter::LINEAR, Wrap::CLAMP, Wrap::CLAMP));
        EXPECT_EQ(1, log.count('E'));
        EXPECT_EQ(GL_NEAREST, parameter(*cube, GL_TEXTURE_MIN_FILTER));
    }

    const auto lost = cache->create(4, 4, Texture::Format::RGB, Texture::Type::UNSIGNED_BYTE, nullptr);
    cache->getResourceCache()->release();
    EXPECT_EQ(Calls{}, callsOf([&] { lost->setFace(TextureCube::Face::POSITIVE_X, nullptr); }));
    for (const GLuint live : glcalls::liveNames(glcalls::Kind::TEXTURE))
        glDeleteTextures(1, &live);
}
