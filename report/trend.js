
"use strict";
// Shows the trend whose data stand in this page: one series at a time.
(() => {
  const { data, byId, signs, say, localised, fixed, signed, make, badge, swatchPair, colourOf, hatch,
    ticks, drawAlways } = common;
  const [DAY, VERDICT, TITLE, NEAREST, LINK] = Array(5).keys(); // Fields of a job.
  const words = { passed: say("trend.passed"), failed: say("trend.failed"),
    incomplete: say("trend.incomplete") };
  const pageSize = 100;
  let series = data.series[0];
  let charts = [];
  let drawNow = () => {};

  // ---- Times: days since 1970 on the room's own clock

  const months = Array.from({ length: 12 }, (_, i) => say(`trend.month.${i + 1}`));
  const two = (number) => String(number).padStart(2, "0");
  function partsOf(time) {
    const date = new Date(Math.round(time * 86400) * 1000);
    const month = months[date.getUTCMonth()];
    const day = String(date.getUTCDate());
    const year = String(date.getUTCFullYear());
    return { day: say("trend.dayMonth", { day, month }), month: say("trend.monthYear", { month, year }),
      date: say("trend.date", { day, month, year }),
      clock: `${two(date.getUTCHours())}:${two(date.getUTCMinutes())}` };
  }
  function timeText(day) {
    const parts = partsOf(day);
    return `${parts.date}, ${parts.clock}`;
  }
  // Ticks where a calendar has them: at hours, days, Mondays or firsts of months, six at the most.
  function ticksOf(from, to) {
    const most = 6;
    const span = to - from;
    const ticks = [];
    if (span / 28 > most) {
      const step = [1, 2, 3, 6, 12].find((months) => span / 30.4 / months <= most)
        || 12 * Math.ceil(span / 365.25 / most);
      const date = new Date(from * 86400000);
      for (let month = Math.ceil((12 * date.getUTCFullYear() + date.getUTCMonth()) / step) * step;;
        month += step) {
        const day = Date.UTC(Math.floor(month / 12), month % 12) / 86400000;
        if (day > to) return ticks;
        if (day >= from) ticks.push(day);
      }
    }
    const step = [1 / 24, 1 / 8, 1 / 4, 1 / 2, 1, 2, 7, 14, 28].find((days) => span / days <= most);
    const monday = step >= 7 ? 4 : 0; // The first Monday after 1 January 1970.
    for (let day = monday + Math.ceil((from - monday) / step) * step; day <= to; day += step) {
      ticks.push(day);
    }
    return ticks;
  }
  function tickText(day, span) {
    const parts = partsOf(day);
    if (span < 3) return `${parts.day} ${parts.clock}`;
    return span > 360 ? parts.month : parts.day;
  }

  // ---- The top of the page

  function showHead() {
    const told = series.movement !== "unknown";
    const state = told && series.failing ? "failing" : series.movement;
    document.title = `${series.word} – ${say("trend.documentTitle")}`;
    byId("title").textContent = series.name;
    byId("subtitle").textContent = `${say(
      series.incomplete ? "trend.subtitleIncomplete" : "trend.subtitle",
      { count: series.jobs.length, span: series.span, passed: series.passed, failed: series.failed,
        incomplete: series.incomplete })} · ${data.subtitle}`;
    byId("verdict").className = state;
    document.querySelector("#verdict .sign").textContent =
      series.movement === "steady" && series.failing ? signs.failed : signs[series.movement];
    byId("word").textContent = series.word;
    byId("sentence").textContent = series.sentence;
    byId("reasons").replaceChildren(...series.reasons.map((reason) => make("li", "", reason)));
  }

  function inkCard(ink) {
    const card = make("div", `ink ${ink.movement}${ink.above ? " above" : ""}`);
    card.append(make("h3", "", ink.name));
    if (ink.began) {
      card.append(swatchPair([[say("trend.aim", { lab: ink.aim }), ink.aimSwatch],
        [say("trend.firstMean", { count: series.beginning, lab: ink.began }), ink.beganSwatch],
        [say("trend.average", { lab: ink.now }), ink.nowSwatch]].filter(([, swatch]) => swatch)));
    }
    card.append(badge(ink.movement, ink.word));
    if (ink.value) {
      const value = card.appendChild(make("div", "value"));
      value.append(make("span", "label", say("trend.latest")), ink.value);
      if (ink.tolerance) {
        value.append(make("span", "unit", say("trend.ofTolerance", { tolerance: ink.tolerance })));
        const bar = card.appendChild(make("div", ink.above ? "failed" : ""))
          .appendChild(make("div", "bar"));
        bar.appendChild(make("i")).style.width = `${100 * ink.fill}%`;
      }
      if (ink.above) value.append(make("span", "unit", say("trend.aboveTolerance")));
    }
    if (ink.averageOff) {
      const off = card.appendChild(make("div", "off"));
      off.append(make("span", "label", say("trend.averageToAim")), make("b", "", ink.averageOff));
      if (ink.correction) off.append(make("span", "correction", ink.correction));
    }
    const sentence = ink.sentence;
    card.append(make("p", "", sentence.charAt(0).toUpperCase() + sentence.slice(1)));
    return card;
  }

  function seriesRow(one) {
    const row = make("tr");
    if (one === series) row.setAttribute("aria-current", "true");
    const state = make("td");
    state.append(badge(one.movement,
      { drifting: say("trend.drifting"), steady: say("trend.steady") }[one.movement] || one.word));
    const name = make("td");
    name.append(make("button", "", one.name));
    name.firstChild.type = "button";
    const jobs = make("td", "number", localised(String(one.jobs.length)));
    const failed = make("td", "number", localised(String(one.failed)));
    jobs.dataset.after = say("trend.jobsAfter");
    failed.dataset.after = say("trend.failedAfter");
    row.append(state, name, jobs, failed);
    row.addEventListener("click", () => { choose(one); scrollTo(0, 0); });
    return row;
  }

  // ---- Charts

  const xs = () => series.jobs.map((job) => job[DAY]);
  const points = (values) => {
    const days = xs();
    return values.map((y, i) => ({ x: days[i], y: y === null ? NaN : y }));
  };

  function timeScale() {
    const days = xs();
    const span = days[days.length - 1] - days[0];
    const edge = Math.max(span * 0.015, 0.02);
    return { type: "linear", min: days[0] - edge, max: days[days.length - 1] + edge,
      grid: { display: false },
      afterBuildTicks: (axis) => {
        axis.ticks = ticksOf(axis.min, axis.max).map((value) => ({ value }));
      },
      ticks: { maxRotation: 0, autoSkip: true, callback: (day) => tickText(day, span) } };
  }

  // A figure with its caption in two parts; what the chart shows is told in words too.
  function addFigure(parent, name, text) {
    const figure = parent.appendChild(make("figure"));
    const caption = figure.appendChild(make("figcaption"));
    caption.append(make("b", "", name), make("span", "", text));
    const canvas = figure.appendChild(make("div", "plot trend")).appendChild(make("canvas"));
    canvas.setAttribute("role", "img");
    canvas.setAttribute("aria-label", `${name}: ${text}`);
    return canvas;
  }

  // The tolerance as a line in steps, on ground that is hatched above it.
  const toleranceLine = (criterion) => ({
    id: "tolerance",
    beforeDatasetsDraw(chart) {
      const { ctx: pen, scales: { x, y }, chartArea: area } = chart;
      const days = xs();
      const ground = hatch(colourOf("--failed"), 0.28);
      pen.save();
      pen.font = `12px ${Chart.defaults.font.family}`;
      criterion.tolerances.forEach(([job, tolerance], i) => {
        if (tolerance === null) return;
        const next = criterion.tolerances[i + 1];
        const left = i === 0 ? area.left : x.getPixelForValue(days[job]);
        const right = next ? x.getPixelForValue(days[next[0]]) : area.right;
        const at = y.getPixelForValue(tolerance);
        pen.fillStyle = ground;
        pen.fillRect(left, area.top, right - left, at - area.top);
        pen.strokeStyle = pen.fillStyle = colourOf("--ink");
        pen.lineWidth = 2;
        pen.beginPath();
        pen.moveTo(left, at);
        pen.lineTo(right, at);
        pen.stroke();
        if (next) return;
        pen.lineWidth = 4;
        pen.strokeStyle = colourOf("--card");
        const text = say("trend.toleranceMark", { tolerance: criterion.tolerance });
        pen.strokeText(text, left + 6, at - 5);
        pen.fillText(text, left + 6, at - 5);
      });
      pen.restore();
    },
  });

  const tooltip = (lines) => ({
    displayColors: false,
    callbacks: {
      title: ([item]) => `${timeText(series.jobs[item.dataIndex][DAY])}\n${
        series.jobs[item.dataIndex][TITLE].slice(0, 60)}`,
      label: (item) => lines(item.dataIndex),
    },
  });

  // Small marks of very many points, which as points of a chart would take their time.
  const crowd = 300;
  const dots = (lists) => ({
    id: "dots",
    afterDatasetsDraw(chart) {
      const { ctx: pen, scales: { x, y } } = chart;
      pen.save();
      for (const { points: all, colour, size } of lists) {
        pen.fillStyle = colour;
        for (const point of all) {
          if (Number.isNaN(point.y)) continue;
          pen.fillRect(x.getPixelForValue(point.x) - size / 2,
            y.getPixelForValue(point.y) - size / 2, size, size);
        }
      }
      pen.restore();
    },
  });

  function criterionText(criterion) {
    if (criterion.answered === 0) return say("trend.noData");
    const { latest, unit, tolerance, failed, answered } = criterion;
    return tolerance ? say("trend.criterionText", { latest, unit, tolerance, failed, answered })
      : say("trend.criterionWithoutLimit", { latest, unit });
  }

  function drawCriterion(parent, criterion) {
    const canvas = addFigure(parent, criterion.title, criterionText(criterion));
    const all = points(criterion.values);
    const only = (wanted) => all.map((point, i) =>
      ((criterion.outcomes[i] === "f") === wanted ? point : { x: point.x, y: NaN }));
    const limits = criterion.tolerances.map(([, tolerance]) => tolerance || 0);
    const many = all.length > crowd;
    const passed = { data: only(false), showLine: false, pointRadius: 3,
      pointBackgroundColor: colourOf("--passed"), pointBorderWidth: 0 };
    const marks = { points: passed.data, colour: colourOf("--passed"), size: 2.5 };
    charts.push(new Chart(canvas, {
      type: "line",
      data: { datasets: [
        { data: only(true), showLine: false, pointStyle: "crossRot", pointRadius: many ? 4 : 5.5,
          pointBorderColor: colourOf("--failed"), pointBorderWidth: many ? 1.5 : 2.5 },
        { data: all, showLine: !many, borderColor: colourOf("--soft"), borderWidth: 1,
          pointRadius: 0, pointHitRadius: many ? 6 : 0 },
        ...(many ? [] : [passed]),
      ] },
      options: {
        parsing: false, normalized: true, spanGaps: true,
        plugins: { tooltip: tooltip((i) => `${fixed(criterion.values[i], criterion.decimals)} ${
          criterion.unit}, ${words[series.jobs[i][VERDICT]]}`) },
        // A tone value has no limit, and a scale from 0 would show nothing of its changes.
        scales: { x: timeScale(), y: criterion.unit === "%"
          ? { type: "linear", grace: "20%", ticks: { ...ticks, maxTicksLimit: 6 } }
          : { type: "linear", min: 0, suggestedMax: 1.25 * Math.max(...limits, 0.1),
            ticks: { ...ticks, maxTicksLimit: 6 } } },
      },
      plugins: [toleranceLine(criterion), ...(many ? [dots([marks])] : [])],
    }));
  }

  const axes = [
    { name: "L*", change: "changeL", average: "averageL", colour: "--ink", dash: [], width: 2.5 },
    { name: "a*", change: "changeA", average: "averageA", colour: "--failed", dash: [7, 4], width: 2 },
    { name: "b*", change: "changeB", average: "averageB", colour: "--accent", dash: [2, 3], width: 2 },
  ];

  // The beginning as shaded ground, and the name of each line at its end, moved apart where two
  // would meet.
  const beginAndNames = {
    id: "beginAndNames",
    beforeDatasetsDraw(chart) {
      const { ctx: pen, scales: { x }, chartArea: area } = chart;
      const days = xs();
      const end = x.getPixelForValue(days[Math.max(series.beginning - 1, 0)]);
      pen.save();
      pen.fillStyle = colourOf("--faint");
      pen.fillRect(area.left, area.top, Math.max(end - area.left, 2), area.bottom - area.top);
      pen.restore();
    },
    afterDatasetsDraw(chart) {
      const { ctx: pen, scales: { y }, chartArea: area } = chart;
      const ends = axes.map((axis, i) => {
        const values = chart.data.datasets[i].data;
        return { axis, at: y.getPixelForValue(values[values.length - 1].y) };
      }).sort((a, b) => a.at - b.at);
      for (let i = 1; i < 3; ++i) ends[i].at = Math.max(ends[i].at, ends[i - 1].at + 14);
      pen.save();
      pen.font = `bold 12px ${Chart.defaults.font.family}`;
      pen.textBaseline = "middle";
      for (const { axis, at } of ends) {
        pen.fillStyle = colourOf(axis.colour);
        pen.fillText(axis.name, area.right + 6, at);
      }
      pen.restore();
    },
  };

  // One scale for all, so that the one that moves stands out.
  function driftRange() {
    let range = 1;
    for (const ink of series.inks) {
      for (const axis of axes) {
        for (const value of [...ink[axis.change], ...ink[axis.average]]) {
          range = Math.max(range, Math.abs(value ?? 0));
        }
      }
    }
    return [1, 2, 3, 4, 5, 6, 8, 10, 15, 20, 30, 50].find((round) => round >= range) || range;
  }

  function drawInk(ink, range) {
    const canvas = addFigure(byId("drift"), ink.name,
      !ink.now ? ink.word
        : say(ink.aim ? "trend.inkTextWithAim" : "trend.inkText",
          { word: ink.word, began: ink.began, now: ink.now, aim: ink.aim }));
    const many = ink.changeL.length > crowd;
    const measured = axes.map((axis, i) => ({
      data: points(ink[axis.change]), showLine: false, pointRadius: 1.8, pointBorderWidth: 0,
      pointStyle: ["circle", "rect", "triangle"][i],
      pointBackgroundColor: `${colourOf(axis.colour)}66` }));
    const marks = measured.map((set) =>
      ({ points: set.data, colour: set.pointBackgroundColor, size: 1.4 }));
    charts.push(new Chart(canvas, {
      type: "line",
      data: { datasets: [...axes.map((axis) => ({
        data: points(ink[axis.average]), borderColor: colourOf(axis.colour), borderDash: axis.dash,
        borderWidth: axis.width, pointRadius: 0, pointHitRadius: 6 })), ...(many ? [] : measured)] },
      options: {
        parsing: false, normalized: true, spanGaps: true,
        layout: { padding: { right: 26 } },
        plugins: { tooltip: tooltip((i) => axes.map((axis) =>
          `${axis.name} ${signed(ink[axis.change][i])}`).join("  ")) },
        scales: { x: timeScale(), y: { type: "linear", min: -range, max: range,
          ticks: { ...ticks, maxTicksLimit: 7 },
          grid: { color: ({ tick }) => colourOf(tick && tick.value === 0 ? "--ink" : "--faint") } } },
      },
      plugins: [beginAndNames, ...(many ? [dots(marks)] : [])],
    }));
  }

  function drawCharts() {
    for (const chart of charts) chart.destroy();
    charts = [];
    for (const id of ["criteria", "others", "drift"]) byId(id).replaceChildren();
    const used = series.criteria.filter((criterion) => criterion.used || criterion.followed);
    const others = series.criteria.filter((criterion) => !criterion.used && !criterion.followed);
    for (const criterion of used) drawCriterion(byId("criteria"), criterion);
    byId("more").hidden = others.length === 0;
    byId("more").firstElementChild.textContent = say("trend.more", { count: others.length });
    // Those that nobody has unfolded cost nothing.
    if (byId("more").open) for (const criterion of others) drawCriterion(byId("others"), criterion);
    const range = driftRange();
    const known = series.inks.filter((ink) => ink.began);
    for (const ink of known) drawInk(ink, range);
    byId("driftNote").textContent = known.length === 0 ? say("trend.noColours")
      : say("trend.driftNote", { count: series.beginning });
  }

  // ---- Jobs

  let jobs = [];
  let start = 0;

  function jobRow(job) {
    const row = make("tr", job[VERDICT]);
    const verdict = make("td");
    verdict.append(badge(job[VERDICT], words[job[VERDICT]]));
    const title = make("td");
    if (job[LINK]) {
      title.append(make("a", "", job[TITLE]));
      title.firstChild.href = job[LINK];
    } else {
      title.textContent = job[TITLE];
    }
    row.append(verdict, make("td", "", timeText(job[DAY])), title, make("td", "", job[NEAREST]));
    return row;
  }

  function showJobs() {
    const end = Math.min(start + pageSize, jobs.length);
    byId("jobs").tBodies[0].replaceChildren(...jobs.slice(start, end).map(jobRow));
    byId("range").textContent =
      jobs.length === 0 ? say("trend.noneFound")
        : say("trend.range", { from: start + 1, to: end, all: jobs.length });
    byId("back").disabled = start === 0;
    byId("next").disabled = end === jobs.length;
  }

  function find() {
    const wanted = byId("find").value.trim().toLowerCase();
    jobs = series.jobs.filter((job) => wanted === "" || words[job[VERDICT]].toLowerCase().includes(wanted)
      || job[TITLE].toLowerCase().includes(wanted) || job[NEAREST].toLowerCase().includes(wanted))
      .reverse(); // The latest first.
    start = 0;
    showJobs();
  }

  // ---- All of it

  function show() {
    showHead();
    byId("inks").replaceChildren(...series.inks.map(inkCard));
    byId("series").tBodies[0].replaceChildren(...data.series.map(seriesRow));
    find();
  }

  function choose(one) {
    series = one;
    show();
    drawNow();
  }

  for (const note of data.notes) byId("warnings").append(make("p", "", note));
  byId("warnings").hidden = data.notes.length === 0;
  byId("overview").hidden = data.series.length === 1;
  byId("find").addEventListener("input", find);
  byId("back").addEventListener("click", () => { start -= pageSize; showJobs(); });
  byId("next").addEventListener("click", () => { start += pageSize; showJobs(); });
  byId("more").addEventListener("toggle", () => drawNow());
  document.querySelector("main").hidden = false;
  show();
  drawNow = drawAlways(drawCharts);
})();
