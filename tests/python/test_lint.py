import unittest

from korva_control import lint_request
from lint_cases import ANSWERED, REFUSED


class LintOfTexts(unittest.TestCase):
    def test_says_why_a_host_is_silent(self) -> None:
        for text, reason in REFUSED:
            with self.subTest(text=text[:80]):
                report = lint_request(text)
                self.assertEqual(reason, report.refusal[: len(reason)])
                self.assertEqual([], report.warnings)

    def test_warns_of_what_a_host_answers_otherwise_than_expected(self) -> None:
        for text, warnings in ANSWERED:
            with self.subTest(text=text):
                report = lint_request(text)
                self.assertEqual(("", warnings), (report.refusal, report.warnings))

    def test_warns_of_bytes_that_are_not_utf_8(self) -> None:
        report = lint_request(b"<EventInformation>\xff</EventInformation>")
        self.assertEqual(["bytes that are not UTF-8 arrive as U+FFFD"], report.warnings)

    def test_a_long_text_takes_no_longer_than_its_length(self) -> None:
        for text in ("<" * 200_000, "<a " * 200_000, "<a b=" * 100_000, "<a>" + "x<b/>" * 100_000):
            self.assertNotEqual("", lint_request(text).refusal)
