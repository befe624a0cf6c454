// Empty where it can be saved.
function whyNotSaved() {
  if (state.mode !== "merge") return "There is nothing to save: two versions are compared.";
  if (state.error !== "") return `There is no result to save: ${state.error}.`;
  if (state.files[state.file].saved) return "It is saved already.";
  return state.pending > 0 ? `It can't be saved yet: ${plural(state.pending, "conflict")} still open.` : "";
}

function save() {
  if (whyNotSaved() !== "") return say(whyNotSaved(), {important: true});
  act(async () => {
    const {title} = state;
    const {next, unread, next_step: step} = await ask("save", shownNow());
    if (next !== null) return load(next, `${title} is saved.`);
    const also = unread.length === 0 ? "" : " What can't be read is not:";
    end("Saved", `${state.files.length > unread.length + 1 ? "Every file" : title} is saved.${also}`, unread, step);
  });
}

// Where it can't be saved yet, what is settled can be kept, if the program says so.
function keep() {
  act(async () => {
    state = await ask("keep", shownNow());
    showHead();
    say(`Saved for later: ${state.conflicts - state.pending} of ${state.conflicts} settled. The rest stays open.`, {important: true});
  });
}

const canKeep = () => state.pending > 0 && state.files[state.file].can_keep;
const saveOrKeep = () => (canKeep() ? keep() : save());

const unsavedFiles = () => state.files.filter((file) => file.unsaved);

function giveUp() {
  const unsaved = unsavedFiles();
  const really = (isKept) => act(async () => {
    const {left, next_step: step} = await ask("give-up", {keep: isKept});
    const words = left.length === 1 ? "This file is still in conflict:" : "These files are still in conflict:";
    if (left.length > 0) end(isKept ? "Saved for later" : "Given up", words, left, step);
    else end("Closed", "");
  });
  if (unsaved.length === 0) return really(false);
  const question = byId("question");
  const stay = unsaved.length === 1 ? "the file stays as it was" : "these files stay as they were";
  question.children[1].textContent = `What you chose for ${unsaved.map((file) => file.title).join(", ")} is lost, and ${stay}.${
    state.files.some((file) => file.saved) ? " Files that are saved stay saved." : ""}`;
  question.querySelector("[value=keep]").hidden = !unsaved.every((file) => file.can_keep);
  question.returnValue = "";
  question.onclose = () => question.returnValue !== "" && really(question.returnValue === "keep");
  question.showModal();
}

// `step` is what somebody does next, outside of the page.
function end(title, text, files = [], step = undefined) {
  ended = true;
  connection.close();
  for (const part of [byId("bars"), main, notice, byId("hint"), byId("files"), byId("notes")]) part.hidden = true;
  document.title = `${title}: ${state.title}`;
  byId("end-title").textContent = title;
  byId("end-what").textContent = text;
  byId("end-files").hidden = files.length === 0;
  listTexts(byId("end-files"), files);
  byId("next-step").textContent = step?.text ?? "";
  byId("command").hidden = !step?.command;
  byId("command").firstElementChild.textContent = step?.command ?? "";
  byId("end").hidden = false;
  byId("end").focus();
}

// Where a browser doesn't let a page copy, what is to be copied is at least selected.
byId("command").querySelector("button").addEventListener("click", async () => {
  getSelection().selectAllChildren(byId("command").firstElementChild);
  try {
    await navigator.clipboard.writeText(byId("command").firstElementChild.textContent);
    byId("copied").textContent = "Copied";
  } catch {
    byId("copied").textContent = "Selected: copy it with Ctrl+C";
  }
});
