#include "manual.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <cctype>
#include <sstream>
#include <vector>

namespace commandline
{

namespace
{

using Options = std::vector<const CLI::Option*>;

/// Those that --help lists.
Options getOptions(const CLI::App& app, bool positional)
{
    return app.get_options([&](const CLI::Option* option)
                           { return option->nonpositional() != positional && !option->get_group().empty(); });
}

std::string replaceAll(std::string text, const std::string& from, const std::string& to)
{
    for (size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size()))
        text.replace(at, from.size(), to);
    return text;
}

std::string toUpper(std::string text)
{
    std::transform(text.begin(), text.end(), text.begin(), [](unsigned char c) { return std::toupper(c); });
    return text;
}

/// "-h" and "--help", in that order.
std::vector<std::string> getNames(const CLI::Option& option)
{
    std::vector<std::string> names;
    for (const std::string& name : option.get_snames())
        names.push_back("-" + name);
    for (const std::string& name : option.get_lnames())
        names.push_back("--" + name);
    return names;
}

/// The option's argument as --help shows it, limits included; empty for a flag.
std::string getType(const CLI::Option& option)
{
    if (option.get_type_size() == 0)
        return "";
    return option.get_option_text().empty() ? option.get_type_name() : option.get_option_text();
}

/// The words that an option accepts, if it accepts only words: of "TEXT:{stepped,sparse}" the two.
std::vector<std::string> getChoices(const CLI::Option& option)
{
    std::vector<std::string> choices;
    const std::string type = getType(option);
    const size_t begin = type.find('{');
    const size_t end = type.find('}');
    if (begin == std::string::npos || end == std::string::npos)
        return choices;
    std::istringstream list(type.substr(begin + 1, end - begin - 1));
    for (std::string word; std::getline(list, word, ',');)
        choices.push_back(word);
    return choices;
}

enum class Value
{
    NONE,
    CHOICE,
    FOLDER,
    FILE,
    OTHER
};

Value getValue(const CLI::Option& option)
{
    const std::string type = getType(option);
    if (type.empty())
        return Value::NONE;
    if (!getChoices(option).empty())
        return Value::CHOICE;
    if (type == "DIR")
        return Value::FOLDER;
    const bool isFile = type == "FILE" || type.find('.') != std::string::npos;
    return isFile && type.find(" in ") == std::string::npos ? Value::FILE : Value::OTHER;
}

std::string join(const std::vector<std::string>& words, const char* between)
{
    std::string text;
    for (const std::string& word : words)
        text += (text.empty() ? "" : between) + word;
    return text;
}

/// Escapes text for roff.
std::string escape(const std::string& text)
{
    const std::string plain = replaceAll(replaceAll(text, "\\", "\\e"), "-", "\\-");
    std::istringstream lines(plain);
    std::string escaped;
    for (std::string line; std::getline(lines, line);)
        escaped += (!line.empty() && (line[0] == '.' || line[0] == '\'') ? "\\&" : "") + line + "\n";
    return escaped;
}

/// The same for words within a line.
std::string escapeWords(const std::string& words)
{
    std::string escaped = escape(words);
    if (!escaped.empty())
        escaped.pop_back();
    return escaped;
}

std::string makeEntry(const CLI::Option& option)
{
    const bool isPositional = !option.nonpositional();
    std::string entry =
        ".TP\n\\fB" + escapeWords(isPositional ? option.get_name() : join(getNames(option), ", "));
    entry += "\\fR";
    if (!isPositional && !getType(option).empty())
        entry += " " + escapeWords(getType(option));
    if (!option.get_default_str().empty())
        entry += " (" + escapeWords(option.get_default_str()) + ")";
    return entry + "\n" + escape(option.get_description());
}

/// The text below the options. A line such as "Examples:" begins a section, of which the indented lines after it are kept
/// as they are.
std::string makeFooter(const std::string& footer)
{
    enum class Section
    {
        NONE,
        FILLED,
        KEPT
    } section = Section::NONE;
    std::istringstream lines(footer);
    std::string text;
    bool isNewParagraph = false;
    for (std::string line; std::getline(lines, line);)
    {
        const bool isTitle = line.size() > 1 && line.back() == ':' && line[0] != ' ';
        if (section == Section::KEPT && !line.empty() && line[0] != ' ')
        {
            text += ".fi\n";
            section = Section::NONE;
        }
        if (isTitle)
            text += ".SH " + toUpper(line.substr(0, line.size() - 1)) + "\n.nf\n";
        else if (section == Section::NONE && !line.empty())
            text += ".SH NOTES\n";
        else if (isNewParagraph && section == Section::FILLED && !line.empty())
            text += ".PP\n";
        if (isTitle)
            section = Section::KEPT;
        else if (section == Section::NONE && !line.empty())
            section = Section::FILLED;
        if (!isTitle && (section == Section::KEPT || !line.empty()))
            text += line.empty() ? "\n" : escape(line);
        isNewParagraph = line.empty();
    }
    return text + (section == Section::KEPT ? ".fi\n" : "");
}

std::string makeFunctionName(const CLI::App& app)
{
    return "_" + replaceAll(app.get_name(), "-", "_");
}

std::string makeBash(const CLI::App& app)
{
    std::string cases;
    std::vector<std::string> all;
    for (const CLI::Option* option : getOptions(app, false))
    {
        const std::vector<std::string> names = getNames(*option);
        all.insert(all.end(), names.begin(), names.end());
        const std::string begin = "        " + join(names, "|") + ") ";
        switch (getValue(*option))
        {
        case Value::CHOICE:
            cases += begin + "COMPREPLY=($(compgen -W '" + join(getChoices(*option), " ") +
                     "' -- \"$word\")); return ;;\n";
            break;
        case Value::FOLDER: cases += begin + "COMPREPLY=($(compgen -d -- \"$word\")); return ;;\n"; break;
        case Value::FILE:
            cases += begin + "return ;;\n"; // -o default completes files
            break;
        case Value::OTHER: cases += begin + "compopt +o default; return ;;\n"; break;
        case Value::NONE: break;
        }
    }
    const std::string function = makeFunctionName(app);
    return function +
           "()\n{\n    local word=${COMP_WORDS[COMP_CWORD]} before=${COMP_WORDS[COMP_CWORD - 1]}\n    "
           "COMPREPLY=()\n"
           "    case $before in\n" +
           cases +
           "    esac\n"
           "    [[ $word != -* ]] || COMPREPLY=($(compgen -W '" +
           join(all, " ") +
           "' -- \"$word\"))\n}\n"
           "complete -o default -F " +
           function + " " + app.get_name() + "\n";
}

/// Within single quotes.
std::string quote(const std::string& text)
{
    return "'" + replaceAll(text, "'", "'\\''") + "'";
}

std::string makeZsh(const CLI::App& app)
{
    std::string text = "#compdef " + app.get_name() + "\n_arguments";
    for (const CLI::Option* option : getOptions(app, false))
    {
        std::string what = replaceAll(replaceAll(option->get_description(), "\\", "\\\\"), "[", "\\[");
        what = "[" + replaceAll(replaceAll(what, "]", "\\]"), ":", "\\:") + "]";
        const Value value = getValue(*option);
        if (value == Value::CHOICE)
            what += ":value:(" + join(getChoices(*option), " ") + ")";
        else if (value != Value::NONE)
            what += value == Value::FOLDER ? ":folder:_files -/"
                    : value == Value::FILE ? ":file:_files"
                                           : ":value: ";
        for (const std::string& name : getNames(*option))
            text += " \\\n    " + quote("*" + name + what); // * allows repetition
    }
    return text + " \\\n    '*:file:_files'\n";
}

std::string makeFish(const CLI::App& app)
{
    std::string text;
    for (const CLI::Option* option : getOptions(app, false))
    {
        text += "complete -c " + app.get_name();
        for (const std::string& name : option->get_snames())
            text += " -s " + name;
        for (const std::string& name : option->get_lnames())
            text += " -l " + name;
        const Value value = getValue(*option);
        if (value == Value::CHOICE)
            text += " -x -a " + quote(join(getChoices(*option), " "));
        else if (value == Value::FOLDER)
            text += " -x -a '(__fish_complete_directories)'";
        else if (value != Value::NONE)
            text += value == Value::FILE ? " -r" : " -x";
        text += " -d " + replaceAll(quote(option->get_description()), "'\\''", "\\'") + "\n";
    }
    return text;
}

} // namespace

std::string makeManual(const CLI::App& app, const std::string& version)
{
    std::string upper = app.get_name();
    std::transform(upper.begin(), upper.end(), upper.begin(),
                   [](unsigned char c) { return std::toupper(c); });
    std::string text =
        ".TH \"" + escapeWords(toUpper(app.get_name())) + "\" 1 \"\" \"orv " + version + "\"\n";
    text += ".SH NAME\n" + escape(app.get_name() + " - " + app.get_description());
    text += ".SH SYNOPSIS\n\\fB" + escapeWords(app.get_name()) + "\\fR [\\fIOPTIONS\\fR]";
    const Options positionals = getOptions(app, true);
    for (const CLI::Option* option : positionals)
    {
        const std::string name = "\\fI" + option->get_name() + "\\fR";
        const std::string many = option->get_items_expected_max() > 1 ? "..." : "";
        text += option->get_required() ? " " + name + many : " [" + name + many + "]";
    }
    text += "\n.SH OPTIONS\n";
    for (const CLI::Option* option : positionals)
        text += makeEntry(*option);
    for (const CLI::Option* option : getOptions(app, false))
        text += makeEntry(*option);
    return text + makeFooter(app.get_footer());
}

std::string makeCompletion(const CLI::App& app, const std::string& shell)
{
    const std::string first = "# What " + app.get_name() + " --help says.\n";
    if (shell == "bash")
        return first + makeBash(app);
    if (shell == "zsh")
        return makeZsh(app); // zsh reads the first line
    return shell == "fish" ? first + makeFish(app) : "";
}

} // namespace commandline
