#pragma once

#include "orv/charrange.h"

namespace orv::detail
{

/// Reads the "1.0" that appearance files and shader program files begin with.
/// @return null, or what is wrong in the words that both readers log.
const char* readFormatVersion(CharRange& text);

struct Statement
{
    CharRange tag;           ///< the word that it begins with
    char* lineEnd = nullptr; ///< of the line on which it begins: the line feed, or the end of the text
};

/// Reads the beginning of the next statement, skipping comments: "//" where a statement could begin, to the end of
/// that line. The code that reads the statement's arguments skips the white space after them.
/// @param statement  the one before it, to begin with an empty one.
/// @return false at the end of the text. White space alone is no end: it yields one statement with an empty tag.
bool readStatement(CharRange& text, Statement& statement);

} // namespace orv::detail
