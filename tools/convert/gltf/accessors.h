#pragma once

#include "buffers.h"

namespace convert::gltf
{

/// Types of numbers in a buffer, by GL's names.
enum class Component
{
    INT8 = 5120,
    UINT8 = 5121,
    INT16 = 5122,
    UINT16 = 5123,
    UINT32 = 5125,
    FLOAT = 5126
};

/// Numbers, element by element.
struct Column
{
    unsigned components = 0; ///< of an element
    std::vector<float> values;

    size_t count() const { return components > 0 ? values.size() / components : 0; }
    const float* operator[](size_t element) const { return values.data() + element * components; }
};

/// How to decode bytes.
struct Decoding
{
    Component component = Component::FLOAT;
    bool normalized = false; ///< integers stand for 0 to 1, signed ones for -1 to 1
};

/// @param bytes  of elements that lie stride bytes apart.
/// @param target  count x components.
void decode(const uint8_t* bytes, size_t stride, size_t count, unsigned components, const Decoding& decoding,
            float* target);

/// Reads the numbers that a file's accessors describe. Throws a Fault for what does not fit into the buffers.
class Accessors
{
public:
    /// Both outlive this.
    Accessors(const Document& document, Buffers& buffers) : m_document(document), m_buffers(buffers) {}

    /// @param user  the object that names the accessor.
    /// @return the number of elements, all of which are in the file.
    size_t count(size_t index, const Object& user);
    Decoding decoding(size_t index, const Object& user) const;

    /// All elements, or those of the given indices, which have to be below count.
    /// @param components  wanted; 0 for as many as there are.
    Column read(size_t index, const Object& user, unsigned components = 0,
                const std::vector<uint32_t>* elements = nullptr);
    /// Single integers.
    std::vector<uint32_t> readIndices(size_t index, const Object& user);

private:
    struct Layout;

    Layout getLayout(const Object& accessor) const;
    Span locate(const Object& accessor, const Layout& layout);
    Column readAll(const Object& accessor, const Layout& layout);
    void applySparse(const Object& accessor, const Layout& layout, Column& column);
    std::vector<uint32_t> readSparseIndices(const Object& indices, size_t count);

    const Document& m_document;
    Buffers& m_buffers;
};

} // namespace convert::gltf
