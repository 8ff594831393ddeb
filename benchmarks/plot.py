# SPDX-License-Identifier: MIT
"""Draws time over size, both logarithmic, one panel a workload, as an SVG."""
import math
from html import escape

COLUMNS = 3
WIDTH, HEIGHT = 330, 260  # Of a panel with all around it.
LEFT, RIGHT, TOP, BOTTOM = 52, 92, 28, 34  # Around the field of a panel.
LABEL = 11  # The least distance of two labels.

COLOURS = {"Orb": "#d1242f", "std": "#1f6feb", "std-string": "#79a8f0", "Qt": "#2da44e", "GLib": "#8250df",
           "GIO": "#8250df", "ICU": "#0a7d8c", "Boost": "#9a6700", "cp": "#57606a", "rm": "#57606a"}
LIMIT_COLOUR = "#8c959f"


def colour(row):
    return COLOURS.get(row, COLOURS["Orb"] if row.startswith("Orb") else LIMIT_COLOUR)


def amount(value, units):
    for unit, factor in units:
        if value >= factor:
            return f"{value / factor:g}{unit}"
    return f"{value:g}"


def time_label(nanoseconds):
    return amount(nanoseconds, ((" s", 1e9), (" ms", 1e6), (" µs", 1e3), (" ns", 1)))


def size_label(size):
    binary = size >= 1024 and size % 1024 == 0
    return amount(size, (("Mi", 1 << 20), ("Ki", 1 << 10)) if binary else (("M", 10**6), ("k", 10**3)))


def text(x, y, content, anchor="middle", extra=""):
    return f'<text x="{x:.1f}" y="{y:.1f}" text-anchor="{anchor}" {extra}>{escape(content)}</text>'


def line(points, style):
    return f'<polyline points="{" ".join(f"{x:.1f},{y:.1f}" for x, y in points)}" fill="none" {style}/>'


def spread(wanted):
    """Heights as near to those wanted, which ascend, as labels that do not overlap can have."""
    placed = []
    for y in wanted:
        placed.append(max(y, placed[-1] + LABEL) if placed else y)
    return placed


class Field:
    """Where a panel's sizes and times lie on the page."""

    def __init__(self, series, x, y):
        points = [point for row in series.values() for point in row]
        self.sizes = sorted({size for size, _ in points})
        self.decades = range(math.floor(math.log10(min(time for _, time in points))),
                             math.ceil(math.log10(max(time for _, time in points))) + 1)
        self.left, self.right = x + LEFT, x + WIDTH - RIGHT
        self.top, self.bottom = y + TOP, y + HEIGHT - BOTTOM

    def x(self, size):
        low, high = math.log(self.sizes[0]), math.log(self.sizes[-1])
        return self.left + (math.log(size) - low) / (high - low) * (self.right - self.left)

    def y(self, time):
        low, high = self.decades[0], self.decades[-1]
        return self.bottom - (math.log10(time) - low) / max(high - low, 1) * (self.bottom - self.top)

    def linear(self, points):
        """Growth in step with the size, from the first point as far as the field goes."""
        (first, time), last = points[0], self.sizes[-1]
        last = min(last, first * 10 ** self.decades[-1] / time)
        return [(self.x(first), self.y(time)), (self.x(last), self.y(time * last / first))]


def draw_axes(field):
    for decade in field.decades:
        y = field.y(10.0**decade)
        yield line([(field.left, y), (field.right, y)], 'stroke="#d8dee4"')
        yield text(field.left - 5, y + 3, time_label(10**decade), "end")
    for size in field.sizes:
        x = field.x(size)
        yield line([(x, field.bottom), (x, field.bottom + 4)], 'stroke="#57606a"')
        yield text(x, field.bottom + 15, size_label(size))


def draw_panel(title, series, x, y):
    field = Field(series, x, y)
    yield text(field.left, y + 16, title, "start", 'font-weight="bold" font-size="12"')
    yield from draw_axes(field)
    own = series.get("Orb") or next(iter(series.values()))
    yield line(field.linear(own), 'stroke="#24292f" stroke-dasharray="1 3"')
    for row, points in series.items():
        style = f'stroke="{colour(row)}" stroke-width="{2.5 if row.startswith("Orb") else 1.3}"'
        style += ' stroke-dasharray="5 3"' if row.startswith("limit") else ""
        yield line([(field.x(size), field.y(time)) for size, time in points], style)
    ends = sorted((field.y(points[-1][1]), row) for row, points in series.items())
    for (_, row), height in zip(ends, spread([end for end, _ in ends])):
        place = field.x(series[row][-1][0])
        yield text(max(place, field.right) + 5, height + 3, row, "start", f'fill="{colour(row)}"')


def draw(panels):
    """`panels`: (title, {row: [(size, ns), ...] in ascending order}), each with two sizes or more."""
    columns = min(COLUMNS, len(panels))
    width, height = columns * WIDTH, -(-len(panels) // columns) * HEIGHT
    parts = [f'<svg xmlns="http://www.w3.org/2000/svg" width="{width}" height="{height}" '
             f'viewBox="0 0 {width} {height}" font-family="sans-serif" font-size="10">',
             '<rect width="100%" height="100%" fill="white"/>']
    for place, (title, series) in enumerate(panels):
        row, column = divmod(place, columns)
        parts += draw_panel(title, series, column * WIDTH, row * HEIGHT)
    return "\n".join([*parts, "</svg>"]) + "\n"
