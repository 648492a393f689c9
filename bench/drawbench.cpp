// What a draw costs: the engine's frame beside a hand-written OpenGL ES 2.0 loop that draws the same picture.
//
// N cubes share a mesh, a program and ten appearances, taken in turn so that each draw changes the material; the
// camera moves from frame to frame. Both sides draw through the same table of GL calls (glcalls), so its few
// instructions per call are in all figures. "Driver" times are whole frames up to glFinish; in "alone" times
// every GL call is dropped, which leaves what the engine, or the loop, costs itself. Medians of many frames.

#include "glcalls/glcalls.h"
#include "headless/headless.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/camera.h"
#include "orv/indexbuffer.h"
#include "orv/mesh.h"
#include "orv/meshutil.h"
#include "orv/renderblock.h"
#include "orv/rendercontext.h"
#include "orv/sceneutil.h"
#include "orv/shaderprogramcache.h"
#include "orv/simplerenderer.h"
#include "orv/solid.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <vector>

using namespace orv;

namespace
{

constexpr int WIDTH = 320;
constexpr int HEIGHT = 240;
constexpr int APPEARANCES = 10;
constexpr int WARM_FRAMES = 5;
constexpr int TIMED_FRAMES = 31;
constexpr float SPACING = 4.0f; // of cubes with edges of 2

const char VERTEX_SOURCE[] = R"(
attribute vec3 a_position;
attribute vec3 a_normal;
uniform mat4 u_modelViewProjection;
uniform mat3 u_normal;
uniform vec4 u_colour;
varying vec4 v_colour;
void main()
{
    float level = 0.3 + 0.7 * max(dot(normalize(u_normal * a_normal), vec3(0.36, 0.48, 0.8)), 0.0);
    v_colour = vec4(u_colour.rgb * level, 1.0);
    gl_Position = u_modelViewProjection * vec4(a_position, 1.0);
}
)";

const char FRAGMENT_SOURCE[] = R"(
precision mediump float;
varying vec4 v_colour;
void main()
{
    gl_FragColor = v_colour;
}
)";

struct UniformSource
{
    const char* uniform;
    const char* property;
};

constexpr UniformSource UNIFORMS[] = {{"u_modelViewProjection", "T_MODEL_VIEW_PROJECTION"},
                                      {"u_normal", "T_NORMAL_MODEL"},
                                      {"u_colour", "M_DIFFUSE_COLOUR"}};

[[noreturn]] void giveUp(const char* reason)
{
    std::fprintf(stderr, "drawbench: %s\n", reason);
    std::exit(EXIT_FAILURE);
}

/// What both sides draw.
struct Scene
{
    std::vector<Matrix4f> transforms;
    Vector4f colours[APPEARANCES];
    float reach = 0.0f; // from the middle

    explicit Scene(int count)
    {
        const int edge = int(std::ceil(std::cbrt(float(count))));
        reach = SPACING * float(edge);
        for (int i = 0; i < count; ++i)
        {
            const Vector3f cell(float(i % edge), float(i / edge % edge), float(i / edge / edge));
            const Vector3f place = (cell - Vector3f(1.0f, 1.0f, 1.0f) * (float(edge - 1) / 2.0f)) * SPACING;
            const auto turn = quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(float(i * 7)));
            transforms.push_back(translationMatrix(place) * toMatrix4(turn));
        }
        for (int i = 0; i < APPEARANCES; ++i)
            colours[i] = Vector4f(float(i) / 9.0f, 1.0f - float(i) / 9.0f, float(i % 3) / 2.0f, 1.0f);
    }

    void placeCamera(Camera& camera, int frame) const
    {
        const float angle = 0.01f * float(frame);
        camera.setFar(reach * 4.0f);
        camera.setPosition(Vector3f(std::sin(angle), 0.4f, std::cos(angle)) * (reach * 1.4f));
        point(camera, Vector3f());
    }
};

/// One way of drawing the scene, with a GL context of its own.
class Contender
{
public:
    Contender()
    {
        headless::Options options;
        options.width = WIDTH;
        options.height = HEIGHT;
        std::string error;
        m_surface = headless::Context::create(options, error);
        if (!m_surface)
            giveUp(error.c_str());
    }
    virtual ~Contender() = default;

    virtual void draw(int frame) = 0;

    headless::Context& surface() { return *m_surface; }

private:
    std::unique_ptr<headless::Context> m_surface;
};

class EngineContender : public Contender
{
public:
    explicit EngineContender(const Scene& scene)
        : m_plan(scene)
        , m_pool(makeShared<AssetCachePool>())
        , m_scene(makeShared<SceneNode>())
        , m_camera(makeShared<Camera>())
    {
        const auto program = m_pool->getShaderProgramCache()->create(VERTEX_SOURCE, FRAGMENT_SOURCE, nullptr);
        const Mesh::Ptr mesh = createCubeMesh(*m_pool->getMeshCache(), Vector2f(1.0f, 1.0f));
        if (!program || !mesh)
            giveUp("the engine's scene cannot be made");
        for (int i = 0; i < program->getUniformCount(); ++i)
        {
            for (const UniformSource& source : UNIFORMS)
            {
                if (std::string(source.uniform) == program->getUniformInstanceName(i))
                    program->setUniformPropertyName(i, source.property);
            }
        }

        std::vector<Appearance::Ptr> appearances;
        for (const Vector4f& colour : scene.colours)
        {
            appearances.push_back(makeShared<Appearance>());
            appearances.back()->setShaderProgram(program);
            appearances.back()->setProperty("M_DIFFUSE_COLOUR", colour);
        }
        for (size_t i = 0; i < scene.transforms.size(); ++i)
        {
            const auto solid = makeShared<Solid>(mesh, appearances[i % APPEARANCES]);
            solid->setParent(m_scene);
            solid->setLocalTransform(scene.transforms[i]); // a new parent would rebuild it
        }
        const auto renderer = makeShared<SimpleRenderer>(makeShared<RenderContext>(), m_pool);
        m_block = makeShared<RenderBlock>(renderer, m_scene, m_camera);
        m_block->setBackgroundColour(Colour4f(0.0f, 0.0f, 0.0f, 1.0f));
    }

    ~EngineContender() override
    {
        surface().makeCurrent();
        m_block.reset();
        m_scene.reset();
        m_pool->flush();
        m_pool->flush();
        m_pool.reset();
    }

    void draw(int frame) override
    {
        m_plan.placeCamera(*m_camera, frame);
        m_block->render();
    }

private:
    const Scene& m_plan;
    SharedPtr<AssetCachePool> m_pool;
    SceneNode::Ptr m_scene;
    Camera::Ptr m_camera;
    RenderBlock::Ptr m_block;
};

/// The floor: what a programmer would write who knows this scene and nothing else.
class HandContender : public Contender
{
public:
    explicit HandContender(const Scene& scene) : m_plan(scene)
    {
        makeProgram();
        makeCube();
        for (const Matrix4f& transform : scene.transforms)
            m_normals.push_back(transpose(inverse(upper3x3(transform))));
        glEnable(GL_DEPTH_TEST);
        glEnable(GL_CULL_FACE);
        glViewport(0, 0, WIDTH, HEIGHT);
        glClearColor(0.0f, 0.0f, 0.0f, 1.0f);
    }

    void draw(int frame) override
    {
        m_plan.placeCamera(m_camera, frame);
        Matrix4f projection;
        m_camera.getProjection(&projection, float(WIDTH) / float(HEIGHT));
        const Matrix4f viewProjection = projection * inverse(m_camera.getWorldTransform());

        glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT | GL_STENCIL_BUFFER_BIT);
        for (size_t i = 0; i < m_plan.transforms.size(); ++i)
        {
            const Matrix4f modelViewProjection = viewProjection * m_plan.transforms[i];
            glUniformMatrix4fv(m_locations[0], 1, GL_FALSE, modelViewProjection.data());
            glUniformMatrix3fv(m_locations[1], 1, GL_FALSE, m_normals[i].data());
            glUniform4fv(m_locations[2], 1, m_plan.colours[i % APPEARANCES].data());
            glDrawElements(GL_TRIANGLES, INDEX_COUNT, GL_UNSIGNED_SHORT, nullptr);
        }
    }

private:
    static constexpr int INDEX_COUNT = 36;

    struct Vertex
    {
        Vector3f position;
        Vector3f normal;
    };

    static GLuint compile(GLenum kind, const char* source)
    {
        const GLuint shader = glCreateShader(kind);
        glShaderSource(shader, 1, &source, nullptr);
        glCompileShader(shader);
        return shader;
    }

    void makeProgram()
    {
        const GLuint program = glCreateProgram();
        glAttachShader(program, compile(GL_VERTEX_SHADER, VERTEX_SOURCE));
        glAttachShader(program, compile(GL_FRAGMENT_SHADER, FRAGMENT_SOURCE));
        glBindAttribLocation(program, 0, "a_position");
        glBindAttribLocation(program, 1, "a_normal");
        glLinkProgram(program);
        GLint isLinked = GL_FALSE;
        glGetProgramiv(program, GL_LINK_STATUS, &isLinked);
        if (!isLinked)
            giveUp("the hand-written program does not link");
        glUseProgram(program);
        for (int i = 0; i < 3; ++i)
            m_locations[i] = glGetUniformLocation(program, UNIFORMS[i].uniform);
    }

    void makeCube()
    {
        std::vector<Vertex> vertices;
        std::vector<uint16_t> indices;
        for (int axis = 0; axis < 3; ++axis)
        {
            for (float side : {-1.0f, 1.0f})
            {
                Vector3f normal;
                Vector3f across;
                normal[axis] = side;
                across[(axis + 1) % 3] = side;
                const Vector3f up = cross(normal, across);
                const int first = int(vertices.size());
                vertices.push_back({normal - across - up, normal});
                vertices.push_back({normal + across - up, normal});
                vertices.push_back({normal + across + up, normal});
                vertices.push_back({normal - across + up, normal});
                for (int corner : {0, 1, 2, 0, 2, 3})
                    indices.push_back(uint16_t(first + corner));
            }
        }
        GLuint buffers[2];
        glGenBuffers(2, buffers);
        glBindBuffer(GL_ARRAY_BUFFER, buffers[0]);
        glBufferData(GL_ARRAY_BUFFER, GLsizeiptr(vertices.size() * sizeof(Vertex)), vertices.data(),
                     GL_STATIC_DRAW);
        glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, buffers[1]);
        glBufferData(GL_ELEMENT_ARRAY_BUFFER, GLsizeiptr(indices.size() * sizeof(uint16_t)), indices.data(),
                     GL_STATIC_DRAW);
        glVertexAttribPointer(0, 3, GL_FLOAT, GL_FALSE, sizeof(Vertex), nullptr);
        glVertexAttribPointer(1, 3, GL_FLOAT, GL_FALSE, sizeof(Vertex),
                              reinterpret_cast<const void*>(offsetof(Vertex, normal)));
        glEnableVertexAttribArray(0);
        glEnableVertexAttribArray(1);
    }

    const Scene& m_plan;
    Camera m_camera;
    std::vector<Matrix3f> m_normals;
    GLint m_locations[3];
};

struct Figures
{
    double glCalls = 0.0; // of one frame
    double driverMs = 0.0;
    double aloneMs = 0.0;
    std::vector<uint8_t> picture; // of the last frame
};

double measureMedianMs(Contender& contender, int firstFrame)
{
    using Clock = std::chrono::steady_clock;
    std::vector<double> times;
    for (int i = 0; i < WARM_FRAMES + TIMED_FRAMES; ++i)
    {
        const Clock::time_point start = Clock::now();
        contender.draw(firstFrame + i);
        glFinish();
        times.push_back(std::chrono::duration<double, std::milli>(Clock::now() - start).count());
    }
    times.erase(times.begin(), times.begin() + WARM_FRAMES);
    std::nth_element(times.begin(), times.begin() + TIMED_FRAMES / 2, times.end());
    return times[TIMED_FRAMES / 2];
}

Figures measure(Contender& contender)
{
    Figures figures;
    contender.surface().makeCurrent();
    glcalls::reset();
    figures.driverMs = measureMedianMs(contender, 0);
    if (glGetError() != GL_NO_ERROR)
        giveUp("GL reports an error");

    glcalls::resetCounts();
    contender.draw(WARM_FRAMES + TIMED_FRAMES);
    figures.glCalls = double(glcalls::total());
    figures.picture = contender.surface().readPixels();

    glcalls::dropAll();
    figures.aloneMs = measureMedianMs(contender, 0);
    glcalls::dropAll(false);
    return figures;
}

/// The share of pixels that differ clearly: rounding moves a few at the edges of cubes.
double compare(const std::vector<uint8_t>& a, const std::vector<uint8_t>& b)
{
    size_t differing = 0;
    for (size_t i = 0; i < a.size(); i += 4)
    {
        for (size_t channel = 0; channel < 3; ++channel)
        {
            if (std::abs(a[i + channel] - b[i + channel]) > 8)
            {
                ++differing;
                break;
            }
        }
    }
    return double(differing) / double(a.size() / 4);
}

void print(const char* name, int count, const Figures& figures)
{
    std::printf("%6d  %-8s  %8.0f  %8.2f  %9.3f  %9.3f\n", count, name, figures.glCalls,
                figures.glCalls / count, figures.driverMs, figures.aloneMs);
}

void compareContenders(int count)
{
    const Scene scene(count);
    EngineContender engine(scene);
    HandContender hand(scene);
    const Figures engineFigures = measure(engine);
    const Figures handFigures = measure(hand);
    const double difference = compare(engineFigures.picture, handFigures.picture);
    if (difference > 0.005)
        giveUp("the two pictures differ, so the figures would not compare");
    print("engine", count, engineFigures);
    print("by hand", count, handFigures);
    std::printf("%6s  %-8s  %8s  %8.2f  %9.2f  %9.2f\n", "", "ratio", "",
                engineFigures.glCalls / handFigures.glCalls, engineFigures.driverMs / handFigures.driverMs,
                engineFigures.aloneMs / handFigures.aloneMs);
}

} // namespace

int main()
{
    std::string error;
    const auto surface = headless::Context::create({}, error);
    if (!surface)
        giveUp(error.c_str());
    std::printf("%s\n\n", surface->describe().c_str());
    std::printf("%6s  %-8s  %8s  %8s  %9s  %9s\n", "solids", "", "GL calls", "per draw", "driver ms",
                "alone ms");
    for (int count : {1000, 5000})
        compareContenders(count);
    return EXIT_SUCCESS;
}
