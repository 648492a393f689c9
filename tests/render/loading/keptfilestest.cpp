#include "glotest.h"

#include "support/picture.h"
#include "support/tempdir.h"

#include "orv/animationgroup.h"
#include "orv/appearance.h"
#include "orv/camera.h"
#include "orv/filestreamsource.h"
#include "orv/light.h"
#include "orv/renderblock.h"
#include "orv/rendercontext.h"
#include "orv/simplerenderer.h"
#include "orv/solid.h"

using namespace orv;

// The files of the folder "kept", some of them converted, were written once and are never written again: later
// additions must not change how they are read.

namespace
{

const std::string FOLDER = ORV_TEST_FOLDER "/kept/";

/// What all versions of the format have.
glo::GloScene makeOldScene(const char* version, const char* tool)
{
    glo::GloScene scene;
    scene.info.gloVersion = version;
    scene.info.authoringTool = tool;
    scene.geometries = {makeSquareGeometry("square")};
    scene.materials = {makeMaterial("m", Vector4f(0.5f, 0.75f, 1, 1)),
                       makeMaterial("n", Vector4f(1, 1, 1, 1))};
    glo::StandardMaterial& textured = scene.materials[0].techniques[0];
    textured.diffuse.sampler.emplace().image = "features-dots.png";
    textured.ambient.colour = textured.diffuse.colour;
    textured.specular.colour = Vector4f(1, 1, 1, 1);
    textured.specularLevel = 0.5f;
    scene.materials[1].techniques[0].opacity = 0.5f;
    scene.materials[1].techniques[0].doubleSided = 1;
    glo::LightDefinition& lamp = scene.lights.emplace_back();
    lamp.name = "lamp";
    lamp.colour = Vector3f(1, 0.9f, 0.8f);
    scene.animations = {
        {"slide", {{0, 1}}, {makeChannel("node", "front", "translation", {0.3f, 0.2f, 1})}, {}}};
    scene.scene = glo::SceneData{
        "scene", makeNode("top", {makeSolidNode("square", "square", "m"),
                                  makeSolidNode("front", "square", "n"), makeLightNode("lamp")})};
    moveTo(scene.scene->top.children[2], Vector3f(1, 1, 3));
    return scene;
}

class KeptFilesTest : public GloTest
{
protected:
    void SetUp() override
    {
        GloTest::SetUp();
        m_pool->registerSource(makeShared<FileStreamSource>(FOLDER.c_str()));
        m_renderer = makeShared<SimpleRenderer>(makeShared<RenderContext>(), m_pool);
    }

    void TearDown() override
    {
        m_renderer.reset();
        GloTest::TearDown();
    }

    void addLamp(float ambientLevel)
    {
        const auto lamp = makeShared<Light>();
        lamp->setPosition(Vector3f(1, 2, 4));
        lamp->setAmbientLevel(ambientLevel);
        lamp->setParent(m_root, false);
    }

    void addSquare(const char* appearance)
    {
        glo::GloScene scene;
        scene.geometries = {makeSquareGeometry("square")};
        scene.materials = {makeMaterial("m", Vector4f(1, 1, 1, 1))};
        scene.scene = glo::SceneData{"scene", makeNode("top", {makeSolidNode("square", "square", "m")})};
        const Glo::Ptr loaded = load(scene);
        static_cast<Solid*>(loaded->getTopNode()->find("square"))
            ->setAppearance(loadAppearance(*m_pool, appearance));
    }

    /// @param width  of what is seen along -z.
    support::Picture draw(float width)
    {
        const auto camera = makeShared<Camera>();
        camera->setProjectionType(Camera::ProjectionType::ORTHOGRAPHIC);
        camera->setWidth(width);
        camera->setPosition(Vector3f(0, 0, 10));
        RenderBlock block(m_renderer, m_root, camera);
        block.setViewport(0, 0, 64, 64);
        block.setBackgroundColour(Colour4f(0.2f, 0.2f, 0.2f, 1.0f));
        block.render();
        return support::readFrame();
    }

    SharedPtr<SimpleRenderer> m_renderer; ///< one for all pictures, as it remembers GL's state
};

} // namespace

// Fault caught: an addition to the format that changes files which do not use it.
TEST_F(KeptFilesTest, sameBytes)
{
    EXPECT_EQ(support::readFile(FOLDER + "old-0.6.0.glo"), write(makeOldScene("0.6.0", "3ds_max2012")));
    EXPECT_EQ(support::readFile(FOLDER + "old-0.13.0.glo"), write(makeOldScene("0.13.0", "3ds_max2012")));
    EXPECT_EQ(support::readFile(FOLDER + "old-0.14.0.glo"), write(makeOldScene("0.14.0", "blender2.63.0")));
}

// Fault caught: an addition to the format that changes the meaning of existing files.
TEST_F(KeptFilesTest, samePictures)
{
    const struct
    {
        const char* file;
        float width;
        float ambientLevel; ///< of a lamp of the test's own; none below 0
        float time;
    } cases[] = {
        {"old-0.6.0.glo", 2, -1, 0},  {"old-0.13.0.glo", 2, -1, 2}, {"old-0.14.0.glo", 2, -1, 2},
        {"features.glo", 4.5f, 0, 0}, {"figure.glo", 2.5f, -1, 0},  {"figure.glo", 2.5f, -1, 0.95f},
        {"lit.ap", 1.2f, 0.1f, 0},    {"program.ap", 1.2f, -1, 0},
    };
    for (const auto& item : cases)
    {
        m_root = makeShared<SceneNode>();
        support::LogCapture log;
        const std::string file = item.file;
        if (file.find(".ap") != std::string::npos)
            addSquare(item.file);
        else
        {
            const Glo::Ptr loaded = loadGloFile(*m_pool, m_root, item.file);
            ASSERT_TRUE(loaded) << file << log.text();
            if (loaded->getAnimationGroup() && item.time > 0)
                loaded->getAnimationGroup()->apply(item.time);
        }
        if (item.ambientLevel >= 0)
            addLamp(item.ambientLevel);
        const support::Picture picture = draw(item.width);
        EXPECT_EQ(0, log.count('E') + log.count('W')) << file << log.text();
        const std::string name = file.substr(0, file.rfind('.')) + (item.time > 0 ? "-moved" : "");
        EXPECT_TRUE(support::comparePictures(name, support::readPng(FOLDER + name + "-drawn.png"), picture,
                                             {4, 0.01}));
    }
}
