// The HTML page of the board check, around its data: styles and script inline, nothing loaded
// from anywhere. The script reads the data (rows: [file, line, text, count or -1, names,
// findings, flags]; findings: kind, severity, message, refs: [row, where, object, wins]) and
// builds the table rows as they come into view, 200 at a time. Opened with #s-FILE-LINE, it
// shows that statement expanded.

extern const char* const kCk_PageHead;
extern const char* const kCk_PageTail;

const char* const kCk_PageHead = R"PAGE(<!DOCTYPE html>
<html lang="en">
<head>
<meta charset="utf-8">
<meta name="viewport" content="width=device-width, initial-scale=1">
<title>quillmap check</title>
<style>
body { font: 14px/1.4 system-ui, sans-serif; margin: 0; color: #1d2025; background: #fafafa; }
header, section { padding: 12px 20px; }
header { background: #24303e; color: #fff; }
h1 { font-size: 20px; margin: 0 0 4px; }
h2 { font-size: 16px; margin: 8px 0; }
#counts { font-size: 16px; font-weight: 600; margin: 4px 0; }
#facts { margin: 0; color: #c9d3de; }
table { border-collapse: collapse; width: 100%; background: #fff; }
th, td { text-align: left; vertical-align: top; padding: 3px 8px; border-bottom: 1px solid #e4e7eb; }
th { background: #eef1f4; }
#statements th, #findings th { position: sticky; top: 0; z-index: 1; }
#findings-box { max-height: 45vh; overflow: auto; }
code, .stmt { font-family: ui-monospace, monospace; font-size: 13px; white-space: pre-wrap; overflow-wrap: anywhere; }
#statements td:nth-child(2) { width: 45%; }
.sev { font-weight: 600; text-transform: uppercase; font-size: 11px; padding: 1px 5px; border-radius: 3px; color: #fff; }
.sev-error { background: #c0392b; } .sev-warning { background: #b7791f; } .sev-info { background: #2b6cb0; }
tr.row { cursor: pointer; }
tr.row:hover { background: #f3f6f9; }
tr.row.has-error td:first-child { box-shadow: inset 4px 0 #c0392b; }
tr.row.has-warning td:first-child { box-shadow: inset 4px 0 #d69e2e; }
tr.row.has-info td:first-child { box-shadow: inset 4px 0 #4299e1; }
tr.row.target { background: #fff4c2; }
tr.detail td { background: #f7f9fb; }
.kind { font-family: ui-monospace, monospace; font-size: 12px; background: #edf2f7; border-radius: 3px; padding: 0 4px; margin-right: 4px; white-space: nowrap; }
.none { color: #9aa5b1; }
.unmatched { color: #c0392b; font-weight: 600; }
.names { columns: 3 16em; margin: 4px 0; padding-left: 18px; }
.msg { margin: 2px 0; }
nav button, #filters button { font: inherit; margin: 0 4px 6px 0; padding: 3px 10px; border: 1px solid #b8c2cc; background: #fff; border-radius: 4px; cursor: pointer; }
nav button.on, #filters button.on { background: #24303e; color: #fff; border-color: #24303e; }
#shown { color: #52606d; margin-left: 8px; }
#earlier { font: inherit; padding: 3px 10px; }
a { color: #2b6cb0; }
</style>
</head>
<body>
<header>
<h1 id="title">quillmap check</h1>
<p id="counts"></p>
<p id="facts"></p>
</header>
<section>
<h2>Findings</h2>
<div id="findings-box">
<table id="findings"><thead><tr><th>Severity</th><th>Kind</th><th>Finding</th><th>Statements</th></tr></thead>
<tbody></tbody></table>
<p><button id="more-findings" hidden>Show more findings</button></p>
</div>
</section>
<section>
<h2>Statements</h2>
<nav id="files"></nav>
<div id="filters"></div>
<p><button id="earlier" hidden></button></p>
<table id="statements"><thead><tr><th>Line</th><th>Statement</th><th>Resolved to</th><th>Findings</th></tr></thead>
<tbody></tbody></table>
<div id="sentinel" style="height: 1px"></div>
</section>
<script type="application/json" id="check-data">)PAGE";

const char* const kCk_PageTail = R"PAGE(</script>
<script>
(function () {
  'use strict';
  var data = JSON.parse(document.getElementById('check-data').textContent);
  var CHUNK = 200, SHOWN_NAMES = 3, SHOWN_REFS = 5;
  var FILTERS = [
    ['all', 'All', 0], ['findings', 'With findings', 0], ['unmatched', 'Unmatched', 1],
    ['overrides', 'Overrides', 2], ['clashes', 'Clashes', 4]
  ];
  var state = { file: 0, filter: 'all', list: [], first: 0, shown: 0, open: {}, target: -1, findingsShown: 0 };
  var rowsOfFile = data.files.map(function () { return []; });
  data.rows.forEach(function (r, i) { if (r[0] >= 0) rowsOfFile[r[0]].push(i); });

  // A byte of a constraint file that is not UTF-8 arrives as U+F780..U+F7FF: shown as the
  // Latin-1 character of that byte.
  function txt(s) {
    return String(s).replace(/[\uF780-\uF7FF]/g, function (c) {
      return String.fromCharCode(c.charCodeAt(0) - 0xF700);
    });
  }
  function el(tag, cls, content) {
    var e = document.createElement(tag);
    if (cls) e.className = cls;
    if (content !== undefined && content !== null) e.textContent = txt(content);
    return e;
  }
  function plural(n, word) { return n + ' ' + word + (n === 1 ? '' : 's'); }
  function anchor(row) { return '#s-' + data.rows[row][0] + '-' + data.rows[row][1]; }

  function header() {
    var s = data.summary;
    document.getElementById('title').textContent = 'quillmap check: ' + txt(data.design);
    document.title = 'quillmap check: ' + txt(data.design);
    document.getElementById('counts').textContent = plural(s.findings, 'finding') + ': ' +
      plural(s.errors, 'error') + ', ' + plural(s.warnings, 'warning') + ', ' + s.info + ' info';
    document.getElementById('facts').textContent = plural(s.statements, 'statement') + ' in ' +
      plural(s.files, 'file') + '. Ports placed: ' + s.ports_placed + ' of ' + s.ports +
      ', with an I/O standard: ' + s.placed_with_iostandard + ' of ' + s.ports_placed +
      '. Clocks covered by a PERIOD: ' + s.clocks_covered + ' of ' + s.clocks + '.';
  }

  function link(ref) {
    if (ref[0] < 0) return el('span', null, ref[1]);
    var a = el('a', null, ref[1]);
    a.href = anchor(ref[0]);
    a.addEventListener('click', function (e) {
      e.preventDefault();
      history.replaceState(null, '', a.getAttribute('href'));
      go(a.getAttribute('href'));
    });
    return a;
  }

  function findingRow(f) {
    var tr = el('tr');
    var sev = el('td'); sev.appendChild(el('span', 'sev sev-' + f.severity, f.severity)); tr.appendChild(sev);
    var kind = el('td'); kind.appendChild(el('span', 'kind', f.kind)); tr.appendChild(kind);
    tr.appendChild(el('td', 'msg', f.message));
    var refs = el('td');
    if (!f.refs.length) refs.appendChild(el('span', 'none', data.design));
    // One link per statement (a statement of several objects is referred to once per object).
    var seen = {}, listed = 0, left = 0;
    f.refs.forEach(function (r) {
      var key = r[0] < 0 ? r[1] : r[0];
      if (seen[key]) return;
      seen[key] = true;
      if (listed === SHOWN_REFS) { left++; return; }
      if (listed++) refs.appendChild(document.createTextNode(', '));
      refs.appendChild(link(r));
    });
    if (left) refs.appendChild(el('span', 'none', ' and ' + left + ' more'));
    tr.appendChild(refs);
    return tr;
  }

  function moreFindings() {
    var body = document.querySelector('#findings tbody');
    var end = Math.min(data.findings.length, state.findingsShown + CHUNK);
    for (; state.findingsShown < end; state.findingsShown++) body.appendChild(findingRow(data.findings[state.findingsShown]));
    if (!data.findings.length && !body.children.length) {
      var tr = el('tr'); var td = el('td', 'none', 'No findings.'); td.colSpan = 4; tr.appendChild(td); body.appendChild(tr);
    }
    var button = document.getElementById('more-findings');
    button.hidden = state.findingsShown >= data.findings.length;
    button.textContent = 'Show more findings (' + (data.findings.length - state.findingsShown) + ' left)';
  }

  function flagOf(name) {
    for (var i = 0; i < FILTERS.length; i++) if (FILTERS[i][0] === name) return FILTERS[i];
    return FILTERS[0];
  }
  function keep(row, filter) {
    var r = data.rows[row];
    if (filter === 'all') return true;
    if (filter === 'findings') return r[5].length > 0;
    return (r[6] & flagOf(filter)[2]) !== 0;
  }
  function severityOf(row) {
    var worst = '';
    data.rows[row][5].forEach(function (f) {
      var s = data.findings[f].severity;
      if (s === 'error' || (s === 'warning' && worst !== 'error') || !worst) worst = s;
    });
    return worst;
  }

  function resolved(r) {
    var td = el('td');
    if (r[3] < 0) { td.appendChild(el('span', 'none', 'design-wide')); return td; }
    if (r[3] === 0) { td.appendChild(el('span', 'unmatched', 'nothing')); return td; }
    var names = r[4].slice(0, SHOWN_NAMES).map(txt).join(', ');
    td.appendChild(el('span', 'count', plural(r[3], 'object')));
    td.appendChild(document.createTextNode(': '));
    td.appendChild(el('code', null, names + (r[3] > SHOWN_NAMES ? ', \u2026' : '')));
    return td;
  }

  function rowElements(row) {
    var r = data.rows[row];
    var tr = el('tr', 'row');
    tr.id = 'r-' + row;
    var sev = severityOf(row);
    if (sev) tr.classList.add('has-' + sev);
    if (row === state.target) tr.classList.add('target');
    tr.appendChild(el('td', null, r[1]));
    tr.appendChild(el('td', 'stmt', r[2]));
    tr.appendChild(resolved(r));
    var kinds = el('td');
    r[5].forEach(function (f) { kinds.appendChild(el('span', 'kind', data.findings[f].kind)); });
    tr.appendChild(kinds);
    tr.addEventListener('click', function () { toggle(row); });
    var out = [tr];
    if (state.open[row]) out.push(detail(row));
    return out;
  }

  function detail(row) {
    var r = data.rows[row];
    var tr = el('tr', 'detail');
    tr.id = 'd-' + row;
    var td = el('td'); td.colSpan = 4; tr.appendChild(td);
    if (r[3] > 0) {
      td.appendChild(el('div', null, 'Resolved to ' + plural(r[3], 'object') +
        (r[3] > r[4].length ? ' (the first ' + r[4].length + ' listed)' : '') + ':'));
      var list = el('ol', 'names');
      r[4].forEach(function (n) { list.appendChild(el('li', null, n)); });
      td.appendChild(list);
    } else if (r[3] === 0) {
      td.appendChild(el('div', 'unmatched', 'Matches no object of the design.'));
    } else {
      td.appendChild(el('div', 'none', 'A design-wide statement: it names no design object.'));
    }
    r[5].forEach(function (f) {
      var finding = data.findings[f];
      var p = el('div', 'msg');
      p.appendChild(el('span', 'sev sev-' + finding.severity, finding.severity));
      p.appendChild(document.createTextNode(' '));
      p.appendChild(el('span', 'kind', finding.kind));
      p.appendChild(el('span', null, finding.message));
      td.appendChild(p);
    });
    return tr;
  }

  function toggle(row) {
    var tr = document.getElementById('r-' + row);
    if (state.open[row]) {
      delete state.open[row];
      var d = document.getElementById('d-' + row);
      if (d) d.remove();
    } else {
      state.open[row] = true;
      if (tr) tr.after(detail(row));
    }
  }

  // The rows of the list from state.first to state.shown are in the table. more() appends the
  // next ones, earlier() puts the ones before in front.
  function rowsFrom(from, to) {
    var frag = document.createDocumentFragment();
    for (var k = from; k < to; k++) rowElements(state.list[k]).forEach(function (e) { frag.appendChild(e); });
    return frag;
  }
  function more() {
    var end = Math.min(state.list.length, state.shown + CHUNK);
    document.querySelector('#statements tbody').appendChild(rowsFrom(state.shown, end));
    state.shown = end;
    counts();
  }
  function earlier() {
    var from = Math.max(0, state.first - CHUNK);
    var body = document.querySelector('#statements tbody');
    body.insertBefore(rowsFrom(from, state.first), body.firstChild);
    state.first = from;
    counts();
  }
  function counts() {
    document.getElementById('shown').textContent = state.list.length + ' of ' +
      plural(rowsOfFile[state.file] ? rowsOfFile[state.file].length : 0, 'statement') + ' shown';
    var button = document.getElementById('earlier');
    button.hidden = state.first === 0;
    button.textContent = 'Show earlier statements (' + state.first + ')';
  }

  // The rows of a file that pass a filter, from the one at position start on.
  function show(file, filter, start) {
    state.file = file;
    state.filter = filter;
    state.list = (rowsOfFile[file] || []).filter(function (row) { return keep(row, filter); });
    state.first = state.shown = start || 0;
    document.querySelector('#statements tbody').textContent = '';
    buttons();
    more();
  }

  function buttons() {
    var nav = document.getElementById('files');
    nav.textContent = '';
    data.files.forEach(function (name, i) {
      var b = el('button', i === state.file ? 'on' : '', name + ' (' + rowsOfFile[i].length + ')');
      b.addEventListener('click', function () { show(i, state.filter); });
      nav.appendChild(b);
    });
    var filters = document.getElementById('filters');
    filters.textContent = '';
    FILTERS.forEach(function (f) {
      var n = (rowsOfFile[state.file] || []).filter(function (row) { return keep(row, f[0]); }).length;
      var b = el('button', f[0] === state.filter ? 'on' : '', f[1] + ' (' + n + ')');
      b.dataset.filter = f[0];
      b.addEventListener('click', function () { show(state.file, f[0]); });
      filters.appendChild(b);
    });
    filters.appendChild(el('span', null)).id = 'shown';
  }

  // #s-FILE-LINE: that statement, expanded and in view; #filter-NAME: a filter.
  function go(hash) {
    var m = /^#s-(\d+)-(\d+)$/.exec(hash || '');
    if (m) {
      var file = Number(m[1]), line = Number(m[2]);
      var rows = rowsOfFile[file] || [];
      var row = -1;
      for (var i = 0; i < rows.length; i++) if (data.rows[rows[i]][1] === line) { row = rows[i]; break; }
      if (row < 0) return false;
      var old = document.getElementById('r-' + state.target);
      if (old) old.classList.remove('target');
      state.target = row;
      state.open[row] = true;
      var filter = keep(row, state.filter) && file === state.file ? state.filter : 'all';
      var at = (rowsOfFile[file] || []).filter(function (k) { return keep(k, filter); }).indexOf(row);
      show(file, filter, Math.max(0, at - 20));
      var tr = document.getElementById('r-' + row);
      tr.scrollIntoView({ block: 'center' });
      return true;
    }
    m = /^#filter-(\w+)$/.exec(hash || '');
    if (m) { show(state.file, flagOf(m[1])[0]); return true; }
    return false;
  }

  header();
  moreFindings();
  document.getElementById('more-findings').addEventListener('click', moreFindings);
  document.getElementById('earlier').addEventListener('click', earlier);
  if (!go(location.hash)) show(0, 'all');
  window.addEventListener('hashchange', function () { go(location.hash); });
  // More rows as the end of the table comes near; observed again after each chunk so that a
  // chunk that does not reach past the window brings the next one.
  var sentinel = document.getElementById('sentinel');
  var observer = new IntersectionObserver(function (entries) {
    if (!entries.some(function (e) { return e.isIntersecting; }) || state.shown >= state.list.length) return;
    more();
    observer.unobserve(sentinel);
    observer.observe(sentinel);
  }, { rootMargin: '600px' });
  observer.observe(sentinel);
})();
</script>
</body>
</html>
)PAGE";
