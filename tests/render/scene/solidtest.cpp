#include "scenetest.h"

#include "orv/indexbuffercache.h"
#include "orv/mesh.h"
#include "orv/vertexbuffercache.h"

#include <GLES2/gl2.h>

using namespace orv;
using support::LogCapture;

using SolidTest = SceneTest;

TEST_F(SolidTest, clampsJointsPerVertex)
{
    for (const auto& [given, stored] : {std::pair(4, 4), std::pair(5, 4), std::pair(-2, 0)})
    {
        LogCapture log;
        Solid solid;
        solid.setJointsPerVertex(given);
        EXPECT_EQ(stored, solid.getJointsPerVertex());
        EXPECT_EQ(given > 4, log.contains(" is greater than the maximum joints per vertex; clamping to 4"));
    }
}

// Faults caught: factors in the wrong order, an unbound joint collapsing its vertices, a count over the limit
// reported for every joint.
TEST_F(SolidTest, jointsMoveTheMeshIntoTheWorld)
{
    const auto solid = makeShared<Solid>();
    solid->setParent(scene);
    solid->setPosition(Vector3f(0, 5, 0));
    solid->setBindShapeTransform(scaleMatrix(Vector3f(2, 2, 2)));
    const auto joint = makeShared<SceneNode>();
    joint->setPosition(Vector3f(1, 0, 0));
    joint->setRotation(quaternionFromAxisAngle(Vector3f::Z_AXIS, Anglef::fromDegrees(90.0f)));
    solid->attachJoint(joint, translationMatrix(Vector3f(-3, 0, 0)));
    solid->attachJoint(nullptr, translationMatrix(Vector3f(-3, 0, 0)));

    const Vector4f moved = solid->getJointTransform(0) * Vector4f(2, 0, 0, 1);
    EXPECT_NEAR(1.0f, moved.x, 1e-5f);
    EXPECT_NEAR(1.0f, moved.y, 1e-5f);
    EXPECT_EQ(Vector4f(4, 5, 0, 1), solid->getJointTransform(1) * Vector4f(2, 0, 0, 1)) << "rest pose";

    solid->setMesh(createSquare(*pool, Vector2f(1, 1))->getMesh());
    solid->setAppearance(makePaint(Colour4f::WHITE));
    render();
    EXPECT_EQ(2, property<int>("J_COUNT"));
    EXPECT_EQ(solid->getJointTransform(1), property<Matrix4f>("J_WORLD", 1));

    LogCapture log;
    while (solid->getJointCount() < 23)
        solid->attachJoint(joint, Matrix4f::IDENTITY);
    EXPECT_EQ(1, log.count('E'));
    render();
    EXPECT_EQ(20, property<int>("J_COUNT"));
}

// Fault caught: what GL fills in for a fourth weight taken for one, or a fourth weight of one taken for what GL fills in.
TEST_F(SolidTest, shadersAreToldWhetherTheLastWeightIsThere)
{
    const SharedPtr<Solid> solid = addSquare(Vector3f(0, 0, 0), 1, makePaint(Colour4f::WHITE));
    solid->attachJoint(scene, Matrix4f::IDENTITY);
    for (int count = 4; count > 0; --count)
    {
        const auto vertices = pool->getVertexBufferCache()->create(nullptr);
        for (const auto& [name, components] : {std::pair("a_position", 3), std::pair("a_weights", count)})
            vertices->addAttrib(makeShared<VertexArray>(4, 4, components), name,
                                VertexBuffer::AttribFormat::FLOAT, VertexBuffer::AttribUsage::GL_BUFFER,
                                false);
        vertices->commit();
        solid->setMesh(makeShared<Mesh>(MeshHeader(), solid->getMesh()->getIndexBuffer(), vertices));
        render();
        EXPECT_EQ(count < 4 ? 1.0f : 0.0f, property<float>("J_WEIGHT_FILLED")) << count;
    }
}

// Fault caught: a solid below its own joint that keeps both alive for ever, or reads the joint after its end.
TEST_F(SolidTest, doesNotOwnTheJointsAboveIt)
{
    auto joint = makeShared<SceneNode>();
    joint->setPosition(Vector3f(1, 0, 0));
    const auto solid = makeShared<Solid>();
    solid->setParent(joint);
    solid->attachJoint(joint, translationMatrix(Vector3f(0, 1, 0)));
    EXPECT_EQ(1, joint->sharedGetCount());
    EXPECT_EQ(translationMatrix(Vector3f(1, 1, 0)), solid->getJointTransform(0));
    joint = nullptr;
    EXPECT_EQ(Matrix4f::IDENTITY, solid->getJointTransform(0)) << "unbound";
}

// Fault caught: mirrored solids turned inside out, or the appearance's own winding forgotten.
TEST_F(SolidTest, turnsTheWindingOfMirroredSolids)
{
    const auto appearance = makePaint(Colour4f::WHITE);
    const auto solid = addSquare(Vector3f(), 1.0f, appearance);
    const struct
    {
        float sceneScale, scale;
        WindingOrder order;
        const char* expected; // the cached state starts counter-clockwise, 0x0901
    } cases[] = {
        {1, 1, WindingOrder::WINDING_CCW, ""},
        {1, -1, WindingOrder::WINDING_CCW, "glFrontFace(0x0900)"},
        {-1, -1, WindingOrder::WINDING_CCW, "glFrontFace(0x0901)"},
        {-1, 1, WindingOrder::WINDING_CCW, "glFrontFace(0x0900)"},
        {-1, 1, WindingOrder::WINDING_CW, "glFrontFace(0x0901)"},
    };
    for (const auto& c : cases)
    {
        scene->setScale(Vector3f(c.sceneScale, 1, 1));
        solid->setScale(Vector3f(1, c.scale, 1));
        appearance->setWindingOrder(c.order);
        glcalls::startRecording();
        render();
        const std::vector<std::string> calls = glcalls::recorded("glFrontFace");
        EXPECT_EQ(c.expected, calls.empty() ? "" : calls.back()) << c.sceneScale << ' ' << c.scale;
    }
}

// Faults caught: the winding of a skinned mesh taken from the solid, which does not move it; that of any other mesh
// taken from its joints.
TEST_F(SolidTest, skinsKeepTheirRightSideOut)
{
    const auto skinned = makeShared<Appearance>();
    skinned->setShaderProgram(
        makeProgram("attribute vec3 a_position; uniform mat4 u_viewProjection, u_joints[20];"
                    "void main() { gl_Position = u_viewProjection * u_joints[1] * vec4(a_position, 1.0); }",
                    "void main() { gl_FragColor = vec4(1.0, 0.0, 0.0, 1.0); }",
                    {{"u_viewProjection", "T_VIEW_PROJECTION"}, {"u_joints", "J_WORLD"}}));
    const auto plain = makePaint(Colour4f::RED);
    const auto mirrorIf = [](unsigned bit) { return scaleMatrix(Vector3f(bit ? -1.0f : 1.0f, 1, 1)); };
    for (unsigned mirrored = 0; mirrored < 64; ++mirrored)
    {
        const auto joint = makeShared<SceneNode>();
        joint->setParent(scene);
        joint->setScale(Vector3f(mirrored & 1 ? -1.0f : 1.0f, 1, 1));
        const auto solid = addSquare(Vector3f(), 1.0f, mirrored & 32 ? plain : skinned);
        solid->setScale(Vector3f(mirrored & 2 ? -1.0f : 1.0f, 1, 1));
        solid->setBindShapeTransform(mirrorIf(mirrored & 4));
        const SharedPtr<SceneNode> bound =
            mirrored & 16 ? nullptr : joint; // an unbound one rests on the solid
        for (int i = 0; i < 3; ++i)
            solid->attachJoint(bound, mirrorIf(mirrored & 8));
        renderFrame();
        EXPECT_EQ(RED, support::readFrame().pixel(32, 32)) << mirrored;
        solid->setParent(nullptr);
        joint->setParent(nullptr);
    }
}

// Fault caught: the buffers of a mesh read by a program that was never told about them, or by none.
TEST_F(SolidTest, drawsWithTheCurrentProgramWhenItHasNone)
{
    const auto square = addSquare(Vector3f(), 1.0f, makeShared<Appearance>());
    glcalls::resetCounts();
    square->draw(*renderContext);
    EXPECT_EQ(0u, glcalls::count(glDrawElements));

    // The current program's values are those of its last use: red, over the whole view.
    const auto painted = addSquare(Vector3f(), 100.0f, makePaint(Colour4f::RED));
    square->setParent(nullptr);
    renderContext->setViewport(0, 0, 1, 1);
    renderFrame();
    renderContext->setViewport(0, 0, 64, 64);
    square->draw(*renderContext);
    EXPECT_EQ(RED, support::readFrame().pixel(32, 32));

    glUseProgram(0); // behind the engine's back, so it is told
    detail::bindingsChanged();
    glcalls::resetCounts();
    square->draw(*renderContext);
    Solid().draw(*renderContext);
    painted->getAppearance()->setShaderProgram(nullptr);
    painted->draw(*renderContext);
    EXPECT_EQ(0u, glcalls::count(glDrawElements));
}

// Fault caught: garbage drawn from what a lost context has left of a solid.
TEST_F(SolidTest, drawsNothingWithoutAllOfItsParts)
{
    const auto square = addSquare(Vector3f(), 1.0f, makePaint(Colour4f::RED));
    const auto countDraws = [&square](RenderContext& context)
    {
        glcalls::resetCounts();
        square->draw(context);
        return glcalls::count(glDrawArrays) + glcalls::count(glDrawElements);
    };
    const auto inOrder =
        create(*pool->getIndexBufferCache(), IndexBuffer::Primitive::TRIANGLE_FAN, 4, nullptr);
    square->setMesh(makeShared<Mesh>(MeshHeader(), inOrder, square->getMesh()->getVertexBuffer()));
    EXPECT_EQ(1u, countDraws(*renderContext));

    replaceContext();
    const auto fresh = makeShared<RenderContext>();
    pool->getVertexBufferCache()->getResourceCache()->release();
    square->getAppearance()->setShaderProgram(makeProgram("void main() { gl_Position = vec4(1.0); }",
                                                          "void main() { gl_FragColor = vec4(1.0); }", {}));
    EXPECT_EQ(0u, countDraws(*fresh)) << "vertices lost";
    square->setMesh(createSquare(*pool, Vector2f(1, 1))->getMesh());
    EXPECT_EQ(1u, countDraws(*fresh));
    pool->getShaderProgramCache()->getResourceCache()->release();
    EXPECT_EQ(0u, countDraws(*fresh)) << "program lost";
    pool->release();
    replaceContext();
}
