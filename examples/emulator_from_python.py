"""How do I test a client in Python against the emulator?

Starts the emulator with an account, logs in over HTTPS, has it fail once and sees that it did. It
needs nothing but Python's standard library. The program is found in PATH, or named by
EMULATOR_PROGRAM.

    python3 emulator_from_python.py
"""

import hashlib
import json
import os
import ssl
import subprocess
import tempfile
import unittest
import urllib.error
import urllib.parse
import urllib.request
import xml.etree.ElementTree

PROGRAM = os.environ.get("EMULATOR_PROGRAM", "quillmere-emulator")
EMAIL = "ann@example.org"
PASSWORD = "a secret"
APPLICATION_ID = "42"  # every new store knows this application
APPLICATION_KEY = "quillmere-development-key"


class Emulator:
    """A service of a test's own, which is gone with the object."""

    def __init__(self, data):
        subprocess.run(
            [PROGRAM, "add-account", "--data", data, "--email", EMAIL, "--password-file", "-"],
            input=PASSWORD.encode(), check=True, stdout=subprocess.DEVNULL)
        reading, writing = os.pipe()
        self.process = subprocess.Popen(
            [PROGRAM, "--data", data, "--admin", "127.0.0.1:0", "--ready-fd", str(writing)],
            pass_fds=[writing], stdout=subprocess.DEVNULL)
        os.close(writing)
        with open(reading, encoding="utf-8") as pipe:
            ready = pipe.read()  # ends when it listens, or has failed to
        if not ready:
            raise RuntimeError(f"the emulator ended with {self.process.wait()}")
        self.addresses = json.loads(ready)
        context = ssl.create_default_context(cafile=self.addresses["ca_file"])
        self.opener = urllib.request.build_opener(
            urllib.request.ProxyHandler({}), urllib.request.HTTPSHandler(context=context))

    def stop(self):
        self.process.terminate()
        return self.process.wait()

    def call(self, action, **parameters):
        """Asks the service; the reply as XML."""
        url = f"{self.addresses['https_url']}/api/{action}.php"
        form = urllib.parse.urlencode(parameters).encode()
        with self.opener.open(url, form) as reply:
            return xml.etree.ElementTree.fromstring(reply.read())

    def admin(self, method, path, told=None):
        """Asks the admin address; the reply from JSON."""
        request = urllib.request.Request(
            self.addresses["admin_url"] + path, method=method,
            data=None if told is None else json.dumps(told).encode(),
            headers={"Content-Type": "application/json"})
        with self.opener.open(request) as reply:
            return json.load(reply)


class LogIn(unittest.TestCase):
    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.emulator = Emulator(os.path.join(folder.name, "data"))
        self.addCleanup(self.emulator.stop)

    def log_in(self):
        signed = EMAIL + PASSWORD + APPLICATION_ID + APPLICATION_KEY
        return self.emulator.call(
            "user/get_session_token", email=EMAIL, password=PASSWORD,
            application_id=APPLICATION_ID, signature=hashlib.sha1(signed.encode()).hexdigest())

    def test_gives_a_session(self):
        token = self.log_in().findtext("session_token")

        account = self.emulator.call("user/get_info", session_token=token)
        self.assertEqual(account.findtext("user_info/email"), EMAIL)

    def test_succeeds_after_the_service_was_unavailable(self):
        fault = self.emulator.admin("POST", "/faults", {
            "kind": "status", "status": 503, "path": "/api/user/", "count": 1})

        with self.assertRaises(urllib.error.HTTPError) as unavailable:
            self.log_in()
        unavailable.exception.close()
        self.assertEqual(unavailable.exception.code, 503)
        self.assertEqual(self.log_in().findtext("result"), "Success")

        counts = self.emulator.admin("GET", f"/faults/{fault['id']}")
        self.assertEqual((counts["seen"], counts["fired"]), (2, 1))


if __name__ == "__main__":
    unittest.main()
