// The cost of loading: a scene file of 200,000 triangles beside read() and glBufferData() of the same bytes, and the
// time from a program's start to its first frame beside a bare context that links one program.
//
// "ms" are medians of wall time on the real driver, with the shader program already loaded. "Instructions" are the
// engine's in one load, without GL calls and without the C library's copying and filling of memory, which callgrind
// tells apart where valgrind is installed; files of the same number of chunks and a quarter of the triangles show what
// depends on the size. "Heap peak" is the largest heap use of C++ code during a load, relative to the start.

#include "callgrind.h"

#include "glcalls/glcalls.h"
#include "glo/glowriter.h"
#include "headless/headless.h"

#include "orv/assetcachepool.h"
#include "orv/camera.h"
#include "orv/glo.h"
#include "orv/light.h"
#include "orv/logsink.h"
#include "orv/renderblock.h"
#include "orv/rendercontext.h"
#include "orv/sceneutil.h"
#include "orv/simplerenderer.h"
#include "orv/solid.h"

#include <fcntl.h>
#include <malloc.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <new>

using namespace orv;

namespace
{

constexpr int GEOMETRIES = 4;
constexpr int LARGE = 250; // columns and, times 0.4, rows of squares of each: 200,000 triangles in all
constexpr int SMALL = 125;
constexpr int RUNS = 21;

const char* const FOR_COUNTING = "--for-counting"; // what runs under callgrind
const char* const START_ENGINE = "--start-engine"; // draw one frame and leave
const char* const START_BARE = "--start-bare";

size_t g_heapBytes = 0;
size_t g_heapPeak = 0;

[[noreturn]] void giveUp(const std::string& reason)
{
    std::fprintf(stderr, "loadbench: %s\n", reason.c_str());
    std::exit(EXIT_FAILURE);
}

} // namespace

// Not inlined: the compiler would warn of free() on memory from new.
[[gnu::noinline]] void* operator new(size_t size, const std::nothrow_t&) noexcept
{
    void* memory = std::malloc(std::max<size_t>(size, 1));
    g_heapBytes += malloc_usable_size(memory);
    g_heapPeak = std::max(g_heapPeak, g_heapBytes);
    return memory;
}

[[gnu::noinline]] void* operator new(size_t size)
{
    void* memory = operator new(size, std::nothrow);
    return memory ? memory : (std::abort(), nullptr);
}

[[gnu::noinline]] void operator delete(void* memory) noexcept
{
    g_heapBytes -= malloc_usable_size(memory);
    std::free(memory);
}

[[gnu::noinline]] void operator delete(void* memory, size_t) noexcept
{
    operator delete(memory);
}

namespace
{

/// A file, and where its large chunks lie.
struct File
{
    struct Chunk
    {
        GLenum target;
        size_t start;
        size_t size;
    };

    std::string name;
    size_t size = 0;
    size_t largestChunk = 0;
    std::vector<Chunk> chunks;
};

glo::Geometry makeGrid(int number, int columns)
{
    const int rows = columns * 2 / 5;
    glo::FloatAttribute position{"a_position", 3, {}};
    glo::FloatAttribute normal{"a_normal", 3, {}};
    glo::FloatAttribute uv{"a_uv0", 2, {}};
    for (int row = 0; row <= rows; ++row)
    {
        for (int column = 0; column <= columns; ++column)
        {
            const float u = float(column) / float(columns);
            const float v = float(row) / float(rows);
            position.values.insert(position.values.end(), {u, v, 0.1f * float(number)});
            normal.values.insert(normal.values.end(), {0.0f, 0.0f, 1.0f});
            uv.values.insert(uv.values.end(), {u, v});
        }
    }
    glo::PrimitiveSet set;
    set.indices.emplace();
    for (int row = 0; row < rows; ++row)
    {
        for (int column = 0; column < columns; ++column)
        {
            const int corner = row * (columns + 1) + column;
            for (int index : {corner, corner + 1, corner + columns + 1, corner + 1, corner + columns + 2,
                              corner + columns + 1})
                set.indices->indices.push_back(uint16_t(index));
        }
    }
    glo::Geometry geometry;
    geometry.name = "grid" + std::to_string(number);
    geometry.vertices = glo::makeVertexSet({position, normal, uv});
    geometry.primitiveSets.push_back(set);
    return geometry;
}

File writeFile(const std::string& folder, int columns)
{
    glo::GloScene scene;
    scene.scene.emplace().top.name = "top";
    for (int i = 0; i < GEOMETRIES; ++i)
    {
        scene.geometries.push_back(makeGrid(i, columns));
        glo::NodeData& node = scene.scene->top.children.emplace_back();
        node.name = "node" + std::to_string(i);
        node.geometry.emplace().geometry = scene.geometries.back().name;
    }
    std::vector<uint8_t> bytes;
    std::string error;
    if (!glo::writeGlo(scene, bytes, error))
        giveUp(error);

    File file;
    file.name = "grid" + std::to_string(columns) + ".glo";
    file.size = bytes.size();
    std::ofstream(folder + "/" + file.name, std::ios::binary)
        .write(reinterpret_cast<const char*>(bytes.data()), std::streamsize(bytes.size()));
    size_t start = 0;
    for (const glo::Geometry& geometry : scene.geometries)
    {
        const auto& vertices = geometry.vertices.data.bytes;
        start =
            size_t(std::search(bytes.begin() + long(start), bytes.end(), vertices.begin(), vertices.end()) -
                   bytes.begin());
        file.chunks.push_back({GL_ARRAY_BUFFER, start, vertices.size()});
        const auto& indices = geometry.primitiveSets[0].indices->indices;
        const size_t indexBytes = indices.size() * sizeof(uint16_t);
        start = start + vertices.size() + 32; // the count of sets, a set and the head of its IBUF
        file.chunks.push_back({GL_ELEMENT_ARRAY_BUFFER, start, indexBytes});
        if (std::memcmp(bytes.data() + start, indices.data(), indexBytes) != 0)
            giveUp("the file is not laid out as expected");
        file.largestChunk = std::max({file.largestChunk, vertices.size(), indexBytes});
    }
    return file;
}

/// The reference: reads the whole file at once, then fills every buffer from it.
void loadByHand(const std::string& folder, const File& file)
{
    const std::unique_ptr<char[]> bytes(new char[file.size]);
    const int handle = open((folder + "/" + file.name).c_str(), O_RDONLY);
    if (handle < 0 || read(handle, bytes.get(), file.size) != ssize_t(file.size))
        giveUp("the file cannot be read");
    close(handle);
    std::vector<GLuint> buffers(file.chunks.size());
    glGenBuffers(GLsizei(buffers.size()), buffers.data());
    for (size_t i = 0; i < buffers.size(); ++i)
    {
        const File::Chunk& chunk = file.chunks[i];
        glBindBuffer(chunk.target, buffers[i]);
        glBufferData(chunk.target, GLsizeiptr(chunk.size), bytes.get() + chunk.start, GL_STATIC_DRAW);
    }
    glFinish();
    glDeleteBuffers(GLsizei(buffers.size()), buffers.data());
}

void loadByEngine(AssetCachePool& pool, const File& file)
{
    if (!loadGloFile(pool, {}, file.name.c_str()))
        giveUp("the engine does not load the file");
    glFinish();
    pool.flush();
    pool.flush();
}

template <class Work>
double measureMedianMs(Work work)
{
    using Clock = std::chrono::steady_clock;
    std::vector<double> times;
    for (int i = 0; i < RUNS; ++i)
    {
        const Clock::time_point start = Clock::now();
        work();
        times.push_back(std::chrono::duration<double, std::milli>(Clock::now() - start).count());
    }
    std::nth_element(times.begin(), times.begin() + RUNS / 2, times.end());
    return times[RUNS / 2];
}

struct Loader
{
    AssetCachePool* pool;
    const File* file;
};

void loadForCounting(AssetCachePool& pool, const File& file)
{
    loadByEngine(pool, file);
    Loader loader{&pool, &file};
    const auto load = [](void* object, int)
    {
        const Loader& what = *static_cast<Loader*>(object);
        loadByEngine(*what.pool, *what.file);
    };
    callgrind::measure(load, &loader, 0);
}

void drawEngineFrame()
{
    const auto pool = makeShared<AssetCachePool>();
    const auto scene = makeShared<SceneNode>();
    const auto camera = makeShared<Camera>();
    camera->setPosition(Vector3f(0.0f, 0.0f, 5.0f));
    createCube(*pool, Vector2f(1.0f, 1.0f))->setParent(scene);
    makeShared<Light>()->setParent(scene);
    RenderBlock(makeShared<SimpleRenderer>(makeShared<RenderContext>(), pool), scene, camera).render();
    glFinish();
    _exit(EXIT_SUCCESS); // exit is not part of the start
}

GLuint compile(GLenum kind, const char* source)
{
    const GLuint shader = glCreateShader(kind);
    glShaderSource(shader, 1, &source, nullptr);
    glCompileShader(shader);
    return shader;
}

void drawBareFrame()
{
    const GLuint program = glCreateProgram();
    glAttachShader(program,
                   compile(GL_VERTEX_SHADER,
                           "attribute vec4 a_position; uniform mat4 u_transform; varying vec4 v_colour;"
                           "void main() { gl_Position = u_transform * a_position; v_colour = a_position; }"));
    glAttachShader(program, compile(GL_FRAGMENT_SHADER, "precision mediump float; varying vec4 v_colour;"
                                                        "void main() { gl_FragColor = v_colour; }"));
    glLinkProgram(program);
    glUseProgram(program);
    const float corners[] = {0.0f, 0.0f, 1.0f, 0.0f, 0.0f, 1.0f};
    const float identity[] = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};
    glUniformMatrix4fv(glGetUniformLocation(program, "u_transform"), 1, GL_FALSE, identity);
    glEnableVertexAttribArray(0);
    glVertexAttribPointer(0, 2, GL_FLOAT, GL_FALSE, 0, corners);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    glDrawArrays(GL_TRIANGLES, 0, 3);
    glFinish();
    _exit(EXIT_SUCCESS);
}

double measureStartMs(const char* argument)
{
    const std::string self = std::filesystem::read_symlink("/proc/self/exe").string();
    return measureMedianMs(
        [&]
        {
            std::string copy = argument;
            char* const arguments[] = {const_cast<char*>(self.c_str()), copy.data(), nullptr};
            pid_t child;
            int status = 0;
            if (posix_spawn(&child, self.c_str(), nullptr, nullptr, arguments, environ) != 0 ||
                waitpid(child, &status, 0) != child || status != 0)
                giveUp("the program does not start once more");
        });
}

void compareLoads(AssetCachePool& pool, const std::string& folder, const File& large)
{
    loadByEngine(pool, large); // loads everything that stays, and warms the file cache
    loadByHand(folder, large);
    const double engineMs = measureMedianMs([&] { loadByEngine(pool, large); });
    const double handMs = measureMedianMs([&] { loadByHand(folder, large); });
    std::printf("200,000 triangles, ms: engine %.2f, read and glBufferData %.2f, ratio %.2f\n", engineMs,
                handMs, engineMs / handMs);

    const size_t before = g_heapBytes;
    g_heapPeak = g_heapBytes;
    loadByEngine(pool, large);
    const double peak = double(g_heapPeak - before);
    std::printf("Heap peak: %.0f bytes; the file has %zu, its largest chunk %zu: file + %.2f chunks\n", peak,
                large.size, large.largestChunk, (peak - double(large.size)) / double(large.largestChunk));
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    std::string error;
    const auto surface = headless::Context::create({}, error);
    if (!surface)
        giveUp(error);
    if (argc == 2 && !std::strcmp(argv[1], START_ENGINE))
        drawEngineFrame();
    if (argc == 2 && !std::strcmp(argv[1], START_BARE))
        drawBareFrame();

    namespace fs = std::filesystem;
    const std::string folder =
        (fs::temp_directory_path() / ("loadbench." + std::to_string(getpid()))).string();
    fs::create_directories(folder);
    {
        const auto held = makeShared<AssetCachePool>();
        AssetCachePool& pool = *held;
        registerSource(pool, folder.c_str(), false);
        const File large = writeFile(folder, LARGE);
        const File small = writeFile(folder, SMALL);
        auto kept =
            makeShared<SceneNode>(); // keeps the program and the pictures that both files' materials share
        if (!loadGloFile(pool, kept, small.name.c_str()))
            giveUp("the engine does not load the file");
        if (argc == 2 && !std::strcmp(argv[1], FOR_COUNTING))
        {
            loadForCounting(pool, large);
            loadForCounting(pool, small);
        }
        else
        {
            std::printf("%s\n\n", surface->describe().c_str());
            compareLoads(pool, folder, large);
            const std::vector<uint64_t> counts = callgrind::isAvailable()
                                                     ? callgrind::count(FOR_COUNTING, {"gl", "__mem"})
                                                     : std::vector<uint64_t>();
            if (counts.size() == 2)
                std::printf("Instructions: %llu for 200,000 triangles, %llu for 50,000\n",
                            static_cast<unsigned long long>(counts[0]),
                            static_cast<unsigned long long>(counts[1]));
            const double engineMs = measureStartMs(START_ENGINE);
            const double bareMs = measureStartMs(START_BARE);
            std::printf("Start to first frame, ms: engine %.1f, context and one program %.1f, ratio %.2f\n",
                        engineMs, bareMs, engineMs / bareMs);
        }
        kept = nullptr;
        pool.flush();
        pool.flush();
    }
    fs::remove_all(folder);
    return EXIT_SUCCESS;
}
