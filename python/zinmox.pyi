"""Sessions on MOX debug cores: named signals, pulse trains, activity and whole ports, plus the
simulated target for test benches. Failures raise zinmox.Error; other session messages go to
the logger "zinmox"."""

import os
from typing import Any, Literal, Mapping, Sequence, overload

__version__: str
"""The version of the libZinMOX build this module belongs to, "MAJOR.MINOR.PATCH"."""

CoreRef = tuple[int, int, int] | list[int] | str
"""A (device, chain, core) tuple or a "D:C:I" text; numbers decimal or 0x hex."""

Port = Literal["sync_out", "sync_in", "async_out", "async_in"]
InputPort = Literal["sync_in", "async_in"]
StepValue = int | str
WriteValue = int | str | list[StepValue] | tuple[StepValue, ...]

class Error(RuntimeError):
    """A failed call. str() gives the session's message texts of that call, one per line."""

    function: str
    """The exported function (or the operation) that failed."""
    messages: list[tuple[int, str]]
    """(code, text) of each message, in the order the session received them."""
    texts: list[str]
    codes: list[int]
    """256 for an error, 32768 for "Zin abort command"."""

class Reading:
    """What Core.read() reports for one input signal; bit i of each field is bit i of the
    signal."""

    def __init__(
        self,
        value: int,
        activity_up: int,
        activity_down: int,
        sync_activity_up: int | None = None,
        sync_activity_down: int | None = None,
    ) -> None: ...
    @property
    def value(self) -> int: ...
    @property
    def activity_up(self) -> int: ...
    @property
    def activity_down(self) -> int: ...
    @property
    def sync_activity_up(self) -> int | None:
        """None for asynchronous inputs."""
    @property
    def sync_activity_down(self) -> int | None:
        """None for asynchronous inputs."""
    def __eq__(self, other: object) -> bool: ...

class Ports:
    """Whole-port access. Vectors are bytes with port bit i in bit i % 8 of byte i // 8."""

    def write(
        self,
        *,
        async_out: bytes | bytearray | memoryview | None = None,
        sync_out: bytes | bytearray | memoryview | None = None,
        async_mask: bytes | bytearray | memoryview | None = None,
        sync_mask: bytes | bytearray | memoryview | None = None,
    ) -> None:
        """Writes whole output ports in one transfer. async_out: ceil(A_out/8) bytes; sync_out:
        16 step vectors of ceil(S_out/8) bytes, step t at byte t*ceil(S_out/8). A port given as
        None is left out; a mask of None updates every bit of a given port."""
    def read(self) -> dict[str, bytes]:
        """Reads both input ports with their activity in one transfer. Keys: async_in,
        async_in_activity_up, async_in_activity_down, sync_in, sync_in_activity_up,
        sync_in_activity_down, sync_in_sync_activity_up, sync_in_sync_activity_down."""

class Core:
    """A MOX core of a session. Every method is one call of the library; a failure raises
    zinmox.Error with that call's messages."""

    @property
    def ref(self) -> tuple[int, int, int]: ...
    def init(self) -> Core:
        """Sets up the core's object with the reserved whole-port signals "async_out_data",
        "sync_out_data", "async_in_data" and "sync_in_data"; a core set up before loses its
        names. Returns the core."""
    def terminate(self) -> None: ...
    @property
    def info(self) -> dict[str, int]:
        """The twelve information fields (manufacturer_id ... sync_output_count) as ints."""
    def define(self, name: str, port: Port, bits: int | Sequence[int] | str) -> None:
        """Names one port bit, a list of them (a bus; value bit i is port bit bits[i]) or a
        bit-list text such as "0-7" (at most the port's width). A bit listed twice, or an
        output name with '.' or '=', raises ValueError."""
    def undefine(self, name: str, port: Port) -> None: ...
    @overload
    def sizes(self, names: str, output: bool = True) -> int: ...
    @overload
    def sizes(self, names: list[str] | tuple[str, ...], output: bool = True) -> list[int]: ...
    def write(self, values: Mapping[str, WriteValue] | None = None, /, **signals: WriteValue) -> None:
        """Writes named outputs in one transfer. An int must be non-negative and fit the
        signal; a hex text may start with "0x", which is removed (a shorter text is sign-extended,
        a longer one keeps its last digits); a list of 16 steps is a pulse train, step 0 first."""
    def read(self) -> dict[str, Reading]:
        """Reads every input signal in one transfer; reading clears the activity latches."""
    @property
    def ports(self) -> Ports: ...

class SimTarget:
    """The simulated target behind a session, for test benches."""

    def set_input(self, ref: CoreRef, port: InputPort, bit: int, source: int | Mapping[str, Any]) -> None:
        """Rewires one input bit: 0, 1, or a source dict such as {"kind": "square",
        "period": 8}, {"kind": "counter", "bit": 0} or {"kind": "loopback", "output": "async",
        "bit": 3}."""
    def advance(self, cycles: int) -> None:
        """Lets cycles pass on every MOX core; OverflowError past a cycle count of 2**64-1."""
    def set_cycles_per_sequence(self, cycles: int) -> None: ...
    def levels(self, ref: CoreRef, port: Port) -> int:
        """The levels of a port, bit i = port bit i."""
    def cycle(self, ref: CoreRef) -> int: ...
    def command_log(self) -> list[str]: ...
    def clear_command_log(self) -> None: ...
    @property
    def flush_count(self) -> int: ...
    def fail_next_transfer(self, message: str) -> None: ...
    def fail_next_status_read(self, message: str) -> None: ...

class Session:
    """A JTAG session. target: None for the simulated demo design, the path of a target
    description file, "tcp://HOST:PORT" or "tls://HOST:PORT" of a target server, or a dict in
    the description format. token: the token the server requires (default: ZINMOX_TOKEN);
    tls_ca: PEM file of the certificate authorities for tls://. A context manager that closes
    the session."""

    def __init__(
        self,
        target: None | str | os.PathLike[str] | dict[str, Any] = None,
        *,
        token: str = "",
        tls_ca: str = "",
    ) -> None: ...
    def close(self) -> None: ...
    @property
    def closed(self) -> bool: ...
    @property
    def handle(self) -> int: ...
    @property
    def target(self) -> SimTarget | None: ...
    def __enter__(self) -> Session: ...
    def __exit__(self, *args: object) -> bool: ...
    def scan(self) -> list[dict[str, Any]]:
        """Each core: {"ref": (d, c, i), "mox": bool, "info": dict[str, int] | None}."""
    def core(self, ref: CoreRef) -> Core: ...
