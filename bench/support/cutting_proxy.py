#!/usr/bin/env python3
"""Passes the connections made to 127.0.0.1:LISTEN on to 127.0.0.1:UPSTREAM and drops (resets) the one in flight
each time another EVERY bytes of answers have passed; writes a line to NOTES for each drop.

  cutting_proxy.py LISTEN UPSTREAM EVERY NOTES
"""
import socket
import struct
import sys
import threading

listen, upstream, every, notes = int(sys.argv[1]), int(sys.argv[2]), int(sys.argv[3]), sys.argv[4]
passed = 0
lock = threading.Lock()


def requests(client, server):
    try:
        while data := client.recv(65536):
            server.sendall(data)
    except OSError:
        pass


def serve(client):
    global passed
    with client, socket.create_connection(("127.0.0.1", upstream)) as server:
        threading.Thread(target=requests, args=(client, server), daemon=True).start()
        try:
            while data := server.recv(65536):
                with lock:
                    room = every - passed % every
                    passed += min(len(data), room)
                client.sendall(data[:room])
                if len(data) >= room:
                    with open(notes, "a") as out:
                        out.write("dropped\n")
                    # A reset, at once: closing alone waits for the thread still reading requests.
                    client.setsockopt(socket.SOL_SOCKET, socket.SO_LINGER, struct.pack("ii", 1, 0))
                    client.shutdown(socket.SHUT_RDWR)
                    return
        except OSError:
            pass


with socket.socket() as listener:
    listener.setsockopt(socket.SOL_SOCKET, socket.SO_REUSEADDR, 1)
    listener.bind(("127.0.0.1", listen))
    listener.listen(16)
    while True:
        connection, _ = listener.accept()
        threading.Thread(target=serve, args=(connection,), daemon=True).start()
