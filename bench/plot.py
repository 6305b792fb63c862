"""The plot: two lines per operation, one mark per peer, on a logarithmic axis."""

import math

from figures import FIRST, LATER, OURS, ROWS

WIDTH, LEFT, RIGHT, TOP, STEP = 860, 230, 30, 84, 26
SMALLEST, LARGEST = 0.01, 10
COLOURS = {"orv": "#e4572e", "official": "#8a8f98", "official-arena": "#4c8fd0", "official-lite": "#7e6bc4",
           "protozero": "#2e9e6b", "upb": "#c2417c", "nanopb": "#c9a227", "protobuf-c": "#b3679b", "floor": "#5fb0b7"}
# The colours can be read on light and on dark paper; a viewer that knows which it has sharpens the text.
STYLE = """
  text { font: 13px system-ui, sans-serif; fill: #6e7681; }
  .quiet { font-size: 11px; }
  .grid { stroke: #8a8f98; stroke-opacity: 0.3; }
  .baseline { stroke: #8a8f98; stroke-width: 1.5; }
  @media (prefers-color-scheme: light) { text { fill: #30343b; } }
  @media (prefers-color-scheme: dark) { text { fill: #dfe2e7; } }"""


def across(ratio):
    """Where a ratio stands on the axis; what is beyond an end stands at it."""
    share = math.log(max(SMALLEST, min(LARGEST, ratio)) / SMALLEST) / math.log(LARGEST / SMALLEST)
    return LEFT + share * (WIDTH - LEFT - RIGHT)


def mark(x, y, peer, ratio):
    radius = 7 if peer == OURS else 5
    return (f'<circle cx="{x:.1f}" cy="{y}" r="{radius}" fill="{COLOURS[peer]}">'
            f"<title>{peer}: {ratio:.3g}</title></circle>")


def legend(peers):
    parts, x = [], LEFT - 120
    for peer in peers:
        parts.append(f'<circle cx="{x}" cy="26" r="5" fill="{COLOURS[peer]}"/>'
                     f'<text class="quiet" x="{x + 9}" y="30">{peer}</text>')
        x += 26 + 6.1 * len(peer)
    return parts


def axis(bottom):
    parts = []
    for exponent in range(round(math.log10(SMALLEST)), round(math.log10(LARGEST)) + 1):
        for factor in (1, 2, 5):
            ratio = factor * 10.0**exponent
            if ratio > LARGEST:
                continue
            x = across(ratio)
            parts.append(f'<line class="{"baseline" if ratio == 1 else "grid"}" x1="{x:.1f}" x2="{x:.1f}" '
                         f'y1="{TOP - 22}" y2="{bottom}"/>'
                         f'<text class="quiet" x="{x:.1f}" y="{TOP - 28}" text-anchor="middle">'
                         f"{ratio:g}</text>")
    return parts


def svg(results):
    lines = [(f"{row.title}, {chosen}", row, chosen) for row in ROWS for chosen in (FIRST, LATER)
             if results.mean(row, OURS, chosen) is not None]
    bottom = TOP + STEP * len(lines) - 8
    parts = legend(results.peers) + axis(bottom)
    for index, (title, row, chosen) in enumerate(lines):
        y = TOP + STEP * index
        parts.append(f'<text x="{LEFT - 14}" y="{y + 4}" text-anchor="end">{title}</text>')
        # Ours comes last, on top of the others.
        for peer in reversed(results.peers):
            ratio = results.mean(row, peer, chosen)
            if ratio is not None:
                parts.append(mark(across(ratio), y, peer, ratio))
    caption = ("Time as a ratio to the generated code, geometric mean over the first and the later workloads.",
               "Further left is faster.")
    parts += [f'<text class="quiet" x="{LEFT}" y="{bottom + 24 + 16 * line}">{text}</text>'
              for line, text in enumerate(caption)]
    body = "\n".join(parts)
    return (f'<svg xmlns="http://www.w3.org/2000/svg" viewBox="0 0 {WIDTH} {bottom + 56}" role="img" '
            f'aria-label="Ratios of every peer to the generated code">\n<style>{STYLE}\n</style>\n'
            f"{body}\n</svg>\n")
