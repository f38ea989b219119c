
"use strict";
// Lists the reports whose summaries stand in this page. Texts are set as text, never as markup.
(() => {
  const data = JSON.parse(document.getElementById("data").textContent);
  const { byId, make, badge } = common;

  function line(report) {
    const row = make("tr", report.verdict);
    const verdict = make("td");
    verdict.append(badge(report.verdict, report.word));
    const link = make("a", "", report.title);
    link.href = report.link;
    const text = make("td");
    text.append(link, make("div", "name", report.subtitle), make("div", "", report.sentence));
    row.append(verdict, text);
    return row;
  }

  const count = data.reports.length;
  byId("subtitle").textContent = count === 0
    ? `No reports were found in ${data.folder}. A report is made for each job that is verified.`
    : `${count} ${count === 1 ? "report" : "reports"} in ${data.folder}, the latest first`;
  byId("reports").tBodies[0].append(...data.reports.map(line));
  document.querySelector("main").hidden = count === 0;
})();
