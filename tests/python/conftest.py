"""Each test on a store of its own: the machine's store and trace settings stay out."""
import pytest


@pytest.fixture(autouse=True)
def private_store(tmp_path, monkeypatch):
    monkeypatch.setenv("XDG_CONFIG_HOME", str(tmp_path / "config"))
    monkeypatch.delenv("QZIVI_CONFIG_STORE", raising=False)
    monkeypatch.delenv("QZIVI_TRACE", raising=False)
    monkeypatch.setenv("QZIVI_SESSION_MANAGER", "none")
    return tmp_path
