#!/usr/bin/env python3
"""Uses the installed tools like a desktop and a shell.

installedtools.py PREFIX

Faults caught: a manual page that is invalid or lacks an option, a completion without effect, a scene with a wrong file
type, a thumbnailer whose command line the viewer refuses.
"""
import configparser
import os
import pty
import re
import select
import struct
import subprocess
import sys
import tempfile

PREFIX = os.path.abspath(sys.argv[1])  # of scenes.py too, which makes its models as this does
BIN = os.path.join(PREFIX, "bin")
SHARE = os.path.join(PREFIX, "share")
TOOLS = ("orv-convert", "orv-inspect", "orv-view")
failures = []


def expect(condition, what):
    if not condition:
        failures.append(what)


def run(*command, **options):
    done = subprocess.run(command, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, timeout=120, **options)
    return done.returncode, done.stdout.decode(errors="replace")


def list_options(tool):
    return set(re.findall(r"(?<![\w-])--[a-z][a-z-]*", run(os.path.join(BIN, tool), "--help")[1].split("\n\n", 1)[1]))


def check_manual(tool):
    page = os.path.join(SHARE, "man/man1", tool + ".1")
    findings = [line for line in run("mandoc", "-T", "lint", "-W", "warning", page)[1].splitlines()
                if "missing date" not in line]  # which would make each day's build another one
    expect(not findings, f"{page}: {findings}")
    text = re.sub(".\b", "", run("mandoc", page)[1]).replace("‐", "-")
    missing = {option for option in list_options(tool) if option not in text}
    expect(not missing, f"{page}: says nothing of {missing}")


def complete(tool, *words):
    """Bash's completions of the last word."""
    script = (f"source {SHARE}/bash-completion/completions/{tool}; COMP_WORDS=({' '.join(map(repr, words))}); "
              f"COMP_CWORD={len(words) - 1}; compopt() {{ :; }}; _{tool.replace('-', '_')}; echo \"${{COMPREPLY[@]}}\"")
    return run("bash", "-c", script)[1].split()


def check_completions():
    for tool in TOOLS:
        offered = set(complete(tool, tool, "--"))
        expect("--help" in offered and offered <= list_options(tool), f"{tool} -- completes to {offered}")
    expect(complete("orv-convert", "orv-convert", "--keys", "sp") == ["sparse"], "--keys sp")
    check_zsh()
    check_fish()


def check_zsh():
    """What zsh makes of a line with the tabulator in it: completion needs a terminal."""
    lines = {"orv-convert --keys sp\t": "--keys sparse", "orv-view --thumb\t 9": "--thumbnail 9",
             "orv-inspect --che\t x": "--check x"}
    environment = dict(os.environ, TERM="dumb", PS1="", HOME="/nonexistent")
    try:
        terminal, end = pty.openpty()
    except OSError: # a chroot without /dev/pts
        return check_zsh_without_terminal()
    with subprocess.Popen(["zsh", "-f", "-i"], stdin=end, stdout=end, stderr=end, env=environment,
                          start_new_session=True) as shell:
        os.close(end)
        said = [""]

        def say(line, answer):
            """@return whether the shell answered so, within a while."""
            before = len(said[0])
            os.write(terminal, (line + "\r").encode())
            while answer not in said[0][before:] and select.select([terminal], [], [], 30)[0]:
                said[0] += os.read(terminal, 65536).decode(errors="replace")
            return answer in said[0][before:]

        tools = "; ".join(f"{tool}() {{ print -r -- GOT $* }}" for tool in TOOLS)
        say(f"fpath=({SHARE}/zsh/vendor-completions $fpath); autoload -U compinit; compinit -u -D; "
            f"{tools}; print REA''DY", "READY")
        for line, wanted in lines.items():
            expect(say(line, "GOT " + wanted), f"zsh makes of {line!r}: {said[0][-300:]!r}")
        shell.kill()
    os.close(terminal)


def check_zsh_without_terminal():
    for tool in TOOLS:
        code, text = run("zsh", "-f", "-c", f"fpath=({SHARE}/zsh/vendor-completions $fpath); autoload -U compinit; "
                         f"compinit -u -D; [[ $_comps[{tool}] = _{tool} ]] && autoload +X _{tool} && functions _{tool}")
        offered = set(re.findall(r"(?<![\w-])--[a-z][a-z-]*", text))
        expect(code == 0 and "--help" in offered and offered <= list_options(tool), f"zsh, {tool}: {text[-300:]}")


def check_fish():
    with tempfile.TemporaryDirectory() as home:
        environment = dict(os.environ, HOME=home, PATH=BIN + ":" + os.environ["PATH"])
        for tool in TOOLS:
            script = f"set -g fish_complete_path {SHARE}/fish/vendor_completions.d; complete -C '{tool} --'"
            code, text = run("fish", "--no-config", "-c", script, env=environment)
            offered = {line.split("\t")[0] for line in text.splitlines()}
            expect(code == 0 and "--help" in offered and offered <= list_options(tool), f"fish, {tool}: {text}")
        code, text = run("fish", "--no-config", "-c", f"set -g fish_complete_path {SHARE}/fish/vendor_completions.d; "
                         "complete -C 'orv-convert --keys sp'", env=environment)
        expect([line.split("\t")[0] for line in text.splitlines()] == ["sparse"], f"fish, --keys sp: {text}")


def make_model(path):
    """A triangle, as glTF with its buffer in a file of its own."""
    with open(os.path.join(os.path.dirname(path), "corners.bin"), "wb") as file:
        file.write(struct.pack("<9f", 0, 0, 0, 1, 0, 0, 0, 1, 0))
    with open(path, "w", encoding="utf-8") as file:
        file.write('{"asset":{"version":"2.0"},"scene":0,"scenes":[{"nodes":[0]}],"nodes":[{"mesh":0}],'
                   '"meshes":[{"primitives":[{"attributes":{"POSITION":0}}]}],'
                   '"buffers":[{"uri":"corners.bin","byteLength":36}],"bufferViews":[{"buffer":0,"byteLength":36}],'
                   '"accessors":[{"bufferView":0,"componentType":5126,"count":3,"type":"VEC3",'
                   '"min":[0,0,0],"max":[1,1,0]}]}')


def check_desktop(folder):
    model, scene, named_otherwise = (os.path.join(folder, name) for name in ("a.gltf", "a.glo", "b.unknown"))
    make_model(model)
    code, text = run(os.path.join(BIN, "orv-convert"), model, scene)
    expect(code == 0, "orv-convert: " + text)
    run("cp", scene, named_otherwise)
    run("update-mime-database", os.path.join(SHARE, "mime"))
    environment = dict(os.environ, XDG_DATA_DIRS=SHARE + ":/usr/share", XDG_DATA_HOME=folder,
                       PATH=BIN + ":" + os.environ["PATH"])
    for path in (scene, named_otherwise):
        text = run("gio", "info", "-a", "standard::content-type", path, env=environment)[1]
        expect("model/x-orv-scene" in text, f"{path} is taken for {text}")
    code, text = run("desktop-file-validate", os.path.join(SHARE, "applications/orv-view.desktop"))
    expect(code == 0, text)
    check_thumbnailer(scene, os.path.join(folder, "picture"), environment)


def check_thumbnailer(scene, out, environment):
    entry = configparser.ConfigParser(interpolation=None)
    entry.read(os.path.join(SHARE, "thumbnailers/orv-view.thumbnailer"))
    command = entry["Thumbnailer Entry"]["Exec"].split()
    values = {"%s": "96", "%o": out, "%i": scene, "%u": "file://" + scene}
    code, text = run(*[values.get(word, word) for word in command], env=environment)
    expect(code == 0, "the thumbnailer: " + text)
    with open(out, "rb") as file:
        expect(file.read()[12:24] == b"IHDR" + struct.pack(">II", 96, 96), "the thumbnail is no PNG of 96 x 96")
    piped = subprocess.run([os.path.join(BIN, "orv-view"), "--out", "-", "--thumbnail", "96", scene], check=False,
                           stdout=subprocess.PIPE, stderr=subprocess.DEVNULL)
    with open(out, "rb") as file:
        expect(piped.stdout == file.read(), "--out - writes another picture than --out FILE")


def check_pipes(folder):
    with open(os.path.join(folder, "a.glo"), "rb") as file:
        code, text = run(os.path.join(BIN, "orv-inspect"), "--check", "-", stdin=file)
    expect(code == 0, f"orv-inspect -: {code} {text}")
    code, text = run(os.path.join(BIN, "orv-convert"), os.path.join(folder, "a.gltf"), os.path.join(folder, "c.glo"),
                     "--report", "-")
    expect(code == 0 and text.startswith("{") and text.endswith("}\n"), "orv-convert --report -: " + text)


def main():
    for tool in TOOLS:
        check_manual(tool)
    check_completions()
    with tempfile.TemporaryDirectory() as folder:
        check_desktop(folder)
        check_pipes(folder)
    print("\n".join(failures) or "The installed tools do what desktops and shells ask of them.")
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())
