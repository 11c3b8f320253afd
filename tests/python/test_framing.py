import unittest

from korva_control.errors import ProtocolError
from korva_control.framing import FrameBuffer, encode_frame


class Framing(unittest.TestCase):
    def test_writes_the_length_of_the_bytes_least_significant_first(self) -> None:
        self.assertEqual(
            b"\x14\x00\x00\x00<ServerInformation/>", encode_frame(b"<ServerInformation/>")
        )
        self.assertEqual(b"\x00\x01\x00\x00", encode_frame(b"x" * 256)[:4])

    def test_takes_no_frame_before_its_last_byte(self) -> None:
        buffer = FrameBuffer(100)
        taken = []
        for byte in b"\x03\x00\x00\x00abc":
            self.assertEqual([], taken)
            buffer.add(bytes([byte]))
            text = buffer.take()
            taken += [text] if text is not None else []

        self.assertEqual([b"abc"], taken)

    def test_takes_several_frames_of_one_arrival_in_their_order(self) -> None:
        buffer = FrameBuffer(100)
        buffer.add(b"\x01\x00\x00\x00a\x00\x00\x00\x00\x02\x00\x00\x00bc\x09\x00")

        self.assertEqual([b"a", b"", b"bc", None], [buffer.take() for _ in range(4)])
        self.assertEqual("2 of the 4 bytes of a header had come", buffer.describe_rest())

    def test_says_how_far_a_frame_has_come(self) -> None:
        buffer = FrameBuffer(100)
        self.assertEqual("", buffer.describe_rest())
        buffer.add(b"\x09\x00\x00\x00ab")

        self.assertEqual("2 of the 9 bytes of a frame had come", buffer.describe_rest())

    def test_takes_a_frame_at_the_limit_and_refuses_one_above_for_good(self) -> None:
        buffer = FrameBuffer(3)
        buffer.add(b"\x03\x00\x00\x00abc\x04\x00\x00\x00")

        self.assertEqual(b"abc", buffer.take())
        for _ in range(2):
            with self.assertRaisesRegex(ProtocolError, "a frame of 4 bytes, above the limit of 3"):
                buffer.take()

    def test_needs_no_memory_for_what_a_header_only_announces(self) -> None:
        buffer = FrameBuffer(0xFFFFFFFF)
        buffer.add(b"\xff\xff\xff\xffabc")

        self.assertIsNone(buffer.take())
        self.assertEqual("3 of the 4294967295 bytes of a frame had come", buffer.describe_rest())
