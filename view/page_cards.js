const sideWords = {base: "before", theirs: "theirs", ours: "ours", result: "result"};
const choiceSides = ["base", "theirs", "ours"];

// The name that a side goes by, such as its branch; empty where nobody gave it one.
function sideName(names, side) {
  const name = names[side] ?? "";
  const inner = name.match(new RegExp(`^${side}(?: \\((.*)\\))?$`, "s"));
  return inner === null ? name : (inner[1] ?? "");
}

function sideTitle(names, side) {
  const name = sideName(names, side);
  return name === "" ? sideWords[side] : `${sideWords[side]} (${name})`;
}

const capital = (words) => words[0].toUpperCase() + words.slice(1);

function setData(element, data) {
  Object.assign(element.dataset, data);
  return element;
}

function button(label, data) {
  const element = make("button", "", label);
  element.type = "button";
  return setData(element, data);
}

function labelButtons(buttons, names, what) {
  for (const element of buttons) {
    element.title = `Take ${sideTitle(names, element.dataset.take)} for ${what}`;
    element.setAttribute("aria-label", element.title);
  }
}

// Three buttons that take a side for several conflicts at once.
function sideButtons(names, what, data) {
  const buttons = choiceSides.map((side) => button(sideWords[side], {...data, take: side}));
  for (const element of buttons) element.classList.add(element.dataset.take);
  labelButtons(buttons, names, what);
  return buttons;
}

// Those rows are alike that are about one field of one kind of component.
function fieldKey(object, row) {
  return row.property && JSON.stringify([object.class, object.script, row.property]);
}

// A side that left a place alone has there what was before.
function cellOf(row, side) {
  const leftAlone = row[side].kind === "unchanged" && row[side].text === "" && side !== "result";
  return leftAlone ? row.base : row[side];
}

// What both added stays whatever is taken: base has nothing to take in its place.
function canTake(row, side) {
  return side !== "base" || row.base.text !== "" || row.theirs.kind !== "added" || row.ours.kind !== "added";
}

function choiceCell(row, side, names) {
  const taken = row.choice === side;
  const says = make("span", "unseen", `Take ${sideTitle(names, side)}: `);
  const element = make("button", "take", make("span", "mark"), says, cellContent(cellOf(row, side), side, row.base));
  element.type = "button";
  element.setAttribute("aria-pressed", String(taken));
  return setData(element, {choice: side});
}

function resultCell(row, merging) {
  const content = [cellContent(row.result, "result", row.base)];
  const kind = row.pending ? "conflict" : row.choice !== null ? "settled" : row.state;
  const words = row.pending ? "open" : row.choice !== null ? `settled: ${sideWords[row.choice]}` : row.state;
  if (merging && words !== "") content.push(make("span", `badge ${kind}`, words));
  if (row.repaired && row.state !== "repaired") content.push(make("span", "badge repaired", "repaired"));
  return content;
}

function makeRow(object, row, {names, merging, alike, fresh}) {
  const element = setData(make("tr"), {row: row.key});
  const head = make("th", "", row.label || row.field || "whole object");
  head.scope = "row";
  if (row.note) head.append(make("small", "", row.note));
  // People read labels; commands and files have the field's own name.
  head.title = [row.property, row.path && `in a terminal: --path '${row.path.replaceAll("'", "'\\''")}'`].filter(Boolean).join("; ");
  element.append(head);
  const settles = row.path !== undefined;
  if (settles) {
    setData(element, {path: row.path});
    element.tabIndex = -1;
    element.classList.add(row.pending ? "conflict" : "settled");
    const field = fieldKey(object, row);
    const count = field === "" ? 0 : alike(field);
    if (count > 1) {
      const many = make("details", "alike", make("summary", "", `all ${count} of this field`));
      many.append(...sideButtons(names, "all conflicts of this field", {field}));
      head.append(setData(many, {field}));
    }
  }
  if (row.repaired) element.classList.add("repaired");
  if (fresh.has(row.key)) element.classList.add("fresh");
  for (const side of merging ? ["base", "theirs", "ours", "result"] : ["base", "result"]) {
    const cell = make("td", side);
    setData(cell, {label: merging ? sideWords[side] : (sideName(names, side) || sideWords[side])});
    if (row[side].kind === "unchanged") cell.classList.add("unchanged");
    if (settles && row.choice === side) cell.classList.add("taken");
    if (side === "result") {
      cell.append(...resultCell(row, merging));
    } else {
      cell.append(settles && canTake(row, side) ? choiceCell(row, side, names) : cellContent(cellOf(row, side), side, row.base));
    }
    cell.append(...wholeText(row[side]));
    element.append(cell);
  }
  return element;
}

function tableHead({names, merging}) {
  const row = make("tr", "", make("th", "", "Field"));
  for (const side of merging ? ["base", "theirs", "ours", "result"] : ["base", "result"]) {
    const name = sideName(names, side);
    const word = merging || name === "" ? sideWords[side] : "";
    row.append(make("th", side, make("span", "", name || capital(word)), name && word ? make("small", "", word) : ""));
  }
  for (const cell of row.children) cell.scope = "col";
  return make("thead", "", row);
}

function cardHead(card, {names, merging}) {
  const title = make("h2", "", make("span", "name", card.name || card.class), " ");
  if (card.class !== "GameObject" && card.class !== card.name) title.append(make("span", "class", card.class), " ");
  if (card.path && card.path !== card.name) title.append(make("span", "path", card.path), " ");
  for (const kind of card.kinds) {
    if (kind === "conflict") continue;
    title.append(make("span", `badge ${kind}`, kind), " ");
  }
  if (card.continued) title.append(make("span", "class", "continued"), " ");
  if (card.pending > 0) title.append(make("span", "badge conflict", `${card.pending} open`), " ");
  const head = make("div", "head", title);
  const settleable = rowsOf(card).filter((row) => row.path !== undefined).length;
  if (merging && settleable > 1 && !card.continued) {
    const what = `all of ${card.name || card.class}`;
    head.append(make("span", "group", make("span", "words", "All of it:"), ...sideButtons(names, what, {card: card.of})));
  }
  return head;
}

function makeGroup(object, context) {
  const title = make("th", "", object.title || object.class);
  title.colSpan = context.merging ? 5 : 3;
  title.scope = "rowgroup";
  if (object.script) title.append(" ", make("span", "class", object.class));
  const rows = object.rows.map((row) => makeRow(object, row, context));
  return make("tbody", "", make("tr", "component", title), ...rows);
}

function rowsOf(card) {
  return card.objects.flatMap((object) => object.rows);
}

// An object with thousands of rows is shown in parts, so that no part is long to draw. Each part knows its
// card's key as `of`.
function partsOfCard(card) {
  const most = 100;
  const parts = [];
  let room = 0;
  for (const object of card.objects) {
    for (let start = 0; start < object.rows.length; start += most) {
      const rows = object.rows.slice(start, start + most);
      if (room < rows.length) {
        parts.push({...card, of: card.key, objects: []});
        room = most;
      }
      room -= rows.length;
      parts.at(-1).objects.push({...object, rows});
    }
  }
  for (const [index, part] of parts.entries()) {
    if (index === 0) continue;
    part.key = `${card.key} ${index}`;
    part.continued = true;
    part.pending = rowsOf(part).filter((row) => row.pending).length;
  }
  return parts;
}

function describeCard(element, card) {
  setData(element, {kinds: card.kinds.join(" ")});
  element.setAttribute("aria-label", card.path || card.name || card.class);
}

function makeCard(card, context) {
  const element = setData(make("section", "object"), {key: card.key});
  describeCard(element, card);
  element.append(cardHead(card, context));
  element.append(make("table", "", tableHead(context), ...card.objects.map((object) => makeGroup(object, context))));
  return element;
}

// Where the same rows are there as before, only those that differ are made anew: of a list with thousands of
// conflicts one click changes one row.
function updateCard(element, before, card, context) {
  const keys = (of) => of.objects.map((object) => [object.id, object.title, object.rows.map((row) => row.key)]);
  if (JSON.stringify(keys(before)) !== JSON.stringify(keys(card))) {
    const made = makeCard(card, context);
    element.replaceChildren(...made.childNodes);
  } else {
    element.firstElementChild.replaceWith(cardHead(card, context));
    const rows = element.querySelectorAll("tr[data-row]");
    const old = rowsOf(before);
    let index = 0;
    for (const object of card.objects) {
      for (const row of object.rows) {
        if (JSON.stringify(old[index]) !== JSON.stringify(row)) rows[index].replaceWith(makeRow(object, row, context));
        index += 1;
      }
    }
  }
  describeCard(element, card);
}

// What can be searched: names, fields, values and notes, but not the words that every object has.
function searchedText(card) {
  const texts = [card.name, card.path, card.class, card.key];
  for (const object of card.objects) {
    texts.push(object.title, object.class, object.script, object.id);
    for (const row of object.rows) {
      texts.push(row.label, row.field, row.note);
      for (const cell of [row.base, row.theirs, row.ours, row.result]) {
        texts.push(cell?.text, cell?.full, cell?.shown);
      }
    }
  }
  return texts.filter(Boolean).join("\n").toLowerCase();
}
