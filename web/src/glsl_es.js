// The one place the module's GLSL meets WebGL 2: each source is rewritten as it is handed to
// the context, so the module keeps its GLSL 4.10 sources as every other platform compiles them.

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

// Wraps the context's shaderSource, so that every shader the module compiles is rewritten.
export function installGlslEs(gl) {
  const shaderSource = gl.shaderSource.bind(gl);
  gl.shaderSource = (shader, source) => shaderSource(shader, toGlslEs(source));
}
