"""What the machine's processors did meanwhile."""


class Processors:
    """What the machine's processors did since this was made, as parts of the time."""

    def __init__(self):
        self.begin = self.ticks()

    @staticmethod
    def ticks():
        with open("/proc/stat", encoding="ascii") as stat:
            words = [int(word) for word in stat.readline().split()[1:9]]
        return words[3] + words[4], words[7], sum(words)

    def idle_and_stolen(self):
        idle, stolen, every = (now - then for now, then in zip(self.ticks(), self.begin))
        return idle / every, stolen / every
