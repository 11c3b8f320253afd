import asyncio
import queue
import unittest

from korva_control import (
    AsyncClient,
    Authorization,
    BackOff,
    Client,
    ClientOptions,
    ClosedError,
    CommandReply,
    Event,
    ServerInformation,
    State,
    TimedOutError,
)
from quorix_host import LIMIT, QuorixHost

CAMERA = {"Param_CameraDeviceId": "1"}
OPTIONS = ClientOptions(time_limit=LIMIT)


class RunningHost(unittest.TestCase):
    def setUp(self) -> None:
        self.host = QuorixHost()
        self.addCleanup(self.host.__exit__)
        self.client = Client(OPTIONS)
        self.addCleanup(self.client.close)
        self.client.connect("127.0.0.1")

    def test_discovery(self) -> None:
        self.assertEqual(ServerInformation(1, 0), self.client.server_information())
        commands = self.client.commands()
        self.assertEqual(["Host.Information", "Host.Echo"], commands[:2])
        self.assertIn("CameraSettings_SetStrobeIntensity", commands)
        self.assertIn("Event.Cameras.SettingChanged", self.client.events())

        described = self.client.command_information("CameraSettings_GetTapEnabled")
        self.assertEqual("Returns the current global Tap-To-Select setting", described.description)
        self.assertEqual(["Param_TapEnabled"], [p.name for p in described.reply_parameters])
        unknown = self.client.command_information("Host.Bogus")
        self.assertEqual("Command not found.", unknown.description)
        self.assertEqual("", self.client.event_information("Event.Cameras.NameChanged").name)

    def test_a_strobe_and_the_event_that_it_causes(self) -> None:
        with self.client.listen("Event.Cameras.SettingChanged") as events:
            reply = self.client.execute(
                "CameraSettings_SetStrobeIntensity", {**CAMERA, "Param_StrobeIntensity": "0.75"}
            )
            event = events.next(LIMIT)

        self.assertEqual(CommandReply("OK", {}), reply)
        self.assertEqual(
            {"CameraId": "1", "SettingName": "StrobeIntensity", "SettingValue": "0.75"},
            event.parameters,
        )
        self.assertEqual(0.75, self.host.state()["cameras"][0]["StrobeIntensity"])

    def test_every_value_that_the_lint_lets_pass_arrives_as_it_was(self) -> None:
        values = {
            "markup": "<a b='c' d=\"e\">&amp;&lt;]]></a>",
            "blanks": " a  b ",
            "lines": "a\r\nb\tc",
            "wide": "м一Р😀\u00a0\ufffd",
            "empty": "",
            "long": "x" * 100_000,
            "na&me>'\"": "1",
        }
        self.assertEqual(values, self.client.execute("Host.Echo", values).parameters)

    def test_what_the_lint_refuses_the_host_would_drop_or_change(self) -> None:
        for request in (
            b"<ExecuteCommand><Name>Host.Echo</Name><Correlation> </Correlation></ExecuteCommand>",
            b"<ExecuteCommand><Name></Name><Correlation>1</Correlation></ExecuteCommand>",
            b"<ExecuteCommand><Name>a<b</Name><Correlation>1</Correlation></ExecuteCommand>",
            b"<EventInformation> </EventInformation>",
        ):
            with self.subTest(request=request), self.assertRaises(TimedOutError):
                self.client.exchange_raw(request, 0.05)
        echo = (
            "<ExecuteCommand><Name>Host.Echo</Name><Correlation>raw</Correlation><Parameters>"
            "<Parameter><Name>p</Name><Value>{}</Value></Parameter>{}</Parameters></ExecuteCommand>"
        )
        blank = self.client.exchange_raw(echo.format(" ", "").encode())
        self.assertIn(b"<Value/>", blank)
        twice = "<Parameter><Name>p</Name><Value>2</Value></Parameter>"
        self.assertIn(
            b"<Value>2</Value>", self.client.exchange_raw(echo.format("1", twice).encode())
        )

    def test_a_failure_in_the_host_s_words(self) -> None:
        reply = self.client.execute("CameraSettings_GetGreyscaleMode", CAMERA)
        self.assertEqual("Error: Unable to access requested data.", reply.result)
        self.assertFalse(reply.ok)

    def test_a_batch_of_ten_thousand_is_answered_in_order(self) -> None:
        commands = [("Host.Echo", {"n": str(number)}) for number in range(10_000)]

        replies = self.client.execute_batch(commands)

        self.assertEqual([c[1] for c in commands], [reply.parameters for reply in replies])

    def test_handlers_hear_what_the_host_publishes(self) -> None:
        heard: "queue.SimpleQueue[Event]" = queue.SimpleQueue()
        self.client.on("Event.A", heard.put)
        self.client.on("Event.Last", heard.put)
        for line in ('Event.A Text="1 < 2"', "Event.B", "Event.A Text=3", "Event.Last"):
            self.assertEqual("ok", self.host.command(f"fire {line}"))
        events = [heard.get(timeout=LIMIT) for _ in range(3)]
        self.assertEqual(
            [Event("Event.A", {"Text": "1 < 2"}), Event("Event.A", {"Text": "3"})], events[:2]
        )
        self.assertEqual(Event("Event.Last"), events[2])

    def test_an_authorization_of_a_host_without_a_window(self) -> None:
        outcome = self.client.authorize("desk-7", "Light desk")
        self.assertTrue(outcome.granted)
        self.assertEqual("300", outcome.server_version)
        self.assertRegex(outcome.server_name, "^Quorix on ")
        record = self.host.state()["control"]["desk-7"]
        self.assertEqual("Light desk", record["Name"])
        beat = self.client.execute("System.Heartbeat", {"BeatId": "x"})
        self.assertEqual(CommandReply("OK", {"BeatId": "x"}), beat)

        with Client(OPTIONS) as other:
            other.connect("127.0.0.1")
            self.assertEqual("Connected", other.authorize("desk-8", "Other desk").status)
            other.cancel_authorization("desk-8")

    def test_the_host_s_end_is_told(self) -> None:
        with self.client.listen("Event.Disconnect") as goodbye:
            self.assertEqual(0, self.host.quit())
            self.assertEqual(Event("Event.Disconnect"), goodbye.next(LIMIT))
            with self.assertRaises(ClosedError):
                goodbye.next(LIMIT)
        with self.assertRaises(ClosedError):
            self.client.commands()


class AskedOperator(unittest.IsolatedAsyncioTestCase):
    """A host with a window, whose operator answers by its console."""

    async def asyncSetUp(self) -> None:
        self.host = await asyncio.get_running_loop().run_in_executor(None, self.start)
        self.addCleanup(self.host.__exit__)
        self.client = AsyncClient(OPTIONS)
        await self.client.connect("127.0.0.1")
        self.addAsyncCleanup(self.client.close)

    @staticmethod
    def start() -> QuorixHost:
        return QuorixHost(window=True)

    async def ask_and(self, answer: str) -> Authorization:
        asking = asyncio.ensure_future(
            self.client.authorize("desk-7", "Light desk", operator_time_limit=LIMIT)
        )
        loop = asyncio.get_running_loop()
        await loop.run_in_executor(None, self.host.wait_for_dialog)
        self.assertEqual("Light desk", self.host.state()["dialog"]["clientName"])
        self.assertEqual("ok", await loop.run_in_executor(None, self.host.command, answer))
        return await asyncio.wait_for(asking, LIMIT)

    async def ask_again(self, name: str) -> Authorization:
        """An outcome is told a moment before its request is over; until then it is "Connected"."""
        outcome = await self.client.authorize("desk-7", name)
        while outcome.status == "Connected":
            outcome = await self.client.authorize("desk-7", name)
        return outcome

    async def test_who_denies(self) -> None:
        outcome = await self.ask_and("answer deny forget")
        self.assertEqual("Failed", outcome.status)
        self.assertEqual({}, self.host.state()["control"])

    async def test_who_allows_and_remembers(self) -> None:
        self.assertTrue((await self.ask_and("answer allow remember")).granted)
        again = await self.ask_again("Another name")
        self.assertEqual("Authorized", again.status)
        self.assertIsNone(self.host.state()["dialog"])

    async def test_who_bans(self) -> None:
        self.assertEqual("Failed", (await self.ask_and("answer deny remember")).status)
        with self.client.listen("Event.Authorize") as events:
            again = await self.ask_again("Light desk")
            self.assertEqual("Failed", again.status)
            await self.client.commands()
            with self.assertRaises(TimedOutError):
                await events.next(0.01)

    async def test_whose_dialog_is_taken_away(self) -> None:
        loop = asyncio.get_running_loop()
        asking = asyncio.ensure_future(self.client.authorize("desk-7", "Light desk"))
        await loop.run_in_executor(None, self.host.wait_for_dialog)
        async with AsyncClient(OPTIONS) as other:
            await other.connect("127.0.0.1")
            self.assertEqual("Connected", (await other.authorize("desk-8", "Other")).status)
        await self.client.cancel_authorization("desk-7")
        await loop.run_in_executor(None, self.host.wait_for_dialog, False)
        asking.cancel()


class RestartedHost(unittest.IsolatedAsyncioTestCase):
    async def test_is_connected_to_and_authorized_with_anew(self) -> None:
        states: "asyncio.Queue[State]" = asyncio.Queue()
        loop = asyncio.get_running_loop()

        async def expect(state: State) -> None:
            while await asyncio.wait_for(states.get(), LIMIT) is not state:
                pass

        options = ClientOptions(time_limit=LIMIT, reconnect=BackOff(first=0.01, longest=0.1))
        async with AsyncClient(options) as client:
            client.on_state(lambda state, text: states.put_nowait(state))
            with await loop.run_in_executor(None, QuorixHost):
                await client.connect("127.0.0.1")
                self.assertTrue((await client.authorize("desk-7", "Light desk")).granted)
                await expect(State.AUTHORIZED)
            await expect(State.LOST)
            with await loop.run_in_executor(None, QuorixHost) as host:
                await expect(State.AUTHORIZED)
                self.assertEqual("Light desk", host.state()["control"]["desk-7"]["Name"])
                self.assertTrue((await client.execute("Host.Echo")).ok)


if __name__ == "__main__":
    unittest.main()
