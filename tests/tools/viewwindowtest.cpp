#include "viewtest.h"

#include "support/picture.h"
#include "view/viewer.h"

#include <chrono>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <thread>

#include <SDL2/SDL.h>
#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

using support::Picture;

namespace
{

constexpr auto PATIENCE = std::chrono::seconds(60); // with what comes in a moment

bool waitFor(const std::function<bool()>& condition)
{
    const auto end = std::chrono::steady_clock::now() + PATIENCE;
    while (!condition())
    {
        if (std::chrono::steady_clock::now() > end)
            return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    return true;
}

/// A program that is ended with this object.
class Process
{
public:
    /// @param output  the file for both of its streams.
    /// @param kept    a descriptor that it inherits, -1 for none.
    Process(const std::string& shellCommand, const std::string& output, int kept = -1)
    {
        m_id = fork();
        if (m_id != 0)
            return;
        const int file = open(output.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
        dup2(file, STDOUT_FILENO);
        dup2(file, STDERR_FILENO);
        if (kept >= 0)
            fcntl(kept, F_SETFD, 0);
        execl("/bin/sh", "sh", "-c", ("exec " + shellCommand).c_str(), nullptr);
        _exit(127);
    }

    ~Process()
    {
        if (m_id > 0)
        {
            kill(m_id, SIGTERM);
            waitpid(m_id, nullptr, 0);
        }
    }

    Process(const Process&) = delete;
    Process& operator=(const Process&) = delete;

    /// @return -1 if it does not end.
    int waitForExit()
    {
        int status = -1;
        if (!waitFor([&] { return waitpid(m_id, &status, WNOHANG) == m_id; }))
            return -1;
        m_id = 0;
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }

private:
    pid_t m_id = 0;
};

/// A screen in memory, and on it a window with orv-view. Needs Xvfb and xdotool (packages xvfb, xdotool).
class ViewWindowTest : public ViewTest
{
protected:
    void SetUp() override
    {
        ViewTest::SetUp();
        int ends[2];
        ASSERT_EQ(0, pipe2(ends, O_CLOEXEC));
        m_screen = std::make_unique<Process>("Xvfb -displayfd " + std::to_string(ends[1]) +
                                                 " -screen 0 640x480x24 -nolisten tcp",
                                             m_logs.path("xvfb.log"), ends[1]);
        close(ends[1]);
        std::string number;
        for (char c; read(ends[0], &c, 1) == 1 && c != '\n';)
            number += c;
        close(ends[0]);
        ASSERT_FALSE(number.empty()) << "Xvfb does not start: " << readLog("xvfb.log");
        m_environment = "DISPLAY=:" + number + " SDL_VIDEODRIVER=x11 ";
    }

    /// Opens the window and puts the pointer into its middle.
    void view(const std::string& arguments)
    {
        m_view =
            std::make_unique<Process>("env -C '" + m_folder.path() + "' TMPDIR='" + m_temporary.path() +
                                          "' " + m_environment + ORV_VIEW " " + arguments + " --size 320x240",
                                      m_logs.path("view.log"));
        use("search --sync --onlyvisible --name ' - orv-view$' mousemove --window %1 9 9 mousemove --window "
            "%1 160 120");
    }

    /// Moves the mouse and presses keys, as xdotool's command line says.
    void use(const std::string& commands) const
    {
        const int status = std::system((m_environment + "timeout 60 xdotool " + commands).c_str());
        ASSERT_EQ(0, status) << "xdotool " << commands << "\n" << readLog("view.log");
    }

    /// Has the window save a picture.
    Picture takePicture(const char* key = "s")
    {
        const std::string digits = std::to_string(++m_pictures);
        const std::string name =
            m_stem + "-" + std::string(3 - std::min<size_t>(digits.size(), 3), '0') + digits + ".png";
        use(std::string("key ") + key);
        EXPECT_TRUE(waitFor([&] { return m_folder.exists(name); })) << name << "\n" << readLog("view.log");
        return picture(name);
    }

    /// What is written at the top of the window.
    Picture getLines()
    {
        Picture lines = takePicture("shift+s");
        lines.height = 90;
        lines.rgba.resize(size_t(lines.width) * size_t(lines.height) * 4);
        return lines;
    }

    /// Takes pictures until the pixel in the middle is as wanted.
    bool waitForMiddle(const std::function<bool(const support::Rgba&)>& isWanted)
    {
        return waitFor([&] { return isWanted(takePicture().pixel(160, 120)); });
    }

    bool waitForLog(const char* text)
    {
        return waitFor([&] { return readLog("view.log").find(text) != std::string::npos; });
    }

    std::string readLog(const char* name) const
    {
        std::ifstream file(m_logs.path(name));
        return std::string(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
    }

    void leave()
    {
        use("key q");
        EXPECT_EQ(0, m_view->waitForExit()) << readLog("view.log");
        EXPECT_TRUE(m_temporary.list().empty());
    }

    static bool isGreen(const support::Rgba& c) { return c.g > 150 && c.r < 60 && c.b < 60; }
    static bool isBlue(const support::Rgba& c) { return c.b > 150 && c.r < 60 && c.g < 60; }

    support::TempDir m_logs;
    support::TempDir m_temporary;
    std::string m_stem = "scene"; ///< of what is looked at
    std::string m_environment;
    int m_pictures = 0;
    std::unique_ptr<Process> m_screen;
    std::unique_ptr<Process> m_view;
};

bool areSame(const Picture& a, const Picture& b)
{
    return a.width == b.width && a.height == b.height && a.rgba == b.rgba;
}

} // namespace

// Fault caught: a key or a button that does nothing, or something else than what the window says it does.
TEST_F(ViewWindowTest, obeysKeysAndMouse)
{
    view("scene.glo");
    use("key space key 0");
    const Picture left = takePicture();
    ASSERT_EQ(320, left.width);
    ASSERT_EQ(240, left.height);
    EXPECT_LT(100, countRed(left, 0, 160));
    EXPECT_EQ(0, countRed(left, 160, 320));
    use("key End");
    const Picture right = takePicture();
    EXPECT_EQ(0, countRed(right, 0, 160));
    EXPECT_LT(100, countRed(right, 160, 320));
    use("key 4 key Right key Right key period"); // 0.8 s, 1 s, and a frame more
    EXPECT_TRUE(areSame(right, takePicture()));
    use("key comma key comma"); // a frame before the jump
    EXPECT_TRUE(areSame(left, takePicture()));
    use("key n");
    EXPECT_TRUE(areSame(right, takePicture())) << "the clip \"rest\" begins after the jump";
    use("key shift+n");
    EXPECT_TRUE(areSame(left, takePicture()));

    use("mousedown 1 mousemove_relative --sync -- 80 0 mouseup 1");
    EXPECT_FALSE(areSame(left, takePicture())) << "turned";
    use("key f");
    EXPECT_TRUE(areSame(left, takePicture())) << "the whole scene again";
    use("mousemove_relative --sync -- -80 0 keydown shift mousedown 1 mousemove_relative --sync 60 0 mouseup "
        "1 keyup shift");
    const Picture moved = takePicture();
    EXPECT_EQ(0, countRed(moved, 0, 50)) << "moved to the right";
    EXPECT_NEAR(countRed(left, 0, 160), countRed(moved, 0, 320), 200);
    use("key f click 4 click 4");
    EXPECT_GT(countRed(takePicture(), 0, 320), countRed(left, 0, 320)) << "nearer";

    use("key f key c key End");
    const Picture through = takePicture();
    EXPECT_TRUE(isRed(through.pixel(160, 120)));
    EXPECT_LT(10000, countRed(through, 0, 320)) << "the file's camera stands near the square";
    use("key c key 0 key b");
    EXPECT_TRUE(isNear(takePicture().pixel(160, 2), {51, 56, 64, 255}, 2)) << "another background";
    use("key b key b key b");
    EXPECT_TRUE(areSame(left, takePicture()));

    const Picture written = takePicture("shift+s");
    EXPECT_FALSE(areSame(left, written)) << "the heads-up line";
    use("key h");
    EXPECT_TRUE(waitFor(
        [&] {
            return isNear(takePicture("shift+s").pixel(310, 4), {33, 38, 46, 255}, 2);
        }))
        << "the keys";
    leave();
}

// Fault caught: a picture in the window that is not the one that is drawn without it.
TEST_F(ViewWindowTest, drawsWhatPicturesShow)
{
    view("scene.glo --camera eye --clip rest --background '#102030'");
    use("key space key 0");
    const Picture shown = takePicture();
    const std::string command = "cd '" + m_folder.path() +
                                "' && " ORV_VIEW
                                " scene.glo --out drawn.png --camera eye --clip rest --background '#102030' "
                                "--size 320x240";
    ASSERT_EQ(0, std::system(command.c_str()));
    EXPECT_TRUE(support::comparePictures("view-window", picture("drawn.png"), shown, {2, 0.01}));
    leave();
}

// Faults caught: a key of a debug view without effect or with the wrong one; views that stay on; hidden nodes drawn or
// found by the pointer.
TEST_F(ViewWindowTest, marksAndHidesWhatIsAskedFor)
{
    view("scene.glo --camera eye --clip rest");
    use("key space key 0");
    const Picture plain = takePicture();
    std::vector<Picture> marked;
    for (const std::string key : {"o", "j", "a", "g", "w"})
    {
        use("key " + key);
        marked.push_back(takePicture());
        EXPECT_FALSE(areSame(plain, marked.back())) << key;
        for (size_t i = 0; i + 1 < marked.size(); ++i)
            EXPECT_FALSE(areSame(marked[i], marked.back())) << key << " is like another";
        use("key " + key);
        EXPECT_TRUE(areSame(plain, takePicture())) << key;
    }
    use("key v");
    EXPECT_EQ(0, countRed(takePicture(), 0, 320));
    use("key v"); // nothing is under the pointer any more
    use("key shift+v");
    EXPECT_TRUE(areSame(plain, takePicture()));

    use("key t");
    EXPECT_TRUE(waitFor([&] { return isNear(takePicture("shift+s").pixel(310, 4), {33, 38, 46, 255}, 2); }));
    const Picture tree = takePicture("shift+s");
    use("key t");
    EXPECT_TRUE(areSame(plain, takePicture()));
    use("key v key t");
    EXPECT_FALSE(areSame(tree, takePicture("shift+s"))) << "what is hidden is told";
    use("key t key shift+v");
    EXPECT_TRUE(areSame(plain, takePicture()));
    leave();
}

// Faults caught: a file dropped that is not shown, found in the last one's folder by its name, or, where it is broken,
// takes away what is shown.
TEST_F(ViewWindowTest, showsFilesDroppedOnIt)
{
    m_folder.write("other/scene.glo", write(makeScene(orv::Vector4f(0, 0, 1, 1))));
    const std::string before = std::filesystem::current_path();
    std::filesystem::current_path(m_folder.path());
    setenv("DISPLAY", m_environment.substr(8, m_environment.find(' ') - 8).c_str(), 1);
    setenv("SDL_VIDEODRIVER", "x11", 1);
    const auto push = [](Uint32 type, SDL_Keycode key, const std::string& path)
    {
        SDL_Event event{};
        event.type = type;
        if (type == SDL_KEYDOWN)
            event.key.keysym.sym = key;
        if (type == SDL_DROPFILE)
            event.drop.file = SDL_strdup(path.c_str());
        SDL_PushEvent(&event);
    };
    std::thread hand(
        [&]
        {
            waitFor([] { return SDL_GetWindowFromID(1) != nullptr; });
            push(SDL_DROPFILE, 0, m_folder.path("other/scene.glo"));
            push(SDL_KEYDOWN, SDLK_0, "");
            push(SDL_KEYDOWN, SDLK_s, "");
            waitFor([&] { return m_folder.exists("scene-001.png"); });
            push(SDL_DROPFILE, 0, m_folder.path("damaged.glo"));
            push(SDL_DROPFILE, 0, m_folder.path("none.dae"));
            push(SDL_KEYDOWN, SDLK_s, "");
            waitFor([&] { return m_folder.exists("scene-002.png"); });
            push(SDL_QUIT, 0, "");
        });
    view::Options options;
    options.scene.path = "scene.glo";
    options.width = 320;
    options.height = 240;
    std::string error;
    EXPECT_TRUE(view::Viewer(options, nullptr).run(error)) << error;
    hand.join();
    std::filesystem::current_path(before);
    const Picture dropped = picture("scene-001.png");
    int blue = 0;
    for (int y = 0; y < dropped.height; ++y)
        for (int x = 0; x < dropped.width; ++x)
            blue += isBlue(dropped.pixel(x, y));
    EXPECT_LT(100, blue);
    EXPECT_EQ(0, countRed(dropped, 0, 320));
    EXPECT_TRUE(areSame(dropped, picture("scene-002.png")));
}

// Fault caught: a node that is named where another is seen, or none at all.
TEST_F(ViewWindowTest, namesWhatIsUnderThePointer)
{
    view("scene.glo --camera eye --clip rest");
    use("key space");
    use("mousemove_relative --sync -- -155 0"); // off the square, in the window
    Picture beside = getLines();
    ASSERT_TRUE(waitFor(
        [&] // until it says that nothing moves
        {
            const Picture before = std::move(beside);
            beside = getLines();
            return areSame(before, beside);
        }));
    use("mousemove_relative --sync -- 155 0");
    EXPECT_TRUE(waitFor([&] { return !areSame(beside, getLines()); }));
    use("mousemove_relative --sync -- -155 0");
    EXPECT_TRUE(waitFor([&] { return areSame(beside, getLines()); }));
    leave();
}

// Fault caught: an edit that is not seen, and a broken one that takes the good picture away or ends the program.
TEST_F(ViewWindowTest, followsEditsOfTheSceneAndKeepsTheLastGoodPicture)
{
    view("scene.glo --camera eye --clip rest");
    use("key space");
    EXPECT_TRUE(waitForMiddle(isRed));
    m_folder.write("scene.glo", write(makeScene(orv::Vector4f(0, 1, 0, 1))));
    EXPECT_TRUE(waitForMiddle(isGreen));
    std::filesystem::copy_file(m_folder.path("damaged.glo"), m_folder.path("scene.glo"),
                               std::filesystem::copy_options::overwrite_existing);
    EXPECT_TRUE(waitForLog("E/ORV"));
    EXPECT_TRUE(isGreen(takePicture().pixel(160, 120)));
    m_folder.write("scene.glo", write(makeScene(orv::Vector4f(0, 0, 1, 1))));
    EXPECT_TRUE(waitForMiddle(isBlue));
    leave();
}

// Fault caught: the same for what a material is made of.
TEST_F(ViewWindowTest, followsEditsOfMaterialsShadersAndTextures)
{
    const auto shader = [](const char* colour)
    {
        return std::string("precision mediump float;\nvoid main() { gl_FragColor = vec4(") + colour +
               ", 1.0); }\n";
    };
    m_folder.write("paint.vert", "attribute vec3 a_position;\nuniform mat4 u_mvp;\n"
                                 "void main() { gl_Position = u_mvp * vec4(a_position, 1.0); }\n");
    m_folder.write("paint.frag", shader("1.0, 0.0, 0.0"));
    m_folder.write("paint.sp", "1.0\nvertex_source_file paint.vert\nfragment_source_file paint.frag\n"
                               "uniform u_mvp T_MODEL_VIEW_PROJECTION\n");
    m_folder.write("paint.ap", "1.0\nshader_program paint.sp\n");
    m_stem = "paint";
    view("paint.ap");
    EXPECT_TRUE(waitForMiddle(isRed));
    m_folder.write("paint.frag", shader("0.0, 1.0, 0.0"));
    EXPECT_TRUE(waitForMiddle(isGreen));
    m_folder.write("paint.frag", shader("no colour"));
    EXPECT_TRUE(waitForLog("E/ORV"));
    EXPECT_TRUE(isGreen(takePicture().pixel(160, 120)));
    m_folder.write("paint.frag", shader("0.0, 0.0, 1.0"));
    EXPECT_TRUE(waitForMiddle(isBlue));

    std::filesystem::copy_file(m_folder.path("paint-001.png"), m_folder.path("texture.png"));
    m_folder.write("paint.ap", "1.0\nshader_program orv#max_pvl.sp$DIFF\n"
                               "property M_DIFFUSE_COLOUR Colour4f 1 1 1 1\n"
                               "property M_DIFFUSE_TEXTURE Texture2D texture.png\n");
    EXPECT_TRUE(waitForMiddle([](const support::Rgba& c) { return !isBlue(c); })) << "another material";
    const Picture before = takePicture();
    m_folder.write("texture.png", "no picture");
    EXPECT_TRUE(waitForLog("texture.png"));
    EXPECT_TRUE(areSame(before, takePicture()));
    const std::string last =
        "paint-" + std::string(m_pictures < 10 ? "00" : "0") + std::to_string(m_pictures) + ".png";
    std::filesystem::copy_file(m_folder.path(last), m_folder.path("texture.png"),
                               std::filesystem::copy_options::overwrite_existing);
    EXPECT_TRUE(waitFor([&] { return !areSame(before, takePicture()); })) << "another texture";
    leave();
}

// Fault caught: a model that is shown once, and not again when it or its materials are saved.
TEST_F(ViewWindowTest, convertsAModelAgainWhenItIsEdited)
{
    m_folder.write("model.mtl", "newmtl paint\nKd 1 0 0\n");
    m_folder.write("model.obj", "mtllib model.mtl\nv -1 -1 0\nv 1 -1 0\nv 0 1 0\nusemtl paint\nf 1 2 3\n");
    m_stem = "model";
    view("model.obj");
    EXPECT_TRUE(waitForMiddle(isRed));
    m_folder.write("model.mtl", "newmtl paint\nKd 0 1 0\n");
    EXPECT_TRUE(waitForMiddle(isGreen));
    m_folder.write("model.obj", "f 1 2 3\n");
    EXPECT_TRUE(waitForLog("orv-convert: "));
    EXPECT_TRUE(isGreen(takePicture().pixel(160, 120)));
    leave();
}
