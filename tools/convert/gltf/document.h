#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <stdexcept>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

namespace convert::gltf
{

using Bytes = std::vector<uint8_t>;
using Span = std::span<const uint8_t>;

/// A fault of a file, with the name of the field.
class Fault : public std::runtime_error
{
    using std::runtime_error::runtime_error;
};

/// An object of a file's JSON, which knows its path, such as "meshes[3].primitives[0]".
///
/// Getters return the fallback for a missing value, and throw a Fault for a wrong type. Belongs to a Document.
class Object
{
public:
    Object() = default; ///< empty
    Object(const nlohmann::json& value, std::string place);

    explicit operator bool() const { return m_value != nullptr; }
    const std::string& place() const { return m_place; }

    bool has(const char* key) const { return find(key) != nullptr; }
    std::vector<std::string> keys() const;

    Object object(const char* key) const;
    Object extension(const char* name) const { return object("extensions").object(name); }

    size_t length(const char* key) const; ///< of an array
    Object at(const char* key, size_t index) const;

    std::optional<size_t> index(const char* key) const;
    size_t size(const char* key, size_t fallback) const; ///< an integer, 0 or more
    double number(const char* key, double fallback) const;
    bool flag(const char* key) const;
    std::string text(const char* key) const;
    std::string word(const char* key) const; ///< a string, or a number read as one: "2.0" or 2.0

    /// @return false if there are none; values are unchanged then.
    bool numbers(const char* key, std::span<float> values) const;
    std::vector<float> numbers(const char* key) const;
    std::vector<size_t> indices(const char* key) const;
    std::vector<std::string> texts(const char* key) const;

    [[noreturn]] void fail(const std::string& what) const; ///< throws a Fault that names the place
    [[noreturn]] void fail(const char* key, const std::string& what) const;

private:
    const nlohmann::json* find(const char* key) const; ///< nothing for null too, which some exporters write
    const nlohmann::json* findArray(const char* key) const;

    const nlohmann::json* m_value = nullptr;
    std::string m_place;
};

/// A glTF 2.0 file's JSON, and the binary chunk if it is a GLB.
class Document
{
public:
    /// Throws a Fault.
    explicit Document(Bytes file);

    Object root() const { return Object(m_json, ""); }
    Span binaryChunk() const { return m_binary; }

    /// An object to which another one refers by index.
    /// @param array  such as "accessors".
    /// @param user   named in the Fault if there is none.
    Object get(const char* array, size_t index, const Object& user) const;

    /// @return the object to which user's field refers; empty if there is no such field.
    Object find(const char* array, const Object& user, const char* key) const;

    size_t fileSize() const { return m_file.size(); }

private:
    Span splitBinary();

    Bytes m_file;
    nlohmann::json m_json;
    Span m_binary;
};

} // namespace convert::gltf
