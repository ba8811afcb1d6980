// The page: filters, keyboard, and what is told.

const byId = id => document.getElementById(id);
const numberText = new Intl.NumberFormat();

class Page {
    constructor(data) {
        this.rows = new Rows(data);
        this.filters = filtersOf(location.hash.slice(1));
        this.player = new Player(this.rows, {
            changed: index => { this.table.refresh(index); this.showPlayer(); },
            moved: (index, played) => { this.table.drawPosition(index, played); this.showPosition(); },
            tell: text => this.tell(text),
        });
        this.table = new Table(this.rows, {
            play: index => this.player.toggle(index),
            seek: (index, position) => this.player.start(index, position),
            stateOf: (index, row) => this.player.stateOf(index, row),
        });
        this.fillChoices();
        this.showFilters();
        this.listen();
        readColors();
        this.table.layOut();
        this.apply();
        // The texts for the first search are made while nobody waits.
        (window.requestIdleCallback || setTimeout)(() => this.rows.searchTexts());
    }

    tell(text) {
        byId("live").textContent = text;
    }

    fillChoices() {
        const add = (select, value, text) => {
            const option = document.createElement("option");
            option.value = value;
            option.textContent = text;
            select.append(option);
        };
        add(byId("key"), "-1", "Any");
        for (let key = 0; key < 24; ++key)
            add(byId("key"), String(key), keyLabel(key));
        for (const name of ["category", "kind", "format"]) {
            const select = byId(name);
            add(select, "", "Any");
            const values = this.rows.values(name);
            for (const [text, count] of values)
                add(select, text, `${name === "kind" ? text[0].toUpperCase() + text.slice(1) : text} (${numberText.format(count)})`);
            select.disabled = values.length === 0;
        }
        add(byId("sorting"), "", "As found");
        for (const head of document.querySelectorAll("[data-sort]")) {
            const label = head.textContent.trim();
            add(byId("sorting"), head.dataset.sort, label);
            add(byId("sorting"), `-${head.dataset.sort}`, `${label}, descending`);
        }
    }

    /** Puts the filters into their fields. */
    showFilters() {
        const filters = this.filters;
        byId("text").value = filters.text;
        byId("tempoFrom").value = filters.from ?? "";
        byId("tempoTo").value = filters.to ?? "";
        byId("key").value = String(filters.key);
        byId("related").checked = filters.related;
        for (const name of ["category", "kind", "format"]) {
            byId(name).value = filters[name];
            if (byId(name).value !== filters[name]) // not a value of this page
                byId(name).value = filters[name] = "";
        }
    }

    /** Takes the filters from their fields. */
    readFilters() {
        const number = id => byId(id).value === "" || !Number.isFinite(byId(id).valueAsNumber) ? null : byId(id).valueAsNumber;
        Object.assign(this.filters, {
            text: byId("text").value.trim(), from: number("tempoFrom"), to: number("tempoTo"), key: Number(byId("key").value),
            related: byId("related").checked, category: byId("category").value, kind: byId("kind").value, format: byId("format").value,
        });
        this.apply();
    }

    apply() {
        const filters = this.filters, hits = this.rows.matching(filters), all = this.rows.length;
        this.table.show(hits);
        const fragment = fragmentOf(filters);
        if (fragment !== location.hash.slice(1))
            history.replaceState(null, "", fragment ? `#${fragment}` : location.pathname + location.search);
        const count = hits.length === all ? numberText.format(all) : `${numberText.format(hits.length)} of ${numberText.format(all)}`;
        byId("hits").textContent = `${count} ${all === 1 ? "sound" : "sounds"}`;
        clearTimeout(this.telling);
        if (this.isShown)
            this.telling = setTimeout(() => this.tell(byId("hits").textContent), 400);
        this.isShown = true;
        byId("empty").hidden = hits.length > 0;
        byId("empty").querySelector("p").textContent = all > 0 ? "No sound matches these filters." : "There are no sounds on this page.";
        byId("empty").querySelector("button").hidden = all === 0;
        this.showSet();
    }

    /** Shows which filters are set, and the order. */
    showSet() {
        const filters = this.filters;
        const set = {tempoFrom: filters.from !== null, tempoTo: filters.to !== null, key: filters.key >= 0,
            category: filters.category !== "", kind: filters.kind !== "", format: filters.format !== ""};
        for (const [id, isSet] of Object.entries(set))
            byId(id).classList.toggle("set", isSet);
        const count = Object.values(set).filter(Boolean).length + (filters.related ? 1 : 0);
        byId("clear").hidden = count === 0 && filters.text === "";
        byId("more").textContent = count > 0 ? `Filters (${count})` : "Filters";
        byId("sorting").value = (filters.descending ? "-" : "") + filters.sort;
        for (const head of document.querySelectorAll("[data-sort]")) {
            if (head.dataset.sort === filters.sort)
                head.setAttribute("aria-sort", filters.descending ? "descending" : "ascending");
            else
                head.setAttribute("aria-sort", "none");
        }
    }

    clear() {
        this.filters = Object.assign(emptyFilters(), {sort: this.filters.sort, descending: this.filters.descending});
        this.showFilters();
        this.apply();
        byId("text").focus();
    }

    /** Up, down, and as it was found. */
    sortBy(column) {
        const {sort, descending} = this.filters;
        if (sort !== column)
            this.setOrder(column, false);
        else
            this.setOrder(descending ? "" : column, !descending);
    }

    setOrder(column, descending) {
        this.filters.sort = column;
        this.filters.descending = column !== "" && descending;
        this.apply();
        this.table.grid.scrollTop = 0;
    }

    listen() {
        byId("filters").addEventListener("submit", event => event.preventDefault());
        byId("filters").addEventListener("reset", event => { event.preventDefault(); this.clear(); });
        byId("empty").querySelector("button").addEventListener("click", () => this.clear());
        for (const id of ["text", "tempoFrom", "tempoTo", "key", "related", "category", "kind", "format"])
            byId(id).addEventListener("input", () => this.readFilters());
        byId("sorting").addEventListener("input", () => {
            const value = byId("sorting").value;
            this.setOrder(value.replace(/^-/, ""), value.startsWith("-"));
        });
        for (const head of document.querySelectorAll("[data-sort]"))
            head.querySelector("button").addEventListener("click", () => this.sortBy(head.dataset.sort));
        byId("more").addEventListener("click", () => {
            const isOpen = byId("filters").classList.toggle("open");
            byId("more").setAttribute("aria-expanded", String(isOpen));
        });
        byId("text").addEventListener("keydown", event => {
            if (event.key === "ArrowDown") {
                event.preventDefault();
                this.table.grid.focus();
            }
        });
        this.table.grid.addEventListener("keydown", event => this.pressed(event));
        document.addEventListener("keydown", event => this.pressedAnywhere(event));
        byId("toggle").addEventListener("click", () => this.player.toggle(this.player.index));
        byId("repeat").addEventListener("click", () => {
            const repeats = byId("repeat").getAttribute("aria-pressed") !== "true";
            byId("repeat").setAttribute("aria-pressed", String(repeats));
            byId("audio").loop = repeats;
        });
        byId("position").addEventListener("pointerdown", event => {
            const box = byId("position").getBoundingClientRect();
            this.player.seek(Math.max(0, Math.min(1, (event.clientX - box.left) / box.width)));
        });
        byId("position").addEventListener("keydown", event => this.pressedOnPosition(event));
        window.addEventListener("hashchange", () => {
            this.filters = filtersOf(location.hash.slice(1));
            this.showFilters();
            this.apply();
        });
        for (const query of ["(prefers-color-scheme: dark)", "print"])
            matchMedia(query).addEventListener("change", () => this.recolor());
        window.addEventListener("beforeprint", () => { readColors(); this.table.setPrinting(true); });
        window.addEventListener("afterprint", () => { readColors(); this.table.setPrinting(false); });
        new ResizeObserver(() => this.showPosition()).observe(byId("position"));
    }

    recolor() {
        readColors();
        this.table.refresh();
        this.showPosition();
    }

    pressed(event) {
        if (event.target !== this.table.grid || event.ctrlKey || event.metaKey || event.altKey)
            return;
        const table = this.table, page = table.rowsOfPage(), last = table.hits.length - 1;
        const moves = {ArrowDown: table.active + 1, ArrowUp: table.active - 1, PageDown: table.active + page,
            PageUp: table.active - page, Home: 0, End: last};
        if (event.key in moves && last >= 0) {
            const before = table.active;
            table.activate(moves[event.key]);
            if (table.active !== before && this.player.isPlaying)
                this.player.start(table.activeIndex(), 0);
        } else if ((event.key === " " || event.key === "Enter") && last >= 0) {
            this.player.toggle(table.activeIndex());
        } else if (event.key === "ArrowLeft" || event.key === "ArrowRight") {
            this.player.step((event.key === "ArrowLeft" ? -1 : 1) * this.stepSeconds());
        } else {
            return;
        }
        event.preventDefault();
    }

    stepSeconds() {
        return Math.min(5, Math.max(0.1, this.player.duration() / 20));
    }

    pressedOnPosition(event) {
        const steps = {ArrowLeft: -1, ArrowDown: -1, ArrowRight: 1, ArrowUp: 1};
        if (event.key in steps)
            this.player.step(steps[event.key] * this.stepSeconds());
        else if (event.key === "Home" || event.key === "End")
            this.player.seek(event.key === "Home" ? 0 : 0.999);
        else if (event.key === " ")
            this.player.toggle(this.player.index);
        else
            return;
        event.preventDefault();
    }

    pressedAnywhere(event) {
        if (event.key === "Escape" && this.player.index >= 0) {
            this.player.stop();
            this.showPlayer();
        } else if (event.key === "/" && !/^(INPUT|SELECT)$/.test(event.target.tagName)) {
            event.preventDefault();
            byId("text").focus();
        }
    }

    showPlayer() {
        const player = this.player, section = byId("player");
        if (player.index < 0) {
            if (section.contains(document.activeElement))
                this.table.grid.focus();
            section.hidden = true;
            return;
        }
        const row = player.row, note = player.noteOf(row), seconds = player.source && player.source.seconds;
        section.hidden = false;
        section.classList.toggle("sounding", player.isPlaying);
        byId("toggle").setAttribute("aria-label", player.isPlaying ? "Pause" : "Play");
        byId("playing").textContent = row.name;
        byId("playing").title = row.name;
        byId("where").textContent = note || (seconds && seconds < (row.duration || 0) ? `The first ${Math.round(seconds)} seconds` : row.folder);
        if (this.waveIndex !== row.index) {
            this.waveIndex = row.index;
            this.wave = waveOf(row.wave);
        }
        this.showPosition();
    }

    showPosition() {
        const player = this.player, canvas = byId("position");
        if (player.index < 0)
            return;
        const duration = player.duration(), played = player.played();
        if (fitCanvas(canvas, canvas.clientWidth, canvas.clientHeight))
            drawWave(canvas, this.wave, player.source ? played : -1);
        const now = clock(played * duration), end = clock(duration);
        if (byId("time").textContent !== `${now} / ${end}`)
            byId("time").textContent = `${now} / ${end}`;
        canvas.setAttribute("aria-valuemax", duration.toFixed(1));
        canvas.setAttribute("aria-valuenow", (played * duration).toFixed(1));
        canvas.setAttribute("aria-valuetext", `${now} of ${end}`);
    }
}

new Page(JSON.parse(byId("data").textContent));
