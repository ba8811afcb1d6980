// Waveforms on canvases.

const colors = {};

function readColors() {
    const style = getComputedStyle(document.documentElement);
    for (const name of ["wave", "accent", "text", "line"])
        colors[name] = style.getPropertyValue(`--${name}`).trim();
}

/** Pairs of lowest and highest value, -1 to 1; null for none. */
function waveOf(text) {
    if (!text)
        return null;
    const bytes = atob(text), wave = new Float32Array(bytes.length & ~1);
    for (let i = 0; i < wave.length; ++i)
        wave[i] = (bytes.charCodeAt(i) - 128) / 127;
    return wave.length > 0 ? wave : null;
}

/** The shape of a wave in a box; it is nowhere thinner than a point. */
function wavePath(wave, width, height, point) {
    const path = new Path2D(), count = wave.length / 2, middle = height / 2, reach = middle - point;
    const x = i => count === 1 ? i * width : i / (count - 1) * width;
    const steps = count === 1 ? [0, 0] : [...Array(count).keys()];
    const top = [], bottom = [];
    for (const column of steps) {
        let high = middle - wave[column * 2 + 1] * reach, low = middle - wave[column * 2] * reach;
        if (low - high < point)
            [high, low] = [(high + low - point) / 2, (high + low + point) / 2];
        top.push(high);
        bottom.push(low);
    }
    path.moveTo(0, top[0]);
    top.forEach((y, i) => path.lineTo(x(i), y));
    for (let i = bottom.length - 1; i >= 0; --i)
        path.lineTo(x(i), bottom[i]);
    path.closePath();
    return path;
}

/** Fits a canvas to its box in points of the screen; false if it has none. */
function fitCanvas(canvas, width, height) {
    const scale = window.devicePixelRatio || 1, wide = Math.round(width * scale), tall = Math.round(height * scale);
    if (canvas.width !== wide)
        canvas.width = wide;
    if (canvas.height !== tall)
        canvas.height = tall;
    return wide > 0 && tall > 0;
}

/** Draws a wave, the part up to `played` (0 to 1) in the accent's colour; `played` below 0 is no position. */
function drawWave(canvas, wave, played) {
    const context = canvas.getContext("2d"), {width, height} = canvas, point = Math.max(1, Math.round(window.devicePixelRatio || 1));
    context.clearRect(0, 0, width, height);
    if (wave) {
        const path = wavePath(wave, width, height, point);
        context.fillStyle = colors.wave;
        context.fill(path);
        if (played > 0) {
            context.save();
            context.beginPath();
            context.rect(0, 0, played * width, height);
            context.clip();
            context.fillStyle = colors.accent;
            context.fill(path);
            context.restore();
        }
    } else {
        context.fillStyle = colors.line;
        context.fillRect(0, Math.floor((height - point) / 2), width, point);
    }
    if (played >= 0) {
        context.fillStyle = colors.text;
        context.fillRect(Math.min(width - point, Math.max(0, Math.round(played * width - point / 2))), 0, point, height);
    }
}
