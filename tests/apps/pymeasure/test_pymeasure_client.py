"""A client nobody here wrote: PyMeasure's driver for the 33500 series, over pyvisa-py's raw
socket on the loopback address, drives the emulator; the emulator's rendered output shows what
reached the simulator."""
import os
import subprocess

import pytest
from pymeasure.adapters import VISAAdapter
from pymeasure.instruments.agilent import Agilent33500


@pytest.fixture
def emulator(tmp_path):
    env = dict(os.environ, XDG_CONFIG_HOME=str(tmp_path), QZIVI_SESSION_MANAGER="none")
    env.pop("QZIVI_CONFIG_STORE", None)
    process = subprocess.Popen([os.environ["QZFGEN_EMU"], "--port", "0"], env=env,
                               stdout=subprocess.PIPE, text=True)
    port = int(process.stdout.readline())
    adapter = VISAAdapter(f"TCPIP::127.0.0.1::{port}::SOCKET", visa_library="@py",
                          read_termination="\n", write_termination="\n", timeout=5000)
    generator = Agilent33500(adapter)
    yield generator
    adapter.connection.close()
    process.terminate()
    process.wait(5)


def render(generator, count, step, channel=1):
    return [float(v) for v in generator.ask(f"SOUR{channel}:EMUL:REND? 0,{step},{count}").split(",")]


def errors(generator):
    return generator.check_errors()


def test_shape_frequency_amplitude_offset_load_and_output(emulator):
    g = emulator
    assert g.id[1] == "33522B"  # a two-channel model of the series
    g.shape = "SQU"
    g.frequency = 2e3
    g.amplitude = 2
    g.offset = 0.5
    g.output_load = 50
    g.output = True
    assert errors(g) == []
    assert g.shape == "SQU"
    assert g.frequency == pytest.approx(2e3)
    assert g.amplitude == pytest.approx(2)
    assert g.offset == pytest.approx(0.5)
    assert g.output in (True, "on", "ON")  # PyMeasure names the instrument's 1 by a key of its map
    # A 2 kHz square between -0.5 and 1.5 V: high for the first half period.
    assert render(g, 6, 1e-4) == [1.5, 1.5, 1.5, -0.5, -0.5, 1.5]
    g.shape = "SIN"
    # A sine from its start phase: the offset, then the crest a quarter period on.
    assert render(g, 2, 1.25e-4) == pytest.approx([0.5, 1.5])


def test_a_refused_value_reaches_the_error_queue(emulator):
    g = emulator
    g.write("VOLT 100")
    assert any("-222" in e for e in errors(g))
    assert g.amplitude == pytest.approx(0.1)


def test_burst_on_the_bus_trigger(emulator):
    g = emulator
    g.shape = "SQU"
    g.frequency = 1e3
    g.output = True
    g.trigger_source = "BUS"
    g.burst_ncycles = 3
    g.burst_mode = "TRIG"
    g.burst_state = True
    assert errors(g) == []
    assert g.burst_state is True
    assert g.burst_ncycles == 3
    assert render(g, 3, 1e-4) == [0.0, 0.0, 0.0]  # idle until triggered
    g.trigger()
    assert errors(g) == []


def test_an_arbitrary_waveform_upload_plays(emulator):
    g = emulator
    points = [0, 8192, 16384, 24576, 32767, 16384, 0, -16384]
    g.shape = "ARB"
    g.arb_srate = 1e4
    g.data_volatile_clear()
    g.data_arb("ramp", points, data_format="DAC")
    g.arb_file = "ramp"
    g.output = True
    assert errors(g) == []
    assert g.arb_file.strip('"') == "RAMP"
    assert render(g, 8, 1e-4) == pytest.approx([p / 32767 for p in points], abs=1e-6)
    g.data_arb("fl", [0, 0.5, 1, 0.5, 0, -0.5, -1, -0.5], data_format="float")
    g.arb_file = "fl"
    assert errors(g) == []
    assert render(g, 8, 1e-4) == pytest.approx([0, 0.5, 1, 0.5, 0, -0.5, -1, -0.5], abs=1e-6)
