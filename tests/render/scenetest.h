#pragma once

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/background.h"
#include "orv/camera.h"
#include "orv/light.h"
#include "orv/rendercontext.h"
#include "orv/rendertarget.h"
#include "orv/sceneutil.h"
#include "orv/shaderprogramcache.h"
#include "orv/simplerenderer.h"
#include "orv/solid.h"
#include "orv/texture2dcache.h"

#include "support/gltest.h"
#include "support/logcapture.h"
#include "support/picture.h"

#include <cstring>
#include <memory>
#include <utility>
#include <vector>

constexpr support::Rgba RED = {255, 0, 0, 255};
constexpr support::Rgba GREEN = {0, 255, 0, 255};
constexpr support::Rgba BLUE = {0, 0, 255, 255};
constexpr support::Rgba WHITE = {255, 255, 255, 255};
constexpr support::Rgba BLACK = {0, 0, 0, 255};

/// A scene with a camera at (0, 0, 3) that looks at the origin and sees 3 units up, down, left and right
/// there. At the end things are dropped as the manual says; what stays behind or is logged is a failure.
class SceneTest : public support::GlTest
{
protected:
    void SetUp() override
    {
        GlTest::SetUp();
        renderContext = orv::makeShared<orv::RenderContext>();
        pool = orv::makeShared<orv::AssetCachePool>();
        renderer = orv::makeShared<orv::SimpleRenderer>(renderContext, pool);
        scene = orv::makeShared<orv::SceneNode>("scene");
        camera = orv::makeShared<orv::Camera>("camera");
        camera->setPosition(orv::Vector3f(0, 0, 3));
        camera->setFieldOfView(orv::Anglef::fromDegrees(90.0f));
    }

    void TearDown() override
    {
        support::LogCapture log;
        scene = nullptr;
        camera = nullptr;
        renderer = nullptr;
        m_paintProgram = nullptr;
        pool->flush();
        pool->flush();
        pool = nullptr;
        renderContext = nullptr;
        EXPECT_EQ(0, log.count('E')) << log.text();
        EXPECT_EQ("", glcalls::describeLiveNames());
        GlTest::TearDown();
    }

    void render() { renderer->render(camera.get(), *scene, orv::FlagMask(), orv::FlagMask()); }

    /// Clears to opaque black first.
    void renderFrame()
    {
        orv::Background(orv::Colour4f::BLACK).enable(*renderContext);
        render();
    }

    /// @param properties  GLSL names of uniforms and what they take.
    orv::SharedPtr<orv::ShaderProgram>
    makeProgram(const char* vertex, const char* fragment,
                const std::vector<std::pair<const char*, const char*>>& properties)
    {
        auto program = pool->getShaderProgramCache()->create(vertex, fragment, nullptr);
        for (int i = 0; i < program->getUniformCount(); ++i)
        {
            for (const auto& [uniform, property] : properties)
            {
                if (std::strcmp(uniform, program->getUniformInstanceName(i)) == 0)
                    program->setUniformPropertyName(i, property);
            }
        }
        return program;
    }

    /// Draws in the one colour M_COLOUR, whatever the light.
    orv::SharedPtr<orv::Appearance> makePaint(const orv::Colour4f& colour)
    {
        if (!m_paintProgram)
            m_paintProgram =
                makeProgram("attribute vec3 a_position; uniform mat4 u_transform;"
                            "void main() { gl_Position = u_transform * vec4(a_position, 1.0); }",
                            "uniform mediump vec4 u_colour; void main() { gl_FragColor = u_colour; }",
                            {{"u_transform", "T_MODEL_VIEW_PROJECTION"}, {"u_colour", "M_COLOUR"}});
        auto appearance = orv::makeShared<orv::Appearance>();
        appearance->setShaderProgram(m_paintProgram);
        appearance->setProperty("M_COLOUR", orv::Vector4f(colour.r, colour.g, colour.b, colour.a));
        return appearance;
    }

    /// Shows the middle of the reflection everywhere.
    orv::SharedPtr<orv::Appearance> makeMirror()
    {
        auto appearance = orv::makeShared<orv::Appearance>();
        appearance->setShaderProgram(makeProgram(
            "attribute vec3 a_position; uniform mat4 u_transform;"
            "void main() { gl_Position = u_transform * vec4(a_position, 1.0); }",
            "uniform sampler2D u_mirror; void main() { gl_FragColor = texture2D(u_mirror, vec2(0.5)); }",
            {{"u_transform", "T_MODEL_VIEW_PROJECTION"}, {"u_mirror", "M_MIRROR_TEXTURE"}}));
        return appearance;
    }

    orv::SharedPtr<orv::RenderTarget> makeTarget(unsigned width, unsigned height)
    {
        const auto texture = pool->getTexture2DCache()->create(
            width, height, orv::Texture::Format::RGB, orv::Texture::Type::UNSIGNED_BYTE, nullptr, nullptr);
        return orv::makeShared<orv::RenderTarget>(texture, nullptr, true, false);
    }

    /// The unit square about a place, facing +z, in the scene.
    orv::SharedPtr<orv::Solid> addSquare(const orv::Vector3f& position, float size,
                                         const orv::SharedPtr<orv::Appearance>& appearance)
    {
        auto solid = orv::createSquare(*pool, orv::Vector2f(1, 1));
        solid->setPosition(position);
        solid->setScale(orv::Vector3f(size, size, size));
        solid->setAppearance(appearance);
        solid->setParent(scene);
        return solid;
    }

    template <class T>
    T property(const char* name, int index = 0)
    {
        T value{};
        const orv::SharedPtr<orv::ShaderUniformBase> holder = renderContext->getProperty(name);
        EXPECT_TRUE(holder && holder->getValue(value, index)) << name;
        return value;
    }

    orv::SharedPtr<orv::RenderContext> renderContext;
    orv::SharedPtr<orv::AssetCachePool> pool;
    orv::SharedPtr<orv::SimpleRenderer> renderer;
    orv::SharedPtr<orv::SceneNode> scene;
    orv::SharedPtr<orv::Camera> camera;

private:
    orv::SharedPtr<orv::ShaderProgram> m_paintProgram;
};
