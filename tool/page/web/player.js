// Plays one file at a time, of the address where it is, of a preview, or decoded by the server.

const PREVIEW_MARGIN = 0.05; // seconds ahead of a preview's end where a position behind it is put

/** The address of a file, relative to the page. */
function linkOf(row) {
    return row.folderLink + (row.more.link || encodeURIComponent(row.name));
}

class Player {
    /** `changed(index)` is called when what is told of a row changes, `moved(index, played)` while it plays. */
    constructor(rows, {changed, moved, tell}) {
        this.rows = rows;
        this.changed = changed;
        this.moved = moved;
        this.tell = tell;
        this.audio = document.getElementById("audio");
        this.index = -1;
        this.notes = new Map(); // what went wrong, by row
        this.canPlay = new Map(); // by type
        this.previews = null;
        this.address = "";
        this.wanted = -1; // a position, 0 to 1, for when it can be set
        this.frame = 0;
        this.isQuick = !matchMedia("(prefers-reduced-motion: reduce)").matches;
        this.audio.addEventListener("loadedmetadata", () => this.setWanted());
        for (const name of ["play", "pause", "ended", "seeked", "durationchange"])
            this.audio.addEventListener(name, () => this.update());
        this.audio.addEventListener("error", () => this.failed());
        this.audio.addEventListener("timeupdate", () => { if (!this.isQuick) this.drawNow(); });
    }

    browserPlays(type) {
        if (!type)
            return false;
        if (!this.canPlay.has(type))
            this.canPlay.set(type, this.audio.canPlayType(type) !== "");
        return this.canPlay.get(type);
    }

    /** Where the sound of a row can come from, the best first. `seconds`: that much of it. */
    sources(row) {
        const found = [];
        if (row.more.gone || row.more.problem)
            return found;
        const isServed = this.rows.data.served;
        if (this.browserPlays(row.type))
            found.push({address: isServed ? `file/${row.index}` : linkOf(row)});
        if (isServed)
            found.push({address: `decoded/${row.index}`});
        else if (row.more.preview)
            found.push({address: row.more.preview, seconds: row.more.seconds});
        else if (row.more.embedded)
            found.push({embedded: true, seconds: row.more.seconds});
        return found;
    }

    /** Why a row does not play; "" if it may. */
    noteOf(row) {
        if (row.more.gone)
            return "This file is gone";
        if (row.more.problem)
            return row.more.problem;
        if (this.notes.has(row.index))
            return this.notes.get(row.index);
        return this.sources(row).length > 0 ? "" : `This browser cannot play ${row.format || "this file"}`;
    }

    stateOf(index, row) {
        const isCurrent = index === this.index, note = this.noteOf(row);
        return {
            note,
            wrong: Boolean(row.more.gone || row.more.problem || this.notes.has(index)),
            mute: note !== "",
            playing: isCurrent && note === "",
            sounding: isCurrent && !this.audio.paused,
            played: isCurrent && note === "" ? this.played() : -1,
        };
    }

    get isPlaying() {
        return this.index >= 0 && !this.audio.paused;
    }

    duration() {
        const known = this.row ? this.row.duration : null;
        return known || (Number.isFinite(this.audio.duration) ? this.audio.duration : 0);
    }

    played() {
        if (this.wanted >= 0)
            return this.wanted;
        const duration = this.duration();
        return duration > 0 ? Math.min(1, this.audio.currentTime / duration) : 0;
    }

    /** Plays a row from the start, or pauses and goes on if it is the current one. */
    toggle(index) {
        if (index !== this.index || this.noteOf(this.row) !== "")
            this.start(index, 0);
        else if (this.audio.paused)
            this.play();
        else
            this.audio.pause();
    }

    /** Plays from a position, 0 to 1. */
    start(index, position) {
        const before = this.index, row = this.rows.row(index);
        if (index !== before) {
            this.audio.pause();
            this.index = index;
            this.row = row;
            this.left = this.sources(row);
            if (before >= 0)
                this.changed(before);
            this.notes.delete(index);
            if (this.left.length === 0) {
                this.audio.removeAttribute("src");
                this.source = null;
                this.tell(`${row.name}: ${this.noteOf(row)}`);
                this.changed(index);
                return;
            }
            this.wanted = position;
            this.load();
        } else {
            this.seek(position);
        }
        this.play();
        this.tell(this.source && this.source.seconds && this.source.seconds < (row.duration || 0)
            ? `Playing the first ${Math.round(this.source.seconds)} seconds of ${row.name}` : `Playing ${row.name}`);
        this.changed(index);
    }

    load() {
        this.source = this.left.shift();
        if (this.address)
            URL.revokeObjectURL(this.address);
        this.address = "";
        if (this.source.embedded)
            this.address = URL.createObjectURL(this.embedded(this.index));
        this.audio.src = this.address || this.source.address;
    }

    /** The preview of a row that stands in the page. */
    embedded(index) {
        this.previews = this.previews || JSON.parse(document.getElementById("previews").textContent);
        const bytes = atob(this.previews[index] || "");
        return new Blob([Uint8Array.from(bytes, byte => byte.charCodeAt(0))], {type: "audio/wav"});
    }

    play() {
        if (this.source)
            this.audio.play().catch(() => {}); // the event "error" tells
    }

    seek(position) {
        this.wanted = position;
        if (this.audio.readyState > 0)
            this.setWanted();
    }

    setWanted() {
        if (this.wanted < 0)
            return;
        const end = this.source && this.source.seconds ? this.source.seconds - PREVIEW_MARGIN : Infinity;
        const time = Math.min(this.wanted * this.duration(), end);
        this.wanted = -1;
        if (time > 0 || this.audio.currentTime > 0)
            this.audio.currentTime = Math.max(0, time);
        this.update();
    }

    /** By seconds, forwards or back. */
    step(seconds) {
        const duration = this.duration();
        if (this.index >= 0 && duration > 0)
            this.seek(Math.max(0, Math.min(0.999, this.played() + seconds / duration)));
    }

    stop() {
        const before = this.index;
        this.audio.pause();
        this.audio.removeAttribute("src");
        this.index = -1;
        this.row = this.source = null;
        if (before >= 0) {
            this.changed(before);
            this.tell("Stopped");
        }
    }

    failed() {
        if (this.index < 0 || !this.audio.error || !this.source)
            return;
        if (this.left.length > 0) {
            const at = this.played();
            this.load();
            this.wanted = at;
            this.play();
            return;
        }
        // Browsers do not tell scripts of local pages whether a file is there; a decoder that has begun has seen it.
        const isDecoding = /DEMUX|DECOD|PIPELINE/i.test(this.audio.error.message) || this.audio.error.code === 3;
        this.notes.set(this.index, isDecoding ? "This browser cannot play this file" : "This file is gone, or cannot be read");
        this.source = null;
        this.tell(`${this.row.name}: ${this.notes.get(this.index)}`);
        this.changed(this.index);
    }

    update() {
        if (this.index < 0)
            return;
        this.changed(this.index);
        if (this.isPlaying && this.isQuick && !this.frame)
            this.frame = requestAnimationFrame(() => this.drawFrame());
    }

    drawFrame() {
        this.frame = 0;
        if (this.index < 0)
            return;
        this.drawNow();
        if (!this.audio.paused)
            this.frame = requestAnimationFrame(() => this.drawFrame());
    }

    drawNow() {
        if (this.index >= 0 && this.source)
            this.moved(this.index, this.played());
    }
}
