#include "buffers.h"

#include "convert/files/datauri.h"
#include "meshopt.h"

namespace convert::gltf
{

namespace
{

/// A buffer view's compression, which has two names; an empty object if it is not compressed.
Object getCompression(const Object& view)
{
    const Object first = view.extension("EXT_meshopt_compression");
    return first ? first : view.extension("KHR_meshopt_compression");
}

} // namespace

Buffers::Buffers(const Document& document, FileOpener open) : m_document(document), m_open(std::move(open)) {}

Span Buffers::view(size_t index, const Object& user)
{
    const Object view = m_document.get("bufferViews", index, user);
    const Object compression = getCompression(view);
    return compression ? decompressed(index, compression) : part(view, 0);
}

size_t Buffers::stride(size_t index, const Object& user) const
{
    return m_document.get("bufferViews", index, user).size("byteStride", 0);
}

/// @param user  with a buffer, an offset and a length.
Span Buffers::part(const Object& user, size_t defaultBuffer)
{
    const Span whole = buffer(user.size("buffer", defaultBuffer), user);
    const size_t offset = user.size("byteOffset", 0);
    const size_t length = user.size("byteLength", 0);
    if (offset > whole.size() || length > whole.size() - offset)
        user.fail("reaches beyond its buffer, which has " + std::to_string(whole.size()) + " bytes");
    return whole.subspan(offset, length);
}

Span Buffers::decompressed(size_t index, const Object& compression)
{
    const auto known = m_decompressed.find(index);
    if (known != m_decompressed.end())
        return known->second;
    return m_decompressed[index] = decompressMeshopt(compression, part(compression, 0));
}

Span Buffers::buffer(size_t index, const Object& user)
{
    const Object description = m_document.get("buffers", index, user);
    if (!description.has("uri") && index == 0 && !m_document.binaryChunk().empty())
        return m_document.binaryChunk();
    auto known = m_buffers.find(index);
    if (known == m_buffers.end())
    {
        known = m_buffers.emplace(index, load(description, index)).first;
        m_totalSize += known->second.size();
    }
    return known->second;
}

Bytes Buffers::load(const Object& description, size_t index)
{
    const std::string uri = description.text("uri");
    if (uri.empty())
        description.fail(index == 0 ? "is not there" : "has no uri");
    if (isDataUri(uri))
    {
        std::optional<Bytes> bytes = readDataUri(uri);
        return bytes ? std::move(*bytes) : (description.fail("uri", "is damaged"), Bytes());
    }
    Bytes bytes;
    if (!m_open(uri, bytes))
        description.fail("is file \"" + uri.substr(0, 200) + "\", which cannot be opened");
    return bytes;
}

} // namespace convert::gltf
