
"use strict";
// Lists the reports whose summaries stand in this page. Texts are set as text, never as markup.
(() => {
  const data = JSON.parse(document.getElementById("data").textContent);
  const signs = { passed: "✓", failed: "✕", incomplete: "?" };

  function make(tag, className, text) {
    const element = document.createElement(tag);
    if (className) element.className = className;
    if (text !== undefined) element.textContent = text;
    return element;
  }

  function line(report) {
    const row = make("tr", report.verdict);
    const badge = make("td");
    badge.append(make("span", `badge ${report.verdict}`,
      `${signs[report.verdict]} ${report.word}`));
    const link = make("a", "", report.title);
    link.href = report.link;
    const text = make("td");
    text.append(link, make("div", "name", report.subtitle), make("div", "", report.sentence));
    row.append(badge, text);
    return row;
  }

  const count = data.reports.length;
  document.getElementById("subtitle").textContent = count === 0
    ? `No reports were found in ${data.folder}. A report is made for each job that is verified.`
    : `${count} ${count === 1 ? "report" : "reports"} in ${data.folder}, the latest first`;
  document.getElementById("reports").tBodies[0].append(...data.reports.map(line));
  document.querySelector("main").hidden = count === 0;
})();
