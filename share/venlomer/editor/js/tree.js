// The library's trees (device > banks > pins, design > buses > bits) as nested lists.
// Children are drawn when a node opens, so the thousand tiles cost nothing until asked.
export class Tree {
  constructor(root, data, select) {
    this.root = root;
    this.select = select;
    this.nodes = new Map();
    const list = document.createElement('ul');
    for (const node of data.roots) list.append(this.item(node, true));
    root.append(list);
  }

  item(node, open) {
    const li = document.createElement('li');
    const twisty = document.createElement('span');
    twisty.className = 'twisty';
    const label = document.createElement('span');
    label.className = 'node';
    label.textContent = node.children.length ? `${node.label} (${node.children.length})` : node.label;
    li.append(twisty, label);
    if (node.id) {
      label.dataset.id = node.id;
      this.nodes.set(node.id, label);
      // A node with children selects what lies below it, as the tree view does.
      label.addEventListener('click', (event) => this.select(node.id, event.shiftKey, node.children.length > 0));
    }
    if (node.children.length) {
      let list = null;
      const toggle = (show) => {
        if (show && !list) {
          list = document.createElement('ul');
          for (const child of node.children) list.append(this.item(child, false));
          li.append(list);
          this.refresh();
        }
        if (list) list.hidden = !show;
        twisty.textContent = show ? '▾' : '▸';
      };
      twisty.addEventListener('click', () => toggle(!list || list.hidden));
      if (!node.id) label.addEventListener('click', () => toggle(!list || list.hidden));
      toggle(open);
    }
    return li;
  }

  update(selected, matched) {
    this.selected = selected;
    this.matched = matched;
    this.refresh();
  }

  refresh() {
    if (!this.selected) return;
    for (const [id, label] of this.nodes) {
      label.classList.toggle('sel', this.selected.has(id));
      label.classList.toggle('hl', this.matched.has(id));
    }
  }
}
