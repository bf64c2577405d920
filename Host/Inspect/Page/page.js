'use strict';
(() => {
  const data = JSON.parse(document.getElementById('data').textContent);
  // Between two frames nothing is ever rendered.
  const stretches = data.stretches.filter((stretch) => stretch.end.frame > stretch.start.frame);
  const allFrames = Math.max(1, data.frames.all);
  const classOf = {gap: 'gap', device: 'device', 'partly host': 'partly', host: 'host'};
  const rateOf = 254016000000 / data.format.frameTicks;
  let selected = -1;
  let zoom = 1;

  const byId = (id) => document.getElementById(id);

  /** An element with attributes and children; texts become text nodes. */
  function make(tag, attributes = {}, ...children) {
    const element = document.createElement(tag);
    for (const [name, value] of Object.entries(attributes)) element.setAttribute(name, value);
    element.append(...children);
    return element;
  }

  function draw(tag, attributes = {}, ...children) {
    const element = document.createElementNS('http://www.w3.org/2000/svg', tag);
    for (const [name, value] of Object.entries(attributes)) element.setAttribute(name, value);
    element.append(...children);
    return element;
  }

  const percentText = (frames) => {
    const percent = 100 * frames / allFrames;
    return frames > 0 && percent < 1 ? 'below 1%' : Math.round(percent) + '%';
  };
  const counted = (count, word) => `${count} ${word}${count === 1 ? '' : 's'}`;
  const milliseconds = (value) => value.toFixed(value < 10 ? 2 : 1) + ' ms';
  const renderedBy = (stretch) => stretch.rendering === 'gap' ? 'nobody: a gap' : stretch.rendering;

  /** What the pictures of a tree come from: its leaves, top layer first. */
  function leafNames(tree) {
    if (tree.inputs.length === 0 || tree.kind === 'sequence') return tree.kind === 'black' ? [] : [tree.name];
    const names = tree.inputs.flatMap(leafNames);
    return tree.kind === 'transition' ? [names.join(' \u2192 ')] : [...new Set(names)].reverse();
  }
  const contentOf = (stretch) => leafNames(stretch.tree).join(' over ') || 'black';

  /** Timecodes count frames at the rounded rate, as the command's do. */
  function timecode(frame) {
    const rate = Math.round(rateOf);
    const first = stretches.length ? parseTimecode(stretches[0].start.timecode, rate) - stretches[0].start.frame : 0;
    const number = first + frame;
    const two = (value) => String(Math.floor(value)).padStart(2, '0');
    return [number / rate / 3600, number / rate / 60 % 60, number / rate % 60, number % rate].map(two).join(':');
  }
  function parseTimecode(text, rate) {
    const [hours, minutes, seconds, frames] = text.split(':').map(Number);
    return ((hours * 60 + minutes) * 60 + seconds) * rate + frames;
  }

  function fillHeader() {
    const name = data.file.split('/').pop();
    document.title = name + ' \u2013 inspection';
    byId('title').textContent = name;
    byId('format').textContent = `${data.format.width} \u00d7 ${data.format.height}, ${+rateOf.toFixed(3)} frames a second, ` +
        `${counted(data.frames.all, 'frame')}, on ${data.device.framework}: ${data.device.name}`;
    const kinds = [['device', 'device', data.frames.device], ['partly', 'partly host', data.frames.partlyHost],
      ['host', 'host', data.frames.host], ['gap', 'gap', data.frames.gap]];
    for (const [style, label, frames] of kinds) {
      byId('legend').append(make('li', {}, make('i', {class: style}), label + ' ', make('b', {}, percentText(frames))));
    }
    byId('legend').append(make('li', {}, make('i', {class: 'slow'}), 'not in real time'));
    for (const line of [...data.offline, ...data.warnings]) byId('notes').append(make('p', {}, line));
  }

  function fillStrip() {
    stretches.forEach((stretch, index) => {
      const frames = stretch.end.frame - stretch.start.frame;
      const label = `${stretch.start.timecode}, ${counted(frames, 'frame')}, ${contentOf(stretch)}, ` +
          `${renderedBy(stretch)}${stretch.realTime ? '' : ', not in real time'}`;
      const button = make('button', {type: 'button', role: 'option', class: 'stretch ' + classOf[stretch.rendering],
        id: 'stretch-' + index, 'aria-label': label, title: label, tabindex: -1, 'aria-selected': false});
      if (!stretch.realTime) button.classList.add('slow');
      button.style.left = 100 * stretch.start.frame / allFrames + '%';
      button.style.width = 100 * frames / allFrames + '%';
      const content = make('span', {class: 'content'});
      if (stretch.rendered) content.append(make('img', {src: stretch.rendered.picture, alt: ''}));
      content.append(make('span', {}, contentOf(stretch)));
      button.append(content);
      button.addEventListener('click', () => select(index));
      byId('strip').append(button);
    });
  }

  function fillRows() {
    stretches.forEach((stretch, index) => {
      const row = make('tr', {id: 'row-' + index, 'aria-selected': false},
          make('td', {}, stretch.start.timecode),
          make('td', {class: 'number'}, String(stretch.end.frame - stretch.start.frame)),
          make('td', {}, stretch.rendering === 'gap' ? make('span', {class: 'none'}, 'black') : contentOf(stretch)),
          make('td', {}, make('span', {class: 'dot ' + classOf[stretch.rendering]}), stretch.rendering),
          make('td', {}, stretch.rendering === 'gap' ? '' : stretch.realTime ? 'yes' : 'no'));
      row.addEventListener('click', () => select(index));
      byId('rows').append(row);
    });
  }

  /** Marks at the roundest distance that leaves each label its room. */
  function fillScale() {
    const rate = Math.round(rateOf);
    const steps = [1, 2, 5, 10, rate, 2 * rate, 5 * rate, 10 * rate, 30 * rate, 60 * rate, 120 * rate, 300 * rate,
      600 * rate, 1800 * rate, 3600 * rate];
    const room = allFrames * 110 / Math.max(1, byId('timeline').clientWidth);
    const step = steps.find((frames) => frames >= room) || 7200 * rate;
    const marks = [];
    for (let frame = 0; frame + room * 0.8 < allFrames || frame === 0; frame += step) {
      const mark = make('span', {}, timecode(frame));
      mark.style.left = 100 * frame / allFrames + '%';
      marks.push(mark);
    }
    byId('scale').replaceChildren(...marks);
  }

  // The tree, media on the left, the finished picture on the right.
  const box = {width: 168, height: 46, across: 34, down: 12};

  /** Gives each node a column by its depth and a row; returns how many rows the subtree takes. */
  function layOut(node, depth, row, places) {
    let rows = 0;
    // Inputs count from the bottom layer; the top layer stands at the top.
    for (const input of [...node.inputs].reverse()) rows += layOut(input, depth + 1, row + rows, places);
    rows = Math.max(1, rows);
    places.set(node, {depth, row: row + (rows - 1) / 2});
    return rows;
  }

  function shorten(text, length) {
    return text.length <= length ? text : text.slice(0, length - 1) + '\u2026';
  }

  function drawNode(node, x, y, show) {
    const kind = (node.kind === 'layers' ? counted(node.inputs.length, 'input') : node.kind) +
        (node.side === 'host' ? ', host' : '');
    const time = node.milliseconds === undefined ? '' : milliseconds(node.milliseconds);
    const group = draw('g', {class: node.side, transform: `translate(${x} ${y})`, tabindex: 0, role: 'img',
      'aria-label': [node.name, kind, time].filter(Boolean).join(', '), 'data-name': node.name},
    draw('rect', {class: 'box', x: 0.5, y: 0.5, width: box.width - 1, height: box.height - 1, rx: 3}),
    draw('rect', {class: 'stripe', x: 0, y: 0, width: 4, height: box.height, rx: 2}),
    draw('text', {class: 'name', x: 14, y: 20}, shorten(node.name, 22)),
    draw('text', {class: 'kind', x: 14, y: 36}, kind),
    draw('text', {class: 'kind', x: box.width - 10, y: 36, 'text-anchor': 'end'}, time),
    draw('title', {}, [node.name, node.detail, node.reason].filter(Boolean).join('\n')));
    for (const event of ['click', 'focus']) group.addEventListener(event, () => show(node, group));
    return group;
  }

  function drawTree(tree) {
    const places = new Map();
    const rows = layOut(tree, 0, 0, places);
    const deepest = Math.max(...[...places.values()].map((place) => place.depth));
    const xOf = (place) => (deepest - place.depth) * (box.width + box.across);
    const yOf = (place) => place.row * (box.height + box.down);
    const width = (deepest + 1) * (box.width + box.across) - box.across;
    const height = rows * (box.height + box.down) - box.down;
    const svg = draw('svg', {class: 'tree', width, height, viewBox: `0 0 ${width} ${height}`, role: 'group',
      'aria-label': 'Tree of nodes, the finished picture on the right'});
    const info = make('p', {class: 'node'});
    const show = (node, group) => {
      for (const shown of svg.querySelectorAll('.shown')) shown.classList.remove('shown');
      group.classList.add('shown');
      const side = node.side === 'host' ? 'rendered by the host' : 'on the device';
      // The host's pictures and decoded media reach the device by an upload, and that is what was measured.
      const uploads = node.side === 'host' || node.inputs.length === 0;
      const time = node.milliseconds === undefined ? '' : (uploads ? 'upload ' : '') + milliseconds(node.milliseconds);
      info.replaceChildren(make('b', {}, node.name), ` \u2013 ${[side, node.detail, time, node.reason].filter(Boolean).join('; ')}`);
    };
    for (const [node, place] of places) {
      for (const input of node.inputs) {
        const from = places.get(input);
        const x1 = xOf(from) + box.width, y1 = yOf(from) + box.height / 2;
        const x2 = xOf(place), y2 = yOf(place) + box.height / 2, middle = (x1 + x2) / 2;
        svg.append(draw('path', {d: `M${x1} ${y1} C${middle} ${y1} ${middle} ${y2} ${x2} ${y2}`}));
      }
    }
    const groups = new Map();
    for (const [node, place] of places) groups.set(node, svg.appendChild(drawNode(node, xOf(place), yOf(place), show)));
    const first = [...places.keys()].find((node) => node.reason) || tree;
    show(first, groups.get(first));
    return make('div', {}, make('div', {class: 'drawing'}, svg), info);
  }

  function listTimes(rendered) {
    const table = make('table', {class: 'times'});
    const longest = Math.max(rendered.totalMilliseconds, ...rendered.timings.map((timing) => timing.milliseconds));
    const add = (style, name, value) => {
      const share = make('i');
      share.style.width = 100 * value / longest + '%';
      table.append(make('tr', {class: style}, make('td', {}, name), make('td', {class: 'number'}, milliseconds(value)),
          make('td', {class: 'share'}, share)));
    };
    for (const timing of rendered.timings) add('', timing.name, timing.milliseconds);
    if (rendered.totalMilliseconds > 0) add('all', 'Whole frame', rendered.totalMilliseconds);
    return table;
  }

  function listReasons(stretch) {
    const list = make('ul', {class: 'reasons'});
    for (const reason of stretch.reasons) {
      list.append(make('li', {class: reason.costs === 'acceleration' ? classOf[stretch.rendering] : ''}, reason.text));
    }
    return list;
  }

  function fillDetail(stretch) {
    const frames = stretch.end.frame - stretch.start.frame;
    const rendered = stretch.rendered;
    const text = make('div', {class: 'text'}, make('p', {class: 'verdict'},
        make('span', {}, make('span', {class: 'dot ' + classOf[stretch.rendering]}), 'Rendered by: ' + renderedBy(stretch)),
        make('span', {}, stretch.realTime ? 'In real time' : 'Not in real time')), listReasons(stretch));
    const parts = [make('h2', {}, stretch.rendering === 'gap' ? 'Gap' : contentOf(stretch)),
      make('p', {class: 'where'}, `${stretch.start.timecode} to ${stretch.end.timecode}, frames ${stretch.start.frame} ` +
          `to ${stretch.end.frame - 1}, ${counted(frames, 'frame')} long`),
      make('div', {class: 'facts'}, text)];
    if (stretch.rendering !== 'gap') {
      const counters = make('dl', {class: 'counters'});
      for (const [name, count] of Object.entries(stretch.counters)) {
        const label = name === 'intrinsics' ? 'motion and conversion' : name;
        counters.append(make('div', {}, make('dt', {}, label), make('dd', {}, String(count))));
      }
      text.append(counters);
      parts.push(make('h3', {}, 'Tree'), drawTree(stretch.tree));
    }
    if (rendered) {
      parts[2].prepend(make('img', {src: rendered.picture, width: rendered.width, height: rendered.height,
        alt: `Frame ${rendered.frame}`}));
      parts.push(make('h3', {}, `Times of frame ${rendered.frame}` +
          (rendered.deviceMegabytes > 0 ? `, ${rendered.deviceMegabytes} MB of device memory` : '')));
      parts.push(rendered.timings.length || rendered.totalMilliseconds > 0 ? listTimes(rendered) :
          make('p', {class: 'none'}, 'The device has no times to tell of it.'));
    }
    byId('detail').replaceChildren(...parts);
  }

  function select(index, {focus = false} = {}) {
    if (index < 0 || index >= stretches.length) return;
    for (const id of ['stretch-', 'row-']) {
      const old = byId(id + selected);
      if (old) old.setAttribute('aria-selected', false);
      byId(id + index).setAttribute('aria-selected', true);
    }
    if (selected >= 0) byId('stretch-' + selected).tabIndex = -1;
    const button = byId('stretch-' + index);
    button.tabIndex = 0;
    if (focus) button.focus();
    button.scrollIntoView({block: 'nearest', inline: 'nearest'});
    selected = index;
    fillDetail(stretches[index]);
    if (location.hash !== '#' + index) history.replaceState(null, '', '#' + index);
  }

  function onKey(event) {
    const target = {ArrowLeft: selected - 1, ArrowUp: selected - 1, ArrowRight: selected + 1, ArrowDown: selected + 1,
      Home: 0, End: stretches.length - 1}[event.key];
    if (target === undefined) return;
    event.preventDefault();
    select(target, {focus: true});
  }

  function setZoom(value) {
    zoom = Math.min(64, Math.max(1, value));
    byId('timeline').style.width = 100 * zoom + '%';
    fillScale();
    if (selected >= 0) byId('stretch-' + selected).scrollIntoView({block: 'nearest', inline: 'center'});
  }

  /** The stretch that the address asks for, if it is there. */
  function fromHash() {
    const index = Number.parseInt(location.hash.slice(1), 10);
    return index >= 0 && index < stretches.length ? index : undefined;
  }

  fillHeader();
  fillStrip();
  fillRows();
  fillScale();
  byId('strip').addEventListener('keydown', onKey);
  byId('zoom-in').addEventListener('click', () => setZoom(zoom * 2));
  byId('zoom-out').addEventListener('click', () => setZoom(zoom / 2));
  addEventListener('resize', fillScale);
  addEventListener('hashchange', () => select(fromHash() ?? selected));
  // Without a wish, what needs a look comes first.
  select(fromHash() ?? Math.max(0, stretches.findIndex((stretch) => stretch.reasons.length > 0)));
})();
