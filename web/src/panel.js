// The parameter panel, made from the panel the module declared: a control for each parameter by
// its kind, in its groups, with its range, choices and enabled state. Nothing of the effect is
// named here; ids, defaults and ranges all come from the declaration.

// Numbers whose declared range spans more than this get a number field only (a slider over
// thousands of frames could not hit one).
const kLongestSliderRange = 1000;

function element(tag, attributes = {}, ...children) {
  const node = document.createElement(tag);
  for (const [key, value] of Object.entries(attributes)) {
    if (key === 'class') node.className = value;
    else node.setAttribute(key, value);
  }
  node.append(...children);
  return node;
}

const hex = (channel) =>
  Math.round(Math.min(Math.max(channel, 0), 1) * 255)
    .toString(16)
    .padStart(2, '0');
const toHexColour = ([r, g, b]) => `#${hex(r)}${hex(g)}${hex(b)}`;
const fromHexColour = (text) => [1, 3, 5].map((i) => parseInt(text.slice(i, i + 2), 16) / 255);

export class ParameterPanel {
  // `onEdit(id, value)` for every change as it happens, `onEditEnd()` when a control is let go,
  // `onKey(id)` for the keyframe toggle.
  constructor(container, { onEdit, onEditEnd, onKey }) {
    this.container = container;
    this.onEdit = onEdit;
    this.onEditEnd = onEditEnd;
    this.onKey = onKey;
    this.controls = new Map(); // id -> {set(value), row, inputs, key}
  }

  build(info) {
    this.controls.clear();
    this.container.replaceChildren(...this.items(info.panel.items, info));
  }

  items(items, info) {
    return items.map((item) =>
      item.group !== undefined ? this.group(item, info) : this.parameter(item, info),
    );
  }

  group(item, info) {
    const details = element('details', { open: '' }, element('summary', {}, item.group));
    details.append(...this.items(item.items, info));
    return details;
  }

  parameter(param, info) {
    const row = element('div', { class: 'param', 'data-id': param.id });
    const label = element('label', { title: param.id }, param.displayName);
    const key = element('button', { class: 'key', title: 'Keyframe at this frame', type: 'button' }, '◆');
    key.addEventListener('click', () => this.onKey(param.id));
    const { inputs, set } = this.editor(param, info);
    for (const input of inputs) {
      input.addEventListener('change', () => this.onEditEnd());
    }
    row.append(label, element('span', { class: 'editor' }, ...inputs), key);
    this.controls.set(param.id, { set, row, inputs, key });
    return row;
  }

  // The inputs that edit the parameter and how to show a value in them.
  editor(param, info) {
    const send = (value) => this.onEdit(param.id, value);
    const number = (attributes) => element('input', { type: 'number', ...attributes });
    switch (param.kind) {
      case 'float':
      case 'int': {
        const step = param.kind === 'int' ? 1 : 10 ** -Math.min(param.precision ?? 2, 3);
        const range = { min: param.minimum, max: param.maximum, step };
        const field = number(range);
        const inputs = [field];
        if (param.maximum - param.minimum <= kLongestSliderRange) {
          inputs.unshift(element('input', { type: 'range', ...range }));
        }
        for (const input of inputs) input.addEventListener('input', () => send(Number(input.value)));
        return { inputs, set: (v) => inputs.forEach((input) => (input.value = v)) };
      }
      case 'angle': {
        const field = number({ step: 1 });
        field.addEventListener('input', () => send(Number(field.value)));
        return { inputs: [field], set: (v) => (field.value = Math.round(v * 100) / 100) };
      }
      case 'bool': {
        const box = element('input', { type: 'checkbox' });
        box.addEventListener('input', () => send(box.checked));
        return { inputs: [box], set: (v) => (box.checked = !!v) };
      }
      case 'choice': {
        const select = element('select');
        param.choices.forEach((choice, i) => select.append(element('option', { value: i }, choice)));
        select.addEventListener('input', () => send(Number(select.value)));
        const set = (v) => (select.value = typeof v === 'number' ? v : param.choices.indexOf(v));
        return { inputs: [select], set };
      }
      case 'point': {
        const x = number({ step: 1 });
        const y = number({ step: 1 });
        const both = () => send([Number(x.value), Number(y.value)]);
        x.addEventListener('input', both);
        y.addEventListener('input', both);
        const set = ([vx, vy]) => {
          x.value = Math.round(vx * 10) / 10;
          y.value = Math.round(vy * 10) / 10;
        };
        return { inputs: [x, y], set };
      }
      case 'colour': {
        const colour = element('input', { type: 'color' });
        colour.addEventListener('input', () => send(fromHexColour(colour.value)));
        return { inputs: [colour], set: (v) => (colour.value = toHexColour(v)) };
      }
      case 'layer': {
        const select = element('select');
        for (const layer of info.layers) select.append(element('option', { value: layer.guid }, layer.name));
        select.addEventListener('input', () => send(select.value));
        return { inputs: [select], set: (v) => (select.value = v) };
      }
      default:
        return { inputs: [element('span', {}, param.kind)], set: () => {} };
    }
  }

  // Shows the values at the current frame, which parameters are usable and which have keys.
  show(state) {
    const focused = document.activeElement;
    for (const [id, control] of this.controls) {
      if (!control.inputs.includes(focused)) control.set(state.values[id]);
      const enabled = state.enabled[id];
      control.row.classList.toggle('disabled', !enabled);
      for (const input of control.inputs) input.disabled = !enabled;
      control.key.dataset.state = state.keys[id];
    }
  }
}
