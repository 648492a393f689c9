#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/memorystreamsource.h"
#include "orv/rendercontext.h"
#include "orv/texture2dcache.h"
#include "orv/texturecubecache.h"

#include "facilitytest.h"

#include <cstdio>

using namespace orv;
using support::LogCapture;

namespace
{

class AppearanceFileTest : public FacilityTest
{
protected:
    void flush() override { m_pool->flush(); }

    /// Applies a "t.ap" that holds these bytes.
    static void apply(Appearance& appearance, const std::string& text)
    {
        const SharedPtr<MemoryStreamSource> source = makeShared<MemoryStreamSource>();
        source->add("t.ap", makeShared<MemoryStream>(text.data(), int(text.size())));
        const SharedPtr<AssetCachePool> pool = makeShared<AssetCachePool>();
        pool->registerSource(source);
        appearance.apply(*pool, "t.ap");
    }

    SharedPtr<AssetCachePool> m_pool = makeShared<AssetCachePool>();
};

/// One face of the stencil state: function reference mask, three operations, write mask.
std::string describeFace(const RenderState& s, int face)
{
    char text[80];
    std::snprintf(text, sizeof(text), "%d %d %x, %d%d%d, %x", int(s.stencilFunction[face]),
                  s.stencilReference[face], s.stencilFunctionMask[face], int(s.stencilFailOperation[face]),
                  int(s.stencilDepthFailOperation[face]), int(s.stencilPassOperation[face]),
                  s.stencilWriteMask[face]);
    return text;
}

/// Everything that a file can set, enums as numbers.
std::string describe(const RenderState& s)
{
    char text[300];
    std::snprintf(text, sizeof(text),
                  "culling %d winding %d width %g offset %g %g test %d function %d write %d mask %d%d%d%d "
                  "colour %g %g %g %g factors %d %d %d %d functions %d %d back ",
                  int(s.cullingMode), int(s.windingOrder), double(s.lineWidth), double(s.depthOffsetFactor),
                  double(s.depthOffsetUnits), s.depthTestEnabled, int(s.depthFunction), s.depthWriteEnabled,
                  s.colourMaskRed, s.colourMaskGreen, s.colourMaskBlue, s.colourMaskAlpha,
                  double(s.blendColour.r), double(s.blendColour.g), double(s.blendColour.b),
                  double(s.blendColour.a), int(s.blendSrcColour), int(s.blendSrcAlpha), int(s.blendDstColour),
                  int(s.blendDstAlpha), int(s.blendFunctionColour), int(s.blendFunctionAlpha));
    return text + describeFace(s, 0) + " front " + describeFace(s, 1) + ".";
}

} // namespace

// Faults caught: a word list, a fallback or a message mixed up with that of another kind.
TEST_F(AppearanceFileTest, statements)
{
    const struct
    {
        const char* statements; ///< after "1.0 "
        const char* state;      ///< part of describe()
        const char* message;    ///< after "Appearance file: t.ap unexpected "; null for none
    } cases[] = {
        {"culling_mode CULL_FRONT_AND_BACK", "culling 2", nullptr},
        {"culling_mode front", "culling 3", "culling mode front"},
        {"winding_order CW winding_order left", "winding 0", "winding mode left"},
        {"polygon_mode NONE WINDING_CW 3.5", "culling 3 winding 1 width 3.5", nullptr},
        {"line_width 2 line_width", "width 1", nullptr},
        {"line_width 2 line_width 0", "width 2", "line width 0"},
        {"line_width 2 line_width -1.5", "width 2", "line width -1.5"},
        {"polygon_mode NONE CW -1e9", "culling 3 winding 1 width 1", "line width -1e+09"},
        {"depth_offset 1 wide", "offset 1 0", "tag wide"},
        {"depth_offset 1.5 -2", "offset 1.5 -2", nullptr},
        {"depth_test 0", "test 0", nullptr},
        {"depth_function MORE", "function 7", "depth function MORE"},
        {"colour_mask true 0 T false", "mask 1010", nullptr},
        {"blend_colour 0.25 0.5", "colour 0.25 0.5 0 0", nullptr},
        {"blend_factors SRC_ALPHA ONE ONE_MINUS_SRC_ALPHA DST_COLOUR", "factors 11 4 9 3", nullptr},
        {"blend_factors ZERO ZERO SOME ZERO", "factors 14 14 4 14", "blend factor SOME"},
        {"blend_functions SUBTRACT REVERSE_SUBTRACT", "functions 2 1", nullptr},
        {"blend_functions MAX SUBTRACT", "functions 0 2", "blend function MAX"},
        {"stencil_function FRONT EQUAL -3 15", "back 7 0 ffffffff, 111, ffffffff front 2 -3 f,", nullptr},
        {"stencil_function BACK SAME", "back 7 0 0,", "stencil function SAME"},
        {"stencil_operations SIDE ZERO INCR_WRAP INVERT", "front 7 0 ffffffff, 065,", "stencil face SIDE"},
        {"stencil_operations BACK KEEP ADD KEEP", "back 7 0 ffffffff, 121,", "stencil operation ADD"},
        {"stencil_mask BACK 7 stencil_mask BACK -1", "111, ffffffff front", nullptr},
        {"stencil_write_mask FRONT 7", "front 7 0 ffffffff, 111, 7.", nullptr},
        {"line_width 2 scissor_test true line_width 3", "width 2", "tag scissor_test"},
        {"line_width 2 property X double 1 line_width 3", "width 2", "type double"},
        // Comments end with their line, however short they are.
        {"//\nline_width 2", "width 2", nullptr},
        {"//\nline_width 2 // one two\n//three\n\"// quoted\" four\nline_width 3", "width 3", nullptr},
    };
    for (const auto& test : cases)
    {
        Appearance appearance;
        LogCapture log;
        apply(appearance, std::string("1.0 ") + test.statements);
        const std::string state = describe(appearance.getRenderState());
        EXPECT_NE(std::string::npos, state.find(test.state)) << test.statements << ": " << state;
        EXPECT_EQ(test.message ? 1 : 0, log.count('E')) << test.statements << "\n" << log.text();
        const std::string message = test.message ? test.message : "";
        EXPECT_TRUE(!test.message || log.countMessage("Appearance file: t.ap unexpected " + message))
            << log.text();
    }
}

// Fault caught: a file that is none changes the appearance, or a good one is refused.
TEST_F(AppearanceFileTest, headers)
{
    const struct
    {
        const char* text;
        const char* message; ///< after "Appearance file: t.ap "; null for none
        bool read;
    } cases[] = {
        {"1.0 line_width 2", nullptr, true},
        {" 1 . 0\n\tline_width 2\n\n", nullptr, true},
        {"1.0", nullptr, false},
        {"1.0\n", "unexpected tag ", false},
        {"", "empty", false},
        {"1.1 line_width 2", "wrong version", false},
        {"x line_width 2", "wrong version", false},
        {"1 line_width 2", "expected '.'", false},
        {"1. line_width 2", "wrong version", false},
    };
    for (const auto& test : cases)
    {
        Appearance appearance;
        LogCapture log;
        apply(appearance, std::string(test.text));
        EXPECT_EQ(test.read ? 2.0f : 1.0f, appearance.getRenderState().lineWidth) << test.text;
        EXPECT_EQ(test.message ? 1 : 0, log.count('E')) << test.text << "\n" << log.text();
        const std::string message =
            std::string("Appearance file: t.ap ") + (test.message ? test.message : "-");
        EXPECT_EQ(test.message ? 1 : 0, log.countMessage(message)) << log.text();
    }
    LogCapture log;
    EXPECT_TRUE(loadAppearance(*m_pool, "orv:none.ap"));
    EXPECT_EQ(1, log.countMessage("Appearance file: orv#none.ap not found"));
}

// Faults caught: components in the wrong order; an existing property that is replaced or grown.
TEST_F(AppearanceFileTest, properties)
{
    const SharedPtr<Appearance> appearance = makeShared<Appearance>();
    appearance->addProperty<float>("M_OPACITY", 3);
    const SharedPtr<ShaderUniformBase> opacity = appearance->getPropertyUniform("M_OPACITY");
    LogCapture log;
    const std::string text =
        "1.0\nproperty C Colour4f 1 2 3 4 property V4 Vector4f 5 6 7 property V3 Vector3f 1 2 3\n"
        "property V2 Vector2f -1 .5 property F float 1e2 property I int -3 property B bool true\n"
        "property M_OPACITY float 0.5 property \"two words\" int 9 property T Texture2D none.png\n"
        "property K TextureCube none.png property C float 8\n";
    apply(*appearance, text);
    EXPECT_EQ(1, log.countMessage(
                     "Appearance file: t.ap names 2 assets that cannot be loaded; the first is none.png"))
        << log.text();

    const auto expect = [&](const char* name, auto expected, auto value)
    {
        EXPECT_TRUE(appearance->getPropertyUniform(name)->getValue(value, 0)) << name;
        EXPECT_TRUE(value == expected) << name;
    };
    const SharedPtr<Texture2D> texture = makeShared<Texture2D>(1, 1, 1.0f, false, nullptr, false);
    expect("C", Vector4f(1, 2, 3, 4), Vector4f()); // the float at the end is refused
    expect("V4", Vector4f(5, 6, 7, 0), Vector4f());
    expect("V3", Vector3f(1, 2, 3), Vector3f());
    expect("V2", Vector2f(-1, 0.5f), Vector2f());
    expect("F", 100.0f, 0.0f);
    expect("I", -3, 0);
    expect("B", true, false);
    expect("two words", 9, 0);
    expect("T", SharedPtr<Texture2D>(), texture);
    expect("K", SharedPtr<TextureCube>(), SharedPtr<TextureCube>());
    expect("M_OPACITY", 0.5f, 0.0f);
    EXPECT_TRUE(opacity == appearance->getPropertyUniform("M_OPACITY") && opacity->getSize() == 3);
}

// Fault caught: a built-in material that does not load without a word, or not with everything it names.
TEST_F(AppearanceFileTest, builtInMaterials)
{
    const SharedPtr<RenderContext> context = makeShared<RenderContext>();
    for (const char* name : {"orv#default_pvl.ap", "orv#fallback.ap"})
    {
        LogCapture log;
        const SharedPtr<Appearance> appearance = loadAppearance(*m_pool, name);
        EXPECT_EQ(0, log.count('E') + log.count('W')) << name << "\n" << log.text();
        ASSERT_TRUE(appearance->getShaderProgram()) << name;
        SharedPtr<Texture2D> texture;
        EXPECT_TRUE(appearance->getPropertyUniform("M_DIFFUSE_TEXTURE")->getValue(texture, 0));
        EXPECT_TRUE(texture && texture == m_pool->getTexture2DCache()->get("orv#white.png")) << name;
        appearance->enable(*context);
    }
}
