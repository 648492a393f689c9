#include "orv/shaderprogram.h"

#include "orv/detail/bindingepoch.h"
#include "orv/detail/resource.h"
#include "orv/rendercontext.h"
#include "orv/shaderprogramcache.h"
#include "orv/texture2dcache.h"
#include "orv/texturecubecache.h"
#include "orv/vertexbuffercache.h"

#include "facilitytest.h"
#include "support/picture.h"

#include <GLES2/gl2ext.h>

#include <new>

using namespace orv;
using support::LogCapture;
using support::Rgba;

namespace
{

const char* const VERTEX = "attribute vec2 a_position;\n"
                           "void main() { gl_Position = vec4(a_position, 0.0, 1.0); }\n";
const char* const TEXTURED = "precision mediump float;\n"
                             "uniform sampler2D u_texture;\n"
                             "void main() { gl_FragColor = texture2D(u_texture, vec2(0.5)); }\n";
const char* const COLOURED = "precision mediump float;\n"
                             "uniform vec4 u_colour;\n"
                             "void main() { gl_FragColor = u_colour; }\n";

/// Programs, textures and a square that fills the view, on a render context of their own.
class ShaderProgramTest : public FacilityTest
{
protected:
    void SetUp() override
    {
        GlTest::SetUp();
        m_renderContext = makeShared<RenderContext>();
        addAttrib("a_position", {-1, -1, 1, -1, -1, 1, 1, 1});
    }

    void flush() override
    {
        m_square.reset();
        m_programs->flush();
        m_textures->flush();
        m_buffers->flush();
    }

    void addAttrib(const char* name, const std::vector<float>& values)
    {
        const SharedPtr<VertexArray> array = makeShared<VertexArray>(4, 4, int(values.size() / 4));
        std::copy(values.begin(), values.end(), array->getData<float>());
        m_square->addAttrib(array, name, VertexBuffer::AttribFormat::FLOAT,
                            VertexBuffer::AttribUsage::GL_BUFFER, false);
    }

    /// A program whose only named uniform takes the property.
    SharedPtr<ShaderProgram> makeProgram(const char* fragment, const char* property,
                                         const char* vertex = VERTEX)
    {
        const SharedPtr<ShaderProgram> program = m_programs->create(vertex, fragment, nullptr);
        if (program && program->getUniformCount() > 0)
            program->setUniformPropertyName(0, property);
        return program;
    }

    SharedPtr<Texture2D> makeTexture(const Rgba& colour)
    {
        return m_textures->create(1, 1, Texture::Format::RGBA, Texture::Type::UNSIGNED_BYTE, &colour,
                                  nullptr);
    }

    /// One draw of the square, values as an appearance hands them over. @return the colour of the view.
    Rgba draw(ShaderProgram& program, const ShaderUniformBase* value = nullptr)
    {
        detail::UniformSources sources;
        program.enable(*m_renderContext, &value, sources);
        program.bind(*m_renderContext, *m_square);
        glDrawArrays(GL_TRIANGLE_STRIP, 0, 4);
        return support::readFrame().pixel(32, 32);
    }

    /// What GL holds for a uniform.
    static std::vector<float> read(const ShaderProgram& program, const char* uniform, size_t count)
    {
        float values[16] = {};
        glGetUniformfv(program.getId(), glGetUniformLocation(program.getId(), uniform), values);
        return {values, values + count};
    }

    SharedPtr<ShaderProgramCache> m_programs = makeShared<ShaderProgramCache>();
    SharedPtr<Texture2DCache> m_textures = makeShared<Texture2DCache>();
    SharedPtr<VertexBufferCache> m_buffers = makeShared<VertexBufferCache>();
    SharedPtr<RenderContext> m_renderContext;
    SharedPtr<VertexBuffer> m_square = m_buffers->create(nullptr);
};

} // namespace

// Fault caught: array names that keep their "[0]", sizes lost, samplers of different kinds meeting on one unit.
TEST_F(ShaderProgramTest, learnsUniformsAndGivesSamplersTheirUnits)
{
    const char* const vertex =
        "attribute vec4 a_position; uniform vec4 u_l_position[4];\n"
        "void main() { gl_Position = a_position + u_l_position[0] + u_l_position[3]; }\n";
    const char* const fragment =
        "precision mediump float; uniform sampler2D u_a; uniform sampler2D u_b; uniform samplerCube u_c[2];\n"
        "void main() { gl_FragColor = texture2D(u_a, vec2(0.5)) + texture2D(u_b, vec2(0.5))\n"
        "    + textureCube(u_c[0], vec3(1.0)) + textureCube(u_c[1], vec3(1.0)); }\n";
    const SharedPtr<ShaderProgram> program = m_programs->create(vertex, fragment, "p");
    ASSERT_TRUE(program);
    std::vector<std::string> names;
    for (int i = 0; i < program->getUniformCount(); ++i)
        names.push_back(program->getUniformInstanceName(i));
    std::sort(names.begin(), names.end());
    EXPECT_EQ((std::vector<std::string>{"u_a", "u_b", "u_c", "u_l_position"}), names);
    const std::pair<const char*, float> units[] = {{"u_a", 0}, {"u_b", 1}, {"u_c[0]", 2}, {"u_c[1]", 3}};
    for (const auto& [name, unit] : units)
        EXPECT_EQ(unit, read(*program, name, 1)[0]) << name;
    GLint current = -1;
    glGetIntegerv(GL_CURRENT_PROGRAM, &current);
    EXPECT_EQ(0, current); // making a program changes nothing that is in use
}

// Fault caught: a type of the table sent by the wrong call, with the wrong count, or not at all.
TEST_F(ShaderProgramTest, sendsEveryTypeOnce)
{
    const RenderContext::DrawScope scope(*m_renderContext);
    using M2 = Matrix2<float>;
    const Vector3f one(1, 2, 3), two(4, 5, 6), three(7, 8, 9);
    const Vector4f row(1, 2, 3, 4);
    const struct
    {
        const char* type;
        const char* use; ///< a float made of the uniform u
        SharedPtr<ShaderUniformBase> value;
        std::vector<float> sent;
    } cases[] = {
        {"float", "u", makeValue(1.5f), {1.5f}},
        {"vec2", "u.x + u.y", makeValue(Vector2f(1, 2)), {1, 2}},
        {"vec3", "u.x + u.z", makeValue(one), {1, 2, 3}},
        {"vec4", "u.x + u.w", makeValue(row), {1, 2, 3, 4}},
        {"int", "float(u)", makeValue(-7), {-7}},
        {"ivec2", "float(u.x + u.y)", makeValue(Vector2<int>(1, -2)), {1, -2}},
        {"ivec3", "float(u.x + u.z)", makeValue(Vector3<int>(1, 2, 3)), {1, 2, 3}},
        {"ivec4", "float(u.x + u.w)", makeValue(Vector4<int>(1, 2, 3, 4)), {1, 2, 3, 4}},
        {"bool", "float(u)", makeValue(true), {1}},
        {"bvec2", "float(u.x || u.y)", makeValue(Vector2<bool>(false, true)), {0, 1}},
        {"bvec3", "float(u.x || u.z)", makeValue(Vector3<bool>(true, false, true)), {1, 0, 1}},
        {"bvec4", "float(u.x || u.w)", makeValue(Vector4<bool>(true, false, false, true)), {1, 0, 0, 1}},
        {"mat2", "u[0].x + u[1].y", makeValue(M2(Vector2f(1, 2), Vector2f(3, 4))), {1, 2, 3, 4}},
        {"mat3", "u[0].x + u[2].y", makeValue(Matrix3f(one, two, three)), {1, 2, 3, 4, 5, 6, 7, 8, 9}},
        {"mat4",
         "u[0].x + u[3].y",
         makeValue(Matrix4f(row, row, row, Vector4f(5, 6, 7, 8))),
         {1, 2, 3, 4, 1, 2, 3, 4, 1, 2, 3, 4, 5, 6, 7, 8}}};
    for (const auto& test : cases)
    {
        const std::string vertex = std::string("attribute vec4 a_position;\nuniform ") + test.type +
                                   " u;\nvoid main() { gl_Position = a_position * (" + test.use + "); }\n";
        const SharedPtr<ShaderProgram> program = m_programs->create(vertex.c_str(), COLOURED, nullptr);
        ASSERT_TRUE(program) << test.type;
        const int index = program->getUniformInstanceName(0) == std::string("u") ? 0 : 1;
        program->setUniformPropertyValue(index, test.value);

        program->enable(*m_renderContext);
        EXPECT_EQ(test.sent, read(*program, "u", test.sent.size())) << test.type;
        glcalls::resetCounts();
        program->enable(*m_renderContext);
        EXPECT_EQ(0u, glcalls::total()) << test.type;
    }
}

// Faults caught: a value of another type that is sent nevertheless; a source of the last draw that stays.
TEST_F(ShaderProgramTest, sourcesInTheirOrder)
{
    const SharedPtr<ShaderProgram> program = makeProgram(COLOURED, "COLOUR");
    const auto global = makeValue(Vector4f(0, 0, 1, 1));
    m_renderContext->addProperty(global, "COLOUR");
    const auto own = makeValue(Vector4f(0, 1, 0, 1));
    const auto handed = makeValue(Vector4f(1, 0, 0, 1));
    const auto wrongType = makeValue(0.5f);

    EXPECT_EQ((Rgba{0, 0, 255}), draw(*program));
    EXPECT_EQ((Rgba{255, 0, 0}), draw(*program, handed.get()));
    EXPECT_EQ((Rgba{0, 0, 255}), draw(*program));
    program->setUniformPropertyValue(0, own);
    EXPECT_EQ((Rgba{0, 255, 0}), draw(*program));
    EXPECT_EQ((Rgba{255, 0, 0}), draw(*program, handed.get()));
    glcalls::resetCounts();
    EXPECT_EQ((Rgba{255, 0, 0}), draw(*program, wrongType.get()));
    EXPECT_EQ(0u, glcalls::count(glUniform4fv));
    program->setUniformPropertyValue(0, nullptr);
    own->setValue(Vector4f(1, 1, 1, 1), 0);
    EXPECT_EQ((Rgba{0, 0, 255}), draw(*program));
}

// Fault caught: a program linked before its property or context existed, or under another name, is never fed.
TEST_F(ShaderProgramTest, linksAgainWhenTheContextChanges)
{
    const SharedPtr<ShaderProgram> program = makeProgram(COLOURED, "COLOUR");
    EXPECT_EQ((Rgba{0, 0, 0, 0}), draw(*program));
    m_renderContext->addProperty(makeValue(Vector4f(1, 0, 0, 1)), "COLOUR");
    m_renderContext->addProperty(makeValue(Vector4f(1, 1, 0, 1)), "OTHER");
    EXPECT_EQ((Rgba{255, 0, 0}), draw(*program));
    program->setUniformPropertyName(0, "OTHER");
    EXPECT_EQ((Rgba{255, 255, 0}), draw(*program));
    program->setUniformPropertyName(0, "COLOUR");

    // A new context in the very memory of the old one.
    alignas(RenderContext) static unsigned char memory[sizeof(RenderContext)];
    const Vector4f colours[] = {{0, 1, 0, 1}, {0, 0, 1, 1}};
    for (const Vector4f& colour : colours)
    {
        RenderContext* context = new (memory) RenderContext;
        context->addProperty(makeValue(colour), "COLOUR");
        program->enable(*context);
        EXPECT_EQ(std::vector<float>(colour.data(), colour.data() + 4), read(*program, "u_colour", 4));
        context->~RenderContext();
    }
}

// Fault caught: a remembered texture binding that something else has taken.
TEST_F(ShaderProgramTest, programsInTurnShowTheirOwnTextures)
{
    const RenderContext::DrawScope scope(*m_renderContext);
    const SharedPtr<ShaderProgram> programs[] = {makeProgram(TEXTURED, "T"), makeProgram(TEXTURED, "T")};
    const Rgba colours[] = {{255, 0, 0}, {0, 255, 0}};
    const SharedPtr<Texture2D> textures[] = {makeTexture(colours[0]), makeTexture(colours[1])};
    const SharedPtr<ShaderUniformBase> values[] = {makeValue(textures[0]), makeValue(textures[1])};

    const std::function<void()> disturbances[] = {
        [] {},
        [this]
        { m_textures->create(1, 1, Texture::Format::RGB, Texture::Type::UNSIGNED_BYTE, nullptr, nullptr); },
        [&] { textures[1]->setMinFilter(TextureParameters::FilterMode::NEAREST); },
        [this] { m_textures->flush(); },
        [&] { textures[0]->enable(); },
    };
    for (const auto& disturb : disturbances)
    {
        for (int i = 0; i < 4; ++i)
        {
            disturb();
            EXPECT_EQ(colours[i % 2], draw(*programs[i % 2], values[i % 2].get()))
                << "disturbance " << &disturb - disturbances << ", draw " << i;
        }
    }
    callsOf([&] { draw(*programs[1], values[1].get()); });
    EXPECT_TRUE(glcalls::recorded("glBindTexture").empty() && glcalls::recorded("glActiveTexture").empty());
}

// Faults caught: a sampler without a texture that shows what was there; a draw that keeps a texture alive.
TEST_F(ShaderProgramTest, samplersKeepNothing)
{
    const SharedPtr<ShaderProgram> program = makeProgram(TEXTURED, "T");
    SharedPtr<Texture2D> texture = makeTexture({255, 255, 255});
    SharedPtr<ShaderUniformBase> value = makeValue(texture);
    const auto empty = makeValue(SharedPtr<Texture2D>());
    const auto cube = makeValue(SharedPtr<TextureCube>());

    const ShaderUniformBase* const nothings[] = {nullptr, empty.get(), cube.get()};
    for (const ShaderUniformBase* nothing : nothings)
    {
        EXPECT_EQ((Rgba{255, 255, 255}), draw(*program, value.get()));
        EXPECT_EQ((Rgba{0, 0, 0}), draw(*program, nothing));
    }

    draw(*program, value.get());
    value.reset();
    texture.reset();
    m_textures->flush();
    EXPECT_TRUE(glcalls::liveNames(glcalls::Kind::TEXTURE).empty());
    EXPECT_EQ((Rgba{0, 0, 0}), draw(*program));
}

// Faults caught: units of a sampler array left to whatever was there; too many units reported one too early.
TEST_F(ShaderProgramTest, samplerArraysShowTheirFirstTexture)
{
    const char* const fragment =
        "precision mediump float;\n"
        "uniform sampler2D u_texture[3];\n"
        "void main() { gl_FragColor = texture2D(u_texture[0], vec2(0.5))\n"
        "    * texture2D(u_texture[1], vec2(0.5)) * texture2D(u_texture[2], vec2(0.5)); }\n";
    LogCapture log;
    const SharedPtr<ShaderProgram> program = makeProgram(fragment, "T");
    replaceInteger(GL_MAX_TEXTURE_IMAGE_UNITS, 2); // one unit too many passes
    makeProgram(fragment, "T");
    EXPECT_EQ(0, log.count('I'));
    replaceInteger(GL_MAX_TEXTURE_IMAGE_UNITS, 1);
    makeProgram(fragment, "T");
    EXPECT_EQ(1, log.countMessage("Max texture units (1) exceeded by shader program (2)."));
    glcalls::restore(glGetIntegerv);

    const SharedPtr<ShaderUniformBase> value = makeShared<ShaderUniform<SharedPtr<Texture2D>>>(3);
    value->setValue(makeTexture({0, 255, 255}), 0);
    value->setValue(makeTexture({0, 0, 0}), 1);
    program->setUniformPropertyValue(0, value);
    EXPECT_EQ((Rgba{0, 255, 255}), draw(*program));
    makeTexture({9, 9, 9}); // takes the active unit
    program->enableUniforms();
    glDrawArrays(GL_TRIANGLE_STRIP, 0, 4);
    EXPECT_EQ((Rgba{0, 255, 255}), support::readFrame().pixel(32, 32));
}

// Fault caught: arrays of another program left on, and read past the end of their buffers.
TEST_F(ShaderProgramTest, plainBindDisablesWhatIsLeftOver)
{
    const char* const five = "attribute vec2 a_position; attribute float a_1, a_2, a_3, a_4;\n"
                             "void main() { gl_Position = vec4(a_position, a_1 + a_2, a_3 + a_4); }\n";
    const char* const three = "attribute vec2 a_position; attribute float a_1, a_2;\n"
                              "void main() { gl_Position = vec4(a_position, a_1, a_2); }\n";
    const SharedPtr<ShaderProgram> programs[] = {makeProgram(COLOURED, "C", five),
                                                 makeProgram(COLOURED, "C", three)};
    for (const char* name : {"a_1", "a_3", "a_4"})
        addAttrib(name, {0, 0, 0, 0});
    m_square->commit();

    programs[0]->bind(*m_square);
    const GLuint missing = GLuint(glGetAttribLocation(programs[0]->getId(), "a_2"));
    GLfloat constant[4] = {};
    glGetVertexAttribfv(missing, GL_CURRENT_VERTEX_ATTRIB, constant);
    EXPECT_EQ(1.0f, constant[0]);

    const Calls calls = callsOf([&] { programs[1]->bind(*m_square); });
    for (const char* call : {"glDisableVertexAttribArray(3)", "glDisableVertexAttribArray(4)"})
        EXPECT_EQ(1, std::count(calls.begin(), calls.end(), call)) << call;

    programs[0]->bind(*m_renderContext, *m_square); // the draw path counts as well
    programs[1]->bind(*m_square);
    for (const GLuint location : {3u, 4u})
    {
        GLint enabled = 1;
        glGetVertexAttribiv(location, GL_VERTEX_ATTRIB_ARRAY_ENABLED, &enabled);
        EXPECT_EQ(0, enabled) << location;
    }
}

// Fault caught: GL calls with names of a context that is lost.
TEST_F(ShaderProgramTest, releasedProgramDoesNothing)
{
    const SharedPtr<ShaderProgram> program = makeProgram(TEXTURED, "T");
    const GLuint name = program->getId();
    m_programs->getResourceCache()->release();
    EXPECT_EQ(Calls{}, callsOf(
                           [&]
                           {
                               program->enable(*m_renderContext);
                               program->bind(*m_renderContext, *m_square);
                               program->bind(*m_square);
                               EXPECT_FALSE(program->isValid());
                           }));
    glDeleteProgram(name);
    for (const GLuint shader : glcalls::liveNames(glcalls::Kind::SHADER))
        glDeleteShader(shader);
}

// Fault caught: a program that is gone, or no longer in use, taken for the current one.
TEST_F(ShaderProgramTest, knowsTheCurrentProgram)
{
    SharedPtr<ShaderProgram> program = makeProgram(COLOURED, "C");
    EXPECT_EQ(nullptr, ShaderProgram::getCurrent(*m_renderContext));
    program->enable(*m_renderContext);
    EXPECT_EQ(program.get(), ShaderProgram::getCurrent(*m_renderContext));
    detail::bindingsChanged();
    EXPECT_EQ(program->getId(), m_renderContext->getBindings().getProgramInUse());
    glUseProgram(0);
    detail::bindingsChanged();
    EXPECT_EQ(nullptr, ShaderProgram::getCurrent(*m_renderContext));

    program->enable(*m_renderContext);
    program.reset();
    m_programs->flush();
    EXPECT_EQ(nullptr, ShaderProgram::getCurrent(*m_renderContext));
}

TEST_F(ShaderProgramTest, badIndicesAreLogged)
{
    const SharedPtr<ShaderProgram> program = makeProgram(COLOURED, "C");
    LogCapture log;
    for (const int index : {-1, 1})
    {
        EXPECT_FALSE(program->getUniformInstanceName(index) || program->getUniformPropertyName(index));
        program->setUniformPropertyName(index, "X");
        program->setUniformPropertyValue(index, nullptr);
        EXPECT_EQ(4, log.countMessage("Uniform index (" + std::to_string(index) + ") out of range [0:1)."));
    }
    EXPECT_FALSE(program->uniformExists("u_colour") || program->usesMirrorTexture());
    program->setUniformPropertyName(0, "M_MIRROR_TEXTURE");
    EXPECT_TRUE(program->usesMirrorTexture());
}

// Fault caught: half-made programs handed out or left in the cache, and GL objects leaked (see TearDown()).
TEST_F(ShaderProgramTest, failedCreationGivesNothing)
{
    const char* const broken = "void main() { nonsense }\n";
    const char* const unlinkable = "precision mediump float; varying vec4 v_missing;\n"
                                   "void main() { gl_FragColor = v_missing; }\n";
    const struct
    {
        const char* vertex;
        const char* fragment;
        const char* message;
        bool refused; ///< by GL, which gives no program
    } cases[] = {{nullptr, COLOURED, "ShaderProgram source code cannot be empty", false},
                 {broken, COLOURED, "Failed to compile shader:\n", false},
                 {VERTEX, broken, "Failed to compile shader:\n", false},
                 {VERTEX, unlinkable, "Failed to link shader program:\n", false},
                 {VERTEX, COLOURED, "Failed to allocate program resource", true}};
    for (const auto& test : cases)
    {
        glcalls::setDropped(glCreateProgram, test.refused);
        LogCapture log;
        EXPECT_FALSE(m_programs->create(test.vertex, test.fragment, "failed")) << test.message;
        EXPECT_TRUE(log.contains(test.message)) << test.message << " in " << log.text();
        EXPECT_FALSE(m_programs->exists("failed"));
    }
}
