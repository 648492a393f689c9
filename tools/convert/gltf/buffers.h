#pragma once

#include "document.h"

#include <functional>
#include <map>

namespace convert::gltf
{

/// Reads a file by its uri in the model.
/// @return false if it cannot be read.
using FileOpener = std::function<bool(const std::string& uri, Bytes& bytes)>;

/// The bytes of a file's buffers and buffer views, read at the first access. Throws a Fault for missing, truncated or
/// out-of-range data.
class Buffers
{
public:
    /// @param document  outlives this.
    Buffers(const Document& document, FileOpener open);

    /// The bytes of a buffer view, decompressed; valid as long as this object.
    Span view(size_t index, const Object& user);
    /// Bytes from one element to the next in a view; 0 where they lie without gaps.
    size_t stride(size_t index, const Object& user) const;

    /// Of all buffers that have been read.
    size_t totalSize() const { return m_totalSize; }

private:
    Span buffer(size_t index, const Object& user);
    Bytes load(const Object& description, size_t index);
    Span decompressed(size_t index, const Object& compression);
    Span part(const Object& user, size_t defaultBuffer);

    const Document& m_document;
    FileOpener m_open;
    std::map<size_t, Bytes> m_buffers;
    std::map<size_t, Bytes> m_decompressed; ///< by view
    size_t m_totalSize = 0;
};

} // namespace convert::gltf
