#include "seeds.h"

#include "seedbytes.h"

#include "facility/imagefiles.h"
#include "render/gloscenes.h"

#include "orv/detail/digestmaker.h"

#include <cstdlib>
#include <cstring>
#include <limits>

namespace hostile
{

namespace
{

Bytes counting(size_t count, int step = 1)
{
    Bytes bytes(count);
    for (size_t i = 0; i < count; ++i)
        bytes[i] = uint8_t(int(i) * step);
    return bytes;
}

// --- Images: what the writer used by the tests does not write -------------------------------------------------

Bytes pngChunk(const char* type, const Bytes& data)
{
    return join({big(uint32_t(data.size())), toBytes(type), data, big(0)}); // the decoder ignores checksums
}

/// Uncompressed rows.
Bytes zlibStored(const Bytes& rows)
{
    const uint32_t size = uint32_t(rows.size());
    return join({{0x78, 0x01, 0x01}, little(size, 2), little(~size, 2), rows, big(0)});
}

/// 4 x 4 pixels.
Bytes makePng(int depth, int colourType, int interlace, const Bytes& extra, size_t bytes)
{
    const Bytes header =
        join({big(4), big(4), {uint8_t(depth), uint8_t(colourType), 0, 0, uint8_t(interlace)}});
    Bytes rows = counting(bytes);
    for (uint8_t& byte : rows)
        byte = uint8_t(byte % 5); // filters, where it is one
    return join({{0x89, 'P', 'N', 'G', 13, 10, 26, 10},
                 pngChunk("IHDR", header),
                 extra,
                 pngChunk("IDAT", zlibStored(rows)),
                 pngChunk("IEND", {})});
}

Bytes makePalettePng()
{
    return makePng(2, 3, 0, join({pngChunk("PLTE", counting(12, 20)), pngChunk("tRNS", {0, 128, 255})}),
                   4 * 2);
}

/// @param masks  of the colours, for bitmaps of 16 and 32 bits.
Bytes makeBmp(int bits, const Bytes& palette, const Bytes& masks, size_t rowBytes)
{
    const uint32_t start = uint32_t(14 + 40 + palette.size() + masks.size());
    const Bytes info = join({little(40), little(4), little(4), little(1, 2), little(uint32_t(bits), 2),
                             little(masks.empty() ? 0 : 3), little(0), little(0), little(0),
                             little(uint32_t(palette.size() / 4)), little(0)});
    return join({toBytes("BM"), little(start + uint32_t(4 * rowBytes)), little(0), little(start), info,
                 palette, masks, counting(4 * rowBytes)});
}

/// 16 bits a pixel, in runs, by way of a palette or not.
Bytes makeTga(bool hasPalette)
{
    const Bytes palette = hasPalette ? counting(16) : Bytes();
    const Bytes runs = hasPalette
                           ? Bytes{0x87, 1, 7, 0, 1, 2, 3, 0, 1, 2, 3}
                           : Bytes{0x87, 1, 2, 7, 0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15};
    return join({{0, uint8_t(hasPalette), uint8_t(hasPalette ? 9 : 10)},
                 little(0, 2),
                 little(hasPalette ? 8 : 0, 2),
                 {uint8_t(hasPalette ? 16 : 0)},
                 little(0, 2),
                 little(0, 2),
                 little(4, 2),
                 little(4, 2),
                 {uint8_t(hasPalette ? 8 : 16), 0},
                 palette,
                 runs});
}

Bytes jpegSegment(uint8_t marker, const Bytes& data)
{
    return join({{0xff, marker}, big(uint32_t(data.size() + 2), 2), data});
}

/// Codes 0 and 10 for two symbols.
Bytes jpegCodes(uint8_t table, const Bytes& symbols)
{
    return jpegSegment(0xc4, join({{table, 1, 1}, Bytes(14), symbols}));
}

Bytes jpegScan(const Bytes& components, int first, int last, int bits, const Bytes& data)
{
    Bytes header = {uint8_t(components.size())};
    for (const uint8_t component : components)
        header = join({header, {component, 0}});
    return join({jpegSegment(0xda, join({header, {uint8_t(first), uint8_t(last), uint8_t(bits)}})), data});
}

/// 8 x 8 pixels in one colour or three, in passes that become finer.
Bytes makeProgressiveJpeg(bool isColour)
{
    Bytes components = {8, 0, 8, 0, 8, uint8_t(isColour ? 3 : 1), 1, 0x11, 0};
    Bytes ids = {1};
    if (isColour)
    {
        components = {8, 0, 8, 0, 8, 3, 1, 0x22, 0, 2, 0x11, 0, 3, 0x11, 0};
        ids = {1, 2, 3};
    }
    return join({{0xff, 0xd8},
                 jpegSegment(0xdb, join({{0}, Bytes(64, 1)})),
                 jpegSegment(0xc2, components),
                 jpegCodes(0x00, {0, 3}),
                 jpegCodes(0x10, {0, 1}),
                 jpegSegment(0xdd, {0, 1}),
                 jpegScan(ids, 0, 0, 0x01, {0xa5, 0xff, 0xd0, 0x55}),
                 jpegScan({1}, 1, 5, 0x02, {0xa0, 0x12}),
                 jpegScan({1}, 1, 63, 0x21, {0xb4, 0x7f}),
                 jpegScan(ids, 0, 0, 0x10, {0x81, 0x00}),
                 {0xff, 0xd9}});
}

void addImages(std::vector<Seed>& seeds)
{
    for (const char* suffix : {"png", "jpg", "bmp", "tga"})
    {
        for (const int channels : {1, 2, 3, 4})
        {
            const Bytes file = imagefiles::encode(suffix, 6, 4, channels, counting(size_t(24 * channels), 5));
            seeds.push_back({"image", suffix + std::to_string(channels), file, "", true});
        }
    }
    const Bytes palette = counting(16, 40);
    const Bytes masks = join({little(0xf800), little(0x07e0), little(0x001f)});
    seeds.push_back({"image", "png-palette", makePalettePng(), "", true});
    seeds.push_back(
        {"image", "png-interlaced", makePng(8, 2, 1, {}, 1 * 4 + 0 + 4 + 2 * 7 + 2 * 7 + 2 * 13), "", true});
    seeds.push_back({"image", "png-deep", makePng(16, 6, 0, pngChunk("gAMA", big(1)), 4 * 33), "", true});
    seeds.push_back({"image", "png-key", makePng(1, 0, 0, pngChunk("tRNS", big(1, 2)), 4 * 2), "", true});
    seeds.push_back({"image", "bmp-1", makeBmp(1, counting(8, 40), {}, 4), "", true});
    seeds.push_back({"image", "bmp-4", makeBmp(4, palette, {}, 4), "", true});
    seeds.push_back({"image", "bmp-8", makeBmp(8, palette, {}, 4), "", true});
    seeds.push_back({"image", "bmp-16", makeBmp(16, {}, masks, 8), "", true});
    seeds.push_back({"image", "bmp-32", makeBmp(32, {}, masks, 16), "", true});
    seeds.push_back({"image", "tga-runs", makeTga(false), "", true});
    seeds.push_back({"image", "tga-palette", makeTga(true), "", true});
    seeds.push_back({"image", "jpg-progressive", makeProgressiveJpeg(false), "", true});
    seeds.push_back({"image", "jpg-progressive3", makeProgressiveJpeg(true), "", true});
    seeds.push_back({"image", "none", {}, "Image failed to load texture \"file.png\"", false});
}

// --- Texts ---------------------------------------------------------------------------------------------------

void addTexts(std::vector<Seed>& seeds)
{
    const auto add =
        [&](const char* loader, const char* name, const std::string& error, const std::string& text)
    {
        const bool loads = error.empty() || std::strcmp(loader, "appearance") == 0 ||
                           error.find("incomplete") != std::string::npos;
        seeds.push_back({loader, name, toBytes(text), error, loads});
    };

    add("cubename", "grid", "", "grid.png");
    add("cubename", "six", "", "face.png; face.png;face.png ;orv:white.png;face.png;face.png");
    add("cubename", "sizes", "TextureCube images must have matching dimensions.",
        "face.png;grid.png;face.png;face.png;face.png;face.png");
    add("cubename", "five", "TextureCube name is invalid: face.png;",
        "face.png;face.png;face.png;face.png;face.png");
    add("cubename", "missing", "TextureCube image \"no.png\" not found.",
        "face.png;no.png;face.png;face.png;face.png;face.png");
    add("cubename", "itself", "TextureCube name is invalid: file.png;;;;;", "file.png;;;;;");

    const std::string sources = "1.0\nvertex_source_file sound.vert\nfragment_source_file \"sound.frag\"\n";
    add("program", "plain", "", sources);
    add("program", "uniforms", "ShaderProgram file: file.sp uniform declaration incomplete",
        sources + "// a comment\nuniform u_float M_OPACITY\nuniform u_texture M_DIFFUSE_TEXTURE\n"
                  "uniform u_cube \"M MIRROR\"\nuniform u_float TIME\nuniform u_lonely\n");
    add("program", "wrongSource", "", "1 . 0 vertex_source_file wrong.vert fragment_source_file sound.frag");
    add("program", "noSource", "Reading vertex shader file: none.vert",
        "1.0\nvertex_source_file none.vert fragment_source_file sound.frag");
    add("program", "noFragment", "ShaderProgram file: file.sp missing fragment source",
        "1.0\nvertex_source_file sound.vert");
    add("program", "unknownTag", "ShaderProgram file: file.sp unexpected tag geometry_source_file",
        sources + "geometry_source_file x\n");
    add("program", "version", "ShaderProgram file: file.sp wrong version", "2.0\n" + sources);
    add("program", "itself", "", "1.0\nvertex_source_file file.sp fragment_source_file file.sp");

    add("appearance", "states", "",
        "1.0\npolygon_mode BACK CCW 2.5\nculling_mode NONE winding_order CW\nline_width 3e0\n"
        "depth_offset 1 -2.5\ndepth_test true depth_function LEQUAL depth_write 0\ncolour_mask 1 t T f\n"
        "blend_colour .1 .2 .3 .4\nblend_factors SRC_ALPHA ONE ZERO DST_COLOUR\nblend_functions ADD "
        "SUBTRACT\n"
        "stencil_function BACK ALWAYS -1 255\nstencil_operations FRONT KEEP INCR_WRAP INVERT\n"
        "stencil_mask BACK -1\nstencil_write_mask FRONT 7\n");
    add("appearance", "properties", "ShaderProgram file: file.ap unexpected tag shader_program",
        "1.0\n// colours\nshader_program sound.sp\nproperty M_DIFFUSE_TEXTURE Texture2D face.png\n"
        "property M_REFLECTION_TEXTURE TextureCube grid.png\nproperty M_A Colour4f 1 .5 1e-1 -2E+3\n"
        "property M_B Vector4f 1 2 3 4\nproperty M_C Vector3f 1 2 3\nproperty \"M D\" Vector2f 1 2\n"
        "property M_OPACITY float 0.5\nproperty M_E int -7\nproperty DYNAMIC bool true\n"
        "property M_OPACITY Vector4f 1 1 1 1\nproperty M_F Texture2D none.png\nshader_program file.ap\n");
    add("appearance", "unknownWords", "Appearance file: file.ap unexpected culling mode X",
        "1.0 culling_mode X winding_order X depth_function X blend_factors X X X X blend_functions X X "
        "stencil_function X X x -1 stencil_operations X X X X property M_A quaternion 1");
    add("appearance", "version", "Appearance file: file.ap wrong version", "1.1\n");
    add("appearance", "noPoint", "Appearance file: file.ap expected '.'", "1 0");
    add("appearance", "openQuote", "Appearance file: file.ap unexpected type ", "1.0 property \"M_A");
    add("appearance", "longNumbers", "",
        "1.0 line_width 99999999999999999999999999999999999999999e99999999999 property M_A int "
        "-99999999999999999999 property M_B float 0.00000000000000000000000000000000000000000000001e-9");
}

// --- Scenes --------------------------------------------------------------------------------------------------

Bytes write(const glo::GloScene& scene)
{
    Bytes file;
    std::string error;
    if (!glo::writeGlo(scene, file, error))
        std::abort(); // a scene of ours
    return file;
}

glo::GloScene makeOldScene(const char* version)
{
    glo::GloScene scene;
    scene.info.gloVersion = version;
    scene.geometries = {makeSquareGeometry("square")};
    scene.materials = {makeMaterial("red zun_ppl", orv::Vector4f(1, 0, 0, 1))};
    scene.lights.emplace_back().name = "lamp";
    scene.scene = glo::SceneData{
        "scene", makeNode("top", {makeSolidNode("square", "square", "red zun_ppl"), makeLightNode("lamp")})};
    return scene;
}

/// Every sampler, blending, and every channel target.
glo::GloScene makeAnimatedScene()
{
    glo::GloScene scene;
    scene.materials = {makeMaterial("m", orv::Vector4f())};
    glo::StandardMaterial& data = scene.materials[0].techniques[0];
    data.opacity = 0.5f;
    data.doubleSided = 1;
    data.bump.emplace().image = "face.png";
    data.reflection.sampler.emplace().image = "grid.png";
    data.reflection.sampler->type = glo::sampler::TEXTURE_CUBE;
    data.gloss.emplace().image = "none.png";
    data.refraction.emplace().type = 9;
    scene.surfaces.list = {{0, 0x1f, 0.25f}, {7, 1, 0.5f}};
    scene.geometries = {makeSquareGeometry("square")};
    scene.geometries[0].primitiveSets[0].indices.reset();
    scene.lights.emplace_back().name = "lamp";
    const float inf = std::numeric_limits<float>::infinity();
    scene.animations = {{"all",
                         {{0, 1}},
                         {makeChannel("node", "top", "rotation", {0, 1, 0, 1}),
                          makeChannel("node", "top", "scale", {1, 2, 3}, inf),
                          makeChannel("light", "lamp", "colour", {1, 1, 1}),
                          makeChannel("light", "lamp", "multiplier", {2}, -inf),
                          makeChannel("material", "m", "diffuse", {1, 1, 1, 1}),
                          makeChannel("material", "m", "shininess", {9})},
                         {}}};
    scene.scene = glo::SceneData{
        "scene", makeNode("top", {makeSolidNode("a", "square", "m"), makeSolidNode("b", "square", "none"),
                                  makeLightNode("lamp node")})};
    return scene;
}

Bytes gloChunk(const char (&id)[5], const Bytes& data, uint32_t size)
{
    return join({little(glo::chunkId(id)), little(size), data});
}

Bytes gloChunk(const char (&id)[5], const Bytes& data)
{
    return gloChunk(id, data, uint32_t(data.size()));
}

Bytes gloText(const std::string& text)
{
    return join({little(uint32_t(text.size() + 1)), toBytes(text), {0}});
}

/// A file of version 0.6.0, whose chunks are the smallest, around other chunks.
Bytes gloFile(const Bytes& chunks)
{
    const Bytes info = gloChunk("INFO", join({gloText("0.6.0"), gloText(""), gloText(""), gloText("")}));
    return gloChunk("GLO3", join({little(1), info, chunks}));
}

Bytes repeat(const Bytes& piece, int count)
{
    return join(std::vector<Bytes>(size_t(count), piece));
}

/// Nested nodes, each with one child.
Bytes nestNodes(int count)
{
    const Bytes start = join({gloText(""), Bytes(4 * 10 + 4 * 2), little(1)});
    return repeat(gloChunk("NODE", start, 0x7fffffff), count);
}

/// Nested animations.
Bytes nestAnimations(int count)
{
    return repeat(gloChunk("ANIM", join({gloText(""), little(0), little(0), little(1)}), 0x7fffffff), count);
}

/// One geometry of many sets, used by many nodes: the number of solids is the product.
Bytes multiplySolids(int sets, int nodes)
{
    const Bytes vertices = gloChunk("VSET", join({little(0), little(0), gloChunk("VBUF", {})}));
    const Bytes pieces = repeat(gloChunk("PSET", join({little(5), little(0)})), sets);
    const Bytes geometry = gloChunk("GEOM", join({gloText(""), vertices, little(uint32_t(sets)), pieces}));
    const Bytes reference = gloChunk("GREF", join({gloText(""), little(0)}));
    const Bytes node =
        gloChunk("NODE", join({gloText(""), Bytes(4 * 10), little(1), reference, little(0), little(0)}));
    const Bytes top = gloChunk(
        "NODE", join({gloText(""), Bytes(4 * 10 + 4 * 2), little(uint32_t(nodes)), repeat(node, nodes)}));
    return gloFile(
        join({gloChunk("LGEO", join({little(1), geometry})), gloChunk("SCNE", join({gloText(""), top}))}));
}

void addScenes(std::vector<Seed>& seeds)
{
    const uint32_t most = 0xffffffff;
    glo::GloScene full = makeFullScene();
    seeds.push_back({"scene", "full", write(full), "", true});
    full.info.authoringTool = "3ds_max2012";
    full.upAxis = uint32_t(glo::UpAxis::Z);
    seeds.push_back({"scene", "max", write(full), "", true});
    seeds.push_back(
        {"scene", "animated", write(makeAnimatedScene()), "Failed to find 2d texture \"none.png\"", true});
    for (const char* version : {"0.6.9", "0.9.0", "0.10.0", "0.12.5", "0.13.0"})
        seeds.push_back({"scene", version, write(makeOldScene(version)), "", true});

    const auto add = [&](const char* name, const char* error, const Bytes& file) {
        seeds.push_back({"scene", name, file, error, !*error});
    };
    add("noScene", "", gloFile({}));
    add("lightsWithoutEnd", "", gloFile(gloChunk("LLGT", little(most))));
    add("materialsWithoutEnd", "Failed to read chunk ID", gloFile(gloChunk("LMAT", little(most))));
    add("skipThatWraps", "Size of WHAT chunk data (0) does not match",
        gloFile(gloChunk("WHAT", {}, most - 7)));
    add("deepNodes", "Chunks lie more than 512 deep",
        gloFile(gloChunk("SCNE", join({gloText(""), nestNodes(520)}))));
    add("deepAnimations", "Chunks lie more than 512 deep",
        gloFile(gloChunk("LANM", join({little(1), nestAnimations(520)}))));
    add("manySolids", "", multiplySolids(60, 30));
    add("tooManySolids", "References in file.glo ask for more", multiplySolids(400, 60));
}

// --- PVR -----------------------------------------------------------------------------------------------------

Bytes joinWords(const std::vector<uint32_t>& words, bool isBig)
{
    Bytes bytes;
    for (const uint32_t word : words)
        bytes = join({bytes, isBig ? big(word) : little(word)});
    return bytes;
}

Bytes makePvr(uint32_t format, uint32_t channels, uint32_t width, uint32_t height, uint32_t levels,
              size_t size, bool isBig = false)
{
    const uint32_t low = isBig ? channels : format;
    const uint32_t high = isBig ? format : channels; // one number of 64 bits
    return join({joinWords({0x03525650, 0, low, high, 0, 0, height, width, 1, 1, 1, levels, 4}, isBig),
                 {1, 2, 3, 4},
                 counting(size, 37)});
}

Bytes makeLegacyPvr(uint32_t headerSize, uint32_t flags, uint32_t side, uint32_t mipmaps, size_t size)
{
    const Bytes header =
        joinWords({headerSize, side, side, mipmaps, flags, 0, 0, 0, 0, 0, 0, 0x21525650, 1}, false);
    return join({Bytes(header.begin(), header.begin() + headerSize), counting(size, 37)});
}

void addPvrs(std::vector<Seed>& seeds)
{
    const auto add = [&](const char* name, const Bytes& file) {
        seeds.push_back({"pvr", name, file, "", true});
    };
    const uint32_t RGBA = 0x61626772, RGBA_BITS = 0x08080808;
    add("rgba", makePvr(RGBA, RGBA_BITS, 4, 4, 3, 64 + 16 + 4));
    add("rgba-big", makePvr(RGBA, RGBA_BITS, 3, 2, 1, 24, true));
    add("pvrtc2", makePvr(0, 0, 16, 8, 1, 32));
    add("pvrtc4", makePvr(3, 0, 16, 8, 1, 64));
    add("etc1", makePvr(6, 0, 8, 8, 4, 32 + 8 + 8 + 8));
    add("legacy", makeLegacyPvr(52, 0x12, 2, 1, 16 + 4));
    add("legacy-565", makeLegacyPvr(44, 0x10013, 4, 0, 32));
    add("legacy-pvrtc", makeLegacyPvr(52, 0x820d, 8, 0, 32));
    seeds.push_back({"pvr", "none", {}, "PVR texture \"file.pvr\" failed to load", false});
}

// --- Others --------------------------------------------------------------------------------------------------

Bytes makeRecord(const std::string& name, uint32_t offset, uint32_t components)
{
    Bytes text = toBytes(name);
    text.resize(16);
    return join({text, little(uint32_t(name.size())), little(0), little(0x1406), little(0), little(0),
                 little(offset), little(components), little(24), little(0), little(0)});
}

void addOthers(std::vector<Seed>& seeds)
{
    const Bytes records = join({makeRecord("a_normal", 0, 3), makeRecord("a_position", 12, 3)});
    seeds.push_back(
        {"vertices", "two", join({little(72), little(24), little(2), records, counting(72)}), "", true});
    seeds.push_back({"vertices", "none", join({little(0), little(0), little(0)}), "", true});

    const auto files = makeSoundFiles();
    orv::detail::DigestMaker maker;
    for (const char* name : {"sound.vert", "sound.frag"})
    {
        const Bytes source = join({toBytes("#define \n"), files.at(name)}); // the program is "sound.sp$"
        maker.append(reinterpret_cast<const char*>(source.data()), unsigned(source.size()));
    }
    const auto& made = maker.digest().bytes;
    const Bytes digest(made.begin(), made.end());
    const auto binary = [&](uint32_t version, uint32_t format, const char* bytes) {
        return join({digest, little(version), little(format), toBytes(bytes)});
    };
    seeds.push_back({"binary", "taken", binary(1, 1, "binary of the driver"), "", true});
    seeds.push_back(
        {"binary", "refused", binary(1, 1, "not of the driver"), "ShaderProgram binary load failed", true});
    seeds.push_back(
        {"binary", "format", binary(1, 0xffffffff, "binary"), "ShaderProgram binary load failed", true});
    seeds.push_back({"binary", "version", binary(2, 1, "binary"), "", true});
    seeds.push_back(
        {"binary", "stale", join({Bytes(16), little(1), little(1), toBytes("binary")}), "", true});
    for (const size_t size : {0, 15, 55, 56, 64, 130})
        seeds.push_back({"digest", std::to_string(size), counting(size, 7), "", size >= 16});
}

// --- Files that cost ------------------------------------------------------------------------------------------

/// Scans over the whole picture without data, so that the decoder has to invent it.
Bytes makeJpegOfScans(bool isProgressive, int side, int scans)
{
    const int last = isProgressive ? 0 : 63;
    Bytes file =
        join({{0xff, 0xd8},
              jpegSegment(0xdb, join({{0}, Bytes(64, 1)})),
              jpegSegment(isProgressive ? 0xc2 : 0xc0,
                          join({{8}, big(uint32_t(side), 2), big(uint32_t(side), 2), {1, 1, 0x11, 0}})),
              jpegCodes(0x00, {0, 0}),
              jpegCodes(0x10, {1, 1}),
              jpegScan({1}, 0, last, 0, {})});
    const Bytes scan = jpegScan({1}, isProgressive ? 1 : 0, 63, 0, {});
    for (int i = 0; i < scans; ++i)
        file = join({file, scan});
    return join({file, {0xff, 0xd9}});
}

/// A text that repeats a line, with another number for each "%".
Bytes repeatLine(const std::string& start, const std::string& line, int count)
{
    std::string text = start;
    for (int i = 0; i < count; ++i)
    {
        for (const char c : line)
            text += c == '%' ? std::to_string(i) : std::string(1, c);
        text += '\n';
    }
    return toBytes(text);
}

/// A name spelled with more and more "./" before it.
Bytes repeatSpelling(const std::string& line, const std::string& name, int count)
{
    std::string text = "1.0\n";
    std::string path;
    for (int i = 0; i < count; ++i, path += "./")
        text += line + path + name + '\n';
    return toBytes(text);
}

} // namespace

std::vector<Seed> makeCostlyFiles()
{
    std::vector<Seed> files;
    const auto add = [&](const char* loader, const char* name, bool loads, const char* error,
                         const Bytes& file) {
        files.push_back({loader, name, file, error, loads});
    };
    const char* const failed = "Image failed to load texture \"file.png\"";
    const char* const beyond = "A file of";
    add("image", "flat", true, "", imagefiles::encodeFlat("png", 512, 512, 4));
    add("image", "flat, above the limit", false, beyond, imagefiles::encodeFlat("png", 514, 512, 4));
    add("image", "one bit a pixel", false, beyond,
        join({{0x89, 'P', 'N', 'G', 13, 10, 26, 10},
              pngChunk("IHDR", join({big(4096), big(4096), {1, 0, 0, 0, 0}})),
              pngChunk("IDAT", Bytes(2500)),
              pngChunk("IEND", {})}));
    add("image", "progressive scans", false, failed, makeJpegOfScans(true, 512, 400));
    add("image", "sequential scans", false, failed, makeJpegOfScans(false, 512, 400));
    add("image", "few scans", true, "", makeJpegOfScans(true, 256, 3));

    add("cubename", "one picture", false,
        "wide.png;wide.png;wide.png;wide.png;wide.png;wide.png asks for textures",
        toBytes("wide.png;wide.png;wide.png;wide.png;wide.png;wide.png"));
    add("cubename", "spellings", false, "wide.png;./wide.png",
        toBytes("wide.png;./wide.png;././wide.png;./././wide.png;././././wide.png;./././././wide.png"));
    add("program", "uniforms", true, "ShaderProgram file: file.sp uniform declaration incomplete",
        repeatLine("1.0\nvertex_source_file sound.vert\nfragment_source_file sound.frag\n", "uniform", 2000));

    const auto addAppearance = [&](const char* name, const char* error, const std::string& line)
    { add("appearance", name, true, error, repeatLine("1.0\n", line, 2000)); };
    addAppearance("words", "Appearance file: file.ap unexpected culling mode X", "culling_mode X");
    addAppearance("line widths", "Appearance file: file.ap unexpected line width 0", "line_width 0");
    addAppearance("deprecated names", "", "property a Texture2D orv:white.png");
    addAppearance("missing pictures", "Appearance file: file.ap names 2000 assets",
                  "property a Texture2D none%.png");
    addAppearance("itself as a picture", "Image failed to load texture \"file.ap\"",
                  "property a Texture2D file.ap");
    addAppearance("itself as a cube", "TextureCube image \"file.ap\" failed",
                  "property a TextureCube file.ap");
    addAppearance("itself as a program", "ShaderProgram file: file.ap", "shader_program file.ap");
    addAppearance("programs", "file.ap asks for shader programs", "shader_program orv#max_pvl.sp$A%");
    addAppearance("programs that fail", "file.ap asks for shader programs", "shader_program wrong.sp$A%");
    addAppearance("properties", "", "property a% bool 1");
    add("appearance", "spellings", true, "file.ap asks for textures of",
        repeatSpelling("property a Texture2D ", "wide.png", 100));
    add("appearance", "spellings of itself", true, "Image failed to load texture",
        repeatSpelling("property a Texture2D ", "file.ap", 300));
    addCostlyScenes(files);
    addCostlyFonts(files);
    return files;
}

std::vector<Seed> makeSeeds()
{
    std::vector<Seed> seeds;
    addImages(seeds);
    addTexts(seeds);
    addScenes(seeds);
    addFonts(seeds);
    addPvrs(seeds);
    addOthers(seeds);
    return seeds;
}

std::map<std::string, Bytes> makeSoundFiles()
{
    return {
        {"face.png", imagefiles::encodeFlat("png", 1, 1, 3)},
        {"grid.png", imagefiles::encodeFlat("png", 6, 4, 3)},
        {"sound.vert",
         toBytes("attribute vec3 a_position; void main() { gl_Position = vec4(a_position, 1.0); }")},
        {"sound.frag", toBytes("void main() { gl_FragColor = vec4(1.0); }")},
        {"wide.png", imagefiles::encodeFlat("png", 256, 256, 4)},
        {"wrong.vert", toBytes("#error\n")},
        {"wrong.sp", toBytes("1.0 vertex_source_file wrong.vert fragment_source_file sound.frag")},
        {"sound.sp", toBytes("1.0 vertex_source_file sound.vert fragment_source_file sound.frag "
                             "uniform u_float TIME uniform u_texture M_A uniform u_cube M_B")},
    };
}

} // namespace hostile
