#!/usr/bin/python3
"""A stand-in geolocation web service for the scan tool's tests, on loopback only.

Usage: geolocation_server.py LOG [--answer LAT,LNG,ACCURACY] [--slow SECONDS]

Listens on 127.0.0.1 at a free port and prints the port as its first line on
stdout. Every request is appended to LOG as one JSON line
{"method", "path", "headers", "body"} before it is answered, so a client that
has its answer finds its request logged.

The path chooses the answers: when its first segment is a comma-separated
list of modes (/notfound,normal/v1/geolocate), the n-th request to that path
gets the n-th mode, the last one repeating; any other path gets "normal".
Modes:
  normal       200 {"location": {"lat", "lng"}, "accuracy"} from --answer
  notfound     404 notFound, in the services' error format
  ratelimited  429 with the message "Too many requests, slow down"
  forbidden    403 keyInvalid
  badrequest   400 parseError
  slow         waits --slow seconds, then answers as normal
  malformed    200 with a body that is not JSON
  incomplete   200 with JSON that holds no position
"""

import argparse
import json
import threading
import time
from http.server import BaseHTTPRequestHandler, ThreadingHTTPServer

MODES = {"normal", "notfound", "ratelimited", "forbidden", "badrequest", "slow", "malformed",
         "incomplete"}


def service_error(code, reason, message):
    return code, json.dumps({"error": {
        "errors": [{"domain": "geolocation", "reason": reason, "message": message}],
        "code": code, "message": message}})


class Handler(BaseHTTPRequestHandler):
    protocol_version = "HTTP/1.1"

    def log_message(self, *args):
        pass

    def do_POST(self):
        length = int(self.headers.get("Content-Length", "0"))
        body = self.rfile.read(length).decode("utf-8", "replace")
        server = self.server
        with server.lock:
            with open(server.log, "a", encoding="utf-8") as log:
                log.write(json.dumps({"method": "POST", "path": self.path,
                                      "headers": dict(self.headers.items()), "body": body}) + "\n")
            mode = server.next_mode(self.path)

        if mode == "slow":
            time.sleep(server.slow)
            mode = "normal"
        lat, lng, accuracy = server.answer
        status, text = {
            "normal": (200, json.dumps({"location": {"lat": lat, "lng": lng},
                                        "accuracy": accuracy})),
            "notfound": service_error(404, "notFound", "Not found"),
            "ratelimited": service_error(429, "rateLimitExceeded", "Too many requests, slow down"),
            "forbidden": service_error(403, "keyInvalid", "Missing or invalid API key."),
            "badrequest": service_error(400, "parseError", "Parse Error"),
            "malformed": (200, "<html>not a position</html>"),
            "incomplete": (200, json.dumps({"location": {"lat": lat}, "accuracy": accuracy})),
        }[mode]
        data = text.encode("utf-8")
        try:
            self.send_response(status)
            self.send_header("Content-Type", "application/json")
            self.send_header("Content-Length", str(len(data)))
            self.end_headers()
            self.wfile.write(data)
        except (BrokenPipeError, ConnectionResetError):
            pass  # the client gave up waiting


class Server(ThreadingHTTPServer):
    daemon_threads = True

    def __init__(self, args):
        super().__init__(("127.0.0.1", 0), Handler)
        self.log = args.log
        self.answer = [float(v) for v in args.answer.split(",")]
        self.slow = args.slow
        self.lock = threading.Lock()
        self.requests = {}

    def next_mode(self, path):
        path = path.split("?", 1)[0]
        first = path.strip("/").split("/", 1)[0]
        modes = first.split(",")
        if not all(m in MODES for m in modes):
            return "normal"
        n = self.requests.get(path, 0)
        self.requests[path] = n + 1
        return modes[min(n, len(modes) - 1)]


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("log")
    parser.add_argument("--answer", default="60.1697,24.936,50")
    parser.add_argument("--slow", type=float, default=5.0)
    server = Server(parser.parse_args())
    print(server.server_address[1], flush=True)
    server.serve_forever()


if __name__ == "__main__":
    main()
