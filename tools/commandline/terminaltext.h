#pragma once

#include <string>

namespace commandline
{

/// Makes text from files safe for terminals and readers of lines: each byte of a control character, of one that turns the
/// direction of writing, and of invalid UTF-8 becomes "\x1b".
std::string toTerminalText(const std::string& text);

} // namespace commandline
