// Draws glTF files with three.js in headless Chromium: node drawwiththree.mjs NODE_MODULES CHROMIUM JOBS.json
//
// JOBS: an array of {model, out, width, height, camera, clip, time, sky}; clip is a number or null, a camera of -1 the last
// one. Each becomes OUT-black.png and OUT-white.png, before backgrounds of these colours. Exit code 1 if one was not drawn.
import { spawn } from 'node:child_process';
import fs from 'node:fs';
import http from 'node:http';
import path from 'node:path';
import { fileURLToPath } from 'node:url';

const [modules, chromium, jobsFile] = process.argv.slice(2);
const jobs = JSON.parse(fs.readFileSync(jobsFile));
const here = path.dirname(fileURLToPath(import.meta.url));
const TYPES = { '.html': 'text/html', '.js': 'text/javascript', '.mjs': 'text/javascript', '.wasm': 'application/wasm',
                '.png': 'image/png', '.jpg': 'image/jpeg', '.webp': 'image/webp' };
const SECONDS = 60 + 20 * jobs.length;

let browser;
function end(code) {
  browser.removeAllListeners('exit');
  browser.on('exit', () => process.exit(code));
  browser.kill();
}

/// Where what the page asks for lies: /page, /modules/FILE, /model/JOB/FILE beside the job's model.
function find(name) {
  const [, kind, ...rest] = name.split('/');
  if (kind === 'page') return path.join(here, 'page.html');
  if (kind === 'modules') return path.join(modules, ...rest);
  if (kind === 'model') return path.join(path.dirname(jobs[Number(rest[0])].model), ...rest.slice(1));
  return null;
}

let failed = 0;
function receive(name, body) {
  const [, kind, job, background] = name.split('/');
  if (kind === 'end') setTimeout(() => end(failed ? 1 : 0), 50);
  else if (kind === 'fault') ++failed, console.error(jobs[Number(job)].model + ': ' + body);
  else fs.writeFileSync(`${jobs[Number(job)].out}-${background}.png`, body);
}

const server = http.createServer((request, response) => {
  const name = decodeURIComponent(new URL(request.url, 'http://x').pathname);
  if (request.method === 'POST') {
    const parts = [];
    request.on('data', (part) => parts.push(part));
    request.on('end', () => {
      receive(name, Buffer.concat(parts));
      response.end();
    });
    return;
  }
  if (name === '/jobs') {
    const list = jobs.map((job, i) => ({ ...job, url: `/model/${i}/${encodeURIComponent(path.basename(job.model))}` }));
    response.end(JSON.stringify(list));
    return;
  }
  const file = find(name);
  if (!file || !fs.existsSync(file)) {
    response.statusCode = 404;
    response.end();
    return;
  }
  response.setHeader('Content-Type', TYPES[path.extname(file)] ?? 'application/octet-stream');
  response.end(fs.readFileSync(file));
});

server.listen(0, '127.0.0.1', () => {
  const url = `http://127.0.0.1:${server.address().port}/page`;
  browser = spawn(chromium, ['--headless', '--no-sandbox', '--disable-gpu-sandbox', '--use-angle=swiftshader',
                             '--enable-unsafe-swiftshader', `--user-data-dir=${jobsFile}-profile`, '--remote-debugging-port=0', url],
                  { stdio: 'ignore' });
  browser.on('exit', () => { console.error('the browser has ended'); process.exit(1); });
  setTimeout(() => { console.error(`not done after ${SECONDS} s`); end(1); }, SECONDS * 1000);
});
