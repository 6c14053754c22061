// What the page does to the canvas's WebGL 2 context before the module draws in it: the one
// place the module's GLSL meets WebGL 2 (each source rewritten as it is handed to the context,
// so the module keeps its GLSL 4.10 sources as every other platform compiles them), and the one
// place where Emscripten's object names part from GL's.

// GLSL ES 3.00 takes the same stages once the version line names it and the fragment stage
// says how precise its floats and integers are (desktop GLSL has no such statement).
const esHeader = '#version 300 es\nprecision highp float;\nprecision highp int;\n';

// The source as GLSL ES 3.00: a desktop version line is replaced by the ES header, which must
// stay the first line; sources already written for ES, or without a version line, pass as they
// are.
export function toGlslEs(source) {
  const match = /^[ \t]*#version[ \t]+(\d+)[ \t]*(\w*)[ \t]*$/m.exec(source);
  if (!match || match[2] === 'es') return source;
  const before = source.slice(0, match.index);
  if (before.trim() !== '') return source;
  return esHeader + source.slice(match.index + match[0].length).replace(/^\n/, '');
}

export function installWebGlSeams(gl) {
  // Every shader the module compiles is rewritten.
  const shaderSource = gl.shaderSource.bind(gl);
  gl.shaderSource = (shader, source) => shaderSource(shader, toGlslEs(source));
  // GL keeps a deleted shader's name while a program holds it, and the module detaches such
  // shaders before deleting its programs; Emscripten forgets the name at once and hands WebGL
  // null. The shader goes with its program either way.
  const detachShader = gl.detachShader.bind(gl);
  gl.detachShader = (program, shader) => {
    if (shader) detachShader(program, shader);
  };
}
