"""Installs the built library into a fresh folder and builds and runs a project of its own against it."""
import argparse, os, shutil, subprocess

parser = argparse.ArgumentParser()
parser.add_argument("--cmake", required=True)
parser.add_argument("--cxx", required=True)
parser.add_argument("build")
parser.add_argument("project")
parser.add_argument("stage")
args = parser.parse_args()


def run(*command, **options):
    print("+", *command, flush=True)
    return subprocess.run(command, check=True, **options)


stage = f"{args.stage}-{os.getpid()}"
try:
    prefix, tree = os.path.join(stage, "prefix"), os.path.join(stage, "build")
    run(args.cmake, "--install", args.build, "--prefix", prefix, stdout=subprocess.DEVNULL)
    run(args.cmake, "-G", "Ninja", "-S", args.project, "-B", tree, f"-DCMAKE_PREFIX_PATH={os.path.abspath(prefix)}",
        f"-DCMAKE_CXX_COMPILER={args.cxx}")
    run(args.cmake, "--build", tree)
    answer = run(os.path.join(tree, "consumer"), capture_output=True, text=True).stdout
    print(answer)
    assert "C:\\dir\\file" in answer, answer
finally:
    shutil.rmtree(stage, ignore_errors=True)
