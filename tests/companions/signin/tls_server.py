"""A TLS end in front of a plain server, with certificates made on the spot; and servers that are none."""

import os
import socket
import ssl
import subprocess
import threading


def make_certificate(folder, name):
    """A certificate for an address or a host name: (certificate file, key file)."""
    certificate, key = (os.path.join(folder, f"{name}.{kind}") for kind in ("crt", "key"))
    kind = "IP" if name[0].isdigit() else "DNS"
    subprocess.run(["openssl", "req", "-x509", "-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:prime256v1",
                    "-nodes", "-days", "2", "-subj", f"/CN={name}", "-addext", f"subjectAltName={kind}:{name}",
                    "-keyout", key, "-out", certificate], check=True, capture_output=True)
    return certificate, key


def _pump(source, target):
    try:
        while data := source.recv(65536):
            target.sendall(data)
    except OSError:
        pass
    finally:
        for end in (source, target):
            try:
                end.shutdown(socket.SHUT_RDWR)
            except OSError:
                pass


class Listener:
    """Serves connections on threads until it is closed; `held` connections wait for release()."""

    def __init__(self):
        self.socket = socket.create_server(("127.0.0.1", 0))
        self.port = self.socket.getsockname()[1]
        self.asked = threading.Event()
        threading.Thread(target=self._accept, daemon=True).start()

    def _accept(self):
        while True:
            try:
                connection, _ = self.socket.accept()
            except OSError:
                return
            threading.Thread(target=self._serve_quietly, args=(connection,), daemon=True).start()

    def _serve_quietly(self, connection):
        try:
            self.serve(connection)
        except OSError:
            connection.close()

    def close(self):
        self.socket.shutdown(socket.SHUT_RDWR)
        self.socket.close()


class TlsEnd(Listener):
    def __init__(self, certificate, key, port):
        self.context = ssl.SSLContext(ssl.PROTOCOL_TLS_SERVER)
        self.context.load_cert_chain(certificate, key)
        self.target = port
        super().__init__()

    def serve(self, connection):
        with self.context.wrap_socket(connection, server_side=True) as secure, \
                socket.create_connection(("127.0.0.1", self.target)) as plain:
            back = threading.Thread(target=_pump, args=(plain, secure), daemon=True)
            back.start()
            _pump(secure, plain)
            back.join()


class Gate(Listener):
    """Passes on what is asked at once, and the answer only after release()."""

    def __init__(self, port):
        self.target = port
        self.open = threading.Event()
        super().__init__()

    def release(self):
        self.open.set()

    def serve(self, connection):
        with socket.create_connection(("127.0.0.1", self.target)) as plain:
            plain.sendall(connection.recv(65536))
            answer = plain.recv(65536)
        self.asked.set()
        self.open.wait()
        connection.sendall(answer)
        connection.close()


class WrongServer(Listener):
    """A web server of somebody else."""

    def serve(self, connection):
        connection.recv(65536)
        page = b"<html>Welcome to the hotel</html>"
        connection.sendall(b"HTTP/1.1 200 OK\r\nContent-Length: %d\r\n\r\n" % len(page) + page)
        connection.close()
