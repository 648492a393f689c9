#include "glotest.h"

#include "support/tempdir.h"

#include "orv/appearance.h"
#include "orv/filestreamsource.h"
#include "orv/light.h"
#include "orv/mesh.h"
#include "orv/shaderprogramcache.h"
#include "orv/solid.h"

using namespace orv;
using support::LogCapture;

namespace
{

using Bytes = std::vector<uint8_t>;

Bytes word(uint32_t value)
{
    return {uint8_t(value), uint8_t(value >> 8), uint8_t(value >> 16), uint8_t(value >> 24)};
}

Bytes text(const std::string& characters)
{
    Bytes bytes = word(uint32_t(characters.size() + 1));
    bytes.insert(bytes.end(), characters.c_str(), characters.c_str() + characters.size() + 1);
    return bytes;
}

Bytes join(const std::vector<Bytes>& pieces)
{
    Bytes all;
    for (const Bytes& piece : pieces)
        all.insert(all.end(), piece.begin(), piece.end());
    return all;
}

Bytes sized(const char (&id)[5], uint32_t size, const Bytes& data)
{
    return join({word(glo::chunkId(id)), word(size), data});
}

Bytes chunk(const char (&id)[5], const Bytes& data)
{
    return sized(id, uint32_t(data.size()), data);
}

/// Files before 0.13.0 name no tool.
Bytes oldInfo(const char* version, const Bytes& tool = {})
{
    return chunk("INFO", join({text(version), text("1"), text("2"), text("3"), tool}));
}

Bytes info(const char* version = "0.14.0", const char* tool = "blender2.63.0")
{
    return oldInfo(version, text(tool));
}

/// A file with the up-axis option 1.
Bytes file(const std::vector<Bytes>& chunks)
{
    return chunk("GLO3", join({word(1), join(chunks)}));
}

std::string sizeError(const char* id, unsigned consumed, unsigned size)
{
    return "Size of " + std::string(id) + " chunk data (" + std::to_string(consumed) +
           ") does not match expected size (" + std::to_string(size) + ")";
}

std::string fieldError(const char* label)
{
    return "Error reading: " + std::string(label) + " in file: test.glo ";
}

std::string idError(const char* met, const char* expected)
{
    return "Chunk ID \"" + std::string(met) + "\" does not match expected ID(s): \"" + expected + "\"";
}

using GloFileTest = GloTest;

} // namespace

// Fault caught: a damaged or foreign container that is accepted, refused with a misleading message, or read
// outside its bytes.
TEST_F(GloFileTest, container)
{
    const Bytes nodeRest = join({text("n"), Bytes((16 + 3 + 4 + 3 + 4) * 4), word(0)});
    const Bytes scene = chunk("SCNE", join({text("s"), chunk("NODE", join({text("n"), nodeRest}))}));
    const Bytes oldNode = chunk("NODE", join({text("n"), Bytes((3 + 4 + 3 + 2) * 4), word(0)}));
    const Bytes unknown = chunk("WHAT", Bytes(5));
    const auto inList = [](const char(&list)[5], const char(&id)[5], const Bytes& content) {
        return file({info(), chunk(list, join({word(1), chunk(id, content)}))});
    };
    const auto inMaterial = [&](const Bytes& content) { return inList("LMAT", "MATL", content); };
    const auto inGeometry = [&](const Bytes& sets, const Bytes& data) {
        return inList("LGEO", "GEOM", join({text("g"), chunk("VSET", join({word(0), word(0), data})), sets}));
    };
    const auto inSet = [&](const Bytes& content) {
        return inGeometry(join({word(1), chunk("PSET", join({word(5), content}))}), chunk("VBUF", {}));
    };
    const auto inAnimation = [&](const Bytes& content) {
        return inList("LANM", "ANIM", join({text("a"), content}));
    };
    const auto inChannel = [&](uint32_t coefficients, uint32_t type, uint32_t keys)
    {
        const Bytes names = join({text("node"), text("n"), text("scale"), word(0)});
        const Bytes numbers = join({word(coefficients), word(type), word(keys)});
        return inAnimation(join({word(0), word(1), chunk("CHAN", join({names, numbers}))}));
    };
    const std::string materialName = fieldError("material name ");

    const struct
    {
        const char* what;
        Bytes file;
        std::string error;
    } cases[] = {
        {"no more than a body", file({}), ""},
        {"a scene", file({info(), scene}), ""},
        {"nothing", {}, "Failed to read chunk ID"},
        {"an ID", word(glo::chunkId("GLO3")), "Failed to read GLO3 chunk size"},
        {"another ID", chunk("RIFF", {}), idError("RIFF", "GLO3")},
        {"no option", chunk("GLO3", {}), fieldError("up-axis option file ")},
        {"the body's size is too large", sized("GLO3", 5, word(1)), sizeError("GLO3", 4, 5)},
        {"the body's size is too small", sized("GLO3", 4, join({word(1), unknown})),
         sizeError("GLO3", 17, 4)},
        {"an unknown chunk", file({info(), unknown}), ""},
        {"one beyond the end", file({info(), sized("WHAT", 6, Bytes(5))}), sizeError("WHAT", 5, 6)},
        {"one of four gigabytes", file({sized("WHAT", 0xfffffff8u, Bytes(5))}),
         sizeError("WHAT", 5, 0xfffffff8u)},
        {"among geometries", inList("LGEO", "WHAT", {}), ""},
        {"among materials", inList("LMAT", "WHAT", {}), idError("WHAT", "MATL")},
        {"among animations", inList("LANM", "WHAT", {}), idError("WHAT", "ANIM")},
        {"a count of four billion at the end", file({info(), chunk("LLGT", word(0xffffffffu))}), ""},
        {"four billion materials", file({info(), chunk("LMAT", word(0xffffffffu))}),
         "Failed to read chunk ID"},
        {"bytes left over", inMaterial(join({text("m"), word(0), word(0)})), sizeError("MATL", 10, 14)},
        {"text of length 0", inMaterial(word(0)), materialName},
        {"text of length 1025", inMaterial(join({word(1025), Bytes(1025), word(0)})), materialName},
        {"text of length 1024", inMaterial(join({word(1024), Bytes(1024), word(0)})), ""},
        {"text without its end", inMaterial(join({word(2), {'a', 'b'}, word(0)})), materialName},
        {"version 0.15.0", file({info("0.15.0")}), "File version not supported in test.glo"},
        {"version 0.14.1", file({info("0.14.1")}), "File version not supported in test.glo"},
        {"version 0.14", file({info("0.14")}), "Incorrect glo version file format in test.glo"},
        {"version x", file({info("x")}), "Incorrect glo version file format in test.glo"},
        {"all versions are read before one is checked", file({chunk("INFO", join({text("x"), text("1")}))}),
         fieldError("zunCollada version")},
        {"an old file names no tool", file({oldInfo("0.12.5")}), ""},
        {"a new file names its tool", file({oldInfo("0.13.0")}), fieldError("Authoring tool")},
        {"an unknown tool", file({info("0.14.0", "vi")}),
         "Only 3DS-Max 2012 and Blender 2.63.0 are supported as authoring tools (test.glo)"},
        {"old nodes are shorter", file({oldInfo("0.10.0"), chunk("SCNE", join({text("s"), oldNode}))}), ""},
        {"two scenes", file({info(), scene, scene}), "More than one scene in test.glo"},
        {"two index buffers", inSet(word(2)), "Unexpected index buffer chunk count in test.glo"},
        {"32-bit indices", inSet(join({word(1), chunk("IBUF", word(5))})),
         "Only 16-bit indices supported (test.glo)"},
        {"vertices of four gigabytes", inGeometry({}, sized("VBUF", 0xfffffff0u, {})),
         "vertex buffer read failed in test.glo"},
        {"keys whose size wraps", inChannel(0x3fffffffu, 6, 0x40000001u),
         "Failed to read animation data in test.glo"},
        {"an unknown key type", inChannel(3, 9, 0), "Unexpected type in test.glo"},
        {"the second end of a loop", inAnimation(join({word(1), word(0)})), fieldError("loop start ")},
    };
    for (const auto& item : cases)
        expectLoad(item.file, item.error, item.what);

    LogCapture log;
    load(Bytes());
    EXPECT_EQ("glofile", log.records().at(0).source);
}

// Fault caught: a stack that overflows on nested chunks.
TEST_F(GloFileTest, depthIsBounded)
{
    const auto nested = [](int depth)
    {
        glo::NodeData node = makeNode("leaf");
        for (int i = 1; i < depth; ++i)
            node = makeNode("node", {node});
        glo::GloScene scene;
        scene.scene = glo::SceneData{"deep", node};
        return scene;
    };
    EXPECT_TRUE(load(nested(glo::MAX_CHUNK_DEPTH - 2)));
    Bytes bytes;
    std::string error;
    EXPECT_FALSE(glo::writeGlo(nested(glo::MAX_CHUNK_DEPTH - 1), bytes, error));

    const Bytes start = join({text("n"), text("n"), Bytes(16 * 4 + 10 * 4 + 4 * 4), word(1)});
    Bytes deep = join({text("s")});
    for (int i = 0; i < 2000; ++i)
        deep = join({deep, word(glo::chunkId("NODE")), word(0x7fffffff), start});
    expectLoad(file({info(), chunk("SCNE", deep)}), "Chunks lie more than 512 deep in test.glo", "");
}

// Fault caught: a file in a directory, whose end is reported later than in memory, that is refused when whole or
// accepted when cut.
TEST_F(GloFileTest, filesInDirectories)
{
    const Bytes whole = write(makeFullScene());
    support::TempDir directory;
    directory.write("whole.glo", whole);
    directory.write("spare.glo", join({whole, {0, 0}}));
    m_pool->registerSource(makeShared<FileStreamSource>(directory.path().c_str()));
    EXPECT_TRUE(loadGloFile(*m_pool, nullptr, "whole.glo"));
    LogCapture log;
    EXPECT_FALSE(loadGloFile(*m_pool, m_root, "spare.glo"));
    EXPECT_FALSE(loadGloFile(*m_pool, m_root, "missing.glo"));
    EXPECT_EQ(1, log.countMessage("GLO file missing.glo cannot be opened"));
    EXPECT_TRUE(log.contains(", GloTestSource")) << log.text();

    for (size_t length = 0; length < whole.size(); length += 7)
    {
        log.clear();
        directory.write("cut.glo", Bytes(whole.begin(), whole.begin() + ptrdiff_t(length)));
        EXPECT_FALSE(loadGloFile(*m_pool, m_root, "cut.glo")) << length;
        EXPECT_EQ(1, log.count('E')) << length << log.text();
    }
    EXPECT_EQ(0u, m_root->getChildCount());
}

// Fault caught: fields read, or left out, in the wrong versions.
TEST_F(GloFileTest, versions)
{
    const std::string PVL = "orv#max_pvl.sp$DIFF", PVL_MAX = "orv#max_pvl.sp$INVSQROOT$DIFF";
    const struct
    {
        const char* version;
        std::string program;
        float intensity; ///< 2.5 in the file, 1 where a file does not hold it
        float x;         ///< 5 by the matrix, 1 by the translation
        int cameraCount;
        bool normalised; ///< the file says no
        float ambient;   ///< of the tool that a file counts as coming from
    } cases[] = {
        {"0.6.9", "orv#fallback.sp", 1, 1, 0, true, 0.1f}, {"0.7.0", PVL_MAX, 1, 1, 0, true, 0.1f},
        {"0.9.9", PVL_MAX, 1, 1, 0, true, 0.1f},           {"0.10.0", PVL_MAX, 2.5f, 1, 0, true, 0.1f},
        {"0.11.0", PVL_MAX, 2.5f, 1, 1, true, 0.1f},       {"0.12.0", PVL_MAX, 2.5f, 5, 1, true, 0.1f},
        {"0.12.5", PVL_MAX, 2.5f, 5, 1, true, 0.1f},       {"0.13.0", PVL, 2.5f, 5, 1, true, 0.0f},
        {"0.13.9", PVL, 2.5f, 5, 1, true, 0.0f},           {"0.14.0", PVL, 2.5f, 5, 1, false, 0.0f},
    };
    for (const auto& item : cases)
    {
        SCOPED_TRACE(item.version);
        glo::GloScene scene;
        scene.info.gloVersion = item.version;
        scene.geometries.push_back(makeSquareGeometry("square"));
        scene.materials.push_back(makeMaterial("red", Vector4f(1, 0, 0, 1)));
        glo::LightDefinition& lamp = scene.lights.emplace_back();
        lamp.name = "lamp";
        lamp.intensity = 2.5f;
        lamp.attenuated = 0;
        glo::NodeData top = makeSolidNode("top", "square", "red");
        top.translation = Vector3f(1, 0, 0);
        top.transform = translationMatrix(Vector3f(5, 0, 0));
        top.children = {makeLightNode("light")};
        if (item.cameraCount > 0)
        {
            scene.cameras.push_back({});
            top.children.push_back(makeNode("camera", &glo::NodeData::camera, glo::CameraReference{""}));
        }
        scene.scene = glo::SceneData{"scene", top};

        const Glo::Ptr loaded = load(scene);
        ASSERT_TRUE(loaded);
        const Solid* solid = static_cast<const Solid*>(loaded->getTopNode().get());
        const auto& programs = m_pool->getShaderProgramCache();
        EXPECT_TRUE(programs->exists(item.program.c_str()));
        EXPECT_EQ(programs->get(item.program.c_str()), solid->getAppearance()->getShaderProgram());
        const Light& light = *loaded->getLight(0);
        EXPECT_EQ(item.intensity, light.getIntensity());
        EXPECT_EQ(item.intensity == 1.0f, light.isAttenuated());
        EXPECT_EQ(item.ambient, light.getAmbientLevel());
        EXPECT_EQ(item.x, loaded->getTopNode()->getWorldTransform()[3].x);
        EXPECT_EQ(item.cameraCount, loaded->getCameraCount());
        EXPECT_EQ(item.normalised, solid->getMesh()->getVertexBuffer()->findAttrib("a_position")->normalised);
    }
}
