// The page: what the panel tells is drawn, what a person does is asked for.
import { device, ask, read, setClock, now, timeText } from './device.js';
import { drawFront, setLooks, blink } from './front.js';
import { clearStrip, addChange, addTick, drawStrip } from './strip.js';
import { makeControls, offerWhatIsHeard } from './controls.js';
import { clearLog, addLines, drawLog } from './log.js';
import { drawStory, markStory } from './story.js';

const by = (id) => document.getElementById(id);
const DONE_MAX = 100;
const SLOW_MS = 250; // between two drawings of log and strip
let loading = null;
let batches = 0; // that the last state held

function drawDaemon() {
  offerWhatIsHeard();
  const { alive, launched, end } = device.daemon;
  by('death').hidden = alive || !launched;
  by('cause').textContent = `The daemon ${end || 'has been killed'}.`;
}

function drawTime() {
  const { wall_ms, now_ms, speed, running, next_ms } = device.clock;
  const ahead = now() - now_ms;
  const wall = new Date(wall_ms + ahead);
  by('wall').textContent = wall.toISOString().slice(0, 19).replace('T', ' ');
  by('since').textContent = `${timeText(now())} after the start`;
  by('run').textContent = running ? 'Pause' : 'Run';
  by('run').setAttribute('aria-pressed', running);
  by('step').disabled = next_ms === null;
  document.querySelector(`input[name="speed"][value="${speed}"]`).checked = true;
}

function addDone(statement) {
  const item = document.createElement('li');
  const at = document.createElement('span');
  at.className = 'at';
  at.textContent = timeText(statement.at_us / 1000);
  item.append(at, ` ${statement.text}`);
  by('done').prepend(item);
  while (by('done').children.length > DONE_MAX) {
    by('done').lastChild.remove();
  }
}

// Everything anew: at first, for a new device, and when batches were missed.
async function load() {
  const state = await (await read('state')).json();
  const isNew = state.generation !== device.generation || state.product !== device.product;
  Object.assign(device, { product: state.product, front: state.front, leds: state.leds, daemon: state.daemon, story: state.story, generation: state.generation });
  device.story.shown = state.story.lines.find((line) => line.state === 'failed')?.shown ?? '';
  setClock(state.clock);
  const missed = state.batches > batches + 1;
  batches = state.batches;
  if (isNew || missed) {
    by('product').replaceChildren(...state.products.map((name) => new Option(name)));
    by('product').value = state.product || state.products[0];
    by('done').replaceChildren();
    drawFront();
    clearStrip();
    clearLog(state.front.flatMap((group) => group.leds.map((led) => led.name)));
    addNews(state.past);
  }
  setLooks();
  drawStory(state.scenarios);
  drawDaemon();
  drawTime();
}

function addNews(news) {
  news.changes.forEach(addChange);
  news.statements.forEach(addTick);
  news.statements.slice(-DONE_MAX).forEach(addDone);
  addLines(news.lines, news.left_out);
}

function reload() {
  loading = loading ?? load().finally(() => { loading = null; });
  return loading;
}

async function take(batch) {
  if (batch.generation !== device.generation || batch.product !== device.product) {
    await reload();
  }
  if (batch.generation !== device.generation || batch.number < batches) {
    return;
  }
  batches = batch.number + 1;
  setClock(batch.clock);
  device.daemon = batch.daemon;
  device.leds = batch.leds;
  Object.assign(device.story, batch.story);
  addNews(batch);
  setLooks();
  markStory();
  drawDaemon();
}

function listen() {
  const events = new EventSource('events');
  let turn = Promise.resolve(); // one batch after the other
  events.onopen = () => {
    by('link').textContent = 'connected';
    turn = turn.then(reload).catch(() => {});
  };
  events.onerror = () => { by('link').textContent = 'the panel does not answer'; };
  events.onmessage = (event) => { turn = turn.then(() => take(JSON.parse(event.data))).catch(() => {}); };
  events.addEventListener('missed', () => { turn = turn.then(reload).catch(() => {}); });
}

async function act(text) {
  const answer = await ask('do', text);
  by('answer').className = answer.ok ? '' : 'bad';
  by('answer').textContent = answer.ok ? 'done' : `${answer.line > 1 ? `line ${answer.line}: ` : ''}${answer.message}`;
  return answer;
}

async function request(path, text) {
  const answer = await ask(path, text);
  by('answer').className = answer.ok ? '' : 'bad';
  by('answer').textContent = answer.ok ? '' : answer.message;
}

async function keep() {
  const text = await (await read('keep')).text();
  by('kept-text').value = text || 'Too much has been done to keep it: a scenario holds 256 KiB.';
  URL.revokeObjectURL(by('download').href);
  by('download').href = URL.createObjectURL(new Blob([text], { type: 'text/plain' }));
  by('kept').showModal();
}

function wire() {
  makeControls(by('controls'), act);
  by('new').addEventListener('click', () => request('new', by('product').value));
  by('restart').addEventListener('click', () => act('start'));
  by('run').addEventListener('click', () => request('time', device.clock.running ? 'pause' : 'run'));
  by('step').addEventListener('click', () => request('time', 'step'));
  by('speeds').addEventListener('change', (event) => request('time', event.target.value));
  by('keep').addEventListener('click', keep);
  by('close').addEventListener('click', () => by('kept').close());
  by('copy').addEventListener('click', () => navigator.clipboard.writeText(by('kept-text').value));
  by('set-clock').addEventListener('submit', (event) => {
    event.preventDefault();
    act(`clock ${by('clock').value.slice(0, 5)}`);
  });
  by('story').addEventListener('submit', (event) => {
    event.preventDefault();
    request('play', by('scenario').value);
  });
  by('statement').addEventListener('submit', async (event) => {
    event.preventDefault();
    const answer = await act(by('text').value);
    if (answer.ok) {
      by('text').value = '';
    }
  });
  by('text').addEventListener('keydown', (event) => {
    if (event.key === 'Enter' && (event.ctrlKey || event.metaKey)) {
      by('statement').requestSubmit();
    }
  });
}

function frame() {
  if (device.clock) {
    blink();
    drawTime();
  }
  requestAnimationFrame(frame);
}

wire();
listen();
requestAnimationFrame(frame);
setInterval(() => {
  if (device.clock && !document.hidden) {
    drawStrip();
    drawLog();
  }
}, SLOW_MS);
