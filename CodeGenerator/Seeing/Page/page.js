"use strict";
// Shows a recorded run. Each part of the data is read when a view first needs it; the later parts stand behind this script. Numbers that name things are as in the
// recording: an index is a place in a table, an id stays with a node or statement through all snapshots.
(() => {

// ---- data ------------------------------------------------------------------------------------------------------------

const parts = new Map();
function data(name) {
  if (!parts.has(name)) {
    const raw = JSON.parse(document.getElementById("data-" + name).textContent);
    parts.set(name, raw.columns ? toObjects(raw) : raw);
  }
  return parts.get(name);
}

function toObjects(raw) {
  const columns = raw.columns, count = columns.length;
  const objects = raw.rows.map((row) => {
    const object = {};
    for (let i = 0; i < count; ++i) object[columns[i]] = row[i];
    return object;
  });
  if (raw.marks) objects.marks = new Map(raw.marks);
  return objects;
}

// A line of a file as one number; 0: no place.
const lineOf = (place) => Math.floor(place / 4096);
const lineNumber = (line) => line % 1048576;
const fileNumber = (line) => Math.floor(line / 1048576);

function lineTitle(line) {
  const text = String(lineNumber(line));
  return data("sources").length > 1 ? data("sources")[fileNumber(line)].name.replace(/.*\//, "") + ":" + text : text;
}

function lazily(make) {
  let value;
  return () => value ??= make();
}

function groupBy(items, keyOf) {
  const groups = new Map();
  items.forEach((item, index) => {
    const key = keyOf(item, index);
    if (!groups.has(key)) groups.set(key, []);
    groups.get(key).push(index);
  });
  return groups;
}

const statementsOnLine = lazily(() => groupBy(data("statements"), (each) => lineOf(each.place)));
const statesOfStatement = lazily(() => groupBy(data("statements"), (each) => each.id));
const fatesOfStatement = lazily(() => groupBy(data("fates"), (each) => data("statements")[each.statement].id));
const saturationsOfStatement = lazily(() => groupBy(data("saturations"), (each) => data("statements")[each.statement].id));
const remarksOnLine = lazily(() => groupBy(data("remarks"), (each) => lineOf(each.place)));
const versionsOfStatement = lazily(() => groupBy(data("versions"),
  (each) => each.definition < 0 ? -1 : data("statements")[each.definition].id));

const asNumber = (value) => value === "inf" ? Infinity : value === "-inf" ? -Infinity : value === "nan" ? NaN : value;

function numberText(value) {
  const number = asNumber(value);
  if (!Number.isFinite(number)) return Number.isNaN(number) ? "NaN" : number > 0 ? "∞" : "−∞";
  const text = Math.abs(number) >= 1e7 || (number !== 0 && Math.abs(number) < 1e-4) ? number.toExponential(4).replace(/\.?0+e/, "e")
    : String(Number(number.toPrecision(9)));
  return text.replace("-", "−");
}

function rangeText(found) {
  switch (found[0]) {
    case "constant": return "= " + numberText(found[1]);
    case "range": return numberText(found[1]) + " … " + numberText(found[2]);
    case "anything": return "anything";
    case "undetermined": return "undetermined";
    default: return "unknown";
  }
}

const variableName = (variable) => (variable.owner ? variable.owner.replace(/^#/, "") + "::" : "") + variable.name;

// ---- building of elements --------------------------------------------------------------------------------------------

function make(tag, attributes, ...children) {
  const element = document.createElement(tag);
  for (const [name, value] of Object.entries(attributes || {})) {
    if (name.startsWith("on")) element.addEventListener(name.slice(2), value);
    else if (value !== null && value !== undefined && value !== false) element.setAttribute(name, value);
  }
  for (const child of children.flat(Infinity)) {
    if (child !== null && child !== undefined && child !== "") element.append(child);
  }
  return element;
}

const byId = (id) => document.getElementById(id);

function fill(element, ...children) {
  element.replaceChildren(...children.flat(Infinity).filter((child) => child !== null && child !== undefined && child !== ""));
}

const escapeText = (text) => text.replace(/&/g, "&amp;").replace(/</g, "&lt;").replace(/>/g, "&gt;").replace(/"/g, "&quot;");
const code = (text) => make("code", {}, text);
const chip = (kind, text) => make("span", { class: "chip " + kind }, text ?? kind);

function lineLink(place, isShort) {
  if (!place) return "";
  return make("button", { type: "button", class: "go", "data-line": lineOf(place) }, (isShort ? "" : "line ") + lineTitle(lineOf(place)));
}

// Texts of the recording quote code in backticks.
function prose(text) {
  return make("span", {}, text.split("`").map((piece, i) => i % 2 ? code(piece) : piece));
}

function variableLink(index, text) {
  return make("button", { type: "button", class: "go", "data-variable": index }, text ?? variableName(data("variables")[index]));
}

function passLink(number) {
  return make("button", { type: "button", class: "go", "data-pass": number }, data("snapshots")[number].pass);
}

function debounce(act) {
  let timer = 0;
  return () => { clearTimeout(timer); timer = setTimeout(act, 120); };
}

// A table that sorts by its heads and filters by words. `columns`: title, value(row) to sort and filter by, cell(row) to show,
// figure: numbers; `tools`: further elements, `accepts(row)`: what they let through.
function sortedTable({ columns, rows, tools, accepts, hint, label }) {
  const most = 300;
  let column = -1, direction = 1, limit = most;
  const search = make("input", { type: "search", placeholder: hint || "filter", "aria-label": hint || "filter" });
  const count = make("span", { class: "soft" });
  const body = make("tbody");
  const more = make("button", { type: "button" });
  const heads = columns.map((each, index) => make("th", { class: each.figure ? "figure" : null, scope: "col" },
    make("button", { type: "button", onclick: () => sortBy(index) }, each.title)));
  const texts = rows.map((row) => columns.map((each) => String(each.value(row) ?? "")).join("\u0001").toLowerCase());

  function sortBy(index) {
    direction = column === index ? -direction : 1;
    column = index;
    heads.forEach((head, i) => i === index ? head.setAttribute("aria-sort", direction > 0 ? "ascending" : "descending")
      : head.removeAttribute("aria-sort"));
    show();
  }

  function compare(a, b) {
    const x = columns[column].value(rows[a]), y = columns[column].value(rows[b]);
    const order = typeof x === "number" && typeof y === "number" ? (x - y || Number.isNaN(x) - Number.isNaN(y))
      : String(x).localeCompare(String(y), "en");
    return order * direction || a - b;
  }

  function show() {
    const words = search.value.toLowerCase().split(/\s+/).filter(Boolean);
    const chosen = [];
    rows.forEach((row, i) => {
      if ((!accepts || accepts(row)) && words.every((word) => texts[i].includes(word))) chosen.push(i);
    });
    if (column >= 0) chosen.sort(compare);
    fill(body, ...chosen.slice(0, limit).map((i) => make("tr", {}, columns.map((each) =>
      make("td", { class: each.figure ? "figure" : each.code ? "code" : null }, (each.cell || each.value)(rows[i]))))));
    count.textContent = chosen.length === rows.length ? `${rows.length} rows` : `${chosen.length} of ${rows.length} rows`;
    more.hidden = chosen.length <= limit;
    more.textContent = `show all ${chosen.length}`;
  }

  search.addEventListener("input", debounce(show));
  more.addEventListener("click", () => { limit = Infinity; show(); });
  (tools || []).forEach((tool) => tool.addEventListener("change", show));
  show();
  const element = make("div", {}, make("div", { class: "tools" }, search, tools || [], count),
    make("div", { class: "scroller" }, make("table", { "aria-label": label }, make("thead", {}, make("tr", {}, heads)), body)), more);
  element.filterBy = (text) => { search.value = text; show(); };
  return element;
}

function choice(label, values) {
  const select = make("select", {}, values.map(([value, text]) => make("option", { value }, text)));
  const element = make("label", {}, label + " ", select);
  element.select = select;
  return element;
}

function tick(label, isOn) {
  const box = make("input", { type: "checkbox" });
  box.checked = isOn;
  const element = make("label", {}, box, " " + label);
  element.box = box;
  return element;
}

// ---- the program text ------------------------------------------------------------------------------------------------

const keywords = /\b(type|input|output|state|param|extern|export|proc|local|if|else|while|for|do|switch|case|default|break|continue|goto|return|range|lsb|offset|saturate|reads|writes|true|false)\b/g;

function paintLine(text) {
  const at = text.indexOf("//");
  const before = at < 0 ? text : text.slice(0, at);
  const painted = escapeText(before).replace(keywords, '<span class="keyword">$1</span>');
  return at < 0 ? painted : painted + '<span class="comment">' + escapeText(text.slice(at)) + "</span>";
}

function showSource() {
  let text = "";
  data("sources").forEach((source, file) => {
    if (data("sources").length > 1) text += `<div class="file">${escapeText(source.name)}</div>`;
    source.text.replace(/\n$/, "").split("\n").forEach((each, i) => {
      const line = file * 1048576 + i + 1;
      text += `<div class="line" id="line-${line}" data-line="${line}"><span class="number">${i + 1}</span><span>${paintLine(each)}</span></div>`;
    });
  });
  byId("source").innerHTML = text;
}

// Marks at the numbers: what was removed, what stays though it looks unused.
function markSource() {
  const marks = new Map();
  for (const each of data("fates")) {
    const line = lineOf(data("statements")[each.statement].place);
    if (line && (each.isRemoved || each.looksUnused)) marks.set(line, marks.get(line) === "−" || each.isRemoved ? "−" : "!");
  }
  for (const [line, mark] of marks) {
    const number = document.querySelector(`#line-${line} .number`);
    if (number) number.prepend(make(mark === "−" ? "b" : "i", { title: mark === "−" ? "something here was removed" : "stays though it looks unused" }, mark + " "));
  }
}

// ---- what is chosen --------------------------------------------------------------------------------------------------

const chosen = { line: 0, node: -1, ids: new Set() };

function chooseLine(line, isFromPicture) {
  chosen.line = line;
  document.querySelectorAll("#source .chosen").forEach((each) => each.classList.remove("chosen"));
  const element = byId("line-" + line);
  if (element) {
    element.classList.add("chosen");
    scrollInside(byId("source"), element);
  }
  if (isFromPicture) return;
  chosen.node = -1;
  inspectLine(line);
  if (!byId("view-passes").hidden) showLineInPictures(line);
}

function scrollInside(container, element) {
  const top = element.offsetTop - container.offsetTop;
  if (top < container.scrollTop + 40 || top > container.scrollTop + container.clientHeight - 40)
    container.scrollTop = top - container.clientHeight / 3;
}

function chooseNode(nodeIndex) {
  const node = data("nodes")[nodeIndex];
  chosen.node = node.id;
  chooseLine(lineOf(node.place), true);
  inspectNode(node);
  markChosen();
}

function inspectLine(line) {
  const states = (statementsOnLine().get(line) || []).map((index) => data("statements")[index]);
  const ids = [...new Set(states.map((each) => each.id))];
  const remarks = (remarksOnLine().get(line) || []).map((index) => data("remarks")[index]);
  const declared = data("variables").map((each, index) => [each, index]).filter(([each]) => lineOf(each.place) === line && !each.isHidden);
  fill(byId("inspector"),
    make("h2", {}, "Line " + lineTitle(line), byId("view-passes").hidden && ids.length
      ? make("button", { type: "button", style: "float:right;font-weight:400;font-size:12px", onclick: () => { openView("passes"); showLineInPictures(line); } }, "show in the graph") : ""),
    ...declared.map(([each, index]) => make("div", {}, "declares ", variableLink(index, variableName(each)), " ", code(rangeText(each.found)))),
    ...ids.map(aboutStatement),
    remarks.length ? make("h3", {}, "Remarks") : "",
    make("ul", {}, remarks.map((each) => make("li", {}, prose(each.text), " ", make("span", { class: "soft" }, each.pass)))),
    ids.length || declared.length || remarks.length ? "" : make("p", { class: "empty" }, "Nothing of the graph begins on this line."));
  byId("inspector").scrollTop = 0;
}

function inspectNode(node) {
  const ids = [...new Set(node.statements.map((index) => data("statements")[index].id))];
  fill(byId("inspector"),
    make("h2", {}, `Node ${node.id}`, node.kind === "block" ? "" : ` (${node.kind})`),
    node.place ? make("div", {}, lineLink(node.place)) : "",
    ...ids.slice(0, 40).map(aboutStatement),
    ids.length > 40 ? make("p", { class: "soft" }, `and ${ids.length - 40} more statements`) : "",
    ids.length ? "" : make("p", { class: "empty" }, "An empty node: control only passes through."));
  byId("inspector").scrollTop = 0;
}

function inspectFolded(indices) {
  const lines = [...new Set(indices.map((index) => lineOf(data("nodes")[index].place)).filter(Boolean))].sort((a, b) => a - b);
  fill(byId("inspector"), make("h2", {}, `${indices.length} nodes, folded`),
    make("ul", {}, lines.slice(0, 200).map((line) => make("li", {}, make("button", { type: "button", class: "go", "data-line": line },
      "line " + lineTitle(line)), " ", code((byId("line-" + line)?.lastChild.textContent || "").trim())))));
}

// History, fate, saturation and versions of one statement.
function aboutStatement(id) {
  const states = statesOfStatement().get(id).map((index) => data("statements")[index]);
  const last = states[states.length - 1];
  const texts = [...new Set(states.map((each) => each.text))];
  const lines = [];
  for (const index of fatesOfStatement().get(id) || []) {
    const fate = data("fates")[index];
    lines.push(make("div", {}, fate.isRemoved ? chip("removed") : chip(fate.looksUnused ? "warn" : "good", "stays"), " ",
      fate.isRemoved ? ["by ", passLink(fate.snapshot), ": "] : "", prose(fate.why), " ", fate.because ? lineLink(fate.because) : ""));
  }
  for (const index of saturationsOfStatement().get(id) || []) lines.push(saturationText(data("saturations")[index]));
  for (const index of (versionsOfStatement().get(id) || []).slice(0, 6)) {
    const version = data("versions")[index];
    lines.push(make("details", {}, make("summary", {}, code(version.name), " " + rangeText(version.found) + " – why?"), explanation(index)));
  }
  return make("div", { class: "about" }, make("h3", {}, code(texts[0]), last.makesCode ? "" : make("span", { class: "soft" }, " " + formTitle(last.form))),
    texts.slice(1).map((text) => make("div", {}, make("span", { class: "soft" }, "→ "), code(text))), lines);
}

const formTitle = (form) => ({ initialValue: "initial value", valueReturn: "what a call leaves", join: "join of ways", note: "what a branch tells",
  output: "read from outside", parameter: "parameter" })[form] || form;

function saturationText(each) {
  const sides = [["low", "lower"], ["high", "upper"]].map(([side, title]) => [chip(each[side], each[side] === "notReached" ? "not reached" : each[side]), ` at its ${title} limit `]);
  return make("div", {}, "saturates ", sides, make("span", { class: "soft" }, "(brings " + rangeText(each.value) + ")"));
}

// Follows the explanation of a version through the versions it names, each one once: a line that names a version gives way to
// what that one says of itself.
function explanation(index) {
  const tree = make("div", { class: "tree" }), told = new Set(), pending = [];
  const tell = (version, depth) => {
    told.add(version);
    const reasons = data("versions")[version].explanation;
    for (let i = reasons.length - 1; i >= 0; --i) pending.push([reasons[i], i ? depth + 1 : depth]);
  };
  tell(index, 0);
  let count = 0;
  while (pending.length && count < 200) {
    const [[text, place, next], depth] = pending.pop();
    if (next >= 0 && !told.has(next)) {
      tell(next, depth);
      continue;
    }
    ++count;
    tree.append(make("div", { style: `padding-left:${Math.min(depth, 14) * 14}px` },
      prose(text), next >= 0 ? make("span", { class: "soft" }, " (see above)") : "", " ", lineLink(place)));
  }
  if (pending.length) tree.append(make("div", { class: "soft" }, "… the chain goes on"));
  return tree;
}

// ---- passes and pictures ---------------------------------------------------------------------------------------------

const view = { pass: 0, procedure: "", before: null, after: null };
const totalOf = (snapshot) => Object.values(snapshot.tally).reduce((sum, each) => sum + each, 0);
const wordsOf = (name) => name.replace(/([a-z])([A-Z])/g, "$1\u200b$2").replace(/_/g, "_\u200b");

function timeText(seconds) {
  return seconds >= 1 ? seconds.toFixed(2) + " s" : seconds >= 0.001 ? (seconds * 1000).toFixed(1) + " ms" : Math.round(seconds * 1e6) + " µs";
}

function showTimeline() {
  const snapshots = data("snapshots");
  const mostChanges = Math.max(1, ...snapshots.map(totalOf)), mostTime = Math.max(1e-9, ...snapshots.map((each) => each.seconds));
  fill(byId("timeline"), ...snapshots.map((each) => {
    const total = totalOf(each), height = total ? 4 + 30 * Math.sqrt(total / mostChanges) : 0;
    const bars = Object.entries(each.tally).filter(([, count]) => count).map(([kind, count]) =>
      make("span", { class: "bar-" + kind, style: `height:${(height * count / total).toFixed(1)}px` }));
    const tally = Object.entries(each.tally).filter(([, count]) => count).map(([kind, count]) => `${count} ${kind}`).join(", ") || "no changes";
    return make("button", { type: "button", role: "option", "data-pass": each.number, title: `${each.pass}: ${each.purpose}\n${tally}\n${timeText(each.seconds)}` },
      make("span", { class: "bars" }, bars), make("span", { class: "time", style: `width:${(100 * each.seconds / mostTime).toFixed(1)}%` }),
      make("span", { class: "figures" }, (each.number ? total + " · " + timeText(each.seconds) : "start")), make("span", {}, each.number + " " + wordsOf(each.pass)));
  }));
}

const snapshotBefore = () => data("snapshots")[Math.max(0, view.pass - 1)];
const snapshotAfter = () => data("snapshots")[view.pass];
const findProcedure = (snapshot, name) => snapshot.procedures.find((index) => data("procedures")[index].name === name) ?? -1;

function choosePass(number, line) {
  view.pass = number;
  changeAt = -1;
  const snapshot = snapshotAfter();
  document.querySelectorAll("#timeline button").forEach((each, i) => each.setAttribute("aria-selected", i === number));
  const tally = Object.entries(snapshot.tally).filter(([, count]) => count);
  fill(byId("pass-about"), make("b", {}, snapshot.pass), ": " + snapshot.purpose + ". ", tally.map(([kind, count]) => [chip(kind, `${count} ${kind}`), " "]),
    make("span", { class: "soft" }, `${snapshot.nodeCount} nodes, ${snapshot.statementCount} statements after it`));
  fillProcedures();
  if (line) chooseProcedureOfLine(line);
  showPictures();
  showChanges();
}

function fillProcedures() {
  const changed = new Map();
  for (const each of data("changes-" + view.pass)) changed.set(each.procedure, (changed.get(each.procedure) || 0) + 1);
  const names = new Map();
  for (const snapshot of [snapshotAfter(), snapshotBefore()])
    for (const index of snapshot.procedures) names.set(data("procedures")[index].name, data("procedures")[index].title);
  const listed = [...names].sort((a, b) => (changed.get(b[0]) || 0) - (changed.get(a[0]) || 0));
  const select = byId("procedure");
  fill(select, ...listed.map(([name, title]) => make("option", { value: name }, title + (changed.get(name) ? ` (${changed.get(name)} changed)` : ""))),
    make("option", { value: "*calls" }, "whole program: calls"));
  if (!names.has(view.procedure) && view.procedure !== "*calls") view.procedure = listed[0][0];
  select.value = view.procedure;
}

function showPictures() {
  const isFirst = view.pass === 0;
  const boxes = [["before", snapshotBefore()], ["after", snapshotAfter()]];
  for (const [side, snapshot] of boxes) {
    const title = snapshot.number ? "after " + snapshot.number + " " + snapshot.pass : "as built";
    byId("caption-" + side).textContent = side === "before" ? `before (${title})` : title;
    byId(side).closest("figure").hidden = isFirst && side === "before";
    view[side] = isFirst && side === "before" ? null : drawSide(byId(side), snapshot, side);
  }
  startPosition();
  drawSsa();
}

function drawSide(element, snapshot, side) {
  element.onpointerdown = null;
  const index = view.procedure === "*calls" ? -1 : findProcedure(snapshot, view.procedure);
  const picture = view.procedure === "*calls" ? { layout: data("pictures").calls[snapshot.number] } : index < 0 ? null : data("pictures").procedures[index];
  if (!picture || picture.layout < 0) {
    fill(element, make("p", {}, whyNoPicture(picture)));
    return null;
  }
  const layout = data("layout-" + picture.layout);
  const scene = { element, layout, rows: new Map(), lines: new Map(), marked: [], boxes: [], x: 0, y: 0, scale: 1, index, side };
  const body = index < 0 ? drawCalls(layout, snapshot) : drawBoxes(scene, layout, picture, snapshot, side);
  element.innerHTML = `<svg role="img" aria-label="graph ${side}"><defs>${["f", "t", "n"].map((kind) =>
    `<marker id="tip-${side}-${kind}" viewBox="0 0 10 10" refX="0" refY="5" markerWidth="7" markerHeight="7" markerUnits="userSpaceOnUse" orient="auto"><path class="tip ${kind}" d="M0,1L10,5L0,9z"/></marker>`).join("")}</defs><g class="world">` +
    layout.edges.map(([, , kind, path]) => `<path class="way ${kind}" d="${path}" marker-end="url(#tip-${side}-${kind})"/>`).join("") + body + '<g class="overlay"></g></g></svg>';
  if (picture.isFolded) byId("caption-" + side).textContent += " (over 1,000 nodes: folded)";
  return scene;
}

function whyNoPicture(picture) {
  if (!picture) return "This procedure is not in the program here.";
  if (!data("pictures").isGraphvizThere) return "No pictures: graphviz (the program dot) was not found when this page was written.";
  if (picture.isTooSlow) return "Left out: graphviz took longer than the time a picture may take. The changes are listed below.";
  return `Left out: the time for pictures was over (${data("pictures").leftOut} are left out, the least changed ones). The changes are listed below.`;
}

const rowHeight = 16, longestText = 64, mostRows = 60, headRows = 40;

// The rows of a node: statements, and one that stands for those in the middle of a long list. The generator reckons with the
// same numbers.
function rowsOf(node) {
  const list = node.statements;
  if (!list.length) return [{ text: node.kind === "block" ? "·" : node.kind, isVirtual: true }];
  const rows = list.map((index) => ({ text: data("statements")[index].text, isVirtual: !data("statements")[index].makesCode }));
  if (rows.length <= mostRows) return rows;
  const skipped = rows.length - (mostRows - 1);
  return [...rows.slice(0, headRows), { text: `… ${skipped} more`, isVirtual: true }, ...rows.slice(headRows + skipped)];
}

function cut(text) {
  const letters = text.length > longestText ? [...text] : null;
  return letters && letters.length > longestText ? letters.slice(0, longestText - 1).join("") + "…" : text;
}

function marksOf(side) {
  if (view.pass === 0) return new Map();
  return data("changes-" + view.pass).marks;
}

function drawBoxes(scene, layout, picture, snapshot, side) {
  const marks = marksOf(side), nodes = data("nodes"), pieces = [];
  layout.boxes.forEach(([x, y, width, height], boxIndex) => {
    pieces.push(`<rect class="box" x="${x}" y="${y}" width="${width}" height="${height}" rx="3"/>`);
    let top = y + 4;
    const ids = scene.boxes[boxIndex] = [];
    picture.boxes[boxIndex].forEach((item, i) => {
      if (i) pieces.push(`<line class="rule" x1="${x}" x2="${x + width}" y1="${top}" y2="${top}"/>`);
      const rows = Array.isArray(item) ? [{ text: `⋯ ${item.length} nodes`, isVirtual: true }] : rowsOf(nodes[item]);
      const high = rows.length * rowHeight, at = { x, y: top, width, height: high };
      if (Array.isArray(item)) {
        const isMarked = item.some((index) => marks.has(nodes[index].id));
        pieces.push(`<g class="row folded${isMarked ? " changed" : ""}" data-box="${boxIndex}" data-item="${i}">`);
        for (const index of item) noteLines(scene, nodes[index], at);
      } else {
        const mark = marks.get(nodes[item].id) || "";
        pieces.push(`<g class="row ${mark}" data-node="${item}" data-id="${nodes[item].id}">`);
        scene.rows.set(nodes[item].id, at);
        ids.push(nodes[item].id);
        noteLines(scene, nodes[item], at);
        if (mark) scene.marked.push(item);
      }
      pieces.push(rowTexts(rows, at, Array.isArray(item) ? "" : marks.get(nodes[item].id) || ""), "</g>");
      top += high;
    });
  });
  return pieces.join("");
}

function rowTexts(rows, at, mark) {
  const sign = { added: "+", removed: "−", changed: "~" }[mark];
  let text = `<rect x="${at.x + 1}" y="${at.y}" width="${at.width - 2}" height="${at.height}"/>`;
  if (sign) text += `<text class="mark" x="${at.x + 3}" y="${at.y + 12}">${sign}</text>`;
  rows.forEach((row, i) => {
    const shown = cut(row.text);
    text += `<g${row.isVirtual ? ' class="virtual"' : ""}><text x="${at.x + 13}" y="${at.y + 12 + i * rowHeight}">${escapeText(shown)}` +
      (shown === row.text ? "" : `<title>${escapeText(row.text)}</title>`) + "</text></g>";
  });
  return text;
}

function noteLines(scene, node, at) {
  const lines = new Set(node.statements.map((index) => lineOf(data("statements")[index].place)));
  lines.add(lineOf(node.place));
  for (const line of lines) {
    if (!scene.lines.has(line)) scene.lines.set(line, []);
    scene.lines.get(line).push({ id: node.id, at });
  }
}

function drawCalls(layout, snapshot) {
  return layout.boxes.map(([x, y, width, height], i) => {
    const procedure = data("procedures")[snapshot.procedures[i]];
    return `<g class="row" data-procedure="${escapeText(procedure.name)}"><rect class="box" style="fill:var(--paper)" x="${x}" y="${y}" width="${width}" height="${height}" rx="3"/>` +
      `<text x="${x + 8}" y="${y + 16}" style="font-weight:700">${escapeText(procedure.title)}</text><text x="${x + 8}" y="${y + 32}">${procedure.nodes.length} nodes</text></g>`;
  }).join("");
}

// SSA edges lie over the picture, from a definition to its uses.
function drawSsa() {
  for (const scene of [view.before, view.after]) {
    if (!scene || scene.index < 0) continue;
    if (!chosen.ids.size && !byId("ssa").checked) {
      scene.element.querySelector(".overlay").replaceChildren();
      continue;
    }
    const list = data("ssa")[data("procedures")[scene.index].ssa];
    let text = "";
    for (let i = 0; i + 1 < list.length; i += 2) {
      const isNear = chosen.ids.has(list[i]) || chosen.ids.has(list[i + 1]);
      if (!isNear && !byId("ssa").checked) continue;
      const from = scene.rows.get(list[i]), to = scene.rows.get(list[i + 1]);
      if (from && to) text += `<path class="ssa${isNear ? " near" : ""}" d="${ssaPath(from, to)}" marker-end="url(#tip-${scene.side}-f)"/>`;
    }
    scene.element.querySelector(".overlay").innerHTML = text;
  }
}

function ssaPath(from, to) {
  const x1 = from.x + from.width, y1 = from.y + from.height / 2, y2 = to.y + to.height / 2;
  const isRight = to.x + to.width / 2 >= x1, x2 = isRight ? to.x - 7 : to.x + to.width + 7;
  const bend = Math.min(160, 24 + Math.abs(y2 - y1) / 6 + Math.abs(x2 - x1) / 4);
  return `M${x1},${y1}C${x1 + bend},${y1} ${isRight ? x2 - bend : x2 + bend},${y2} ${x2},${y2}`;
}

// ---- moving about in the pictures ------------------------------------------------------------------------------------

function place(scene) {
  const world = scene.element.querySelector(".world");
  if (world) world.setAttribute("transform", `translate(${scene.x.toFixed(1)},${scene.y.toFixed(1)}) scale(${scene.scale.toFixed(4)})`);
}

const scenes = () => [view.before, view.after].filter(Boolean);

function fit(scene) {
  const width = scene.element.clientWidth, height = scene.element.clientHeight;
  scene.scale = Math.min(1.3, width / (scene.layout.width + 30), height / (scene.layout.height + 30));
  scene.x = (width - scene.layout.width * scene.scale) / 2;
  scene.y = (height - scene.layout.height * scene.scale) / 2;
  place(scene);
}

function bringToSight(scene, at, scale) {
  scene.scale = scale ?? Math.max(scene.scale, 0.75);
  scene.x = scene.element.clientWidth / 2 - (at.x + Math.min(at.width, 300) / 2) * scene.scale;
  scene.y = scene.element.clientHeight / 3 - at.y * scene.scale;
  place(scene);
}

// What fits stays whole; of anything larger the first change is shown, readable.
function startPosition() {
  scenes().forEach(fit);
  const large = scenes().filter((scene) => scene.index >= 0 && scene.scale < 0.6), first = changedNodes()[0];
  for (const scene of large) {
    const [x, y, width] = scene.layout.boxes[0];
    bringToSight(scene, (first === undefined ? null : placeNear(scene, data("nodes")[first].id)) || { x, y, width }, 0.85);
  }
  if (chosen.line || chosen.node >= 0) markChosen();
}

function zoom(scene, factor, x, y) {
  const scale = Math.min(4, Math.max(0.02, scene.scale * factor));
  scene.x = x - (x - scene.x) * scale / scene.scale;
  scene.y = y - (y - scene.y) * scale / scene.scale;
  scene.scale = scale;
  place(scene);
}

const movedWith = (scene) => byId("together").checked ? scenes() : [scene];

function zoomAll(factor) {
  for (const scene of scenes()) zoom(scene, factor, scene.element.clientWidth / 2, scene.element.clientHeight / 2);
}

function pan(scene, x, y) {
  for (const each of movedWith(scene)) {
    each.x += x;
    each.y += y;
    place(each);
  }
}

let changeAt = -1;
function nextChange(step) {
  const nodes = changedNodes();
  if (!nodes.length) return;
  changeAt = changeAt < 0 && step < 0 ? nodes.length - 1 : (changeAt + step + nodes.length) % nodes.length;
  const index = nodes[changeAt];
  chooseNode(index);
  bringBothToSight(data("nodes")[index].id);
}

function bringBothToSight(id) {
  for (const scene of scenes()) {
    const at = placeNear(scene, id);
    if (at) bringToSight(scene, at);
  }
}

// Marked nodes of both sides, first those that have gone.
function changedNodes() {
  const nodes = new Map();
  for (const scene of scenes())
    for (const index of scene.marked) if (!nodes.has(data("nodes")[index].id)) nodes.set(data("nodes")[index].id, index);
  return [...nodes.values()];
}

// Where a node stands, or on the side that lacks it the nearest one on the way to it.
function placeNear(scene, id) {
  if (scene.rows.has(id)) return scene.rows.get(id);
  const other = scenes().find((each) => each !== scene && each.rows.has(id));
  if (!other) return null;
  const first = other.boxes.findIndex((ids) => ids.includes(id)), seen = new Set([first]), pending = [first];
  const common = (ids) => scene.rows.get(ids.filter((each) => scene.rows.has(each)).pop());
  const before = common(other.boxes[first].slice(0, other.boxes[first].indexOf(id)));
  if (before) return before;
  while (pending.length) {
    const box = pending.shift();
    for (const [from, to] of other.layout.edges) {
      if (to !== box || seen.has(from)) continue;
      const found = common(other.boxes[from]);
      if (found) return found;
      seen.add(from);
      pending.push(from);
    }
  }
  return null;
}

function listenToPicture(side) {
  const element = byId(side);
  let drag = null;
  element.addEventListener("wheel", (event) => {
    if (!view[side]) return;
    event.preventDefault();
    const box = element.getBoundingClientRect(), factor = Math.exp(-event.deltaY * 0.0015);
    for (const scene of movedWith(view[side])) zoom(scene, factor, event.clientX - box.left, event.clientY - box.top);
  }, { passive: false });
  element.addEventListener("pointerdown", (event) => { drag = { x: event.clientX, y: event.clientY, far: 0 }; });
  element.addEventListener("pointermove", (event) => {
    if (!drag || !view[side] || !(event.buttons & 1)) return;
    const x = event.clientX - drag.x, y = event.clientY - drag.y;
    drag = { x: event.clientX, y: event.clientY, far: drag.far + Math.abs(x) + Math.abs(y) };
    element.classList.toggle("dragged", drag.far > 3);
    pan(view[side], x, y);
  });
  element.addEventListener("pointerleave", () => element.classList.remove("dragged"));
  element.addEventListener("click", (event) => {
    const wasDragged = drag && drag.far > 3;
    drag = null;
    element.classList.remove("dragged");
    if (!wasDragged) clickRow(event.target.closest(".row"), view[side]);
  });
  element.addEventListener("dblclick", () => scenes().forEach(fit));
  element.addEventListener("keydown", (event) => keyInPicture(event, side));
}

function clickRow(row, scene) {
  if (!row || !scene) return;
  if (row.dataset.node) chooseNode(Number(row.dataset.node));
  else if (row.dataset.procedure) chooseProcedure(row.dataset.procedure);
  else inspectFolded(data("pictures").procedures[scene.index].boxes[row.dataset.box][row.dataset.item]);
}

function keyInPicture(event, side) {
  const scene = view[side];
  const moves = { ArrowLeft: [60, 0], ArrowRight: [-60, 0], ArrowUp: [0, 60], ArrowDown: [0, -60] };
  if (!scene || event.ctrlKey || event.metaKey || event.altKey) return;
  if (moves[event.key]) pan(scene, ...moves[event.key]);
  else if (event.key === "+" || event.key === "=") zoomAll(1.25);
  else if (event.key === "-") zoomAll(0.8);
  else if (event.key === "0") scenes().forEach(fit);
  else if (event.key === "n") nextChange(1);
  else if (event.key === "p") nextChange(-1);
  else return;
  event.preventDefault();
}

function markChosen() {
  document.querySelectorAll(".picture .chosen").forEach((each) => each.classList.remove("chosen"));
  chosen.ids.clear();
  for (const scene of scenes()) {
    const ids = chosen.node >= 0 ? [chosen.node] : (scene.lines.get(chosen.line) || []).map((each) => each.id);
    for (const id of ids) {
      chosen.ids.add(id);
      scene.element.querySelector(`[data-id="${id}"]`)?.classList.add("chosen");
    }
  }
  drawSsa();
}

function chooseProcedure(name) {
  view.procedure = name;
  byId("procedure").value = name;
  changeAt = -1;
  showPictures();
}

// The procedure of this snapshot in which a line stands, if not the one that is shown.
function chooseProcedureOfLine(line) {
  const isIn = (index) => index >= 0 && data("procedures")[index].nodes.some((node) =>
    data("nodes")[node].statements.some((each) => lineOf(data("statements")[each].place) === line));
  for (const snapshot of [snapshotAfter(), snapshotBefore()]) {
    if (isIn(findProcedure(snapshot, view.procedure))) return false;
  }
  for (const snapshot of [snapshotAfter(), snapshotBefore()]) {
    const found = snapshot.procedures.find(isIn);
    if (found === undefined) continue;
    view.procedure = data("procedures")[found].name;
    byId("procedure").value = view.procedure;
    return true;
  }
  return false;
}

function showLineInPictures(line) {
  if (!line) return;
  if (chooseProcedureOfLine(line)) showPictures();
  markChosen();
  for (const scene of scenes()) {
    const places = scene.lines.get(line);
    if (places) bringToSight(scene, places[0].at);
  }
}

function showChanges() {
  if (view.pass === 0) {
    fill(byId("changes"));
    return;
  }
  const text = (index) => index < 0 ? "" : data("statements")[index].text;
  const placeOf = (each) => data("statements")[each.before >= 0 ? each.before : each.after]?.place || 0;
  const title = (name) => name.replace(/^#/, "");
  fill(byId("changes"), make("h3", {}, "What this pass changed"), sortedTable({
    label: "changes", hint: "filter the changes", rows: data("changes-" + view.pass),
    columns: [
      { title: "change", value: (each) => each.kind, cell: (each) => chip(each.kind) },
      { title: "line", value: (each) => lineOf(placeOf(each)), cell: (each) => lineLink(placeOf(each), true) },
      { title: "procedure", value: (each) => title(each.procedure) },
      { title: "before", value: (each) => text(each.before), code: true },
      { title: "after", value: (each) => text(each.after), code: true },
      { title: "why", value: (each) => each.why, cell: (each) => prose(each.why) }
    ] }));
}

// ---- variables -------------------------------------------------------------------------------------------------------

function limitsText(each) {
  if (!each.hasLimits) return "–";
  const saturates = each.saturatesLow && each.saturatesHigh ? " saturates" : each.saturatesLow ? " saturates low" : each.saturatesHigh ? " saturates high" : "";
  return numberText(each.lower) + " … " + numberText(each.upper) + saturates;
}

function scalingText(each) {
  if (!each.isScaled) return "–";
  return numberText(each.lsb) + (each.unit ? " " + each.unit : "") + (each.offset ? ", offset " + numberText(each.offset) : "");
}

function fillVariables(section) {
  const kind = choice("kind", [["", "all"], ...["input", "output", "state", "param", "local", "formal", "result"].map((each) => [each, each])]);
  const hidden = tick("hidden ones too", false);
  const list = data("variables").map((each, index) => ({ ...each, index }));
  const places = (all) => {
    const lines = [...new Set(all.map(lineOf))].filter(Boolean);
    return make("span", {}, lines.slice(0, 4).map((line, i) => [i ? ", " : "", make("button", { type: "button", class: "go", "data-line": line }, lineTitle(line))]),
      lines.length > 4 ? ` +${lines.length - 4}` : "");
  };
  section.append(sortedTable({
    label: "variables", hint: "filter by name, type, unit, value …", rows: list, tools: [kind, hidden],
    accepts: (each) => (!kind.select.value || each.kind === kind.select.value) && (hidden.box.checked || !each.isHidden),
    columns: [
      { title: "variable", value: variableName, cell: (each) => variableLink(each.index) },
      { title: "kind", value: (each) => each.kind },
      { title: "type", value: (each) => each.type + (each.base !== each.type ? " " + each.base : ""), cell: (each) =>
        make("span", {}, each.type + (each.count ? `[${each.count}]` : ""), each.base !== each.type ? make("span", { class: "soft" }, " " + each.base) : "") },
      { title: "step", value: (each) => each.lsb, cell: scalingText },
      { title: "limits", value: limitsText },
      { title: "found", value: (each) => ["constant", "range"].includes(each.found[0]) ? asNumber(each.found[1]) : rangeText(each.found),
        cell: (each) => make("span", { title: each.notTracked || null }, rangeText(each.found), each.unit && ["constant", "range"].includes(each.found[0]) ? make("span", { class: "soft" }, " " + each.unit) : "") },
      { title: "starts as", value: (each) => each.kind === "input" ? NaN : asNumber(each.initial), cell: (each) => each.kind === "input" ? "–" : numberText(each.initial), figure: true },
      { title: "read", value: (each) => each.uses.length, figure: true },
      { title: "declared", value: (each) => lineOf(each.place), cell: (each) => places([each.place]) },
      { title: "defined in lines", value: (each) => each.definitions.length, cell: (each) => places(each.definitions) },
      { title: "kept / not tracked", value: (each) => [each.notTracked && "not tracked: " + each.notTracked, each.keptBecause].filter(Boolean).join("; ") }
    ] }));
}

// ---- ranges ----------------------------------------------------------------------------------------------------------

// Judges a range that was found: how it meets the limits, and whether a smaller storage would do.
function judge(each) {
  const [kind, a, b] = each.found, notes = [];
  if (kind !== "constant" && kind !== "range") return { kind, notes };
  const low = asNumber(a), high = asNumber(kind === "constant" ? a : b);
  const bottom = each.hasLimits ? asNumber(each.lower) : asNumber(each.storageLow), top = each.hasLimits ? asNumber(each.upper) : asNumber(each.storageHigh);
  if (kind === "range" && Number.isFinite(top - bottom) && each.base !== "bool") {
    const near = (top - bottom) * 0.02;
    if (each.saturatesHigh && high >= top) notes.push(["warn", "reaches its upper limit"]);
    else if (high > top - near) notes.push(["warn", high >= top ? "fills the type at the top" : "nearly at the top"]);
    if (each.saturatesLow && low <= bottom && bottom < 0) notes.push(["warn", "reaches its lower limit"]);
    else if (bottom < 0 && low < bottom + near) notes.push(["warn", low <= bottom ? "fills the type at the bottom" : "nearly at the bottom"]);
  }
  const bits = Number((/\d+/.exec(each.base) || [0])[0]), steps = (high - low) / each.lsb + 1;
  const needed = steps <= 2 && each.lsb === 1 && low >= 0 && high <= 1 ? 1 : steps <= 256 ? 8 : steps <= 65536 ? 16 : 32;
  if (kind === "range" && !each.base.startsWith("float") && bits > needed) notes.push(["wide", `far too wide: ${needed} bit${needed > 1 ? "s" : ""} would do`]);
  return { kind, low, high, notes };
}

function rangeBar(each, verdict) {
  let bottom = each.hasLimits ? asNumber(each.lower) : asNumber(each.storageLow), top = each.hasLimits ? asNumber(each.upper) : asNumber(each.storageHigh);
  const isKnown = verdict.low !== undefined && Number.isFinite(verdict.low) && Number.isFinite(verdict.high);
  const isEndless = !Number.isFinite(top - bottom);
  if (isEndless && isKnown) { bottom = Math.min(0, verdict.low); top = Math.max(0, verdict.high, bottom + 1); }
  if (isKnown) { bottom = Math.min(bottom, verdict.low); top = Math.max(top, verdict.high); }
  const at = (value) => 1 + 98 * (value - bottom) / (top - bottom || 1);
  const label = (value, x, anchor) => `<text x="${x}%" y="30" text-anchor="${anchor}">${numberText(value)}</text>`;
  let text = `<svg role="img" aria-label="${escapeText(variableName(each) + " " + rangeText(each.found))}">`;
  text += isEndless ? '<rect class="none" x="1%" y="8" width="98%" height="10"/>' : '<rect class="track" x="1%" y="8" width="98%" height="10" rx="2"/>';
  if (verdict.kind === "anything" && !isEndless) text += '<rect class="any" x="1%" y="8" width="98%" height="10" rx="2"/>';
  if (isKnown) {
    const kind = verdict.notes.some(([note]) => note === "wide") ? "wide" : verdict.notes.length ? "warn" : "";
    text += `<rect class="found ${kind}" x="${at(verdict.low).toFixed(3)}%" y="8" width="${Math.max(0.4, at(verdict.high) - at(verdict.low)).toFixed(3)}%" height="10" rx="2"/>`;
  }
  if (!isEndless) text += label(bottom, 1, "start") + label(top, 99, "end");
  if (bottom < 0 && top > 0 && at(0) > 12 && at(0) < 88) text += `<line x1="${at(0)}%" x2="${at(0)}%" y1="5" y2="21" stroke="currentColor" stroke-opacity=".5"/>` + label(0, at(0), "middle");
  return text + "</svg>";
}

function fillRanges(section) {
  const which = choice("show", [["all", "all"], ["known", "ranges that were found"], ["warn", "at or near a limit"], ["wide", "types far too wide"], ["constant", "constants"]]);
  const search = make("input", { type: "search", placeholder: "filter by name or type", "aria-label": "filter by name or type" });
  const count = make("span", { class: "soft" }), plot = make("div", { id: "plot" });
  const list = data("variables").map((each, index) => ({ each, index, verdict: judge(each) })).filter(({ each }) => !each.isHidden);
  const accepts = ({ verdict }) => ({ known: verdict.kind === "range", constant: verdict.kind === "constant", all: true }[which.select.value] ??
    verdict.notes.some(([kind]) => kind === which.select.value));
  function show() {
    const words = search.value.toLowerCase().split(/\s+/).filter(Boolean);
    const shown = list.filter((item) => accepts(item) && words.every((word) => (variableName(item.each) + " " + item.each.type).toLowerCase().includes(word)));
    fill(plot, ...shown.slice(0, 400).flatMap(({ each, index, verdict }) => {
      const bar = make("div", {});
      bar.innerHTML = rangeBar(each, verdict);
      return [make("div", {}, variableLink(index), make("div", { class: "soft", style: "font-size:12px" }, each.type + (each.unit ? ", " + each.unit : ""))), bar,
        make("div", { title: each.notTracked || null }, each.found[0] === "unknown" ? make("span", { class: "soft" }, "not tracked") : code(rangeText(each.found)), each.unit && verdict.low !== undefined ? make("span", { class: "soft" }, " " + each.unit) : "",
          make("div", {}, verdict.notes.map(([kind, text]) => [chip(kind === "wide" ? "info" : "warn", text), " "])))];
    }));
    count.textContent = `${shown.length} of ${list.length} variables` + (shown.length > 400 ? ", the first 400 shown" : "");
  }
  search.addEventListener("input", debounce(show));
  which.addEventListener("change", show);
  section.append(make("div", { class: "tools" }, search, which, count),
    make("p", { class: "soft" }, "Grey: what the type admits, in physical units. Coloured: what the optimiser found, over all places; pale: anything that the type can hold. A dashed frame: the type has no end."), plot);
  show();
}

// ---- why, saturation, statements, remarks ----------------------------------------------------------------------------

let whyOf = -1;
function fillWhy(section) {
  const list = data("variables").map((each, index) => [index, variableName(each), each]).filter(([, , each]) => !each.isHidden && each.versions.length)
    .sort((a, b) => a[1].localeCompare(b[1], "en"));
  const select = choice("variable", list.map(([index, name]) => [index, name]));
  const search = make("input", { type: "search", placeholder: "find a variable", "aria-label": "find a variable" });
  const answer = make("div", {});
  search.addEventListener("input", debounce(() => {
    const found = list.find(([, name]) => name.toLowerCase().startsWith(search.value.toLowerCase())) || list.find(([, name]) => name.toLowerCase().includes(search.value.toLowerCase()));
    if (found && search.value) show(found[0]);
  }));
  select.addEventListener("change", () => show(Number(select.select.value)));
  section.append(make("div", { class: "tools" }, search, select), answer);

  function show(index) {
    whyOf = index;
    select.select.value = index;
    const each = data("variables")[index];
    const versions = each.versions.slice(0, 100);
    fill(answer, make("h2", {}, variableName(each), " ", make("span", { class: "soft", style: "font-weight:400" }, `${each.kind} ${each.type}`), " ", lineLink(each.place)),
      make("p", {}, "Altogether: ", code(rangeText(each.found)), each.unit ? " " + each.unit : "", each.notTracked ? `. Never taken for constant: ${each.notTracked}` : "",
        each.keptBecause ? `. Its definitions stay: ${each.keptBecause}` : ""),
      ...versions.flatMap((number) => {
        const version = data("versions")[number];
        const text = version.definition >= 0 ? data("statements")[version.definition] : null;
        return [make("h3", {}, code(version.name), " ", chip(version.found[0] === "constant" ? "good" : version.found[0] === "range" ? "info" : "", rangeText(version.found)), " ",
          text ? code(text.text) : "", " ", lineLink(version.place), version.isReached ? "" : [" ", chip("removed", "never reached")]), explanation(number)];
      }), each.versions.length > versions.length ? make("p", { class: "soft" }, `and ${each.versions.length - versions.length} more versions`) : "");
  }
  section.show = show;
  const start = whyOf >= 0 ? whyOf : (list.find(([, , each]) => each.kind === "output") || list[0] || [-1])[0];
  if (start >= 0) show(start);
}

function showWhy(index) {
  whyOf = index;
  openView("why");
  byId("view-why").show?.(index);
}

function fillSaturation(section) {
  const answers = choice("answer", [["", "all"], ["may", "may"], ["always", "always"], ["never", "never"], ["notReached", "not reached"]]);
  const cell = (value) => chip(value, value === "notReached" ? "not reached" : value);
  section.append(make("p", { class: "soft" }, "Each assignment to a variable whose type saturates: whether the value is clipped there."), sortedTable({
    label: "saturations", hint: "filter by statement or variable", rows: data("saturations"), tools: [answers],
    accepts: (each) => { const wanted = answers.select.value; return !wanted || (wanted === "never" ? each.low === wanted && each.high === wanted : each.low === wanted || each.high === wanted); },
    columns: [
      { title: "line", value: (each) => lineOf(each.place), cell: (each) => lineLink(each.place, true) },
      { title: "variable", value: (each) => variableName(data("variables")[each.variable]), cell: (each) => variableLink(each.variable) },
      { title: "statement", value: (each) => data("statements")[each.statement]?.text ?? "", code: true },
      { title: "limits", value: (each) => limitsText(data("variables")[each.variable]).replace(/ saturates$/, "") },
      { title: "brings", value: (each) => rangeText(each.value), cell: (each) => make("span", { class: "whole" }, rangeText(each.value)) },
      { title: "at the lower limit", value: (each) => each.low, cell: (each) => cell(each.low) },
      { title: "at the upper limit", value: (each) => each.high, cell: (each) => cell(each.high) }
    ] }));
}

function fillStatements(section) {
  const which = choice("show", [["", "all"], ["removed", "removed"], ["kept", "kept"], ["unused", "kept though it looks unused"]]);
  section.append(make("p", { class: "soft" }, "Every statement that a pass removed and on what grounds, and what keeps those that stay."), sortedTable({
    label: "statements", hint: "filter by text, pass or reason", rows: data("fates"), tools: [which],
    accepts: (each) => ({ removed: each.isRemoved, kept: !each.isRemoved, unused: each.looksUnused })[which.select.value] ?? true,
    columns: [
      { title: "line", value: (each) => lineOf(data("statements")[each.statement].place), cell: (each) => lineLink(data("statements")[each.statement].place, true) },
      { title: "statement", value: (each) => data("statements")[each.statement].text, code: true },
      { title: "fate", value: (each) => each.isRemoved ? "removed" : each.looksUnused ? "stays, looks unused" : "stays",
        cell: (each) => each.isRemoved ? chip("removed") : chip(each.looksUnused ? "warn" : "good", each.looksUnused ? "stays, looks unused" : "stays") },
      { title: "pass", value: (each) => each.isRemoved ? data("snapshots")[each.snapshot].pass : "", cell: (each) => each.isRemoved ? passLink(each.snapshot) : "" },
      { title: "why", value: (each) => each.why, cell: (each) => prose(each.why) },
      { title: "see", value: (each) => lineOf(each.because), cell: (each) => lineLink(each.because) }
    ] }));
}

function fillRemarks(section) {
  const kind = choice("kind", [["", "all"], ["passed", "done"], ["missed", "not done"], ["analysis", "found out"]]);
  section.append(sortedTable({
    label: "remarks", hint: "filter the remarks", rows: data("remarks"), tools: [kind], accepts: (each) => !kind.select.value || each.kind === kind.select.value,
    columns: [
      { title: "line", value: (each) => lineOf(each.place), cell: (each) => lineLink(each.place, true) },
      { title: "kind", value: (each) => each.kind, cell: (each) => chip(each.kind, { passed: "done", missed: "not done", analysis: "found out" }[each.kind]) },
      { title: "remark", value: (each) => each.text, cell: (each) => prose(each.text) },
      { title: "pass", value: (each) => each.pass }
    ] }));
}

// ---- the C before and after ------------------------------------------------------------------------------------------

// Pairs of equal lines: lines that stand once on both sides anchor the comparison (patience), between them small gaps are
// compared line by line.
function equalPairs(a, b) {
  const pairs = [], gaps = [[0, a.length, 0, b.length]];
  while (gaps.length) {
    let [a0, a1, b0, b1] = gaps.pop();
    while (a0 < a1 && b0 < b1 && a[a0] === b[b0]) pairs.push([a0++, b0++]);
    while (a0 < a1 && b0 < b1 && a[a1 - 1] === b[b1 - 1]) pairs.push([--a1, --b1]);
    if (a0 >= a1 || b0 >= b1) continue;
    if ((a1 - a0) * (b1 - b0) <= 250000) {
      pairs.push(...commonLines(a, a0, a1, b, b0, b1));
      continue;
    }
    let i = a0, j = b0;
    for (const [x, y] of anchors(a, a0, a1, b, b0, b1)) {
      pairs.push([x, y]);
      gaps.push([i, x, j, y]);
      [i, j] = [x + 1, y + 1];
    }
    if (i > a0) gaps.push([i, a1, j, b1]);
  }
  return pairs.sort((x, y) => x[0] - y[0]);
}

function anchors(a, a0, a1, b, b0, b1) {
  const seen = new Map();
  const note = (text, side, at) => {
    const entry = seen.get(text) || seen.set(text, { a: -1, b: -1 }).get(text);
    entry[side] = entry[side] === -1 ? at : -2;
  };
  for (let i = a0; i < a1; ++i) note(a[i], "a", i);
  for (let j = b0; j < b1; ++j) note(b[j], "b", j);
  const unique = [...seen.values()].filter((each) => each.a >= 0 && each.b >= 0);
  const tops = [], before = new Map(); // longest row of anchors that rises on both sides
  for (const each of unique.sort((x, y) => x.a - y.a)) {
    let low = 0, high = tops.length;
    while (low < high) {
      const middle = (low + high) >> 1;
      if (tops[middle].b < each.b) low = middle + 1;
      else high = middle;
    }
    before.set(each, tops[low - 1]);
    tops[low] = each;
  }
  const row = [];
  for (let each = tops[tops.length - 1]; each; each = before.get(each)) row.push([each.a, each.b]);
  return row.reverse();
}

function commonLines(a, a0, a1, b, b0, b1) {
  const width = b1 - b0 + 1, table = new Uint16Array((a1 - a0 + 1) * width), pairs = [];
  for (let i = a1 - a0 - 1; i >= 0; --i)
    for (let j = width - 2; j >= 0; --j)
      table[i * width + j] = a[a0 + i] === b[b0 + j] ? table[(i + 1) * width + j + 1] + 1 : Math.max(table[(i + 1) * width + j], table[i * width + j + 1]);
  for (let i = 0, j = 0; i < a1 - a0 && j < width - 1;) {
    if (a[a0 + i] === b[b0 + j]) pairs.push([a0 + i++, b0 + j++]);
    else if (table[(i + 1) * width + j] >= table[i * width + j + 1]) ++i;
    else ++j;
  }
  return pairs;
}

function fillCode(section) {
  const before = data("code").before.replace(/\n$/, "").split("\n"), after = data("code").after.replace(/\n$/, "").split("\n");
  const rows = []; // [line before or -1, line after or -1]
  let i = 0, j = 0;
  for (const [x, y] of [...equalPairs(before, after), [before.length, after.length]]) {
    for (; i < x || j < y; ++i, ++j) rows.push([i < x ? i : -1, j < y ? j : -1, true]);
    if (x < before.length) rows.push([x, y, false]);
    [i, j] = [x + 1, y + 1];
  }
  const diff = make("div", { class: "diff" });
  const cell = (lines, index, kind) => [make("span", { class: "n" }, index < 0 ? "" : String(index + 1)), make("span", { class: index < 0 ? "" : kind }, index < 0 ? "" : lines[index])];
  const pair = ([x, y, isChanged]) => make("div", { class: "pair" }, cell(before, x, isChanged ? "out" : ""), cell(after, y, isChanged ? "in" : ""));
  for (let at = 0; at < rows.length;) {
    let end = at;
    while (end < rows.length && rows[end][2] === rows[at][2]) ++end;
    const stretch = rows.slice(at, end), from = at === 0 ? 0 : 3, to = end === rows.length ? stretch.length : stretch.length - 3;
    if (rows[at][2] || to - from < 6) diff.append(...stretch.map(pair));
    else {
      const folded = stretch.slice(from, to);
      const button = make("button", { type: "button", class: "skip", onclick: () => button.replaceWith(...folded.map(pair)) }, `… ${folded.length} equal lines`);
      diff.append(...stretch.slice(0, from).map(pair), button, ...stretch.slice(to).map(pair));
    }
    at = end;
  }
  section.append(make("p", { class: "soft" }, `The C without any pass (left, ${before.length} lines) and with all of them (right, ${after.length} lines).`), diff);
}

// ---- the page --------------------------------------------------------------------------------------------------------

const views = [["passes", "Passes", null], ["variables", "Variables", fillVariables], ["ranges", "Ranges", fillRanges], ["why", "Why", fillWhy],
  ["saturation", "Saturation", fillSaturation], ["statements", "Statements", fillStatements], ["remarks", "Remarks", fillRemarks], ["code", "C code", fillCode]];
const filled = new Set(["passes"]);
let shown = "passes";

function openView(name) {
  for (const [each, , fillView] of views) {
    const section = byId("view-" + each), isOpen = each === name;
    section.hidden = !isOpen;
    const tab = byId("tab-" + each);
    tab.setAttribute("aria-selected", isOpen);
    tab.tabIndex = isOpen ? 0 : -1;
    if (isOpen && shown !== name) byId("views").scrollTop = 0;
    if (!isOpen || filled.has(each)) continue;
    filled.add(each);
    fillView(section);
  }
  shown = name;
}

function showTabs() {
  byId("tabs").append(...views.map(([name, title]) => make("button", { type: "button", role: "tab", id: "tab-" + name, "aria-controls": "view-" + name, onclick: () => document.documentElement.dataset.ready && openView(name) }, title)));
  for (const [name] of views) byId("view-" + name).setAttribute("aria-labelledby", "tab-" + name);
  byId("tabs").addEventListener("keydown", (event) => {
    const step = { ArrowRight: 1, ArrowLeft: -1 }[event.key];
    if (!step) return;
    const at = views.findIndex(([name]) => byId("tab-" + name) === document.activeElement);
    const next = views[(at + step + views.length) % views.length][0];
    openView(next);
    byId("tab-" + next).focus();
  });
}

function listen() {
  document.addEventListener("click", (event) => {
    const target = event.target.closest("[data-line],[data-variable],[data-pass]");
    if (!target) return;
    if (target.dataset.line) chooseLine(Number(target.dataset.line));
    else if (target.dataset.variable) showWhy(Number(target.dataset.variable));
    else {
      openView("passes");
      choosePass(Number(target.dataset.pass), chosen.line);
      if (chosen.line) showLineInPictures(chosen.line);
    }
  });
  byId("source").addEventListener("keydown", (event) => {
    const step = { ArrowDown: 1, ArrowUp: -1 }[event.key];
    if (!step) return;
    event.preventDefault();
    const next = byId("line-" + ((chosen.line || 0) + step)) || byId("line-1");
    if (next) chooseLine(Number(next.dataset.line));
  });
  byId("timeline").addEventListener("keydown", (event) => {
    const step = { ArrowRight: 1, ArrowLeft: -1 }[event.key];
    if (!step) return;
    choosePass(Math.min(data("snapshots").length - 1, Math.max(0, view.pass + step)));
    byId("timeline").children[view.pass].focus();
  });
  byId("procedure").addEventListener("change", () => chooseProcedure(byId("procedure").value));
  byId("ssa").addEventListener("change", drawSsa);
  byId("zoom-in").addEventListener("click", () => zoomAll(1.25));
  byId("zoom-out").addEventListener("click", () => zoomAll(0.8));
  byId("zoom-fit").addEventListener("click", () => scenes().forEach(fit));
  byId("next-change").addEventListener("click", () => nextChange(1));
  byId("previous-change").addEventListener("click", () => nextChange(-1));
  listenToPicture("before");
  listenToPicture("after");
}

function start() {
  showTabs();
  const assumptions = data("about").assumptions;
  if (assumptions.length) {
    byId("assumptions").hidden = false;
    byId("assumptions").textContent = "For this run alone: " + assumptions.join("; ") + ".";
  }
  openView("passes");
  showTimeline();
  if (!data("pictures").isGraphvizThere)
    byId("timeline").before(make("p", { class: "notice", id: "no-graphviz" }, "Graphviz (the program dot) was not found when this page was written, so it has no pictures of the graphs. Everything else is here."));
  else if (data("pictures").leftOut)
    byId("timeline").before(make("p", { class: "notice", id: "left-out" }, `${data("pictures").leftOut} of ${data("pictures").procedures.length} pictures are left out, those with the fewest changes: the time for them was over.`));
  const snapshots = data("snapshots");
  const propagation = snapshots.findIndex((each) => each.pass.startsWith("propagate"));
  choosePass(propagation >= 0 ? propagation : snapshots.length - 1);
  byId("inspector").append(make("p", { class: "empty" }, "Choose a line or a node: what it became, which pass did it, and why, stands here."));
  requestAnimationFrame(() => setTimeout(() => { document.documentElement.dataset.firstPicture = String(Math.round(performance.now())); }));
}

// The rest of the data stands behind the script: only when it is there can everything be clicked.
function startRest() {
  showSource();
  listen();
  document.documentElement.dataset.ready = "yes";
  setTimeout(markSource, 50);
}

start();
document.addEventListener("DOMContentLoaded", startRest);
})();
