# SPDX-License-Identifier: Apache-2.0
"""handset/scope: a page on this machine that shows a virtual phone and plays on it.

The page and this server talk through one WebSocket. From the page: {"id": N, "call": [words]} for
vibctl, {"id": N, "phone": [words]} for the phone tool, {"id": N, "profile": name}, {"id": N,
"doctor": true}. To the page: answers with that id, and the lines, the drive and the state as they
change. Only who has the token gets in, and only from this machine.
"""

import asyncio
import collections
import json
import os
import secrets
import shlex
import shutil
import signal
import socket
import sys
import tempfile

from aiohttp import WSMsgType, web

from failure import Failure, Parser, path
from live import LiveRun
from options import built_in_profiles, whole

_VIEW = os.path.dirname(os.path.realpath(__file__))
_HANDSET = os.path.dirname(_VIEW)
_PAGE = os.path.join(_VIEW, "page")
_PLOTS = "/usr/share/javascript/dygraphs"
_FILES = {"scope.js": _PAGE, "scope.css": _PAGE, "dygraph.min.js": _PLOTS, "dygraph.min.css": _PLOTS}
_LOOK_SECONDS = 0.02
_PHONE_WORDS = ("fault", "unplug", "plug", "service", "node", "status")
_ENDED = (3, "the handset has ended")
_CALL_SECONDS = 120  # vibctl itself gives up earlier, unless it is told to wait so long
_NO_CLIENT = "the client was started anew"
_KEPT = 2000  # lines that a page gets when it is opened


class Guest:
    """A handset whose guest runs one command after the other, or several at a time, and in which one
    client goes on living and makes call after call."""

    def __init__(self, options):
        self._options = options
        self._waiting, self._number = {}, 0
        self._calls = collections.deque()  # what the client owes, in the order of the calls
        self._process = None

    async def start(self, out):
        words = [os.path.join(_HANDSET, "run"), "--profile", "off", "--out", out, "--timeout",
                 "1000000"]
        if self._options.build:
            words += ["--build", self._options.build]
        self._process = await asyncio.create_subprocess_exec(
            *words, "--", os.path.join(_VIEW, "scope_guest"), stdin=asyncio.subprocess.PIPE,
            stdout=asyncio.subprocess.PIPE, start_new_session=True, limit=1 << 24)
        self.reader = asyncio.create_task(self._read())

    async def run(self, *words):
        """Runs a command in the guest; returns (exit status, what it printed)."""
        self._number += 1
        if self.reader.done():
            return _ENDED
        answer = self._waiting[str(self._number)] = asyncio.get_running_loop().create_future()
        self._process.stdin.write(f"{self._number} {shlex.join(words)}\n".encode())
        return await answer

    def start_client(self):
        """Starts the client, anew where there is one. To be called when the phone is up."""
        self._give_up(_NO_CLIENT)
        self._process.stdin.write(b"client\n")

    async def call(self, *words):
        """The client's answer to a call, as vibctl prints it with --json."""
        if self.reader.done():
            return _ENDED[1]
        answer = asyncio.get_running_loop().create_future()
        self._calls.append(answer)
        self._process.stdin.write(f"call {json.dumps(words)}\n".encode())
        try:
            return await asyncio.wait_for(answer, _CALL_SECONDS)
        except asyncio.TimeoutError:
            self.start_client()
            return _NO_CLIENT

    def _give_up(self, why):
        while self._calls:
            answer = self._calls.popleft()
            if not answer.done():
                answer.set_result(why)

    async def _read(self):
        while line := await self._process.stdout.readline():
            if line.startswith(b"{"):
                if self._calls:
                    self._calls.popleft().set_result(line.decode(errors="replace"))
                continue
            number, status, output = line.decode(errors="replace").rstrip("\n").split(" ", 2)
            self._waiting.pop(number).set_result((int(status), output.replace("\x1e", "\n")))
        for answer in self._waiting.values():
            answer.set_result(_ENDED)
        self._waiting.clear()
        self._give_up(_ENDED[1])

    async def stop(self):
        """Ends the guest in an orderly way, or, when that takes long, at once."""
        if self._process is None or self._process.returncode is not None:
            return
        self._process.stdin.close()
        try:
            await asyncio.wait_for(self._process.wait(), 20)
        except asyncio.TimeoutError:
            self._process.terminate()
            await self._process.wait()


class Scope:
    """The server: the guest, the run under way, and the pages that look at it."""

    def __init__(self, options, token):
        self._options, self._token = options, token
        self._pages, self._lines = set(), []
        self._calls = asyncio.Lock()
        self._cause = {"number": 0, "text": ""}
        self._state = {"profile": options.profile, "phone": "starting",
                       "profiles": built_in_profiles()}
        self._guest, self._run, self._sent = Guest(options), None, []
        self._client = False    # whether there is one to make calls
        self._recorded = False  # whether it has recorded the call under way

    def application(self):
        application = web.Application(middlewares=[self._guard])
        application.add_routes([web.get("/", self._index), web.get("/socket", self._socket),
                                web.get("/{name}", self._file)])
        application.cleanup_ctx.append(self._life)
        return application

    # --- who may come in --------------------------------------------------------------------------

    @web.middleware
    async def _guard(self, request, handler):
        # The name is checked too: another page could have its own name lead here.
        if request.host.rsplit(":", 1)[0] not in ("127.0.0.1", "localhost"):
            raise web.HTTPForbidden(text="This page is for this machine alone.\n")
        given = request.query.get("token") or request.cookies.get("token") or ""
        if not secrets.compare_digest(given.encode(), self._token.encode()):
            raise web.HTTPForbidden(text="Wrong token: open the address that handset/scope "
                                         "printed.\n")
        origin = request.headers.get("Origin")
        if origin is not None and origin != f"http://{request.host}":
            raise web.HTTPForbidden(text="Another page has no business here.\n")
        response = await handler(request)
        if not response.prepared:
            response.headers["Content-Security-Policy"] = "default-src 'self'; img-src data:; " \
                                                          "style-src 'self' 'unsafe-inline'"
            response.headers["Cache-Control"] = "no-store"
            response.headers["Referrer-Policy"] = "no-referrer"
        return response

    async def _index(self, _):
        response = web.FileResponse(os.path.join(_PAGE, "index.html"))
        response.set_cookie("token", self._token, httponly=True, samesite="Strict")
        return response

    async def _file(self, request):
        name = request.match_info["name"]
        if name not in _FILES:
            raise web.HTTPNotFound()
        return web.FileResponse(os.path.join(_FILES[name], name))

    # --- the pages --------------------------------------------------------------------------------

    async def _socket(self, request):
        page = web.WebSocketResponse(max_msg_size=1 << 20)
        await page.prepare(request)
        await page.send_json({"state": self._state})
        await page.send_json({"lines": self._lines[-_KEPT:]})
        await page.send_json({"drive": {"from": 0, "stretches": self._sent,
                                          "now": self._run.now() if self._run else None}})
        self._pages.add(page)
        tasks = set()
        try:
            async for message in page:
                if message.type == WSMsgType.TEXT:
                    task = asyncio.create_task(self._answer(page, message.data))
                    tasks.add(task)
                    task.add_done_callback(tasks.discard)
        finally:
            self._pages.discard(page)
        return page

    async def _tell(self, **message):
        for page in list(self._pages):
            try:
                await page.send_json(message)
            except (ConnectionError, RuntimeError):
                self._pages.discard(page)

    async def _answer(self, page, text):
        number = None
        try:
            asked = json.loads(text)
            number = asked["id"]
            answer = await self._do(asked)
        except (ValueError, KeyError, TypeError) as error:
            answer = {"status": 2, "output": f"not understood: {error}"}
        if not page.closed:
            await page.send_json({"id": number, **answer})

    async def _do(self, asked):
        if "call" in asked:
            return await self._call([str(word) for word in asked["call"]])
        if "profile" in asked:
            return await self._bring_up(asked["profile"])
        if asked.get("doctor"):
            return await self._examine()
        words = [str(word) for word in asked["phone"]]
        if words[:1] and words[0] not in _PHONE_WORDS:
            raise ValueError(f"phone {words[0]}")
        await self._add([{"us": None, "source": "you", "bad": True,
                          "text": "phone " + " ".join(words)}], {"number": 0, "text": ""})
        answer = _answer(await self._guest.run("phone", *words))
        await self._show_phone(_answer(await self._guest.run("phone", "status"))["output"])
        return answer

    async def _examine(self):
        answer = _answer(await self._guest.run("phone", "exec", "--", "vibctl", "doctor"))
        await self._tell(findings=answer["output"])
        return answer

    async def _show_phone(self, text):
        self._state.update(phone=text.strip())
        await self._tell(state=self._state)

    async def _call(self, words):
        if words[:1] not in (["std"], ["ext"]):
            raise ValueError("a call begins with std or ext")
        async with self._calls:
            self._cause = {"number": self._cause["number"] + 1, "text": " ".join(words)}
            await self._add([{"us": None, "source": "call", "bad": False,
                              "text": " ".join(words)}])
            if not self._client:
                return {"status": 3, "output": "the phone is not up"}
            self._recorded = False
            output = await self._guest.call(*words)
            fields = _fields(output)
            await self._look()
            if not self._recorded:  # nothing was called
                await self._add([{"us": None, "source": "answer", "bad": True,
                                  "text": fields.get("text") or output}])
            well = fields.get("exception") == 0 and fields.get("callback") != "timeout"
            return {"status": 0 if well else 1, "output": output}

    async def _add(self, lines, cause=None):
        for line in lines:
            line["cause"] = cause or self._cause
        self._lines += lines
        del self._lines[:-_KEPT]
        if lines:
            await self._tell(lines=lines)

    # --- the phone --------------------------------------------------------------------------------

    async def _life(self, _):
        with tempfile.TemporaryDirectory(prefix="scope-") as directory:
            self._directory = directory
            await self._guest.start(directory)
            work = [asyncio.create_task(self._follow()), self._guest.reader,
                    asyncio.create_task(self._bring_up(self._options.profile))]
            self._guest.reader.add_done_callback(
                lambda _: asyncio.ensure_future(self._show_phone(_ENDED[1])))
            yield
            for task in work:
                task.cancel()
            for page in list(self._pages):
                await page.close()
            await self._guest.stop()

    async def _bring_up(self, profile):
        if profile not in self._state["profiles"]:
            raise ValueError(f"no profile {profile}")
        self._state.update(profile=profile)
        await self._show_phone("starting")
        self._client = False
        if self._run is not None:
            await self._guest.run("phone", "down")
        out = os.path.join(self._directory, profile)
        shutil.rmtree(out, ignore_errors=True)
        self._run, self._sent, self._lines = None, [], []
        self._cause = {"number": self._cause["number"], "text": ""}
        await self._tell(cleared=True)
        self._run = LiveRun(out)
        answer = _answer(await self._guest.run("phone", "up", "--profile", profile, "--out",
                                               f"/run/handset/out/{profile}"))
        self._client = answer["status"] < 2
        if self._client:
            self._guest.start_client()
        await self._show_phone(answer["output"])
        return await self._examine()

    async def _follow(self):
        while True:
            await asyncio.sleep(_LOOK_SECONDS)
            await self._look()

    async def _look(self):
        """Tells the pages what is new."""
        run = self._run
        if run is None:
            return
        lines = run.look()
        self._recorded = self._recorded or any(line["source"] == "answer" for line in lines)
        await self._add(lines)
        drive = run.drive()
        if drive is not None and run is self._run:
            self._sent[drive["from"]:] = drive["stretches"]
            await self._tell(drive=drive)


def _answer(result):
    return {"status": result[0], "output": result[1]}


def _fields(output):
    """What vibctl printed with --json, as a dictionary; an empty one where it is none."""
    try:
        fields = json.loads(output)
    except ValueError:
        return {}
    return fields if isinstance(fields, dict) else {}


def main(program, description, words):
    """handset/scope; returns its exit status."""
    parser = Parser(program, description)
    parser.add_argument("--profile", metavar="NAME", default="leds",
                        help="what phone comes up first (default leds)")
    parser.add_argument("--port", metavar="PORT", type=whole(0, 65535), default=0,
                        help="default: one that is free")
    parser.add_argument("--build", metavar="DIR", type=path,
                        help="build directory (default build/release)")
    try:
        options = parser.parse_args(words)
        if options.profile not in built_in_profiles():
            raise Failure(f"no profile '{options.profile}': use {', '.join(built_in_profiles())}")
    except Failure as failure:
        print(f"{program}: {failure}", file=sys.stderr)
        return 2
    token = secrets.token_urlsafe(24)
    try:
        asyncio.run(_serve(Scope(options, token), options.port, token))
    except OSError as error:
        print(f"{program}: {error}", file=sys.stderr)
        return 2
    return 0


async def _serve(scope, port, token):
    ended = asyncio.Event()
    for number in (signal.SIGINT, signal.SIGTERM, signal.SIGHUP):
        asyncio.get_running_loop().add_signal_handler(number, ended.set)
    runner = web.AppRunner(scope.application(), access_log=None)
    await runner.setup()
    try:
        listening = socket.create_server(("127.0.0.1", port))
        await web.SockSite(runner, listening).start()
        print(f"http://127.0.0.1:{listening.getsockname()[1]}/?token={token}", flush=True)
        await ended.wait()
    finally:
        await runner.cleanup()
