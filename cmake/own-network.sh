# Sourced by run: plays a command in a network of its own, for who may not bind port 803 in the
# machine's.

# Settings by which a system forbids such networks to ordinary users, with the value that allows them.
settings_against_own_networks() {
    set -- kernel.unprivileged_userns_clone 0 1 \
        kernel.apparmor_restrict_unprivileged_userns 1 0 \
        user.max_user_namespaces 0 1000
    while [ $# -gt 0 ]; do
        file=/proc/sys/$(printf '%s' "$1" | tr . /)
        [ "$(cat "$file" 2>/dev/null)" != "$2" ] ||
            echo "  sudo sysctl $1=$3    allows such networks again"
        shift 3
    done
}

enter_own_network() { # COMMAND...: replaces this shell; ends it with 1 where the system refuses
    if reason=$(unshare -Urn true 2>&1); then
        exec unshare -Urn sh -c 'ip link set lo up && exec "$@"' sh "$@"
    fi
    {
        echo
        echo "This system does not let you make a network of your own, so nothing can be played:"
        echo "  $reason"
        echo "Do one of these, and start $1 again:"
        echo "  sudo sysctl net.ipv4.ip_unprivileged_port_start=803    opens the port until the next boot"
        settings_against_own_networks
        echo "  sudo $*    plays it as root, in the machine's network"
    } >&2
    exit 1
}
