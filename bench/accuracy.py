#!/usr/bin/env python3
"""Tables of how exact measurements are, for docs/program.md: synthetic signals whose answers are known,
measured by the program. Called with the program, prints Markdown."""
import cmath
import json
import math
import os
import random
import struct
import subprocess
import sys
import tempfile

PROGRAM = sys.argv[1] if len(sys.argv) > 1 else "build/bin/wavkit"
random.seed(1)


def array_file(samples):
    """Samples as a NumPy file holds them."""
    head = f"{{'descr': '<f8', 'fortran_order': False, 'shape': ({len(samples)},), }}"
    head = head.ljust(117) + "\n"
    return (b"\x93NUMPY\x01\x00" + struct.pack("<H", len(head)) + head.encode()
            + struct.pack(f"<{len(samples)}d", *samples))


def told(samples, *arguments):
    """What a command prints about these samples."""
    with tempfile.NamedTemporaryFile(suffix=".npy", delete=False) as file:
        file.write(array_file(samples))
    name = file.name
    try:
        return subprocess.run([PROGRAM, arguments[0], name, *arguments[1:]],
                              check=True, capture_output=True).stdout
    finally:
        os.unlink(name)


def measured(samples, *arguments):
    """The first signal of a report about these samples."""
    return json.loads(told(samples, *arguments, "--json"))["signals"][0]


def tone(count, frequency, phase, amplitude=1.0):
    turns = (math.fmod(frequency * n, 1) for n in range(count))
    return [amplitude * math.cos(2 * math.pi * t + phase) for t in turns]


def rms(values):
    return math.sqrt(sum(v * v for v in values) / len(values))


def sine_fits(count=1000, runs=200):
    print("| noise, rms | bound of frequency | fit: frequency | amplitude | phase |"
          " peak: frequency | amplitude |\n|---|---|---|---|---|---|---|")
    for noise in (0.1, 0.001, 0.0):
        fits, peaks = [], []
        for _ in range(runs):
            f, phase = random.uniform(0.02, 0.48), random.uniform(-3, 3)
            x = [v + random.gauss(0, noise) for v in tone(count, f, phase)]
            fit = measured(x, "fit", "--sine")
            peak = measured(x, "spectrum", "--window", "gausstop", "--any-length", "--peaks", "1")
            turn = math.remainder(math.radians(fit["phase"]) - phase, 2 * math.pi)
            fits.append((fit["frequency"] - f, fit["amplitude"] - 1, math.degrees(turn)))
            top = peak["peaks"][0]
            peaks.append((top["frequency"] - f, top["amplitude"] - 1))
        bound = math.sqrt(6) * noise / (math.pi * count ** 1.5)
        row = [f"{noise:g}", f"{bound:.1e}"]
        row += [f"{rms(column):.1e}" for column in [*zip(*fits), *zip(*peaks)]]
        row[4] += "°"
        print("| " + " | ".join(row) + " |")


def distortion(count=16384, runs=20):
    levels = {2: -40, 3: -60, 4: -80, 5: -100}
    print("| window | THD+N of a pure tone | greatest error of -40 dB | -60 dB | -80 dB | -100 dB |"
          " periods at least |\n|---|---|---|---|---|---|---|")
    for window, lobe in (("Hann", 2), ("Blackman_Harris4", 4), ("Kaiser100", 5), ("Gausstop", 5),
                         ("Kaiser120", 6), ("P601", 7)):
        floor, errors = -400.0, {h: 0.0 for h in levels}
        for _ in range(runs):
            f, phase = random.uniform(0.011, 0.09), random.uniform(-3, 3)
            x = tone(count, f, phase)
            pure = measured(x, "distortion", "--window", window, "--harmonics", "5")
            floor = max(floor, -pure["sinad"])
            for h, level in levels.items():
                more = tone(count, h * f, random.uniform(-3, 3), 10 ** (level / 20))
                x = [a + b for a, b in zip(x, more)]
            for line in measured(x, "distortion", "--window", window)["harmonics"]:
                if line["harmonic"] in levels:
                    error = abs(line["level_db"] - levels[line["harmonic"]])
                    errors[line["harmonic"]] = max(errors[line["harmonic"]], error)
        row = [window, f"{floor:.0f} dB"] + [f"{e:.4f} dB" if e >= 1e-4 else "< 0.0001 dB" for e in errors.values()]
        print("| " + " | ".join(row) + f" | {2 * lobe} |")


def converters(count=65536):
    print("| converter | ENOB | SNR | 6.02 bits + 1.76 |\n|---|---|---|---|")
    for bits in (8, 12, 16, 20, 24):
        step = 2.0 ** (1 - bits)
        x = tone(count, 0.0712345, 1)
        x = [step * (math.floor(v * (1 - step / 2) / step) + 0.5) for v in x]
        m = measured(x, "distortion")
        ideal = 20 * bits * math.log10(2) + 10 * math.log10(1.5)
        print(f"| {bits} bits | {m['enob']:.3f} | {m['snr']:.2f} dB | {ideal:.2f} dB |")


def written(samples, *commands):
    """The samples that commands make of these, one of what the other leaves; none where one fails."""
    with tempfile.TemporaryDirectory() as folder:
        path = os.path.join(folder, "0.npy")
        with open(path, "wb") as file:
            file.write(array_file(samples))
        for i, (name, *options) in enumerate(commands, 1):
            target = os.path.join(folder, f"{i}.npy")
            if subprocess.run([PROGRAM, name, path, *options, "-o", target],
                              stderr=subprocess.DEVNULL).returncode:
                return None
            path = target
        with open(path, "rb") as file:
            data = file.read()[128:]
    return struct.unpack(f"<{len(data) // 8}d", data)


def local_polynomials(count=1000):
    print("| order | window | value | slope | curvature |\n|---|---|---|---|---|")
    for order, window in ((2, 5), (3, 21), (4, 101), (9, 101), (15, 201)):
        scale = [random.uniform(-1, 1) / (order + 1) for _ in range(order + 1)]
        errors = []
        for derivative in range(3):
            factors = [math.prod(range(k - derivative + 1, k + 1)) for k in range(order + 1)]
            x = [sum(a * (n / 1000) ** k for k, a in enumerate(scale)) for n in range(count)]
            want = [sum(a * f * (n / 1000) ** (k - derivative)
                        for k, (a, f) in enumerate(zip(scale, factors)) if k >= derivative)
                    for n in range(count)]
            got = written(x, ("smooth", "--window", str(window), "--order", str(order),
                              "--derivative", str(derivative), "--delta", "0.001"))
            errors.append(max(abs(a - b) for a, b in zip(got, want)))
        print(f"| {order} | {window} | " + " | ".join(f"{e:.1e}" for e in errors) + " |")


def outliers(count=100000):
    print("| threshold | outliers found | others taken for some |\n|---|---|---|")
    x = [random.gauss(0, 1) + (10 if n % 100 == 50 else 0) for n in range(count)]
    for threshold in (3, 4, 5):
        found = measured(x, "smooth", "--method", "hampel", "--window", "11",
                         "--threshold", str(threshold))["outliers_at"]
        right = sum(at % 100 == 50 for at in found)
        print(f"| {threshold} | {100 * right / (count / 100):.1f} % "
              f"| {100 * (len(found) - right) / (count * 0.99):.2f} % |")


def frames(count=100000):
    print("| window | hop 256 | hop 512 | hop 1000 |\n|---|---|---|---|")
    x = [random.gauss(0, 1) for _ in range(count)]
    for window in ("uniform", "Hann", "Blackman_Harris4", "Kaiser100", "P601"):
        row = [window]
        for hop in ("256", "512", "1000"):
            options = ("--length", "1024", "--hop", hop, "--window", window)
            back = written(x, ("stft", *options),
                           ("stft", "--inverse", "--points", str(count), *options))
            row.append(f"{max(abs(a - b) for a, b in zip(back, x)):.1e}" if back else "refused")
        print("| " + " | ".join(row) + " |")


def weightings():
    """By tones, without what their beginning excites: of the second half of each."""
    print("| rate | A: to | greatest error | bilinear transform |\n|---|---|---|---|")
    corners = (20.598997, 20.598997, 107.652648, 737.862230, 12194.217148, 12194.217148)

    def analog(f):
        gain = f ** 8
        for c in corners:
            gain /= f * f + c * c
        return 10 * math.log10(gain)

    for rate in (8000, 16000, 44100, 48000, 96000):
        highest, worst, plain = min(20000, 0.45 * rate), 0.0, 0.0
        for step in range(60):
            f = 10 * (highest / 10) ** (step / 59)
            # Whole periods.
            count = 2 * int(rate / 2)
            f = max(2, round(f)) * rate / count
            x = tone(2 * count, f / rate, -math.pi / 2)
            held = [10 ** (measured(part, "levels", "--rate", str(rate))["exposure"] / 10)
                    for part in (x[:count], x)]
            mean_square = (held[1] - held[0]) * rate / count
            error = 10 * math.log10(2 * mean_square) - analog(f) + analog(1000)
            worst = max(worst, abs(error))
            warped = rate / math.pi * math.tan(math.pi * f / rate)
            level = rate / math.pi * math.tan(math.pi * 1000 / rate)
            plain = max(plain, abs(analog(warped) - analog(level) - analog(f) + analog(1000)))
        print(f"| {rate / 1000:g} kHz | {highest / 1000:g} kHz | {worst:.2f} dB | {plain:.1f} dB |")


def orders(runs=20, rate=5000, seconds=10):
    print("| pulses | noise of the tachometer | order | amplitude |\n|---|---|---|---|")
    for pulses, noise in ((1, 0), (1, 1e-3), (4, 0), (4, 1e-3), (60, 0)):
        worst = [0.0, 0.0]
        turned = [10 * n / rate + (n / rate) ** 2 for n in range(rate * seconds)]
        tacho = [math.sin(2 * math.pi * pulses * t) + random.gauss(0, noise) for t in turned]
        for _ in range(runs):
            order = random.uniform(0.5, 20)
            x = [math.cos(2 * math.pi * order * t) for t in turned]
            found = measured_pair(x, tacho, "orders", "--tacho", "2", "--per-revolution", str(pulses),
                                  "--window", "Gausstop", "--revolutions", "16")
            peak = found["peaks"][0]
            worst = [max(worst[0], abs(peak["frequency"] - order)), max(worst[1], abs(peak["amplitude"] - 1))]
        print(f"| {pulses} | {noise:g} | {worst[0]:.1e} | {worst[1]:.1e} |")


def integrals(edge=0.002):
    """Tones under an offset of ten times their size; of the middle, the errors of amplitude and phase."""
    print("| frequency | velocity | displacement | phase |\n|---|---|---|---|")
    count, ends = round(60 / edge), round(14 / edge)
    for f in (edge, 2 * edge, 10 * edge, 0.1, 0.3, 0.45):
        x = [10 + v for v in tone(count, f, 0)]
        row, turns = [], []
        for options in ((), ("--twice",)):
            y = written(x, ("integrate", "--highpass", repr(edge), *options, "--delta", "1"))[ends:-ends]
            fit = measured(y, "fit", "--sine", "--at", repr(f))
            times = 1 + len(options)
            row.append(f"{abs(fit['amplitude'] * (2 * math.pi * f) ** times - 1):.1e}")
            turn = math.radians(fit["phase"]) - 2 * math.pi * f * ends + times * math.pi / 2
            turns.append(abs(math.remainder(turn, 2 * math.pi)))
        print(f"| {f / edge:g} F | {row[0]} | {row[1]} | {max(turns):.1e} |")


def measured_pair(x, y, *arguments):
    """The same of two signals side by side."""
    with tempfile.NamedTemporaryFile("w", suffix=".csv", delete=False) as file:
        file.writelines(f"{a!r},{b!r}\n" for a, b in zip(x, y))
    try:
        report = subprocess.run([PROGRAM, arguments[0], file.name, *arguments[1:], "--rate", "5000", "--json"],
                                check=True, capture_output=True).stdout
    finally:
        os.unlink(file.name)
    return json.loads(report)["signals"][0]


def response(x, y, *arguments):
    """The report about two signals, and the rows of the table: frequency, gain, phase, coherence."""
    with tempfile.TemporaryDirectory() as folder:
        path = os.path.join(folder, "pair.csv")
        with open(path, "w", encoding="ascii") as file:
            file.write("# delta = 1\n" + "".join(f"{a!r},{b!r}\n" for a, b in zip(x, y)))
        call = [PROGRAM, "response", path, *arguments]
        report = subprocess.run([*call, "--json"], check=True, capture_output=True).stdout
        table = subprocess.run([*call, "-o", "-", "--to", "csv"], check=True, capture_output=True).stdout
    rows = [[float(v) for v in line.split(",")] for line in table.decode().splitlines()[1:]]
    return json.loads(report), rows


def responses(count=65536):
    taps, delay = [0.2, 0.6, 0.2], 6  # the delay is that of the middle tap
    x = [random.gauss(0, 1) for _ in range(count + 7)]
    y = [sum(t * x[n + 2 - k] for k, t in enumerate(taps)) for n in range(count)]
    x = x[7:]
    print("| noise in the output | segment | segments | gain | phase | delay, samples |"
          "\n|---|---|---|---|---|---|")
    for noise in (0.0, 0.1, 1.0):
        noisy = [v + random.gauss(0, noise) for v in y]
        for segment in (256, 1024, 4096):
            report, rows = response(x, noisy, "--segment", str(segment))
            gains, phases = [], []
            for f, gain, phase, _ in rows[1:-1]:
                h = 0.6 + 0.4 * math.cos(2 * math.pi * f)
                gains.append(20 * math.log10(gain / h))
                phases.append(math.remainder(phase + 360 * f * delay, 360))
            print(f"| {noise:g} | {segment} | {report['segments']} | {rms(gains):.3f} dB |"
                  f" {rms(phases):.2f}° | {abs(report['delay_samples'] - delay):.4f} |")


def zooms(count=4096, runs=200):
    print("| window | frequency, bins | amplitude |\n|---|---|---|")
    for window in ("Hann", "Blackman_Harris4", "Gausstop", "Flattop", "Kaiser100"):
        worst = [0.0, 0.0]
        for _ in range(runs):
            f = random.uniform(0.05, 0.45)
            low, high = f - random.uniform(1.5, 2.5) / count, f + 2 / count
            x = tone(count, f, random.uniform(-3, 3))
            top = measured(x, "spectrum", "--window", window, "--zoom", repr(low), repr(high),
                           "--peaks", "1")["peaks"][0]
            worst[0] = max(worst[0], abs(top["frequency"] - f) * count)
            worst[1] = max(worst[1], abs(top["amplitude"] - 1))
        print(f"| {window} | {worst[0]:.1e} | {worst[1]:.1e} |")


def sections(settled=60000, count=20000):
    """Tones at the edge of Butterworth's low-pass, which passes the root of a half of them."""
    print("| edge | order 2 | 4 | 8 | 12 | 20 |\n|---|---|---|---|---|---|")
    for edge in (0.1, 0.01, 0.001):
        row = [f"{edge:g} of the rate"]
        for order in (2, 4, 8, 12, 20):
            x = tone(settled + count, edge, 0.3)
            out = told(x, "filter", "--iir", "butter", "--order", str(order), "--lowpass",
                       repr(edge), "--to", "npy")
            y = struct.unpack(f"<{len(x)}d", out[-8 * len(x):])[settled:]
            fit = measured(y, "fit", "--sine", "--at", repr(edge))
            row.append(f"{abs(fit['amplitude'] / math.sqrt(0.5) - 1):.0e}")
        print("| " + " | ".join(row) + " |")


for table in (sine_fits, distortion, converters, responses, zooms, weightings, orders, integrals, local_polynomials,
              outliers, frames, sections):
    table()
    print()
