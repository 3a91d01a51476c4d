"""What playing costs, when nothing is drawn and nobody hears it."""

import programs
import report
import seeking

SLICES = 3
SLICE = 19  # seconds
APART = 20  # so that no slice meets the end of the movie


def measure(settings, movie):
    """A minute, in slices: each program's in turn."""
    times = seeking.picture_times(movie)
    starts = [min(time for time in times if time >= turn * APART) for turn in range(SLICES)]
    player = programs.Player(settings.program("clipsa-bench-player"), movie)
    mpv = programs.Mpv(movie, "--keep-open=yes")
    ours, theirs = [], []
    shown = 0
    try:
        for start in starts:
            for program in (player, mpv):
                program.seek(seeking.just_behind(start))
            before = programs.processor_seconds(player.pid)
            shown += player.play(SLICE)
            ours.append(programs.processor_seconds(player.pid) - before)
            before = programs.processor_seconds(mpv.pid)
            mpv.play(SLICE)
            theirs.append(programs.processor_seconds(mpv.pid) - before)
        dropped = mpv.dropped()
    finally:
        player.close()
        mpv.close()
    report.heading(f"Playing {SLICES} times {SLICE} s without a display: {settings.show(movie)}")
    report.ratio("processor time of a slice", ours, theirs, "s", 2)
    report.ratio("of all slices", [sum(ours)], [sum(theirs)], "s", 2)
    report.note(f"Clipsa showed {shown} pictures; mpv says that it dropped {dropped}")
