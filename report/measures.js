"use strict";
// Tone values, greys, repeated readings and paper, of results that have them.
const measures = (() => {
  const { byId, say, fixed, signed, make, swatchPair, colourOf, ticks } = common;
  const [NOMINAL, MEASURED, AIM, TOLERANCE, ABOVE] = Array(5).keys(); // Fields of a tint.
  const [TONE, A, B, AIM_A, AIM_B] = Array(5).keys(); // Fields of a grey.
  let data = null;
  let canvases = {};

  function addFigure(name, text, wide) {
    const figure = byId("measureCharts").appendChild(make("figure", wide ? "wide" : ""));
    const caption = figure.appendChild(make("figcaption"));
    caption.append(make("b", "", name), text);
    const canvas = figure.appendChild(make("div", "plot")).appendChild(make("canvas"));
    canvas.setAttribute("role", "img");
    canvas.setAttribute("aria-label", `${name}: ${text}`);
    return canvas;
  }

  function showPapers() {
    const list = make("dl");
    for (const [label, text] of data.papers) list.append(make("dt", "", label), make("dd", "", text));
    list.append(make("dt", "", say("page.paperDifference")), make("dd", "", data.paperDifference));
    byId("papers").append(swatchPair(data.papers.map(([label, , swatch]) => [label, swatch])), list,
      make("p", "", data.aims));
  }

  function show(given) {
    data = given;
    byId("measures").hidden = !data;
    if (!data) return;
    showPapers();
    canvases.tones = data.tones.map(([title, text]) => addFigure(title, text));
    if (data.greys.length) {
      canvases.greys = addFigure(say("page.greys"), say("page.greysText"), true);
    }
    if (data.spreads.length) {
      canvases.spreads = addFigure(say("page.spreads"), say("page.spreadsText"), true);
    }
    byId("spreads").textContent = data.spreadsText;
  }

  const axis = (text, more) => ({ type: "linear", ticks: { ...ticks, maxTicksLimit: 9 },
    title: { display: true, text }, ...more });
  const zeroLine = { color: ({ tick }) => colourOf(tick && tick.value === 0 ? "--soft" : "--faint") };
  const legend = () => ({ display: true, position: "bottom",
    labels: { boxWidth: 26, boxHeight: 0, padding: 12, color: colourOf("--soft") } });

  // The tolerance of each tint as a bar around its aim.
  const tolerances = (points) => ({
    id: "tolerances",
    beforeDatasetsDraw(chart) {
      const { ctx: pen, scales: { x, y } } = chart;
      pen.save();
      pen.strokeStyle = colourOf("--soft");
      pen.lineWidth = 1.5;
      pen.beginPath();
      for (const point of points) {
        if (point[TOLERANCE] === null) continue;
        const at = x.getPixelForValue(point[NOMINAL]);
        for (const side of [-1, 1]) {
          const end = y.getPixelForValue(point[AIM] + side * point[TOLERANCE]);
          pen.moveTo(at, y.getPixelForValue(point[AIM]));
          pen.lineTo(at, end);
          pen.moveTo(at - 4, end);
          pen.lineTo(at + 4, end);
        }
      }
      pen.stroke();
      pen.restore();
    },
  });

  function drawTones(canvas, points) {
    const line = (field) => points.map((point) => ({ x: point[NOMINAL], y: point[field] }));
    const ends = points.flatMap((point) => [point[MEASURED], point[AIM] - point[TOLERANCE],
      point[AIM] + point[TOLERANCE]]);
    return new Chart(canvas, {
      type: "line",
      data: { datasets: [
        { label: say("page.measuredLine"), data: line(MEASURED), borderColor: colourOf("--accent"), borderWidth: 2,
          pointRadius: points.map((point) => (point[ABOVE] ? 6 : 3)),
          pointStyle: points.map((point) => (point[ABOVE] ? "crossRot" : "circle")),
          pointBorderWidth: points.map((point) => (point[ABOVE] ? 2.5 : 1)),
          pointBorderColor: points.map((point) => colourOf(point[ABOVE] ? "--failed" : "--accent")),
          pointBackgroundColor: colourOf("--accent"), pointHitRadius: 6 },
        { label: say("page.aimLine"), data: line(AIM), borderColor: colourOf("--ink"), borderDash: [6, 4],
          borderWidth: 1.5, pointRadius: 0 },
      ] },
      options: {
        plugins: { legend: legend(), tooltip: { displayColors: false, callbacks: {
          title: ([item]) => `${points[item.dataIndex][NOMINAL]} %`,
          label: ({ dataIndex }) => {
            const [nominal, measured, aim, tolerance] = points[dataIndex];
            return [say("page.toneTip",
              { value: fixed(nominal + measured, 2), aim: fixed(nominal + aim, 2) }),
            say("page.deviationTip", { deviation: signed(measured - aim) }),
            ...(tolerance === null ? []
              : [say("page.toleranceTip", { tolerance: fixed(tolerance, 2) })])];
          } } } },
        scales: {
          x: axis(say("page.tintAxis"), { min: 0, max: 100 }),
          y: axis(say("page.toneAxis"), { grid: zeroLine, suggestedMin: Math.min(0, ...ends),
            suggestedMax: 1.06 * Math.max(4, ...ends) }),
        },
      },
      plugins: [tolerances(points)],
    });
  }

  function drawGreys(canvas) {
    const set = (label, field, colour, dash, shape) => ({
      label, data: data.greys.map((grey) => ({ x: grey[TONE], y: grey[field] ?? NaN })),
      borderColor: colourOf(colour), borderDash: dash, borderWidth: dash.length ? 1.5 : 2,
      pointRadius: dash.length ? 0 : 4, pointStyle: shape, pointBackgroundColor: colourOf(colour) });
    return new Chart(canvas, {
      type: "line",
      data: { datasets: [
        set("a*", A, "--failed", [], "circle"), set(say("page.aimOf", { axis: "a*" }), AIM_A, "--failed", [6, 4], "circle"),
        set("b*", B, "--accent", [], "rect"), set(say("page.aimOf", { axis: "b*" }), AIM_B, "--accent", [2, 3], "rect"),
      ] },
      options: {
        plugins: { legend: legend(), tooltip: { displayColors: false, callbacks: {
          title: ([item]) => `${say("page.cyanAxis")} ${data.greys[item.dataIndex][TONE]}`,
          label: ({ dataset, parsed }) => `${dataset.label} ${signed(parsed.y)}` } } },
        scales: {
          x: axis(say("page.cyanAxis"), { min: 0, max: 100 }),
          y: axis(say("page.greyAxis"), { grid: zeroLine, suggestedMin: -2, suggestedMax: 2 }),
        },
      },
    });
  }

  function drawSpreads(canvas) {
    const set = (label, field, colour) => ({ label, backgroundColor: colourOf(colour), grouped: false,
      data: data.spreads.map((bar) => bar[field]), categoryPercentage: 0.9,
      barPercentage: field === 1 ? 0.5 : 1 });
    return new Chart(canvas, {
      type: "bar",
      data: { labels: data.spreads.map(([label]) => label),
        datasets: [set(say("page.averageBar"), 1, "--ink"), set(say("page.largestBar"), 2, "--accent")] },
      options: {
        plugins: { legend: { ...legend(), labels: { ...legend().labels, boxHeight: 8 } } },
        scales: { x: { ticks: { display: data.spreads.length <= 16, maxRotation: 60 },
          grid: { display: false } },
        y: { beginAtZero: true, ticks: { ...ticks, maxTicksLimit: 6 } } },
      },
    });
  }

  function draw() {
    if (!data) return [];
    const charts = data.tones.map(([, , points], i) => drawTones(canvases.tones[i], points));
    if (canvases.greys) charts.push(drawGreys(canvases.greys));
    if (canvases.spreads) charts.push(drawSpreads(canvases.spreads));
    return charts;
  }

  return { show, draw };
})();
