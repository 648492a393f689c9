#include "textfiles.h"

#include "images.h"

#include "orv/detail/assetpath.h"
#include "orv/detail/textstatement.h"
#include "orv/filestreamsource.h"
#include "orv/filetostring.h"
#include "orv/memfilesource.h"
#include "orv/renderstate.h"
#include "orv/tokenreader.h"

#include <algorithm>
#include <cctype>
#include <map>
#include <regex>
#include <set>

namespace inspect
{

using orv::CharRange;

namespace
{

/// The arguments of a statement, one letter for each:
struct StatementKind
{
    const char* tag;
    const char* arguments;
};

/// f float, i integer, b truth, p program, 2 texture, c cube map; the capitals are the words of WORDS.
constexpr StatementKind STATEMENTS[] = {
    {"shader_program", "p"},   {"polygon_mode", "CWf"},      {"culling_mode", "C"},
    {"winding_order", "W"},    {"line_width", "f"},          {"depth_offset", "ff"},
    {"depth_test", "b"},       {"depth_function", "D"},      {"depth_write", "b"},
    {"colour_mask", "bbbb"},   {"blend_colour", "ffff"},     {"blend_factors", "BBBB"},
    {"blend_functions", "AA"}, {"stencil_function", "FDii"}, {"stencil_operations", "FSSS"},
    {"stencil_mask", "Fi"},    {"stencil_write_mask", "Fi"},
};

constexpr StatementKind PROPERTY_TYPES[] = {
    {"Texture2D", "2"}, {"TextureCube", "c"}, {"Colour4f", "ffff"}, {"Vector4f", "ffff"}, {"Vector3f", "fff"},
    {"Vector2f", "ff"}, {"float", "f"},       {"int", "i"},         {"bool", "b"},
};

template <size_t N>
const char* findArguments(const StatementKind (&kinds)[N], const std::string& tag)
{
    for (const StatementKind& kind : kinds)
    {
        if (tag == kind.tag)
            return kind.arguments;
    }
    return nullptr;
}

bool isWord(char kind, const std::string& word)
{
    switch (kind)
    {
    case 'C': return orv::findKeyword(orv::CULLING_MODES, word) >= 0;
    case 'W': return orv::findKeyword(orv::WINDING_ORDERS, word) >= 0;
    case 'B': return orv::findKeyword(orv::BLEND_FACTORS, word) >= 0;
    case 'A': return orv::findKeyword(orv::BLEND_FUNCTIONS, word) >= 0;
    case 'D': return orv::findKeyword(orv::COMPARISONS, word) >= 0;
    case 'F': return orv::findKeyword(orv::STENCIL_FACES, word) >= 0;
    default: return orv::findKeyword(orv::STENCIL_OPERATIONS, word) >= 0;
    }
}

/// Assets beside a file and those of the engine.
class Assets
{
public:
    explicit Assets(const std::filesystem::path& folder)
        : m_sources{orv::create_memfilesource_orv(), orv::create_memfilesource_luvane(),
                    orv::makeShared<orv::FileStreamSource>(folder.empty() ? "." : folder.c_str())}
    {
    }

    bool has(const std::string& name) const { return bool(open(name)); }

    std::string read(const std::string& name) const
    {
        const orv::SharedPtr<orv::Stream> stream = open(name);
        if (!stream)
            return "";
        const orv::FileToString text(*stream);
        return text.getStart() ? std::string(text.getStart(), text.getEnd()) : "";
    }

private:
    orv::SharedPtr<orv::Stream> open(const std::string& name) const
    {
        const std::string normalised =
            orv::detail::normalizeAssetName(name.substr(0, name.find('$')).c_str());
        for (const auto& source : m_sources)
        {
            if (source->exists(normalised.c_str()))
                return source->open(normalised.c_str(), false);
        }
        return {};
    }

    orv::SharedPtr<orv::StreamSource> m_sources[3];
};

/// The common part of both formats. Like the engine's reader, it modifies its text.
class TextChecker
{
public:
    TextChecker(const std::string& text, const std::filesystem::path& folder, Findings& findings)
        : m_assets(folder)
        , m_images(folder)
        , m_findings(findings)
        , m_buffer(text.begin(), text.end())
    {
        m_buffer.push_back('\0');
        m_text = {m_buffer.data(), m_buffer.data() + text.size()};
        for (size_t i = 0; i < text.size(); ++i)
        {
            if (text[i] == '\n')
                m_lineEnds.push_back(i);
        }
    }

    const TextFile& getFile() const { return m_file; }

protected:
    /// @return false if there is nothing to read.
    bool begin()
    {
        if (m_text.empty())
        {
            report(Kind::TEXT_EMPTY, 0, "the file is empty");
            return false;
        }
        if (const char* problem = orv::detail::readFormatVersion(m_text))
        {
            report(Kind::TEXT_VERSION, 0, "the file does not begin with 1.0: " + std::string(problem));
            return false;
        }
        return true;
    }

    bool next(std::string& tag)
    {
        if (!orv::detail::readStatement(m_text, m_statement))
            return false;
        tag.assign(m_statement.tag.start, m_statement.tag.end);
        m_file.statements.push_back({getLine(offset(m_statement.tag.start)), {tag}});
        return true;
    }

    std::string readWord() { return readWord(m_text); }

    std::string readWord(CharRange& range)
    {
        const CharRange token = orv::readToken(range);
        m_place = offset(token.start);
        m_file.statements.back().words.emplace_back(token.start, token.end);
        return m_file.statements.back().words.back();
    }

    uint64_t offset(const char* place) const { return uint64_t(place - m_buffer.data()); }

    void report(Kind kind, uint64_t place, const std::string& sentence)
    {
        m_findings.add(kind, place, "line " + std::to_string(getLine(place)), sentence);
    }

    int getLine(uint64_t place) const
    {
        return 1 + int(std::lower_bound(m_lineEnds.begin(), m_lineEnds.end(), place) - m_lineEnds.begin());
    }

    Assets m_assets;
    Images m_images;
    Findings& m_findings;
    CharRange m_text;
    orv::detail::Statement m_statement;
    uint64_t m_place = 0; ///< of the last word
    TextFile m_file;

private:
    std::vector<char> m_buffer;
    std::vector<size_t> m_lineEnds;
};

class AppearanceChecker : public TextChecker
{
public:
    using TextChecker::TextChecker;

    void check()
    {
        std::string tag;
        for (bool more = begin(); more && next(tag); orv::eatWhite(m_text))
            more = tag == "property" ? checkProperty() : checkStatement(tag);
    }

private:
    bool checkStatement(const std::string& tag)
    {
        const char* arguments = findArguments(STATEMENTS, tag);
        if (!arguments)
            return end("\"" + tag + "\" is no statement; the engine ignores the rest of the file");
        checkArguments(tag, arguments);
        return true;
    }

    bool checkProperty()
    {
        const std::string property = readWord();
        const std::string type = readWord();
        const char* arguments = findArguments(PROPERTY_TYPES, type);
        if (!arguments)
            return end("\"" + type + "\" is no type of a property; the engine ignores the rest of the file");
        checkArguments(property, arguments);
        return true;
    }

    bool end(const std::string& sentence)
    {
        report(Kind::TEXT_TAG, offset(m_statement.tag.start), sentence);
        m_text.start = m_text.end;
        return true;
    }

    void checkArguments(const std::string& what, const char* arguments)
    {
        for (; *arguments; ++arguments)
        {
            if (*arguments == 'f' || *arguments == 'i')
                checkNumber(what, *arguments == 'f');
            else
                checkWord(what, *arguments, readWord());
        }
    }

    /// The engine reads a number; any rest of the word becomes the next argument.
    void checkNumber(const std::string& what, bool real)
    {
        orv::eatWhite(m_text);
        const char* const start = m_text.start;
        real ? void(orv::readFloat(m_text, 0.0f)) : void(orv::readInt(m_text, 0));
        const char* const end = m_text.start;
        const bool isNumber =
            std::any_of(start, end, [](char c) { return std::isdigit(static_cast<unsigned char>(c)) != 0; });
        m_file.statements.back().words.emplace_back(start, end);
        if (!isNumber)
            report(Kind::TEXT_ARGUMENT, offset(start), "\"" + what + "\" lacks a number; 0 is taken");
    }

    void checkWord(const std::string& what, char kind, const std::string& word)
    {
        if (word.empty())
            report(Kind::TEXT_ARGUMENT, m_place, "\"" + what + "\" lacks an argument");
        else if (kind == 'p' && !m_assets.has(word))
            report(Kind::PROGRAM_MISSING, m_place, "the program \"" + word + "\" is not found");
        else if (kind == '2' || kind == 'c')
            checkImage(word, kind == 'c');
        else if (std::isupper(static_cast<unsigned char>(kind)) && !isWord(kind, word))
            report(Kind::TEXT_WORD, m_place, "\"" + what + "\" does not know \"" + word + "\"");
    }

    void checkImage(const std::string& name, bool cube)
    {
        const ImageSize size = m_images.measure(name, cube);
        if (size.state == ImageState::MISSING)
            report(Kind::IMAGE_MISSING, m_place, "the picture \"" + name + "\" is not found");
        else if (size.state == ImageState::UNREADABLE)
            report(Kind::IMAGE_UNREADABLE, m_place, "the picture \"" + name + "\" cannot be decoded");
    }
};

/// Uniforms declared in a shader source, including those in comments and disabled parts.
std::set<std::string> findUniforms(std::string source)
{
    source = std::regex_replace(source, std::regex("//[^\n]*"), "");
    std::set<std::string> names;
    const std::regex pattern(R"(\buniform\s+(?:lowp\s+|mediump\s+|highp\s+)?\w+\s+(\w+))");
    for (std::sregex_iterator i(source.begin(), source.end(), pattern), end; i != end; ++i)
        names.insert((*i)[1]);
    return names;
}

class ProgramChecker : public TextChecker
{
public:
    using TextChecker::TextChecker;

    void check()
    {
        std::string tag;
        if (!begin())
            return;
        while (next(tag))
        {
            if (tag == "uniform")
                readUniform();
            else if (tag == "vertex_source_file" || tag == "fragment_source_file")
                readSource(tag);
            else
            {
                report(Kind::TEXT_TAG, offset(m_statement.tag.start),
                       "\"" + tag + "\" is no statement; the engine refuses the file");
                return;
            }
            orv::eatWhite(m_text);
        }
        for (const char* kind : {"vertex_source_file", "fragment_source_file"})
        {
            if (!m_sources.count(kind))
                report(Kind::SOURCE_MISSING, 0, "there is no " + std::string(kind));
        }
        compareUniforms();
    }

private:
    void readSource(const std::string& kind)
    {
        const std::string name = readWord();
        m_sources.insert(kind);
        if (!m_assets.has(name))
        {
            report(Kind::SOURCE_MISSING, m_place, "the source \"" + name + "\" is not found");
            m_complete = false;
        }
        m_declared.merge(findUniforms(m_assets.read(name)));
    }

    void readUniform()
    {
        CharRange line{m_text.start, std::max(m_text.start, m_statement.lineEnd)};
        const std::string uniform = readWord(line);
        const std::string property = readWord(line);
        m_text.start = line.start;
        if (uniform.empty() || property.empty())
            report(Kind::TEXT_ARGUMENT, offset(m_statement.tag.start),
                   "a uniform's name and its property have to stand on one line");
        else
            m_bound[uniform] = offset(m_statement.tag.start);
    }

    void compareUniforms()
    {
        if (!m_complete || m_sources.size() < 2)
            return;
        for (const auto& [name, place] : m_bound)
        {
            if (!m_declared.count(name))
                report(Kind::UNIFORM_ABSENT, place, "the shaders have no uniform \"" + name + "\"");
        }
        for (const std::string& name : m_declared)
        {
            if (!m_bound.count(name))
                report(Kind::UNIFORM_UNBOUND, 0, "the uniform \"" + name + "\" is fed by no property");
        }
    }

    std::set<std::string> m_sources;
    std::set<std::string> m_declared;
    std::map<std::string, uint64_t> m_bound;
    bool m_complete = true;
};

} // namespace

TextFile checkAppearanceFile(const std::string& text, const std::filesystem::path& folder, Findings& findings)
{
    AppearanceChecker checker(text, folder, findings);
    checker.check();
    return checker.getFile();
}

TextFile checkProgramFile(const std::string& text, const std::filesystem::path& folder, Findings& findings)
{
    ProgramChecker checker(text, folder, findings);
    checker.check();
    return checker.getFile();
}

} // namespace inspect
