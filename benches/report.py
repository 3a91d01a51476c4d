"""What the lines of ./bench look like, and the little statistics behind them."""

import math
import os
import statistics


def percentile(values, part):
    """The smallest value that `part` of the values do not exceed."""
    ordered = sorted(values)
    return ordered[max(0, math.ceil(part * len(ordered)) - 1)]


def load():
    return f"load {os.getloadavg()[0]:.1f} on {os.cpu_count()} processors"


def heading(text):
    print(f"\n{text}  [{load()}]", flush=True)


def ratio(name, ours, theirs, unit, digits=0):
    """One line: both medians, their ratio, and the same for p95 where there are enough values to speak of one."""

    def part(what, of):
        a, b = of(ours), of(theirs)
        quotient = "–" if b <= 0 else f"{a / b:.2f}" if a >= 0.1 * b else f"{a / b:.2g}"  # clocks have coarse ticks
        return f"{what} {quotient} ({a:.{digits}f} : {b:.{digits}f} {unit})"

    parts = [part("median" if len(ours) > 1 else "once", statistics.median)]
    if min(len(ours), len(theirs)) >= 10:
        parts.append(part("p95", lambda values: percentile(values, 0.95)))
    count = f"n={len(ours)}" if len(ours) == len(theirs) else f"n={len(ours)}:{len(theirs)}"
    print(f"  {name:<34} {'  '.join(parts)}  {count}", flush=True)


def note(text):
    print(f"    {text}", flush=True)
