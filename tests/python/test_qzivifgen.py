"""The control from Python: the road of one request, errors as exceptions, events, numpy points,
and .qzc files shared with the C++ side."""
import os
import subprocess
import sys

import numpy as np
import pytest

import qzivifgen as q

QZFGEN = os.environ.get("QZFGEN", "qzfgen")


def square_on_channel1(fgen):
    ch = fgen.Channels.Add("Channel1")
    ch.FuncWaveform = q.qzivifgenWaveformSquare
    ch.FuncFrequency = 2.5e3
    ch.FuncAmplitude = 3.0
    return ch


def test_one_request_reaches_the_simulator_and_its_output(tmp_path, monkeypatch):
    trace = tmp_path / "trace.log"
    monkeypatch.setenv("QZIVI_TRACE", str(trace))
    fgen = q.QZIviFgen()
    square_on_channel1(fgen)
    fgen.Init()
    fgen.Configure()
    calls = [line for line in trace.read_text().splitlines()
             if line.startswith("IviFgen_ConfigureStandardWaveform(")]
    assert len(calls) == 1
    assert '"Channel1", 2, 3, 0, 2500, 0' in calls[0]
    fgen.Initiate()
    volts = fgen.RenderOutput("Channel1", 0.0, 1e-6, 800)  # two periods
    assert isinstance(volts, np.ndarray) and volts.dtype == np.float64 and volts.shape == (800,)
    assert sorted(set(np.round(volts, 9))) == [-1.5, 1.5]
    assert abs(volts.mean()) < 0.01
    fgen.CloseSession()
    assert fgen.SessionHandle == 0


def test_failures_are_exceptions_with_number_source_and_text():
    fgen = q.QZIviFgen()
    fgen.Channels.Add("Channel1")
    with pytest.raises(q.QZIviFgenError) as caught:
        fgen.Channels.Item(9)
    assert caught.value.number == -31624
    assert "does not exist" in caught.value.description
    assert caught.value.source.endswith("Item")
    assert caught.value.description.endswith("(QZIviFgen.Channels.Item)")  # where, from the top
    fgen.LogicalName = "NoSuchGenerator"
    with pytest.raises(q.QZIviFgenError) as caught:
        fgen.Init()
    assert caught.value.number < 0 and "NoSuchGenerator" in caught.value.description
    # Python's own kinds of error for Python's own mistakes.
    with pytest.raises(TypeError, match="FuncFrequency takes a number"):
        fgen.Channels[0].FuncFrequency = "fast"
    with pytest.raises(TypeError, match="OutputMode takes a whole number"):
        fgen.OutputMode = 1.5
    with pytest.raises(ValueError, match="beyond a 32-bit number"):
        fgen.Channels[0].BurstCount = 2**40
    with pytest.raises(KeyError):
        fgen.Channels["Channel9"]
    with pytest.raises(IndexError):
        fgen.Channels[3]
    assert fgen.Channels[-1].Name == "Channel1" and "Channel1" in fgen.Channels
    assert repr(fgen) == "<QZIviFgen NoSuchGenerator>"
    assert repr(fgen.Channels[0]) == "<QZIviFgenChannel Channel1>"


@pytest.mark.filterwarnings("ignore::pytest.PytestUnraisableExceptionWarning")
def test_events_take_callables():
    fgen = q.QZIviFgen()
    fgen.ExceptionOnError = False
    errors, configured, initialized = [], [], []
    fgen.connect_IviError(lambda number, source, text: errors.append((number, text)))
    handle = fgen.connect_Configured(lambda: configured.append(True))
    fgen.connect_Initialized(lambda: initialized.append(True))
    fgen.Configure()  # no channels: refused, as an event
    assert errors and errors[0][0] == -31620
    square_on_channel1(fgen)
    fgen.Configure()
    assert initialized and len(configured) == 1
    fgen.disconnect(handle)
    fgen.connect_Configured(lambda: 1 / 0)  # a failing handler does not stop the control
    fgen.Configure()
    assert len(configured) == 1


def test_points_from_numpy_and_from_a_data_file(tmp_path):
    fgen = q.QZIviFgen()
    held = fgen.Waveforms.Add("Held")
    held.Data = np.arange(16)  # integers are taken as float64
    assert np.array_equal(held.Data, np.arange(16, dtype=np.float64))
    assert not held.Data.flags.writeable
    with pytest.raises(ValueError):
        held.Data = np.zeros((2, 8))
    data = tmp_path / "ramp.txt"
    data.write_text("\n".join(str(v) for v in np.linspace(0, 2, 11)) + "\n")
    from_file = fgen.Waveforms.Add("Ramp", q.qzivifgenASCIIFile, str(data), q.qzivifgenNormalize)
    assert np.allclose(from_file.GetDataSample(), np.linspace(0, 1, 11))
    # A sample is normalised over its own points: 0.4, 1.0 and 1.6 by their peak.
    assert np.allclose(from_file.GetDataSample(2, 3, 3), np.array([0.4, 1.0, 1.6]) / 1.6)
    assert from_file.DataSize == 11


def test_a_qzc_goes_from_python_to_cpp_and_back(tmp_path):
    fgen = q.QZIviFgen()
    square_on_channel1(fgen).FuncDutyCycleHigh = 20.0
    written = tmp_path / "from-python.qzc"
    fgen.Configurations.Add("saved").Export(str(written))
    run = subprocess.run([QZFGEN, "configure", str(written)], capture_output=True, text=True)
    assert run.returncode == 0, run.stderr
    assert "Channel1: Square 2.500 kHz, 3.000 Vpp, offset 0.000 V, duty 20 %" in run.stdout

    from_cpp = tmp_path / "from-cpp.qzc"
    run = subprocess.run([QZFGEN, "export", str(from_cpp), "--waveform", "triangle",
                          "--frequency", "7k"], capture_output=True, text=True)
    assert run.returncode == 0, run.stderr
    loaded = q.QZIviFgen()
    loaded.Configurations.Add("cpp", str(from_cpp)).Load()
    assert [c.Name for c in loaded.Channels] == ["Channel1", "Channel2"]
    assert all(c.FuncWaveform == q.qzivifgenWaveformTriangle for c in loaded.Channels)
    assert loaded.Channels["Channel2"].FuncFrequency == 7000.0


def test_a_sequence_built_in_python_plays_in_order():
    fgen = q.QZIviFgen()
    fgen.Extensions = fgen.Extensions | q.qzivifgenArbWfmExt | q.qzivifgenArbSeqExt
    fgen.OutputMode = q.qzivifgenOutputSeq
    fgen.ArbSampleRate = 1e6
    low, high = fgen.Waveforms.Add("Low"), fgen.Waveforms.Add("High")
    low.Data = np.full(8, 0.25)
    high.Data = np.full(8, 0.75)
    seq = fgen.Sequences.Add("Train")
    seq.Add(high, 1)
    seq.Add(low, 2)
    ch = fgen.Channels.Add("Channel1")
    ch.Sequence = seq
    ch.ArbGain = 1.0
    fgen.Init()
    fgen.Configure()
    fgen.Initiate()
    volts = fgen.RenderOutput("Channel1", 0.5e-6, 1e-6, 24)
    assert np.array_equal(volts, np.r_[np.full(8, 0.75), np.full(16, 0.25)])
    assert [item.Iterations for item in seq] == [1, 2]


def test_the_python_example_runs_and_saves(tmp_path):
    example = os.path.join(os.path.dirname(__file__), "..", "..", "examples", "python",
                           "two_channels.py")
    saved = tmp_path / "example.qzc"
    run = subprocess.run([sys.executable, example, str(saved)], capture_output=True, text=True,
                         cwd=tmp_path)
    assert run.returncode == 0, run.stderr
    assert "Channel2: +0.000 V to +1.000 V" in run.stdout
    assert saved.read_bytes().startswith(b"QZIviFgen")
