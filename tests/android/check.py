#!/usr/bin/env python3
"""Checks the application for Android, as far as Linux can.

    check.py [--only-package] BUILD ANDROIDBUILD MODELS [TYPES]

Packs the resources and the manifest, compiles the Java sources against the stand-ins for Android's classes, aligns and signs
the package. Without --only-package, it also compares what the Java sources use of Android with the declarations in TYPES (the
folder of the npm package @nativescript/types-android), compiles the native sources with Clang, and runs the application's
Java on this machine's virtual machine with the native side of ANDROIDBUILD. BUILD has the converter and the viewer, MODELS is the
folder of models that other people made. Exit code 1 if anything fails.
"""
import argparse
import json
import os
import pathlib
import re
import shlex
import shutil
import subprocess
import sys
import zipfile

import api

TESTS = pathlib.Path(__file__).resolve().parent
ROOT = TESTS.parents[1]
APP = ROOT / "platforms/android/app"
MAIN = APP / "src/main"
FRAMEWORK = "/usr/share/android-framework-res/framework-res.apk"
JAVA = pathlib.Path(os.environ.get("JAVA_HOME", "/usr")) / "bin"
SIZE = "320x240"
PASSWORD = "pass:throwaway"


def run(*command, **options):
    """@return the output. Ends this script with the output if the command fails."""
    done = subprocess.run([str(part) for part in command], stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True, **options)
    if done.returncode != 0:
        sys.exit(f"{shlex.join(str(part) for part in command)}\n{done.stdout}\nexit code {done.returncode}")
    return done.stdout


def gradle(name):
    """A value of the application's build.gradle."""
    return re.search(rf"\b{name} = '?([\w.]+)'?", (APP / "build.gradle").read_text()).group(1)


def sources(folder):
    return sorted(folder.rglob("*.java"))


def compile_java(folder, classpath, files, release, lint="all"):
    shutil.rmtree(folder, ignore_errors=True)
    folder.mkdir(parents=True)
    run(JAVA / "javac", f"-Xlint:{lint}", "-Werror", "--release", release, "-encoding", "UTF-8", "-d", folder,
        "-cp", ":".join(str(path) for path in classpath), *files)


class Package:
    """The application's package, made in a folder."""

    def __init__(self, folder):
        self.folder = folder
        self.generated = folder / "generated"
        self.standin, self.classes = folder / "standin", folder / "classes"
        self.signed = folder / "orvviewer.apk"

    def make(self):
        shutil.rmtree(self.folder, ignore_errors=True)
        self.folder.mkdir(parents=True)
        self.pack()
        compile_java(self.standin, [], sources(TESTS / "standin"), "17")
        compile_java(self.classes, [self.standin], sources(MAIN / "java") + sources(self.generated), "8")
        run(JAVA / "jar", "--create", "--file", self.folder / "classes.jar", "-C", self.classes, ".")
        self.sign()

    def pack(self):
        """Adds to the manifest what Gradle would add."""
        manifest = self.folder / "AndroidManifest.xml"
        manifest.write_text((MAIN / "AndroidManifest.xml").read_text().replace(
            "<manifest ", f'<manifest package="{gradle("namespace")}" ', 1))
        run("aapt2", "compile", "--dir", MAIN / "res", "-o", self.folder / "resources.zip")
        run("aapt2", "link", "-I", FRAMEWORK, "--manifest", manifest, "--java", self.generated, "-A", MAIN / "assets",
            "-0", "glo", "--min-sdk-version", gradle("minSdk"), "--target-sdk-version", gradle("targetSdk"),
            "--version-code", gradle("versionCode"), "--version-name", gradle("versionName"),
            "-o", self.folder / "unaligned.apk", self.folder / "resources.zip")

    def sign(self):
        """With a key that is made and deleted here."""
        aligned, key = self.folder / "aligned.apk", self.folder / "throwaway.keystore"
        run("zipalign", "-p", "4", self.folder / "unaligned.apk", aligned)
        run("zipalign", "-c", "-p", "4", aligned)
        run(JAVA / "keytool", "-genkeypair", "-keystore", key, "-storepass", "throwaway", "-keypass", "throwaway", "-alias",
            "throwaway", "-keyalg", "RSA", "-keysize", "2048", "-validity", "1", "-dname", "CN=throwaway")
        run("apksigner", "sign", "--ks", key, "--ks-pass", PASSWORD, "--out", self.signed, aligned)
        key.unlink()

    def tell(self):
        said = run("apksigner", "verify", "--verbose", "--min-sdk-version", gradle("minSdk"), self.signed)
        print("\n".join(line for line in said.splitlines() if line.startswith("Verif") and "true" in line or line == "Verifies"))
        badging = run("aapt", "dump", "badging", self.signed)
        print("\n".join(line for line in badging.splitlines() if re.match(" *(package|sdk|target|launchable|uses-gl)", line)))
        for wanted in ("package: name='orv.viewer'", "launchable-activity: name='orv.viewer.ViewerActivity'"):
            if wanted not in badging:
                sys.exit(f"aapt reads something else from the package than {wanted}:\n{badging}")
        with zipfile.ZipFile(self.signed) as archive:
            for entry in archive.infolist():
                print(f"  {entry.file_size:8} {entry.filename}")
        print(f"{self.signed}: {self.signed.stat().st_size} bytes, without classes.dex and the native library, which only Android's own tools can make.")


def compare_scene(build, folder):
    """Ends this script if the package's first scene is not what the converter makes of the sample."""
    made = folder / "windmill.glo"
    run(build / "tools/convert/orv-convert", ROOT / "samples/windmill/windmill.gltf", made)
    if made.read_bytes() != (MAIN / "assets/windmill.glo").read_bytes():
        sys.exit(f"platforms/android/app/src/main/assets/windmill.glo is not what orv-convert makes today: copy {made} there")


def compile_native(androidbuild):
    """Compiles the sources for Android with Clang as well, with the flags of the build."""
    count = 0
    for entry in json.loads((androidbuild / "compile_commands.json").read_text()):
        if not re.search("platforms/android/|pss/src/android/|tools/stage/", entry["file"]):
            continue
        flags = shlex.split(entry["command"])
        while "clang" not in flags[0] and not flags[0].endswith(("++", "++-12")): # what starts the compiler
            flags = flags[1:]
        flags = [flag for flag in flags[1:] if not re.match("-fno-align|-ffat-lto|-fno-inline-functions", flag)]
        run("clang++", "-fsyntax-only", "-Werror", *flags, cwd=entry["directory"])
        count += 1
    print(f"Clang compiles the {count} native sources as well.")
    if count < 10:
        sys.exit("compile_commands.json has too few native sources")


def check_exports(androidbuild, classes):
    """Ends this script unless the library exports every native function of the Java class and nothing else."""
    said = run(JAVA / "javap", "-p", "-cp", classes, "orv.viewer.NativeViewer")
    wanted = {f"Java_orv_viewer_NativeViewer_{name}" for name in re.findall(r" native .*?(\w+)\(", said)}
    said = run("nm", "-D", "--defined-only", androidbuild / "application/liborvviewer.so")
    found = {line.split()[-1] for line in said.splitlines()}
    if wanted != found:
        sys.exit(f"liborvviewer.so exports something else than NativeViewer calls: {sorted(wanted ^ found)}")
    print(f"liborvviewer.so exports the {len(wanted)} functions of NativeViewer and nothing else.")


def make_test_files(build, models, package, folder):
    compare_scene(build, folder)
    run(build / "tools/convert/orv-convert", models / "Collada/duck.dae", folder / "duck.glo")
    pictures = sorted(folder.glob("duck-*"))
    shutil.copy(package.signed, folder / "app.apk")
    with zipfile.ZipFile(folder / "test.apk", "w") as archive:
        archive.writestr("AndroidManifest.xml", "<manifest/>")
        for file in [folder / "windmill.glo", folder / "duck.glo", *pictures]:
            kind = zipfile.ZIP_DEFLATED if file in pictures else zipfile.ZIP_STORED
            archive.write(file, f"assets/{file.name}", kind)
    for name in ("windmill", "duck"):
        run(build / "tools/view/orv-view", folder / f"{name}.glo", "--out", folder / f"{name}.png", "--size", SIZE, "--time", "0")


def run_java(androidbuild, package, folder):
    checks = package.folder / "checks"
    compile_java(checks, [package.standin, package.classes], sources(TESTS / "checks"), "17", "all,-try")
    log = folder / "checks.log"
    command = [JAVA / "java", "-Xcheck:jni", "-Djava.awt.headless=true",
               f"-Djava.library.path={androidbuild}:{androidbuild / 'application'}",
               "-cp", f"{checks}:{package.classes}:{package.standin}", "orv.viewer.Checks", folder, MAIN / "res/values/strings.xml"]
    said = ""
    with open(log, "wb") as errors, subprocess.Popen(
            command, env={**os.environ, "MESA_GLES_VERSION_OVERRIDE": "2.0"}, stdout=subprocess.PIPE, stderr=errors,
            encoding="utf-8", errors="replace") as checking:
        for line in checking.stdout:
            print(line, end="", flush=True)
            said += line
    print(run(*command[:2], f"-Djava.library.path={folder}", *command[4:-3], "orv.viewer.NoLibrary", *command[-2:]), end="")
    said += log.read_text(errors="replace")
    for complaint in ("WARNING in native method", "WARNING: JNI", "FATAL ERROR"):
        if complaint in said:
            sys.exit(f"the virtual machine complains; see {log}")
    if checking.returncode != 0:
        sys.exit(f"exit code {checking.returncode}; what the engine said is in {log}")


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--only-package", action="store_true")
    for name in ("build", "androidbuild", "models"):
        parser.add_argument(name, type=pathlib.Path)
    parser.add_argument("types", type=pathlib.Path, nargs="?")
    options = parser.parse_args()

    package = Package(options.androidbuild.resolve() / "package")
    package.make()
    package.tell()
    if options.only_package:
        return
    print(api.check(JAVA, package.classes, package.standin, options.types, int(gradle("minSdk"))))
    androidbuild = options.androidbuild.resolve()
    compile_native(androidbuild)
    check_exports(androidbuild, package.classes)
    folder = androidbuild / "check"
    shutil.rmtree(folder, ignore_errors=True)
    folder.mkdir()
    make_test_files(options.build.resolve(), options.models, package, folder)
    run_java(androidbuild, package, folder)


if __name__ == "__main__":
    main()
