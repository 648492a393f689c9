"""Compares what Java classes use of Android with the declarations of the npm package @nativescript/types-android, which its
authors generate from Android's own class files. The declarations are TypeScript, which has one type for all numbers. Compared are
names, classes, parameters, results, what is static, the values of constants, and the level at which something was added.
"""
import pathlib
import re
import subprocess
import sys

NUMBERS = {"int", "long", "float", "double", "short", "byte", "char"}
PLATFORM = re.compile(r"(?:android|javax/microedition)/")
MEMBER = re.compile(r"public (static )?(?:constructor|(\w+))(\(.*\))?(?:: (.*?))?;$")


class Type:
    def __init__(self, bases, since):
        self.bases = bases
        self.since = since
        self.members = {}  # by name, each (is static, parameters or None, result, level)


def read_declarations(file):
    """@return every class and interface by its name, with dots."""
    types, path, level = {}, [], 1
    for line in file.read_text().splitlines():
        text = line.strip()
        since = re.search(r"@since (\d+)", text)
        opened = re.match(r"(?:declare|export) (?:module|namespace) ([\w.]+) \{", text)
        declared = re.match(r"export (?:abstract )?(?:class|interface) (\w+)(?:<.*?>)?(?: extends (.*?))?(?: implements (.*?))? \{$", text)
        if since:
            level = int(since.group(1))
        elif opened:
            path.append(opened.group(1))
        elif declared:
            name = ".".join([part for part in path if part] + [declared.group(1)])
            bases = [re.sub("<.*", "", base).strip() for base in re.split(r",\s*(?![^<]*>)", ",".join(filter(None, declared.groups()[1:])))]
            types.setdefault(name, Type([], level)).bases += [base for base in bases if base]
            path.append("")  # what is inside belongs to this class
            current = (name, len(path))
            level = 1
        else:
            member = MEMBER.match(text) if path and path[-1] == "" and len(path) == current[1] else None
            if member:
                add_member(types[current[0]], member, level)
            if text.endswith("{"):
                path.append("?")
            elif text.startswith("}"):
                path.pop()
            if not text.startswith(("*", "/**")) or member:
                level = 1
    return types


def add_member(owner, member, level):
    static, name, parameters, result = member.groups()
    found = None
    if parameters is not None:
        inner = parameters[1:-1]
        found = [re.sub(r"^\.{0,3}\w+\??: ", "", part) for part in re.split(r",\s*(?![^<]*>)", inner) if part]
    owner.members.setdefault(name or "<init>", []).append((bool(static), found, result or "void", level))


def simple(name):
    """A type of the declarations, without what may be null and what it is generic over."""
    return re.sub(r"<.*>", "", name.replace(" | null", "").strip())


def from_descriptor(descriptor):
    """@return the parameters and the result of a Java descriptor, as the declarations name them."""
    names = {"V": "void", "Z": "boolean"}
    types = []
    for dimensions, letter, name in re.findall(r"(\[*)(?:([VZBCSIJFD])|L([^;]+);)", descriptor):
        text = names.get(letter, "number") if letter else name.replace("/", ".").replace("$", ".")
        text = {"java.lang.String": "string", "java.lang.CharSequence": "string", "java.lang.Object": "any"}.get(text, text)
        types.append("androidNative.Array" if dimensions else text)
    return types[:-1], types[-1]


class Android:
    def __init__(self, types, level):
        self.types = types
        self.level = level
        self.used = 0

    def ancestors(self, name):
        """@return a type and all types that it derives from; nothing if it is not declared."""
        found, queue = [], [name]
        while queue:
            name = queue.pop(0)
            if name in self.types and name not in found:
                found.append(name)
                queue += self.types[name].bases
        return found

    def fault(self, name, member, static, parameters, result):
        """@return why there is no such member at the level, or None. parameters is None for a field, static for unknown."""
        candidates = [entry for base in self.ancestors(name) for entry in self.types[base].members.get(member, [])
                      if member != "<init>" or base == name]
        for is_static, found, returned, since in candidates:
            alike = found is None and parameters is None or found is not None and parameters is not None and \
                [simple(part) for part in found] == parameters
            if alike and (static is None or is_static == static) and (found is None or simple(returned) == result or member == "<init>"):
                if since > self.level:
                    return f"added at level {since}"
                self.used += 1
                return None
        shown = "; ".join(f"{'static ' if entry[0] else ''}{entry[1]}: {entry[2]}" for entry in candidates)
        return f"declared otherwise ({shown})" if candidates else "not declared"


def javap(java, folder, *names):
    return subprocess.run([java / "javap", "-v", "-p", "-cp", folder, *names], check=True, capture_output=True, text=True).stdout


def class_names(folder):
    return [str(path.relative_to(folder).with_suffix("")).replace("/", ".") for path in sorted(folder.rglob("*.class"))]


def check_uses(android, said, own):
    """Every reference of the classes that javap has described. own: the platform class that one of ours derives from."""
    static = set(re.findall(r"(?:invokestatic|getstatic|putstatic)\s+#\d+\s+// (?:Interface)?(?:Method|Field) (\S+)", said))
    for kind, reference in set(re.findall(r"= (Methodref|InterfaceMethodref|Fieldref)\s+\S+\s+// (\S+)", said)):
        match = re.match(r'"?([^."]+)"?\."?([^:"]+)"?:(.+)', reference)
        owner, member, descriptor = match.groups()
        owners = [owner] if PLATFORM.match(owner) else own.get(owner, []) if member != "<init>" else []
        parameters, result = from_descriptor(descriptor)
        faults = [android.fault(name.replace("/", ".").replace("$", "."), member, reference in static,
                                None if kind == "Fieldref" else parameters, result) for name in owners]
        if faults and all(faults) and (PLATFORM.match(owner) or member not in own[owner + "!"]):
            yield f"{reference}: {faults[0]}"


def read_own(said):
    """Of our classes: the platform's types that each derives from, and the names that it declares."""
    own = {}
    for part in re.split(r"(?m)^Classfile ", said)[1:]:
        name = re.search(r"this_class: #\d+\s+// (\S+)", part).group(1)
        bases = re.findall(r"(?:super_class): #\d+\s+// (\S+)", part)
        head = re.search(r"(?m)^(?:public |final |abstract |synchronized )*(?:class|interface) .*$", part).group(0)
        implemented = re.search(r" implements (.*)$", head)
        bases += [base.strip().replace(".", "/") for base in re.sub("<.*?>", "", implemented.group(1)).split(",")] if implemented else []
        own[name] = [base for base in bases if PLATFORM.match(base)]
        own[name + "!"] = set(re.findall(r"(?m)^  (?:[\w.$\[\]<>]+ )*?([\w$]+)\(", part)) | set(re.findall(r"(?m)^  [\w.$\[\] ]+ ([\w$]+);$", part))
    return own


def check_overrides(android, java, own, standin):
    """The platform must have each method that our classes override, as the stand-ins declare it."""
    for name, bases in own.items():
        for base in bases if not name.endswith("!") else []:
            binary = base.replace("/", ".")
            if not (standin / (base + ".class")).exists() and "." not in base:
                binary = re.sub(r"\.(\w+)$", r"$\1", binary)
            said = javap(java, standin, binary)
            for member, descriptor in re.findall(r"(?m)^  (?:[\w.$\[\]]+ )*(\w+)\([^\n]*\n\s+descriptor: (\S+)", said):
                if member in own[name + "!"] and not member.startswith("standIn"):
                    fault = android.fault(binary.replace("$", "."), member, False, *from_descriptor(descriptor))
                    if fault:
                        yield f"{name} overrides {binary}.{member}{descriptor}: {fault}"


def check_constants(android, said):
    """The compiler copies constants of the stand-ins into our classes, so their values must be Android's."""
    count = 0
    for part in re.split(r"(?m)^Classfile ", said)[1:]:
        owner = re.search(r"this_class: #\d+\s+// (\S+)", part).group(1)
        if not PLATFORM.match(owner):
            continue
        for name, value in re.findall(r"(?m)^  public static final [\w.]+ (\w+);\n(?:    .*\n)*?    ConstantValue: \w+ (.*)$", part):
            if name.startswith("STAND_IN"):
                continue
            entries = [entry for base in android.ancestors(re.sub(r"[/$]", ".", owner)) for entry in android.types[base].members.get(name, [])]
            values = {entry[2].strip('"') for entry in entries}
            count += 1
            if value not in values:
                yield f"{owner}.{name} is {value} in the stand-in, {sorted(values)} in Android"
    if count < 15:
        yield f"only {count} constants were found in the stand-ins"


def check(java, classes, standin, package, level):
    """@return a line that says how much was compared. Ends the program if something differs."""
    file = next(iter(pathlib.Path(package).glob("lib/android/android-platform-*merged.d.ts")))
    android = Android(read_declarations(file), level)
    said = javap(java, classes, *class_names(classes))
    own = read_own(said)
    faults = sorted(check_uses(android, said, own)) + sorted(check_overrides(android, java, own, standin))
    used = android.used
    faults += sorted(check_constants(android, javap(java, standin, *class_names(standin))))
    if faults or used < 60:
        sys.exit("\n".join(faults) + f"\n{len(faults)} differences from {file.name}, {used} uses compared")
    return f"{used} uses of Android's classes are declared as such by {file.name}, at level {level}; the constants have its values."
