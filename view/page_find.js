const side = byId("side");
const text = byId("text");
const kinds = Array.from(document.querySelectorAll("input[name=kind]"));
let wanted = {side: "all", kinds: [], words: []};

const filtering = () => wanted.side !== "all" || wanted.kinds.length > 0 || wanted.words.length > 0;

function matches(card) {
  const {sides} = card.data;
  if (wanted.side === "both" ? sides.length !== 2 : wanted.side !== "all" && !sides.includes(wanted.side)) return false;
  if (wanted.kinds.length > 0 && !wanted.kinds.some((kind) => card.data.kinds.includes(kind))) return false;
  if (wanted.words.length === 0) return true;
  card.text ??= searchedText(card.data);
  return wanted.words.every((word) => card.text.includes(word));
}

// A card that a choice has made another one stays where it is: it goes only when the filters change.
const isShown = (card) => (card.element === null ? matches(card) : !card.element.hidden);

function shownRows() {
  return order.filter((key) => isShown(cards.get(key))).flatMap((key) => rowsOf(cards.get(key).data));
}

const openShown = () => shownRows().filter((row) => row.pending && settles(row));

function showShown() {
  for (const card of cards.values()) {
    if (card.element?.hidden && matches(card)) card.element.hidden = false;
  }
  const count = order.filter((key) => isShown(cards.get(key))).length;
  byId("shown").textContent = `${count} of ${plural(order.length, "object")}`;
  byId("filters").hidden = order.length < 2 && !filtering();
  byId("nothing").hidden = count > 0 || state.error !== "";
  byId("nothing").textContent = order.length > 0 ? "Nothing matches the filters." : "Nothing changed.";
}

function filter() {
  const now = {
    side: side.value,
    kinds: kinds.filter((input) => input.checked).map((input) => input.value),
    words: text.value.toLowerCase().split(/\s+/).filter(Boolean),
  };
  // Leaving the field says "change" once more, while a button is being pressed.
  if (JSON.stringify(now) === JSON.stringify(wanted)) return;
  wanted = now;
  for (const card of cards.values()) {
    if (card.element !== null) card.element.hidden = !matches(card);
  }
  divider.hidden = filtering();
  showShown();
  showRest();
  if (main.getBoundingClientRect().top < 0) main.scrollIntoView();
}

byId("filters").addEventListener("change", filter);
text.addEventListener("input", filter);
byId("filters").addEventListener("submit", (event) => event.preventDefault());
// The form is empty again before its fields are.
byId("filters").addEventListener("reset", () => setTimeout(filter));
