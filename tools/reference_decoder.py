"""A second decoder of the controller's reports, slow and plain, against which the first one is held.

Written from the descriptions of the reports with offsets and texts of its own; it shares nothing with the C++ code.
"""

import math
import struct

from reference_catalogue import (BLOB_COUNTER_BLOCKS, BLOB_EVENTS, BLOB_OPTION_BLOCKS, BLOBS, COUNTER_BLOCKS, EVENTS,
                                 GLOBALS, LEVELS, PRESENCE_BITS, option_byte)

INPUT_REPORTS = {0x76: 792, 0x77: 2064}
FEATURE_REPORTS = {0xA2: 193, 0xA9: 49, 0xD0: None, 0xD2: None, 0xDC: 25, 0xDE: 2, 0xDF: 25, 0xE0: 7, 0xE1: 1023,
                   0xE2: 241, 0xE3: 57, 0xE4: 401, 0xE5: 401, 0xEA: 1023, 0xEC: 193}
REPORTS = INPUT_REPORTS | FEATURE_REPORTS  # ID: bytes, the ID included; None for a text


class F32(float):
    """A number that came as a single-precision float; `bits` keeps what a double cannot, the sign of a NaN."""

    def __new__(cls, bits):
        number = super().__new__(cls, struct.unpack("<f", struct.pack("<I", bits))[0])
        number.bits = bits
        return number

    def printed(self, form):
        """As C prints it, where a NaN has a sign too."""
        if math.isnan(self) and self.bits >> 31:
            return (form % -math.inf).replace("inf", "nan")
        return form % self


class Reader:
    """Little-endian fields by offset; whatever is missing at the end reads as zero."""

    def __init__(self, report):
        self.report = report + bytes(1 + max(INPUT_REPORTS.values()))

    def unsigned(self, offset, width):
        return int.from_bytes(self.report[offset:offset + width], "little")

    def u8(self, offset):
        return self.unsigned(offset, 1)

    def u16(self, offset):
        return self.unsigned(offset, 2)

    def u32(self, offset):
        return self.unsigned(offset, 4)

    def u64(self, offset):
        return self.unsigned(offset, 8)

    def words(self, offset, count):
        return [self.u32(offset + 4 * i) for i in range(count)]

    def integers(self, offset, count):
        return [signed(word, 32) for word in self.words(offset, count)]

    def floats(self, offset, count):
        return [F32(word) for word in self.words(offset, count)]


def signed(number, bits):
    return number - (1 << bits) if number >> (bits - 1) else number


def lines_of_eight(texts):
    return ["".join(texts[i:i + 8]) for i in range(0, len(texts), 8)]


def word_lines(words, decimal):
    """Decimal words are shown signed, whatever they are."""
    return lines_of_eight(["%14d " % signed(w & 0xFFFFFFFF, 32) if decimal else "%08x " % (w & 0xFFFFFFFF)
                           for w in words])


def sensor_image(r, decimal):
    blocks = {"D-SCAN I": 16, "D-SCAN Q": 208, "P-SCAN I": 400, "P-SCAN Q": 592}
    frame, params, time, cookie, flags = r.u32(4), r.u32(8), r.u32(12), r.u8(1), r.u16(2)
    tmon_params, (tmon,) = r.u32(784), r.floats(788, 1)
    lines = [f"[Frame # = {frame}]", f"[Frame Params = 0x{params:08x}]", f"[Timestamp = {time} ms]",
             tmon.printed("[TMON = %f degC]"), f"[TMON Params = 0x{tmon_params:08x}]", f"[Cookie = 0x{cookie:02x}]",
             f"[Flags = 0x{flags:04x}]", ""]
    value = {"FRAME_NUMBER": frame, "FRAME_PARAMS": params, "TIMESTAMP_MS": time, "TMON_DEG_C": tmon,
             "TMON_PARAMS": tmon_params, "COOKIE": cookie, "FLAGS": flags}
    for name, offset in blocks.items():
        samples = r.integers(offset, 48)
        lines += [f"[{name}]", *word_lines(samples, decimal), ""]
        value[name.replace("-", "_").replace(" ", "_")] = samples
    return lines, value


def adc_dump_packet(r, decimal):
    a, b, c = r.report[1:4]
    payload = r.words(16, 512)
    return ([f"[ADC Packet #    = {r.u32(4)}]", f"[Magic Value     = 0x{a:02x}{b:02x}{c:02x}]",
             f"[Payload Size    = {r.u32(8)}]", f"[Total Dump Size = {r.u32(12)}]", "", "[Packet Payload Data]",
             *word_lines(payload, False)],
            {"PACKET_ID": r.u32(4), "MAGIC_VALUE": 4 * a | 2 * b | c, "PAYLOAD_SIZE": r.u32(8),
             "TOTAL_DUMP_SIZE": r.u32(12), "PAYLOAD_DATA": payload})


def floats_report(title, key):
    def decode(r, decimal):
        values = r.floats(1, 48)
        return [title, "", *lines_of_eight([v.printed("% -13.3f ") for v in values]), ""], {key: values}
    return decode


def power_modes(r, decimal):
    names = ["INIT", "ACTIVE", "TIMEOUT", "READY", "LIGHT_SLEEP_EXITING", "LIGHT_SLEEP"]
    times = {name: r.u32(1 + 8 * m) for m, name in enumerate(names)}
    counts = {name: r.u32(5 + 8 * m) for m, name in enumerate(names)}
    return (["Power Mode Statistics - Total Time:", *[f"{n:20}: {t:12} ms" for n, t in times.items()], "",
             "Power Mode Statistics - Number of Times Entered:", *[f"{n:20}: {c}" for n, c in counts.items()]],
            {f"{n} time ms": t for n, t in times.items()} | {f"{n} times entered": c for n, c in counts.items()})


def text_of(r):
    return r.report[1:r.report.index(0, 1)].decode()


def version(r, decimal):
    return [text_of(r)], text_of(r)


def version_extended(r, decimal):
    lines = text_of(r).split("\n")
    return lines, dict(zip(["PROJECT", "SDK", "TOOLCHAIN", "KORVO", "VENDOR", "ALGS"], lines[:6], strict=True))


def adc_dump_config(r, decimal):
    address, low, high, samples, compare = r.words(1, 5)
    trigger = "STIM_TIMER" if r.u32(21) else "RX_EN"
    return (["--ADC Dump Configuration--", "", f"Start Address       = 0x{address:08x}",
             f"Channel Enable Mask = {high:04x}{low:08x}", f"Sample Count        = {samples}",
             f"Stim Timer Compare  = {compare}", f"Trigger Source      = {trigger}"],
            {"START_ADDRESS": address, "CHANNEL_ENABLE_MASK": r.u64(5), "SAMPLE_COUNT": samples,
             "STIM_TIMER_COMPARE": compare, "TRIGGER_SOURCE": trigger})


def adc_dump_state(r, decimal):
    state = {0: "STANDBY", 1: "SINGLE", 2: "CONTINUOUS"}.get(r.u8(1), "INVALID")
    return [f"ADC Dump State: {state}"], state


def single(number):
    """Rounds a number that a double holds exactly to single precision."""
    return struct.unpack("<f", struct.pack("<f", number))[0]


def single_of_integer(number):
    """Rounds once, half to even: by way of a double a long number would be rounded twice."""
    excess = max(0, number.bit_length() - 24)
    kept, rest = number >> excess, number & ((1 << excess) - 1)
    half = 1 << excess >> 1
    if excess and (rest > half or (rest == half and kept & 1)):
        kept += 1
    return float(kept << excess)


def watchdog(r, decimal):
    time = r.u64(5)
    seconds = single(single_of_integer(time) * single(1e-6))
    return (["Watchdog Data:", f"    Feed Count:{r.u32(1)}", f"Feed Timestamp:0x{time:016X}",
             "Feed Wallclock:%15.3f" % seconds, f"      Register:0x{r.u32(13):08X}", f"          Wake:{r.u32(17)}",
             f"         Sleep:{r.u32(21)}"],
            {"Count": r.u32(1), "Timestamp": signed(time, 64), "Wallclock": seconds, "Register": r.u32(13),
             "Wake": r.u32(17), "Idle": r.u32(21)})


def black_box_summary(r, decimal):
    bits = {name: r.unsigned(4, 3) >> bit & 1 for name, bit in PRESENCE_BITS.items()}
    return (["--Black Box Summary--", f"Severity Level: {LEVELS[r.u8(1) & 7]}", f"Module Count:   {r.u16(2)}", "",
             *[f"{name:>20}: {bit}" for name, bit in bits.items()]],
            {"SEVERITY_LEVEL": r.u8(1), "MODULE_COUNT": r.u16(2)} | bits)


def black_box_full_report(r, decimal):
    def row(label, number):
        return f"{label:>40}: {signed(number, 32)}"

    lines = ["---Black Box Full Report---", "", row("Module Count", r.u16(1)), ""]
    value = {"MODULE_COUNT": r.u16(1)}
    for module, start in COUNTER_BLOCKS.items():
        counters = dict(zip(EVENTS[module], r.words(start + 4, len(EVENTS[module])), strict=True))
        lines += [f"{module + ' Module ID':>40}: 0x{r.u16(start):04X}", row(f"{module} # Events", r.u16(start + 2)),
                  *[row(name, counter) for name, counter in counters.items()], ""]
        value[module] = {f"{module}_MODULE_ID": r.u16(start), f"{module}_NUM_EVENTS": r.u16(start + 2)} | counters
    del value["PMGR"]["PMGR_NUM_EVENTS"]
    for blob, start in zip(BLOBS, BLOB_COUNTER_BLOCKS, strict=True):
        counters = dict(zip(BLOB_EVENTS, r.words(start + 4, 7), strict=True))
        lines += [f"{blob:>30} Module ID: 0x{r.u16(start):04X}", row("BLOB # Events", r.u16(start + 2)),
                  *[row(f"BLOB_EVENT_{name}", counter) for name, counter in counters.items()], ""]
        value[blob] = {f"{blob}_MODULE_ID": r.u16(start), f"{blob}_NUM_EVENTS": r.u16(start + 2)} | {
            f"{blob}_EVENT_{name}": counter for name, counter in counters.items()}
    return lines, value


def option_words(option):
    words = ["MASKED "] if option & 0x08 else []
    words += ["MESSAGE "] if option & 0x40 else []
    words += [["", "GPIO_0 ", "GPIO_1 ", "GPIO_2 "][option >> 4 & 3]]
    words += ["BREAKPOINT "] if option & 0x80 else []
    return "".join(words) or "(no options set)"


def black_box_config(r, decimal):
    def line(label, option):
        return f"{label:>40}: {LEVELS[option & 7]} {option_words(option)}"

    def entry(option):
        return {"ERROR_LEVEL": LEVELS[option & 7], "OPTIONS_RAW": option}

    lines = [f"{f'Global {name} Config':>40}:  {option_words(r.u8(1 + i))}" for i, name in enumerate(GLOBALS)] + [""]
    value = {f"GLOBAL_CONFIG_{name.upper()}": entry(r.u8(1 + i)) for i, name in enumerate(GLOBALS)}
    for module, events in EVENTS.items():
        for number, event in enumerate(events):
            option = r.u8(option_byte(module, number))
            # On screen one event shows the byte of the event before it.
            lines.append(line(event, r.u8(25) if event == "OPEN_SHORT_EVENT_SINGLE_OPEN" else option))
            value[event] = entry(option)
        lines.append("")
    for blob, start in zip(BLOBS, BLOB_OPTION_BLOCKS, strict=True):
        options = {event: r.u8(start + i) for i, event in enumerate(BLOB_EVENTS)}
        lines += [f"{blob:>40}", *[line(f"BLOB_EVENT_{event}", option) for event, option in options.items()], ""]
        value |= {f"{blob}_EVENT_{event}": entry(option) for event, option in options.items()}
    return lines, value


def drawn(mask):
    positions = ["X" if mask >> position & 1 else "." for position in range(47, -1, -1)]
    return "".join(" " + "".join(positions[i:i + 8]) for i in range(0, 48, 8))


def open_short_test(r, decimal):
    faults = [("Short TX+ ", "SHORT_TX_POS"), ("Short TX- ", "SHORT_TX_NEG"), ("Short BOTH", "SHORT_BOTH"),
              ("Open  TX+ ", "OPEN_TX_POS"), ("Open  TX- ", "OPEN_TX_NEG"), ("Open  BOTH", "OPEN_BOTH"),
              ("Weak  O/S ", "WEAK_OS")]
    masks = [r.u64(1 + 8 * i) for i in range(7)]
    ruler = "\t" + " " * 18 + "40       32       24       16        8        0"
    return (["Open/Short Test Results:", "", ruler,
             *[f"\t{label} {drawn(mask)}" for (label, _), mask in zip(faults, masks, strict=True)]],
            {key: mask for (_, key), mask in zip(faults, masks, strict=True)})


def open_short_data(scan):
    def decode(r, decimal):
        brownout = r.u8(393) & 1
        in_phase, quadrature = r.words(9, 48), r.words(201, 48)
        return ([f"Open/Short Test {scan} Data:", "",
                 " " * 23 + "40       32       24       16        8        0", f"ADC Saturation  {drawn(r.u64(1))}", "",
                 "Brownout: YES" if brownout else "Brownout: NO", "", f"[{scan} I]", *word_lines(in_phase, decimal), "",
                 f"[{scan} Q]", *word_lines(quadrature, decimal)],
                {"SATURATION_DATA": r.u64(1), "BROWNOUT": brownout, "SCAN_DATA_I": in_phase, "SCAN_DATA_Q": quadrature})
    return decode


DECODERS = {
    0x76: sensor_image, 0x77: adc_dump_packet, 0xA2: floats_report("Vesk Algorithms Baseline:", "BASELINE"),
    0xA9: power_modes, 0xD0: version, 0xD2: version_extended, 0xDC: adc_dump_config, 0xDE: adc_dump_state,
    0xDF: watchdog, 0xE0: black_box_summary, 0xE1: black_box_full_report, 0xE2: black_box_config,
    0xE3: open_short_test, 0xE4: open_short_data("D-SCAN"), 0xE5: open_short_data("P-SCAN"),
    0xEA: black_box_full_report, 0xEC: floats_report("Noisy Pixel Thresholds:", "NOISY_PIXEL_THRESHOLDS"),
}


def lines(report, decimal=False):
    """The display lines of a whole report."""
    return DECODERS[report[0]](Reader(report), decimal)[0]


def value(report):
    """The value tree of a whole report, of int, float, F32, str, list and dict."""
    return DECODERS[report[0]](Reader(report), False)[1]


def printed(report, decimal=False):
    """The report as it is printed: its lines between two empty ones."""
    return "\n" + "".join(line + "\n" for line in lines(report, decimal)) + "\n"
