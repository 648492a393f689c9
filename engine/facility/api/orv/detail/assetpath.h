#pragma once

#include "orv/export.h"
#include "orv/sharedptr.h"
#include "orv/streamsource.h"

#include <string>
#include <vector>

namespace orv
{

class Stream;

namespace detail
{

/// Turns the deprecated namespace forms "orv:" and "luvane:" at the start of a name into "orv#" and "luvane#",
/// logging a warning; any other name comes back unchanged, and null as an empty text.
ORV_API std::string normalizeAssetName(const char* name);

/// An ordered list of stream sources in which names are looked up, first to last.
///
/// An empty source may be in the list: each search that passes it logs the null pointer and goes on to the next.
/// A source may add sources while it is asked: they come last in that very search. One that removes sources makes the
/// search pass over one of those behind.
class ORV_API AssetPath : public Shared
{
public:
    ORV_CLASS_NAME("AssetPath")

    AssetPath() = default;
    ~AssetPath() override;

    /// @param path  as for StreamSource::get(). @return false if there is no such kind of source.
    bool add(const char* path, bool archive);
    bool add(const SharedPtr<StreamSource>& source); ///< Always true, for an empty source as well.

    /// Removes the first source of this name. @return false if there is none.
    bool remove(const char* name);

    /// Opens the name, which is taken exactly as given, in the first source that has it.
    /// @return empty if no source has it, or if that first source then fails to open it.
    SharedPtr<Stream> find(const char* name) const;

    /// The names of the sources in order, with ", " between them, for messages.
    std::string describe() const;

    /// To be called after a message about a file that may not have been found: where no source has it, logs a warning that
    /// says where it was looked for, once in a load.
    ORV_LOCAL void explainMissing(const char* name) const;

    /// Stored for the application; the engine does not use it.
    void setCacheDirectory(const char* directory);
    const char* getCacheDirectory() const { return m_cacheDirectory.c_str(); }

private:
    std::vector<SharedPtr<StreamSource>> m_sources;
    std::string m_cacheDirectory;
};

} // namespace detail
} // namespace orv
