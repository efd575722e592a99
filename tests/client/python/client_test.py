"""Runs the Python package against a service of its own."""
import asyncio
import pathlib
import sys
import threading
import unittest

sys.path[:0] = [str(pathlib.Path(__file__).resolve().parents[2] / "system/tool"), sys.argv[3]]
import tarn  # noqa: E402
from harness import DEADLINE, ToolTest  # noqa: E402

PLAYER = "player,org.example.Test"


class ThePackage(ToolTest):
    def setUp(self):
        super().setUp()
        self.path = str(self.folder / "ostrel.tarnd")
        self.long, self.short = (tarn.file_url(self.folder / name) for name in ("long.wav", "short.wav"))

    def connect(self, **options):
        return self.enterContext(tarn.Client(self.path, timeout=DEADLINE, **options))

    def make(self, client, *urls):
        for number, url in enumerate(urls):
            client.upsert_asset(str(number), url)
            client.upsert_item(str(number), str(number))
        client.upsert_queue_player(PLAYER, map(str, range(len(urls))))

    def wait_for(self, client, *kinds):
        """Returns all events up to one of this kind."""
        seen = []
        while (event := client.next_event(DEADLINE)) is not None:
            seen.append(event)
            if isinstance(event, kinds):
                return seen
        raise AssertionError(f"no {kinds} in {seen}")

    def test_plays_and_tells_of_it(self):
        with self.service():
            client = self.connect()
            self.assertEqual(client.upsert_asset("0", self.short, title="Größe"), tarn.AssetInfo(0.3, "Größe"))
            self.assertEqual(client.upsert_item("0", "0").state, tarn.State.UNKNOWN)
            self.assertEqual(client.upsert_queue_player(PLAYER, ["0"]).identifier, "0")
            client.set_rate(PLAYER, 1)
            self.assertIn(tarn.PlayerRateChanged(PLAYER, 1.0), self.wait_for(client, tarn.ItemPlayedToEnd))
            self.wait_for(client, tarn.PlayerRateChanged)
            client.set_current_time("0", 0.1)
            self.assertAlmostEqual(client.current_time("0"), 0.1, delta=1 / 60)
            with self.assertRaises(tarn.CommandFailed) as caught:
                client.current_time("unknown")
            self.assertEqual((caught.exception.domain, caught.exception.code), ("ostrel.pellion.errors", 26))

    def test_edits_queues(self):
        with self.service():
            client = self.connect()
            self.make(client, self.long, self.long, self.long)
            client.remove_item(PLAYER, "1")
            client.append_item(PLAYER, "1")
            client.advance_to_next_item(PLAYER)
            client.advance_to_next_item(PLAYER)
            client.replace_current_item(PLAYER, "2")
            client.remove_all_items(PLAYER)
            currents = [client.next_event(DEADLINE)]
            while currents[-1] != tarn.CurrentItemChanged(PLAYER, None):
                currents.append(client.next_event(DEADLINE))
            self.assertEqual([event.item for event in currents if isinstance(event, tarn.CurrentItemChanged)],
                             ["0", "2", "1", "2", None])
            client.destroy_queue_player(PLAYER)
            client.destroy_item("0")
            client.destroy_asset("0")

    def test_fails_what_waits_when_the_service_ends(self):
        with self.service() as service:
            client = self.connect()
            service.kill()
            with self.assertRaises(tarn.ConnectionLost):
                while True:
                    client.current_time("unknown") if client.fileno() >= 0 else client.set_rate(PLAYER, 1)
        self.assertEqual(list(client.events()), [tarn.Disconnected()])

    def test_puts_everything_back(self):
        with self.service() as service:
            client = self.connect(reconnect_limit=DEADLINE)
            self.make(client, self.long, self.long)
            client.upsert_asset("0", self.long, token=client.grant_file(self.folder / "long.wav"))
            client.set_current_time("0", 20)
            client.set_rate(PLAYER, 1)
            self.wait_for(client, tarn.PlayerRateChanged)
            before = client.current_time("0")
            service.kill()
            service.wait()
        self.wait_for(client, tarn.Reconnecting)
        with self.service():
            self.assertAlmostEqual(client.current_time("0"), before, delta=0.3)
            self.wait_for(client, tarn.Reconnected)
            moved = client.current_time("0")
            while client.current_time("0") <= moved:
                pass
            client.advance_to_next_item(PLAYER)
            self.assertEqual(self.wait_for(client, tarn.CurrentItemChanged)[-1].item, "1")

    def test_does_not_fight_for_its_place(self):
        with self.service():
            first = self.connect(reconnect_limit=DEADLINE)
            second = self.connect()
            self.make(second, self.long)
            self.wait_for(first, tarn.ReplacedByAnother)
            with self.assertRaises(tarn.TakenOver):
                first.set_rate(PLAYER, 1)
            first.reconnect()
            self.make(first, self.short)
            self.wait_for(second, tarn.Disconnected, tarn.ReplacedByAnother)

    def test_serves_many_calls_of_one_loop(self):
        async def play():
            async with tarn.AsyncClient(self.path, reconnect_limit=DEADLINE) as client:
                await asyncio.gather(*(client.upsert_asset(str(i), self.short) for i in range(50)))
                await asyncio.gather(*(client.upsert_item(str(i), str(i)) for i in range(50)))
                await client.upsert_queue_player(PLAYER, ["0", "1"])
                await client.set_rate(PLAYER, 1)
                ended = [event.item async for event in self.up_to_the_end(client)]
                again.set()
                async for event in client.events():
                    if isinstance(event, tarn.Reconnected):
                        break
                return ended, await client.upsert_queue_player(PLAYER, ["2"])

        again = threading.Event()
        with self.service() as service:
            killer = threading.Thread(target=lambda: (again.wait(DEADLINE), service.kill(), service.wait(), gone.set()))
            gone = threading.Event()
            killer.start()
            result = []
            player = threading.Thread(target=lambda: result.append(asyncio.run(asyncio.wait_for(play(), DEADLINE))))
            player.start()
            gone.wait(DEADLINE)
        with self.service():
            player.join()
        killer.join()
        self.assertEqual(result[0][0], ["0", "1"])
        self.assertEqual(result[0][1].identifier, "2")

    @staticmethod
    async def up_to_the_end(client):
        async for event in client.events():
            if isinstance(event, tarn.ItemPlayedToEnd):
                yield event
                if event.item == "1":
                    return


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1] + sys.argv[4:])
