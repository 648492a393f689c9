#include "scenetest.h"

#include "orv/indexbuffercache.h"
#include "orv/mesh.h"
#include "orv/renderblock.h"
#include "orv/renderdevice.h"
#include "orv/texturecubecache.h"
#include "orv/vertexbuffercache.h"

#include <GLES2/gl2.h>

#include <algorithm>
#include <array>
#include <functional>
#include <random>
#include <string>
#include <vector>

using namespace orv;

namespace
{

int getInteger(GLenum name)
{
    GLint value = 0;
    glGetIntegerv(name, &value);
    return value;
}

GLuint compileShader(GLenum kind, const char* source)
{
    const GLuint shader = glCreateShader(kind);
    glShaderSource(shader, 1, &source, nullptr);
    glCompileShader(shader);
    return shader;
}

/// Frames of a render block, and GL calls of an application that knows nothing of the engine between them.
class OwnGlTest : public SceneTest
{
protected:
    struct OwnCalls
    {
        const char* name;
        std::function<void()> make;
    };

    void SetUp() override
    {
        SceneTest::SetUp();
        makeOwnObjects();
        addSquare(Vector3f(-1.5f, 1.5f, 0.0f), 1.0f, makePaint(Colour4f::RED));
        const auto cube = createCube(*pool, Vector2f(1.0f, 1.0f));
        cube->getAppearance()->setProperty("M_DIFFUSE_TEXTURE", makeStripes());
        cube->setPosition(Vector3f(1.0f, 0.5f, -1.0f));
        cube->setParent(scene);
        addClientMemorySolid();
        const auto glass = makePaint(Colour4f(0.0f, 0.0f, 1.0f, 0.5f));
        glass->setBlendFactors(BlendFactor::SRC_ALPHA, BlendFactor::ONE, BlendFactor::ONE_MINUS_SRC_ALPHA,
                               BlendFactor::ONE);
        addSquare(Vector3f(0.5f, 0.5f, 0.5f), 1.0f, glass);
        addSquare(Vector3f(-1.0f, -1.5f, 0.0f), 1.0f, makeMirror());
        const auto light = makeShared<Light>();
        light->setPosition(Vector3f(0, 0, 5));
        light->setParent(scene);

        block = makeShared<RenderBlock>(renderer, scene, camera);
        block->setBackgroundColour(Colour4f(0.2f, 0.2f, 0.2f, 1.0f));
        block->render();
        undisturbed = support::readFrame();
        block->render();
        ASSERT_EQ(undisturbed.rgba, support::readFrame().rgba);
        ASSERT_GT(countColours(undisturbed), 20) << "a picture that shows little would tell little";
    }

    void TearDown() override
    {
        glUseProgram(0);
        glDeleteProgram(ownProgram);
        glDeleteBuffers(GLsizei(ownBuffers.size()), ownBuffers.data());
        glDeleteTextures(GLsizei(ownTextures.size()), ownTextures.data());
        glDeleteFramebuffers(1, &ownFramebuffer);
        drawnAlone = nullptr;
        block = nullptr;
        SceneTest::TearDown();
    }

    static int countColours(const support::Picture& picture)
    {
        std::vector<std::array<uint8_t, 4>> colours;
        for (size_t i = 0; i < picture.rgba.size(); i += 4)
            colours.push_back({picture.rgba[i], picture.rgba[i + 1], picture.rgba[i + 2], 255});
        std::sort(colours.begin(), colours.end());
        return int(std::unique(colours.begin(), colours.end()) - colours.begin());
    }

    void makeOwnObjects()
    {
        ownProgram = glCreateProgram();
        const GLuint shaders[] = {
            compileShader(GL_VERTEX_SHADER, "attribute vec4 a, b, c, d, e, f;"
                                            "void main() { gl_Position = a + b + c + d + e + f; }"),
            compileShader(GL_FRAGMENT_SHADER, "void main() { gl_FragColor = vec4(1.0); }")};
        for (const GLuint shader : shaders)
        {
            glAttachShader(ownProgram, shader);
            glDeleteShader(shader);
        }
        glLinkProgram(ownProgram);
        glGenBuffers(GLsizei(ownBuffers.size()), ownBuffers.data());
        for (const GLuint buffer : ownBuffers)
        {
            glBindBuffer(GL_ARRAY_BUFFER, buffer);
            glBufferData(GL_ARRAY_BUFFER, 64, ZEROS, GL_STATIC_DRAW);
        }
        glGenTextures(GLsizei(ownTextures.size()), ownTextures.data());
        glBindTexture(GL_TEXTURE_2D, ownTextures[0]);
        glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA, 1, 1, 0, GL_RGBA, GL_UNSIGNED_BYTE, ZEROS);
        glBindTexture(GL_TEXTURE_CUBE_MAP, ownTextures[1]);
        glGenFramebuffers(1, &ownFramebuffer);
        detail::bindingsChanged();
    }

    SharedPtr<Texture2D> makeStripes()
    {
        std::vector<uint8_t> pixels;
        for (int i = 0; i < 8 * 8; ++i)
            pixels.insert(pixels.end(), {uint8_t(i * 4), uint8_t(i % 8 * 32), 128});
        return pool->getTexture2DCache()->create(8, 8, Texture::Format::RGB, Texture::Type::UNSIGNED_BYTE,
                                                 pixels.data(), nullptr);
    }

    void addClientMemorySolid()
    {
        const float corners[] = {0.0f, -2.0f, 0.0f, 2.0f, -2.0f, 0.0f, 0.0f, 0.0f, 0.0f};
        const unsigned short order[] = {0, 1, 2};
        const auto array = makeShared<VertexArray>(3, int(sizeof(float)), 3);
        std::copy(std::begin(corners), std::end(corners), array->getData<float>());
        const auto vertices = makeShared<VertexBuffer>(nullptr);
        vertices->addAttrib(array, "a_position", VertexBuffer::AttribFormat::FLOAT,
                            VertexBuffer::AttribUsage::CLIENT_MEMORY, false);
        const auto indices = makeShared<IndexBuffer>(IndexBuffer::Primitive::TRIANGLES, 3, true, nullptr);
        std::copy(std::begin(order), std::end(order), indices->getIndices());
        const auto solid =
            makeShared<Solid>(makeShared<Mesh>(MeshHeader(), indices, vertices), makePaint(Colour4f::GREEN));
        solid->setParent(scene);
        drawnAlone = solid;
    }

    Appearance::Ptr makeMirror()
    {
        auto mirror = makeShared<Appearance>();
        mirror->setShaderProgram(makeProgram(
            "attribute vec3 a_position; attribute vec2 a_uv0; varying mediump vec2 v_uv; uniform mat4 u_t;"
            "void main() { v_uv = a_uv0; gl_Position = u_t * vec4(a_position, 1.0); }",
            "uniform sampler2D u_mirror; varying mediump vec2 v_uv;"
            "void main() { gl_FragColor = texture2D(u_mirror, v_uv) + vec4(0.2); }",
            {{"u_mirror", "M_MIRROR_TEXTURE"}, {"u_t", "T_MODEL_VIEW_PROJECTION"}}));
        return mirror;
    }

    static void setAllArrays(bool enabled)
    {
        for (GLuint i = 0; i < GLuint(getInteger(GL_MAX_VERTEX_ATTRIBS)); ++i)
        {
            if (enabled)
                glEnableVertexAttribArray(i);
            else
                glDisableVertexAttribArray(i);
        }
    }

    void bindOnEveryUnit(GLuint texture2D, GLuint textureCube)
    {
        for (int i = 0; i < 8; ++i)
        {
            glActiveTexture(GLenum(GL_TEXTURE0 + i));
            glBindTexture(GL_TEXTURE_2D, texture2D);
            glBindTexture(GL_TEXTURE_CUBE_MAP, textureCube);
        }
    }

    /// As an application does that draws an overlay of its own from memory.
    void drawOwnTriangle()
    {
        static const float POINTS[24] = {-1, -1, 0, 1, 1, -1, 0, 1, 0, 1, 0, 1};
        glUseProgram(ownProgram);
        glBindBuffer(GL_ARRAY_BUFFER, 0);
        glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
        for (GLuint i = 0; i < 6; ++i)
        {
            glEnableVertexAttribArray(i);
            glVertexAttribPointer(i, 4, GL_FLOAT, GL_FALSE, 0, POINTS);
        }
        glDrawArrays(GL_TRIANGLES, 0, 3);
    }

    /// Every kind of call that binds; each leaves what it does as it is.
    std::vector<OwnCalls> makeOwnCalls()
    {
        return {
            {"no program", [] { glUseProgram(0); }},
            {"own program", [this] { glUseProgram(ownProgram); }},
            {"no array buffer",
             []
             {
                 glBindBuffer(GL_ARRAY_BUFFER, 0);
                 glDisableVertexAttribArray(0);
             }},
            {"own array buffer", [this] { glBindBuffer(GL_ARRAY_BUFFER, ownBuffers[0]); }},
            {"no element buffer", [] { glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0); }},
            {"own element buffer", [this] { glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, ownBuffers[1]); }},
            {"all arrays off", [] { setAllArrays(false); }},
            {"all arrays on, at nothing",
             []
             {
                 GLuint gone = 0;
                 glGenBuffers(1, &gone);
                 glBindBuffer(GL_ARRAY_BUFFER, gone);
                 setAllArrays(true);
                 for (GLuint i = 0; i < 8; ++i)
                     glVertexAttribPointer(i, 4, GL_FLOAT, GL_FALSE, 0, nullptr);
                 glDeleteBuffers(1, &gone);
             }},
            {"pointers elsewhere",
             [this]
             {
                 glBindBuffer(GL_ARRAY_BUFFER, ownBuffers[0]);
                 for (GLuint i = 0; i < 8; ++i)
                     glVertexAttribPointer(i, 1, GL_UNSIGNED_BYTE, GL_TRUE, 0, nullptr);
             }},
            {"constants",
             []
             {
                 for (GLuint i = 0; i < 8; ++i)
                     glVertexAttrib4f(i, 0.1f, 0.2f, 0.3f, 0.4f);
             }},
            {"another active unit", [] { glActiveTexture(GL_TEXTURE5); }},
            {"no textures", [this] { bindOnEveryUnit(0, 0); }},
            {"own textures", [this] { bindOnEveryUnit(ownTextures[0], ownTextures[1]); }},
            {"own framebuffer and back",
             [this]
             {
                 glBindFramebuffer(GL_FRAMEBUFFER, ownFramebuffer);
                 glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, ownTextures[0],
                                        0);
                 glClear(GL_COLOR_BUFFER_BIT);
                 glBindFramebuffer(GL_FRAMEBUFFER, 0);
             }},
            {"own draw", [this] { drawOwnTriangle(); }},
            {"another solid alone", [this] { drawnAlone->draw(*renderContext); }},
            {"plain calls of the engine",
             [this]
             {
                 drawnAlone->getAppearance()->enable(*renderContext);
                 drawnAlone->getAppearance()->getShaderProgram()->bind(
                     *drawnAlone->getMesh()->getVertexBuffer());
                 drawnAlone->getMesh()->getIndexBuffer()->draw();
             }},
            {"a new texture", [this] { makeStripes(); }},
        };
    }

    /// The frame as it is without those calls, and GL left as RenderContext::DrawScope promises.
    void expectUndisturbedFrame(const std::string& after)
    {
        block->render();
        EXPECT_EQ(0, getInteger(GL_ARRAY_BUFFER_BINDING)) << after;
        EXPECT_EQ(0, getInteger(GL_ELEMENT_ARRAY_BUFFER_BINDING)) << after;
        EXPECT_EQ(GL_TEXTURE0, getInteger(GL_ACTIVE_TEXTURE)) << after;
        for (GLuint i = 0; i < GLuint(getInteger(GL_MAX_VERTEX_ATTRIBS)); ++i)
        {
            GLint enabled = 1;
            glGetVertexAttribiv(i, GL_VERTEX_ATTRIB_ARRAY_ENABLED, &enabled);
            EXPECT_EQ(0, enabled) << i << " after " << after;
        }
        EXPECT_EQ(GLenum(GL_NO_ERROR), glGetError()) << after;
        EXPECT_TRUE(comparePictures("owngl", undisturbed, support::readFrame(), {0, 0.0})) << after;
    }

    static constexpr uint8_t ZEROS[64] = {};

    GLuint ownProgram = 0;
    GLuint ownFramebuffer = 0;
    std::array<GLuint, 2> ownBuffers = {};
    std::array<GLuint, 2> ownTextures = {};
    SharedPtr<RenderBlock> block;
    Solid::Ptr drawnAlone; // also in the scene
    support::Picture undisturbed;
};

} // namespace

// Fault caught: a binding trusted although the application has changed it.
TEST_F(OwnGlTest, framesAreTheSameWhateverWasBoundBetweenThem)
{
    for (const OwnCalls& calls : makeOwnCalls())
    {
        calls.make();
        expectUndisturbedFrame(calls.name);
    }
}

// Fault caught: faults that only appear with two kinds of calls together.
TEST_F(OwnGlTest, framesAreTheSameAfterCallsInAnyOrder)
{
    const std::vector<OwnCalls> all = makeOwnCalls();
    std::mt19937 random(10);
    for (int frame = 0; frame < 150 && !HasFailure(); ++frame)
    {
        std::string made;
        for (unsigned i = random() % 5; i > 0; --i)
        {
            const OwnCalls& calls = all[random() % all.size()];
            calls.make();
            made += std::string(calls.name) + "; ";
        }
        expectUndisturbedFrame(made);
    }
}

// Fault caught: a material enabled outside of a block that trusts what it bound the last time.
TEST_F(OwnGlTest, directEnablesBindWhatTheyNeed)
{
    uint64_t textures = 0;
    for (const SharedPtr<SceneNode>& child : scene->getChildren())
    {
        if (child->getNodeType() != Solid::NODE_TYPE)
            continue;
        Appearance& appearance = *static_cast<Solid*>(child.get())->getAppearance();
        appearance.enable(*renderContext);
        glcalls::resetCounts();
        appearance.enable(*renderContext);
        EXPECT_EQ(1u, glcalls::count(glUseProgram)) << child->getName();
        textures += glcalls::count(glBindTexture);
    }
    EXPECT_LT(0u, textures);
}

// Faults caught: a direct draw that trusts the draw before it; forgetBindings() that forgets too little.
TEST_F(OwnGlTest, directDrawsBindWhatTheyNeed)
{
    const auto drawAll = [this](const std::function<void()>& between)
    {
        Background(Colour4f::BLACK).enable(*renderContext);
        for (const SharedPtr<SceneNode>& child : scene->getChildren())
        {
            between();
            if (child->getNodeType() == Solid::NODE_TYPE)
                static_cast<Solid*>(child.get())->draw(*renderContext);
        }
        return support::readFrame();
    };
    const support::Picture expected = drawAll([] {});
    for (const OwnCalls& calls : makeOwnCalls())
    {
        if (calls.name == std::string("own draw") || calls.name == std::string("another solid alone") ||
            calls.name == std::string("plain calls of the engine"))
            continue; // they draw
        EXPECT_EQ(expected.rgba, drawAll(calls.make).rgba) << calls.name;
        const RenderContext::DrawScope scope(*renderContext);
        const support::Picture picture = drawAll(
            [&]
            {
                calls.make();
                renderContext->forgetBindings();
            });
        EXPECT_EQ(expected.rgba, picture.rgba) << calls.name << ", in a scope";
    }

    glcalls::resetCounts();
    drawnAlone->draw(*renderContext);
    const uint64_t alone = glcalls::total();
    const RenderContext::DrawScope scope(*renderContext);
    drawnAlone->draw(*renderContext);
    glcalls::resetCounts();
    drawnAlone->draw(*renderContext);
    EXPECT_EQ(1u, glcalls::total()) << "in a scope the draw itself, instead of " << alone;
}

// Fault caught: rows written beyond the caller's memory when an application has asked for padded ones.
TEST_F(OwnGlTest, pixelsComeWithoutPadding)
{
    glPixelStorei(GL_PACK_ALIGNMENT, 8);
    std::vector<uint8_t> pixels(3 * 5 * 4 + 32, 99);
    RenderDevice::getPixels(0, 0, 3, 5, pixels.data());
    EXPECT_EQ(std::vector<uint8_t>(32, 99), std::vector<uint8_t>(pixels.end() - 32, pixels.end()));
    EXPECT_EQ(8, getInteger(GL_PACK_ALIGNMENT));
}
