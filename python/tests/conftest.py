"""What the package's tests share: the project's samples and the built veltmarquist tool."""
import os
import shutil
from pathlib import Path

import pytest

PROJECT = Path(__file__).resolve().parents[2]
SAMPLES = PROJECT / "samples"
REAL_DATA = PROJECT.parent / "shared" / "data" / "APTEC_PC10_CardBoard_2023_v1_Spectral.txt"


@pytest.fixture(scope="session")
def tool():
    """The tool whose files the package must reproduce: $VELTMARQUIST_TOOL, else the dev build's."""
    path = os.environ.get("VELTMARQUIST_TOOL") or PROJECT / "build" / "dev" / "tools" / "veltmarquist"
    if not Path(path).is_file() and not shutil.which(str(path)):
        pytest.skip(f"no veltmarquist tool at {path}: set VELTMARQUIST_TOOL (scripts/stages/80-python.sh does)")
    return str(path)
