// What can happen to the device: each control says it in statements of the scenario language.
import { device } from './device.js';

const on = (label, text) => ({ label, text });
const choice = (label, name, options) => ({ label, name, options });
const slider = (label, most, value, text) => ({ label, most, value, text });
const notify = (nv, event) => `nv ${nv}\nnotify ${event}`;

const SIM_NETWORKS = [
  ['no service', 'missing'], ['limited service', 'LIMITED_SERVICE_GSM'], ['2G', 'EDGE'], ['3G', 'HSPA+'], ['4G', 'LTE'],
  ['5G', 'SA'], ['5G beside 4G', 'ENDC'],
];

const groups = [
  ['Power', [
    on('On', 'notify MAIN POWERON'),
    on('Self-test', 'notify MAIN INITAL'),
    on('Shut down', 'notify MAIN SHUTTING_DOWN'),
    on('Restart', 'notify MAIN RESTARTING'),
    on('Factory reset', 'notify MAIN RESETTING'),
    choice('Off as', 'off', [
      ['charging', 'notify MAIN POWER_OFF_CHARGE'], ['only for the eye', 'notify MAIN POWER_OFF_UNREADL'],
      ['quick', 'notify MAIN POWER_OFF_QUICKEN'], ['quick, charging', 'notify MAIN POWER_OFF_CHARGE_QUICKEN'],
      ['quick, acknowledged', 'notify MAIN POWER_OFF_QUICKEN_ACK']]),
    choice('Sleep', 'sleep', [['awake', 'notify SLEEP 0'], ['asleep', 'notify SLEEP 1'], ['asleep (5)', 'notify SLEEP 5']]),
  ]],
  ['Battery', [
    slider('Level %', 100, 80, (v) => notify(`battery_value=${v}`, 'MAIN BATTERY_VALUE')),
    choice('Charging', 'charging', [
      ['no', 'charger 0 0\nnv battery_charging=0\nnotify MAIN CHARGIN_STATUS'],
      ['yes', 'charger 0 1\nnv battery_charging=1\nnotify MAIN CHARGIN_STATUS'],
      ['full', 'charger 0 1\nnv battery_charging=2\nnotify MAIN CHARGIN_STATUS']]),
    choice('Battery', 'battery', [
      ['in the device', 'battery 0 1\nnv battery_exist=1\nnotify MAIN BATTERY_VALUE'],
      ['none', 'battery 0 0\nnv battery_exist=0\nnotify MAIN BATTERY_VALUE']]),
    choice('Board says', 'board', [1350, 1351, 1352, 1353, 1354, 1355, 1356, 1357].map((i) => [`${i}`, `indication ${i}`])),
  ]],
  ['Network', [
    choice('Type', 'network', SIM_NETWORKS.map(([word, nv]) => [word, notify(`network_type=${nv}`, 'NWINFO NETTYPE')])),
    slider('Bars', 5, 4, (v) => notify(`signalbar=${v}`, 'NWINFO SIG_BAR')),
    choice('Roaming', 'roaming', ['Home', 'Roaming'].map((v) => [v, notify(`simcard_roam=${v}`, 'NWINFO ROAMING_STATUS')])),
    choice('Data call', 'call', [
      ['down', 'nv q6_ppp_status=q6_ppp_disconnected\nnotify PPP PPP_STATUS 0'],
      ['up', 'nv q6_ppp_status=q6_ppp_connected\nnotify PPP PPP_STATUS 1']]),
  ]],
  ['Wi-Fi', [
    on('On', 'nv wifi_onoff_state=1\nnotify WLAN CURRENT_STATUS 1'),
    on('Off', 'nv wifi_onoff_state=0\nnotify WLAN CURRENT_STATUS 0'),
    on('WPS pairing', 'nv wifi_chip1_wps_state=1\nnotify WLAN AP_WPS_STATE 1'),
    on('WPS over', 'nv wifi_chip1_wps_state=0\nnotify WLAN AP_WPS_STATE 0'),
  ]],
  ['Messages and calls', [
    on('New message', 'nv sms_nvunread_count=1\nnotify SMS NEW_SMS'),
    on('All read', 'nv sms_nvunread_count=0 sms_nvtotal_count=1\nnotify SMS NV_UNREAD_SMS'),
    on('Store full', 'nv sms_nvtotal_count=100\nnotify SMS MEMORY_FULL'),
    on('Voicemail', 'notify SMS VOCEMAIL_SET_FLAG 1'),
    on('No voicemail', 'notify SMS VOCEMAIL_SET_FLAG 0'),
    choice('Phone', 'phone', [
      ['on the hook', 'notify VOICE "PHONE LED OFF"'], ['in use', 'notify VOICE "PHONE LED ON"'],
      ['rings', 'notify VOICE "PHONE BLINK"']]),
  ]],
  ['Heat, night and allowance', [
    slider('Sensor 0 °C', 120, 40, (v) => `nv thermal_led_enable=60\nsensor 0 ${v}\ncommand OVER_TEMP`),
    choice('Night mode', 'night', [
      ['off', 'nv night_mode_switch=0\ncommand NIGHT_MODE'],
      ['dimmed 22:00 to 06:30', 'nv night_mode_switch=1 night_mode_start_time=22:00 night_mode_end_time=06:30 syn_done=1 night_mode_close_all_led=0\ncommand NIGHT_MODE'],
      ['dark 22:00 to 06:30', 'nv night_mode_switch=1 night_mode_start_time=22:00 night_mode_end_time=06:30 syn_done=1 night_mode_close_all_led=1\ncommand NIGHT_MODE']]),
    choice('Allowance', 'allowance', [
      ['no limit', 'nv data_volume_limit_switch=0'],
      ['4 GB, 1 GB used', 'nv data_volume_limit_switch=1 data_volume_limit_unit=data data_volume_limit_size=4_1024 data_volume_alert_percent=75 monthly_tx_bytes=1073741824 monthly_rx_bytes=0'],
      ['4 GB, used up', 'nv data_volume_limit_switch=1 data_volume_limit_unit=data data_volume_limit_size=4_1024 data_volume_alert_percent=75 monthly_tx_bytes=4294967296 monthly_rx_bytes=0']]),
  ]],
  ['Daemon and board', [
    on('Relight', 'command RELIGHT'),
    on('Re-read heat', 'command OVER_TEMP'),
    on('Re-read night', 'command NIGHT_MODE'),
    on('Kill', 'kill'),
    on('Start', 'start'),
    on('LED calls fail', 'fail kiv_bsp_set_leds_sync * -1'),
    on('NV reads fail', 'fail kiv_nvconfig_read * -1'),
    on('Repair all', 'repair all'),
  ]],
];

function labelled(text, element) {
  const label = document.createElement('label');
  label.append(`${text} `, element);
  return label;
}

function makeButton(item, act) {
  const button = document.createElement('button');
  button.type = 'button';
  button.textContent = item.label;
  button.title = item.text;
  button.dataset.says = item.text;
  button.addEventListener('click', () => act(item.text));
  return button;
}

// Not at every arrow key: what is chosen is done with Enter, or when the list closes.
function makeChoice(item, act) {
  const select = document.createElement('select');
  select.dataset.control = item.name;
  select.append(new Option('choose…', ''), ...item.options.map(([word, text]) => new Option(word, text)));
  [...select.options].slice(1).forEach((option) => { option.dataset.says = option.value; });
  select.addEventListener('change', () => select.value && act(select.value));
  return labelled(item.label, select);
}

function makeSlider(item, act) {
  const range = document.createElement('input');
  const value = document.createElement('output');
  Object.assign(range, { type: 'range', min: 0, max: item.most });
  range.value = value.textContent = item.value;
  range.dataset.says = item.text(item.value);
  range.addEventListener('input', () => { value.textContent = range.value; });
  range.addEventListener('change', () => act(item.text(range.value)));
  const label = labelled(item.label, range);
  label.append(' ', value);
  return label;
}

export function makeControls(place, act) {
  const perform = (text) => device.clock && act(text);
  for (const [name, items] of groups) {
    const box = document.createElement('fieldset');
    const legend = document.createElement('legend');
    legend.textContent = name;
    box.append(legend, ...items.map((item) => {
      const make = item.options ? makeChoice : item.most ? makeSlider : makeButton;
      return make(item, perform);
    }));
    place.append(box);
  }
}

const hides = (within) => [...within.querySelectorAll('[data-says]')].every((one) => one.hidden);

// What the daemon of this product has not asked to be told of is not offered; before it has asked, everything is.
export function offerWhatIsHeard() {
  const hears = device.daemon.hears ?? [];
  const names = (module, word) => (one) => one === `${module} ${word}` || (!/^[A-Z_]{2,}$/.test(word) && one.startsWith(`${module} `));
  const reaches = (text) => [...text.matchAll(/^notify (\w+) (\S+)/gm)].every(([, module, word]) => hears.some(names(module, word)));
  for (const one of document.querySelectorAll('#controls [data-says]')) {
    one.hidden = hears.length > 1 && !reaches(one.dataset.says);
  }
  for (const around of document.querySelectorAll('#controls label, #controls fieldset')) {
    around.hidden = hides(around);
  }
}
