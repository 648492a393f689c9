#pragma once

#include "outputfiles.h"

#include <string>
#include <vector>

namespace convert
{

/// The viewer for web browsers, to be written beside a scene so that any web server shows it.
class Page
{
public:
    /// Looks for its files: where the tools are installed, or where a build puts them.
    /// @return false, with the reason in error, if they are not all there.
    bool load(std::string& error);

    /// Adds the page that shows a scene to what is to be written; what makes a page of a folder comes last.
    /// @param files  those of the scene, in the folder of the page, the scene last; at least that one.
    void addTo(std::vector<OutputFile>& files) const;

private:
    std::vector<OutputFile> m_parts; ///< named without a folder
};

} // namespace convert
