#include "glotest.h"

#include "support/damage.h"
#include "support/logcapture.h"
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

/// The information of a file by Blender.
Bytes info(const char* version = "0.14.0")
{
    return chunk("INFO", join({text(version), text("1"), text("2"), text("3"), text("blender2.63.0")}));
}

Bytes oldInfo(const char* version)
{
    return chunk("INFO", join({text(version), text("1"), text("2"), text("3")}));
}

/// A file with the up-axis option 1.
Bytes file(const std::vector<Bytes>& chunks)
{
    return chunk("GLO3", join({word(1), join(chunks)}));
}

const char* sizeMessage(const char* id, unsigned consumed, unsigned size)
{
    static char message[100];
    std::snprintf(message, sizeof(message), "Size of %s chunk data (%u) does not match expected size (%u)",
                  id, consumed, size);
    return message;
}

using GloFileTest = GloTest;

} // namespace

// Fault caught: a damaged or foreign container that is accepted, refused with a misleading message, or read
// outside its bytes.
TEST_F(GloFileTest, container)
{
    const Bytes nodeRest = join({Bytes(16 * 4), Bytes(3 * 4), Bytes(4 * 4), Bytes(3 * 4), Bytes(4 * 4)});
    const Bytes node = chunk("NODE", join({text("n"), text("n"), nodeRest, word(0)}));
    const Bytes unknown = chunk("WHAT", Bytes(5));
    const auto fieldError = [](const char* label)
    { return "Error reading: " + std::string(label) + " in file: test.glo "; };
    const auto inGeometry = [](const Bytes& sets)
    {
        const Bytes vertices = chunk("VSET", join({word(0), word(0), chunk("VBUF", {})}));
        return file(
            {info(), chunk("LGEO", join({word(1), chunk("GEOM", join({text("g"), vertices, sets}))}))});
    };
    const auto inMaterial = [](const Bytes& content) {
        return file({info(), chunk("LMAT", join({word(1), chunk("MATL", content)}))});
    };
    const auto inAnimation = [](const Bytes& content) {
        return file({info(), chunk("LANM", join({word(1), chunk("ANIM", join({text("a"), content}))}))});
    };
    const auto inChannel = [&inAnimation](const Bytes& content)
    {
        const Bytes names = join({text("node"), text("n"), text("scale"), word(0)});
        return inAnimation(join({word(0), word(1), chunk("CHAN", join({names, content}))}));
    };

    const struct
    {
        const char* what;
        Bytes file;
        std::string message; ///< empty: loads
    } cases[] = {
        {"no more than a body", file({}), ""},
        {"information alone", file({info()}), ""},
        {"a scene", file({info(), chunk("SCNE", join({text("s"), node}))}), ""},
        {"nothing", {}, "Failed to read chunk ID"},
        {"an ID", word(glo::chunkId("GLO3")), "Failed to read GLO3 chunk size"},
        {"another ID", chunk("RIFF", {}), "Chunk ID \"RIFF\" does not match expected ID(s): \"GLO3\""},
        {"no option", chunk("GLO3", {}), fieldError("up-axis option file ")},
        {"the body's size is too large", sized("GLO3", 5, word(1)), sizeMessage("GLO3", 4, 5)},
        {"the body's size is too small", sized("GLO3", 4, join({word(1), info()})),
         sizeMessage("GLO3", 4 + unsigned(info().size()), 4)},
        {"an unknown chunk", file({info(), unknown}), ""},
        {"an unknown chunk beyond the end", file({info(), sized("WHAT", 6, Bytes(5))}),
         sizeMessage("WHAT", 5, 6)},
        {"an unknown chunk of four gigabytes", file({info(), sized("WHAT", 0xfffffff8u, Bytes(5))}),
         sizeMessage("WHAT", 5, 0xfffffff8u)},
        {"among geometries", file({info(), chunk("LGEO", join({word(1), unknown}))}), ""},
        {"among materials", file({info(), chunk("LMAT", join({word(1), unknown}))}),
         "Chunk ID \"WHAT\" does not match expected ID(s): \"MATL\""},
        {"among animations", file({info(), chunk("LANM", join({word(1), unknown}))}),
         "Chunk ID \"WHAT\" does not match expected ID(s): \"ANIM\""},
        {"a count of four billion at the end", file({info(), chunk("LLGT", word(0xffffffffu))}), ""},
        {"four billion materials", file({info(), chunk("LMAT", word(0xffffffffu))}),
         "Failed to read chunk ID"},
        {"bytes left over in a chunk", inMaterial(join({text("m"), word(0), word(0)})),
         sizeMessage("MATL", 10, 14)},
        {"a material", inMaterial(join({text("m"), word(0)})), ""},
        {"text of length 0", inMaterial(word(0)), fieldError("material name ")},
        {"text of length 1025", inMaterial(join({word(1025), Bytes(1025), word(0)})),
         fieldError("material name ")},
        {"text of length 1024", inMaterial(join({word(1024), Bytes(1024), word(0)})), ""},
        {"text without its end", inMaterial(join({word(2), {'a', 'b'}, word(0)})),
         fieldError("material name ")},
        {"version 0.15.0", file({info("0.15.0")}), "File version not supported in test.glo"},
        {"version 0.14.1", file({info("0.14.1")}), "File version not supported in test.glo"},
        {"version 0.14", file({info("0.14")}), "Incorrect glo version file format in test.glo"},
        {"version x", file({info("x")}), "Incorrect glo version file format in test.glo"},
        {"all versions are read before one is checked", file({chunk("INFO", join({text("x"), text("1")}))}),
         fieldError("zunCollada version")},
        {"an old file names no tool", file({oldInfo("0.12.5")}), ""},
        {"a new file names its tool", file({oldInfo("0.13.0")}), fieldError("Authoring tool")},
        {"an unknown tool",
         file({chunk("INFO", join({text("0.14.0"), text("1"), text("2"), text("3"), text("vi")}))}),
         "Only 3DS-Max 2012 and Blender 2.63.0 are supported as authoring tools (test.glo)"},
        {"old nodes are shorter",
         file({oldInfo("0.10.0"),
               chunk("SCNE", join({text("s"), chunk("NODE", join({text("n"), Bytes(3 * 4), Bytes(4 * 4),
                                                                  Bytes(3 * 4), Bytes(2 * 4), word(0)}))}))}),
         ""},
        {"two scenes",
         file({info(), chunk("SCNE", join({text("s"), node})), chunk("SCNE", join({text("s"), node}))}),
         "More than one scene in test.glo"},
        {"two index buffers", inGeometry(join({word(1), chunk("PSET", join({word(5), word(2)}))})),
         "Unexpected index buffer chunk count in test.glo"},
        {"32-bit indices",
         inGeometry(join({word(1), chunk("PSET", join({word(5), word(1), chunk("IBUF", word(5))}))})),
         "Only 16-bit indices supported (test.glo)"},
        {"vertices of four gigabytes",
         file({info(),
               chunk("LGEO",
                     join({word(1),
                           chunk("GEOM", join({text("g"),
                                               chunk("VSET", join({word(0), word(0),
                                                                   sized("VBUF", 0xfffffff0u, {})}))}))}))}),
         "vertex buffer read failed in test.glo"},
        {"keys whose size wraps", inChannel(join({word(0x3fffffffu), word(6), word(0x40000001u)})),
         "Failed to read animation data in test.glo"},
        {"an unknown key type", inChannel(join({word(3), word(9), word(0)})), "Unexpected type in test.glo"},
        {"the second end of a loop", inAnimation(join({word(1), word(0)})), fieldError("loop start ")},
    };
    for (const auto& item : cases)
    {
        LogCapture log;
        const Glo::Ptr loaded = load(item.file);
        EXPECT_EQ(item.message.empty(), bool(loaded)) << item.what << log.text();
        EXPECT_EQ(item.message.empty() ? 0 : 1, log.count('E')) << item.what << log.text();
        if (!item.message.empty())
        {
            EXPECT_EQ(1, log.countMessage(item.message)) << item.what << log.text();
            for (const LogCapture::Record& record : log.records())
                EXPECT_EQ("glofile", record.source);
        }
    }
}

// Fault caught: a stack that overflows on nested chunks.
TEST_F(GloFileTest, depthIsBounded)
{
    const auto nested = [](int depth)
    {
        glo::NodeData node = makeNode("leaf");
        for (int i = 1; i < depth; ++i)
        {
            glo::NodeData outer = makeNode("node");
            outer.children.push_back(std::move(node));
            node = std::move(outer);
        }
        glo::GloScene scene;
        scene.scene = glo::SceneData{"deep", std::move(node)};
        return scene;
    };
    EXPECT_TRUE(load(nested(glo::MAX_CHUNK_DEPTH - 2)));

    std::vector<uint8_t> bytes;
    std::string error;
    EXPECT_FALSE(glo::writeGlo(nested(glo::MAX_CHUNK_DEPTH - 1), bytes, error));

    const Bytes start = join({text("n"), text("n"), Bytes(16 * 4 + 10 * 4 + 4 * 4), word(1)});
    Bytes deep = join({text("s")});
    for (int i = 0; i < 2000; ++i)
        deep = join({deep, word(glo::chunkId("NODE")), word(0x7fffffff), start});
    LogCapture log;
    EXPECT_FALSE(load(file({info(), chunk("SCNE", deep)})));
    EXPECT_EQ(1, log.countMessage("Chunks lie more than 512 deep in test.glo"));
}

// Fault caught: a cut or spoilt file that crashes, hangs, loads in part, or leaves something under the parent.
TEST_F(GloFileTest, damage)
{
    const Bytes whole = write(makeFullScene());
    ASSERT_TRUE(load(whole));
    m_root = makeShared<SceneNode>();

    support::forEachCut(whole,
                        [&](const Bytes& cut, size_t length)
                        {
                            LogCapture log;
                            EXPECT_FALSE(load(cut)) << length;
                            EXPECT_EQ(1, log.count('E')) << length << log.text();
                        });
    EXPECT_EQ(0u, m_root->getChildCount());

    support::forEachSpoiledByte(
        whole,
        [&](const Bytes& spoiled, size_t offset)
        {
            LogCapture log;
            const unsigned count = m_root->getChildCount();
            const bool loaded = bool(load(spoiled));
            EXPECT_EQ(count + (loaded ? 1 : 0), m_root->getChildCount()) << offset;
            EXPECT_TRUE(loaded || log.count('E') > 0) << offset;
        },
        5);
}

// Fault caught: a file that ends where its body ends but is refused, as files report their end later than memory
// does; a cut one that is accepted.
TEST_F(GloFileTest, fromDirectory)
{
    support::TempDir directory;
    const Bytes whole = write(makeFullScene());
    directory.write("whole.glo", whole);
    directory.write("spare.glo", join({whole, {0, 0}}));
    m_pool->registerSource(makeShared<FileStreamSource>(directory.path().c_str()));

    EXPECT_TRUE(loadGloFile(*m_pool, m_root, "whole.glo"));
    LogCapture log;
    EXPECT_FALSE(loadGloFile(*m_pool, m_root, "spare.glo"));
    EXPECT_FALSE(loadGloFile(*m_pool, m_root, "missing.glo"));
    EXPECT_EQ(1, log.countMessage("GLO file missing.glo cannot be opened"));
    support::forEachCut(
        whole,
        [&](const Bytes& cut, size_t length)
        {
            directory.write("cut.glo", cut);
            log.clear();
            EXPECT_FALSE(loadGloFile(*m_pool, m_root, "cut.glo")) << length;
            EXPECT_EQ(1, log.count('E')) << length << log.text();
        },
        7);
    EXPECT_EQ(1u, m_root->getChildCount());
}

// Fault caught: fields read, or left out, in the wrong versions.
TEST_F(GloFileTest, versions)
{
    const struct
    {
        const char* version;
        const char* program;
        float intensity; ///< 2.5 in the file, 1 where a file does not hold it
        float x;         ///< 5 by the matrix, 1 by the translation
        int cameraCount;
        bool normalised; ///< the file says no
        float ambient;   ///< of the tool that a file counts as coming from
    } cases[] = {
        {"0.1.0", "orv#fallback.sp", 1.0f, 1.0f, 0, true, 0.1f},
        {"0.6.9", "orv#fallback.sp", 1.0f, 1.0f, 0, true, 0.1f},
        {"0.7.0", "orv#max_pvl.sp$INVSQROOT$DIFF", 1.0f, 1.0f, 0, true, 0.1f},
        {"0.9.9", "orv#max_pvl.sp$INVSQROOT$DIFF", 1.0f, 1.0f, 0, true, 0.1f},
        {"0.10.0", "orv#max_pvl.sp$INVSQROOT$DIFF", 2.5f, 1.0f, 0, true, 0.1f},
        {"0.11.0", "orv#max_pvl.sp$INVSQROOT$DIFF", 2.5f, 1.0f, 1, true, 0.1f},
        {"0.12.0", "orv#max_pvl.sp$INVSQROOT$DIFF", 2.5f, 5.0f, 1, true, 0.1f},
        {"0.12.5", "orv#max_pvl.sp$INVSQROOT$DIFF", 2.5f, 5.0f, 1, true, 0.1f},
        {"0.13.0", "orv#max_pvl.sp$DIFF", 2.5f, 5.0f, 1, true, 0.0f},
        {"0.13.9", "orv#max_pvl.sp$DIFF", 2.5f, 5.0f, 1, true, 0.0f},
        {"0.14.0", "orv#max_pvl.sp$DIFF", 2.5f, 5.0f, 1, false, 0.0f},
    };
    for (const auto& item : cases)
    {
        glo::GloScene scene;
        scene.info.gloVersion = item.version;
        scene.geometries.push_back(makeSquareGeometry("square"));
        scene.materials.push_back(makeMaterial("red", Vector4f(1, 0, 0, 1)));
        glo::LightDefinition lamp;
        lamp.name = "lamp";
        lamp.intensity = 2.5f;
        lamp.attenuated = 0;
        scene.lights.push_back(lamp);
        glo::NodeData top = makeNode("top");
        top.geometry = glo::GeometryReference{"square", {"red"}};
        top.translation = Vector3f(1, 0, 0);
        top.transform = translationMatrix(Vector3f(5, 0, 0));
        glo::NodeData light = makeNode("light");
        light.light = glo::LightReference{"lamp"};
        top.children.push_back(light);
        if (item.cameraCount > 0)
        {
            scene.cameras.push_back({});
            glo::NodeData camera = makeNode("camera");
            camera.camera = glo::CameraReference{""};
            top.children.push_back(camera);
        }
        scene.scene = glo::SceneData{"scene", top};

        const Glo::Ptr loaded = load(scene);
        ASSERT_TRUE(loaded) << item.version;
        const Solid* solid = static_cast<const Solid*>(loaded->getTopNode().get());
        EXPECT_TRUE(m_pool->getShaderProgramCache()->exists(item.program)) << item.version;
        EXPECT_EQ(m_pool->getShaderProgramCache()->get(item.program),
                  solid->getAppearance()->getShaderProgram())
            << item.version;
        EXPECT_EQ(item.intensity, loaded->getLight(0)->getIntensity()) << item.version;
        EXPECT_EQ(item.intensity == 1.0f, loaded->getLight(0)->isAttenuated()) << item.version;
        EXPECT_EQ(item.x, loaded->getTopNode()->getWorldTransform()[3].x) << item.version;
        EXPECT_EQ(item.cameraCount, loaded->getCameraCount()) << item.version;
        EXPECT_EQ(item.normalised, solid->getMesh()->getVertexBuffer()->findAttrib("a_position")->normalised)
            << item.version;
        EXPECT_EQ(item.ambient, loaded->getLight(0)->getAmbientLevel()) << item.version;
    }
}
