#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""tool_peers.py TOOLS FOLDER [--task NAME] [--rounds N]: times the ovrinresize command beside its peers.

TOOLS is where ovrinresize and make_sample lie. FOLDER gets the inputs, once, the results, and a log of all
runs. In each round every program runs once, one after the other; the table has the medians over all rounds
in the log, and the largest peak of memory.
"""
import argparse
import os
import shutil
import statistics
import subprocess
import sys
import time

PICTURES = 500
FRAMES = 300


def run(words, **options):
    subprocess.run(words, check=True, stdin=subprocess.DEVNULL, **options)


def make_photo(tools, folder):
    """12 megapixels with noise, as a camera's have."""
    sample = f"{folder}/sample.png"
    run([f"{tools}/make_sample", sample], stdout=subprocess.DEVNULL)
    run(["convert", sample, "-resize", "4000x3000!", "-seed", "1", "-attenuate", "0.15",
         "+noise", "Gaussian", "-sampling-factor", "2x2", "-quality", "90", f"{folder}/photo.jpg"])


def make_album(tools, folder):
    """Copies of ten crops of 1600 x 1200."""
    os.makedirs(f"{folder}/album")
    for number in range(PICTURES):
        path = f"{folder}/album/{number:03}.jpg"
        if number < 10:
            run(["convert", f"{folder}/photo.jpg", "-crop", f"1600x1200+{240 * number}+{180 * number}",
                 "+repage", "-quality", "88", path])
        else:
            shutil.copy(f"{folder}/album/{number % 10:03}.jpg", path)


def make_video(tools, folder):
    run(["ffmpeg", "-v", "error", "-y", "-f", "lavfi", "-i", "testsrc2=size=1920x1080:rate=30",
         "-frames:v", str(FRAMES), "-pix_fmt", "yuv420p", f"{folder}/film.y4m"])


def album_commands(tool, folder):
    """Every program writes into a folder of its own; where one takes only one core, two share the work."""
    album = sorted(f"{folder}/album/{name}" for name in os.listdir(f"{folder}/album"))
    halves = "printf '%s\\n' \"$@\" | xargs -P 2 -n 250"
    vips = ["vipsthumbnail", "-s", "200x", "-o", f"{folder}/vips/%s.jpg[Q=90]"]
    mogrify = ["mogrify", "-path", f"{folder}/mogrify", "-resize", "200x", "-quality", "90"]
    return {
        "ovrinresize": [tool, *album, "-s", "200", "-o", f"{folder}/ours/%s.jpg", "--quiet"],
        "ovrinresize --jobs 1": [tool, *album, "-s", "200", "-o", f"{folder}/ours/%s.jpg", "--quiet",
                                 "--jobs", "1"],
        "vipsthumbnail": [*vips, *album],
        "vipsthumbnail, two side by side": ["sh", "-c", f"{halves} {' '.join(vips)}", "sh", *album],
        "mogrify": [*mogrify, *album],
        "mogrify, jpeg:size": ["mogrify", "-define", "jpeg:size=400x300", *mogrify[1:], *album],
        "mogrify, jpeg:size, two side by side": [
            "sh", "-c", f"{halves} mogrify -define jpeg:size=400x300 {' '.join(mogrify[1:])}", "sh", *album],
        "ffmpeg": ["ffmpeg", "-v", "error", "-y", "-i", f"{folder}/album/%03d.jpg", "-vf", "scale=200:-1",
                   "-q:v", "3", f"{folder}/ffmpeg/%03d.jpg"],
    }


def photo_commands(tool, folder):
    photo = f"{folder}/photo.jpg"
    return {
        "ovrinresize": [tool, photo, f"{folder}/ours/photo.jpg", "-s", "400x300"],
        "ovrinresize --threads 1": [tool, photo, f"{folder}/ours/photo.jpg", "-s", "400x300",
                                    "--threads", "1"],
        "vipsthumbnail": ["vipsthumbnail", photo, "-s", "400x300", "-o", f"{folder}/vips/photo.jpg[Q=90]"],
        "convert": ["convert", photo, "-resize", "400x300", "-quality", "90",
                    f"{folder}/mogrify/photo.jpg"],
        "convert, jpeg:size": ["convert", "-define", "jpeg:size=800x600", photo, "-resize", "400x300",
                               "-quality", "90", f"{folder}/mogrify/photo.jpg"],
        "ffmpeg": ["ffmpeg", "-v", "error", "-y", "-i", photo, "-vf", "scale=400:300", "-q:v", "3",
                   f"{folder}/ffmpeg/photo.jpg"],
    }


def video_commands(tool, folder):
    film = f"{folder}/film.y4m"
    ffmpeg = ["ffmpeg", "-v", "error", "-y", "-i", film, "-vf"]
    into = ["-f", "yuv4mpegpipe", f"{folder}/ffmpeg/film.y4m"]
    return {
        "ovrinresize": [tool, film, f"{folder}/ours/film.y4m", "-s", "640x360"],
        "ovrinresize --engine thumbnail": [tool, film, f"{folder}/ours/film.y4m", "-s", "640x360",
                                           "-e", "thumbnail"],
        "ffmpeg": [*ffmpeg, "scale=640:360", *into],
        "ffmpeg, fast_bilinear": [*ffmpeg, "scale=640:360:flags=fast_bilinear", *into],
    }


TASKS = {
    "photo": ("photo.jpg", make_photo, photo_commands),
    "album": ("album", make_album, album_commands),
    "video": ("film.y4m", make_video, video_commands),
}


def measured(words):
    """Seconds, and the peak of memory in megabytes, of a program or of the largest of its children."""
    start = time.monotonic()
    process = subprocess.Popen(words, stdin=subprocess.DEVNULL)
    _, status, usage = os.wait4(process.pid, 0)
    seconds = time.monotonic() - start
    if status != 0:
        sys.exit(f"failed: {' '.join(words[:8])}")
    return seconds, usage.ru_maxrss / 1000


def print_table(log):
    runs = {}
    with open(log, encoding="utf-8") as file:
        for line in file:
            task, name, seconds, megabytes = line.rstrip("\n").split("\t")
            runs.setdefault((task, name), []).append((float(seconds), float(megabytes)))
    for (task, name), values in sorted(runs.items(), key=lambda item: list(TASKS).index(item[0][0])):
        seconds = [value[0] for value in values]
        print(f"{task:<6} {name:<37} {statistics.median(seconds):8.3f} s   "
              f"({min(seconds):.3f} to {max(seconds):.3f}, {len(seconds)} runs) "
              f"{max(value[1] for value in values):7.0f} MB")


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("tools")
    parser.add_argument("folder")
    parser.add_argument("--task", choices=TASKS, action="append")
    parser.add_argument("--rounds", type=int, default=5)
    arguments = parser.parse_args()
    folder = arguments.folder
    for name in ("ours", "vips", "mogrify", "ffmpeg"):
        os.makedirs(f"{folder}/{name}", exist_ok=True)
    for task in TASKS:  # an album is made of the photograph
        needed = not arguments.task or task in arguments.task or task == "photo"
        if needed and not os.path.exists(f"{folder}/{TASKS[task][0]}"):
            TASKS[task][1](arguments.tools, folder)
    log = f"{folder}/runs.log"
    for task in arguments.task or TASKS:
        commands = TASKS[task][2](f"{arguments.tools}/ovrinresize", folder)
        for _ in range(arguments.rounds):
            for name, words in commands.items():
                seconds, megabytes = measured(words)
                with open(log, "a", encoding="utf-8") as file:
                    file.write(f"{task}\t{name}\t{seconds}\t{megabytes}\n")
    if os.path.exists(log):
        print_table(log)


main()
