#pragma once

#include "orv/assetloader.h"
#include "orv/export.h"
#include "orv/shaderprogram.h"

namespace orv
{

/// Reads shader programs from ".sp" files: a text that names a vertex and a fragment source file and says which
/// property feeds which uniform.
///
///     1.0
///     vertex_source_file ripple.vert
///     fragment_source_file ripple.frag
///     // a comment runs to the end of its line
///     uniform u_time TIME
///
/// A requested name may end in defines, "max_pvl.sp$DIFF$SPEC": the file is the part before the first "$", and
/// one "#define" line for each piece goes in front of both sources. A source can therefore hold no "#version".
///
/// Where the driver supports program binaries they are read from and kept in the cache source under the requested
/// name with a "c" appended: the digest of both final sources (16 bytes), a 32-bit version (1), the driver's
/// 32-bit format and the binary itself, integers little-endian. One that does not match the sources, or that the
/// driver refuses, is ignored and replaced.
class ORV_API ShaderProgramLoader : public AssetLoader<ShaderProgram>
{
public:
    /// Binary caching starts switched on where the driver supports it, and ORV_NO_PROGRAM_CACHE is not in the
    /// environment.
    ShaderProgramLoader();

    /// @param cache  a ShaderProgramCache, the only kind that makes programs.
    /// @return the program; "orv#error.sp" when the sources do not compile; null when the file is missing or
    /// wrong (which is logged, except for a missing ".sp" file).
    SharedPtr<ShaderProgram> load(AssetCache<ShaderProgram>& cache, const char* name) override;

    /// Whether the name ends in ".sp", whatever the case. Names with defines do not; they load all the same.
    bool isKnown(const char* name) override;

    /// Affects later loads. Switching it on is refused with an error where binaries are unsupported.
    void setBinaryCachingEnabled(bool enabled);
    bool getBinaryCachingEnabled() const { return m_binaryCaching; }

private:
    bool m_binaryCaching;
};

} // namespace orv
