#!/usr/bin/env python3
"""Runs a video or a camera through an effect, with OpenCV reading and writing.

    opencv_effect.py INPUT OUTPUT.avi EFFECT [NAME=VALUE...]

INPUT is a file, or the number of a camera: opencv_effect.py 0 out.avi dreamy degree=20
"""

import sys

import cv2
import kyvdsp


def value_of(text):
    """A number where it is one; labels and colors stay text."""
    try:
        return float(text)
    except ValueError:
        return text


def main():
    if len(sys.argv) < 4:
        sys.exit(__doc__)
    source, target, effect, *settings = sys.argv[1:]
    capture = cv2.VideoCapture(int(source) if source.isdigit() else source)
    if not capture.isOpened():
        sys.exit(f"{source} cannot be opened")
    width = int(capture.get(cv2.CAP_PROP_FRAME_WIDTH))
    height = int(capture.get(cv2.CAP_PROP_FRAME_HEIGHT))
    rate = capture.get(cv2.CAP_PROP_FPS) or 25
    count = max(capture.get(cv2.CAP_PROP_FRAME_COUNT), 0)  # a camera has none: no fade at the end
    parameters = {name: value_of(value) for name, _, value in (s.partition("=") for s in settings)}

    writer = cv2.VideoWriter(target, cv2.VideoWriter_fourcc(*"MJPG"), rate, (width, height))
    with kyvdsp.Effect(effect, width, height, duration=count / rate, **parameters) as e:
        number = 0
        while True:
            taken, frame = capture.read()
            if not taken:
                break
            frame = cv2.cvtColor(frame, cv2.COLOR_BGR2BGRA)
            e.render(frame, position=number / rate, out=frame)
            writer.write(cv2.cvtColor(frame, cv2.COLOR_BGRA2BGR))
            number += 1
    writer.release()
    if not number:
        sys.exit(f"{source} has no frames")
    print(f"{number} frames of {width} x {height} in {target}")


if __name__ == "__main__":
    main()
