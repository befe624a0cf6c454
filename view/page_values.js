"use strict";

const byId = (id) => document.getElementById(id);

// Whatever comes from a file becomes the text of an element, never markup.
function make(tag, className, ...children) {
  const element = document.createElement(tag);
  if (className) element.className = className;
  element.append(...children);
  return element;
}

// The parts of a vector or a colour, with those marked that differ from what they were before.
function partsOf(parts, before) {
  const list = make("span", "parts");
  for (const [name, number] of Object.entries(parts)) {
    const changed = before !== undefined && before[name] !== number;
    list.append(make("span", changed ? "part differs" : "part", make("i", "", name), " ", String(number)), " ");
  }
  return list;
}

function colourParts({r, g, b, a}) {
  return a === undefined ? {r, g, b} : {r, g, b, a};
}

// Lights may be brighter than white: the swatch shows the nearest colour, the numbers say what it is.
function swatch({r, g, b, a = 1}) {
  const element = make("span", "swatch", make("span"));
  const byte = (part) => Math.round(255 * Math.min(1, Math.max(0, Number(part) || 0)));
  element.firstChild.style.backgroundColor = `rgb(${byte(r)} ${byte(g)} ${byte(b)} / ${byte(a) / 255})`;
  return element;
}

function reference(value, shown) {
  if (value.name) return make("span", "reference", make("span", "arrow", "→ "), shown ?? value.name);
  if (!value.guid && (value.id === "0" || value.id === "")) return make("span", "none", "none");
  return null;
}

// What a value is as people see it, or null where its text says it best.
function shownValue({value, shown}, before) {
  const parts = (of) => (before?.type === value.type ? of(before) : undefined);
  switch (value?.type) {
    case "number":
      return make("span", "number", value.number);
    case "vector":
      return partsOf(value.parts, parts((other) => other.parts));
    case "colour":
      return make("span", "", swatch(value), " ", partsOf(colourParts(value), parts(colourParts)));
    case "boolean":
      return make("span", value.on ? "switch on" : "switch", value.on ? "on" : "off");
    case "reference":
      return reference(value, shown);
    default:
      return value?.empty ? make("span", "none", "empty") : null;
  }
}

const mostLines = 6;
const kindWords = {added: "added", removed: "removed"};

// What stands in a cell, without the part that is only unfolded.
function cellContent(cell, side, base) {
  const content = make("span", `value ${cell.kind}`);
  if (kindWords[cell.kind]) content.append(make("b", cell.kind, kindWords[cell.kind]), " ");
  const value = shownValue(cell, side === "base" ? null : base?.value);
  if (value !== null) {
    content.append(value);
  } else if (cell.text !== "") {
    content.append(firstLines(cell));
  } else if (!kindWords[cell.kind]) {
    content.append(make("span", "none", "not there"));
  }
  return content;
}

const linesOf = (cell) => (cell.shown ?? cell.text).split("\n");

function firstLines(cell) {
  const lines = linesOf(cell);
  return lines.length <= mostLines ? lines.join("\n") : [...lines.slice(0, mostLines), `${lines.length - mostLines} more`].join("\n");
}

// What is left out of a cell, or only told in part.
function restOf(cell) {
  if (cell.shown === undefined) return cell.full;
  if (linesOf(cell).length > mostLines) return cell.shown;
  return /\.\.\.$/m.test(cell.shown) ? cell.full : undefined;
}

// The whole of a long value, read only when somebody wants to see it.
function wholeText(cell) {
  const whole = restOf(cell);
  if (!whole) return [];
  const text = make("pre");
  text.tabIndex = 0;
  const details = make("details", "whole", make("summary", "", "all of it"), text);
  details.addEventListener("toggle", () => {
    text.textContent = details.open ? whole : "";
  });
  return [details];
}
