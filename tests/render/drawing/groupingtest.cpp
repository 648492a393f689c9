#include "scenetest.h"

#include "orv/meshutil.h"

#include <random>

using namespace orv;

class GroupingTest : public SceneTest
{
protected:
    void TearDown() override
    {
        programs.clear();
        meshes.clear();
        materials.clear();
        SceneTest::TearDown();
    }

    /// Of two programs in turn, so that the order of the scene changes them at each solid.
    SharedPtr<Appearance> addMaterial(const Colour4f& colour)
    {
        if (programs.size() < 2)
            programs.push_back(
                makeProgram("attribute vec3 a_position; uniform mat4 u_transform;"
                            "void main() { gl_Position = u_transform * vec4(a_position, 1.0); }",
                            "uniform mediump vec4 u_colour; void main() { gl_FragColor = u_colour; }",
                            {{"u_transform", "T_MODEL_VIEW_PROJECTION"}, {"u_colour", "M_COLOUR"}}));
        const auto appearance = makeShared<Appearance>();
        appearance->setShaderProgram(programs[materials.size() % programs.size()]);
        appearance->setProperty("M_COLOUR", Vector4f(colour.r, colour.g, colour.b, colour.a));
        appearance->setCullingMode(CullingMode::CULL_NONE);
        materials.push_back(appearance);
        return appearance;
    }

    void addSolid(size_t material, size_t mesh, const Vector3f& position)
    {
        while (meshes.size() <= mesh)
            meshes.push_back(meshes.size() % 2 ? createSphereMesh(*pool->getMeshCache(), 6, 6, Vector2f(1, 1))
                                               : createSquareMesh(*pool->getMeshCache(), Vector2f(1, 1)));
        const auto solid = makeShared<Solid>(meshes[mesh], materials[material]);
        solid->setPosition(position);
        solid->setParent(scene);
    }

    support::Picture drawGrouped(bool grouped)
    {
        renderer->setOpaqueGrouped(grouped);
        renderFrame();
        return support::readFrame();
    }

    std::vector<SharedPtr<ShaderProgram>> programs;
    std::vector<SharedPtr<Mesh>> meshes;
    std::vector<SharedPtr<Appearance>> materials;
};

// Faults caught: a solid moved past one whose state makes the order matter, or that one moved; a solid lost or drawn
// twice; transparent ones drawn in groups.
TEST_F(GroupingTest, picturesStayTheSame)
{
    using Change = void (*)(Appearance&, int material);
    const Change changes[] = {
        [](Appearance& a, int) { a.setDepthTestEnabled(false); },
        [](Appearance& a, int) { a.setDepthWriteEnabled(false); },
        [](Appearance& a, int) { a.setDepthTestFunction(DepthFunction::GREATER); },
        [](Appearance& a, int) { a.setDepthTestFunction(DepthFunction::ALWAYS); },
        [](Appearance& a, int i) { a.setDepthOffset(0.0f, -1e6f * float(i)); }, // each takes the last one's
        [](Appearance& a, int) { a.setColourMask(true, false, true, true); },
        [](Appearance& a, int)
        {
            a.setStencilTestEnabled(true);
            a.setStencilFunction(StencilFace::BACK, StencilFunction::EQUAL, 0, 0xFF);
            a.setStencilFunction(StencilFace::FRONT, StencilFunction::EQUAL, 0, 0xFF);
            a.setStencilOperations(StencilFace::BACK, StencilOperation::KEEP, StencilOperation::KEEP,
                                   StencilOperation::INCR);
            a.setStencilOperations(StencilFace::FRONT, StencilOperation::KEEP, StencilOperation::KEEP,
                                   StencilOperation::INCR);
        },
        [](Appearance& a, int)
        {
            a.setBlendFactors(BlendFactor::SRC_ALPHA, BlendFactor::ONE, BlendFactor::ONE_MINUS_SRC_ALPHA,
                              BlendFactor::ONE_MINUS_SRC_ALPHA);
        },
    };
    std::mt19937 random(5);
    std::uniform_real_distribution<float> number(0.0f, 1.0f);
    for (size_t change = 0; change <= std::size(changes); ++change)
    {
        for (int i = 0; i < 12; ++i)
        {
            const float alpha = 0.5f;
            const auto material =
                addMaterial(Colour4f(number(random), number(random), number(random), alpha));
            if (i % 4 == 3 && change < std::size(changes))
                changes[change](*material, i);
        }
        for (int i = 0; i < 150; ++i)
            addSolid(random() % materials.size(), random() % 3,
                     Vector3f(number(random) * 3.0f - 1.5f, number(random) * 3.0f - 1.5f,
                              number(random) * 3.0f - 2.0f));
        const support::Picture expected = drawGrouped(false);
        EXPECT_TRUE(comparePictures("grouping", expected, drawGrouped(true), {0, 0.0}))
            << "change " << change;
        while (scene->getChildCount() > 0)
            scene->removeChild(scene->getChild(0));
        materials.clear();
    }
}

// Fault caught: groups that are none, in the frame or in what a mirror shows.
TEST_F(GroupingTest, everyProgramMaterialAndMeshIsTakenOnce)
{
    for (int i = 0; i < 4; ++i)
        addMaterial(Colour4f(0.25f * float(i), 0.5f, 0.5f, 1.0f));
    for (size_t i = 0; i < 60; ++i)
        addSolid(i % 4, i % 3, Vector3f(0.02f * float(i), 0.0f, -0.01f * float(i)));
    const auto count = [this](bool grouped)
    {
        drawGrouped(grouped);
        glcalls::resetCounts();
        drawGrouped(grouped);
        return std::vector<uint64_t>{glcalls::count(glUseProgram), glcalls::count(glUniform4fv),
                                     glcalls::count(glVertexAttribPointer), glcalls::count(glDrawElements)};
    };
    EXPECT_EQ((std::vector<uint64_t>{60, 60, 60, 60}), count(false));
    // A material has three meshes; the first of the next material is another one than the last.
    EXPECT_EQ((std::vector<uint64_t>{2, 4, 4 * 3, 60}), count(true));

    addSquare(Vector3f(0, 0, -4), 1.0f, makeMirror());
    const std::vector<uint64_t> both = count(true);
    EXPECT_EQ(2u + 2u + 1u, both[0]);
    EXPECT_EQ(4u + 4u, both[1]);
    EXPECT_EQ(121u, both[3]);
}
