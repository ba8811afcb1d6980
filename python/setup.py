"""What pyproject.toml cannot say: the compiled part, which stands on the installed library."""

import pathlib
import subprocess

from setuptools import Extension, setup


def installed(*question):
    return subprocess.run(["pkg-config", *question, "KTFiles"], check=True, capture_output=True, text=True).stdout.split()


setup(
    version=installed("--modversion")[0],
    ext_modules=[
        Extension(
            "ktfiles._core",
            sorted(str(source) for source in pathlib.Path("binding").glob("*.cpp")),
            include_dirs=["."],
            extra_compile_args=["-std=c++20", "-O2", "-fvisibility=hidden", *installed("--cflags")],
            extra_link_args=[*installed("--libs"), f"-Wl,-rpath,{installed('--variable=libdir')[0]}"],
        )
    ],
)
