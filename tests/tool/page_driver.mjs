// Drives a browser for test_page.py: a JSON object a line in, an answer a line out. Usage: page_driver.mjs PLAYWRIGHT BROWSER
import { createRequire } from "node:module";
import { createInterface } from "node:readline";

const [playwright, executablePath] = process.argv.slice(2);
const { chromium } = createRequire(import.meta.url)(playwright);
const browser = await chromium.launch({ executablePath, args: ["--no-sandbox", "--disable-gpu", "--autoplay-policy=no-user-gesture-required"] });
let page = null, seen = null;

async function open({ url, width = 1280, height = 800, scheme = "light", motion = "no-preference", scale = 1 }) {
    if (page)
        await page.context().close();
    const context = await browser.newContext({ viewport: { width, height }, colorScheme: scheme, reducedMotion: motion, deviceScaleFactor: scale });
    page = await context.newPage();
    seen = { console: [], errors: [], dialogs: 0, requests: [] };
    page.on("console", message => seen.console.push(message.text()));
    page.on("pageerror", error => seen.errors.push(String(error)));
    page.on("dialog", dialog => { ++seen.dialogs; dialog.dismiss(); });
    page.on("request", request => seen.requests.push(request.url()));
    await page.goto(url);
    await wait({ script: "document.getElementById('hits').textContent !== ''" });
}

// The page's own policy forbids what the driver's library would wait with.
async function wait({ script }) {
    for (const end = Date.now() + 15000; !(await page.evaluate(script)); await new Promise(done => setTimeout(done, 20)))
        if (Date.now() > end)
            throw new Error("not within 15 seconds");
    return true;
}

// Roles and names as a screen reader hears them.
async function tree() {
    const session = await page.context().newCDPSession(page);
    const { nodes } = await session.send("Accessibility.getFullAXTree");
    return nodes.filter(node => !node.ignored).map(node => ({
        role: node.role?.value, name: node.name?.value,
        ...Object.fromEntries((node.properties || []).map(property => [property.name, property.value.value])),
    }));
}

const actions = {
    open,
    tree,
    press: ({ keys }) => keys.reduce((before, key) => before.then(() => page.keyboard.press(key)), Promise.resolve()),
    click: ({ selector, x, y }) => page.click(selector, x === undefined ? {} : { position: { x, y } }),
    fill: ({ selector, text }) => page.fill(selector, text),
    select: ({ selector, value }) => page.selectOption(selector, value),
    run: ({ script }) => page.evaluate(script),
    wait,
    picture: ({ path }) => page.screenshot({ path }).then(() => true),
    seen: () => seen,
};

for await (const line of createInterface({ input: process.stdin })) {
    const { act, ...more } = JSON.parse(line);
    try {
        console.log(JSON.stringify({ result: (await actions[act](more)) ?? null }));
    } catch (error) {
        console.log(JSON.stringify({ error: String(error) }));
    }
}
await browser.close();
