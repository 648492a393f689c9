#include "glotest.h"

#include "support/picture.h"

#include "orv/animationgroup.h"
#include "orv/camera.h"
#include "orv/renderblock.h"
#include "orv/rendercontext.h"
#include "orv/simplerenderer.h"

using namespace orv;
using support::Picture;
using support::Rgba;

namespace
{

constexpr Rgba RED = {255, 0, 0, 255};
constexpr Rgba GREEN = {0, 255, 0, 255};
constexpr Rgba BLUE = {0, 0, 255, 255};
constexpr Rgba GREY = {51, 51, 51, 255};

/// Glows, and is seen from both sides.
glo::Material makeGlow(const char* name, const Vector4f& colour)
{
    glo::StandardMaterial technique;
    technique.emissive.colour = colour;
    technique.doubleSided = 1;
    return {name, {technique}};
}

/// Edge length 1.
glo::Geometry makeCubeGeometry()
{
    std::vector<float> corners;
    for (int i = 0; i < 8; ++i)
        corners.insert(corners.end(), {i & 1 ? 0.5f : -0.5f, i & 2 ? 0.5f : -0.5f, i & 4 ? 0.5f : -0.5f});
    const glo::IndexData indices = {3, {0, 2, 1, 1, 2, 3, 4, 5, 6, 5, 7, 6, 0, 1, 4, 1, 5, 4,
                                        2, 6, 3, 3, 6, 7, 0, 4, 2, 2, 4, 6, 1, 3, 5, 3, 7, 5}};
    return {"cube", glo::makeVertexSet({{"a_position", 3, corners}}), {{glo::primitive::TRIANGLES, indices}}};
}

class GloPictureTest : public GloTest
{
protected:
    /// Seen along -z by a camera that shows x and y from -2 to 2 over 64 pixels; on dark grey.
    Picture draw()
    {
        const auto camera = makeShared<Camera>();
        camera->setProjectionType(Camera::ProjectionType::ORTHOGRAPHIC);
        camera->setWidth(4.0f);
        camera->setPosition(Vector3f(0, 0, 10));
        RenderBlock block(makeShared<SimpleRenderer>(makeShared<RenderContext>(), m_pool), m_root, camera);
        block.setViewport(0, 0, 64, 64);
        block.setBackgroundColour(Colour4f(0.2f, 0.2f, 0.2f, 1.0f));
        block.render();
        return support::readFrame();
    }

    /// x and y as the camera sees them.
    static Rgba at(const Picture& picture, float x, float y)
    {
        return picture.pixel(int(32 + 16 * x), int(32 - 16 * y));
    }
};

} // namespace

// Fault caught: a scene that lies on its side or back.
TEST_F(GloPictureTest, upAxis)
{
    const struct
    {
        uint32_t option;
        const char* version;
        Rgba top, left, right, centre;
    } cases[] = {
        {0, "0.14.0", BLUE, RED, GREY, GREEN}, {1, "0.14.0", RED, GREY, BLUE, GREEN},
        {2, "0.14.0", GREEN, GREY, BLUE, RED}, {0, "0.11.0", BLUE, RED, GREY, GREEN},
        {2, "0.11.0", GREEN, GREY, BLUE, RED},
    };
    for (const auto& item : cases)
    {
        glo::GloScene scene;
        scene.info.gloVersion = item.version;
        scene.upAxis = item.option;
        scene.geometries.push_back(makeCubeGeometry());
        scene.materials = {makeGlow("y", Vector4f(1, 0, 0, 1)), makeGlow("x", Vector4f(0, 0, 1, 1)),
                           makeGlow("z", Vector4f(0, 1, 0, 1))};
        scene.scene = glo::SceneData{"scene", makeNode("top")};
        const Vector3f places[] = {Vector3f(0, 1.2f, 0), Vector3f(1.2f, 0, 0), Vector3f(0, 0, 1.2f)};
        for (size_t i = 0; i < 3; ++i)
        {
            const glo::NodeData cube = makeSolidNode("cube", "cube", scene.materials[i].name);
            moveTo(scene.scene->top.children.emplace_back(cube), places[i]);
        }
        m_root = makeShared<SceneNode>();
        m_root->setPosition(Vector3f(0, 0, 1)); // only the file's own top node is turned
        ASSERT_TRUE(load(scene));

        const Picture picture = draw();
        const bool right = at(picture, 0, 1.2f) == item.top && at(picture, -1.2f, 0) == item.left &&
                           at(picture, 1.2f, 0) == item.right && at(picture, 0, 0) == item.centre;
        EXPECT_TRUE(right) << item.option << " in " << item.version << ": "
                           << support::savePicture("upaxis" + std::to_string(item.option), picture);
    }
}

// Fault caught: holes that hide what lies behind them, whichever is drawn first; colours of vertices without effect.
TEST_F(GloPictureTest, cutOutsShowWhatIsBehind)
{
    glo::GloScene scene;
    scene.materials = {makeMaterial("leaf", Vector4f(1, 1, 1, 1)), makeGlow("wall", Vector4f(0, 0, 1, 1))};
    scene.materials[0].techniques[0].selfIllumination = 1.0f;
    scene.surfaces.list = {{0, glo::surface::VERTEX_COLOUR | glo::surface::CUTOFF, 0.5f}};
    scene.geometries = {makeSquareGeometry("wall"), makeSquareGeometry("leaf")};
    scene.geometries[1].vertices = glo::makeVertexSet(
        {{"a_position", 3, {-0.5f, -0.5f, 0, 0.5f, -0.5f, 0, 0.5f, 0.5f, 0, -0.5f, 0.5f, 0}},
         {"a_colour", 4, {255, 0, 0, 255, 255, 0, 0, 0, 255, 0, 0, 0, 255, 0, 0, 255}, glo::type::UINT8, 1}});
    scene.scene = glo::SceneData{"scene", makeNode("top")};
    for (const float depth : {1.0f, -1.0f})
    {
        glo::NodeData wall = makeSolidNode("wall", "wall", "wall");
        glo::NodeData leaf = makeSolidNode("leaf", "leaf", "leaf");
        moveTo(wall, Vector3f(depth, 0, -1));
        moveTo(leaf, Vector3f(depth, 0, 0));
        if (depth > 0) // once before the wall, once behind it in the file
            scene.scene->top.children.insert(scene.scene->top.children.end(), {wall, leaf});
        else
            scene.scene->top.children.insert(scene.scene->top.children.end(), {leaf, wall});
    }
    ASSERT_TRUE(load(scene));
    const Picture picture = draw();
    for (const float x : {1.0f, -1.0f})
    {
        EXPECT_TRUE(at(picture, x - 0.3f, 0) == RED) << x << support::savePicture("cutout", picture);
        EXPECT_TRUE(at(picture, x + 0.3f, 0) == BLUE) << x;
    }
}

// Fault caught: a texture upside down, glass that hides what is behind it.
TEST_F(GloPictureTest, textureAndOpacity)
{
    // A true-colour TGA of two rows, the upper one (first, by the last header byte) red, the lower one blue.
    m_source->set("flag.tga",
                  {0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 0, 1, 0, 2, 0, 24, 0x20, 0, 0, 255, 255, 0, 0});

    glo::GloScene scene;
    scene.geometries.push_back(makeSquareGeometry("square"));
    scene.materials = {makeGlow("flag", Vector4f(1, 1, 1, 1)), makeGlow("glass", Vector4f(0, 1, 0, 1))};
    scene.materials[0].techniques[0].emissive.sampler = glo::Sampler{0, 0, 0, 1, 1, 0, "flag.tga"};
    scene.materials[1].techniques[0].opacity = 0.5f;
    glo::NodeData top = makeSolidNode("top", "square", "flag");
    moveTo(top.children.emplace_back(makeSolidNode("glass", "square", "glass")), Vector3f(0.5f, 0, 1));
    scene.scene = glo::SceneData{"scene", top};
    ASSERT_TRUE(load(scene));

    const Picture picture = draw();
    EXPECT_EQ(RED, at(picture, -0.25f, 0.25f));
    EXPECT_EQ(BLUE, at(picture, -0.25f, -0.25f));
    EXPECT_EQ(GREY, at(picture, -0.75f, 0.0f));
    EXPECT_TRUE(support::isNear({128, 128, 0, 255}, at(picture, 0.25f, 0.25f), 2))
        << at(picture, 0.25f, 0.25f);
    EXPECT_NEAR(25 + 128, at(picture, 0.75f, 0.25f).g, 3);
}

// Fault caught: skinned vertices that stay, fly off, or move twice with their node.
TEST_F(GloPictureTest, skin)
{
    glo::GloScene scene = makeFullScene();
    scene.materials[1] = makeGlow("blue", Vector4f(0, 0, 1, 1));
    scene.geometries[1].primitiveSets.pop_back();
    scene.skins[0].attachments[1].inverseBindPose = translationMatrix(Vector3f(0, 0.5f, 0));
    glo::NodeData& top = scene.scene->top;
    top.children.erase(top.children.begin()); // the plain square
    top.children[0].skin->materials = {"blue"};
    moveTo(top.children[0], Vector3f(100, 0, 0)); // of no matter: joints move what they move
    glo::NodeData& knee = top.children[1].children[0];
    moveTo(knee, Vector3f(0, -0.5f, 0)); // where it was bound
    scene.animations[0].animations.clear();
    const Glo::Ptr loaded = load(scene);
    ASSERT_TRUE(loaded);

    Picture picture = draw();
    EXPECT_EQ(BLUE, at(picture, 0.5f, 0.5f));
    EXPECT_EQ(GREY, at(picture, 0.5f, 1.5f));
    EXPECT_EQ(GREY, at(picture, 0.5f, -0.5f));

    // The lower edge follows the first joint, the upper edge the second, which hangs on the first.
    loaded->getTopNode()->find("knee")->setPosition(Vector3f(0, 0.25f, 0));
    loaded->getAnimationGroup()->apply(1.0f); // the first goes up by 1
    picture = draw();
    EXPECT_EQ(GREY, at(picture, 0.5f, 0.5f));
    EXPECT_EQ(BLUE, at(picture, 0.5f, 1.25f));
    EXPECT_EQ(BLUE, at(picture, 0.5f, 1.9f));
}
