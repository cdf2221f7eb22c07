// The zinmox dashboard page: the cores of the target, names, outputs and inputs of the live
// core, and a waveform of the latest reads. Reads come from the server's shared reader through
// one event stream; every change goes through the JSON API.
"use strict";

const STEPS = 16;          // steps of a pulse train
const KEEP = 1000;         // reads kept for the waveform (the server keeps as many)
const FLASH_MS = 400;      // how long an activity mark stays lit

const state = { core: null, version: 0, details: null, samples: [], lastSeq: 0, paused: false,
  trains: {} };
const $ = (sel, root = document) => root.querySelector(sel);
const el = (tag, attrs = {}, ...children) => {
  const node = document.createElement(tag);
  for (const [k, v] of Object.entries(attrs)) {
    if (k.startsWith("on")) node.addEventListener(k.slice(2), v); else node.setAttribute(k, v);
  }
  for (const child of children) node.append(child);
  return node;
};

function say(text) { $("#message").textContent = text || ""; }

async function api(method, path, body) {
  const options = { method, headers: {} };
  if (body !== undefined) {
    options.headers["Content-Type"] = "application/json";
    options.body = JSON.stringify(body);
  }
  const response = await fetch(path, options);
  const data = await response.json().catch(() => ({}));
  if (!response.ok) throw new Error(data.error || response.statusText);
  return data;
}

async function act(work) {
  try { say(""); return await work(); } catch (error) { say(error.message); return null; }
}

// Hex text <-> bits (bit 0 the least significant).
const hexBits = (hex, width) => {
  const bits = [];
  for (let i = 0; i < width; i++) {
    const digit = parseInt(hex[hex.length - 1 - (i >> 2)] || "0", 16) || 0;
    bits.push((digit >> (i & 3)) & 1);
  }
  return bits;
};
const digitsFor = (width) => Math.ceil(width / 4);
const anySet = (hex) => !!hex && /[1-9a-f]/i.test(hex);

// ---- cores and names ---------------------------------------------------------------------

async function loadTarget() {
  const target = await api("GET", "/api/target");
  $("#target").textContent = target.target;
  const body = $("#cores tbody");
  const select = $("#core-select");
  body.replaceChildren();
  select.replaceChildren(el("option", { value: "" }, "(choose)"));
  for (const c of target.cores) {
    const cells = c.mox
      ? [c.core, "MOX", c.version, c.async_output_count, c.sync_output_count,
         c.async_input_count, c.sync_input_count]
      : [c.core, "type " + c.core_type, c.version, "-", "-", "-", "-"];
    const row = el("tr", { "data-core": c.core }, ...cells.map((v) => el("td", {}, String(v))));
    if (c.mox) {
      row.addEventListener("click", () => chooseCore(c.core));
      select.append(el("option", { value: c.core }, c.core));
    }
    body.append(row);
  }
  applyLive(target.live);
  if (!target.live.core) {
    const first = target.cores.find((c) => c.mox);
    if (first) await chooseCore(first.core);
  }
}

async function chooseCore(core) {
  await act(() => api("POST", "/api/live", { core }));
}

function applyLive(live) {
  state.paused = live.paused;
  $("#pause").textContent = live.paused ? "Resume" : "Pause";
  if (document.activeElement !== $("#rate")) $("#rate").value = live.rate_hz;
  $("#core-select").value = live.core || "";
  for (const row of document.querySelectorAll("#cores tbody tr")) {
    row.classList.toggle("live", row.dataset.core === live.core);
  }
  if (live.core !== state.core) {
    state.core = live.core;
    state.samples = [];
    state.lastSeq = 0;
    state.version = -1;
    $("#inputs").replaceChildren();
  }
}

async function loadCore() {
  if (!state.core) return;
  const details = await api("GET", "/api/cores/" + state.core);
  state.details = details;
  const info = $("#info tbody");
  info.replaceChildren();
  for (const [key, value] of Object.entries(details.info)) {
    if (key !== "core" && key !== "mox") {
      info.append(el("tr", {}, el("td", {}, key), el("td", {}, String(value))));
    }
  }
  const names = $("#names tbody");
  names.replaceChildren();
  for (const n of details.names) {
    const remove = n.reserved ? "" : el("button", { type: "button", "data-undefine": n.name,
      onclick: () => act(() => api("POST", `/api/cores/${state.core}/undefine`,
        { name: n.name, port: n.port })) }, "Remove");
    names.append(el("tr", {}, el("td", {}, n.name), el("td", {}, n.port),
      el("td", {}, n.bits), el("td", {}, remove)));
  }
  // Controls are rebuilt only when the names change, so a write elsewhere does not reset them.
  const shape = JSON.stringify([state.core, details.names]);
  if (shape !== state.shape) {
    state.shape = shape;
    buildOutputs(details);
  }
}

// ---- outputs -----------------------------------------------------------------------------

function write(values) {
  return act(() => api("POST", `/api/cores/${state.core}/write`, { values }));
}

function switchRow(n, written) {
  const box = el("input", { type: "checkbox", class: "switch", "data-output": n.name });
  box.checked = anySet(written);
  box.addEventListener("change", () => write({ [n.name]: box.checked ? "1" : "0" }));
  return [box];
}

function hexRow(n, written) {
  const field = el("input", { class: "hex", "data-output": n.name, maxlength: 2 + digitsFor(n.width),
    placeholder: "0".repeat(digitsFor(n.width)) });
  field.value = written || "";
  const send = () => write({ [n.name]: field.value.trim() });
  field.addEventListener("keydown", (e) => { if (e.key === "Enter") send(); });
  return [field, el("button", { type: "button", "data-write": n.name, onclick: send }, "Write")];
}

// A pulse train: 16 steps, each a level (1 bit: a toggle) or a hex value (buses).
function trainRow(n, written) {
  const bytes = Math.ceil(n.width / 8);
  const steps = state.trains[n.name] || new Array(STEPS).fill(0);
  if (written && !state.trains[n.name]) {
    for (let t = 0; t < STEPS; t++) {
      const end = written.length - t * 2 * bytes;
      steps[t] = parseInt(written.slice(Math.max(0, end - 2 * bytes), Math.max(0, end)) || "0", 16) || 0;
    }
  }
  state.trains[n.name] = steps;
  const cells = el("div", { class: "train", "data-train": n.name });
  for (let t = 0; t < STEPS; t++) {
    if (n.width === 1) {
      const b = el("button", { type: "button", "data-step": t, title: "step " + t },
        String(steps[t]));
      b.classList.toggle("on", steps[t] === 1);
      b.addEventListener("click", () => {
        steps[t] ^= 1; b.textContent = String(steps[t]); b.classList.toggle("on", steps[t] === 1);
      });
      cells.append(b);
    } else {
      const f = el("input", { "data-step": t, title: "step " + t, value: steps[t].toString(16) });
      f.addEventListener("change", () => { steps[t] = parseInt(f.value, 16) || 0; });
      cells.append(f);
    }
  }
  const send = () => {
    let text = "";
    for (let t = STEPS - 1; t >= 0; t--) text += steps[t].toString(16).padStart(2 * bytes, "0");
    write({ [n.name + ".pulsetrain"]: text });
  };
  return [cells, el("button", { type: "button", "data-train-write": n.name, onclick: send },
    "Play")];
}

function buildOutputs(details) {
  const box = $("#outputs");
  box.replaceChildren();
  for (const n of details.names) {
    if (n.port !== "async_out" && n.port !== "sync_out") continue;
    const key = n.name.toLowerCase();
    const written = details.outputs[key] || details.outputs[key + ".pulsetrain"];
    const parts = n.port === "sync_out" ? trainRow(n, details.outputs[key + ".pulsetrain"])
      : n.width === 1 ? switchRow(n, written) : hexRow(n, written);
    box.append(el("div", { class: "row" },
      el("span", { class: "label", title: `${n.port} ${n.bits}` }, n.name), ...parts));
  }
}

// ---- inputs ------------------------------------------------------------------------------

function inputRow(input) {
  const row = el("div", { class: "row", "data-input": input.name },
    el("span", { class: "label" }, input.name), el("div", { class: "leds" }),
    el("span", { class: "value" }), el("span", { class: "act up", title: "rose" }, "\u25B2"),
    el("span", { class: "act down", title: "fell" }, "\u25BC"));
  const leds = $(".leds", row);
  for (let i = Math.min(input.width, 16) - 1; i >= 0; i--) {
    leds.append(el("span", { class: "led", "data-bit": i }));
  }
  return row;
}

function flash(node, cls) {
  node.classList.add(cls);
  node.dataset.flashes = String(Number(node.dataset.flashes || 0) + 1);
  clearTimeout(node.flashTimer);
  node.flashTimer = setTimeout(() => node.classList.remove(cls), FLASH_MS);
}

function showInputs(inputs) {
  const box = $("#inputs");
  const names = new Set(inputs.map((input) => input.name));
  for (const row of [...box.children]) if (!names.has(row.dataset.input)) row.remove();
  for (const input of inputs) {
    let row = box.querySelector(`[data-input="${CSS.escape(input.name)}"]`);
    if (!row) { row = inputRow(input); box.append(row); }
    $(".value", row).textContent = input.value;
    const bits = hexBits(input.value, input.width);
    for (const led of row.querySelectorAll(".led")) {
      led.classList.toggle("on", bits[Number(led.dataset.bit)] === 1);
    }
    if (anySet(input.activity_up) || anySet(input.sync_activity_up)) flash($(".up", row), "flash-up");
    if (anySet(input.activity_down) || anySet(input.sync_activity_down)) {
      flash($(".down", row), "flash-down");
    }
  }
}

// ---- waveform ----------------------------------------------------------------------------

function drawWaveform() {
  const canvas = $("#waveform");
  canvas.dataset.samples = String(state.samples.length);
  const ctx = canvas.getContext("2d");
  const shown = state.samples.slice(-200);
  const names = shown.length ? shown[shown.length - 1].inputs : [];
  const laneH = 28;
  canvas.height = Math.max(60, names.length * laneH + 10);
  ctx.fillStyle = "#10161d";
  ctx.fillRect(0, 0, canvas.width, canvas.height);
  const left = 130;
  const dx = (canvas.width - left - 10) / 200;
  ctx.font = "12px monospace";
  names.forEach((input, lane) => {
    const top = 6 + lane * laneH;
    ctx.fillStyle = "#ccd";
    ctx.fillText(input.name, 6, top + 16);
    ctx.strokeStyle = input.width === 1 ? "#5fd35f" : "#4dabf7";
    ctx.beginPath();
    let previous = null;
    let textEnd = 0;  // bus values are written only where the previous one ends
    shown.forEach((sample, i) => {
      const match = sample.inputs.find((x) => x.name === input.name);
      const value = match ? match.value : "?";
      const x = left + i * dx;
      if (input.width === 1) {
        const y = top + (parseInt(value, 16) & 1 ? 4 : 20);
        if (i === 0) ctx.moveTo(x, y); else ctx.lineTo(x, y);
        ctx.lineTo(x + dx, y);
      } else {
        if (value !== previous) {
          ctx.moveTo(x, top + 4); ctx.lineTo(x, top + 20);
          if (x >= textEnd) {
            ctx.fillStyle = "#dde";
            ctx.fillText(value, x + 2, top + 16);
            textEnd = x + ctx.measureText(value).width + 6;
          }
        }
        ctx.moveTo(x, top + 4); ctx.lineTo(x + dx, top + 4);
        ctx.moveTo(x, top + 20); ctx.lineTo(x + dx, top + 20);
      }
      previous = value;
    });
    ctx.stroke();
  });
}

// ---- the event stream --------------------------------------------------------------------

async function onEvent(event) {
  const update = JSON.parse(event.data);
  applyLive(update.live);
  $("#status").textContent = update.error ? "read failed" : state.paused ? "paused" : "live";
  if (update.error) say(update.error);
  if (update.version !== state.version && state.core) {
    state.version = update.version;
    await act(loadCore);
  }
  const fresh = update.samples.filter((s) => s.seq > state.lastSeq);
  if (!fresh.length) return;
  state.lastSeq = fresh[fresh.length - 1].seq;
  state.samples.push(...fresh);
  if (state.samples.length > KEEP) state.samples.splice(0, state.samples.length - KEEP);
  for (const sample of fresh) showInputs(sample.inputs);
  drawWaveform();
}

function connect() {
  const source = new EventSource("/api/events");
  let queue = Promise.resolve();
  source.onmessage = (event) => { queue = queue.then(() => onEvent(event)); };
  source.onerror = () => { $("#status").textContent = "reconnecting"; };
}

function wireControls() {
  $("#core-select").addEventListener("change", (e) => e.target.value && chooseCore(e.target.value));
  $("#rate").addEventListener("change", (e) =>
    act(() => api("POST", "/api/live", { rate_hz: Number(e.target.value) })));
  $("#pause").addEventListener("click", () =>
    act(() => api("POST", "/api/live", { paused: !state.paused })));
  $("#define-form").addEventListener("submit", (e) => {
    e.preventDefault();
    act(() => api("POST", `/api/cores/${state.core}/define`, { name: $("#define-name").value.trim(),
      port: $("#define-port").value, bits: $("#define-bits").value.trim() }));
  });
}

wireControls();
act(loadTarget).then(connect);
