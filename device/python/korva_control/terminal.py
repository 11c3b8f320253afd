"""Makes texts from the network harmless for a terminal."""

from __future__ import annotations

_SHORT = {"\n": "\\n", "\r": "\\r", "\t": "\\t"}


def _is_harmful(code: int) -> bool:
    """Controls, separators of lines, and what is not seen but changes how its neighbours are shown.

    Not the two joiners, U+200C and U+200D: words and emoji are written with them.
    """
    return (
        code < 0x20
        or 0x7F <= code <= 0x9F
        or code in (0xAD, 0x061C, 0x180E, 0x200B, 0x200E, 0x200F, 0xFEFF)
        or 0x2028 <= code <= 0x202E
        or 0x2060 <= code <= 0x206F
        or 0xFFF9 <= code <= 0xFFFB
    )


def for_terminal(text: str) -> str:
    shown = ""
    for character in text:
        code = ord(character)
        if not _is_harmful(code):
            shown += character
        else:
            shown += _SHORT.get(character) or (
                f"\\x{code:02X}" if code < 0x100 else f"\\u{code:04X}"
            )
    return shown


def word_for_terminal(text: str) -> str:
    """In double quotes where the word would not stand out as one."""
    shown = for_terminal(text)
    if text and " " not in text and '"' not in text:
        return shown
    quoted = shown.replace('"', '\\"')
    return f'"{quoted}"'
