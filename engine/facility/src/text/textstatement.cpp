#include "orv/detail/textstatement.h"

#include "orv/tokenreader.h"

#include <algorithm>

namespace orv::detail
{

namespace
{

bool isComment(const CharRange& text)
{
    return text.end - text.start >= 2 && text.start[0] == '/' && text.start[1] == '/';
}

} // namespace

const char* readFormatVersion(CharRange& text)
{
    if (readInt(text, -1) != 1)
        return "wrong version";
    if (!requireChar(text, '.'))
        return "expected '.'";
    if (readInt(text, -1) != 0)
        return "wrong version";
    return nullptr;
}

bool readStatement(CharRange& text, Statement& statement)
{
    while (!text.empty())
    {
        eatWhite(text);
        // Checked before the token is read: readToken() would consume the line feed after a one-word comment, and the
        // next line would be read as a part of it.
        if (!isComment(text))
        {
            // Kept for all statements of a line; otherwise a long line would be searched for each statement.
            if (!statement.lineEnd || statement.lineEnd < text.start)
                statement.lineEnd = std::find(text.start, text.end, '\n');
            statement.tag = readToken(text);
            if (!isComment(statement.tag)) // may still be one, in quotes
                return true;
        }
        readTo(text, '\n');
        eatWhite(text);
    }
    return false;
}

} // namespace orv::detail
