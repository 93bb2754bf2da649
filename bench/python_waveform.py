"""Points between numpy and the control, against a numpy copy of the same array in the same run.

    PYTHONPATH=build/release/python /usr/bin/python3 bench/python_waveform.py

Prints the best of several runs of each, and each one's ratio to the copy.
"""
import os
import time

import numpy as np

import qzivifgen as q

POINTS = 10_000_000
RUNS = 7


def best(action):
    times = []
    for _ in range(RUNS):
        start = time.perf_counter()
        action()
        times.append(time.perf_counter() - start)
    return min(times)


def main():
    os.environ.setdefault("QZIVI_SESSION_MANAGER", "none")
    points = np.sin(np.linspace(0, 200 * np.pi, POINTS))
    fgen = q.QZIviFgen()
    fgen.Extensions = fgen.Extensions | q.qzivifgenArbWfmExt
    fgen.OutputMode = q.qzivifgenOutputArb
    fgen.ArbSampleRate = 100e6
    waveform = fgen.Waveforms.Add("Big")
    channel = fgen.Channels.Add("Channel1")
    channel.ArbWaveform = waveform
    channel.ArbGain = 1.0

    copy = best(lambda: np.copy(points))
    # The waveform keeps its points until new ones replace them; a copy kept the same way.
    held = {}

    def keep():
        held["copy"] = np.copy(points)
    kept = best(keep)

    def put():
        waveform.Data = points
    into = best(put)
    out = best(lambda: waveform.Data)
    # The simulated instrument takes 4 Mi points a waveform unless told otherwise.
    fgen.Init(OptionString="DriverSetup=MaxWaveformSize=10000000")
    fgen.Configure()
    fgen.Initiate()
    render = best(lambda: fgen.RenderOutput("Channel1", 0.0, 1e-8, POINTS))
    rendered = fgen.RenderOutput("Channel1", 0.0, 1e-8, POINTS)
    assert rendered.shape == (POINTS,)
    print(f"{POINTS:,} points, best of {RUNS}:")
    for name, seconds in [("numpy copy", copy), ("numpy copy, kept until the next", kept),
                          ("waveform.Data = array", into),
                          ("waveform.Data (read)", out),
                          ("RenderOutput (synthesis included)", render)]:
        print(f"  {name:36s} {seconds * 1e3:8.2f} ms  {seconds / copy:6.2f} x the copy")


if __name__ == "__main__":
    main()
