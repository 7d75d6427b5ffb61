"""A share while one of several share servers is killed: the one that receives, in mid request."""

import collections
import contextlib
import os

import world
from postgres_engine import PostgresEngine
from server_cluster import ServerCluster, store_address
from way import Way, say
from world import WorldError

UPLOAD_SECONDS = 20  # that the largest file takes
STRIKE = 0.35  # of the whole
FILM = 32 * 1024 * 1024  # bytes of the sample that is large enough to be interrupted
KEPT_FOR_SURE = 24 * 1024 * 1024  # of so large a file some of what was sent is noted when the server dies
PATIENCE = 5.0  # seconds for the balancer to notice a death


@contextlib.contextmanager
def started():
    """Three servers on engines of their own; programs that are started from now on use them."""
    folder = os.path.join(os.environ["PELLIKO_STATE"], "cluster")
    with PostgresEngine() as database, \
            ServerCluster("pelliko-server", folder, database.url(), store_address("run")) as cluster:
        use = {"PELLIKO_SERVER_URL": cluster.url, "SSL_CERT_FILE": cluster.ca}
        os.environ.update(use)
        world.activation_environment(**use)
        yield cluster


def film(folder):
    """One more sample, which takes its time."""
    path = os.path.join(folder, "film.mp4")
    with open(path, "wb") as file:
        file.write(os.urandom(FILM))
    return path


class ClusterWay(Way):
    look_from = 0.6  # when the other servers are at it

    def __init__(self, args, people, files, cluster):
        self.cluster = cluster
        self.stores = cluster.stores
        self.log = world.Follower(str(cluster.folder / "requests.log"))
        self.killed = None
        self.broken = 0  # which line of the log it was
        super().__init__(args, people, files)

    def upload_rate(self):
        sizes = [os.path.getsize(path) for path in self.files]
        return max(max(sizes), sum(sizes) // 8) // UPLOAD_SECONDS

    def launch(self):
        names = ", ".join(node.name for node in self.cluster.nodes)
        say(f"0. {names} run on PostgreSQL and an S3 store; nginx in front of them answers at {self.cluster.url}.")
        super().launch()

    def requests(self):
        """What nginx has dealt with so far, without links."""
        return [self.cluster.balancer.request_of(line) for line in self.log.read()]

    def progressed(self, progress):
        told_late = self.shown < len(self.panel.items)
        if self.killed is None and progress >= STRIKE and not told_late:
            self.strike()

    def strike(self):
        """Kills the server that receives, unless none does just now. One that had received all of its request when it died
        does not count and comes back."""
        before = len(self.log.read())
        node = next((node for node in self.cluster.nodes if node.metric("pelliko_uploads") > 0), None)
        if node is None:
            return
        node.kill()
        try:
            self.broken = self.log.wait(lambda _: self.broken_at(node, before), "a broken request", PATIENCE)
        except WorldError:
            node.start()
            return
        self.killed = node
        say(f"   {node.name} is receiving and is killed (kill -9): its request has ended with {self.requests()[self.broken]['status']}.")

    def broken_at(self, node, first):
        """The first line from there on that tells of an append which this server did not answer."""
        return next((first + index for index, request in enumerate(self.requests()[first:])
                     if request["method"] == "PATCH" and request["status"] >= 500 and request["servers"][-1:] == [node.port]), None)

    def conclude(self):
        if self.killed is None:
            raise WorldError("no server was killed: the files were gone too soon; share larger ones")
        requests = self.requests()
        upload = requests[self.broken]["path"]
        following = [request for request in requests[self.broken + 1:]
                     if (request["method"], request["path"], request["status"]) == ("PATCH", upload, 204)]
        if not following or self.killed.runs():
            raise WorldError("no other server went on with the upload")
        offset, other = int(following[0]["from"]), self.cluster.node_at(following[0]["servers"][-1])
        if offset == 0 and max(map(os.path.getsize, self.files)) >= KEPT_FOR_SURE:
            raise WorldError("the upload began again from nothing")
        say(f"7. {self.killed.name} was killed in mid upload and stayed away; {other.name} went on from byte {offset:,}.")
        by_port = collections.Counter(request["servers"][-1] for request in requests if request["servers"])
        say("   pelliko-server check finds no row without bytes and no bytes without a row: "
            + world.run("pelliko-server", "check", *self.stores).splitlines()[-1])
        say("   Answered: " + ", ".join(f"{by_port[node.port]} requests by {node.name}" for node in self.cluster.nodes) + ".")
