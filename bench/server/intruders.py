"""Clients that should not be let in: some try passwords, some begin TLS handshakes and do not go on.

load.py runs them beside a client that goes on with its work.
"""

import base64
import contextlib
import http.client
import multiprocessing
import os
import socket
import ssl
import threading
import time

HANDSHAKES = 300


def basic(user, password):
    return "Basic " + base64.b64encode(f"{user}:{password}".encode()).decode()


def trusting():
    context = ssl.create_default_context()
    context.check_hostname = False
    context.verify_mode = ssl.CERT_NONE
    return context


def wrong_logins(port, done):
    """Tries one password after the other, on 20 connections at once, which the server may close."""
    context = trusting()

    def guess():
        connection = http.client.HTTPSConnection("127.0.0.1", port, context=context, timeout=30)
        while True:
            try:
                connection.request("POST", "/cimom", "", {"Authorization": basic("bench", f"guess {time.monotonic_ns()}")})
                connection.getresponse().read()
            except (OSError, http.client.HTTPException):
                connection.close()
            with done.get_lock():
                done.value += 1

    guessers = [threading.Thread(target=guess, daemon=True) for _ in range(20)]
    for guesser in guessers:
        guesser.start()
    for guesser in guessers:
        guesser.join()


def client_hello():
    """The first bytes of a handshake."""
    incoming, outgoing = ssl.MemoryBIO(), ssl.MemoryBIO()
    with contextlib.suppress(ssl.SSLWantReadError):
        trusting().wrap_bio(incoming, outgoing, server_hostname="localhost").do_handshake()
    return outgoing.read()


def half_handshakes(port, done):
    """Keeps 300 handshakes open: half of them send a byte now and then, half wait after their whole hello."""
    hello = client_hello()
    held = []
    while True:
        while len(held) < HANDSHAKES:
            client = socket.create_connection(("127.0.0.1", port))
            whole = len(held) % 2 == 0
            client.sendall(hello if whole else hello[:1])
            held.append([client, len(hello) if whole else 1])
        done.value += HANDSHAKES if done.value == 0 else 1
        for entry in [each for each in held if each[1] < len(hello)]:
            client, sent = entry
            time.sleep(0.05 / HANDSHAKES)  # not all at once: that would be a load of its own on this machine
            try:
                client.sendall(hello[sent:sent + 1])
                entry[1] = sent + 1
            except OSError:
                held.remove(entry)
        time.sleep(0.02)


def attack_at_lowest_priority(attack, port, done):
    os.nice(19)
    attack(port, done)


@contextlib.contextmanager
def running(attack, port):
    """Runs an attack in a process of its own; gives the count of what it has done."""
    done = multiprocessing.Value("i", 0)
    process = multiprocessing.Process(target=attack_at_lowest_priority, args=(attack, port, done))
    process.start()
    try:
        yield done
    finally:
        process.terminate()
        process.join()
