"use strict";

// Everything is readable without this script; it only adds the filters.

// What can be searched: names, file IDs, fields, values and notes, but not the words that every object has.
function searchedText(element) {
  const parts = Array.from(element.querySelectorAll("h2 > :not(.badge), .value, pre, small"), (part) => part.textContent);
  const paths = Array.from(element.querySelectorAll("tr[data-path]"), (row) => row.dataset.path);
  return [...parts, ...paths].join("\n").toLowerCase();
}

const objects = Array.from(document.querySelectorAll("section.object"), (element) => ({
  element,
  sides: element.dataset.sides.split(" "),
  kinds: element.dataset.kinds.split(" "),
  text: searchedText(element),
}));
const filters = document.getElementById("filters");
const side = document.getElementById("side");
const text = document.getElementById("text");
const kinds = Array.from(document.querySelectorAll("input[name=kind]"));
const shown = document.getElementById("shown");
const nothing = document.getElementById("nothing");

function matches(object, wantedKinds, words) {
  if (side.value === "both") {
    if (object.sides.length !== 2) return false;
  } else if (side.value !== "all" && !object.sides.includes(side.value)) {
    return false;
  }
  if (wantedKinds.length > 0 && !wantedKinds.some((kind) => object.kinds.includes(kind))) return false;
  return words.every((word) => object.text.includes(word));
}

function update() {
  const wantedKinds = kinds.filter((input) => input.checked).map((input) => input.value);
  const words = text.value.toLowerCase().split(/\s+/).filter(Boolean);
  let count = 0;
  for (const object of objects) {
    const hidden = !matches(object, wantedKinds, words);
    if (!hidden) count += 1;
    if (object.element.hidden !== hidden) object.element.hidden = hidden;
  }
  shown.textContent = `${count} of ${objects.length} objects`;
  nothing.hidden = count > 0;
}

if (filters !== null) {
  filters.hidden = false;
  filters.addEventListener("change", update);
  text.addEventListener("input", update);
  filters.addEventListener("submit", (event) => event.preventDefault());
  // The form is empty again before its fields are.
  filters.addEventListener("reset", () => setTimeout(update));
  document.addEventListener("keydown", (event) => {
    if (event.key !== "/" || event.ctrlKey || event.metaKey || event.target instanceof HTMLInputElement) return;
    event.preventDefault();
    text.focus();
  });
  // A browser that goes back keeps what was entered.
  update();
}
