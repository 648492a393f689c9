#include "converttest.h"

#include "convert/guard.h"

#include "headless/png.h"

#include "orv/scenenode.h"

#include <nlohmann/json.hpp>

#include <filesystem>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

using namespace orv;

// Fault caught: a failure that exits with 0, does not name the file, or leaves something behind.
TEST_F(ConvertTest, failuresWriteNothing)
{
    m_folder.write("broken.gltf", std::string("{\"asset\":"));
    m_folder.write("noise.xyz", std::string("noise"));
    m_folder.write("tri.obj", std::string("v 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n"));
    const std::vector<std::string> before = m_folder.list();
    const struct
    {
        const char* arguments;
        int exitCode;
        const char* message;
    } cases[] = {
        {"--help", 0, "orv-convert walk.fbx"},
        {"", 2, "MODEL"},
        {"tri.obj", 2, "OUT.glo"},
        {"tri.obj out.txt", 2, "out.txt: the output's name has to end in .glo"},
        {"tri.obj out.glo --fps 0", 2, "fps"},
        {"missing.obj out.glo", 1, "missing.obj: No such file"},
        {". out.glo", 2, ". is a folder and out.glo a scene"},
        {"broken.gltf out.glo", 1, "broken.gltf: "},
        {"noise.xyz out.glo", 1, "noise.xyz: "},
        {"tri.obj nowhere/out.glo", 1, "nowhere/out.glo: No such file"},
        {"tri.obj out.glo --report nowhere/out.json", 1, "nowhere/out.json: No such file"},
        {"tri.obj out.glo --up w", 2, "up"},
        {"tri.obj out.glo --scale 0", 2, "scale"},
        {"tri.obj out.glo --scale nan", 2, "scale"},
        {"tri.obj out.glo --max-texture-size 0", 2, "max-texture-size"},
        {"tri.obj out.glo --time-limit 0.000001", 1,
         "tri.obj: not done after 1e-06 seconds (see --time-limit)"},
        {"tri.obj out.glo --dry-run", 0, "out.glo: "},
    };
    for (const auto& item : cases)
    {
        const Outcome outcome = convert(item.arguments);
        EXPECT_EQ(item.exitCode, outcome.exitCode) << item.arguments << "\n" << outcome.output;
        EXPECT_NE(std::string::npos, outcome.output.find(item.message)) << outcome.output;
        EXPECT_EQ(before, m_folder.list()) << item.arguments;
    }
}

// Fault caught: names in a model that write lines of the report, or move the terminal's cursor.
TEST_F(ConvertTest, printsPlainLines)
{
    const std::string name = "\\u001b[2J\\nb.glo: lost";
    const std::string start =
        R"({"asset":{"version":"2.0"},"scene":0,"scenes":[{"nodes":[0]}],"nodes":[{"mesh":0}],)";
    const std::string mesh =
        R"("meshes":[{"name":")" + name + R"(","primitives":[{"attributes":{"POSITION":0,"_A":0}}]}],)";
    const std::string end =
        R"("accessors":[{"componentType":5126,"count":3,"type":"VEC3","bufferView":0}],)"
        R"("bufferViews":[{"buffer":0,"byteLength":36}],)"
        R"("buffers":[{"uri":"data:;base64,AAAAAAAAAAAAAAAAAACAPwAAAAAAAAAAAAAAAAAAgD8AAAAA"}],)";
    m_folder.write("a.gltf", start + mesh + end + R"("extensionsUsed":[")" + name + "\"]}");
    m_folder.write("b.gltf", start + mesh + end + R"("extensionsRequired":[")" + name + "\"]}");
    for (const char* arguments : {"a.gltf a.glo", "b.gltf b.glo", ". out"})
    {
        const Outcome outcome = convert(arguments);
        EXPECT_EQ(std::string::npos, outcome.output.find('\x1b')) << outcome.output;
        EXPECT_EQ(std::string::npos, outcome.output.find("\nb.glo: lost")) << outcome.output;
        const bool isNamed = outcome.output.find("\\x1b[2J\\x0ab.glo: lost") != std::string::npos;
        EXPECT_TRUE(isNamed) << arguments << outcome.output;
    }
}

// Fault caught: half an output where the second half cannot be written.
TEST_F(ConvertTest, allOrNothing)
{
    const uint8_t pixel[] = {255, 0, 0, 255};
    std::string error;
    ASSERT_TRUE(headless::writePng(m_folder.path("a.png"), 1, 1, pixel, error)) << error;
    m_folder.write("m.mtl", std::string("newmtl m\nKd 1 1 1\nmap_Kd a.png\n"));
    m_folder.write("tri.obj",
                   std::string("mtllib m.mtl\nusemtl m\nv 0 0 0\nv 1 0 0\nv 0 1 0\nvt 0 0\nf 1/1 2/1 3/1\n"));
    std::filesystem::create_directories(m_folder.path("out.glo/taken"));
    const std::vector<std::string> before = m_folder.list();
    EXPECT_EQ(1, convert("tri.obj out.glo").exitCode);
    EXPECT_EQ(before, m_folder.list());
}

// Fault caught: a pipe or a device (/dev/null, for root) whose place a file takes, pictures of other tools included.
TEST_F(ConvertTest, pipesAreWrittenTo)
{
    m_folder.write("tri.obj", std::string("v 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n"));
    ASSERT_EQ(0, mkfifo(m_folder.path("pipe").c_str(), 0600));
    const int end =
        open(m_folder.path("pipe").c_str(), O_RDWR | O_NONBLOCK); // so that nobody waits for the other
    char bytes[4096];
    EXPECT_EQ(0, convert("tri.obj out.glo --report pipe").exitCode);
    EXPECT_LT(100, read(end, bytes, sizeof bytes));
    EXPECT_EQ('{', bytes[0]);
    const uint8_t pixel[] = {255, 0, 0, 255};
    std::string error;
    EXPECT_TRUE(headless::writePng(m_folder.path("pipe"), 1, 1, pixel, error)) << error;
    EXPECT_LT(50, read(end, bytes, sizeof bytes));
    EXPECT_TRUE(std::filesystem::is_fifo(m_folder.path("pipe")));
    close(end);
}

// Fault caught: a memory limit that stops the converter instead of the conversion.
TEST_F(ConvertTest, namesTheMemoryLimit)
{
    if (!convert::CAN_LIMIT_MEMORY)
        GTEST_SKIP() << "this build has no such limit, and the machine may have less";
    m_folder.write("huge.off", std::string("OFF\n2000000000 1 0\n0 0 0\n"));
    const Outcome outcome = convert("huge.off out.glo --memory-limit 600 --report r.json");
    EXPECT_EQ(1, outcome.exitCode);
    EXPECT_NE(std::string::npos, outcome.output.find("more than 600 MiB")) << outcome.output;
    EXPECT_EQ(std::vector<std::string>{"huge.off"}, m_folder.list()) << outcome.output;
}

// Fault caught: outputs that depend on the time, on addresses or on the order of a folder; a report that a script
// cannot rely on.
TEST_F(ConvertTest, sameInputSameBytes)
{
    const std::string model = std::string(MODELS) + "Collada/human.zae";
    const char* const names[] = {"out.glo", "out.json"};
    std::vector<uint8_t> first[2];
    for (int pass = 0; pass < 2; ++pass)
    {
        const Outcome outcome = convert(model + " out.glo --report out.json");
        ASSERT_EQ(0, outcome.exitCode) << outcome.output;
        for (int i = 0; i < 2; ++i)
        {
            const std::vector<uint8_t> file = support::readFile(m_folder.path(names[i]));
            EXPECT_TRUE(pass == 0 || file == first[i]) << names[i];
            first[i] = file;
        }
    }
    const auto json = nlohmann::json::parse(first[1]);
    EXPECT_EQ("Collada Importer", json["model"]["format"]);
    EXPECT_EQ(first[0].size(), json["scene"]["bytes"]);
    EXPECT_EQ(m_folder.list().size(), json["textures"].size() + 2);
    for (const auto& kind : {"approximated", "lost"})
    {
        for (const auto& finding : json[kind])
            EXPECT_TRUE(finding["code"].is_string() && finding["sentence"].is_string() &&
                        finding["times"] > 0);
    }
}

// Fault caught: options that are taken and have no effect.
TEST_F(ConvertTest, options)
{
    m_folder.write("tri.obj", std::string("v 0 0 3\nv 1 0 0\nv 0 1 0\nf 1 2 3\n"));
    const struct
    {
        const char* arguments;
        Vector3f tip;
    } cases[] = {
        {"", {0, 0, 3}},
        {" --scale 2", {0, 0, 6}},
        {" --up z", {0, 3, 0}},
        {" --up x --scale 0.5", {0, 0, 1.5f}},
    };
    for (const auto& item : cases)
    {
        const Glo::Ptr loaded = convertAndLoad(std::string("tri.obj out.glo") + item.arguments, "out.glo");
        ASSERT_TRUE(loaded);
        SceneNode* node = loaded->getTopNode().get();
        while (!node->getChildren().empty())
            node = node->getChildren()[0].get();
        const Vector4f tip = node->getWorldTransform() * Vector4f(0, 0, 3, 1);
        EXPECT_NEAR(0.0f, length(tip.xyz() - item.tip), 1e-5f) << item.arguments;
    }
    const std::string moving = std::string(MODELS) + "3DS/RotatingCube.3DS out.glo";
    EXPECT_EQ(1, convertAndLoad(moving, "out.glo")->getAnimationCount());
    EXPECT_EQ(0, convertAndLoad(moving + " --no-animation", "out.glo")->getAnimationCount());
}

// Fault caught: codes and figures for scripts that are not documented.
TEST(ConvertReport, documentsEveryCode)
{
    const std::filesystem::path source(ORV_SOURCE_FOLDER);
    const auto read = [](const std::filesystem::path& path)
    {
        const std::vector<uint8_t> bytes = support::readFile(path);
        return std::string(bytes.begin(), bytes.end());
    };
    const std::string page = read(source / "docs/convert.md");
    int found = 0;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(source / "tools/convert"))
    {
        if (!entry.is_regular_file())
            continue;
        const std::string text = read(entry.path());
        for (const std::string call : {"lose(", "approximate(", "count("})
        {
            for (size_t at = text.find(call); at != std::string::npos; at = text.find(call, at + 1))
            {
                const size_t start = text.find_first_not_of(" \n", at + call.size());
                if (text[start] != '"')
                    continue; // a variable, or the declaration
                const std::string code = text.substr(start + 1, text.find('"', start + 1) - start - 1);
                EXPECT_NE(std::string::npos, page.find("`" + code + "`")) << code;
                ++found;
            }
        }
    }
    EXPECT_LT(30, found);
}
