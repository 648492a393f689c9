#pragma once

#include <GLES2/gl2.h>

#include <cstdint>
#include <functional>
#include <string>
#include <type_traits>
#include <vector>

/// Stands between the callers of OpenGL ES 2.0 in this process and the real library.
///
/// A program that links orv_glcalls and uses anything declared here defines all 142 entry points itself, so
/// that its own calls and those of every shared library it loads arrive here first. Each call is counted and
/// goes on to the real libGLESv2 unless a test says otherwise:
///
///     glcalls::Scope gl;
///     mesh->draw();
///     EXPECT_EQ(1u, glcalls::count(glDrawElements));
///
///     glcalls::replace(glGenTextures, [](GLsizei n, GLuint* names) { std::fill_n(names, n, 0u); });
///     glcalls::replace(glGetIntegerv, [](GLenum name, GLint* value) {
///         name == GL_MAX_TEXTURE_SIZE ? void(*value = 64) : glcalls::real(glGetIntegerv)(name, value);
///     });
///
/// Calls made by the test itself count too: read counts before reading pixels.
///
/// With ORV_GL_CHECK in the environment, GL is asked for errors after each call, and one is written to standard error with
/// the call, its arguments and what was bound. It is still there for the program's own glGetError.
/// Threads: none; everything belongs to the one GL thread.
namespace glcalls
{

template <class Result, class... Arguments>
using EntryPoint = Result (*)(Arguments...);

/// Clears counts, records, drops, replacements and live names.
void reset();

/// Resets at both ends of a block.
class Scope
{
public:
    Scope() { reset(); }
    ~Scope() { reset(); }
    Scope(const Scope&) = delete;
    Scope& operator=(const Scope&) = delete;
};

// --- Counting: every call since reset(), dropped and replaced ones included. -------------------------------

uint64_t total();

/// @param name  "glUseProgram"; a name that is no entry point ends the program with a message.
uint64_t count(const std::string& name);

namespace detail
{

/// One entry point.
struct Entry
{
    const char* name;
    const char* parameters; ///< as declared: "(GLenum target, GLuint texture)"
    void (*untypedReal)();
    void (*nothing)(); ///< of the same signature
    void (*target)();  ///< where the call goes: to one of these two
    uint64_t calls = 0;
    bool isSlow = false; ///< more to do than counting and calling the target
    bool isDropped = false;
    bool isReplaced = false;
};

template <class Signature>
struct TypedEntry;

template <class Result, class... Arguments>
struct TypedEntry<Result(Arguments...)> : Entry
{
    std::function<Result(Arguments...)> replacement;
};

/// A name or address that is no entry point ends the program with a message.
Entry& find(const std::string& name);
Entry& find(void (*address)());
void setDropped(Entry& entry, bool dropped);
void setReplaced(Entry& entry, bool replaced);

template <class Result, class... Arguments>
TypedEntry<Result(Arguments...)>& find(EntryPoint<Result, Arguments...> entry)
{
    return static_cast<TypedEntry<Result(Arguments...)>&>(find(reinterpret_cast<void (*)()>(entry)));
}

} // namespace detail

/// count(glUseProgram)
template <class Result, class... Arguments>
uint64_t count(EntryPoint<Result, Arguments...> entry)
{
    return detail::find(entry).calls;
}

/// Sets only the counts to 0.
void resetCounts();

// --- Recording ---------------------------------------------------------------------------------------------

/// Begins a new, empty record.
void startRecording();
void stopRecording();

/// One text per call, in order: "glBindTexture(0x0de1, 3)", "glUniform4fv(2, 1, {1, 0, 0, 1})".
/// Enums and bit fields are in hexadecimal with at least four digits, booleans 0 or 1, text in quotes; the
/// last argument of glDrawElements and glVertexAttribPointer is a byte offset; arrays that are inputs of
/// known length are written out, every other pointer is "null" or "data".
const std::vector<std::string>& recorded();

/// The recorded calls of one entry point.
std::vector<std::string> recorded(const std::string& name);

// --- Dropping: the real library is not called; 0 or null is returned, outputs are not written. -------------

void setDropped(const std::string& name, bool dropped = true);
void dropAll(bool dropped = true);

template <class Result, class... Arguments>
void setDropped(EntryPoint<Result, Arguments...> entry, bool dropped = true)
{
    detail::setDropped(detail::find(entry), dropped);
}

// --- Replacing and failing ---------------------------------------------------------------------------------

/// The real library's function: not counted, recorded, dropped or replaced.
template <class Result, class... Arguments>
EntryPoint<Result, Arguments...> real(EntryPoint<Result, Arguments...> entry)
{
    return reinterpret_cast<EntryPoint<Result, Arguments...>>(detail::find(entry).untypedReal);
}

/// Until reset() or restore(), calls of entry run function instead of the real library.
template <class Result, class... Arguments>
void replace(EntryPoint<Result, Arguments...> entry,
             std::type_identity_t<std::function<Result(Arguments...)>> function)
{
    auto& typedEntry = detail::find(entry);
    typedEntry.replacement = std::move(function);
    detail::setReplaced(typedEntry, true);
}

template <class Result, class... Arguments>
void restore(EntryPoint<Result, Arguments...> entry)
{
    auto& typedEntry = detail::find(entry);
    detail::setReplaced(typedEntry, false);
    typedEntry.replacement = nullptr;
}

/// glGenBuffers, glGenTextures, glGenFramebuffers or glGenRenderbuffers yields zeros. (For glCreateProgram
/// and glCreateShader: setDropped.)
void refuseNames(EntryPoint<void, GLsizei, GLuint*> entry);

/// Every shader fails to compile and every program fails to link, with the reason in log.
void failCompiling(const std::string& log);
void failLinking(const std::string& log);

/// The call of that number from here on (1 is the next) fails as if out of memory: it does nothing, returns no name or
/// value, and glGetError then returns GL_OUT_OF_MEMORY. 0 ends this. Calls that cannot fail in a driver are not
/// counted: glGetError, and calls without which the next draw would read invalid memory (glBindBuffer,
/// glVertexAttribPointer, glDisableVertexAttribArray).
void refuseCall(uint64_t number);

/// The entry point that refuseCall() made fail; "" if there were fewer calls.
const std::string& refusedCall();

/// glCheckFramebufferStatus returns status.
void setFramebufferStatus(GLenum status);

/// The next glGetError calls return these codes in order, before the real ones.
void queueError(GLenum code);

/// glGetString(GL_EXTENSIONS) returns text. (The engine asks for some extensions once per process only.)
void setExtensions(const std::string& text);

/// eglGetProcAddress(name) returns function, or null for a missing one.
void setProcAddress(const std::string& name, void (*function)());

// --- GL objects made and not yet deleted since reset() -----------------------------------------------------

enum class Kind
{
    BUFFER,
    TEXTURE,
    FRAMEBUFFER,
    RENDERBUFFER,
    SHADER,
    PROGRAM
};

/// The names alive in the current context, ascending. A shader or program counts as deleted once its deletion was
/// requested. Names of a destroyed context do not count.
std::vector<GLuint> liveNames(Kind kind);

/// "" if none is alive, else the live names by kind: "buffers 1 2, textures 7".
std::string describeLiveNames();

} // namespace glcalls
