"""The most memory that a long 4K movie takes: opened, sought in, scrubbed and played."""

import programs
import report
import seeking

SEEKS = 10
PLAYED = 5  # seconds


def measure(settings, movie):
    times = seeking.picture_times(movie)
    places = [seeking.just_behind(settings.random.choice(times[:-200])) for _ in range(SEEKS)]
    scrubbed = [seeking.just_behind(time) for time in times[1000:1100:2]]

    def peak(program):
        try:
            for place in places + scrubbed:
                program.seek(place)
            program.play(PLAYED)
            return programs.memory_peak(program.pid)
        finally:
            program.close()

    ours = peak(programs.Player(settings.program("clipsa-bench-player"), movie))
    theirs = peak(programs.Mpv(movie))
    report.heading(f"Memory, {SEEKS} seeks, {len(scrubbed)} steps and {PLAYED} s of playing: {settings.show(movie)}")
    report.ratio("peak resident (VmHWM)", [ours[0]], [theirs[0]], "MiB")
    report.ratio("of that, at the end, not files", [ours[1]], [theirs[1]], "MiB")
