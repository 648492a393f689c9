#include "gltfwriter.h"

#include "support/tempdir.h"

#include "convert/formats/mending.h"
#include "convert/gltf/reader.h"

#include <assimp/GltfMaterial.h>
#include <assimp/scene.h>
#include <draco/compression/encode.h>
#include <gtest/gtest.h>
#include <meshoptimizer.h>

#include <cmath>
#include <filesystem>
#include <functional>
#include <limits>
#include <memory>
#include <set>

using nlohmann::json;
using Numbers = std::vector<float>;

namespace
{

const Numbers CORNERS = {0, 0, 0, 1, 0, 0, 0, 1, 0};

class GltfReader : public testing::Test
{
protected:
    const aiScene& read(GltfWriter::Bytes bytes)
    {
        m_report = convert::Report();
        const auto open = [](const std::string&, GltfWriter::Bytes&) { return false; };
        convert::gltf::Opened opened = convert::gltf::openGltf(std::move(bytes), "model.glb");
        m_scene = convert::gltf::readGltf(std::move(opened.document), open, m_options, m_report);
        return *m_scene;
    }

    /// @return the message; "" if it is read.
    std::string getFault(GltfWriter::Bytes bytes)
    {
        try
        {
            read(std::move(bytes));
            return "";
        }
        catch (const convert::gltf::Fault& fault)
        {
            return fault.what();
        }
    }

    bool isLost(const std::string& code) const
    {
        return std::any_of(m_report.getLosses().begin(), m_report.getLosses().end(),
                           [&](const auto& loss) { return loss.first.first == code; });
    }

    static Numbers getPositions(const aiMesh& mesh)
    {
        Numbers numbers;
        for (unsigned i = 0; i < mesh.mNumVertices; ++i)
            numbers.insert(numbers.end(), &mesh.mVertices[i].x, &mesh.mVertices[i].x + 3);
        return numbers;
    }

    static Numbers toNumbers(const aiVector3D& v) { return {v.x, v.y, v.z}; }

    static void expectNear(const Numbers& wanted, const Numbers& found, float tolerance = 1e-6f)
    {
        ASSERT_EQ(wanted.size(), found.size());
        for (size_t i = 0; i < wanted.size(); ++i)
            EXPECT_NEAR(wanted[i], found[i], tolerance) << "number " << i;
    }

    convert::Options m_options;
    convert::Report m_report;
    std::unique_ptr<aiScene> m_scene;
};

/// Positions of a triangle for which integers and normalised integers differ.
template <class T>
std::vector<T> getExtremes()
{
    const T most = std::numeric_limits<T>::max();
    const T least = std::numeric_limits<T>::min();
    return {0, T(most / 2), least, most, 0, 1, 2, most, 3};
}

/// Puts one kind of number to all attributes that may have it and reads it back.
template <class T>
Numbers decodeExtremes(bool normalized)
{
    Numbers made;
    for (const T value : getExtremes<T>())
    {
        const double share = double(value) / double(std::numeric_limits<T>::max());
        made.push_back(normalized ? float(std::max(share, -1.0)) : float(value));
    }
    return made;
}

template <class T>
GltfWriter writeExtremes(bool normalized)
{
    GltfWriter writer;
    writer.setAttribute("POSITION", writer.add(getExtremes<T>(), "VEC3", normalized));
    return writer;
}

} // namespace

// Fault caught: integers read as floats, or normalised ones as plain ones; signs lost; -128 that becomes less than -1.
TEST_F(GltfReader, everyKindOfNumber)
{
    const struct
    {
        const char* name;
        GltfWriter writer;
        Numbers wanted;
    } cases[] = {
        {"int8", writeExtremes<int8_t>(false), decodeExtremes<int8_t>(false)},
        {"int8 share", writeExtremes<int8_t>(true), decodeExtremes<int8_t>(true)},
        {"uint8", writeExtremes<uint8_t>(false), decodeExtremes<uint8_t>(false)},
        {"uint8 share", writeExtremes<uint8_t>(true), decodeExtremes<uint8_t>(true)},
        {"int16", writeExtremes<int16_t>(false), decodeExtremes<int16_t>(false)},
        {"int16 share", writeExtremes<int16_t>(true), decodeExtremes<int16_t>(true)},
        {"uint16", writeExtremes<uint16_t>(false), decodeExtremes<uint16_t>(false)},
        {"uint16 share", writeExtremes<uint16_t>(true), decodeExtremes<uint16_t>(true)},
        {"uint32 share", writeExtremes<uint32_t>(true), decodeExtremes<uint32_t>(true)},
    };
    for (const auto& item : cases)
    {
        SCOPED_TRACE(item.name);
        const aiScene& scene = read(GltfWriter(item.writer).write());
        ASSERT_EQ(1u, scene.mNumMeshes);
        expectNear(item.wanted, getPositions(*scene.mMeshes[0]));
    }
}

// Fault caught: strides ignored; sparse values dropped or in the wrong place; an accessor without a buffer view
// refused; indices read with the wrong size.
TEST_F(GltfReader, everyPlaceOfNumbers)
{
    const Numbers moved = {0, 0, 0, 7, 8, 9, 0, 1, 0};
    const auto makeSparse = [](GltfWriter& writer, size_t accessor)
    {
        const size_t places = writer.addView(GltfWriter::toBytes(std::vector<uint8_t>{1}));
        const size_t values = writer.addView(GltfWriter::toBytes(Numbers{7, 8, 9}));
        writer.file["accessors"][accessor]["sparse"] = {
            {"count", 1},
            {"indices", {{"bufferView", places}, {"componentType", 5121}}},
            {"values", {{"bufferView", values}}}};
    };
    const struct
    {
        const char* name;
        std::function<void(GltfWriter&)> write;
        Numbers wanted;
    } cases[] = {
        {"interleaved",
         [](GltfWriter& writer)
         {
             Numbers rows;
             for (size_t i = 0; i < 3; ++i)
                 rows.insert(rows.end(), {CORNERS[i * 3], CORNERS[i * 3 + 1], CORNERS[i * 3 + 2], 50, 60});
             const size_t view = writer.addView(GltfWriter::toBytes(rows));
             writer.file["bufferViews"][view]["byteStride"] = 20;
             writer.setAttribute("POSITION", writer.addAccessor<float>(view, 3, "VEC3"));
         },
         CORNERS},
        {"offset",
         [](GltfWriter& writer)
         {
             const size_t view = writer.addView(GltfWriter::toBytes(Numbers{9, 0, 0, 0, 1, 0, 0, 0, 1, 0}));
             const size_t accessor = writer.addAccessor<float>(view, 3, "VEC3");
             writer.file["accessors"][accessor]["byteOffset"] = 4;
             writer.setAttribute("POSITION", accessor);
         },
         CORNERS},
        {"sparse",
         [&](GltfWriter& writer)
         {
             writer.setAttribute("POSITION", writer.add(CORNERS, "VEC3"));
             makeSparse(writer, 0);
         },
         moved},
        {"sparse zeros",
         [&](GltfWriter& writer)
         {
             writer.setAttribute("POSITION", writer.add(CORNERS, "VEC3"));
             makeSparse(writer, 0);
             writer.file["accessors"][0].erase("bufferView");
         },
         {0, 0, 0, 7, 8, 9, 0, 0, 0}},
        {"8-bit indices of some vertices",
         [](GltfWriter& writer)
         {
             Numbers many = {5, 5, 5};
             many.insert(many.end(), CORNERS.begin(), CORNERS.end());
             writer.setAttribute("POSITION", writer.add(many, "VEC3"));
             writer.primitive()["indices"] = writer.add(std::vector<uint8_t>{1, 2, 3}, "SCALAR");
         },
         CORNERS},
        {"32-bit indices",
         [](GltfWriter& writer)
         {
             writer.setAttribute("POSITION", writer.add(CORNERS, "VEC3"));
             writer.primitive()["indices"] = writer.add(std::vector<uint32_t>{0, 1, 2}, "SCALAR");
         },
         CORNERS},
    };
    for (const auto& item : cases)
    {
        SCOPED_TRACE(item.name);
        GltfWriter writer;
        item.write(writer);
        const aiScene& scene = read(writer.write());
        ASSERT_EQ(1u, scene.mNumMeshes);
        ASSERT_EQ(1u, scene.mMeshes[0]->mNumFaces);
        expectNear(item.wanted, getPositions(*scene.mMeshes[0]));
    }
}

// Fault caught: attributes that quantised files have as whole numbers read as floats, and the transform of their texture
// coordinates lost.
TEST_F(GltfReader, quantisedAttributes)
{
    GltfWriter writer;
    writer.file["extensionsRequired"] = {"KHR_mesh_quantization", "KHR_texture_transform"};
    writer.setAttribute("POSITION", writer.add(std::vector<uint16_t>{0, 0, 0, 100, 0, 0, 0, 100, 0}, "VEC3"));
    writer.setAttribute("NORMAL",
                        writer.add(std::vector<int8_t>{0, 0, 127, 0, 127, 0, -127, 0, 0}, "VEC3", true));
    writer.setAttribute(
        "TANGENT",
        writer.add(std::vector<int8_t>{127, 0, 0, 127, 127, 0, 0, -127, 0, 127, 0, 127}, "VEC4", true));
    writer.setAttribute("TEXCOORD_0", writer.add(std::vector<uint16_t>{0, 0, 4095, 0, 0, 4095}, "VEC2"));
    writer.setAttribute("COLOR_0",
                        writer.add(std::vector<uint8_t>{255, 0, 51, 0, 0, 0, 102, 255, 0}, "VEC3", true));
    writer.file["images"] = {{{"uri", "a.png"}}};
    writer.file["textures"] = {{{"source", 0}}};
    const json transform = {{"scale", {2.0 / 4095, 1.0 / 4095}}, {"offset", {0.5, 0.25}}};
    writer.file["materials"] = {
        {{"pbrMetallicRoughness",
          {{"baseColorTexture", {{"index", 0}, {"extensions", {{"KHR_texture_transform", transform}}}}}}}}};
    writer.primitive()["material"] = 0;
    const aiScene& scene = read(writer.write());
    ASSERT_EQ(1u, scene.mNumMeshes);
    const aiMesh& mesh = *scene.mMeshes[0];
    expectNear({0, 0, 0, 100, 0, 0, 0, 100, 0}, getPositions(mesh));
    expectNear({0, 1, 0}, toNumbers(mesh.mNormals[1]));
    expectNear({-1, 0, 0}, toNumbers(mesh.mNormals[2]));
    expectNear({0, 0, 1}, toNumbers(mesh.mBitangents[1])); // (0,1,0) x (1,0,0), the other way round
    expectNear({2.5f, 0.75f, 0}, toNumbers(mesh.mTextureCoords[0][1])); // v goes up here
    expectNear({0.5f, -0.25f, 0}, toNumbers(mesh.mTextureCoords[0][2]));
    const aiColor4D& colour = mesh.mColors[0][0];
    expectNear({1, 0, 0.2f, 1}, {colour.r, colour.g, colour.b, colour.a});
}

// Fault caught: compressed meshes that come out empty, as shards or with attributes mixed up.
TEST_F(GltfReader, meshoptCompression)
{
    const std::vector<uint32_t> indices = {0, 1, 2};
    GltfWriter writer;
    writer.file["buffers"].push_back(
        {{"byteLength", 1}, {"extensions", {{"EXT_meshopt_compression", {{"fallback", true}}}}}});
    const auto addPacked = [&](const GltfWriter::Bytes& packed, size_t count, size_t stride, const char* mode,
                               const char* filter)
    {
        const size_t view = writer.addView(packed);
        json& made = writer.file["bufferViews"][view];
        json compression = made;
        compression.update({{"count", count}, {"byteStride", stride}, {"mode", mode}, {"filter", filter}});
        made["buffer"] = 1; // of which nothing is there
        made["extensions"]["EXT_meshopt_compression"] = compression;
        return view;
    };
    const auto packVertices = [](const void* vertices, size_t count, size_t stride)
    {
        GltfWriter::Bytes packed(meshopt_encodeVertexBufferBound(count, stride));
        packed.resize(meshopt_encodeVertexBuffer(packed.data(), packed.size(), vertices, count, stride));
        return packed;
    };
    GltfWriter::Bytes triangles(meshopt_encodeIndexBufferBound(3, 3));
    triangles.resize(meshopt_encodeIndexBuffer(triangles.data(), triangles.size(), indices.data(), 3));

    writer.setAttribute("POSITION", writer.addAccessor<float>(addPacked(packVertices(CORNERS.data(), 3, 12),
                                                                        3, 12, "ATTRIBUTES", "NONE"),
                                                              3, "VEC3"));
    const float normals[] = {0, 0, 1, 0, 0.6f, 0, 0.8f, 0, 0, -1, 0, 0};
    int8_t packedNormals[12];
    meshopt_encodeFilterOct(packedNormals, 3, 4, 8, normals);
    const size_t normalView = addPacked(packVertices(packedNormals, 3, 4), 3, 4, "ATTRIBUTES", "OCTAHEDRAL");
    writer.file["bufferViews"][normalView]["byteStride"] = 4;
    writer.setAttribute("NORMAL", writer.addAccessor<int8_t>(normalView, 3, "VEC3", true));
    writer.primitive()["indices"] =
        writer.addAccessor<uint16_t>(addPacked(triangles, 3, 2, "TRIANGLES", "NONE"), 3, "SCALAR");
    const GltfWriter::Bytes file = writer.write();
    const aiScene& scene = read(file);
    ASSERT_EQ(1u, scene.mNumMeshes);
    expectNear(CORNERS, getPositions(*scene.mMeshes[0]));
    expectNear({0.6f, 0, 0.8f}, toNumbers(scene.mMeshes[0]->mNormals[1]), 0.01f);

    json& compression = writer.file["bufferViews"][0]["extensions"]["EXT_meshopt_compression"];
    compression["count"] = 1u << 30;
    EXPECT_EQ(
        "bufferViews[0].extensions.EXT_meshopt_compression.count is more than the compressed bytes can hold",
        getFault(writer.write()));
}

TEST_F(GltfReader, dracoCompression)
{
    draco::Mesh packed;
    packed.set_num_points(3);
    packed.AddFace({draco::PointIndex(0), draco::PointIndex(1), draco::PointIndex(2)});
    const auto addAttribute = [&](draco::GeometryAttribute::Type kind, draco::DataType type,
                                  int8_t components, const void* values, size_t size)
    {
        draco::GeometryAttribute attribute;
        attribute.Init(kind, nullptr, uint8_t(components), type, false, int64_t(size), 0);
        const int id = packed.AddAttribute(attribute, true, 3);
        for (uint32_t i = 0; i < 3; ++i)
            packed.attribute(id)->SetAttributeValue(draco::AttributeValueIndex(i),
                                                    static_cast<const uint8_t*>(values) + i * size);
        return packed.attribute(id)->unique_id();
    };
    const uint8_t joints[] = {0, 1, 0, 0, 1, 0, 0, 0, 1, 0, 0, 0};
    const float weights[] = {0.25f, 0.75f, 0, 0, 1, 0, 0, 0, 1, 0, 0, 0};
    const uint32_t ids[] = {
        addAttribute(draco::GeometryAttribute::POSITION, draco::DT_FLOAT32, 3, CORNERS.data(), 12),
        addAttribute(draco::GeometryAttribute::GENERIC, draco::DT_UINT8, 4, joints, 4),
        addAttribute(draco::GeometryAttribute::GENERIC, draco::DT_FLOAT32, 4, weights, 16)};
    draco::Encoder encoder;
    encoder.SetEncodingMethod(draco::MESH_SEQUENTIAL_ENCODING); // keeps the order
    draco::EncoderBuffer buffer;
    ASSERT_TRUE(encoder.EncodeMeshToBuffer(packed, &buffer).ok());

    GltfWriter writer;
    const size_t view = writer.addView(GltfWriter::Bytes(buffer.data(), buffer.data() + buffer.size()));
    const auto declare = [&](const char* name, int code, const char* type)
    {
        writer.file["accessors"].push_back({{"componentType", code}, {"count", 3}, {"type", type}});
        writer.setAttribute(name, writer.file["accessors"].size() - 1);
    };
    declare("POSITION", 5126, "VEC3");
    declare("JOINTS_0", 5121, "VEC4");
    declare("WEIGHTS_0", 5126, "VEC4");
    writer.primitive()["extensions"]["KHR_draco_mesh_compression"] = {
        {"bufferView", view},
        {"attributes", {{"POSITION", ids[0]}, {"JOINTS_0", ids[1]}, {"WEIGHTS_0", ids[2]}}}};
    writer.file["nodes"][0]["skin"] = 0;
    writer.file["nodes"].push_back({{"name", "first"}, {"children", {2}}});
    writer.file["nodes"].push_back({{"name", "second"}});
    writer.file["scenes"][0]["nodes"].push_back(1);
    writer.file["skins"] = {{{"joints", {1, 2}}}};
    const aiScene& scene = read(writer.write());
    ASSERT_EQ(1u, scene.mNumMeshes);
    const aiMesh& mesh = *scene.mMeshes[0];
    expectNear(CORNERS, getPositions(mesh));
    ASSERT_EQ(2u, mesh.mNumBones);
    EXPECT_STREQ("second", mesh.mBones[1]->mName.C_Str());
    ASSERT_EQ(3u, mesh.mBones[1]->mNumWeights);
    EXPECT_EQ(0.75f, mesh.mBones[1]->mWeights[0].mWeight);

    writer.bytes[4] ^= 0xff; // in the packed mesh's header
    EXPECT_NE(std::string::npos, getFault(writer.write()).find("KHR_draco_mesh_compression is damaged"));
}

// Fault caught: a model in the wrong shape at rest; weights of the mesh that outweigh the node's; normals that no longer
// have length 1.
TEST_F(GltfReader, defaultWeightsShapeTheMesh)
{
    GltfWriter writer;
    writer.setAttribute("POSITION", writer.add(CORNERS, "VEC3"));
    writer.setAttribute("NORMAL", writer.add(Numbers{0, 0, 1, 0, 0, 1, 0, 0, 1}, "VEC3"));
    Numbers lift(30000, 0.0f); // far more than there are positions; they count for nothing
    lift[2] = 4.0f;
    const size_t first = writer.add(lift, "VEC3");
    const size_t second = writer.add(std::vector<int8_t>{0, 0, 0, 0, 0, 0, 127, 0, 0}, "VEC3", true);
    const size_t turn = writer.add(Numbers{8, 0, 0, 0, 0, 0, 0, 0, 0}, "VEC3");
    writer.primitive()["targets"] = {{{"POSITION", first}, {"NORMAL", turn}}, {{"POSITION", second}}};
    writer.file["meshes"][0]["weights"] = {0.5, 0};
    writer.file["nodes"].push_back({{"name", "other"}, {"mesh", 0}, {"weights", {0, 2}}});
    writer.file["scenes"][0]["nodes"].push_back(1);
    const aiScene& scene = read(writer.write());
    ASSERT_EQ(2u, scene.mNumMeshes);
    expectNear({0, 0, 2, 1, 0, 0, 0, 1, 0}, getPositions(*scene.mMeshes[0]));
    expectNear({0.9701425f, 0, 0.2425356f}, toNumbers(scene.mMeshes[0]->mNormals[0])); // (4, 0, 1)
    expectNear({0, 0, 0, 1, 0, 0, 2, 1, 0}, getPositions(*scene.mMeshes[1]));
    EXPECT_EQ(2u, scene.mMeshes[0]->mNumAnimMeshes); // which the report tells of
}

// Fault caught: curves flattened to lines, steps to slopes, whole numbers of rotations to nonsense.
TEST_F(GltfReader, animationsMoveAsTheFileHasThem)
{
    GltfWriter writer;
    writer.setAttribute("POSITION", writer.add(CORNERS, "VEC3"));
    const size_t times = writer.add(Numbers{0.5f, 1.5f}, "SCALAR");
    const size_t curve = writer.add(Numbers{0, 0, 0, 1, 2, 3, 3, 0, 0, -2, 0, 0, 5, 6, 7, 0, 0, 0}, "VEC3");
    const size_t steps = writer.add(Numbers{1, 1, 1, 2, 2, 2}, "VEC3");
    const size_t turns = writer.add(std::vector<int16_t>{0, 0, 0, 32767, 0, 23170, 0, 23170}, "VEC4", true);
    writer.file["animations"] = {{{"name", "move"},
                                  {"samplers",
                                   {{{"input", times}, {"output", curve}, {"interpolation", "CUBICSPLINE"}},
                                    {{"input", times}, {"output", steps}, {"interpolation", "STEP"}},
                                    {{"input", times}, {"output", turns}}}},
                                  {"channels",
                                   {{{"sampler", 0}, {"target", {{"node", 0}, {"path", "translation"}}}},
                                    {{"sampler", 1}, {"target", {{"node", 0}, {"path", "scale"}}}},
                                    {{"sampler", 2}, {"target", {{"node", 0}, {"path", "rotation"}}}}}}}};
    m_options.fps = 4.0;
    const aiScene& scene = read(writer.write());
    ASSERT_EQ(1u, scene.mNumAnimations);
    EXPECT_EQ(1.5, scene.mAnimations[0]->mDuration);
    ASSERT_EQ(1u, scene.mAnimations[0]->mNumChannels);
    const aiNodeAnim& channel = *scene.mAnimations[0]->mChannels[0];
    EXPECT_STREQ("node", channel.mNodeName.C_Str());
    ASSERT_EQ(5u, channel.mNumPositionKeys); // both ends, and three samples of a quarter of a second between
    EXPECT_EQ(0.75, channel.mPositionKeys[1].mTime);
    // By hand, at a quarter: 27/32 of the first, 5/32 of the second, 9/64 of the leaving tangent, -3/64 of the arriving.
    expectNear(
        {27.0f / 32 + 25.0f / 32 + 27.0f / 64 + 6.0f / 64, 54.0f / 32 + 30.0f / 32, 81.0f / 32 + 35.0f / 32},
        toNumbers(channel.mPositionKeys[1].mValue));
    ASSERT_EQ(3u, channel.mNumScalingKeys);
    EXPECT_EQ(1.5, channel.mScalingKeys[1].mTime);
    EXPECT_EQ(1.0f, channel.mScalingKeys[1].mValue.x);
    EXPECT_EQ(2.0f, channel.mScalingKeys[2].mValue.x);
    ASSERT_EQ(2u, channel.mNumRotationKeys);
    EXPECT_NEAR(0.70710678f, channel.mRotationKeys[1].mValue.y, 1e-4f);

    writer.file["animations"][0]["samplers"][0]["output"] = steps; // fewer values than a curve needs
    EXPECT_EQ(0u, read(writer.write()).mAnimations[0]->mChannels[0]->mNumPositionKeys);
    EXPECT_TRUE(isLost("animation-target"));
}

// Fault caught: vertices at the end that make no whole face and go without a word.
TEST_F(GltfReader, facesThatAreCutShort)
{
    GltfWriter writer;
    writer.setAttribute("POSITION", writer.add(Numbers{0, 0, 0, 1, 0, 0, 0, 1, 0, 1, 1, 0, 2, 2, 2}, "VEC3"));
    EXPECT_EQ(1u, read(GltfWriter(writer).write()).mMeshes[0]->mNumFaces);
    EXPECT_TRUE(isLost("face"));
    writer.primitive()["mode"] = 5;
    EXPECT_EQ(3u, read(writer.write()).mMeshes[0]->mNumFaces);
    EXPECT_FALSE(isLost("face"));
}

// Fault caught: instances, hidden nodes, lights and cameras that get lost, or scenes that get mixed.
TEST_F(GltfReader, scenesHoldWhatTheFileHas)
{
    GltfWriter writer;
    writer.setAttribute("POSITION", writer.add(CORNERS, "VEC3"));
    const size_t places = writer.add(Numbers{1, 2, 3, 4, 5, 6}, "VEC3");
    const size_t turns = writer.add(std::vector<int8_t>{0, 0, 0, 127, 0, 0, 127, 0}, "VEC4", true);
    writer.file["scenes"] = {{{"nodes", {0}}}, {{"nodes", {1, 2, 3}}}};
    writer.file["scene"] = 1;
    writer.file["nodes"] = {
        {{"name", "elsewhere"}, {"mesh", 0}, {"skin", nullptr}}, // null: as if it were not there
        {{"name", "many"},
         {"mesh", 0},
         {"extensions",
          {{"EXT_mesh_gpu_instancing", {{"attributes", {{"TRANSLATION", places}, {"ROTATION", turns}}}}}}}},
        {{"name", nullptr}, {"mesh", 0}, {"extensions", {{"KHR_node_visibility", {{"visible", false}}}}}},
        {{"name", "many"},
         {"rotation", {0, 0, 1, 1}},
         {"scale", {2, 3, 4}},
         {"camera", 0},
         {"extensions", {{"KHR_lights_punctual", {{"light", 0}}}}}}};
    writer.file["cameras"] = {
        {{"type", "perspective"}, {"perspective", {{"yfov", 1.0}, {"aspectRatio", 2.0}, {"znear", 0.5}}}}};
    writer.file["extensions"]["KHR_lights_punctual"]["lights"] = {{{"type", "spot"},
                                                                   {"color", {1, 0.5, 0}},
                                                                   {"intensity", 2},
                                                                   {"range", 5},
                                                                   {"spot", {{"outerConeAngle", 0.5}}}}};
    const aiScene& scene = read(writer.write());
    EXPECT_TRUE(isLost("scene"));
    ASSERT_EQ(3u, scene.mRootNode->mNumChildren);
    const aiNode& many = *scene.mRootNode->mChildren[0];
    EXPECT_EQ(0u, many.mNumMeshes);
    ASSERT_EQ(2u, many.mNumChildren);
    EXPECT_EQ(1u, many.mChildren[1]->mNumMeshes);
    expectNear({4, 5, 6}, toNumbers(many.mChildren[1]->mTransformation * aiVector3D()));
    expectNear({3, 5, 6}, toNumbers(many.mChildren[1]->mTransformation * aiVector3D(1, 0, 0))); // half a turn
    EXPECT_EQ(0u, scene.mRootNode->mChildren[1]->mNumMeshes);
    EXPECT_STREQ("many 2",
                 scene.mRootNode->mChildren[2]->mName.C_Str()); // of two names alike, animations need one
    ASSERT_EQ(1u, scene.mNumCameras);
    EXPECT_STREQ("many 2", scene.mCameras[0]->mName.C_Str());
    EXPECT_NEAR(2.0 * std::atan(2.0 * std::tan(0.5)), double(scene.mCameras[0]->mHorizontalFOV), 1e-6);
    ASSERT_EQ(1u, scene.mNumLights);
    EXPECT_EQ(1.0f, scene.mLights[0]->mAngleOuterCone);
    EXPECT_EQ(1.0f, scene.mLights[0]->mAttenuationQuadratic); // its range of 5 is beyond where it ends
}

// Fault caught: factors of extensions that are dropped without a word.
TEST_F(GltfReader, materialExtensions)
{
    GltfWriter writer;
    writer.setAttribute("POSITION", writer.add(CORNERS, "VEC3"));
    writer.file["extensionsUsed"] = {"VENDOR_paint", "KHR_materials_unlit"};
    writer.file["images"] = {{{"name", "bark"}, {"uri", "bark.ktx2"}}};
    writer.file["textures"] = {{{"extensions", {{"KHR_texture_basisu", {{"source", 0}}}}}}};
    writer.file["materials"] = {
        {{"emissiveFactor", {0.5, 0.25, 0}},
         {"alphaMode", "MASK"},
         {"alphaCutoff", 0.25},
         {"doubleSided", true},
         {"pbrMetallicRoughness", {{"baseColorTexture", {{"index", 0}}}}},
         {"extensions",
          {{"KHR_materials_emissive_strength", {{"emissiveStrength", 4}}},
           {"KHR_materials_specular", {{"specularFactor", 0.5}, {"specularColorFactor", {1, 0.5, 0}}}},
           {"KHR_materials_ior", {{"ior", 1.5}}},
           {"KHR_materials_iridescence", {{"iridescenceFactor", 1}}},
           {"KHR_materials_unlit", json::object()}}}}};
    const aiScene& scene = read(writer.write());
    const aiMaterial& material = *scene.mMaterials[0];
    aiColor3D colour;
    material.Get(AI_MATKEY_COLOR_EMISSIVE, colour);
    EXPECT_EQ(aiColor3D(2, 1, 0), colour);
    float strength = 0.0f;
    material.Get(AI_MATKEY_SPECULAR_FACTOR, strength);
    EXPECT_NEAR(0.5f, strength, 1e-6f);
    int shading = 0;
    material.Get(AI_MATKEY_SHADING_MODEL, shading);
    EXPECT_EQ(aiShadingMode_NoShading, shading);
    EXPECT_TRUE(isLost("extension"));
    EXPECT_TRUE(isLost("material-extension"));
    EXPECT_TRUE(m_report.getLosses().count(
        {"texture-unreadable", "texture \"bark\", which is in Basis Universal (KHR_texture_basisu) alone"}));
}

// Fault caught: numbers that are none in transforms, bind poses, weights and keys, which end up in the scene.
TEST_F(GltfReader, replacesNumbersThatAreNone)
{
    const float none = std::numeric_limits<float>::quiet_NaN();
    const float endless = std::numeric_limits<float>::infinity();
    GltfWriter writer;
    writer.setAttribute("POSITION", writer.add(CORNERS, "VEC3"));
    writer.setAttribute("JOINTS_0", writer.add(std::vector<uint8_t>(12, 0), "VEC4"));
    Numbers weights(12, 0.0f);
    weights[0] = endless;
    weights[4] = weights[8] = 1.0f;
    writer.setAttribute("WEIGHTS_0", writer.add(weights, "VEC4"));
    const size_t bindPose = writer.add(Numbers(16, none), "MAT4");
    const size_t times = writer.add(Numbers{0, 1, 2}, "SCALAR");
    const size_t keys = writer.add(Numbers{0, 0, 0, none, 0, 0, 1, 1, 1}, "VEC3");
    writer.file["nodes"][0]["skin"] = 0;
    writer.file["nodes"].push_back({{"name", "joint"}, {"scale", {1e30, 1e30, 1e30}}});
    writer.file["scenes"][0]["nodes"].push_back(1);
    writer.file["skins"] = {{{"joints", {1}}, {"inverseBindMatrices", bindPose}}};
    writer.file["animations"] = {
        {{"samplers", {{{"input", times}, {"output", keys}}}},
         {"channels", {{{"sampler", 0}, {"target", {{"node", 1}, {"path", "translation"}}}}}}}};
    read(writer.write());
    convert::mend(*m_scene, m_report);
    const aiBone& bone = *m_scene->mMeshes[0]->mBones[0];
    EXPECT_TRUE(bone.mOffsetMatrix.IsIdentity());
    EXPECT_EQ(0.0f, bone.mWeights[0].mWeight);
    EXPECT_EQ(1.0f, bone.mWeights[1].mWeight);
    EXPECT_TRUE(m_scene->mRootNode->FindNode("joint")->mTransformation.IsIdentity());
    EXPECT_EQ(2u, m_scene->mAnimations[0]->mChannels[0]->mNumPositionKeys);
    std::set<std::string> sentences;
    for (const auto& loss : m_report.getLosses())
        sentences.insert(loss.first.second.substr(0, loss.first.second.find(" with values")));
    EXPECT_EQ((std::set<std::string>{"the transform of node \"joint\"", "the bind pose of joint \"joint\"",
                                     "weights of joint \"joint\"", "keys of node \"joint\""}),
              sentences);
}

// Fault caught: damage that is read as something else, or whose message does not say where it is.
TEST_F(GltfReader, refusesWithThePlace)
{
    const struct
    {
        const char* change; // a JSON merge patch
        const char* message;
    } cases[] = {
        {R"({"extensionsRequired":["KHR_mesh_quantization","VENDOR_a","VENDOR_b"]})",
         "requires unknown extensions: VENDOR_a, VENDOR_b"},
        {R"({"asset":{"version":"3.0"}})", "is of glTF 3.0, which is not read"},
        {R"({"asset":{"minVersion":"2.1"}})", "is of glTF 2.1, which is not read"},
        {R"({"asset":null})", "does not say which version of glTF it is"},
        {R"({"scene":7})", "the file asks for scenes[7], which is not there"},
        {R"({"nodes":[{"children":[0]}]})", "nodes[0] contains itself"},
        {R"({"nodes":[{"mesh":-1}]})", "nodes[0].mesh is not a whole number of 0 or more"},
        {R"({"nodes":[{"mesh":0,"scale":[1,2]}]})", "nodes[0].scale has 2 numbers instead of 3"},
        {R"({"nodes":[{"mesh":0,"scale":[1,1e39,1]}]})", "nodes[0].scale[1] is too large"},
        {R"({"meshes":[{"primitives":[{"attributes":{"POSITION":9}}]}]})",
         "meshes[0].primitives[0].attributes asks for accessors[9], which is not there"},
        {R"({"meshes":[{"primitives":[{"mode":9,"attributes":{"POSITION":0}}]}]})",
         "meshes[0].primitives[0].mode is none"},
        {R"({"accessors":[{"bufferView":0,"componentType":5124,"count":3,"type":"VEC3"}]})",
         "accessors[0].componentType is 5124, which is no kind of number"},
        {R"({"accessors":[{"bufferView":0,"componentType":5126,"count":4,"type":"VEC3"}]})",
         "accessors[0] has 4 elements, which reach beyond its buffer view"},
        {R"({"accessors":[{"componentType":5126,"count":4000000000,"type":"VEC3"}]})",
         "accessors[0].count is more than the file has bytes"},
        {R"({"bufferViews":[{"buffer":0,"byteOffset":4,"byteLength":36}]})",
         "bufferViews[0] reaches beyond its buffer, which has 36 bytes"},
        {R"({"bufferViews":[{"buffer":0,"byteLength":36,"byteStride":8}]})",
         "accessors[0] has elements that overlap, by the stride of its buffer view"},
        {R"({"buffers":[{"uri":"none.bin"}]})", "buffers[0] is file \"none.bin\", which cannot be opened"},
    };
    for (const auto& item : cases)
    {
        GltfWriter writer;
        writer.setAttribute("POSITION", writer.add(CORNERS, "VEC3"));
        writer.file.merge_patch(json::parse(item.change));
        const std::string fault = getFault(writer.write());
        EXPECT_EQ(item.message, fault) << item.change;
    }
    GltfWriter whole;
    whole.setAttribute("POSITION", whole.add(CORNERS, "VEC3"));
    whole.file["asset"]["version"] = "2.1"; // compatible, as it does not say otherwise
    EXPECT_EQ("", getFault(whole.write()));
    const std::string huge = R"({"asset":{"version":"2.0"},"extras":1e999})";
    EXPECT_EQ("has a number that is too large", getFault({huge.begin(), huge.end()}));
    const GltfWriter::Bytes bytes = whole.write();
    for (size_t size = 0; size + 1 < bytes.size(); ++size)
        EXPECT_NE("", getFault({bytes.begin(), bytes.begin() + std::ptrdiff_t(size)})) << size;
}

// Fault caught: damage that the reader neither refuses nor leaves out. Scenes that it makes are valid.
TEST_F(GltfReader, damagedFiles)
{
    const std::filesystem::path seeds = std::filesystem::path(ORV_SOURCE_FOLDER) / "fuzz/corpus/gltf";
    int readCount = 0;
    int refusedCount = 0;
    for (const auto& seed : std::filesystem::directory_iterator(seeds))
    {
        const GltfWriter::Bytes bytes = support::readFile(seed.path());
        ASSERT_EQ("", getFault(bytes)) << seed.path();
        for (size_t at = 0; at < bytes.size(); ++at)
        {
            for (const char spoilt : {'0', '9', '-', '}', 'A'})
            {
                GltfWriter::Bytes damaged = bytes;
                damaged[at] = uint8_t(spoilt);
                m_scene.reset();
                const bool isRead = getFault(damaged).empty();
                ++(isRead ? readCount : refusedCount);
                for (unsigned i = 0; isRead && i < m_scene->mNumMeshes; ++i)
                {
                    const aiMesh& mesh = *m_scene->mMeshes[i];
                    ASSERT_LT(mesh.mMaterialIndex, m_scene->mNumMaterials) << at;
                    for (unsigned face = 0; face < mesh.mNumFaces; ++face)
                    {
                        for (unsigned c = 0; c < mesh.mFaces[face].mNumIndices; ++c)
                            ASSERT_LT(mesh.mFaces[face].mIndices[c], mesh.mNumVertices) << at;
                    }
                }
            }
        }
    }
    EXPECT_LT(1000, readCount);
    EXPECT_LT(1000, refusedCount);
}
