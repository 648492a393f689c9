#include "glcalls/weakdevice.h"
#include "headless/headless.h"
#include "support/logcapture.h"
#include "support/picture.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <iterator>
#include <sstream>

/// The main() of examples/showpiece.cpp, which is compiled into this program under that name.
int showpiece_main(int argc, char** argv);

namespace
{

std::string convert(const support::TempDir& folder, const std::string& model)
{
    const std::string scene = folder.path(model.substr(model.find('/') + 1) + ".glo");
    const std::string command =
        ORV_CONVERT " /usr/share/assimp/models/" + model + " " + scene + " > /dev/null 2>&1";
    EXPECT_EQ(0, std::system(command.c_str())) << command;
    return scene;
}

/// The picture that a command line of the show-piece makes.
support::Picture draw(const std::string& commandLine)
{
    std::istringstream stream(commandLine);
    std::vector<std::string> words{std::istream_iterator<std::string>(stream), {}};
    std::vector<char*> arguments;
    for (std::string& word : words)
        arguments.push_back(word.data());
    EXPECT_EQ(0, showpiece_main(int(arguments.size()), arguments.data()));
    return support::readPng(words.back());
}

/// Draws the show-piece on each weak device, on the driver that the environment chooses.
void compareDevices()
{
    const support::TempDir folder;
    const std::string commandLine = "showpiece --size 240x135 --duck " + convert(folder, "Collada/duck.dae") +
                                    " --dancer " + convert(folder, "ASE/MotionCaptureROM.ase") + " --out " +
                                    folder.path("out.png");
    const support::Picture full = draw(commandLine);
    for (const glcalls::Device& device : glcalls::WEAK_DEVICES)
    {
        support::LogCapture log;
        std::string error;
        const auto context = headless::Context::create({}, error); // emulating asks the driver
        ASSERT_TRUE(context) << error;
        const bool isRounding = context->describe().find("softpipe") == std::string::npos;
        const glcalls::Scope gl;
        glcalls::emulate(device);
        const support::Picture weak = draw(commandLine);
        // Where the driver rounds mediump to 16 bits, some pixels of the chrome ball reflect another place.
        const double differing = isRounding && !device.hasFragmentHighp ? 0.001 : 0.0;
        EXPECT_TRUE(comparePictures("weakdevice", full, weak, {.perChannel = 4, .differingShare = differing}))
            << device.name;
        EXPECT_EQ(0, log.count('E')) << device.name << log.text();
        EXPECT_EQ("", glcalls::describeLiveNames()) << device.name;
    }
}

} // namespace

// Fault caught: a shader, texture or target that only a strong driver takes.
TEST(WeakDeviceTest, showpieceAndModelsLookTheSameOnEach)
{
    setenv("GALLIUM_DRIVER", "softpipe", 0); // computes mediump as exactly as highp
    compareDevices();
}

// Fault caught: a number that 16 bits do not hold.
TEST(WeakDeviceTest, showpieceAndModelsLookNearlyTheSameWhereMediumpIsRounded)
{
    compareDevices();
}
