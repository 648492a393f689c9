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

/// What is wrong with a file, with the name of the field.
class Fault : public std::runtime_error
{
    using std::runtime_error::runtime_error;
};

/// An object of a file's JSON, which knows where it stands, such as "meshes[3].primitives[0]".
///
/// What a getter does not find is the fallback; what is there and of another type is a Fault. Belongs to a Document.
class Object
{
public:
    Object() = default; ///< one that has nothing
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
    size_t size(const char* key, size_t fallback) const; ///< a whole number, 0 or more
    double number(const char* key, double fallback) const;
    bool flag(const char* key) const;
    std::string text(const char* key) const;
    std::string word(const char* key) const; ///< a text, or a number as if it were one: "2.0" or 2.0

    /// @return false if there are none; values are as they were then.
    bool numbers(const char* key, std::span<float> values) const;
    std::vector<float> numbers(const char* key) const;
    std::vector<size_t> indices(const char* key) const;
    std::vector<std::string> texts(const char* key) const;

    [[noreturn]] void fail(const std::string& what) const; ///< throws a Fault that names the place
    [[noreturn]] void fail(const char* key, const std::string& what) const;

private:
    const nlohmann::json* find(const char* key) const;
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

    /// An object that another one names by its number.
    /// @param array  such as "accessors".
    /// @param user   for the Fault if there is none.
    Object get(const char* array, size_t index, const Object& user) const;

    /// @return the object that user's field names; one that has nothing if there is no such field.
    Object find(const char* array, const Object& user, const char* key) const;

    size_t fileSize() const { return m_file.size(); }

private:
    Span splitBinary();

    Bytes m_file;
    nlohmann::json m_json;
    Span m_binary;
};

} // namespace convert::gltf
