"""The virtual appliance: a 32-bit ARM machine in an emulator, started or woken from a saved state.

Nothing of a running machine is in the file system: its disks are unlinked files (unless they are named, and kept), its
lines to the host inherited sockets, and the emulator dies with the process that started it.
"""
import dataclasses
import fcntl
import hashlib
import json
import os
import re
import selectors
import shlex
import shutil
import signal
import socket
import struct
import subprocess
import tempfile
import threading
import time

TOOLS = os.path.dirname(os.path.realpath(__file__))
TREE = os.path.realpath(os.path.join(TOOLS, '../../..'))
OWN = os.path.join(TREE, 'build/appliance/arm')
CACHE = os.path.realpath(os.environ.get('TAVO_ARM_CACHE') or OWN)

# What a kernel says when something in it went wrong. A process that ran out of memory is not among it.
FAULT = re.compile(r'Kernel panic|Oops|BUG:|kernel BUG at|Internal error:|Unable to handle kernel|WARNING: CPU:'
                   r'|refcount_t:|list_(add|del) corruption|blocked for more than|Bad page state')


STICK = 99  # its number among the emulator's files: beyond all bays
LOG = 100  # and those of logs are this one and the bay's


class Died(Exception):
    """The machine ended, or stopped answering, in the middle of a job."""


class OutOfTime(Exception):
    """The host's own limit for the whole run has passed."""


@dataclasses.dataclass(frozen=True)
class Hardware:
    disks: int = 6
    size: int = 96  # MiB each
    bus: str = 'sata'
    memory: int = 512  # MiB

    def __post_init__(self):
        most = 6 if self.bus == 'sata' else 26
        if self.bus not in ('sata', 'scsi') or not 0 <= self.disks <= most or self.size < 1 or self.memory < 256:
            raise ValueError(f'no such machine: {self.disks} disks of {self.size} MiB on {self.bus} '
                             f'({most} disks at most), {self.memory} MiB of memory (256 at least)')


@dataclasses.dataclass(frozen=True)
class KeptDisk:
    path: str
    size: int  # bytes; 0: what the file has

    @classmethod
    def parse(cls, text):
        """FILE[:SIZE], the size in MiB or with G or T."""
        match = re.fullmatch(r'(.+?)(?::([0-9]+)([GT]?))?', text)
        if not match:
            raise ValueError(f'no such disk: {text}')
        unit = {'': 20, 'G': 30, 'T': 40}[match[3] or '']
        return cls(match[1], int(match[2] or 0) << unit)

    def open(self):
        """The open file, of the size that was asked for, for one machine at a time."""
        if not self.size and not os.path.exists(self.path):
            raise ValueError(f'a new disk needs a size: {self.path}:SIZE')
        disk = os.fdopen(os.open(self.path, os.O_RDWR | os.O_CREAT | os.O_CLOEXEC, 0o644), 'r+b')
        try:
            fcntl.flock(disk, fcntl.LOCK_EX | fcntl.LOCK_NB)
        except BlockingIOError:
            raise ValueError(f'another machine has the disk {self.path}') from None
        there = os.fstat(disk.fileno()).st_size
        if self.size and there not in (0, self.size):
            raise ValueError(f'the disk {self.path} has {there >> 20} MiB already')
        if not there:
            disk.truncate(self.size)
        return disk


@dataclasses.dataclass
class Outcome:
    status: int  # as wait() gives it
    killed_for_memory: int
    left_behind: int

    @property
    def signal(self):
        return os.WTERMSIG(self.status) if os.WIFSIGNALED(self.status) else 0

    @property
    def exit_code(self):
        """As a shell gives it."""
        return 128 + self.signal if self.signal else os.WEXITSTATUS(self.status)


class _Monitor:
    """Commands to the emulator itself."""

    def __init__(self, line):
        line.settimeout(60)
        self.stream = line.makefile('rwb', buffering=0)
        self.events = []
        json.loads(self._line())
        self('qmp_capabilities')

    def _line(self):
        line = self.stream.readline()
        if not line:
            raise Died('the emulator ended')
        return line

    def __call__(self, command, **arguments):
        self.stream.write(json.dumps({'execute': command, 'arguments': arguments}).encode() + b'\n')
        while True:
            answer = json.loads(self._line())
            if 'return' in answer:
                return answer['return']
            if 'error' in answer:
                raise RuntimeError(answer['error']['desc'])
            self.events.append(answer)

    def wait_for(self, event, device):
        while True:
            for seen in self.events:
                if seen['event'] == event and seen['data'].get('device') == device:
                    self.events.remove(seen)
                    return
            self.events.append(json.loads(self._line()))


class SilentDrive:
    """A drive whose requests another process serves, which can be stopped.

    When a kernel resets a drive the emulator waits for the requests to it and does nothing else meanwhile, where a real
    one forgets them. So whenever it does not answer the drive goes on for a moment, which gives the reset its way."""

    def __init__(self, disk):
        self.folder = tempfile.mkdtemp(prefix='tavo-silent.')
        self.path = os.path.join(self.folder, 'socket')
        self.process = subprocess.Popen(
            ['setpriv', '--pdeathsig', 'KILL', 'qemu-storage-daemon', '--blockdev',
             f'driver=file,node-name=disk,filename=/proc/self/fd/{disk.fileno()},locking=off',
             '--nbd-server', f'addr.type=unix,addr.path={self.path}',
             '--export', 'type=nbd,id=disk,node-name=disk,name=disk,writable=on'],
            stdin=subprocess.DEVNULL, pass_fds=[disk.fileno()], process_group=0)
        self.monitor = self.watcher = None
        self.silent = False
        while not os.path.exists(self.path):
            if self.process.poll() is not None:
                raise Died('the silent drive ended')
            time.sleep(0.02)

    def found(self, monitor):
        """The emulator has it open, and is asked by this monitor whether it goes on."""
        self.monitor = monitor
        shutil.rmtree(self.folder)

    def stop(self):
        self.process.send_signal(signal.SIGSTOP)
        self.silent = True
        self.watcher = threading.Thread(target=self._watch, daemon=True)
        self.watcher.start()

    def _watch(self):
        while self.silent:
            released = threading.Timer(0.5, self.process.send_signal, [signal.SIGCONT])
            released.start()
            try:
                self.monitor('query-status')
            except (Died, OSError):
                return
            finally:
                released.cancel()
                released.join()
            if self.silent:
                self.process.send_signal(signal.SIGSTOP)
            time.sleep(0.1)

    def go_on(self):
        self.silent = False
        self.watcher.join()
        self.process.send_signal(signal.SIGCONT)

    def close(self):
        self.process.kill()
        self.process.wait()
        shutil.rmtree(self.folder, ignore_errors=True)


class Machine:
    """with Machine(...) as machine: outcome = machine.run([...])"""

    def __init__(self, image, hardware=Hardware(), share=None, cold=False, deadline=None, kept=(), own_programs=True,
                 above=None):
        self.image, self.hardware, self.deadline = image, hardware, deadline
        self.share = os.path.realpath(share) if share else None
        self.kept = list(kept)
        self.own_programs = own_programs  # this tree's, over the root
        self.above = above or {}  # of some bays: the emulator's filter over the disk, see _filter()
        self.cold = cold or bool(self.kept or self.above)  # a saved machine remembers what was on its disks
        self.console = b''
        self.console_to = None  # where an interactive console goes
        self.tick = None
        self.process = None
        self.lines = {}
        self.disks = []
        self.silent = {}

    def __enter__(self):
        try:
            if self.cold:
                self._start()
                self._await(b'H')
            else:
                self._wake(self._saved_state())
            self._send(b'S', b'%d\n' % time.time() + os.urandom(32))
            if self._await(b'W') != b'ready':
                raise Died('it cannot unpack the programs of this tree: ' + self.console.decode(errors='replace')[-500:])
        except BaseException:
            self.close()
            raise
        return self

    def __exit__(self, *_):
        self.close()

    def close(self):
        if self.process:
            self.process.kill()
            self.process.wait()
            self.process = None
        for line in self.lines.values():
            line.close()
        self.lines = {}
        self.disks = []
        for drive in self.silent.values():
            drive.close()
        self.silent = {}

    # Starting

    def _start(self, memory_file=None, private=True, incoming=False):
        hardware = self.hardware
        nothing = os.path.join(OWN, 'nothing')
        programs = os.path.join(OWN, 'programs') if self.own_programs else nothing
        for directory in (nothing, programs):
            os.makedirs(directory, exist_ok=True)
        inherited = []
        peers = {}

        def line(name):
            ours, theirs = socket.socketpair()
            self.lines[name] = ours
            peers[name] = theirs
            inherited.append(theirs.fileno())
            return f'socket,id={name},fd={theirs.fileno()}'

        memory = f'memory-backend-ram,id=ram,size={hardware.memory}M'
        if memory_file:
            memory = (f'memory-backend-file,id=ram,size={hardware.memory}M,mem-path={memory_file},'
                      f'share={"off" if private else "on"}')
        command = [
            'setpriv', '--pdeathsig', 'KILL', 'qemu-system-arm', '-nodefaults', '-no-user-config', '-no-reboot', '-display', 'none',
            '-M', 'virt,memory-backend=ram', '-object', memory, '-m', str(hardware.memory),
            '-cpu', 'cortex-a15', '-accel', 'tcg', '-smp', '1',
            '-kernel', f'{self.image}/vmlinuz', '-initrd', f'{self.image}/root.cpio',
            '-append', 'console=ttyAMA0 loglevel=5 quiet panic=-1 oops=panic rdinit=/init cryptomgr.notests nowatchdog '
                       f'rcupdate.rcu_cpu_stall_suppress=1 tavo.disks={hardware.disks}',
            '-chardev', line('console'), '-serial', 'chardev:console',
            '-chardev', line('monitor'), '-mon', 'chardev=monitor,mode=control',
            '-chardev', line('watch'), '-mon', 'chardev=watch,mode=control',
            '-device', 'virtio-serial-pci', '-device', 'virtio-rng-pci',
            '-chardev', line('agent'), '-device', 'virtserialport,chardev=agent,name=agent',
            '-chardev', line('events'), '-device', 'virtserialport,chardev=events,name=events',
            '-fsdev', f'local,id=host,path={self.share or nothing},security_model=none',
            '-device', 'virtio-9p-pci,fsdev=host,mount_tag=host',
            '-fsdev', f'local,id=programs,path={programs},security_model=none,readonly=on',
            '-device', 'virtio-9p-pci,fsdev=programs,mount_tag=programs',
            '-device', 'ich9-ahci,id=bus' if hardware.bus == 'sata' else 'virtio-scsi-pci,id=bus']
        # Both network cards are on one cable: each receives what the other sends.
        for card in range(2):
            command += ['-netdev', f'hubport,hubid=0,id=cable{card}', '-device',
                        f'virtio-net-pci,id=eth{card},romfile=,speed=1000,duplex=full,netdev=cable{card},'
                        f'mac=52:54:00:00:00:0{card + 1}']
        # A third one that can wake the machine. Without its driver, which nothing loads by itself, it has no name.
        command += ['-netdev', 'hubport,hubid=1,id=cable2', '-device',
                    'rtl8139,id=eth2,romfile=,netdev=cable2,mac=52:54:00:00:00:03']
        self.disks = []
        for bay in range(1, hardware.disks + 1):
            if self.kept:
                disk = self.kept[bay - 1].open()
            else:
                disk = tempfile.TemporaryFile(prefix='tavo-disk.')
                disk.truncate(hardware.size << 20)
            self.disks.append(disk)
            inherited.append(disk.fileno())
            filtered = bay in self.above
            command += ['-add-fd', f'fd={disk.fileno()},set={bay}', '-blockdev',
                        f'driver=raw,node-name={"file" if filtered else "disk"}{bay},discard=unmap,'
                        f'cache.no-flush={"off" if filtered else "on"},file.driver=file,'
                        f'file.filename=/dev/fdset/{bay},file.locking=off,file.discard=unmap']
            if filtered:
                command += self._filter(bay, dict(self.above[bay]), inherited)
            command += ['-device', json.dumps(self._bay(bay))]
        # What "plug usb" plugs in.
        self.stick = tempfile.TemporaryFile(prefix='tavo-disk.')
        self.stick.truncate(hardware.size << 20)
        inherited.append(self.stick.fileno())
        command += ['-device', 'qemu-xhci,id=usb', '-add-fd', f'fd={self.stick.fileno()},set={STICK}', '-blockdev',
                    f'driver=raw,node-name=stick,cache.no-flush=on,file.driver=file,file.filename=/dev/fdset/{STICK},'
                    'file.locking=off']
        if incoming:
            command += ['-incoming', 'defer']
        # In a group of its own: an interrupt at the terminal is for us, who then end the machine.
        self.process = subprocess.Popen(command, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                                        stderr=subprocess.PIPE, pass_fds=inherited, process_group=0)
        for peer in peers.values():
            peer.close()
        try:
            self.monitor = _Monitor(self.lines['monitor'])
            for drive in self.silent.values():
                drive.found(_Monitor(self.lines['watch']))
        except (Died, OSError) as problem:
            raise Died(self._last_words()) from problem
        self.selector = selectors.DefaultSelector()
        for name in ('agent', 'console', 'events'):
            self.lines[name].setblocking(True)
            self.selector.register(self.lines[name], selectors.EVENT_READ, name)
        self.received = {'agent': b'', 'events': b''}

    def _filter(self, bay, node, inherited):
        """What the emulator has between a drive and its file, by its driver: 'blkdebug' fails requests; 'nbd' may stop
        answering, see stall(); 'blklogwrites' writes what comes in into the open file 'log'."""
        words = []
        if node['driver'] == 'nbd':
            drive = self.silent[bay] = SilentDrive(self.disks[bay - 1])
            node.update(server={'type': 'unix', 'path': drive.path}, export='disk')
            return ['-blockdev', json.dumps({'node-name': f'disk{bay}', **node})]
        if node['driver'] == 'blklogwrites':
            log = node['log']
            inherited.append(log.fileno())
            words += ['-add-fd', f'fd={log.fileno()},set={LOG + bay}', '-blockdev',
                      f'driver=raw,node-name=log{bay},file.driver=file,file.filename=/dev/fdset/{LOG + bay},'
                      'file.locking=off']
            node['log'] = f'log{bay}'
        node['image' if node['driver'] == 'blkdebug' else 'file'] = f'file{bay}'
        return [*words, '-blockdev', json.dumps({'node-name': f'disk{bay}', **node})]

    def stall(self, bay, stalled=True):
        """Has a drive with the driver 'nbd' answer nothing that reads or writes, or go on."""
        drive = self.silent[bay]
        drive.stop() if stalled else drive.go_on()

    def _bay(self, bay):
        if self.hardware.bus == 'sata':
            return {'driver': 'ide-hd', 'id': f'bay{bay}', 'bus': f'bus.{bay - 1}', 'drive': f'disk{bay}',
                    'model': f'NASLAB-HD-{bay}', 'serial': f'SN{bay:04}', 'ver': 'FW1.0'}
        return {'driver': 'scsi-hd', 'id': f'bay{bay}', 'bus': 'bus.0', 'drive': f'disk{bay}', 'scsi-id': bay - 1,
                'lun': 0, 'vendor': 'NASLAB', 'product': f'HD-{bay}', 'ver': '1.0', 'serial': f'SN{bay:04}'}

    def _await(self, wanted):
        while True:
            kind, payload = self._frame()
            if kind == wanted:
                return payload

    def _saved_state(self):
        """The folder with a machine of this hardware, saved when it had just become ready; made at the first need."""
        made_from = repr((os.path.basename(self.image), self.hardware)).encode()
        with open(__file__, 'rb') as source:
            key = hashlib.sha256(made_from + source.read()).hexdigest()[:16]
        folder = os.path.join(CACHE, 'saved', key)
        os.makedirs(os.path.dirname(folder), exist_ok=True)
        with open(os.path.join(CACHE, 'saved.lock'), 'w') as lock:
            fcntl.flock(lock, fcntl.LOCK_EX)
            if not os.path.isdir(folder):
                self._save(folder)
            os.utime(folder)
        return folder

    def _save(self, folder):
        kept = sorted((entry for entry in os.scandir(os.path.dirname(folder))), key=lambda e: e.stat().st_mtime)
        for old in kept[:-3]:  # each takes as much room as the machine has memory
            shutil.rmtree(old.path)
        new = folder + '.new'
        shutil.rmtree(new, ignore_errors=True)
        os.mkdir(new)
        self._start(f'{new}/memory', private=False)
        self._await(b'H')
        self.monitor('stop')
        self.monitor('migrate-set-capabilities', capabilities=[{'capability': 'x-ignore-shared', 'state': True}])
        self.monitor('migrate', uri='exec:cat >' + shlex.quote(f'{new}/devices'))
        while (status := self.monitor('query-migrate')['status']) != 'completed':
            if status == 'failed':
                raise Died('the machine could not be saved')
            time.sleep(0.02)
        self.monitor('quit')
        self.process.wait()
        self.close()
        os.rename(new, folder)

    def _wake(self, folder):
        self._start(f'{folder}/memory', incoming=True)
        self.monitor('migrate-set-capabilities', capabilities=[{'capability': 'x-ignore-shared', 'state': True}])
        self.monitor('migrate-incoming', uri='exec:cat ' + shlex.quote(f'{folder}/devices'))
        while self.monitor('query-status')['status'] == 'inmigrate':
            time.sleep(0.005)
        self.monitor('cont')

    # Talking to it

    def _send(self, kind, payload):
        self.lines['agent'].sendall(kind + struct.pack('<I', len(payload)) + payload)

    def _frame(self):
        """The next frame of the agent; what else comes in meanwhile is taken care of."""
        while True:
            buffer = self.received['agent']
            if len(buffer) >= 5:
                size = struct.unpack_from('<I', buffer, 1)[0]
                if len(buffer) >= 5 + size:
                    self.received['agent'] = buffer[5 + size:]
                    return buffer[:1], buffer[5:5 + size]
            self._pump()

    def _pump(self):
        left = self.deadline - time.monotonic() if self.deadline else 60
        if left <= 0:
            raise OutOfTime
        if self.tick:
            self.tick()
        for key, _ in self.selector.select(min(left, 1)):
            if callable(key.data):
                key.data()
                continue
            try:
                data = key.fileobj.recv(1 << 20)
            except ConnectionError:
                data = b''
            if not data:
                raise Died(self._last_words())
            if key.data == 'console':
                self.console += data
                if self.console_to:
                    self.console_to(data)
            else:
                self.received[key.data] += data
        while b'\n' in self.received['events']:
            request, self.received['events'] = self.received['events'].split(b'\n', 1)
            self.lines['events'].sendall(self._answer(request.decode(errors='replace')).encode() + b'\n')

    def end_job(self):
        """Ends the running job; its run() still returns the outcome."""
        self._send(b'K', b'')

    def _last_words(self):
        self.process.wait()
        lines = self.process.stderr.read().decode(errors='replace').splitlines()
        return '; '.join(line for line in lines if ' warning: ' not in line) or 'the emulator ended'

    def run(self, arguments, output=None, tick=None, environment=(), **options):
        """Runs a program; output(stream, bytes) gets what it writes while it runs, stream is 'out' or 'err'.

        tick() is called at least once a second. Options: directory, memory (bytes), fresh (a throw-away copy of the
        root), layer (a folder in the guest that is mounted over that copy), host_at (where the share is shown there, too),
        terminal ("rows columns": on the console).
        """
        self.tick = tick
        words = [f'env={variable}' for variable in environment]
        words += [name if value is True else f'{name}={value}' for name, value in options.items() if value]
        words += ['--', *arguments]
        self._send(b'R', b''.join(word.encode() + b'\0' for word in words))
        while True:
            kind, payload = self._frame()
            if kind == b'X':
                fields = dict(field.split('=') for field in payload.decode().split())
                return Outcome(int(fields['status']), int(fields['killed_for_memory']), int(fields['left_behind']))
            if output and kind in (b'o', b'e'):
                output('out' if kind == b'o' else 'err', payload)

    def faults(self):
        """What the kernel said of faults of its own, with what it said around them; empty when all is well."""
        lines = self.console.decode(errors='replace').replace('\r', '').split('\n')
        first = next((number for number, line in enumerate(lines) if FAULT.search(line)), None)
        return [] if first is None else [line for line in lines[max(0, first - 2):first + 40] if line.strip()]

    # Events from outside

    def _answer(self, request):
        identity, verb, *words = (request.split() + ['', ''])[:5]
        words = [word for word in words if word]
        try:
            self._happen(verb, *words)
            return f'{identity} done'
        except Exception as problem:
            return f'{identity} failed {problem}'.replace('\n', ' ')

    def _happen(self, verb, what, how='', size=''):
        if verb in ('cut', 'restore') and what in ('eth0', 'eth1'):
            self.monitor('set_link', name=what, up=verb == 'restore')
        elif verb == 'plug' and what == 'usb':
            if how == 'blank':
                self.stick.truncate(0)
                self.stick.truncate(self.hardware.size << 20)
            self.monitor('device_add', driver='usb-storage', id='stick', bus='usb.0', drive='stick', serial='STICK1')
        elif verb == 'pull' and what == 'usb':
            self.monitor('device_del', id='stick')
            self.monitor.wait_for('DEVICE_DELETED', 'stick')
        elif verb in ('pull', 'plug', 'blank') and what.isdigit() and 1 <= int(what) <= self.hardware.disks:
            bay = int(what)
            if verb == 'pull':
                self.plugged(bay, False)
            if verb == 'blank' or how == 'blank':
                disk = self.disks[bay - 1]
                disk.truncate(0)
                size = int(size or self.hardware.size) << 20
                disk.truncate(size)
                self.monitor('block_resize', **{'node-name': f'disk{bay}', 'size': size})
            if verb == 'plug':
                self.plugged(bay)
        else:
            raise ValueError(f'no such event: {verb} {what}')

    def plugged(self, bay, there=True):
        """A disk comes or goes; on SATA the machine does the work itself."""
        if self.hardware.bus != 'scsi':
            return
        if there:
            self.monitor('device_add', **self._bay(bay))
        else:
            self.monitor('device_del', id=f'bay{bay}')
            self.monitor.wait_for('DEVICE_DELETED', f'bay{bay}')
