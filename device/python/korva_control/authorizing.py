"""The dialogue by which a device is let in, and its heartbeat."""

from __future__ import annotations

import asyncio
from dataclasses import dataclass
from typing import TYPE_CHECKING, Callable, Dict, Optional

from .errors import ControlError, TimedOutError
from .options import BackOff, State
from .records import Authorization, CommandReply

if TYPE_CHECKING:
    from .aio import AsyncClient


@dataclass(frozen=True)
class _Wish:
    """What was asked for, to ask for it again on a new connection."""

    device_id: str
    device_name: str
    server_name: str
    operator_time_limit: float
    heartbeat: bool


class Authorizer:
    """Owns: the wish to be authorized and the task that beats. It belongs to one client."""

    def __init__(
        self,
        client: AsyncClient,
        beat_seconds: float,
        tell: Callable[[State, str], None],
        post: Callable[[str, Dict[str, str]], None],
    ) -> None:
        self._client = client
        self._beat_seconds = beat_seconds
        self._tell = tell
        self._post = post
        self._wish: Optional[_Wish] = None
        self._beating: Optional[asyncio.Task[None]] = None
        self.current: Optional[Authorization] = None

    def pause(self) -> None:
        """The connection has gone."""
        self.current = None
        if self._beating is not None:
            self._beating.cancel()
            self._beating = None

    def forget(self) -> None:
        self.pause()
        self._wish = None

    async def resume(self, back_off: BackOff) -> None:
        """Asks anew after a reconnection. While another device, or this one's own earlier request,
        is in the way it asks again and again; a refusal and an unanswered request end that."""
        for pause in back_off.seconds():
            wish = self._wish
            if wish is None or not self._client.connected:
                return
            try:
                outcome = await self._ask(wish)
            except ControlError as error:
                self._tell(State.NOT_AUTHORIZED, str(error))
                return
            if outcome.status != "Connected":
                return
            await back_off.pause(pause)

    async def authorize(
        self,
        device_id: str,
        device_name: str,
        server_name: str,
        operator_time_limit: float,
        heartbeat: bool,
    ) -> Authorization:
        self.forget()
        wish = _Wish(device_id, device_name, server_name, operator_time_limit, heartbeat)
        outcome = await self._ask(wish)
        if outcome.granted:
            self._wish = wish
        return outcome

    async def _ask(self, wish: _Wish) -> Authorization:
        parameters = {"DeviceId": wish.device_id, "DeviceName": wish.device_name}
        if wish.server_name:
            parameters["ServerName"] = wish.server_name
        # Deliberate: the event bears no device. It belongs to the one that has a request open, and
        # it may overtake the reply, so that listening begins before asking.
        with self._client.listen("Event.Authorize") as outcomes:
            reply = await self._client.execute("System.Authorize", parameters)
            outcome = self._read(reply)
            if outcome.status == "Pending":
                try:
                    event = await outcomes.next(wish.operator_time_limit)
                except TimedOutError:
                    raise await self._take_back(wish) from None
                except asyncio.CancelledError:
                    self._abandon(wish)
                    raise
                outcome = Authorization(
                    event.parameters.get("Status", ""),
                    event.parameters.get("ServerName", ""),
                    outcome.server_version,
                )
        self._settle(outcome, wish)
        return outcome

    def _abandon(self, wish: _Wish) -> None:
        """Takes a request back without waiting: whoever has asked has no time left."""
        self._post("System.Authorize.Cancel", {"DeviceId": wish.device_id})

    async def _take_back(self, wish: _Wish) -> TimedOutError:
        """A request that stays open would keep every device out until the operator is back."""
        text = f"timed out after {wish.operator_time_limit:g} s, waiting for the operator's answer"
        try:
            await self.cancel(wish.device_id)
        except ControlError as error:
            return TimedOutError(f"{text}; the request could not be taken back: {error}")
        return TimedOutError(f"{text}; the request was taken back")

    @staticmethod
    def _read(reply: CommandReply) -> Authorization:
        if not reply.ok:
            raise ControlError(f"the host does not take authorizations: {reply.result}")
        return Authorization(
            reply.parameters.get("Status", ""),
            reply.parameters.get("ServerName", ""),
            reply.parameters.get("ServerVersion", ""),
        )

    def _settle(self, outcome: Authorization, wish: _Wish) -> None:
        if not self._client.connected:
            return  # it was for the connection that has just gone
        self.current = outcome
        if not outcome.granted:
            self._tell(State.NOT_AUTHORIZED, outcome.status)
            return
        if self._beating is not None:
            self._beating.cancel()  # two calls of `authorize` at once have one heart
        if wish.heartbeat:
            self._beating = asyncio.get_running_loop().create_task(self._beat())
        self._tell(State.AUTHORIZED, outcome.server_name)

    async def cancel(self, device_id: str) -> None:
        # Deliberate: the reply is a failure also where the dialog was closed. Hosts always
        # answer so.
        await self._client.execute("System.Authorize.Cancel", {"DeviceId": device_id})

    async def _beat(self) -> None:
        beat = 0
        while True:
            beat += 1
            try:
                reply = await self._client.execute("System.Heartbeat", {"BeatId": str(beat)})
                if not reply.ok:
                    self._tell(State.HEARTBEAT_FAILED, reply.result)
            except ControlError as error:
                self._tell(State.HEARTBEAT_FAILED, str(error))
            await asyncio.sleep(self._beat_seconds)
