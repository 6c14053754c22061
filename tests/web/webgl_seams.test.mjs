// The GLSL rewrite the page applies to every shader the module hands WebGL 2, and the module's
// own sources through it: each must come out as GLSL ES 3.00 with its body unchanged.
import assert from 'node:assert/strict';
import { test } from 'node:test';
import { installWebGlSeams, toGlslEs } from '../../web/src/webgl_seams.js';

const es = '#version 300 es\nprecision highp float;\nprecision highp int;\n';

test('desktop version lines become the ES header; other sources pass unchanged', () => {
  const cases = [
    ['#version 410\nvoid main() {}\n', `${es}void main() {}\n`],
    ['  #version 330 core\nin vec2 p;\n', `${es}in vec2 p;\n`],
    ['\n#version 410\nout vec4 c;\n', `${es}out vec4 c;\n`],
    ['#version 300 es\nvoid main() {}\n', '#version 300 es\nvoid main() {}\n'],
    ['void main() {}\n', 'void main() {}\n'],
    // A version line after code is not a version line GL would take: left for GL to refuse.
    ['int a;\n#version 410\n', 'int a;\n#version 410\n'],
  ];
  for (const [source, expected] of cases) assert.equal(toGlslEs(source), expected, JSON.stringify(source));
});

test('the context compiles rewritten sources and ignores detaching a forgotten shader', () => {
  const calls = [];
  const gl = {
    shaderSource: (shader, source) => calls.push(['source', shader, source]),
    detachShader: (program, shader) => calls.push(['detach', program, shader]),
  };
  installWebGlSeams(gl);
  gl.shaderSource('s', '#version 410\nvoid main() {}\n');
  gl.detachShader('p', null);
  gl.detachShader('p', 's');
  assert.deepEqual(calls, [
    ['source', 's', `${es}void main() {}\n`],
    ['detach', 'p', 's'],
  ]);
});
