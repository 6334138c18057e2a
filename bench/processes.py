"""The CPU time and the memory of a process and all that it has started."""

import os


def stat(pid):
    """The fields of a process after its name; None if it has ended."""
    try:
        with open(f'/proc/{pid}/stat', encoding='ascii', errors='replace') as file:
            return file.read().rpartition(')')[2].split()
    except OSError:
        return None


def family_of(process):
    """The fields of the processes by their ids."""
    processes = {int(pid): stat(pid) for pid in os.listdir('/proc') if pid.isdigit()}
    family, size = {process.pid}, 0
    while len(family) > size:
        size = len(family)
        family |= {pid for pid, fields in processes.items() if fields and int(fields[1]) in family}
    return {pid: processes[pid] for pid in family if processes.get(pid)}


def cpu_seconds(process):
    ticks = sum(int(fields[11]) + int(fields[12]) for fields in family_of(process).values())
    return ticks / os.sysconf('SC_CLK_TCK')


def proportional_bytes(pid):
    """The memory of a process, with its share of the pages that it has in common with others; 0 if it has ended."""
    try:
        with open(f'/proc/{pid}/smaps_rollup', encoding='ascii') as file:
            return 1024 * next(int(line.split()[1]) for line in file if line.startswith('Pss:'))
    except OSError:
        return 0


def memory_bytes(process):
    return sum(proportional_bytes(pid) for pid in family_of(process))
