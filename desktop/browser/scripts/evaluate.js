// The value of an expression, as truth and as JSON, or the text of what it threw.
(function (expression) {
    try {
        var value = (0, eval)('(' + expression + '\n)');
        var json = JSON.stringify(value);
        return { truth: !!value, json: json === undefined ? 'null' : json };
    } catch (error) {
        return { error: String(error) };
    }
})
