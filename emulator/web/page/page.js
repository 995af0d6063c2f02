// The panel on a page: draws the states that the emulator sends, and tells it of keys.

const element = id => document.getElementById(id);
// What has not changed stays as it is, and is not read out again.
const put = (id, text) => element(id).textContent !== text && (element(id).textContent = text);
const keyButtons = [...document.querySelectorAll("[data-key]")];
const keyNames = { up: "Up", down: "Down", enter: "Enter", escape: "Escape" };
const panelKeys = { ArrowUp: "up", ArrowDown: "down", Enter: "enter", Escape: "escape" };

let socket = null;
let state = null;     // the last that came
let own = {};         // what holds for this page alone, as the first state has said it
let opened = 0;       // how much had been recorded when the page was opened
let glass = null;     // the display's measures and colours, and its characters' dots

// The display. A dot is a square with a thin gap behind it, and as many whole pixels of the screen as
// fit with another dot at either side: pixels that are stretched would make dots uneven.

const blinkTime = 400;
const stillness = matchMedia("(prefers-reduced-motion: reduce)");
let dot = 0, blinkTimer = 0;

function fitGlass() {
  if (!glass)
    return;
  const canvas = element("dots"), ratio = devicePixelRatio;
  dot = Math.max(1, Math.floor(element("glass").clientWidth * ratio / (glass.size[0] + 2)));
  [canvas.width, canvas.height] = glass.size.map(dots => dots * dot);
  canvas.style.width = `${canvas.width / ratio}px`;
  canvas.style.translate = "0";
  const { left, top } = canvas.getBoundingClientRect();
  canvas.style.translate = [left, top].map(side => `${Math.round(side * ratio) / ratio - side}px`).join(" ");
  drawGlass();
}

function drawGlass() {
  clearTimeout(blinkTimer);
  if (!state || !dot)
    return;
  const { size, pitch, glyph, glyphs, background, blankDot, darkDot } = glass;
  const pen = element("dots").getContext("2d");
  const gap = dot >= 4 ? Math.round(dot / 8) || 1 : 0;
  const isOn = stillness.matches || Math.floor(performance.now() / blinkTime) % 2 === 0;
  pen.fillStyle = background;
  pen.fillRect(0, 0, size[0] * dot, size[1] * dot);
  state.rows.forEach((text, row) => [...text].forEach((character, column) => {
    const hasCursor = isOn && state.cursor?.[0] === row && state.cursor[1] === column;
    for (let y = 0; y < glyph[1]; y++)
      for (let x = 0; x < glyph[0]; x++) {
        const isSet = glyphs[character][y] >> (glyph[0] - 1 - x) & 1;
        pen.fillStyle = isSet !== Number(hasCursor) ? darkDot : blankDot;
        pen.fillRect((column * pitch[0] + x) * dot, (row * pitch[1] + y) * dot, dot - gap, dot - gap);
      }
  }));
  if (state.cursor && !stillness.matches)
    blinkTimer = setTimeout(drawGlass, blinkTime - performance.now() % blinkTime);
}

// The program counts the polls of a held key: the first one acts, the next four rest, and from then on
// the key repeats or is long.
function meaning(key, polls) {
  if (polls <= 1) return polls ? "press" : "not asked for yet";
  if (polls <= 5) return "rest";
  return key === "up" || key === "down" ? "repeat" : "long";
}

const isOthers = ({ down, presser }) => Boolean(down) && presser !== null && presser !== own.page;

function describeKey(state) {
  const key = state.down ?? (state.polls ? state.counted : null);
  if (!key)
    return "No key is down";
  const polls = key === state.counted ? state.polls : 0;
  const held = state.down ? ` held${isOthers(state) ? " in another browser" : ""}` : "";
  return `${keyNames[key]}${held}, ${polls} poll${polls === 1 ? "" : "s"}: ${meaning(key, polls)}`;
}

// An address has its octets in four columns each; elsewhere, a character is what the cursor stands on.
function describeCursor({ rows, cursor }) {
  if (!cursor)
    return "";
  const [row, column] = cursor, octet = Math.floor(column / 4);
  if (/^[ \d]{3}(\.[ \d]{3}){3} $/.test(rows[row]))
    return `Cursor on octet ${octet + 1}: ${rows[row].slice(4 * octet, 4 * octet + 3).trim()}`;
  return `Cursor on position ${column + 1}: ${rows[row][column].trim() || "blank"}`;
}

let sayTimer = 0, changedSince = null;

// Drawing a screen takes a fifth of a second, and a screen that is half drawn should not be read out.
// While a key is down it may change all the time, so it is read when the key has come up.
function sayRows() {
  clearTimeout(sayTimer);
  changedSince = state.down ? null : changedSince ?? performance.now();
  if (state.down)
    return;
  sayTimer = setTimeout(() => {
    changedSince = null;
    [...state.rows, describeCursor(state)].forEach((text, row) => put(`line${row}`, text));
  }, Math.min(250, Math.max(0, changedSince + 1000 - performance.now())));
}

function tell(notice, trouble = "") {
  put("notice", notice);
  put("trouble", trouble);
  document.body.classList.toggle("lost", trouble !== "");
}

const watching = { journey: "A journey is being played: you can watch.",
                   address: "You can watch: this address presses no keys." };

function show(newest) {
  const before = state;
  state = newest;
  if ("page" in newest)
    own = newest;
  if (before?.appliance !== state.appliance) {
    opened = before ? 0 : state.recorded;
    put("saved", "");
  }
  const sight = ({ rows, cursor }) => [...rows, cursor?.[0], cursor?.[1]];
  const hasChanged = !before || sight(state).some((part, k) => part !== sight(before)[k]);
  if (hasChanged)
    drawGlass();
  if (hasChanged || before.down !== state.down)
    sayRows();
  for (const button of keyButtons) {
    button.classList.toggle("down", button.dataset.key === state.down);
    button.classList.toggle("others", isOthers(state));
    button.disabled = !isLive();
  }
  put("held", describeKey(state));
  put("load", `${state.load} %`);
  put("bytes", state.bytes);
  put("program", state.ending ?? state.program);
  element("save").disabled = false;
  element("anew").disabled = !own.canStartOver || !isLive();
  put("recording", state.isFull ? "The recording is full: nothing more is added to it." : "");
  if (state.ending)
    tell("", `The emulator has ended: ${state.ending}.`);
  else
    tell(state.isStartingOver ? "A fresh appliance is started …" : watching[own.watch] ?? "Connected.");
}

// The keys: one is down at a time, by the keyboard key or the pointer that pressed it last.

let presser = null;

const isOpen = () => socket?.readyState === WebSocket.OPEN;
const isLive = () => isOpen() && Boolean(state) && !own.watch && !state.ending && !state.isStartingOver;
const send = text => isOpen() && socket.send(text);

function press(key, by) {
  presser = by;
  send(`press ${key}`);
}

function release(by) {
  if (presser === null || presser !== by)
    return;
  presser = null;
  send("release");
}

// The emulator lets a key go of which it hears nothing for a second and a half.
setInterval(() => presser !== null && send("hold"), 500);

// A button that has the keyboard's focus is pressed by Enter and the space bar, as anywhere.
function keyOf(event) {
  if (event.ctrlKey || event.altKey || event.metaKey)
    return null;
  const isActivation = event.key === "Enter" || event.key === " ";
  const button = isActivation && event.target.closest?.("button, summary");
  return button ? button.dataset.key : panelKeys[event.key];
}

addEventListener("keydown", event => {
  const key = keyOf(event);
  if (!key || !isLive())
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
for (const away of ["blur", "pagehide"])
  addEventListener(away, () => release(presser));
document.addEventListener("visibilitychange", () => document.hidden && release(presser));

for (const end of ["pointerup", "pointercancel"])
  addEventListener(end, event => release(event.pointerId));
for (const button of keyButtons) {
  const key = button.dataset.key;
  button.addEventListener("pointerdown", event => event.button === 0 && press(key, event.pointerId));
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
    const text = state.journey ?? await (await fetched("journey")).text();
    const head = text.split("\n", 2).join("\n") + "\n";
    if (!text)
      return put("saved", "Nothing has been recorded yet.");
    const bytes = new TextEncoder().encode(text);  // of which `opened` is a number
    const link = document.createElement("a");
    const added = bytes.slice(Math.max(opened, head.length));
    link.href = URL.createObjectURL(new Blob([head, added], { type: "text/plain" }));
    link.download = "panel.journey";
    link.click();
    setTimeout(() => URL.revokeObjectURL(link.href), 1000);
    const mayBeginInMenu = /^(tap|hold) enter/m.test(new TextDecoder().decode(bytes.slice(0, opened)));
    put("saved", !mayBeginInMenu ? "Saved." :
      "Saved. Enter was pressed before this page was opened: if it was opened in a menu, the journey " +
      "cannot be played. Reload the page while a status page is shown, and do it once more.");
  } catch {
    put("saved", "The journey could not be fetched: nothing has been saved.");
  }
});

element("anew").addEventListener("click", () => {
  if (confirm("Start over with a fresh appliance? All that was set and recorded is lost."))
    send("start over");
});

element("full").hidden = !document.fullscreenEnabled;
element("full").addEventListener("click", async () => {
  if (document.fullscreenElement)
    return document.exitFullscreen();
  await document.documentElement.requestFullscreen().catch(
    () => put("saved", "The browser does not allow a full screen here."));
  // Otherwise Escape would only end the full screen.
  navigator.keyboard?.lock?.(["Escape"]);
});

// The connection.

const retryTime = 1000;
const patience = 4000;  // the emulator sends a state every second, even if nothing has changed
let silenceTimer = 0;

async function fetched(name) {
  const answer = await fetch(name, { signal: AbortSignal.timeout(patience) });
  if (!answer.ok)
    throw new Error("refused", { cause: answer.status === 503 ? await answer.text() : "" });
  return answer;
}

function awaitState() {
  clearTimeout(silenceTimer);
  silenceTimer = setTimeout(() => {
    socket.onclose = socket.onmessage = null;  // closing takes long where nobody answers
    socket.close();
    connectAgain();
  }, patience);
}

function connectAgain({ cause } = {}) {
  clearTimeout(silenceTimer);
  presser = null;
  if (state?.ending)
    return;
  for (const button of [...keyButtons, element("anew")]) {
    button.classList.remove("down");
    button.disabled = true;
  }
  ["held", "load", "bytes", "program"].forEach(field => put(field, ""));
  tell("", cause || "The connection is lost. Trying again … If the emulator was ended, start it anew and " +
       "open the address that it prints.");
  setTimeout(connect, retryTime);
}

async function connect() {
  try {
    glass = await (await fetched("glass.json")).json();
  } catch (error) {
    return connectAgain(error);
  }
  document.documentElement.style.setProperty("--glass", glass.background);
  fitGlass();
  socket = new WebSocket("panel");
  socket.onmessage = event => {
    awaitState();
    show(JSON.parse(event.data));
  };
  socket.onclose = () => connectAgain();
  awaitState();
}

// Another zoom, or another screen.
function awaitResolution() {
  fitGlass();
  matchMedia(`(resolution: ${devicePixelRatio}dppx)`).addEventListener("change", awaitResolution, { once: true });
}

new ResizeObserver(fitGlass).observe(element("glass"));
awaitResolution();
connect();
