#include "accessors.h"

#include <algorithm>
#include <cstring>
#include <limits>

namespace convert::gltf
{

/// The layout of an element's numbers.
struct Accessors::Layout
{
    size_t count;
    unsigned components;
    unsigned rows;       ///< numbers of a matrix's column; those of a column begin at a multiple of 4 bytes
    size_t elementSize;  ///< bytes, to the end of the last number
    size_t columnStride; ///< bytes; elementSize unless it is a matrix
    size_t stride;       ///< bytes
    Decoding decoding;
};

namespace
{

constexpr size_t MOST_ZEROS = 1 << 20; // elements without a buffer view, or one for each byte

template <class T>
void decodeAs(const uint8_t* bytes, size_t stride, size_t count, unsigned components, bool normalized,
              float* target)
{
    const float scale = normalized ? 1.0f / float(std::numeric_limits<T>::max()) : 1.0f;
    for (size_t i = 0; i < count; ++i)
    {
        for (unsigned c = 0; c < components; ++c)
        {
            T value;
            std::memcpy(&value, bytes + i * stride + c * sizeof(T), sizeof(T));
            *target++ = normalized ? std::max(float(value) * scale, -1.0f) : float(value);
        }
    }
}

template <class T>
void readWhole(const uint8_t* bytes, size_t stride, size_t count, std::vector<uint32_t>& target)
{
    for (size_t i = 0; i < count; ++i)
    {
        T value;
        std::memcpy(&value, bytes + i * stride, sizeof(T));
        target.push_back(value);
    }
}

size_t getSize(Component component)
{
    switch (component)
    {
    case Component::INT8:
    case Component::UINT8: return 1;
    case Component::INT16:
    case Component::UINT16: return 2;
    default: return 4;
    }
}

Component getComponent(const Object& object)
{
    const size_t code = object.size("componentType", 0);
    const bool isKnown = code >= 5120 && code <= 5126 && code != 5124;
    if (!isKnown)
        object.fail("componentType", "is " + std::to_string(code) + ", which is no kind of number");
    return Component(code);
}

/// @return the numbers of columns and rows; other types than matrices have one column.
std::pair<unsigned, unsigned> getShape(const Object& accessor)
{
    const struct
    {
        const char* name;
        unsigned columns, rows;
    } shapes[] = {{"SCALAR", 1, 1}, {"VEC2", 1, 2}, {"VEC3", 1, 3}, {"VEC4", 1, 4},
                  {"MAT2", 2, 2},   {"MAT3", 3, 3}, {"MAT4", 4, 4}};
    const std::string type = accessor.text("type");
    for (const auto& shape : shapes)
    {
        if (type == shape.name)
            return {shape.columns, shape.rows};
    }
    accessor.fail("type", "is \"" + type + "\", which is no accessor type");
}

/// The bytes that a number of elements take.
/// @return nothing if no file could hold that many.
std::optional<size_t> getExtent(size_t count, size_t stride, size_t elementSize)
{
    if (count == 0)
        return 0;
    if (count - 1 > (std::numeric_limits<size_t>::max() - elementSize) / stride)
        return std::nullopt;
    return (count - 1) * stride + elementSize;
}

} // namespace

void decode(const uint8_t* bytes, size_t stride, size_t count, unsigned components, const Decoding& decoding,
            float* target)
{
    const bool normalized = decoding.normalized;
    switch (decoding.component)
    {
    case Component::INT8: return decodeAs<int8_t>(bytes, stride, count, components, normalized, target);
    case Component::UINT8: return decodeAs<uint8_t>(bytes, stride, count, components, normalized, target);
    case Component::INT16: return decodeAs<int16_t>(bytes, stride, count, components, normalized, target);
    case Component::UINT16: return decodeAs<uint16_t>(bytes, stride, count, components, normalized, target);
    case Component::UINT32: return decodeAs<uint32_t>(bytes, stride, count, components, normalized, target);
    case Component::FLOAT: return decodeAs<float>(bytes, stride, count, components, false, target);
    }
}

size_t Accessors::count(size_t index, const Object& user)
{
    const Object accessor = m_document.get("accessors", index, user);
    const Layout layout = getLayout(accessor);
    locate(accessor, layout);
    return layout.count;
}

Decoding Accessors::decoding(size_t index, const Object& user) const
{
    const Object accessor = m_document.get("accessors", index, user);
    return {getComponent(accessor), accessor.flag("normalized")};
}

Accessors::Layout Accessors::getLayout(const Object& accessor) const
{
    Layout layout{};
    const auto [columns, rows] = getShape(accessor);
    layout.count = accessor.size("count", 0);
    layout.components = columns * rows;
    layout.rows = rows;
    layout.decoding = {getComponent(accessor), accessor.flag("normalized")};
    const size_t columnSize = rows * getSize(layout.decoding.component);
    layout.columnStride = columns > 1 ? (columnSize + 3) / 4 * 4 : columnSize;
    layout.elementSize = (columns - 1) * layout.columnStride + columnSize;
    const size_t packed = columns * layout.columnStride;
    const std::optional<size_t> view = accessor.index("bufferView");
    const size_t given = view ? m_buffers.stride(*view, accessor) : 0;
    layout.stride = given > 0 ? given : packed;
    if (layout.stride < layout.elementSize)
        accessor.fail("has elements that overlap, by the stride of its buffer view");
    return layout;
}

/// @return the bytes from the first element's on; none for an accessor of zeros.
Span Accessors::locate(const Object& accessor, const Layout& layout)
{
    const std::optional<size_t> view = accessor.index("bufferView");
    if (!view)
    {
        if (layout.count > std::max(MOST_ZEROS, m_document.fileSize() + m_buffers.totalSize()))
            accessor.fail("count", "is more than the file has bytes");
        return {};
    }
    const Span bytes = m_buffers.view(*view, accessor);
    const size_t offset = accessor.size("byteOffset", 0);
    const std::optional<size_t> extent = getExtent(layout.count, layout.stride, layout.elementSize);
    if (!extent || offset > bytes.size() || *extent > bytes.size() - offset)
        accessor.fail("has " + std::to_string(layout.count) +
                      " elements, which reach beyond its buffer view");
    return bytes.subspan(offset);
}

Column Accessors::readAll(const Object& accessor, const Layout& layout)
{
    const Span bytes = locate(accessor, layout);
    Column column{layout.components, {}};
    column.values.resize(layout.count * layout.components);
    if (!accessor.has("bufferView"))
        return column;
    if (layout.rows == layout.components)
    {
        decode(bytes.data(), layout.stride, layout.count, layout.components, layout.decoding,
               column.values.data());
        return column;
    }
    for (size_t i = 0; i < layout.count; ++i)
    {
        decode(bytes.data() + i * layout.stride, layout.columnStride, layout.components / layout.rows,
               layout.rows, layout.decoding, column.values.data() + i * layout.components);
    }
    return column;
}

void Accessors::applySparse(const Object& accessor, const Layout& layout, Column& column)
{
    const Object sparse = accessor.object("sparse");
    if (!sparse)
        return;
    const Object indices = sparse.object("indices");
    const Object values = sparse.object("values");
    Layout tight = layout;
    tight.count = sparse.size("count", 0);
    tight.stride = layout.components / layout.rows * layout.columnStride;
    if (!values.has("bufferView") || !indices.has("bufferView"))
        sparse.fail("has no values or no indices");
    const std::vector<uint32_t> places = readSparseIndices(indices, tight.count);
    // The object of the sparse values has an accessor's fields.
    const Span bytes = locate(values, tight);
    for (size_t i = 0; i < tight.count; ++i)
    {
        if (places[i] >= layout.count)
            indices.fail("name element " + std::to_string(places[i]) + ", which is not there");
        decode(bytes.data() + i * tight.stride, layout.columnStride, layout.components / layout.rows,
               layout.rows, layout.decoding, column.values.data() + size_t(places[i]) * layout.components);
    }
}

std::vector<uint32_t> Accessors::readSparseIndices(const Object& indices, size_t count)
{
    Layout layout{};
    layout.count = count;
    layout.decoding.component = getComponent(indices);
    layout.stride = layout.elementSize = getSize(layout.decoding.component);
    const Span bytes = locate(indices, layout);
    std::vector<uint32_t> places;
    switch (layout.decoding.component)
    {
    case Component::UINT8: readWhole<uint8_t>(bytes.data(), 1, count, places); break;
    case Component::UINT16: readWhole<uint16_t>(bytes.data(), 2, count, places); break;
    case Component::UINT32: readWhole<uint32_t>(bytes.data(), 4, count, places); break;
    default: indices.fail("componentType", "is not an index type");
    }
    return places;
}

Column Accessors::read(size_t index, const Object& user, unsigned components,
                       const std::vector<uint32_t>* elements)
{
    const Object accessor = m_document.get("accessors", index, user);
    const Layout layout = getLayout(accessor);
    if (components > 0 && layout.components != components)
        accessor.fail("has elements of " + std::to_string(layout.components) + " numbers instead of " +
                      std::to_string(components));
    const bool isPlain =
        !accessor.has("sparse") && accessor.has("bufferView") && layout.rows == layout.components;
    if (elements && isPlain)
    {
        const Span bytes = locate(accessor, layout);
        Column column{layout.components, {}};
        column.values.resize(elements->size() * layout.components);
        for (size_t i = 0; i < elements->size(); ++i)
            decode(bytes.data() + size_t((*elements)[i]) * layout.stride, 0, 1, layout.components,
                   layout.decoding, column.values.data() + i * layout.components);
        return column;
    }
    Column all = readAll(accessor, layout);
    applySparse(accessor, layout, all);
    if (!elements)
        return all;
    Column column{layout.components, {}};
    for (const uint32_t element : *elements)
        column.values.insert(column.values.end(), all[element], all[element] + layout.components);
    return column;
}

std::vector<uint32_t> Accessors::readIndices(size_t index, const Object& user)
{
    const Object accessor = m_document.get("accessors", index, user);
    const Layout layout = getLayout(accessor);
    if (layout.components != 1)
        accessor.fail("type", "is not SCALAR, which indices are");
    const Component component = layout.decoding.component;
    if (component != Component::UINT8 && component != Component::UINT16 && component != Component::UINT32)
        accessor.fail("componentType", "is not an index type");
    if (!accessor.has("bufferView") || accessor.has("sparse"))
    {
        const Column column = read(index, user, 1);
        return {column.values.begin(), column.values.end()};
    }
    const Span bytes = locate(accessor, layout);
    std::vector<uint32_t> made;
    made.reserve(layout.count);
    if (component == Component::UINT8)
        readWhole<uint8_t>(bytes.data(), layout.stride, layout.count, made);
    else if (component == Component::UINT16)
        readWhole<uint16_t>(bytes.data(), layout.stride, layout.count, made);
    else
        readWhole<uint32_t>(bytes.data(), layout.stride, layout.count, made);
    return made;
}

} // namespace convert::gltf
