
"use strict";
// What the pages share. Texts of tickets and files are set as text, never as markup.
const common = (() => {
  const byId = (id) => document.getElementById(id);
  const data = JSON.parse(byId("data").textContent);
  const signs = { passed: "✓", failed: "✕", incomplete: "?", unjudged: "",
    drifting: "↗", steady: "=", unknown: "?" };

  // ---- Texts in the page's language: data.texts has them, from report/languages.

  // A text of digits with a decimal point, as the language writes it.
  function localised(digits) {
    const [, sign, whole, fraction] = /^(-?)(\d+)(?:\.(\d+))?$/.exec(digits) || [];
    if (whole === undefined) return digits; // 1e+21 and the like.
    const grouped = whole.length < 5 ? whole
      : whole.replace(/\B(?=(\d{3})+$)/g, data.texts["common.thousands"]);
    return sign + grouped + (fraction ? data.texts["common.decimal"] + fraction : "");
  }
  const fixed = (value, decimals) => (value === null || Number.isNaN(value) ? "–"
    : localised(value.toFixed(decimals).replace(/^-(0\.?0*)$/, "$1")));
  const signed = (value) => (value > 0 ? "+" : "") + fixed(value, 2);
  // Numbers are written as the language writes them. The one named "count" selects the form.
  function say(key, values = {}) {
    const text = data.texts[key];
    const one = values.count === 1 || (values.count === 0 && document.documentElement.lang === "fr");
    return (Array.isArray(text) ? text[one ? 0 : 1] : text).replace(/\{(\w+)\}/g, (whole, name) =>
      (typeof values[name] === "number" ? localised(String(values[name])) : values[name] ?? whole));
  }

  function make(tag, className, text) {
    const element = document.createElement(tag);
    if (className) element.className = className;
    if (text !== undefined) element.textContent = text;
    return element;
  }

  const badge = (key, word, kind = key) =>
    make("span", `badge ${kind}`, `${signs[key]} ${word}`.trim());

  // Target or beginning on the left, measured or latest on the right; each "#rrggbb", with "!"
  // behind it where a screen can't show the colour.
  function swatchPair(sides) {
    const pair = make("div", "pair");
    for (const [side, swatch] of sides) {
      const half = pair.appendChild(make("span", swatch.endsWith("!") ? "clipped" : ""));
      half.style.backgroundColor = swatch.slice(0, 7);
      half.title = half.className ? say("common.clipped", { side }) : side;
    }
    return pair;
  }

  const colourOf = (name) =>
    getComputedStyle(document.documentElement).getPropertyValue(name).trim();

  // What is above a limit is hatched, so that it stands out in grey too.
  function hatch(colour, strength = 1) {
    const tile = document.createElement("canvas");
    tile.width = tile.height = 8;
    const pen = tile.getContext("2d");
    pen.fillStyle = colour;
    pen.globalAlpha = 0.3 * strength;
    pen.fillRect(0, 0, 8, 8);
    pen.globalAlpha = strength;
    pen.strokeStyle = colour;
    pen.lineWidth = 2.4;
    pen.beginPath();
    for (const shift of [-8, 0, 8]) { pen.moveTo(shift, 8); pen.lineTo(shift + 8, 0); }
    pen.stroke();
    return pen.createPattern(tile, "repeat");
  }

  // Calls draw now, and again whenever the charts have to look different: on paper, where the page
  // is light and charts have sizes of their own, and when the user turns to dark or light.
  function drawAlways(draw) {
    const drawNow = () => {
      const printing = document.documentElement.classList.contains("printing");
      Chart.defaults.animation = false;
      Chart.defaults.devicePixelRatio = printing ? 3 : devicePixelRatio;
      Chart.defaults.maintainAspectRatio = false;
      Chart.defaults.plugins.legend.display = false;
      Chart.defaults.font.family = getComputedStyle(document.body).fontFamily;
      Chart.defaults.color = colourOf("--soft");
      Chart.defaults.borderColor = colourOf("--faint");
      draw();
    };
    const turnPrinting = (on) => {
      document.documentElement.classList.toggle("printing", on);
      drawNow();
    };
    drawNow();
    addEventListener("beforeprint", () => turnPrinting(true));
    addEventListener("afterprint", () => turnPrinting(false));
    matchMedia("(prefers-color-scheme: dark)").addEventListener("change", drawNow);
    return drawNow;
  }

  // Ticks of a chart's axis of numbers.
  const ticks = { callback: (value) => localised(String(+value.toFixed(10))) };

  return { data, byId, signs, say, localised, fixed, signed, make, badge, swatchPair, colourOf, hatch,
    ticks, drawAlways };
})();
