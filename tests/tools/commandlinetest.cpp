#include "support/tempdir.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <cstdlib>
#include <fstream>
#include <iterator>
#include <string>

namespace
{

struct Tool
{
    const char* name;
    const char* path;
};

constexpr Tool TOOLS[] = {
    {"orv-convert", ORV_CONVERT},
    {"orv-inspect", ORV_INSPECT},
    {"orv-view", ORV_VIEW},
};

/// Runs a shell command. @return its exit code, and what it wrote to the file.
int run(const std::string& command, const std::string& output, std::string& text)
{
    const int status = std::system((command + " >'" + output + "' 2>&1 </dev/null").c_str());
    std::ifstream file(output);
    text.assign(std::istreambuf_iterator<char>(file), {});
    return WEXITSTATUS(status);
}

} // namespace

// Faults caught: an error that does not say which of the programs in a script it came from; wrong usage that passes for a
// failure; a full disk that passes for success.
TEST(CommandLineTest, toolsAgree)
{
    const support::TempDir folder;
    const std::string output = folder.path("output");
    for (const Tool& tool : TOOLS)
    {
        const std::string path = tool.path;
        const std::string start = std::string(tool.name) + ": ";
        std::string text;
        EXPECT_EQ(0, run(path + " --version", output, text));
        EXPECT_EQ(std::string(tool.name) + " 1.0.0\n", text);
        EXPECT_EQ(2, run(path + " --no-such-option x y", output, text)) << text;
        EXPECT_EQ(0u, text.find(start)) << text;
        EXPECT_EQ(text.size(), text.find('\n') + 1) << text;
        EXPECT_EQ(1,
                  run(path + " none.gltf out.glo" + (path == ORV_VIEW ? " --out a.png" : ""), output, text));
        EXPECT_EQ(0u, text.find(start)) << text;
        EXPECT_EQ(1, run("{ " + path + " --help >/dev/full; }", output, text));
        EXPECT_EQ(start + "standard output: No space left on device\n", text);
    }
}

// Fault caught: a file that could not be read, missing from what a script reads.
TEST(CommandLineTest, inspectorNamesWhatItCannotRead)
{
    const support::TempDir folder;
    std::string text;
    EXPECT_EQ(1, run("{ " ORV_INSPECT " --json none.glo 2>/dev/null; }", folder.path("output"), text));
    const nlohmann::json json = nlohmann::json::parse(text, nullptr, false);
    ASSERT_TRUE(json.is_array() && json.size() == 1) << text;
    EXPECT_EQ("none.glo", json[0].value("file", ""));
    EXPECT_EQ("No such file or directory", json[0].value("error", ""));
}
