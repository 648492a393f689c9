// The cost of loading: a scene file of 200,000 triangles beside read() and glBufferData() of the same bytes, and the
// time from a program's start to its first frame beside a bare context that links one program.
//
// "ms" are medians of wall time on the real driver, with the shader program and the file's pages already loaded. In the
// first load of a program the kernel gives it the memory, in later ones malloc() has it. "Instructions" are the
// engine's in one load, without GL calls and without the C library's copying and filling of memory, which callgrind
// tells apart where valgrind is installed; files of the same number of chunks and a quarter of the triangles show what
// depends on the size. "Heap peak" is the largest heap use of C++ code during a load, relative to the start.

#include "callgrind.h"
#include "timing.h"

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
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <memory>
#include <new>
#include <string_view>

using namespace orv;

namespace
{

constexpr int GEOMETRIES = 4;
constexpr int LARGE = 250; // columns and, times 0.4, rows of squares of each: 200,000 triangles in all
constexpr int SMALL = 125;
constexpr int LOADS = 101;
constexpr int PROCESSES = 11;
constexpr int STARTS = 21;

const char* const FOR_COUNTING = "--for-counting";     // what runs under callgrind
const char* const LOAD_BY_ENGINE = "--load-by-engine"; // print times
const char* const LOAD_BY_HAND = "--load-by-hand";
const char* const START_ENGINE = "--start-engine"; // draw one frame and leave
const char* const START_BARE = "--start-bare";

bool g_countsHeap = false; // not while time is measured
ptrdiff_t g_heapBytes = 0;
ptrdiff_t g_heapPeak = 0;

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
    if (g_countsHeap)
    {
        g_heapBytes += ptrdiff_t(malloc_usable_size(memory));
        g_heapPeak = std::max(g_heapPeak, g_heapBytes);
    }
    return memory;
}

[[gnu::noinline]] void* operator new(size_t size)
{
    void* memory = operator new(size, std::nothrow);
    return memory ? memory : (std::abort(), nullptr);
}

[[gnu::noinline]] void operator delete(void* memory) noexcept
{
    if (g_countsHeap)
        g_heapBytes -= ptrdiff_t(malloc_usable_size(memory));
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
    size_t largestGeometry = 0; ///< bytes of its vertices and indices
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
    glo::Material& material = scene.materials.emplace_back();
    material.name = "paint";
    material.techniques.emplace_back();
    for (int i = 0; i < GEOMETRIES; ++i)
    {
        scene.geometries.push_back(makeGrid(i, columns));
        glo::NodeData& node = scene.scene->top.children.emplace_back();
        node.name = "node" + std::to_string(i);
        glo::GeometryReference& reference = node.geometry.emplace();
        reference.geometry = scene.geometries.back().name;
        reference.materials = {material.name};
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
        file.largestGeometry = std::max(file.largestGeometry, vertices.size() + indexBytes);
    }
    return file;
}

/// What loading by hand gives, deleted after the time was taken.
class Buffers
{
public:
    explicit Buffers(size_t count) : m_names(count) { glGenBuffers(GLsizei(count), m_names.data()); }
    ~Buffers() { glDeleteBuffers(GLsizei(m_names.size()), m_names.data()); }
    Buffers(const Buffers&) = delete;
    Buffers& operator=(const Buffers&) = delete;

    GLuint operator[](size_t index) const { return m_names[index]; }

private:
    std::vector<GLuint> m_names;
};

/// The reference: reads the whole file at once, then fills every buffer from it.
std::unique_ptr<Buffers> loadByHand(const std::string& folder, const File& file)
{
    const std::unique_ptr<char[]> bytes(new char[file.size]);
    const int handle = open((folder + "/" + file.name).c_str(), O_RDONLY);
    if (handle < 0 || read(handle, bytes.get(), file.size) != ssize_t(file.size))
        giveUp("the file cannot be read");
    close(handle);
    auto buffers = std::make_unique<Buffers>(file.chunks.size());
    for (size_t i = 0; i < file.chunks.size(); ++i)
    {
        const File::Chunk& chunk = file.chunks[i];
        glBindBuffer(chunk.target, (*buffers)[i]);
        glBufferData(chunk.target, GLsizeiptr(chunk.size), bytes.get() + chunk.start, GL_STATIC_DRAW);
    }
    glFinish();
    return buffers;
}

/// What the engine loads, dropped after the time was taken.
class Scene
{
public:
    Scene(AssetCachePool& pool, const SharedPtr<Glo>& glo) : m_pool(pool), m_glo(glo) {}
    ~Scene()
    {
        m_glo = nullptr;
        m_pool.flush();
        m_pool.flush();
    }
    Scene(const Scene&) = delete;
    Scene& operator=(const Scene&) = delete;

    bool isLoaded() const { return bool(m_glo); }

private:
    AssetCachePool& m_pool;
    SharedPtr<Glo> m_glo;
};

std::unique_ptr<Scene> loadByEngine(AssetCachePool& pool, const File& file)
{
    auto scene = std::make_unique<Scene>(pool, loadGloFile(pool, {}, file.name.c_str()));
    if (!scene->isLoaded())
        giveUp("the engine does not load the file");
    glFinish();
    return scene;
}

void printComparison(const char* what, const std::vector<double>& engineMs, const char* reference,
                     const std::vector<double>& referenceMs)
{
    const double engine = getMedian(engineMs);
    const double other = getMedian(referenceMs);
    std::printf("%s, ms: engine %.3f, %s %.3f, ratio %.2f\n", what, engine, reference, other, engine / other);
}

struct Loader
{
    AssetCachePool* pool;
    const File* file;
    std::unique_ptr<Scene> scene; ///< dropped after the count was taken
};

void loadForCounting(AssetCachePool& pool, const File& file)
{
    loadByEngine(pool, file);
    Loader loader{&pool, &file, nullptr};
    const auto load = [](void* object, int)
    {
        Loader& what = *static_cast<Loader*>(object);
        what.scene = loadByEngine(*what.pool, *what.file);
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

struct LoadTimes
{
    double firstMs;
    double laterMs; ///< the median of the others
};

/// Runs in a program of its own, so that neither side finds memory that the other one used.
template <class Work>
void printLoadTimes(Work load)
{
    malloc_trim(0); // what writing the files took
    const double firstMs = measureMs(load);
    std::vector<double> later(LOADS);
    for (double& ms : later)
        ms = measureMs(load);
    std::printf("%f %f\n", firstMs, getMedian(later));
}

LoadTimes measureLoads(const char* argument)
{
    LoadTimes times;
    FILE* const output = popen((getProgram() + " " + argument).c_str(), "r");
    if (!output || std::fscanf(output, "%lf %lf", &times.firstMs, &times.laterMs) != 2 || pclose(output) != 0)
        giveUp("the program does not start once more");
    return times;
}

void compareLoads()
{
    std::vector<double> first[2], later[2];
    for (int i = 0; i < PROCESSES; ++i)
    {
        for (const int side : {0, 1})
        {
            const LoadTimes times = measureLoads(side == 0 ? LOAD_BY_ENGINE : LOAD_BY_HAND);
            first[side].push_back(times.firstMs);
            later[side].push_back(times.laterMs);
        }
    }
    const char* const reference = "read and glBufferData";
    printComparison("200,000 triangles, a program's first load", first[0], reference, first[1]);
    printComparison("200,000 triangles, again and again", later[0], reference, later[1]);
}

void printHeapPeak(AssetCachePool& pool, const File& file)
{
    loadByEngine(pool, file);
    g_countsHeap = true;
    loadByEngine(pool, file);
    g_countsHeap = false;
    std::printf("Heap peak, bytes: %td; the file has %zu, its largest geometry %zu: ratio %.2f\n", g_heapPeak,
                file.size, file.largestGeometry, double(g_heapPeak) / double(file.largestGeometry));
}

void printInstructions()
{
    const std::vector<uint64_t> counts =
        callgrind::isAvailable() ? callgrind::count(FOR_COUNTING, {"gl", "__mem"}) : std::vector<uint64_t>();
    if (counts.size() == 2)
        std::printf("Instructions: %llu for 200,000 triangles, %llu for 50,000\n",
                    static_cast<unsigned long long>(counts[0]), static_cast<unsigned long long>(counts[1]));
}

void start(const char* argument)
{
    const std::string self = getProgram();
    std::string copy = argument;
    char* const arguments[] = {const_cast<char*>(self.c_str()), copy.data(), nullptr};
    pid_t child;
    int status = 0;
    if (posix_spawn(&child, self.c_str(), nullptr, nullptr, arguments, environ) != 0 ||
        waitpid(child, &status, 0) != child || status != 0)
        giveUp("the program does not start once more");
}

void compareStarts()
{
    std::vector<double> engine, bare;
    for (int i = 0; i < STARTS; ++i)
    {
        engine.push_back(measureMs([] { start(START_ENGINE); }));
        bare.push_back(measureMs([] { start(START_BARE); }));
    }
    printComparison("Start to first frame", engine, "context and one program", bare);
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    std::string error;
    const auto surface = headless::Context::create({}, error);
    if (!surface)
        giveUp(error);
    const std::string_view mode = argc == 2 ? argv[1] : "";
    if (mode == START_ENGINE)
        drawEngineFrame();
    if (mode == START_BARE)
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
        if (mode == FOR_COUNTING)
        {
            loadForCounting(pool, large);
            loadForCounting(pool, small);
        }
        else if (mode == LOAD_BY_ENGINE)
            printLoadTimes([&] { return loadByEngine(pool, large); });
        else if (mode == LOAD_BY_HAND)
            printLoadTimes([&] { return loadByHand(folder, large); });
        else
        {
            std::printf("%s\n\n", surface->describe().c_str());
            std::fflush(stdout);
            compareLoads();
            printHeapPeak(pool, large);
            printInstructions();
            compareStarts();
        }
        kept = nullptr;
        pool.flush();
        pool.flush();
    }
    fs::remove_all(folder);
    return EXIT_SUCCESS;
}
