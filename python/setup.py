"""What pyproject.toml cannot say: the compiled part, which stands on the installed library."""

import pathlib
import subprocess

from setuptools import Extension, setup


def installed(*question):
    return subprocess.run(["pkg-config", *question, "KTFiles"], check=True, capture_output=True, text=True).stdout.split()


# Compiled together, which takes a tenth of the time: most of it goes into headers that they share.
unit = pathlib.Path("build/unit.cpp")
unit.parent.mkdir(exist_ok=True)
unit.write_text("".join(f'#include "{source}"\n' for source in sorted(pathlib.Path("binding").glob("*.cpp"))))

setup(
    version=installed("--modversion")[0],
    ext_modules=[
        Extension(
            "ktfiles._core",
            [str(unit)],
            include_dirs=["."],
            extra_compile_args=["-std=c++20", "-O2", "-fvisibility=hidden", *installed("--cflags")],
            extra_link_args=[*installed("--libs"), f"-Wl,-rpath,{installed('--variable=libdir')[0]}"],
        )
    ],
)
