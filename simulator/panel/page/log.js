// The daemon's log and its platform calls, the newest last, by level, LED and text.
import { timeText } from './device.js';

const LINES_MAX = 1000;
const SHOWN_MAX = 300;
const CALL = -1;
const list = document.getElementById('log');
const level = document.getElementById('level');
const ofLed = document.getElementById('of-led');
const filter = document.getElementById('filter');
const levels = {
  all: () => true,
  log: (line) => line.level !== CALL,
  error: (line) => line.level === 0,
  calls: (line) => line.level === CALL,
};
let lines = [];
let dirty = true;

for (const control of [level, ofLed, filter]) {
  control.addEventListener('input', () => { dirty = true; });
}

export function clearLog(leds) {
  lines = [];
  dirty = true;
  ofLed.replaceChildren(new Option('all', ''), ...leds.map((name) => new Option(name, name)));
}

export function addLines(added, leftOut) {
  if (leftOut > 0) {
    lines.push({ at_us: added[0]?.at_us ?? 0, level: 6, led: '', thread: '', text: `… ${leftOut} lines left out` });
  }
  lines.push(...added);
  lines.splice(0, lines.length - LINES_MAX);
  dirty = dirty || added.length > 0;
}

function show(line) {
  const element = document.createElement('div');
  element.className = line.level === CALL ? 'call' : line.level === 0 ? 'error' : '';
  element.textContent = `${timeText(line.at_us / 1000)} ${line.level === 0 ? 'ERROR ' : ''}${line.thread}: ${line.text}`;
  return element;
}

// A few times a second.
export function drawLog() {
  if (!dirty) {
    return;
  }
  const atEnd = list.scrollHeight - list.scrollTop - list.clientHeight < 30;
  const text = filter.value.toLowerCase();
  const wanted = (line) => levels[level.value](line) && (!ofLed.value || line.led === ofLed.value || line.text.includes(ofLed.value)) && line.text.toLowerCase().includes(text);
  list.replaceChildren(...lines.filter(wanted).slice(-SHOWN_MAX).map(show));
  dirty = false;
  if (atEnd) {
    list.scrollTop = list.scrollHeight;
  }
}
