#include "contender.h"

#include <GLES2/gl2.h>

#include <cstddef>

using namespace orv;

namespace
{

enum Location
{
    MODEL_VIEW_PROJECTION,
    NORMAL,
    LIGHT_DIRECTION,
    LIGHT_COLOUR,
    COLOUR,
    LOCATION_COUNT
};

constexpr const char* LOCATION_NAMES[] = {"u_modelViewProjection", "u_normal", "u_lightDirection",
                                          "u_lightColour", "u_colour"};

struct Vertex
{
    Vector3f position;
    Vector3f normal;
    Vector2f uv;
};

GLuint compile(GLenum kind, const char* source)
{
    const GLuint shader = glCreateShader(kind);
    glShaderSource(shader, 1, &source, nullptr);
    glCompileShader(shader);
    return shader;
}

/// Material after material, each bound once a frame; rotations are used as normal matrices.
class HandContender : public Contender
{
public:
    explicit HandContender(const DrawScene& plan) : m_plan(plan)
    {
        makeProgram();
        makeCube();
        makeTextures();
        for (int i = 0; i < DrawScene::TURNS; ++i)
            m_turns[i] = toMatrix3(m_plan.turns[i]);
        m_cubes.resize(m_plan.places.size());
        for (size_t i = 0; i < m_cubes.size(); ++i)
        {
            m_cubes[i].local.columns[3] = Vector4f(m_plan.places[i], 1.0f);
            turn(m_cubes[i].local, m_turns[m_plan.findTurn(i, 0)]);
            place(m_cubes[i], m_cubes[i].local);
        }
        glEnable(GL_DEPTH_TEST);
        glEnable(GL_CULL_FACE);
        glViewport(0, 0, WIDTH, HEIGHT);
        glClearColor(0.0f, 0.0f, 0.0f, 1.0f);
        glUniform4fv(m_locations[LIGHT_DIRECTION], 1, m_plan.lightDirection.data());
        glUniform4f(m_locations[LIGHT_COLOUR], 1.0f, 1.0f, 1.0f, 1.0f);
    }

    void draw(int frame) override
    {
        m_plan.placeCamera(m_camera, frame);
        Matrix4f projection;
        m_camera.getProjection(&projection, float(WIDTH) / float(HEIGHT));
        const Matrix4f viewProjection = projection * inverse(m_camera.getWorldTransform());

        move(frame);
        glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT | GL_STENCIL_BUFFER_BIT);
        for (size_t material = 0; material < DrawScene::MATERIALS; ++material)
        {
            glUniform4fv(m_locations[COLOUR], 1, m_plan.colours[material].data());
            glBindTexture(GL_TEXTURE_2D, m_textures[material]);
            for (size_t i = material; i < m_cubes.size(); i += DrawScene::MATERIALS)
            {
                const Matrix4f modelViewProjection = viewProjection * m_cubes[i].world;
                glUniformMatrix4fv(m_locations[MODEL_VIEW_PROJECTION], 1, GL_FALSE,
                                   modelViewProjection.data());
                glUniformMatrix3fv(m_locations[NORMAL], 1, GL_FALSE, m_cubes[i].normal.data());
                glDrawElements(GL_TRIANGLES, INDEX_COUNT, GL_UNSIGNED_SHORT, nullptr);
            }
        }
    }

private:
    static constexpr int INDEX_COUNT = 36;

    struct Cube
    {
        Matrix4f local;
        Matrix4f world;
        Matrix3f normal;
    };

    static void turn(Matrix4f& transform, const Matrix3f& rotation)
    {
        for (int i = 0; i < 3; ++i)
            transform.columns[i] = Vector4f(rotation.columns[i], 0.0f);
    }

    static void place(Cube& cube, const Matrix4f& world)
    {
        cube.world = world;
        cube.normal = upper3x3(world);
    }

    void move(int frame)
    {
        if (m_plan.motion == DrawScene::Motion::PARENT)
        {
            Matrix4f parent = Matrix4f::IDENTITY;
            turn(parent, m_turns[m_plan.findTurn(0, frame)]);
            for (Cube& cube : m_cubes)
                place(cube, parent * cube.local);
            return;
        }
        const size_t step = m_plan.getTurningStep();
        for (size_t i = 0; step > 0 && i < m_cubes.size(); i += step)
        {
            const Matrix3f& rotation = m_turns[m_plan.findTurn(i, frame)];
            turn(m_cubes[i].world, rotation);
            m_cubes[i].normal = rotation;
        }
    }

    void makeProgram()
    {
        const GLuint program = glCreateProgram();
        glAttachShader(program, compile(GL_VERTEX_SHADER, DrawScene::VERTEX_SOURCE));
        glAttachShader(program, compile(GL_FRAGMENT_SHADER, DrawScene::FRAGMENT_SOURCE));
        glBindAttribLocation(program, 0, "a_position");
        glBindAttribLocation(program, 1, "a_normal");
        glBindAttribLocation(program, 2, "a_uv0");
        glLinkProgram(program);
        GLint isLinked = GL_FALSE;
        glGetProgramiv(program, GL_LINK_STATUS, &isLinked);
        if (!isLinked)
            giveUp("the hand-written program does not link");
        glUseProgram(program);
        for (int i = 0; i < LOCATION_COUNT; ++i)
            m_locations[i] = glGetUniformLocation(program, LOCATION_NAMES[i]);
    }

    void makeTextures()
    {
        glGenTextures(DrawScene::MATERIALS, m_textures);
        for (int i = 0; i < DrawScene::MATERIALS; ++i)
        {
            glBindTexture(GL_TEXTURE_2D, m_textures[i]);
            glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
            glTexImage2D(GL_TEXTURE_2D, 0, GL_RGB, DrawScene::TEXTURE_SIZE, DrawScene::TEXTURE_SIZE, 0,
                         GL_RGB, GL_UNSIGNED_BYTE, m_plan.makeTexture(i).data());
            glGenerateMipmap(GL_TEXTURE_2D);
        }
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
                const uint16_t first = uint16_t(vertices.size());
                vertices.push_back({normal - across - up, normal, Vector2f(0.0f, 0.0f)});
                vertices.push_back({normal + across - up, normal, Vector2f(1.0f, 0.0f)});
                vertices.push_back({normal + across + up, normal, Vector2f(1.0f, 1.0f)});
                vertices.push_back({normal - across + up, normal, Vector2f(0.0f, 1.0f)});
                for (uint16_t corner : {0, 1, 2, 0, 2, 3})
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
        setAttribute(0, 3, offsetof(Vertex, position));
        setAttribute(1, 3, offsetof(Vertex, normal));
        setAttribute(2, 2, offsetof(Vertex, uv));
    }

    static void setAttribute(GLuint location, GLint size, size_t offset)
    {
        glEnableVertexAttribArray(location);
        glVertexAttribPointer(location, size, GL_FLOAT, GL_FALSE, sizeof(Vertex),
                              reinterpret_cast<const void*>(offset));
    }

    const DrawScene& m_plan;
    Camera m_camera;
    Matrix3f m_turns[DrawScene::TURNS];
    std::vector<Cube> m_cubes;
    GLuint m_textures[DrawScene::MATERIALS];
    GLint m_locations[LOCATION_COUNT];
};

} // namespace

std::unique_ptr<Contender> makeHandContender(const DrawScene& scene)
{
    return std::make_unique<HandContender>(scene);
}
