#include "shaderprogramfile.h"

#include "orv/detail/textstatement.h"

#include "orv/log.h"
#include "orv/tokenreader.h"

#include <algorithm>

namespace orv::detail
{

namespace
{

std::string toString(const CharRange& token)
{
    return std::string(token.start, token.end);
}

} // namespace

bool ShaderProgramFile::read(CharRange text, const char* name)
{
    if (text.empty())
    {
        ORV_LOG_ERROR("ShaderProgram file: %s empty", name);
        return false;
    }
    if (const char* problem = readFormatVersion(text))
    {
        ORV_LOG_ERROR("ShaderProgram file: %s %s", name, problem);
        return false;
    }

    Statement statement;
    while (readStatement(text, statement))
    {
        const std::string word = toString(statement.tag);
        if (word == "vertex_source_file")
        {
            vertexSource = toString(readToken(text));
        }
        else if (word == "fragment_source_file")
        {
            fragmentSource = toString(readToken(text));
        }
        else if (word == "uniform")
        {
            readUniform(text, statement.lineEnd, name);
        }
        else
        {
            ORV_LOG_ERROR("ShaderProgram file: %s unexpected tag %s", name, word.c_str());
            return false;
        }
        eatWhite(text);
    }

    if (vertexSource.empty())
        ORV_LOG_ERROR("ShaderProgram file: %s missing vertex source", name);
    else if (fragmentSource.empty())
        ORV_LOG_ERROR("ShaderProgram file: %s missing fragment source", name);
    return !vertexSource.empty() && !fragmentSource.empty();
}

void ShaderProgramFile::readUniform(CharRange& text, char* lineEnd, const char* name)
{
    // Both names must be on the tag's line; otherwise the next line's word would replace a missing one.
    CharRange line{text.start, std::max(text.start, lineEnd)};
    const std::string uniform = toString(readToken(line));
    const std::string property = toString(readToken(line));
    text.start = line.start;
    if (uniform.empty() || property.empty())
        ORV_LOG_ERROR("ShaderProgram file: %s uniform declaration incomplete", name);
    else
        properties[uniform] = property;
}

} // namespace orv::detail
