"""The page of inspect: what is in it, and what it does in a browser, where chromium is found."""

import base64
import hashlib
import html.parser
import json
import os
import re
import shutil
import subprocess

from tool import delimited, expect, in_scratch_directory, record, run

HOSTILE = "</script><img src=x onerror=document.title='run'>&\"'"
MEMBERS = record(2, record(1, b"ann")) + record(2, record(1, HOSTILE.encode()))
MESSAGES = [
    bytes.fromhex("08 01 10 05") + record(3, record(1, MEMBERS)),
    bytes.fromhex("10 02") + record(3, record(2, bytes(range(256)) * 9)),
    bytes.fromhex("08 01 10 05 1A 0C 12 0A 0A 01 FF 12 17 0A 03 61 6E 6E"),
]


def page():
    """A page with one error, in a file of a hostile name."""
    name = HOSTILE.replace("/", "∕")
    with open(name, "wb") as file:
        file.write(delimited(*MESSAGES))
    done = run("inspect", "-d", "--defaults", "--to", "html", name, "-o", "page.html")
    expect("status", done.returncode, 3)
    with open("page.html", encoding="utf-8") as file:
        return file.read(), name


class Elements(html.parser.HTMLParser):
    """The names of elements and attributes, and the text."""

    def __init__(self, text):
        super().__init__()
        self.elements, self.attributes, self.text = set(), set(), ""
        self.feed(text)

    def handle_starttag(self, tag, attrs):
        self.elements.add(tag)
        self.attributes |= {name for name, _ in attrs}

    def handle_data(self, data):
        self.text += data


def contents(text, name):
    body = Elements(text.split("</style>")[1].split("<script>")[0])
    wanted = "b body div em footer h1 h2 head header i kbd main output p pre section span"
    expect("elements", body.elements - set(wanted.split()), set())
    wanted = "aria-level class data-f data-s id role tabindex"
    expect("attributes", body.attributes - set(wanted.split()), set())
    expect("the file's name", name in body.text, True)
    expect("the value", HOSTILE.replace('"', '\\"')[:50] in body.text, True)
    expect("the bytes that are left out", "… 1280 bytes more" in body.text, True)
    expect("absent fields", "absent" in body.text, True)
    expect("addresses", re.findall(r"https?:|//\w|@import|url\(", text.split("<body>")[0]), [])
    # The browser refuses what does not have the digest that the page's head names.
    for element in ("style", "script"):
        source = re.search(f"<{element}>(.*?)</{element}>", text, re.DOTALL)[1]
        digest = base64.b64encode(hashlib.sha256(source.encode()).digest()).decode()
        expect(f"digest of the {element}", re.search(f"{element}-src 'sha256-([^']*)'", text)[1], digest)


class Browser:
    """A page in a headless browser, over the pipes of its DevTools protocol."""

    def __init__(self, program, path):
        self.to_browser, self.from_browser = os.pipe(), os.pipe()
        command = [program, "--headless", "--disable-gpu", "--remote-debugging-pipe", "--user-data-dir=profile"]
        command += ["--no-sandbox"] if os.geteuid() == 0 else []
        ends = (self.to_browser[0], self.from_browser[1])
        self.process = subprocess.Popen(
            ["bash", "-c", f'exec "$@" 3<&{ends[0]} 4>&{ends[1]}', "bash", *command],
            pass_fds=ends,
            stderr=subprocess.DEVNULL,
        )
        for end in ends:
            os.close(end)
        self.events, self.answers, self.count, self.session, self.pending = [], {}, 0, None, b""
        target = self.call("Target.createTarget", url="about:blank")["targetId"]
        self.session = self.call("Target.attachToTarget", targetId=target, flatten=True)["sessionId"]
        for domain in ("Runtime", "Log", "Network", "Page"):
            self.call(domain + ".enable")
        window = {"width": 1300, "height": 900, "deviceScaleFactor": 1, "mobile": False}
        self.call("Emulation.setDeviceMetricsOverride", **window)
        self.call("Page.navigate", url="file://" + os.path.abspath(path))
        while not any(event["method"] == "Page.loadEventFired" for event in self.events):
            self.read()

    def read(self):
        while b"\0" not in self.pending:
            piece = os.read(self.from_browser[0], 65536)
            assert piece, "the browser is gone"
            self.pending += piece
        message, self.pending = self.pending.split(b"\0", 1)
        message = json.loads(message)
        if "id" in message:
            self.answers[message["id"]] = message
        else:
            self.events.append(message)

    def call(self, method, **parameters):
        self.count += 1
        message = {"id": self.count, "method": method, "params": parameters}
        if self.session is not None:
            message["sessionId"] = self.session
        os.write(self.to_browser[1], json.dumps(message).encode() + b"\0")
        while self.count not in self.answers:
            self.read()
        return self.answers[self.count]["result"]

    def value(self, expression):
        answer = self.call("Runtime.evaluate", expression=expression, returnByValue=True)
        return answer["result"].get("value", answer.get("exceptionDetails"))

    def point_at(self, selector):
        element = f"document.querySelector('{selector}')"
        self.value(f"{element}.scrollIntoView({{block: 'center'}})")
        place = self.value(f"(r => [r.x + r.width / 2, r.y + r.height / 2])({element}.getBoundingClientRect())")
        self.call("Input.dispatchMouseEvent", type="mouseMoved", x=place[0], y=place[1])

    def press(self, key):
        for kind in ("keyDown", "keyUp"):
            self.call("Input.dispatchKeyEvent", type=kind, key=key, code=key)

    def lit(self):
        """The field that is lit, the bytes that are its own, and those of the fields in it."""
        texts = "(s => [...document.querySelectorAll(s)].map(e => e.textContent).join(' '))"
        field = self.value(f"{texts}('.tree .lit > :first-child, .tree > .bad.lit')")
        return field, self.value(f"{texts}('.dump i.lit')"), self.value(f"{texts}('.dump i.within')")


def behaviour(browser):
    heading = browser.value("document.querySelector('h1').textContent")
    expect("no other script has run", browser.value("document.title"), heading + " · orv inspect")
    expect("nothing is lit", browser.lit(), ("", "", ""))
    expect("errors are listed", browser.value("document.querySelectorAll('#errors a').length"), 1)

    # The members' list: the handle of the first, by its bytes and by its line.
    handle = browser.value("fields.findIndex(field => field.textContent.includes('ann'))")
    wanted = ("handle", "0a 03 61 6e 6e", "")
    browser.point_at(f'.dump i[data-f="{handle}"].string')
    expect("pointing at bytes", browser.lit(), wanted)
    place = browser.value("document.getElementById('status').textContent")
    expect("the field's place", place, "data.initialize.members[0].handle · byte 11 · 5 bytes")
    browser.point_at(f'.tree [data-f="{handle - 1}"]')
    expect("pointing at a message", browser.lit(), ("members[0]", "12 05", "0a 03 61 6e 6e"))
    browser.point_at("h1")
    expect("pointing elsewhere", browser.lit(), ("", "", ""))

    browser.press("ArrowDown")
    expect("the first field by keyboard", browser.lit(), ("version", "08 01", ""))
    for _ in range(handle):
        browser.press("ArrowDown")
    expect("a field by keyboard", browser.lit(), wanted)
    browser.press("ArrowLeft")
    expect("the message around it", browser.lit()[0], "members[0]")
    expect("what has the focus", browser.value("Number(document.activeElement.dataset.f)"), handle - 1)
    browser.press("End")
    expect("the error by keyboard", browser.lit()[1], "12 17 0a 03 61 6e 6e")
    browser.press("Escape")
    expect("letting go", browser.lit(), ("", "", ""))

    colours = set()
    for scheme in ("light", "dark"):
        browser.call("Emulation.setEmulatedMedia", features=[{"name": "prefers-color-scheme", "value": scheme}])
        style = "getComputedStyle(document.body)"
        colours.add(browser.value(f"{style}.backgroundColor + {style}.color"))
        assert browser.call("Page.captureScreenshot")["data"]
    expect("colours of their own in light and dark", len(colours), 2)
    fits = "document.documentElement.scrollWidth <= innerWidth"
    expect("nothing runs over the window", browser.value(fits), True)
    printed = base64.b64decode(browser.call("Page.printToPDF")["data"])
    expect("it is printed", len(re.findall(rb"/Type /Page\b", printed)) >= 2, True)

    def told(method):
        return [event["params"] for event in browser.events if event["method"] == method]

    expect("errors in the browser", told("Runtime.exceptionThrown") + told("Log.entryAdded"), [])
    requested = [event["request"]["url"].split("/")[-1] for event in told("Network.requestWillBeSent")]
    expect("requests", requested, ["page.html"])


def test():
    text, name = page()
    contents(text, name)
    programs = [path for path in map(shutil.which, ("chromium", "chromium-headless-shell")) if path]
    if not programs:
        print("chromium is missing (.ci/install-packages browser): the page was not opened")
        return
    browser = Browser(programs[0], "page.html")
    try:
        behaviour(browser)
    finally:
        browser.session = None
        browser.call("Browser.close")
        browser.process.wait(timeout=60)


in_scratch_directory(test)
