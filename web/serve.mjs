// A static server for the built page on this machine only (127.0.0.1), with the types module
// scripts and WebAssembly need. Any static server does as well; this one needs nothing beyond
// Node.
//
//   node web/serve.mjs FOLDER [PORT]       (port 0: any free one; the address is printed)
import { createReadStream, statSync } from 'node:fs';
import { createServer } from 'node:http';
import { extname, join, normalize, resolve } from 'node:path';

const kTypes = {
  '.html': 'text/html; charset=utf-8',
  '.js': 'text/javascript; charset=utf-8',
  '.mjs': 'text/javascript; charset=utf-8',
  '.css': 'text/css; charset=utf-8',
  '.json': 'application/json; charset=utf-8',
  '.wasm': 'application/wasm',
  '.png': 'image/png',
  '.jpg': 'image/jpeg',
  '.mp4': 'video/mp4',
  '.webm': 'video/webm',
};

export function serve(folder, port = 8080) {
  const root = resolve(folder);
  const server = createServer((request, response) => {
    const path = normalize(decodeURIComponent(new URL(request.url, 'http://x').pathname));
    let file = join(root, path);
    if (!file.startsWith(root)) {
      response.writeHead(403).end();
      return;
    }
    try {
      if (statSync(file).isDirectory()) file = join(file, 'index.html');
      const size = statSync(file).size;
      response.writeHead(200, {
        'content-type': kTypes[extname(file)] ?? 'application/octet-stream',
        'content-length': size,
        'cache-control': 'no-cache',
      });
      createReadStream(file).pipe(response);
    } catch {
      response.writeHead(404).end();
    }
  });
  return new Promise((resolvePromise) => server.listen(port, '127.0.0.1', () => resolvePromise(server)));
}

if (import.meta.url === `file://${process.argv[1]}`) {
  const server = await serve(process.argv[2] ?? '.', Number(process.argv[3] ?? 8080));
  console.log(`serving ${resolve(process.argv[2] ?? '.')} at http://127.0.0.1:${server.address().port}/`);
}
