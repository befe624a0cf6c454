class LostConnection extends Error {}

// Asks the program that opened this page; throws an Error with its own words where it refuses.
async function ask(place, body) {
  const options = {cache: "no-store"};
  if (body !== undefined) {
    options.method = "POST";
    options.headers = {"Content-Type": "application/json"};
    options.body = JSON.stringify(body);
  }
  let response;
  let text;
  try {
    response = await fetch(place, options);
    text = await response.text();
  } catch {
    throw new LostConnection("The connection is lost.");
  }
  let answer;
  try {
    answer = JSON.parse(text);
  } catch {
    throw new Error(`The program answered ${response.status}.`);
  }
  if (!response.ok) throw new Error(answer.error || `The program answered ${response.status}.`);
  return answer;
}

// Tells whether the program is there; it ends when no page holds this connection any longer.
function watch(onThere, onLost) {
  const events = new EventSource("events");
  events.addEventListener("open", onThere);
  events.addEventListener("error", onLost);
  return events;
}

// One after the other, so that each choice is made on what the last one left.
let working = Promise.resolve();
function inTurn(job) {
  working = working.then(job);
  return working;
}
