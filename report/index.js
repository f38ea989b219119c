
"use strict";
// Lists the reports whose summaries stand in this page. Texts are set as text, never as markup.
(() => {
  const { data, byId, say, make, badge } = common;

  function line(report) {
    const row = make("tr", report.verdict);
    const verdict = make("td");
    verdict.append(badge(report.verdict, report.word));
    const link = make("a", "", report.title);
    link.href = report.link;
    const text = make("td");
    text.lang = report.language;
    text.append(link, make("div", "name", report.subtitle), make("div", "", report.sentence));
    row.append(verdict, text);
    return row;
  }

  const count = data.reports.length;
  byId("subtitle").textContent = count === 0
    ? say("index.none", { folder: data.folder })
    : say("index.found", { count, folder: data.folder });
  byId("reports").tBodies[0].append(...data.reports.map(line));
  document.querySelector("main").hidden = count === 0;
})();
