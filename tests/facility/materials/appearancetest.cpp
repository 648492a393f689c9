#include "orv/appearance.h"

#include "orv/assetcachepool.h"
#include "orv/propertycollector.h"
#include "orv/rendercontext.h"
#include "orv/shaderprogramcache.h"
#include "orv/texture2dcache.h"
#include "orv/texturecubecache.h"
#include "orv/texturepropertyutil.h"

#include "facilitytest.h"

using namespace orv;
using support::LogCapture;

namespace
{

const char* const VERTEX = "attribute vec4 a_position;\n"
                           "uniform float u_a, u_b, u_c;\n"
                           "void main() { gl_Position = a_position * (u_a + u_b + u_c); }\n";
const char* const FRAGMENT = "void main() { gl_FragColor = vec4(1.0); }\n";

class AppearanceTest : public FacilityTest
{
protected:
    void SetUp() override
    {
        GlTest::SetUp();
        m_context = makeShared<RenderContext>();
    }

    void flush() override
    {
        m_appearance.reset();
        m_pool->flush();
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

    SharedPtr<AssetCachePool> m_pool = makeShared<AssetCachePool>();
    SharedPtr<RenderContext> m_context;
    SharedPtr<Appearance> m_appearance = makeShared<Appearance>();
};

/// Writes down what it is shown; stops after a number of them.
class Notes : public PropertyCollector
{
public:
    explicit Notes(int limit) : m_limit(limit) {}

    bool collect(const SharedPtr<ShaderUniformBase>&, const char* name, int uniformIndex) override
    {
        text += std::string(name) + (uniformIndex < 0 ? "- " : "+ ");
        return --m_limit > 0;
    }

    std::string text;

private:
    int m_limit;
};

/// What a property of floats holds; empty if there is none.
std::vector<float> valuesOf(const Appearance& appearance, const char* name)
{
    const SharedPtr<ShaderUniformBase>& uniform = appearance.getPropertyUniform(name);
    std::vector<float> values(size_t(uniform ? uniform->getSize() : 0), -1.0f);
    for (size_t i = 0; i < values.size(); ++i)
        uniform->getValue(values[i], int(i));
    return values;
}

} // namespace

// Fault caught: a blend state that is taken for opaque is drawn without blending and out of order.
TEST(Appearance, opaqueOnlyWithTheDefaultBlending)
{
    for (int changed = 0; changed <= 6; ++changed)
    {
        const auto factor = [changed](int i) {
            return i == changed ? BlendFactor::SRC_ALPHA : i < 3 ? BlendFactor::ONE : BlendFactor::ZERO;
        };
        const auto function = [changed](int i)
        { return i == changed ? BlendFunction::SUBTRACT : BlendFunction::ADD; };
        Appearance appearance;
        appearance.setBlendFactors(factor(1), factor(2), factor(3), factor(4));
        appearance.setBlendFunctions(function(5), function(6));
        appearance.setBlendColour(Colour4f(1, 1, 1, 1));
        EXPECT_EQ(changed == 0, appearance.isOpaque()) << changed;
        appearance.setForceOpaque(true);
        EXPECT_TRUE(appearance.isOpaque());
    }
}

// Faults caught: a change that never reaches GL, the stored compare mask sent, winding that stays turned.
TEST_F(AppearanceTest, sendsItsState)
{
    using F = BlendFactor;
    const auto keep = StencilOperation::KEEP;
    const std::function<void(Appearance&)> setters[] = {
        [](auto& a) { a.setBlendFactors(F::SRC_ALPHA, F::ONE, F::ONE_MINUS_SRC_ALPHA, F::ZERO); },
        [](auto& a) { a.setBlendColour(Colour4f(1, 0, 0, 0)); },
        [](auto& a) { a.setBlendFunctions(BlendFunction::SUBTRACT, BlendFunction::ADD); },
        [](auto& a) { a.setForceOpaque(true); },
        [](auto& a) { a.setCullingMode(CullingMode::CULL_FRONT); },
        [](auto& a) { a.setWindingOrder(WindingOrder::WINDING_CW); },
        [](auto& a) { a.setLineWidth(2.0f); },
        [](auto& a) { a.setColourMask(true, true, false, true); },
        [](auto& a) { a.setDepthWriteEnabled(false); },
        [](auto& a) { a.setDepthOffset(1.0f, 2.0f); },
        [](auto& a) { a.setDepthTestEnabled(false); },
        [](auto& a) { a.setDepthTestFunction(DepthFunction::ALWAYS); },
        [](auto& a) { a.setScissorTestEnabled(true); },
        [](auto& a) { a.setScissorBox(1, 2, 3, 4); },
        [](auto& a) { a.setStencilTestEnabled(true); },
        [](auto& a) { a.setStencilFunction(StencilFace::FRONT, StencilFunction::EQUAL, 1, 0x0f); },
        [=](auto& a) { a.setStencilOperations(StencilFace::BACK, StencilOperation::ZERO, keep, keep); },
    };
    const auto enable = [this](bool turnWinding)
    { return callsOf([&] { m_appearance->enable(*m_context, turnWinding); }); };
    enable(false); // the defaults
    Calls sent;    // the last call of each
    for (const auto& set : setters)
    {
        set(*m_appearance);
        const Calls calls = enable(false);
        sent.push_back(calls.empty() ? "" : calls.back());
    }
    EXPECT_EQ((Calls{"glBlendFuncSeparate(0x0302, 0x0303, 0x0001, 0x0000)", "glBlendColor(1, 0, 0, 0)",
                     "glBlendEquationSeparate(0x800a, 0x8006)", "glDisable(0x0be2)", "glCullFace(0x0404)",
                     "glFrontFace(0x0900)", "glLineWidth(2)", "glColorMask(1, 1, 0, 1)", "glDepthMask(0)",
                     "glPolygonOffset(0, 0)", "glDisable(0x0b71)", "glDepthFunc(0x0207)", "glEnable(0x0c11)",
                     "glScissor(1, 2, 3, 4)", "glEnable(0x0b90)",
                     "glStencilFuncSeparate(0x0404, 0x0202, 1, 4294967295)",
                     "glStencilOpSeparate(0x0405, 0x0000, 0x1e00, 0x1e00)"}),
              sent);
    m_appearance->setStencilMask(StencilFace::FRONT, 0xf0);
    EXPECT_EQ((Calls{"glStencilFuncSeparate(0x0404, 0x0202, 1, 240)", "glStencilMaskSeparate(0x0404, 240)"}),
              enable(false));
    EXPECT_EQ(Calls{}, enable(false));
    EXPECT_EQ(Calls{"glFrontFace(0x0901)"}, enable(true));
    EXPECT_EQ(Calls{"glFrontFace(0x0900)"}, enable(false));
}

// Fault caught: properties created, grown or replaced where they must not be.
TEST(Appearance, propertiesFromCode)
{
    const char* const grown =
        "Property array \"P[3]\" value is being set without prior knowledge of the size of the "
        "array; please define size of array explicitly using addProperty() before setting "
        "values.";
    const char* const sizeBelowOne = "Size of property cannot be less than 1.";
    const struct
    {
        std::function<void(Appearance&)> change;
        const char* message; ///< null for none
        std::vector<float> values;
    } cases[] = {
        {[](auto& a) { a.template addProperty<float>("P", 0); }, sizeBelowOne, {}},
        {[](auto& a) { a.setProperty("P", 1.0f, INT32_MAX); }, sizeBelowOne, {}},
        {[](auto& a) { a.setProperty("P", 1.0f, -1); }, "Property index cannot be less than 0.", {}},
        {[](auto& a) { a.setProperty("P", 2.0f, 0); }, nullptr, {2}},
        {[](auto& a) { a.setProperty("P", 2.0f, 3); }, grown, {0, 0, 0, 2}},
        {[](auto& a) { a.setProperty("P", 1.0f), a.setProperty("P", 2.0f, 1); },
         "Uniform value index (1) out of range [0:1).",
         {1}},
        {[](auto& a) { a.setProperty("P", 1.0f), a.setProperty("P", 7); }, nullptr, {1}},
        {[](auto& a) { a.setProperty("P", 1.0f), a.template addProperty<float>("P", 2); }, nullptr, {0, 0}},
    };
    for (const auto& test : cases)
    {
        Appearance appearance;
        LogCapture log;
        test.change(appearance);
        EXPECT_EQ(test.values, valuesOf(appearance, "P")) << &test - cases;
        EXPECT_EQ(!test.values.empty(), appearance.propertyExists("P")) << &test - cases;
        EXPECT_EQ(test.message ? 1 : 0, log.countMessage(test.message ? test.message : "")) << log.text();
        EXPECT_EQ(!test.message, log.text().empty()) << log.text();
    }
    Appearance one, other;
    EXPECT_EQ(&one.getPropertyUniform("none"), &other.getPropertyUniform("nothing"));
}

// Fault caught: a uniform fed by a wrong property, by one of another appearance, or by one that was replaced.
TEST_F(AppearanceTest, feedsTheProgram)
{
    const SharedPtr<ShaderProgram> program = makeProgram({{"u_a", "P"}, {"u_b", "Q"}, {"u_c", "P"}});
    const SharedPtr<Appearance> other = makeShared<Appearance>();
    m_context->addProperty(makeValue(9.0f), "Q");

    m_appearance->setShaderProgram(program);
    m_appearance->setProperty("P", 1.0f);
    m_appearance->setProperty("Unasked", 5.0f);
    other->setShaderProgram(program);
    other->setProperty("P", 3.0f);
    other->setProperty("Q", 4.0f);

    using Values = std::vector<float>;
    const auto draw = [&](Appearance& appearance)
    {
        appearance.enable(*m_context);
        return Values{getSent(*program, "u_a"), getSent(*program, "u_b"), getSent(*program, "u_c")};
    };
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

    const RenderContext::DrawScope scope(*m_context);
    other->enable(*m_context);
    EXPECT_EQ(Calls{}, callsOf([&] { other->enable(*m_context); }));
    program->enable(*m_context); // nothing of the appearance stays behind
    EXPECT_EQ(9.0f, getSent(*program, "u_b"));
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
                  applyTextureProperty(*m_pool, appearance, "T", test.kind, test.name, test.white));
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
