#include "render/glotest.h"
#include "support/damage.h"
#include "support/tempdir.h"

#include "inspect/forecast.h"
#include "inspect/glochecks.h"
#include "inspect/print.h"

#include "inspect/textfiles.h"

#include "glcalls/glcalls.h"
#include "headless/png.h"

#include "orv/filestreamsource.h"
#include "orv/shaderprogramcache.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <set>

using namespace orv;
using glo::GloScene;

namespace
{

using Bytes = std::vector<uint8_t>;
using Change = std::function<void(GloScene&)>;

class InspectTest : public GloTest
{
protected:
    void SetUp() override
    {
        GloTest::SetUp();
        m_pool->registerSource(makeShared<FileStreamSource>(m_folder.path().c_str()));
    }

    std::vector<inspect::Finding> check(const Bytes& bytes) const
    {
        inspect::Findings findings;
        const inspect::ScannedFile file = inspect::scanGlo(bytes, findings);
        if (file.top.id != 0)
            inspect::checkGlo(file, m_folder.path(), findings);
        return findings.getSorted();
    }

    support::TempDir m_folder;
};

std::string describe(const std::vector<inspect::Finding>& findings)
{
    std::string text;
    for (const inspect::Finding& finding : findings)
        text += std::string(inspect::getInfo(finding.kind).code) + " at " + std::to_string(finding.offset) +
                ", " + finding.path + ": " + finding.sentence + "\n";
    return text;
}

bool hasErrors(const std::vector<inspect::Finding>& findings)
{
    return std::any_of(findings.begin(), findings.end(),
                       [](const inspect::Finding& finding)
                       { return inspect::getInfo(finding.kind).severity == inspect::Severity::ERROR; });
}

/// Replaces the first appearance of a text.
Bytes replace(Bytes bytes, const std::string& from, const std::string& to)
{
    const auto at = std::search(bytes.begin(), bytes.end(), from.begin(), from.end());
    EXPECT_NE(bytes.end(), at) << from;
    std::copy(to.begin(), to.end(), at);
    return bytes;
}

glo::StandardMaterial& technique(GloScene& scene)
{
    return scene.materials[0].techniques[0];
}

glo::VertexAttribute& attribute(GloScene& scene, size_t index)
{
    return scene.geometries[1].vertices.attributes[index];
}

glo::Channel& channel(GloScene& scene)
{
    return scene.animations[0].channels[0];
}

struct SceneFault
{
    const char* code;
    Change change;
};

const float NOT_A_NUMBER = std::nanf("");

const SceneFault SCENE_FAULTS[] = {
    {"no-scene", [](GloScene& s) { s.scene.reset(), s.animations.clear(); }},
    {"nothing-drawn",
     [](GloScene& s)
     {
         for (auto& geometry : s.geometries)
             geometry.primitiveSets.clear();
     }},
    {"up-axis", [](GloScene& s) { s.upAxis = 3; }},
    {"attribute-bounds", [](GloScene& s) { attribute(s, 1).offset = 1000; }},
    {"attribute-type", [](GloScene& s) { attribute(s, 1).type = 9; }},
    {"no-vertex-data", [](GloScene& s) { s.geometries[0].vertices.data.bytes.clear(); }},
    {"index-bounds", [](GloScene& s) { s.geometries[0].primitiveSets[0].indices->indices[1] = 4; }},
    {"bad-number", [](GloScene& s)
     { s.geometries[0].vertices.data.bytes[3] = s.geometries[0].vertices.data.bytes[2] = 255; }},
    {"bad-number", [](GloScene& s) { s.scene->top.children[0].transform[1].y = NAN; }},
    {"bad-number", [](GloScene& s) { s.skins[0].attachments[1].inverseBindPose[3].x = INFINITY; }},
    {"no-positions", [](GloScene& s) { attribute(s, 0).name = "a_place"; }},
    {"primitive-type", [](GloScene& s) { s.geometries[0].primitiveSets[0].primitive = 7; }},
    {"degenerate", [](GloScene& s) { s.geometries[0].primitiveSets[0].indices->indices[1] = 0; }},
    {"weight-sum", [](GloScene& s) { attribute(s, 2).offset = 0; }},
    {"joint-number", [](GloScene& s) { s.skins[0].attachments.pop_back(); }},
    {"many-joints", [](GloScene& s) { s.skins[0].attachments.resize(21, s.skins[0].attachments[0]); }},
    {"joint-missing", [](GloScene& s) { s.skins[0].attachments[1].joint = "nobody"; }},
    {"joints-per-vertex", [](GloScene& s) { s.skins[0].jointsPerVertex = 5; }},
    {"unknown-geometry", [](GloScene& s) { s.scene->top.children[0].geometry->geometry = "circle"; }},
    {"unknown-skin", [](GloScene& s) { s.scene->top.children[1].skin->skin = "fur"; }},
    {"unknown-light", [](GloScene& s) { s.scene->top.children[3].light->light = "sun"; }},
    {"unknown-camera", [](GloScene& s) { s.scene->top.children[4].camera->camera = "eye"; }},
    {"light-type", [](GloScene& s) { s.lights[0].type = 4; }},
    {"ambient-light", [](GloScene& s) { s.lights[0].type = 0; }},
    {"camera-type", [](GloScene& s) { s.cameras[0].projection = 2; }},
    {"no-material", [](GloScene& s) { s.scene->top.children[0].geometry->materials.clear(); }},
    {"no-technique", [](GloScene& s) { s.materials[1].techniques.clear(); }},
    {"black-textured",
     [](GloScene& s) {
         technique(s).diffuse.colour = {0, 0, 0, 1};
     }},
    {"surface",
     [](GloScene& s) {
         s.surfaces.list = {{9, glo::surface::LINEAR, 0.5f}};
     }},
    {"surface",
     [](GloScene& s) {
         s.surfaces.list = {{0, glo::surface::CUTOFF, 0.0f}};
     }},
    {"surface",
     [](GloScene& s) {
         s.surfaces.list = {{0, glo::surface::BACK, 0.5f}};
     }},
    {"surface",
     [](GloScene& s) {
         s.surfaces.list = {{0, 1u << 31, 0.5f}};
     }},
    {"sampler-type", [](GloScene& s) { technique(s).diffuse.sampler->type = 2; }},
    {"image-missing", [](GloScene& s) { technique(s).diffuse.sampler->image = "gone.png"; }},
    {"image-unreadable", [](GloScene& s) { technique(s).diffuse.sampler->image = "bad.png"; }},
    {"duplicate-name", [](GloScene& s) { s.lights.push_back(s.lights[0]); }},
    {"unused", [](GloScene& s) { s.cameras.emplace_back().name = "spare"; }},
    {"transforms-differ", [](GloScene& s) { s.scene->top.children[0].scale.x = 2; }},
    {"channel-target", [](GloScene& s) { channel(s).targetName = "nobody"; }},
    {"channel-property", [](GloScene& s) { channel(s).property = "visibility"; }},
    {"coefficients",
     [](GloScene& s) {
         s.animations[0].channels = {makeChannel("node", "hip", "scale", {1, 1})};
     }},
    {"key-time", [](GloScene& s)
     { s.animations[0].channels = {makeChannel("light", "lamp", "multiplier", {1}, NOT_A_NUMBER)}; }},
    {"bad-number", [](GloScene& s)
     { s.animations[0].channels = {makeChannel("light", "lamp", "multiplier", {NOT_A_NUMBER}, 1)}; }},
    {"key-order",
     [](GloScene& s) {
         glo::addKey(channel(s), 0.5f, {0, 0, 0});
     }},
    {"never-repeats", [](GloScene& s) { technique(s).diffuse.sampler->image = "odd.png"; }},
    {"loop-range",
     [](GloScene& s) {
         s.animations[0].loopRanges = {{2, 1}};
     }},
    {"references",
     [](GloScene& s)
     {
         s.geometries[0].primitiveSets.resize(3000);
         s.scene->top.children.resize(22, s.scene->top.children[0]);
     }},
};

struct ByteFault
{
    const char* code;
    std::function<Bytes(const Bytes&)> change;
};

Bytes cut(Bytes bytes, size_t count)
{
    bytes.resize(bytes.size() - count);
    return bytes;
}

Bytes append(Bytes bytes, const std::string& text, bool counted)
{
    bytes.insert(bytes.end(), text.begin(), text.end());
    const size_t size = bytes.size() - 8;
    for (size_t i = 0; i < 4 && counted; ++i)
        bytes[4 + i] = uint8_t(size >> (8 * i));
    return bytes;
}

/// Sets a word that lies this many bytes behind a text.
Bytes setWord(Bytes bytes, const std::string& behind, size_t distance, uint8_t value)
{
    const auto at = std::search(bytes.begin(), bytes.end(), behind.begin(), behind.end());
    EXPECT_NE(bytes.end(), at) << behind;
    *(at + ptrdiff_t(behind.size() + distance)) = value;
    return bytes;
}

/// A body of nothing but animations, each inside the one before.
Bytes nest(const Bytes& file)
{
    std::string inner;
    for (int i = 0; i < 600; ++i)
    {
        const auto word = [](size_t value) {
            return std::string({char(value), char(value >> 8), char(value >> 16), 0});
        };
        const std::string counts =
            std::string("\1\0\0\0\0", 5) + word(0) + word(0) + word(inner.empty() ? 0 : 1);
        inner = "ANIM" + word(counts.size() + inner.size()) + counts + inner;
    }
    const auto word = [](size_t value) {
        return std::string({char(value), char(value >> 8), char(value >> 16), 0});
    };
    return append(file, "LANM" + word(4 + inner.size()) + word(1) + inner, true);
}

/// A geometry without vertices whose index buffer holds one byte.
Bytes oddIndices(const Bytes& file)
{
    const std::string set("LGEO\x4b\0\0\0\1\0\0\0GEOM\x3f\0\0\0\2\0\0\0x\0VSET\x10\0\0\0\0\0\0\0\0\0\0\0"
                          "VBUF\0\0\0\0\1\0\0\0PSET\x15\0\0\0\5\0\0\0\1\0\0\0IBUF\5\0\0\0\3\0\0\0!",
                          83);
    return append(file, set, true);
}

const ByteFault BYTE_FAULTS[] = {
    {"not-glo", [](const Bytes& b) { return replace(b, "GLO3", "GLO2"); }},
    {"header-cut", [](const Bytes& b) { return append(b, "SCNE\1", true); }},
    {"chunk-size", [](const Bytes& b) { return append(b, "more", false); }},
    {"chunk-cut", [](const Bytes& b) { return cut(b, 4); }},
    {"unexpected-chunk", [](const Bytes& b) { return replace(b, "VSET", "VSOT"); }},
    {"missing-chunk", [](const Bytes& b) { return setWord(b, "square\0", 13, 9); }},
    {"skipped-chunk", [](const Bytes& b) { return replace(b, "LCAM", "LCOM"); }},
    {"field-cut", [](const Bytes& b) { return setWord(b, "LGHT", 0, 5); }},
    {"bad-text", [](const Bytes& b) { return setWord(b, "scene", 0, 1); }},
    {"trailing-bytes", [](const Bytes& b) { return append(b, "end", true); }},
    {"list-short", [](const Bytes& b) { return append(b, std::string("LGEO\4\0\0\0\1\0\0\0", 12), true); }},
    {"no-info", [](const Bytes& b) { return replace(b, "INFO", "INFU"); }},
    {"late-info",
     [](const Bytes& b) { return append(b, std::string(b.begin() + 12, b.begin() + 12 + 8 + b[16]), true); }},
    {"bad-version", [](const Bytes& b) { return replace(b, "0.14.0", "0.14-0"); }},
    {"new-version", [](const Bytes& b) { return replace(b, "0.14.0", "0.15.0"); }},
    {"unknown-tool", [](const Bytes& b) { return replace(b, "blender", "blander"); }},
    {"second-scene",
     [](const Bytes& b)
     {
         const std::string id = "SCNE";
         return append(b, std::string(std::search(b.begin(), b.end(), id.begin(), id.end()), b.end()), true);
     }},
    {"index-type", [](const Bytes& b) { return setWord(b, "IBUF", 4, 4); }},
    {"odd-indices", [](const Bytes& b) { return oddIndices(b); }},
    {"too-deep", [](const Bytes& b) { return nest(b); }},
    {"index-buffers", [](const Bytes& b) { return setWord(b, "PSET", 8, 2); }},
    {"key-type", [](const Bytes& b) { return setWord(b, std::string("translation\0", 12), 8, 9); }},
    {"keys-cut", [](const Bytes& b) { return setWord(b, std::string("translation\0", 12), 12, 9); }},
};

const struct TextFault
{
    const char* code;
    bool program;
    const char* text;
} TEXT_FAULTS[] = {
    {"text-empty", false, ""},
    {"text-version", false, "2.0\n"},
    {"text-tag", false, "1.0\nculling CULL_NONE"},
    {"text-tag", false, "1.0\nproperty X Vector5f 1"},
    {"text-word", false, "1.0\nculling_mode CULL_SOME"},
    {"text-argument", false, "1.0\nproperty X Vector2f 1"},
    {"program-missing", false, "1.0\nshader_program no.sp$DIFF"},
    {"image-missing", false, "1.0\nproperty X Texture2D no.png"},
    {"source-missing", true, "1.0\nvertex_source_file orv#base.vert"},
    {"uniform-absent", true,
     "1.0\nvertex_source_file a.vert fragment_source_file a.frag\n"
     "uniform u_a A\nuniform u_b B"},
    {"uniform-unbound", true, "1.0\nvertex_source_file a.vert fragment_source_file a.frag\n"},
    {"text-argument", true, "1.0\nvertex_source_file a.vert fragment_source_file a.frag\nuniform u_a\n"},
};

} // namespace

// Faults caught: a code that nothing triggers, a fault found twice, a place outside of the file.
TEST_F(InspectTest, findsEachFault)
{
    m_folder.write("bad.png", "no picture");
    const std::vector<uint8_t> pixels(3 * 2 * 4);
    std::string error;
    ASSERT_TRUE(headless::writePng(m_folder.path("odd.png"), 3, 2, pixels.data(), error)) << error;
    m_folder.write("a.vert", "attribute vec4 a_position; uniform float u_a; void main() {}");
    m_folder.write("a.frag", "void main() {}");
    std::set<std::string> found;
    const auto expect =
        [&](const std::string& code, const std::vector<inspect::Finding>& findings, size_t size)
    {
        size_t count = 0;
        for (const inspect::Finding& finding : findings)
        {
            count += inspect::getInfo(finding.kind).code == code ? 1 : 0;
            EXPECT_LE(finding.offset, size) << describe(findings);
        }
        EXPECT_EQ(1u, count) << code << "\n" << describe(findings);
        found.insert(code);
    };
    EXPECT_EQ("", describe(check(write(makeFullScene()))));
    for (const SceneFault& fault : SCENE_FAULTS)
    {
        GloScene scene = makeFullScene();
        fault.change(scene);
        const Bytes bytes = write(scene);
        expect(fault.code, check(bytes), bytes.size());
    }
    for (const ByteFault& fault : BYTE_FAULTS)
    {
        const Bytes bytes = fault.change(write(makeFullScene()));
        expect(fault.code, check(bytes), bytes.size());
    }
    for (const TextFault& fault : TEXT_FAULTS)
    {
        inspect::Findings findings;
        const auto checkFile = fault.program ? inspect::checkProgramFile : inspect::checkAppearanceFile;
        checkFile(fault.text, m_folder.path(), findings);
        expect(fault.code, findings.getSorted(), std::strlen(fault.text));
    }
    for (const inspect::KindInfo& info : inspect::getAllInfo())
        EXPECT_TRUE(found.count(info.code)) << info.code;
}

// Fault caught: an inspector that accepts a file which the engine refuses, or the other way round.
TEST_F(InspectTest, agreesWithTheEngine)
{
    GloScene scene = makeFullScene();
    technique(scene).diffuse.sampler.reset();
    int refused = 0;
    support::forEachDamage(write(scene), 11,
                           [&](const Bytes& damaged, const std::string& what)
                           {
                               support::LogCapture log;
                               const bool loaded = bool(load(damaged));
                               const auto findings = check(damaged);
                               EXPECT_NE(loaded, hasErrors(findings)) << what << "\n"
                                                                      << log.text() << describe(findings);
                               refused += loaded ? 0 : 1;
                           });
    EXPECT_GT(refused, 1000);
}

// Fault caught: a limit of references that is not the engine's.
TEST_F(InspectTest, agreesWithTheEngineAboutReferences)
{
    int refused = 0;
    int accepted = 0;
    for (const size_t sets : {1000, 1700, 1800, 1850, 1900, 2500, 3000, 3100, 3500})
    {
        for (const size_t joints : {1, 3})
        {
            GloScene scene = makeFullScene();
            technique(scene).diffuse.sampler.reset();
            scene.geometries[1].primitiveSets.resize(sets);
            scene.skins[0].attachments.resize(joints, scene.skins[0].attachments[0]);
            scene.scene->top.children.resize(7, scene.scene->top.children[1]);
            const Bytes bytes = write(scene);
            support::LogCapture log;
            const bool loaded = bool(load(bytes));
            EXPECT_NE(loaded, hasErrors(check(bytes))) << sets << " sets, " << joints << " joints";
            ++(loaded ? accepted : refused);
        }
    }
    EXPECT_LT(2, refused);
    EXPECT_LT(2, accepted);
}

// Faults caught: a name in a file that writes lines of its own or moves the cursor, "1 geometries" and "at 0, :".
TEST_F(InspectTest, printsPlainLines)
{
    GloScene scene = makeFullScene();
    scene.materials.emplace_back().name = "\x1b[2J\nb.glo: error \xc3\xbc \xe2\x80\xae \xc2\x9b \xff";
    scene.geometries.resize(1);
    inspect::Report report;
    report.path = "a.glo";
    report.kind = "scene";
    const Bytes bytes = write(scene);
    report.scene = inspect::scanGlo(bytes, report.findings);
    inspect::checkGlo(report.scene, m_folder.path(), report.findings);
    report.findings.add(inspect::Kind::NO_INFO, 0, "", "nothing");
    testing::internal::CaptureStdout();
    inspect::printTotals(report);
    inspect::printFindings(report);
    const std::string text = testing::internal::GetCapturedStdout();
    EXPECT_NE(std::string::npos,
              text.find("\\x1b[2J\\x0ab.glo: error \xc3\xbc \\xe2\\x80\\xae \\xc2\\x9b \\xff"))
        << text;
    EXPECT_EQ(std::string::npos, text.find("\nb.glo")) << text;
    EXPECT_EQ(std::string::npos, text.find('\x1b')) << text;
    EXPECT_NE(std::string::npos, text.find(", 1 geometry (0 vertices), ")) << text;
    EXPECT_NE(std::string::npos, text.find(" at 0: nothing\n")) << text;
}

// Fault caught: figures that are not those of what the engine does.
TEST_F(InspectTest, forecastsWhatTheEngineDoes)
{
    const std::vector<uint8_t> pixels(64 * 32 * 4, 255);
    std::string error;
    ASSERT_TRUE(headless::writePng(m_folder.path("a.png"), 64, 32, pixels.data(), error)) << error;
    GloScene scene = makeFullScene();
    technique(scene).diffuse.sampler->image = "a.png";
    technique(scene).diffuse.colour = {0, 0, 0, 1};
    scene.animations[0].channels.push_back(makeChannel("material", "red", "diffuse", {1, 0, 0}));
    const Bytes bytes = write(scene);
    inspect::Findings findings;
    const inspect::Forecast forecast = inspect::forecast(inspect::scanGlo(bytes, findings), m_folder.path());

    uint64_t textureBytes = 0, bufferBytes = 0;
    std::set<std::string> programs;
    {
        glcalls::Scope gl;
        GLsizei width = 0, height = 0;
        GLenum format = 0;
        const auto level = [&] { return uint64_t(width) * uint64_t(height) * (format == GL_RGB ? 3 : 4); };
        glcalls::replace(glTexImage2D,
                         [&](GLenum target, GLint mip, GLint internal, GLsizei w, GLsizei h, GLint border,
                             GLenum f, GLenum type, const void* data)
                         {
                             width = w, height = h, format = f;
                             textureBytes += level();
                             glcalls::real(glTexImage2D)(target, mip, internal, w, h, border, f, type, data);
                         });
        glcalls::replace(glGenerateMipmap,
                         [&](GLenum target)
                         {
                             for (; width > 1 || height > 1; textureBytes += level())
                                 width = std::max(1, width / 2), height = std::max(1, height / 2);
                             glcalls::real(glGenerateMipmap)(target);
                         });
        glcalls::replace(glBufferData,
                         [&](GLenum target, GLsizeiptr size, const void* data, GLenum usage)
                         {
                             bufferBytes += uint64_t(size);
                             glcalls::real(glBufferData)(target, size, data, usage);
                         });
        const Glo::Ptr loaded = load(bytes);
        ASSERT_TRUE(loaded);
        for (const char* wanted : {"orv#max_pvl.sp$DIFF", "orv#max_pvl.sp$DIFF$SKIN"})
        {
            EXPECT_TRUE(m_pool->getShaderProgramCache()->exists(wanted));
            programs.insert(wanted);
        }
    }
    EXPECT_NEAR(double(bufferBytes), double(forecast.vertexBytes + forecast.indexBytes),
                0.02 * double(bufferBytes));
    EXPECT_NEAR(double(textureBytes), double(forecast.textureBytes), 0.02 * double(textureBytes));
    ASSERT_EQ(programs.size(), forecast.programs.size());
    for (const inspect::Forecast::Program& program : forecast.programs)
        EXPECT_TRUE(programs.count(program.name)) << program.name;
}
