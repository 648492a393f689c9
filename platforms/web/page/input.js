// Translates pointers, wheel and keys to commands of the page.

const STEP = 0.9; // factor of the distance for one zoom step
const WHEEL_STEP = 100; // pixels
const LINE = 16; // pixels of a line, for wheels that scroll by lines
const KEY_TURN = 12; // pixels
const DOUBLE_TAP_MS = 300;
const DOUBLE_TAP_PIXELS = 25;

const distance = (one, other) => Math.hypot(one.x - other.x, one.y - other.y);
const middle = (one, other) => ({ x: (one.x + other.x) / 2, y: (one.y + other.y) / 2 });

/// One pointer turns, with another button or shift it moves; two move and pinch.
export function listenToHands(canvas, run) {
    const pointers = new Map(); // their positions
    let pinched = null; // the last positions of two pointers
    let tap = { time: -Infinity, x: 0, y: 0 };

    const place = (event) => {
        const box = canvas.getBoundingClientRect();
        return { x: event.clientX - box.left, y: event.clientY - box.top, pans: event.shiftKey || (event.buttons & 6) !== 0 };
    };
    const moveOne = (from, to) => run(to.pans ? "pan" : "turn", to.x - from.x, to.y - from.y);
    // Both together: one after the other would move the view during a pinch.
    const followTwo = () => {
        const now = [...pointers.values()];
        if (!pinched || now.length !== 2)
            return;
        const before = middle(...pinched);
        const after = middle(...now);
        const factor = distance(...now) / distance(...pinched);
        pinched = now;
        run("pan", after.x - before.x, after.y - before.y);
        if (Number.isFinite(factor) && factor > 0)
            run("zoom", Math.log(factor) / -Math.log(STEP));
    };
    const countTwo = () => {
        pinched = pointers.size === 2 ? [...pointers.values()] : null;
    };

    canvas.addEventListener("pointerdown", (event) => {
        canvas.focus({ preventScroll: true });
        canvas.setPointerCapture(event.pointerId);
        pointers.set(event.pointerId, place(event));
        countTwo();
    });
    canvas.addEventListener("pointermove", (event) => {
        const from = pointers.get(event.pointerId);
        if (!from)
            return;
        const to = place(event);
        pointers.set(event.pointerId, to);
        if (pointers.size === 1)
            moveOne(from, to);
        else
            requestAnimationFrame(followTwo); // once per frame
    });
    const end = (event) => {
        followTwo();
        pointers.delete(event.pointerId);
        countTwo();
    };
    canvas.addEventListener("pointerup", end);
    canvas.addEventListener("pointercancel", end);
    canvas.addEventListener("pointerup", (event) => {
        if (event.pointerType !== "touch")
            return;
        const at = { time: event.timeStamp, ...place(event) };
        const isDouble = at.time - tap.time < DOUBLE_TAP_MS && distance(at, tap) < DOUBLE_TAP_PIXELS;
        tap = isDouble ? { time: -Infinity, x: 0, y: 0 } : at;
        if (isDouble)
            run("closer", at.x, at.y);
    });
    canvas.addEventListener("dblclick", (event) => {
        const at = place(event);
        run("closer", at.x, at.y);
    });
    canvas.addEventListener("contextmenu", (event) => event.preventDefault());
    canvas.addEventListener("wheel", (event) => {
        event.preventDefault();
        const pixels = event.deltaY * (event.deltaMode === WheelEvent.DOM_DELTA_LINE ? LINE : 1);
        run("zoom", -pixels / (event.ctrlKey ? WHEEL_STEP / 10 : WHEEL_STEP)); // ctrl: a pinched trackpad
    }, { passive: false });
}

const sides = { ArrowLeft: [-1, 0], ArrowRight: [1, 0], ArrowUp: [0, -1], ArrowDown: [0, 1] };
const keys = {
    " ": ["play"], ".": ["step", 1], ",": ["step", -1], Home: ["share", 0], End: ["share", 1],
    "+": ["zoom", 1], "=": ["zoom", 1], "-": ["zoom", -1], "]": ["speed", 2], "[": ["speed", 0.5],
    f: ["all"], l: ["loop"], b: ["backdrop"], i: ["info"], h: ["help"], "?": ["help"], Escape: ["away"],
    c: ["camera", 1], C: ["camera", -1], n: ["clip", 1], N: ["clip", -1],
};

function findCommand(event) {
    const side = sides[event.key];
    if (side)
        return [event.shiftKey ? "pan" : "turn", side[0] * KEY_TURN, side[1] * KEY_TURN];
    return keys[event.key] || (event.key.length === 1 && keys[event.key.toLowerCase()]);
}

/// Keys go to the view, except those that the focused button, slider or list uses itself.
export function listenToKeys(run) {
    addEventListener("keydown", (event) => {
        const command = findCommand(event);
        const isOnView = event.target === document.body || event.target.id === "view";
        const isOwn = !isOnView && (event.target.tagName === "SELECT" || event.key.length > 1 && event.key !== "Escape" || event.key === " ");
        if (!command || isOwn || event.ctrlKey || event.metaKey || event.altKey)
            return;
        event.preventDefault();
        run(...command);
    });
}
