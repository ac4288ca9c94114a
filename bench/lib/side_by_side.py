"""Prints one benchmark's figures from several interpreters as one table.

    side_by_side.py VERSION FIGURES.json [VERSION FIGURES.json ...]

Each figures file is what one run printed: {"title": ..., "columns": [first
column, value columns...], "rows": [[label, cell, ...], ...], "notes": [...],
"ratio_of": "a/b" (optional), "ratios": "..."}. The rows of all runs line up by the first
run's labels; each run gives its value columns under its version. Anything a
run printed after its figures (the module at interpreter exit, say) is shown.
"""
import json
import sys

from bench_support import print_table


def read_run(path):
    """The figures of a run; what else it printed after them becomes a note."""
    with open(path) as output:
        text = output.read()
    figures, end = json.JSONDecoder().raw_decode(text)
    if text[end:].strip():
        figures.setdefault('notes', []).append('also printed: ' + ' '.join(text[end:].split()))
    return figures


def read_runs(arguments):
    return [(version, read_run(path)) for version, path in zip(arguments[::2], arguments[1::2])]


def main(arguments):
    runs = read_runs(arguments)
    if not runs:
        return 'usage: side_by_side.py VERSION FIGURES.json [VERSION FIGURES.json ...]'
    first = runs[0][1]
    header = [first['columns'][0]] + ['%s %s' % (version, column) for version, figures in runs
                                      for column in figures['columns'][1:]]
    cells = [dict((row[0], row[1:]) for row in figures['rows']) for _, figures in runs]
    rows = [[row[0]] + [cell for by_label in cells for cell in by_label.get(row[0], ['-'])]
            for row in first['rows']]
    print('%s; Python %s' % (first['title'], ' beside '.join(version for version, _ in runs)))
    print_table(header, rows)
    shared = [note for note in first.get('notes', [])
              if all(note in figures.get('notes', []) for _, figures in runs)]
    for note in shared:
        print(note)
    for version, figures in runs:
        for note in figures.get('notes', []):
            if note not in shared:
                print('%s: %s' % (version, note))
    ratio_of = ' (%s)' % first['ratio_of'] if 'ratio_of' in first else ''
    print('ratios%s: %s' % (ratio_of, '  |  '.join('%s: %s' % (version, figures['ratios'])
                                                   for version, figures in runs)))
    return 0


if __name__ == '__main__':
    sys.exit(main(sys.argv[1:]))
