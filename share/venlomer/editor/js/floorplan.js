// The device drawn as SVG: tiles in their site colours, pins in their bank colours, the
// top edge (bank 0) at the top. Zoom with the wheel, pan by dragging the background.
const NS = 'http://www.w3.org/2000/svg';
const CELL = 16;

function svg(tag, attributes = {}) {
  const node = document.createElementNS(NS, tag);
  for (const [name, value] of Object.entries(attributes)) node.setAttribute(name, value);
  return node;
}

export class Floorplan {
  constructor(root, tip, device, actions) {
    this.root = root;
    this.tip = tip;
    this.device = device;
    this.actions = actions;
    this.pins = new Map();
    this.labels = new Map();
    const width = device.width * CELL;
    const height = device.height * CELL;
    // Room outside the grid for the port names, which point outward from their edge.
    const margin = 4 * CELL;
    this.view = { x: -margin, y: -margin, w: width + 2 * margin, h: height + 2 * margin };
    this.applyView();
    const place = (x, y) => [x * CELL, (device.height - 1 - y) * CELL];
    const tiles = svg('g', { class: 'tiles' });
    for (const tile of device.tiles) {
      const [px, py] = place(tile.x, tile.y);
      const rect = svg('rect', { x: px + 0.5, y: py + 0.5, width: CELL - 1, height: CELL - 1, fill: tile.color });
      rect.append(svg('title'));
      rect.firstChild.textContent = `${tile.name} (${tile.site})`;
      tiles.append(rect);
    }
    root.append(tiles);
    const pins = svg('g', { class: 'pins' });
    const labels = svg('g', { class: 'labels' });
    for (const pin of device.pins) {
      const [px, py] = place(pin.x, pin.y);
      const offset = (pin.block === 0 ? -0.22 : 0.22) * CELL;
      const edge = pin.y === device.height - 1 ? 'top' : pin.y === 0 ? 'bottom'
        : pin.x === 0 ? 'left' : 'right';
      const horizontal = edge === 'top' || edge === 'bottom';
      const cx = px + CELL / 2 + (horizontal ? offset : 0);
      const cy = py + CELL / 2 + (horizontal ? 0 : offset);
      const circle = svg('circle', { cx, cy, r: 3, fill: pin.color, class: 'pin' });
      circle.dataset.id = pin.id;
      circle.dataset.name = pin.name;
      circle.addEventListener('click', (event) => actions.select(pin.id, event.shiftKey, false));
      circle.addEventListener('mouseenter', () => this.showTip(pin));
      circle.addEventListener('mouseleave', () => { this.tip.hidden = true; });
      circle.addEventListener('dragover', (event) => {
        event.preventDefault();
        circle.classList.add('drop');
      });
      circle.addEventListener('dragleave', () => circle.classList.remove('drop'));
      circle.addEventListener('drop', (event) => {
        event.preventDefault();
        circle.classList.remove('drop');
        const port = event.dataTransfer.getData('text/plain');
        if (port) actions.assign(port, pin.name);
      });
      pins.append(circle);
      this.pins.set(pin.name, { pin, circle });
      // Pins sit two to a tile, 8 units apart, and a name is longer than that: side by
      // side the names of a crowded edge run into each other. Each name instead leaves
      // its pin at a right angle to the edge, outward, so neighbours stay parallel.
      const label = svg('text', { class: `label ${edge}`, 'dominant-baseline': 'central' });
      if (edge === 'top' || edge === 'bottom') {
        const ly = edge === 'top' ? py - 2 : py + CELL + 2;
        label.setAttribute('x', cx);
        label.setAttribute('y', ly);
        label.setAttribute('transform', `rotate(-90 ${cx} ${ly})`);
        label.setAttribute('text-anchor', edge === 'top' ? 'start' : 'end');
      } else {
        label.setAttribute('x', edge === 'left' ? px - 2 : px + CELL + 2);
        label.setAttribute('y', cy);
        label.setAttribute('text-anchor', edge === 'left' ? 'end' : 'start');
      }
      labels.append(label);
      this.labels.set(pin.name, label);
    }
    root.append(pins, labels);
    this.panZoom();
  }

  showTip(pin) {
    const port = this.state?.assignments[pin.name];
    this.tip.textContent = `${pin.name} · bank ${pin.bank}${pin.gbuf ? ' · global buffer' : ''}${port ? ' · ' + port : ''}`;
    const box = this.pins.get(pin.name).circle.getBoundingClientRect();
    const frame = this.root.getBoundingClientRect();
    this.tip.style.left = `${box.right - frame.left + 6}px`;
    this.tip.style.top = `${box.top - frame.top - 4}px`;
    this.tip.hidden = false;
  }

  update(state) {
    this.state = state;
    const selected = new Set(state.selected);
    const problems = new Set(state.problemPins);
    for (const [name, { pin, circle }] of this.pins) {
      const lit = state.highlighted[name];
      const port = state.assignments[name];
      circle.setAttribute('fill', lit || pin.color);
      circle.setAttribute('r', lit || port ? 4.5 : 3);
      circle.classList.toggle('hl', Boolean(lit));
      circle.classList.toggle('sel', selected.has(pin.id));
      circle.classList.toggle('assigned', Boolean(port));
      circle.classList.toggle('problem', problems.has(name));
      if (selected.has(pin.id)) circle.setAttribute('stroke', this.device.selectedPath[1]);
      else circle.removeAttribute('stroke');
      this.labels.get(name).textContent = port || '';
    }
  }

  legend(box) {
    const add = (colour, text) => {
      const swatch = document.createElement('i');
      swatch.style.background = colour;
      box.append(swatch, text);
    };
    for (const [site, colour] of Object.entries(this.device.sites)) add(colour, site);
    box.append(document.createElement('br'));
    for (const bank of this.device.banks) add(bank.color, `bank ${bank.bank}`);
    add(this.device.selectedPath[0], 'match');
  }

  applyView() {
    const { x, y, w, h } = this.view;
    this.root.setAttribute('viewBox', `${x} ${y} ${w} ${h}`);
  }

  panZoom() {
    this.root.addEventListener('wheel', (event) => {
      event.preventDefault();
      const factor = event.deltaY > 0 ? 1.15 : 1 / 1.15;
      const frame = this.root.getBoundingClientRect();
      const fx = (event.clientX - frame.left) / frame.width;
      const fy = (event.clientY - frame.top) / frame.height;
      const v = this.view;
      const w = v.w * factor;
      const h = v.h * factor;
      this.view = { x: v.x + (v.w - w) * fx, y: v.y + (v.h - h) * fy, w, h };
      this.applyView();
    }, { passive: false });
    let drag = null;
    this.root.addEventListener('pointerdown', (event) => {
      if (event.target.classList.contains('pin')) return;
      drag = { x: event.clientX, y: event.clientY, view: { ...this.view } };
      this.root.classList.add('panning');
    });
    window.addEventListener('pointermove', (event) => {
      if (!drag) return;
      const frame = this.root.getBoundingClientRect();
      const scale = Math.max(drag.view.w / frame.width, drag.view.h / frame.height);
      this.view = { ...drag.view, x: drag.view.x - (event.clientX - drag.x) * scale,
                    y: drag.view.y - (event.clientY - drag.y) * scale };
      this.applyView();
    });
    window.addEventListener('pointerup', () => {
      drag = null;
      this.root.classList.remove('panning');
    });
  }
}
