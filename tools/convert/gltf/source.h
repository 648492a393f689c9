#pragma once

#include "accessors.h"

#include "convert/options.h"
#include "convert/report.h"

#include <memory>

namespace convert::gltf
{

/// A file that is being read, shared by the readers of its parts.
struct Source
{
    Source(std::unique_ptr<Document> file, FileOpener open, const Options& choices, Report& findings)
        : owned(std::move(file))
        , document(*owned)
        , buffers(document, std::move(open))
        , accessors(document, buffers)
        , options(choices)
        , report(findings)
    {
    }

    const std::unique_ptr<Document> owned;
    const Document& document;
    Buffers buffers;
    Accessors accessors;
    const Options& options;
    Report& report;
};

/// An object's name, or else its path, such as "meshes[3]"; cut to the length of libassimp's strings and at a NUL.
inline std::string getName(const Object& object)
{
    constexpr size_t LONGEST = 1000;
    const std::string name = object.text("name");
    const std::string kept = name.substr(0, std::min(name.find('\0'), LONGEST));
    return kept.empty() ? object.place() : kept;
}

} // namespace convert::gltf
