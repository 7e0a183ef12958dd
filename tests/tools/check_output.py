"""Compares what each command prints with --json with its schema, docs/quillmere-output.schema.json.

    check_output.py PROGRAM EMULATOR SCHEMA

It runs every command that the program's help lists on an account of a local service, in a home of its own. A command
that the schema or this script does not know is an error, and so is a document with a field more or less.
"""

import json
import os
import re
import signal
import subprocess
import sys
import tempfile

import jsonschema

PROGRAM, EMULATOR, SCHEMA = sys.argv[1:]
PRINTS_NO_JSON = {"completion"}


def leads_elsewhere(name):
    return name.startswith(("QUILLMERE_", "XDG_")) or name == "SSL_CERT_FILE" or name.lower().endswith("_proxy")


class Home:
    """An account, a service that knows it, and a command line that talks to it."""

    def __init__(self, folder):
        self.folder = folder
        self.data = self.path("service")
        self.environment = {name: value for name, value in os.environ.items() if not leads_elsewhere(name)}
        self.environment |= {"HOME": folder, "TMPDIR": folder, "QUILLMERE_EMULATOR": self.path("ready.json")}
        self.write("password", "a pass word\n")
        for who in ("ada", "bob"):
            self.run([EMULATOR, "add-account", "--data", self.data, "--email", f"{who}@example.com",
                      "--password-file", self.path("password")])
        self.service = self.start()

    def path(self, name):
        return os.path.join(self.folder, name)

    def write(self, name, content):
        with open(self.path(name), "w", encoding="utf-8") as file:
            file.write(content)
        return self.path(name)

    def run(self, words):
        return subprocess.run(words, env=self.environment, cwd=self.folder, capture_output=True, check=False,
                              text=True)

    def start(self):
        ready, told = os.pipe()
        service = subprocess.Popen(
            [EMULATOR, "--data", self.data, "--port", "0", "--http-port", "0", "--ready-fd", str(told),
             "--ready-file", self.path("ready.json")],
            env=self.environment, stdout=subprocess.DEVNULL, pass_fds=[told])
        os.close(told)
        with open(ready, encoding="utf-8") as pipe: # which ends with the service, if that does not start
            if "https_url" not in pipe.readline():
                raise SystemExit("the emulator did not start")
        return service

    def stop(self):
        self.service.send_signal(signal.SIGTERM)
        self.service.wait()


class Checker:
    def __init__(self, home):
        self.home = home
        with open(SCHEMA, encoding="utf-8") as file:
            self.schema = json.load(file)
        jsonschema.Draft202012Validator.check_schema(self.schema)
        self.seen = set()

    def validator(self, reference):
        return jsonschema.Draft202012Validator({"$ref": reference, "$defs": self.schema["$defs"]})

    def document(self, words, expected_exit=0):
        ended = self.home.run([PROGRAM, *words, "--json"])
        if ended.returncode != expected_exit:
            raise SystemExit(f"{words}: exit code {ended.returncode}\n{ended.stdout}{ended.stderr}")
        return json.loads(ended.stdout)

    def check(self, *words, exit_code=0):
        """The document of a command that succeeds is the one that the schema describes for it."""
        found = self.document(words, exit_code)
        self.match(found, f"#/$defs/commands/properties/{words[0]}", words)
        self.seen.add(words[0])
        return found

    def check_error(self, *words, exit_code):
        self.match(self.document(words, exit_code), "#/$defs/error", words)

    def match(self, found, reference, words):
        for validator in (self.validator(reference), jsonschema.Draft202012Validator(self.schema)):
            problems = [f"{'/'.join(map(str, each.absolute_path))}: {each.message}"
                        for each in validator.iter_errors(found)]
            if problems:
                raise SystemExit(f"{words}: {found}\n" + "\n".join(problems))
        self.match_nothing_else(found, self.validator(reference), words)

    @staticmethod
    def match_nothing_else(found, validator, words):
        """A schema that takes anything would be no help: it must notice a field that is missing or new."""
        for changed in ({**found, "unheard_of": 1}, {key: found[key] for key in list(found)[1:]}):
            if validator.is_valid(changed):
                raise SystemExit(f"{words}: the schema takes {changed}, too")

    def check_all_seen(self):
        listed = set()
        for line in self.home.run([PROGRAM, "--help"]).stdout.split("Subcommands:")[1].splitlines():
            if found := re.match(r"  ([a-z][a-z-]*) ", line):
                listed.add(found[1])
        described = set(self.schema["$defs"]["commands"]["properties"])
        for name, missing in (("no schema", listed - described - PRINTS_NO_JSON),
                              ("no check", listed - self.seen - PRINTS_NO_JSON),
                              ("no such command", described - listed)):
            if missing:
                raise SystemExit(f"{name}: {', '.join(sorted(missing))}")


def check_sessions(checker):
    password = checker.home.path("password")
    checker.check("login", "ada@example.com", "--password-file", password)
    checker.check("renew")
    checker.check("login-token", "ada@example.com", "--password-file", password,
                  "--token-file", checker.home.path("token"))
    checker.check("whoami")
    checker.check("status")
    checker.check("limits")
    checker.check("device-status")


def check_tree(checker):
    home = checker.home
    checker.check("ls")
    checker.check("mkdir", "-p", "/a/b")
    checker.check("create", "/a/empty")
    checker.check("put", home.write("one.txt", "one\n"), "/a")
    checker.check("put", home.write("one.txt", "two\n"), "/a")
    checker.check("update", home.write("one.txt", "three\n"), "/a/one.txt")
    checker.check("get", "/a/one.txt", home.path("back.txt"))
    checker.check("get", "/a/one.txt", home.path("back.txt"))
    checker.check("mirror", "/a", home.path("copy"), "--dry-run")
    checker.check("mirror", "/a", home.path("copy"))
    checker.check("mirror", "/a", home.path("copy"))
    checker.check("ls", "/a")
    checker.check("ls", "-l", "/a")
    for path in ("/", "/a", "/a/one.txt", "/a/empty"):
        checker.check("stat", path)
    checker.check("set", "/a/one.txt", "--description", "first", "--privacy", "private")
    checker.check("links", "/a/one.txt")
    checker.check("links", "/a/one.txt", "--type", "view")
    checker.check("links", "/a/one.txt", "--download")
    checker.check("cp", "/a/one.txt", "/a/b")
    checker.check("mv", "/a/b", "/c")
    checker.check("rm", "-r", "/c")
    checker.check("changes")
    checker.check("changes", "--sample")


def check_foreign(checker):
    key = checker.check("stat", "/a")["key"]
    checker.check("login", "bob@example.com", "--password-file", checker.home.path("password"))
    checker.check("attach", f"key:{key}")
    checker.check("ls")
    checker.check("detach", "/a")


def check_errors(checker):
    checker.check_error("frobnicate", exit_code=2)
    checker.check_error("stat", "/absent", exit_code=3)
    checker.check_error("rm", "key:absent", exit_code=3)
    checker.check_error("put", checker.home.path("absent"), exit_code=9)
    checker.check_error("status", "--service", "https://127.0.0.1:1", "--retries", "0", exit_code=5)
    checker.check("logout")
    checker.check("logout")
    checker.check_error("ls", exit_code=4)


def main():
    with tempfile.TemporaryDirectory() as folder:
        home = Home(folder)
        try:
            checker = Checker(home)
            check_sessions(checker)
            check_tree(checker)
            check_foreign(checker)
            checker.check("doctor")
            checker.check("doctor", "--service", "https://127.0.0.1:1", exit_code=5)
            checker.check("quickstart")
            check_errors(checker)
            checker.check_all_seen()
        finally:
            home.stop()


main()
