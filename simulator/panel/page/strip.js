// The last minutes as a strip: a row an LED, colours as bars, blinking hatched, what was done as ticks.
import { device, now, isLit, timeText } from './device.js';

const canvas = document.getElementById('strip');
const span = document.getElementById('window');
const ROW = 18;
const LEFT = 118;
const NARROW = 480; // where the times at both ends would meet
const FOOT = 18;
const BARS_MAX = 600; // an LED
const TICKS_MAX = 1000;
const paints = { red: '#e03535', green: '#27b348', blue: '#4a86f0', yellow: '#e8b200', white: '#ffffff', other: '#a878e0' };
const hatches = new Map();
let bars = new Map(); // by LED: [{ from, to (undefined: still), look }]
let ticks = [];
let colours = new Map();

export function clearStrip() {
  colours = new Map(device.front.flatMap((group) => group.leds).map((led) => [led.name, led.colour || 'other']));
  bars = new Map([...colours.keys()].map((name) => [name, []]));
  ticks = [];
}

export function addChange(change) {
  const row = bars.get(change.led);
  if (!row) {
    return;
  }
  const last = row.at(-1);
  if (last && last.to === undefined) {
    last.to = change.at_us / 1000;
  }
  if (isLit(change)) {
    row.push({ from: change.at_us / 1000, look: change });
  }
  if (row.length > BARS_MAX) {
    row.splice(0, row.length - BARS_MAX);
  }
}

export function addTick(statement) {
  ticks.push(statement.at_us / 1000);
  if (ticks.length > TICKS_MAX) {
    ticks.splice(0, ticks.length - TICKS_MAX);
  }
}

function hatch(context, colour) {
  if (!hatches.has(colour)) {
    const tile = document.createElement('canvas');
    tile.width = tile.height = 6;
    const pen = tile.getContext('2d');
    pen.strokeStyle = paints[colour];
    pen.lineWidth = 2.4;
    pen.beginPath();
    for (const x of [-6, 0, 6]) {
      pen.moveTo(x, 6);
      pen.lineTo(x + 6, 0);
    }
    pen.stroke();
    hatches.set(colour, context.createPattern(tile, 'repeat'));
  }
  return hatches.get(colour);
}

function drawBar(context, bar, colour, top, x, width) {
  const height = 4 + 2.5 * Math.min(bar.look.brightness, 4);
  const y = top + (ROW - height) / 2;
  context.fillStyle = bar.look.mode === 'blink' ? hatch(context, colour) : paints[colour];
  context.fillRect(x, y, width, height);
  context.strokeRect(x, y, width, height);
}

export function drawStrip() {
  const names = [...bars.keys()];
  const ratio = devicePixelRatio || 1;
  const width = canvas.clientWidth;
  const height = names.length * ROW + FOOT;
  if (canvas.width !== Math.round(width * ratio) || canvas.height !== Math.round(height * ratio)) {
    canvas.width = Math.round(width * ratio);
    canvas.height = Math.round(height * ratio);
    canvas.style.height = `${height}px`;
    hatches.clear();
  }
  const context = canvas.getContext('2d');
  const style = getComputedStyle(canvas);
  const end = now();
  const length = Number(span.value) * 1000;
  const begin = end - length;
  const place = (ms) => LEFT + ((Math.max(ms, begin) - begin) / length) * (width - LEFT - 4);
  context.setTransform(ratio, 0, 0, ratio, 0, 0);
  context.clearRect(0, 0, width, height);
  context.font = '12px system-ui, sans-serif';
  context.textBaseline = 'middle';
  context.textAlign = 'right';
  names.forEach((name, row) => {
    context.fillStyle = style.color;
    context.fillText(name, LEFT - 6, row * ROW + ROW / 2);
    context.strokeStyle = '#8888';
    context.beginPath();
    context.moveTo(LEFT, row * ROW + ROW / 2);
    context.lineTo(width - 4, row * ROW + ROW / 2);
    context.stroke();
    context.strokeStyle = style.color;
    for (const bar of bars.get(name)) {
      const to = bar.to ?? end;
      if (to >= begin) {
        const x = place(bar.from);
        drawBar(context, bar, colours.get(name), row * ROW, x, Math.max(place(to) - x, 1));
      }
    }
  });
  context.strokeStyle = '#8886';
  context.fillStyle = style.color;
  let last = -1;
  for (const tick of ticks) {
    const x = Math.round(place(tick)) + 0.5;
    if (tick >= begin && x !== last) {
      context.beginPath();
      context.moveTo(x, 0);
      context.lineTo(x, names.length * ROW + 5);
      context.stroke();
      last = x;
    }
  }
  context.textAlign = 'left';
  context.fillText(begin > 0 ? timeText(begin) : width < NARROW ? '' : `${timeText(0)} and before`, LEFT, height - 7);
  context.textAlign = 'right';
  context.fillText(timeText(end), width - 4, height - 7);
}
