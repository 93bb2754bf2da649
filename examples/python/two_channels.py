"""Builds a two-channel tree in Python, configures the simulated "SampleFGen", plots what the
outputs carry (with matplotlib, where it is installed) and saves the configuration.

    PYTHONPATH=build/release/python /usr/bin/python3 examples/python/two_channels.py [out.qzc]
"""
import os
import sys

import numpy as np

import qzivifgen as q

os.environ.setdefault("QZIVI_SESSION_MANAGER", "none")
fgen = q.QZIviFgen()
fgen.LogicalName = "SampleFGen"
fgen.connect_IviWarning(lambda number, source, text: print("warning", number, text))

sine = fgen.Channels.Add("Channel1")
sine.FuncWaveform = q.qzivifgenWaveformSine
sine.FuncFrequency = 1e3
sine.FuncAmplitude = 2.0

square = fgen.Channels.Add("Channel2")
square.FuncWaveform = q.qzivifgenWaveformSquare
square.FuncFrequency = 2.5e3
square.FuncAmplitude = 1.0
square.FuncDCOffset = 0.5
square.FuncDutyCycleHigh = 30.0

fgen.Init()
fgen.Configure()
fgen.Initiate()
step = 1e-6
t = np.arange(3000) * step
outputs = {ch.Name: fgen.RenderOutput(ch.Name, 0.0, step, t.size) for ch in fgen.Channels}
for name, volts in outputs.items():
    print(f"{name}: {volts.min():+.3f} V to {volts.max():+.3f} V")

try:
    import matplotlib

    matplotlib.use("Agg")
    import matplotlib.pyplot as plt

    for name, volts in outputs.items():
        plt.plot(t * 1e3, volts, label=name)
    plt.xlabel("time (ms)")
    plt.ylabel("volts")
    plt.legend()
    plt.savefig("two_channels.png")
    print("plotted two_channels.png")
except ImportError:
    print("matplotlib is not installed: no plot")

file = sys.argv[1] if len(sys.argv) > 1 else "two_channels.qzc"
fgen.Configurations.Add("saved").Export(file)
print("saved", file)
fgen.CloseSession()
