const main = byId("cards");
const notice = byId("notice");
const divider = make("h2", "divider");

// What the program last said about the file that is shown, without its cards.
let state = null;
// By their keys, in the order of `order`: {data, element, text}; the first `drawn` of them have elements.
const cards = new Map();
let order = [];
let drawn = 0;
let fieldCounts = null;
// Rows that the last choice brought up, and the row that the letters are about.
let fresh = new Set();
let current = null;
let ended = false;
let connection = null;

const allRows = () => order.flatMap((key) => rowsOf(cards.get(key).data));
const settles = (row) => row.path !== undefined;
const plural = (count, word) => `${count} ${word}${count === 1 ? "" : "s"}`;

function countAlike(key) {
  if (fieldCounts === null) {
    fieldCounts = new Map();
    for (const {data} of cards.values()) {
      for (const object of data.objects) {
        for (const row of object.rows.filter(settles)) {
          const field = fieldKey(object, row);
          fieldCounts.set(field, (fieldCounts.get(field) ?? 0) + 1);
        }
      }
    }
  }
  return fieldCounts.get(key) ?? 0;
}

function context() {
  return {names: state.names, merging: state.mode === "merge", alike: countAlike, fresh};
}

// Drawing

function drawUpTo(count) {
  const fragment = document.createDocumentFragment();
  for (; drawn < Math.min(count, order.length); drawn += 1) {
    const card = cards.get(order[drawn]);
    card.element = makeCard(card.data, context());
    card.element.hidden = !matches(card);
    fragment.append(card.element);
  }
  main.append(fragment);
}

// The rest of thousands of cards comes while the first ones are being looked at. Pieces of so many cards, not of so
// many milliseconds: on a busy machine these would get ever smaller, and each piece costs a look at all cards.
function drawRest(of) {
  if (of !== order) return;
  drawUpTo(drawn + (drawn === 0 ? 20 : 100));
  main.setAttribute("aria-busy", String(drawn < order.length));
  if (drawn === order.length) placeDivider();
  else setTimeout(drawRest, 0, of);
}

// Before the objects at the end that nothing is to be settled about.
function placeDivider() {
  const last = order.findLastIndex((key) => rowsOf(cards.get(key).data).some(settles));
  const alone = order.length - last - 1;
  divider.textContent = `Merged without a conflict: ${plural(alone, "object")}`;
  divider.hidden = filtering();
  if (last >= 0 && alone > 0) cards.get(order[last]).element.after(divider);
  else divider.remove();
}

// What happened in it, such as "2 changed, 1 added"; empty for what isn't read yet.
function objectsOf({objects}) {
  if (objects === undefined) return "";
  const some = ["changed", "added", "removed"].filter((word) => objects[word] > 0);
  return some.map((word) => `${objects[word]} ${word}`).join(", ") || "nothing changed";
}

function wordsOf(file) {
  if (file.error !== "") return "can't be read";
  if (file.saved) return "saved";
  if (state.mode !== "merge") return objectsOf(file);
  if (file.pending === null) return "not read yet";
  return file.pending > 0 ? `${file.pending} open` : "";
}

function showFiles() {
  const several = state.files.length > 1;
  byId("files").hidden = !several;
  byId("next-file").hidden = !several;
  if (!several) return;
  byId("files").firstElementChild.replaceChildren(...state.files.map((file, index) => {
    const words = wordsOf(file);
    const choice = button(file.title, {file: index});
    const isPlain = file.saved || (state.mode !== "merge" && file.error === "");
    if (words !== "") choice.append(" ", make("span", isPlain ? "badge" : "badge conflict", words));
    if (index === state.file) choice.setAttribute("aria-current", "true");
    return make("li", "", choice);
  }));
}

// In a review the list of files is its index: the others are read while the first one is looked at.
async function readOthers() {
  for (let i = 0; i < state.files.length && !ended; i += 1) {
    if (state.files[i].objects !== undefined || state.files[i].error !== "") continue;
    const file = await ask(`summary?file=${i}`);
    state.files[i] = file;
    const words = wordsOf(file);
    const choice = byId("files").querySelectorAll("button")[i];
    choice.append(" ", make("span", file.error === "" ? "badge" : "badge conflict", words));
  }
}

function showRest() {
  const open = openShown().length;
  const rest = byId("rest");
  const isAll = open === state.pending;
  const count = open === 1 ? "the one" : isAll ? `all ${open}` : `the ${open}`;
  const what = `${count} open${isAll ? "" : open === 1 ? " that is shown" : " that are shown"}`;
  rest.hidden = state.mode !== "merge" || state.conflicts < 2;
  rest.firstElementChild.textContent = `${capital(what)}:`;
  rest.setAttribute("aria-label", `Take for ${what}`);
  // The buttons stay the same ones: somebody may be pressing one.
  if (rest.children.length === 1) rest.append(...sideButtons(state.names, what, {rest: ""}));
  const choices = rest.querySelectorAll("button");
  labelButtons(choices, state.names, what);
  for (const choice of choices) choice.disabled = open === 0;
}

function listTexts(list, texts) {
  list.replaceChildren(...texts.map((text) => make("li", "", text)));
}

function showHead() {
  const merging = state.mode === "merge";
  const settled = state.conflicts - state.pending;
  document.title = `${merging && state.pending > 0 ? `(${state.pending}) ` : ""}${state.title}`;
  byId("title").textContent = state.title;
  byId("bars").hidden = false;
  byId("hint").hidden = !merging || state.conflicts === 0;
  byId("error").hidden = state.error === "";
  const failed = state.files[state.file].error === "" ? "The merge failed" : "The file can't be read";
  byId("error").textContent = state.error === "" ? "" : `${failed}: ${state.error}`;
  byId("notes").hidden = state.notes.length === 0;
  byId("notes").firstElementChild.textContent = plural(state.notes.length, "note");
  listTexts(byId("notes").lastElementChild, state.notes);
  byId("not-shown").hidden = state.not_shown.length === 0;
  listTexts(byId("not-shown").lastElementChild, state.not_shown);
  document.body.classList.toggle("review", !merging);
  const nothing = state.error === "" ? "Nothing is in conflict" : "There is no result";
  byId("settled").textContent = state.conflicts === 0 ? nothing : `${settled} of ${state.conflicts} settled`;
  byId("pending").textContent = String(state.pending);
  const bar = byId("progress").querySelector("progress");
  byId("pending").parentElement.hidden = state.conflicts === 0;
  bar.max = Math.max(1, state.conflicts);
  bar.value = state.conflicts > 0 ? settled : state.error === "" ? 1 : 0;
  byId("undo").disabled = !state.can_undo;
  byId("redo").disabled = !state.can_redo;
  byId("previous").disabled = byId("next").disabled = state.conflicts === 0;
  byId("names").textContent = merging ? `${capital(sideTitle(state.names, "theirs"))}, ${sideTitle(state.names, "ours")}` : "";
  byId("save").disabled = whyNotSaved() !== "";
  byId("keep").hidden = !canKeep();
  byId("keep").disabled = !state.files[state.file].unsaved;
  byId("save").title = whyNotSaved();
  byId("give-up").textContent = merging ? "Give up" : "Close";
  const options = byId("side").options;
  options[1].textContent = sideTitle(state.names, "theirs");
  options[2].textContent = sideTitle(state.names, "ours");
  showFiles();
  showRest();
}

// `important` texts are seen, too; the others are only read out. The button leads to a row.
function say(text, {important = false, failure = false, row = null} = {}) {
  notice.className = failure ? "failure" : important ? "" : "unseen";
  notice.firstElementChild.textContent = text;
  notice.lastElementChild.hidden = row === null;
  notice.lastElementChild.onclick = () => focusRow(row);
  clearTimeout(notice.timer);
  if (!failure && row === null) notice.timer = setTimeout(() => notice.classList.add("unseen"), 8000);
}

async function load(file, words = "") {
  const {cards: list, ...head} = await ask(file === undefined ? "state" : `state?file=${file}`);
  state = head;
  cards.clear();
  fieldCounts = current = null;
  fresh = new Set();
  const parts = list.flatMap(partsOfCard);
  for (const data of parts) cards.set(data.key, {data, element: null, text: null});
  order = parts.map((part) => part.key);
  drawn = 0;
  for (const old of main.querySelectorAll(".object")) old.remove();
  main.setAttribute("aria-busy", "true");
  drawRest(order);
  showHead();
  showShown();
  if (words !== "") say(`${words} This is ${state.title}.`, {important: true});
}

// Changes

// What a choice did elsewhere than at the chosen places.
function effects(changed, gone, chosen) {
  const found = {open: [], repaired: [], settled: 0};
  const lists = [...changed.map((card) => [cards.get(card.key)?.data, card]), ...gone.map((key) => [cards.get(key)?.data])];
  for (const [before, after] of lists) {
    const old = new Map(before ? rowsOf(before).map((row) => [row.key, row]) : []);
    for (const row of after ? rowsOf(after) : []) {
      const was = old.get(row.key);
      old.delete(row.key);
      if (chosen.has(row.path)) continue;
      if (row.pending && !was?.pending) found.open.push(row.key);
      if (!row.pending && was?.pending) found.settled += 1;
      if (row.repaired && !was?.repaired) found.repaired.push(row.key);
    }
    for (const row of old.values()) if (row.pending && !chosen.has(row.path)) found.settled += 1;
  }
  return found;
}

function sayEffects(words, {open, repaired, settled}, refused, notes) {
  const also = [];
  if (refused.length > 0) also.push("It can't be done together with what else was chosen.");
  if (open.length > 0) also.push(`This brought up ${plural(open.length, "other conflict")}.`);
  if (settled > 0) also.push(`${plural(settled, "other conflict")} ${settled === 1 ? "is" : "are"} settled by this, too.`);
  if (repaired.length > 0) also.push(`The merge repaired ${plural(repaired.length, "other place")}.`);
  also.push(...notes.slice(0, 2).map((note) => `${note}.`));
  const counts = state.pending === 0 ? "Nothing is open any more: you can save." : `${state.pending} open.`;
  const row = [...refused, ...open, ...repaired][0] ?? null;
  say([words, ...also, counts].join(" "), {important: also.length > 0 || state.pending === 0, row});
}

function reorder(newOrder) {
  const parts = Map.groupBy(cards.values(), (card) => card.data.of);
  order = newOrder.flatMap((key) => (parts.get(key) ?? []).map((card) => card.data.key));
  drawn = order.length;
  divider.remove();
  let last = byId("nothing");
  for (const key of order) {
    const card = cards.get(key);
    card.element ??= makeCard(card.data, context());
    if (last.nextElementSibling !== card.element) last.after(card.element);
    last = card.element;
  }
  drawRest(order);
}

// What is focused may be made anew; the focus then goes to what has its place.
function keepingFocus(change) {
  const held = document.activeElement;
  const row = held?.closest("tr[data-row]")?.dataset.row;
  const card = held?.closest(".object")?.dataset.key;
  const {choice, take} = held?.dataset ?? {};
  change();
  if (card === undefined || document.activeElement === held) return;
  if (held.isConnected) return held.focus({preventScroll: true});
  const element = cards.get(card)?.element ?? main;
  const again = row === undefined ? element : element.querySelector(`[data-row="${CSS.escape(row)}"]`);
  const inside = choice ? `[data-choice=${choice}]` : take && row === undefined ? `[data-card][data-take=${take}]` : null;
  const target = (inside && again?.querySelector(inside)) || again || element;
  if (!target.matches("button")) target.tabIndex = -1;
  target.focus({preventScroll: true});
}

// The answer speaks of whole cards, the page shows their parts.
function applyChanges({changed: whole, gone: wholeGone, order: newOrder, ...head}, chosen) {
  const before = state;
  const changed = whole.flatMap(partsOfCard);
  const kept = new Set(changed.map((part) => part.key));
  const touched = new Set([...wholeGone, ...whole.map((card) => card.key)]);
  const gone = Array.from(cards.keys()).filter((key) => touched.has(cards.get(key).data.of) && !kept.has(key));
  for (const row of main.querySelectorAll("tr.fresh")) row.classList.remove("fresh");
  state = head;
  fieldCounts = null;
  const found = effects(changed, gone, chosen);
  fresh = new Set(chosen.size > 0 ? [...found.open, ...found.repaired] : []);
  keepingFocus(() => {
    const old = new Map(changed.map((card) => [card.key, cards.get(card.key)]));
    for (const data of changed) {
      const element = old.get(data.key)?.element ?? null;
      cards.set(data.key, {data, element, text: null});
    }
    for (const data of changed) {
      const {element} = cards.get(data.key);
      if (element !== null) updateCard(element, old.get(data.key).data, data, context());
    }
    if (cards.size !== order.length || newOrder !== undefined || gone.length > 0) {
      drawUpTo(order.length);
      for (const key of gone) cards.get(key).element?.remove();
      for (const key of gone) cards.delete(key);
      reorder(newOrder ?? Array.from(new Set(order.map((key) => cards.get(key)?.data.of))));
    }
  });
  if (before.conflicts !== state.conflicts) {
    for (const many of main.querySelectorAll(".alike")) {
      many.firstElementChild.textContent = `all ${countAlike(many.dataset.field)} of this field`;
    }
  }
  if (drawn === order.length) placeDivider();
  showHead();
  showShown();
  return found;
}

// Runs a request; a refusal is shown, and what the program holds is shown again.
function act(job) {
  if (ended) return;
  inTurn(async () => {
    try {
      await job();
    } catch (error) {
      if (error instanceof LostConnection) return lost();
      await load(state?.file).catch(() => {});
      say(error.message, {failure: true});
    }
  });
}

// What a change is asked for on.
const shownNow = () => ({file: state.file, revision: state.revision});

function choose(find, words) {
  act(async () => {
    const choices = find();
    if (choices.length === 0) return;
    const {notes} = state;
    const chosen = new Set(choices.map((choice) => choice.path));
    const found = applyChanges(await ask("choose", {...shownNow(), choices}), chosen);
    const [{choice}] = choices;
    const refused = choice === null ? [] : allRows().filter((row) => row.pending && chosen.has(row.path));
    const newNotes = state.notes.filter((note) => !notes.includes(note));
    sayEffects(`${words}: ${choice === null ? "open again" : sideTitle(state.names, choice)}.`, found,
      refused.map((row) => row.key), newNotes);
  });
}

// The side that is taken already is given back.
function chooseRow(row, side) {
  const again = () => allRows().find((other) => other.path === row.path);
  choose(() => (again() ? [{path: row.path, choice: again().choice === side ? null : side}] : []), row.label);
}

function chooseRows(rows, side, words) {
  choose(() => rows().filter((row) => row.choice !== side).map(({path}) => ({path, choice: side})), words);
}

function step(which, words) {
  act(async () => {
    applyChanges(await ask(which, shownNow()), new Set());
    say(`${words} ${state.pending} open.`);
  });
}

function lost() {
  if (ended) return;
  byId("bars").inert = main.inert = true;
  say("The program that opened this page can't be reached. If it has ended, what isn't saved is lost.", {failure: true});
}

function there() {
  if (ended || !main.inert) return;
  byId("bars").inert = main.inert = false;
  act(() => load(state?.file, "Connected again."));
}
