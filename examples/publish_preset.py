#!/usr/bin/env python2.7
"""Publishes an adjustment preset to the community service, with a progress bar.

Signs in, lists the preset categories, makes a preset file and twelve preview
images on the spot, and uploads them. On a terminal the progress bar is
redrawn in place; into a log or a pipe it writes a line per tenth of the upload.
Ctrl-C cancels the upload.

    publish_preset.py [--account NAME] [--password PW] [--preset-mb N]
"""
import argparse
import os
import shutil
import signal
import struct
import sys
import tempfile
import time
import zlib

from PyUploader import OBLoginData, PyPresetUploader

VERSION = u"5.0"
VERSION_TYPE = u"Retail"
MACHINE_ID = u"7f3c2a10-demo-0000-0000-000000000001"
BAR_WIDTH = 40
TEXT = type(u"")


def argument_text(value):
    """A command-line argument as text: 2.7 gives bytes, Python 3 text already."""
    return value if isinstance(value, TEXT) else value.decode("utf-8")


def output_text(text):
    """Text for an output stream: 2.7's take UTF-8 bytes, Python 3's take text."""
    return text if str is TEXT else text.encode("utf-8")


def png_bytes(width, height):
    """A valid RGB PNG of noise: stored uncompressed, so its size is predictable."""
    def chunk(kind, data):
        body = kind + data
        return struct.pack(">I", len(data)) + body + struct.pack(">I", zlib.crc32(body) & 0xFFFFFFFF)
    rows = b"".join(b"\x00" + os.urandom(width * 3) for _ in range(height))
    header = struct.pack(">IIBBBBB", width, height, 8, 2, 0, 0, 0)
    return (b"\x89PNG\r\n\x1a\n" + chunk(b"IHDR", header)
            + chunk(b"IDAT", zlib.compress(rows, 0)) + chunk(b"IEND", b""))


def make_preset(folder, preset_mb):
    """Writes a preset file and twelve images; returns their paths."""
    preset = os.path.join(folder, u"Golden hour.preset")
    with open(preset, "wb") as f:
        f.write(b'<?xml version="1.0" encoding="utf-8"?>\n<preset name="Golden hour">\n'
                b'  <exposure>0.35</exposure><contrast>12</contrast><warmth>18</warmth>\n'
                b'</preset>\n')
        f.write(b"\n" * (preset_mb * 1024 * 1024))
    images = []
    for number in range(1, 13):
        path = os.path.join(folder, u"preview_%02d.png" % number)
        with open(path, "wb") as f:
            f.write(png_bytes(320, 320))
        images.append(path)
    return preset, images


def bar_text(percent, status):
    filled = BAR_WIDTH * max(0, min(percent, 100)) // 100
    return "[%s%s] %3d%%  %s" % ("#" * filled, "." * (BAR_WIDTH - filled), percent, status)


def time_left(half_seconds_left):
    return "about %ds left for this file" % ((half_seconds_left + 1) // 2)


class TerminalBar(object):
    """One line redrawn in place; the rest of the line is cleared each time, so
    a shorter text leaves nothing of a longer one behind."""

    CLEAR_TO_END = "\x1b[K"

    def __init__(self, out):
        self.out = out
        self.percent = None
        self.cancelling = False

    def progress(self, percent, half_seconds_left):
        self.percent = percent
        self.draw(time_left(half_seconds_left))

    def cancel(self):
        self.cancelling = True
        self.draw(None)

    def draw(self, status):
        if self.cancelling:
            status = "Cancelling..."
        self.out.write("\r" + bar_text(self.percent or 0, status) + self.CLEAR_TO_END)
        self.out.flush()

    def outcome(self, line):
        if self.percent is not None:
            self.out.write("\n")
        self.out.write(line + "\n")
        self.out.flush()


class LogLines(object):
    """For a log or a pipe: a line each time the upload enters the next tenth."""

    def __init__(self, out):
        self.out = out
        self.tenth = None

    def progress(self, percent, half_seconds_left):
        tenth = max(0, min(percent, 100)) // 10
        if self.tenth is None or tenth > self.tenth:
            self.tenth = tenth
            self.line(bar_text(percent, time_left(half_seconds_left)))

    def cancel(self):
        self.line("Cancelling...")

    def outcome(self, line):
        self.line(line)

    def line(self, text):
        self.out.write(text + "\n")
        self.out.flush()


class ProgressReport(object):
    """Receives the uploader's reports on this (the main) thread."""

    def __init__(self, display):
        self.display = display
        self.done = False
        self.success = False
        self.url = u""
        self.error = u""

    def __call__(self, kind, event, percent, *rest):
        if event == u"ProgressChanged":
            self.display.progress(percent, rest[0])
        elif event == u"UploadComplete":
            self.done = True
            self.success, self.url, self.error = bool(rest[0]), rest[1], rest[2]
            if self.success:
                self.display.progress(percent, 0)


def sign_in(args):
    session = OBLoginData(VERSION, VERSION_TYPE, MACHINE_ID)
    if not session.LoginOrbishare(argument_text(args.account), argument_text(args.password)):
        sys.exit("Sign-in failed: check the account and the service.")
    print(u"Signed in as %s on %s" % (session.GetUserName(), session.GetServerUrl()))
    return session


def choose_category(session):
    categories = session.GetPresetCategory(u"ENU") or {}
    # Numeric ids in number order before the others, as 2.7 orders int and text.
    for category_id in sorted(categories, key=lambda k: (0, int(k)) if k.isdigit() else (1, k)):
        print(u"  category %s: %s" % (category_id, categories[category_id]))
    return sorted(categories)[0] if categories else u""


def wait_for(report, uploader):
    """Runs Python on the main thread until the completion report has arrived;
    returns whether a cancel was asked for.

    Ctrl-C only notes the wish to cancel: an interrupt raised anywhere else, in
    the middle of a report for instance, could lose the completion."""
    interrupts = []
    previous = signal.signal(signal.SIGINT, lambda number, frame: interrupts.append(number))
    try:
        cancelled = False
        while not report.done:
            time.sleep(0.05)  # reports are delivered between Python instructions
            if interrupts and not cancelled:
                cancelled = True
                report.display.cancel()
                uploader.CancelUpload()
        return cancelled
    finally:
        signal.signal(signal.SIGINT, previous)


def outcome_line(report, cancelled):
    """What became of the upload. The completion report tells success and the
    service's error text; a failure without one, after Ctrl-C, is the cancel."""
    if report.success:
        return u"Published: %s" % report.url
    if report.error:
        return u"Failed: %s" % report.error
    if cancelled:
        return u"Cancelled"
    return u"Failed: no reason was reported (the service could not be reached or sent none)"


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--account", default="demo@example.org")
    parser.add_argument("--password", default="s3cret & more")
    parser.add_argument("--preset-mb", type=int, default=64,
                        help="padding of the preset file, so the progress is worth watching")
    args = parser.parse_args()

    session = sign_in(args)
    category = choose_category(session)
    folder = tempfile.mkdtemp(prefix="preset-")
    try:
        preset, images = make_preset(folder, args.preset_mb)
        uploader = PyPresetUploader(session.GetServerUrl(), session.GetLoginTokenID(),
                                    VERSION, VERSION_TYPE, MACHINE_ID)
        display = TerminalBar(sys.stdout) if sys.stdout.isatty() else LogLines(sys.stdout)
        report = ProgressReport(display)
        uploader.SetCallback(report)
        if not uploader.StartUpload(preset, images, u"golden-hour", u"Golden hour",
                                    category, u"warm,sunset", u"Soft warm light for evenings"):
            sys.exit("The upload could not be started.")
        cancelled = wait_for(report, uploader)
    finally:
        shutil.rmtree(folder, ignore_errors=True)

    display.outcome(output_text(outcome_line(report, cancelled)))
    return 0 if report.success else 1


if __name__ == "__main__":
    sys.exit(main())
