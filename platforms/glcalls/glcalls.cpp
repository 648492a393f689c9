#include "glcalls/glcalls.h"

#include "glcalls/gltable.h"

#include <EGL/egl.h>
#include <GLES2/gl2.h>
#include <dlfcn.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <deque>
#include <map>
#include <set>
#include <sstream>
#include <utility>

namespace glcalls
{

namespace
{

using detail::Entry;
using detail::TypedEntry;
using Address = void (*)();

constexpr const char* KIND_NAMES[] = {"buffers",       "textures", "framebuffers",
                                      "renderbuffers", "shaders",  "programs"};

struct State
{
    bool isChecking = std::getenv("ORV_GL_CHECK") != nullptr;
    bool isRecording = false;
    bool dropsAll = false;
    std::vector<std::string> recorded;
    std::deque<GLenum> queuedErrors;
    std::string extensions;
    std::map<std::string, Address> procAddresses;
    std::map<std::pair<EGLContext, Kind>, std::set<GLuint>> liveNames;
    uint64_t callsToRefusal = 0; ///< the last of them is refused; 0: none is
    std::string refusedCall;
};

State& state()
{
    static State theState;
    return theState;
}

[[noreturn]] void fail(const std::string& message)
{
    std::fprintf(stderr, "glcalls: %s\n", message.c_str());
    std::abort();
}

/// The function of that name in a library's own export table, never the one defined here.
Address resolve(const char* library, const char* name)
{
    void* handle = dlopen(library, RTLD_LAZY | RTLD_LOCAL);
    if (!handle)
        fail(dlerror());
    void* function = dlsym(handle, name);
    if (!function)
        fail(std::string(library) + " has no " + name);
    return reinterpret_cast<Address>(function);
}

template <class Result, class... Arguments>
Result doNothing(Arguments...)
{
    return Result();
}

template <class Result, class... Arguments>
Address findNothing(EntryPoint<Result, Arguments...>)
{
    return reinterpret_cast<Address>(&doNothing<Result, Arguments...>);
}

Entry makeEntry(const char* name, const char* parameters, Address nothing)
{
    const Address real = resolve("libGLESv2.so.2", name);
    return {name, parameters, real, nothing, real};
}

/// One entry per entry point, made when first asked for, so that calls from static constructors work.
#define GLCALLS_ENTRY(Result, Name, Parameters, Arguments)                                                   \
    TypedEntry<Result Parameters>& entryOf_##Name()                                                          \
    {                                                                                                        \
        using Real = Result(*) Parameters;                                                                   \
        static TypedEntry<Result Parameters> entry = {makeEntry(#Name, #Parameters, findNothing(Real())),    \
                                                      nullptr};                                              \
        return entry;                                                                                        \
    }
GLCALLS_TABLE(GLCALLS_ENTRY)
#undef GLCALLS_ENTRY

struct Row
{
    Address address;
    Entry* entry;
};

#define GLCALLS_ROW(Result, Name, Parameters, Arguments)                                                     \
    {reinterpret_cast<Address>(::Name), &entryOf_##Name()},

const std::vector<Row>& rows()
{
    static const std::vector<Row> theRows = {GLCALLS_TABLE(GLCALLS_ROW)};
    return theRows;
}
#undef GLCALLS_ROW

// --- Live names --------------------------------------------------------------------------------------------

struct Maker
{
    const char* name;
    Kind kind;
    bool makes;
};

constexpr Maker MAKERS[] = {
    {"glGenBuffers", Kind::BUFFER, true},
    {"glDeleteBuffers", Kind::BUFFER, false},
    {"glGenTextures", Kind::TEXTURE, true},
    {"glDeleteTextures", Kind::TEXTURE, false},
    {"glGenFramebuffers", Kind::FRAMEBUFFER, true},
    {"glDeleteFramebuffers", Kind::FRAMEBUFFER, false},
    {"glGenRenderbuffers", Kind::RENDERBUFFER, true},
    {"glDeleteRenderbuffers", Kind::RENDERBUFFER, false},
    {"glCreateShader", Kind::SHADER, true},
    {"glDeleteShader", Kind::SHADER, false},
    {"glCreateProgram", Kind::PROGRAM, true},
    {"glDeleteProgram", Kind::PROGRAM, false},
};

const Maker* findMaker(const Entry& entry)
{
    for (const Maker& maker : MAKERS)
    {
        if (!std::strcmp(maker.name, entry.name))
            return &maker;
    }
    return nullptr;
}

void note(const Maker& maker, const GLuint* names, GLsizei count)
{
    std::set<GLuint>& live = state().liveNames[{eglGetCurrentContext(), maker.kind}];
    for (GLsizei i = 0; names && i < count; ++i)
    {
        if (!maker.makes)
            live.erase(names[i]);
        else if (names[i])
            live.insert(names[i]);
    }
}

/// Called with the entry point's arguments (names passed in or filled in), by its kind of signature.
template <class... Arguments>
void noteArguments(const Maker&, Arguments...)
{
}

void noteArguments(const Maker& maker, GLsizei count, GLuint* names)
{
    note(maker, names, count);
}

void noteArguments(const Maker& maker, GLsizei count, const GLuint* names)
{
    note(maker, names, count);
}

void noteArguments(const Maker& maker, GLuint name)
{
    if (!maker.makes) // glCreateShader takes a kind of shader, not a name
        note(maker, &name, 1);
}

template <class Result>
void noteResult(const Maker&, Result)
{
}

void noteResult(const Maker& maker, GLuint name)
{
    note(maker, &name, 1);
}

// --- Recording: texts of arguments -------------------------------------------------------------------------

/// "GLenum target" and so on, in order.
std::vector<std::string> splitParameters(const char* parameters)
{
    std::vector<std::string> parts;
    std::stringstream text(std::string(parameters + 1, std::strlen(parameters) - 2));
    for (std::string part; std::getline(text, part, ',');)
        parts.push_back(part.substr(part.find_first_not_of(' ')));
    return parts;
}

/// The number of values in an input array of this call; 0 if unknown.
int arrayLength(const std::string& entryName, const std::vector<long>& integers)
{
    const auto startsWith = [&](const char* start) { return entryName.rfind(start, 0) == 0; };
    const size_t digitAt = entryName.find_first_of("1234");
    const int digit = digitAt == std::string::npos ? 0 : entryName[digitAt] - '0';
    if (startsWith("glUniformMatrix"))
        return digit * digit * int(integers[1]);
    if (startsWith("glUniform"))
        return digit * int(integers[1]);
    if (startsWith("glVertexAttrib") && digit > 0)
        return digit;
    if (startsWith("glDelete"))
        return int(integers[0]);
    return 0;
}

/// Writes one call's arguments; knows the declared parameters and the whole numbers met so far.
class ArgumentWriter
{
public:
    explicit ArgumentWriter(const Entry& entry)
        : m_entryName(entry.name)
        , m_parameters(splitParameters(entry.parameters))
    {
        m_text = m_entryName + "(";
    }

    template <class T>
    void add(T value)
    {
        if (m_index > 0)
            m_text += ", ";
        write(value);
        ++m_index;
    }

    std::string finish() const { return m_text + ")"; }

private:
    bool isDeclared(const char* start) const { return m_parameters[m_index].rfind(start, 0) == 0; }

    void writeFormatted(const char* format, auto value)
    {
        char buffer[40];
        std::snprintf(buffer, sizeof buffer, format, value);
        m_text += buffer;
    }

    void write(float value) { writeFormatted("%g", value); }
    void write(unsigned char value) { writeInteger(value); }
    void write(int value) { writeInteger(value); }
    void write(long value) { writeInteger(value); }

    void write(unsigned value)
    {
        m_integers.push_back(long(value));
        writeFormatted(isDeclared("GLenum") || isDeclared("GLbitfield") ? "0x%04x" : "%u", value);
    }

    void writeInteger(long value)
    {
        m_integers.push_back(value);
        writeFormatted("%ld", value);
    }

    void write(const char* text) { m_text += text ? "\"" + std::string(text) + "\"" : "null"; }

    void write(const void* data)
    {
        if (isDeclared("const void* pointer") || isDeclared("const void* indices"))
            writeFormatted("%ld", reinterpret_cast<long>(data));
        else
            m_text += data ? "data" : "null";
    }

    void write(char* text) { write(static_cast<const void*>(text)); } // an output
    void write(const float* values) { writeArray(values, "%g"); }
    void write(const int* values) { writeArray(values, "%d"); }
    void write(const unsigned* values) { writeArray(values, "%u"); }
    void write(float* values) { write(static_cast<const void*>(values)); }
    void write(int* values) { write(static_cast<const void*>(values)); }
    void write(unsigned* values) { write(static_cast<const void*>(values)); }

    template <class T>
    void writeArray(const T* values, const char* format)
    {
        const int length = values ? arrayLength(m_entryName, m_integers) : 0;
        if (length <= 0)
            return write(static_cast<const void*>(values));
        for (int i = 0; i < length; ++i)
        {
            m_text += i == 0 ? "{" : ", ";
            writeFormatted(format, values[i]);
        }
        m_text += "}";
    }

    std::string m_entryName;
    std::vector<std::string> m_parameters;
    std::vector<long> m_integers;
    std::string m_text;
    size_t m_index = 0;
};

template <class... Arguments>
void record(const Entry& entry, Arguments... arguments)
{
    ArgumentWriter writer(entry);
    (writer.add(arguments), ...);
    state().recorded.push_back(writer.finish());
}

// --- Checking ----------------------------------------------------------------------------------------------

int getReal(GLenum name)
{
    GLint value = 0;
    real(glGetIntegerv)(name, &value);
    return value;
}

/// State that can make a correct call fail.
std::string describeBindings()
{
    char text[200];
    std::snprintf(
        text, sizeof text,
        "program %d, array buffer %d, element buffer %d, framebuffer %d, unit %d with texture %d and cube %d",
        getReal(GL_CURRENT_PROGRAM), getReal(GL_ARRAY_BUFFER_BINDING),
        getReal(GL_ELEMENT_ARRAY_BUFFER_BINDING), getReal(GL_FRAMEBUFFER_BINDING),
        getReal(GL_ACTIVE_TEXTURE) - GL_TEXTURE0, getReal(GL_TEXTURE_BINDING_2D),
        getReal(GL_TEXTURE_BINDING_CUBE_MAP));
    return text;
}

/// Reports the call in which GL found an error; the caller's own glGetError still returns it.
template <class... Arguments>
void check(const Entry& entry, Arguments... arguments)
{
    if (&entry == &entryOf_glGetError() || !eglGetCurrentContext())
        return;
    while (const GLenum error = real(glGetError)())
    {
        ArgumentWriter writer(entry);
        (writer.add(arguments), ...);
        std::fprintf(stderr, "GL error 0x%04x: %s; bound are %s\n", error, writer.finish().c_str(),
                     describeBindings().c_str());
        queueError(error);
    }
}

// --- Calls -------------------------------------------------------------------------------------------------

/// Dropped calls take a fast path, so that the cost of the code around them can be measured.
void updateWay(Entry& entry)
{
    const bool drops = state().dropsAll || entry.isDropped;
    entry.target = drops ? entry.nothing : entry.untypedReal;
    entry.isSlow = state().isChecking || state().isRecording || state().callsToRefusal > 0 ||
                   (!drops && (entry.isReplaced || findMaker(entry)));
}

void updateAllWays()
{
    for (const Row& row : rows())
        updateWay(*row.entry);
}

// The first call of any function prepares all entries: makers of names take the slow path from the start.
[[maybe_unused]] const bool g_prepared = (updateAllWays(), true);

// --- Refusing ----------------------------------------------------------------------------------------------

/// Outputs of a refused call: unchanged, except names.
template <class... Arguments>
void refuseOutputs(Arguments...)
{
}

void refuseOutputs(GLsizei count, GLuint* names)
{
    std::fill_n(names, count, 0u);
}

bool isToBeRefused(const Entry& entry)
{
    const Entry* const exempt[] = {&entryOf_glGetError(), &entryOf_glBindBuffer(),
                                   &entryOf_glVertexAttribPointer(), &entryOf_glDisableVertexAttribArray()};
    const bool counts = state().callsToRefusal > 0 &&
                        std::find(std::begin(exempt), std::end(exempt), &entry) == std::end(exempt);
    return counts && --state().callsToRefusal == 0;
}

template <class Result, class... Arguments>
Result refuse(const Entry& entry, Arguments... arguments)
{
    state().refusedCall = entry.name;
    queueError(GL_OUT_OF_MEMORY);
    refuseOutputs(arguments...);
    if constexpr (std::is_same_v<Result, GLint>) // a location
        return -1;
    else
        return Result();
}

template <class Result, class... Arguments>
Result callSlowly(TypedEntry<Result(Arguments...)>& entry, Arguments... arguments)
{
    if (state().isRecording)
        record(entry, arguments...);
    if (isToBeRefused(entry))
        return refuse<Result>(entry, arguments...);
    const bool drops = entry.target == entry.nothing;
    const auto run = [&]
    {
        if (drops || !entry.isReplaced)
            return reinterpret_cast<EntryPoint<Result, Arguments...>>(entry.target)(arguments...);
        const auto replacement = entry.replacement; // which may restore itself
        return replacement(arguments...);
    };
    const Maker* maker = drops ? nullptr : findMaker(entry);
    if constexpr (std::is_void_v<Result>)
    {
        if (maker && !maker->makes) // names can be reused after the call, so note it first
            noteArguments(*maker, arguments...);
        run();
        if (maker && maker->makes)
            noteArguments(*maker, arguments...);
        if (state().isChecking)
            check(entry, arguments...);
    }
    else
    {
        const Result result = run();
        if (maker)
            noteResult(*maker, result);
        if (state().isChecking)
            check(entry, arguments...);
        return result;
    }
}

} // namespace

namespace detail
{

Entry& find(const std::string& name)
{
    for (const Row& row : rows())
    {
        if (name == row.entry->name)
            return *row.entry;
    }
    fail(name + " is no entry point of OpenGL ES 2.0");
}

Entry& find(void (*address)())
{
    for (const Row& row : rows())
    {
        if (address == row.address)
            return *row.entry;
    }
    fail("not the address of an entry point of OpenGL ES 2.0");
}

void setDropped(Entry& entry, bool dropped)
{
    entry.isDropped = dropped;
    updateWay(entry);
}

void setReplaced(Entry& entry, bool replaced)
{
    entry.isReplaced = replaced;
    updateWay(entry);
}

} // namespace detail

void reset()
{
#define GLCALLS_RESTORE(Result, Name, Parameters, Arguments) entryOf_##Name().replacement = nullptr;
    GLCALLS_TABLE(GLCALLS_RESTORE)
#undef GLCALLS_RESTORE
    for (const Row& row : rows())
        row.entry->isDropped = row.entry->isReplaced = false;
    state() = State();
    resetCounts();
    updateAllWays();
}

uint64_t total()
{
    uint64_t sum = 0;
    for (const Row& row : rows())
        sum += row.entry->calls;
    return sum;
}

uint64_t count(const std::string& name)
{
    return detail::find(name).calls;
}

void resetCounts()
{
    for (const Row& row : rows())
        row.entry->calls = 0;
}

void startRecording()
{
    state().recorded.clear();
    state().isRecording = true;
    updateAllWays();
}

void stopRecording()
{
    state().isRecording = false;
    updateAllWays();
}

const std::vector<std::string>& recorded()
{
    return state().recorded;
}

std::vector<std::string> recorded(const std::string& name)
{
    std::vector<std::string> found;
    const std::string start = std::string(detail::find(name).name) + "(";
    for (const std::string& call : state().recorded)
    {
        if (call.rfind(start, 0) == 0)
            found.push_back(call);
    }
    return found;
}

void setDropped(const std::string& name, bool dropped)
{
    detail::setDropped(detail::find(name), dropped);
}

void dropAll(bool dropped)
{
    state().dropsAll = dropped;
    updateAllWays();
}

void refuseNames(EntryPoint<void, GLsizei, GLuint*> entry)
{
    replace(entry, [](GLsizei count, GLuint* names) { std::fill_n(names, count, 0u); });
}

namespace
{

/// What glGetShaderInfoLog and glGetProgramInfoLog do.
void giveLog(const std::string& log, GLsizei size, GLsizei* length, GLchar* text)
{
    const GLsizei written = size > 0 ? std::min(size - 1, GLsizei(log.size())) : 0;
    if (size > 0)
        std::snprintf(text, size_t(size), "%s", log.c_str());
    if (length)
        *length = written;
}

} // namespace

void failCompiling(const std::string& log)
{
    replace(glGetShaderiv,
            [log](GLuint shader, GLenum name, GLint* value)
            {
                real(glGetShaderiv)(shader, name, value);
                if (name == GL_COMPILE_STATUS)
                    *value = GL_FALSE;
                else if (name == GL_INFO_LOG_LENGTH)
                    *value = GLint(log.size()) + 1;
            });
    replace(glGetShaderInfoLog,
            [log](GLuint, GLsizei size, GLsizei* length, GLchar* text) { giveLog(log, size, length, text); });
}

void failLinking(const std::string& log)
{
    replace(glGetProgramiv,
            [log](GLuint program, GLenum name, GLint* value)
            {
                real(glGetProgramiv)(program, name, value);
                if (name == GL_LINK_STATUS)
                    *value = GL_FALSE;
                else if (name == GL_INFO_LOG_LENGTH)
                    *value = GLint(log.size()) + 1;
            });
    replace(glGetProgramInfoLog,
            [log](GLuint, GLsizei size, GLsizei* length, GLchar* text) { giveLog(log, size, length, text); });
}

void refuseCall(uint64_t number)
{
    state().callsToRefusal = number;
    state().refusedCall.clear();
    updateAllWays();
}

const std::string& refusedCall()
{
    return state().refusedCall;
}

void setFramebufferStatus(GLenum status)
{
    replace(glCheckFramebufferStatus, [status](GLenum) { return status; });
}

void queueError(GLenum code)
{
    state().queuedErrors.push_back(code);
    replace(glGetError,
            []
            {
                std::deque<GLenum>& errors = state().queuedErrors;
                if (errors.empty())
                    return real(glGetError)();
                const GLenum first = errors.front();
                errors.pop_front();
                return first;
            });
}

void setExtensions(const std::string& text)
{
    state().extensions = text;
    replace(glGetString,
            [](GLenum name)
            {
                if (name != GL_EXTENSIONS)
                    return real(glGetString)(name);
                return reinterpret_cast<const GLubyte*>(state().extensions.c_str());
            });
}

void setProcAddress(const std::string& name, void (*function)())
{
    state().procAddresses[name] = function;
}

std::vector<GLuint> liveNames(Kind kind)
{
    const std::set<GLuint>& live = state().liveNames[{eglGetCurrentContext(), kind}];
    return {live.begin(), live.end()};
}

std::string describeLiveNames()
{
    std::string text;
    for (int kind = 0; kind < int(std::size(KIND_NAMES)); ++kind)
    {
        const std::vector<GLuint> live = liveNames(Kind(kind));
        if (live.empty())
            continue;
        text += (text.empty() ? "" : ", ") + std::string(KIND_NAMES[kind]);
        for (GLuint name : live)
            text += " " + std::to_string(name);
    }
    return text;
}

} // namespace glcalls

// --- The entry points themselves ---------------------------------------------------------------------------

#define GLCALLS_DEFINE(Result, Name, Parameters, Arguments)                                                  \
    extern "C" __attribute__((visibility("default"))) Result Name Parameters                                 \
    {                                                                                                        \
        auto& entry = glcalls::entryOf_##Name();                                                             \
        ++entry.calls;                                                                                       \
        if (!entry.isSlow)                                                                                   \
            return reinterpret_cast<decltype(&Name)>(entry.target) Arguments;                                \
        const auto call = [&](auto... arguments) { return glcalls::callSlowly(entry, arguments...); };       \
        return call Arguments;                                                                               \
    }
GLCALLS_TABLE(GLCALLS_DEFINE)
#undef GLCALLS_DEFINE

/// GL objects go with their context, and a later context may get its address.
extern "C" __attribute__((visibility("default"))) EGLBoolean eglDestroyContext(EGLDisplay dpy, EGLContext ctx)
{
    static const auto real =
        reinterpret_cast<decltype(&eglDestroyContext)>(glcalls::resolve("libEGL.so.1", "eglDestroyContext"));
    std::erase_if(glcalls::state().liveNames, [ctx](const auto& entry) { return entry.first.first == ctx; });
    return real(dpy, ctx);
}

extern "C" __attribute__((visibility("default"))) __eglMustCastToProperFunctionPointerType
eglGetProcAddress(const char* name)
{
    using GetProcAddress = __eglMustCastToProperFunctionPointerType (*)(const char*);
    static const auto real =
        reinterpret_cast<GetProcAddress>(glcalls::resolve("libEGL.so.1", "eglGetProcAddress"));

    const auto& given = glcalls::state().procAddresses;
    const auto found = given.find(name);
    return found != given.end() ? found->second : real(name);
}
