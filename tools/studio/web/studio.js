// The studio page: the viewport (a multipart JPEG stream drawn on a canvas), transport, camera,
// inspector with a field per link, the curve editor, live plots and the console. Every request
// carries the token the page was opened with.
'use strict';

const token = document.querySelector('meta[name="studio-token"]').content;
const $ = (id) => document.getElementById(id);

// What the tests and a curious user can look at from the browser's console.
const studio = {
  state: null,
  inspector: null,
  selected: null,
  frames: 0,        // pictures drawn
  lastStats: null,
  history: [],      // stats of the frames drawn, the last kPlotFrames
  charts: {},
};
window.studio = studio;
const kPlotFrames = 150;

async function api(path, body) {
  const options = { headers: { 'X-Studio-Token': token } };
  if (body !== undefined) {
    options.method = 'POST';
    options.headers['Content-Type'] = 'application/json';
    options.body = JSON.stringify(body);
  }
  const response = await fetch(path, options);
  const answer = await response.json();
  if (path === '/api/state') applyState(answer);
  else if (answer.state) applyState(answer.state);
  return answer;
}

// ---- Viewport stream -------------------------------------------------------------------------

function indexOf(bytes, pattern, from) {
  outer: for (let i = from; i <= bytes.length - pattern.length; ++i) {
    for (let j = 0; j < pattern.length; ++j) if (bytes[i + j] !== pattern[j]) continue outer;
    return i;
  }
  return -1;
}

async function readStream() {
  const blankLine = new TextEncoder().encode('\r\n\r\n');
  for (;;) {
    try {
      const response = await fetch('/api/stream', { headers: { 'X-Studio-Token': token } });
      if (!response.ok) throw new Error('stream refused: ' + response.status);
      const reader = response.body.getReader();
      let buffer = new Uint8Array(0);
      for (;;) {
        const { value, done } = await reader.read();
        if (done) break;
        const joined = new Uint8Array(buffer.length + value.length);
        joined.set(buffer);
        joined.set(value, buffer.length);
        buffer = joined;
        for (;;) {
          const headEnd = indexOf(buffer, blankLine, 0);
          if (headEnd < 0) break;
          const head = new TextDecoder().decode(buffer.subarray(0, headEnd));
          const length = Number((/Content-Length: (\d+)/i.exec(head) || [])[1]);
          const stats = (/X-Stats: (.*)/i.exec(head) || [])[1];
          const start = headEnd + 4;
          if (!(length >= 0) || buffer.length < start + length + 2) break;
          const jpeg = buffer.slice(start, start + length);
          buffer = buffer.slice(start + length + 2);
          await showFrame(jpeg, stats ? JSON.parse(stats) : null);
        }
      }
    } catch (error) {
      console.warn(error);
    }
    await new Promise((resolve) => setTimeout(resolve, 500));
  }
}

async function showFrame(jpeg, stats) {
  const bitmap = await createImageBitmap(new Blob([jpeg], { type: 'image/jpeg' }));
  const canvas = $('viewport');
  if (canvas.width !== bitmap.width || canvas.height !== bitmap.height) {
    canvas.width = bitmap.width;
    canvas.height = bitmap.height;
  }
  // A canvas kept in main memory: an accelerated one loses its picture when the browser's GPU
  // process restarts, and the page (and its tests) read the pixels back.
  canvas.getContext('2d', { willReadFrequently: true }).drawImage(bitmap, 0, 0);
  bitmap.close();
  studio.frames += 1;
  if (stats) addStats(stats);
}

// ---- Plots -----------------------------------------------------------------------------------

function makeChart(id, title, series) {
  const colours = ['#6cf', '#fc6', '#f79', '#9e7', '#c9f', '#fa8'];
  return new Chart($(id), {
    type: 'line',
    data: {
      labels: [],
      datasets: series.map((name, i) => ({
        label: name, data: [], borderColor: colours[i % colours.length], pointRadius: 0,
        borderWidth: 1.5,
      })),
    },
    options: {
      animation: false, responsive: true, maintainAspectRatio: false,
      plugins: { title: { display: true, text: title, color: '#ccd' },
                 legend: { labels: { color: '#ccd', boxWidth: 10 } } },
      scales: { x: { ticks: { color: '#889', maxTicksLimit: 6 } },
                y: { ticks: { color: '#889' }, beginAtZero: true } },
    },
  });
}

function setupCharts() {
  if (typeof Chart === 'undefined') return;
  studio.charts.live = makeChart('plot-live', 'Live particles', ['live']);
  studio.charts.births = makeChart('plot-births', 'Births per frame', ['births']);
  studio.charts.attached = makeChart('plot-attached', 'Attached and sliding', ['attached', 'sliding']);
  studio.charts.cpu = makeChart('plot-cpu', 'Channel time per frame (ms)', []);
}

function cpuChannels() {
  const names = (studio.state && studio.state.channelNames) || [];
  const shown = [];
  names.forEach((name, i) => { if (name && name !== 'camera.eye') shown.push([name, i]); });
  return shown;
}

function addStats(stats) {
  studio.lastStats = stats;
  studio.history.push(stats);
  if (studio.history.length > kPlotFrames) studio.history.shift();
  $('frame-label').textContent = stats.frame + ' / ' + stats.frames;
  if (!scrubbing) $('scrub').value = stats.frame;
  $('scrub').max = stats.frames;
  if (stats.messages !== (studio.state && studio.state.messageTotal)) refreshStateSoon();
  if (!studio.charts.live) return;
  const labels = studio.history.map((s) => s.frame);
  const set = (chart, series) => {
    chart.data.labels = labels;
    series.forEach((pick, i) => { chart.data.datasets[i].data = studio.history.map(pick); });
    chart.update('none');
  };
  set(studio.charts.live, [(s) => s.live]);
  set(studio.charts.births, [(s) => s.births]);
  set(studio.charts.attached, [(s) => s.attached, (s) => s.sliding]);
  const cpu = studio.charts.cpu;
  const channels = cpuChannels();
  if (cpu.data.datasets.length !== channels.length ||
      cpu.data.datasets.some((d, i) => d.label !== channels[i][0])) {
    const colours = ['#6cf', '#fc6', '#f79', '#9e7', '#c9f', '#fa8'];
    cpu.data.datasets = channels.map(([name], i) => ({
      label: name, data: [], borderColor: colours[i % colours.length], pointRadius: 0,
      borderWidth: 1.5,
    }));
  }
  set(cpu, channels.map(([, index]) => (s) => (s.channelMs || [])[index] || 0));
}

// ---- State, transport, files -----------------------------------------------------------------

let scrubbing = false;
let stateTimer = null;

function refreshStateSoon() {
  if (stateTimer) return;
  stateTimer = setTimeout(async () => { stateTimer = null; await api('/api/state'); }, 300);
}

function applyState(state) {
  const previous = studio.state;
  studio.state = state;
  $('scene-name').textContent = state.scene + (state.device === 'null' ? ' (no pictures)' : '');
  $('play').textContent = state.playing ? 'Pause' : 'Play';
  $('undo').disabled = state.undo === 0;
  $('redo').disabled = state.redo === 0;
  if (!$('save-name').value) $('save-name').value = state.saveName;
  if (state.frames) $('scrub').max = state.frames;
  if (state.width) $('resolution').value = state.width + 'x' + state.height;
  $('message-total').textContent = state.messageTotal ? state.messageTotal + ' messages' : '';
  if (state.background !== undefined)
    $('background').value = '#' + state.background.toString(16).padStart(6, '0');
  const list = $('console');
  list.replaceChildren(
    ...(state.warnings || []).map((w) => element('li', { className: 'warning', textContent: 'scene warning: ' + w })),
    ...(state.messages || []).map((m) => element('li', {
      textContent: m.text + (m.count > 1 ? '  \u00d7' + m.count : ''),
    })));
  const changed = !previous || previous.revision !== state.revision;
  if (changed) loadInspector();
}

function setupTransport() {
  $('play').onclick = () => api('/api/play', { playing: !studio.state.playing });
  $('step').onclick = () => api('/api/step', {});
  $('restart').onclick = () => api('/api/restart', {});
  $('undo').onclick = () => api('/api/undo', {});
  $('redo').onclick = () => api('/api/redo', {});
  const scrub = $('scrub');
  scrub.oninput = () => { scrubbing = true; $('frame-label').textContent = scrub.value + ' / ' + scrub.max; };
  scrub.onchange = async () => {
    await api('/api/play', { playing: false });
    await api('/api/seek', { frame: Number(scrub.value) });
    scrubbing = false;
  };
  $('resolution').onchange = () => {
    const [w, h] = $('resolution').value.split('x').map(Number);
    edit(['resolution'], [w, h], $('view-message'));
  };
  $('background').onchange = () => edit(['background'], $('background').value.toUpperCase(),
                                        $('view-message'));
  $('reset-view').onclick = () => api('/api/view', { reset: true });
  $('save').onclick = async () => {
    const answer = await api('/api/save', { name: $('save-name').value });
    $('file-message').textContent = answer.ok ? 'saved ' + $('save-name').value : answer.error;
    $('file-message').className = answer.ok ? 'note' : 'error';
  };
  $('open').onclick = async () => {
    const answer = await api('/api/open', { name: $('save-name').value });
    $('file-message').textContent = answer.ok ? 'opened ' + $('save-name').value : answer.error;
    $('file-message').className = answer.ok ? 'note' : 'error';
  };
  $('export').onclick = async () => {
    const answer = await api('/api/export', { folder: $('export-folder').value });
    if (!answer.ok) {
      $('file-message').textContent = answer.error;
      $('file-message').className = 'error';
      return;
    }
    watchExport();
  };
  document.addEventListener('keydown', (event) => {
    if (event.target.tagName === 'INPUT' || event.target.tagName === 'SELECT') return;
    if (event.ctrlKey && event.key === 'z') api('/api/undo', {});
    if (event.ctrlKey && event.key === 'y') api('/api/redo', {});
    if (event.key === ' ') { event.preventDefault(); $('play').click(); }
  });
}

async function watchExport() {
  const bar = $('export-progress');
  bar.hidden = false;
  for (;;) {
    const progress = await api('/api/export');
    bar.max = Math.max(progress.total, 1);
    bar.value = progress.done;
    $('file-message').className = progress.error ? 'error' : 'note';
    $('file-message').textContent = progress.error ? progress.error :
      progress.running ? 'exporting ' + progress.done + ' / ' + progress.total :
      'exported ' + progress.done + ' frames to ' + progress.folder;
    if (!progress.running) break;
    await new Promise((resolve) => setTimeout(resolve, 250));
  }
  bar.hidden = true;
}

// ---- Camera: orbit, pan, zoom ----------------------------------------------------------------

const vec = {
  sub: (a, b) => [a[0] - b[0], a[1] - b[1], a[2] - b[2]],
  add: (a, b) => [a[0] + b[0], a[1] + b[1], a[2] + b[2]],
  scale: (a, s) => [a[0] * s, a[1] * s, a[2] * s],
  length: (a) => Math.hypot(a[0], a[1], a[2]),
  cross: (a, b) => [a[1] * b[2] - a[2] * b[1], a[2] * b[0] - a[0] * b[2], a[0] * b[1] - a[1] * b[0]],
  normal: (a) => { const l = Math.hypot(a[0], a[1], a[2]) || 1; return [a[0] / l, a[1] / l, a[2] / l]; },
};
let viewInFlight = false;
let viewPending = null;

async function sendView(view) {
  viewPending = view;
  if (viewInFlight) return;
  viewInFlight = true;
  while (viewPending) {
    const next = viewPending;
    viewPending = null;
    const answer = await api('/api/view', next);
    $('view-message').textContent = answer.ok ? '' : answer.error;
  }
  viewInFlight = false;
}

function setupCamera() {
  const canvas = $('viewport');
  let drag = null;
  canvas.addEventListener('contextmenu', (event) => event.preventDefault());
  canvas.addEventListener('mousedown', (event) => {
    if (!studio.state || !studio.state.view) return;
    drag = { x: event.clientX, y: event.clientY, pan: event.shiftKey || event.button === 2,
             eye: studio.state.view.eye, target: studio.state.view.target };
  });
  window.addEventListener('mouseup', () => { drag = null; });
  window.addEventListener('mousemove', (event) => {
    if (!drag) return;
    const dx = event.clientX - drag.x, dy = event.clientY - drag.y;
    const offset = vec.sub(drag.eye, drag.target);
    const distance = vec.length(offset);
    let eye, target;
    if (drag.pan) {
      const forward = vec.normal(vec.scale(offset, -1));
      const right = vec.normal(vec.cross([0, 1, 0], forward));
      const up = vec.cross(forward, right);
      const move = vec.add(vec.scale(right, -dx * distance * 0.002), vec.scale(up, dy * distance * 0.002));
      eye = vec.add(drag.eye, move);
      target = vec.add(drag.target, move);
    } else {
      const yaw = Math.atan2(offset[0], offset[2]) - dx * 0.01;
      const pitch = Math.max(-1.5, Math.min(1.5, Math.asin(offset[1] / distance) + dy * 0.01));
      target = drag.target;
      eye = vec.add(target, [distance * Math.cos(pitch) * Math.sin(yaw), distance * Math.sin(pitch),
                             distance * Math.cos(pitch) * Math.cos(yaw)]);
    }
    sendView({ eye, target });
  });
  canvas.addEventListener('wheel', (event) => {
    event.preventDefault();
    if (!studio.state || !studio.state.view) return;
    const { eye, target } = studio.state.view;
    const factor = event.deltaY > 0 ? 1.1 : 1 / 1.1;
    sendView({ eye: vec.add(target, vec.scale(vec.sub(eye, target), factor)), target });
  }, { passive: false });
}

// ---- Inspector -------------------------------------------------------------------------------

async function edit(path, value, messageElement) {
  const answer = await api('/api/edit', { path, value });
  if (messageElement) {
    messageElement.textContent = answer.ok ? '' : answer.error;
    messageElement.classList.toggle('error', !answer.ok);
  }
  return answer;
}

async function loadInspector() {
  studio.inspector = await (await fetch('/api/inspector', { headers: { 'X-Studio-Token': token } })).json();
  const channels = studio.inspector.channels;
  if (!channels.some((c) => c.name === studio.selected)) {
    const emitter = channels.find((c) => c.type === 'AdvancedParticleEmitter');
    studio.selected = (emitter || channels[0] || {}).name || null;
  }
  renderChannelList();
  renderInspector();
}

function renderChannelList() {
  $('channel-list').replaceChildren(...studio.inspector.channels.map((channel) => {
    const item = document.createElement('li');
    item.textContent = channel.name + ' (' + channel.type + ')';
    item.dataset.channel = channel.name;
    if (channel.name === studio.selected) item.classList.add('selected');
    item.onclick = () => { studio.selected = channel.name; renderChannelList(); renderInspector(); };
    return item;
  }));
}

function element(tag, properties, children) {
  const made = Object.assign(document.createElement(tag), properties || {});
  for (const child of children || []) made.append(child);
  return made;
}

function numberInput(value, onChange, placeholder) {
  const input = element('input', { type: 'number', step: 'any', value: value === null ? '' : value,
                                   placeholder: placeholder || '' });
  input.onchange = () => onChange(input.value === '' ? NaN : Number(input.value), input);
  return input;
}

// A row: the name, the inputs and the message place beside them.
function fieldRow(label, title, build) {
  const message = element('span', { className: 'message' });
  const inputs = element('span', { className: 'inputs' });
  const row = element('div', { className: 'field' }, [element('label', { textContent: label, title: title || label }), inputs]);
  build(inputs, message);
  inputs.append(message);
  return row;
}

function sliderRange(value) {
  const magnitude = Math.max(1, Math.abs(value) * 4);
  return value < 0 ? [-magnitude, magnitude] : [0, magnitude];
}

function numberField(inputs, message, path, value, fallback) {
  const [low, high] = sliderRange(typeof value === 'number' ? value : 0);
  const slider = element('input', { type: 'range', min: low, max: high, step: (high - low) / 500,
                                    value: typeof value === 'number' ? value : 0 });
  const number = numberInput(value, (v) => send(v), fallback);
  const send = async (v) => {
    if (!Number.isFinite(v)) {
      // Not sent as JSON (NaN has no JSON form): the server is asked with the text, and refuses.
      message.textContent = 'expected a finite number';
      message.classList.add('error');
      return;
    }
    await edit(path, v, message);
  };
  slider.oninput = () => { number.value = slider.value; };
  slider.onchange = () => send(Number(slider.value));
  inputs.append(slider, number);
}

function vectorField(inputs, message, path, value) {
  const parts = Array.isArray(value) && value.length === 3 ? value.slice() : [0, 0, 0];
  ['x', 'y', 'z'].forEach((axis, i) => {
    inputs.append(axis, numberInput(parts[i], async (v) => {
      parts[i] = v;
      await edit(path, parts.slice(), message);
    }));
  });
}

function matrixField(inputs, message, path, value) {
  if (value !== null && (Array.isArray(value) || typeof value !== 'object' || 'keys' in value)) {
    return jsonField(inputs, message, path, value);
  }
  const transform = Object.assign({}, value || {});
  const rows = [['translation', [0, 0, 0]], ['rotation', [0, 0, 0]], ['scale', [1, 1, 1]]];
  for (const [part, fallback] of rows) {
    let current = transform[part];
    if (part === 'scale' && typeof current === 'number') current = [current, current, current];
    if (part === 'rotation' && current && !Array.isArray(current)) current = [current.pitch || 0, current.yaw || 0, current.roll || 0];
    const parts = Array.isArray(current) ? current.slice() : fallback.slice();
    inputs.append(element('span', { className: 'note', textContent: part }));
    ['x', 'y', 'z'].forEach((axis, i) => {
      inputs.append(numberInput(parts[i], async (v) => {
        parts[i] = v;
        transform[part] = parts.slice();
        await edit(path, Object.assign({}, transform), message);
      }));
    });
  }
}

function jsonField(inputs, message, path, value) {
  const text = element('input', { className: 'wide', value: value === null ? '' : JSON.stringify(value) });
  text.onchange = async () => {
    let parsed;
    try {
      parsed = text.value.trim() === '' ? null : JSON.parse(text.value);
    } catch (error) {
      // Sent as it is: the server's refusal names the fault.
      const answer = await fetch('/api/edit', {
        method: 'POST', headers: { 'X-Studio-Token': token, 'Content-Type': 'application/json' },
        body: '{"path":' + JSON.stringify(path) + ',"value":' + text.value + '}',
      }).then((r) => r.json());
      message.textContent = answer.error || 'malformed JSON';
      message.classList.add('error');
      return;
    }
    await edit(path, parsed, message);
  };
  inputs.append(text);
}

function channelField(inputs, message, path, link) {
  if (link.many) return jsonField(inputs, message, path, link.value);
  const select = element('select', {}, [element('option', { value: '', textContent: '(none)' })]);
  for (const choice of link.choices) select.append(element('option', { value: choice, textContent: choice }));
  const current = typeof link.value === 'string' ? link.value : '';
  if (link.value !== null && typeof link.value !== 'string') {
    select.append(element('option', { value: '(inline)', textContent: '(written inline)' }));
    select.value = '(inline)';
  } else {
    select.value = current;
  }
  select.onchange = () => {
    if (select.value !== '(inline)') edit(path, select.value === '' ? null : select.value, message);
  };
  inputs.append(select);
}

function yesNoField(inputs, message, path, value) {
  const box = element('input', { type: 'checkbox', checked: typeof value === 'number' && value > 0 });
  box.onchange = () => edit(path, box.checked ? 1 : 0, message);
  inputs.append(box);
}

function linkField(channel, link) {
  const path = ['channels', channel.name, 'links', link.key];
  const title = link.name + ' (' + link.type + (link.unit ? ', ' + link.unit : '') + ')' +
                (link.help ? ': ' + link.help : '') + (link.default ? ' Empty: ' + link.default : '');
  const build = (inputs, message) => {
    const value = link.value;
    const animated = value !== null && typeof value === 'object' && !Array.isArray(value) && 'keys' in value;
    if (link.kind === 'envelope') {
      if (Array.isArray(value)) return curveEditor(inputs, message, path, value);
      if (typeof value === 'string' || value === null) return channelField(inputs, message, path, link);
      return jsonField(inputs, message, path, value);
    }
    if (animated) return jsonField(inputs, message, path, value);
    if (typeof value === 'string' && link.kind !== 'channel') return channelField(inputs, message, path, link);
    if (link.kind === 'number') return numberField(inputs, message, path, value, link.default);
    if (link.kind === 'yesno') return yesNoField(inputs, message, path, value);
    if (link.kind === 'vector') return vectorField(inputs, message, path, value);
    if (link.kind === 'matrix') return matrixField(inputs, message, path, value);
    return channelField(inputs, message, path, link);
  };
  const row = fieldRow(link.name, title, (inputs, message) => {
    build(inputs, message);
    if (link.unit && link.kind !== 'channel') inputs.append(element('span', { className: 'note', textContent: link.unit }));
  });
  row.dataset.link = link.name;
  return row;
}

// Own settings of a channel (colliders, attractor, mesh...): numbers, x/y/z, text, nested.
function settingFields(container, path, value, label) {
  if (Array.isArray(value) && value.length === 3 && value.every((v) => typeof v === 'number')) {
    container.append(fieldRow(label, label, (inputs, message) => vectorField(inputs, message, path, value)));
  } else if (Array.isArray(value) && value.length && value.every((v) => v && typeof v === 'object' && !Array.isArray(v))) {
    value.forEach((item, i) => {
      const group = element('fieldset', {}, [element('legend', { textContent: label + ' ' + (i + 1) })]);
      for (const [key, inner] of Object.entries(item)) settingFields(group, path.concat([i, key]), inner, key);
      container.append(group);
    });
  } else if (typeof value === 'number') {
    container.append(fieldRow(label, label, (inputs, message) => numberField(inputs, message, path, value)));
  } else if (typeof value === 'boolean') {
    container.append(fieldRow(label, label, (inputs, message) => {
      const box = element('input', { type: 'checkbox', checked: value });
      box.onchange = () => edit(path, box.checked, message);
      inputs.append(box);
    }));
  } else {
    container.append(fieldRow(label, label, (inputs, message) => jsonField(inputs, message, path, value)));
  }
}

function renderInspector() {
  const panel = $('inspector');
  const channel = studio.inspector.channels.find((c) => c.name === studio.selected);
  if (!channel) return panel.replaceChildren();
  const parts = [element('h3', { textContent: channel.name + ' \u2014 ' + channel.type })];
  const settings = Object.entries(channel.settings);
  if (settings.length) {
    const group = element('fieldset', {}, [element('legend', { textContent: 'settings' })]);
    for (const [key, value] of settings) settingFields(group, ['channels', channel.name, key], value, key);
    parts.push(group);
  }
  const groups = new Map();
  for (const link of channel.links) {
    const name = link.group || 'links';
    if (!groups.has(name)) groups.set(name, element('fieldset', {}, [element('legend', { textContent: name })]));
    groups.get(name).append(linkField(channel, link));
  }
  parts.push(...groups.values());
  panel.replaceChildren(...parts);
}

// ---- Curve editor ----------------------------------------------------------------------------

const kModes = ['linear', 'step', 'smooth'];

function curveEditor(inputs, message, path, keysValue) {
  let keys = keysValue.map((k) => k.slice());
  const canvas = element('canvas', { className: 'curve', width: 320, height: 120,
    title: 'drag a key; double-click to add a key; right-click a key to remove it' });
  const table = element('table', { className: 'keys' });
  const bounds = () => {
    const xs = keys.map((k) => k[0]), ys = keys.map((k) => k[1]);
    const x0 = Math.min(0, ...xs), x1 = Math.max(1, ...xs);
    const y0 = Math.min(0, ...ys), y1 = Math.max(...ys, y0 + 1) * 1.1;
    return { x0, x1, y0, y1 };
  };
  const toScreen = (k, b) => [8 + (k[0] - b.x0) / (b.x1 - b.x0) * (canvas.width - 16),
                              canvas.height - 8 - (k[1] - b.y0) / (b.y1 - b.y0) * (canvas.height - 16)];
  const fromScreen = (x, y, b) => [b.x0 + (x - 8) / (canvas.width - 16) * (b.x1 - b.x0),
                                   b.y0 + (canvas.height - 8 - y) / (canvas.height - 16) * (b.y1 - b.y0)];
  const round = (v) => Math.round(v * 1000) / 1000;
  let frozen = null;  // the bounds while dragging, so the curve does not rescale under the mouse
  const draw = () => {
    const b = frozen || bounds();
    const g = canvas.getContext('2d');
    g.clearRect(0, 0, canvas.width, canvas.height);
    g.strokeStyle = '#6cf';
    g.beginPath();
    const sorted = keys.slice().sort((a, c) => a[0] - c[0]);
    sorted.forEach((k, i) => {
      const [x, y] = toScreen(k, b);
      if (i === 0) return g.moveTo(x, y);
      const previous = sorted[i - 1];
      if ((previous[2] || 'linear') === 'step') g.lineTo(x, toScreen(previous, b)[1]);
      g.lineTo(x, y);
    });
    g.stroke();
    g.fillStyle = '#fc6';
    for (const k of keys) { const [x, y] = toScreen(k, b); g.fillRect(x - 3, y - 3, 6, 6); }
  };
  const send = () => edit(path, keys.map((k) => k.slice()), message);
  const nearest = (event) => {
    const b = bounds();
    let best = -1, bestDistance = 8;
    keys.forEach((k, i) => {
      const [x, y] = toScreen(k, b);
      const d = Math.hypot(x - event.offsetX, y - event.offsetY);
      if (d < bestDistance) { best = i; bestDistance = d; }
    });
    return best;
  };
  let dragging = -1;
  canvas.onmousedown = (event) => {
    if (event.button !== 0) return;
    dragging = nearest(event);
    frozen = bounds();
  };
  canvas.onmousemove = (event) => {
    if (dragging < 0) return;
    const [x, y] = fromScreen(event.offsetX, event.offsetY, frozen);
    keys[dragging][0] = round(x);
    keys[dragging][1] = round(y);
    draw();
  };
  canvas.onmouseup = () => {
    if (dragging >= 0) send();
    dragging = -1;
    frozen = null;
  };
  canvas.ondblclick = (event) => {
    const [x, y] = fromScreen(event.offsetX, event.offsetY, bounds());
    keys.push([round(x), round(y)]);
    keys.sort((a, c) => a[0] - c[0]);
    send();
  };
  canvas.oncontextmenu = (event) => {
    event.preventDefault();
    const i = nearest(event);
    if (i >= 0 && keys.length > 1) { keys.splice(i, 1); send(); }
  };
  keys.forEach((k, i) => {
    const mode = element('select', {}, kModes.map((m) => element('option', { value: m, textContent: m })));
    mode.value = k[2] || 'linear';
    mode.onchange = () => {
      keys[i] = mode.value === 'linear' ? [keys[i][0], keys[i][1]] : [keys[i][0], keys[i][1], mode.value];
      send();
    };
    const remove = element('button', { textContent: '\u2212', title: 'remove this key' });
    remove.onclick = () => { if (keys.length > 1) { keys.splice(i, 1); send(); } };
    const x = numberInput(k[0], (v) => { keys[i][0] = v; send(); });
    const y = numberInput(k[1], (v) => { keys[i][1] = v; send(); });
    x.dataset.key = i; x.dataset.axis = 'x';
    y.dataset.key = i; y.dataset.axis = 'y';
    table.append(element('tr', {}, [element('td', {}, [x]), element('td', {}, [y]),
                                     element('td', {}, [mode]), element('td', {}, [remove])]));
  });
  const add = element('button', { textContent: 'add key' });
  add.onclick = () => {
    const last = keys[keys.length - 1];
    keys.push([round(last[0] + 0.1), last[1]]);
    send();
  };
  inputs.append(element('div', {}, [canvas, table, add]));
  draw();
}

// ---- Start -----------------------------------------------------------------------------------

async function start() {
  setupCharts();
  setupTransport();
  setupCamera();
  await api('/api/state');
  readStream();
}

start();
