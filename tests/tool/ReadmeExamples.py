#!/usr/bin/env python3
"""Runs the README's examples as a reader would paste them.

    ReadmeExamples.py README.md BIN_DIR

Every ```sh block of the README runs, in order, in one bash shell that stops at the first
failing line; ```console and ```text blocks show, they are not run. The shell starts in a
scratch folder laid out like a clone after scripts/demo: build/release/bin is the tested
build's program folder and tests/ is the clone's, so the README's own PATH line is what
finds `venlomer`. `venlomer edit` serves until stopped: it gets five seconds, then Ctrl-C.
"""
import os
import pathlib
import re
import subprocess
import sys
import tempfile


def script_of(readme):
    blocks = re.findall(r"^```sh\n(.*?)^```", readme.read_text(encoding="utf-8"), re.M | re.S)
    if not blocks:
        sys.exit(f"{readme}: no ```sh block to run")
    lines = []
    for block in blocks:
        for line in block.splitlines():
            if line.startswith("venlomer edit "):
                # Serving for five seconds is the success; any earlier exit is a failure.
                line = f"timeout -s INT 5 {line} && exit 1 || test $? -eq 124"
            lines.append(line)
    return "\n".join(lines) + "\n"


def main():
    readme, bin_dir = pathlib.Path(sys.argv[1]).resolve(), pathlib.Path(sys.argv[2]).resolve()
    script = script_of(readme)
    with tempfile.TemporaryDirectory(prefix="venlomer-readme-") as scratch:
        root = pathlib.Path(scratch)
        (root / "build" / "release").mkdir(parents=True)
        (root / "build" / "release" / "bin").symlink_to(bin_dir)
        (root / "tests").symlink_to(readme.parent / "tests")
        env = dict(os.environ)
        # A venlomer already on the PATH must not stand in for the one the README puts there.
        env["PATH"] = os.pathsep.join(
            p for p in env.get("PATH", "").split(os.pathsep) if not (pathlib.Path(p) / "venlomer").exists()
        )
        result = subprocess.run(
            ["bash", "-c", "PS4='$ '\nset -euo pipefail -x\n" + script], cwd=root, env=env, timeout=300
        )
        return result.returncode


if __name__ == "__main__":
    sys.exit(main())
