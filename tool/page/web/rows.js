"use strict";
// The rows of the page's data, and which of them are wanted in what order. Nothing here touches the document.

const ROW_FIELDS = ["folder", "name", "tempo", "key", "note", "mode", "duration", "category", "kind", "format", "detail", "type", "wave", "more"];
const COLUMNS = ["name", "tempo", "key", "duration", "category", "kind", "format"];
const NOTES = ["C", "C♯", "D", "D♯", "E", "F", "F♯", "G", "G♯", "A", "A♯", "B"];
const FLATS = {1: "D♭", 3: "E♭", 6: "G♭", 8: "A♭", 10: "B♭"};

/** What a search compares: without accents, in small letters, sharps and flats as they are typed. */
function plain(text) {
    return text.normalize("NFD").replace(/\p{M}/gu, "").replace(/♯/g, "#").replace(/♭/g, "b").toLowerCase();
}

/** Orders "take 2" ahead of "take 10". */
function naturalKey(text) {
    return plain(text).replace(/\d+/g, digits => digits.replace(/^0+(?=\d)/, "").padStart(12, "0"));
}

/** Position of a key among the 24, C major first; -1 for what is none of them. */
function keyNumber(note, mode) {
    return note < 0 || (mode !== "major" && mode !== "minor") ? -1 : note * 2 + (mode === "minor" ? 1 : 0);
}

class Rows {
    constructor(data) {
        this.data = data;
        this.length = data.rows.length;
        this.orders = new Map();
        this.searched = null;
    }

    /** One row as an object. */
    row(index) {
        const fields = this.data.rows[index], texts = this.data.texts, row = {index};
        ROW_FIELDS.forEach((name, i) => { row[name] = fields[i]; });
        [row.folder, row.folderLink] = this.data.folders[row.folder];
        for (const name of ["key", "mode", "category", "kind", "format", "detail", "type"])
            row[name] = texts[row[name]];
        row.more = row.more || {};
        return row;
    }

    field(index, name) {
        return this.data.rows[index][ROW_FIELDS.indexOf(name)];
    }

    text(index, name) {
        return this.data.texts[this.field(index, name)];
    }

    /** Values of a column with the number of their rows, the most frequent ones first. */
    values(name) {
        const counts = new Map(), at = ROW_FIELDS.indexOf(name);
        for (const fields of this.data.rows)
            counts.set(fields[at], (counts.get(fields[at]) || 0) + 1);
        return [...counts].map(([text, count]) => [this.data.texts[text], count]).filter(([text]) => text !== "")
            .sort((a, b) => b[1] - a[1] || (a[0] < b[0] ? -1 : 1));
    }

    /** What a search for words looks at, a text for each row; made once. */
    searchTexts() {
        if (!this.searched) {
            const texts = this.data.texts.map(plain), folders = this.data.folders.map(folder => plain(folder[0]));
            this.searched = this.data.rows.map(fields => {
                const more = fields[13];
                return [plain(fields[1]), folders[fields[0]], texts[fields[3]], texts[fields[7]], texts[fields[8]], texts[fields[9]],
                    more && more.words ? plain(more.words) : ""].join("\n");
            });
        }
        return this.searched;
    }

    /** All rows in the order of a column; those without a value are last in either direction. */
    order(column, descending) {
        const name = column ? `${column} ${descending}` : "";
        let order = this.orders.get(name);
        if (!order) {
            order = Uint32Array.from({length: this.length}, (_, i) => i);
            if (column) {
                const keys = this.sortKeys(column), sign = descending ? -1 : 1;
                order.sort((a, b) => {
                    const x = keys[a], y = keys[b];
                    if (x === y)
                        return a - b;
                    if (x === null || y === null)
                        return x === null ? 1 : -1;
                    return x < y ? -sign : sign;
                });
            }
            this.orders.set(name, order);
        }
        return order;
    }

    sortKeys(column) {
        const rows = this.data.rows, texts = this.data.texts, at = ROW_FIELDS.indexOf(column);
        if (column === "name") {
            const folders = this.data.folders.map(folder => naturalKey(folder[0]));
            return rows.map(fields => naturalKey(fields[1]) + "\n" + folders[fields[0]]);
        }
        if (column === "key")
            return rows.map(fields => fields[4] < 0 ? null : fields[4] * 4 + ["major", "minor", "both", "neither"].indexOf(texts[fields[5]]));
        if (column === "tempo" || column === "duration")
            return rows.map(fields => fields[at]);
        const keys = texts.map(text => text === "" ? null : naturalKey(text));
        return rows.map(fields => keys[fields[at]]);
    }

    /** The rows that pass the filters, in order. */
    matching(filters) {
        const tests = this.tests(filters), order = this.order(filters.sort, filters.descending);
        if (tests.length === 0)
            return order;
        const found = new Uint32Array(this.length);
        let count = 0;
        for (const index of order) {
            const fields = this.data.rows[index];
            if (tests.every(test => test(fields, index)))
                found[count++] = index;
        }
        return found.subarray(0, count);
    }

    tests(filters) {
        const tests = [], texts = this.data.texts;
        for (const name of ["category", "kind", "format"]) {
            if (filters[name]) {
                const wanted = texts.indexOf(filters[name]), at = ROW_FIELDS.indexOf(name);
                tests.push(fields => fields[at] === wanted);
            }
        }
        if (filters.from !== null || filters.to !== null)
            tests.push(tempoTest(filters.from === null ? 0 : filters.from, filters.to === null ? Infinity : filters.to, filters.related));
        if (filters.key >= 0)
            tests.push(keyTest(filters.key, filters.related, texts));
        const words = plain(filters.text).split(/\s+/).filter(word => word !== "");
        if (words.length > 0) {
            const searched = this.searchTexts();
            tests.push((_, index) => words.every(word => searched[index].includes(word)));
        }
        return tests;
    }
}

/** Half a hundredth beside the limits counts as on them: tempos of loops are worked out from lengths. */
function tempoTest(from, to, related) {
    const low = from - 0.005, high = to + 0.005;
    const isWithin = tempo => tempo >= low && tempo <= high;
    return fields => fields[2] !== null && (isWithin(fields[2]) || (related && (isWithin(fields[2] * 2) || isWithin(fields[2] / 2))));
}

/** A file that is said to go with both modes is in either. */
function keyTest(key, related, texts) {
    const note = key >> 1, isMinor = (key & 1) === 1, wanted = new Set([key]);
    if (related) {
        wanted.add(key ^ 1); // parallel
        wanted.add(isMinor ? (note + 3) % 12 * 2 : (note + 9) % 12 * 2 + 1); // relative
    }
    return fields => {
        if (fields[4] < 0)
            return false;
        const mode = texts[fields[5]];
        if (mode === "both")
            return wanted.has(fields[4] * 2) || wanted.has(fields[4] * 2 + 1);
        return wanted.has(keyNumber(fields[4], mode));
    };
}

/** "F♯ minor", or with flats "G♭ minor"; white keys have one name. */
function keyName(key, notes = NOTES) {
    return `${notes[key >> 1] || NOTES[key >> 1]} ${key & 1 ? "minor" : "major"}`;
}

/** "F♯ / G♭ minor" */
function keyLabel(key) {
    const flat = FLATS[key >> 1];
    return flat ? keyName(key).replace(" ", ` / ${flat} `) : keyName(key);
}

function emptyFilters() {
    return {text: "", from: null, to: null, key: -1, related: false, category: "", kind: "", format: "", sort: "", descending: false};
}

/** Filters as the fragment of an address, without what is not set. */
function fragmentOf(filters) {
    const parts = new URLSearchParams();
    if (filters.text)
        parts.set("q", filters.text);
    if (filters.from !== null || filters.to !== null)
        parts.set("tempo", `${filters.from ?? ""}..${filters.to ?? ""}`);
    if (filters.key >= 0)
        parts.set("key", keyName(filters.key).replace("♯", "#"));
    if (filters.related)
        parts.set("related", "1");
    for (const name of ["category", "kind", "format"])
        if (filters[name])
            parts.set(name, filters[name]);
    if (filters.sort)
        parts.set("sort", (filters.descending ? "-" : "") + filters.sort);
    return parts.toString();
}

/** The filters of a fragment; what makes no sense there is passed over. */
function filtersOf(fragment) {
    const parts = new URLSearchParams(fragment), filters = emptyFilters();
    const number = text => text !== undefined && text !== "" && Number.isFinite(Number(text)) ? Number(text) : null;
    filters.text = parts.get("q") || "";
    const [from, to] = (parts.get("tempo") || "").split("..");
    filters.from = number(from);
    filters.to = number(to);
    const key = plain(parts.get("key") || "");
    filters.key = [...Array(24).keys()].findIndex(i => plain(keyName(i)) === key || plain(keyName(i, FLATS)) === key);
    filters.related = parts.get("related") === "1";
    for (const name of ["category", "kind", "format"])
        filters[name] = parts.get(name) || "";
    const sort = parts.get("sort") || "", column = sort.replace(/^-/, "");
    if (COLUMNS.includes(column)) {
        filters.sort = column;
        filters.descending = sort.startsWith("-");
    }
    return filters;
}
