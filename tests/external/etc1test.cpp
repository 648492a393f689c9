#include "pvr/etc1.h"

#include "support/gltest.h"
#include "support/picture.h"

#include <ETC1/etc1.h>
#include <GLES2/gl2.h>
#include <GLES2/gl2ext.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <random>

namespace
{

using Bytes = std::vector<uint8_t>;

constexpr unsigned RGB = 3;
constexpr uint32_t SIDE = 512; // so large that noise has every mode, table and colour

Bytes makeNoise(size_t size, unsigned seed)
{
    std::mt19937 random(seed);
    Bytes bytes(size);
    std::generate(bytes.begin(), bytes.end(), [&random] { return uint8_t(random()); });
    return bytes;
}

bool isInvalid(const uint8_t* block)
{
    const bool isDifferential = block[3] & 2;
    return isDifferential && std::any_of(block, block + 3,
                                         [](uint8_t channel)
                                         {
                                             const int sum = (channel >> 3) + ((channel & 7) ^ 4) - 4;
                                             return sum < 0 || sum > 31;
                                         });
}

/// Noise whose invalid blocks are changed to the mode of two individual colours. Invalid blocks are undefined; Mesa
/// decodes them otherwise than libETC1: its sums overflow eight bits, not five.
Bytes makeValidNoise(size_t size)
{
    Bytes data = makeNoise(size, 2);
    for (size_t block = 0; block < size; block += 8)
        if (isInvalid(&data[block]))
            data[block + 3] &= 0xfd;
    return data;
}

/// Decodes from and to allocations of exactly the right size, so that a sanitizer sees a byte too much.
Bytes decode(const Bytes& data, uint32_t width, uint32_t height)
{
    const auto in = std::make_unique<uint8_t[]>(data.size());
    std::copy(data.begin(), data.end(), in.get());
    const size_t size = size_t(width) * height * 4;
    const auto out = std::make_unique<uint8_t[]>(size);
    EXPECT_TRUE(pvr::decodeEtc1(in.get(), data.size(), width, height, out.get()));
    return Bytes(out.get(), out.get() + size);
}

Bytes decodeWithLibrary(const Bytes& data, uint32_t width, uint32_t height)
{
    Bytes rgb(size_t(width) * height * RGB);
    EXPECT_EQ(0, etc1_decode_image(data.data(), rgb.data(), width, height, RGB, width * RGB));
    Bytes rgba;
    for (size_t i = 0; i < rgb.size(); i += RGB)
        rgba.insert(rgba.end(), {rgb[i], rgb[i + 1], rgb[i + 2], 255});
    return rgba;
}

GLuint makeProgram()
{
    const char* const vertex =
        "attribute vec2 a_position; void main() { gl_Position = vec4(a_position, 0.0, 1.0); }";
    const char* const fragment = "precision highp float; uniform sampler2D u_texture; uniform vec2 u_size;"
                                 "void main() { vec2 at = vec2(gl_FragCoord.x, u_size.y - gl_FragCoord.y);"
                                 "gl_FragColor = texture2D(u_texture, at / u_size); }";
    const GLuint program = glCreateProgram();
    for (const auto& [type, source] :
         {std::pair(GL_VERTEX_SHADER, vertex), std::pair(GL_FRAGMENT_SHADER, fragment)})
    {
        const GLuint shader = glCreateShader(GLenum(type));
        glShaderSource(shader, 1, &source, nullptr);
        glCompileShader(shader);
        glAttachShader(program, shader);
        glDeleteShader(shader);
    }
    glBindAttribLocation(program, 0, "a_position");
    glLinkProgram(program);
    return program;
}

class Etc1Test : public support::GlTest
{
protected:
    /// The driver's result, drawn pixel by pixel. Needs a current context of this size or larger.
    Bytes decodeWithDriver(const Bytes& data, uint32_t width, uint32_t height)
    {
        GLuint texture = 0;
        glGenTextures(1, &texture);
        glBindTexture(GL_TEXTURE_2D, texture);
        for (const GLenum filter : {GL_TEXTURE_MIN_FILTER, GL_TEXTURE_MAG_FILTER})
            glTexParameteri(GL_TEXTURE_2D, filter, GL_NEAREST);
        for (const GLenum wrap : {GL_TEXTURE_WRAP_S, GL_TEXTURE_WRAP_T})
            glTexParameteri(GL_TEXTURE_2D, wrap, GL_CLAMP_TO_EDGE);
        glCompressedTexImage2D(GL_TEXTURE_2D, 0, GL_ETC1_RGB8_OES, GLsizei(width), GLsizei(height), 0,
                               GLsizei(data.size()), data.data());

        const GLuint program = makeProgram();
        glUseProgram(program);
        glUniform2f(glGetUniformLocation(program, "u_size"), float(width), float(height));
        const float corners[] = {-1, -1, 1, -1, -1, 1, 1, 1};
        glEnableVertexAttribArray(0);
        glVertexAttribPointer(0, 2, GL_FLOAT, GL_FALSE, 0, corners);
        glViewport(0, 0, GLsizei(width), GLsizei(height));
        glDrawArrays(GL_TRIANGLE_STRIP, 0, 4);
        glDeleteTextures(1, &texture);
        glDeleteProgram(program);
        return support::readFramebuffer(0, 0, int(width), int(height)).rgba;
    }
};

// Fault caught: any bit of any mode read wrongly.
TEST_F(Etc1Test, isBitExactWithDriver)
{
    const std::unique_ptr<headless::Context> large = makeContext(SIDE, SIDE);
    const Bytes data = makeValidNoise(pvr::etc1Size(SIDE, SIDE));
    EXPECT_TRUE(decodeWithDriver(data, SIDE, SIDE) == decode(data, SIDE, SIDE));
    context().makeCurrent();
}

// Faults caught: any bit of any mode read wrongly, invalid blocks included; partly filled blocks at the right and
// lower edges placed wrongly; a byte beyond the buffers.
TEST(Etc1, isBitExactWithLibraryAtEverySize)
{
    std::vector<std::pair<uint32_t, uint32_t>> sizes = {{SIDE, SIDE}};
    for (uint32_t height = 1; height <= 13; ++height)
        for (uint32_t width = 1; width <= 13; ++width)
            sizes.emplace_back(width, height);

    for (const auto& [width, height] : sizes)
    {
        const Bytes data = makeNoise(pvr::etc1Size(width, height), width * 64 + height);
        EXPECT_TRUE(decodeWithLibrary(data, width, height) == decode(data, width, height))
            << width << " x " << height;
    }
}

// Fault caught: reading beyond data that is too short, above all where sizes overflow 32 bits.
TEST(Etc1, refusesWhatIsTooShort)
{
    const struct
    {
        uint32_t width, height;
        size_t size;
    } cases[] = {{4, 4, 7},     {5, 4, 15}, {1, 9, 23}, {0, 4, 8}, {4, 0, 8}, {0x80000000, 0x80000000, 64},
                 {~0u, ~0u, 64}};

    const Bytes data(64);
    for (const auto& test : cases)
    {
        uint8_t untouched = 1;
        EXPECT_FALSE(pvr::decodeEtc1(data.data(), test.size, test.width, test.height, &untouched));
        EXPECT_EQ(1, untouched);
    }
}

} // namespace
