"""A database one of whose tables is on a disk that can be filled."""

from cluster_case import MIB, ClusterCase


class FullDatabaseCase(ClusterCase):
    engine_options = {"room": 6 * MIB}

    def put_on_the_small_disk(self, table):
        if not self.engine.sql("SELECT 1 FROM pg_tablespace WHERE spcname = 'small'", "postgres"):
            self.engine.sql(f"CREATE TABLESPACE small LOCATION '{self.engine.small_place()}'")
        self.engine.sql(f"ALTER TABLE {table} SET TABLESPACE small")
        self.table = table

    def put_uploads_on_the_small_disk(self):
        """Whatever is noted of an upload from here on takes a page of its own."""
        self.engine.sql("ALTER TABLE blobs ADD padding text; ALTER TABLE blobs ALTER padding SET STORAGE PLAIN;"
                        "ALTER TABLE blobs ALTER padding SET DEFAULT repeat('x', 7000)")
        self.put_on_the_small_disk("blobs")

    def fill_the_disk(self):
        # What former versions of rows took would be room as well.
        self.engine.sql(f"VACUUM FULL {self.table}")
        self.engine.sql("CREATE TABLE filler (bytes text) TABLESPACE small;"
                        "ALTER TABLE filler ALTER bytes SET STORAGE PLAIN")
        for size in (1_000_000, 100_000, 8_000):
            self.fill_by(size)

    def fill_by(self, size):
        statement = f"INSERT INTO filler SELECT repeat('x', 7900) FROM generate_series(1, {max(1, size // 8000)})"
        while True:
            try:
                self.engine.sql(statement)
            except RuntimeError as error:
                self.assertIn("No space left", str(error))
                return

    def make_room(self):
        self.engine.sql("DROP TABLE filler; CHECKPOINT")
