// The table: only the rows that can be seen are in the document.

const OVERSCAN = 8;

/** "1:23.4", of seconds, from an hour on "1:02:03"; "" for what is not known. */
function clock(seconds) {
    if (seconds === null || !Number.isFinite(seconds))
        return "";
    const digits = seconds < 3599.5 ? 1 : 0, scale = 10 ** digits, all = Math.round(seconds * scale) / scale;
    const hours = Math.floor(all / 3600), minutes = Math.floor(all / 60) % 60, rest = (all % 60).toFixed(digits);
    const padded = rest.padStart(digits > 0 ? 4 : 2, "0");
    return hours > 0 ? `${hours}:${String(minutes).padStart(2, "0")}:${padded}` : `${minutes}:${padded}`;
}

function tempoText(tempo) {
    return tempo === null ? "" : String(Math.round(tempo * 100) / 100);
}

class Table {
    /** `actions` has play(index), seek(index, fraction), stateOf(index): {note, wrong, mute, playing, sounding, played}. */
    constructor(rows, actions) {
        this.rows = rows;
        this.actions = actions;
        this.grid = document.getElementById("grid");
        this.body = document.getElementById("body");
        this.template = document.getElementById("row").content.firstElementChild;
        this.head = this.grid.querySelector(".head");
        this.shown = new Map(); // elements by position
        this.pool = [];
        this.hits = new Uint32Array(0);
        this.active = 0; // position
        this.wide = 0;
        this.frame = 0;
        this.isPrinting = false;
        this.grid.addEventListener("scroll", () => this.requestRender(), {passive: true});
        new ResizeObserver(() => this.layOut()).observe(this.grid);
        this.body.addEventListener("mousedown", event => this.pressed(event));
        this.body.addEventListener("dblclick", event => this.pressedTwice(event));
    }

    layOut() {
        this.height = parseFloat(getComputedStyle(document.documentElement).getPropertyValue("--row")) || 44;
        this.body.style.height = `${this.hits.length * this.height}px`;
        this.wide = 0; // is measured on the next row
        this.dropAll();
        this.render();
    }

    /** Shows other rows; the active one stays the same file if it is among them. */
    show(hits) {
        const index = this.hits[this.active], at = index === undefined ? -1 : hits.indexOf(index);
        this.hits = hits;
        this.active = Math.max(0, at);
        this.grid.setAttribute("aria-rowcount", String(hits.length + 1));
        this.body.style.height = `${hits.length * this.height}px`;
        this.dropAll();
        if (at < 0)
            this.grid.scrollTop = 0;
        else
            this.scrollToActive();
        this.render();
    }

    dropAll() {
        for (const element of this.shown.values())
            this.drop(element);
        this.shown.clear();
    }

    drop(element) {
        element.root.remove();
        if (this.pool.length < 100)
            this.pool.push(element);
    }

    requestRender() {
        if (!this.frame)
            this.frame = requestAnimationFrame(() => { this.frame = 0; this.render(); });
    }

    range() {
        if (this.isPrinting)
            return [0, Math.min(this.hits.length, 1000)];
        const first = Math.floor(this.grid.scrollTop / this.height) - OVERSCAN;
        const last = Math.ceil((this.grid.scrollTop + this.grid.clientHeight) / this.height) + OVERSCAN;
        return [Math.max(0, first), Math.min(this.hits.length, last)];
    }

    render() {
        if (!this.height)
            return;
        const [first, last] = this.range();
        for (const [position, element] of this.shown) {
            if (position < first || position >= last) {
                this.drop(element);
                this.shown.delete(position);
            }
        }
        for (let position = first; position < last; ++position) {
            if (!this.shown.has(position)) {
                const element = this.pool.pop() || this.newElement();
                this.fill(element, position);
                this.shown.set(position, element);
                this.place(element, position);
            }
        }
        for (const element of this.shown.values())
            if (element.needsWave)
                this.drawRow(element);
        this.markActive();
    }

    // Readers of screens go through the rows in the order of the document.
    place(element, position) {
        let next = null;
        for (const [other, {root}] of this.shown)
            if (other > position && (next === null || other < next[0]))
                next = [other, root];
        this.body.insertBefore(element.root, next ? next[1] : null);
    }

    newElement() {
        const root = this.template.cloneNode(true), element = {root};
        for (const name of ["play", "file", "folder", "wave", "tempo", "key", "duration", "category", "kind", "container", "detail"])
            element[name] = root.querySelector(`.${name}`);
        element.button = root.querySelector("button");
        element.canvas = root.querySelector("canvas");
        return element;
    }

    fill(element, position) {
        const index = this.hits[position], row = this.rows.row(index);
        Object.assign(element, {row, position, index, points: waveOf(row.wave), needsWave: true});
        element.root.id = `r${index}`;
        element.root.setAttribute("aria-rowindex", String(position + 2));
        element.root.style.transform = `translateY(${position * this.height}px)`;
        element.file.textContent = row.name;
        element.file.title = row.name;
        element.tempo.textContent = tempoText(row.tempo);
        element.key.textContent = row.key;
        element.duration.textContent = clock(row.duration);
        element.category.textContent = row.category;
        element.category.title = row.category;
        element.kind.textContent = row.kind;
        element.container.textContent = row.format;
        element.detail.textContent = row.detail;
        this.update(element);
    }

    /** What changes while a row is shown. */
    update(element) {
        const state = this.actions.stateOf(element.index, element.row);
        element.state = state;
        element.folder.textContent = element.folder.title = [state.note, element.row.folder].filter(Boolean).join(" · ");
        element.root.classList.toggle("noted", state.wrong);
        element.root.classList.toggle("mute", state.mute);
        element.root.classList.toggle("playing", state.playing);
        element.root.classList.toggle("sounding", state.sounding);
        element.button.setAttribute("aria-label", `${state.sounding ? "Pause" : "Play"} ${element.row.name}`);
        element.needsWave = true;
    }

    /** Shows the state of one file, or of all that can be seen. */
    refresh(index) {
        for (const element of this.shown.values()) {
            if (index === undefined || element.index === index) {
                this.update(element);
                this.drawRow(element);
            }
        }
    }

    drawRow(element) {
        if (!this.wide) {
            this.wide = element.canvas.clientWidth;
            this.tall = element.canvas.clientHeight;
        }
        element.needsWave = false;
        if (fitCanvas(element.canvas, this.wide, this.tall))
            drawWave(element.canvas, element.points, element.state.played);
    }

    /** Moves the position of the file that plays. */
    drawPosition(index, played) {
        for (const element of this.shown.values()) {
            if (element.index === index) {
                element.state.played = played;
                this.drawRow(element);
            }
        }
    }

    markActive() {
        let found = false;
        for (const [position, {root}] of this.shown) {
            const isActive = position === this.active;
            root.classList.toggle("active", isActive);
            root.setAttribute("aria-selected", String(isActive));
            if (isActive) {
                this.grid.setAttribute("aria-activedescendant", root.id);
                found = true;
            }
        }
        if (!found)
            this.grid.removeAttribute("aria-activedescendant");
    }

    activeIndex() {
        return this.hits[this.active];
    }

    activate(position) {
        this.active = Math.max(0, Math.min(this.hits.length - 1, position));
        this.scrollToActive();
        this.render();
    }

    scrollToActive() {
        const head = this.head.getBoundingClientRect().height > 2 ? this.head.offsetHeight : 0;
        const top = this.active * this.height, room = this.grid.clientHeight - head;
        if (top < this.grid.scrollTop)
            this.grid.scrollTop = top;
        else if (top + this.height > this.grid.scrollTop + room)
            this.grid.scrollTop = top + this.height - room;
    }

    rowsOfPage() {
        return Math.max(1, Math.floor(this.grid.clientHeight / this.height) - 2);
    }

    elementOf(event) {
        const root = event.target.closest(".row");
        return root && [...this.shown.values()].find(element => element.root === root);
    }

    pressed(event) {
        const element = this.elementOf(event);
        if (!element || event.button !== 0)
            return;
        this.active = element.position;
        this.markActive();
        if (event.target === element.canvas) {
            const box = element.canvas.getBoundingClientRect();
            this.actions.seek(element.index, Math.max(0, Math.min(1, (event.clientX - box.left) / box.width)));
        } else if (event.target.closest("button")) {
            this.actions.play(element.index);
        } else {
            return; // text can be marked
        }
        event.preventDefault();
        this.grid.focus({preventScroll: true, focusVisible: false});
    }

    pressedTwice(event) {
        const element = this.elementOf(event);
        if (element && event.target !== element.canvas && !event.target.closest("button"))
            this.actions.play(element.index);
    }

    setPrinting(isPrinting) {
        this.isPrinting = isPrinting;
        this.layOut();
    }
}
