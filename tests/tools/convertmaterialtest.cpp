#include "converttest.h"
#include "support/picture.h"

#include "convert/files/filegate.h"
#include "convert/files/modelfiles.h"
#include "convert/materials/picturefinder.h"
#include "convert/materials/pictures.h"

#include "headless/png.h"

#include "orv/shaderprogramcache.h"
#include "orv/texture2dcache.h"

#include <assimp/scene.h>
#include <nlohmann/json.hpp>
#include <webp/encode.h>

#include <cstdlib>
#include <filesystem>

using namespace orv;
using nlohmann::json;
using support::Picture;
using support::Rgba;

namespace
{

const char* const SQUARES = R"({"asset":{"version":"2.0"},
"extensionsUsed":["KHR_materials_unlit","KHR_materials_pbrSpecularGlossiness","KHR_texture_transform"],
"scene":0,"scenes":[{"nodes":[0]}],
"cameras":[{"type":"orthographic","orthographic":{"xmag":1,"ymag":1,"znear":1,"zfar":9}}],
"nodes":[{"name":"eye","camera":0}],"meshes":[],"materials":[],
"textures":[{"source":0},{"source":1},{"source":0,"sampler":0}],
"samplers":[{"magFilter":9728,"minFilter":9984,"wrapS":33071,"wrapT":33648}],
"images":[{"uri":"holes.png"},{"uri":"flat.png"}],
"accessors":[{"bufferView":0,"componentType":5126,"count":4,"type":"VEC3","min":[-1,-1,0],"max":[1,1,0]},
  {"bufferView":1,"componentType":5126,"count":4,"type":"VEC3"},
  {"bufferView":2,"componentType":5126,"count":4,"type":"VEC2"}],
"bufferViews":[{"buffer":0,"byteLength":48},{"buffer":0,"byteOffset":48,"byteLength":48},
  {"buffer":0,"byteOffset":96,"byteLength":32}],
"buffers":[{"byteLength":128,"uri":"square.bin"}]})";

/// A strip of two triangles: positions, normals, texture coordinates.
const float SQUARE[32] = {-1, 1, 0, -1, -1, 0, 1, 1, 0, 1, -1, 0, 0, 0, 1, 0,
                          0,  1, 0, 0,  1,  0, 0, 1, 0, 0, 0,  1, 1, 0, 1, 1};

class ConvertMaterialTest : public ConvertTest
{
protected:
    void SetUp() override
    {
        ConvertTest::SetUp();
        std::vector<uint8_t> holes; // the right half is mostly transparent
        for (int i = 0; i < 64; ++i)
            holes.insert(holes.end(), {255, 128, 0, uint8_t(i % 8 < 4 ? 255 : 100)});
        writePng("holes.png", 8, 8, holes);
        std::vector<uint8_t> flat;
        for (int i = 0; i < 64; ++i)
            flat.insert(flat.end(), {128, 128, 255, 255});
        writePng("flat.png", 8, 8, flat);
        const uint8_t* bytes = reinterpret_cast<const uint8_t*>(SQUARE);
        m_folder.write("square.bin", std::vector<uint8_t>(bytes, bytes + sizeof SQUARE));
    }

    void writePng(const char* name, int width, int height, const std::vector<uint8_t>& rgba)
    {
        std::string error;
        ASSERT_TRUE(headless::writePng(m_folder.path(name), width, height, rgba.data(), error)) << error;
    }

    /// A square, two wide, for each material, one beside the other, and a camera "eye" that has them all in view.
    static json makeModel(const std::vector<std::string>& materials)
    {
        json model = json::parse(SQUARES);
        for (size_t i = 0; i < materials.size(); ++i)
        {
            model["materials"].push_back(json::parse(materials[i]));
            const json attributes = {{"POSITION", 0}, {"NORMAL", 1}, {"TEXCOORD_0", 2}};
            const json primitive = {{"attributes", attributes}, {"mode", 5}, {"material", i}};
            model["meshes"].push_back({{"primitives", {primitive}}});
            model["nodes"].push_back({{"mesh", i}, {"translation", {2 * i, 0, 0}}});
            model["scenes"][0]["nodes"].push_back(i + 1);
        }
        model["cameras"][0]["orthographic"]["xmag"] = materials.size();
        model["nodes"][0]["translation"] = {double(materials.size()) - 1.0, 0, 5};
        return model;
    }

    template <class T>
    static T getValue(const SharedPtr<Appearance>& appearance, const char* property)
    {
        T value{};
        EXPECT_TRUE(appearance->getPropertyUniform(property)->getValue(value, 0)) << property;
        return value;
    }
};

const uint8_t GIF[] = {'G', 'I', 'F', '8', '9', 'a', 1, 0, 1, 0, 0x80, 0, 0, 255,  0, 0, 0,  0,
                       0,   ',', 0,   0,   0,   0,   1, 0, 1, 0, 0,    2, 2, 0x44, 1, 0, ';'};

} // namespace

// Fault caught: materials that hide their texture, cover what is behind them, or show grey as transparent black;
// pictures of one name that overwrite each other.
TEST_F(ConvertTest, classicMaterials)
{
    std::string error;
    std::vector<uint8_t> pixels(6 * 4 * 4, 255);
    pixels[3] = 0; // one of them transparent
    ASSERT_TRUE(headless::writePng(m_folder.path("a.png"), 6, 4, pixels.data(), error)) << error;
    const std::vector<uint8_t> white(8 * 8 * 4, 255);
    ASSERT_TRUE(headless::writePng(m_folder.path("b.png"), 8, 8, white.data(), error)) << error;
    std::filesystem::create_directory(m_folder.path("sub"));
    std::vector<uint8_t> grey(18 + 4 * 4, 100); // TGA
    const uint8_t header[18] = {0, 0, 3, 0, 0, 0, 0, 0, 0, 0, 0, 0, 4, 0, 4, 0, 8, 0};
    std::copy(header, header + 18, grey.begin());
    m_folder.write("sub/a.png", grey);
    m_folder.write("m.mtl", std::string("newmtl grey\nKd 0 0 0\nmap_Kd sub\\a.png\n"
                                        "newmtl glass\nKd 1 0 0\nd 0.25\n"
                                        "newmtl holes\nKd 1 1 1\nKs 1 1 1\nNs 500\nmap_Kd A.PNG\n"
                                        "newmtl lost\nKd 0 1 0\nmap_Kd nowhere.png\n"
                                        "newmtl worn\nKd 1 1 1\nmap_Kd b.png\nmap_d sub/a.png\n"
                                        "newmtl bumpy\nKd 1 1 1\nmap_bump sub/a.png\n"
                                        "newmtl glow\nKe 1 1 0\nmap_Kd b.png\n"));
    std::string model = "mtllib m.mtl\nv 0 0 0\nv 1 0 0\nv 0 1 0\nvt 0 0\nvt 3 0\nvt 0 3\n";
    for (const char* name : {"grey", "glass", "holes", "lost", "worn", "bumpy", "glow"})
        model += std::string("usemtl ") + name + "\nf 1/1 2/2 3/3\n";
    m_folder.write("model.obj", model);

    const Glo::Ptr loaded = convertAndLoad("model.obj out.glo", "out.glo");
    ASSERT_TRUE(loaded);
    EXPECT_TRUE(reports("lost: texture \"nowhere.png\", which is not there")) << m_outcome.output;
    EXPECT_TRUE(m_folder.exists("out-a.png"));
    EXPECT_TRUE(m_folder.exists("out-A_2.png"));
    ASSERT_EQ(7u, loaded->getAppearances().size());

    Vector4f colour;
    const SharedPtr<Appearance> plain = loaded->getAppearance("grey");
    EXPECT_TRUE(plain->getPropertyUniform("M_DIFFUSE_COLOUR")->getValue(colour, 0));
    EXPECT_EQ(Vector4f(1, 1, 1, 1), colour);
    EXPECT_TRUE(plain->isOpaque());
    EXPECT_EQ(4u * 4u * 3u, getTexture(plain)->getSizeInBytes());
    EXPECT_FALSE(loaded->getAppearance("glass")->isOpaque());

    const SharedPtr<Appearance> holes = loaded->getAppearance("holes");
    EXPECT_TRUE(holes->isOpaque());
    EXPECT_EQ(m_pool->getShaderProgramCache()->get("orv#max_pvl.sp$DIFF$AMBI$CUTOFF"),
              holes->getShaderProgram());
    EXPECT_EQ(8u, getTexture(holes)->getWidth()); // repeated, so the size has to be a power of two
    EXPECT_EQ(TextureParameters::WrapMode::REPEAT, getTexture(holes)->getHorizontalWrap());
    EXPECT_EQ(m_pool->getTexture2DCache()->get("orv#white.png"), getTexture(loaded->getAppearance("lost")));

    const SharedPtr<Appearance> worn = loaded->getAppearance("worn"); // opacity from a map
    EXPECT_FALSE(worn->isOpaque());
    EXPECT_EQ(8u * 8u * 4u, getTexture(worn)->getSizeInBytes());
    EXPECT_TRUE(loaded->getAppearance("bumpy")->getPropertyUniform("M_BUMP_TEXTURE"));
    EXPECT_TRUE(reports("approximated: a height map")) << m_outcome.output;
    SharedPtr<Texture2D> glow; // fixed-function light goes through the picture
    const SharedPtr<Appearance> glowing = loaded->getAppearance("glow");
    EXPECT_TRUE(glowing->getPropertyUniform("M_EMISSIVE_TEXTURE")->getValue(glow, 0));
    EXPECT_EQ(getTexture(glowing), glow);
}

namespace
{

/// A material of a glTF file, and what is to become of it.
struct PhysicalCase
{
    const char* material;
    const char* program; // after "orv#max_"
    bool opaque;
    Rgba left, right; // of the square, where nothing but the material decides; else SEEN_THROUGH or lit
    float specularLevel = 0.0f, shininess = 1.0f;
};

const Rgba ORANGE{255, 128, 0}, SEEN_THROUGH{0, 0, 0, 0};
const PhysicalCase PHYSICAL_CASES[] = {
    {R"({"name":"unlit","pbrMetallicRoughness":{"baseColorTexture":{"index":0},
             "baseColorFactor":[0.2,1,1,0.5]},"extensions":{"KHR_materials_unlit":{}}})",
     "pvl.sp$EMIS",
     true,
     {124, 128, 0}, // 0.2 of the light
     {124, 128, 0}},
    {R"({"name":"mask","alphaMode":"MASK","pbrMetallicRoughness":{"baseColorTexture":{"index":0}},
             "extensions":{"KHR_materials_unlit":{}}})",
     "pvl.sp$DIFF$CUTOFF$UNLIT", true, ORANGE, SEEN_THROUGH},
    {R"({"name":"lit mask","alphaMode":"MASK","pbrMetallicRoughness":{"baseColorTexture":{"index":0},
             "baseColorFactor":[1,1,1,0.9],"metallicFactor":0},"alphaCutoff":0.36})",
     "pvl.sp$DIFF$AMBI$CUTOFF$LINEAR",
     true,
     {},
     SEEN_THROUGH},
    {R"({"name":"turned","alphaMode":"MASK","extensions":{"KHR_materials_unlit":{}},"pbrMetallicRoughness":
             {"baseColorTexture":{"index":0,"extensions":{"KHR_texture_transform":
             {"rotation":-1.5707963,"scale":[0.4,0.4],"offset":[0.45,0.1]}}}}})",
     "pvl.sp$DIFF$CUTOFF$UNLIT", true, ORANGE, ORANGE}, // u = 0.45 - 0.4 v
    {R"({"name":"low cutoff","alphaMode":"MASK","alphaCutoff":0.3,
             "pbrMetallicRoughness":{"baseColorTexture":{"index":0}},"extensions":{"KHR_materials_unlit":{}}})",
     "pvl.sp$EMIS", true, ORANGE, ORANGE},
    {R"({"name":"blend","alphaMode":"BLEND","pbrMetallicRoughness":{"baseColorFactor":[1,0,0,0]},
             "extensions":{"KHR_materials_unlit":{}}})",
     "pvl.sp$EMIS", false, SEEN_THROUGH, SEEN_THROUGH},
    {R"({"name":"emissive","emissiveFactor":[0,1,0],"pbrMetallicRoughness":{"baseColorFactor":[0,0,0,1]}})",
     "pvl.sp$EMIS",
     true,
     {0, 255, 0},
     {0, 255, 0}},
    {R"({"name":"bump","normalTexture":{"index":1}})", "ppl.sp$BUMP$DIFF$AMBI$LINEAR", true, {}, {}},
    {R"({"name":"metal","doubleSided":true,"pbrMetallicRoughness":{"metallicFactor":1,"roughnessFactor":0.5,
             "baseColorFactor":[1,0.5,0,1]}})",
     "pvl.sp$DIFF$SPEC$AMBI$BACK$LINEAR",
     true,
     {},
     {},
     0.25f,
     30.0f},
    {R"({"name":"dull","pbrMetallicRoughness":{"metallicFactor":0,"roughnessFactor":0.5},
             "extensions":{"KHR_materials_specular":{"specularFactor":0}}})",
     "pvl.sp$DIFF$AMBI$LINEAR",
     true,
     {},
     {},
     0.125f,
     30.0f},
    {R"({"name":"gloss","extensions":{"KHR_materials_pbrSpecularGlossiness":
             {"specularFactor":[0.04,0.04,0.04],"glossinessFactor":0.5}}})",
     "pvl.sp$DIFF$SPEC$AMBI$LINEAR",
     true,
     {},
     {},
     0.125f,
     30.0f},
};

/// The left and the right of a square as they are to be seen; Rgba() stands for any lit colour.
void expectSeen(const PhysicalCase& item, const Picture& picture, int x)
{
    for (const auto& [wanted, column] : {std::pair(item.left, x + 5), std::pair(item.right, x + 15)})
    {
        const Rgba seen = picture.pixel(column, 10);
        const bool isBackground = support::isNear(seen, {214, 219, 227}, 8);
        EXPECT_EQ(wanted == SEEN_THROUGH, isBackground) << item.material << " " << seen;
        EXPECT_TRUE(wanted == SEEN_THROUGH || wanted == Rgba() || support::isNear(wanted, seen, 2))
            << item.material << " " << seen;
    }
}

} // namespace

// Fault caught: features of a material that are dropped, or switched on without being in the model.
TEST_F(ConvertMaterialTest, physicalMaterials)
{
    std::vector<std::string> materials;
    for (const PhysicalCase& item : PHYSICAL_CASES)
        materials.push_back(item.material);
    m_folder.write("model.gltf", makeModel(materials).dump());
    const Glo::Ptr loaded = convertAndLoad("model.gltf out.glo", "out.glo");
    ASSERT_TRUE(loaded);
    const std::string view = "cd '" + m_folder.path() + "' && " ORV_VIEW " out.glo --camera eye --size " +
                             std::to_string(20 * materials.size()) + "x20 --out out.png 2> view.log";
    ASSERT_EQ(0, std::system(view.c_str()));
    const Picture picture = support::readPng(m_folder.path("out.png"));

    int x = 0;
    for (const PhysicalCase& item : PHYSICAL_CASES)
    {
        const std::string name = json::parse(item.material)["name"];
        const SharedPtr<Appearance> appearance = loaded->getAppearance(name.c_str());
        ASSERT_TRUE(appearance) << name;
        EXPECT_EQ(m_pool->getShaderProgramCache()->get((std::string("orv#max_") + item.program).c_str()),
                  appearance->getShaderProgram())
            << name;
        EXPECT_EQ(item.opaque, appearance->isOpaque()) << name;
        EXPECT_NEAR(item.specularLevel, getValue<float>(appearance, "M_SPECULAR_LEVEL"), 1e-4f) << name;
        EXPECT_NEAR(item.shininess, getValue<float>(appearance, "M_SHININESS"), 1e-3f) << name;
        expectSeen(item, picture, x);
        x += 20;
    }
    const Vector4f metal = getValue<Vector4f>(loaded->getAppearance("metal"), "M_SPECULAR_COLOUR");
    EXPECT_LT(length(metal - Vector4f(1, 0.73536f, 0, 1)), 1e-4f) << metal.y; // half of the light
}

// Fault caught: occlusion from a channel other than red, in the wrong colour space or at full strength; a map with its
// own coordinates drawn with others; metals that lose their colour to the sky, or whose sky is upside down.
TEST_F(ConvertMaterialTest, occlusionAndSky)
{
    std::vector<uint8_t> packed;
    for (int i = 0; i < 64; ++i)
        packed.insert(packed.end(), {128, 10, 250, 255});
    writePng("packed.png", 8, 8, packed);
    json model = makeModel({R"({"name":"dim","occlusionTexture":{"index":3,"strength":0.5}})",
                            R"({"name":"apart","occlusionTexture":{"index":3,"texCoord":1}})",
                            R"({"name":"gold","pbrMetallicRoughness":{"metallicFactor":1,"roughnessFactor":0,
                                "baseColorTexture":{"index":0}}})"});
    model["images"].push_back({{"uri", "packed.png"}});
    model["textures"].push_back({{"source", 2}});
    m_folder.write("model.gltf", model.dump());
    for (const auto& [options, light] : {std::pair("", 224), std::pair(" --linear off", 192)}) // 0.75 of it
    {
        SCOPED_TRACE(options);
        ASSERT_EQ(0, convert(std::string("model.gltf out.glo") + options).exitCode);
        const Rgba pixel = support::readPng(m_folder.path("out-packed.png")).pixel(0, 0);
        EXPECT_TRUE(support::isNear(Rgba{uint8_t(light), uint8_t(light), uint8_t(light)}, pixel, 1)) << pixel;
    }

    const Glo::Ptr loaded = convertAndLoad("model.gltf out.glo --sky", "out.glo");
    ASSERT_TRUE(loaded);
    EXPECT_TRUE(reports("lost: an occlusion map with its own coordinates")) << m_outcome.output;
    const auto getWidth = [&](const char* name, const char* property)
    { return getValue<SharedPtr<Texture2D>>(loaded->getAppearance(name), property)->getWidth(); };
    EXPECT_EQ(8u, getWidth("dim", "M_AMBIENT_TEXTURE"));
    EXPECT_NE(8u, getWidth("apart", "M_AMBIENT_TEXTURE"));
    const SharedPtr<Appearance> gold = loaded->getAppearance("gold");
    EXPECT_EQ(m_pool->getShaderProgramCache()->get("orv#max_pvl.sp$SPEC$REFL$CUBE$LINEAR"),
              gold->getShaderProgram());
    EXPECT_EQ(8u, getWidth("gold", "M_SPECULAR_TEXTURE"));
    const Picture sky = support::readPng(m_folder.path("out-sky.png"));
    const struct
    {
        int x, y; // in a grid of 3 x 2 faces of 64 pixels
        Rgba wanted;
    } places[] = {{96, 96, {111, 159, 216}},
                  {32, 96, {92, 84, 76}},
                  {32, 31, {230, 236, 242}},
                  {32, 33, {92, 84, 76}},
                  {96, 0, {157, 187, 224}}};
    for (const auto& place : places)
        EXPECT_TRUE(support::isNear(place.wanted, sky.pixel(place.x, place.y), 4))
            << place.x << " " << place.y << " " << sky.pixel(place.x, place.y);
}

// Fault caught: vertex colours that are not shown, in the wrong colour space, or whose alpha is used where it should
// not be.
TEST_F(ConvertMaterialTest, coloursOfVertices)
{
    const Rgba GREEN{124, 255, 0}, BACKGROUND{214, 219, 227}, MIXED{169, 237, 114};
    const struct
    {
        const char* alpha;
        const char* features;
        bool opaque;
        Rgba seen;
    } cases[] = {
        {R"("alphaMode":"OPAQUE")", "$VCOL$UNLIT$LINEAR", true, GREEN},
        {R"("alphaMode":"BLEND")", "$VCOL$UNLIT$LINEAR", false, MIXED},
        {R"("alphaMode":"MASK","alphaCutoff":0.4)", "$VCOL$CUTOFF$UNLIT$LINEAR", true, GREEN},
        {R"("alphaMode":"MASK","alphaCutoff":0.6)", "$VCOL$CUTOFF$UNLIT$LINEAR", true, BACKGROUND},
    };
    std::vector<std::string> materials;
    for (const auto& item : cases)
        materials.push_back(R"({"name":"m)" + std::to_string(materials.size()) +
                            R"(","extensions":{"KHR_materials_unlit":{}},)" + item.alpha + "}");
    json model = makeModel(materials);
    std::vector<float> colours;
    for (int i = 0; i < 4; ++i)
        colours.insert(colours.end(), {0.2f, 1.0f, 0.0f, 0.5f}); // 0.2 of the light
    const uint8_t* bytes = reinterpret_cast<const uint8_t*>(colours.data());
    m_folder.write("colours.bin", std::vector<uint8_t>(bytes, bytes + 64));
    model["buffers"].push_back({{"byteLength", 64}, {"uri", "colours.bin"}});
    model["bufferViews"].push_back({{"buffer", 1}, {"byteLength", 64}});
    model["accessors"].push_back(
        {{"bufferView", 3}, {"componentType", 5126}, {"count", 4}, {"type", "VEC4"}});
    for (json& mesh : model["meshes"])
        mesh["primitives"][0]["attributes"]["COLOR_0"] = 3;
    m_folder.write("model.gltf", model.dump());
    const Glo::Ptr loaded = convertAndLoad("model.gltf out.glo", "out.glo");
    ASSERT_TRUE(loaded);
    const std::string view = "cd '" + m_folder.path() +
                             "' && " ORV_VIEW " out.glo --camera eye --size 80x20 --out out.png 2> view.log";
    ASSERT_EQ(0, std::system(view.c_str()));
    const Picture picture = support::readPng(m_folder.path("out.png"));
    for (size_t i = 0; i < materials.size(); ++i)
    {
        const SharedPtr<Appearance> appearance = loaded->getAppearance(("m" + std::to_string(i)).c_str());
        ASSERT_TRUE(appearance);
        const std::string program = std::string("orv#max_pvl.sp$DIFF") + cases[i].features;
        EXPECT_EQ(m_pool->getShaderProgramCache()->get(program.c_str()), appearance->getShaderProgram()) << i;
        EXPECT_EQ(cases[i].opaque, appearance->isOpaque()) << i;
        const Rgba seen = picture.pixel(int(20 * i + 10), 10);
        EXPECT_TRUE(support::isNear(cases[i].seen, seen, 3)) << i << " " << seen;
    }

    m_folder.write(
        "c.off",
        std::string("COFF\n3 1 0\n0 0 0 255 0 0 255\n1 0 0 0 255 0 255\n0 1 0 0 0 255 255\n3 0 1 2\n"));
    const Glo::Ptr plain = convertAndLoad("c.off off.glo", "off.glo");
    ASSERT_TRUE(plain);
    const SharedPtr<Appearance> appearance = plain->getAppearances().begin()->second;
    EXPECT_EQ(Vector4f(1, 1, 1, 1),
              getValue<Vector4f>(appearance, "M_DIFFUSE_COLOUR")); // and not the library's grey
    EXPECT_EQ(m_pool->getShaderProgramCache()->get("orv#max_pvl.sp$DIFF$AMBI$VCOL$BACK"),
              appearance->getShaderProgram());
}

// Fault caught: pictures in a format, size or place that the engine cannot use, or rewritten without need.
TEST_F(ConvertMaterialTest, pictures)
{
    const std::vector<uint8_t> pixels(12 * 10 * 4, 200);
    writePng("size.png", 12, 10, pixels);
    std::filesystem::copy(m_folder.path("flat.png"), m_folder.path("wrong.tga"));
    std::filesystem::copy(m_folder.path("flat.png"), m_folder.path("a b#c.png"));
    m_folder.write("dot.gif", std::vector<uint8_t>(GIF, GIF + sizeof GIF));
    m_folder.write("broken.png", std::string("\x89PNG\r\n and nothing else"));
    const struct
    {
        const char* uri;
        const char* arguments;
        const char* file; // after the scene's name
        unsigned width, height;
    } cases[] = {
        {"flat.png", "", "-flat.png", 8, 8},
        {"wrong.tga", "", "-wrong.png", 8, 8},
        {"a%20b%23c.png", "", "-a_b_c.png", 8, 8},
        {"dot.gif", "", "-dot.png", 1, 1},
        {"size.png", "", "-size.png", 12, 10},
        {"size.png", " --power-of-two", "-size.png", 16, 16},
        {"size.png", " --max-texture-size 6", "-size.png", 6, 5},
        {"size.png", " --max-texture-size 7 --power-of-two", "-size.png", 4, 4},
        {"broken.png", "", nullptr, 1, 1},
        {"none.png", "", nullptr, 1, 1},
    };
    const std::string material = R"({"name":"m","pbrMetallicRoughness":{"baseColorTexture":{"index":0}}})";
    int number = 0;
    for (const auto& item : cases)
    {
        json model = makeModel({material});
        model["images"][0]["uri"] = item.uri;
        m_folder.write("model.gltf", model.dump());
        const std::string stem = "scene" + std::to_string(++number);
        const Glo::Ptr loaded =
            convertAndLoad("model.gltf " + stem + ".glo" + item.arguments, (stem + ".glo").c_str());
        ASSERT_TRUE(loaded) << item.uri;
        const SharedPtr<Texture2D> texture = getTexture(loaded->getAppearance("m"));
        EXPECT_EQ(item.file == nullptr, reports("lost: texture")) << m_outcome.output;
        EXPECT_EQ(item.width, texture->getWidth()) << item.uri << item.arguments;
        EXPECT_EQ(item.height, texture->getHeight()) << item.uri << item.arguments;
        ASSERT_TRUE(!item.file || m_folder.exists(stem + item.file)) << item.file;
        if (item.width == 8)
        {
            EXPECT_EQ(support::readFile(m_folder.path("flat.png")),
                      support::readFile(m_folder.path(stem + item.file)))
                << item.uri;
        }
    }
}

// Fault caught: filters and wrapping that are lost, or that one material imposes on another with the same picture.
TEST_F(ConvertMaterialTest, samplersKeepTheirSettings)
{
    const std::string body = R"(","pbrMetallicRoughness":{"baseColorTexture":{"index":)";
    m_folder.write(
        "model.gltf",
        makeModel({R"({"name":"usual)" + body + "0}}}", R"({"name":"own)" + body + "2}}}"}).dump());
    const Glo::Ptr loaded = convertAndLoad("model.gltf out.glo", "out.glo");
    ASSERT_TRUE(loaded);
    using Filter = TextureParameters::FilterMode;
    using Wrap = TextureParameters::WrapMode;
    const SharedPtr<Texture2D> usual = getTexture(loaded->getAppearance("usual"));
    EXPECT_EQ(Filter::LINEAR_MIPMAP_LINEAR, usual->getMinFilter());
    EXPECT_EQ(Wrap::REPEAT, usual->getHorizontalWrap());
    const SharedPtr<Texture2D> own = getTexture(loaded->getAppearance("own"));
    EXPECT_EQ(Filter::NEAREST_MIPMAP_NEAREST, own->getMinFilter());
    EXPECT_EQ(Filter::NEAREST, own->getMagFilter());
    EXPECT_EQ(Wrap::CLAMP, own->getHorizontalWrap());
    EXPECT_EQ(Wrap::MIRRORED_REPEAT, own->getVerticalWrap());
}

// Fault caught: WebP pictures that are not read, or whose alpha is lost.
TEST(Pictures, readsWebp)
{
    std::vector<uint8_t> pixels;
    for (uint8_t i = 0; i < 6; ++i)
        pixels.insert(pixels.end(), {uint8_t(40 * i), 7, uint8_t(255 - i), uint8_t(i % 2 ? 255 : 90)});
    for (const bool hasAlpha : {true, false})
    {
        uint8_t* encoded = nullptr;
        const size_t size = hasAlpha ? WebPEncodeLosslessRGBA(pixels.data(), 3, 2, 12, &encoded)
                                     : WebPEncodeLosslessRGB(pixels.data(), 4, 2, 12, &encoded);
        std::vector<uint8_t> bytes(encoded, encoded + size);
        WebPFree(encoded);
        convert::PictureHeader header;
        convert::DecodedPicture picture;
        ASSERT_TRUE(convert::readHeader(bytes, header));
        EXPECT_EQ("", header.extension); // the engine reads none
        ASSERT_TRUE(convert::decodePicture(bytes, header, picture));
        EXPECT_EQ(hasAlpha ? 3 : 4, picture.width);
        EXPECT_EQ(pixels, picture.data);
        bytes.resize(size / 2);
        EXPECT_FALSE(convert::decodePicture(bytes, header, picture));
    }
}

// Fault caught: slopes that lean the wrong way; opacity from a map that lands in another pixel or channel.
TEST(Pictures, mapsBecomeOthers)
{
    convert::DecodedPicture ramp{3, 3, 1, {0, 100, 200, 0, 100, 200, 0, 100, 200}};
    ASSERT_TRUE(convert::makeNormals(ramp));
    EXPECT_LT(ramp.data[4 * 3], 100) << "rises to the right, so it looks left";
    EXPECT_NEAR(128, ramp.data[4 * 3 + 1], 1);
    convert::DecodedPicture stairs{
        3, 3, 1, {200, 200, 200, 100, 100, 100, 0, 0, 0}}; // the top row is the highest
    ASSERT_TRUE(convert::makeNormals(stairs));
    EXPECT_LT(stairs.data[4 * 3 + 1], 100) << "rises upwards, so it looks down";
    convert::DecodedPicture normals{1, 1, 3, {128, 128, 255}};
    EXPECT_FALSE(convert::makeNormals(normals));

    convert::DecodedPicture base{2, 1, 3, {1, 2, 3, 4, 5, 6}};
    convert::setAlpha(base, {2, 1, 1, {0, 255}});
    EXPECT_EQ((std::vector<uint8_t>{1, 2, 3, 0, 4, 5, 6, 255}), base.data);
}

TEST(PictureFinder, readsDataUris)
{
    const aiScene none;
    convert::FileGate gate("model.dae");
    convert::ModelFiles files("model.dae", gate);
    const convert::FoundPicture found =
        convert::PictureFinder(none, files).find("data:image/png;base64,aGVs%0AbG8=");
    EXPECT_TRUE(found.isThere);
    EXPECT_EQ((std::vector<uint8_t>{'h', 'e', 'l', 'l', 'o'}), found.bytes);
}
