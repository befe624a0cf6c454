function rowElement(key) {
  const cardKey = order.find((other) => rowsOf(cards.get(other).data).some((row) => row.key === key));
  if (cardKey === undefined) return null;
  drawUpTo(order.indexOf(cardKey) + 1);
  return cards.get(cardKey).element.querySelector(`[data-row="${CSS.escape(key)}"]`);
}

function focusRow(key) {
  const element = rowElement(key);
  if (element === null) return;
  element.closest(".object").hidden = false;
  element.tabIndex = -1;
  element.focus({preventScroll: true});
  element.scrollIntoView({block: "center"});
}

function go(direction, openOnly) {
  const rows = shownRows().filter(settles);
  const start = rows.findIndex((row) => row.key === current);
  for (let i = 1; i <= rows.length; i += 1) {
    const from = start < 0 && direction < 0 ? 0 : start;
    const row = rows[(from + i * direction + rows.length * 2) % rows.length];
    if (!openOnly || row.pending) return focusRow(row.key);
  }
  say(state.pending === 0 ? "Nothing is open." : "Nothing is open among what is shown.", {important: true});
}

// The button of the bar goes through everything once there is nothing open.
const goBy = (direction) => go(direction, openShown().length > 0);

function takeByKey(side, whole) {
  const row = allRows().find((other) => other.key === current && settles(other));
  if (row === undefined) return go(1, true);
  if (!whole) return chooseRow(row, side);
  takeCard(cards.get(order.find((key) => rowsOf(cards.get(key).data).includes(row))).data.of, side);
}

function takeCard(key, side) {
  const parts = () => Array.from(cards.values()).filter((card) => card.data.of === key);
  chooseRows(() => parts().flatMap((card) => rowsOf(card.data).filter(settles)), side, `All of ${cards.get(key).data.name}`);
}

function takeField(key, side) {
  const alike = () => Array.from(cards.values()).flatMap(({data}) => data.objects)
    .flatMap((object) => object.rows.filter((row) => settles(row) && fieldKey(object, row) === key));
  chooseRows(alike, side, "All of this field");
}

function clicked(event) {
  const {choice, take, card, field} = event.target.closest("button")?.dataset ?? {};
  // Who clicks twice means it once.
  if (choice !== undefined && event.detail < 2) {
    const {path} = event.target.closest("[data-path]").dataset;
    chooseRow(allRows().find((row) => row.path === path), choice);
  } else if (field !== undefined) {
    takeField(field, take);
  } else if (card !== undefined) {
    takeCard(card, take);
  }
}

main.addEventListener("click", clicked);
main.addEventListener("focusin", (event) => {
  const row = event.target.closest("tr[data-path]");
  if (row === null) return;
  current = row.dataset.row;
  for (const other of main.querySelectorAll("tr.current")) other.classList.remove("current");
  row.classList.add("current");
});
byId("rest").addEventListener("click", (event) => {
  const {take} = event.target.dataset;
  if (take !== undefined) chooseRows(openShown, take, "All that was open");
});
byId("files").addEventListener("click", (event) => {
  const {file} = event.target.closest("button")?.dataset ?? {};
  if (file !== undefined) act(() => load(Number(file), " "));
});
byId("next-file").addEventListener("click", () => {
  const count = state.files.length;
  const others = Array.from({length: count}, (_, i) => (state.file + 1 + i) % count);
  const next = others.find((i) => !state.files[i].saved && state.files[i].error === "");
  if (next !== undefined) act(() => load(next, " "));
});
byId("previous").addEventListener("click", () => goBy(-1));
byId("next").addEventListener("click", () => goBy(1));
byId("undo").addEventListener("click", () => step("undo", "Undone."));
byId("redo").addEventListener("click", () => step("redo", "Done again."));
byId("save").addEventListener("click", save);
byId("keep").addEventListener("click", keep);
byId("give-up").addEventListener("click", giveUp);
byId("keys").addEventListener("click", () => byId("help").showModal());

const letterKeys = {
  n: () => go(1, true),
  p: () => go(-1, true),
  j: () => go(1, false),
  k: () => go(-1, false),
  t: (whole) => takeByKey("theirs", whole),
  o: (whole) => takeByKey("ours", whole),
  b: (whole) => takeByKey("base", whole),
  "/": () => text.focus(),
  "?": () => byId("help").showModal(),
};
const controlKeys = {
  z: (shift) => byId(shift ? "redo" : "undo").click(),
  y: () => byId("redo").click(),
  s: saveOrKeep,
};

document.addEventListener("keydown", (event) => {
  if (ended || main.inert || state === null || event.altKey || document.querySelector("dialog[open]")) return;
  const typing = event.target.matches("input[type=search]");
  const control = event.ctrlKey || event.metaKey;
  const key = event.key.toLowerCase();
  const command = control ? controlKeys[key] : byId("letters").checked ? letterKeys[key] : undefined;
  if (command === undefined || (typing && key !== "s") || (typing && !control)) return;
  event.preventDefault();
  if (!event.repeat || "npjk".includes(key)) command(event.shiftKey);
});

// What is scrolled to must not hide below the bars, which have more lines in a narrow window.
const bars = new ResizeObserver(() => {
  const height = byId("bars").offsetHeight || byId("bar").offsetHeight;
  document.documentElement.style.scrollPaddingTop = `${height + 8}px`;
});
bars.observe(byId("bars"));
bars.observe(byId("bar"));

window.addEventListener("beforeunload", (event) => {
  if (!ended && !main.inert && state !== null && unsavedFiles().some((file) => !file.can_keep)) event.preventDefault();
});
// As JSON it names its origin, without which the program refuses it.
window.addEventListener("pagehide", () => {
  if (!ended) navigator.sendBeacon("bye", new Blob(["{}"], {type: "application/json"}));
});
// A page that comes back out of the browser's memory may have missed what was done since.
window.addEventListener("pageshow", (event) => event.persisted && location.reload());

connection = watch(there, lost);
act(async () => {
  await load();
  if (state.mode !== "merge") readOthers().catch(() => {});
});
