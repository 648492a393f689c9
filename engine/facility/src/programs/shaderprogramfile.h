#pragma once

#include "orv/charrange.h"

#include <functional>
#include <map>
#include <string>

namespace orv::detail
{

/// The contents of a ".sp" file.
struct ShaderProgramFile
{
    std::string vertexSource; ///< asset name
    std::string fragmentSource;
    std::map<std::string, std::string, std::less<>> properties; ///< property name by GLSL uniform name

    /// @param text  the whole file; modified in place.
    /// @param name  the file's name, for messages.
    /// @return false, after logging why, if the text is not valid.
    bool read(CharRange text, const char* name);

private:
    void readUniform(CharRange& text, char* lineEnd, const char* name);
};

} // namespace orv::detail
