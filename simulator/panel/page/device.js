// The device as this page knows it: its state, its clock, and how it is asked for something.
export const device = { product: '', front: [], leds: {}, daemon: {}, clock: null, story: { lines: [] }, generation: -1 };

const token = document.querySelector('meta[name="panel-token"]').content;
let clockAt = 0; // when the clock was told, by the page's own

export function setClock(clock) {
  device.clock = clock;
  clockAt = performance.now();
}

// Milliseconds of the device; runs on between two tellings, but not far.
export function now() {
  const { now_ms, speed, running } = device.clock;
  return running ? now_ms + Math.min(performance.now() - clockAt, 300) * speed : now_ms;
}

export async function ask(path, text) {
  try {
    const response = await fetch(path, { method: 'POST', body: text, headers: { 'X-Panel-Token': token } });
    return response.ok ? await response.json() : { ok: false, message: (await response.text()).trim() };
  } catch {
    return { ok: false, message: 'the panel does not answer' };
  }
}

export async function read(path) {
  const response = await fetch(path);
  if (!response.ok) {
    throw new Error(`${path}: ${response.status}`);
  }
  return response;
}

export function timeText(ms) {
  const s = Math.floor(ms / 1000);
  const two = (n) => String(n).padStart(2, '0');
  const head = s >= 86400 ? `${Math.floor(s / 86400)} d ` : '';
  return `${head}${two(Math.floor(s / 3600) % 24)}:${two(Math.floor(s / 60) % 60)}:${two(s % 60)}.${String(Math.floor(ms % 1000)).padStart(3, '0')}`;
}

export function isLit(look) {
  return look !== undefined && look.mode !== 'off' && look.brightness > 0;
}

export function colourWord(led) {
  return led.colour || `LED ${led.name.split('_').pop()}`;
}

export function inWords(led, look) {
  const seconds = (ms) => `${ms / 1000} s`;
  if (!isLit(look)) {
    return `${colourWord(led)}, off`;
  }
  const how = look.mode === 'on' ? 'on' : `blinking, ${seconds(look.on_ms)} on, ${seconds(look.off_ms)} off`;
  return `${colourWord(led)}, ${how}, brightness ${Math.min(look.brightness, 4)} of 4`;
}
