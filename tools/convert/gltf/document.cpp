#include "document.h"

#include <cmath>
#include <cstring>

namespace convert::gltf
{

using nlohmann::json;

namespace
{

constexpr size_t GLB_HEADER = 12;
constexpr size_t CHUNK_HEADER = 8;
constexpr uint32_t JSON_CHUNK = 0x4e4f534a;
constexpr uint32_t BINARY_CHUNK = 0x004e4942;
constexpr double LARGEST = 9007199254740992.0; // integer that a double holds exactly

uint32_t readWord(const Bytes& bytes, size_t at)
{
    uint32_t word = 0;
    for (size_t i = 0; i < 4 && at + i < bytes.size(); ++i)
        word |= uint32_t(bytes[at + i]) << (8 * i);
    return word;
}

bool isBinary(const Bytes& file)
{
    return file.size() >= GLB_HEADER && std::memcmp(file.data(), "glTF", 4) == 0;
}

std::optional<size_t> toIndex(const json& value)
{
    if (value.is_number_unsigned())
        return value.get<size_t>();
    if (!value.is_number())
        return std::nullopt;
    const double number = value.get<double>(); // some programs write 3.0
    if (!(number >= 0.0 && number <= LARGEST) || number != std::floor(number))
        return std::nullopt;
    return size_t(number);
}

std::string element(const std::string& array, size_t index)
{
    return array + "[" + std::to_string(index) + "]";
}

} // namespace

Object::Object(const json& value, std::string place) : m_value(&value), m_place(std::move(place))
{
    if (!value.is_object())
        fail("is not an object");
}

void Object::fail(const std::string& what) const
{
    throw Fault((m_place.empty() ? "the file" : m_place) + " " + what);
}

void Object::fail(const char* key, const std::string& what) const
{
    throw Fault((m_place.empty() ? "" : m_place + ".") + key + " " + what);
}

const json* Object::find(const char* key) const
{
    if (!m_value)
        return nullptr;
    const auto found = m_value->find(key);
    return found != m_value->end() && !found->is_null() ? &*found : nullptr;
}

const json* Object::findArray(const char* key) const
{
    const json* value = find(key);
    if (value && !value->is_array())
        fail(key, "is not an array");
    return value;
}

std::vector<std::string> Object::keys() const
{
    std::vector<std::string> names;
    if (m_value)
    {
        for (const auto& item : m_value->items())
            names.push_back(item.key());
    }
    return names;
}

Object Object::object(const char* key) const
{
    const json* value = find(key);
    return value ? Object(*value, m_place.empty() ? key : m_place + "." + key) : Object();
}

size_t Object::length(const char* key) const
{
    const json* array = findArray(key);
    return array ? array->size() : 0;
}

Object Object::at(const char* key, size_t index) const
{
    const json* array = findArray(key);
    if (!array || index >= array->size())
        fail(key, "has no element " + std::to_string(index));
    return {(*array)[index], element(m_place.empty() ? key : m_place + "." + key, index)};
}

std::optional<size_t> Object::index(const char* key) const
{
    const json* value = find(key);
    if (!value)
        return std::nullopt;
    const std::optional<size_t> made = toIndex(*value);
    if (!made)
        fail(key, "is not a whole number of 0 or more");
    return made;
}

size_t Object::size(const char* key, size_t fallback) const
{
    return index(key).value_or(fallback);
}

double Object::number(const char* key, double fallback) const
{
    const json* value = find(key);
    if (!value)
        return fallback;
    if (!value->is_number())
        fail(key, "is not a number");
    if (!std::isfinite(value->get<float>()))
        fail(key, "is too large");
    return value->get<double>();
}

bool Object::flag(const char* key) const
{
    const json* value = find(key);
    if (value && !value->is_boolean())
        fail(key, "is neither true nor false");
    return value && value->get<bool>();
}

std::string Object::text(const char* key) const
{
    const json* value = find(key);
    if (!value)
        return {};
    if (!value->is_string())
        fail(key, "is not a text");
    return value->get<std::string>();
}

std::vector<float> Object::numbers(const char* key) const
{
    std::vector<float> made;
    const json* array = findArray(key);
    for (size_t i = 0; array && i < array->size(); ++i)
    {
        if (!(*array)[i].is_number())
            fail(element(key, i).c_str(), "is not a number");
        made.push_back((*array)[i].get<float>());
        if (!std::isfinite(made.back()))
            fail(element(key, i).c_str(), "is too large");
    }
    return made;
}

std::string Object::word(const char* key) const
{
    const json* value = find(key);
    return value && value->is_number() ? value->dump() : text(key);
}

bool Object::numbers(const char* key, std::span<float> values) const
{
    const std::vector<float> made = numbers(key);
    if (!has(key))
        return false;
    if (made.size() != values.size())
        fail(key,
             "has " + std::to_string(made.size()) + " numbers instead of " + std::to_string(values.size()));
    std::copy(made.begin(), made.end(), values.begin());
    return true;
}

std::vector<size_t> Object::indices(const char* key) const
{
    std::vector<size_t> made;
    const json* array = findArray(key);
    for (size_t i = 0; array && i < array->size(); ++i)
    {
        const std::optional<size_t> number = toIndex((*array)[i]);
        if (!number)
            fail(element(key, i).c_str(), "is not a whole number of 0 or more");
        made.push_back(*number);
    }
    return made;
}

std::vector<std::string> Object::texts(const char* key) const
{
    std::vector<std::string> made;
    const json* array = findArray(key);
    for (size_t i = 0; array && i < array->size(); ++i)
    {
        if (!(*array)[i].is_string())
            fail(element(key, i).c_str(), "is not a text");
        made.push_back((*array)[i].get<std::string>());
    }
    return made;
}

Document::Document(Bytes file) : m_file(std::move(file))
{
    const Span text = isBinary(m_file) ? splitBinary() : Span(m_file);
    try
    {
        m_json = json::parse(text.begin(), text.end());
    }
    catch (const json::parse_error& error)
    {
        throw Fault("is not JSON from byte " + std::to_string(error.byte) + " on");
    }
    catch (const json::out_of_range&)
    {
        throw Fault("has a number that is too large");
    }
    root(); // fails unless it is an object
}

/// @return the JSON.
Span Document::splitBinary()
{
    const uint32_t version = readWord(m_file, 4);
    if (version != 2)
        throw Fault("is a GLB of version " + std::to_string(version) + ", which is not read");
    Span text;
    size_t at = GLB_HEADER;
    const size_t end = m_file.size();
    for (int chunk = 0; end - at >= CHUNK_HEADER; ++chunk)
    {
        const size_t size = readWord(m_file, at);
        const uint32_t type = readWord(m_file, at + 4);
        at += CHUNK_HEADER;
        if (size > end - at)
            throw Fault("is cut short: a chunk of " + std::to_string(size) + " bytes has " +
                        std::to_string(end - at));
        if (chunk == 0 && type == JSON_CHUNK)
            text = Span(m_file).subspan(at, size);
        else if (type == BINARY_CHUNK && m_binary.empty())
            m_binary = Span(m_file).subspan(at, size);
        at += std::min((size + 3) / 4 * 4, end - at);
    }
    if (text.empty())
        throw Fault("does not begin with its JSON, as a GLB has to");
    return text;
}

Object Document::get(const char* array, size_t index, const Object& user) const
{
    if (index >= root().length(array))
        user.fail("asks for " + element(array, index) + ", which is not there");
    return root().at(array, index);
}

Object Document::find(const char* array, const Object& user, const char* key) const
{
    const std::optional<size_t> index = user.index(key);
    return index ? get(array, *index, user) : Object();
}

} // namespace convert::gltf
