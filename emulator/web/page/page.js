// The panel on a page: draws the states that the emulator sends, and tells it of keys.

const element = id => document.getElementById(id);
const keyButtons = [...document.querySelectorAll("[data-key]")];
const keyNames = { up: "Up", down: "Down", enter: "Enter", escape: "Escape" };
const panelKeys = { ArrowUp: "up", ArrowDown: "down", Enter: "enter", Escape: "escape" };

let socket = null;
let state = null;     // the last that came
let opened = null;    // how much had been recorded when the page was opened
let font = null;

// The display. All measures are in dots; a dot is a square with a thin gap behind it.

const columns = 16, rows = 2, margin = 4;
const cellWidth = 6, cellHeight = 10, glyphWidth = 5, glyphHeight = 8;
const glassWidth = columns * cellWidth - 1 + 2 * margin;
const glassHeight = rows * cellHeight - 2 + 2 * margin;
const blank = "#a0b83a", dark = "#1d2a10", blinkTime = 400;
const stillness = matchMedia("(prefers-reduced-motion: reduce)");

function drawGlass() {
  const canvas = element("glass");
  const dot = Math.max(2, Math.round(canvas.clientWidth * devicePixelRatio / glassWidth));
  if (canvas.width !== glassWidth * dot) {
    canvas.width = glassWidth * dot;
    canvas.height = glassHeight * dot;
  }
  const pen = canvas.getContext("2d");
  pen.clearRect(0, 0, canvas.width, canvas.height);
  if (!state || !font)
    return;
  const gap = dot >= 4 ? Math.round(dot / 8) || 1 : 0;
  const isOn = stillness.matches || Math.floor(performance.now() / blinkTime) % 2 === 0;
  state.rows.forEach((text, row) => [...text].forEach((character, column) => {
    const hasCursor = isOn && state.cursor && state.cursor[0] === row && state.cursor[1] === column;
    const glyph = font[character];
    for (let y = 0; y < glyphHeight; y++)
      for (let x = 0; x < glyphWidth; x++) {
        const isSet = glyph[y] >> (glyphWidth - 1 - x) & 1;
        pen.fillStyle = isSet !== Number(hasCursor) ? dark : blank;
        pen.fillRect((margin + column * cellWidth + x) * dot,
                     (margin + row * cellHeight + y) * dot, dot - gap, dot - gap);
      }
  }));
}

// The texts beside the display.

// The program counts the polls of a held key: the first one acts, the next four rest, and from then on
// the key repeats or is long.
function meaning(key, polls) {
  if (polls === 0) return "not asked for yet";
  if (polls === 1) return "press";
  if (polls <= 5) return "rest";
  return key === "up" || key === "down" ? "repeat" : "long";
}

function describeKey({ down, counted, polls }) {
  const key = down ?? (polls ? counted : null);
  if (!key)
    return "none is down";
  const own = key === counted ? polls : 0;
  const count = own === 1 ? "1 poll" : `${own} polls`;
  return `${keyNames[key]}${down ? " held" : ""}, ${count}: ${meaning(key, own)}`;
}

let sayTimer = 0, changedSince = null;

// Drawing a screen takes a fifth of a second, and a screen that is half drawn should not be read out.
// A key that repeats changes the display all the time, so the rows are then read out once a second.
function sayRows() {
  changedSince ??= performance.now();
  clearTimeout(sayTimer);
  sayTimer = setTimeout(() => {
    changedSince = null;
    state.rows.forEach((text, row) => {
      const line = element("text").children[row];
      if (line.textContent !== text)
        line.textContent = text;
    });
  }, Math.min(250, Math.max(0, changedSince + 1000 - performance.now())));
}

function notice(text, isAlarm) {
  if (element("notice").textContent !== text)
    element("notice").textContent = text;
  element("notice").classList.toggle("alarm", isAlarm);
  document.body.classList.toggle("lost", isAlarm);
}

function show(newest) {
  const haveRowsChanged = String(state?.rows) !== String(newest.rows);
  state = newest;
  opened ??= state.recorded;
  drawGlass();
  if (haveRowsChanged)
    sayRows();
  for (const button of keyButtons) {
    button.classList.toggle("down", button.dataset.key === state.down);
    button.disabled = state.watch || Boolean(state.ending);
  }
  element("held").textContent = describeKey(state);
  element("load").value = state.load;
  element("percent").textContent = `${state.load} %`;
  element("bytes").textContent = state.bytes;
  element("program").textContent = state.ending ?? state.program;
  element("save").disabled = false;
  if (state.ending)
    notice(`The emulator has ended: ${state.ending}.`, true);
  else
    notice(state.watch ? "A journey is being played: you can watch." : "Connected.", false);
}

// The keys: one is down at a time, by the keyboard key or the pointer that pressed it last.

let presser = null;

function send(text) {
  if (socket?.readyState === WebSocket.OPEN)
    socket.send(text);
}

function press(key, by) {
  presser = by;
  send(`press ${key}`);
}

function release(by) {
  if (presser !== by)
    return;
  presser = null;
  send("release");
}

function letGo() {
  release(presser);
}

// The emulator lets a key go of which it hears nothing for a second and a half.
setInterval(() => presser !== null && send("hold"), 500);

// A drawn key that has the keyboard's focus is pressed by Enter and the space bar, as any button.
function keyOf(event) {
  if (event.ctrlKey || event.altKey || event.metaKey)
    return null;
  const isActivation = event.key === "Enter" || event.key === " ";
  const button = event.target.closest?.("button");
  return button && isActivation ? button.dataset.key : panelKeys[event.key];
}

addEventListener("keydown", event => {
  const key = keyOf(event);
  if (!key)
    return;
  event.preventDefault();
  if (!event.repeat)
    press(key, event.code);
});
addEventListener("keyup", event => {
  if (keyOf(event))
    event.preventDefault();
  release(event.code);
});
addEventListener("blur", letGo);
addEventListener("pagehide", letGo);
document.addEventListener("visibilitychange", () => document.hidden && letGo());

for (const button of keyButtons) {
  const key = button.dataset.key;
  button.addEventListener("pointerdown", event => {
    if (event.button !== 0)
      return;
    button.setPointerCapture(event.pointerId);
    press(key, event.pointerId);
  });
  for (const end of ["pointerup", "pointercancel", "lostpointercapture"])
    button.addEventListener(end, event => release(event.pointerId));
  // The focus stays away, so that Enter and the space bar keep their meaning.
  button.addEventListener("mousedown", event => event.preventDefault());
  button.addEventListener("contextmenu", event => event.preventDefault());
  // A screen reader clicks without any of these.
  button.addEventListener("click", event => {
    if (event.detail !== 0 || presser !== null)
      return;
    press(key, "click");
    release("click");
  });
}

// The recording begins when the emulator starts. The page saves what has been added since the page was
// opened, behind the two lines with which every journey begins.
element("save").addEventListener("click", async () => {
  try {
    const text = state.journey ?? await fetched("journey", "text");
    const head = text.split("\n", 2).join("\n") + "\n";
    const added = new TextEncoder().encode(text).slice(opened);  // which counts bytes
    const link = document.createElement("a");
    link.href = URL.createObjectURL(new Blob([head, added], { type: "text/plain" }));
    link.download = "panel.journey";
    link.click();
    setTimeout(() => URL.revokeObjectURL(link.href), 1000);
  } catch {
    notice("The journey could not be fetched.", true);
  }
});

async function fetched(name, kind) {
  const answer = await fetch(name, { signal: AbortSignal.timeout(patience) });
  if (!answer.ok)
    throw new Error(answer.status);
  return answer[kind]();
}

const retryTime = 1000;
const patience = 4000;  // the emulator sends a state every second, even if nothing has changed
let silenceTimer = 0;

function awaitState() {
  clearTimeout(silenceTimer);
  silenceTimer = setTimeout(() => {
    socket.onclose = socket.onmessage = null;  // closing takes long where nobody answers
    socket.close();
    connectAgain();
  }, patience);
}

function connectAgain() {
  clearTimeout(silenceTimer);
  presser = null;
  if (state?.ending)
    return;
  for (const button of keyButtons) {
    button.classList.remove("down");
    button.disabled = true;
  }
  for (const field of ["held", "percent", "bytes", "program"])
    element(field).textContent = "";
  element("load").value = 0;
  notice("The connection is lost. Trying again … If the emulator was ended, start it anew and " +
         "open the address that it prints.", true);
  setTimeout(connect, retryTime);
}

async function connect() {
  try {
    font ??= await fetched("font.json", "json");
  } catch {
    return connectAgain();
  }
  const address = new URL("panel", location.href);
  address.protocol = "ws:";
  socket = new WebSocket(address);
  socket.onmessage = event => {
    awaitState();
    show(JSON.parse(event.data));
  };
  socket.onclose = connectAgain;
  awaitState();
}

new ResizeObserver(drawGlass).observe(element("glass"));
setInterval(drawGlass, blinkTime / 4);
connect();
