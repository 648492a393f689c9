#pragma once

#include <cstdint>
#include <cstring>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

/// Writes small glTF files, number by number.
class GltfWriter
{
public:
    using json = nlohmann::json;
    using Bytes = std::vector<uint8_t>;

    /// A file with a node "node" in its scene, which draws mesh 0; what else there is adds the test.
    GltfWriter()
        : file(json::parse(R"({"asset":{"version":"2.0"},"scene":0,"scenes":[{"nodes":[0]}],
              "nodes":[{"name":"node","mesh":0}],"meshes":[{"name":"mesh","primitives":[{"attributes":{}}]}],
              "buffers":[{"byteLength":0}],"bufferViews":[],"accessors":[]})"))
    {
    }

    template <class T>
    static Bytes toBytes(const std::vector<T>& values)
    {
        Bytes bytes(values.size() * sizeof(T));
        std::memcpy(bytes.data(), values.data(), bytes.size());
        return bytes;
    }

    template <class T>
    static int getCode()
    {
        if (std::is_same_v<T, float>)
            return 5126;
        return (sizeof(T) == 4 ? 5124 : sizeof(T) == 2 ? 5122 : 5120) + int(std::is_unsigned_v<T>);
    }

    /// @return the number of the view.
    size_t addView(const Bytes& content)
    {
        while (bytes.size() % 4 != 0)
            bytes.push_back(0);
        file["bufferViews"].push_back(
            {{"buffer", 0}, {"byteOffset", bytes.size()}, {"byteLength", content.size()}});
        bytes.insert(bytes.end(), content.begin(), content.end());
        return file["bufferViews"].size() - 1;
    }

    /// @return the number of the accessor.
    template <class T>
    size_t add(const std::vector<T>& values, const char* type, bool normalized = false)
    {
        const size_t view = addView(toBytes(values));
        return addAccessor<T>(view, values.size() / getSize(type), type, normalized);
    }

    template <class T>
    size_t addAccessor(size_t view, size_t count, const char* type, bool normalized = false)
    {
        json accessor = {
            {"bufferView", view}, {"componentType", getCode<T>()}, {"count", count}, {"type", type}};
        if (normalized)
            accessor["normalized"] = true;
        file["accessors"].push_back(accessor);
        return file["accessors"].size() - 1;
    }

    json& primitive() { return file["meshes"][0]["primitives"][0]; }
    void setAttribute(const char* name, size_t accessor) { primitive()["attributes"][name] = accessor; }

    /// As a GLB.
    Bytes write()
    {
        while (bytes.size() % 4 != 0)
            bytes.push_back(0);
        file["buffers"][0]["byteLength"] = bytes.size();
        std::string text = file.dump();
        text.resize((text.size() + 3) / 4 * 4, ' ');
        const uint32_t head[] = {0x46546c67, 2, uint32_t(28 + text.size() + bytes.size()),
                                 uint32_t(text.size()), 0x4e4f534a};
        const uint32_t middle[] = {uint32_t(bytes.size()), 0x004e4942};
        Bytes made(sizeof head + text.size() + sizeof middle + bytes.size());
        std::memcpy(made.data(), head, sizeof head);
        std::memcpy(made.data() + sizeof head, text.data(), text.size());
        std::memcpy(made.data() + sizeof head + text.size(), middle, sizeof middle);
        std::copy(bytes.begin(), bytes.end(), made.end() - std::ptrdiff_t(bytes.size()));
        return made;
    }

    json file;
    Bytes bytes; ///< of the buffer

private:
    static size_t getSize(const std::string& type)
    {
        return type == "SCALAR" ? 1 : type == "VEC2" ? 2 : type == "VEC3" ? 3 : type == "MAT4" ? 16 : 4;
    }
};
