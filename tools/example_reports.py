"""What the example reports hold: invented, but consistent with one another, as one controller would send them."""

import dataclasses
import struct

from reference_catalogue import (BLOB_COUNTER_BLOCKS, BLOB_EVENTS, BLOB_OPTION_BLOCKS, BLOBS, COUNTER_BLOCKS, EVENTS,
                                 LEVELS, PRESENCE_BITS, option_byte)
from reference_decoder import FEATURE_REPORTS, INPUT_REPORTS


@dataclasses.dataclass
class Example:
    title: str
    pieces: list  # of (bytes, comment)

    @property
    def bytes(self):
        return b"".join(data for data, _ in self.pieces)


def u16(number):
    return struct.pack("<H", number)


def u32(number):
    return struct.pack("<I", number & 0xFFFFFFFF)


def u64(number):
    return struct.pack("<Q", number)


def f32(number):
    return struct.pack("<f", number)


class Noise:
    """A small generator of our own, so that the examples are the same everywhere and for ever."""

    def __init__(self, seed):
        self.state = seed

    def __call__(self, spread):
        """An integer from -spread to +spread."""
        self.state = (self.state * 1103515245 + 12345) & 0x7FFFFFFF
        return (self.state >> 8) % (2 * spread + 1) - spread


CHANNELS = range(48)
TOUCH = {19: 900, 20: 4100, 21: 11800, 22: 14950, 23: 10300, 24: 3650, 25: 700}  # channel: what a finger adds


def samples(noise, base, spread, touch):
    """48 samples around `base`, with `touch` percent of a finger."""
    return [base + noise(spread) + TOUCH.get(channel, 0) * touch // 100 for channel in CHANNELS]


def words(numbers):
    return b"".join(map(u32, numbers))


def image(frame, touch):
    noise = Noise(frame)
    blocks = [("D-SCAN I", 118200, 420, touch), ("D-SCAN Q", -2350, 160, touch // 12), ("P-SCAN I", 74150, 380, touch),
              ("P-SCAN Q", -1190, 140, touch // 12)]
    milliseconds = 304812 + (frame - 18231) * 17
    return Example(f"Sensor image, input 0x76: frame {frame}", [
        (b"\x76", "report ID"), (b"\x5A", "cookie"), (u16(0x0003), "flags"), (u32(frame), "frame number"),
        (u32(0x00010230), "frame parameters"), (u32(milliseconds), "timestamp, ms"),
        *[(words(samples(noise, base, spread, share)), f"{name}, 48 samples") for name, base, spread, share in blocks],
        (u32(0x00000412), "TMON parameters"), (f32(34.81 + frame % 4 * 0.06), "TMON, degrees Celsius")])


def adc_packet(number):
    noise = Noise(number + 77)
    # Two 12-bit samples of a triangle of 64 steps in each word.
    triangle = [abs((n + 32 * number) % 64 - 32) * 96 + 512 + noise(24) for n in range(1024)]
    payload = [triangle[2 * n] | triangle[2 * n + 1] << 16 for n in range(512)]
    return Example(f"ADC dump packet, input 0x77: packet {number}", [
        (b"\x77", "report ID"), (b"\x41\x44\x43", "magic value"), (u32(number), "packet number"),
        (u32(2048), "payload size"), (u32(32768), "total dump size"), (words(payload), "payload, 512 words")])


def float_table(report_id, title, comment, numbers):
    return Example(title, [(bytes([report_id]), "report ID"), (b"".join(map(f32, numbers)), comment)])


def baseline():
    noise = Noise(2)
    return float_table(0xA2, "Algorithm baseline, feature 0xA2", "48 channels",
                       [-3.4375 if channel == 47 else 1180 + noise(4000) / 128 for channel in CHANNELS])


def thresholds():
    noise = Noise(3)
    return float_table(0xEC, "Noisy-pixel thresholds, feature 0xEC", "48 channels",
                       [12.5 + noise(900) / 1000 for _ in CHANNELS])


def power_modes():
    modes = {"INIT": (412, 1), "ACTIVE": (187340, 46), "TIMEOUT": (9120, 12), "READY": (61877, 45),
             "LIGHT_SLEEP_EXITING": (63, 14), "LIGHT_SLEEP": (46000, 14)}
    return Example("Power mode statistics, feature 0xA9", [(b"\xA9", "report ID")] + [
        (u32(time) + u32(count), f"{name}: time in ms, times entered") for name, (time, count) in modes.items()])


def text_report(report_id, title, lines):
    pieces = [(bytes([report_id]), "report ID")]
    for number, line in enumerate(lines, 1):
        pieces.append((line.encode() + (b"\n" if number < len(lines) else b"\0"), f'"{line}"'))
    return Example(title, pieces)


def adc_config():
    return Example("ADC dump configuration, feature 0xDC", [
        (b"\xDC", "report ID"), (u32(0x20014000), "start address"), (u32(0xFFFFFFFF), "channels 0 to 31"),
        (u32(0x0000FFFF), "channels 32 to 47"), (u32(16384), "sample count"), (u32(2400), "stim timer compare"),
        (u32(1), "trigger source: stim timer")])


def adc_state():
    return Example("ADC dump state, feature 0xDE", [(b"\xDE", "report ID"), (b"\x02", "continuous")])


def watchdog():
    return Example("Watchdog, feature 0xDF", [
        (b"\xDF", "report ID"), (u32(3048), "feed count"), (u64(304812345), "last fed, microseconds"),
        (u32(0x00000ABC), "register"), (u32(14), "wake count"), (u32(13), "sleep count")])


COUNTERS = {
    "BLACK_BOX_EVENT_UNKNOWN": 1, "PSE_EVENT_AFE_BROWNOUT": 2, "OPEN_SHORT_EVENT_SINGLE_OPEN": 1,
    "OPEN_SHORT_EVENT_WEAK_OS": 3, "SVC_SMGR_EVENT_FRAME_TRIG_NOT_READY": 5, "HIDSPI_MASTER_EVENT_ACK_SENT": 48213,
    "HIDSPI_MASTER_EVENT_ACK_RECEIVED": 48190, "HIDSPI_MASTER_EVENT_BUSY_RECEIVED": 17,
    "HIDSPI_MASTER_EVENT_TRANSFER_RECEIVED": 48190, "HIDSPI_MASTER_EVENT_TRANSFER_SENT": 48213,
    "HIDSPI_MASTER_EVENT_TRANSFER_RETRY": 23, "HIDSPI_SLAVE_EVENT_ACK_SENT": 18240,
    "HIDSPI_SLAVE_EVENT_ACK_RECEIVED": 18236, "HIDSPI_SLAVE_EVENT_TRANSFER_RECEIVED": 18240,
    "HIDSPI_SLAVE_EVENT_TRANSFER_SENT": 18236, "HIDSPI_SLAVE_EVENT_SPI_CS_ACTIVATED": 36481,
    "HIDSPI_SLAVE_EVENT_SPI_CS_DEACTIVATED": 36480, "HIDSPI_SLAVE_EVENT_SPI_XFER_COMPLETE": 36476,
    "HIDSPI_SLAVE_EVENT_BUS_PRESLEEP": 14, "HIDSPI_SLAVE_EVENT_BUS_SLEEP": 14, "HIDSPI_SLAVE_EVENT_BUS_RESUME": 14,
    "ALGS_EVENT_FRAME_MISMATCH": 2, "ALGS_EVENT_DISCARDED_PATH": 31, "ALGS_EVENT_PIXEL_NOISE_RUN_CNT": 18231,
    "ALGS_EVENT_PIXEL_NOISE_VALID_CNT": 18219, "ALGS_EVENT_PIXEL_NOISE_INVALID_CNT": 12,
    "ALGS_EVENT_PIXEL_NOISE_BAD_CH_CNT": 1, "ALGS_EVENT_PIXEL_NOISE_PRE_HYST_BIN_0": 17902,
    "ALGS_EVENT_PIXEL_NOISE_PRE_HYST_BIN_1": 301, "ALGS_EVENT_PIXEL_NOISE_PRE_HYST_BIN_2": 16,
    "ALGS_EVENT_PIXEL_NOISE_POST_HYST_BIN_0": 18088, "ALGS_EVENT_PIXEL_NOISE_POST_HYST_BIN_1": 131,
    "ALGS_EVENT_PIXEL_NOISE_CNT_CH_0": 4, "ALGS_EVENT_PIXEL_NOISE_CNT_CH_22": 211,
    "ALGS_EVENT_PIXEL_NOISE_CNT_CH_47": 9, "ALGS_EVENT_C2G_RUN_CNT": 120, "ALGS_EVENT_C2G_MAX_FORCE_BIN_PASS": 118,
    "ALGS_EVENT_C2G_FAIL_CNT": 2, "ALGS_EVENT_C2G_MAX_FORCE_BIN_FAIL_LOW": 2, "QOR_EVENT_DEV_ATTACH_RETRY": 1,
    "QOR_EVENT_TPT_TOUCH_RX_COUNT": 5521, "QOR_EVENT_TPT_QOR_RX_COUNT": 18231, "QOR_EVENT_VESK_RX_COUNT": 18231,
    "PMGR_EVENT_WAKE_SRC_UNKNOWN": 1,
}


def full_report(report_id, later):
    """The counters as they stand, or as they stood a little later."""
    blocks = []  # (offset, bytes, comment)
    for number, (module, offset) in enumerate(COUNTER_BLOCKS.items()):
        counters = [COUNTERS.get(event, 0) for event in EVENTS[module]]
        counters = [counter + later * (counter // 1000) for counter in counters]
        blocks.append((offset, u16(0x0010 + number) + u16(len(counters)) + words(counters), module))
    for number, (blob, offset) in enumerate(zip(BLOBS, BLOB_COUNTER_BLOCKS, strict=True)):
        counters = [1, 0, 0, 0, 1 if blob == "BLOB_LSPM" else 0, 0, 0]
        blocks.append((offset, u16(0x0040 + number) + u16(len(counters)) + words(counters), blob))
    return Example(f"Black box full report, feature 0x{report_id:02X}", [
        (bytes([report_id]), "report ID"), (u16(len(blocks)), "module count"),
        *[(data, f"{module}: ID, number of events, counters") for _, data, module in sorted(blocks)]])


def summary():
    recorded = {module for module, events in EVENTS.items() if any(event in COUNTERS for event in events)} | set(BLOBS)
    mask = sum(1 << bit for module, bit in PRESENCE_BITS.items() if module in recorded)
    return Example("Black box summary, feature 0xE0", [
        (b"\xE0", "report ID"), (b"\x0B", "severity: warning, in the three low bits"), (u16(22), "module count"),
        (mask.to_bytes(3, "little"), "modules that have something recorded")])


MASKED, GPIO_1, MESSAGE, BREAKPOINT = 0x08, 0x20, 0x40, 0x80


def option_of(event):
    """How an event is recorded, by the kind of thing that it counts."""
    kinds = {("BROWNOUT", "FAULT", "BAD_MODULE_ID"): LEVELS.index("CRITICAL") | MESSAGE | GPIO_1 | BREAKPOINT,
             ("BAD_", "FAIL", "SHORT_EVENT_DOUBLE", "MISSING", "INVALID"): LEVELS.index("ERROR") | MESSAGE,
             ("ERR", "RETRY", "TIMEOUT", "LOST", "OPEN", "WEAK"): LEVELS.index("WARNING") | MESSAGE,
             ("_CNT", "_BIN", "SENT", "RECEIVED", "COUNT", "SPI_", "BUS_"): LEVELS.index("TRACE") | MASKED}
    for words_of_kind, option in kinds.items():
        if any(word in event for word in words_of_kind):
            return option
    return LEVELS.index("INFO")


def configuration():
    body = bytearray(241)
    body[0] = 0xE2
    body[1:7] = [MASKED, MASKED, 0, MESSAGE, MESSAGE, MESSAGE | GPIO_1 | BREAKPOINT]
    for module, events in EVENTS.items():
        for number, event in enumerate(events):
            body[option_byte(module, number)] = option_of(event)
    for offset in BLOB_OPTION_BLOCKS:
        body[offset:offset + 7] = [option_of(event) for event in BLOB_EVENTS]
    body[202] = 0xFF  # nobody's
    starts = {1: "global settings, TRACE to CRITICAL"}
    starts |= {option_byte(module, 0): f"{module} events" for module in EVENTS}
    starts |= {offset: f"{blob} events" for blob, offset in zip(BLOBS, BLOB_OPTION_BLOCKS, strict=True)}
    order = sorted(starts)
    return Example("Black box configuration, feature 0xE2", [(b"\xE2", "report ID")] + [
        (bytes(body[start:end]), starts[start]) for start, end in zip(order, order[1:] + [241], strict=True)])


def open_short_test():
    masks = {"short, TX+": 0, "short, TX-": 0, "short, both": 0, "open, TX+": 1 << 22, "open, TX-": 0,
             "open, both": 0, "weak open/short": 1 << 21 | 1 << 22 | 1 << 47}
    return Example("Open/short test result, feature 0xE3", [(b"\xE3", "report ID")] + [
        (u64(mask), fault) for fault, mask in masks.items()])


def open_short_data(report_id, scan, base, saturated, brownout):
    noise = Noise(report_id)
    in_phase = [base // 20 if channel == 22 else base + noise(900) for channel in CHANNELS]
    quadrature = [noise(350) for _ in CHANNELS]
    return Example(f"Open/short test data, {scan}, feature 0x{report_id:02X}", [
        (bytes([report_id]), "report ID"), (u64(saturated), "ADC saturation, one bit a position"),
        (words(in_phase), "I, 48 samples"), (words(quadrature), "Q, 48 samples"),
        (bytes([brownout]), "bit 0: brownout"), (bytes(7), "unused")])


def example_reports():
    """File name without suffix to report: one of each ID, and further ones that the session holds too."""
    return {
        "76-sensor-image": image(18231, 0),
        "76-sensor-image-touch": image(18232, 70),
        "77-adc-dump-packet": adc_packet(0),
        "77-adc-dump-packet-1": adc_packet(1),
        "A2-algorithm-baseline": baseline(),
        "A9-power-modes": power_modes(),
        "D0-version": text_report(0xD0, "Version, feature 0xD0", ["4.7.2-1183"]),
        "D2-version-extended": text_report(0xD2, "Extended version, feature 0xD2", [
            "vesk-controller 4.7.2 (build 1183)", "sdk 12.1.0", "toolchain 9.3.1", "korvo 3.2.0", "vendor 5",
            "algs 7.15.4"]),
        "DC-adc-dump-config": adc_config(),
        "DE-adc-dump-state": adc_state(),
        "DF-watchdog": watchdog(),
        "E0-black-box-summary": summary(),
        "E1-black-box-report": full_report(0xE1, 0),
        "E2-black-box-config": configuration(),
        "E3-open-short-result": open_short_test(),
        "E4-open-short-data-d": open_short_data(0xE4, "D-SCAN", 91800, 1 << 20 | 1 << 22, 0),
        "E5-open-short-data-p": open_short_data(0xE5, "P-SCAN", 58300, 0, 1),
        "EA-black-box-report-2": full_report(0xEA, 1),
        "EC-noisy-pixel-thresholds": thresholds(),
    }


# Microseconds since the session began, and the report: identity and settings, frames, an ADC dump, tests, black box.
SESSION = [
    (0, "D0-version"), (4120, "D2-version-extended"), (9035, "A2-algorithm-baseline"),
    (13990, "EC-noisy-pixel-thresholds"), (18870, "E2-black-box-config"), (250000, "76-sensor-image"),
    (266667, "76-sensor-image-touch"), (1000310, "DC-adc-dump-config"), (1003275, "DE-adc-dump-state"),
    (1020000, "77-adc-dump-packet"), (1024170, "77-adc-dump-packet-1"), (2000205, "E3-open-short-result"),
    (2004960, "E4-open-short-data-d"), (2010115, "E5-open-short-data-p"), (3000190, "E0-black-box-summary"),
    (3005420, "E1-black-box-report"), (3950330, "DF-watchdog"), (3953210, "A9-power-modes"),
    (4005480, "EA-black-box-report-2"),
]


def report_descriptor():
    """All reports on one vendor page, each an array of bytes behind its ID."""
    items = b"\x06\x00\xFF\x09\x01\xA1\x01\x15\x00\x26\xFF\x00\x75\x08"
    for main_item, sizes in ((b"\x81\x02", INPUT_REPORTS), (b"\xB1\x02", FEATURE_REPORTS)):
        for report_id, size in sizes.items():
            items += bytes([0x85, report_id, 0x09, report_id, 0x96]) + u16((size or 256) - 1) + main_item
    return items + b"\xC0"
