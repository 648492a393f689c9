// Sources of files: chosen, dropped, or from the server.

/// @return 0 for files that are not shown by themselves; otherwise smaller numbers are preferred.
export function isModel(name) {
    return 1 + [".glo", ".ap", ".sp"].findIndex((suffix) => name.toLowerCase().endsWith(suffix));
}

async function readFile(file, name) {
    return { name, bytes: new Uint8Array(await file.arrayBuffer()) };
}

/// @param list  of a file chooser; files of a folder keep their paths in it.
export function readChosen(list) {
    return Promise.all([...list].map((file) => readFile(file, file.webkitRelativePath || file.name)));
}

/// Calls back for all entries: a reader returns some hundred at a time.
function listFolder(folder) {
    const reader = folder.createReader();
    return new Promise((resolve, reject) => {
        const all = [];
        const readOn = () => reader.readEntries((some) => {
            all.push(...some);
            if (some.length > 0)
                readOn();
            else
                resolve(all);
        }, reject);
        readOn();
    });
}

async function readEntry(entry, path) {
    if (entry.isFile) {
        const file = await new Promise((resolve, reject) => entry.file(resolve, reject));
        return [await readFile(file, path + entry.name)];
    }
    const inside = await listFolder(entry);
    return (await Promise.all(inside.map((each) => readEntry(each, `${path}${entry.name}/`)))).flat();
}

/// @param transfer  of a drop; only valid while the event is handled.
export async function collectDropped(transfer) {
    const entries = [...transfer.items].filter((item) => item.kind === "file")
        .map((item) => (item.webkitGetAsEntry ? item.webkitGetAsEntry() : null));
    if (entries.length === 0 || entries.includes(null))
        return readChosen(transfer.files);
    return (await Promise.all(entries.map((entry) => readEntry(entry, "")))).flat();
}

/// The name of the file that an address leads to.
export function nameFile(url) {
    const name = url.pathname.slice(url.pathname.lastIndexOf("/") + 1);
    try {
        return decodeURIComponent(name);
    } catch {
        return name; // "100%.glo"
    }
}

export async function fetchFile(url) {
    const name = nameFile(url);
    let answer;
    try {
        answer = await fetch(url);
    } catch (error) {
        throw new Error(`${name} cannot be fetched: ${error.message}`);
    }
    if (!answer.ok)
        throw new Error(`${name} cannot be fetched: ${answer.status} ${answer.statusText}`);
    return new Uint8Array(await answer.arrayBuffer());
}
