// The front as a drawing: a lens for each indicator, the LEDs of one indicator behind the same lens.
import { device, now, isLit, inWords, colourWord, read } from './device.js';

const SVG = 'http://www.w3.org/2000/svg';
const LENS = { width: 96, height: 56, top: 26, apart: 118, row: 124 };
const NARROW = 560; // pixels; below, the lenses stand in rows of
const NARROW_ROW = 3;
const SLOWEST_FAST_MS = 160; // a blink that is shorter than this on the screen is drawn as a steady half light
const still = matchMedia('(prefers-reduced-motion: reduce)');
const drawing = document.getElementById('front');
const details = document.getElementById('details');
let lenses = []; // { group, leds: [{ led, g, core, glow, letter, ring }], state, both, word }
let shown = null; // the lens that the details are about
let asked = 0;
let inRow = 0;

addEventListener('resize', () => {
  if ((drawing.clientWidth < NARROW) !== (inRow === NARROW_ROW)) {
    drawFront();
  }
});

function make(name, attributes, parent) {
  const element = document.createElementNS(SVG, name);
  for (const [key, value] of Object.entries(attributes)) {
    element.setAttribute(key, value);
  }
  parent.append(element);
  return element;
}

function makeLed(led, parent) {
  const g = make('g', { class: 'led', 'data-led': led.name, 'data-lit': 'false' }, parent);
  const paint = led.colour || 'other';
  const glow = make('circle', { class: `${paint} glow`, opacity: 0, filter: 'url(#soft)' }, g);
  const core = make('circle', { class: `${paint} core`, r: 12, opacity: 0 }, g);
  const letter = make('text', { class: 'letter', opacity: 0 }, g);
  letter.textContent = led.colour ? led.colour[0].toUpperCase() : led.name.split('_').pop();
  const ring = make('circle', { class: 'ring', r: 16, opacity: 0 }, g);
  return { led, g, core, glow, letter, ring };
}

function makeLens(group, column, row, parent) {
  const place = `translate(${14 + column * LENS.apart} ${LENS.top + row * LENS.row})`;
  const g = make('g', { class: 'lens', tabindex: 0, role: 'img', transform: place }, parent);
  make('rect', { class: 'glass', width: LENS.width, height: LENS.height, rx: 12 }, g);
  const unlit = make('circle', { class: 'unlit', cx: LENS.width / 2, cy: LENS.height / 2, r: 9 }, g);
  const lens = { group, g, unlit, leds: group.leds.map((led) => makeLed(led, g)) };
  lens.word = make('text', { class: 'word', x: LENS.width / 2, y: LENS.height + 20 }, g);
  lens.word.textContent = group.word;
  lens.state = make('text', { class: 'state', x: LENS.width / 2, y: LENS.height + 38 }, g);
  lens.both = make('text', { class: 'both', x: LENS.width - 6, y: 14 }, g);
  g.addEventListener('pointerenter', () => tell(lens));
  g.addEventListener('focus', () => tell(lens));
  return lens;
}

export function drawFront() {
  inRow = drawing.clientWidth < NARROW ? NARROW_ROW : Math.max(1, device.front.length);
  const width = inRow * LENS.apart + 10;
  const height = Math.ceil(device.front.length / inRow) * LENS.row + 16;
  const svg = document.createElementNS(SVG, 'svg');
  svg.setAttribute('viewBox', `0 0 ${width} ${height}`);
  svg.style.maxWidth = `${width * 1.15}px`;
  svg.setAttribute('role', 'group');
  svg.setAttribute('aria-label', `Front of ${device.product || 'no device yet'}`);
  const filter = make('filter', { id: 'soft', x: '-100%', y: '-100%', width: '300%', height: '300%' }, make('defs', {}, svg));
  make('feGaussianBlur', { stdDeviation: 7 }, filter);
  make('rect', { class: 'case', x: 0, y: 0, width, height, rx: 18 }, svg);
  lenses = device.front.map((group, index) => makeLens(group, index % inRow, Math.floor(index / inRow), svg));
  drawing.replaceChildren(svg);
  shown = null;
  setLooks();
}

function shortWords(lit) {
  if (lit.length === 0) {
    return 'dark';
  }
  return lit.map(({ led }) => (device.leds[led.name].mode === 'blink' ? 'blinks ' : '') + colourWord(led)).join(' + ');
}

// Places the lit LEDs of each lens; what blinks is lit and dark by blink().
export function setLooks() {
  for (const lens of lenses) {
    const lit = lens.leds.filter(({ led }) => isLit(device.leds[led.name]));
    lens.leds.forEach((part) => {
      const place = lit.indexOf(part);
      const x = LENS.width / 2 + (place < 0 ? 0 : (place - (lit.length - 1) / 2) * (lit.length > 2 ? 26 : 38));
      const brightness = place < 0 ? 0 : Math.min(device.leds[part.led.name].brightness, 4);
      for (const circle of [part.core, part.glow, part.ring]) {
        circle.setAttribute('cx', x);
        circle.setAttribute('cy', LENS.height / 2);
      }
      part.letter.setAttribute('x', x);
      part.letter.setAttribute('y', LENS.height / 2 + 4);
      part.glow.setAttribute('r', 12 + 4 * brightness);
      part.ring.setAttribute('opacity', place >= 0 && device.leds[part.led.name].mode === 'blink' ? 1 : 0);
      part.light = place < 0 ? 0 : 0.4 + 0.15 * brightness;
    });
    lens.unlit.setAttribute('opacity', lit.length > 0 ? 0 : 1);
    lens.state.textContent = shortWords(lit);
    lens.both.textContent = lit.length > 1 ? `${lit.length} lit` : '';
    const words = lit.length === 0 ? 'dark' : lit.map(({ led }) => inWords(led, device.leds[led.name])).join('; ');
    lens.g.setAttribute('aria-label', `${lens.group.word}: ${words}`);
  }
  blink();
  if (shown) {
    tell(shown);
  }
}

function isOnNow(look) {
  const period = look.on_ms + look.off_ms;
  if (look.mode !== 'blink' || period === 0) {
    return 1;
  }
  if (still.matches || period / (device.clock.running ? device.clock.speed : 1) < SLOWEST_FAST_MS) {
    return 0.6;
  }
  const phase = (now() - look.since_us / 1000) % period;
  return (phase + period) % period < look.on_ms ? 1 : 0;
}

// At every frame.
export function blink() {
  for (const lens of lenses) {
    for (const part of lens.leds) {
      const light = part.light > 0 ? part.light * isOnNow(device.leds[part.led.name] ?? { mode: 'off' }) : 0;
      if (light === part.drawn) {
        continue;
      }
      part.drawn = light;
      part.core.setAttribute('opacity', light);
      part.glow.setAttribute('opacity', light * 0.8);
      part.letter.setAttribute('opacity', light > 0 ? 1 : 0);
      part.g.setAttribute('data-lit', light > 0);
    }
  }
}

function paragraph(text, name = 'p') {
  const element = document.createElement(name);
  element.textContent = text;
  return element;
}

function tell(lens) {
  const changed = lens !== shown;
  const words = lens.leds.map(({ led }) => `${led.name} (${led.id}): ${inWords(led, device.leds[led.name])}`);
  if (!changed && details.dataset.words === words.join()) {
    return;
  }
  shown = lens;
  details.dataset.words = words.join();
  details.replaceChildren(paragraph(lens.group.word, 'h3'), ...lens.leds.flatMap((part, at) => {
    part.why = paragraph('', 'pre');
    return [paragraph(words[at]), part.why];
  }));
  const turn = ++asked;
  setTimeout(() => turn === asked && tellWhy(lens, turn), 250);
}

async function tellWhy(lens, turn) {
  for (const part of lens.leds.filter(({ led }) => isLit(device.leds[led.name]))) {
    try {
      const text = await (await read(`why?led=${part.led.name}`)).text();
      if (turn !== asked) {
        return;
      }
      part.why.textContent = text.trim();
    } catch {
      part.why.textContent = '';
    }
  }
}
