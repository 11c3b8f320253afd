"""A client that is connected to a scripted host."""

from __future__ import annotations

import asyncio
import dataclasses
import unittest
from typing import Callable

from korva_control import AsyncClient, ClientOptions
from scripted_host import LIMIT, Peer, ScriptedHost

SHORT = 0.05
"""A time limit that is meant to run out."""


def hang_up(peer: Peer) -> None:
    """A script of a host that closes instead of answering the first question."""
    peer.read()


class ClientCase(unittest.IsolatedAsyncioTestCase):
    async def start(
        self, *scripts: Callable[[Peer], object], options: ClientOptions = ClientOptions()
    ) -> None:
        """Connects. Each script is run on a connection of its own, once the client is greeted."""

        def greeting(script: Callable[[Peer], object]) -> Callable[[Peer], None]:
            def whole(peer: Peer) -> None:
                if script is not hang_up:
                    peer.greet()
                script(peer)

            return whole

        self.host = ScriptedHost(*map(greeting, scripts))
        self.client = AsyncClient(dataclasses.replace(options, time_limit=LIMIT))
        await self.client.connect("127.0.0.1", self.host.port)

    async def asyncTearDown(self) -> None:
        await self.client.close()
        await asyncio.get_running_loop().run_in_executor(None, self.host.close)
