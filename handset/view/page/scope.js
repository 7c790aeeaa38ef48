// SPDX-License-Identifier: Apache-2.0
//
// The page of handset/scope: its controls become messages to the server, what the server tells
// becomes lines and a plot. Nothing is worked out here that the server could know.
"use strict";

const EFFECTS = ["CLICK", "DOUBLE_CLICK", "TICK", "HEAVY_CLICK"];
const PRIMITIVES = ["CLICK", "THUD", "SPIN", "QUICK_RISE", "SLOW_RISE", "QUICK_FALL", "LIGHT_TICK",
    "LOW_TICK", "NOOP"];
const METHODS = ["std getCapabilities", "std getSupportedEffects", "std getSupportedPrimitives",
    "ext performHybridHapticEngine 10000 5,5000,1,3,170", "ext performFifoHapticEngine PATTERN_3",
    "ext performPlaybackEngine true 2 5,100,0 7,80,3", "ext getNumberOfPrebakedHapticPattern",
    "ext supportsHapticEngine", "ext setForceTouchAmplitude 5000", "ext setFolderStatus 1"];
const PATTERN_NODES = ["intensity", "cp_trigger_index", "cp_trigger_queue", "haptic_engine"];
const NODES = {  // by the beginning of the profile's name: directory, nodes
    legacy: ["/sys/class/timed_output/vibrator/", ["enable", ...PATTERN_NODES]],
    leds: ["/sys/class/leds/vibrator/", ["duration", "activate", "state", ...PATTERN_NODES]],
    ff: ["", ["motor"]],
};
const SHOWN_LINES = 2000;
const WINDOW_MS = 6000;

const find = id => document.getElementById(id);
const waiting = new Map();
let socket = null;
let asked = 0;
let tapped = null;     // when the last call was asked for, until its answer is seen
let wrote = null;      // when its first and its last write were seen
let stretches = [];
let faults = [];       // milliseconds of the run's clock
let clock = null;      // {run, here}: the run's clock and this page's, at one moment

function element(name, text) {
    const made = document.createElement(name);
    if (text !== undefined) made.textContent = text;
    return made;
}

// --- to the server ------------------------------------------------------------------------------

function ask(message) {
    return new Promise(resolve => {
        message.id = ++asked;
        waiting.set(message.id, resolve);
        socket.send(JSON.stringify(message));
    });
}

async function call(words) {
    tapped = performance.now();
    wrote = null;
    find("tap").textContent = "";
    find("last").textContent = words.join(" ") + " …";
    const answer = await ask({call: words});
    find("last").textContent = words.join(" ") + (answer.status === 0 ? ": ok" : ": failed");
}

async function phone(words) {
    const answer = await ask({phone: words});
    find("last").textContent = "phone " + words.join(" ") + ": " + (answer.output || "done");
}

// --- from the server ----------------------------------------------------------------------------

function connect() {
    socket = new WebSocket("ws://" + location.host + "/socket");
    socket.onmessage = event => receive(JSON.parse(event.data));
    socket.onclose = () => {
        find("phone").textContent = "the scope has ended, or is gone; reload to try again";
    };
}

function receive(message) {
    if (message.cleared) clear();
    if (message.state) showState(message.state);
    if (message.lines) showLines(message.lines);
    if (message.drive) showDrive(message.drive);
    if (message.findings) find("findings").textContent = message.findings;
    if (message.id !== undefined) {
        waiting.get(message.id)(message);
        waiting.delete(message.id);
    }
}

function clear() {
    stretches = [];
    faults = [];
    clock = null;
    find("lines").querySelector("tbody").replaceChildren();
}

function showState(state) {
    find("phone").textContent = state.phone;
    find("profile").replaceChildren(...state.profiles.map(name => element("option", name)));
    find("profile").value = state.profile;
    const [directory, names] = NODES[state.profile.split("-")[0]] || ["", []];
    find("node").replaceChildren(...names.map(name => {
        const option = element("option", name);
        option.value = directory + name;
        return option;
    }));
}

function isShown(source) {
    const wanted = find("source").value;
    return wanted === "" || source === wanted || !["driver", "log"].includes(source);
}

function showLines(lines) {
    const body = find("lines").querySelector("tbody");
    const box = find("lines");
    const atEnd = box.scrollTop + box.clientHeight >= box.scrollHeight - 30;
    const rows = document.createDocumentFragment();
    for (const line of lines) {
        if (tapped !== null) showTap(line);
        if (line.source === "driver" && line.bad) faults.push(line.us / 1000);
        const row = element("tr");
        row.className = line.source + (line.bad ? " bad" : "");
        row.hidden = !isShown(line.source);
        row.append(element("td", line.us === null ? "" : (line.us / 1e6).toFixed(3)),
            element("td", line.cause.number ? "#" + line.cause.number : ""),
            element("td", line.source), element("td", line.text));
        row.title = line.cause.text;
        rows.append(row);
    }
    body.append(rows);
    while (body.children.length > SHOWN_LINES) body.firstChild.remove();
    if (atEnd) box.scrollTop = box.scrollHeight;
}

// How long the last tap took, to the writes that it caused and to its answer.
function showTap(line) {
    const after = Math.round(performance.now() - tapped);
    if (line.source === "driver") wrote = [wrote === null ? after : wrote[0], after];
    if (line.source !== "answer") return;
    find("tap").textContent = (wrote === null ? "" : "writes after " + wrote[0] + " to " + wrote[1] +
        " ms, ") + "answer after " + after + " ms";
    tapped = null;
}

function showDrive(drive) {
    stretches.length = drive.from;
    stretches.push(...drive.stretches);
    if (drive.now !== null) clock = {run: drive.now / 1000, here: performance.now()};
}

// --- the plot -----------------------------------------------------------------------------------

const plot = new Dygraph(find("drive"), [[0, 0]], {
    labels: ["s", "drive %"], stepPlot: true, fillGraph: true, valueRange: [0, 105],
    colors: ["#0072b2"], strokeWidth: 2, drawPoints: false, legend: "never", axisLabelFontSize: 11,
    ylabel: "drive %", xlabel: "seconds since boot", interactionModel: {},
    underlayCallback: (context, area, graph) => {
        context.strokeStyle = "#b3261e";
        context.lineWidth = 2;
        context.setLineDash([4, 3]);
        for (const fault of faults) {
            const x = graph.toDomXCoord(fault / 1000);
            if (x < area.x || x > area.x + area.w) continue;
            context.beginPath();
            context.moveTo(x, area.y);
            context.lineTo(x, area.y + area.h);
            context.stroke();
        }
        context.setLineDash([]);
    },
});

function draw() {
    requestAnimationFrame(draw);
    if (clock === null) return;
    const now = clock.run + performance.now() - clock.here;
    const from = now - WINDOW_MS;
    const points = [[from / 1000, 0]];
    let level = 0;
    let playing = "";
    for (const [start, end, share, kind, label] of stretches) {
        if (end / 1000 < from || start / 1000 > now) continue;
        points.push([Math.max(start / 1000, from) / 1000, share * 100],
            [Math.min(end / 1000, now) / 1000, end / 1000 > now ? share * 100 : 0]);
        if (end / 1000 > now) [level, playing] = [share, ": " + label + " (" + kind + ")"];
    }
    points.push([now / 1000, level * 100]);
    plot.updateOptions({file: points, dateWindow: [from / 1000, now / 1000]});
    find("now").textContent = "drive " + Math.round(level * 100) + " %" + playing;
}

// --- controls -----------------------------------------------------------------------------------

function addPrimitive(delay, primitive, scale) {
    const row = element("tr");
    const fields = [["Delay in ms", delay], ["Primitive", primitive], ["Scale", scale]].map(
        ([label, value]) => {
            const input = element(label === "Primitive" ? "select" : "input");
            if (label === "Primitive") {
                input.append(...PRIMITIVES.map(name => element("option", name)));
            } else {
                input.type = "number";
                input.step = "any";
            }
            input.value = value;
            input.setAttribute("aria-label", label);
            const cell = element("td");
            cell.append(input);
            return cell;
        });
    const remove = element("button", "×");
    remove.setAttribute("aria-label", "Remove");
    remove.onclick = () => row.remove();
    const last = element("td");
    last.append(remove);
    row.append(...fields, last);
    find("composition").append(row);
}

function filledIn(text) {
    return text.split(" ").flatMap(
        word => word.startsWith("$") ? find(word.slice(1)).value.trim().split(/\s+/) : [word]);
}

for (const effect of EFFECTS) {
    const button = element("button", effect);
    button.onclick = () => call(["std", "perform", effect, find("strength").value]);
    find("effects").append(button);
}
for (const button of document.querySelectorAll("[data-call]")) {
    button.onclick = () => call(filledIn(button.dataset.call));
}
for (const button of document.querySelectorAll("[data-phone]")) {
    button.onclick = () => phone(button.dataset.phone.split(" "));
}
for (const button of document.querySelectorAll("[data-fault]")) {
    button.onclick = () => phone(["fault", "node=" + find("node").value, "op=write",
        ...button.dataset.fault.split(" ")]);
}
find("methods").append(...METHODS.map(words => {
    const option = element("option");
    option.value = words;
    return option;
}));
find("add").onclick = () => addPrimitive(50, "LIGHT_TICK", 1);
find("compose").onclick = () => call(["std", "compose",
    ...[...find("composition").children].map(row => [...row.querySelectorAll("input, select")].map(
        field => field.value).join(",")), "--callback"]);
find("amplitude").oninput = () => { find("amplitude-value").value = find("amplitude").value; };
find("amplitude").onchange = () => call(["std", "setAmplitude", find("amplitude").value]);
find("external").onchange = () => call(["std", "setExternalControl",
    String(find("external").checked)]);
find("any").onsubmit = event => {
    event.preventDefault();
    call(find("words").value.trim().split(/\s+/));
};
find("profile").onchange = () => ask({profile: find("profile").value});
find("doctor").onclick = () => {
    find("findings").textContent = "…";
    ask({doctor: true});
};
find("source").onchange = () => {
    for (const row of find("lines").querySelectorAll("tr")) {
        row.hidden = !isShown(row.className.split(" ")[0]);
    }
};

addPrimitive(0, "CLICK", 1);
addPrimitive(50, "THUD", 0.5);
connect();
draw();
