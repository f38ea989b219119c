
"use strict";
// Draws what the page can't have without a script: charts, and the table of patches that can be
// searched and sorted. Texts of tickets and files are set as text, never as markup.
(() => {
  const { data, byId, say, localised, fixed, signed, make, swatchPair, colourOf, hatch, ticks,
    drawAlways } = common;

  // Fields of a row.
  const [INDEX, ID, NAME, DEVICE, TARGET, MEASURED, DELTA, DIFFERENCE, TARGET_SWATCH,
    MEASURED_SWATCH, SHEET_ID, SHEET_NAME] = Array(12).keys();

  // ---- Patches

  const pageSize = 100;
  const allRows = data.rows.slice(0, data.shown); // Further ones are for charts alone.
  const patchText = (row) =>
    row[ID] === "" && row[NAME] === "" ? say("page.row", { row: row[INDEX] + 1 })
      : row[ID] || row[NAME];
  const plainDevice = (row) =>
    row[DEVICE].map((value) => (value === null ? "–" : String(+value.toFixed(2))));
  const device = (row) => plainDevice(row).map(localised);
  const lab = (values) => values.map((value) => fixed(value, 2)).join(" ");
  const natural = new Intl.Collator(document.documentElement.lang, { numeric: true });
  const byNumber = (get) => (a, b) => (get(a) ?? -Infinity) - (get(b) ?? -Infinity);
  const inks = data.channels.map((name) => name.replace(/^[A-Z0-9]+_(?=.)/, ""));
  const channels = inks.join(inks.some((name) => name.includes(" ")) ? ", " : " ");

  // A row has labels of the sheet only if they differ from those of the target.
  const sheetId = (row) => (row.length > SHEET_ID ? row[SHEET_ID] : row[ID]);
  const sheetName = (row) => (row.length > SHEET_ID ? row[SHEET_NAME] : row[NAME]);
  const isRelabelled = allRows.some((row) => row.length > SHEET_ID);
  const labelled = (title, id, name, text, hidden) => ({
    title, kind: "patch", hidden,
    order: (a, b) => natural.compare(text(a), text(b)) || a[INDEX] - b[INDEX],
    fill(cell, row) {
      cell.textContent = text(row);
      if (id(row) !== "" && name(row) !== "" && name(row) !== id(row)) {
        cell.append(" ", make("span", "name", name(row)));
      }
    } });

  // Title, class of the cells, order of rows (falling first where `falls`), cell.
  const columns = [
    labelled(say("page.onSheet"), sheetId, sheetName, (row) => sheetId(row) || sheetName(row) || "–",
      !isRelabelled),
    labelled(say(isRelabelled ? "page.inTarget" : "page.patch"), (row) => row[ID], (row) => row[NAME],
      patchText, false),
    { title: say("page.pair"), kind: "swatches", order: byNumber((row) => row[TARGET][0]),
      fill(cell, row) {
        cell.append(swatchPair([[say("page.target"), row[TARGET_SWATCH]],
          [say("page.measured"), row[MEASURED_SWATCH]]]));
      } },
    { title: channels, kind: "device", hidden: data.channels.length === 0,
      order: (a, b) => a[DEVICE].reduce((found, value, i) => found || value - b[DEVICE][i], 0),
      fill(cell, row) { cell.textContent = device(row).join(" "); } },
    { title: say("page.targetLab"), kind: "lab", order: byNumber((row) => row[TARGET][0]),
      fill(cell, row) { cell.textContent = lab(row[TARGET]); } },
    { title: say("page.measuredLab"), kind: "lab", order: byNumber((row) => row[MEASURED][0]),
      fill(cell, row) { cell.textContent = lab(row[MEASURED]); } },
    ...["ΔL*", "Δa*", "Δb*"].map((title, i) => ({
      title, kind: "number delta", falls: true, order: byNumber((row) => row[DELTA][i]),
      fill(cell, row) { cell.textContent = signed(row[DELTA][i]); } })),
    { title: data.unit, kind: "number difference", falls: true,
      order: byNumber((row) => row[DIFFERENCE]),
      fill(cell, row) { cell.textContent = fixed(row[DIFFERENCE], 2); } },
  ].filter((column) => !column.hidden);

  let sorted = columns[columns.length - 1]; // As the rows come: the worst first.
  let falling = true;
  let rows = allRows;
  let start = 0;

  function showHeadings() {
    const line = byId("patches").tHead.rows[0];
    line.replaceChildren(...columns.map((column) => {
      const heading = make("th", column.kind);
      heading.scope = "col";
      const sign = column !== sorted ? "" : falling ? " ▼" : " ▲";
      if (sign) heading.setAttribute("aria-sort", falling ? "descending" : "ascending");
      const button = heading.appendChild(make("button", "", column.title + sign));
      button.type = "button";
      const onPaper = heading.appendChild(make("span", "onPaper", column.title + sign));
      onPaper.setAttribute("aria-hidden", "true");
      button.addEventListener("click", () => {
        falling = column === sorted ? !falling : Boolean(column.falls);
        sorted = column;
        choose();
        byId("patches").tHead.rows[0].cells[columns.indexOf(column)].firstChild.focus();
      });
      return heading;
    }));
  }

  function choose() {
    const wanted = byId("find").value.trim().toLowerCase();
    rows = allRows.filter((row) => wanted === "" || row[ID].toLowerCase().includes(wanted) ||
      row[NAME].toLowerCase().includes(wanted) ||
      sheetId(row).toLowerCase().includes(wanted) ||
      sheetName(row).toLowerCase().includes(wanted) || device(row).join(" ") === wanted ||
      plainDevice(row).join(" ") === wanted ||
      patchText(row) === wanted);
    rows.sort((a, b) => (falling ? sorted.order(b, a) : sorted.order(a, b)));
    start = 0;
    showHeadings();
    showRows();
  }

  function showRows() {
    const end = Math.min(start + pageSize, rows.length);
    byId("patches").tBodies[0].replaceChildren(...rows.slice(start, end).map((row) => {
      const line = make("tr");
      for (const column of columns) {
        column.fill(line.appendChild(make("td", column.kind)), row);
      }
      return line;
    }));
    const range = rows.length === 0 ? say("page.noneFound")
      : say("page.range", { from: start + 1, to: end, all: rows.length });
    byId("range").textContent = range;
    byId("back").disabled = start === 0;
    byId("next").disabled = end === rows.length;
    byId("printed").textContent = end - start === data.all ? ""
      : say(rows.length < allRows.length ? "page.foundPart" : "page.part",
        { range, all: data.all });
  }

  function csvText() {
    // A spreadsheet would run a text that begins like a formula.
    const cell = (value) => {
      if (typeof value === "number") return String(value);
      if (value === null) return "";
      const safe = /^[=+\-@\t\r]/.test(value) ? `'${value}` : value;
      return /[",\r\n]/.test(safe) ? `"${safe.replaceAll("\"", "\"\"")}"` : safe;
    };
    const head = ["id", "name", ...data.channels, "target_L", "target_a", "target_b",
      "measured_L", "measured_a", "measured_b", "difference", "measured_id", "measured_name"];
    const lines = [...allRows].sort((a, b) => a[INDEX] - b[INDEX]).map((row) =>
      [row[ID], row[NAME], ...row[DEVICE], ...row[TARGET], ...row[MEASURED], row[DIFFERENCE],
        sheetId(row), sheetName(row)]);
    return [head, ...lines].map((line) => line.map(cell).join(",")).join("\r\n") + "\r\n";
  }

  function saveCsv() {
    const link = make("a");
    link.href = URL.createObjectURL(new Blob(["\ufeff", csvText()], { type: "text/csv" }));
    link.download = "patches.csv";
    link.click();
    setTimeout(() => URL.revokeObjectURL(link.href), 60000);
  }

  function showPatches() {
    byId("patches").classList.toggle("relabelled", isRelabelled);
    showHeadings();
    showRows();
    byId("worst").textContent = data.shownText;
    byId("worst").hidden = data.shownText === "";
    byId("find").addEventListener("input", choose);
    byId("back").addEventListener("click", () => { start -= pageSize; showRows(); });
    byId("next").addEventListener("click", () => { start += pageSize; showRows(); });
    byId("csv").addEventListener("click", saveCsv);
  }

  // ---- Charts

  const number = { type: "linear", ticks: { ...ticks, maxTicksLimit: 9 } };
  let charts = [];

  const markLines = {
    id: "markLines",
    afterDatasetsDraw(chart) {
      const { ctx: pen, scales: { x }, chartArea: area } = chart;
      pen.save();
      pen.font = `12px ${getComputedStyle(document.body).fontFamily}`;
      data.marks.forEach((mark, i) => {
        const at = x.getPixelForValue(mark.value);
        if (at < area.left || at > area.right) return;
        const y = area.top + 12 + 16 * i;
        pen.strokeStyle = pen.fillStyle = colourOf(mark.limit ? "--failed" : "--ink");
        pen.setLineDash(mark.limit ? [] : [4, 3]);
        pen.lineWidth = mark.limit ? 2 : 1;
        pen.beginPath();
        pen.moveTo(at, area.top);
        pen.lineTo(at, area.bottom);
        pen.stroke();
        const room = at + 6 + pen.measureText(mark.label).width < area.right;
        pen.textAlign = room ? "left" : "right";
        pen.lineWidth = 4;
        pen.setLineDash([]);
        pen.strokeStyle = colourOf("--card");
        pen.strokeText(mark.label, at + (room ? 6 : -6), y);
        pen.fillText(mark.label, at + (room ? 6 : -6), y);
      });
      pen.restore();
    },
  };

  // Bars at or above the first limit are hatched.
  function drawHistogram() {
    const limits = data.marks.filter((mark) => mark.limit).map((mark) => mark.value);
    const limit = limits.length ? Math.max(...limits) : Infinity;
    const plain = colourOf("--accent");
    const over = hatch(colourOf("--failed"));
    const last = data.histogram[data.histogram.length - 1];
    const width = last[1] - last[0];
    byId("histogram").setAttribute("aria-label",
      say("page.histogramText", { bins: data.histogramText }));
    const decimals = Math.max(0, Math.ceil(-Math.log10(width) - 1e-9));
    charts.push(new Chart(byId("histogram"), {
      type: "bar",
      data: { datasets: [{
        data: data.histogram.map(([from, to, count]) => ({ x: (from + to) / 2, y: count })),
        backgroundColor: data.histogram.map(([from]) => (from >= limit - 1e-9 ? over : plain)),
        barPercentage: 0.94, categoryPercentage: 1,
      }] },
      options: {
        plugins: { tooltip: { callbacks: {
          title: ([item]) => {
            const [from, to] = data.histogram[item.dataIndex];
            return say("page.bin", { from: fixed(from, decimals), to: fixed(to, decimals),
              unit: data.unit });
          },
          label: (item) => say("page.patches", { count: item.parsed.y }) } } },
        scales: {
          x: { ...number, offset: false, min: 0, max: last[1], grid: { display: false },
            title: { display: true, text: data.unit } },
          y: { ...number, beginAtZero: true, ticks: { ...ticks, precision: 0, maxTicksLimit: 6 },
            title: { display: true, text: say("page.patchesAxis") } },
        },
      },
      plugins: [markLines],
    }));
  }

  const drawnRows = data.drawn.map((i) => data.rows[i])
    .filter((row) => row[TARGET].every((v) => v !== null) && row[MEASURED].every((v) => v !== null));
  const tooltip = (rows) => ({
    displayColors: false,
    callbacks: { label: ({ dataIndex }) => {
      const row = rows[dataIndex];
      return [`${patchText(row)}${row[ID] && row[NAME] ? ` ${row[NAME]}` : ""}`,
        `${say("page.target")} ${lab(row[TARGET])}`, `${say("page.measured")} ${lab(row[MEASURED])}`,
        `${data.unit} ${fixed(row[DIFFERENCE], 2)}`];
    } },
  });

  // A line from each target to what was measured.
  const shifts = {
    id: "shifts",
    beforeDatasetsDraw(chart) {
      const { ctx: pen, scales: { x, y } } = chart;
      pen.save();
      pen.strokeStyle = colourOf("--soft");
      pen.lineWidth = 1;
      pen.beginPath();
      for (const row of drawnRows) {
        pen.moveTo(x.getPixelForValue(row[TARGET][1]), y.getPixelForValue(row[TARGET][2]));
        pen.lineTo(x.getPixelForValue(row[MEASURED][1]), y.getPixelForValue(row[MEASURED][2]));
      }
      pen.stroke();
      pen.restore();
    },
  };

  function drawPlane() {
    const many = drawnRows.length > 300;
    const point = (values) => ({ x: values[1], y: values[2] });
    const reach = drawnRows.reduce((most, row) => Math.max(most,
      ...[row[TARGET], row[MEASURED]].map(([, a, b]) => Math.max(Math.abs(a), Math.abs(b)))), 10);
    const edge = Math.ceil(reach / 10) * 10;
    const axis = (text) => ({ ...number, min: -edge, max: edge,
      title: { display: true, text },
      grid: { color: ({ tick }) => colourOf(tick && tick.value === 0 ? "--soft" : "--faint") } });
    charts.push(new Chart(byId("plane"), {
      type: "scatter",
      data: { datasets: [
        { label: say("page.measuredMark"), data: drawnRows.map((row) => point(row[MEASURED])),
          pointBackgroundColor: drawnRows.map((row) => row[MEASURED_SWATCH].slice(0, 7)),
          pointBorderColor: colourOf("--soft"), borderWidth: many ? 0.5 : 1,
          pointRadius: many ? 3 : 5 },
        { label: say("page.targetMark"), data: drawnRows.map((row) => point(row[TARGET])),
          pointBackgroundColor: "transparent", pointBorderColor: colourOf("--ink"),
          borderWidth: 1, pointRadius: many ? 2 : 6 },
      ] },
      options: { aspectRatio: 1,
        plugins: { legend: legend(), tooltip: tooltip(drawnRows) },
        scales: { x: axis(say("page.aAxis")), y: axis(say("page.bAxis")) } },
      plugins: [shifts],
    }));
  }

  const legend = () => ({ display: true, position: "bottom",
    labels: { usePointStyle: true, boxWidth: 6, boxHeight: 6, padding: 16, color: colourOf("--soft"),
      generateLabels: (chart) => Chart.defaults.plugins.legend.labels.generateLabels(chart)
        .map((label, i) => ({ ...label, strokeStyle: colourOf("--ink"), lineWidth: 1,
          fillStyle: i === 0 ? colourOf("--soft") : "transparent" })) } });

  function drawLightness() {
    charts.push(new Chart(byId("lightness"), {
      type: "scatter",
      data: { datasets: [{
        data: drawnRows.map((row) => ({ x: row[TARGET][0], y: row[DELTA][0] })),
        pointBackgroundColor: drawnRows.map((row) => row[MEASURED_SWATCH].slice(0, 7)),
        pointBorderColor: colourOf("--soft"), borderWidth: 0.5,
        pointRadius: drawnRows.length > 300 ? 3 : 5,
      }] },
      options: {
        plugins: { tooltip: tooltip(drawnRows) },
        scales: {
          x: { ...number, min: 0, suggestedMax: 100,
            title: { display: true, text: say("page.lightnessAxis") } },
          y: { ...number, suggestedMin: -2, suggestedMax: 2,
            title: { display: true, text: say("page.lightnessDifferenceAxis") },
            grid: { color: ({ tick }) => colourOf(tick && tick.value === 0 ? "--ink" : "--faint") } },
        },
      },
    }));
  }

  function drawCharts() {
    for (const chart of charts) chart.destroy();
    charts = [];
    drawHistogram();
    drawPlane();
    drawLightness();
    charts.push(...measures.draw());
    byId("drawn").textContent = data.drawnText;
  }

  showPatches();
  for (const section of document.querySelectorAll(".drawn")) section.hidden = false;
  measures.show(data.measures);
  byId("plane").setAttribute("aria-label", say("page.planeText"));
  byId("lightness").setAttribute("aria-label", say("page.lightnessText"));
  drawAlways(drawCharts);
})();
