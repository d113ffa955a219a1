"""Line charts with logarithmic axes as SVG, readable on light and dark pages."""

import math
from xml.sax.saxutils import escape

WIDTH, HEIGHT = 560, 340
LEFT, RIGHT, TOP, BOTTOM = 64, 96, 40, 48

STYLE = """\
  svg { color: #1f2328; font: 12px system-ui, sans-serif; }
  .s0 { color: #0b5fc2; } .s1 { color: #b04a00; }
  @media (prefers-color-scheme: dark) {
    svg { color: #d7dce2; } .s0 { color: #6cb0ff; } .s1 { color: #ffa657; }
  }
  text { fill: currentColor; }
  .grid { stroke: currentColor; stroke-opacity: .18; }
  .line { fill: none; stroke: currentColor; stroke-width: 2; }
  circle { fill: currentColor; }"""


def decades(values):
    """The exponents of ten that enclose the values; at least one decade."""
    first = math.floor(math.log10(min(values)))
    return first, max(math.ceil(math.log10(max(values))), first + 1)


def number_text(exponent):
    return f"{10 ** exponent:,}" if exponent >= 0 else f"{10 ** exponent:.{-exponent}f}"


class Axis:
    """Maps values to places on the page."""

    def __init__(self, values, start, end):
        self.first, self.last = decades(values)
        self.start, self.end = start, end

    def place(self, value):
        share = (math.log10(value) - self.first) / (self.last - self.first)
        return round(self.start + share * (self.end - self.start), 1)

    def ticks(self):
        return [(exponent, self.place(10.0**exponent))
                for exponent in range(self.first, self.last + 1)]


def grid(x, y):
    for exponent, place in x.ticks():
        yield f'<path class="grid" d="M{place} {TOP}V{HEIGHT - BOTTOM}"/>'
        yield (f'<text x="{place}" y="{HEIGHT - BOTTOM + 18}" text-anchor="middle">'
               f"{number_text(exponent)}</text>")
    for exponent, place in y.ticks():
        yield f'<path class="grid" d="M{LEFT} {place}H{WIDTH - RIGHT}"/>'
        yield f'<text x="{LEFT - 8}" y="{place + 4}" text-anchor="end">{number_text(exponent)}</text>'


def line(index, name, points, x, y):
    places = [(x.place(first), y.place(second)) for first, second in points]
    path = "L".join(f"{left} {top}" for left, top in places)
    yield f'<g class="s{index % 2}"><path class="line" d="M{path}"/>'
    for left, top in places:
        yield f'<circle cx="{left}" cy="{top}" r="3.5"/>'
    left, top = places[-1]
    yield f'<text x="{left + 8}" y="{top + 4}">{escape(name)}</text></g>'


def log_log_chart(title, x_label, y_label, series):
    """SVG text. `series` is a list of (name, [(x, y), …]) with values above 0, two at most."""
    points = [point for _, values in series for point in values]
    x = Axis([first for first, _ in points], LEFT, WIDTH - RIGHT)
    y = Axis([second for _, second in points], HEIGHT - BOTTOM, TOP)
    parts = [
        f'<svg xmlns="http://www.w3.org/2000/svg" viewBox="0 0 {WIDTH} {HEIGHT}" width="{WIDTH}">',
        f"<title>{escape(title)}</title>",
        f"<style>\n{STYLE}\n</style>",
        f'<text x="{LEFT}" y="22" font-weight="600">{escape(title)}</text>',
        *grid(x, y),
        f'<text x="{(LEFT + WIDTH - RIGHT) / 2}" y="{HEIGHT - 10}" text-anchor="middle">'
        f"{escape(x_label)}</text>",
        f'<text transform="translate(14 {HEIGHT / 2}) rotate(-90)" text-anchor="middle">'
        f"{escape(y_label)}</text>",
    ]
    for index, (name, values) in enumerate(series):
        parts += line(index, name, values, x, y)
    return "\n".join([*parts, "</svg>", ""])
