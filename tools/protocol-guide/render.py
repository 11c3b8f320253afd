"""Writes a session and the table of facts as the guide and as data."""

from __future__ import annotations

import json
import re
from typing import Any, Callable, Dict, Iterable, List, Optional, Sequence, Tuple

import facts
from oddities import ODDITIES
from scenario import Session
from stage import Exchange, Frame

Results = Sequence[Tuple[int, str]]


def show_frame(direction: str, frame: Frame) -> List[str]:
    return [f"{direction}  {frame.hexadecimal}", frame.text]


def show_exchange(exchange: Exchange) -> str:
    lines = show_frame("device → host", exchange.request)
    if exchange.reply is not None:
        lines += show_frame("host → device", exchange.reply)
    return "\n".join(["```", *lines, "```"])


def show_event(frame: Frame) -> str:
    return "\n".join(["```", *show_frame("host → device", frame), "```"])


def table(header: Sequence[str], rows: Iterable[Sequence[str]]) -> str:
    lines = ["| " + " | ".join(header) + " |", "|" + "---|" * len(header)]
    lines += ["| " + " | ".join(cell.replace("|", "\\|") for cell in row) + " |" for row in rows]
    return "\n".join(lines)


def listed(pairs: Iterable[Tuple[str, str]]) -> str:
    return "<br>".join(f"`{name}`: {text}" for name, text in pairs) or "none"


def show_commands(session: Session) -> str:
    return table(
        ("Command", "Description", "Input parameters", "Reply parameters"),
        [
            (
                f"`{command.name}`",
                command.description,
                listed((p.name, p.description) for p in command.input_parameters),
                listed((p.name, p.description) for p in command.reply_parameters),
            )
            for command in session.commands
        ],
    )


def show_authorization_commands(_session: Session) -> str:
    return table(
        ("Command", "What it does", "Input parameters", "Reply parameters"),
        [
            (
                f"`{command.name}`",
                command.description,
                listed(command.inputs),
                listed(command.replies),
            )
            for command in facts.AUTHORIZATION_COMMANDS
        ],
    )


def show_events(session: Session) -> str:
    parts = []
    for name, event in facts.EVENTS.items():
        parts.append(f"**`{name}`**. {event.description}")
        if event.parameters:
            parts.append("\n".join(f"- `{key}`: {text}" for key, text in event.parameters))
        parts.append(show_event(session.events[name]))
    return "\n\n".join(parts)


def show_failures(_session: Session) -> str:
    return table(
        ("Text of `Result`", "Where"),
        [(f'"{failure.result}"', failure.text) for failure in facts.FAILURES],
    )


def show_probe(exchange: Exchange) -> List[str]:
    reply = exchange.reply.text.split("?>", 1)[1] if exchange.reply is not None else "(silence)"
    return [f"→ {exchange.request.text}", f"← {reply}"]


def show_oddities(session: Session) -> str:
    parts = []
    for number, (oddity, exchanges) in enumerate(zip(ODDITIES, session.probes), 1):
        parts.append(f"### {number}. {oddity.title}")
        parts.append(oddity.text)
        if exchanges:
            lines = [line for exchange in exchanges for line in show_probe(exchange)]
            parts.append("\n".join(["```", *lines, "```"]))
        parts.append(f"Why it stays: {oddity.reason}")
    return "\n\n".join(parts)


def write_guide(template: str, session: Session, results: Results) -> str:
    makers: Dict[str, Callable[[Session], str]] = {
        "commands": show_commands,
        "authorization-commands": show_authorization_commands,
        "events": show_events,
        "oddities": show_oddities,
        "failures": show_failures,
        "results": lambda _: table(
            ("Code", "Text of `Result`"), [(str(code), f'"{text}"') for code, text in results]
        ),
        "times": lambda _: table(("Time", "What it bounds", "Remark"), facts.TIMES),
    }

    def fill(match: "re.Match[str]") -> str:
        sort, _, name = match.group(1).partition(" ")
        if sort == "exchange":
            return show_exchange(session.exchanges[name])
        if sort == "event":
            return show_event(session.events[name])
        if sort == "denial" and session.denial is not None:
            return show_event(session.denial)
        return makers[sort](session)

    return re.sub(r"\{\{(.*?)\}\}", fill, template)


def frame_data(frame: Optional[Frame]) -> Optional[Dict[str, str]]:
    if frame is None:
        return None
    return {"header": frame.hexadecimal, "text": frame.text}


def exchange_data(exchange: Exchange) -> Dict[str, Any]:
    return {"request": frame_data(exchange.request), "reply": frame_data(exchange.reply)}


def pairs_data(pairs: Iterable[Tuple[str, str]]) -> List[Dict[str, str]]:
    return [{"name": name, "description": text} for name, text in pairs]


def commands_data(session: Session) -> List[Dict[str, Any]]:
    described = [
        {
            "name": command.name,
            "description": command.description,
            "inputParameters": pairs_data(
                (p.name, p.description) for p in command.input_parameters
            ),
            "replyParameters": pairs_data(
                (p.name, p.description) for p in command.reply_parameters
            ),
            "describedByHost": True,
        }
        for command in session.commands
    ]
    return described + [
        {
            "name": command.name,
            "description": command.description,
            "inputParameters": pairs_data(command.inputs),
            "replyParameters": pairs_data(command.replies),
            "describedByHost": False,
        }
        for command in facts.AUTHORIZATION_COMMANDS
    ]


def write_data(session: Session, results: Results) -> str:
    data: Dict[str, Any] = {
        "streamVersion": {"major": 1, "minor": 0},
        "port": 803,
        "discovery": {"serviceType": "_korva._tcp.", "domain": "local.", "advertisedPort": 810},
        "frame": {"lengthBytes": 4, "byteOrder": "little", "text": "UTF-8 XML"},
        "commands": commands_data(session),
        "events": [
            {
                "name": name,
                "description": event.description,
                "parameters": pairs_data(event.parameters),
                "capture": frame_data(session.events[name]),
            }
            for name, event in facts.EVENTS.items()
        ],
        "failures": [
            {"when": failure.text, "result": failure.result, "exchange": exchange_data(exchange)}
            for failure, exchange in zip(facts.FAILURES, session.failures)
        ],
        "times": [
            {"time": time, "bounds": what, "remark": remark} for time, what, remark in facts.TIMES
        ],
        "results": [{"code": code, "text": text} for code, text in results],
        "exchanges": {name: exchange_data(said) for name, said in session.exchanges.items()},
        "oddities": [
            {
                "title": oddity.title,
                "text": oddity.text,
                "reason": oddity.reason,
                "probes": [exchange_data(exchange) for exchange in exchanges],
            }
            for oddity, exchanges in zip(ODDITIES, session.probes)
        ],
    }
    return json.dumps(data, indent=2, ensure_ascii=False) + "\n"
