#include "orv/shaderprogramloader.h"

#include "orv/extensions.h"
#include "orv/filestreamsource.h"
#include "orv/memfilesource.h"
#include "orv/shaderprogramcache.h"

#include "facilitytest.h"
#include "support/tempdir.h"

#include <GLES2/gl2ext.h>

#include <cstring>

using namespace orv;
using support::LogCapture;
using support::TempDir;

namespace
{

const char* const VERTEX = "attribute vec4 a_position;\n"
                           "uniform float u_a;\n"
                           "void main() { gl_Position = a_position * u_a; }\n";
const char* const FRAGMENT = "precision mediump float;\n"
                             "uniform float u_b;\n"
                             "void main() { gl_FragColor = vec4(u_b); }\n";
const char* const SOURCES = "vertex_source_file t.vert fragment_source_file t.frag\n";
const char* const UNIFORMS = "uniform u_a A\nuniform u_b B\n";

/// A driver's program binaries, faked: a good one is the text BINARY under the format FORMAT.
const char BINARY[] = "linked";
const unsigned int FORMAT = 0x01020304;
const GLsizei BINARY_SIZE = sizeof(BINARY) - 1;

void getProgramBinary(GLuint, GLsizei, GLsizei* length, GLenum* format, void* binary)
{
    *length = BINARY_SIZE;
    *format = FORMAT;
    std::memcpy(binary, BINARY, BINARY_SIZE);
}

void programBinary(GLuint program, GLenum format, const void* binary, GLint length)
{
    if (format != FORMAT || length != BINARY_SIZE || std::memcmp(binary, BINARY, BINARY_SIZE) != 0)
        return;
    for (const auto& [kind, source] : {std::pair(GL_VERTEX_SHADER, VERTEX), {GL_FRAGMENT_SHADER, FRAGMENT}})
    {
        const GLuint shader = glcalls::real(glCreateShader)(GLenum(kind));
        glcalls::real(glShaderSource)(shader, 1, &source, nullptr);
        glcalls::real(glCompileShader)(shader);
        glcalls::real(glAttachShader)(program, shader);
        glcalls::real(glDeleteShader)(shader);
    }
    glcalls::real(glLinkProgram)(program);
}

class ShaderProgramLoaderTest : public FacilityTest
{
protected:
    explicit ShaderProgramLoaderTest(const char* extensions = "GL_OES_get_program_binary")
        : m_extensions(extensions)
    {
    }

    void SetUp() override
    {
        GlTest::SetUp();
        if (m_extensions)
            fakeDriver();
        m_cache = makeShared<ShaderProgramCache>();
        m_loader = makeShared<ShaderProgramLoader>();
        m_loader->setBinaryCachingEnabled(false);
        m_cache->registerLoader(m_loader);
        m_cache->registerSource(create_memfilesource_orv());
        m_cache->registerSource(makeShared<FileStreamSource>(m_files.path().c_str()));
        m_files.write("t.vert", VERTEX);
        m_files.write("t.frag", FRAGMENT);
        m_files.write("t.sp", std::string("1.0\n") + SOURCES + UNIFORMS);
    }

    void flush() override { m_cache->flush(); }

    void fakeDriver()
    {
        // Answers that the engine asks for once in a process.
        glcalls::setExtensions(m_extensions);
        glcalls::setProcAddress("glGetProgramBinaryOES", reinterpret_cast<void (*)()>(getProgramBinary));
        glcalls::setProcAddress("glProgramBinaryOES", reinterpret_cast<void (*)()>(programBinary));
        glcalls::replace(glGetProgramiv,
                         [](GLuint program, GLenum name, GLint* value)
                         {
                             name == GL_PROGRAM_BINARY_LENGTH_OES
                                 ? void(*value = BINARY_SIZE)
                                 : glcalls::real(glGetProgramiv)(program, name, value);
                         });
    }

    /// Property names by uniform, "u_a=A u_b=B "; empty for no program.
    static std::string describe(const SharedPtr<ShaderProgram>& program)
    {
        std::string text;
        for (int i = 0; program && i < program->getUniformCount(); ++i)
            text += std::string(program->getUniformInstanceName(i)) + "=" +
                    program->getUniformPropertyName(i) + " ";
        return text;
    }

    /// Whether the faked driver is in place, which it cannot be when the process has met another one before.
    bool binariesAreFaked()
    {
        return getShaderProgramBinariesSupported() &&
               get_glProgramBinaryOES() == reinterpret_cast<ProgramBinaryFunction>(programBinary) &&
               get_glGetProgramBinaryOES() == reinterpret_cast<GetProgramBinaryFunction>(getProgramBinary);
    }

    const char* m_extensions;
    TempDir m_files;
    SharedPtr<ShaderProgramCache> m_cache;
    SharedPtr<ShaderProgramLoader> m_loader;
};

struct NoProgramBinariesTest : ShaderProgramLoaderTest
{
    NoProgramBinariesTest() : ShaderProgramLoaderTest("GL_OES_depth24") {}
};

struct RealProgramBinariesTest : ShaderProgramLoaderTest
{
    RealProgramBinariesTest() : ShaderProgramLoaderTest(nullptr) {}
};

} // namespace

// Faults caught: a wrong file that loads, a good one that does not, a declaration lost or taken for another.
TEST_F(ShaderProgramLoaderTest, files)
{
    const std::string good = std::string("1.0\n") + SOURCES;
    const char* const incomplete = "uniform declaration incomplete";
    const struct
    {
        std::string text;
        const char* uniforms; ///< as describe() has them; empty for no program
        const char*
            message; ///< after "ShaderProgram file: t.sp " but for those of missing files; null for none
    } cases[] = {
        {good + UNIFORMS, "u_a=A u_b=B ", nullptr},
        {"// none\n1.0", "", "wrong version"},
        {" 1 . 0 // one\n//\n//two\nuniform u_a \"A B\"\nuniform u_b B uniform u_b C " + std::string(SOURCES),
         "u_a=A B u_b=C ", nullptr},
        {good + "uniform u_a A\nuniform u_gone G",
         "u_a=A u_b= ", "uniform \"u_b\" is not declared in the shader program file"},
        {good + "uniform\nuniform u_a A\nuniform u_b B", "u_a=A u_b=B ", incomplete},
        {good + "uniform u_a A\nuniform u_b B\nuniform u_a", "u_a=A u_b=B ", incomplete},
        {"", "", "empty"},
        {"1.1 " + good, "", "wrong version"},
        {"1 0", "", "expected '.'"},
        {good + "geometry_source_file x", "", "unexpected tag geometry_source_file"},
        {"1.0 fragment_source_file t.frag", "", "missing vertex source"},
        {"1.0 vertex_source_file t.vert", "", "missing fragment source"},
        {"1.0 vertex_source_file x.vert fragment_source_file t.frag", "",
         "Reading vertex shader file: x.vert"},
        {"1.0 vertex_source_file t.vert fragment_source_file x.frag", "",
         "Reading vertex shader file: x.frag"},
    };
    for (const auto& test : cases)
    {
        m_files.write("t.sp", test.text);
        LogCapture log;
        EXPECT_EQ(test.uniforms, describe(m_loader->load(*m_cache, "t.sp"))) << test.text;
        const int explained = log.contains("was looked for in") ? 1 : 0;
        EXPECT_EQ((test.message ? 1 : 0) + explained, log.count('E') + log.count('W')) << log.text();
        const std::string message = test.message ? test.message : "";
        const std::string full = (message[0] == 'R' ? "" : "ShaderProgram file: t.sp ") + message;
        EXPECT_EQ(test.message ? 1 : 0, log.countMessage(full)) << test.text << log.text();
    }
    LogCapture log;
    EXPECT_FALSE(m_cache->get("none.sp$A"));
    EXPECT_EQ("", log.text());
}

// Fault caught: defines in another order, or not in both sources, or after the text that they are to change.
TEST_F(ShaderProgramLoaderTest, defines)
{
    std::vector<std::string> sources;
    glcalls::replace(glShaderSource,
                     [&sources](GLuint shader, GLsizei count, const GLchar* const* text, const GLint* sizes)
                     {
                         sources.push_back(*text);
                         glcalls::real(glShaderSource)(shader, count, text, sizes);
                     });
    const struct
    {
        const char* name;
        const char* block;
    } cases[] = {{"t.sp", ""}, {"t.sp$A$B", "#define A\n#define B\n"}, {"t.sp$N 3", "#define N 3\n"}};
    for (const auto& test : cases)
    {
        sources.clear();
        EXPECT_TRUE(m_cache->get(test.name)) << test.name;
        EXPECT_EQ(
            (std::vector<std::string>{std::string(test.block) + VERTEX, std::string(test.block) + FRAGMENT}),
            sources);
    }
    EXPECT_TRUE(m_loader->isKnown("T.SP"));
    EXPECT_FALSE(m_loader->isKnown("t.sp$A")); // and yet loaded above
    EXPECT_FALSE(m_cache->get("t.sp$A$B") == m_cache->get("t.sp"));
    EXPECT_TRUE(m_cache->get("t.sp$A$B") == m_cache->get("t.sp$A$B"));

    LogCapture log; // an empty piece gives a bare line, which the compiler refuses
    sources.clear();
    EXPECT_TRUE(m_cache->get("t.sp$$A"));
    EXPECT_EQ(std::string("#define \n#define A\n") + VERTEX, sources[0]);
}

// Fault caught: an asset that does not compile leaves nothing to draw with, or the error program loads itself for ever.
TEST_F(ShaderProgramLoaderTest, errorProgramStandsIn)
{
    m_files.write("t.frag", "nonsense");
    LogCapture log;
    const SharedPtr<ShaderProgram> program = m_cache->get("t.sp");
    EXPECT_TRUE(program->uniformExists("M_ERROR_TEXTURE"));
    EXPECT_EQ(1, log.countMessage("Failed to compile shader \"t.sp\" from source."));
    EXPECT_TRUE(program == m_cache->get("orv#error.sp"));

    log.clear();
    glcalls::failCompiling("out of order");
    EXPECT_FALSE(m_loader->load(*m_cache, "t.sp"));
    EXPECT_EQ(1, log.countMessage("ORV_ASSERT: !errorShaderHasError"));
}

// Faults caught: a binary of other sources or another driver used; a spoiled one not replaced.
TEST_F(ShaderProgramLoaderTest, binaryCache)
{
    if (!binariesAreFaked())
        GTEST_SKIP() << "another driver was met in this process";
    TempDir cached;
    m_cache->setCacheSource(makeShared<FileStreamSource>(cached.path().c_str()));
    m_loader->setBinaryCachingEnabled(true);

    // A program in a folder is kept as well.
    m_files.write("lit/by/t.sp", std::string("1.0\n") + SOURCES + UNIFORMS);
    EXPECT_TRUE(m_loader->load(*m_cache, "lit/by/t.sp"));
    EXPECT_LT(0u, support::readFile(cached.path("lit/by/t.spc")).size());

    const auto load = [this]
    {
        glcalls::resetCounts();
        LogCapture log;
        EXPECT_EQ("u_a=A u_b=B ", describe(m_loader->load(*m_cache, "t.sp$A")));
        const bool compiled = log.countMessage("Compiled shader from source \"t.sp$A\".") == 1;
        EXPECT_EQ(compiled ? 2u : 0u, glcalls::count(glCompileShader));
        EXPECT_EQ(compiled, log.countMessage("Wrote compiled shader to file \"t.sp$Ac\".") == 1)
            << log.text();
        EXPECT_EQ(!compiled, log.countMessage("Loaded precompiled shader binary \"t.sp$Ac\".") == 1)
            << log.text();
        return log.text();
    };
    load();
    const std::vector<uint8_t> good = support::readFile(cached.path("t.sp$Ac"));
    ASSERT_EQ(16u + 4 + 4 + BINARY_SIZE, good.size());
    EXPECT_EQ((std::vector<uint8_t>{1, 0, 0, 0, 4, 3, 2, 1, 'l'}),
              std::vector<uint8_t>(good.begin() + 16, good.begin() + 25));

    const auto spoiled = [&](size_t offset)
    {
        std::vector<uint8_t> file = good;
        file[offset] ^= 2;
        return file;
    };
    const auto cut = [&](size_t size) { return std::vector<uint8_t>(good.data(), good.data() + size); };
    const struct
    {
        std::vector<uint8_t> file;
        const char* message; ///< expected in the log
        bool loaded;
    } cases[] = {
        {good, "Cached shader binary \"t.sp$Ac\" found", true},
        {spoiled(3), "Compiled", false}, // the digest
        {spoiled(16), "Unrecognized cached shader version\"t.sp$Ac\"", false},
        {spoiled(21), "ShaderProgram binary load failed", false}, // the format
        {cut(0), "Compiled", false},
        {cut(18), "Failed to read -cached- shader \"t.sp$Ac\"", false},
        {cut(23), "Failed to load cached shader \"t.sp$Ac\"", false},
        {cut(28), "ShaderProgram binary load failed", false},
    };
    for (const auto& test : cases)
    {
        cached.write("t.sp$Ac", test.file);
        const std::string log = load();
        EXPECT_NE(std::string::npos, log.find(test.message)) << log;
        EXPECT_EQ(test.loaded, log.find("Loaded precompiled") != std::string::npos) << log;
        EXPECT_EQ(good, support::readFile(cached.path("t.sp$Ac"))) << test.message;
    }

    m_files.write("t.vert", std::string(VERTEX) + "// changed\n");
    EXPECT_NE(std::string::npos, load().find("Compiled shader from source"));
    EXPECT_NE(good, support::readFile(cached.path("t.sp$Ac")));

    // Shipped among the assets, it is found first.
    m_files.write("t.sp$Ac", support::readFile(cached.path("t.sp$Ac")));
    EXPECT_NE(std::string::npos, load().find("Precompiled shader binary \"t.sp$Ac\" found"));

    m_loader->setBinaryCachingEnabled(false);
    LogCapture log;
    EXPECT_TRUE(m_loader->load(*m_cache, "t.sp$A"));
    EXPECT_EQ(std::string::npos, log.text().find("binary")) << log.text();
}

// Fault caught: a driver without binaries is asked for some, or caching is switched on over it.
TEST_F(NoProgramBinariesTest, areRefused)
{
    if (getShaderProgramBinariesSupported())
        GTEST_SKIP() << "another driver was met in this process";
    LogCapture log;
    m_loader->setBinaryCachingEnabled(true);
    EXPECT_FALSE(m_loader->getBinaryCachingEnabled());
    EXPECT_FALSE(m_cache->create(1, 1, "x", "x"));
    unsigned int length = 1, format = 2;
    char* binary = nullptr;
    EXPECT_FALSE(m_cache->create(VERTEX, FRAGMENT, "t")->getBinary(length, format, binary));
    EXPECT_TRUE(length == 1 && format == 2 && !binary);
    EXPECT_EQ(3, log.countMessage("Shader program binaries are not supported; please check support using "
                                  "getShaderProgramBinariesSupported()"));
}

// Fault caught: binaries exchanged with a driver in a way that only the faked one takes.
TEST_F(RealProgramBinariesTest, comeBackAsPrograms)
{
    GLint formats = 0;
    glGetIntegerv(GL_NUM_PROGRAM_BINARY_FORMATS_OES, &formats);
    if (!getShaderProgramBinariesSupported() || binariesAreFaked() || formats == 0)
        GTEST_SKIP() << "the driver has none";
    TempDir cached;
    m_cache->setCacheSource(makeShared<FileStreamSource>(cached.path().c_str()));
    m_loader->setBinaryCachingEnabled(true);
    EXPECT_TRUE(m_loader->load(*m_cache, "t.sp"));
    LogCapture log;
    EXPECT_EQ("u_a=A u_b=B ", describe(m_loader->load(*m_cache, "t.sp")));
    EXPECT_EQ(1, log.countMessage("Loaded precompiled shader binary \"t.spc\".")) << log.text();
}
