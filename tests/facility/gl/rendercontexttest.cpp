#include "orv/rendercontext.h"

#include "facilitytest.h"

#include "orv/appearance.h"

#include <cmath>
#include <functional>

using namespace orv;
using support::LogCapture;

namespace
{

using RenderContextTest = support::GlTest;
using Set = std::function<void(RenderContext&)>;

/// An action and the GL calls that it makes.
struct Step
{
    Set set;
    Calls expected;
};

} // namespace

// Fault caught: a wrong constant in the tables, or two entries swapped. GL is asked what it has.
TEST_F(RenderContextTest, everyValueReachesGlAsTheOneOfItsName)
{
    RenderContext context;
    const auto expectEach =
        [](const std::vector<int>& expected, GLenum state, const std::function<void(int)>& set)
    {
        for (size_t i = 0; i < expected.size(); ++i)
        {
            set(int(i));
            GLint value = -1;
            glGetIntegerv(state, &value);
            EXPECT_EQ(expected[i], value) << i;
        }
    };
    expectEach({GL_CONSTANT_ALPHA, GL_CONSTANT_COLOR, GL_DST_ALPHA, GL_DST_COLOR, GL_ONE,
                GL_ONE_MINUS_CONSTANT_ALPHA, GL_ONE_MINUS_CONSTANT_COLOR, GL_ONE_MINUS_DST_ALPHA,
                GL_ONE_MINUS_DST_COLOR, GL_ONE_MINUS_SRC_ALPHA, GL_ONE_MINUS_SRC_COLOR, GL_SRC_ALPHA,
                GL_SRC_ALPHA_SATURATE, GL_SRC_COLOR, GL_ZERO},
               GL_BLEND_SRC_RGB,
               [&](int i)
               {
                   const auto factor = BlendFactor(i);
                   context.setBlendFactors(factor, BlendFactor::ONE, BlendFactor::ZERO, BlendFactor::ZERO);
               });
    expectEach({GL_FUNC_ADD, GL_FUNC_REVERSE_SUBTRACT, GL_FUNC_SUBTRACT}, GL_BLEND_EQUATION_RGB,
               [&](int i) { context.setBlendFunctions(BlendFunction(i), BlendFunction::ADD); });
    expectEach({GL_BACK, GL_FRONT, GL_FRONT_AND_BACK}, GL_CULL_FACE_MODE,
               [&](int i) { context.setCullingMode(CullingMode(i)); });
    expectEach({GL_CCW, GL_CW}, GL_FRONT_FACE, [&](int i) { context.setWindingOrder(WindingOrder(i)); });
    const std::vector<int> comparisons = {GL_NEVER,   GL_LESS,     GL_EQUAL,  GL_LEQUAL,
                                          GL_GREATER, GL_NOTEQUAL, GL_GEQUAL, GL_ALWAYS};
    expectEach(comparisons, GL_DEPTH_FUNC, [&](int i) { context.setDepthTestFunction(DepthFunction(i)); });
    expectEach(comparisons, GL_STENCIL_BACK_FUNC,
               [&](int i) { context.setStencilFunction(StencilFace::BACK, StencilFunction(i), 0, 1); });
    expectEach({GL_ZERO, GL_KEEP, GL_REPLACE, GL_INCR, GL_DECR, GL_INVERT, GL_INCR_WRAP, GL_DECR_WRAP},
               GL_STENCIL_FAIL,
               [&](int i)
               {
                   context.setStencilOperations(StencilFace::FRONT, StencilOperation(i),
                                                StencilOperation::KEEP, StencilOperation::KEEP);
               });
}

// Faults caught: a default that is not GL's (the first setting is swallowed), repeated or swapped arguments.
TEST_F(RenderContextTest, settersCallGlOnChangeOnly)
{
    using F = BlendFactor;
    using O = StencilOperation;
    const auto setDefaults = [](RenderContext& c)
    {
        c.setBlendEnabled(false);
        c.setBlendColour(Colour4f());
        c.setBlendFactors(F::ONE, F::ONE, F::ZERO, F::ZERO);
        c.setBlendFunctions(BlendFunction::ADD, BlendFunction::ADD);
        c.setCullingMode(CullingMode::CULL_NONE);
        c.setWindingOrder(WindingOrder::WINDING_CCW);
        c.setLineWidth(1.0f);
        c.setColourMask(true, true, true, true);
        c.setDepthWriteEnabled(true);
        c.setDepthOffset(0.0f, 0.0f);
        c.setDepthTestEnabled(false);
        c.setDepthTestFunction(DepthFunction::LESS);
        c.setScissorTestEnabled(false);
        c.setScissorBox(0, 0, 64, 64);
        c.setStencilTestEnabled(false);
        setStencilFunction(c, StencilFunction::ALWAYS, 0, 0xFFFFFFFFu);
        setStencilOperations(c, O::KEEP, O::KEEP, O::KEEP);
        setStencilMask(c, 0xFFFFFFFFu);
        c.setViewport(0, 0, 64, 64);
        c.setDepthRange(0.0f, 1.0f);
        c.setClearColour(Colour4f());
        c.setClearDepth(1.0f);
        c.setClearStencil(0);
    };
    const Colour4f colour(0.25f, 0.5f, 0.75f, 1.0f);

    RenderContext::Ptr target;
    EXPECT_EQ((Calls{"glGetIntegerv(0x0c10, data)", "glGetIntegerv(0x0ba2, data)"}),
              callsOf([&] { target = makeShared<RenderContext>(); }));
    EXPECT_EQ(Calls(), callsOf([&] { setDefaults(*target); }));
    int changes = 0;
    const auto expectOnce = [&](const char* expected, const std::function<void()>& set)
    {
        EXPECT_EQ(Calls{expected}, callsOf(set));
        EXPECT_EQ(Calls(), callsOf(set)) << expected << " again";
        ++changes;
    };
    expectOnce("glEnable(0x0be2)", [&] { target->setBlendEnabled(true); });
    expectOnce("glBlendColor(0.25, 0.5, 0.75, 1)", [&] { target->setBlendColour(colour); });
    expectOnce(
        "glBlendFuncSeparate(0x0302, 0x0303, 0x0001, 0x8001)",
        [&] { target->setBlendFactors(F::SRC_ALPHA, F::ONE, F::ONE_MINUS_SRC_ALPHA, F::CONSTANT_COLOUR); });
    expectOnce("glBlendEquationSeparate(0x800a, 0x800b)",
               [&] { target->setBlendFunctions(BlendFunction::SUBTRACT, BlendFunction::REVERSE_SUBTRACT); });
    expectOnce("glFrontFace(0x0900)", [&] { target->setWindingOrder(WindingOrder::WINDING_CW); });
    expectOnce("glLineWidth(2)", [&] { target->setLineWidth(2.0f); });
    expectOnce("glColorMask(1, 0, 1, 0)", [&] { target->setColourMask(true, false, true, false); });
    expectOnce("glDepthMask(0)", [&] { target->setDepthWriteEnabled(false); });
    expectOnce("glEnable(0x0b71)", [&] { target->setDepthTestEnabled(true); });
    expectOnce("glDepthFunc(0x0206)", [&] { target->setDepthTestFunction(DepthFunction::GEQUAL); });
    expectOnce("glEnable(0x0c11)", [&] { target->setScissorTestEnabled(true); });
    expectOnce("glScissor(1, 2, 3, 4)", [&] { target->setScissorBox(1, 2, 3, 4); });
    expectOnce("glEnable(0x0b90)", [&] { target->setStencilTestEnabled(true); });
    expectOnce("glStencilFuncSeparate(0x0404, 0x0202, 3, 15)",
               [&] { target->setStencilFunction(StencilFace::FRONT, StencilFunction::EQUAL, 3, 15u); });
    expectOnce("glStencilOpSeparate(0x0405, 0x0000, 0x150a, 0x8507)",
               [&] { target->setStencilOperations(StencilFace::BACK, O::ZERO, O::INVERT, O::INCR_WRAP); });
    expectOnce("glStencilMaskSeparate(0x0404, 7)", [&] { target->setStencilMask(StencilFace::FRONT, 7u); });
    expectOnce("glViewport(4, 3, 2, 1)", [&] { target->setViewport(4, 3, 2, 1); });
    expectOnce("glDepthRangef(0.25, 0.5)", [&] { target->setDepthRange(0.25f, 0.5f); });
    expectOnce("glClearColor(0.25, 0.5, 0.75, 1)", [&] { target->setClearColour(colour); });
    expectOnce("glClearDepthf(0.5)", [&] { target->setClearDepth(0.5f); });
    expectOnce("glClearStencil(9)", [&] { target->setClearStencil(9); });
    EXPECT_EQ(size_t(changes), callsOf([&] { setDefaults(*target); }).size());
}

// Faults caught: culling enabled again with every face; the offset's lag "corrected"; both faces sent for one.
TEST_F(RenderContextTest, sequencesOfSettings)
{
    RenderContext target;
    const Step steps[] = {
        {[](auto& c) { c.setCullingMode(CullingMode::CULL_BACK); },
         {"glEnable(0x0b44)", "glCullFace(0x0405)"}},
        {[](auto& c) { c.setCullingMode(CullingMode::CULL_FRONT); }, {"glCullFace(0x0404)"}},
        {[](auto& c) { c.setCullingMode(CullingMode::CULL_NONE); }, {"glDisable(0x0b44)"}},
        {[](auto& c) { c.setDepthOffset(1.0f, 1.0f); }, {"glEnable(0x8037)", "glPolygonOffset(0, 0)"}},
        {[](auto& c) { c.setDepthOffset(2.0f, 2.0f); }, {"glPolygonOffset(1, 1)"}},
        {[](auto& c) { c.setDepthOffset(0.0f, 0.0f); }, {"glDisable(0x8037)"}},
        {[](auto& c) { c.setStencilFunction(StencilFace::STENCIL_BACK, StencilFunction::NEVER, 1, 255u); },
         {"glStencilFuncSeparate(0x0405, 0x0200, 1, 255)"}},
        {[](auto& c) { setStencilFunction(c, StencilFunction::NEVER, 1, 255u); },
         {"glStencilFuncSeparate(0x0404, 0x0200, 1, 255)"}},
    };
    for (size_t i = 0; i < std::size(steps); ++i)
        EXPECT_EQ(steps[i].expected, callsOf([&] { steps[i].set(target); })) << "step " << i;
}

// Faults caught: reading past a table, or an invalid value that is not reported.
TEST_F(RenderContextTest, invalidEnumsAreLoggedAndRefusedByGl)
{
    const struct
    {
        Set set;
        const char* message;
    } cases[] = {
        {[](auto& c)
         { c.setBlendFactors(BlendFactor(15), BlendFactor::ONE, BlendFactor::ONE, BlendFactor::ONE); },
         "Invalid blend factor 15"},
        {[](auto& c) { c.setBlendFunctions(BlendFunction(7), BlendFunction::ADD); },
         "Invalid blend function 7"},
        {[](auto& c) { c.setCullingMode(CullingMode(4)); }, "Invalid culling mode 4"},
        {[](auto& c) { c.setWindingOrder(WindingOrder(-1)); }, "Invalid winding order -1"},
        {[](auto& c) { c.setStencilFunction(StencilFace(2), StencilFunction::ALWAYS, 0, 0u); },
         "Invalid stencil face 2"},
        {[](auto& c) { c.setStencilFunction(StencilFace::BACK, StencilFunction(8), 0, 0u); },
         "Invalid stencil function 8"},
    };
    RenderContext target;
    for (const auto& test : cases)
    {
        LogCapture log;
        test.set(target);
        EXPECT_EQ(1, log.countMessage(test.message)) << test.message;
        EXPECT_EQ(GLenum(GL_INVALID_ENUM), glGetError()) << test.message;
    }
    EXPECT_EQ(BlendFunction(7), target.getState().blendFunctionColour);
}

// Faults caught: a revision trusted after a setter, a mirrored solid inside out, the lagging offset moved on.
TEST_F(RenderContextTest, applySendsDifferencesAndSkipsWhatWasApplied)
{
    RenderContext target;
    RenderState state;
    state.depthOffsetFactor = 1.0f;
    state.stencilFunction[1] = StencilFunction::EQUAL;
    state.stencilReference[1] = 1;
    state.stencilFunctionMask[1] = 0x0F;
    state.stencilWriteMask[1] = 0xF0;
    // The scissor box is cached as the surface's, a material's default is empty.
    EXPECT_EQ((Calls{"glEnable(0x0be2)", "glEnable(0x0b44)", "glCullFace(0x0405)", "glEnable(0x8037)",
                     "glPolygonOffset(0, 0)", "glEnable(0x0b71)", "glScissor(0, 0, 0, 0)",
                     "glStencilFuncSeparate(0x0404, 0x0202, 1, 240)", "glStencilMaskSeparate(0x0404, 240)"}),
              callsOf([&] { target.apply(state, 77, true); }));
    EXPECT_EQ(Calls(), callsOf([&] { target.apply(state, 77, true); }));
    EXPECT_EQ(Calls{"glFrontFace(0x0900)"}, callsOf([&] { target.apply(state, 77, true, true); }));
    EXPECT_EQ(Calls{"glFrontFace(0x0901)"}, callsOf([&] { target.apply(state, 77, true, false); }));
    EXPECT_EQ(Calls{"glDisable(0x0be2)"}, callsOf([&] { target.apply(state, 77, false); }));

    target.setDepthWriteEnabled(false);
    EXPECT_EQ(Calls{"glDepthMask(1)"}, callsOf([&] { target.apply(state, 77, false); }));

    state.lineWidth = 3.0f;
    EXPECT_EQ(Calls{"glLineWidth(3)"}, callsOf([&] { target.apply(state, 78, false); }));
}

// Faults caught: GL errors, or a value sent again and again, from numbers that GL does not take.
TEST_F(RenderContextTest, refusesWhatGlWouldRefuse)
{
    const float nan = NAN;
    RenderContext target;
    Appearance appearance;
    RenderState before = target.getState();
    const Set refused[] = {
        [](auto& c) { c.setLineWidth(0.0f); },
        [](auto& c) { c.setLineWidth(-1.0f); },
        [nan](auto& c) { c.setLineWidth(nan); },
        [](auto& c) { c.setScissorBox(0, 0, -1, 5); },
        [](auto& c) { c.setScissorBox(0, 0, 5, -1); },
        [](auto& c) { c.setViewport(0, 0, -1, 5); },
        [](auto& c) { c.setViewport(0, 0, 5, -1); },
        [nan](auto& c) { c.setDepthOffset(nan, 1.0f); },
        [nan](auto& c) { c.setDepthOffset(1.0f, nan); },
        [nan](auto& c) { c.setDepthRange(nan, 1.0f); },
        [nan](auto& c) { c.setDepthRange(0.0f, nan); },
        [nan](auto& c) { c.setClearDepth(nan); },
        [&](auto&) { appearance.setLineWidth(nan); },
        [&](auto&) { appearance.setLineWidth(0.0f); },
        [&](auto&) { appearance.setScissorBox(1, 1, -1, 1); },
        [&](auto&) { appearance.setDepthOffset(0.0f, nan); },
    };
    for (const Set& set : refused)
    {
        LogCapture log;
        EXPECT_EQ(Calls(), callsOf([&] { set(target); })) << &set - refused;
        EXPECT_EQ(1, log.count('E')) << &set - refused;
        EXPECT_TRUE(log.contains("; the old one is kept.")) << log.text();
    }
    EXPECT_EQ(before, target.getState());
    EXPECT_EQ(RenderState(), appearance.getRenderState());
    EXPECT_EQ(64, target.getViewportWidth());
    EXPECT_EQ(1.0f, target.getClearDepth());
    EXPECT_EQ(Calls{"glScissor(0, 0, 0, 0)"}, callsOf([&] { target.setScissorBox(0, 0, 0, 0); }));
}

// Faults caught: a property overwritten under those who linked it; programs that never learn of a later one.
TEST_F(RenderContextTest, propertiesKeepTheirFirstHolder)
{
    LogCapture log;
    RenderContext target;
    const auto first = makeValue(1.0f), second = makeValue(2);
    target.addProperty(first, "TIME");
    const uint64_t added = target.getPropertyRevision();
    target.addProperty(second, "TIME");
    EXPECT_EQ(1, log.countMessage("Property \"TIME\" already exists in context."));
    target.addProperty(nullptr, "NONE");
    target.addProperty(second, nullptr);
    EXPECT_EQ(3, log.count('E'));
    EXPECT_EQ(added, target.getPropertyRevision());

    EXPECT_TRUE(target.getProperty("TIME") == first);
    EXPECT_FALSE(target.getProperty("NONE"));
    SharedPtr<ShaderUniformBase> uniform = second;
    target.linkUniform(uniform, "UNKNOWN");
    EXPECT_TRUE(uniform == second);
    target.linkUniform(uniform, "TIME");
    EXPECT_TRUE(uniform == first);
}
