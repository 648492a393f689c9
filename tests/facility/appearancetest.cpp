#include "orv/appearance.h"

#include "orv/assetcachepool.h"
#include "orv/propertycollector.h"
#include "orv/propertyref.h"
#include "orv/rendercontext.h"
#include "orv/shaderprogramcache.h"
#include "orv/texture2dcache.h"
#include "orv/texturecubecache.h"
#include "orv/texturepropertyutil.h"

#include "support/gltest.h"
#include "support/logcapture.h"

using namespace orv;
using support::LogCapture;

namespace
{

const char* const VERTEX = "attribute vec4 a_position;\n"
                           "uniform float u_a, u_b, u_c;\n"
                           "void main() { gl_Position = a_position * (u_a + u_b + u_c); }\n";
const char* const FRAGMENT = "void main() { gl_FragColor = vec4(1.0); }\n";

class AppearanceTest : public support::GlTest
{
protected:
    void SetUp() override
    {
        GlTest::SetUp();
        LogCapture silence;
        m_pool = makeShared<AssetCachePool>();
        m_context = makeShared<RenderContext>();
        m_appearance = makeShared<Appearance>();
    }

    void TearDown() override
    {
        m_appearance.reset();
        m_context.reset();
        m_pool->flush();
        m_pool->flush();
        EXPECT_EQ("", glcalls::describeLiveNames());
        GlTest::TearDown();
    }

    /// @param properties  what the uniforms u_a, u_b and u_c take.
    SharedPtr<ShaderProgram> makeProgram(const std::map<std::string, std::string>& properties)
    {
        const SharedPtr<ShaderProgram> program =
            m_pool->getShaderProgramCache()->create(VERTEX, FRAGMENT, nullptr);
        for (int i = 0; i < program->getUniformCount(); ++i)
        {
            const auto found = properties.find(program->getUniformInstanceName(i));
            program->setUniformPropertyName(i, found != properties.end() ? found->second.c_str() : "");
        }
        return program;
    }

    /// What GL holds for one of the uniforms.
    float getSent(const ShaderProgram& program, const char* uniform)
    {
        GLfloat value = -1.0f;
        glGetUniformfv(program.getId(), glGetUniformLocation(program.getId(), uniform), &value);
        return value;
    }

    SharedPtr<AssetCachePool> m_pool;
    SharedPtr<RenderContext> m_context;
    SharedPtr<Appearance> m_appearance;
};

/// Writes down what it is shown; stops after so many.
class Notes : public PropertyCollector
{
public:
    explicit Notes(int limit) : m_limit(limit) {}

    bool collect(const SharedPtr<ShaderUniformBase>& uniform, const char* name, int uniformIndex) override
    {
        text += std::string(name) + (uniform ? "" : "?") + (uniformIndex < 0 ? "- " : "+ ");
        return --m_limit > 0;
    }

    std::string text;

private:
    int m_limit;
};

} // namespace

// Fault caught: a blend state that is taken for opaque is drawn without blending and out of order.
TEST(Appearance, opaqueOnlyWithTheDefaultBlending)
{
    using F = BlendFactor;
    using E = BlendFunction;
    const struct
    {
        F factors[4];
        E functions[2];
        bool opaque;
    } cases[] = {
        {{F::ONE, F::ONE, F::ZERO, F::ZERO}, {E::ADD, E::ADD}, true},
        {{F::SRC_ALPHA, F::SRC_ALPHA, F::ONE_MINUS_SRC_ALPHA, F::ONE_MINUS_SRC_ALPHA},
         {E::ADD, E::ADD},
         false},
        {{F::ONE, F::SRC_ALPHA, F::ZERO, F::ZERO}, {E::ADD, E::ADD}, false},
        {{F::ONE, F::ONE, F::ONE, F::ZERO}, {E::ADD, E::ADD}, false},
        {{F::ONE, F::ONE, F::ZERO, F::ONE}, {E::ADD, E::ADD}, false},
        {{F::ONE, F::ONE, F::ZERO, F::ZERO}, {E::SUBTRACT, E::ADD}, false},
        {{F::ONE, F::ONE, F::ZERO, F::ZERO}, {E::ADD, E::REVERSE_SUBTRACT}, false},
    };
    for (const auto& test : cases)
    {
        Appearance appearance;
        const F* factors = test.factors;
        appearance.setBlendFactors(factors[0], factors[1], factors[2], factors[3]);
        appearance.setBlendFunctions(test.functions[0], test.functions[1]);
        appearance.setBlendColour(Colour4f(1, 1, 1, 1));
        EXPECT_EQ(test.opaque, appearance.isOpaque()) << &test - cases;
        appearance.setForceOpaque(true);
        EXPECT_TRUE(appearance.isOpaque());
    }
}

// Faults caught: a setter whose change never reaches GL, the stored compare mask sent in place of the write mask,
// winding that stays turned, state sent again.
TEST_F(AppearanceTest, sendsItsState)
{
    using F = BlendFactor;
    using O = StencilOperation;
    using Calls = std::vector<std::string>;
    const struct
    {
        std::function<void(Appearance&)> set;
        Calls expected;
    } steps[] = {
        {[](auto& a) { a.setBlendFactors(F::SRC_ALPHA, F::ONE, F::ONE_MINUS_SRC_ALPHA, F::ZERO); },
         {"glEnable(0x0be2)", "glBlendFuncSeparate(0x0302, 0x0303, 0x0001, 0x0000)"}},
        {[](auto& a) { a.setBlendColour(Colour4f(1, 0, 0, 0)); }, {"glBlendColor(1, 0, 0, 0)"}},
        {[](auto& a) { a.setBlendFunctions(BlendFunction::SUBTRACT, BlendFunction::ADD); },
         {"glBlendEquationSeparate(0x800a, 0x8006)"}},
        {[](auto& a) { a.setForceOpaque(true); }, {"glDisable(0x0be2)"}},
        {[](auto& a) { a.setCullingMode(CullingMode::CULL_FRONT); }, {"glCullFace(0x0404)"}},
        {[](auto& a) { a.setWindingOrder(WindingOrder::WINDING_CW); }, {"glFrontFace(0x0900)"}},
        {[](auto& a) { a.setLineWidth(2.0f); }, {"glLineWidth(2)"}},
        {[](auto& a) { a.setColourMask(true, true, false, true); }, {"glColorMask(1, 1, 0, 1)"}},
        {[](auto& a) { a.setDepthWriteEnabled(false); }, {"glDepthMask(0)"}},
        {[](auto& a) { a.setDepthOffset(1.0f, 2.0f); }, {"glEnable(0x8037)", "glPolygonOffset(0, 0)"}},
        {[](auto& a) { a.setDepthTestEnabled(false); }, {"glDisable(0x0b71)"}},
        {[](auto& a) { a.setDepthTestFunction(DepthFunction::ALWAYS); }, {"glDepthFunc(0x0207)"}},
        {[](auto& a) { a.setScissorTestEnabled(true); }, {"glEnable(0x0c11)"}},
        {[](auto& a) { a.setScissorBox(1, 2, 3, 4); }, {"glScissor(1, 2, 3, 4)"}},
        {[](auto& a) { a.setStencilTestEnabled(true); }, {"glEnable(0x0b90)"}},
        {[](auto& a) { a.setStencilFunction(StencilFace::FRONT, StencilFunction::EQUAL, 1, 0x0f); },
         {"glStencilFuncSeparate(0x0404, 0x0202, 1, 4294967295)"}},
        {[](auto& a) { a.setStencilOperations(StencilFace::BACK, O::ZERO, O::KEEP, O::INCR); },
         {"glStencilOpSeparate(0x0405, 0x0000, 0x1e00, 0x1e02)"}},
        {[](auto& a) { a.setStencilMask(StencilFace::FRONT, 0xf0); },
         {"glStencilFuncSeparate(0x0404, 0x0202, 1, 240)", "glStencilMaskSeparate(0x0404, 240)"}},
    };
    const auto enable = [this](bool turnWinding)
    {
        glcalls::startRecording();
        m_appearance->enable(*m_context, turnWinding);
        return glcalls::recorded();
    };
    enable(false); // the defaults
    for (const auto& step : steps)
    {
        step.set(*m_appearance);
        EXPECT_EQ(step.expected, enable(false));
    }
    EXPECT_EQ(Calls{}, enable(false));
    EXPECT_EQ(Calls{"glFrontFace(0x0901)"}, enable(true));
    EXPECT_EQ(Calls{"glFrontFace(0x0900)"}, enable(false));

    LogCapture log;
    m_appearance->setStencilMask(StencilFace(2), 0);
    EXPECT_EQ(1, log.countMessage("Invalid stencil face 2"));
}

// Fault caught: properties created, grown or replaced where they must not be.
TEST(Appearance, propertiesFromCode)
{
    const char* const grown =
        "Property array \"P[3]\" value is being set without prior knowledge of the size of the "
        "array; please define size of array explicitly using addProperty() before setting "
        "values.";
    const struct
    {
        std::function<void(Appearance&)> change;
        const char* message; ///< null for none
        int size;            ///< of P; 0 for none
        std::vector<float> values;
    } cases[] = {
        {[](Appearance& a) { a.addProperty<float>("P", 0); },
         "Size of property cannot be less than 1.",
         0,
         {}},
        {[](Appearance& a) { a.setProperty("P", 1.0f, -1); }, "Property index cannot be less than 0.", 0, {}},
        {[](Appearance& a) { a.setProperty("P", 2.0f, 0); }, nullptr, 1, {2}},
        {[](Appearance& a) { a.setProperty("P", 2.0f, 3); }, grown, 4, {0, 0, 0, 2}},
        {[](Appearance& a) { a.setProperty("P", 1.0f), a.setProperty("P", 2.0f, 1); },
         "Uniform value index (1) out of range [0:1).",
         1,
         {1}},
        {[](Appearance& a) { a.setProperty("P", 1.0f), a.setProperty("P", 7), a.addProperty<float>("Q", 1); },
         nullptr,
         1,
         {1}},
        {[](Appearance& a) { a.setProperty("P", 1.0f), a.addProperty<float>("P", 2); }, nullptr, 2, {0, 0}},
        {[](Appearance& a) { EXPECT_FALSE(a.setProperty("P", 1.0f, 2147483647)); },
         "Size of property cannot be less than 1.",
         0,
         {}},
    };
    for (const auto& test : cases)
    {
        Appearance appearance;
        LogCapture log;
        test.change(appearance);
        const size_t number = size_t(&test - cases);
        EXPECT_EQ(test.size != 0, appearance.propertyExists("P")) << number;
        const SharedPtr<ShaderUniformBase>& uniform = appearance.getPropertyUniform("P");
        ASSERT_EQ(test.size, uniform ? uniform->getSize() : 0) << number;
        for (size_t i = 0; i < test.values.size(); ++i)
        {
            float value = -1.0f;
            EXPECT_TRUE(uniform->getValue(value, int(i)));
            EXPECT_EQ(test.values[i], value) << number << "[" << i << "]";
        }
        EXPECT_EQ(test.message == nullptr, log.text().empty()) << number << ": " << log.text();
        EXPECT_TRUE(!test.message || log.contains(test.message)) << number << ": " << log.text();
    }
    Appearance one, other;
    EXPECT_EQ(&one.getPropertyUniform("none"), &other.getPropertyUniform("nothing"));
}

// Faults caught: a uniform fed by the wrong property, by the property of another appearance, or by one that has been
// replaced.
TEST_F(AppearanceTest, feedsTheProgram)
{
    const SharedPtr<ShaderProgram> program = makeProgram({{"u_a", "P"}, {"u_b", "Q"}, {"u_c", "P"}});
    const SharedPtr<Appearance> other = makeShared<Appearance>();
    const SharedPtr<ShaderUniform<float>> global = makeShared<ShaderUniform<float>>(1);
    global->set(9.0f);
    m_context->addProperty(global, "Q");

    m_appearance->setShaderProgram(program);
    m_appearance->setProperty("P", 1.0f);
    m_appearance->setProperty("Unasked", 5.0f);
    other->setShaderProgram(program);
    other->setProperty("P", 3.0f);
    other->setProperty("Q", 4.0f);

    const auto draw = [&](Appearance& appearance)
    {
        appearance.enable(*m_context);
        return std::vector<float>{getSent(*program, "u_a"), getSent(*program, "u_b"),
                                  getSent(*program, "u_c")};
    };
    using Values = std::vector<float>;
    for (int frame = 0; frame < 2; ++frame)
    {
        EXPECT_EQ((Values{1, 9, 1}), draw(*m_appearance));
        EXPECT_EQ((Values{3, 4, 3}), draw(*other));
    }
    Notes all(9);
    m_appearance->collectProperties(&all);
    EXPECT_EQ("P+ Unasked- ", all.text);
    Notes first(1);
    other->collectProperties(&first);
    EXPECT_EQ("P+ ", first.text);

    m_appearance->setProperty("Q", 2.0f); // a new property binds again
    EXPECT_EQ((Values{1, 2, 1}), draw(*m_appearance));
    m_appearance->addProperty<float>("P", 1); // a replaced one too
    EXPECT_EQ((Values{0, 2, 0}), draw(*m_appearance));
    m_appearance->setShaderProgram(makeProgram({{"u_b", "P"}}));
    m_appearance->setProperty("P", 8.0f);
    m_appearance->enable(*m_context);
    EXPECT_EQ(8.0f, getSent(*m_appearance->getShaderProgram(), "u_b"));
    EXPECT_EQ((Values{3, 4, 3}), draw(*other));

    glcalls::resetCounts();
    other->enable(*m_context);
    EXPECT_EQ(0u, glcalls::total());
    program->enable(*m_context); // nothing of the appearance stays behind
    EXPECT_EQ(9.0f, getSent(*program, "u_b"));
}

TEST_F(AppearanceTest, withoutProgram)
{
    LogCapture log;
    m_appearance->setProperty("P", 1.0f);
    m_appearance->enable(*m_context);
    EXPECT_EQ("", log.text());
    EXPECT_EQ(0u, glcalls::count(glUseProgram));
    m_appearance->linkShaderProgram();
    EXPECT_EQ(1, log.countMessage("ORV_ASSERT: m_shaderProgram"));
}

// Fault caught: a remembered holder that is written although its appearance, or the property in it, is another.
TEST(PropertyRef, writesThePropertyOfTheMoment)
{
    PropertyRef reference("P");
    Appearance first, second;
    const auto read = [](const Appearance& appearance)
    {
        float value = -1.0f;
        appearance.getPropertyUniform("P")->getValue(value, 0);
        return value;
    };
    EXPECT_TRUE(reference.set(first, 1.0f)); // creates it
    EXPECT_TRUE(reference.set(second, 2.0f));
    EXPECT_EQ(1.0f, read(first));
    EXPECT_EQ(2.0f, read(second));
    second.addProperty<float>("P", 1);
    EXPECT_TRUE(reference.set(second, 3.0f));
    EXPECT_EQ(3.0f, read(second));
    EXPECT_TRUE(reference.set(first, 4.0f));
    EXPECT_EQ(4.0f, read(first));
    EXPECT_FALSE(reference.set(first, 5));
    LogCapture log;
    EXPECT_FALSE(reference.set(first, 5.0f, -1));
    EXPECT_FALSE(reference.set(first, 5.0f, 1));
    EXPECT_EQ(2, log.count('E'));
}

// Faults caught: noise about a ".pvr" variant that need not be there; a failure that leaves the material untextured.
TEST_F(AppearanceTest, texturePropertiesFromNames)
{
    const SharedPtr<Texture2DCache>& textures = m_pool->getTexture2DCache();
    const char* const failed2d = "Failed to find 2d texture \"none.png\"; using \"missing\" texture.";
    const char* const failedCube = "Failed to find cube texture \"none.png\"; using \"missing\" texture.";
    for (const char* name : {"both.pvr", "both.png", "plain.png", "pvr"})
        textures->create(1, 1, Texture::Format::ALPHA, Texture::Type::UNSIGNED_BYTE, "a", name);
    m_pool->getTextureCubeCache()->create(1, 1, Texture::Format::ALPHA, Texture::Type::UNSIGNED_BYTE,
                                          "cube.png");

    const struct
    {
        unsigned kind;
        const char* name;
        bool white;
        const char* texture; ///< that the property has; null for no property
        const char* message; ///< null for none
        bool found;
    } cases[] = {
        {SAMPLER_KIND_2D, "", true, "orv#white.png", nullptr, false},
        {SAMPLER_KIND_2D, "", false, nullptr, nullptr, false},
        {SAMPLER_KIND_2D, nullptr, false, nullptr, nullptr, false},
        {SAMPLER_KIND_2D, "plain.png", false, "plain.png", nullptr, true},
        {SAMPLER_KIND_2D, "both.png", false, "both.pvr", nullptr, true},
        {SAMPLER_KIND_2D, "both.pvr", false, "both.pvr", nullptr, true},
        {SAMPLER_KIND_2D, "both", false, "both.pvr", nullptr, true},
        {SAMPLER_KIND_2D, "none.png", true, "orv#missing.png", failed2d, false},
        {SAMPLER_KIND_CUBE, "cube.png", false, "cube", nullptr, true},
        {SAMPLER_KIND_CUBE, "none.png", false, "orv#missing.png", failedCube, false},
        {7, "plain.png", false, "orv#missing.png", "Unsupported sampler type; using \"missing\" texture.",
         false},
    };
    for (const auto& test : cases)
    {
        const size_t number = size_t(&test - cases);
        Appearance appearance;
        LogCapture log;
        EXPECT_EQ(test.found,
                  applyTextureProperty(*m_pool, appearance, "T", test.kind, test.name, test.white))
            << number;
        EXPECT_EQ(test.message == nullptr, log.text().empty()) << number << ": " << log.text();
        EXPECT_EQ(test.message ? 1 : 0, log.countMessage(test.message ? test.message : "")) << number;

        const SharedPtr<ShaderUniformBase>& uniform = appearance.getPropertyUniform("T");
        ASSERT_EQ(test.texture != nullptr, bool(uniform)) << number;
        if (!uniform)
            continue;
        SharedPtr<Texture2D> flat;
        SharedPtr<TextureCube> cube;
        const bool isCube = uniform->getValue(cube, 0);
        EXPECT_EQ(std::string("cube") == test.texture, isCube && cube) << number;
        EXPECT_EQ(!isCube, uniform->getValue(flat, 0) && flat == textures->get(test.texture)) << number;
    }
}
