#pragma once

#include "outputfiles.h"

#include <string>
#include <vector>

namespace convert
{

/// The viewer for web browsers, to be written beside a scene.
class Page
{
public:
    /// Loads its files from where the tools are installed or built.
    /// @return false, with the reason in error, if a file is missing.
    bool load(std::string& error);

    /// Adds the page of a scene to the files to be written, index.html last.
    /// @param files  those of the scene, in the folder of the page, the scene last; at least that one.
    void addTo(std::vector<OutputFile>& files) const;

private:
    std::vector<OutputFile> m_parts; ///< named without a folder
};

} // namespace convert
