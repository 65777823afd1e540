#!/usr/bin/env bash
# A one-node Slurm cluster on this machine, for trying and testing batch runs:
# munged with a freshly generated key, slurmctld and slurmd on localhost, and a
# slurm.conf written for this machine's cores and memory. Everything (key,
# sockets, spool, state, logs, configuration) lives in one folder; nothing in
# /etc is touched and the daemons stop with `stop`.
#
#   local_cluster.sh install        install Debian's slurm-wlm and munge (root; no daemon is
#                                   started by the installation)
#   local_cluster.sh start DIR      start the cluster with its files in DIR; prints the line
#                                   `export SLURM_CONF=DIR/slurm.conf` for the client commands
#   local_cluster.sh stop DIR       stop the daemons that `start DIR` started
#   local_cluster.sh status DIR     the node as Slurm sees it
#
# Variables: SLURM_LOCAL_PORT (slurmctld port, default 6817; slurmd takes the next one),
# SLURM_LOCAL_INSTALL=1 (`start` installs missing packages first).
# Exit status of `start`: 0 running, 3 Slurm or munge is not installed, 4 they cannot run here
# (not root, a daemon did not come up); the reason is printed on the error stream.
set -uo pipefail

die() {
  echo "local_cluster: $2" >&2
  exit "$1"
}

have_binaries() {
  command -v munged >/dev/null && command -v slurmctld >/dev/null && command -v slurmd >/dev/null &&
    command -v sbatch >/dev/null
}

install_packages() {
  [ "$(id -u)" -eq 0 ] || die 4 "installing slurm-wlm and munge needs root"
  command -v apt-get >/dev/null || die 3 "no apt-get: install slurm-wlm and munge by hand"
  # Keep the packages' own services from starting: the cluster is started here, with its
  # own configuration, and only on request.
  local policy=/usr/sbin/policy-rc.d ours=0
  if [ ! -e "$policy" ]; then
    printf '#!/bin/sh\nexit 101\n' >"$policy" && chmod 755 "$policy" && ours=1
  fi
  export DEBIAN_FRONTEND=noninteractive
  local status=0
  if ! apt-get install -y -qq --no-install-recommends slurm-wlm munge >/dev/null 2>&1; then
    apt-get update -qq >/dev/null 2>&1
    apt-get install -y -qq --no-install-recommends slurm-wlm munge >/dev/null 2>&1 || status=1
  fi
  [ "$ours" -eq 1 ] && rm -f "$policy"
  [ "$status" -eq 0 ] || die 3 "apt-get could not install slurm-wlm and munge"
}

# Kills the process of a pid file if it is still the program named, and waits for it.
stop_pidfile() {
  local file=$1 program=$2 pid i
  [ -f "$file" ] || return 0
  pid=$(cat "$file" 2>/dev/null)
  if [ -n "$pid" ] && [ -r "/proc/$pid/comm" ] && [ "$(cat "/proc/$pid/comm")" = "$program" ]; then
    kill "$pid" 2>/dev/null
    for i in $(seq 1 50); do
      [ -d "/proc/$pid" ] || break
      sleep 0.1
    done
    [ -d "/proc/$pid" ] && kill -9 "$pid" 2>/dev/null
  fi
  rm -f "$file"
}

start_cluster() {
  local dir=$1
  if ! have_binaries; then
    if [ "${SLURM_LOCAL_INSTALL:-0}" = 1 ]; then install_packages; fi
    have_binaries || die 3 "slurm-wlm and munge are not installed (run: $0 install)"
  fi
  [ "$(id -u)" -eq 0 ] || die 4 "slurmd must run as root to start jobs"
  mkdir -p "$dir" || die 4 "cannot create $dir"
  dir=$(cd "$dir" && pwd)
  mkdir -p "$dir/munge" "$dir/state" "$dir/spool" "$dir/log"
  chmod 700 "$dir/munge"

  # Munge: a key of our own, its socket in the cluster folder.
  local key="$dir/munge/munge.key" socket="$dir/munge/munge.socket"
  [ ${#socket} -lt 100 ] || die 4 "the folder $dir is too deep for munge's socket path"
  local port=${SLURM_LOCAL_PORT:-6817} p
  for p in "$port" $((port + 1)); do
    if (exec 3<>"/dev/tcp/127.0.0.1/$p") 2>/dev/null; then
      die 4 "port $p is in use on this machine (choose others with SLURM_LOCAL_PORT)"
    fi
  done
  if [ ! -f "$key" ]; then
    if command -v mungekey >/dev/null; then
      mungekey --create --keyfile="$key" >/dev/null 2>&1 || die 4 "mungekey could not write $key"
    else
      dd if=/dev/urandom of="$key" bs=1024 count=1 status=none || die 4 "cannot write $key"
    fi
    chmod 600 "$key"
  fi
  munged --force --key-file="$key" --socket="$socket" --pid-file="$dir/munge/munged.pid" \
    --log-file="$dir/log/munged.log" --seed-file="$dir/munge/munged.seed" 2>"$dir/log/munged.err" ||
    die 4 "munged did not start: $(tail -n 3 "$dir/log/munged.err" "$dir/log/munged.log" 2>/dev/null | tr '\n' ' ')"

  # The node as slurmd sees this machine: cores, sockets, memory.
  local node host
  host=$(hostname -s)
  node=$(slurmd -C 2>/dev/null | head -n 1)
  [ -n "$node" ] || node="NodeName=$host CPUs=$(nproc) RealMemory=$(awk '/MemTotal/ {print int($2 / 1024)}' /proc/meminfo)"
  cat >"$dir/slurm.conf" <<EOF
# One-node cluster on $host, written by local_cluster.sh.
ClusterName=localcluster
SlurmctldHost=$host(127.0.0.1)
SlurmctldPort=$port
SlurmdPort=$((port + 1))
AuthType=auth/munge
AuthInfo=socket=$socket
CredType=cred/munge
SlurmUser=root
SlurmdUser=root
StateSaveLocation=$dir/state
SlurmdSpoolDir=$dir/spool
SlurmctldPidFile=$dir/slurmctld.pid
SlurmdPidFile=$dir/slurmd.pid
SlurmctldLogFile=$dir/log/slurmctld.log
SlurmdLogFile=$dir/log/slurmd.log
ProctrackType=proctrack/linuxproc
TaskPlugin=task/none
MpiDefault=none
JobAcctGatherType=jobacct_gather/linux
JobAcctGatherFrequency=5
AccountingStorageType=accounting_storage/none
JobCompType=jobcomp/none
SchedulerType=sched/backfill
SelectType=select/cons_tres
SelectTypeParameters=CR_Core_Memory
ReturnToService=2
MinJobAge=600
$node NodeAddr=127.0.0.1 State=UNKNOWN
PartitionName=local Nodes=ALL Default=YES MaxTime=INFINITE State=UP
EOF
  export SLURM_CONF="$dir/slurm.conf"
  slurmctld -f "$SLURM_CONF" 2>"$dir/log/slurmctld.err" || {
    stop_cluster "$dir"
    die 4 "slurmctld did not start: $(tail -n 3 "$dir/log/slurmctld.err" "$dir/log/slurmctld.log" 2>/dev/null | tr '\n' ' ')"
  }
  slurmd -f "$SLURM_CONF" 2>"$dir/log/slurmd.err" || {
    stop_cluster "$dir"
    die 4 "slurmd did not start: $(tail -n 3 "$dir/log/slurmd.err" "$dir/log/slurmd.log" 2>/dev/null | tr '\n' ' ')"
  }
  # Up when the node is idle; 60 s at most.
  local i state=""
  for i in $(seq 1 120); do
    state=$(sinfo -h -N -o %T 2>/dev/null | head -n 1)
    case "$state" in
      idle*|mix*|alloc*) echo "export SLURM_CONF=$SLURM_CONF"; return 0 ;;
      down*|drain*) scontrol update nodename="$host" state=resume >/dev/null 2>&1 ;;
    esac
    sleep 0.5
  done
  stop_cluster "$dir"
  die 4 "the node did not become idle (state '${state:-none}'); logs in $dir/log"
}

stop_cluster() {
  local dir=$1
  [ -d "$dir" ] || return 0
  dir=$(cd "$dir" && pwd)
  if [ -f "$dir/slurm.conf" ] && [ -f "$dir/slurmctld.pid" ]; then
    SLURM_CONF="$dir/slurm.conf" scontrol shutdown >/dev/null 2>&1
  fi
  stop_pidfile "$dir/slurmd.pid" slurmd
  stop_pidfile "$dir/slurmctld.pid" slurmctld
  stop_pidfile "$dir/munge/munged.pid" munged
  return 0
}

case "${1:-}" in
  install) install_packages ;;
  start) [ $# -eq 2 ] || die 2 "usage: $0 start DIR"; start_cluster "$2" ;;
  stop) [ $# -eq 2 ] || die 2 "usage: $0 stop DIR"; stop_cluster "$2" ;;
  status) [ $# -eq 2 ] || die 2 "usage: $0 status DIR"; SLURM_CONF="$2/slurm.conf" sinfo -N -l ;;
  *) die 2 "usage: $0 install | start DIR | stop DIR | status DIR" ;;
esac
