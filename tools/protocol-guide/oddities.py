"""What looks like a mistake and is not. Each stands with probes that a running host must answer."""

from __future__ import annotations

from typing import List

from facts import CAMERA_1, SILENCE, UNKNOWN_COMMAND, Oddity, execute, reply

NOTHING_FOUND = (
    "<Description>Command not found.</Description><InputParameters/><ReplyParameters/>"
    "</CommandInformation>"
)

ODDITIES: List[Oddity] = [
    Oddity(
        "Silence",
        "A message that the host does not take gets no reply, no error, and the connection stays "
        "open: text that is not XML, an unknown element, a missing or empty `Correlation`. Such a "
        "message cannot be told from a lost one, so check yours before you send it.",
        "There is no message for an error, and devices of every age would not know a new one.",
        [
            ("this is not XML", SILENCE),
            ("<Novelty/>", SILENCE),
            ("<Commands/>", SILENCE),
            ("<ExecuteCommand><Name>Host.Echo</Name></ExecuteCommand>", SILENCE),
        ],
    ),
    Oddity(
        "One request of a frame is answered",
        "Of several at the top of one frame the host takes one, and the others are lost: the first "
        "that is whole in the order `ExecuteCommand`, `ServerInformation`, `Commands`, "
        "`CommandInformation`, `EventInformation`, `Events`. Other elements beside it are passed "
        "over.",
        "Devices send one request a frame, so that nobody misses the others.",
        [
            (
                "<Novelty/><Commands/><EventInformation>Event.Disconnect</EventInformation><Events/>",
                "<EventInformation><Name/><Description/><Parameters/></EventInformation>",
            )
        ],
    ),
    Oddity(
        "The declaration says UTF-16",
        'Every message of the host says `encoding="UTF-16"`, and its bytes are UTF-8. Decode the '
        "bytes as UTF-8 first, and keep your XML reader from looking at the declaration: cut it "
        "off. What you send needs none.",
        "Devices skip these very bytes.",
        [
            (
                execute("Host.Echo", ("Text", "é😀")),
                reply("Host.Echo", ("Text", "é😀")),
            )
        ],
    ),
    Oddity(
        "Two elements at the top of one reply",
        "`Correlation` stands beside `Commands`, and in every other reply it stands inside. An XML "
        "reader that wants one root needs one put around it.",
        "Devices look for it there.",
    ),
    Oddity(
        "Entities are decoded in the values of parameters only",
        "`Name` and `Correlation` are taken as they stand. Written as `a&amp;b`, a correlation is "
        "seven characters, and comes back encoded once more. So use letters and digits. In a "
        "value the five entities are decoded, `&amp;` last, and references by number are not.",
        "Devices compare what comes back with what they know to come back.",
        [
            (
                execute("Host.Echo", correlation="a&amp;b"),
                reply("Host.Echo", correlation="a&amp;amp;b"),
            ),
            (
                execute("Host.Echo", ("Text", "&lt;&amp;lt;&quot;")),
                reply("Host.Echo", ("Text", "&lt;&amp;lt;&quot;")),
            ),
            (
                execute("Host.Echo", ("Text", "&#233;")),
                reply("Host.Echo", ("Text", "&amp;#233;")),
            ),
        ],
    ),
    Oddity(
        "White space alone counts as empty",
        "A correlation of one blank is none, and a value of one blank arrives as an empty one. "
        "Blanks before and behind other characters stay. A CDATA section is no value either.",
        "It is how the server's XML reader sees text.",
        [
            ("<Commands><Correlation> </Correlation></Commands>", SILENCE),
            ("<Commands><Correlation><![CDATA[7]]></Correlation></Commands>", SILENCE),
            (
                execute("Host.Echo", ("A", " "), ("B", " x ")),
                reply("Host.Echo", ("A", ""), ("B", " x ")),
            ),
        ],
    ),
    Oddity(
        "Parameters",
        "An absent parameter cannot be told from an empty one. A name that is given twice keeps "
        "the later value. Behind the first `Parameter` every element counts as one, whatever its "
        "name, and one without a `Name` spoils the message: nothing is run. The reply has them in "
        "the order of their names.",
        "A stricter server would refuse what devices send today.",
        [
            (
                execute("Host.Echo", ("B", "1"), ("A", "2"), ("B", "3")),
                reply("Host.Echo", ("A", "2"), ("B", "3")),
            ),
            (
                "<ExecuteCommand><Name>Host.Echo</Name><Correlation>7</Correlation><Parameters>"
                "<Parameter><Name>A</Name><Value>1</Value></Parameter>"
                "<Novelty><Name>B</Name></Novelty></Parameters></ExecuteCommand>",
                reply("Host.Echo", ("A", "1"), ("B", "")),
            ),
            (execute("Host.Echo", ("A", "1"), ("", "2")), SILENCE),
        ],
    ),
    Oddity(
        "The description of a command's parameter is called Value",
        "In the reply to `CommandInformation` the text for people stands in `Value`; in that to "
        "`EventInformation` it would stand in `Description`.",
        "Devices read it by that name.",
    ),
    Oddity(
        "Events are not described",
        "The reply to `EventInformation` is empty for every event, known or not. Its request has "
        "the name as its own text: a `Name` inside gets silence. Neither it nor `Events` carries a "
        "correlation; the host answers in the order in which it was asked.",
        "The names and parameters of events are part of this protocol and stand above.",
        [
            (
                "<EventInformation>Event.Disconnect</EventInformation>",
                "<EventInformation><Name/><Description/><Parameters/></EventInformation>",
            ),
            ("<EventInformation><Name>Event.Disconnect</Name></EventInformation>", SILENCE),
        ],
    ),
    Oddity(
        'An unknown command is described as "Command not found."',
        "There is no failure in the reply to `CommandInformation`. The three commands of the "
        "authorization are described so too, though they exist.",
        "Devices know those three from the protocol.",
        [
            (
                "<CommandInformation><Correlation>7</Correlation><Name>System.Authorize</Name>"
                "</CommandInformation>",
                f"<CommandInformation><Correlation>7</Correlation><Name/>{NOTHING_FOUND}",
            )
        ],
    ),
    Oddity(
        "A cancellation is answered by a failure",
        "`System.Authorize.Cancel` closes the operator's dialog and then answers as an unknown "
        "command does. It looks at no device: a device can cancel another's request. One that "
        "comes before the dialog is on the screen closes nothing.",
        "Devices take that answer for granted.",
        [
            (
                execute("System.Authorize.Cancel", ("DeviceId", "desk-9")),
                reply("System.Authorize.Cancel", result=UNKNOWN_COMMAND),
            )
        ],
    ),
    Oddity(
        "A heartbeat belongs to nobody",
        "`System.Heartbeat` names no device, and needs no authorization. Any connected device "
        "keeps the place of the one that is let in.",
        "A field for the device would be one more that old devices do not send.",
        [
            (
                execute("System.Heartbeat", ("BeatId", "41")),
                reply("System.Heartbeat", ("BeatId", "41")),
            ),
            (execute("System.Heartbeat"), reply("System.Heartbeat", ("BeatId", ""))),
        ],
    ),
    Oddity(
        "Two commands do nothing",
        "`CameraSettings_EnableStrobes` and `CameraSettings_DisableStrobes` are answered with OK "
        "and change nothing, in spite of their descriptions.",
        "Devices send them, and expect OK.",
        [
            (
                execute("CameraSettings_DisableStrobes"),
                reply("CameraSettings_DisableStrobes"),
            )
        ],
    ),
    Oddity(
        "The greyscale mode cannot be asked for",
        "`CameraSettings_GetGreyscaleMode` fails for a camera that works. Keep what "
        "`Event.Cameras.GreyscaleModeChanged` tells.",
        "Devices in use expect this answer, and take the mode from the event.",
        [
            (
                execute("CameraSettings_GetGreyscaleMode", CAMERA_1),
                reply(
                    "CameraSettings_GetGreyscaleMode",
                    result="Error: Unable to access requested data.",
                ),
            )
        ],
    ),
    Oddity(
        "A number that is none is written all the same",
        "A camera's setting that cannot be read as a number is answered with OK, and what is "
        "written then is not settled. Nor is a range checked: the host keeps what it can. Check "
        "your numbers, and believe the event.",
        "The check would turn today's OK into a failure.",
        [
            (
                execute(
                    "CameraSettings_SetStrobeIntensity",
                    CAMERA_1,
                    ("Param_StrobeIntensity", "bright"),
                ),
                reply("CameraSettings_SetStrobeIntensity"),
            ),
            (
                execute(
                    "CameraSettings_SetStrobeIntensity", CAMERA_1, ("Param_StrobeIntensity", "5.0")
                ),
                reply("CameraSettings_SetStrobeIntensity"),
            ),
        ],
    ),
    Oddity(
        "Small and great numbers have an exponent",
        'A number comes back in the host\'s own writing: "0.5", "1.0", and below 0.001 or from '
        '100000 on "1.0e-04". The last digits may differ from what was sent.',
        "It is how the host writes numbers everywhere.",
        [
            (
                execute(
                    "CameraSettings_SetStrobeIntensity",
                    CAMERA_1,
                    ("Param_StrobeIntensity", "0.0001"),
                ),
                reply("CameraSettings_SetStrobeIntensity"),
            ),
            (
                execute("CameraSettings_GetStrobeIntensity", CAMERA_1),
                reply("CameraSettings_GetStrobeIntensity", ("Param_StrobeIntensity", "1.0e-04")),
            ),
        ],
    ),
    Oddity(
        "An unknown greyscale mode means None",
        "`CameraSettings_SetGreyscaleMode` compares exactly. A text that is none of the six "
        'switches the camera\'s greyscale off and is answered with OK. "No Edges" has a blank.',
        "Devices rely on being answered with OK.",
        [
            (
                execute(
                    "CameraSettings_SetGreyscaleMode", CAMERA_1, ("Param_GreyscaleMode", "noedges")
                ),
                reply("CameraSettings_SetGreyscaleMode"),
            )
        ],
    ),
    Oddity(
        "ToggleTap does not toggle",
        '`CameraSettings_ToggleTap` switches tap-to-select on for exactly "1" and off for '
        'anything else, "true" and nothing at all included.',
        "Devices send the state that they want.",
        [
            (
                execute("CameraSettings_ToggleTap", ("Param_TapEnabled", "true")),
                reply("CameraSettings_ToggleTap"),
            ),
            (
                execute("CameraSettings_GetTapEnabled"),
                reply("CameraSettings_GetTapEnabled", ("Param_TapEnabled", "0")),
            ),
        ],
    ),
    Oddity(
        "A selection that becomes empty is not told",
        "Numbers that cannot be read are left out of a selection without a word, and "
        "`Event.Cameras.SelectionChanged` is not sent where nothing is selected any more.",
        "Devices were written against it.",
        [
            (
                execute("CameraSettings_SetSelection", ("Param_CameraSelection", "1,two,3")),
                reply("CameraSettings_SetSelection"),
            ),
            (
                execute("CameraSettings_GetSelection"),
                reply("CameraSettings_GetSelection", ("Param_CameraSelection", "1,3")),
            ),
        ],
    ),
]
