#include "converttest.h"

#include "headless/png.h"

#include <filesystem>
#include <iterator>

namespace fs = std::filesystem;

namespace
{

/// A model in the folder "model", with a secret beside that folder.
class ConvertFilesTest : public ConvertTest
{
protected:
    void SetUp() override
    {
        ConvertTest::SetUp();
        fs::create_directories(m_folder.path("model/pictures"));
        writePicture("secret.png", 255, 0);
        writePicture("model/pictures/own.png", 0, 255);
        fs::create_symlink("../secret.png", m_folder.path("model/leak.png"));
        fs::create_symlink("pictures/own.png", m_folder.path("model/link.png"));
        fs::create_directory_symlink("..", m_folder.path("model/up"));
    }

    void writePicture(const std::string& name, uint8_t red, uint8_t green) const
    {
        const uint8_t pixel[] = {red, green, 0, 255};
        std::string error;
        ASSERT_TRUE(headless::writePng(m_folder.path(name), 1, 1, pixel, error)) << error;
    }

    /// @param pictures  one for each triangle.
    void writeModel(const std::string& name, const std::vector<std::string>& pictures) const
    {
        std::string materials;
        std::string faces = "mtllib m.mtl\nv 0 0 0\nv 1 0 0\nv 0 1 0\nvt 0 0\n";
        for (const std::string& picture : pictures)
        {
            materials += "newmtl " + picture + "\nKd 1 1 1\nmap_Kd " + picture + "\n";
            faces += "usemtl " + picture + "\nf 1/1 2/1 3/1\n";
        }
        m_folder.write(fs::path(name).parent_path().string() + "/m.mtl", materials);
        m_folder.write(name, faces);
    }
};

const char* const GLTF = R"({"asset":{"version":"2.0"},"scenes":[{"nodes":[0]}],"nodes":[{"mesh":0}],
"meshes":[{"primitives":[{"attributes":{"POSITION":0}}]}],
"accessors":[{"bufferView":0,"componentType":5126,"count":3,"type":"VEC3","min":[0,0,0],"max":[1,1,1]}],
"bufferViews":[{"buffer":0,"byteLength":36}],"buffers":[{"byteLength":36,"uri":"%s"}]})";

} // namespace

// Fault caught: a model that has other people's files copied beside the scene, by whatever way it names them.
TEST_F(ConvertFilesTest, reachesItsOwnFolderAlone)
{
    const std::string secret = m_folder.path("secret.png");
    const struct
    {
        std::string name;
        bool isOwn;
    } cases[] = {
        {"pictures/own.png", true},
        {"pictures\\own.png", true},
        {"link.png", true},
        {"pictures/../link.png", true},
        {m_folder.path("model/pictures/own.png"), true},
        {"../secret.png", false},
        {"..\\secret.png", false},
        {"%2e%2e/secret.png", false},
        {"pictures/../../secret.png", false},
        {"up/secret.png", false},
        {"leak.png", false},
        {secret, false},
        {"file://" + secret, false},
    };
    for (const auto& item : cases)
    {
        writeModel("model/a.obj", {item.name});
        const Outcome outcome = convert("model/a.obj out/a.glo --dry-run");
        EXPECT_EQ(0, outcome.exitCode) << outcome.output;
        EXPECT_EQ(item.isOwn, outcome.output.find(".png: ") != std::string::npos) << item.name << "\n"
                                                                                  << outcome.output;
        EXPECT_EQ(!item.isOwn, outcome.output.find("which is not in the model's folder") != std::string::npos)
            << item.name << "\n"
            << outcome.output;
        const Outcome allowed = convert("model/a.obj --allow . out/a.glo --dry-run");
        EXPECT_NE(std::string::npos, allowed.output.find(".png: ")) << item.name << "\n" << allowed.output;
    }
}

// Fault caught: files that libassimp opens by itself, such as buffers that end up in the scene as vertices.
TEST_F(ConvertFilesTest, buffersAndLibrariesAreFilesToo)
{
    m_folder.write("secret.bin", std::string(36, '?'));
    char text[1000];
    for (const char* name : {"../secret.bin", "up/secret.bin", "%2e%2e/secret.bin"})
    {
        std::snprintf(text, sizeof text, GLTF, name);
        m_folder.write("model/a.gltf", std::string(text));
        const Outcome outcome = convert("model/a.gltf a.glo");
        EXPECT_EQ(1, outcome.exitCode) << outcome.output;
        EXPECT_FALSE(m_folder.exists("a.glo")) << name;
    }
    m_folder.write("secret.mtl", std::string("newmtl m\nKd 1 0 0\n"));
    m_folder.write("model/b.obj",
                   std::string("mtllib ../secret.mtl\nusemtl m\nv 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n"));
    EXPECT_NE(std::string::npos, convert("model/b.obj b.glo").output.find("secret.mtl\", which is not in"));
}

// Fault caught: names of a model's files that make reads as commands, or as something else than a file.
TEST_F(ConvertFilesTest, dependenciesAreFitForMake)
{
    const std::string folder = fs::canonical(m_folder.path("model/pictures")).string();
    const struct
    {
        std::string name;
        std::string line; // of the dependency file
    } cases[] = {{"a b (1).bin", folder + "/a\\ b\\ (1).bin"},
                 {"a;touch b.bin", folder},
                 {"a=b.bin", folder},
                 {"a: b.bin", folder},
                 {"a|b.bin", folder},
                 {"a#b?.bin", folder}};
    const float corners[9] = {0, 0, 0, 1, 0, 0, 0, 1, 0};
    const std::string buffer(reinterpret_cast<const char*>(corners), sizeof corners);
    char text[1000];
    for (const auto& item : cases)
    {
        m_folder.write("model/pictures/" + item.name, buffer);
        std::snprintf(text, sizeof text, GLTF, ("pictures/" + item.name).c_str());
        m_folder.write("model/a.gltf", std::string(text));
        convert("model/a.gltf a.glo --depfile a.d");
        const std::vector<uint8_t> bytes = support::readFile(m_folder.path("a.d"));
        const std::string made(bytes.begin(), bytes.end());
        EXPECT_NE(std::string::npos, made.find("\n  " + item.line + "\n")) << made;
        EXPECT_EQ(std::string::npos, made.find_first_of(";=|")) << made;
    }
}

// Fault caught: a picture of the model's that is lost to one of the scene's, by name or by what the name leads to.
TEST_F(ConvertFilesTest, inputsAreNeverWrittenOver)
{
    const std::string kept = m_folder.path("model/duck-CM.png");
    const std::string other = m_folder.path("model/pictures/own.png");
    for (const char* way : {"name", "hard link", "symbolic link"})
    {
        fs::remove(kept);
        writePicture("model/CM.png", 255, 255);
        const bool isName = way == std::string("name");
        if (isName)
            fs::copy_file(other, kept);
        else if (way == std::string("hard link"))
            fs::create_hard_link(other, kept);
        else
            fs::create_symlink(other, kept);
        writeModel("model/duck.obj", {"CM.png", isName ? "duck-CM.png" : "pictures/own.png"});
        const std::vector<uint8_t> before = support::readFile(kept);
        for (int pass = 0; pass < 2; ++pass)
        {
            const Outcome outcome = convert("model/duck.obj model/duck.glo");
            EXPECT_EQ(0, outcome.exitCode) << outcome.output;
            EXPECT_EQ(before, support::readFile(kept)) << way;
            EXPECT_NE(std::string::npos, outcome.output.find("duck-CM_2.png")) << outcome.output;
        }
        EXPECT_EQ(way == std::string("symbolic link"), fs::is_symlink(kept));
        EXPECT_EQ(support::readFile(m_folder.path("model/CM.png")),
                  support::readFile(m_folder.path("model/duck-CM_2.png")));
    }
}

// Fault caught: a picture that is lost to another scene's in the same folder.
TEST_F(ConvertFilesTest, scenesOfAFolderHaveTheirOwnPictures)
{
    const struct
    {
        std::string scene;
        std::string picture;
    } models[] = {{"house", "roof-tiles.png"},        {"house-roof", "tiles.png"},
                  {"two words", "own.png"},           {"two_words", "own.png"},
                  {"\xe5\xae\xb6", "own.png"},        {"\xe6\xa9\x8b", "own.png"},
                  {std::string(101, 'l'), "own.png"}, {std::string(102, 'l'), "own.png"}};
    fs::create_directories(m_folder.path("out"));
    for (const auto& model : models)
    {
        writePicture("model/" + model.picture, 255, 255);
        writeModel("model/a.obj", {model.picture});
        const Outcome outcome = convert("model/a.obj 'out/" + model.scene + ".glo'");
        EXPECT_EQ(0, outcome.exitCode) << outcome.output;
    }
    const auto files = fs::directory_iterator(m_folder.path("out"));
    EXPECT_EQ(std::ptrdiff_t(2 * std::size(models)), std::distance(begin(files), end(files)));
}

// Fault caught: the same for names that the user gave, where there is no other to take.
TEST_F(ConvertFilesTest, outputsThatAreInputsAreRefused)
{
    writeModel("model/a.obj", {"link.png"});
    fs::rename(m_folder.path("model/m.mtl"), m_folder.path("model/a.glo"));
    m_folder.write("model/a.obj", std::string("mtllib a.glo\nv 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n"));
    for (const char* arguments : {"model/a.obj model/a.glo", "model/a.obj b.glo --report model/a.obj",
                                  "model/a.obj b.glo --report up/model/a.glo --dry-run"})
    {
        fs::remove(m_folder.path("up"));
        fs::create_directory_symlink(".", m_folder.path("up"));
        const auto before = m_folder.list();
        const auto model = support::readFile(m_folder.path("model/a.obj"));
        const auto library = support::readFile(m_folder.path("model/a.glo"));
        const Outcome outcome = convert(arguments);
        EXPECT_EQ(1, outcome.exitCode) << outcome.output;
        EXPECT_NE(std::string::npos, outcome.output.find("was read from this file")) << outcome.output;
        EXPECT_EQ(before, m_folder.list());
        EXPECT_EQ(model, support::readFile(m_folder.path("model/a.obj")));
        EXPECT_EQ(library, support::readFile(m_folder.path("model/a.glo")));
    }
}
