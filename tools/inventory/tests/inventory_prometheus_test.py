#!/usr/bin/env python3
"""Finds a broken fan as the watcher of a fleet does: ic-inventory writes metrics about a machine whose fan umockdev
has broken, a node exporter reads them from its textfile folder, and Prometheus, which scrapes it, is asked for the
nodes with a status above 0. Both run on loopback, on free ports, and end with this process.

    inventory_prometheus_test.py INVENTORY UMOCKDEV_RUN NODE_EXPORTER PROMETHEUS
"""
import ctypes
import json
import os
import signal
import socket
import subprocess
import sys
import tempfile
import time
import urllib.error
import urllib.parse
import urllib.request

BOARD = """P: /devices/platform/board.1
E: SUBSYSTEM=platform

P: /devices/platform/board.1/hwmon/hwmon0
E: SUBSYSTEM=hwmon
A: name=board\\n
A: fan1_input=0\\n
A: fan1_min=1000\\n
A: fan1_alarm=1\\n
A: fan2_input=4200\\n
A: fan2_min=1000\\n
A: fan2_alarm=0\\n
L: device=../../../board.1

"""
SECONDS_AT_MOST = 60
LIBC = ctypes.CDLL(None)


def die_with_parent():
    """Run by a child before its program: the kernel ends it with this process, whatever ends this one."""
    PR_SET_PDEATHSIG = 1
    LIBC.prctl(PR_SET_PDEATHSIG, signal.SIGKILL)


def free_port():
    with socket.socket() as probe:
        probe.bind(("127.0.0.1", 0))
        return probe.getsockname()[1]


def get(url):
    """What the server on loopback answers, or None if it does not answer yet."""
    opener = urllib.request.build_opener(urllib.request.ProxyHandler({}))
    try:
        with opener.open(url, timeout=5) as answer:
            return answer.read().decode()
    except (urllib.error.URLError, OSError):
        return None


def query(port, expression):
    answer = get(f"http://127.0.0.1:{port}/api/v1/query?" + urllib.parse.urlencode({"query": expression}))
    return json.loads(answer)["data"]["result"] if answer else []


def wait_for(what, ask, servers):
    end = time.monotonic() + SECONDS_AT_MOST
    while time.monotonic() < end:
        answer = ask()
        if answer:
            return answer
        for server in servers:
            if server.poll() is not None:
                sys.exit(f"{server.args[0]} has ended with status {server.returncode} before {what}")
        time.sleep(0.2)
    sys.exit(f"{what}: not within {SECONDS_AT_MOST} s")


def write_metrics(inventory, umockdev_run, folder, textfile):
    device = os.path.join(folder, "board.umockdev")
    with open(device, "w", encoding="ascii") as file:
        file.write(BOARD)
    # umockdev-run takes only ASCII; AddressSanitizer demands to be the first library, but works as the second too.
    environment = dict(os.environ, PROGRAM=inventory, ASAN_OPTIONS="verify_asan_link_order=0", HWLOC_COMPONENTS="-pci")
    subprocess.run([umockdev_run, "--device", device, "--", "sh", "-c", 'exec "$PROGRAM" "$@"', "sh",
                    "--metrics", "--output", textfile],
                   env=environment, check=True, timeout=SECONDS_AT_MOST)


def main():
    inventory, umockdev_run, node_exporter, prometheus = sys.argv[1:]
    servers = []
    with tempfile.TemporaryDirectory() as folder:
        textfiles = os.path.join(folder, "textfiles")
        os.mkdir(textfiles)
        write_metrics(inventory, umockdev_run, folder, os.path.join(textfiles, "ic-inventory.prom"))

        exporter_port, prometheus_port = free_port(), free_port()
        configuration = os.path.join(folder, "prometheus.yml")
        with open(configuration, "w", encoding="ascii") as file:
            json.dump({"global": {"scrape_interval": "1s"},  # JSON is YAML
                       "scrape_configs": [{"job_name": "node", "static_configs": [
                           {"targets": [f"127.0.0.1:{exporter_port}"]}]}]}, file)
        try:
            with open(os.path.join(folder, "log"), "wb") as log:
                for command in (
                        [node_exporter, f"--web.listen-address=127.0.0.1:{exporter_port}",
                         "--collector.disable-defaults", "--collector.textfile",
                         f"--collector.textfile.directory={textfiles}"],
                        [prometheus, f"--config.file={configuration}",
                         f"--storage.tsdb.path={os.path.join(folder, 'data')}",
                         f"--web.listen-address=127.0.0.1:{prometheus_port}"]):
                    servers.append(subprocess.Popen(command, stdout=log, stderr=log, preexec_fn=die_with_parent))
            text = wait_for("the node exporter answers", lambda: get(f"http://127.0.0.1:{exporter_port}/metrics"),
                            servers)
            assert "node_textfile_scrape_error 0" in text, text
            wait_for("Prometheus has scraped", lambda: query(prometheus_port, "ic_up == 1"), servers)
            broken = query(prometheus_port, 'ic_node_status{sensor="Fan"} > 0')
            paths = [(one["metric"]["path"], int(one["value"][1]) > 0) for one in broken]
            assert len(paths) == 1 and paths[0][0].endswith("fan1") and paths[0][1], broken
            everywhere = query(prometheus_port, "ic_node_status > 0")
            assert broken[0]["metric"] in [one["metric"] for one in everywhere], everywhere
            assert query(prometheus_port, 'sum(ic_alerts{severity=~"2|3"}) > 0'), "no alert"
        except BaseException:
            with open(os.path.join(folder, "log"), errors="replace", encoding="utf-8") as log:
                sys.stderr.write(log.read()[-4000:])
            raise
        finally:
            for server in servers:
                server.terminate()
            for server in servers:
                try:
                    server.wait(timeout=10)
                except subprocess.TimeoutExpired:
                    server.kill()
                    server.wait()
    print("Prometheus has found", paths[0][0])


main()
