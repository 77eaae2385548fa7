// A scenario of the tree while it is played: each statement marked, each expectation with what was shown.
import { device } from './device.js';

const list = document.getElementById('lines');
const verdict = document.getElementById('verdict');
const scenario = document.getElementById('scenario');

export function drawStory(scenarios) {
  const chosen = device.story.name || scenario.value;
  scenario.replaceChildren(...scenarios.map((name) => new Option(name.replace(/^scenarios\//, ''), name)));
  if (scenarios.includes(chosen)) {
    scenario.value = chosen;
  }
  list.replaceChildren(...device.story.lines.map((line) => {
    const item = document.createElement('li');
    item.textContent = line.text;
    return item;
  }));
  markStory();
}

function stateOf(index) {
  const { next, failed } = device.story;
  if (failed && index === next - 1) {
    return 'failed';
  }
  return index < next ? 'held' : index === next && !failed ? 'current' : 'coming';
}

export function markStory() {
  const { next, failed, shown, name, lines } = device.story;
  [...list.children].forEach((item, index) => {
    const state = stateOf(index);
    if (item.className !== state) {
      item.className = state;
      item.setAttribute('aria-label', `${state}: ${lines[index].text}`);
      if (state === 'failed') {
        item.textContent = `${lines[index].text} — ${shown}`;
      } else if (state === 'current') {
        list.scrollTop = item.offsetTop - list.offsetTop - list.clientHeight / 2;
      }
    }
  });
  const over = name && next >= lines.length;
  verdict.className = failed ? 'bad' : over ? 'good' : '';
  verdict.textContent = !name ? '' : failed ? 'failed' : over ? 'every expectation held' : `statement ${next + 1} of ${lines.length}`;
}
