"""Host names and addresses of the community service inside the test sandbox.

The C++ code compiles the first three names in as its defaults; discovery's
default reply names the fourth as the server host. Each host has a loopback
address of its own, so a test can take one host down while the others answer.

Python 2 and 3 both read this file: the service (3) and the test suites (2.7).
Run it to print the table for shell scripts:
    hosts.py --shell       NAME=value lines (DEFAULT_HOST=..., DEFAULT_HOST_ADDRESS=...)
    hosts.py --etc-hosts   an /etc/hosts file mapping every name to its address
"""
import sys

DEFAULT_HOST = 'www.orbishare.com'
STAGING_HOST = 'staging.orbishare.com'
DETECTION_HOST = 'detect.orbishare.com'
SERVER_HOST = 'api.orbishare.com'

# (variable name, host name, loopback address)
HOSTS = [
    ('DETECTION_HOST', DETECTION_HOST, '127.0.0.2'),
    ('DEFAULT_HOST', DEFAULT_HOST, '127.0.0.3'),
    ('STAGING_HOST', STAGING_HOST, '127.0.0.4'),
    ('SERVER_HOST', SERVER_HOST, '127.0.0.5'),
]
ADDRESSES = dict((name, address) for _, name, address in HOSTS)

HTTP_PORT = 80
TLS_PORT = 443

CONTROL_ADDRESS = '127.0.0.1'
CONTROL_PORT = 8950
CONTROL_URL = 'http://%s:%d' % (CONTROL_ADDRESS, CONTROL_PORT)


def shell_lines():
    lines = []
    for variable, name, address in HOSTS:
        lines.append('%s=%s' % (variable, name))
        lines.append('%s_ADDRESS=%s' % (variable, address))
    lines.append('REFSERVICE_CONTROL=%s' % CONTROL_URL)
    return lines


def etc_hosts_lines():
    lines = ['127.0.0.1 localhost', '::1 localhost ip6-localhost ip6-loopback']
    lines += ['%s %s' % (address, name) for _, name, address in HOSTS]
    return lines


if __name__ == '__main__':
    modes = {'--shell': shell_lines, '--etc-hosts': etc_hosts_lines}
    if len(sys.argv) != 2 or sys.argv[1] not in modes:
        sys.stderr.write('usage: hosts.py --shell | --etc-hosts\n')
        sys.exit(2)
    sys.stdout.write('\n'.join(modes[sys.argv[1]]()) + '\n')
