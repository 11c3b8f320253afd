"""The lint's word on each text, held against a host."""

import socket
import sys
import unittest
from pathlib import Path
from typing import List

from korva_control.framing import encode_frame
from quorix_host import LIMIT, QuorixHost

sys.path.insert(0, str(Path(__file__).resolve().parents[1]))

from lint_cases import ANSWERED, REFUSED  # noqa: E402


class LintTruth(unittest.TestCase):
    def test_what_is_refused_gets_silence_and_the_rest_gets_a_reply(self) -> None:
        with QuorixHost(), socket.create_connection(("127.0.0.1", 803), LIMIT) as device:
            device.setsockopt(socket.IPPROTO_TCP, socket.TCP_NODELAY, 1)
            stream = device.makefile("rb")

            def answers_to(text: str) -> List[bytes]:
                """Everything that comes before the answer to a question that is surely taken."""
                end = b"<Commands><Correlation>the end</Correlation></Commands>"
                device.sendall(encode_frame(text.encode()) + encode_frame(end))
                answers: List[bytes] = []
                while True:
                    length = int.from_bytes(stream.read(4), "little")
                    answer = stream.read(length)
                    if b"<Correlation>the end<" in answer:
                        return answers
                    answers.append(answer)

            for text, _ in REFUSED:
                with self.subTest(refused=text[:80]):
                    self.assertEqual([], answers_to(text))
            for text, _ in ANSWERED:
                with self.subTest(answered=text):
                    self.assertEqual(1, len(answers_to(text)))
            stream.close()


if __name__ == "__main__":
    unittest.main()
