"use strict";
// The table is complete without this; it adds sorting and filters.
(() => {
    const table = document.getElementById("plugins");
    const body = table.tBodies[0];
    const rows = Array.from(body.rows);
    const filters = document.getElementById("filters");
    const search = document.getElementById("search");
    const selects = Array.from(filters.querySelectorAll("select"));
    const order = new Intl.Collator(undefined, { numeric: true, sensitivity: "base" });
    const texts = new Map(rows.map(row => [row, row.textContent.toLowerCase()]));

    const filter = () => {
        const words = search.value.toLowerCase().split(/\s+/);
        let shown = 0;
        for (const row of rows) {
            row.hidden = !words.every(word => texts.get(row).includes(word)) ||
                selects.some(select => select.value && row.dataset[select.dataset.key] !== select.value);
            shown += row.hidden ? 0 : 1;
        }
        document.getElementById("shown").textContent = `${shown} of ${rows.length} shown`;
    };

    const valueIn = (row, column) => row.cells[column].dataset.sort ?? row.cells[column].textContent;
    const sort = header => {
        const isDescending = header.getAttribute("aria-sort") === "ascending";
        for (const other of header.parentNode.cells)
            other.removeAttribute("aria-sort");
        header.setAttribute("aria-sort", isDescending ? "descending" : "ascending");
        rows.sort((a, b) => order.compare(valueIn(a, header.cellIndex), valueIn(b, header.cellIndex)) * (isDescending ? -1 : 1));
        body.append(...rows);
    };

    for (const header of table.tHead.rows[0].cells) {
        const button = document.createElement("button");
        button.type = "button";
        button.append(...header.childNodes);
        header.append(button);
        button.addEventListener("click", () => sort(header));
    }
    for (const select of selects)
        for (const value of [...new Set(rows.map(row => row.dataset[select.dataset.key]))].sort(order.compare))
            select.add(new Option(value, value));
    filters.addEventListener("input", filter);
    filters.addEventListener("submit", event => event.preventDefault());
    filters.hidden = false;
    filter();
})();
